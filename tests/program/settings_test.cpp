// The settings kept between runs, as a user meets them: Sombrel.exe is
// started against the registry of the throw-away prefix, prepared or read
// byte for byte by the test, and closed with or without a Play in between.
// Also the equaliser's "Error 7294", which needs a box answered from outside.
#include <gtest/gtest.h>
#include <windows.h>

#include <cstdio>
#include <string>
#include <vector>

#include "tests/program/driver.h"
#include "tests/program/settings_store.h"

namespace {

constexpr int32_t PlayId = 1030, StopId = 1031, AlarmId = 1032, HourId = 1033, MinuteId = 1034;
constexpr int32_t AmId = 1035, PmId = 1036, StopTimeId = 1038, FadeInId = 1039, FadeOutId = 1040;
constexpr int32_t FadeInFieldId = 1041, FadeOutFieldId = 1042, WhiteId = 1043, TalkingId = 1047;
constexpr int32_t DogsId = 1049, TrafficId = 1050, ChimeTestId = 1029, EqPanelId = 1055;
constexpr int32_t EqLockId = 1057, EqFrequencyId = 1058, EqLevelId = 1059;
constexpr int32_t M1Id = 1065, M2Id = 1066, M3Id = 1067, DefeatId = 1068;

std::string Hex(const std::vector<uint8_t>& bytes) {
    std::string out;
    char part[4];
    for (uint8_t b : bytes) {
        std::snprintf(part, sizeof(part), "%02x ", b);
        out += part;
    }
    return out;
}

// Each test begins without stored settings and prepares what it needs.
class Settings : public ::testing::Test {
protected:
    Program P = {};
    void SetUp() override {
        ASSERT_TRUE(ForgetStoredSettings()) << "the key HKLM\\Software\\Sombrel could not be removed";
    }
    void TearDown() override {
        AnswerBoxes();
        if (P.Process.hProcess != nullptr && CloseProgram(&P) < 0) EndProgram(&P);
        ForgetStoredSettings();
    }
    void Launch() {
        ASSERT_TRUE(LaunchProgram(&P)) << "LaunchProgram(" << Config.ProgramPath
                                       << ") found no visible main window within 30 s";
        ASSERT_TRUE(Settle(P)) << "the program does not answer after its start";
    }
    // Controls by id; the volume slider has id 0, as the labels and frames
    // do, so it is found by its class.
    HWND C(int32_t id) {
        if (id != 0) return Control(P, id);
        HWND child = nullptr;
        while ((child = FindWindowExA(P.Window, child, "ScrollBar", nullptr)) != nullptr)
            if (GetDlgCtrlID(child) == 0) return child;
        return nullptr;
    }
    std::vector<Box> AnswerBoxes() {
        std::vector<Box> seen;
        for (int i = 0; i < 20; ++i) {
            std::vector<Box> boxes = OpenBoxes(P);
            if (boxes.empty()) break;
            seen.push_back(boxes.back());
            CloseBox(boxes.back());
        }
        return seen;
    }
    // Play then Stop, answering whatever boxes a missing sound device shows:
    // what matters here is that Play was used.
    void PlayOnce() {
        ClickAsync(P, PlayId);
        ASSERT_TRUE(WaitFor([&] { AnswerBoxes(); return Settle(P, 200); }, 20000))
            << "the program does not answer after Play";
        AnswerBoxes();
        ClickAsync(P, StopId);
        ASSERT_TRUE(WaitFor([&] { AnswerBoxes(); return Settle(P, 200); }, 20000))
            << "the program does not answer after Stop";
    }
    // Closes the program and expects it to end by itself with code 0.
    void Close() {
        const int32_t code = CloseProgram(&P);
        ASSERT_EQ(0, code) << "the program's exit code after WM_CLOSE (-1: it did not end within 20 s)";
    }
    void ExpectNoBox(const char* when) {
        std::vector<Box> boxes = OpenBoxes(P);
        EXPECT_TRUE(boxes.empty()) << when << ": a box is open, text \""
                                   << (boxes.empty() ? "" : boxes[0].Text) << "\"; expected none";
    }
};

// Stores all 109 values as the program would, from a table of numbers.
void StoreAll(const int32_t numbers[109]) {
    for (int32_t i = 0; i < 109; ++i)
        ASSERT_TRUE(StoreNumber(StoredName(i).c_str(), numbers[i])) << "StoreNumber(" << StoredName(i) << ")";
}

// A full set of stored values, each distinct where the control allows it,
// with the timer switches off so that Play checks no field.
void DistinctValues(int32_t numbers[109]) {
    for (int32_t i = 0; i < 5; ++i) numbers[i] = 30 + 40 * i;  // 30, 70, 110, 150, 190
    for (int32_t k = 0; k < 31; ++k) {
        numbers[5 + k] = 1 + 8 * k;     // M1: 1 .. 241
        numbers[36 + k] = 255 - 7 * k;  // M2
        numbers[67 + k] = 20 + 5 * k;   // M3
    }
    const int32_t tail[11] = {0, 0, 1, 0, 7, 5, 106, 0, 0, 3, 12};
    for (int32_t i = 0; i < 11; ++i) numbers[98 + i] = tail[i];
}

}  // namespace

