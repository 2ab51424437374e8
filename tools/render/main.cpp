// sombrel-render: renders what Play sends to the sound card, block by block
// from block 0, as a WAV file (48 000 Hz, 16-bit, two channels) or as raw
// PCM on standard output. The same options always give the same bytes.
#include <cerrno>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string>

#ifdef _WIN32
#include <fcntl.h>
#include <io.h>
#endif

#include "app/core_state.h"
#include "engine/block.h"
#include "timers/chime.h"
#include "timers/timer_gains.h"
#include "tools/render/render.h"

namespace {

const char UsageText[] =
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

constexpr int32_t MaxWavBlocks = 131071;        // keeps the RIFF sizes below 4 GiB
constexpr int64_t MaxRawBlocks = 1000000000;    // a limit only against typing mistakes

struct Options {
    std::string Out;
    std::string Curves;
    std::string Chime;
    int64_t Blocks = 30;
    const char* LengthOption = nullptr;   // --blocks or --seconds, when given
    int32_t StartIndex = 0;
    bool Progress = false;
    bool StopAfterGiven = false;
    int32_t StopAfter = 0;
};

int Fail(const char* option, const std::string& why) {
    std::fprintf(stderr, "sombrel-render: %s: %s\n", option, why.c_str());
    return 2;
}

// Whole decimal number within [low, high]; false for anything else.
bool ParseInteger(const char* text, int64_t low, int64_t high, int64_t* value) {
    if (*text == '\0') return false;
    const char* p = text;
    if (*p == '-' || *p == '+') ++p;
    if (*p == '\0') return false;
    for (const char* q = p; *q; ++q)
        if (*q < '0' || *q > '9') return false;
    if (std::strlen(p) > 12) return false;
    const long long v = std::strtoll(text, nullptr, 10);
    if (v < low || v > high) return false;
    *value = v;
    return true;
}

bool ParseProfile(const char* text, int32_t* profile) {
    static const char* const names[] = {"white", "pink",  "red",     "brown",
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

bool ParseBands(const char* text, ControlRecord* settings) {
    std::string list(text);
    size_t start = 0;
    for (int32_t band = 0; band < EqBandCount; ++band) {
        const size_t comma = list.find(',', start);
        const bool last = band == EqBandCount - 1;
        if (last != (comma == std::string::npos)) return false;
        const std::string item = list.substr(start, last ? std::string::npos : comma - start);
        int64_t v = 0;
        if (!ParseInteger(item.c_str(), SliderMin, SliderMax, &v)) return false;
        settings->Value[EqBandFirst + band] = static_cast<int32_t>(v);
        start = comma + 1;
    }
    return true;
}

void PutU32(unsigned char* p, uint32_t v) {
    for (int i = 0; i < 4; ++i) p[i] = static_cast<unsigned char>(v >> (8 * i));
}

void PutU16(unsigned char* p, uint16_t v) {
    p[0] = static_cast<unsigned char>(v);
    p[1] = static_cast<unsigned char>(v >> 8);
}

// The 44-byte RIFF header of a 48 kHz, 16-bit, two-channel PCM file.
void MakeWavHeader(unsigned char* h, uint32_t dataBytes) {
    std::memcpy(h, "RIFF", 4);
    PutU32(h + 4, 36 + dataBytes);
    std::memcpy(h + 8, "WAVEfmt ", 8);
    PutU32(h + 16, 16);
    PutU16(h + 20, 1);
    PutU16(h + 22, 2);
    PutU32(h + 24, SampleRate);
    PutU32(h + 28, SampleRate * 4);
    PutU16(h + 32, 4);
    PutU16(h + 34, 16);
    std::memcpy(h + 36, "data", 4);
    PutU32(h + 40, dataBytes);
}

// The PCM block as little-endian bytes, whatever the host's byte order.
void PutBlock(const int16_t* pcm, unsigned char* bytes) {
    for (int32_t i = 0; i < BlockFrames * 2; ++i) PutU16(bytes + 2 * i, static_cast<uint16_t>(pcm[i]));
}

bool WriteCurves(const char* path, const SynthRecord* s) {
    FILE* f = std::fopen(path, "wb");  // the same bytes on every platform: \n line ends
    if (!f) return false;
    std::fprintf(f, "bin,hz,profile,eq,bass,subbass,treble,total\n");
    for (int32_t b = 0; b < FrameLength; ++b) {
        std::fprintf(f, "%d,%.7g,%.9g,%.9g,%.9g,%.9g,%.9g,%.9g\n", b, b * 2.9296875,
                     s->ProfileResponse[b], s->EqResponse[b], s->BassResponse[b],
                     s->SubBassResponse[b], s->TrebleResponse[b], s->TotalResponse[b]);
    }
    return std::fclose(f) == 0;
}

// The chime as the program queues it, written whole under a temporary name.
bool WriteChime(const std::string& path) {
    const std::string partial = path + ".partial";
    FILE* f = std::fopen(partial.c_str(), "wb");
    if (!f) return false;
    static unsigned char bytes[ChimeBufferFrames * 4];
    unsigned char header[44];
    MakeWavHeader(header, ChimeFrames * 4);
    bool ok = std::fwrite(header, 1, sizeof header, f) == sizeof header;
    for (int32_t b = 0; b < ChimeBufferCount && ok; ++b) {
        PutBlock(ChimePcm + 2 * ChimeBufferFrames * b, bytes);
        ok = std::fwrite(bytes, 1, sizeof bytes, f) == sizeof bytes;
    }
    ok = (std::fclose(f) == 0) && ok;
    if (ok) {
        std::remove(path.c_str());  // rename does not replace a file on Windows
        ok = std::rename(partial.c_str(), path.c_str()) == 0;
    }
    if (!ok) std::remove(partial.c_str());
    return ok;
}

// Reads the options into *o and the control record. Returns -1 to go on,
// or the exit status to end with (0 after --help, 2 after bad input).
int ParseOptions(int argc, char** argv, Options* options) {
    Options& o = *options;
    int32_t* v = ControlSettings.Value;
    for (int i = 1; i < argc; ++i) {
        const char* opt = argv[i];
        if (std::strcmp(opt, "--help") == 0) {
            std::fputs(UsageText, stdout);
            return 0;
        }
        if (std::strcmp(opt, "--progress") == 0) {
            o.Progress = true;
            continue;
        }
        if (std::strncmp(opt, "--", 2) != 0)
            return Fail(opt, "unexpected argument (options start with --; see --help)");
        static const char* const withValue[] = {
            "--out", "--blocks", "--seconds", "--volume", "--hardness", "--bass", "--sub-bass",
            "--treble", "--profile", "--eq", "--fade-in", "--fade-out", "--stop-after",
            "--start-index", "--curves", "--chime"};
        bool known = false;
        for (const char* name : withValue) known = known || std::strcmp(opt, name) == 0;
        if (!known) return Fail(opt, "unknown option (see --help)");
        if (i + 1 >= argc) return Fail(opt, "needs a value");
        const char* val = argv[++i];
        const std::string name(opt);
        int64_t n = 0;
        if (name == "--out") {
            if (*val == '\0') return Fail(opt, "needs a file name");
            o.Out = val;
        } else if (name == "--chime") {
            if (*val == '\0') return Fail(opt, "needs a file name");
            o.Chime = val;
        } else if (name == "--curves") {
            if (*val == '\0') return Fail(opt, "needs a file name");
            o.Curves = val;
        } else if (name == "--blocks") {
            if (!ParseInteger(val, 1, MaxRawBlocks, &n))
                return Fail(opt, std::string("'") + val + "' is not a whole number of blocks from 1");
            o.Blocks = n;
            o.LengthOption = "--blocks";
        } else if (name == "--seconds") {
            char* end = nullptr;
            errno = 0;
            const double seconds = std::strtod(val, &end);
            if (*val == '\0' || *end != '\0' || errno != 0 || !(seconds > 0.0) || seconds > 1e8)
                return Fail(opt, std::string("'") + val + "' is not a number of seconds above 0");
            // Whole blocks, rounded up: a block is 8192 / 48000 s.
            const double exact = seconds * SampleRate / BlockFrames;
            int64_t blocks = static_cast<int64_t>(exact);
            if (static_cast<double>(blocks) < exact) ++blocks;
            o.Blocks = blocks < 1 ? 1 : blocks;
            o.LengthOption = "--seconds";
        } else if (name == "--volume" || name == "--hardness" || name == "--bass" ||
                   name == "--sub-bass" || name == "--treble") {
            if (!ParseInteger(val, SliderMin, SliderMax, &n))
                return Fail(opt, std::string("'") + val + "' is not a slider value 1..255");
            const ControlField field = name == "--volume"     ? Attenuator
                                       : name == "--hardness" ? Hardness
                                       : name == "--bass"     ? Bass
                                       : name == "--sub-bass" ? SubBass
                                                              : Treble;
            v[field] = static_cast<int32_t>(n);
        } else if (name == "--profile") {
            if (!ParseProfile(val, &v[Profile]))
                return Fail(opt, std::string("'") + val +
                                     "' is not a profile (100..107, white, pink, red, brown, "
                                     "talking, music, traffic, dogs)");
        } else if (name == "--eq") {
            if (!ParseBands(val, &ControlSettings))
                return Fail(opt, "expects 31 comma-separated band values 1..255");
        } else if (name == "--fade-in") {
            if (!ParseInteger(val, 1, 15, &n)) return Fail(opt, std::string("'") + val + "' is not 1..15 minutes");
            v[FadeInOn] = 1;
            v[FadeInTime] = static_cast<int32_t>(n);
        } else if (name == "--fade-out") {
            if (!ParseInteger(val, 1, 15, &n)) return Fail(opt, std::string("'") + val + "' is not 1..15 minutes");
            v[FadeOutOn] = 1;
            v[FadeOutTime] = static_cast<int32_t>(n);
        } else if (name == "--stop-after") {
            if (!ParseInteger(val, 0, 1439, &n)) return Fail(opt, std::string("'") + val + "' is not 0..1439 minutes");
            o.StopAfterGiven = true;
            o.StopAfter = static_cast<int32_t>(n);
        } else if (name == "--start-index") {
            if (!ParseInteger(val, 0, LastBlockIndex + 1, &n))
                return Fail(opt, std::string("'") + val + "' is not a block index 0..524289");
            o.StartIndex = static_cast<int32_t>(n);
        }
    }
    return -1;
}

// Renders the rain into o.Out (a WAV file, or raw PCM on standard output).
int RenderRain(const Options& o) {
    const bool raw = o.Out == "-";
    // Written under a temporary name and renamed at the end, so a failed
    // render leaves no partial file behind.
    const std::string partial = o.Out + ".partial";
    FILE* out = nullptr;
    if (raw) {
#ifdef _WIN32
        _setmode(_fileno(stdout), _O_BINARY);
#endif
        out = stdout;
    } else {
        out = std::fopen(partial.c_str(), "wb");
        if (!out) return Fail("--out", std::string("cannot write ") + o.Out + ": " + std::strerror(errno));
    }
    unsigned char header[44] = {};
    bool ok = raw || std::fwrite(header, 1, sizeof header, out) == sizeof header;

    InitEngine(&SynthState);
    SetUpTimers(&ControlSettings, &SynthState);
    PrepareForPlay(&ControlSettings, &SynthState);
    SynthState.BlockIndex = o.StartIndex;

    static unsigned char bytes[BlockFrames * 4];
    int64_t written = 0;
    for (int64_t b = 0; b < o.Blocks && ok; ++b) {
        ProcessBlock(&ControlSettings, &CachedSettings, &SynthState);
        if (b == 0 && !o.Curves.empty() && !WriteCurves(o.Curves.c_str(), &SynthState)) {
            if (!raw) {
                std::fclose(out);
                std::remove(partial.c_str());
            }
            return Fail("--curves", "cannot write " + o.Curves);
        }
        if (RenderStopped) break;
        PutBlock(SynthState.PcmBlock, bytes);
        ok = std::fwrite(bytes, 1, sizeof bytes, out) == sizeof bytes;
        ++written;
        if (o.Progress && (written % 64 == 0 || b + 1 == o.Blocks))
            std::fprintf(stderr, "\rsombrel-render: %lld blocks, %.1f s", static_cast<long long>(written),
                         written * static_cast<double>(BlockFrames) / SampleRate);
    }
    if (o.Progress) std::fputc('\n', stderr);
    if (!raw && ok) {
        MakeWavHeader(header, static_cast<uint32_t>(written * sizeof bytes));
        ok = std::fseek(out, 0, SEEK_SET) == 0 && std::fwrite(header, 1, sizeof header, out) == sizeof header;
    }
    ok = (std::fflush(out) == 0) && ok;
    if (!raw) {
        ok = (std::fclose(out) == 0) && ok;
        if (ok) {
            std::remove(o.Out.c_str());  // rename does not replace a file on Windows
            ok = std::rename(partial.c_str(), o.Out.c_str()) == 0;
        }
        if (!ok) {
            std::remove(partial.c_str());
            return Fail("--out", "cannot write " + o.Out);
        }
    }
    if (!ok) return Fail("--out", "cannot write to standard output");
    return 0;
}

}  // namespace

int main(int argc, char** argv) {
    Options o;
    SetControlStartValues(&ControlSettings);
    int32_t* v = ControlSettings.Value;
    const int parsed = ParseOptions(argc, argv, &o);
    if (parsed >= 0) return parsed;

    if (!o.Chime.empty()) {
        MakeChime(v[Attenuator]);
        if (!WriteChime(o.Chime)) return Fail("--chime", "cannot write " + o.Chime);
        if (o.Out.empty()) return 0;
    }
    if (o.Out.empty()) return Fail("--out", "is required (see --help)");
    if (v[FadeOutOn] == 1 && !o.StopAfterGiven) return Fail("--fade-out", "needs --stop-after");
    const char* lengthOption = o.LengthOption;
    if (o.StopAfterGiven) {
        // The stop time as the program holds it: minutes past the render's
        // midnight clock, on a 24-hour dial (neither AM nor PM set).
        v[PlayUntilOn] = 1;
        v[Alarm_AM] = 0;
        v[Alarm_PM] = 0;
        v[Alarm_Hr] = o.StopAfter / 60;
        v[Alarm_Min] = o.StopAfter % 60;
        // The stop rule ends the render after the block whose index is
        // floor(minutes * 351.5625), counting from the first block's index
        // (an index past the cycle starts over at 0).
        const int64_t first = o.StartIndex > LastBlockIndex ? 0 : o.StartIndex;
        const int64_t untilStop = static_cast<int64_t>(o.StopAfter * 351.5625) + 1 - first;
        const int64_t blocks = untilStop < 1 ? 0 : untilStop;
        if (lengthOption == nullptr || blocks < o.Blocks) {
            o.Blocks = blocks;
            lengthOption = "--stop-after";
        }
    }
    if (o.Out != "-" && o.Blocks > MaxWavBlocks)
        return Fail(lengthOption ? lengthOption : "--blocks",
                    "a WAV file holds at most 131071 blocks (6.2 hours); use --out - for longer");
    return RenderRain(o);
}
