// The render tool's command line: what each option sets, and bad input
// refused with one line that names the option.
#include <gtest/gtest.h>
#include <cstring>
#include <string>
#include <vector>
#include "tools/render/options.h"

namespace {
const std::string Flat = "128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128,128";

RenderOptions o;  // what the last Parse set
ControlRecord s;

// Parses "--out a.wav" and `args` into o and s; the error, "" when they were taken.
std::string Parse(std::vector<std::string> args, bool out = true) {
    if (out) args.insert(args.begin(), {"--out", "a.wav"});
    args.insert(args.begin(), "sombrel-render");
    std::vector<const char*> argv;
    for (const std::string& a : args) argv.push_back(a.c_str());
    o = RenderOptions();
    SetControlStartValues(&s);
    std::string error;
    return ParseRenderOptions(static_cast<int>(argv.size()), argv.data(), &o, &s, &error) ? "" : error;
}
}  // namespace

TEST(RenderOptions, BadInputIsRefusedNamingTheOption) {
    const std::vector<std::string> cases[] = {  // the error names the first argument
        {"--volume", "0"}, {"--hardness", "256"}, {"--bass", "12x"}, {"--treble"}, {"--sub-bass", ""}, {"--profile", "purple"},
        {"--profile", "99"}, {"--profile", "108"}, {"--eq", "1,2,3"}, {"--eq", Flat + ",128"}, {"--eq", "0" + Flat.substr(3)},
        {"--eq", Flat.substr(0, 120) + ","}, {"--fade-in", "16"}, {"--fade-in", "0"}, {"--fade-out", "5"}, {"--stop-after", "1440"},
        {"--stop-after", "-1"}, {"--blocks", "0"}, {"--blocks", "131072"}, {"--seconds", "22369.9"}, {"--stop-after", "1439"},
        {"--seconds", "-1"}, {"--seconds", "1x"}, {"--start-index", "524290"}, {"--frobnicate", "3"}, {"stray"}, {"--out", ""},
        {"--curves", ""}, {"--volume", "2\n1"}};
    for (const auto& c : cases) {
        const std::string error = Parse(c);
        EXPECT_TRUE(error.compare(0, c[0].size(), c[0]) == 0 && error.find('\n') == std::string::npos)
            << c[0] << " " << (c.size() > 1 ? c[1] : "") << ": " << error;
    }
    EXPECT_EQ(Parse({"--stop-after", "1440"}), "--stop-after: '1440' is not 0..1439 minutes");
    EXPECT_EQ(Parse({}, false), "--out: is required (see --help)");
    EXPECT_EQ(Parse({"--out", "-", "--seconds", "30000"}, false), "") << "no WAV limit on standard output";
}

TEST(RenderOptions, GoodInputSetsTheControlsAndTheLength) {
    ASSERT_EQ(Parse({}), "");
    EXPECT_TRUE(o.Blocks == 30 && o.StartIndex == 0 && s.Value[Profile] == 104 && s.Value[PlayUntilOn] == 0);
    ASSERT_EQ(Parse({"--volume", "1", "--hardness", "255", "--bass", "2", "--sub-bass", "3", "--treble", "4", "--profile", "dogs",
                     "--eq", "1" + Flat.substr(3), "--fade-in", "15", "--seconds", "1"}), "");
    EXPECT_EQ(std::vector<int32_t>(s.Value, s.Value + 6), (std::vector<int32_t>{1, 255, 2, 3, 4, 1}));
    EXPECT_TRUE(s.Value[Profile] == 107 && s.Value[EqBandFirst + 1] == 128 && s.Value[FadeInOn] == 1 && s.Value[FadeInTime] == 15);
    EXPECT_EQ(o.Blocks, 6) << "--seconds 1: whole blocks, rounded up";
    const struct { std::vector<std::string> Args; int64_t Blocks; int32_t Profile; } lengths[] = {
        {{"--seconds", "0.3413", "--profile", "traffic"}, 2, 106}, {{"--stop-after", "1"}, 352, 104},
        {{"--stop-after", "2", "--fade-out", "1", "--profile", "100"}, 704, 100}, {{"--stop-after", "0", "--blocks", "10"}, 1, 104},
        {{"--stop-after", "2", "--start-index", "524289"}, 704, 104}, {{"--blocks", "800", "--stop-after", "2"}, 704, 104},
        {{"--blocks", "5", "--stop-after", "2"}, 5, 104}, {{"--blocks", "131071"}, 131071, 104}};
    for (const auto& l : lengths) {
        ASSERT_EQ(Parse(l.Args), "") << l.Args[0] << " " << l.Args[1];
        EXPECT_TRUE(o.Blocks == l.Blocks && s.Value[Profile] == l.Profile) << l.Args[0] << " " << l.Args[1] << ": " << o.Blocks << " blocks";
    }
    ASSERT_EQ(Parse({"--stop-after", "61", "--fade-out", "15"}), "");
    EXPECT_EQ(std::vector<int32_t>(s.Value + PlayUntilOn, s.Value + ControlFieldCount), (std::vector<int32_t>{1, 0, 0, 0, 0, 1, 104, 1, 1, 0, 15}))
        << "a stop time 61 minutes past the render's midnight, on a 24-hour dial";
    ASSERT_EQ(Parse({"--chime", "c.wav"}, false), "");
    EXPECT_TRUE(o.Out.empty() && o.Chime == "c.wav");
}