TEST_F(Settings, FirstRunShowsTheStartValuesAndWritesOnlyAfterPlay) {
    Launch();
    ExpectNoBox("first start without a key");
    for (int32_t id = 0; id <= 35; ++id)
        EXPECT_EQ(128, SliderPosition(C(id))) << "SBM_GETPOS of slider " << id << " at the first start";
    EXPECT_FALSE(IsChecked(C(EqLockId))) << "BM_GETCHECK of \"EQ Lock\" at the first start gave 1, expected 0";
    EXPECT_TRUE(IsChecked(C(TalkingId))) << "\" Talking / TV\" not checked at the first start";
    Close();
    EXPECT_FALSE(SettingsKeyExists()) << "closing without Play created HKLM\\Software\\Sombrel";

    Launch();
    PlayOnce();
    Close();
    ASSERT_TRUE(SettingsKeyExists()) << "closing after Play did not create HKLM\\Software\\Sombrel";
    const std::vector<std::string> names = StoredNames();
    EXPECT_EQ(109u, names.size()) << "values in the key after the first save";
    for (int32_t i = 0; i < 109; ++i) {
        const RawValue v = ReadRaw(StoredName(i).c_str());
        EXPECT_TRUE(v.Found) << "value \"" << StoredName(i) << "\" missing after the save";
        EXPECT_EQ(static_cast<DWORD>(REG_DWORD), v.Type) << "type of \"" << StoredName(i) << "\"";
        EXPECT_EQ(4u, v.Bytes.size()) << "length of \"" << StoredName(i) << "\"";
    }
    EXPECT_EQ(128, ReadNumber("Attenuator")) << "\"Attenuator\" after a run with the start values";
    EXPECT_EQ(104, ReadNumber("Profile")) << "\"Profile\" after a run with the start values";
    EXPECT_EQ(1, ReadNumber("Alarm_AM")) << "\"Alarm_AM\" after a run with the start values";
}

TEST_F(Settings, NumbersAreStoredAsTheStartOfTheirDecimalText) {
    Launch();
    DWORD_PTR result = 0;  // Attenuator 15, as the volume slider sends it
    SendMessageTimeoutA(P.Window, WM_HSCROLL, MAKEWPARAM(SB_THUMBPOSITION, 15),
                        reinterpret_cast<LPARAM>(C(0)), SMTO_NORMAL, 10000, &result);
    ASSERT_EQ(15, SliderPosition(C(0))) << "volume slider after SB_THUMBPOSITION 15";
    PlayOnce();
    Close();
    const RawValue hardness = ReadRaw("Hardness");
    ASSERT_EQ(4u, hardness.Bytes.size()) << "length of \"Hardness\"";
    const uint32_t dword = hardness.Bytes[0] | hardness.Bytes[1] << 8 | hardness.Bytes[2] << 16 |
                           static_cast<uint32_t>(hardness.Bytes[3]) << 24;
    EXPECT_EQ(0x00383231u, dword) << "\"Hardness\" 128 read as a DWORD; bytes " << Hex(hardness.Bytes);
    const RawValue attenuator = ReadRaw("Attenuator");
    ASSERT_EQ(4u, attenuator.Bytes.size()) << "length of \"Attenuator\"";
    EXPECT_TRUE(attenuator.Bytes[0] == 0x31 && attenuator.Bytes[1] == 0x35 && attenuator.Bytes[2] == 0)
        << "\"Attenuator\" 15 stored as " << Hex(attenuator.Bytes) << ", expected 31 35 00 and one more byte";
    const RawValue stopTime = ReadRaw("PlayUntilOn");
    ASSERT_EQ(4u, stopTime.Bytes.size()) << "length of \"PlayUntilOn\"";
    EXPECT_TRUE(stopTime.Bytes[0] == 0x30 && stopTime.Bytes[1] == 0)
        << "\"PlayUntilOn\" 0 stored as " << Hex(stopTime.Bytes) << ", expected 30 00 and two more bytes";
}

