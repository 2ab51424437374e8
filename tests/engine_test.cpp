// The rain engine: the transform against a direct DFT; golden digests of
// fixed settings on both filter paths, the same blocks compared with a plain
// single-precision arrangement (the oracle), the clip and the meter's peaks;
// and the rebuild rules.
#include <gtest/gtest.h>
#include <algorithm>
#include <cmath>
#include <complex>
#include <cstring>
#include <vector>
#include "app/core_state.h"
#include "engine/block.h"
#include "engine/block_filter.h"
#include "engine/fft.h"
#include "engine/generator.h"
#include "engine/shuffle.h"
#include "timers/timer_gains.h"
#include "tests/test_platform.h"

namespace {

void StartPlay() { SetUpTimers(&ControlSettings, &SynthState); PrepareForPlay(&ControlSettings, &SynthState); }
void Block() { ProcessBlock(&ControlSettings, &CachedSettings, &SynthState); }
// A fixed pseudo-random value in [-1, 1): no test depends on luck.
float Noise(uint32_t* x) { *x = *x * 1664525u + 1013904223u; return static_cast<float>((*x >> 8) * (1.0 / 8388608.0) - 1.0); }

}  // namespace

TEST(Fft, BothDirectionsMatchADirectDftAtEveryOrder) {
    // Single-precision radix-2 errs about log2(N) roundings of the signal's
    // norm; 2e-7 log2(N) of it leaves a margin of ~10x and still catches a
    // wrong twiddle, sign or scale, which errs by the norm itself.
    for (int32_t order : {1, 3, 7, 10, 14, 3}) {  // 3 again: the tables are made per order
        const int32_t n = 1 << order;
        std::vector<float> re(n), im(n);
        uint32_t seed = 17u + order;
        double norm = 0.0;  // the signal's squared norm
        for (int32_t i = 0; i < n; ++i) re[i] = Noise(&seed), im[i] = Noise(&seed), norm += re[i] * re[i] + im[i] * im[i];
        for (double sign : {-1.0, 1.0}) {
            std::vector<float> r = re, m = im;
            (sign < 0 ? FftForward : FftInverse)(r.data(), m.data(), order);
            const double scale = sign < 0 ? 1.0 : 1.0 / n;
            for (int32_t k = 0; k < n; k += order <= 10 ? 1 : 251) {
                std::complex<double> sum = 0.0;
                for (int32_t i = 0; i < n; ++i)
                    sum += std::complex<double>(re[i], im[i]) * std::polar(1.0, sign * 2 * 3.14159265358979323846 * ((int64_t(i) * k) % n) / n);
                ASSERT_LE(std::abs(std::complex<double>(r[k], m[k]) - sum * scale), 2e-7 * order * std::sqrt(norm) * scale)
                    << (sign < 0 ? "forward" : "inverse") << " order " << order << " bin " << k << ": " << r[k] << ", " << m[k] << " for " << sum * scale;
            }
        }
    }
}

TEST(ProcessBlock, RebuildsOnlyWhatChanged) {
    const float poison = -12345.0f;  // a value no builder writes
    float* marked[] = {&SynthState.ProfileResponse[100], &SynthState.BassResponse[100], &SynthState.SubBassResponse[20],
                       &SynthState.TrebleResponse[1000], &SynthState.EqResponse[100], &SynthState.TotalResponse[3], &SynthState.DropTable[0]};
    const struct { int32_t Field, Value; const char* Rebuilt; } steps[] = {  // which marks a change takes away (p b s t e T d)
        {-1, 0, "......."}, {Bass, 128, "......."}, {Treble, 1, "...t.T."}, {Bass, 1, ".b...T."}, {SubBass, 1, "..s..T."},
        {Profile, 107, "p....T."}, {EqBandFirst + 3, 1, "....eT."}, {Attenuator, 200, "......d"}, {Hardness, 30, "......d"}};
    ResetProgramState();
    StartPlay();
    Block();
    for (const auto& s : steps) {
        for (float* m : marked) *m = poison;
        if (s.Field >= 0) ControlSettings.Value[s.Field] = s.Value;
        if (s.Field >= EqBandFirst && s.Field <= EqBandLast) EqChanged = 1;
        Block();
        std::string rebuilt;
        for (int32_t i = 0; i < 7; ++i) rebuilt += *marked[i] == poison ? '.' : "pbsteTd"[i];
        EXPECT_EQ(rebuilt, s.Rebuilt) << "after field " << s.Field << " = " << s.Value;
    }
    EXPECT_TRUE(EqChanged == 0 && SynthState.TotalResponse[5] == 1e-22f && SynthState.TotalResponse[6826] == 1e-22f)
        << "1e-22 outside the band, not " << SynthState.TotalResponse[5] << " and " << SynthState.TotalResponse[6826];
}

