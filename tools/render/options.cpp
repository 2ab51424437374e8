#include "tools/render/options.h"

#include <cerrno>
#include <cstdlib>
#include <cstring>

#include "engine/synth_state.h"
#include "timers/timer_gains.h"

const char RenderUsage[] =
    "usage: sombrel-render --out FILE [options]\n"
    "Renders the rain exactly as the program plays it, from block 0\n"
    "(8192 frames, 170.67 ms each), as a 48 kHz 16-bit stereo WAV file.\n"
    "\n"
    "  --out FILE          output file; - writes raw PCM to standard output\n"
    "  --blocks N          blocks to render (default 30)\n"
    "  --seconds S         seconds to render, rounded up to whole blocks\n"
    "  --volume V          Volume slider, 1..255 (default 128)\n"
    "  --hardness V        Hardness slider, 1..255 (default 128)\n"
    "  --bass V            Bass slider, 1..255 (default 128)\n"
    "  --sub-bass V        Sub Bass slider, 1..255 (default 128)\n"
    "  --treble V          Treble slider, 1..255 (default 128)\n"
    "  --profile P         100..107 or white, pink, red, brown, talking,\n"
    "                      music, traffic, dogs (default 104, talking)\n"
    "  --eq V0,...,V30     the 31 equaliser band sliders, 1..255, lowest band\n"
    "                      first; 1 is +20 dB, 128 flat, 255 -20 dB\n"
    "  --fade-in M         fade in over M minutes, 1..15\n"
    "  --fade-out M        fade out over the M minutes before the stop, 1..15\n"
    "                      (needs --stop-after)\n"
    "  --stop-after M      stop time M minutes after Play, 0..1439; the render\n"
    "                      ends where playback stops\n"
    "  --start-index N     block index of the first block, 0..524289\n"
    "  --curves FILE.csv   write the response curves after the first block\n"
    "  --chime FILE.wav    write the alarm chime at --volume (5.461 s); with\n"
    "                      it, --out may be left out\n"
    "  --progress          show progress on standard error\n"
    "  --help              show this text\n";

namespace {

// The message quotes what was typed; a control character in it (a newline
// passed inside an argument) would break the message's one line, so it is
// shown as "?".
bool Fail(std::string* error, const char* option, const std::string& why) {
    *error = std::string(option) + ": " + why;
    for (char& c : *error)
        if (static_cast<unsigned char>(c) < 0x20 || c == 0x7F) c = '?';
    return false;
}

std::string Quoted(const char* text) { return std::string("'") + text + "'"; }

// Whole decimal number within [low, high]; false for anything else.
bool ParseInteger(const char* text, int64_t low, int64_t high, int64_t* value) {
    const char* p = text;
    if (*p == '-' || *p == '+') ++p;
    if (*p == '\0' || std::strlen(p) > 12) return false;
    for (const char* q = p; *q; ++q)
        if (*q < '0' || *q > '9') return false;
    const long long v = std::strtoll(text, nullptr, 10);
    if (v < low || v > high) return false;
    *value = v;
    return true;
}

bool ParseProfile(const char* text, int32_t* profile) {
    static const char* const names[] = {"white",   "pink",  "red",     "brown",
                                        "talking", "music", "traffic", "dogs"};
    for (int32_t i = 0; i < 8; ++i) {
        if (std::strcmp(text, names[i]) == 0) {
            *profile = ProfileWhite + i;
            return true;
        }
    }
    int64_t v = 0;
    if (!ParseInteger(text, ProfileWhite, ProfileDogs, &v)) return false;
    *profile = static_cast<int32_t>(v);
    return true;
}

// Exactly 31 comma-separated slider values; nothing is written unless all are good.
bool ParseBands(const char* text, ControlRecord* settings) {
    int32_t bands[EqBandCount];
    const char* item = text;
    for (int32_t band = 0; band < EqBandCount; ++band) {
        const char* comma = std::strchr(item, ',');
        if ((band == EqBandCount - 1) != (comma == nullptr)) return false;
        const std::string one = comma ? std::string(item, comma) : std::string(item);
        int64_t v = 0;
        if (!ParseInteger(one.c_str(), SliderMin, SliderMax, &v)) return false;
        bands[band] = static_cast<int32_t>(v);
        item = comma ? comma + 1 : item;
    }
    for (int32_t band = 0; band < EqBandCount; ++band) settings->Value[EqBandFirst + band] = bands[band];
    return true;
}

// Whole blocks for a number of seconds, rounded up (a block is 8192 / 48000 s).
bool ParseSeconds(const char* text, int64_t* blocks) {
    char* end = nullptr;
    errno = 0;
    const double seconds = std::strtod(text, &end);
    if (*text == '\0' || *end != '\0' || errno != 0 || !(seconds > 0.0) || seconds > 1e8) return false;
    const double exact = seconds * SampleRate / BlockFrames;
    int64_t whole = static_cast<int64_t>(exact);
    if (static_cast<double>(whole) < exact) ++whole;
    *blocks = whole < 1 ? 1 : whole;
    return true;
}

}  // namespace