TEST_F(Settings, EveryValueComesBackAndIsWrittenBackUnchanged) {
    int32_t numbers[109];
    DistinctValues(numbers);
    StoreAll(numbers);
    Launch();
    ExpectNoBox("start with stored settings");
    for (int32_t i = 0; i < 5; ++i)
        EXPECT_EQ(numbers[i], SliderPosition(C(i))) << "slider " << i << " after the load";
    for (int32_t k = 0; k < 31; ++k)
        EXPECT_EQ(numbers[5 + k], SliderPosition(C(5 + k))) << "band " << k << " shows M1's stored level";
    EXPECT_TRUE(IsChecked(C(M1Id))) << "M1 not selected after the load";
    EXPECT_TRUE(IsChecked(C(EqLockId))) << "\"EQ Lock\" not checked after a load";
    EXPECT_TRUE(IsChecked(C(PmId))) << "\"PM\" not checked with Alarm_PM 1";
    EXPECT_FALSE(IsChecked(C(AmId))) << "\"AM\" checked with Alarm_AM 0";
    EXPECT_TRUE(IsChecked(C(TrafficId))) << "Profile 106 does not check \" Traffic\"";
    for (int32_t id = WhiteId; id < TrafficId; ++id)
        EXPECT_FALSE(IsChecked(C(id))) << "profile button " << id << " checked with Profile 106";
    EXPECT_EQ("7", TextOf(C(HourId))) << "hour field with Alarm_Hr 7";
    EXPECT_EQ("5", TextOf(C(MinuteId))) << "minute field with Alarm_Min 5";
    EXPECT_EQ("3", TextOf(C(FadeInFieldId))) << "fade-in field with FadeInTime 3";
    EXPECT_EQ("12", TextOf(C(FadeOutFieldId))) << "fade-out field with FadeOutTime 12";
    // M2 and M3 are not shown until pressed; the save shows them all.
    PlayOnce();
    Close();
    for (int32_t i = 0; i < 109; ++i)
        EXPECT_EQ(numbers[i], ReadNumber(StoredName(i).c_str()))
            << "value \"" << StoredName(i) << "\" after a load, a Play and a save";
}

TEST_F(Settings, M2SelectedAtExitComesBackAsM1) {
    int32_t numbers[109];
    DistinctValues(numbers);
    StoreAll(numbers);
    Launch();
    ASSERT_TRUE(Click(P, EqPanelId));
    SendMessageA(C(EqLockId), BM_SETCHECK, BST_UNCHECKED, 0);
    ASSERT_TRUE(Click(P, M2Id));
    ASSERT_EQ(numbers[36 + 4], SliderPosition(C(9))) << "band 4 after M2";
    PlayOnce();
    Close();
    Launch();
    EXPECT_TRUE(IsChecked(C(M1Id))) << "M1 not selected after a run that ended with M2";
    EXPECT_FALSE(IsChecked(C(M2Id))) << "M2 selected after a restart";
    for (int32_t k = 0; k < 31; ++k)
        EXPECT_EQ(numbers[5 + k], SliderPosition(C(5 + k))) << "band " << k << " after a restart: M1's level";
    ASSERT_TRUE(Click(P, EqPanelId));
    SendMessageA(C(EqLockId), BM_SETCHECK, BST_UNCHECKED, 0);
    ASSERT_TRUE(Click(P, M2Id));
    for (int32_t k = 0; k < 31; ++k)
        EXPECT_EQ(numbers[36 + k], SliderPosition(C(5 + k))) << "band " << k << " after M2 in the new run";
}

