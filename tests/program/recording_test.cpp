// What the program plays, heard through the sound server while a user works
// its window: an equaliser band moved while playing, settings restored at
// start, the stop time on the clock, the alarm chime, the fade-in and the
// fade-out. Run by the harness while it records the sound server's output
// into the file named by SOMBREL_CAPTURE. Each test notes in the time line
// what it did, with the recording's size at that moment and the render
// tool's options for the settings in force; the harness
// (compare_recording.py) then compares the recording with those renders.
//
// Time line lines, the last word always the recording's size in bytes:
//   begin KIND 'what the test shows' [render options]   a stretch starts
//   set [render options]                                 settings changed while playing
//   end KIND                                             the stretch ends
#include <gtest/gtest.h>
#include <windows.h>

#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <string>
#include <vector>

#include "tests/program/driver.h"
#include "tests/program/window_ids.h"
#include "tests/program/settings_store.h"

namespace {

constexpr int32_t BandCount = 31;

// The chime lasts 262 144 frames at 48 000 Hz.
constexpr double ChimeSeconds = 262144.0 / 48000.0;

std::string BandList(const int32_t bands[BandCount]) {
    std::string out;
    for (int32_t k = 0; k < BandCount; ++k) out += (k ? "," : "") + std::to_string(bands[k]);
    return out;
}

SYSTEMTIME Now() {
    SYSTEMTIME t;
    GetLocalTime(&t);
    return t;
}

int32_t MinuteOfDay(const SYSTEMTIME& t) { return t.wHour * 60 + t.wMinute; }

// A fresh program per test, started by the test once it has prepared what
// the program finds at its start; closed afterwards with any box answered.
class RecordingTest : public ::testing::Test {
protected:
    Program P = {};
    std::string Capture;
    std::ofstream Timeline;

    void SetUp() override {
        const char* capture = std::getenv("SOMBREL_CAPTURE");
        ASSERT_NE(capture, nullptr) << "SOMBREL_CAPTURE is not set: the harness records the sound";
        Capture = WindowsPath(capture);
        ASSERT_GE(Recorded(), 0) << "the recording " << Capture << " does not exist";
        Timeline.open((Config.WorkDir + "\\sound-timeline.txt").c_str(), std::ios::app);
        ASSERT_TRUE(Timeline.is_open()) << "the time line in " << Config.WorkDir << " cannot be written";
        ASSERT_TRUE(ForgetStoredSettings()) << "the key HKLM\\Software\\Sombrel could not be removed";
    }
    void TearDown() override {
        for (int i = 0; i < 40; ++i) {
            std::vector<Box> boxes = OpenBoxes(P);
            if (boxes.empty()) break;
            CloseBox(boxes.back());
        }
        if (P.Process.hProcess != nullptr && CloseProgram(&P) < 0) EndProgram(&P);
        ForgetStoredSettings();
    }
    void Launch() {
        ASSERT_TRUE(LaunchProgram(&P)) << "LaunchProgram(" << Config.ProgramPath
                                       << ") found no visible window of class \"Sombrel Player\" within 30 s";
        ASSERT_TRUE(Settle(P)) << "the program does not answer after its start";
    }

    int64_t Recorded() { return FileSize(Capture); }
    void Note(const std::string& what) {
        Timeline << what << ' ' << Recorded() << '\n';
        Timeline.flush();
    }
    // Waits until the recording has grown by `seconds` of sound.
    bool RecordFor(double seconds) {
        const int64_t target = Recorded() + static_cast<int64_t>(seconds * 48000) * 4;
        return WaitFor([&] { return Recorded() >= target; }, static_cast<DWORD>(seconds * 1000 * 3 + 5000));
    }

