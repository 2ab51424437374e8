// sombrel-render: renders what Play sends to the sound card, block by block
// from block 0, as a WAV file (48 000 Hz, 16-bit, two channels) or as raw
// PCM on standard output. The same options always give the same bytes.
#include <cerrno>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string>
#include <sys/stat.h>

#ifdef _WIN32
#include <fcntl.h>
#include <io.h>
#endif

#include "app/core_state.h"
#include "engine/block.h"
#include "timers/chime.h"
#include "timers/timer_gains.h"
#include "tools/render/options.h"
#include "tools/render/render.h"

namespace {

int Fail(const char* option, const std::string& why) {
    std::fprintf(stderr, "sombrel-render: %s: %s\n", option, why.c_str());
    return 2;
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

// A file is written under a temporary name and put in place at the end, so
// a failed write leaves no partial file behind. Something under the name
// that is not a regular file (/dev/null, a pipe, Windows' NUL) is written to
// directly: removing it or renaming over it would destroy it.
FILE* OpenOutput(const std::string& path, std::string* partial) {
    struct stat st;
    const bool special = stat(path.c_str(), &st) == 0 && !S_ISREG(st.st_mode);
    *partial = special ? "" : path + ".partial";
    return std::fopen(special ? path.c_str() : partial->c_str(), "wb");
}

// Closes the output and, when everything was written, puts it in place;
// otherwise removes what was written under the temporary name.
bool FinishOutput(FILE* f, const std::string& path, const std::string& partial, bool ok) {
    ok = (std::fclose(f) == 0) && ok;
    if (partial.empty()) return ok;
    if (ok) {
        std::remove(path.c_str());  // rename does not replace a file on Windows
        ok = std::rename(partial.c_str(), path.c_str()) == 0;
    }
    if (!ok) std::remove(partial.c_str());
    return ok;
}

// The chime as the program queues it.
bool WriteChime(const std::string& path) {
    std::string partial;
    FILE* f = OpenOutput(path, &partial);
    if (!f) return false;
    static unsigned char bytes[ChimeBufferFrames * 4];
    unsigned char header[44];
    MakeWavHeader(header, ChimeFrames * 4);
    bool ok = std::fwrite(header, 1, sizeof header, f) == sizeof header;
    for (int32_t b = 0; b < ChimeBufferCount && ok; ++b) {
        PutBlock(ChimePcm + 2 * ChimeBufferFrames * b, bytes);
        ok = std::fwrite(bytes, 1, sizeof bytes, f) == sizeof bytes;
    }
    return FinishOutput(f, path, partial, ok);
}

// Renders the rain into o.Out (a WAV file, or raw PCM on standard output).
int RenderRain(const RenderOptions& o) {
    const bool raw = o.Out == "-";
    std::string partial;
    FILE* out = nullptr;
    if (raw) {
#ifdef _WIN32
        _setmode(_fileno(stdout), _O_BINARY);
#endif
        out = stdout;
    } else {
        out = OpenOutput(o.Out, &partial);
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
            if (!raw) FinishOutput(out, o.Out, partial, false);
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
    if (!raw && !FinishOutput(out, o.Out, partial, ok)) return Fail("--out", "cannot write " + o.Out);
    if (!ok) return Fail("--out", "cannot write to standard output");
    return 0;
}

}  // namespace

int main(int argc, char** argv) {
    RenderOptions o;
    SetControlStartValues(&ControlSettings);
    std::string error;
    if (!ParseRenderOptions(argc, argv, &o, &ControlSettings, &error)) {
        std::fprintf(stderr, "sombrel-render: %s\n", error.c_str());
        return 2;
    }
    if (o.Help) {
        std::fputs(RenderUsage, stdout);
        return 0;
    }
    if (!o.Chime.empty()) {
        MakeChime(ControlSettings.Value[Attenuator]);
        if (!WriteChime(o.Chime)) return Fail("--chime", "cannot write " + o.Chime);
    }
    if (o.Out.empty()) return 0;
    return RenderRain(o);
}
