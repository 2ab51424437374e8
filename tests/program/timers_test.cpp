// The timer controls as a user meets them, driven from another process under
// Wine: the time fields checked at Play (boxes, rewriting, focus, the red
// colour), the "Fade Out" pair following "Stop Time" and "Alarm", the timer
// controls refused while playing, the chime test button shown with "Alarm",
// Play and the chime test refused while the chime plays, and the chime's
// failure with no sound server.
#include <gtest/gtest.h>
#include <windows.h>
#include <mmsystem.h>
#include <set>
#include <string>
#include <vector>
#include "tests/program/driver.h"
#include "tests/program/program_fixture.h"
#include "tests/program/window_ids.h"
#include "tests/program/settings_store.h"

namespace {

const uint32_t Red = Rgb(255, 0, 0);
const uint32_t White = Rgb(255, 255, 255);

std::string Hex(uint32_t pixel) {
    char text[16];
    wsprintfA(text, "0x%06x", pixel);
    return text;
}

// The program fixture with what the timer tests add: pressing, typing and
// the focus.
class TimersTest : public ProgramTest {
protected:
    void Press(int32_t id) {
        ASSERT_TRUE(Click(P, id)) << "SendMessageTimeout(BM_CLICK) to control " << id
                                  << " timed out; expected the click handled";
    }
    // Puts a text into a field as WM_SETTEXT does (the field tells the window).
    void Type(int32_t id, const std::string& text) {
        DWORD_PTR result = 0;
        ASSERT_NE(SendMessageTimeoutA(C(id), WM_SETTEXT, 0, reinterpret_cast<LPARAM>(text.c_str()), SMTO_NORMAL,
                                      5000, &result),
                  0)
            << "SendMessageTimeout(WM_SETTEXT \"" << text << "\") to field " << id << " timed out";
    }
    // The control that has the keyboard focus in the program's thread.
    HWND Focus() {
        GUITHREADINFO info = {};
        info.cbSize = sizeof(info);
        GetGUIThreadInfo(GetWindowThreadProcessId(P.Window, nullptr), &info);
        return info.hwndFocus;
    }
    int32_t FocusId() { return Focus() ? GetDlgCtrlID(Focus()) : 0; }
    // Answers every box until none has come for `quietMs`; returns their texts.
    std::vector<std::string> AnswerAllBoxes(DWORD quietMs = 1500) {
        std::vector<std::string> texts;
        for (int32_t i = 0; i < 200; ++i) {
            if (!WaitFor([&] { return !OpenBoxes(P).empty(); }, quietMs)) break;
            Box box;
            if (!WaitForBox(P, &box, 5000)) break;
            texts.push_back(box.Text);
            CloseBox(box);
        }
        return texts;
    }
    // Reads the next box, checks it is a time field's complaint and answers it.
    void ExpectComplaint(const char* text, const char* after) {
        Box box;
        ASSERT_TRUE(WaitForBox(P, &box)) << after << ": no box within 20 s; expected \"" << text << "\"";
        EXPECT_EQ(box.Text, text) << after << ": text of the box";
        EXPECT_EQ(box.Caption, "Sombrel Player") << after << ": caption of the box \"" << box.Text << "\"";
        EXPECT_TRUE(box.HasIcon) << after << ": the box \"" << box.Text << "\" shows no icon; expected the stop sign";
        EXPECT_EQ(box.Buttons, std::vector<std::string>{"OK"}) << after << ": buttons of \"" << box.Text << "\"";
        ASSERT_TRUE(CloseBox(box)) << after << ": the box \"" << box.Text << "\" did not close on OK";
    }
    // A stop time at least six hours from now, so no test reaches it.
    void SetDistantStopTime() {
        SYSTEMTIME now;
        GetLocalTime(&now);
        const int32_t hour12 = (now.wHour % 12) == 0 ? 12 : now.wHour % 12;
        Type(HourId, std::to_string(hour12));
        Type(MinuteId, std::to_string(now.wMinute));
        Press(now.wHour < 12 ? PmId : AmId);
    }
    // The colour inside a field near its right end, where no text is drawn,
    // as the screen shows it.
    uint32_t FieldColour(int32_t id) {
        const RECT r = ClientRectOf(P, C(id));
        Picture picture;
        if (!CaptureClient(P, &picture)) return 0x1000000;
        return picture.At(r.right - 4, (r.top + r.bottom) / 2);
    }
    // Has the field repainted and waits until it shows `colour`.
    bool FieldTurns(int32_t id, uint32_t colour, uint32_t* seen) {
        RedrawWindow(C(id), nullptr, nullptr, RDW_INVALIDATE | RDW_ERASE | RDW_FRAME);
        return WaitFor([&] {
            *seen = FieldColour(id);
            return *seen == colour;
        }, 5000);
    }
};

// ---------------------------------------------------------------- the fields at Play

class TimeFields : public TimersTest {};

TEST_F(TimeFields, BadMinuteAndHourShowTwoBoxesMinuteFirstAndTheFocusEndsInTheHourField) {
    Press(StopTimeId);
    Type(MinuteId, "7x");  // fails the character check: kept as typed
    Type(HourId, ".");     // passes the check, converts to 0: out of range
    ClickAsync(P, PlayId);
    ExpectComplaint("Minutes must be between 0 and 59", "Play with minute \"7x\" and hour \".\", first box");
    ExpectComplaint("Hours must be between 1 and 12", "Play with minute \"7x\" and hour \".\", second box");
    ExpectNoBox("after the two boxes of Play");
    EXPECT_EQ(FocusId(), HourId) << "GetGUIThreadInfo gives the focus to control " << FocusId()
                                 << ", expected the hour field (" << HourId << ")";
    EXPECT_TRUE(Stopped()) << "after a refused Play a timer control is disabled; expected the stopped state";
    EXPECT_EQ(TextOf(C(MinuteId)), "7x") << "text of the minute field after its failed check";
    EXPECT_EQ(TextOf(C(HourId)), "0") << "text of the hour field \".\" after Play";
}

TEST_F(TimeFields, EmptyFieldsOfFeaturesThatAreOnStayRedUntilTouched) {
    Press(StopTimeId);
    Press(FadeInId);
    uint32_t seen = 0;
    for (int32_t id : {MinuteId, HourId, FadeInFieldId})
        EXPECT_TRUE(FieldTurns(id, White, &seen)) << "empty field " << id << " before Play shows " << Hex(seen)
                                                  << ", expected white";
    ClickAsync(P, PlayId);
    Box box;
    ASSERT_TRUE(WaitForBox(P, &box)) << "Play with three empty fields showed no box";
    EXPECT_EQ(box.Text, "Minutes must be between 0 and 59") << "text of the first box of Play";
    // The window paints while the box is open: both failed fields are red;
    // the fade-in field is checked only after the stop time's boxes.
    for (int32_t id : {MinuteId, HourId})
        EXPECT_TRUE(FieldTurns(id, Red, &seen)) << "with the first box open, empty field " << id << " shows "
                                                << Hex(seen) << ", expected red";
    EXPECT_TRUE(FieldTurns(FadeInFieldId, White, &seen))
        << "with the first box open, the fade-in field, not checked yet, shows " << Hex(seen) << ", expected white";
    // A touch of the minute field (its text set: a notification) takes its red away.
    Type(MinuteId, "");
    EXPECT_TRUE(FieldTurns(MinuteId, White, &seen))
        << "after a notification of the minute field it shows " << Hex(seen) << ", expected white";
    ASSERT_TRUE(CloseBox(box)) << "the box \"" << box.Text << "\" did not close on OK";
    ASSERT_TRUE(WaitForBox(P, &box)) << "no second box after \"Minutes must be between 0 and 59\"";
    EXPECT_EQ(box.Text, "Hours must be between 1 and 12") << "text of the second box of Play";
    EXPECT_TRUE(FieldTurns(MinuteId, White, &seen))
        << "with the second box open the touched minute field shows " << Hex(seen) << ", expected white";
    EXPECT_TRUE(FieldTurns(HourId, Red, &seen))
        << "with the second box open, the untouched hour field shows " << Hex(seen) << ", expected red";
    ASSERT_TRUE(CloseBox(box)) << "the box \"" << box.Text << "\" did not close on OK";
    ASSERT_TRUE(WaitForBox(P, &box)) << "no third box after \"Hours must be between 1 and 12\"";
    EXPECT_EQ(box.Text, "Fade In Time must be between 1 and 15 minutes") << "text of the third box of Play";
    for (int32_t id : {HourId, FadeInFieldId})
        EXPECT_TRUE(FieldTurns(id, Red, &seen)) << "with the third box open, untouched field " << id << " shows "
                                                << Hex(seen) << ", expected red";
    ASSERT_TRUE(CloseBox(box)) << "the box \"" << box.Text << "\" did not close on OK";
    ExpectNoBox("after the three boxes of Play");
    // The focus then visits the hour and the fade-in field, each visit a
    // notification: both are white again, and the focus stays in the last.
    EXPECT_EQ(FocusId(), FadeInFieldId) << "GetGUIThreadInfo gives the focus to control " << FocusId()
                                        << ", expected the fade-in field (" << FadeInFieldId << ")";
    for (int32_t id : {MinuteId, HourId, FadeInFieldId})
        EXPECT_TRUE(FieldTurns(id, White, &seen)) << "after the focus visited them, field " << id << " shows "
                                                  << Hex(seen) << ", expected white";
    EXPECT_TRUE(Stopped()) << "after a refused Play a timer control is disabled; expected the stopped state";
}

TEST_F(TimeFields, FieldsOfFeaturesThatAreOffAreNotChecked) {
    Type(MinuteId, "7x");
    Type(HourId, "");
    Type(FadeInFieldId, "99");
    Type(FadeOutFieldId, "1.5");
    Press(PlayId);
    ExpectNoBox("Play with Stop Time, Alarm, Fade In and Fade Out off");
    EXPECT_TRUE(Playing()) << "Play with only the fields of unused features bad did not start";
    EXPECT_EQ(TextOf(C(MinuteId)), "7x") << "the unused minute field was rewritten";
    EXPECT_EQ(TextOf(C(FadeInFieldId)), "99") << "the unused fade-in field was rewritten";
    EXPECT_EQ(TextOf(C(FadeOutFieldId)), "1.5") << "the unused fade-out field was rewritten";
    Press(StopId);
}

TEST_F(TimeFields, FadeFieldsOf16AreRewrittenAndRefusedAnd15Accepted) {
    Press(StopTimeId);
    SetDistantStopTime();
    Press(FadeInId);
    Press(FadeOutId);
    Type(FadeInFieldId, "16");
    Type(FadeOutFieldId, "16.9");
    ClickAsync(P, PlayId);
    ExpectComplaint("Fade In Time must be between 1 and 15 minutes", "Play with fade-in 16");
    ExpectComplaint("Fade Out Time must be between 1 and 15 minutes", "Play with fade-out 16.9");
    ExpectNoBox("after the two fade boxes");
    EXPECT_EQ(TextOf(C(FadeInFieldId)), "16") << "text of the fade-in field \"16\" after Play";
    EXPECT_EQ(TextOf(C(FadeOutFieldId)), "16") << "text of the fade-out field \"16.9\" after Play";
    EXPECT_EQ(FocusId(), FadeOutFieldId) << "GetGUIThreadInfo gives the focus to control " << FocusId()
                                         << ", expected the fade-out field (" << FadeOutFieldId << ")";
    EXPECT_TRUE(Stopped()) << "Play with fades of 16 started; expected it refused";

    Type(FadeInFieldId, "15");
    Type(FadeOutFieldId, "15");
    Press(PlayId);
    ExpectNoBox("Play with fades of 15");
    EXPECT_TRUE(Playing()) << "Play with fades of 15 did not start";
    Press(StopId);
}

TEST_F(TimeFields, TextsAreCutToTheirNumberAndShownAsIt) {
    // Two characters are checked and four converted: "12x" is 12, "1.5" is 1.
    SYSTEMTIME now;
    GetLocalTime(&now);
    Press(StopTimeId);
    Type(HourId, "12x");
    Type(MinuteId, "1.5");
    // 12:01 at least six hours away: PM (noon) at night, AM (midnight) by day.
    Press(now.wHour < 6 || now.wHour >= 18 ? PmId : AmId);
    Press(FadeInId);
    Type(FadeInFieldId, "3.9");
    Press(PlayId);
    ExpectNoBox("Play with hour \"12x\", minute \"1.5\" and fade-in \"3.9\"");
    EXPECT_TRUE(Playing()) << "Play with hour \"12x\", minute \"1.5\" and fade-in \"3.9\" did not start";
    EXPECT_EQ(TextOf(C(HourId)), "12") << "text of the hour field \"12x\" after Play";
    EXPECT_EQ(TextOf(C(MinuteId)), "1") << "text of the minute field \"1.5\" after Play";
    EXPECT_EQ(TextOf(C(FadeInFieldId)), "3") << "text of the fade-in field \"3.9\" after Play";
    Press(StopId);
}

// ---------------------------------------------------------------- the controls

class DisabledWhilePlayingTest : public TimersTest {};

TEST_F(DisabledWhilePlayingTest, FadeOutFollowsStopTimeAndAlarmAndKeepsItsCheckMark) {
    EXPECT_FALSE(Enabled(FadeOutId)) << "\"Fade Out\" enabled at first start with Stop Time and Alarm off";
    Press(StopTimeId);
    ASSERT_TRUE(Enabled(FadeOutId)) << "\"Fade Out\" still disabled after checking \"Stop Time\"";
    Press(FadeOutId);
    ASSERT_TRUE(IsChecked(C(FadeOutId))) << "BM_GETCHECK of \"Fade Out\" gave 0 after a click";
    struct Step {
        int32_t Press;
        bool PairEnabled;
        const char* What;
    } steps[] = {
        {StopTimeId, false, "\"Stop Time\" unchecked, \"Alarm\" off"},
        {AlarmId, true, "\"Alarm\" checked"},
        {StopTimeId, true, "\"Stop Time\" and \"Alarm\" checked"},
        {AlarmId, true, "\"Alarm\" unchecked, \"Stop Time\" on"},
        {StopTimeId, false, "both unchecked again"},
    };
    for (const Step& step : steps) {
        Press(step.Press);
        EXPECT_EQ(Enabled(FadeOutId), step.PairEnabled)
            << step.What << ": IsWindowEnabled(\"Fade Out\") gave " << Enabled(FadeOutId) << ", expected "
            << step.PairEnabled;
        EXPECT_EQ(Enabled(FadeOutFieldId), step.PairEnabled)
            << step.What << ": IsWindowEnabled(fade-out field) gave " << Enabled(FadeOutFieldId) << ", expected "
            << step.PairEnabled;
        EXPECT_TRUE(IsChecked(C(FadeOutId))) << step.What << ": BM_GETCHECK of \"Fade Out\" gave 0, expected 1";
    }
}

TEST_F(DisabledWhilePlayingTest, AllAreDisabledWhilePlayingAndEnabledAfterStop) {
    Press(AlarmId);
    SetDistantStopTime();
    Press(FadeInId);
    Press(FadeOutId);
    Type(FadeInFieldId, "5");
    Type(FadeOutFieldId, "5");
    for (int32_t id : DisabledWhilePlaying)
        ASSERT_TRUE(Enabled(id)) << "before Play control " << id << " is disabled";
    Press(PlayId);
    ExpectNoBox("Play with Alarm, Fade In and Fade Out on");
    for (int32_t id : DisabledWhilePlaying)
        EXPECT_FALSE(Enabled(id)) << "while playing IsWindowEnabled(control " << id << ") gave 1, expected 0";
    for (int32_t id : {AlarmId, FadeInId, FadeOutId})
        EXPECT_TRUE(IsChecked(C(id))) << "while playing BM_GETCHECK of " << id << " gave 0, expected 1";
    Press(StopId);
    // Alarm is on, so the Fade Out pair comes back with the others.
    for (int32_t id : DisabledWhilePlaying)
        EXPECT_TRUE(Enabled(id)) << "after Stop IsWindowEnabled(control " << id << ") gave 0, expected 1";
    Press(AlarmId);
    Press(PlayId);
    ExpectNoBox("Play with Fade In and Fade Out on, Alarm off");
    EXPECT_TRUE(Playing()) << "Play with Alarm off left a timer control enabled";
    Press(StopId);
    EXPECT_TRUE(Stopped()) << "after the second Stop a timer control is disabled";
    EXPECT_FALSE(Enabled(FadeOutId)) << "after Stop with Stop Time and Alarm off \"Fade Out\" is enabled";
    EXPECT_FALSE(Enabled(FadeOutFieldId)) << "after Stop with Stop Time and Alarm off the fade-out field is enabled";
    EXPECT_TRUE(IsChecked(C(FadeOutId))) << "after Stop \"Fade Out\" lost its check mark";
}

// ---------------------------------------------------------------- the chime test button

class ChimeButton : public TimersTest {};

TEST_F(ChimeButton, VisibleAtFirstStartThenFollowsAlarmAlsoFromStoredSettings) {
    EXPECT_FALSE(IsChecked(C(AlarmId))) << "\"Alarm\" checked at first start";
    EXPECT_TRUE(IsWindowVisible(C(ChimeTestId))) << "at first start the chime test button is hidden; expected visible";
    Press(AlarmId);
    EXPECT_TRUE(IsWindowVisible(C(ChimeTestId))) << "\"Alarm\" checked: the chime test button is hidden";
    Press(AlarmId);
    EXPECT_FALSE(IsWindowVisible(C(ChimeTestId))) << "\"Alarm\" unchecked: the chime test button is visible";
    Press(AlarmId);
    EXPECT_TRUE(IsWindowVisible(C(ChimeTestId))) << "\"Alarm\" checked again: the chime test button is hidden";
    // Stored with "Alarm" off (Play stores the settings at closing): the
    // next start hides the button.
    Press(AlarmId);
    Press(PlayId);
    Press(StopId);
    ASSERT_EQ(CloseProgram(&P), 0) << "CloseProgram gave a non-zero exit code";
    ASSERT_TRUE(LaunchProgram(&P)) << "the second start showed no window";
    EXPECT_FALSE(IsChecked(C(AlarmId))) << "\"Alarm\" checked after a start with it stored off";
    EXPECT_FALSE(IsWindowVisible(C(ChimeTestId)))
        << "started with \"Alarm\" stored off, the chime test button is visible; expected hidden";
}

// ---------------------------------------------------------------- the chime and Play

class WhileChiming : public TimersTest {
protected:
    // Presses Play until it is taken (the chime has ended), Stop after it.
    bool PlayTakenWithin(DWORD ms) {
        return WaitFor([&] {
            if (!Click(P, PlayId)) return false;
            if (!Playing()) return false;
            Click(P, StopId);
            return true;
        }, ms);
    }
};

TEST_F(WhileChiming, PlayAndTheTestDoNothingAndBothWorkAfterTheChime) {
    // The chime lasts 5.461 s; the program is given 20 s to finish it.
    for (int32_t round = 1; round <= 2; ++round) {
        Press(ChimeTestId);
        ExpectNoBox("the chime test");
        Press(PlayId);
        ExpectNoBox("Play while the chime plays");
        EXPECT_TRUE(Stopped()) << "round " << round << ": Play while the chime plays disabled the timer controls; "
                               << "expected it refused";
        Press(ChimeTestId);
        ExpectNoBox("a second chime test while the chime plays");
        Press(PlayId);
        EXPECT_TRUE(Stopped()) << "round " << round << ": Play after a second test press disabled the controls; "
                               << "expected it refused while the chime plays";
        EXPECT_TRUE(PlayTakenWithin(20000)) << "round " << round << ": Play was refused for 20 s after the chime "
                                            << "test; expected it taken once the chime ended";
        ExpectNoBox("Play and Stop after the chime");
        EXPECT_TRUE(Stopped()) << "round " << round << ": after Play and Stop a timer control is disabled";
    }
}

// ---------------------------------------------------------------- no sound server

// Run by the harness with no sound server: the chime's device does not open.
class NoSoundServerChime : public TimersTest {
protected:
    std::set<std::string> DeviceTexts;
    void SetUp() override {
        TimersTest::SetUp();
        char text[400];
        for (UINT code = 1; code < 64; ++code)
            if (waveOutGetErrorTextA(code, text, sizeof(text)) == MMSYSERR_NOERROR) DeviceTexts.insert(text);
    }
    // The chime test's two boxes: the open's code, then the device's text.
    void ExpectOpenFailure(const char* after) {
        ClickAsync(P, ChimeTestId);
        Box code, text;
        ASSERT_TRUE(WaitForBox(P, &code)) << after << ": the chime test showed no box; expected \"Error 4558\"";
        EXPECT_EQ(code.Text, "Error 4558") << after << ": text of the first box of the chime test";
        EXPECT_EQ(code.Caption, "Sombrel Player") << after << ": caption of \"" << code.Text << "\"";
        EXPECT_FALSE(code.HasIcon) << after << ": \"" << code.Text << "\" shows an icon; expected none";
        EXPECT_EQ(code.Buttons, std::vector<std::string>{"OK"}) << after << ": buttons of \"" << code.Text << "\"";
        ASSERT_TRUE(CloseBox(code)) << after << ": \"" << code.Text << "\" did not close on OK";
        ASSERT_TRUE(WaitForBox(P, &text)) << after << ": no device text after \"" << code.Text << "\"";
        EXPECT_TRUE(DeviceTexts.count(text.Text)) << after << ": the second box says \"" << text.Text
                                                  << "\", which is no text of waveOutGetErrorTextA";
        EXPECT_EQ(text.Caption, "Sombrel Player") << after << ": caption of the device text";
        EXPECT_TRUE(text.HasIcon) << after << ": the device text shows no icon; expected the exclamation mark";
        ASSERT_TRUE(CloseBox(text)) << after << ": the device text did not close on OK";
        // The chime ended: nothing follows (no buffers were prepared or written).
        ExpectNoBox(after);
    }
};

TEST_F(NoSoundServerChime, TheTestShowsTheOpenFailureAndThenTheTestAndPlayWorkAgain) {
    ExpectOpenFailure("the first chime test");
    // A chime left "playing" would refuse both of these silently.
    ExpectOpenFailure("a second chime test");
    ClickAsync(P, PlayId);
    Box first;
    ASSERT_TRUE(WaitForBox(P, &first)) << "Play after the failed chime showed no box: it was refused; expected "
                                       << "the stream's own \"Error 4528\"";
    EXPECT_EQ(first.Text, "Error 4528") << "first box of Play after the failed chime";
    AnswerAllBoxes();
    ASSERT_TRUE(Settle(P)) << "SendMessageTimeout(WM_NULL) timed out after Play's boxes";
    EXPECT_TRUE(Playing()) << "after Play's boxes the timer controls are not disabled; expected the playing state";
    ClickAsync(P, StopId);
    AnswerAllBoxes();
    ASSERT_TRUE(Settle(P)) << "SendMessageTimeout(WM_NULL) timed out after Stop's boxes";
    EXPECT_TRUE(Stopped()) << "Stop did not bring the program back to the stopped state";
}

}  // namespace
