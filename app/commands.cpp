#include "app/commands.h"
#include "app/controls.h"
#include "app/core_state.h"
#include "app/globals.h"
#include "timers/time_fields.h"
#include "audio/stream.h"
#include "engine/block.h"
#include "engine/platform.h"
#include "shaping/eq_window.h"
#include "timers/chime_win.h"
#include "timers/timer_gains.h"

namespace {
const char AboutText[] =
    "Sombrel Player 1.00\n\n"
    "Continuous synthesised rain to mask talking, television, music, dogs and "
    "traffic. Sombrel Player is owned and distributed by the Sombrel Player "
    "developers. For support, write to support@sombrel.example.";

// Profile value of each radio button, in id order: Dogs (1049) is 107 and
// Traffic (1050) is 106, although Dogs comes first.
constexpr int32_t ProfileOfButton[ProfileButtonCount] = {
    ProfileWhite, ProfilePink, ProfileRed, ProfileBrown,
    ProfileTalking, ProfileMusic, ProfileDogs, ProfileTraffic};

int32_t CheckState(HWND box) {
    return static_cast<int32_t>(SendMessageA(box, BM_GETCHECK, 0, 0));
}

void SetCheck(HWND button, bool on) {
    SendMessageA(button, BM_SETCHECK, on ? BST_CHECKED : BST_UNCHECKED, 0);
}

void SelectProfile(int32_t id) {
    for (int32_t i = 0; i < ProfileButtonCount; ++i) SetCheck(ProfileButtons[i], false);
    SetCheck(ProfileButtons[id - ProfileFirstId], true);
    ControlSettings.Value[Profile] = ProfileOfButton[id - ProfileFirstId];
}

void ChimeTest() {
    if (IsPlaying || IsChiming) return;
    StartChime();
}

void StopCommand() {
    if (IsPlaying == 1) StopStream();
}

void PickAm(bool am) {
    SetCheck(am ? PmButton : AmButton, false);
    SetCheck(am ? AmButton : PmButton, true);
    ControlSettings.Value[Alarm_AM] = am ? 1 : 0;
    ControlSettings.Value[Alarm_PM] = am ? 0 : 1;
}

void ToggleEqPanel(HWND window) {
    // Opening or closing always locks the equaliser sliders first.
    SetCheck(EqLockBox, true);
    if (PanelHeight == PanelOpenHeight)
        HideEqPanel(window);
    else
        ShowEqPanel(window);
}
}  // namespace

bool RunCommand(HWND window, int32_t id) {
    if (id >= ProfileFirstId && id <= ProfileLastId) {
        SelectProfile(id);
        return true;
    }
    switch (id) {
    case ChimeTestId: ChimeTest(); return true;
    case PlayId: PlaySequence(window); return true;
    case StopId: StopCommand(); return true;
    case AlarmId:
        ControlSettings.Value[AlarmOn] = CheckState(AlarmBox);
        EnableFadeOutControls();
        ShowChimeButton();
        return true;
    // Any notification of a field (typing, focus, new text) takes its red away.
    case HourFieldId: FieldValid[1] = 1; return true;
    case MinuteFieldId: FieldValid[0] = 1; return true;
    case FadeInFieldId: FieldValid[2] = 1; return true;
    case FadeOutFieldId: FieldValid[3] = 1; return true;
    case AmId: PickAm(true); return true;
    case PmId: PickAm(false); return true;
    case StopTimeId:
        ControlSettings.Value[PlayUntilOn] = CheckState(StopTimeBox);
        EnableFadeOutControls();
        return true;
    case FadeInId: ControlSettings.Value[FadeInOn] = CheckState(FadeInBox); return true;
    case FadeOutId: ControlSettings.Value[FadeOutOn] = CheckState(FadeOutBox); return true;
    case HelpId: HelpSequence(); return true;
    case EqPanelId: ToggleEqPanel(window); return true;
    case EqCloseId: HideEqPanel(window); return true;
    case EqMemory1Id:
    case EqMemory1Id + 1:
    case EqMemory1Id + 2:
    case EqDefeatId: SelectEqMemory(id); return true;
    default: return false;
    }
}

