// The program's own window, hosted by this test process: the same start-up,
// window procedure, stream, meter, panel, time fields, chime and settings as
// Sombrel.exe, driven with the messages its controls send, while the state
// it keeps is read where it keeps it. The sound goes to the harness's sound
// server (or to none: the NoDevice tests run first, before it starts).
// The Launch tests instead start Sombrel.exe as a user does: the exit code,
// the settings across starts, and Help opening the manual beside it.
#include <gtest/gtest.h>
#include <windows.h>
#include <mmsystem.h>
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
using Texts = std::vector<std::string>;

HWND C(int32_t id) { return id < SliderCount ? SliderBars[id] : GetDlgItem(MainWindow, id); }
bool Checked(int32_t id) { return SendMessageA(C(id), BM_GETCHECK, 0, 0) == BST_CHECKED; }
bool Enabled(int32_t id) { return IsWindowEnabled(C(id)) != FALSE; }
void Press(int32_t id) { SendMessageA(C(id), BM_CLICK, 0, 0); }  // as a click: the button tells the window
// A check box set as a click would leave it, also while it is disabled.
void SetBox(int32_t id, bool on) {
    SendMessageA(C(id), BM_SETCHECK, on ? BST_CHECKED : BST_UNCHECKED, 0);
    SendMessageA(MainWindow, WM_COMMAND, MAKEWPARAM(id, BN_CLICKED), reinterpret_cast<LPARAM>(C(id)));
}
void Type(int32_t id, const std::string& text) { SetWindowTextA(C(id), text.c_str()); }
// The texts of the controls, joined by spaces.
std::string Text(std::initializer_list<int32_t> ids) {
    std::string all;
    char text[64];
    for (int32_t id : ids) all += (id == *ids.begin() ? "" : " ") + std::string(text, GetWindowTextA(C(id), text, sizeof(text)));
    return all;
}
// A slider's scroll request: horizontal for the main five, vertical for bands.
void Scroll(int32_t id, int32_t code, int32_t position = 0) {
    SendMessageA(MainWindow, id < EqBandFirst ? WM_HSCROLL : WM_VSCROLL, MAKEWPARAM(code, position), reinterpret_cast<LPARAM>(C(id)));
}
int32_t Thumb(int32_t id) { return GetScrollPos(C(id), SB_CTL); }
int32_t Band(int32_t k) { return ControlSettings.Value[EqBandFirst + k]; }
// The brush the window answers for an edit field's WM_CTLCOLOREDIT.
HBRUSH BrushOf(int32_t id) {
    HDC dc = GetDC(C(id));
    const LRESULT brush = SendMessageA(MainWindow, WM_CTLCOLOREDIT, reinterpret_cast<WPARAM>(dc), reinterpret_cast<LPARAM>(C(id)));
    ReleaseDC(C(id), dc);
    return reinterpret_cast<HBRUSH>(brush);
}
// The clock's minute of the day, read at least 5 s before the minute turns.
int32_t ClockMinute() {
    SYSTEMTIME t;
    for (GetLocalTime(&t); t.wSecond >= 55; GetLocalTime(&t)) Sleep(500);
    return t.wHour * 60 + t.wMinute;
}
// A minute of the day in the hour and minute fields, on a 12-hour clock.
void TypeTimeOfDay(int32_t minuteOfDay) {
    const int32_t hour = minuteOfDay / 60 % 24;
    Type(HourFieldId, std::to_string(hour % 12 == 0 ? 12 : hour % 12));
    Type(MinuteFieldId, std::to_string(minuteOfDay % 60));
    Press(hour < 12 ? AmId : PmId);
}
// What Play disables and Stop enables, besides the Fade Out pair.
const int32_t TimerControls[] = {StopTimeId, HourFieldId, MinuteFieldId, AmId, PmId, AlarmId, FadeInFieldId, FadeInId, ChimeTestId};
bool TimerControlsEnabled(bool on) {
    return std::all_of(std::begin(TimerControls), std::end(TimerControls), [&](int32_t id) { return Enabled(id) == on; });
}
void Restart() { SettingsLoaded = 0, LoadSettings(); }  // what a start does with the stored settings
// A number as the program stores it: a REG_DWORD holding the start of its text.
std::string StoredForm(int32_t number) {
    char text[16] = {}, bytes[32];
    std::snprintf(text, sizeof(text), "%d", number);
    std::snprintf(bytes, sizeof(bytes), "4: %02x %02x %02x %02x", text[0], text[1], text[2], text[3]);
    return bytes;
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
        for (auto& memory : EqMemories) std::fill(std::begin(memory), std::end(memory), 128);
        SetBox(EqLockId, false);
        Press(EqMemory1Id);
        if (PanelHeight == PanelOpenHeight) Press(EqCloseId);
        PumpUntil([] { return false; }, 50);
        Boxes.clear();
    }
    void TearDown() override {
        PumpUntil([] { return false; }, 50);
        EXPECT_EQ(BoxTexts(), Texts{}) << "boxes the test did not expect";
    }
};

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
// (the pictures), its kind, tab stop and range (the Tab key follows the
// order the controls were made in).
TEST(FirstStart, TheWindowLooksAsItsPicturesClosedWithThePanelAndAfterAResize) {
    EXPECT_TRUE(Photograph("first-start", "first-start"));
    SendMessageA(MainWindow, WM_COMMAND, EqPanelId, 0);  // as the button's click, leaving no focus mark in the pictures
    EXPECT_TRUE(Photograph("panel-open", "panel-open"));
    RECT r;
    std::string heights;  // the panel button opens and closes, checking EQ Lock each time; Close only closes
    for (int32_t id : {EqPanelId, EqPanelId, EqCloseId, EqCloseId}) {
        SendMessageA(C(EqLockId), BM_SETCHECK, BST_UNCHECKED, 0);
        SendMessageA(MainWindow, WM_COMMAND, id, 0);
        GetWindowRect(MainWindow, &r);
        heights += std::to_string(r.bottom - r.top) + (Checked(EqLockId) ? "L " : " ");
    }
    EXPECT_EQ(heights, "270L 580L 270 270 ") << "the window's height after Panel, Panel, Close, Close (L: EQ Lock checked)";
    for (HWND c : {C(EqBandFirst + 20), C(EqLockId), EqFrame, C(EqLevelId), C(EqFrequencyId), EqLevelLabel, EqFrequencyLabel})
        EXPECT_FALSE(IsWindowVisible(c)) << "a panel control shown with the panel closed";
    SetWindowPos(MainWindow, nullptr, 0, 0, 900, 400, SWP_NOZORDER | SWP_NOMOVE | SWP_NOACTIVATE);
    GetWindowRect(MainWindow, &r);
    EXPECT_TRUE(r.right - r.left == 750 && r.bottom - r.top == 270) << r.right - r.left << " x " << r.bottom - r.top;
    EXPECT_TRUE(Photograph("after-resize", "first-start"));
    std::string kinds;
    for (HWND c = GetWindow(MainWindow, GW_CHILD); c != nullptr; c = GetWindow(c, GW_HWNDNEXT)) {
        const LONG style = GetWindowLongA(c, GWL_STYLE);
        char cls[16] = {};
        GetClassNameA(c, cls, sizeof(cls));
        const char kind = cls[0] == 'B' ? "bi.ar..g"[style & BS_ICON ? 1 : style & 7] : cls[1] == 'c' ? 's' : cls[0] == 'E' ? 'e' : 't';
        kinds += std::to_string(GetDlgCtrlID(c)) + kind + (style & WS_TABSTOP && kind != 'r' ? "T" : "");  // a checked radio takes the tab stop
        int32_t low = 0, high = 0;
        if (kind == 's' && (GetScrollRange(c, SB_CTL, &low, &high), low != 1 || high != 255)) kinds += "(range)";
        kinds += ' ';
    }
    EXPECT_EQ(kinds, "1030iT 1031iT 1055iT 1029iT 1051iT 1069iT 0g 1038a 1035r 1036r 1032a 0g 1043r 1044r 1045r 1046r 1047r 1048r 1049r 1050r "
                     "1033e 1034e 1041e 1042e 1039a 1040a 0t 0t 0t 0t 0t 0t 0t 0t 0t 0sT 1sT 2sT 3sT 4sT 5sT 6sT 7sT 8sT 9sT 10sT 11sT 12sT 13sT 14sT "
                     "15sT 16sT 17sT 18sT 19sT 20sT 21sT 22sT 23sT 24sT 25sT 26sT 27sT 28sT 29sT 30sT 31sT 32sT 33sT 34sT 35sT 1057a 0g 1058e 1059e 0t 0t "
                     "1065r 1066r 1067r 1068r ") << "each control's id, kind (icon, auto check box, radio, group, edit, text, scroll bar of 1 to 255) and tab stop";
    EXPECT_EQ(GetClassLongPtrA(MainWindow, GCLP_HICON), reinterpret_cast<LONG_PTR>(LoadIconA(GetModuleHandleA(nullptr), MAKEINTRESOURCEA(101))));
}

