// tools/render/options.h: the render tool's command line, read into the
// settings it renders with. Free of any output, so that any argument list
// (also a hostile one) can be parsed and checked without rendering.
#pragma once
#include <cstdint>
#include <string>
#include "app/control_settings.h"

constexpr int32_t MaxWavBlocks = 131071;        // keeps the RIFF sizes below 4 GiB
constexpr int64_t MaxRawBlocks = 1000000000;    // a limit only against typing mistakes

struct RenderOptions {
    std::string Out;          // WAV file, "-" for raw PCM on standard output, "" for none
    std::string Curves;       // CSV file of the response curves, "" for none
    std::string Chime;        // WAV file of the alarm chime, "" for none
    int64_t Blocks = 30;      // blocks to render, 0 when the stop time is at block 0's start
    int32_t StartIndex = 0;   // block index of the first block, 0..524289
    bool Progress = false;    // a progress line on standard error
    bool Help = false;        // --help: print the usage and render nothing
};

// The usage text --help prints.
extern const char RenderUsage[];

// Reads argv[1..argc-1] into *options and *settings (which the caller has
// set to the control start values). On bad input returns false with *error
// set to one line naming the option ("--volume: '0' is not a slider value
// 1..255"); the caller then writes no file. On success every setting lies in
// its control's range, a stop time is set as the program holds it (a 24-hour
// time past the render's midnight clock) and Blocks ends where it stops.
bool ParseRenderOptions(int argc, const char* const* argv, RenderOptions* options,
                        ControlRecord* settings, std::string* error);