TEST_F(Settings, Profile107ChecksDogs) {
    ASSERT_TRUE(StoreNumber("Profile", 107));
    Launch();
    EXPECT_TRUE(IsChecked(C(DogsId))) << "Profile 107 does not check \" Dogs\"";
    EXPECT_FALSE(IsChecked(C(TrafficId))) << "Profile 107 checks \" Traffic\"";
    EXPECT_FALSE(IsChecked(C(TalkingId))) << "Profile 107 leaves \" Talking / TV\" checked";
}

TEST_F(Settings, FadeOutPairFollowsStopTimeAndAlarmNotItsOwnMark) {
    ASSERT_TRUE(StoreNumber("PlayUntilOn", 0));
    ASSERT_TRUE(StoreNumber("AlarmOn", 0));
    ASSERT_TRUE(StoreNumber("FadeOutOn", 1));
    Launch();
    EXPECT_TRUE(IsChecked(C(FadeOutId))) << "\"Fade Out\" does not show FadeOutOn 1";
    EXPECT_FALSE(IsWindowEnabled(C(FadeOutId))) << "\"Fade Out\" enabled with Stop Time and Alarm off";
    EXPECT_FALSE(IsWindowEnabled(C(FadeOutFieldId))) << "the fade-out field enabled with Stop Time and Alarm off";
    EXPECT_FALSE(IsWindowVisible(C(ChimeTestId))) << "the chime test button shown with AlarmOn 0 stored";
    CloseProgram(&P);

    ASSERT_TRUE(StoreNumber("AlarmOn", 1));
    Launch();
    EXPECT_TRUE(IsWindowEnabled(C(FadeOutId))) << "\"Fade Out\" disabled with AlarmOn 1 stored";
    EXPECT_TRUE(IsWindowVisible(C(ChimeTestId))) << "the chime test button hidden with AlarmOn 1 stored";
    EXPECT_TRUE(IsChecked(C(AlarmId))) << "\"Alarm\" not checked with AlarmOn 1 stored";
}

TEST_F(Settings, ADamagedKeyLoadsTheStartValuesWhereAValueCannotBeUsed) {
    const uint8_t sound200[4] = {'2', '0', '0', 0};
    const uint8_t long200[8] = {'2', '0', '0', 0, 0, 0, 0, 0};
    struct Damage {
        const char* What;
        const char* Name;
        DWORD Type;
        const void* Data;
        DWORD Length;
    };
    const Damage damages[] = {
        {"out of range", "Attenuator", REG_DWORD, "999", 4},
        {"zero", "Hardness", REG_DWORD, "0\0\0", 4},
        {"negative", "Bass", REG_DWORD, "-5\0", 4},
        {"non-digits", "SubBass", REG_DWORD, "ab\0", 4},
        {"wrong type", "Treble", REG_SZ, "200", 4},
        {"wrong length", "3", REG_DWORD, long200, 8},
        {"empty", "4", REG_DWORD, sound200, 0},
        {"band out of range", "5", REG_DWORD, "256", 4},
        {"Profile 0", "Profile", REG_DWORD, "0\0\0", 4},
        {"switch 2", "PlayUntilOn", REG_DWORD, "2\0\0", 4},
        {"Alarm_AM non-digits", "Alarm_AM", REG_DWORD, "x\0\0", 4},
    };
    for (const Damage& d : damages)
        ASSERT_TRUE(StoreRaw(d.Name, d.Type, d.Data, d.Length)) << "StoreRaw(" << d.Name << ")";
    // A sound neighbour: band 6 ("6") at 200 is used.
    ASSERT_TRUE(StoreRaw("6", REG_DWORD, sound200, 4));
    // Everything else is missing.
    Launch();
    ExpectNoBox("start with a damaged key");
    for (int32_t id = 0; id <= 35; ++id)
        EXPECT_EQ(id == 11 ? 200 : 128, SliderPosition(C(id))) << "slider " << id << " after a damaged load";
    EXPECT_TRUE(IsChecked(C(TalkingId))) << "Profile 0 stored: \" Talking / TV\" (104) should stay checked";
    EXPECT_TRUE(IsChecked(C(AmId))) << "Alarm_AM damaged: \"AM\" should stay checked";
    EXPECT_FALSE(IsChecked(C(StopTimeId))) << "PlayUntilOn 2 stored: \"Stop Time\" should stay unchecked";
    EXPECT_TRUE(IsChecked(C(EqLockId))) << "\"EQ Lock\" not checked after a load from an existing key";
    // What the program used is what it writes back.
    PlayOnce();
    Close();
    const struct {
        const char* Name;
        int32_t Used;
    } used[] = {{"Attenuator", 128}, {"Hardness", 128}, {"Bass", 128},  {"SubBass", 128},
                {"Treble", 128},     {"3", 128},        {"4", 128},     {"5", 128},
                {"6", 200},          {"Profile", 104},  {"PlayUntilOn", 0}, {"Alarm_AM", 1},
                {"130", 128},        {"1030", 128},     {"Alarm_Hr", 0}};
    for (const auto& u : used)
        EXPECT_EQ(u.Used, ReadNumber(u.Name)) << "value \"" << u.Name << "\" written after a damaged load";
}