void PlaySequence(HWND window) {
    if (IsPlaying || IsChiming) return;
    if (ValidateTimeFields() != 1) return;
    IsPlaying = 1;
    HasPlayed = 1;
    SetUpTimers(&ControlSettings, &SynthState);
    DisableTimerControls();
    PrepareForPlay(&ControlSettings, &SynthState);
    OpenStream(window);
    for (int32_t i = 0; i < 2; ++i) {
        ProcessBlock(&ControlSettings, &CachedSettings, &SynthState);
        WriteBlock(SynthState.PcmBlock);
    }
}

void HelpSequence() {
    MessageBoxA(MainWindow, AboutText, "Sombrel Player", MB_OK);
    DWORD n = GetModuleFileNameA(nullptr, ModulePath, sizeof(ModulePath));
    // A path that fills the buffer comes back cut to its size, and position n
    // would then lie past the end: start the scan at the last character.
    if (n >= sizeof(ModulePath)) n = sizeof(ModulePath) - 1;
    // Cut the path at its last backslash to keep the directory; positions
    // 0..2 are the drive ("C:\") and stay.
    if (n > 2) {
        for (DWORD i = n; i > 2; --i) {
            if (ModulePath[i] == '\\') {
                ModulePath[i] = '\0';
                break;
            }
        }
    }
    // A missing manual is the shell's business: the program says nothing.
    ShellExecuteA(nullptr, "open", "Sombrel.pdf", nullptr, ModulePath, SW_SHOWDEFAULT);
}

void StepMainSlider(HWND slider, int32_t code, int32_t position) {
    const int32_t id = static_cast<int32_t>(GetWindowLongA(slider, GWL_ID));
    if (id < 0 || id >= EqBandFirst) return;
    int32_t& value = ControlSettings.Value[id];
    switch (code) {
    case SB_LINELEFT: value = value - 5 < SliderMin ? SliderMin : value - 5; break;
    case SB_LINERIGHT: value = value + 5 > SliderMax ? SliderMax : value + 5; break;
    case SB_PAGELEFT: value = value - 25 < SliderMin ? SliderMin : value - 25; break;
    case SB_PAGERIGHT: value = value + 25 > SliderMax ? SliderMax : value + 25; break;
    case SB_THUMBPOSITION:
    case SB_THUMBTRACK: value = position; break;
    default: break;
    }
    SetScrollPos(slider, SB_CTL, value, TRUE);
}

void OnBufferDone(HWAVEOUT device) {
    // Buffers handed back by a stop come first in the queue, and they are
    // neither refills nor chime buffers. Telling them by IsPlaying alone is
    // not enough: a Play handled before they are dispatched would take them
    // as refills of its new stream (releasing slots the device still plays),
    // and a chime device opened right after the stop may get the same handle
    // value, so they would be counted as chime buffers and end it early.
    if (HandedBack > 0) {
        --HandedBack;
        return;
    }
    if (IsPlaying == 1) {
        // While the main stream plays the chime cannot, so this is the main
        // stream's buffer. A stream error box being open means an operation
        // stands half done behind it: refill after it, not inside it.
        if (StreamBoxIsOpen()) {
            ++DeferredRefills;
            return;
        }
        --BuffersQueued;
        ReleaseDoneBlock();
        ProcessBlock(&ControlSettings, &CachedSettings, &SynthState);
        WriteBlock(SynthState.PcmBlock);  // nothing if the block hit the stop time
        return;
    }
    if (IsChiming == 1 && device == ChimeDevice) OnChimeBufferDone(device);
}

void DisableTimerControls() {
    HWND refused[] = {StopTimeBox, HourField, MinuteField, AmButton, PmButton, AlarmBox,
                      FadeInField, FadeInBox, FadeOutField, FadeOutBox, ChimeButton};
    for (HWND control : refused) EnableWindow(control, FALSE);
}

void EnableTimerControls() {
    HWND restored[] = {StopTimeBox, HourField, MinuteField, AmButton, PmButton, AlarmBox,
                       FadeInField, FadeInBox, ChimeButton};
    for (HWND control : restored) EnableWindow(control, TRUE);
    EnableFadeOutControls();
}
