// The program's own window, hosted by this test process: the same start-up,
// window procedure, stream, meter, panel, time fields, chime and settings as
// Sombrel.exe, driven with the messages its controls send, while the state
// it keeps is read where it keeps it. The sound goes to the harness's sound
// server (or to none: the NoDevice tests run first, before it starts).
#include <gtest/gtest.h>
#include <windows.h>
#include <mmsystem.h>
#include <winternl.h>
#include <cstdio>
#include <algorithm>
#include <fstream>
#include <string>
#include <vector>
#include "app/commands.h"
#include "app/core_state.h"
#include "app/globals.h"
#include "app/window.h"
#include "engine/block.h"
#include "engine/platform.h"
#include "settings/registry.h"
#include "shaping/eq_response.h"
#include "settings/value_codec.h"
#include "tests/expected_stored_names.h"
#include "tests/program/harness.h"

namespace {

constexpr int32_t DogsId = 1049, TrafficId = 1050, TalkingId = 1047, M2Id = 1066, M3Id = 1067;

HWND C(int32_t id) { return id < SliderCount ? SliderBars[id] : GetDlgItem(MainWindow, id); }
bool Checked(int32_t id) { return SendMessageA(C(id), BM_GETCHECK, 0, 0) == BST_CHECKED; }
bool Enabled(int32_t id) { return IsWindowEnabled(C(id)) != FALSE; }
// A click as the user makes it: the button presses itself and tells the window.
void Press(int32_t id) { SendMessageA(C(id), BM_CLICK, 0, 0); }
// A check box set as a click would leave it, also while it is disabled.
void SetBox(int32_t id, bool on) {
    SendMessageA(C(id), BM_SETCHECK, on ? BST_CHECKED : BST_UNCHECKED, 0);
    SendMessageA(MainWindow, WM_COMMAND, MAKEWPARAM(id, BN_CLICKED), reinterpret_cast<LPARAM>(C(id)));
}
void Type(int32_t id, const std::string& text) { SetWindowTextA(C(id), text.c_str()); }
std::string Text(int32_t id) {
    char text[64] = {};
    GetWindowTextA(C(id), text, sizeof(text));
    return text;
}
// A slider's scroll request: horizontal for the main five, vertical for bands.
void Scroll(int32_t id, int32_t code, int32_t position = 0) {
    SendMessageA(MainWindow, id < EqBandFirst ? WM_HSCROLL : WM_VSCROLL, MAKEWPARAM(code, position),
                 reinterpret_cast<LPARAM>(C(id)));
}
int32_t Thumb(int32_t id) { return GetScrollPos(C(id), SB_CTL); }
// The brush the window answers for an edit field's WM_CTLCOLOREDIT.
HBRUSH BrushOf(int32_t id) {
    HDC dc = GetDC(C(id));
    const LRESULT brush = SendMessageA(MainWindow, WM_CTLCOLOREDIT, reinterpret_cast<WPARAM>(dc),
                                       reinterpret_cast<LPARAM>(C(id)));
    ReleaseDC(C(id), dc);
    return reinterpret_cast<HBRUSH>(brush);
}
// A time of day (minutes after midnight) in the hour and minute fields, as a
// user reads a 12-hour clock, with AM or PM.
void TypeTimeOfDay(int32_t minuteOfDay) {
    const int32_t hour = minuteOfDay / 60 % 24;
    Type(HourFieldId, std::to_string(hour % 12 == 0 ? 12 : hour % 12));
    Type(MinuteFieldId, std::to_string(minuteOfDay % 60));
    Press(hour < 12 ? AmId : PmId);
}
// The clock's minute of the day, read at least 5 s before the minute turns.
int32_t ClockMinute() {
    SYSTEMTIME t;
    for (GetLocalTime(&t); t.wSecond >= 55; GetLocalTime(&t)) Sleep(500);
    return t.wHour * 60 + t.wMinute;
}
bool TimerControlsEnabled(bool on) {
    for (int32_t id : {StopTimeId, HourFieldId, MinuteFieldId, AmId, PmId, AlarmId, FadeInFieldId, FadeInId, ChimeTestId})
        if (Enabled(id) != on) return false;
    return true;
}

// Every test starts stopped with the start values, the panel closed and no
// box noted; every test ends without a box it did not expect.
class App : public ::testing::Test {
protected:
    void SetUp() override {
        PumpUntil([] { return IsChiming == 0; }, 20000);
        if (IsPlaying) Press(StopId);
        for (int32_t id : {FadeOutId, FadeInId, StopTimeId, AlarmId}) SetBox(id, false);
        for (int32_t id : {HourFieldId, MinuteFieldId, FadeInFieldId, FadeOutFieldId}) Type(id, "");
        Press(AmId);
        Press(TalkingId);
        for (int32_t id = Attenuator; id <= Treble; ++id) Scroll(id, SB_THUMBPOSITION, 128);
        for (auto& memory : EqMemories)
            for (int32_t& level : memory) level = 128;
        SetBox(EqLockId, false);
        Press(EqMemory1Id);
        if (PanelHeight == PanelOpenHeight) Press(EqCloseId);
        PumpUntil([] { return false; }, 50);
        Boxes.clear();
    }
    void TearDown() override {
        PumpUntil([] { return false; }, 50);
        EXPECT_EQ(BoxTexts(), std::vector<std::string>{}) << "boxes the test did not expect";
    }
};

// ---------------------------------------------------------------- the first start

// Asks the harness to photograph the client area and compare it with the
// committed picture tests/program/REFERENCE.png (made under the harness's
// fixed display, Wine and fonts).
bool Photograph(const char* name, const char* reference) {
    RedrawWindow(MainWindow, nullptr, nullptr, RDW_INVALIDATE | RDW_ERASE | RDW_FRAME | RDW_ALLCHILDREN | RDW_UPDATENOW);
    PumpUntil([] { return false; }, 300);
    RECT r;
    GetClientRect(MainWindow, &r);
    POINT at = {0, 0};
    ClientToScreen(MainWindow, &at);
    char area[64];
    std::snprintf(area, sizeof(area), "%ldx%ld+%ld+%ld %s %s", r.right, r.bottom, at.x, at.y, name, reference);
    return AskHarness("screenshot", area);
}

// Runs first, at a first start: every control in its place, text and state
// (the pictures), its kind and tab stop (the Tab key follows the order the
// controls were made in).
TEST(FirstStart, TheWindowLooksAsItsPicturesClosedWithThePanelAndAfterAResize) {
    EXPECT_TRUE(Photograph("first-start", "first-start"));
    SendMessageA(MainWindow, WM_COMMAND, EqPanelId, 0);
    EXPECT_TRUE(Photograph("panel-open", "panel-open"));
    SendMessageA(MainWindow, WM_COMMAND, EqCloseId, 0);
    SendMessageA(C(EqLockId), BM_SETCHECK, BST_UNCHECKED, 0);  // the panel button checked it
    SetWindowPos(MainWindow, nullptr, 0, 0, 900, 400, SWP_NOZORDER | SWP_NOMOVE | SWP_NOACTIVATE);
    RECT r;
    GetWindowRect(MainWindow, &r);
    EXPECT_TRUE(r.right - r.left == 750 && r.bottom - r.top == 270) << r.right - r.left << " x " << r.bottom - r.top;
    EXPECT_TRUE(Photograph("after-resize", "first-start"));
    std::string kinds;
    for (HWND c = GetWindow(MainWindow, GW_CHILD); c != nullptr; c = GetWindow(c, GW_HWNDNEXT)) {
        const LONG style = GetWindowLongA(c, GWL_STYLE);
        char cls[16] = {};
        GetClassNameA(c, cls, sizeof(cls));
        const char kind = cls[0] == 'B' ? "bi.ar..g"[style & BS_ICON ? 1 : style & 7] : cls[1] == 'c' ? 's' : cls[0] == 'E' ? 'e' : 't';
        kinds += std::to_string(GetDlgCtrlID(c)) + kind + (style & WS_TABSTOP && kind != 'r' ? "T " : " ");  // a checked radio button takes the tab stop
    }
    EXPECT_EQ(kinds, "1030iT 1031iT 1055iT 1029iT 1051iT 1069iT 0g 1038a 1035r 1036r 1032a 0g 1043r 1044r 1045r 1046r 1047r 1048r 1049r 1050r "
                     "1033e 1034e 1041e 1042e 1039a 1040a 0t 0t 0t 0t 0t 0t 0t 0t 0t 0sT 1sT 2sT 3sT 4sT 5sT 6sT 7sT 8sT 9sT 10sT 11sT 12sT 13sT 14sT "
                     "15sT 16sT 17sT 18sT 19sT 20sT 21sT 22sT 23sT 24sT 25sT 26sT 27sT 28sT 29sT 30sT 31sT 32sT 33sT 34sT 35sT 1057a 0g 1058e 1059e 0t 0t "
                     "1065r 1066r 1067r 1068r ") << "each control's id, kind (icon, auto check box, radio, group, edit, text, scroll bar) and tab stop";
    EXPECT_EQ(GetClassLongPtrA(MainWindow, GCLP_HICON), reinterpret_cast<LONG_PTR>(LoadIconA(GetModuleHandleA(nullptr), MAKEINTRESOURCEA(101))));
}

// ---------------------------------------------------------------- commands

TEST_F(App, PlayDisablesTheTimerControlsAloneAndStopEnablesThemAgain) {
    const int32_t refused[] = {StopTimeId, HourFieldId, MinuteFieldId, AmId, PmId, AlarmId,
                               FadeInFieldId, FadeInId, FadeOutFieldId, FadeOutId, ChimeTestId};
    std::vector<std::pair<HWND, bool>> before;
    for (HWND c = GetWindow(MainWindow, GW_CHILD); c != nullptr; c = GetWindow(c, GW_HWNDNEXT))
        before.push_back({c, IsWindowEnabled(c) != FALSE});
    Press(StopId);  // while stopped: nothing
    EXPECT_TRUE(TimerControlsEnabled(true));
    Press(PlayId);
    ASSERT_EQ(IsPlaying, 1);
    for (const auto& c : before) {
        bool listed = false;
        for (int32_t id : refused) listed = listed || C(id) == c.first;
        EXPECT_EQ(IsWindowEnabled(c.first) != FALSE, c.second && !listed) << "control " << GetDlgCtrlID(c.first) << " while playing";
    }
    const int32_t blocks = SynthState.BlockIndex;
    Press(PlayId);  // while playing: nothing, no new stream
    EXPECT_EQ(SynthState.BlockIndex, blocks) << "a second Play made blocks";
    Press(StopId);
    EXPECT_EQ(IsPlaying, 0);
    EXPECT_TRUE(TimerControlsEnabled(true));
    EXPECT_FALSE(Enabled(FadeOutId) || Enabled(FadeOutFieldId)) << "the Fade Out pair with Stop Time and Alarm off";
    SetBox(AlarmId, true);  // the alarm far away: Stop brings the pair back with the rest
    TypeTimeOfDay(ClockMinute() + 720);
    Press(PlayId);
    ASSERT_EQ(IsPlaying, 1);
    EXPECT_FALSE(Enabled(FadeOutId));
    Press(StopId);
    EXPECT_TRUE(Enabled(FadeOutId) && Enabled(FadeOutFieldId)) << "the Fade Out pair after Stop with Alarm on";
}

TEST_F(App, SwitchesSetTheirFieldsAndTheFadeOutPairFollowsStopTimeAndAlarm) {
    const struct { int32_t Id, Profile; } profiles[] = {{1043, 100}, {1044, 101}, {1045, 102}, {1046, 103},
                                                       {1047, 104}, {1048, 105}, {DogsId, 107}, {TrafficId, 106}};
    for (const auto& p : profiles) {
        Press(p.Id);
        EXPECT_EQ(ControlSettings.Value[Profile], p.Profile) << "after button " << p.Id;
        for (const auto& other : profiles) EXPECT_EQ(Checked(other.Id), other.Id == p.Id) << "after button " << p.Id;
    }
    for (int32_t id : {PmId, AmId}) {
        Press(id);
        EXPECT_EQ(ControlSettings.Value[Alarm_PM], id == PmId);
        EXPECT_EQ(ControlSettings.Value[Alarm_AM], id == AmId);
        EXPECT_TRUE(Checked(id) && !Checked(id == AmId ? PmId : AmId)) << "after " << id;
    }
    Press(StopTimeId);
    Press(FadeOutId);
    Press(FadeInId);
    EXPECT_EQ(ControlSettings.Value[FadeOutOn], 1);
    EXPECT_EQ(ControlSettings.Value[FadeInOn], 1);
    const struct { int32_t Press; bool Pair, Chime; } steps[] = {
        {StopTimeId, false, false}, {AlarmId, true, true}, {StopTimeId, true, true}, {AlarmId, true, false},
        {StopTimeId, false, false}};
    for (const auto& s : steps) {
        Press(s.Press);
        EXPECT_EQ(ControlSettings.Value[PlayUntilOn], Checked(StopTimeId));
        EXPECT_EQ(ControlSettings.Value[AlarmOn], Checked(AlarmId));
        EXPECT_EQ(Enabled(FadeOutId), s.Pair) << "Stop Time " << Checked(StopTimeId) << ", Alarm " << Checked(AlarmId);
        EXPECT_EQ(Enabled(FadeOutFieldId), s.Pair) << "Stop Time " << Checked(StopTimeId) << ", Alarm " << Checked(AlarmId);
        EXPECT_EQ(IsWindowVisible(C(ChimeTestId)) != FALSE, s.Chime) << "chime test button, Alarm " << Checked(AlarmId);
        EXPECT_TRUE(Checked(FadeOutId)) << "the Fade Out check mark";
    }
    ShowWindow(MainWindow, SW_MINIMIZE);
    SendMessageA(MainWindow, WM_POWERBROADCAST, PBT_APMRESUMEAUTOMATIC, 0);
    EXPECT_FALSE(IsIconic(MainWindow)) << "a power event leaves the window minimised";
}

TEST_F(App, MainSlidersStepWithinTheirRangeStoppedAndPlaying) {
    const struct { int32_t Start, Code, Position, Result; } steps[] = {
        {240, SB_PAGERIGHT, 0, 255}, {10, SB_PAGELEFT, 0, 1},     {100, SB_PAGERIGHT, 0, 125}, {100, SB_PAGELEFT, 0, 75},
        {26, SB_PAGELEFT, 0, 1},     {25, SB_PAGELEFT, 0, 1},     {230, SB_PAGERIGHT, 0, 255}, {231, SB_PAGERIGHT, 0, 255},
        {6, SB_LINELEFT, 0, 1},      {5, SB_LINELEFT, 0, 1},      {250, SB_LINERIGHT, 0, 255}, {251, SB_LINERIGHT, 0, 255},
        {100, SB_LINERIGHT, 0, 105}, {100, SB_LINELEFT, 0, 95},
        {100, SB_ENDSCROLL, 0, 100}, {100, SB_TOP, 0, 100},       {100, SB_THUMBTRACK, 37, 37}, {37, SB_THUMBPOSITION, 200, 200}};
    for (bool playing : {false, true}) {
        if (playing) Press(PlayId);
        for (int32_t id = Attenuator; id <= Treble; ++id) {
            for (const auto& s : steps) {
                Scroll(id, SB_THUMBPOSITION, s.Start);
                Scroll(id, s.Code, s.Position);
                EXPECT_EQ(ControlSettings.Value[id], s.Result) << "slider " << id << " at " << s.Start << ", code " << s.Code << (playing ? ", playing" : "");
                EXPECT_EQ(Thumb(id), s.Result) << "slider " << id << " at " << s.Start << ", code " << s.Code;
            }
            Scroll(id, SB_THUMBPOSITION, 128);
        }
        for (int32_t position = 1; position <= 255; position += 2) {  // a drag writes every position
            Scroll(Attenuator, SB_THUMBTRACK, position);
            ASSERT_EQ(ControlSettings.Value[Attenuator], position);
        }
    }
}

// ---------------------------------------------------------------- the meter

// Where the blue and the red bar of a row end (one past their last pixel,
// 16 when there is none).
std::pair<int32_t, int32_t> BarEnds(int32_t y) {
    UpdateWindow(MainWindow);
    HDC dc = GetDC(MainWindow);
    std::pair<int32_t, int32_t> ends{16, 16};
    for (int32_t x = 14; x <= 676; ++x) {
        const COLORREF c = GetPixel(dc, x, y);
        if (c == RGB(0, 0, 200)) ends.first = x + 1;
        if (c == RGB(200, 0, 0)) ends.second = x + 1;
    }
    ReleaseDC(MainWindow, dc);
    return ends;
}

TEST_F(App, MeterBarsAreBlueUpTo28000RedAboveUpperRightAndEmptyWhenStopped) {
    Press(PlayId);
    ASSERT_TRUE(PumpUntil([] { return BarEnds(5).first > 16; }, 5000)) << "no bar while playing";
    // Between two blocks nothing else runs: the peaks given here are painted.
    static float right[BlockFrames], left[BlockFrames];
    for (int32_t i = 0; i < BlockFrames; ++i) {
        right[i] = i == 100 ? -28000.0f : 5.0f;
        left[i] = i == 4000 ? 28001.5f : -7.0f;
    }
    UpdatePeaks(right, left);
    const std::pair<int32_t, int32_t> blue673{673, 16}, red674{16, 674}, none{16, 16};
    for (int32_t y = 3; y <= 8; ++y) EXPECT_EQ(BarEnds(y), blue673) << "upper row " << y << ", right peak 28000";
    for (int32_t y = 13; y <= 18; ++y) EXPECT_EQ(BarEnds(y), red674) << "lower row " << y << ", left peak 28001";
    for (int32_t y : {2, 9, 12, 19}) EXPECT_EQ(BarEnds(y), none) << "row " << y << " outside the bars";
    UpdatePeaks(left, right);
    EXPECT_EQ(BarEnds(5), red674) << "upper row with a right peak of 28001";
    const struct { float Peak; std::pair<int32_t, int32_t> Ends; } bars[] = {
        {0, none}, {1, none}, {14000, {343, 16}}, {32000, red674}, {40000, red674}};
    for (const auto& b : bars) {
        right[100] = b.Peak;
        UpdatePeaks(right, left);
        EXPECT_EQ(BarEnds(5), b.Ends) << "right peak " << b.Peak;
    }
    Press(StopId);
    EXPECT_EQ(BarEnds(5), none) << "after Stop";
    EXPECT_EQ(BarEnds(15), none) << "after Stop";
    RedrawWindow(MainWindow, nullptr, nullptr, RDW_INVALIDATE | RDW_ERASE);
    EXPECT_EQ(BarEnds(5), none) << "a repaint while stopped";
}

// ---------------------------------------------------------------- the ring

// After every refill two blocks are queued: the slot written next is two
// ahead of the one the device hands back next.
bool RingInOrder() { return (WriteSlot - DoneSlot + 3) % 3 == 2; }

TEST_F(App, RingSlotsGoInOrderAndEveryPlayStartsAgainAtSlot0) {
    for (int32_t round = 0; round < 3; ++round) {
        Press(PlayId);  // round 1 and 2: right after Stop, with its handed-back buffers still to come
        ASSERT_TRUE(WriteSlot == 2 && DoneSlot == 0 && SynthState.BlockIndex == 2) << "round " << round;
        const WAVEFORMATEX& f = StreamFormat;  // 48 000 Hz, 16-bit stereo PCM, its derived fields computed
        EXPECT_TRUE(f.wFormatTag == 1 && f.nChannels == 2 && f.nSamplesPerSec == 48000 && f.wBitsPerSample == 16 &&
                    f.nBlockAlign == 4 && f.nAvgBytesPerSec == 192000 && f.cbSize == 0);
        for (int32_t refill = 1; refill <= 4; ++refill) {
            ASSERT_TRUE(PumpUntil([&] { return DoneSlot == refill % 3; }, 3000)) << "round " << round << " refill " << refill;
            EXPECT_TRUE(RingInOrder()) << "WriteSlot " << WriteSlot << ", DoneSlot " << DoneSlot;
            EXPECT_EQ(SynthState.BlockIndex, 2 + refill);
            EXPECT_EQ(BuffersQueued, 2);
        }
        Press(StopId);
        EXPECT_TRUE(WriteSlot == 0 && DoneSlot == 0 && IsPlaying == 0) << "after Stop";
        for (const WAVEHDR& h : WaveHeaders) EXPECT_EQ(h.dwFlags & WHDR_PREPARED, 0u) << "a header still prepared";
    }
    PumpUntil([] { return false; }, 300);  // the handed-back buffers are ignored
    EXPECT_TRUE(WriteSlot == 0 && DoneSlot == 0 && HandedBack == 0);
}

// The code box of a failed release is held open until a notification has
// arrived behind it; then the device is put back.
HWAVEOUT RealDevice = nullptr;
bool HoldUntilANotificationWaits(const Box& box) {
    if (box.Text != "Error 4531" || RealDevice == nullptr) return false;
    static ULONGLONG since = 0;
    if (since == 0) since = GetTickCount64();
    if (DeferredRefills == 0 && GetTickCount64() - since < 5000) return true;
    EXPECT_GE(DeferredRefills, 1) << "no notification arrived while the box was open";
    MainDevice = RealDevice;
    RealDevice = nullptr;
    return false;
}

TEST_F(App, ANotificationDuringAStreamErrorBoxWaitsAndTheRingStaysInOrder) {
    Press(PlayId);
    ASSERT_TRUE(PumpUntil([] { return DoneSlot == 1; }, 3000));
    RealDevice = MainDevice;  // the next release fails on a handle that is not a device
    MainDevice = reinterpret_cast<HWAVEOUT>(static_cast<UINT_PTR>(0x5A5A));
    HoldBox = HoldUntilANotificationWaits;
    const int32_t blocks = SynthState.BlockIndex;
    ASSERT_TRUE(PumpUntil([&] { return SynthState.BlockIndex >= blocks + 6; }, 10000)) << "the stream did not go on";
    HoldBox = nullptr;
    char text[400];
    waveOutGetErrorTextA(MMSYSERR_INVALHANDLE, text, sizeof(text));
    EXPECT_EQ(BoxTexts(), (std::vector<std::string>{"Error 4531", text}));
    EXPECT_EQ(DeferredRefills, 0) << "held-back notifications never handled";
    for (int32_t n = 1; n <= 3; ++n) {
        const int32_t next = (DoneSlot + 1) % 3;
        ASSERT_TRUE(PumpUntil([&] { return DoneSlot == next; }, 3000)) << "refill " << n << " after the box";
        EXPECT_TRUE(RingInOrder()) << "WriteSlot " << WriteSlot << ", DoneSlot " << DoneSlot;
        EXPECT_EQ(WaveHeaders[WriteSlot].dwFlags & WHDR_INQUEUE, 0u) << "slot " << WriteSlot << " written next is still queued";
    }
}

// Notifications reaching the window, by whether the chime was on when they came.
struct DoneTally { int32_t WhileChiming, After; WNDPROC Next; } Tally;
LRESULT CALLBACK CountingProc(HWND window, UINT message, WPARAM wParam, LPARAM lParam) {
    if (message == MM_WOM_DONE) ++(IsChiming ? Tally.WhileChiming : Tally.After);
    return CallWindowProcA(Tally.Next, window, message, wParam, lParam);
}
void CountNotifications(bool on) {
    if (on) Tally = DoneTally{0, 0, reinterpret_cast<WNDPROC>(SetWindowLongPtrA(MainWindow, GWLP_WNDPROC, reinterpret_cast<LONG_PTR>(CountingProc)))};
    else SetWindowLongPtrA(MainWindow, GWLP_WNDPROC, reinterpret_cast<LONG_PTR>(Tally.Next));
}

TEST_F(App, AChimeRightAfterStopCountsOnlyItsOwn32Buffers) {
    // The stop's handed-back buffers are still queued, and the chime's device
    // may get the handle value the main device had.
    Press(PlayId);
    ASSERT_TRUE(PumpUntil([] { return DoneSlot == 1; }, 3000));
    Press(StopId);
    CountNotifications(true);
    Press(ChimeTestId);
    ASSERT_EQ(IsChiming, 1);
    EXPECT_TRUE(PumpUntil([] { return IsChiming == 0; }, 15000)) << "the chime did not end";
    PumpUntil([] { return false; }, 1000);  // a chime closed early hands back buffers after its end
    CountNotifications(false);
    EXPECT_EQ(ChimeBuffersDone, 32);
    EXPECT_EQ(Tally.WhileChiming, 2 + 32) << "the stop's 2 handed-back buffers and the chime's 32";
    EXPECT_EQ(Tally.After, 0) << "notifications after the chime's end: it was closed before its last buffers played";
    EXPECT_EQ(HandedBack, 0);
}

// ---------------------------------------------------------------- the chime

TEST_F(App, TheAlarmStopsTheRainChimesOnceAndRefusesPlayAndTheTestMeanwhile) {
    SetBox(AlarmId, true);
    TypeTimeOfDay(ClockMinute());  // now: the second priming block stops the rain
    Scroll(Attenuator, SB_THUMBPOSITION, 255);
    CountNotifications(true);
    Press(PlayId);
    const HWAVEOUT chime = ChimeDevice;
    ASSERT_TRUE(IsChiming == 1 && IsPlaying == 0) << "IsChiming " << int(IsChiming) << ", IsPlaying " << int(IsPlaying);
    EXPECT_TRUE(TimerControlsEnabled(true)) << "the stop enables the timer controls";
    PumpUntil([] { return ChimeBuffersDone >= 2; }, 5000);  // repaints while it plays
    EXPECT_EQ(MeterState.PeakLeft + MeterState.PeakRight, 0) << "the meter shows the block that stopped the rain";
    const int32_t done = ChimeBuffersDone;
    Press(ChimeTestId);
    Press(PlayId);
    EXPECT_TRUE(IsChiming == 1 && IsPlaying == 0 && ChimeBuffersDone >= done && ChimeDevice == chime)
        << "the test or Play acted while the chime played";
    EXPECT_TRUE(PumpUntil([] { return IsChiming == 0; }, 20000)) << "the chime did not end";
    PumpUntil([] { return Tally.After > 0; }, 1000);
    CountNotifications(false);
    EXPECT_EQ(Tally.WhileChiming, 1 + 32) << "block 0 handed back by the stop, and the chime's 32 buffers";
    EXPECT_EQ(Tally.After, 0) << "a second chime, or one closed before its end";
    EXPECT_EQ(ChimeBuffersDone, 32);
    SetBox(AlarmId, false);
    Press(PlayId);
    EXPECT_EQ(IsPlaying, 1) << "Play after the chime";
    Press(StopId);
    Press(ChimeTestId);
    EXPECT_TRUE(IsChiming == 1 && PumpUntil([] { return IsChiming == 0; }, 20000)) << "a second chime from the test";
    EXPECT_EQ(ChimeBuffersDone, 32);
}

// ---------------------------------------------------------------- the equaliser panel

int32_t Band(int32_t k) { return ControlSettings.Value[EqBandFirst + k]; }
// Levels, thumbs, memories, readouts and EqChanged, to see what an action changed.
std::string PanelState() {
    std::string s;
    for (int32_t k = 0; k < EqBandCount; ++k) s += std::to_string(Band(k)) + "/" + std::to_string(Thumb(EqBandFirst + k)) + " ";
    for (const auto& memory : EqMemories)
        for (int32_t level : memory) s += std::to_string(level) + " ";
    return s + "| " + Text(EqLevelId) + " " + Text(EqFrequencyId) + " changed " + std::to_string(EqChanged);
}

TEST_F(App, BandStepsStayWithinTheRangeAndEveryAcceptedOneSetsEqChangedAndTheMemory) {
    const struct { int32_t Start, Code, Result; } steps[] = {
        {3, SB_LINEUP, 1}, {6, SB_LINEUP, 1}, {5, SB_LINEUP, 1}, {20, SB_PAGEUP, 1}, {26, SB_PAGEUP, 1}, {25, SB_PAGEUP, 1},
        {240, SB_PAGEDOWN, 255}, {230, SB_PAGEDOWN, 255}, {231, SB_PAGEDOWN, 255}, {252, SB_LINEDOWN, 255},
        {250, SB_LINEDOWN, 255}, {251, SB_LINEDOWN, 255}, {128, SB_LINEDOWN, 133},
        {128, SB_PAGEUP, 103}, {90, SB_ENDSCROLL, 90}, {90, SB_TOP, 90}, {90, SB_THUMBTRACK, 37}};
    for (const auto& s : steps) {
        Scroll(EqBandFirst + 4, SB_THUMBPOSITION, s.Start);
        EqChanged = 0;
        Scroll(EqBandFirst + 4, s.Code, 37);
        EXPECT_TRUE(Band(4) == s.Result && Thumb(EqBandFirst + 4) == s.Result && EqMemories[0][4] == s.Result)
            << "band 4 at " << s.Start << ", code " << s.Code << ": level " << Band(4) << ", thumb "
            << Thumb(EqBandFirst + 4) << ", M1 " << EqMemories[0][4] << "; expected " << s.Result;
        EXPECT_EQ(EqChanged, 1) << "code " << s.Code;
    }
    // A block after the change builds the equaliser from the band levels.
    Scroll(EqBandFirst + 10, SB_THUMBPOSITION, 1);
    ProcessBlock(&ControlSettings, &CachedSettings, &SynthState);
    EXPECT_NEAR(SynthState.EqResponse[68], 10.0f, 1e-4) << "band 10 (bin 68) at +20 dB";
    EXPECT_EQ(EqChanged, 0);
}

TEST_F(App, LockAndDefeatIgnoreScrollingAndDefeatKeepsThePresets) {
    Press(M2Id);
    for (int32_t k = 0; k < EqBandCount; ++k) Scroll(EqBandFirst + k, SB_THUMBPOSITION, 10 + 7 * k);
    for (bool lock : {true, false}) {
        if (lock) SetBox(EqLockId, true);
        else Press(EqDefeatId);
        EqChanged = 0;
        const std::string before = PanelState();
        for (int32_t code : {SB_LINEUP, SB_LINEDOWN, SB_PAGEUP, SB_PAGEDOWN, SB_THUMBPOSITION, SB_THUMBTRACK, SB_ENDSCROLL})
            for (int32_t k : {0, 7, 30}) Scroll(EqBandFirst + k, code, 40);
        EXPECT_EQ(PanelState(), before) << (lock ? "with EQ Lock" : "with EQ Defeat");
        SetBox(EqLockId, false);
    }
    EXPECT_TRUE(Checked(EqDefeatId) && !Checked(EqMemory1Id) && !Checked(M2Id) && !Checked(M3Id));
    for (int32_t k = 0; k < EqBandCount; ++k) EXPECT_TRUE(Band(k) == 128 && Thumb(EqBandFirst + k) == 128) << "band " << k << " with EQ Defeat";
    EXPECT_EQ(Text(EqLevelId) + " " + Text(EqFrequencyId), "0 20");
    Press(M2Id);
    for (int32_t k = 0; k < EqBandCount; ++k) EXPECT_TRUE(Band(k) == 10 + 7 * k && Thumb(EqBandFirst + k) == 10 + 7 * k) << "band " << k << " after M2";
    EXPECT_FALSE(Checked(EqDefeatId));
}

TEST_F(App, TheSelectedMemoryFollowsItsBandsAloneAndAPressShowsBand0) {
    for (int32_t i = 0; i < 93; ++i) EqMemories[i / 31][i % 31] = 60 + i;
    Press(M3Id);
    Scroll(EqBandFirst + 7, SB_THUMBPOSITION, 250);
    for (int32_t i = 0; i < 93; ++i) EXPECT_EQ(EqMemories[i / 31][i % 31], i == 69 ? 250 : 60 + i) << "entry " << i;
    Scroll(EqBandFirst + 12, SB_THUMBPOSITION, 2);
    EXPECT_EQ(Text(EqFrequencyId), "316");
    EqChanged = 0;
    const std::string levels = PanelState().substr(0, PanelState().find('|'));
    Press(M3Id);  // the selected memory again: no level changes, a rebuild and band 0 shown
    EXPECT_EQ(PanelState().substr(0, PanelState().find('|')), levels);
    EXPECT_EQ(EqChanged, 1);
    EXPECT_EQ(Text(EqLevelId) + " " + Text(EqFrequencyId), "0 20") << "band 0 at 122 (+0.94 dB)";
    SendMessageA(C(EqLevelId), WM_CHAR, '7', 0);  // typing into a readout changes nothing
    SetWindowTextA(C(EqFrequencyId), "999");
    EXPECT_EQ(PanelState().substr(0, PanelState().find('|')), levels);
    Scroll(EqBandFirst + 4, SB_LINEDOWN);
    EXPECT_EQ(Text(EqFrequencyId), "50") << "the next update replaces the typed text";
}

TEST_F(App, ReadoutsShowTheCentreAndTheLevelCutTowardZero) {
    const struct { int32_t Band, Value; const char* Shown; } cases[] = {
        {10, 2, "19 200"}, {10, 1, "20 200"}, {0, 127, "0 20"}, {0, 129, "0 20"},
        {30, 255, "-20 20000"}, {17, 254, "-19 1002"}, {3, 128, "0 39"}, {29, 135, "-1 15887"}};
    for (const auto& c : cases) {
        Scroll(EqBandFirst + c.Band, SB_THUMBPOSITION, c.Value);
        EXPECT_EQ(Text(EqLevelId) + " " + Text(EqFrequencyId), c.Shown) << "band " << c.Band << " at " << c.Value;
        EXPECT_EQ(SynthState.EqBandLevelDb[c.Band], EqLevelDbFor(c.Value));
    }
    SetWindowTextA(C(EqLevelId), "5");  // a vertical scroll naming a slider that is no band
    SendMessageA(MainWindow, WM_VSCROLL, MAKEWPARAM(SB_PAGEDOWN, 0), reinterpret_cast<LPARAM>(C(Attenuator)));
    ASSERT_EQ(Boxes.size(), 1u);
    EXPECT_EQ(Boxes[0].Text + "|" + Boxes[0].Caption, "Error 7294|Sombrel Player");
    EXPECT_TRUE(Boxes[0].Icon == nullptr && Boxes[0].Buttons == 1);
    Boxes.clear();
    EXPECT_EQ(Text(EqLevelId) + Text(EqFrequencyId), "") << "readouts after Error 7294";
    EXPECT_EQ(ControlSettings.Value[Attenuator], 128) << "the volume moved by a vertical scroll";
}

TEST_F(App, ThePanelButtonOpensAndClosesWithTheLockCheckedAndCloseOnlyCloses) {
    for (int32_t press = 1; press <= 3; ++press) {
        Press(EqPanelId);
        RECT r;
        GetWindowRect(MainWindow, &r);
        EXPECT_EQ(r.bottom - r.top, press % 2 ? 580 : 270) << "after " << press << " presses";
        EXPECT_EQ(IsWindowVisible(C(EqBandFirst + 20)) != FALSE, press % 2 == 1);
        EXPECT_TRUE(Checked(EqLockId));
        SetBox(EqLockId, false);
    }
    Press(EqCloseId);
    Press(EqCloseId);
    EXPECT_EQ(PanelHeight, 270);
    for (HWND c : {C(EqBandFirst), C(EqLockId), EqFrame, C(EqLevelId), C(EqFrequencyId), EqLevelLabel, EqFrequencyLabel})
        EXPECT_FALSE(IsWindowVisible(c)) << "a panel control shown with the panel closed";
}

// ---------------------------------------------------------------- the time fields

const char* const MinuteBox = "Minutes must be between 0 and 59";
const char* const HourBox = "Hours must be between 1 and 12";
const char* const FadeInBox = "Fade In Time must be between 1 and 15 minutes";
const char* const FadeOutBox = "Fade Out Time must be between 1 and 15 minutes";
const int32_t TimeFields[4] = {MinuteFieldId, HourFieldId, FadeInFieldId, FadeOutFieldId};
const int32_t StoredField[4] = {Alarm_Min, Alarm_Hr, FadeInTime, FadeOutTime};

// The fields that are red ("m", "h", "i", "o") while each box is open.
std::vector<std::string> RedWhileOpen;
bool NoteRedFields(const Box&) {
    std::string red;
    for (int32_t i = 0; i < 4; ++i) red += BrushOf(TimeFields[i]) == RedFieldBrush ? "mhio"[i] : '.';
    RedWhileOpen.push_back(red);
    return false;
}

TEST_F(App, PlayChecksTheFieldsOfTheFeaturesThatAreOnRewritesThemAndSaysWhatIsWrong) {
    // Switches: "s" Stop Time, "a" Alarm, "i" Fade In, "o" Fade Out. The stop
    // time, when valid, is always at least six hours away.
    const struct {
        const char* On;
        const char* Typed[4];     // minute, hour, fade-in, fade-out
        std::vector<const char*> Complaints;
        const char* Red;          // fields red while each box is open
        const char* Shown[4];     // the fields' texts after Play
        int32_t Stored[4];        // Alarm_Min, Alarm_Hr, FadeInTime, FadeOutTime (-1: not looked at)
        int32_t Focus;
    } rows[] = {
        {"s", {"7x", ".", "", ""}, {MinuteBox, HourBox}, "mh.. mh..", {"7x", "0", "", ""}, {-1, 0, -1, -1}, HourFieldId},
        {"si", {"30", "13", "-5", ""}, {HourBox, FadeInBox}, ".h.. .hi.", {"30", "13", "-5", ""}, {30, 13, -1, -1}, FadeInFieldId},
        {"", {"7x", "", "99", "1.5"}, {}, "", {"7x", "", "99", "1.5"}, {-1, -1, -1, -1}, 0},
        {"aio", {"1", "12", "16", "16.9"}, {FadeInBox, FadeOutBox}, "..i. ..io", {"1", "12", "16", "16"}, {1, 12, 16, 16}, FadeOutFieldId},
        {"sio", {"1.5", "12x", "3.9", "15"}, {}, "", {"1", "12", "3", "15"}, {1, 12, 3, 15}, 0},
        {"si", {"59", "1", "1", ""}, {}, "", {"59", "1", "1", ""}, {59, 1, 1, -1}, 0},
        {"si", {"60", "0", "0", ""}, {MinuteBox, HourBox, FadeInBox}, "mh.. mh.. mhi.", {"60", "0", "0", ""}, {60, 0, 0, -1}, FadeInFieldId},
        {"s", {"12e1", "1", "", ""}, {}, "", {"12", "1", "", ""}, {12, 1, -1, -1}, 0},
        {"a", {"0", "55e9", "", ""}, {HourBox}, ".h..", {"0", "55", "", ""}, {0, 55, -1, -1}, HourFieldId},
        {"so", {"", "", "", "0"}, {MinuteBox, HourBox, FadeOutBox}, "mh.. mh.. mh.o", {"", "", "", "0"}, {-1, -1, -1, 0}, FadeOutFieldId},
    };
    SYSTEMTIME now;
    GetLocalTime(&now);
    for (const auto& r : rows) {
        SCOPED_TRACE(std::string("switches \"") + r.On + "\", minute \"" + r.Typed[0] + "\", hour \"" + r.Typed[1] +
                     "\", fade-in \"" + r.Typed[2] + "\", fade-out \"" + r.Typed[3] + "\"");
        for (int32_t i = 0; i < 4; ++i) Type(TimeFields[i], r.Typed[i]);
        Press(now.wHour < 6 || now.wHour >= 18 ? PmId : AmId);  // 12:xx and 1:xx are far away
        for (const char* s = r.On; *s; ++s) SetBox(*s == 's' ? StopTimeId : *s == 'a' ? AlarmId : *s == 'i' ? FadeInId : FadeOutId, true);
        RedWhileOpen.clear();
        HoldBox = NoteRedFields;
        Press(PlayId);
        HoldBox = nullptr;
        std::string red;
        for (const std::string& box : RedWhileOpen) red += (red.empty() ? "" : " ") + box;
        EXPECT_EQ(IsPlaying, r.Complaints.empty() ? 1 : 0);
        for (const Box& box : Boxes)
            EXPECT_TRUE(box.Caption == "Sombrel Player" && box.Icon == LoadIconA(nullptr, IDI_HAND) && box.Buttons == 1) << box.Text;
        EXPECT_EQ(BoxTexts(), std::vector<std::string>(r.Complaints.begin(), r.Complaints.end()));
        EXPECT_EQ(red, r.Red);
        for (int32_t i = 0; i < 4; ++i) {
            EXPECT_EQ(Text(TimeFields[i]), r.Shown[i]) << "field " << TimeFields[i];
            EXPECT_TRUE(r.Stored[i] < 0 || ControlSettings.Value[StoredField[i]] == r.Stored[i])
                << "field " << TimeFields[i] << " stored " << ControlSettings.Value[StoredField[i]];
            EXPECT_EQ(BrushOf(TimeFields[i]), WhiteFieldBrush) << "field " << TimeFields[i] << " after the focus visited it";
        }
        EXPECT_TRUE(r.Focus == 0 || GetFocus() == C(r.Focus)) << "the focus is in " << GetDlgCtrlID(GetFocus());
        EXPECT_TRUE(TimerControlsEnabled(!r.Complaints.empty()));
        SetUp();
    }
}

TEST_F(App, AFieldIsRedOnlyWhileItFailedAndItsFeatureIsOn) {
    const struct { int32_t Field, Slot, Switch; } cases[] = {
        {MinuteFieldId, 0, StopTimeId}, {HourFieldId, 1, StopTimeId}, {MinuteFieldId, 0, AlarmId},
        {HourFieldId, 1, AlarmId},      {FadeInFieldId, 2, FadeInId}, {FadeOutFieldId, 3, FadeOutId}};
    for (const auto& c : cases) {
        FieldValid[c.Slot] = 0;
        EXPECT_EQ(BrushOf(c.Field), WhiteFieldBrush) << "field " << c.Field << ", failed, switch " << c.Switch << " off";
        SetBox(c.Switch, true);
        EXPECT_EQ(BrushOf(c.Field), RedFieldBrush) << "field " << c.Field << ", failed, switch " << c.Switch << " on";
        Type(c.Field, "5");  // any notice of the field takes the red away
        EXPECT_EQ(BrushOf(c.Field), WhiteFieldBrush) << "field " << c.Field << " after its text was set";
        SetBox(c.Switch, false);
    }
    const HBRUSH other = BrushOf(EqLevelId);
    EXPECT_TRUE(other != RedFieldBrush && other != WhiteFieldBrush) << "a readout got a time field's brush";
}

// ---------------------------------------------------------------- the stored settings

// What a start does with the stored settings: read them once, after the layout.
void Restart() {
    SettingsLoaded = 0;
    LoadSettings();
}

// A full set of stored values, each distinct where the control allows it.
int32_t Distinct(int32_t row) {
    const int32_t tail[11] = {0, 1, 1, 0, 7, 5, 106, 1, 1, 3, 12};  // Alarm on at 7:05 PM, Traffic, both fades
    if (row < 5) return 30 + 40 * row;
    if (row < 36) return 1 + 8 * (row - 5);      // M1
    if (row < 67) return 255 - 7 * (row - 36);  // M2
    if (row < 98) return 20 + 5 * (row - 67);   // M3
    return tail[row - 98];
}

TEST_F(App, StoredSettingsComeBackOnceIntoTheControlsAndAreStoredBackByteForByte) {
    ASSERT_TRUE(ForgetStoredSettings());
    for (int32_t row = 0; row < StoredValueCount; ++row) ASSERT_TRUE(StoreNumber(StoredValueAt(row).Name, Distinct(row)));
    Restart();
    for (int32_t id = 0; id < SliderCount; ++id)
        EXPECT_TRUE(Thumb(id) == Distinct(id) && ControlSettings.Value[id] == Distinct(id)) << "slider " << id;
    for (int32_t i = 0; i < 93; ++i) EXPECT_EQ(EqMemories[i / 31][i % 31], Distinct(5 + i)) << "memory entry " << i;
    for (int32_t id : {EqMemory1Id, EqLockId, PmId, TrafficId, AlarmId, FadeInId, FadeOutId}) EXPECT_TRUE(Checked(id)) << id;
    for (int32_t id : {M2Id, AmId, DogsId, TalkingId, StopTimeId}) EXPECT_FALSE(Checked(id)) << id;
    EXPECT_EQ(Text(HourFieldId) + ":" + Text(MinuteFieldId) + " " + Text(FadeInFieldId) + " " + Text(FadeOutFieldId), "7:5 3 12");
    EXPECT_TRUE(IsWindowVisible(C(ChimeTestId)) && Enabled(FadeOutId)) << "the chime button and the Fade Out pair with Alarm on";
    Scroll(Attenuator, SB_THUMBPOSITION, 99);  // a later layout loads nothing again
    SetWindowPos(MainWindow, nullptr, 0, 0, 800, 300, SWP_NOZORDER | SWP_NOMOVE | SWP_NOACTIVATE);
    EXPECT_EQ(Thumb(Attenuator), 99) << "the stored settings were applied again at a later WM_SIZE";
    Scroll(Attenuator, SB_THUMBPOSITION, Distinct(0));

    Press(EqDefeatId);  // the bands flat: a save writes the memories, not the bands
    ASSERT_TRUE(ForgetStoredSettings());
    HasPlayed = 0;
    SaveSettings();
    EXPECT_FALSE(KeyExists()) << "a run without Play wrote the settings";
    HasPlayed = 1;
    SaveSettings();
    EXPECT_EQ(ValueCount(), StoredValueCount);
    for (int32_t row = 0; row < StoredValueCount; ++row) {  // a REG_DWORD holding the start of the number's text
        char text[16] = {};
        std::snprintf(text, sizeof(text), "%d", Distinct(row));
        char bytes[32];
        std::snprintf(bytes, sizeof(bytes), "4: %02x %02x %02x %02x", text[0], text[1], text[2], text[3]);
        EXPECT_EQ(RawValue(ExpectedStoredName(row).c_str()), bytes) << ExpectedStoredName(row);
    }
    ASSERT_TRUE(ForgetStoredSettings());
}

TEST_F(App, ADamagedKeyKeepsTheStartValueWhereAStoredValueCannotBeUsed) {
    ASSERT_TRUE(ForgetStoredSettings());
    const uint8_t long200[8] = {'2', '0', '0', 0, 0, 0, 0, 0};
    const struct { const char* Name; DWORD Type; const void* Data; DWORD Length; } damaged[] = {
        {"Attenuator", REG_DWORD, "999", 4}, {"Hardness", REG_DWORD, "0\0\0", 4}, {"Bass", REG_DWORD, "-5\0", 4},
        {"SubBass", REG_DWORD, "ab\0", 4},   {"Treble", REG_SZ, "200", 4},        {"3", REG_DWORD, long200, 8},
        {"4", REG_DWORD, "200", 0},          {"5", REG_DWORD, "256", 4},          {"6", REG_DWORD, "200", 4},
        {"Profile", REG_DWORD, "0\0\0", 4},  {"PlayUntilOn", REG_DWORD, "2\0\0", 4}, {"Alarm_AM", REG_DWORD, "x\0\0", 4},
        {"Alarm_Hr", REG_DWORD, "99\0", 4},  {"Alarm_Min", REG_DWORD, "-5\0", 4}, {"FadeInTime", REG_SZ, "3", 2}};
    for (const auto& d : damaged) ASSERT_TRUE(StoreRaw(d.Name, d.Type, d.Data, d.Length)) << d.Name;
    Restart();  // "6" (M1's band 6) at 200 is sound; the time fields are taken as stored, for Play to check
    for (int32_t id = 0; id < SliderCount; ++id) EXPECT_EQ(Thumb(id), id == EqBandFirst + 6 ? 200 : 128) << "slider " << id;
    EXPECT_TRUE(Checked(TalkingId) && Checked(AmId) && !Checked(StopTimeId) && Checked(EqLockId));
    EXPECT_EQ(Text(HourFieldId) + ":" + Text(MinuteFieldId) + " " + Text(FadeInFieldId), "99:-5 ");
    EXPECT_TRUE(ControlSettings.Value[Alarm_Hr] == 99 && ControlSettings.Value[Alarm_Min] == -5 && ControlSettings.Value[FadeInTime] == 0);
    ASSERT_TRUE(ForgetStoredSettings());
}

TEST_F(App, AUserWhoMayNotWriteTheMachineKeyKeepsTheSettingsInTheirOwnKey) {
    const struct { int32_t Machine, User, Shown; } starts[] = {{0, 0, 128}, {50, 0, 50}, {0, 60, 60}, {50, 60, 60}};
    for (const auto& s : starts) {  // the per-user key, when there is one, is read
        ASSERT_TRUE(ForgetStoredSettings());
        ASSERT_TRUE(!s.Machine || StoreNumber("Attenuator", s.Machine, HKEY_LOCAL_MACHINE));
        ASSERT_TRUE(!s.User || StoreNumber("Attenuator", s.User, HKEY_CURRENT_USER));
        Scroll(Attenuator, SB_THUMBPOSITION, 128);
        Restart();
        EXPECT_EQ(Thumb(Attenuator), s.Shown) << "machine's key " << s.Machine << ", user's " << s.User << " (0: none)";
    }
    HasPlayed = 1;
    SaveSettings();  // to the machine's key; the user's older copy goes
    EXPECT_TRUE(ReadNumber("Attenuator") == 60 && !KeyExists(HKEY_CURRENT_USER));
    ASSERT_TRUE(DenyKey(HKEY_LOCAL_MACHINE));
    Scroll(Attenuator, SB_THUMBPOSITION, 150);
    SaveSettings();  // silently to the user's key
    EXPECT_EQ(ReadNumber("Attenuator", HKEY_CURRENT_USER), 150);
    EXPECT_EQ(BoxTexts(), std::vector<std::string>{});
    ASSERT_TRUE(DenyKey(HKEY_CURRENT_USER));
    SaveSettings();  // neither key: one box
    ASSERT_EQ(Boxes.size(), 1u);
    EXPECT_TRUE(Boxes[0].Caption == "Sombrel Player" && Boxes[0].Icon == LoadIconA(nullptr, IDI_ASTERISK));
    EXPECT_EQ(BoxTexts(), std::vector<std::string>{"Registry Creation Error 8734"});
    ASSERT_TRUE(ForgetStoredSettings());
}

// ---------------------------------------------------------------- a long run

// Kernel handles of this process, from the system's handle list.
int32_t KernelHandles() {
    struct Entry { ULONG ProcessId; UCHAR Type, Flags; USHORT Handle; PVOID Object; ACCESS_MASK Access; };
    static std::vector<char> list(1 << 23);
    ULONG length = 0;
    if (NtQuerySystemInformation(static_cast<SYSTEM_INFORMATION_CLASS>(16), list.data(), static_cast<ULONG>(list.size()), &length) != 0)
        return -1;
    const Entry* entries = reinterpret_cast<const Entry*>(list.data() + sizeof(ULONG_PTR));
    int32_t count = 0;
    for (ULONG i = 0; i < *reinterpret_cast<const ULONG*>(list.data()); ++i) count += entries[i].ProcessId == GetCurrentProcessId();
    return count;
}

// GDI objects of this process: the used entries of its GDI handle table
// (24 bytes each, type byte at 14), whose address the PEB holds at 0xF8.
int32_t GdiObjects() {
    PROCESS_BASIC_INFORMATION process = {};
    NtQueryInformationProcess(GetCurrentProcess(), ProcessBasicInformation, &process, sizeof(process), nullptr);
    const uint8_t* table = *reinterpret_cast<const uint8_t* const*>(reinterpret_cast<const char*>(process.PebBaseAddress) + 0xF8);
    int32_t count = 0;
    for (size_t i = 0; table != nullptr && i < 65536; ++i) count += table[i * 24 + 14] != 0;
    return count;
}

BOOL CALLBACK CountWindow(HWND, LPARAM count) {
    ++*reinterpret_cast<int32_t*>(count);
    return TRUE;
}

TEST_F(App, TwoHundredPlayStopCyclesLeakNothing) {
    // Counted after 10 cycles, once the sound system has made its lasting
    // objects; a leak of one object per cycle would add 190.
    int32_t counts[3] = {}, windows = 0;
    for (int32_t cycle = 1; cycle <= 200; ++cycle) {
        Press(PlayId);
        ASSERT_EQ(IsPlaying, 1) << "cycle " << cycle;
        Press(StopId);
        if (cycle == 10 || cycle == 200) {
            windows = 0;
            EnumThreadWindows(GetCurrentThreadId(), CountWindow, reinterpret_cast<LPARAM>(&windows));
            EnumChildWindows(MainWindow, CountWindow, reinterpret_cast<LPARAM>(&windows));
            const int32_t now[3] = {KernelHandles(), GdiObjects(), windows};
            std::printf("cycle %d: kernel handles %d, GDI objects %d, windows %d\n", cycle, now[0], now[1], now[2]);
            for (int32_t i = 0; i < 3; ++i) {
                if (cycle == 10) counts[i] = now[i];
                else EXPECT_LE(now[i], counts[i] + (i == 2 ? 0 : 10)) << "count " << i << " grew over 190 cycles";
            }
            ASSERT_GT(counts[0] * counts[1], 0) << "the counts could not be read";
        }
    }
}

// ---------------------------------------------------------------- the sound device missing

// Every failing device call shows its code (no icon) and then the device's
// own text (exclamation mark), each with an OK button alone.
void ExpectFailures(const std::vector<std::pair<std::string, std::string>>& codes) {
    std::vector<std::string> texts;
    char text[400];
    for (UINT code = 1; code < 64; ++code)
        if (waveOutGetErrorTextA(code, text, sizeof(text)) == MMSYSERR_NOERROR) texts.push_back(text);
    std::vector<std::pair<std::string, std::string>> seen;
    for (size_t i = 0; i + 1 < Boxes.size(); i += 2) {
        EXPECT_TRUE(Boxes[i].Icon == nullptr && Boxes[i].Buttons == 1) << Boxes[i].Text;
        const Box& device = Boxes[i + 1];
        EXPECT_TRUE(device.Caption == "Sombrel Player" && device.Icon == LoadIconA(nullptr, IDI_EXCLAMATION) && device.Buttons == 1 &&
                    std::find(texts.begin(), texts.end(), device.Text) != texts.end()) << "after " << Boxes[i].Text << ": " << device.Text;
        if (Boxes[i].Text != "Error 4532") seen.push_back({Boxes[i].Text, Boxes[i].Caption});  // 0 to 3 of them
    }
    EXPECT_EQ(Boxes.size() % 2, 0u);
    EXPECT_EQ(seen, codes);
    Boxes.clear();
}

TEST_F(App, NoDeviceMakesPlayAndStopShowEveryFailureAndTheProgramComesBack) {
    for (int32_t round = 1; round <= 2; ++round) {
        Press(PlayId);
        ASSERT_GE(Boxes.size(), 2u);
        char text[400];
        waveOutGetErrorTextA(MMSYSERR_BADDEVICEID, text, sizeof(text));
        EXPECT_EQ(Boxes[1].Text, text) << "the open's device text";
        ExpectFailures({{"Error 4528", "Sombrel Player"}, {"Error 4529", "Sombrel"}, {"Error 4530", "Sombrel"},
                        {"Error 4529", "Sombrel"}, {"Error 4530", "Sombrel"}});
        EXPECT_TRUE(IsPlaying == 1 && TimerControlsEnabled(false)) << "round " << round;
        Press(StopId);
        ExpectFailures({{"Error 4534", "Sombrel Player"}, {"Error 4535", "Sombrel Player"}});
        EXPECT_TRUE(IsPlaying == 0 && TimerControlsEnabled(true)) << "round " << round;
    }
}

TEST_F(App, NoDeviceChimeTestShowsItsOpenFailureEndsAndThenPlayWorks) {
    for (int32_t round = 1; round <= 2; ++round) {
        Press(ChimeTestId);
        ExpectFailures({{"Error 4558", "Sombrel Player"}});
        EXPECT_EQ(IsChiming, 0) << "round " << round;
    }
    Press(PlayId);
    ASSERT_FALSE(Boxes.empty());
    EXPECT_EQ(Boxes[0].Text, "Error 4528") << "Play after the failed chime was refused";
    Press(StopId);
    Boxes.clear();
}

TEST_F(App, DeviceBackPlayWorksAgainWhenTheSoundServerReturns) {
    ASSERT_TRUE(AskHarness("stop-sound-server"));
    Press(PlayId);
    ASSERT_FALSE(Boxes.empty());
    EXPECT_EQ(Boxes[0].Text, "Error 4528");
    Press(StopId);
    Boxes.clear();
    ASSERT_TRUE(AskHarness("start-sound-server"));
    Press(PlayId);
    EXPECT_EQ(IsPlaying, 1);
    EXPECT_TRUE(PumpUntil([] { return DoneSlot == 2; }, 5000)) << "no refill with the device back";
    EXPECT_GT(MeterState.PeakRight, 0);
}

// ---------------------------------------------------------------- the sound

// Run while the harness records the sound server into SOMBREL_CAPTURE. The
// time line tells compare_recording.py what was played, each line ending
// with the recording's size at that moment:
//   play OPTIONS       Play pressed; the render tool's OPTIONS are in force
//   set BLOCK OPTIONS  from block BLOCK on the settings are OPTIONS
//   stop BLOCK         Stop pressed after BLOCK blocks were made
//   chime OPTIONS      the alarm chime started
//   end
int64_t Recorded() {
    WIN32_FILE_ATTRIBUTE_DATA data;
    const char* capture = std::getenv("SOMBREL_CAPTURE");
    if (!capture || !GetFileAttributesExA(WindowsPath(capture).c_str(), GetFileExInfoStandard, &data)) return -1;
    return static_cast<int64_t>(data.nFileSizeHigh) << 32 | data.nFileSizeLow;
}
void Note(const std::string& line) {
    std::ofstream((WorkDir() + "\\timeline.txt").c_str(), std::ios::app) << line << ' ' << Recorded() << '\n';
}
bool RecordFor(double seconds) {
    const int64_t target = Recorded() + static_cast<int64_t>(seconds * 48000) * 4;
    return Recorded() >= 0 && PumpUntil([&] { return Recorded() >= target; }, static_cast<DWORD>(seconds * 3000 + 5000));
}

TEST_F(App, SoundOfStoredSettingsAndOfChangesWhilePlayingIsWhatTheRenderMakes) {
    ASSERT_TRUE(RecordFor(0.5)) << "the harness is not recording";
    ASSERT_TRUE(ForgetStoredSettings());
    std::string bands;
    for (int32_t row = 0; row < StoredValueCount; ++row) {
        const int32_t tail[11] = {0, 0, 0, 1, 7, 5, 105, 1, 0, 1, 12};  // Music, fade-in of 1 minute
        const int32_t v = row < 5 ? 150 - 20 * row : row < 36 ? 60 + 5 * (row - 5) : row < 98 ? 255 - row : tail[row - 98];
        ASSERT_TRUE(StoreNumber(StoredValueAt(row).Name, v));
        if (row >= 5 && row < 36) bands += (row > 5 ? "," : "") + std::to_string(v);
    }
    Restart();
    SetBox(EqLockId, false);
    std::string options = "--volume 150 --hardness 130 --bass 110 --sub-bass 90 --treble 70 --profile 105 --fade-in 1 --eq " + bands;
    Note("play " + options);
    Press(PlayId);
    ASSERT_TRUE(RecordFor(3));
    Press(PlayId);  // a second Play must not start the sound again
    ASSERT_TRUE(RecordFor(1));
    Scroll(Attenuator, SB_THUMBPOSITION, 200);
    options += " --volume 200";
    Note("set " + std::to_string(SynthState.BlockIndex) + " " + options);
    ASSERT_TRUE(RecordFor(2));
    Press(DogsId);
    options += " --profile 107";
    Note("set " + std::to_string(SynthState.BlockIndex) + " " + options);
    ASSERT_TRUE(RecordFor(2));
    Scroll(EqBandFirst + 14, SB_THUMBPOSITION, 30);
    Scroll(EqBandFirst + 4, SB_PAGEDOWN);
    Scroll(EqBandFirst + 4, SB_PAGEDOWN);
    std::string moved;
    for (int32_t k = 0; k < EqBandCount; ++k) moved += (k ? "," : "") + std::to_string(Band(k));
    options += " --eq " + moved;
    Note("set " + std::to_string(SynthState.BlockIndex) + " " + options);
    ASSERT_TRUE(RecordFor(2));
    Press(StopId);
    Note("stop " + std::to_string(SynthState.BlockIndex));
    ASSERT_TRUE(RecordFor(1));
    Note("end");
    ASSERT_TRUE(ForgetStoredSettings());
}

TEST_F(App, SoundOfTheAlarmAMinuteAheadFadesOutStopsAndChimesOnce) {
    Scroll(Attenuator, SB_THUMBPOSITION, 200);
    SetBox(AlarmId, true);
    SetBox(FadeOutId, true);
    Type(FadeOutFieldId, "1");
    TypeTimeOfDay(ClockMinute() + 1);
    Note("play --volume 200 --stop-after 1 --fade-out 1");
    Press(PlayId);
    ASSERT_EQ(IsPlaying, 1);
    ASSERT_TRUE(PumpUntil([] { return IsChiming == 1; }, 100000)) << "the alarm did not come a minute after Play";
    Note("chime --volume 200");
    Press(ChimeTestId);  // both refused while it sounds: the recording would hold them
    Press(PlayId);
    ASSERT_TRUE(PumpUntil([] { return IsChiming == 0; }, 20000));
    ASSERT_TRUE(RecordFor(1));
    Note("end");
}

}  // namespace

int main(int argc, char** argv) {
    if (argc == 4 && std::string(argv[1]) == "--mark-opened") {  // the shell opening a manual
        std::ofstream(argv[2]) << argv[3] << '\n';
        return 0;
    }
    ::testing::InitGoogleTest(&argc, argv);
    // A first start: no stored settings to apply over the start values.
    if (!ForgetStoredSettings() || StartProgram(GetModuleHandleA(nullptr), SW_SHOWNORMAL) == nullptr) {
        std::fprintf(stderr, "the settings could not be removed or the window not made (is there a display?)\n");
        return 1;
    }
    StartAnsweringBoxes();
    PumpUntil([] { return false; }, 200);
    return RUN_ALL_TESTS();
}