// Fixed settings whose sound the test below pins. JumpTo, when not 0,
// is the block index given after block 0 (the wrap at 524289, or many set
// bits of the index).
struct GoldenCase {
    const char* Name;
    void (*Set)();         // the settings, from the start values
    int32_t JumpTo;
    uint64_t Digest;       // FNV-1a of the first 12 blocks' PCM bytes
    double MinIdentical;   // share of samples equal to the oracle's, see below
};
const GoldenCase GoldenCases[] = {
    {"start values", [] {}, 0, 0x22fd8e0ca7e2c967ull, 0.999},
    // Stored values no control holds: the first block still builds every
    // curve and the drop table (a zeroed cache would match them).
    {"damaged: 0s and profile 0", [] { for (int32_t f : {Attenuator, Hardness, Bass, SubBass, Treble, Profile}) ControlSettings.Value[f] = 0; }, 0, 0x1f3ed52f0753fe7aull, 0.999},
    // Full volume: the oracle's own float rounding is ten times larger in
    // LSB, so ~0.16 % of its samples sit on the other side of an integer
    // (the same arrangement computed in double differs as much).
    {"white, volume 255", [] { ControlSettings.Value[Profile] = ProfileWhite; ControlSettings.Value[Attenuator] = 255; }, 0, 0x44d28973ee252f02ull, 0.998},
    {"volume and hardness 255: clipped", [] { ControlSettings.Value[Attenuator] = 255; ControlSettings.Value[Hardness] = 255; }, 0, 0xe565d79ac0e060ecull, 0.998},
    {"brown, hardness 1, bass 255", [] { ControlSettings.Value[Profile] = ProfileBrown; ControlSettings.Value[Hardness] = 1; ControlSettings.Value[Bass] = 255; }, 524280, 0x2b8620eed51127c3ull, 0.999},
    {"dogs, treble 1, sub bass 200, band 17 at 1", [] { ControlSettings.Value[Profile] = ProfileDogs; ControlSettings.Value[Treble] = 1; ControlSettings.Value[SubBass] = 200; ControlSettings.Value[EqBandFirst + 17] = 1; }, 262000, 0xba343595ec22c5a2ull, 0.999},
    {"music, fade in 1", [] { ControlSettings.Value[Profile] = ProfileMusic; ControlSettings.Value[FadeInOn] = 1; ControlSettings.Value[FadeInTime] = 1; }, 0, 0xa23b6354096f8f13ull, 0.999},
    {"traffic, fade out 1 to a stop 1 minute ahead", [] { ControlSettings.Value[Profile] = ProfileTraffic; ControlSettings.Value[PlayUntilOn] = 1; ControlSettings.Value[FadeOutOn] = 1; ControlSettings.Value[FadeOutTime] = 1; ControlSettings.Value[Alarm_Hr] = 0; ControlSettings.Value[Alarm_Min] = 1; ControlSettings.Value[Alarm_AM] = 0; ControlSettings.Value[Alarm_PM] = 0; }, 0, 0x3c6d54fdf20aed5dull, 0.999},
};

// The block path in its plainest form, kept as the oracle: the excitation
// table by table, the 16384-point float transform pair, a pow per frame for
// each ramp. It reads the drop table and the response that ProcessBlock
// built for the same block, and keeps its own overlap and ramp counts.
struct Oracle {
    float Direct[BlockFrames], Reversed[BlockFrames], Re[FrameLength], Im[FrameLength], Overlap[2][20480];
    int64_t Ramp, FadeIn, FadeOut;
} Described;

template <typename Exponent>
void OracleRamp(int64_t* count, int64_t limit, Exponent x) {
    for (int i = 0; i < BlockFrames; ++i) {
        if (*count < limit) *count += 1;
        const double g = std::pow(10.0, x(*count));
        Described.Direct[i] = static_cast<float>(g * Described.Direct[i]);
        Described.Reversed[i] = static_cast<float>(g * Described.Reversed[i]);
    }
}