TEST_F(Settings, TimeFieldsComeBackAsStoredForPlayToCheck) {
    ASSERT_TRUE(StoreNumber("Alarm_Hr", 99));
    ASSERT_TRUE(StoreNumber("Alarm_Min", -5));
    ASSERT_TRUE(StoreRaw("FadeInTime", REG_SZ, "3", 2));  // unreadable: the field stays empty
    Launch();
    EXPECT_EQ("99", TextOf(C(HourId))) << "hour field with Alarm_Hr 99 stored";
    EXPECT_EQ("-5", TextOf(C(MinuteId))) << "minute field with Alarm_Min -5 stored";
    EXPECT_EQ("", TextOf(C(FadeInFieldId))) << "fade-in field with FadeInTime stored as REG_SZ";
}

TEST_F(Settings, AUserWhoMayNotWriteTheMachineKeyKeepsSettingsInTheirOwnKey) {
    // Which key a start reads: the per-user key when there is one.
    const struct { int32_t Machine, User, Shown; } loads[] = {{0, 0, 128}, {50, 0, 50}, {0, 60, 60}, {50, 60, 60}};
    for (const auto& l : loads) {
        ASSERT_TRUE(ForgetStoredSettings());
        ASSERT_TRUE(!l.Machine || StoreNumber("Attenuator", l.Machine, HKEY_LOCAL_MACHINE));
        ASSERT_TRUE(!l.User || StoreNumber("Attenuator", l.User, HKEY_CURRENT_USER));
        Launch();
        EXPECT_EQ(l.Shown, SliderPosition(C(0))) << "volume at start with the machine's key at " << l.Machine
                                                 << " and the user's at " << l.User << " (0: no key)";
        Close();
    }
    // A save to the machine's key removes the user's older copy.
    Launch();
    PlayOnce();
    Close();
    EXPECT_FALSE(SettingsKeyExists(HKEY_CURRENT_USER)) << "HKCU\\Software\\Sombrel left after a save to HKLM";
    EXPECT_EQ(60, ReadNumber("Attenuator")) << "HKLM \"Attenuator\" after the save";
    // The machine's key refuses writing: the user's own key takes the save, silently.
    ASSERT_TRUE(DenySettingsKey(HKEY_LOCAL_MACHINE)) << "the key could not be given an empty access list";
    Launch();
    DWORD_PTR result = 0;
    SendMessageTimeoutA(P.Window, WM_HSCROLL, MAKEWPARAM(SB_THUMBPOSITION, 200), reinterpret_cast<LPARAM>(C(0)),
                        SMTO_NORMAL, 10000, &result);
    PlayOnce();
    Close();  // a box would hold the program: it must end by itself with 0
    EXPECT_EQ(200, ReadNumber("Attenuator", -1, HKEY_CURRENT_USER)) << "HKCU \"Attenuator\" after the save";
    Launch();
    EXPECT_EQ(200, SliderPosition(C(0))) << "volume at the next start";
}