TEST_F(App, PlayDisablesTheTimerControlsAloneAndStopEnablesThemAgain) {
    std::vector<std::pair<HWND, bool>> before;
    for (HWND c = GetWindow(MainWindow, GW_CHILD); c != nullptr; c = GetWindow(c, GW_HWNDNEXT)) before.push_back({c, IsWindowEnabled(c) != FALSE});
    Press(StopId);  // while stopped: nothing
    EXPECT_TRUE(TimerControlsEnabled(true));
    Press(PlayId);
    ASSERT_EQ(IsPlaying, 1);
    for (const auto& [control, was] : before) {
        const int32_t id = GetDlgCtrlID(control);
        const bool refused = std::count(std::begin(TimerControls), std::end(TimerControls), id) || id == FadeOutId || id == FadeOutFieldId;
        EXPECT_EQ(IsWindowEnabled(control) != FALSE, was && !refused) << "control " << id << " while playing";
    }
    const int32_t blocks = SynthState.BlockIndex;
    Press(PlayId);  // while playing: nothing, no new stream
    EXPECT_EQ(SynthState.BlockIndex, blocks) << "a second Play made blocks";
    Press(StopId);
    EXPECT_TRUE(IsPlaying == 0 && TimerControlsEnabled(true));
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
    const int32_t profiles[][2] = {{1043, 100}, {1044, 101}, {1045, 102}, {1046, 103}, {1047, 104}, {1048, 105}, {DogsId, 107}, {TrafficId, 106}};
    for (const auto& p : profiles) {
        Press(p[0]);
        for (const auto& other : profiles) EXPECT_EQ(Checked(other[0]), other[0] == p[0]) << "after button " << p[0];
        EXPECT_EQ(ControlSettings.Value[Profile], p[1]) << "after button " << p[0];
    }
    for (int32_t id : {PmId, AmId}) {
        Press(id);
        EXPECT_TRUE(ControlSettings.Value[Alarm_PM] == (id == PmId) && ControlSettings.Value[Alarm_AM] == (id == AmId) && Checked(id) &&
                    !Checked(id == AmId ? PmId : AmId)) << "after " << id;
    }
    for (int32_t id : {StopTimeId, FadeOutId, FadeInId}) Press(id);
    EXPECT_TRUE(ControlSettings.Value[FadeOutOn] == 1 && ControlSettings.Value[FadeInOn] == 1);
    const struct { int32_t Press; bool Pair, Chime; } steps[] = {
        {StopTimeId, false, false}, {AlarmId, true, true}, {StopTimeId, true, true}, {AlarmId, true, false}, {StopTimeId, false, false}};
    for (const auto& s : steps) {
        Press(s.Press);
        SCOPED_TRACE("Stop Time " + std::to_string(Checked(StopTimeId)) + ", Alarm " + std::to_string(Checked(AlarmId)));
        EXPECT_TRUE(ControlSettings.Value[PlayUntilOn] == Checked(StopTimeId) && ControlSettings.Value[AlarmOn] == Checked(AlarmId));
        EXPECT_TRUE(Enabled(FadeOutId) == s.Pair && Enabled(FadeOutFieldId) == s.Pair) << "the Fade Out pair";
        EXPECT_EQ(IsWindowVisible(C(ChimeTestId)) != FALSE, s.Chime) << "the chime test button";
        EXPECT_TRUE(Checked(FadeOutId)) << "the Fade Out check mark";
    }
    ShowWindow(MainWindow, SW_MINIMIZE);
    SendMessageA(MainWindow, WM_POWERBROADCAST, PBT_APMRESUMEAUTOMATIC, 0);
    EXPECT_FALSE(IsIconic(MainWindow)) << "a power event leaves the window minimised";
}

