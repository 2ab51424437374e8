// The timers inside the program's own window, run in this test process: the
// brush the window answers for each time field, and the chime's counting
// while the chime test and Play are pressed again during the chime. The
// chime plays on the harness's sound server.
#include <gtest/gtest.h>
#include <windows.h>
#include <mmsystem.h>
#include <string>
#include <vector>
#include "app/core_state.h"
#include "app/globals.h"
#include "app/ids.h"
#include "app/window.h"
#include "tests/program/in_process.h"

namespace {

// Checks or unchecks a check box as a click would, and tells the window.
void SetBox(HWND box, int32_t id, bool on) {
    SendMessageA(box, BM_SETCHECK, on ? BST_CHECKED : BST_UNCHECKED, 0);
    Command(id);
}

// The brush the window answers for a field's WM_CTLCOLOREDIT.
HBRUSH BrushFor(HWND field) {
    HDC dc = GetDC(field);
    const LRESULT brush = SendMessageA(MainWindow, WM_CTLCOLOREDIT, reinterpret_cast<WPARAM>(dc),
                                       reinterpret_cast<LPARAM>(field));
    ReleaseDC(field, dc);
    return reinterpret_cast<HBRUSH>(brush);
}

std::string NameOf(HBRUSH brush) {
    if (brush == RedFieldBrush) return "the red brush";
    if (brush == WhiteFieldBrush) return "the white brush";
    return "another brush";
}

// What the box answerer saw: each box's text, and the brushes of the hour
// and fade-in fields while it was open.
struct BoxSeen {
    std::string Text;
    HBRUSH Hour;
    HBRUSH FadeIn;
};
std::vector<BoxSeen> Seen;

// A thread timer, dispatched also by a box's own modal loop: notes and
// answers every box, so no box holds the test.
void CALLBACK AnswerBoxes(HWND, UINT, UINT_PTR, DWORD) {
    HWND box = OwnOpenBox();
    if (box == nullptr) return;
    char text[400] = {0};
    GetDlgItemTextA(box, 0xFFFF, text, sizeof(text));
    if (text[0] == 0) return;  // not filled in yet
    Seen.push_back({text, BrushFor(HourField), BrushFor(FadeInField)});
    PostMessageA(box, WM_COMMAND, MAKEWPARAM(IDOK, BN_CLICKED), 0);
}

class ProgramEnvironment : public ::testing::Environment {
public:
    void SetUp() override {
        ASSERT_NE(StartProgram(GetModuleHandleA(nullptr), SW_SHOWNORMAL), nullptr) << "StartProgram gave no window";
        SetTimer(nullptr, 0, 20, AnswerBoxes);
        PumpUntil([] { return false; }, 200);
    }
};

// Every feature off and every field empty and shown normally.
void ClearTimers() {
    SetBox(StopTimeBox, StopTimeId, false);
    SetBox(AlarmBox, AlarmId, false);
    SetBox(FadeInBox, FadeInId, false);
    SetBox(FadeOutBox, FadeOutId, false);
    for (HWND field : {MinuteField, HourField, FadeInField, FadeOutField}) SetWindowTextA(field, "");
    Seen.clear();
}

// ---------------------------------------------------------------- the field colours

TEST(FieldBrush, RedOnlyForAFailedFieldOfAFeatureThatIsOn) {
    ClearTimers();
    struct Case {
        HWND Field;
        int32_t Slot;
        HWND Box;
        int32_t BoxId;
        const char* Name;
    } cases[] = {
        {MinuteField, 0, StopTimeBox, StopTimeId, "minute field with \"Stop Time\""},
        {HourField, 1, StopTimeBox, StopTimeId, "hour field with \"Stop Time\""},
        {MinuteField, 0, AlarmBox, AlarmId, "minute field with \"Alarm\""},
        {HourField, 1, AlarmBox, AlarmId, "hour field with \"Alarm\""},
        {FadeInField, 2, FadeInBox, FadeInId, "fade-in field with \"Fade In\""},
        {FadeOutField, 3, FadeOutBox, FadeOutId, "fade-out field with \"Fade Out\""},
    };
    for (const Case& c : cases) {
        FieldValid[c.Slot] = 0;
        HBRUSH off = BrushFor(c.Field);
        EXPECT_EQ(off, WhiteFieldBrush) << c.Name << " off, FieldValid 0: WM_CTLCOLOREDIT gave " << NameOf(off)
                                        << ", expected the white brush";
        SetBox(c.Box, c.BoxId, true);
        HBRUSH failed = BrushFor(c.Field);
        EXPECT_EQ(failed, RedFieldBrush) << c.Name << " on, FieldValid 0: WM_CTLCOLOREDIT gave " << NameOf(failed)
                                         << ", expected the red brush";
        FieldValid[c.Slot] = 1;
        HBRUSH passed = BrushFor(c.Field);
        EXPECT_EQ(passed, WhiteFieldBrush) << c.Name << " on, FieldValid 1: WM_CTLCOLOREDIT gave "
                                           << NameOf(passed) << ", expected the white brush";
        SetBox(c.Box, c.BoxId, false);
    }
    // Any other edit control gets the default colours, not a time field's brush.
    HWND readout = GetDlgItem(MainWindow, EqFrequencyId);
    ASSERT_NE(readout, nullptr) << "GetDlgItem(main window, " << EqFrequencyId << ") found no frequency readout";
    HBRUSH other = BrushFor(readout);
    EXPECT_TRUE(other != RedFieldBrush && other != WhiteFieldBrush)
        << "WM_CTLCOLOREDIT for the frequency readout gave " << NameOf(other) << ", expected the default brush";
}

TEST(FieldBrush, AFailedFieldIsRedWhileItsBoxIsOpenAndANotificationClearsIt) {
    ClearTimers();
    SetBox(StopTimeBox, StopTimeId, true);
    SetWindowTextA(MinuteField, "30");
    SetWindowTextA(HourField, "13");  // out of range
    SetBox(FadeInBox, FadeInId, true);
    SetWindowTextA(FadeInField, "-5");  // fails the character check
    Command(PlayId);
    ASSERT_EQ(Seen.size(), 2u) << "Play with hour 13 and fade-in -5 showed " << Seen.size()
                               << " boxes, expected 2";
    EXPECT_EQ(Seen[0].Text, "Hours must be between 1 and 12") << "first box of Play";
    EXPECT_EQ(Seen[0].Hour, RedFieldBrush) << "while \"" << Seen[0].Text << "\" is open the hour field gets "
                                           << NameOf(Seen[0].Hour) << ", expected the red brush";
    EXPECT_EQ(Seen[1].Text, "Fade In Time must be between 1 and 15 minutes") << "second box of Play";
    EXPECT_EQ(Seen[1].Hour, RedFieldBrush) << "while \"" << Seen[1].Text << "\" is open the hour field gets "
                                           << NameOf(Seen[1].Hour) << ", expected the red brush";
    EXPECT_EQ(Seen[1].FadeIn, RedFieldBrush) << "while \"" << Seen[1].Text << "\" is open the fade-in field gets "
                                             << NameOf(Seen[1].FadeIn) << ", expected the red brush";
    EXPECT_EQ(IsPlaying, 0) << "IsPlaying after a refused Play";
    EXPECT_EQ(ControlSettings.Value[Alarm_Hr], 13) << "Alarm_Hr after Play with hour 13 (kept although out of range)";
    // The focus rule visited both fields: each visit is a notification.
    EXPECT_EQ(GetFocus(), FadeInField) << "GetFocus after the refused Play is not the fade-in field";
    EXPECT_EQ(FieldValid[1], 1) << "FieldValid of the hour field after the focus visited it";
    EXPECT_EQ(FieldValid[2], 1) << "FieldValid of the fade-in field after the focus visited it";
    // A notification of its own (the field's text set) clears a flag too.
    FieldValid[1] = 0;
    ASSERT_EQ(BrushFor(HourField), RedFieldBrush) << "hour field with FieldValid 0";
    SetWindowTextA(HourField, "13");
    EXPECT_EQ(FieldValid[1], 1) << "FieldValid of the hour field after its text was set";
    EXPECT_EQ(BrushFor(HourField), WhiteFieldBrush) << "WM_CTLCOLOREDIT of the hour field after its text was set";
    ClearTimers();
}

// ---------------------------------------------------------------- the chime

// Notifications from the chime's device reaching the window.
struct ChimeTally {
    HWAVEOUT Device = nullptr;
    int32_t Done = 0;
    WNDPROC Next = nullptr;
};
ChimeTally Tally;

LRESULT CALLBACK CountingProc(HWND window, UINT message, WPARAM wParam, LPARAM lParam) {
    if (message == MM_WOM_DONE && reinterpret_cast<HWAVEOUT>(wParam) == Tally.Device) ++Tally.Done;
    return CallWindowProcA(Tally.Next, window, message, wParam, lParam);
}

TEST(ChimeTest, PressedAgainAndPlayDuringTheChimeChangeNothingAndWorkAfterIt) {
    ClearTimers();
    Command(ChimeTestId);
    ASSERT_EQ(IsChiming, 1) << "IsChiming after the chime test command";
    ASSERT_TRUE(Seen.empty()) << "the chime test showed the box \"" << Seen[0].Text << "\"";
    Tally = ChimeTally();
    Tally.Device = ChimeDevice;
    Tally.Next = reinterpret_cast<WNDPROC>(
        SetWindowLongPtrA(MainWindow, GWLP_WNDPROC, reinterpret_cast<LONG_PTR>(CountingProc)));
    ASSERT_TRUE(PumpUntil([] { return ChimeBuffersDone >= 2; }, 5000))
        << "ChimeBuffersDone is " << ChimeBuffersDone << " 5 s after the chime test, expected at least 2";
    const int32_t doneBefore = ChimeBuffersDone;
    Command(ChimeTestId);
    EXPECT_EQ(IsChiming, 1) << "IsChiming after a second chime test";
    EXPECT_GE(ChimeBuffersDone, doneBefore) << "a second chime test set ChimeBuffersDone back from " << doneBefore
                                            << " to " << ChimeBuffersDone << ": it started a new chime";
    EXPECT_EQ(ChimeDevice, Tally.Device) << "a second chime test changed the chime's device: it started a new chime";
    Command(PlayId);
    EXPECT_EQ(IsPlaying, 0) << "IsPlaying after Play during the chime";
    EXPECT_NE(IsWindowEnabled(StopTimeBox), FALSE) << "Play during the chime disabled \"Stop Time\"";
    EXPECT_TRUE(PumpUntil([] { return IsChiming == 0; }, 20000))
        << "the chime (5.461 s) did not end within 20 s: ChimeBuffersDone " << ChimeBuffersDone;
    EXPECT_EQ(ChimeBuffersDone, 32) << "chime buffers counted when the chime ended";
    // A second chime would bring 32 more notifications; wait a little for strays.
    PumpUntil([] { return Tally.Done > 32; }, 1000);
    SetWindowLongPtrA(MainWindow, GWLP_WNDPROC, reinterpret_cast<LONG_PTR>(Tally.Next));
    EXPECT_EQ(Tally.Done, 32) << "notifications from the chime's device, counted from the chime test on; "
                              << "expected its 32 buffers and no second chime's";
    EXPECT_TRUE(Seen.empty()) << "a box appeared during the chime: \"" << (Seen.empty() ? "" : Seen[0].Text) << "\"";

    Command(PlayId);
    EXPECT_EQ(IsPlaying, 1) << "IsPlaying after Play once the chime ended";
    Command(StopId);
    ASSERT_EQ(IsPlaying, 0) << "IsPlaying after Stop";
    Command(ChimeTestId);
    EXPECT_EQ(IsChiming, 1) << "IsChiming after the chime test once the first chime ended";
    EXPECT_TRUE(PumpUntil([] { return IsChiming == 0; }, 20000)) << "the second chime did not end within 20 s";
    EXPECT_EQ(ChimeBuffersDone, 32) << "buffers counted for the second chime";
}

TEST(ChimeTest, TheAlarmStopsTheRainAndTheMeterShowsNoBlockThatWasNotPlayed) {
    ClearTimers();
    SYSTEMTIME now;
    GetLocalTime(&now);
    if (now.wSecond >= 58) {  // not across a minute's turn
        Sleep(3000);
        GetLocalTime(&now);
    }
    SetWindowTextA(HourField, std::to_string(now.wHour % 12 == 0 ? 12 : now.wHour % 12).c_str());
    SetWindowTextA(MinuteField, std::to_string(now.wMinute).c_str());
    Command(now.wHour < 12 ? AmId : PmId);
    SetBox(AlarmBox, AlarmId, true);
    Command(PlayId);  // the stop time is now: the second priming block stops the rain
    ASSERT_EQ(IsChiming, 1) << "IsChiming after Play at the alarm time (IsPlaying " << int(IsPlaying) << ")";
    PumpUntil([] { return IsChiming == 0; }, 1000);  // repaints while the chime plays
    EXPECT_EQ(MeterState.PeakLeft, 0) << "left peak while the chime plays: the stopping block was never played";
    EXPECT_EQ(MeterState.PeakRight, 0) << "right peak while the chime plays";
    EXPECT_TRUE(PumpUntil([] { return IsChiming == 0; }, 20000)) << "the alarm chime did not end within 20 s";
    ClearTimers();
}

}  // namespace

int main(int argc, char** argv) {
    ::testing::InitGoogleTest(&argc, argv);
    ::testing::AddGlobalTestEnvironment(new ProgramEnvironment);
    return RUN_ALL_TESTS();
}
