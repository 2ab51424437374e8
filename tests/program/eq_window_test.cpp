// The equaliser panel from inside the program: the real main window and its
// controls are created in this process (the program's own start-up), driven
// with the messages the controls send, and the band levels, memories,
// readouts and EqChanged are read where the program keeps them.
#include <gtest/gtest.h>
#include <windows.h>

#include <cstdio>
#include <cstring>
#include <string>

#include "app/core_state.h"
#include "app/globals.h"
#include "app/window.h"
#include "engine/block.h"
#include "shaping/eq_response.h"
#include "tests/program/settings_store.h"

namespace {

constexpr int32_t M1 = 1065, M2 = 1066, M3 = 1067, Defeat = 1068, PanelButton = 1055;

std::string Text(HWND control) {
    char text[64] = {};
    GetWindowTextA(control, text, sizeof(text));
    return text;
}

bool Checked(HWND button) { return SendMessageA(button, BM_GETCHECK, 0, 0) == BST_CHECKED; }

// What a band slider sends when the user scrolls it.
void ScrollBand(int32_t band, int32_t request, int32_t thumb = 0) {
    SendMessageA(MainWindow, WM_VSCROLL, MAKEWPARAM(request, thumb),
                 reinterpret_cast<LPARAM>(SliderBars[5 + band]));
}

// What a button sends when the user clicks it.
void Press(int32_t id) {
    SendMessageA(MainWindow, WM_COMMAND, MAKEWPARAM(id, BN_CLICKED),
                 reinterpret_cast<LPARAM>(GetDlgItem(MainWindow, id)));
}

void SetLock(bool on) { SendMessageA(EqLockBox, BM_SETCHECK, on ? BST_CHECKED : BST_UNCHECKED, 0); }

int32_t Level(int32_t band) { return ControlSettings.Value[5 + band]; }
int32_t Thumb(int32_t band) { return GetScrollPos(SliderBars[5 + band], SB_CTL); }

struct Snapshot {
    int32_t Levels[31];
    int32_t Thumbs[31];
    int32_t Memories[93];
    std::string LevelText, FrequencyText;
    int32_t Changed;
};

Snapshot Take() {
    Snapshot s;
    for (int32_t k = 0; k < 31; ++k) {
        s.Levels[k] = Level(k);
        s.Thumbs[k] = Thumb(k);
    }
    std::memcpy(s.Memories, EqMemories, sizeof(s.Memories));
    s.LevelText = Text(EqLevelReadout);
    s.FrequencyText = Text(EqFrequencyReadout);
    s.Changed = EqChanged;
    return s;
}

// Lists every difference between two snapshots, empty when they agree.
std::string Differences(const Snapshot& a, const Snapshot& b) {
    std::string out;
    for (int32_t k = 0; k < 31; ++k) {
        if (a.Levels[k] != b.Levels[k])
            out += " level " + std::to_string(k) + ": " + std::to_string(a.Levels[k]) + " -> " + std::to_string(b.Levels[k]) + ";";
        if (a.Thumbs[k] != b.Thumbs[k])
            out += " thumb " + std::to_string(k) + ": " + std::to_string(a.Thumbs[k]) + " -> " + std::to_string(b.Thumbs[k]) + ";";
    }
    for (int32_t i = 0; i < 93; ++i)
        if (a.Memories[i] != b.Memories[i])
            out += " EqMemories entry " + std::to_string(i) + ": " + std::to_string(a.Memories[i]) + " -> " +
                   std::to_string(b.Memories[i]) + ";";
    if (a.LevelText != b.LevelText) out += " level readout \"" + a.LevelText + "\" -> \"" + b.LevelText + "\";";
    if (a.FrequencyText != b.FrequencyText)
        out += " frequency readout \"" + a.FrequencyText + "\" -> \"" + b.FrequencyText + "\";";
    if (a.Changed != b.Changed)
        out += " EqChanged " + std::to_string(a.Changed) + " -> " + std::to_string(b.Changed) + ";";
    return out;
}

// Every test starts from the start-up state of the panel: flat bands and
// memories, M1 selected, unlocked, empty readouts, nothing to rebuild.
class EqPanel : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_NE(MainWindow, nullptr) << "the program's window was not created";
        SetLock(false);
        for (auto& memory : EqMemories)
            for (int32_t& v : memory) v = 128;
        Press(M1);
        SetWindowTextA(EqLevelReadout, "");
        SetWindowTextA(EqFrequencyReadout, "");
        EqChanged = 0;
    }
};

}  // namespace