// The main sliders scroll horizontally and the bands vertically; codes of the
// same value step both the same way (SB_LINEUP is SB_LINELEFT).
TEST_F(App, SlidersStepWithinTheirRangeAndABandStepSetsEqChangedAndTheMemory) {
    const struct { int32_t Start, Code, Result; } steps[] = {
        {240, SB_PAGEDOWN, 255}, {230, SB_PAGEDOWN, 255}, {231, SB_PAGEDOWN, 255}, {100, SB_PAGEDOWN, 125},
        {10, SB_PAGEUP, 1},      {26, SB_PAGEUP, 1},      {25, SB_PAGEUP, 1},      {100, SB_PAGEUP, 75},
        {250, SB_LINEDOWN, 255}, {251, SB_LINEDOWN, 255}, {252, SB_LINEDOWN, 255}, {100, SB_LINEDOWN, 105},
        {3, SB_LINEUP, 1},       {6, SB_LINEUP, 1},       {5, SB_LINEUP, 1},       {100, SB_LINEUP, 95},
        {100, SB_ENDSCROLL, 100}, {100, SB_TOP, 100},     {100, SB_THUMBTRACK, 37}, {200, SB_THUMBPOSITION, 37}};
    for (bool playing : {false, true}) {
        if (playing) Press(PlayId);
        for (int32_t id : {0, 1, 2, 3, 4, EqBandFirst + 4}) {
            for (const auto& s : steps) {
                Scroll(id, SB_THUMBPOSITION, s.Start);
                EqChanged = 0;
                Scroll(id, s.Code, 37);
                EXPECT_TRUE(ControlSettings.Value[id] == s.Result && Thumb(id) == s.Result)
                    << "slider " << id << " at " << s.Start << ", code " << s.Code << (playing ? ", playing" : "") << ": value "
                    << ControlSettings.Value[id] << ", thumb " << Thumb(id) << ", expected " << s.Result;
                EXPECT_TRUE(id < EqBandFirst || (EqChanged == 1 && EqMemories[0][4] == s.Result)) << "band 4, code " << s.Code;
            }
            Scroll(id, SB_THUMBPOSITION, 128);
        }
    }
}

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
    static float right[BlockFrames], left[BlockFrames];  // between two blocks the peaks given here are painted
    for (int32_t i = 0; i < BlockFrames; ++i) right[i] = i == 100 ? -28000.0f : 5.0f, left[i] = i == 4000 ? 28001.5f : -7.0f;
    UpdatePeaks(right, left);
    const std::pair<int32_t, int32_t> blue673{673, 16}, red674{16, 674}, none{16, 16};
    for (int32_t y = 2; y <= 19; ++y)
        EXPECT_EQ(BarEnds(y), y >= 3 && y <= 8 ? blue673 : y >= 13 && y <= 18 ? red674 : none) << "row " << y << ", right peak 28000, left 28001";
    UpdatePeaks(left, right);
    EXPECT_EQ(BarEnds(5), red674) << "upper row with a right peak of 28001";
    const struct { float Peak; std::pair<int32_t, int32_t> Ends; } bars[] = {{0, none}, {1, none}, {14000, {343, 16}}, {32000, red674}, {40000, red674}};
    for (const auto& b : bars) {
        right[100] = b.Peak;
        UpdatePeaks(right, left);
        EXPECT_EQ(BarEnds(5), b.Ends) << "right peak " << b.Peak;
    }
    Press(StopId);
    EXPECT_TRUE(BarEnds(5) == none && BarEnds(15) == none) << "after Stop";
}

// After every refill two blocks are queued: the slot written next is two
// ahead of the one the device hands back next.
bool RingInOrder() { return (WriteSlot - DoneSlot + 3) % 3 == 2; }

TEST_F(App, RingSlotsGoInOrderAndEveryPlayStartsAgainAtSlot0) {
    for (int32_t round = 0; round < 3; ++round) {
        Press(PlayId);  // round 1 and 2: right after Stop, with its handed-back buffers still to come
        ASSERT_TRUE(WriteSlot == 2 && DoneSlot == 0 && SynthState.BlockIndex == 2) << "round " << round;
        const WAVEFORMATEX& f = StreamFormat;  // 48 000 Hz 16-bit stereo PCM; Windows' drivers read the derived fields, Wine's do not
        EXPECT_TRUE(f.wFormatTag == 1 && f.nChannels == 2 && f.nSamplesPerSec == 48000 && f.wBitsPerSample == 16 && f.nBlockAlign == 4 && f.nAvgBytesPerSec == 192000 && !f.cbSize);
        for (int32_t refill = 1; refill <= 4; ++refill) {
            ASSERT_TRUE(PumpUntil([&] { return DoneSlot == refill % 3; }, 3000)) << "round " << round << " refill " << refill;
            EXPECT_TRUE(RingInOrder() && SynthState.BlockIndex == 2 + refill && BuffersQueued == 2)
                << "WriteSlot " << WriteSlot << ", DoneSlot " << DoneSlot << ", blocks " << SynthState.BlockIndex << ", queued " << BuffersQueued;
        }
        Press(StopId);
        EXPECT_TRUE(WriteSlot == 0 && DoneSlot == 0 && IsPlaying == 0) << "after Stop";
        for (const WAVEHDR& h : WaveHeaders) EXPECT_EQ(h.dwFlags & WHDR_PREPARED, 0u) << "a header still prepared";
    }
    PumpUntil([] { return false; }, 300);  // the handed-back buffers are ignored
    EXPECT_TRUE(WriteSlot == 0 && DoneSlot == 0 && HandedBack == 0);
}

