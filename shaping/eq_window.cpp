#include "shaping/eq_window.h"

#include "app/core_state.h"
#include "app/globals.h"
#include "shaping/eq_response.h"
#include "shaping/eq_steps.h"

namespace {
bool Checked(HWND button) { return SendMessageA(button, BM_GETCHECK, 0, 0) == BST_CHECKED; }

// Moves band k's level and its thumb together: the field first, then the thumb.
void SetBand(int32_t k, int32_t level) {
    ControlSettings.Value[EqBandFirst + k] = level;
    SetScrollPos(SliderBars[EqBandFirst + k], SB_CTL, level, TRUE);
}

void ShowNumber(HWND readout, int32_t number) {
    char text[16];
    wsprintfA(text, "%d", number);
    SetWindowTextA(readout, text);
}
}  // namespace

void ScrollEqBand(HWND slider, int32_t request, int32_t thumb) {
    // Locked or defeated: nothing moves, nothing is stored, nothing rebuilt.
    if (Checked(EqLockBox) || Checked(EqDefeatButton)) return;
    const int32_t id = static_cast<int32_t>(GetWindowLongA(slider, GWL_ID));
    if (!IsEqBandId(id)) {
        // No band of the panel sent this: there is no level to change.
        UpdateEqReadouts(&ControlSettings, &SynthState, id);
        return;
    }
    const int32_t level = SteppedBandLevel(ControlSettings.Value[id], request, thumb);
    SetBand(id - EqBandFirst, level);
    // Also for end-of-scrolling: releasing a slider costs one more rebuild.
    UpdateEqReadouts(&ControlSettings, &SynthState, id);
    StoreEqMemory();
    EqChanged = 1;
}

void SelectEqMemory(int32_t id) {
    if (id != EqDefeatId && (id < EqMemory1Id || id > EqMemory1Id + 2)) return;
    for (int32_t m = 0; m < 3; ++m) SendMessageA(EqMemoryButtons[m], BM_SETCHECK, BST_UNCHECKED, 0);
    SendMessageA(EqDefeatButton, BM_SETCHECK, BST_UNCHECKED, 0);
    HWND pressed = id == EqDefeatId ? EqDefeatButton : EqMemoryButtons[id - EqMemory1Id];
    SendMessageA(pressed, BM_SETCHECK, BST_CHECKED, 0);
    EqChanged = 1;
    if (id == EqDefeatId) {
        // Flat, without touching any memory: pressing a memory leaves it.
        for (int32_t k = 0; k < EqBandCount; ++k) SetBand(k, SliderNeutral);
        UpdateEqReadouts(&ControlSettings, &SynthState, EqBandFirst);
        return;
    }
    RecallEqMemory(id);
}

void UpdateEqReadouts(const ControlRecord* settings, SynthRecord* state, int32_t id) {
    if (!IsEqBandId(id)) MessageBoxA(MainWindow, "Error 7294", "Sombrel Player", MB_OK);
    for (int32_t k = 0; k < EqBandCount; ++k)
        state->EqBandLevelDb[k] = EqLevelDbFor(settings->Value[EqBandFirst + k]);
    if (!IsEqBandId(id)) {
        SetWindowTextA(EqLevelReadout, "");
        SetWindowTextA(EqFrequencyReadout, "");
        return;
    }
    const int32_t k = id - EqBandFirst;
    ShowNumber(EqLevelReadout, ReadoutNumber(state->EqBandLevelDb[k]));
    ShowNumber(EqFrequencyReadout, ReadoutNumber(state->EqBandFrequency[k]));
}

void RecallEqMemory(int32_t id) {
    if (id < EqMemory1Id || id > EqMemory1Id + 2) return;
    const int32_t m = id - EqMemory1Id;
    for (int32_t k = 0; k < EqBandCount; ++k) SetBand(k, EqMemories[m][k]);
    UpdateEqReadouts(&ControlSettings, &SynthState, EqBandFirst);
}

void StoreEqMemory() {
    for (int32_t m = 0; m < 3; ++m) {
        if (!Checked(EqMemoryButtons[m])) continue;
        for (int32_t k = 0; k < EqBandCount; ++k)
            EqMemories[m][k] = ControlSettings.Value[EqBandFirst + k];
    }
}
