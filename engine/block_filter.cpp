// The block filter's tables, its coefficients and the choice of code path.
//
// Twiddles are made from plain IEEE double arithmetic only (a double-double
// Taylor series and rotation, no libm), so the native and the Windows build
// hold the same bits: their libm may differ in the last bit.
#include "engine/block_filter.h"

#include "engine/block_filter_tables.h"

alignas(64) double StageTwiddles[StageTwiddleLength];
alignas(64) double FilterData[2 * PackedLength + FilterImOffset];
alignas(64) double FilterA[PackedLength];
alignas(64) double FilterB[PackedLength];
int32_t FirstChunkPartner[32];

namespace Sse2Filter {
void FilterFrameKernel(const float* excitation, const float* window, float* frame);
}
namespace Avx2Filter {
void FilterFrameKernel(const float* excitation, const float* window, float* frame);
}

namespace {

constexpr int32_t GridLength = 16384;   // angles 2 pi k / 16384
constexpr int32_t OctantLength = 2049;  // k = 0 .. 2048, up to pi / 4

double OctantCos[OctantLength];         // cos(2 pi k / 16384), correctly rounded but for ~1e-28
double OctantSin[OctantLength];
bool TablesMade = false;
int32_t UseAvx2 = -1;                   // -1 until the processor is asked

// Double-double numbers (value = Hi + Lo) from error-free transformations;
// the splitting product stands in for a fused multiply-add, which is not used.
struct Wide {
    double Hi, Lo;
};

Wide QuickTwoSum(double a, double b) {
    const double s = a + b;
    return {s, b - (s - a)};
}

Wide TwoSum(double a, double b) {
    const double s = a + b;
    const double bb = s - a;
    return {s, (a - (s - bb)) + (b - bb)};
}

Wide TwoProduct(double a, double b) {
    const double p = a * b;
    const double ta = 134217729.0 * a, tb = 134217729.0 * b;  // 2^27 + 1: Veltkamp split
    const double ah = ta - (ta - a), al = a - ah, bh = tb - (tb - b), bl = b - bh;
    return {p, ((ah * bh - p) + ah * bl + al * bh) + al * bl};
}

Wide Add(Wide x, Wide y) {
    Wide s = TwoSum(x.Hi, y.Hi);
    const Wide t = TwoSum(x.Lo, y.Lo);
    s = QuickTwoSum(s.Hi, s.Lo + t.Hi);
    return QuickTwoSum(s.Hi, s.Lo + t.Lo);
}

Wide Multiply(Wide x, Wide y) {
    const Wide p = TwoProduct(x.Hi, y.Hi);
    return QuickTwoSum(p.Hi, p.Lo + (x.Hi * y.Lo + x.Lo * y.Hi));
}

Wide Negate(Wide x) { return {-x.Hi, -x.Lo}; }

Wide DivideBy(Wide x, double d) {  // d a small integer
    const double q1 = x.Hi / d;
    const Wide back = TwoProduct(q1, d);
    const double q2 = ((x.Hi - back.Hi) - back.Lo + x.Lo) / d;
    return QuickTwoSum(q1, q2);
}

// cos and sin of 2 pi k / 16384 for k = 0 .. 2048: the Taylor series of the
// first step (pi in double-double, error below 1e-32), then rotation by it.
void MakeOctant() {
    const Wide theta{3.141592653589793116 / 8192, 1.2246467991473532072e-16 / 8192};
    const Wide square = Multiply(theta, theta);
    Wide sinStep = theta, cosStep{1.0, 0.0}, term = theta, cosTerm{1.0, 0.0};
    for (int32_t n = 2; n <= 10; n += 2) {
        cosTerm = Negate(DivideBy(DivideBy(Multiply(cosTerm, square), n - 1), n));
        cosStep = Add(cosStep, cosTerm);
        term = Negate(DivideBy(DivideBy(Multiply(term, square), n), n + 1));
        sinStep = Add(sinStep, term);
    }
    Wide c{1.0, 0.0}, s{0.0, 0.0};
    for (int32_t k = 0; k < OctantLength; ++k) {
        OctantCos[k] = c.Hi + c.Lo;
        OctantSin[k] = s.Hi + s.Lo;
        const Wide nc = Add(Multiply(c, cosStep), Negate(Multiply(s, sinStep)));
        s = Add(Multiply(s, cosStep), Multiply(c, sinStep));
        c = nc;
    }
    OctantCos[0] = 1.0;
    OctantSin[0] = 0.0;
}

// cos and sin of 2 pi k / 16384 for any k, from the octant by exact symmetries.
void GridAngle(int32_t k, double* c, double* s) {
    k &= GridLength - 1;
    const int32_t quadrant = k / 4096, r = k % 4096;
    double x = r <= 2048 ? OctantCos[r] : OctantSin[4096 - r];
    double y = r <= 2048 ? OctantSin[r] : OctantCos[4096 - r];
    for (int32_t i = 0; i < quadrant; ++i) {  // a quarter turn: (x, y) -> (-y, x)
        const double t = x;
        x = -y;
        y = t;
    }
    *c = x;
    *s = y;
}

int32_t ReverseBits13(int32_t v) {
    int32_t r = 0;
    for (int32_t b = 0; b < 13; ++b) r |= ((v >> b) & 1) << (12 - b);
    return r;
}

// Frequency index held at storage position q, and storage position of
// frequency k (see block_filter_tables.h).
int32_t FrequencyAt(int32_t q) { return ReverseBits13((q & ~31) | ((q & 3) << 3) | ((q >> 2) & 7)); }

int32_t PositionOf(int32_t k) {
    const int32_t l = ReverseBits13(k);
    return (l & ~31) | ((l & 7) << 2) | ((l >> 3) & 3);
}

void MakeTables() {
    MakeOctant();
    for (int32_t s = 0; s < 5; ++s) {
        const int32_t q = StageQuarters[s];
        const int32_t step = GridLength / (4 * q);  // W_4q^j is grid angle j * step
        double* t = StageTwiddles + StageOffsets[s];
        for (int32_t m = 1; m <= 3; ++m) {
            for (int32_t j = 0; j < q; ++j) {
                double c, sn;
                GridAngle(m * j * step, &c, &sn);
                // Four lanes of each array side by side: one stream per stage.
                t[6 * (j & ~3) + 8 * (m - 1) + (j & 3)] = c;
                t[6 * (j & ~3) + 8 * (m - 1) + 4 + (j & 3)] = -sn;  // forward: e^(-i angle)
            }
        }
    }
    for (int32_t q = 0; q < 32; ++q) FirstChunkPartner[q] = PositionOf((PackedLength - FrequencyAt(q)) & (PackedLength - 1));
    TablesMade = true;
}

}  // namespace

