// The program as a user meets it, driven from another process under Wine:
// first start, commands, sliders, the meter on screen, Help, closing, the
// missing sound device, a long run of Play and Stop, and the actions of the
// recording check (the harness compares the recording with the render).
#include <gtest/gtest.h>
#include <windows.h>
#include <mmsystem.h>
#include <cstdio>
#include <fstream>
#include <set>
#include <string>
#include "tests/program/driver.h"
#include "tests/program/program_fixture.h"
#include "tests/program/window_ids.h"
#include "tests/program/settings_store.h"

namespace {

struct Expected {
    const char* Class;
    const char* Text;
    int32_t Id;
    RECT Place;       // client coordinates: left, top, right, bottom
    bool Visible;
    bool Enabled;
    LONG Style;       // style bits that must be set (besides WS_CHILD)
};

RECT At(int32_t x, int32_t y, int32_t w, int32_t h) { return RECT{x, y, x + w, y + h}; }

std::vector<Expected> ExpectedControls() {
    std::vector<Expected> e;
    const LONG icon = WS_TABSTOP | BS_ICON;
    e.push_back({"Button", "", PlayId, At(10, 20, 40, 40), true, true, icon});
    e.push_back({"Button", "", StopId, At(50, 20, 40, 40), true, true, icon});
    e.push_back({"Button", "", EqPanelId, At(90, 20, 40, 40), true, true, icon});
    e.push_back({"Button", "", ChimeTestId, At(535, 32, 16, 16), true, true, icon});
    e.push_back({"Button", "", HelpId, At(695, 20, 40, 40), true, true, icon});
    e.push_back({"Button", "", EqCloseId, At(690, 240, 40, 40), true, true, icon});
    e.push_back({"Button", "", 0, At(135, 15, 515, 45), true, true, BS_GROUPBOX});
    e.push_back({"Button", "Stop Time", StopTimeId, At(145, 30, 100, 20), true, true, BS_AUTOCHECKBOX});
    e.push_back({"Edit", "", HourId, At(255, 30, 30, 20), true, true, WS_BORDER});
    e.push_back({"Static", " HR", 0, At(290, 30, 40, 20), true, true, 0});
    e.push_back({"Edit", "", MinuteId, At(330, 30, 30, 20), true, true, WS_BORDER});
    e.push_back({"Static", " MIN", 0, At(370, 30, 40, 20), true, true, 0});
    e.push_back({"Button", "AM", AmId, At(425, 30, 50, 20), true, true, BS_RADIOBUTTON});
    e.push_back({"Button", "PM", PmId, At(475, 30, 50, 20), true, true, BS_RADIOBUTTON});
    e.push_back({"Button", "Alarm", AlarmId, At(554, 30, 80, 20), true, true, BS_AUTOCHECKBOX});
    const char* sliderLabels[5] = {" Volume", " Hardness", " Bass", " Sub Bass", " Treble"};
    for (int32_t i = 0; i < 5; ++i) {
        e.push_back({"ScrollBar", "", i, At(10, 70 + 30 * i, 200, 20), true, true, WS_TABSTOP | SBS_HORZ});
        e.push_back({"Static", sliderLabels[i], 0, At(215, 70 + 30 * i, 100, 20), true, true, 0});
    }
    e.push_back({"Button", "Masking Profile", 0, At(320, 70, 330, 110), true, true, BS_GROUPBOX});
    const char* profiles[8] = {" White ", " Pink", " Red", " Brown",
                               " Talking / TV", " Music", " Dogs", " Traffic"};
    for (int32_t i = 0; i < 4; ++i)
        e.push_back({"Button", profiles[i], WhiteId + i, At(340, 95 + 20 * i, 100, 20), true, true, BS_RADIOBUTTON});
    for (int32_t i = 4; i < 8; ++i)
        e.push_back({"Button", profiles[i], WhiteId + i, At(470, 95 + 20 * (i - 4), 175, 20), true, true, BS_RADIOBUTTON});
    e.push_back({"Button", "Fade In", FadeInId, At(320, 190, 80, 20), true, true, BS_AUTOCHECKBOX});
    e.push_back({"Edit", "", FadeInFieldId, At(405, 190, 40, 20), true, true, WS_BORDER});
    e.push_back({"Static", " MIN", 0, At(445, 190, 40, 20), true, true, 0});
    e.push_back({"Button", "Fade Out", FadeOutId, At(500, 190, 80, 20), true, false, BS_AUTOCHECKBOX});
    e.push_back({"Edit", "", FadeOutFieldId, At(600, 190, 40, 20), true, false, WS_BORDER});
    e.push_back({"Static", " MIN", 0, At(640, 190, 40, 20), true, true, 0});
    for (int32_t k = 0; k < 31; ++k)
        e.push_back({"ScrollBar", "", 5 + k, At(20 + 23 * k, 285, 18, 185), false, true, WS_TABSTOP | SBS_VERT});
    e.push_back({"Button", "EQ Lock", EqLockId, At(35, 245, 100, 30), false, true, BS_AUTOCHECKBOX});
    e.push_back({"Button", "WYSIWYG 31 Band Graphic Equalizer", 0, At(10, 230, 730, 300), false, true, BS_GROUPBOX});
    e.push_back({"Edit", "", 1058, At(200, 255, 60, 20), false, true, WS_BORDER});
    e.push_back({"Edit", "", 1059, At(460, 255, 60, 20), false, true, WS_BORDER});
    e.push_back({"Static", " Level (dB)", 0, At(530, 255, 100, 20), false, true, 0});
    e.push_back({"Static", " Frequency (Hz)", 0, At(270, 255, 150, 20), false, true, 0});
    e.push_back({"Button", " M1", 1065, At(170, 495, 60, 25), true, true, BS_RADIOBUTTON});
    e.push_back({"Button", " M2", 1066, At(230, 495, 60, 25), true, true, BS_RADIOBUTTON});
    e.push_back({"Button", " M3", 1067, At(290, 495, 60, 25), true, true, BS_RADIOBUTTON});
    e.push_back({"Button", " EQ Defeat", 1068, At(20, 495, 150, 25), true, true, BS_RADIOBUTTON});
    return e;
}

std::string Describe(const RECT& r) {
    char text[96];
    std::snprintf(text, sizeof(text), "(%ld, %ld, %ld x %ld)", r.left, r.top, r.right - r.left,
                  r.bottom - r.top);
    return text;
}

bool SameRect(const RECT& a, const RECT& b) {
    return a.left == b.left && a.top == b.top && a.right == b.right && a.bottom == b.bottom;
}

struct ChildList {
    std::vector<HWND> Children;
};

BOOL CALLBACK CollectChild(HWND child, LPARAM data) {
    reinterpret_cast<ChildList*>(data)->Children.push_back(child);
    return TRUE;
}

std::vector<HWND> Children(const Program& program) {
    ChildList list;
    EnumChildWindows(program.Window, CollectChild, reinterpret_cast<LPARAM>(&list));
    return list.Children;
}

std::string Lower(std::string s) {
    for (char& c : s) c = static_cast<char>(tolower(static_cast<unsigned char>(c)));
    return s;
}

// The button-kind bits of a button style (BS_TYPEMASK) must equal; other
// expected bits must be present.
bool HasStyle(HWND control, const Expected& e) {
    const LONG style = GetWindowLongA(control, GWL_STYLE);
    if ((style & WS_CHILD) == 0) return false;
    if (Lower(e.Class) == "button") {
        if ((style & BS_TYPEMASK) != (e.Style & BS_TYPEMASK)) return false;
        return (style & (e.Style & ~BS_TYPEMASK)) == (e.Style & ~BS_TYPEMASK);
    }
    if (Lower(e.Class) == "scrollbar") {
        if ((style & SBS_VERT) != (e.Style & SBS_VERT)) return false;
        return (style & WS_TABSTOP) == (e.Style & WS_TABSTOP);
    }
    if (Lower(e.Class) == "edit" && (e.Style & WS_BORDER)) {
        // An edit control takes WS_BORDER out of its style when it is
        // created and draws the border itself: the border is checked on the
        // screen (FieldsHaveABorder) instead.
        return true;
    }
    return (style & e.Style) == e.Style;
}

// ---------------------------------------------------------------- first start

class FirstStart : public ProgramTest {};

TEST_F(FirstStart, EveryControlHasItsClassTextIdPlaceVisibilityAndState) {
    std::vector<HWND> children = Children(P);
    std::vector<Expected> expected = ExpectedControls();
    EXPECT_EQ(children.size(), expected.size())
        << "EnumChildWindows(main window) found " << children.size() << " controls, expected "
        << expected.size();
    std::set<HWND> used;
    for (const Expected& e : expected) {
        HWND match = nullptr;
        for (HWND child : children) {
            if (used.count(child)) continue;
            if (Lower(ClassOf(child)) == Lower(e.Class) && TextOf(child) == e.Text &&
                GetDlgCtrlID(child) == e.Id && SameRect(ClientRectOf(P, child), e.Place)) {
                match = child;
                break;
            }
        }
        const std::string what = std::string("control class \"") + e.Class + "\" text \"" + e.Text +
                                 "\" id " + std::to_string(e.Id) + " at " + Describe(e.Place);
        if (match == nullptr) {
            // Say where the control with this id (or text) is instead.
            HWND byId = e.Id != 0 ? C(e.Id) : ChildByText(P, e.Class, e.Text);
            ADD_FAILURE() << what << ": not found; "
                          << (byId ? "GetDlgItem/text search gives class \"" + ClassOf(byId) +
                                         "\" text \"" + TextOf(byId) + "\" at " +
                                         Describe(ClientRectOf(P, byId))
                                   : std::string("no control with that id or text"));
            continue;
        }
        used.insert(match);
        EXPECT_EQ(IsWindowVisible(match) != FALSE, e.Visible)
            << what << ": IsWindowVisible gave " << IsWindowVisible(match) << ", expected " << e.Visible;
        EXPECT_EQ(IsWindowEnabled(match) != FALSE, e.Enabled)
            << what << ": IsWindowEnabled gave " << IsWindowEnabled(match) << ", expected " << e.Enabled;
        EXPECT_TRUE(HasStyle(match, e)) << what << ": GetWindowLongA(GWL_STYLE) gave 0x" << std::hex
                                        << GetWindowLongA(match, GWL_STYLE) << " (extended 0x"
                                        << GetWindowLongA(match, GWL_EXSTYLE) << "), expected bits 0x"
                                        << e.Style << std::dec;
    }
}

TEST_F(FirstStart, FieldsHaveABorder) {
    // Polled: right after start the window may not be painted yet.
    for (int32_t id : {HourId, MinuteId, FadeInFieldId, FadeOutFieldId}) {
        const RECT r = ClientRectOf(P, C(id));
        const int32_t middle = (r.top + r.bottom) / 2;
        uint32_t edge = 0, inside = 0;
        Picture picture;
        EXPECT_TRUE(WaitFor([&] {
            if (!CaptureClient(P, &picture)) return false;
            edge = picture.At(r.left, middle);
            inside = picture.At((r.left + r.right) / 2, middle);
            // An enabled field is white inside; a disabled one is greyed.
            return edge != inside && (!IsWindowEnabled(C(id)) || inside == Rgb(255, 255, 255));
        }, 5000)) << "field " << id << ": the pixel at its left edge (0x" << std::hex << edge
                  << ") and inside (0x" << inside << std::dec << ") show no border around the field";
    }
}

TEST_F(FirstStart, TalkingAmAndM1AreSelectedAndNothingElse) {
    for (int32_t id = WhiteId; id <= TrafficId; ++id)
        EXPECT_EQ(IsChecked(C(id)), id == TalkingId)
            << "BM_GETCHECK of profile button " << id << " gave " << IsChecked(C(id));
    EXPECT_TRUE(IsChecked(C(AmId))) << "BM_GETCHECK of \"AM\" gave 0, expected 1";
    EXPECT_FALSE(IsChecked(C(PmId))) << "BM_GETCHECK of \"PM\" gave 1, expected 0";
    EXPECT_TRUE(IsChecked(C(1065))) << "BM_GETCHECK of \" M1\" gave 0, expected 1";
    for (int32_t id : {StopTimeId, AlarmId, FadeInId, FadeOutId, EqLockId})
        EXPECT_FALSE(IsChecked(C(id))) << "BM_GETCHECK of check box " << id << " gave 1, expected 0";
    for (int32_t id : {HourId, MinuteId, FadeInFieldId, FadeOutFieldId})
        EXPECT_EQ(TextOf(C(id)), "") << "text of field " << id << " is \"" << TextOf(C(id)) << "\", expected empty";
}

TEST_F(FirstStart, WindowIs750By270AndKeepsThatSize) {
    RECT r = OuterRect(P.Window);
    EXPECT_EQ(r.right - r.left, 750) << "GetWindowRect width " << r.right - r.left << ", expected 750";
    EXPECT_EQ(r.bottom - r.top, 270) << "GetWindowRect height " << r.bottom - r.top << ", expected 270";
    // The user drags the frame: the window is given another size.
    SetWindowPos(P.Window, nullptr, r.left, r.top, 900, 400, SWP_NOZORDER | SWP_NOACTIVATE);
    ASSERT_TRUE(Settle(P)) << "SendMessageTimeout(WM_NULL) timed out; expected the program back in its message loop";
    RECT after = OuterRect(P.Window);
    EXPECT_EQ(after.right - after.left, 750)
        << "after SetWindowPos(900 x 400) the width is " << after.right - after.left << ", expected 750";
    EXPECT_EQ(after.bottom - after.top, 270)
        << "after SetWindowPos(900 x 400) the height is " << after.bottom - after.top << ", expected 270";
    EXPECT_EQ(after.left, r.left) << "the window moved: left " << after.left << ", expected " << r.left;
    EXPECT_TRUE(SameRect(ClientRectOf(P, C(PlayId)), At(10, 20, 40, 40)))
        << "Play is at " << Describe(ClientRectOf(P, C(PlayId))) << " after the resize, expected (10, 20, 40 x 40)";
}

TEST_F(FirstStart, PanelButtonOpensTo580AndClosesTo270) {
    ASSERT_TRUE(Click(P, EqPanelId)) << "BM_CLICK on the panel button was not answered";
    RECT r = OuterRect(P.Window);
    EXPECT_EQ(r.bottom - r.top, 580) << "after the panel button the height is " << r.bottom - r.top << ", expected 580";
    EXPECT_EQ(r.right - r.left, 750) << "after the panel button the width is " << r.right - r.left << ", expected 750";
    for (int32_t id = 5; id <= 35; ++id)
        EXPECT_TRUE(IsWindowVisible(C(id))) << "band slider " << id << " hidden with the panel open";
    EXPECT_TRUE(IsWindowVisible(ChildByText(P, "Button", "WYSIWYG 31 Band Graphic Equalizer")))
        << "the equaliser frame is hidden with the panel open";
    EXPECT_TRUE(IsWindowVisible(C(EqLockId))) << "\"EQ Lock\" is hidden with the panel open";
    EXPECT_TRUE(IsChecked(C(EqLockId))) << "BM_GETCHECK of \"EQ Lock\" gave 0 after the panel button, expected 1";

    ASSERT_TRUE(Click(P, EqPanelId)) << "SendMessageTimeout(BM_CLICK) to control " << (EqPanelId) << " timed out; expected the click handled";
    r = OuterRect(P.Window);
    EXPECT_EQ(r.bottom - r.top, 270) << "after the second press the height is " << r.bottom - r.top << ", expected 270";
    for (int32_t id = 5; id <= 35; ++id)
        EXPECT_FALSE(IsWindowVisible(C(id))) << "band slider " << id << " visible with the panel closed";

    ASSERT_TRUE(Click(P, EqPanelId)) << "SendMessageTimeout(BM_CLICK) to control " << (EqPanelId) << " timed out; expected the click handled";
    ASSERT_TRUE(Click(P, EqCloseId)) << "SendMessageTimeout(BM_CLICK) to control " << (EqCloseId) << " timed out; expected the click handled";
    r = OuterRect(P.Window);
    EXPECT_EQ(r.bottom - r.top, 270) << "after the close button the height is " << r.bottom - r.top << ", expected 270";
    EXPECT_FALSE(IsWindowVisible(C(EqLockId))) << "\"EQ Lock\" visible after the close button";
}

// ---------------------------------------------------------------- commands

class Commands : public ProgramTest {};

TEST_F(Commands, PlayDisablesExactlyTheDisableList) {
    std::vector<HWND> children = Children(P);
    std::set<HWND> before;
    for (HWND child : children)
        if (IsWindowEnabled(child)) before.insert(child);
    ASSERT_TRUE(Click(P, PlayId)) << "BM_CLICK on Play was not answered within 10 s";
    ExpectNoBox("Play");
    std::set<HWND> refused;
    for (int32_t id : DisabledWhilePlaying) refused.insert(C(id));
    for (HWND child : children) {
        const bool expectEnabled = refused.count(child) ? false : before.count(child) > 0;
        EXPECT_EQ(IsWindowEnabled(child) != FALSE, expectEnabled)
            << "while playing, control id " << GetDlgCtrlID(child) << " \"" << TextOf(child)
            << "\": IsWindowEnabled gave " << IsWindowEnabled(child) << ", expected " << expectEnabled;
    }
}

TEST_F(Commands, SecondPlayDoesNothingAndStopWhenStoppedDoesNothing) {
    ASSERT_TRUE(Click(P, StopId)) << "BM_CLICK on Stop while stopped was not answered within 10 s";
    ExpectNoBox("Stop while stopped");
    EXPECT_TRUE(Stopped()) << "Stop while stopped changed the enabled controls";
    ASSERT_TRUE(Click(P, PlayId)) << "SendMessageTimeout(BM_CLICK) to control " << (PlayId) << " timed out; expected the click handled";
    ASSERT_TRUE(Playing()) << "Play did not disable the timer controls";
    ASSERT_TRUE(Click(P, PlayId)) << "the second BM_CLICK on Play was not answered within 10 s";
    ExpectNoBox("a second Play");
    EXPECT_TRUE(Playing()) << "a second Play changed the enabled controls";
    ASSERT_TRUE(Click(P, StopId)) << "SendMessageTimeout(BM_CLICK) to control " << (StopId) << " timed out; expected the click handled";
    EXPECT_TRUE(Stopped()) << "Stop did not enable the timer controls again";
    EXPECT_FALSE(Enabled(FadeOutId)) << "Stop enabled \"Fade Out\" with Stop Time and Alarm off";
    EXPECT_FALSE(Enabled(FadeOutFieldId)) << "Stop enabled the fade-out field with Stop Time and Alarm off";
    ASSERT_TRUE(Click(P, StopId)) << "SendMessageTimeout(BM_CLICK) to control " << (StopId) << " timed out; expected the click handled";
    ExpectNoBox("a second Stop");
    EXPECT_TRUE(Stopped()) << "a second Stop changed the enabled controls";
}

TEST_F(Commands, StopEnablesTheFadeOutPairWhenStopTimeIsOn) {
    // A stop time half a day away cannot be reached during the test.
    SYSTEMTIME now;
    GetLocalTime(&now);
    const int32_t hour12 = (now.wHour % 12) == 0 ? 12 : now.wHour % 12;
    SendMessageTimeoutA(C(HourId), WM_SETTEXT, 0, reinterpret_cast<LPARAM>(std::to_string(hour12).c_str()),
                        SMTO_NORMAL, 5000, nullptr);
    SendMessageTimeoutA(C(MinuteId), WM_SETTEXT, 0,
                        reinterpret_cast<LPARAM>(std::to_string(now.wMinute).c_str()), SMTO_NORMAL, 5000, nullptr);
    ASSERT_TRUE(Click(P, now.wHour < 12 ? PmId : AmId)) << "SendMessageTimeout(BM_CLICK) to control " << (now.wHour < 12 ? PmId : AmId) << " timed out; expected the click handled";
    ASSERT_TRUE(Click(P, StopTimeId)) << "SendMessageTimeout(BM_CLICK) to control " << (StopTimeId) << " timed out; expected the click handled";
    EXPECT_TRUE(IsChecked(C(StopTimeId))) << "BM_GETCHECK of \"Stop Time\" gave 0 after a click";
    EXPECT_TRUE(Enabled(FadeOutId)) << "\"Fade Out\" still disabled after checking \"Stop Time\"";
    EXPECT_TRUE(Enabled(FadeOutFieldId)) << "fade-out field still disabled after checking \"Stop Time\"";
    ASSERT_TRUE(Click(P, PlayId)) << "SendMessageTimeout(BM_CLICK) to control " << (PlayId) << " timed out; expected the click handled";
    ExpectNoBox("Play with a valid stop time");
    EXPECT_TRUE(Playing()) << "Play with a valid stop time did not start";
    ASSERT_TRUE(Click(P, StopId)) << "SendMessageTimeout(BM_CLICK) to control " << (StopId) << " timed out; expected the click handled";
    EXPECT_TRUE(Stopped()) << "Stop did not enable the timer controls";
    EXPECT_TRUE(Enabled(FadeOutId)) << "Stop left \"Fade Out\" disabled although Stop Time is on";
    EXPECT_TRUE(Enabled(FadeOutFieldId)) << "Stop left the fade-out field disabled although Stop Time is on";
    ASSERT_TRUE(Click(P, StopTimeId)) << "SendMessageTimeout(BM_CLICK) to control " << (StopTimeId) << " timed out; expected the click handled";
    EXPECT_FALSE(Enabled(FadeOutId)) << "unchecking \"Stop Time\" left \"Fade Out\" enabled";
}

TEST_F(Commands, DogsChecksOnlyItself) {
    ASSERT_TRUE(Click(P, DogsId)) << "SendMessageTimeout(BM_CLICK) to control " << (DogsId) << " timed out; expected the click handled";
    for (int32_t id = WhiteId; id <= TrafficId; ++id)
        EXPECT_EQ(IsChecked(C(id)), id == DogsId)
            << "after \" Dogs\", BM_GETCHECK of profile button " << id << " gave " << IsChecked(C(id));
    ASSERT_TRUE(Click(P, TrafficId)) << "SendMessageTimeout(BM_CLICK) to control " << (TrafficId) << " timed out; expected the click handled";
    for (int32_t id = WhiteId; id <= TrafficId; ++id)
        EXPECT_EQ(IsChecked(C(id)), id == TrafficId)
            << "after \" Traffic\", BM_GETCHECK of profile button " << id << " gave " << IsChecked(C(id));
}

TEST_F(Commands, AmAndPmHoldOppositeStates) {
    ASSERT_TRUE(Click(P, PmId)) << "SendMessageTimeout(BM_CLICK) to control " << (PmId) << " timed out; expected the click handled";
    EXPECT_TRUE(IsChecked(C(PmId)) && !IsChecked(C(AmId))) << "after \"PM\": AM " << IsChecked(C(AmId))
                                                             << " PM " << IsChecked(C(PmId)) << ", expected 0 1";
    ASSERT_TRUE(Click(P, AmId)) << "SendMessageTimeout(BM_CLICK) to control " << (AmId) << " timed out; expected the click handled";
    EXPECT_TRUE(IsChecked(C(AmId)) && !IsChecked(C(PmId))) << "after \"AM\": AM " << IsChecked(C(AmId))
                                                             << " PM " << IsChecked(C(PmId)) << ", expected 1 0";
}

TEST_F(Commands, AlarmShowsTheChimeButtonOnlyWhileOn) {
    ASSERT_TRUE(Click(P, AlarmId)) << "SendMessageTimeout(BM_CLICK) to control " << (AlarmId) << " timed out; expected the click handled";
    EXPECT_TRUE(IsWindowVisible(C(ChimeTestId))) << "chime test button hidden with \"Alarm\" checked";
    EXPECT_TRUE(Enabled(FadeOutId)) << "\"Fade Out\" disabled with \"Alarm\" checked";
    ASSERT_TRUE(Click(P, AlarmId)) << "SendMessageTimeout(BM_CLICK) to control " << (AlarmId) << " timed out; expected the click handled";
    EXPECT_FALSE(IsWindowVisible(C(ChimeTestId))) << "chime test button visible with \"Alarm\" unchecked";
    EXPECT_FALSE(Enabled(FadeOutId)) << "\"Fade Out\" enabled with \"Alarm\" unchecked";
}

TEST_F(Commands, PowerBroadcastRestoresAMinimisedWindow) {
    ShowWindowAsync(P.Window, SW_MINIMIZE);
    ASSERT_TRUE(WaitFor([&] { return IsIconic(P.Window) != FALSE; }, 10000))
        << "ShowWindowAsync(SW_MINIMIZE) did not minimise the window";
    DWORD_PTR result = 0;
    ASSERT_NE(SendMessageTimeoutA(P.Window, WM_POWERBROADCAST, PBT_APMRESUMEAUTOMATIC, 0, SMTO_NORMAL,
                                  10000, &result), 0)
        << "WM_POWERBROADCAST was not answered";
    EXPECT_TRUE(WaitFor([&] { return !IsIconic(P.Window) && IsWindowVisible(P.Window); }, 10000))
        << "after WM_POWERBROADCAST IsIconic gives " << IsIconic(P.Window) << ", expected 0";
    RECT r = OuterRect(P.Window);
    EXPECT_EQ(r.right - r.left, 750) << "restored width " << r.right - r.left << ", expected 750";
    EXPECT_EQ(r.bottom - r.top, 270) << "restored height " << r.bottom - r.top << ", expected 270";
}

// ---------------------------------------------------------------- the meter on screen

class Meter : public ProgramTest {};

// Columns 16..674, rows 3..8 (upper bar) or 13..18 (lower bar): the bar's
// right end (last column in the bar colours), or 15 when the row is empty.
int32_t BarEnd(const Picture& picture, int32_t row) {
    int32_t end = 15;
    for (int32_t x = 16; x <= 674; ++x) {
        const uint32_t p = picture.At(x, row);
        if (p == Rgb(0, 0, 200) || p == Rgb(200, 0, 0)) end = x;
    }
    return end;
}

TEST_F(Meter, BarsShowWhilePlayingAndGoAfterStop) {
    ASSERT_TRUE(Click(P, PlayId)) << "SendMessageTimeout(BM_CLICK) to control " << (PlayId) << " timed out; expected the click handled";
    Picture picture;
    ASSERT_TRUE(WaitFor([&] {
        return CaptureClient(P, &picture) && BarEnd(picture, 5) > 16 && BarEnd(picture, 15) > 16;
    }, 10000)) << "no bar in rows 5 and 15 within 10 s of Play: ends at x " << BarEnd(picture, 5) << " and "
               << BarEnd(picture, 15);
    for (int32_t row : {3, 8, 13, 18})
        EXPECT_GT(BarEnd(picture, row), 16) << "while playing row " << row << " has no bar";
    for (int32_t row : {1, 2, 9, 10, 11, 12, 19, 20})
        EXPECT_EQ(BarEnd(picture, row), 15) << "while playing row " << row << " outside the bars is painted";
    // The screenshot of the playing window for the documentation, taken by
    // the harness from the X display (frame and caption included).
    if (!Config.Requests.empty()) {
        const RECT r = OuterRect(P.Window);
        char geometry[64];
        std::snprintf(geometry, sizeof(geometry), "%ldx%ld+%ld+%ld", r.right - r.left, r.bottom - r.top,
                      r.left, r.top);
        EXPECT_TRUE(AskHarness("screenshot", geometry)) << "the harness took no screenshot";
    }

    ASSERT_TRUE(Click(P, StopId)) << "SendMessageTimeout(BM_CLICK) to control " << (StopId) << " timed out; expected the click handled";
    EXPECT_TRUE(WaitFor([&] {
        return CaptureClient(P, &picture) && BarEnd(picture, 5) == 15 && BarEnd(picture, 15) == 15;
    }, 5000)) << "after Stop the bars still end at x " << BarEnd(picture, 5) << " and " << BarEnd(picture, 15)
              << ", expected no bar";
    // Covering and uncovering repaints empty bars.
    InvalidateRect(P.Window, nullptr, TRUE);
    ASSERT_TRUE(Settle(P)) << "SendMessageTimeout(WM_NULL) timed out; expected the program back in its message loop";
    ASSERT_TRUE(CaptureClient(P, &picture)) << "BitBlt from the screen failed";
    EXPECT_EQ(BarEnd(picture, 5), 15) << "a repaint while stopped shows an upper bar to x " << BarEnd(picture, 5);
}

// ---------------------------------------------------------------- Help

class Help : public ::testing::Test {
protected:
    Program P = {};
    std::string Dir;
    std::string Marker;
    // A copy of the program in its own directory, with or without a manual;
    // a program that already has its manual beside it (a release unpacked)
    // is run where it lies. The shell opens .pdf files with this driver in
    // its marker mode, which writes the opened path into Marker.
    void Prepare(const char* name, bool withManual) {
        const std::string home = Config.ProgramPath.substr(0, Config.ProgramPath.rfind('\\'));
        const bool release =
            withManual && GetFileAttributesA((home + "\\Sombrel.pdf").c_str()) != INVALID_FILE_ATTRIBUTES;
        Dir = release ? home : Config.WorkDir + "\\" + name;
        Marker = Config.WorkDir + "\\" + name + "-opened.txt";
        DeleteFileA(Marker.c_str());
        if (!release) {
            CreateDirectoryA(Dir.c_str(), nullptr);
            ASSERT_TRUE(CopyFileA(Config.ProgramPath.c_str(), (Dir + "\\Sombrel.exe").c_str(), FALSE))
                << "CopyFileA to " << Dir << " failed, error " << GetLastError();
            DeleteFileA((Dir + "\\Sombrel.pdf").c_str());
            if (withManual) std::ofstream((Dir + "\\Sombrel.pdf").c_str()) << "%PDF-1.4\n";
        }
        char self[MAX_PATH];
        GetModuleFileNameA(nullptr, self, sizeof(self));
        const std::string command = std::string("\"") + self + "\" --mark-opened \"" + Marker + "\" \"%1\"";
        HKEY key;
        ASSERT_EQ(RegCreateKeyExA(HKEY_CLASSES_ROOT, ".pdf", 0, nullptr, 0, KEY_WRITE,
                                  nullptr, &key, nullptr), ERROR_SUCCESS);
        RegSetValueExA(key, nullptr, 0, REG_SZ, reinterpret_cast<const BYTE*>("SombrelTestPdf"), 15);
        RegCloseKey(key);
        ASSERT_EQ(RegCreateKeyExA(HKEY_CLASSES_ROOT, "SombrelTestPdf\\shell\\open\\command",
                                  0, nullptr, 0, KEY_WRITE, nullptr, &key, nullptr), ERROR_SUCCESS);
        RegSetValueExA(key, nullptr, 0, REG_SZ, reinterpret_cast<const BYTE*>(command.c_str()),
                       static_cast<DWORD>(command.size() + 1));
        RegCloseKey(key);
        ASSERT_TRUE(LaunchProgram(&P, Dir + "\\Sombrel.exe")) << "the copy in " << Dir << " showed no window";
    }
    void TearDown() override {
        for (int i = 0; i < 10; ++i) {
            std::vector<Box> boxes = OpenBoxes(P);
            if (boxes.empty()) break;
            CloseBox(boxes.back());
        }
        if (CloseProgram(&P) < 0) EndProgram(&P);
        RegDeleteTreeA(HKEY_CLASSES_ROOT, "SombrelTestPdf");
        RegDeleteTreeA(HKEY_CLASSES_ROOT, ".pdf");
    }
    bool Opened() { return GetFileAttributesA(Marker.c_str()) != INVALID_FILE_ATTRIBUTES; }
};

TEST_F(Help, AboutBoxComesFirstAndTheManualOpensAfterIt) {
    Prepare("help-with-manual", true);
    ClickAsync(P, HelpId);
    Box about;
    ASSERT_TRUE(WaitForBox(P, &about)) << "Help showed no box within 20 s";
    EXPECT_EQ(about.Caption, "Sombrel Player") << "about box caption";
    EXPECT_NE(about.Text.find("Sombrel Player"), std::string::npos) << "about text \"" << about.Text << "\" lacks the product name";
    EXPECT_NE(about.Text.find("1.00"), std::string::npos) << "about text \"" << about.Text << "\" lacks the version 1.00";
    EXPECT_FALSE(about.HasIcon) << "the about box shows an icon";
    EXPECT_EQ(about.Buttons, std::vector<std::string>{"OK"}) << "about box buttons";
    // While the box is open the manual must not be opened: the shell would
    // have done so within this second if it had been asked.
    EXPECT_FALSE(WaitFor([&] { return Opened(); }, 1500)) << "the manual was opened while the about box was open";
    ASSERT_TRUE(CloseBox(about)) << "WM_COMMAND IDOK to the about box left it open";
    ASSERT_TRUE(WaitFor([&] { return Opened(); }, 20000)) << "the manual was not opened within 20 s of closing the about box";
    std::ifstream marker(Marker.c_str());
    std::string opened;
    std::getline(marker, opened);
    EXPECT_EQ(Lower(opened), Lower(Dir + "\\Sombrel.pdf")) << "the shell opened \"" << opened << "\"";
    // After Help the program plays, stops and ends cleanly.
    ASSERT_TRUE(Click(P, PlayId) && ShowsPlaying(P)) << "Play after Help did not reach the playing state";
    ASSERT_TRUE(Click(P, StopId) && ShowsStopped(P)) << "Stop did not bring the stopped state back";
    EXPECT_EQ(CloseProgram(&P), 0) << "exit code after Help, Play, Stop and closing";
}

TEST_F(Help, WithoutTheManualTheProgramShowsNothingOfItsOwn) {
    Prepare("help-without-manual", false);
    ClickAsync(P, HelpId);
    Box about;
    ASSERT_TRUE(WaitForBox(P, &about)) << "Help showed no box within 20 s";
    ASSERT_TRUE(CloseBox(about)) << "WM_COMMAND IDOK to the about box left it open";
    // Whatever the shell says about the missing file is the shell's; the
    // program itself adds no box with its captions.
    const bool own = WaitFor([&] {
        for (const Box& b : OpenBoxes(P))
            if (b.Caption == "Sombrel Player" || b.Caption == "Sombrel") return true;
        return false;
    }, 2000);
    EXPECT_FALSE(own) << "a box captioned \"Sombrel Player\" or \"Sombrel\" appeared after the about box";
    EXPECT_FALSE(Opened()) << "something was opened although there is no manual";
    EXPECT_TRUE(Settle(P)) << "the program stopped answering after Help";
}

// ---------------------------------------------------------------- closing

TEST(Closing, ExitCodeIsZeroAfterANormalClose) {
    Program p;
    ASSERT_TRUE(LaunchProgram(&p)) << "LaunchProgram(" << Config.ProgramPath << ") showed no window within 30 s";
    const int32_t code = CloseProgram(&p);
    EXPECT_EQ(code, 0) << "exit code after WM_CLOSE was " << code << ", expected 0";
}

TEST(Closing, ClosingWhilePlayingEndsCleanly) {
    Program p;
    ASSERT_TRUE(LaunchProgram(&p)) << "LaunchProgram(" << Config.ProgramPath << ") showed no window within 30 s";
    ASSERT_TRUE(Click(p, PlayId)) << "SendMessageTimeout(BM_CLICK) to control " << (PlayId) << " timed out; expected the click handled";
    ASSERT_TRUE(WaitFor([&] { return !IsWindowEnabled(Control(p, StopTimeId)); }, 5000))
        << "\"Stop Time\" still enabled 5 s after Play; expected disabled while playing";
    const int32_t code = CloseProgram(&p);
    EXPECT_EQ(code, 0) << "exit code after WM_CLOSE while playing was " << code << ", expected 0";
}

// ---------------------------------------------------------------- soak

class Soak : public ProgramTest {};

TEST_F(Soak, TwoHundredPlayStopCyclesLeakNothing) {
    // Counts are taken after a few cycles, once Wine's sound system has
    // made its lasting objects; a leak of one object per cycle would add
    // 190 by the end, so a margin of 10 for unrelated housekeeping is safe.
    int32_t handles = 0, gdi = 0, windows = 0;
    for (int32_t cycle = 1; cycle <= 200; ++cycle) {
        ASSERT_TRUE(Click(P, PlayId)) << "cycle " << cycle << ": Play was not answered within 10 s";
        ASSERT_TRUE(Playing()) << "cycle " << cycle << ": not playing after Play";
        ASSERT_TRUE(Click(P, StopId)) << "cycle " << cycle << ": Stop was not answered within 10 s";
        ASSERT_TRUE(Stopped()) << "cycle " << cycle << ": not stopped after Stop";
        if (cycle == 10) {
            ASSERT_TRUE(Settle(P)) << "SendMessageTimeout(WM_NULL) timed out; expected the program back in its message loop";
            handles = KernelHandleCount(P.Process.dwProcessId);
            gdi = GdiObjectCount(P.Process.hProcess);
            windows = WindowCount(P.Process.dwProcessId);
            ASSERT_GT(handles, 0) << "KernelHandleCount could not read the handle list";
            ASSERT_GT(gdi, 0) << "GdiObjectCount could not read the GDI table";
        }
    }
    ExpectNoBox("200 cycles");
    ASSERT_TRUE(Settle(P)) << "SendMessageTimeout(WM_NULL) timed out; expected the program back in its message loop";
    const int32_t handlesAfter = KernelHandleCount(P.Process.dwProcessId);
    const int32_t gdiAfter = GdiObjectCount(P.Process.hProcess);
    const int32_t windowsAfter = WindowCount(P.Process.dwProcessId);
    std::printf("soak: kernel handles %d -> %d, GDI objects %d -> %d, windows %d -> %d\n", handles,
                handlesAfter, gdi, gdiAfter, windows, windowsAfter);
    EXPECT_LE(handlesAfter, handles + 10) << "kernel handles grew from " << handles << " at cycle 10 to "
                                          << handlesAfter << " at cycle 200";
    EXPECT_LE(gdiAfter, gdi + 10) << "GDI objects grew from " << gdi << " at cycle 10 to " << gdiAfter
                                  << " at cycle 200";
    EXPECT_EQ(windowsAfter, windows) << "windows: " << windows << " at cycle 10, " << windowsAfter << " at 200";
}

// ---------------------------------------------------------------- no sound device

// Run by the harness with no sound server. Every failing device call shows
// its code box (no icon, OK) and then the device's own text (an icon, OK).
class NoSoundServer : public ProgramTest {
protected:
    std::set<std::string> DeviceTexts;
    void SetUp() override {
        ProgramTest::SetUp();
        char text[400];
        for (UINT code = 1; code < 64; ++code)
            if (waveOutGetErrorTextA(code, text, sizeof(text)) == MMSYSERR_NOERROR) DeviceTexts.insert(text);
    }
    // Reads the next pair of boxes and closes both; returns the code text.
    std::string NextPair(const char* expectedCode, const char* expectedCaption) {
        Box code, text;
        if (!WaitForBox(P, &code)) {
            ADD_FAILURE() << "no box for \"" << expectedCode << "\" within 20 s";
            return "";
        }
        EXPECT_EQ(code.Text, expectedCode) << "code box text";
        EXPECT_EQ(code.Caption, expectedCaption) << "caption of the box \"" << code.Text << "\"";
        EXPECT_FALSE(code.HasIcon) << "the box \"" << code.Text << "\" shows an icon";
        EXPECT_EQ(code.Buttons, std::vector<std::string>{"OK"}) << "buttons of \"" << code.Text << "\"";
        CloseBox(code);
        if (!WaitForBox(P, &text)) {
            ADD_FAILURE() << "no device text box after \"" << code.Text << "\"";
            return code.Text;
        }
        EXPECT_EQ(text.Caption, "Sombrel Player") << "caption of the device text after \"" << code.Text << "\"";
        EXPECT_TRUE(DeviceTexts.count(text.Text)) << "after \"" << code.Text << "\" the box says \"" << text.Text
                                                  << "\", which is no text of waveOutGetErrorTextA";
        EXPECT_TRUE(text.HasIcon) << "the device text after \"" << code.Text << "\" shows no icon";
        CloseBox(text);
        return code.Text;
    }
};

TEST_F(NoSoundServer, PlayShowsEveryFailureAndStopBringsTheProgramBack) {
    char expectedText[400];
    waveOutGetErrorTextA(MMSYSERR_BADDEVICEID, expectedText, sizeof(expectedText));
    for (int32_t round = 1; round <= 2; ++round) {
        ClickAsync(P, PlayId);
        Box code, text;
        ASSERT_TRUE(WaitForBox(P, &code)) << "round " << round << ": Play without a device showed no box";
        EXPECT_EQ(code.Text, "Error 4528") << "round " << round << ": text of the first box of Play";
        EXPECT_EQ(code.Caption, "Sombrel Player") << "round " << round << ": caption of \"Error 4528\"";
        EXPECT_FALSE(code.HasIcon) << "round " << round << ": \"Error 4528\" shows an icon; expected none";
        CloseBox(code);
        ASSERT_TRUE(WaitForBox(P, &text)) << "round " << round << ": no device text after \"Error 4528\"";
        EXPECT_EQ(text.Text, expectedText) << "the device's text after \"Error 4528\"";
        EXPECT_TRUE(text.HasIcon) << "round " << round << ": the device text shows no icon; expected the exclamation";
        CloseBox(text);
        for (int32_t block = 0; block < 2; ++block) {
            NextPair("Error 4529", "Sombrel");
            NextPair("Error 4530", "Sombrel");
        }
        ASSERT_TRUE(WaitFor([&] { return OpenBoxes(P).empty(); }, 5000))
            << "round " << round << ": a box is still open after the two blocks' boxes";
        ASSERT_TRUE(Settle(P)) << "SendMessageTimeout(WM_NULL) timed out; expected the program back in its message loop";
        EXPECT_TRUE(Playing()) << "round " << round << ": after the failed open the program is not in the playing state";
        ClickAsync(P, StopId);
        NextPair("Error 4534", "Sombrel Player");
        // Unpreparing on a device that never opened: each failure has its box.
        std::string next;
        for (int32_t i = 0; i < 3; ++i) {
            Box peek;
            ASSERT_TRUE(WaitForBox(P, &peek)) << "Stop showed no box after \"Error 4534\"";
            if (peek.Text != "Error 4532") break;
            NextPair("Error 4532", "Sombrel");
        }
        NextPair("Error 4535", "Sombrel Player");
        ASSERT_TRUE(WaitFor([&] { return OpenBoxes(P).empty(); }, 5000)) << "a box is left after Stop";
        ASSERT_TRUE(Settle(P)) << "SendMessageTimeout(WM_NULL) timed out; expected the program back in its message loop";
        EXPECT_TRUE(Stopped()) << "round " << round << ": Stop did not bring the program back to the stopped state";
    }
}

// The sound server goes away while the program runs and comes back: Play
// fails with its boxes while it is away and plays again once it is back.
TEST_F(NoSoundServer, PlayWorksAgainWhenTheDeviceIsBack) {
    ASSERT_TRUE(Click(P, PlayId)) << "SendMessageTimeout(BM_CLICK) to control " << (PlayId) << " timed out; expected the click handled";
    ASSERT_TRUE(Click(P, StopId)) << "SendMessageTimeout(BM_CLICK) to control " << (StopId) << " timed out; expected the click handled";
    ASSERT_TRUE(AskHarness("stop-sound-server")) << "the harness did not stop the sound server";
    ClickAsync(P, PlayId);
    Box first;
    ASSERT_TRUE(WaitForBox(P, &first)) << "Play without the sound server showed no box";
    EXPECT_EQ(first.Text, "Error 4528") << "first box of Play without the sound server";
    // Answer every box of this Play and of the Stop after it.
    auto answerAll = [&] {
        while (WaitFor([&] { return !OpenBoxes(P).empty(); }, 1500)) {
            std::vector<Box> boxes = OpenBoxes(P);
            if (!boxes.empty()) CloseBox(boxes.back());
        }
    };
    answerAll();
    ClickAsync(P, StopId);
    answerAll();
    ASSERT_TRUE(Settle(P)) << "SendMessageTimeout(WM_NULL) timed out; expected the program back in its message loop";
    EXPECT_TRUE(Stopped()) << "Stop did not bring the program back";
    ASSERT_TRUE(AskHarness("start-sound-server")) << "the harness did not start the sound server";
    ASSERT_TRUE(Click(P, PlayId)) << "Play with the device back was not answered within 10 s";
    ExpectNoBox("Play with the device back");
    EXPECT_TRUE(Playing()) << "with the device back, Play left timer controls enabled; expected the playing state";
    Picture picture;
    EXPECT_TRUE(WaitFor([&] { return CaptureClient(P, &picture) && BarEnd(picture, 5) > 16; }, 10000))
        << "with the device back the meter shows no sound within 10 s";
    ASSERT_TRUE(Click(P, StopId)) << "SendMessageTimeout(BM_CLICK) to control " << (StopId) << " timed out; expected the click handled";
    ExpectNoBox("Stop with the device back");
}

// ---------------------------------------------------------------- the recording

// Run by the harness while it records the sound server's output into the
// file named by SOMBREL_CAPTURE. Each test notes, in the time line file, the
// recording's size at every action; the harness then compares the recording
// with renders of the same settings.
class Sound : public ProgramTest {
protected:
    std::string Capture;
    std::ofstream Timeline;
    void SetUp() override {
        const char* capture = std::getenv("SOMBREL_CAPTURE");
        ASSERT_NE(capture, nullptr) << "SOMBREL_CAPTURE is not set: the harness records the sound";
        Capture = WindowsPath(capture);
        Timeline.open((Config.WorkDir + "\\sound-timeline.txt").c_str(), std::ios::app);
        ProgramTest::SetUp();
    }
    int64_t Recorded() { return FileSize(Capture); }
    void Note(const std::string& what) { Timeline << what << ' ' << Recorded() << '\n'; Timeline.flush(); }
    // Waits until the recording has grown by `seconds` of sound.
    bool RecordFor(double seconds) {
        const int64_t target = Recorded() + static_cast<int64_t>(seconds * 48000) * 4;
        return WaitFor([&] { return Recorded() >= target; }, static_cast<DWORD>(seconds * 1000 * 3 + 5000));
    }
};

TEST_F(Sound, PlaysWhatTheRenderMakes) {
    ASSERT_GE(Recorded(), 0) << "the recording " << Capture << " does not exist";
    Note("begin plain");
    ASSERT_TRUE(Click(P, PlayId)) << "SendMessageTimeout(BM_CLICK) to control " << (PlayId) << " timed out; expected the click handled";
    ASSERT_TRUE(RecordFor(4)) << "the recording did not grow by 4 s";
    // A second Play while playing must not restart the sound: the harness
    // finds the render continuing without a break.
    ASSERT_TRUE(Click(P, PlayId)) << "SendMessageTimeout(BM_CLICK) to control " << (PlayId) << " timed out; expected the click handled";
    ASSERT_TRUE(RecordFor(8)) << "the recording did not grow by 8 s";
    ASSERT_TRUE(Click(P, StopId)) << "SendMessageTimeout(BM_CLICK) to control " << (StopId) << " timed out; expected the click handled";
    ASSERT_TRUE(RecordFor(0.5)) << "the recording did not grow by 0.5 s in time; expected the sound server to record";
    Note("end plain");
    ExpectNoBox("playing");
}

TEST_F(Sound, VolumeAndProfileChangesAreHeardWithinTwoBlocks) {
    Note("begin changes");
    ASSERT_TRUE(Click(P, PlayId)) << "SendMessageTimeout(BM_CLICK) to control " << (PlayId) << " timed out; expected the click handled";
    ASSERT_TRUE(RecordFor(3)) << "the recording did not grow by 3 s in time; expected the sound server to record";
    Scroll(P, VolumeId, SB_THUMBPOSITION, 200);
    Note("volume 200");
    ASSERT_TRUE(RecordFor(3)) << "the recording did not grow by 3 s in time; expected the sound server to record";
    ASSERT_TRUE(Click(P, DogsId)) << "SendMessageTimeout(BM_CLICK) to control " << (DogsId) << " timed out; expected the click handled";
    Note("profile 107");
    ASSERT_TRUE(RecordFor(3)) << "the recording did not grow by 3 s in time; expected the sound server to record";
    ASSERT_TRUE(Click(P, StopId)) << "SendMessageTimeout(BM_CLICK) to control " << (StopId) << " timed out; expected the click handled";
    ASSERT_TRUE(RecordFor(0.5)) << "the recording did not grow by 0.5 s in time; expected the sound server to record";
    Note("end changes");
    ExpectNoBox("playing");
}

}  // namespace