TEST_F(EqPanel, StepsStayWithinOneTo255) {
    const struct {
        int32_t Start, Request;
        const char* Name;
        int32_t Expected;
    } cases[] = {{3, SB_LINEUP, "SB_LINEUP", 1},       {20, SB_PAGEUP, "SB_PAGEUP", 1},
                 {240, SB_PAGEDOWN, "SB_PAGEDOWN", 255}, {128, SB_LINEDOWN, "SB_LINEDOWN", 133},
                 {128, SB_PAGEUP, "SB_PAGEUP", 103},    {252, SB_LINEDOWN, "SB_LINEDOWN", 255}};
    for (const auto& c : cases) {
        ScrollBand(4, SB_THUMBPOSITION, c.Start);
        ASSERT_EQ(c.Start, Level(4)) << "WM_VSCROLL(SB_THUMBPOSITION, " << c.Start << ") on band 4";
        ScrollBand(4, c.Request);
        EXPECT_EQ(c.Expected, Level(4)) << "WM_VSCROLL(" << c.Name << ") on band 4 at " << c.Start;
        EXPECT_EQ(c.Expected, Thumb(4)) << "GetScrollPos of band 4 after " << c.Name << " at " << c.Start;
        EXPECT_EQ(c.Expected, EqMemories[0][4]) << "M1 band 4 after " << c.Name << " at " << c.Start;
    }
}

TEST_F(EqPanel, EveryAcceptedMessageSetsEqChangedAlsoEndOfScrolling) {
    ScrollBand(9, SB_THUMBTRACK, 90);
    EXPECT_EQ(1, EqChanged) << "EqChanged after SB_THUMBTRACK";
    EqChanged = 0;
    ScrollBand(9, SB_ENDSCROLL);
    EXPECT_EQ(1, EqChanged) << "EqChanged after SB_ENDSCROLL";
    EXPECT_EQ(90, Level(9)) << "SB_ENDSCROLL changed the level";
}

TEST_F(EqPanel, LockIgnoresEveryScroll) {
    ScrollBand(7, SB_THUMBPOSITION, 100);
    EqChanged = 0;
    SetLock(true);
    const Snapshot before = Take();
    for (int32_t request : {SB_LINEUP, SB_LINEDOWN, SB_PAGEUP, SB_PAGEDOWN, SB_THUMBPOSITION, SB_THUMBTRACK, SB_ENDSCROLL})
        for (int32_t band : {0, 7, 30}) ScrollBand(band, request, 40);
    const std::string changed = Differences(before, Take());
    EXPECT_EQ("", changed) << "WM_VSCROLL with \"EQ Lock\" checked changed:" << changed;
    SetLock(false);
    ScrollBand(7, SB_THUMBPOSITION, 40);
    EXPECT_EQ(40, Level(7)) << "after clearing \"EQ Lock\" the band does not move";
}

TEST_F(EqPanel, DefeatFlattensIgnoresScrollingAndKeepsThePresets) {
    Press(M2);
    for (int32_t k = 0; k < 31; ++k) ScrollBand(k, SB_THUMBPOSITION, 10 + 7 * k);
    EqChanged = 0;
    Press(Defeat);
    EXPECT_EQ(1, EqChanged) << "EqChanged after \" EQ Defeat\"";
    EXPECT_TRUE(Checked(EqDefeatButton)) << "BM_GETCHECK of \" EQ Defeat\" after pressing it";
    for (int32_t m = 0; m < 3; ++m)
        EXPECT_FALSE(Checked(EqMemoryButtons[m])) << "memory button " << m + 1 << " checked with EQ Defeat";
    for (int32_t k = 0; k < 31; ++k) {
        EXPECT_EQ(128, Level(k)) << "band " << k << " level with EQ Defeat";
        EXPECT_EQ(128, Thumb(k)) << "band " << k << " thumb with EQ Defeat";
    }
    EXPECT_EQ("0", Text(EqLevelReadout)) << "level readout with EQ Defeat";
    EXPECT_EQ("20", Text(EqFrequencyReadout)) << "frequency readout with EQ Defeat";

    EqChanged = 0;
    const Snapshot defeated = Take();
    for (int32_t request : {SB_LINEUP, SB_PAGEDOWN, SB_THUMBTRACK, SB_ENDSCROLL}) ScrollBand(5, request, 3);
    const std::string changed = Differences(defeated, Take());
    EXPECT_EQ("", changed) << "WM_VSCROLL with EQ Defeat changed:" << changed;

    Press(M2);
    for (int32_t k = 0; k < 31; ++k) {
        EXPECT_EQ(10 + 7 * k, Level(k)) << "band " << k << " after M2 following EQ Defeat";
        EXPECT_EQ(10 + 7 * k, Thumb(k)) << "band " << k << " thumb after M2 following EQ Defeat";
    }
    EXPECT_FALSE(Checked(EqDefeatButton)) << "\" EQ Defeat\" still checked after M2";
}

TEST_F(EqPanel, EditingBand7WithM3SelectedChangesEntry69Alone) {
    for (int32_t i = 0; i < 93; ++i) EqMemories[i / 31][i % 31] = 60 + i;
    Press(M3);
    const Snapshot before = Take();
    ScrollBand(7, SB_THUMBPOSITION, 250);
    for (int32_t i = 0; i < 93; ++i)
        EXPECT_EQ(i == 69 ? 250 : 60 + i, EqMemories[i / 31][i % 31])
            << "EqMemories entry " << i << " after band 7 went to 250 with M3 selected";
    EXPECT_NE(before.Memories[69], 250) << "the test needs entry 69 to start elsewhere";
    EXPECT_EQ(1, EqChanged) << "EqChanged after the edit";
}