    // Controls by id; the volume slider shares id 0 with the labels and
    // frames, so it is found as the scroll bar with that id.
    HWND C(int32_t id) { return id == VolumeId ? Slider(P, id) : Control(P, id); }
    bool Enabled(int32_t id) { return IsWindowEnabled(C(id)) != FALSE; }
    bool Playing() { return ShowsPlaying(P); }
    bool Stopped() { return ShowsStopped(P); }
    void ExpectNoBox(const char* after) {
        std::vector<Box> boxes = OpenBoxes(P);
        EXPECT_TRUE(boxes.empty()) << after << ": a box is open, caption \""
                                   << (boxes.empty() ? "" : boxes[0].Caption) << "\", text \""
                                   << (boxes.empty() ? "" : boxes[0].Text) << "\"; expected none";
    }
    void ClickOrFail(int32_t id) {
        EXPECT_TRUE(Click(P, id)) << "SendMessageTimeout(BM_CLICK) to control " << id
                                  << " timed out; expected the click handled";
    }
    void SetText(int32_t id, const std::string& text) {
        SendMessageTimeoutA(C(id), WM_SETTEXT, 0, reinterpret_cast<LPARAM>(text.c_str()), SMTO_NORMAL, 5000,
                            nullptr);
    }
    // An equaliser band slider scrolled, as its scroll bar reports it.
    void ScrollBand(int32_t band, int32_t code, int32_t position = 0) {
        DWORD_PTR result = 0;
        SendMessageTimeoutA(P.Window, WM_VSCROLL, MAKEWPARAM(code, position),
                            reinterpret_cast<LPARAM>(C(FirstBandId + band)), SMTO_NORMAL, 10000, &result);
    }
    // Writes a time of day (minutes after midnight) into the hour and
    // minute fields as a user reads a 12-hour clock, with AM or PM.
    void SetTimeOfDay(int32_t minuteOfDay) {
        const int32_t hour = minuteOfDay / 60, minute = minuteOfDay % 60;
        SetText(HourId, std::to_string(hour % 12 == 0 ? 12 : hour % 12));
        SetText(MinuteId, std::to_string(minute));
        ClickOrFail(hour < 12 ? AmId : PmId);
    }
    // Sets the stop / alarm time `ahead` minutes after the clock's minute,
    // notes `begin` and presses Play. The program reads the clock itself at
    // Play and ignores the seconds, so the test makes sure the minute it
    // read is the program's: it starts with at least 5 s left in the minute
    // and reads the clock again after Play. If the minute ticked over all
    // the same, the planned time is a minute shorter: Stop, and try once
    // more. False when Play was not answered or both tries missed.
    bool PlayWithTimeAhead(int32_t ahead, const std::string& begin) {
        for (int32_t attempt = 0; attempt < 2; ++attempt) {
            if (!WaitFor([] { return Now().wSecond < 55; }, 10000)) return false;
            const SYSTEMTIME before = Now();
            SetTimeOfDay((MinuteOfDay(before) + ahead) % 1440);
            Note(begin);
            if (!Click(P, PlayId)) return false;
            if (MinuteOfDay(Now()) == MinuteOfDay(before)) return true;
            std::printf("the clock's minute changed while Play was pressed; starting again\n");
            Click(P, StopId);
            WaitFor([&] { return Stopped(); }, 5000);
            RecordFor(0.5);
        }
        return false;
    }
    // Waits for the program to stop by itself `seconds` of sound after Play.
    bool StopsWithin(double seconds) {
        return WaitFor([&] { return Stopped(); }, static_cast<DWORD>(seconds * 1000 * 2 + 20000));
    }
};

// ---------------------------------------------------------------- the equaliser

class SoundEqualiser : public RecordingTest {};

// The user opens the panel, unlocks it and moves a band's thumb, then pages
// another band down: each change is heard from the next blocks on, as the
// render with the new levels (the harness allows the same two blocks as
// for the volume and the profile).
TEST_F(SoundEqualiser, BandsMovedWhilePlayingAreHeardFromTheNextBlocksOn) {
    Launch();
    int32_t bands[BandCount];
    for (int32_t& level : bands) level = 128;
    Note("begin changes 'equaliser bands moved while playing'");
    ClickOrFail(PlayId);
    ASSERT_TRUE(Playing()) << "Play did not start: the timer controls are still enabled";
    ASSERT_TRUE(RecordFor(3)) << "the recording did not grow by 3 s in time; expected the sound server to record";

    ClickOrFail(EqPanelId);
    ASSERT_TRUE(IsChecked(C(EqLockId))) << "\"EQ Lock\" not checked after the panel button; expected checked";
    ClickOrFail(EqLockId);
    ASSERT_FALSE(IsChecked(C(EqLockId))) << "\"EQ Lock\" still checked after a click; expected unchecked";
    // Band 14 (about 1 kHz) up by about 15 dB: the thumb dragged to 30.
    ScrollBand(14, SB_THUMBPOSITION, 30);
    bands[14] = 30;
    ASSERT_EQ(SliderPosition(C(FirstBandId + 14)), 30) << "band 14's thumb after SB_THUMBPOSITION 30";
    Note("set --eq " + BandList(bands));
    ASSERT_TRUE(RecordFor(3)) << "the recording did not grow by 3 s in time; expected the sound server to record";

    // Band 4 (about 50 Hz) paged down twice: 128 + 25 + 25, a cut.
    ScrollBand(4, SB_PAGEDOWN);
    ScrollBand(4, SB_PAGEDOWN);
    bands[4] = 178;
    ASSERT_EQ(SliderPosition(C(FirstBandId + 4)), 178) << "band 4's thumb after two SB_PAGEDOWN from 128";
    Note("set --eq " + BandList(bands));
    ASSERT_TRUE(RecordFor(3)) << "the recording did not grow by 3 s in time; expected the sound server to record";

    ClickOrFail(StopId);
    ASSERT_TRUE(RecordFor(0.5)) << "the recording did not grow by 0.5 s in time; expected the sound server to record";
    Note("end changes");
    ExpectNoBox("playing with the equaliser changed");
}

// ---------------------------------------------------------------- settings restored

class SoundRestoredSettings : public RecordingTest {};

// A key left by an earlier run, with every main slider, the profile and M1
// away from their start values (M2 and M3 differ from M1, so a wrong
// memory would be heard): the first Play sounds as the render of exactly
// those settings.
TEST_F(SoundRestoredSettings, PlaySoundsAsTheRenderOfTheStoredSettings) {
    const int32_t sliders[5] = {150, 90, 170, 100, 60};  // Volume, Hardness, Bass, Sub Bass, Treble
    int32_t m1[BandCount];
    for (int32_t k = 0; k < BandCount; ++k) m1[k] = 60 + 5 * k;  // +10.7 dB low to -6.6 dB high
    for (int32_t i = 0; i < 5; ++i)
        ASSERT_TRUE(StoreNumber(StoredName(i).c_str(), sliders[i])) << "StoreNumber(" << StoredName(i) << ")";
    for (int32_t k = 0; k < BandCount; ++k) {
        ASSERT_TRUE(StoreNumber(StoredName(5 + k).c_str(), m1[k])) << "StoreNumber(" << StoredName(5 + k) << ")";
        ASSERT_TRUE(StoreNumber(StoredName(36 + k).c_str(), 255 - 3 * k)) << "StoreNumber(" << StoredName(36 + k) << ")";
        ASSERT_TRUE(StoreNumber(StoredName(67 + k).c_str(), 200)) << "StoreNumber(" << StoredName(67 + k) << ")";
    }
    // Timer switches off, so Play checks no field; Profile 105 is " Music".
    const int32_t tail[11] = {0, 0, 0, 1, 7, 5, 105, 0, 0, 3, 12};
    for (int32_t i = 0; i < 11; ++i)
        ASSERT_TRUE(StoreNumber(StoredName(98 + i).c_str(), tail[i])) << "StoreNumber(" << StoredName(98 + i) << ")";

    Launch();
    ExpectNoBox("start with a stored key");
    // The controls say what was loaded, so a load fault is told apart from a sound fault.
    EXPECT_EQ(SliderPosition(C(VolumeId)), 150) << "the volume slider after the load";
    EXPECT_EQ(SliderPosition(C(FirstBandId + 30)), m1[30]) << "band 30's slider after the load (M1's level)";
    EXPECT_TRUE(IsChecked(C(M1Id))) << "\" M1\" not selected after the load";
    Note("begin plain 'settings restored at start' --volume 150 --hardness 90 --bass 170 --sub-bass 100 "
         "--treble 60 --profile 105 --eq " + BandList(m1));
    ClickOrFail(PlayId);
    ASSERT_TRUE(Playing()) << "Play did not start: the timer controls are still enabled";
    ASSERT_TRUE(RecordFor(9)) << "the recording did not grow by 9 s in time; expected the sound server to record";
    ClickOrFail(StopId);
    ASSERT_TRUE(RecordFor(0.5)) << "the recording did not grow by 0.5 s in time; expected the sound server to record";
    Note("end plain");
    ExpectNoBox("playing the stored settings");
}

// ---------------------------------------------------------------- the stop time

class SoundStopTime : public RecordingTest {};

// Stop Time at the clock's own minute: 0 minutes to go, so the second of the
// two blocks Play makes at once triggers the stop; block 0 alone was
// written, and the controls are enabled again when Play returns.
TEST_F(SoundStopTime, AtTheCurrentMinuteStopsAtOnceAfterBlockZero) {
    Launch();
    ClickOrFail(StopTimeId);
    ASSERT_TRUE(PlayWithTimeAhead(0, "begin stop 'Stop Time at the current minute' --stop-after 0"))
        << "Play with the stop time at the current minute: no answer, or the clock's minute changed twice";
    EXPECT_TRUE(WaitFor([&] { return Stopped(); }, 5000))
        << "5 s after Play with the stop time at the current minute the timer controls are still disabled; "
           "expected the program stopped and the controls enabled again";
    EXPECT_TRUE(Enabled(FadeOutId)) << "\"Fade Out\" disabled after the stop although Stop Time is on";
    ASSERT_TRUE(RecordFor(1.5)) << "the recording did not grow by 1.5 s in time; expected the sound server to record";
    Note("end stop");
    ExpectNoBox("the stop at the current minute");
}

// Stop Time one minute ahead: blocks 0 to 351 play (351.5625 blocks make a
// minute) and the program stops by itself while making block 352.
TEST_F(SoundStopTime, OneMinuteAheadPlaysBlocksZeroTo351AndStopsByItself) {
    Launch();
    ClickOrFail(StopTimeId);
    ASSERT_TRUE(PlayWithTimeAhead(1, "begin stop 'Stop Time one minute ahead' --stop-after 1"))
        << "Play with the stop time a minute ahead: no answer, or the clock's minute changed twice";
    ASSERT_TRUE(Playing()) << "Play with the stop time a minute ahead did not start";
    ASSERT_TRUE(StopsWithin(60)) << "the program did not stop by itself (timer controls still disabled) "
                                    "within 140 s of Play with the stop time a minute ahead";
    ASSERT_TRUE(RecordFor(1.5)) << "the recording did not grow by 1.5 s in time; expected the sound server to record";
    Note("end stop");
    ExpectNoBox("the stop a minute after Play");
}

// ---------------------------------------------------------------- the alarm

class SoundAlarm : public RecordingTest {};

// "Alarm" with the time at the current minute and the volume at 200: the
// rain stops after block 0 and the chime follows on its own device, all
// 5.461 s, sample for sample as the render tool makes it at volume 200.
// The chime test button and Play pressed while it sounds change nothing
// (the recording would hold a second chime or the rain mixed in); once it
// has ended Play works again.
TEST_F(SoundAlarm, TheChimeFollowsTheStopWholeAndPlayWorksAgainAfterIt) {
    Launch();
    Scroll(P, VolumeId, SB_THUMBPOSITION, 200);
    ASSERT_EQ(SliderPosition(C(VolumeId)), 200) << "the volume slider after SB_THUMBPOSITION 200";
    ClickOrFail(StopTimeId);
    ClickOrFail(AlarmId);
    ASSERT_TRUE(IsWindowVisible(C(ChimeTestId))) << "the chime test button is hidden with \"Alarm\" checked";
    ASSERT_TRUE(PlayWithTimeAhead(0, "begin alarm 'the alarm at the current minute' --stop-after 0 --volume 200"))
        << "Play with the alarm at the current minute: no answer, or the clock's minute changed twice";
    EXPECT_TRUE(WaitFor([&] { return Stopped(); }, 5000))
        << "5 s after Play with the alarm at the current minute the timer controls are still disabled";
    ASSERT_TRUE(RecordFor(1.5)) << "the recording did not grow by 1.5 s in time; expected the sound server to record";
    ClickOrFail(ChimeTestId);
    // With Stop Time and Alarm off a Play that was not refused would play
    // the rain on and on over the chime.
    ClickOrFail(AlarmId);
    ClickOrFail(StopTimeId);
    ClickOrFail(PlayId);
    EXPECT_TRUE(Stopped()) << "Play pressed while the chime sounds started playing; expected it refused";
    ASSERT_TRUE(RecordFor(ChimeSeconds - 1.5 + 1.5))
        << "the recording did not grow to 1.5 s past the chime's end in time; expected the sound server to record";
    Note("end alarm");
    ExpectNoBox("the alarm");
    EXPECT_TRUE(WaitFor([&] { return Click(P, PlayId) && Playing(); }, 10000))
        << "Play still refused 10 s after the chime's end; expected the chime over and Play working again";
    ClickOrFail(StopId);
    ExpectNoBox("Play after the chime");
}

// ---------------------------------------------------------------- the fades

class SoundFades : public RecordingTest {};

// "Fade In" of one minute: the first 15 s rise from -20 dB by the fade-in's
// law (with the start ramp in the first two blocks), as the render makes them.
TEST_F(SoundFades, FadeInRisesByItsLaw) {
    Launch();
    SetText(FadeInFieldId, "1");
    ClickOrFail(FadeInId);
    ASSERT_TRUE(IsChecked(C(FadeInId))) << "\"Fade In\" not checked after a click";
    Note("begin plain 'a fade-in of one minute' --fade-in 1");
    ClickOrFail(PlayId);
    ExpectNoBox("Play with a fade-in of one minute");
    ASSERT_TRUE(Playing()) << "Play with a fade-in of one minute did not start";
    ASSERT_TRUE(RecordFor(15)) << "the recording did not grow by 15 s in time; expected the sound server to record";
    ClickOrFail(StopId);
    ASSERT_TRUE(RecordFor(0.5)) << "the recording did not grow by 0.5 s in time; expected the sound server to record";
    Note("end plain");
}

// Stop Time two minutes ahead with a one-minute "Fade Out": the first minute
// at full level, the second falling by the fade-out's law from block 352 on
// to -20 dB at the stop, then silence.
TEST_F(SoundFades, FadeOutFallsByItsLawToTheStopTime) {
    Launch();
    ClickOrFail(StopTimeId);
    ASSERT_TRUE(Enabled(FadeOutId)) << "\"Fade Out\" disabled with Stop Time on";
    SetText(FadeOutFieldId, "1");
    ClickOrFail(FadeOutId);
    ASSERT_TRUE(IsChecked(C(FadeOutId))) << "\"Fade Out\" not checked after a click";
    ASSERT_TRUE(PlayWithTimeAhead(2, "begin stop 'a fade-out of one minute to a stop two minutes ahead' "
                                     "--stop-after 2 --fade-out 1"))
        << "Play with the stop time two minutes ahead: no answer, or the clock's minute changed twice";
    ExpectNoBox("Play with a fade-out of one minute");
    ASSERT_TRUE(Playing()) << "Play with the stop time two minutes ahead did not start";
    ASSERT_TRUE(StopsWithin(120)) << "the program did not stop by itself within 260 s of Play with the stop "
                                     "time two minutes ahead";
    ASSERT_TRUE(RecordFor(1.5)) << "the recording did not grow by 1.5 s in time; expected the sound server to record";
    Note("end stop");
    ExpectNoBox("the stop after the fade-out");
}

}  // namespace
