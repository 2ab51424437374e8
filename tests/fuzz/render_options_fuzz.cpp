// Any argument list for the render tool (arguments separated by NUL bytes).
// Bad input gives one line naming an option or argument; accepted input
// leaves every setting in its control's range and a length the tool can write.
#include <cstdlib>
#include <sstream>
#include <string>
#include <vector>
#include "engine/synth_state.h"
#include "tools/render/options.h"

namespace {
bool Within(int32_t v, int32_t low, int32_t high) { return v >= low && v <= high; }
}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* input, size_t size) {
    std::vector<std::string> words{"sombrel-render"};
    std::istringstream in(std::string(reinterpret_cast<const char*>(input), size));
    for (std::string word; std::getline(in, word, '\0');) words.push_back(word);
    std::vector<const char*> argv;
    for (const std::string& w : words) argv.push_back(w.c_str());
    RenderOptions o;
    ControlRecord s;
    SetControlStartValues(&s);
    std::string error;
    if (!ParseRenderOptions(static_cast<int>(argv.size()), argv.data(), &o, &s, &error)) {
        if (error.empty() || error.find('\n') != std::string::npos) std::abort();
        return 0;
    }
    if (o.Help) return 0;
    const int32_t* v = s.Value;
    bool ok = Within(v[Profile], ProfileWhite, ProfileDogs) && Within(o.StartIndex, 0, LastBlockIndex + 1) &&
              o.Blocks >= 0 && o.Blocks <= MaxRawBlocks && (o.Out != "" || o.Chime != "") &&
              (o.Out == "" || o.Out == "-" || o.Blocks <= MaxWavBlocks);
    for (int32_t f = Attenuator; f <= EqBandLast; ++f) ok = ok && Within(v[f], SliderMin, SliderMax);
    for (int32_t f = PlayUntilOn; f <= FadeOutOn; ++f) ok = ok && Within(v[f], 0, 1);
    ok = ok && (v[FadeInOn] == 0 || Within(v[FadeInTime], 1, 15)) &&
         (v[FadeOutOn] == 0 || (Within(v[FadeOutTime], 1, 15) && v[PlayUntilOn] == 1)) &&
         (v[PlayUntilOn] == 0 || (Within(v[Alarm_Hr], 0, 23) && Within(v[Alarm_Min], 0, 59)));
    if (!ok) std::abort();
    return 0;
}