TEST_F(EqPanel, PressingTheSelectedMemoryChangesNoLevelButRebuildsAndShowsBand0) {
    ScrollBand(12, SB_THUMBPOSITION, 2);
    ScrollBand(0, SB_THUMBPOSITION, 200);
    ScrollBand(12, SB_THUMBPOSITION, 2);  // the readouts show band 12
    ASSERT_EQ("316", Text(EqFrequencyReadout)) << "frequency readout after scrolling band 12";
    EqChanged = 0;
    const Snapshot before = Take();
    Press(M1);
    EXPECT_EQ(1, EqChanged) << "EqChanged after pressing the selected M1";
    for (int32_t k = 0; k < 31; ++k) EXPECT_EQ(before.Levels[k], Level(k)) << "band " << k << " after M1 again";
    EXPECT_EQ("20", Text(EqFrequencyReadout)) << "frequency readout after M1";
    EXPECT_EQ("-11", Text(EqLevelReadout)) << "level readout after M1 (band 0 at 200 is -11.34 dB)";
}

TEST_F(EqPanel, ReadoutsShowTheCentreAndTheLevelCutTowardZero) {
    const struct {
        int32_t Band, Value;
        const char* Level;
        const char* Frequency;
    } cases[] = {{10, 2, "19", "200"},  {10, 1, "20", "200"},   {0, 127, "0", "20"},
                 {0, 129, "0", "20"},   {30, 255, "-20", "20000"}, {17, 254, "-19", "1002"},
                 {3, 128, "0", "39"},   {29, 135, "-1", "15887"}};
    for (const auto& c : cases) {
        ScrollBand(c.Band, SB_THUMBPOSITION, c.Value);
        EXPECT_EQ(c.Level, Text(EqLevelReadout)) << "level readout for band " << c.Band << " at " << c.Value;
        EXPECT_EQ(c.Frequency, Text(EqFrequencyReadout)) << "frequency readout for band " << c.Band;
        EXPECT_EQ(EqLevelDbFor(c.Value), SynthState.EqBandLevelDb[c.Band])
            << "EqBandLevelDb[" << c.Band << "] after the readout update";
    }
}

TEST_F(EqPanel, TypingIntoAReadoutChangesNothing) {
    ScrollBand(4, SB_THUMBPOSITION, 90);
    EqChanged = 0;
    SendMessageA(EqLevelReadout, WM_CHAR, '7', 0);
    SetWindowTextA(EqFrequencyReadout, "999");
    EXPECT_EQ(90, Level(4)) << "band 4 after typing into the readouts";
    EXPECT_EQ(0, EqChanged) << "EqChanged after typing into the readouts";
    ScrollBand(4, SB_LINEDOWN);
    EXPECT_EQ("50", Text(EqFrequencyReadout)) << "the next update replaces the typed text";
}

TEST_F(EqPanel, PanelButtonTwiceLeavesThePanelAsItWasAndLocked) {
    const int32_t height = PanelHeight;
    const BOOL visible = IsWindowVisible(SliderBars[20]);
    Press(PanelButton);
    EXPECT_NE(height, PanelHeight) << "PanelHeight after one press of the panel button";
    Press(PanelButton);
    EXPECT_EQ(height, PanelHeight) << "PanelHeight after two presses";
    EXPECT_EQ(visible, IsWindowVisible(SliderBars[20])) << "band slider 20 visibility after two presses";
    EXPECT_TRUE(Checked(EqLockBox)) << "BM_GETCHECK of \"EQ Lock\" after two presses";
}

TEST_F(EqPanel, AChangeReachesTheNextBlock) {
    // Band 10 (200 Hz, bin 68) to the top: +20 dB there, a gain of 10.
    PrepareForPlay(&ControlSettings, &SynthState);
    EqChanged = 1;
    ProcessBlock(&ControlSettings, &CachedSettings, &SynthState);
    EXPECT_FLOAT_EQ(1.0f, SynthState.EqResponse[68]) << "EqResponse[68] with flat bands";
    ScrollBand(10, SB_THUMBPOSITION, 1);
    ProcessBlock(&ControlSettings, &CachedSettings, &SynthState);
    EXPECT_NEAR(10.0f, SynthState.EqResponse[68], 1e-4) << "EqResponse[68] in the block after band 10 went to 1";
    EXPECT_EQ(0, EqChanged) << "EqChanged after the block rebuilt the equaliser";
}

int main(int argc, char** argv) {
    ::testing::InitGoogleTest(&argc, argv);
    // A first start: no stored settings to apply over the start values.
    if (!ForgetStoredSettings()) {
        std::fprintf(stderr, "the settings key HKLM\\Software\\Sombrel cannot be removed\n");
        return 1;
    }
    if (StartProgram(GetModuleHandleA(nullptr), SW_SHOWNOACTIVATE) == nullptr) {
        std::fprintf(stderr, "StartProgram failed: no main window (is there a display?)\n");
        return 1;
    }
    return RUN_ALL_TESTS();
}