// A release failing mid-stream: its box is held open until a notification
// waits behind it, then the device is put back; the ring stays in order.
HWAVEOUT RealDevice = nullptr;
int32_t MostDeferred = 0;  // notifications seen held back while the box was open
TEST_F(App, ANotificationDuringAStreamErrorBoxWaitsAndTheRingStaysInOrder) {
    Press(PlayId);
    ASSERT_TRUE(PumpUntil([] { return DoneSlot == 1; }, 3000));
    RealDevice = MainDevice;
    MainDevice = reinterpret_cast<HWAVEOUT>(static_cast<UINT_PTR>(0x5A5A));  // not a device: the next release fails
    HoldBox = [](const Box& box) {
        static const ULONGLONG since = GetTickCount64();
        if (box.Text != "Error 4531" || MainDevice == RealDevice) return false;
        MostDeferred = std::max(MostDeferred, DeferredRefills);
        if (DeferredRefills == 0 && GetTickCount64() - since < 5000) return true;
        return MainDevice = RealDevice, false;
    };
    const int32_t blocks = SynthState.BlockIndex;
    ASSERT_TRUE(PumpUntil([&] { return SynthState.BlockIndex >= blocks + 6; }, 10000)) << "the stream did not go on";
    HoldBox = nullptr;
    char text[400];
    waveOutGetErrorTextA(MMSYSERR_INVALHANDLE, text, sizeof(text));
    EXPECT_EQ(BoxTexts(), (Texts{"Error 4531", text}));
    EXPECT_TRUE(MostDeferred >= 1 && DeferredRefills == 0) << "held back while the box was open " << MostDeferred << ", never handled " << DeferredRefills;
    for (int32_t n = 1; n <= 3; ++n) {
        const int32_t next = (DoneSlot + 1) % 3;
        ASSERT_TRUE(PumpUntil([&] { return DoneSlot == next; }, 3000)) << "refill " << n << " after the box";
        EXPECT_TRUE(RingInOrder() && (WaveHeaders[WriteSlot].dwFlags & WHDR_INQUEUE) == 0) << "WriteSlot " << WriteSlot << ", DoneSlot " << DoneSlot;
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
    EXPECT_TRUE(IsChiming == 1 && IsPlaying == 0 && ChimeBuffersDone >= done && ChimeDevice == chime) << "the test or Play acted while the chime played";
    EXPECT_TRUE(PumpUntil([] { return IsChiming == 0; }, 20000)) << "the chime did not end";
    PumpUntil([] { return Tally.After > 0; }, 1000);  // the buffers of a chime closed early would come back now
    CountNotifications(false);
    EXPECT_EQ(Tally.WhileChiming, 1 + 32) << "block 0 handed back by the stop, and the chime's 32 buffers";
    EXPECT_EQ(Tally.After, 0) << "a second chime, or one closed before its end";
    EXPECT_TRUE(ChimeBuffersDone == 32 && HandedBack == 0) << "done " << ChimeBuffersDone << ", still handed back " << HandedBack;
}

// Levels, thumbs and memories, to see what an action changed.
std::string Levels() {
    std::string s;
    for (int32_t k = 0; k < EqBandCount; ++k) s += std::to_string(Band(k)) + "/" + std::to_string(Thumb(EqBandFirst + k)) + " ";
    for (const auto& memory : EqMemories)
        for (int32_t level : memory) s += std::to_string(level) + " ";
    return s;
}

TEST_F(App, LockAndDefeatIgnoreScrollingDefeatKeepsThePresetsAndAMemoryFollowsItsBandsAlone) {
    Press(M2Id);
    for (int32_t k = 0; k < EqBandCount; ++k) Scroll(EqBandFirst + k, SB_THUMBPOSITION, 10 + 7 * k);
    for (bool lock : {true, false}) {
        lock ? SetBox(EqLockId, true) : Press(EqDefeatId);
        EqChanged = 0;
        const std::string before = Levels() + Text({EqLevelId, EqFrequencyId});
        for (int32_t code : {SB_LINEUP, SB_LINEDOWN, SB_PAGEUP, SB_PAGEDOWN, SB_THUMBPOSITION, SB_THUMBTRACK, SB_ENDSCROLL})
            for (int32_t k : {0, 7, 30}) Scroll(EqBandFirst + k, code, 40);
        EXPECT_TRUE(Levels() + Text({EqLevelId, EqFrequencyId}) == before && EqChanged == 0) << (lock ? "with EQ Lock" : "with EQ Defeat");
        SetBox(EqLockId, false);
    }
    EXPECT_TRUE(Checked(EqDefeatId) && !Checked(EqMemory1Id) && !Checked(M2Id) && !Checked(M3Id));
    for (int32_t k = 0; k < EqBandCount; ++k) EXPECT_TRUE(Band(k) == 128 && Thumb(EqBandFirst + k) == 128) << "band " << k << " with EQ Defeat";
    EXPECT_EQ(Text({EqLevelId, EqFrequencyId}), "0 20");
    Press(M2Id);
    for (int32_t k = 0; k < EqBandCount; ++k) EXPECT_TRUE(Band(k) == 10 + 7 * k && Thumb(EqBandFirst + k) == 10 + 7 * k) << "band " << k << " after M2";
    EXPECT_FALSE(Checked(EqDefeatId));

    for (int32_t i = 0; i < 93; ++i) EqMemories[i / 31][i % 31] = 60 + i;
    Press(M3Id);
    Scroll(EqBandFirst + 7, SB_THUMBPOSITION, 250);
    for (int32_t i = 0; i < 93; ++i) EXPECT_EQ(EqMemories[i / 31][i % 31], i == 69 ? 250 : 60 + i) << "entry " << i;
    Scroll(EqBandFirst + 12, SB_THUMBPOSITION, 2);
    EqChanged = 0;
    const std::string levels = Levels();
    Press(M3Id);  // the selected memory again: no level changes, a rebuild and band 0 shown
    EXPECT_TRUE(Levels() == levels && EqChanged == 1);
    EXPECT_EQ(Text({EqLevelId, EqFrequencyId}), "0 20") << "band 0 at 122 (+0.94 dB)";
}

TEST_F(App, ReadoutsShowTheCentreAndTheLevelCutTowardZero) {
    const struct { int32_t Band, Value; const char* Shown; } cases[] = {
        {10, 2, "19 200"}, {10, 1, "20 200"}, {0, 127, "0 20"}, {0, 129, "0 20"}, {30, 255, "-20 20000"},
        {17, 254, "-19 1002"}, {3, 128, "0 39"}, {29, 135, "-1 15887"}, {12, 2, "19 316"}};
    for (const auto& c : cases) {
        Scroll(EqBandFirst + c.Band, SB_THUMBPOSITION, c.Value);
        EXPECT_EQ(Text({EqLevelId, EqFrequencyId}), c.Shown) << "band " << c.Band << " at " << c.Value;
    }
}

const char *const MinuteBox = "Minutes must be between 0 and 59", *const HourBox = "Hours must be between 1 and 12",
                  *const FadeInBox = "Fade In Time must be between 1 and 15 minutes",
                  *const FadeOutBox = "Fade Out Time must be between 1 and 15 minutes";
const int32_t TimeFields[4] = {MinuteFieldId, HourFieldId, FadeInFieldId, FadeOutFieldId};
const int32_t StoredField[4] = {Alarm_Min, Alarm_Hr, FadeInTime, FadeOutTime};

// The fields that are red ("m", "h", "i", "o") while each box is open.
std::string RedWhileOpen;
bool NoteRedFields(const Box&) {
    RedWhileOpen += RedWhileOpen.empty() ? "" : " ";
    for (int32_t i = 0; i < 4; ++i) RedWhileOpen += BrushOf(TimeFields[i]) == RedFieldBrush ? "mhio"[i] : '.';
    return false;
}

TEST_F(App, PlayChecksTheFieldsOfTheFeaturesThatAreOnRewritesThemAndSaysWhatIsWrong) {
    // Switches: "s" Stop Time, "a" Alarm, "i" Fade In, "o" Fade Out. The stop
    // time, when valid, is always at least six hours away.
    // Typed and Shown (after Play): minute, hour, fade-in, fade-out; Red: the
    // fields red while each box is open; Stored: Alarm_Min, Alarm_Hr,
    // FadeInTime, FadeOutTime (-1: not looked at); Focus: where it ends.
    const struct { const char *On, *Typed[4]; Texts Complaints; const char *Red, *Shown[4]; int32_t Stored[4], Focus; } rows[] = {
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
        SCOPED_TRACE(std::string("switches \"") + r.On + "\", typed \"" + r.Typed[0] + "\" \"" + r.Typed[1] + "\" \"" + r.Typed[2] + "\" \"" + r.Typed[3] + "\"");
        for (int32_t i = 0; i < 4; ++i) Type(TimeFields[i], r.Typed[i]);
        Press(now.wHour < 6 || now.wHour >= 18 ? PmId : AmId);  // 12:xx and 1:xx are far away
        for (const char* s = r.On; *s; ++s) SetBox(*s == 's' ? StopTimeId : *s == 'a' ? AlarmId : *s == 'i' ? FadeInId : FadeOutId, true);
        RedWhileOpen.clear();
        HoldBox = NoteRedFields;
        Press(PlayId);
        HoldBox = nullptr;
        EXPECT_EQ(IsPlaying, r.Complaints.empty() ? 1 : 0);
        for (const Box& box : Boxes)
            EXPECT_TRUE(box.Caption == "Sombrel Player" && box.Icon == LoadIconA(nullptr, IDI_HAND) && box.Buttons == 1) << box.Text;
        EXPECT_EQ(BoxTexts(), r.Complaints);
        EXPECT_EQ(RedWhileOpen, r.Red);
        EXPECT_EQ(Text({MinuteFieldId, HourFieldId, FadeInFieldId, FadeOutFieldId}), std::string(r.Shown[0]) + " " + r.Shown[1] + " " + r.Shown[2] + " " + r.Shown[3]);
        for (int32_t i = 0; i < 4; ++i) {
            EXPECT_TRUE(r.Stored[i] < 0 || ControlSettings.Value[StoredField[i]] == r.Stored[i])
                << "field " << TimeFields[i] << " stored " << ControlSettings.Value[StoredField[i]];
            EXPECT_EQ(BrushOf(TimeFields[i]), WhiteFieldBrush) << "field " << TimeFields[i] << " after the focus visited it";
        }
        EXPECT_TRUE(r.Focus == 0 || GetFocus() == C(r.Focus)) << "the focus is in " << GetDlgCtrlID(GetFocus());
        EXPECT_TRUE(TimerControlsEnabled(!r.Complaints.empty()));
        SetUp();
    }
    const int32_t switches[6] = {StopTimeId, StopTimeId, AlarmId, AlarmId, FadeInId, FadeOutId};
    for (int32_t c = 0; c < 6; ++c) {  // red only while it failed and its feature is on
        const int32_t slot = c < 4 ? c % 2 : c - 2, field = TimeFields[slot];
        FieldValid[slot] = 0;
        EXPECT_EQ(BrushOf(field), WhiteFieldBrush) << "field " << field << ", failed, switch " << switches[c] << " off";
        SetBox(switches[c], true);
        EXPECT_EQ(BrushOf(field), RedFieldBrush) << "field " << field << ", failed, switch " << switches[c] << " on";
        Type(field, "5");  // any notice of the field takes the red away
        EXPECT_EQ(BrushOf(field), WhiteFieldBrush) << "field " << field << " after its text was set";
        SetBox(switches[c], false);
    }
}

// A full set of stored values, each distinct where the control allows it.
int32_t Distinct(int32_t row) {
    const int32_t tail[11] = {0, 1, 1, 0, 7, 5, 106, 1, 1, 3, 12};  // Alarm on at 7:05 PM, Traffic, both fades
    return row < 5 ? 30 + 40 * row : row < 36 ? 1 + 8 * (row - 5) : row < 67 ? 255 - 7 * (row - 36) : row < 98 ? 20 + 5 * (row - 67) : tail[row - 98];
}

TEST_F(App, StoredSettingsComeBackOnceIntoTheControlsAndAreStoredBackByteForByte) {
    ASSERT_TRUE(ForgetStoredSettings());
    for (int32_t row = 0; row < StoredValueCount; ++row) ASSERT_TRUE(StoreNumber(StoredValueAt(row).Name, Distinct(row)));
    Restart();
    for (int32_t id = 0; id < SliderCount; ++id) EXPECT_TRUE(Thumb(id) == Distinct(id) && ControlSettings.Value[id] == Distinct(id)) << "slider " << id;
    for (int32_t i = 0; i < 93; ++i) EXPECT_EQ(EqMemories[i / 31][i % 31], Distinct(5 + i)) << "memory entry " << i;
    for (int32_t id : {EqMemory1Id, EqLockId, PmId, TrafficId, AlarmId, FadeInId, FadeOutId}) EXPECT_TRUE(Checked(id)) << id;
    for (int32_t id : {M2Id, AmId, DogsId, TalkingId, StopTimeId}) EXPECT_FALSE(Checked(id)) << id;
    EXPECT_EQ(Text({HourFieldId, MinuteFieldId, FadeInFieldId, FadeOutFieldId}), "7 5 3 12");
    EXPECT_TRUE(IsWindowVisible(C(ChimeTestId)) && Enabled(FadeOutId)) << "the chime button and the Fade Out pair with Alarm on";
    Scroll(Attenuator, SB_THUMBPOSITION, 99);  // a later layout loads nothing again
    SetWindowPos(MainWindow, nullptr, 0, 0, 800, 300, SWP_NOZORDER | SWP_NOMOVE | SWP_NOACTIVATE);
    EXPECT_EQ(Thumb(Attenuator), 99) << "the stored settings were applied again at a later WM_SIZE";
    Scroll(Attenuator, SB_THUMBPOSITION, Distinct(0));
    Press(EqDefeatId);  // the bands flat: a save writes the memories, not the bands
    ASSERT_TRUE(ForgetStoredSettings());
    HasPlayed = 1;  // a run without Play stores nothing: the Launch test
    SaveSettings();
    EXPECT_EQ(ValueCount(), StoredValueCount);
    for (int32_t row = 0; row < StoredValueCount; ++row)
        EXPECT_EQ(RawValue(ExpectedStoredName(row).c_str()), StoredForm(Distinct(row))) << ExpectedStoredName(row);

    ASSERT_TRUE(ForgetStoredSettings());  // a damaged key: the start value where a stored one cannot be used
    const uint8_t long200[8] = {'2', '0', '0', 0, 0, 0, 0, 0};
    const struct { const char* Name; DWORD Type; const void* Data; DWORD Length; } damaged[] = {
        {"Attenuator", REG_DWORD, "999", 4}, {"Hardness", REG_DWORD, "0\0\0", 4}, {"Bass", REG_DWORD, "-5\0", 4},
        {"SubBass", REG_DWORD, "ab\0", 4},   {"Treble", REG_SZ, "200", 4},        {"3", REG_DWORD, long200, 8},
        {"4", REG_DWORD, "200", 0},          {"5", REG_DWORD, "256", 4},          {"6", REG_DWORD, "200", 4},
        {"Profile", REG_DWORD, "0\0\0", 4},  {"PlayUntilOn", REG_DWORD, "2\0\0", 4}, {"Alarm_AM", REG_DWORD, "x\0\0", 4},
        {"Alarm_Hr", REG_DWORD, "99\0", 4},  {"Alarm_Min", REG_DWORD, "-5\0", 4}, {"FadeInTime", REG_SZ, "3", 2}};
    for (const auto& d : damaged) ASSERT_TRUE(StoreRaw(d.Name, d.Type, d.Data, d.Length)) << d.Name;
    SetUp();
    Restart();  // "6" (M1's band 6) at 200 is sound; the time fields are taken as stored, for Play to check
    for (int32_t id = 0; id < SliderCount; ++id) EXPECT_EQ(Thumb(id), id == EqBandFirst + 6 ? 200 : 128) << "slider " << id;
    EXPECT_TRUE(Checked(TalkingId) && Checked(AmId) && !Checked(StopTimeId) && Checked(EqLockId));
    EXPECT_EQ(Text({HourFieldId, MinuteFieldId, FadeInFieldId}), "99 -5 ");
    EXPECT_TRUE(ControlSettings.Value[Alarm_Hr] == 99 && ControlSettings.Value[Alarm_Min] == -5 && ControlSettings.Value[FadeInTime] == 0);
    ASSERT_TRUE(ForgetStoredSettings());
}

TEST_F(App, AUserWhoMayNotWriteTheMachineKeyKeepsTheSettingsInTheirOwnKey) {
    ASSERT_TRUE(ForgetStoredSettings() && StoreNumber("Attenuator", 50, HKEY_LOCAL_MACHINE) && StoreNumber("Attenuator", 60, HKEY_CURRENT_USER));
    Restart();
    EXPECT_EQ(Thumb(Attenuator), 60) << "the user's key is read when there is one";
    HasPlayed = 1;
    SaveSettings();  // to the machine's key; the user's older copy goes
    EXPECT_TRUE(RawValue("Attenuator") == StoredForm(60) && !KeyExists(HKEY_CURRENT_USER));
    ASSERT_TRUE(DenyKey(HKEY_LOCAL_MACHINE));
    Scroll(Attenuator, SB_THUMBPOSITION, 150);
    SaveSettings();  // silently to the user's key
    EXPECT_EQ(RawValue("Attenuator", HKEY_CURRENT_USER), StoredForm(150));
    EXPECT_EQ(BoxTexts(), Texts{});
    ASSERT_TRUE(DenyKey(HKEY_CURRENT_USER));
    SaveSettings();  // neither key: one box
    ASSERT_EQ(Boxes.size(), 1u);
    EXPECT_TRUE(Boxes[0].Caption == "Sombrel Player" && Boxes[0].Icon == LoadIconA(nullptr, IDI_ASTERISK));
    EXPECT_EQ(BoxTexts(), Texts{"Registry Creation Error 8734"});
    ASSERT_TRUE(ForgetStoredSettings());
}

// Every failing device call shows its code (no icon) and then the device's
// own text (exclamation mark), each with an OK button alone; `codes` are the
// code boxes' texts and captions, leaving out a release's 4532.
void ExpectFailures(const std::vector<std::pair<std::string, std::string>>& codes) {
    Texts texts;  // every text the device has for a result
    char text[400];
    for (UINT code = 1; code < 64; ++code) if (waveOutGetErrorTextA(code, text, sizeof(text)) == MMSYSERR_NOERROR) texts.push_back(text);
    std::vector<std::pair<std::string, std::string>> seen;
    for (size_t i = 0; i + 1 < Boxes.size(); i += 2) {
        const Box& device = Boxes[i + 1];
        EXPECT_TRUE(Boxes[i].Icon == nullptr && Boxes[i].Buttons == 1) << Boxes[i].Text;
        EXPECT_TRUE(device.Caption == "Sombrel Player" && device.Icon == LoadIconA(nullptr, IDI_EXCLAMATION) && device.Buttons == 1 &&
                    std::find(texts.begin(), texts.end(), device.Text) != texts.end()) << "after " << Boxes[i].Text << ": " << device.Text;
        if (Boxes[i].Text != "Error 4532") seen.push_back({Boxes[i].Text, Boxes[i].Caption});
    }
    EXPECT_EQ(Boxes.size() % 2, 0u);
    EXPECT_EQ(seen, codes);
    Boxes.clear();
}

TEST_F(App, NoDeviceMakesPlayStopAndTheChimeTestShowEveryFailureAndTheProgramComesBack) {
    for (int32_t round = 1; round <= 2; ++round) {
        Press(PlayId);
        char text[400];
        waveOutGetErrorTextA(MMSYSERR_BADDEVICEID, text, sizeof(text));
        EXPECT_TRUE(Boxes.size() >= 2 && Boxes[1].Text == text) << "the open's device text";
        ExpectFailures({{"Error 4528", "Sombrel Player"}, {"Error 4529", "Sombrel"}, {"Error 4530", "Sombrel"}, {"Error 4529", "Sombrel"}, {"Error 4530", "Sombrel"}});
        EXPECT_TRUE(IsPlaying == 1 && TimerControlsEnabled(false)) << "round " << round;
        Press(StopId);
        ExpectFailures({{"Error 4534", "Sombrel Player"}, {"Error 4535", "Sombrel Player"}});
        EXPECT_TRUE(IsPlaying == 0 && TimerControlsEnabled(true)) << "round " << round;
        Press(ChimeTestId);
        ExpectFailures({{"Error 4558", "Sombrel Player"}});
        EXPECT_EQ(IsChiming, 0) << "round " << round;
    }
}

// Run while the harness records the sound server into SOMBREL_CAPTURE. The
// time line tells compare_recording.py what was played, each line ending
// with the recording's size at that moment:
//   play OPTIONS       Play pressed; the render tool's OPTIONS are in force
//   set BLOCK OPTIONS  from block BLOCK on the settings are OPTIONS
//   stop BLOCK         Stop pressed after BLOCK blocks were made
//   chime OPTIONS      the chime started
//   end
int64_t Recorded() {
    WIN32_FILE_ATTRIBUTE_DATA data;
    const char* capture = std::getenv("SOMBREL_CAPTURE");
    if (!capture || !GetFileAttributesExA(WindowsPath(capture).c_str(), GetFileExInfoStandard, &data)) return -1;
    return static_cast<int64_t>(data.nFileSizeHigh) << 32 | data.nFileSizeLow;
}
void Note(const std::string& line) { std::ofstream((WorkDir() + "\\timeline.txt").c_str(), std::ios::app) << line << ' ' << Recorded() << '\n'; }
// From the next block on, the render tool's options are `options`.
void NoteChange(const std::string& options) { Note("set " + std::to_string(SynthState.BlockIndex) + " " + options); }
bool RecordFor(double seconds) {
    const int64_t target = Recorded() + static_cast<int64_t>(seconds * 48000) * 4;
    return Recorded() >= 0 && PumpUntil([&] { return Recorded() >= target; }, static_cast<DWORD>(seconds * 3000 + 5000));
}

TEST_F(App, SoundOfStoredSettingsOfChangesWhilePlayingAndOfTheChimeIsWhatTheRenderMakes) {
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
    Scroll(Attenuator, SB_THUMBPOSITION, 200);
    NoteChange(options += " --volume 200");
    ASSERT_TRUE(RecordFor(2));
    Press(DogsId);
    NoteChange(options += " --profile 107");
    ASSERT_TRUE(RecordFor(2));
    Scroll(EqBandFirst + 14, SB_THUMBPOSITION, 30);
    for (int32_t twice = 0; twice < 2; ++twice) Scroll(EqBandFirst + 4, SB_PAGEDOWN);
    options += " --eq ";
    for (int32_t k = 0; k < EqBandCount; ++k) options += (k ? "," : "") + std::to_string(Band(k));
    NoteChange(options);
    ASSERT_TRUE(RecordFor(2));
    Press(StopId);
    Note("stop " + std::to_string(SynthState.BlockIndex));
    ASSERT_TRUE(RecordFor(1));
    Note("chime --volume 200");  // the chime right after Stop, heard whole
    Press(ChimeTestId);
    ASSERT_TRUE(IsChiming == 1 && PumpUntil([] { return IsChiming == 0; }, 20000));
    ASSERT_TRUE(RecordFor(1));
    Note("end");
    ASSERT_TRUE(ForgetStoredSettings());
}

// Run with SOMBREL_EXE naming the program, started from its own folder, and
// without the hosted window.
std::string Exe;  // the program under test (SOMBREL_EXE), a Windows path
std::string Marker() { return WorkDir() + "\\opened.txt"; }
bool Opened() { return GetFileAttributesA(Marker().c_str()) != INVALID_FILE_ATTRIBUTES; }
HWND Volume(const Program& p) { return FindWindowExA(p.Window, nullptr, "ScrollBar", nullptr); }

TEST(Launch, HelpShowsTheAboutBoxThenOpensTheManualBesideTheProgramAndARunWithPlayStoresTheSettingsForTheNextStartWithoutTheMachineKey) {
    char self[MAX_PATH];
    GetModuleFileNameA(nullptr, self, sizeof(self));
    const std::string command = std::string("\"") + self + "\" --mark-opened \"" + Marker() + "\" \"%1\"";
    RegSetValueA(HKEY_CLASSES_ROOT, ".pdf", REG_SZ, "SombrelTestPdf", 14);
    RegSetValueA(HKEY_CLASSES_ROOT, "SombrelTestPdf\\shell\\open\\command", REG_SZ, command.c_str(), static_cast<DWORD>(command.size()));
    ASSERT_TRUE(ForgetStoredSettings());
    Program p;
    ASSERT_TRUE(Launch(&p, Exe)) << Exe;
    EXPECT_EQ(Close(&p), 0);
    EXPECT_FALSE(KeyExists()) << "a run without Play stored the settings";
    ASSERT_TRUE(DenyKey(HKEY_LOCAL_MACHINE));  // as for a standard user on Windows
    for (int32_t start = 1; start <= 2; ++start) {
        DeleteFileA(Marker().c_str());
        ASSERT_TRUE(Launch(&p, Exe)) << Exe;
        EXPECT_EQ(SendMessageA(Volume(p), SBM_GETPOS, 0, 0), start == 1 ? 128 : 200) << "the volume at start " << start;
        PostMessageA(GetDlgItem(p.Window, HelpId), BM_CLICK, 0, 0);
        ASSERT_TRUE(PumpUntil([&] { return !OpenBoxes(p).empty() && ReadBox(OpenBoxes(p)[0]).Buttons > 0; }, 20000)) << "no about box";
        const Box about = ReadBox(OpenBoxes(p)[0]);
        EXPECT_TRUE(about.Caption == "Sombrel Player" && about.Text.find("Sombrel Player") != std::string::npos &&
                    about.Text.find("1.00") != std::string::npos && about.Icon == nullptr && about.Buttons == 1) << about.Text;
        EXPECT_FALSE(PumpUntil(Opened, 1500)) << "the manual was opened while the about box was open";
        PostMessageA(OpenBoxes(p)[0], WM_COMMAND, MAKEWPARAM(IDOK, BN_CLICKED), 0);
        ASSERT_TRUE(PumpUntil(Opened, 20000)) << "the manual was not opened";
        std::string opened;
        std::getline(std::ifstream(Marker().c_str()), opened);
        EXPECT_EQ(lstrcmpiA(opened.c_str(), (Exe.substr(0, Exe.find_last_of('\\')) + "\\Sombrel.pdf").c_str()), 0) << opened;
        DWORD_PTR result = 0;
        if (start == 1) SendMessageTimeoutA(p.Window, WM_HSCROLL, MAKEWPARAM(SB_THUMBPOSITION, 200), reinterpret_cast<LPARAM>(Volume(p)), SMTO_NORMAL, 10000, &result);
        EXPECT_TRUE(Click(p, PlayId) && (start == 1 || Click(p, StopId))) << "Play, and Stop at the second start";
        EXPECT_EQ(Close(&p), 0) << (start == 1 ? "closed while playing" : "closed after Stop");
        EXPECT_EQ(BoxTexts(), Texts{}) << "boxes at the close";
        EXPECT_EQ(RawValue("Attenuator", HKEY_CURRENT_USER), StoredForm(200)) << "the settings stored in the user's key at the end of a run with Play";
    }
    RegDeleteTreeA(HKEY_CLASSES_ROOT, "SombrelTestPdf");
    RegDeleteTreeA(HKEY_CLASSES_ROOT, ".pdf");
    ForgetStoredSettings();
}

}  // namespace

int main(int argc, char** argv) {
    if (argc == 4 && std::string(argv[1]) == "--mark-opened") {  // the shell opening a manual for the Help test
        std::ofstream(argv[2]) << argv[3] << '\n';
        return 0;
    }
    ::testing::InitGoogleTest(&argc, argv);
    if (const char* exe = std::getenv("SOMBREL_EXE")) return Exe = WindowsPath(exe), RUN_ALL_TESTS();
    // A first start: no stored settings to apply over the start values.
    if (!ForgetStoredSettings() || StartProgram(GetModuleHandleA(nullptr), SW_SHOWNORMAL) == nullptr)
        return std::fprintf(stderr, "the settings could not be removed or the window not made (is there a display?)\n"), 1;
    StartAnsweringBoxes();
    PumpUntil([] { return false; }, 200);
    return RUN_ALL_TESTS();
}