TEST_F(Settings, KeysThatCannotBeCreatedAreReportedOnce) {
    ASSERT_TRUE(DenySettingsKey(HKEY_LOCAL_MACHINE)) << "the machine's key could not be given an empty access list";
    ASSERT_TRUE(DenySettingsKey(HKEY_CURRENT_USER)) << "the user's key could not be given an empty access list";
    Launch();
    ExpectNoBox("start with a key that cannot be read");
    EXPECT_FALSE(IsChecked(C(EqLockId))) << "\"EQ Lock\" checked although the key could not be opened";
    PlayOnce();
    PostMessageA(P.Window, WM_CLOSE, 0, 0);
    std::vector<std::string> texts;
    // Answer every box until the program ends; 113 boxes would take 113 answers.
    const bool ended = WaitFor([&] {
        std::vector<Box> boxes = OpenBoxes(P);
        if (!boxes.empty() && !boxes.back().Buttons.empty()) {
            texts.push_back(boxes.back().Text);
            EXPECT_EQ("Sombrel Player", boxes.back().Caption) << "caption of box " << texts.size();
            EXPECT_TRUE(boxes.back().HasIcon) << "box \"" << boxes.back().Text << "\" shows no icon";
            CloseBox(boxes.back());
        }
        return WaitForSingleObject(P.Process.hProcess, 0) == WAIT_OBJECT_0;
    }, 60000);
    EXPECT_TRUE(ended) << "the program did not end within 60 s after WM_CLOSE, " << texts.size() << " boxes answered";
    ASSERT_EQ(1u, texts.size()) << "boxes at exit with keys that cannot be created; the first was \""
                                << (texts.empty() ? "" : texts[0]) << "\"";
    EXPECT_EQ("Registry Creation Error 8734", texts[0]) << "text of the box at exit";
    DWORD code = 99;
    GetExitCodeProcess(P.Process.hProcess, &code);
    EXPECT_EQ(0u, code) << "exit code after the failed save";
}

TEST_F(Settings, ScrollFromANonBandShowsError7294AndChangesNothing) {
    Launch();
    ASSERT_TRUE(Click(P, EqPanelId));
    SendMessageA(C(EqLockId), BM_SETCHECK, BST_UNCHECKED, 0);
    SetWindowTextA(C(EqLevelId), "5");
    // A vertical scroll message naming the volume slider (id 0) as its sender.
    PostMessageA(P.Window, WM_VSCROLL, MAKEWPARAM(SB_PAGEDOWN, 0), reinterpret_cast<LPARAM>(C(0)));
    Box box;
    ASSERT_TRUE(WaitForBox(P, &box)) << "no box within 20 s after WM_VSCROLL from slider id 0";
    EXPECT_EQ("Error 7294", box.Text) << "text of the box";
    EXPECT_EQ("Sombrel Player", box.Caption) << "caption of the box";
    EXPECT_EQ(std::vector<std::string>{"OK"}, box.Buttons) << "buttons of the box";
    ASSERT_TRUE(CloseBox(box));
    ASSERT_TRUE(Settle(P)) << "the program does not answer after the box";
    EXPECT_EQ(128, SliderPosition(C(0))) << "the volume slider moved";
    EXPECT_EQ("", TextOf(C(EqLevelId))) << "level readout after Error 7294";
    EXPECT_EQ("", TextOf(C(EqFrequencyId))) << "frequency readout after Error 7294";
    ExpectNoBox("after answering Error 7294");
    // The panel still works.
    PostMessageA(P.Window, WM_VSCROLL, MAKEWPARAM(SB_THUMBPOSITION, 2), reinterpret_cast<LPARAM>(C(15)));
    ASSERT_TRUE(Settle(P));
    EXPECT_EQ("19", TextOf(C(EqLevelId))) << "level readout for band 10 at 2 (+19.84 dB)";
    EXPECT_EQ("200", TextOf(C(EqFrequencyId))) << "frequency readout for band 10";
}
