// The permutation tables and the per-block excitation shuffle.
#include <gtest/gtest.h>

#include <vector>

#include "engine/shuffle.h"

namespace {

std::vector<float> Ramp() {
    std::vector<float> v(BlockFrames);
    for (int i = 0; i < BlockFrames; ++i) v[i] = static_cast<float>(i);
    return v;
}

// The shuffle by hand: value at i moves to table[i].
std::vector<float> Apply(const std::vector<float>& v, int table) {
    std::vector<float> out(BlockFrames);
    for (int i = 0; i < BlockFrames; ++i) out[PermutationTable[table][i]] = v[i];
    return out;
}

std::vector<float> Signed(std::vector<float> v) {
    for (float& x : v)
        if ((static_cast<int32_t>(x) & 1) == 0) x = -x;
    return v;
}

// Large odd and even magnitudes, so that a wrong order shows and the sign
// rule has both cases.
std::vector<float> Excitation() {
    std::vector<float> v(BlockFrames);
    for (int i = 0; i < BlockFrames; ++i) v[i] = 10.25f + i;
    return v;
}

}  // namespace

TEST(PermutationTables, EachIsAPermutationWithAtMostTwoFixedPoints) {
    for (int t = 0; t < PermutationTableCount; ++t) {
        std::vector<int> seen(BlockFrames, 0);
        int fixedPoints = 0;
        for (int i = 0; i < BlockFrames; ++i) {
            const int v = PermutationTable[t][i];
            ASSERT_GE(v, 0) << "table " << t << " entry " << i;
            ASSERT_LT(v, BlockFrames) << "table " << t << " entry " << i;
            seen[v] += 1;
            fixedPoints += v == i;
        }
        for (int v = 0; v < BlockFrames; ++v) ASSERT_EQ(seen[v], 1) << "table " << t << " value " << v;
        EXPECT_LE(fixedPoints, 2) << "table " << t;
    }
}

TEST(PermutationTables, ShippedTablesBeginAndEndAsPublished) {
    const int16_t table0Start[] = {2596, 7722, 3178, 5835, 5656, 1748};
    const int16_t table0End[] = {7656, 5560, 3862};
    const int16_t table1Start[] = {7266, 333, 1711, 5235};
    const int16_t table20Start[] = {2800, 8083, 1342, 6586, 3341, 34};
    for (int i = 0; i < 6; ++i) EXPECT_EQ(PermutationTable[0][i], table0Start[i]) << "table 0 entry " << i;
    for (int i = 0; i < 3; ++i) EXPECT_EQ(PermutationTable[0][8189 + i], table0End[i]) << "table 0 entry " << 8189 + i;
    for (int i = 0; i < 4; ++i) EXPECT_EQ(PermutationTable[1][i], table1Start[i]) << "table 1 entry " << i;
    for (int i = 0; i < 6; ++i) EXPECT_EQ(PermutationTable[20][i], table20Start[i]) << "table 20 entry " << i;
}

TEST(PermutationTables, NoTwoTablesAreAlikeAndNoneIsAShift) {
    // "No visible structure": neither a copy of another table nor i + c.
    for (int a = 0; a < PermutationTableCount; ++a) {
        int shiftLike = 0;
        for (int i = 1; i < BlockFrames; ++i)
            shiftLike += (PermutationTable[a][i] - PermutationTable[a][i - 1] + BlockFrames) % BlockFrames == 1;
        EXPECT_LT(shiftLike, 20) << "table " << a << " has long ascending runs";
        for (int b = a + 1; b < PermutationTableCount; ++b) {
            int same = 0;
            for (int i = 0; i < BlockFrames; ++i) same += PermutationTable[a][i] == PermutationTable[b][i];
            EXPECT_LT(same, 10) << "tables " << a << " and " << b;
        }
    }
}

TEST(PermuteByTable, MovesEachValueToItsTableEntryAndTheInverseUndoesIt) {
    std::vector<float> v = Ramp();
    PermuteByTable(v.data(), PermutationTable[0]);
    for (int i = 0; i < BlockFrames; ++i)
        ASSERT_EQ(v[PermutationTable[0][i]], static_cast<float>(i)) << "value " << i << " moved to table[i]";
    std::vector<int16_t> inverse(BlockFrames);
    for (int i = 0; i < BlockFrames; ++i) inverse[PermutationTable[0][i]] = static_cast<int16_t>(i);
    PermuteByTable(v.data(), inverse.data());
    EXPECT_EQ(v, Ramp()) << "table 0 then its inverse";
}

TEST(ShuffleExcitation, BitsOfTheBlockIndexChooseTablesLowBitFirst) {
    struct Case {
        int32_t Index;
        std::vector<int> Tables;  // in the order they apply
    };
    const Case cases[] = {{0, {}}, {5, {20, 18}}, {524288, {1}}, {3, {20, 19}}, {524287, {}}};
    for (const Case& c : cases) {
        std::vector<int> tables = c.Tables;
        if (c.Index == 524287)
            for (int b = 0; b < 19; ++b) tables.push_back(20 - b);
        std::vector<float> expected = Excitation();
        for (int t : tables) expected = Apply(expected, t);
        expected = Signed(expected);
        std::vector<float> v = Excitation();
        int32_t index = c.Index;
        ShuffleExcitation(v.data(), &index);
        EXPECT_EQ(index, c.Index) << "ShuffleExcitation must not change index " << c.Index;
        EXPECT_EQ(v, expected) << "block index " << c.Index;
    }
}

TEST(ShuffleExcitation, IndexPastTheCycleStartsOverAtZero) {
    std::vector<float> first = Excitation(), wrapped = Excitation();
    int32_t zero = 0, past = 524289;
    ShuffleExcitation(first.data(), &zero);
    ShuffleExcitation(wrapped.data(), &past);
    EXPECT_EQ(past, 0) << "ShuffleExcitation(524289) leaves the index at";
    EXPECT_EQ(wrapped, first) << "block 524289 is made as block 0";
}

TEST(ShuffleExcitation, SignFollowsTheParityOfTheIntegerPart) {
    std::vector<float> v(BlockFrames, 1.0f);
    const float in[] = {4.2f, 3.7f, 0.4f, 32766.0f, 32765.5f, 1.0f, 2.0f};
    const float out[] = {-4.2f, 3.7f, -0.4f, -32766.0f, 32765.5f, 1.0f, -2.0f};
    for (int i = 0; i < 7; ++i) v[i] = in[i];
    int32_t index = 0;
    ShuffleExcitation(v.data(), &index);
    for (int i = 0; i < 7; ++i) EXPECT_EQ(v[i], out[i]) << "sign rule on " << in[i];
}

TEST(MakeExcitation, EqualsShuffleExcitationInOrderAndAfterJumps) {
    // The composites kept from block to block must give every index its own
    // order: in sequence (carries through bits 1..9) and after jumps.
    const std::vector<float> drop = Excitation();
    SetExcitationValues(drop.data());
    std::vector<int32_t> indices;
    for (int32_t n = 0; n <= 520; ++n) indices.push_back(n);
    for (int32_t n : {131071, 131072, 5, 524286, 524287, 524288, 524289, 1, 262143, 0}) indices.push_back(n);
    for (int32_t n : indices) {
        std::vector<float> expected = drop, v(BlockFrames);
        int32_t a = n, b = n;
        ShuffleExcitation(expected.data(), &a);
        MakeExcitation(v.data(), &b);
        ASSERT_EQ(b, a) << "index " << n;
        ASSERT_EQ(v, expected) << "index " << n;
    }
}