// The marker mode: the shell runs this program to "open" a manual; it notes
// what it was asked to open and ends.
int MarkOpened(const char* marker, const char* opened) {
    FILE* f = std::fopen(marker, "wb");
    if (f == nullptr) return 1;
    std::fprintf(f, "%s\n", opened);
    std::fclose(f);
    return 0;
}

// The figures mode, for scripts/measure-program: starts the program, prints
// the time to its window and its process id, plays for the given seconds
// (the script reads CPU and memory meanwhile) and closes it.
int MeasureFigures(const char* exe, const char* seconds) {
    Config.ProgramPath = WindowsPath(exe);
    Program p;
    if (!LaunchProgram(&p)) return 1;
    std::printf("time-to-window-ms %.1f\n", p.MillisecondsToShow);
    if (!Click(p, PlayId)) return 1;
    std::printf("playing-pid %lu\n", p.Process.dwProcessId);
    std::fflush(stdout);
    Sleep(static_cast<DWORD>(std::atof(seconds) * 1000));
    if (!Click(p, StopId)) return 1;
    return CloseProgram(&p) == 0 ? 0 : 1;
}

int main(int argc, char** argv) {
    if (argc == 4 && std::string(argv[1]) == "--mark-opened") return MarkOpened(argv[2], argv[3]);
    if (argc == 4 && std::string(argv[1]) == "--figures") return MeasureFigures(argv[2], argv[3]);
    ::testing::InitGoogleTest(&argc, argv);
    if (argc < 3) {
        std::fprintf(stderr, "usage: program_tests SOMBREL.EXE WORKDIR [REQUESTS] [gtest options]\n");
        return 2;
    }
    Config.ProgramPath = WindowsPath(argv[1]);
    Config.WorkDir = WindowsPath(argv[2]);
    if (argc > 3) Config.Requests = WindowsPath(argv[3]);
    CreateDirectoryA(Config.WorkDir.c_str(), nullptr);
    return RUN_ALL_TESTS();
}
