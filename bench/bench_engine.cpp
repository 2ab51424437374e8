// Engine benchmarks. A block lasts 170.67 ms of sound; the real-time factor
// reported is that period divided by the time to make one block.
#include <benchmark/benchmark.h>

#include <vector>

#include "app/core_state.h"
#include "engine/block.h"
#include "engine/block_filter.h"
#include "engine/fft.h"
#include "engine/generator.h"
#include "tests/test_platform.h"
#include "timers/chime.h"
#include "timers/timer_gains.h"

namespace {

constexpr double BlockSeconds = 8192.0 / 48000.0;

void StartPlay() {
    ResetProgramState();
    SetUpTimers(&ControlSettings, &SynthState);
    PrepareForPlay(&ControlSettings, &SynthState);
    ProcessBlock(&ControlSettings, &CachedSettings, &SynthState);
    ProcessBlock(&ControlSettings, &CachedSettings, &SynthState);
}

void ReportRealTime(benchmark::State& state) {
    state.counters["realtime_x"] = benchmark::Counter(
        BlockSeconds * static_cast<double>(state.iterations()), benchmark::Counter::kIsRate);
}

void FftPair(benchmark::State& state) {
    std::vector<float> re(16384), im(16384, 0.0f);
    for (int i = 0; i < 16384; ++i) re[i] = static_cast<float>(i % 17) - 8.0f;
    for (auto _ : state) {
        FftForward(re.data(), im.data(), 14);
        FftInverse(re.data(), im.data(), 14);
        benchmark::DoNotOptimize(re.data());
    }
}
BENCHMARK(FftPair)->Unit(benchmark::kMicrosecond);

// The block path's transform pair: the packed 8192-point forward transform,
// the response pass and the inverse into the windowed float frame. Range 1
// forces the SSE2 baseline.
void BlockFilterPair(benchmark::State& state) {
    ResetProgramState();
    std::vector<float> response(16384, 1e-22f), excitation(8192);
    for (int k = 6; k <= 6825; ++k) response[k] = 1.0f;
    for (int i = 0; i < 8192; ++i) excitation[i] = static_cast<float>(i % 17) * 100.0f - 800.0f;
    SetFilterResponse(response.data());
    ForceBaselineFilter(state.range(0) == 1);
    for (auto _ : state) {
        FilterFrame(excitation.data(), SynthesisWindow, FftReal);
        benchmark::DoNotOptimize(FftReal);
    }
    state.SetLabel(FilterUsesAvx2() ? "AVX2" : "SSE2 baseline");
    ForceBaselineFilter(false);
}
BENCHMARK(BlockFilterPair)->DenseRange(0, 1)->Unit(benchmark::kMicrosecond);

// Steady state: no control changed, so only excitation, transforms,
// overlap-add, clip and convert.
void ProcessBlockSteady(benchmark::State& state) {
    StartPlay();
    for (auto _ : state) {
        if (SynthState.BlockIndex > 100000) SynthState.BlockIndex = 2;
        ProcessBlock(&ControlSettings, &CachedSettings, &SynthState);
        benchmark::DoNotOptimize(SynthState.PcmBlock);
    }
    ReportRealTime(state);
}
BENCHMARK(ProcessBlockSteady)->Unit(benchmark::kMicrosecond);

// A block after a control change, one benchmark per kind of rebuild.
void ProcessBlockAfterChange(benchmark::State& state) {
    StartPlay();
    const int kind = static_cast<int>(state.range(0));
    int32_t flip = 0;
    for (auto _ : state) {
        flip ^= 1;
        int32_t* v = ControlSettings.Value;
        switch (kind) {
        case 0: v[Attenuator] = 120 + flip; break;
        case 1: v[Bass] = 120 + flip; break;
        case 2: v[Treble] = 120 + flip; break;
        case 3: v[EqBandFirst + 7] = 120 + flip; EqChanged = 1; break;
        case 4: v[Profile] = flip ? ProfileMusic : ProfileTraffic; break;
        case 5: v[Profile] = flip ? ProfilePink : ProfileBrown; break;
        }
        if (SynthState.BlockIndex > 100000) SynthState.BlockIndex = 2;
        ProcessBlock(&ControlSettings, &CachedSettings, &SynthState);
        benchmark::DoNotOptimize(SynthState.PcmBlock);
    }
    static const char* const names[] = {"volume (drop table)", "bass", "treble", "equaliser band",
                                        "masking profile (6 sections)", "colour"};
    state.SetLabel(names[kind]);
    ReportRealTime(state);
}
BENCHMARK(ProcessBlockAfterChange)->DenseRange(0, 5)->Unit(benchmark::kMicrosecond);

// The gain stage with the start ramp, the fade-in and the fade-out all
// running.
void ApplyTimerGainsAllRamps(benchmark::State& state) {
    ResetProgramState();
    ControlSettings.Value[FadeInOn] = 1;
    ControlSettings.Value[FadeOutOn] = 1;
    SynthState.FadeInLength = 1LL << 40;
    SynthState.FadeInSlopeDb = 1e-9f;
    SynthState.FadeOutLength = 1LL << 40;
    SynthState.FadeOutSlopeDb = -1e-9f;
    SynthState.FadeOutStartBlock = -1;
    std::vector<float> direct(8192, 1000.0f), reversed(8192, -1000.0f);
    for (auto _ : state) {
        SynthState.StartRampCount = 0;
        ApplyTimerGains(direct.data(), reversed.data(), 0);
        benchmark::DoNotOptimize(direct.data());
    }
}
BENCHMARK(ApplyTimerGainsAllRamps)->Unit(benchmark::kMicrosecond);

void ApplyTimerGainsIdle(benchmark::State& state) {
    ResetProgramState();
    SynthState.StartRampCount = StartRampFrames;
    std::vector<float> direct(8192, 1000.0f), reversed(8192, -1000.0f);
    for (auto _ : state) {
        ApplyTimerGains(direct.data(), reversed.data(), 5);
        benchmark::DoNotOptimize(direct.data());
    }
}
BENCHMARK(ApplyTimerGainsIdle)->Unit(benchmark::kMicrosecond);

// The whole chime: partials, 32 partials of 262144 frames, scaling and
// conversion.
void ChimeSynthesis(benchmark::State& state) {
    for (auto _ : state) benchmark::DoNotOptimize(MakeChime(200));
}
BENCHMARK(ChimeSynthesis)->Unit(benchmark::kMillisecond);

}  // namespace

BENCHMARK_MAIN();
