#include "app/controls.h"
#include "app/core_state.h"
#include "app/globals.h"

namespace {
constexpr DWORD ChildStyle = WS_CHILD | WS_VISIBLE;

HWND MakeChild(HWND parent, HINSTANCE instance, const char* cls, const char* text, DWORD style,
               int32_t id) {
    return CreateWindowExA(0, cls, text, ChildStyle | style, 0, 0, 0, 0, parent,
                           reinterpret_cast<HMENU>(static_cast<INT_PTR>(id)), instance, nullptr);
}

HWND MakeIconButton(HWND parent, HINSTANCE instance, int32_t id, int32_t iconId) {
    HWND button = MakeChild(parent, instance, "Button", "", WS_TABSTOP | BS_ICON, id);
    ButtonIcons[iconId - AppIconId] = LoadIconA(instance, MAKEINTRESOURCEA(iconId));
    SendMessageA(button, BM_SETIMAGE, IMAGE_ICON,
                 reinterpret_cast<LPARAM>(ButtonIcons[iconId - AppIconId]));
    return button;
}

void Place(HWND control, int32_t x, int32_t y, int32_t w, int32_t h) {
    MoveWindow(control, x, y, w, h, TRUE);
}

// The panel's controls that hiding and showing touch; the memory buttons,
// EQ Defeat and the close button lie below a 270-high client area anyway.
void ShowPanelControls(int command) {
    for (int32_t id = EqBandFirst; id <= EqBandLast; ++id) ShowWindow(SliderBars[id], command);
    ShowWindow(EqFrame, command);
    ShowWindow(EqLockBox, command);
    ShowWindow(EqFrequencyReadout, command);
    ShowWindow(EqLevelReadout, command);
    ShowWindow(EqLevelLabel, command);
    ShowWindow(EqFrequencyLabel, command);
}
}  // namespace

void CreateIconButtons(HWND window, HINSTANCE instance) {
    PlayButton = MakeIconButton(window, instance, PlayId, PlayIconId);
    StopButton = MakeIconButton(window, instance, StopId, StopIconId);
    EqPanelButton = MakeIconButton(window, instance, EqPanelId, EqPanelIconId);
    ChimeButton = MakeIconButton(window, instance, ChimeTestId, ChimeIconId);
    HelpButton = MakeIconButton(window, instance, HelpId, HelpIconId);
    EqCloseButton = MakeIconButton(window, instance, EqCloseId, EqCloseIconId);
}

void CreateRemainingControls(HWND w, HINSTANCE in) {
    StopTimeGroup = MakeChild(w, in, "Button", "", BS_GROUPBOX, 0);
    StopTimeBox = MakeChild(w, in, "Button", "Stop Time", BS_AUTOCHECKBOX, StopTimeId);
    AmButton = MakeChild(w, in, "Button", "AM", BS_RADIOBUTTON, AmId);
    PmButton = MakeChild(w, in, "Button", "PM", BS_RADIOBUTTON, PmId);
    AlarmBox = MakeChild(w, in, "Button", "Alarm", BS_AUTOCHECKBOX, AlarmId);

    ProfileGroup = MakeChild(w, in, "Button", "Masking Profile", BS_GROUPBOX, 0);
    static const char* const profileTexts[ProfileButtonCount] = {
        " White ", " Pink", " Red", " Brown", " Talking / TV", " Music", " Dogs", " Traffic"};
    for (int32_t i = 0; i < ProfileButtonCount; ++i)
        ProfileButtons[i] = MakeChild(w, in, "Button", profileTexts[i], BS_RADIOBUTTON,
                                      ProfileFirstId + i);

    // Plain fields: no digit-only style, no limit, no horizontal scrolling;
    // the check at Play decides what is acceptable.
    HourField = MakeChild(w, in, "edit", nullptr, WS_BORDER, HourFieldId);
    MinuteField = MakeChild(w, in, "edit", nullptr, WS_BORDER, MinuteFieldId);
    FadeInField = MakeChild(w, in, "edit", nullptr, WS_BORDER, FadeInFieldId);
    FadeOutField = MakeChild(w, in, "edit", nullptr, WS_BORDER, FadeOutFieldId);
    FadeInBox = MakeChild(w, in, "Button", "Fade In", BS_AUTOCHECKBOX, FadeInId);
    FadeOutBox = MakeChild(w, in, "Button", "Fade Out", BS_AUTOCHECKBOX, FadeOutId);

    HourLabel = MakeChild(w, in, "static", " HR", 0, 0);
    MinuteLabel = MakeChild(w, in, "static", " MIN", 0, 0);
    FadeInLabel = MakeChild(w, in, "static", " MIN", 0, 0);
    FadeOutLabel = MakeChild(w, in, "static", " MIN", 0, 0);
    static const char* const sliderTexts[5] = {" Volume", " Hardness", " Bass", " Sub Bass",
                                               " Treble"};
    for (int32_t i = 0; i < 5; ++i) SliderLabels[i] = MakeChild(w, in, "static", sliderTexts[i], 0, 0);

    for (int32_t id = 0; id < EqBandFirst; ++id)
        SliderBars[id] = MakeChild(w, in, "scrollbar", nullptr, WS_TABSTOP | SBS_HORZ, id);
    for (int32_t id = EqBandFirst; id <= EqBandLast; ++id)
        SliderBars[id] = MakeChild(w, in, "scrollbar", nullptr, WS_TABSTOP | SBS_VERT, id);

    // The equaliser panel's own controls.
    EqLockBox = MakeChild(w, in, "Button", "EQ Lock", BS_AUTOCHECKBOX, EqLockId);
    EqFrame = MakeChild(w, in, "Button", "WYSIWYG 31 Band Graphic Equalizer", BS_GROUPBOX, 0);
    EqFrequencyReadout = MakeChild(w, in, "edit", "", WS_BORDER, EqFrequencyId);
    EqLevelReadout = MakeChild(w, in, "edit", "", WS_BORDER, EqLevelId);
    EqLevelLabel = MakeChild(w, in, "static", " Level (dB)", 0, 0);
    EqFrequencyLabel = MakeChild(w, in, "static", " Frequency (Hz)", 0, 0);
    static const char* const memoryTexts[3] = {" M1", " M2", " M3"};
    for (int32_t m = 0; m < 3; ++m)
        EqMemoryButtons[m] = MakeChild(w, in, "Button", memoryTexts[m], BS_RADIOBUTTON,
                                       EqMemory1Id + m);
    EqDefeatButton = MakeChild(w, in, "Button", " EQ Defeat", BS_RADIOBUTTON, EqDefeatId);
}

