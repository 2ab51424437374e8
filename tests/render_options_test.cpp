// The render tool's command line: what each option sets, and bad input
// refused with one line that names the option.
#include <gtest/gtest.h>
#include <cstring>
#include <string>
#include <vector>
#include "tools/render/options.h"

namespace {
const std::string Flat = "128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128";

// Parses "--out a.wav" and `args`; the error, "" when they were taken.
std::string Parse(std::vector<std::string> args, RenderOptions* o, ControlRecord* s, bool out = true) {
    if (out) args.insert(args.begin(), {"--out", "a.wav"});
    args.insert(args.begin(), "sombrel-render");
    std::vector<const char*> argv;
    for (const std::string& a : args) argv.push_back(a.c_str());
    *o = RenderOptions();
    SetControlStartValues(s);
    std::string error;
    return ParseRenderOptions(static_cast<int>(argv.size()), argv.data(), o, s, &error) ? "" : error;
}
}  // namespace

TEST(RenderOptions, BadInputIsRefusedNamingTheOption) {
    const struct { std::vector<std::string> Args; const char* Named; } cases[] = {
        {{"--volume", "0"}, "--volume"}, {{"--hardness", "256"}, "--hardness"}, {{"--bass", "12x"}, "--bass"},
        {{"--treble"}, "--treble"}, {{"--sub-bass", ""}, "--sub-bass"}, {{"--profile", "purple"}, "--profile"},
        {{"--profile", "99"}, "--profile"}, {{"--profile", "108"}, "--profile"}, {{"--eq", "1,2,3"}, "--eq"},
        {{"--eq", Flat + ",128"}, "--eq"}, {{"--eq", "0" + Flat.substr(3)}, "--eq"}, {{"--eq", Flat.substr(0, 120) + ","}, "--eq"},
        {{"--fade-in", "16"}, "--fade-in"}, {{"--fade-in", "0"}, "--fade-in"}, {{"--fade-out", "5"}, "--fade-out"},
        {{"--stop-after", "1440"}, "--stop-after: '1440' is not 0..1439 minutes"}, {{"--stop-after", "-1"}, "--stop-after"}, {{"--blocks", "0"}, "--blocks"},
        {{"--blocks", "131072"}, "--blocks"}, {{"--seconds", "22369.9"}, "--seconds"}, {{"--stop-after", "1439"}, "--stop-after"},
        {{"--seconds", "-1"}, "--seconds"}, {{"--seconds", "1x"}, "--seconds"}, {{"--start-index", "524290"}, "--start-index"},
        {{"--frobnicate", "3"}, "--frobnicate"}, {{"stray"}, "stray"}, {{"--out", ""}, "--out"}, {{"--curves", ""}, "--curves"},
        {{"--volume", "2\n1"}, "--volume"}};
    for (const auto& c : cases) {
        RenderOptions o;
        ControlRecord s;
        const std::string error = Parse(c.Args, &o, &s);
        EXPECT_EQ(error.substr(0, std::strlen(c.Named)), c.Named) << c.Args[0] << " " << (c.Args.size() > 1 ? c.Args[1] : "") << ": " << error;
        EXPECT_EQ(error.find('\n'), std::string::npos) << error;
    }
    RenderOptions o;
    ControlRecord s;
    EXPECT_EQ(Parse({}, &o, &s, false), "--out: is required (see --help)");
    EXPECT_EQ(Parse({"--out", "-", "--seconds", "30000"}, &o, &s, false), "") << "no WAV limit on standard output";
}

TEST(RenderOptions, GoodInputSetsTheControlsAndTheLength) {
    RenderOptions o;
    ControlRecord s;
    ASSERT_EQ(Parse({}, &o, &s), "");
    EXPECT_TRUE(o.Blocks == 30 && o.StartIndex == 0 && s.Value[Profile] == 104 && s.Value[PlayUntilOn] == 0);
    ASSERT_EQ(Parse({"--volume", "1", "--hardness", "255", "--bass", "2", "--sub-bass", "3", "--treble", "4", "--profile", "dogs",
                     "--eq", "1" + Flat.substr(3), "--fade-in", "15", "--seconds", "1"}, &o, &s), "");
    EXPECT_EQ(std::vector<int32_t>(s.Value, s.Value + 6), (std::vector<int32_t>{1, 255, 2, 3, 4, 1}));
    EXPECT_TRUE(s.Value[Profile] == 107 && s.Value[EqBandFirst + 1] == 128 && s.Value[FadeInOn] == 1 && s.Value[FadeInTime] == 15);
    EXPECT_EQ(o.Blocks, 6) << "--seconds 1: whole blocks, rounded up";
    const struct { std::vector<std::string> Args; int64_t Blocks; int32_t Profile; } lengths[] = {
        {{"--seconds", "0.3413", "--profile", "traffic"}, 2, 106}, {{"--stop-after", "1"}, 352, 104},
        {{"--stop-after", "2", "--fade-out", "1", "--profile", "100"}, 704, 100}, {{"--stop-after", "0", "--blocks", "10"}, 1, 104},
        {{"--stop-after", "2", "--start-index", "524289"}, 704, 104}, {{"--blocks", "800", "--stop-after", "2"}, 704, 104},
        {{"--blocks", "5", "--stop-after", "2"}, 5, 104}, {{"--blocks", "131071"}, 131071, 104}};
    for (const auto& l : lengths) {
        ASSERT_EQ(Parse(l.Args, &o, &s), "") << l.Args[0] << " " << l.Args[1];
        EXPECT_TRUE(o.Blocks == l.Blocks && s.Value[Profile] == l.Profile) << l.Args[0] << " " << l.Args[1] << ": " << o.Blocks << " blocks";
    }
    ASSERT_EQ(Parse({"--stop-after", "61", "--fade-out", "15"}, &o, &s), "");
    EXPECT_EQ(std::vector<int32_t>(s.Value + PlayUntilOn, s.Value + ControlFieldCount), (std::vector<int32_t>{1, 0, 0, 0, 0, 1, 104, 1, 1, 0, 15}))
        << "a stop time 61 minutes past the render's midnight, on a 24-hour dial";
    ASSERT_EQ(Parse({"--chime", "c.wav"}, &o, &s, false), "");
    EXPECT_TRUE(o.Out.empty() && o.Chime == "c.wav");
}