bool ParseRenderOptions(int argc, const char* const* argv, RenderOptions* options,
                        ControlRecord* settings, std::string* error) {
    RenderOptions& o = *options;
    int32_t* v = settings->Value;
    const char* lengthOption = nullptr;   // --blocks or --seconds, when given
    int64_t stopAfter = -1;               // minutes, -1 when --stop-after is not given
    for (int i = 1; i < argc; ++i) {
        const char* opt = argv[i];
        if (std::strcmp(opt, "--help") == 0) {
            o.Help = true;
            return true;
        }
        if (std::strcmp(opt, "--progress") == 0) {
            o.Progress = true;
            continue;
        }
        if (std::strncmp(opt, "--", 2) != 0)
            return Fail(error, opt, "unexpected argument (options start with --; see --help)");
        static const char* const withValue[] = {
            "--out", "--blocks", "--seconds", "--volume", "--hardness", "--bass", "--sub-bass",
            "--treble", "--profile", "--eq", "--fade-in", "--fade-out", "--stop-after",
            "--start-index", "--curves", "--chime"};
        bool known = false;
        for (const char* name : withValue) known = known || std::strcmp(opt, name) == 0;
        if (!known) return Fail(error, opt, "unknown option (see --help)");
        if (i + 1 >= argc) return Fail(error, opt, "needs a value");
        const char* val = argv[++i];
        const std::string name(opt);
        int64_t n = 0;
        if (name == "--out" || name == "--chime" || name == "--curves") {
            if (*val == '\0') return Fail(error, opt, "needs a file name");
            (name == "--out" ? o.Out : name == "--chime" ? o.Chime : o.Curves) = val;
        } else if (name == "--blocks") {
            if (!ParseInteger(val, 1, MaxRawBlocks, &n))
                return Fail(error, opt, Quoted(val) + " is not a whole number of blocks from 1");
            o.Blocks = n;
            lengthOption = "--blocks";
        } else if (name == "--seconds") {
            if (!ParseSeconds(val, &o.Blocks))
                return Fail(error, opt, Quoted(val) + " is not a number of seconds above 0");
            lengthOption = "--seconds";
        } else if (name == "--volume" || name == "--hardness" || name == "--bass" ||
                   name == "--sub-bass" || name == "--treble") {
            if (!ParseInteger(val, SliderMin, SliderMax, &n))
                return Fail(error, opt, Quoted(val) + " is not a slider value 1..255");
            const ControlField field = name == "--volume"     ? Attenuator
                                       : name == "--hardness" ? Hardness
                                       : name == "--bass"     ? Bass
                                       : name == "--sub-bass" ? SubBass
                                                              : Treble;
            v[field] = static_cast<int32_t>(n);
        } else if (name == "--profile") {
            if (!ParseProfile(val, &v[Profile]))
                return Fail(error, opt, Quoted(val) + " is not a profile (100..107, white, pink, red, "
                                                      "brown, talking, music, traffic, dogs)");
        } else if (name == "--eq") {
            if (!ParseBands(val, settings))
                return Fail(error, opt, "expects 31 comma-separated band values 1..255");
        } else if (name == "--fade-in" || name == "--fade-out") {
            if (!ParseInteger(val, 1, 15, &n)) return Fail(error, opt, Quoted(val) + " is not 1..15 minutes");
            const bool in = name == "--fade-in";
            v[in ? FadeInOn : FadeOutOn] = 1;
            v[in ? FadeInTime : FadeOutTime] = static_cast<int32_t>(n);
        } else if (name == "--stop-after") {
            if (!ParseInteger(val, 0, 1439, &n)) return Fail(error, opt, Quoted(val) + " is not 0..1439 minutes");
            stopAfter = n;
        } else if (name == "--start-index") {
            if (!ParseInteger(val, 0, LastBlockIndex + 1, &n))
                return Fail(error, opt, Quoted(val) + " is not a block index 0..524289");
            o.StartIndex = static_cast<int32_t>(n);
        }
    }
    if (o.Out.empty() && o.Chime.empty()) return Fail(error, "--out", "is required (see --help)");
    if (v[FadeOutOn] == 1 && stopAfter < 0) return Fail(error, "--fade-out", "needs --stop-after");
    if (stopAfter >= 0) {
        // The stop time as the program holds it: minutes past the render's
        // midnight clock, on a 24-hour dial (neither AM nor PM set).
        v[PlayUntilOn] = 1;
        v[Alarm_AM] = 0;
        v[Alarm_PM] = 0;
        v[Alarm_Hr] = static_cast<int32_t>(stopAfter / 60);
        v[Alarm_Min] = static_cast<int32_t>(stopAfter % 60);
        // The stop rule ends the render after the block whose index is
        // BlocksIn(minutes), counting from the first block's index (an
        // index past the cycle starts over at 0).
        const int64_t first = o.StartIndex > LastBlockIndex ? 0 : o.StartIndex;
        const int64_t untilStop = BlocksIn(static_cast<int32_t>(stopAfter)) + 1 - first;
        const int64_t blocks = untilStop < 1 ? 0 : untilStop;
        if (lengthOption == nullptr || blocks < o.Blocks) {
            o.Blocks = blocks;
            lengthOption = "--stop-after";
        }
    }
    if (!o.Out.empty() && o.Out != "-" && o.Blocks > MaxWavBlocks)
        return Fail(error, lengthOption ? lengthOption : "--blocks",
                    "a WAV file holds at most 131071 blocks (6.2 hours); use --out - for longer");
    return true;
}