void SetStartPositions() {
    SendMessageA(EqMemoryButtons[0], BM_SETCHECK, BST_CHECKED, 0);
    for (int32_t id = 0; id < SliderCount; ++id) {
        SetScrollRange(SliderBars[id], SB_CTL, SliderMin, SliderMax, FALSE);
        SetScrollPos(SliderBars[id], SB_CTL, SliderNeutral, FALSE);
    }
    SendMessageA(AmButton, BM_SETCHECK, BST_CHECKED, 0);
    ControlSettings.Value[Alarm_AM] = 1;
    ControlSettings.Value[Alarm_PM] = 0;
    SendMessageA(ProfileButtons[ProfileTalking - ProfileWhite], BM_SETCHECK, BST_CHECKED, 0);
    ControlSettings.Value[Profile] = ProfileTalking;
}

void LayoutWindow(HWND window) {
    // Dragging the frame changes nothing: the size is imposed again. When
    // the size does change, MoveWindow sends a nested WM_SIZE, which finds
    // it already right.
    RECT outer;
    GetWindowRect(window, &outer);
    MoveWindow(window, outer.left, outer.top, WindowWidth, PanelHeight, TRUE);

    for (int32_t id = 0; id < EqBandFirst; ++id) {
        Place(SliderBars[id], 10, 70 + 30 * id, 200, 20);
        Place(SliderLabels[id], 215, 70 + 30 * id, 100, 20);
    }
    for (int32_t k = 0; k < EqBandCount; ++k)
        Place(SliderBars[EqBandFirst + k], 20 + 23 * k, 285, 18, 185);
    Place(EqLockBox, 35, 245, 100, 30);
    Place(EqFrame, 10, 230, 730, 300);
    Place(EqFrequencyReadout, 200, 255, 60, 20);
    Place(EqLevelReadout, 460, 255, 60, 20);
    Place(EqLevelLabel, 530, 255, 100, 20);
    Place(EqFrequencyLabel, 270, 255, 150, 20);
    for (int32_t m = 0; m < 3; ++m) Place(EqMemoryButtons[m], 170 + 60 * m, 495, 60, 25);
    Place(EqDefeatButton, 20, 495, 150, 25);

    Place(PlayButton, 10, 20, 40, 40);
    Place(StopButton, 50, 20, 40, 40);
    Place(EqPanelButton, 90, 20, 40, 40);
    Place(ChimeButton, 535, 32, 16, 16);
    Place(HelpButton, 695, 20, 40, 40);
    Place(EqCloseButton, 690, 240, 40, 40);

    Place(StopTimeGroup, 135, 15, 515, 45);
    Place(StopTimeBox, 145, 30, 100, 20);
    Place(HourField, 255, 30, 30, 20);
    Place(HourLabel, 290, 30, 40, 20);
    Place(MinuteField, 330, 30, 30, 20);
    Place(MinuteLabel, 370, 30, 40, 20);
    Place(AmButton, 425, 30, 50, 20);
    Place(PmButton, 475, 30, 50, 20);
    Place(AlarmBox, 554, 30, 80, 20);

    Place(ProfileGroup, 320, 70, 330, 110);
    for (int32_t i = 0; i < 4; ++i) Place(ProfileButtons[i], 340, 95 + 20 * i, 100, 20);
    for (int32_t i = 4; i < ProfileButtonCount; ++i)
        Place(ProfileButtons[i], 470, 95 + 20 * (i - 4), 175, 20);

    Place(FadeInBox, 320, 190, 80, 20);
    Place(FadeInField, 405, 190, 40, 20);
    Place(FadeInLabel, 445, 190, 40, 20);
    Place(FadeOutBox, 500, 190, 80, 20);
    Place(FadeOutField, 600, 190, 40, 20);
    Place(FadeOutLabel, 640, 190, 40, 20);

    SetMeterRectangles(&MeterState);
}

void HideEqPanel(HWND window) {
    ShowPanelControls(SW_HIDE);
    PanelHeight = PanelClosedHeight;
    SendMessageA(window, WM_SIZE, 0, 0);
}

void ShowEqPanel(HWND window) {
    ShowPanelControls(SW_HIDE);
    ShowPanelControls(SW_SHOW);
    PanelHeight = PanelOpenHeight;
    SendMessageA(window, WM_SIZE, 0, 0);
}