void OracleBlock(int32_t index, int16_t* pcm) {
    Oracle& o = Described;
    const SynthRecord& s = SynthState;
    std::copy_n(s.DropTable, BlockFrames, o.Direct);
    ShuffleExcitation(o.Direct, &index);
    std::fill_n(o.Re, FrameLength, 0.0f), std::fill_n(o.Im, FrameLength, 0.0f);
    std::copy_n(o.Direct, BlockFrames, o.Re + 4096);
    FftForward(o.Re, o.Im, FftOrder);
    for (int k = 0; k < FrameLength; ++k) o.Re[k] *= s.TotalResponse[k], o.Im[k] *= s.TotalResponse[k];
    FftInverse(o.Re, o.Im, FftOrder);
    for (int k = 0; k < FrameLength; ++k) o.Re[k] *= SynthesisWindow[k];
    if (index == 0) std::fill_n(&o.Overlap[0][0], 2 * 20480, 0.0f);
    for (int k = index == 0 ? 4096 : 0; k < FrameLength; ++k) {
        o.Overlap[0][k + (index == 0 ? -4096 : 4096)] += o.Re[k];
        o.Overlap[1][k + (index == 0 ? -4096 : 4096)] += o.Re[(FrameLength - k) % FrameLength];
    }
    std::copy_n(o.Overlap[0], BlockFrames, o.Direct), std::copy_n(o.Overlap[1], BlockFrames, o.Reversed);
    for (float* a : {o.Overlap[0], o.Overlap[1]})
        if (index != 0) std::copy_n(a + 8192, 12288, a), std::fill_n(a + 12288, 8192, 0.0f);
    const int32_t* v = ControlSettings.Value;
    const double depth = s.RampDepthDb, ramp = s.StartRampSlopeDb, in = s.FadeInSlopeDb, out = s.FadeOutSlopeDb;
    if (index <= 1 && o.Ramp < StartRampFrames) OracleRamp(&o.Ramp, INT64_MAX, [&](int64_t n) { return (n * ramp - depth) * 0.05; });
    if (v[FadeInOn] == 1 && o.FadeIn < s.FadeInLength) OracleRamp(&o.FadeIn, INT64_MAX, [&](int64_t n) { return (n * in - depth) * 0.05; });
    if (v[FadeOutOn] == 1 && index > s.FadeOutStartBlock) OracleRamp(&o.FadeOut, s.FadeOutLength, [&](int64_t n) { return n * out * 0.05; });
    ClipAndConvert(o.Direct, o.Reversed, pcm);
}

TEST(ProcessBlock, FixedSettingsGiveTheirGoldenDigestsOnBothFilterPathsMatchTheOracleAndMeterTheirPeaks) {
    // The digests of the first 12 blocks pin the whole engine, on the filter
    // path this processor takes and on the baseline one; the Windows build
    // runs the same test, so its blocks must be identical. Over 200 blocks
    // the real-input double route, the composed shuffle and the geometric
    // ramps may differ from the oracle only where rounding puts a sample on
    // the other side of an integer: by 1 LSB, in at most 0.1 % of samples.
    std::printf("FilterFrame: %s\n", FilterUsesAvx2() ? "the AVX2 path and the baseline" : "no AVX2 here, the baseline only");
    std::vector<int16_t> expected(BlockFrames * 2);
    for (bool baseline : {false, true})
        for (const GoldenCase& c : GoldenCases) {
            ForceBaselineFilter(baseline);
            ResetProgramState(), c.Set(), StartPlay();  // Play with the case's settings
            Described.Ramp = Described.FadeIn = Described.FadeOut = 0;
            const int32_t blocks = baseline ? 12 : 200;
            uint64_t h = 1469598103934665603ull;
            int64_t identical = 0;
            int32_t worst = 0, clipped = 0;
            for (int32_t b = 0; b < blocks; ++b) {
                if (b == 1 && c.JumpTo != 0) SynthState.BlockIndex = c.JumpTo;
                const int32_t index = SynthState.BlockIndex;
                Block();
                if (!baseline) OracleBlock(index, expected.data());
                int32_t peak[2] = {0, 0};  // left, right
                for (int32_t i = 0; i < BlockFrames * 2; ++i) {
                    const int16_t got = SynthState.PcmBlock[i];
                    const uint16_t bytes = static_cast<uint16_t>(got);
                    const int32_t d = baseline ? 0 : std::abs(expected[i] - got);
                    identical += d == 0, worst = std::max(worst, d);
                    peak[i % 2] = std::max(peak[i % 2], std::abs(int32_t{got}));
                    if (b < 12) h = (h ^ (bytes & 0xFF)) * 1099511628211ull, h = (h ^ (bytes >> 8)) * 1099511628211ull;
                }
                // The meter gets each channel's peak before the clip at 32000, once a block.
                const int32_t meter[2] = {Platform.PeakLeft, Platform.PeakRight};
                for (int32_t ch = 0; ch < 2; ++ch) {
                    clipped += meter[ch] > 32000;
                    ASSERT_TRUE((peak[ch] < 32000 ? meter[ch] == peak[ch] : peak[ch] == 32000 && meter[ch] >= 32000) && Platform.PeakUpdates == b + 1)
                        << c.Name << ", block " << b << (ch ? ", right" : ", left") << ": " << peak[ch] << " played, " << meter[ch] << " metered, "
                        << Platform.PeakUpdates << " meter updates";
                }
            }
            const double share = static_cast<double>(identical) / (blocks * BlockFrames * 2);
            EXPECT_EQ(h, c.Digest) << c.Name << (baseline ? ", baseline filter" : "") << ": digest 0x" << std::hex << h;
            EXPECT_TRUE(std::strstr(c.Name, "clipped") == nullptr || clipped > 0) << c.Name << ": the clip is never reached";
            EXPECT_TRUE(worst <= 1 && share >= c.MinIdentical) << c.Name << ": " << share << " identical to the oracle, max " << worst << " LSB";
            if (!baseline) std::printf("%-48s %.4f %% identical, max %d LSB\n", c.Name, 100.0 * share, worst);
        }
    ForceBaselineFilter(false);
}
