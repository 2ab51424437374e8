// The program's own window, run inside this test process: the same start-up,
// window procedure, stream and meter as Sombrel.exe, driven with window
// messages on this thread, so the tests can also read the state the window
// keeps (slider fields, ring slots, the meter's pixels). The sound goes to
// the harness's sound server.
#include <gtest/gtest.h>
#include <windows.h>
#include <mmsystem.h>
#include <string>
#include <vector>
#include "app/commands.h"
#include "app/core_state.h"
#include "app/globals.h"
#include "app/meter.h"
#include "app/window.h"
#include "tests/program/in_process.h"
#include "audio/stream.h"
#include "engine/platform.h"

namespace {

void Scroll(int32_t id, int32_t code, int32_t position = 0) {
    SendMessageA(MainWindow, WM_HSCROLL, MAKEWPARAM(code, position),
                 reinterpret_cast<LPARAM>(SliderBars[id]));
}

void CALLBACK WatchBoxes(HWND, UINT, UINT_PTR, DWORD);

// One program for the whole run: its window class can be registered once.
// A box watcher runs all the time, so an unexpected box is answered (and
// noted) instead of holding the test forever.
class ProgramEnvironment : public ::testing::Environment {
public:
    void SetUp() override {
        ASSERT_NE(StartProgram(GetModuleHandleA(nullptr), SW_SHOWNORMAL), nullptr)
            << "StartProgram gave no window";
        SetTimer(nullptr, 0, 20, WatchBoxes);
        PumpUntil([] { return false; }, 200);
    }
};

// ---------------------------------------------------------------- main sliders

TEST(MainSlider, StartsAt128OnTheRange1To255) {
    for (int32_t id = 0; id < 36; ++id) {
        int low = 0, high = 0;
        GetScrollRange(SliderBars[id], SB_CTL, &low, &high);
        EXPECT_EQ(low, 1) << "GetScrollRange(slider " << id << ") low " << low << ", expected 1";
        EXPECT_EQ(high, 255) << "GetScrollRange(slider " << id << ") high " << high << ", expected 255";
        EXPECT_EQ(GetScrollPos(SliderBars[id], SB_CTL), 128)
            << "GetScrollPos(slider " << id << ") gave " << GetScrollPos(SliderBars[id], SB_CTL) << ", expected 128";
    }
}

void CheckSteps(const char* state) {
    struct Step {
        int32_t Start, Code, Position, Result;
    } steps[] = {
        {240, SB_PAGERIGHT, 0, 255}, {10, SB_PAGELEFT, 0, 1},      {100, SB_PAGERIGHT, 0, 125},
        {100, SB_PAGELEFT, 0, 75},   {253, SB_LINERIGHT, 0, 255},  {3, SB_LINELEFT, 0, 1},
        {100, SB_LINERIGHT, 0, 105}, {100, SB_LINELEFT, 0, 95},    {100, SB_ENDSCROLL, 0, 100},
        {100, SB_TOP, 0, 100},       {100, SB_THUMBTRACK, 37, 37}, {37, SB_THUMBPOSITION, 200, 200},
    };
    for (int32_t id = 0; id < 5; ++id) {
        for (const Step& s : steps) {
            Scroll(id, SB_THUMBPOSITION, s.Start);
            Scroll(id, s.Code, s.Position);
            EXPECT_EQ(ControlSettings.Value[id], s.Result)
                << state << ": slider " << id << " at " << s.Start << ", WM_HSCROLL code " << s.Code << " pos "
                << s.Position << " left the field at " << ControlSettings.Value[id] << ", expected " << s.Result;
            EXPECT_EQ(GetScrollPos(SliderBars[id], SB_CTL), s.Result)
                << state << ": slider " << id << " at " << s.Start << ", code " << s.Code << ": GetScrollPos gave "
                << GetScrollPos(SliderBars[id], SB_CTL) << ", expected " << s.Result;
        }
        Scroll(id, SB_THUMBPOSITION, 128);
    }
    // A drag writes every position it passes through.
    for (int32_t position = 1; position <= 255; position += 2) {
        Scroll(0, SB_THUMBTRACK, position);
        ASSERT_EQ(ControlSettings.Value[Attenuator], position)
            << state << ": SB_THUMBTRACK to " << position << " left Attenuator at " << ControlSettings.Value[Attenuator];
    }
    Scroll(0, SB_THUMBPOSITION, 128);
}

TEST(MainSlider, StepsStayWithinTheRangeWhenStoppedAndWhilePlaying) {
    CheckSteps("stopped");
    Command(PlayId);
    ASSERT_EQ(IsPlaying, 1) << "Play did not start";
    CheckSteps("playing");
    PumpUntil([] { return DoneSlot == 2; }, 2000);
    CheckSteps("playing, after refills");
    Command(StopId);
    EXPECT_EQ(IsPlaying, 0) << "IsPlaying after the Stop command";
}

// ---------------------------------------------------------------- the meter

TEST(MeterGeometry, BarEndsFollowThePeak) {
    SetMeterRectangles(&MeterState);
    const RECT& up = MeterState.UpperArea;
    const RECT& low = MeterState.LowerArea;
    EXPECT_TRUE(up.left == 15 && up.top == 2 && up.right == 675 && up.bottom == 10)
        << "upper area " << up.left << "," << up.top << "," << up.right << "," << up.bottom << ", expected 15,2,675,10";
    EXPECT_TRUE(low.left == 15 && low.top == 12 && low.right == 675 && low.bottom == 20)
        << "lower area " << low.left << "," << low.top << "," << low.right << "," << low.bottom << ", expected 15,12,675,20";
    const RECT& f = MeterState.Frame;
    EXPECT_TRUE(f.left == 14 && f.top == 1 && f.right == 676 && f.bottom == 21)
        << "meter frame " << f.left << "," << f.top << "," << f.right << "," << f.bottom << ", expected 14,1,676,21";
    struct Case {
        int32_t Peak, Right;
    } cases[] = {{0, 16}, {1, 16}, {28000, 673}, {28001, 674}, {32000, 674}, {40000, 674}, {14000, 343}};
    for (const Case& c : cases)
        EXPECT_EQ(MeterBarRight(&up, 660, c.Peak), c.Right)
            << "MeterBarRight(upper area, 660, " << c.Peak << ") gave " << MeterBarRight(&up, 660, c.Peak)
            << ", expected " << c.Right;
}

// Where the blue and the red bar of one row end: the bar's right edge as a
// rectangle, one past its last pixel (16 for no bar, which starts at x 16).
std::string Row(HDC dc, int32_t y, int32_t* blueEnd, int32_t* redEnd) {
    *blueEnd = 16;
    *redEnd = 16;
    for (int32_t x = 14; x <= 676; ++x) {
        const COLORREF c = GetPixel(dc, x, y);
        if (c == RGB(0, 0, 200)) *blueEnd = x + 1;
        if (c == RGB(200, 0, 0)) *redEnd = x + 1;
    }
    return "blue bar's right edge x " + std::to_string(*blueEnd) + ", red bar's x " + std::to_string(*redEnd);
}

TEST(MeterGeometry, PeakOf28000IsBlueTo673And28001RedTo674UpperBarRight) {
    Command(PlayId);
    ASSERT_EQ(IsPlaying, 1) << "IsPlaying after the Play command";
    // Between two blocks nothing else runs on this thread: the peaks given
    // here are painted before the next buffer-done notification.
    static float right[BlockFrames], left[BlockFrames];
    for (int32_t i = 0; i < BlockFrames; ++i) {
        right[i] = (i == 100) ? -28000.0f : 5.0f;
        left[i] = (i == 4000) ? 28001.5f : -7.0f;
    }
    UpdatePeaks(right, left);
    UpdateWindow(MainWindow);
    HDC dc = GetDC(MainWindow);
    int32_t blue = 0, red = 0;
    for (int32_t y = 3; y <= 8; ++y) {
        const std::string seen = Row(dc, y, &blue, &red);
        EXPECT_TRUE(blue == 673 && red == 16) << "upper row " << y << " (right channel, peak 28000): " << seen
                                              << "; expected a blue bar to x 673, no red";
        EXPECT_NE(GetPixel(dc, 16, y), GetPixel(dc, 15, y)) << "upper row " << y << ": the bar does not start at x 16";
    }
    for (int32_t y = 13; y <= 18; ++y) {
        const std::string seen = Row(dc, y, &blue, &red);
        EXPECT_TRUE(red == 674 && blue == 16) << "lower row " << y << " (left channel, peak 28001): " << seen
                                              << "; expected a red bar to x 674, no blue";
    }
    for (int32_t y : {2, 9, 12, 19}) {
        const std::string seen = Row(dc, y, &blue, &red);
        EXPECT_TRUE(blue == 16 && red == 16) << "row " << y << " outside the bars: " << seen;
    }
    // Swapped channels: the upper bar follows the right one.
    UpdatePeaks(left, right);
    UpdateWindow(MainWindow);
    const std::string upper = Row(dc, 5, &blue, &red);
    EXPECT_EQ(red, 674) << "upper row with a right-channel peak of 28001: " << upper;
    ReleaseDC(MainWindow, dc);

    Command(StopId);
    UpdateWindow(MainWindow);
    dc = GetDC(MainWindow);
    for (int32_t y : {5, 15}) {
        const std::string seen = Row(dc, y, &blue, &red);
        EXPECT_TRUE(blue == 16 && red == 16) << "after Stop row " << y << ": " << seen << "; expected empty";
    }
    ReleaseDC(MainWindow, dc);
    EXPECT_EQ(MeterState.PeakLeft, 0) << "PeakLeft after Stop";
    EXPECT_EQ(MeterState.PeakRight, 0) << "PeakRight after Stop";
}

// ---------------------------------------------------------------- the ring

// After every refill two blocks are queued: the slot being written next is
// two ahead of the one the device hands back next.
bool RingInOrder() { return (WriteSlot - DoneSlot + 3) % 3 == 2; }

TEST(Ring, SlotsAreUsedInOrderAndStopStartsAgainAtSlot0) {
    Command(PlayId);
    ASSERT_EQ(IsPlaying, 1) << "IsPlaying after the Play command";
    EXPECT_EQ(WriteSlot, 2) << "after Play the next slot to write is " << WriteSlot << ", expected 2";
    EXPECT_EQ(DoneSlot, 0) << "after Play the next slot to release is " << DoneSlot << ", expected 0";
    EXPECT_EQ(SynthState.BlockIndex, 2) << "BlockIndex after the two blocks of Play";
    for (int32_t expectedDone = 1; expectedDone <= 7; ++expectedDone) {
        ASSERT_TRUE(PumpUntil([&] { return DoneSlot == expectedDone % 3; }, 3000))
            << "refill " << expectedDone << " did not come within 3 s (DoneSlot " << DoneSlot << ")";
        EXPECT_TRUE(RingInOrder()) << "after refill " << expectedDone << ": WriteSlot " << WriteSlot << ", DoneSlot "
                                   << DoneSlot;
        EXPECT_EQ(SynthState.BlockIndex, 2 + expectedDone) << "BlockIndex after refill " << expectedDone;
    }
    Command(StopId);
    EXPECT_EQ(IsPlaying, 0) << "IsPlaying after the Stop command";
    EXPECT_TRUE(WriteSlot == 0 && DoneSlot == 0) << "after Stop WriteSlot " << WriteSlot << ", DoneSlot " << DoneSlot;
    for (int32_t i = 0; i < 3; ++i)
        EXPECT_EQ(WaveHeaders[i].dwFlags & WHDR_PREPARED, 0u) << "header " << i << " still prepared after Stop";
    // The buffers handed back by the stop are ignored.
    PumpUntil([] { return false; }, 300);
    EXPECT_TRUE(WriteSlot == 0 && DoneSlot == 0) << "the handed-back buffers moved the ring: WriteSlot "
                                                 << WriteSlot << ", DoneSlot " << DoneSlot;
    Command(PlayId);
    EXPECT_EQ(WriteSlot, 2) << "a new Play did not start again at slot 0";
    Command(StopId);

}

// Notifications reaching the window, by whether the chime was on when they
// came: the test puts itself in front of the window procedure.
struct DoneTally {
    int32_t WhileChiming = 0;
    int32_t AfterChime = 0;     // after the chime had ended
    bool ChimeStarted = false;
    WNDPROC Next = nullptr;
};
DoneTally Tally;

LRESULT CALLBACK CountingProc(HWND window, UINT message, WPARAM wParam, LPARAM lParam) {
    if (message == MM_WOM_DONE && Tally.ChimeStarted) {
        if (IsChiming == 1)
            ++Tally.WhileChiming;
        else
            ++Tally.AfterChime;
    }
    return CallWindowProcA(Tally.Next, window, message, wParam, lParam);
}

TEST(Ring, AChimeRightAfterStopCountsOnlyItsOwnBuffers) {
    // The chime test handled right after Stop: the stop's handed-back
    // buffers are still queued, and the chime's device may get the handle
    // value the main device had. The chime must still play all its 32
    // buffers: none of them is handed back by an early close.
    Command(PlayId);
    ASSERT_EQ(IsPlaying, 1) << "IsPlaying after the Play command";
    ASSERT_TRUE(PumpUntil([] { return DoneSlot == 1; }, 3000)) << "no refill within 3 s";
    const HWAVEOUT mainDevice = MainDevice;
    Tally = DoneTally();
    Tally.Next = reinterpret_cast<WNDPROC>(
        SetWindowLongPtrA(MainWindow, GWLP_WNDPROC, reinterpret_cast<LONG_PTR>(CountingProc)));
    Command(StopId);
    Command(ChimeTestId);
    Tally.ChimeStarted = true;
    ASSERT_EQ(IsChiming, 1) << "IsChiming after the chime test command";
    std::printf("main device %p, chime device %p\n", static_cast<void*>(mainDevice),
                static_cast<void*>(ChimeDevice));
    EXPECT_TRUE(PumpUntil([] { return IsChiming == 0; }, 15000)) << "the chime did not end within 15 s";
    EXPECT_EQ(ChimeBuffersDone, 32) << "chime buffers counted";
    // A chime closed early hands its last buffers back, each with a
    // notification after the end; a chime played out has none left.
    PumpUntil([] { return false; }, 1000);
    SetWindowLongPtrA(MainWindow, GWLP_WNDPROC, reinterpret_cast<LONG_PTR>(Tally.Next));
    EXPECT_EQ(Tally.AfterChime, 0) << Tally.AfterChime << " notifications came after the chime ended: it was "
                                   << "closed before its last buffers had played";
    EXPECT_EQ(Tally.WhileChiming, 32 + 2) << "notifications while the chime was on: expected the stop's 2 "
                                             "handed-back buffers and the chime's 32";
    EXPECT_EQ(HandedBack, 0) << "handed-back notifications still expected";
}

// What the box watcher saw and did.
struct BoxLog {
    std::vector<std::string> Texts;   // every stream box, in order
    int32_t HeldBack = 0;              // DeferredRefills while the code box was open
    HWAVEOUT RealDevice = nullptr;     // put back before the code box is closed
    ULONGLONG FirstSeen = 0;
};
BoxLog Watch;

// A thread timer: the box's own modal loop dispatches it. The code box is
// held open until a buffer-done notification has arrived behind it (or 5 s
// have passed), then the real device is put back and the box answered.
void CALLBACK WatchBoxes(HWND, UINT, UINT_PTR, DWORD) {
    HWND box = OwnOpenBox();
    if (box == nullptr) return;
    char text[400] = {0};
    GetDlgItemTextA(box, 0xFFFF, text, sizeof(text));
    if (Watch.FirstSeen == 0) Watch.FirstSeen = GetTickCount64();
    if (std::string(text) == "Error 4531" && Watch.RealDevice != nullptr) {
        if (DeferredRefills == 0 && GetTickCount64() - Watch.FirstSeen < 5000) return;
        Watch.HeldBack = DeferredRefills;
        MainDevice = Watch.RealDevice;
        Watch.RealDevice = nullptr;
    }
    Watch.Texts.push_back(text);
    Watch.FirstSeen = 0;
    PostMessageA(box, WM_COMMAND, MAKEWPARAM(IDOK, BN_CLICKED), 0);
}

TEST(Ring, PlayRightAfterStopIgnoresTheBuffersTheStopHandedBack) {
    // Stop and Play handled back to back: the notifications of the buffers
    // the stop handed back are still queued when the new stream starts.
    Watch = BoxLog();
    for (int32_t round = 0; round < 5; ++round) {
        Command(PlayId);
        ASSERT_TRUE(PumpUntil([] { return DoneSlot == 1; }, 3000)) << "round " << round << ": no refill";
        Command(StopId);
        Command(PlayId);
        ASSERT_EQ(IsPlaying, 1) << "IsPlaying after the Play command";
        ASSERT_TRUE(RingInOrder()) << "WriteSlot " << WriteSlot << ", DoneSlot " << DoneSlot << "; expected WriteSlot two ahead";
        const int32_t blockBefore = SynthState.BlockIndex;
        ASSERT_TRUE(PumpUntil([&] { return SynthState.BlockIndex >= blockBefore + 3; }, 5000))
            << "round " << round << ": the new stream did not go on";
        EXPECT_EQ(HandedBack, 0) << "round " << round << ": notifications of handed-back buffers still to come";
        EXPECT_TRUE(RingInOrder()) << "round " << round << ": WriteSlot " << WriteSlot << ", DoneSlot " << DoneSlot;
        EXPECT_EQ(BuffersQueued, 2) << "round " << round << ": the device holds " << BuffersQueued << " buffers";
        Command(StopId);
    }
    EXPECT_TRUE(Watch.Texts.empty()) << Watch.Texts.size() << " stream boxes appeared, the first \""
                                     << (Watch.Texts.empty() ? "" : Watch.Texts[0]) << "\"";
}

TEST(Ring, ANotificationDuringAStreamErrorBoxWaitsAndTheRingStaysInOrder) {
    Command(PlayId);
    ASSERT_EQ(IsPlaying, 1) << "IsPlaying after the Play command";
    ASSERT_TRUE(PumpUntil([] { return DoneSlot == 1; }, 3000)) << "the first refill did not come";
    ASSERT_TRUE(RingInOrder()) << "WriteSlot " << WriteSlot << ", DoneSlot " << DoneSlot << "; expected WriteSlot two ahead";
    // The next release fails: its device handle is made invalid until the
    // watcher has seen a notification arrive while the failure's box is open.
    Watch = BoxLog();
    Watch.RealDevice = MainDevice;
    MainDevice = reinterpret_cast<HWAVEOUT>(static_cast<UINT_PTR>(0x5A5A));
    const int32_t blockBefore = SynthState.BlockIndex;
    ASSERT_TRUE(PumpUntil([&] { return SynthState.BlockIndex >= blockBefore + 6; }, 10000))
        << "the stream did not go on after the failed release: BlockIndex " << SynthState.BlockIndex;
    char deviceText[400];
    waveOutGetErrorTextA(MMSYSERR_INVALHANDLE, deviceText, sizeof(deviceText));
    ASSERT_EQ(Watch.Texts.size(), 2u) << "stream boxes: " << Watch.Texts.size()
                                      << " (first \"" << (Watch.Texts.empty() ? "" : Watch.Texts[0])
                                      << "\"), expected exactly \"Error 4531\" and the device text";
    EXPECT_EQ(Watch.Texts[0], "Error 4531") << "first stream box of the failed release";
    EXPECT_EQ(Watch.Texts[1], deviceText) << "second box: waveOutGetErrorTextA(MMSYSERR_INVALHANDLE)";
    EXPECT_GE(Watch.HeldBack, 1) << "no notification arrived while the box was open: the case was not exercised";
    EXPECT_EQ(DeferredRefills, 0) << "held-back notifications were never handled";
    EXPECT_TRUE(RingInOrder()) << "after the box: WriteSlot " << WriteSlot << ", DoneSlot " << DoneSlot;
    for (int32_t n = 1; n <= 3; ++n) {
        const int32_t next = (DoneSlot + 1) % 3;
        ASSERT_TRUE(PumpUntil([&] { return DoneSlot == next; }, 3000)) << "refill " << n << " after the box did not come";
        EXPECT_TRUE(RingInOrder()) << "refill " << n << " after the box: WriteSlot " << WriteSlot << ", DoneSlot "
                                   << DoneSlot;
        // The slot written next is free: the device handed it back.
        EXPECT_EQ(WaveHeaders[WriteSlot].dwFlags & WHDR_INQUEUE, 0u)
            << "slot " << WriteSlot << " is the next to be written but the device still has it";
    }
    Command(StopId);
    EXPECT_EQ(IsPlaying, 0) << "IsPlaying after the Stop command";
}

}  // namespace

int main(int argc, char** argv) {
    ::testing::InitGoogleTest(&argc, argv);
    ::testing::AddGlobalTestEnvironment(new ProgramEnvironment);
    return RUN_ALL_TESTS();
}