void SetFilterResponse(const float* response) {
    if (!TablesMade) MakeTables();
    // H[j] = (R[j] + R[-j]) / 2 is the even part that the real output sees;
    // the inverse's 1/16384 is folded in. For the packed transform, with
    // A = H[k], B = H[8192 - k], S = A + B, D = B - A, angle = 2 pi k / 16384:
    //   a_k = S + D sin(angle),  b_k = -D cos(angle).
    auto even = [response](int32_t j) {
        return (static_cast<double>(response[j]) + static_cast<double>(response[(GridLength - j) & (GridLength - 1)])) *
               (1.0 / (2.0 * GridLength));
    };
    for (int32_t q = 0; q < PackedLength; ++q) {
        const int32_t k = FrequencyAt(q);
        const double a = even(k), b = even(PackedLength - k);
        double c, s;
        GridAngle(k, &c, &s);
        FilterA[q] = (a + b) + (b - a) * s;
        FilterB[q] = -((b - a) * c);
    }
}

void FilterFrame(const float* excitation, const float* window, float* frame) {
    if (!TablesMade) MakeTables();
    if (FilterUsesAvx2())
        Avx2Filter::FilterFrameKernel(excitation, window, frame);
    else
        Sse2Filter::FilterFrameKernel(excitation, window, frame);
}

int32_t FilterUsesAvx2() {
    if (UseAvx2 < 0) {
        __builtin_cpu_init();
        UseAvx2 = __builtin_cpu_supports("avx2") ? 1 : 0;
    }
    return UseAvx2;
}

void ForceBaselineFilter(bool baseline) {
    UseAvx2 = -1;
    if (baseline) UseAvx2 = 0;
}
