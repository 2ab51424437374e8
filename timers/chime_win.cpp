// The alarm chime on a wave-out device of its own. All 32 buffers are queued
// at once and never refilled; the device posts one MM_WOM_DONE per buffer to
// the main window, and the 32nd closes the device.
//
//   Idle --StartChime--> Chiming (32 queued) --32nd done--> Idle, CloseChime
//                          |
//                          +--a device call fails--> Idle, device closed
#include "timers/chime_win.h"

#include "app/core_state.h"
#include "app/globals.h"
#include "audio/stream.h"
#include "engine/platform.h"
#include "timers/chime.h"

namespace {

constexpr DWORD ChimeBufferBytes = ChimeBufferFrames * 2 * sizeof(int16_t);  // 32 768

WAVEHDR ChimeHeaders[ChimeBufferCount];  // header i plays frames 8192 i .. 8192 i + 8191 of ChimePcm

// Two boxes per failure: the call site's code, then the device's own text.
void ReportChimeError(const char* code, MMRESULT result) {
    MessageBoxA(MainWindow, code, "Sombrel Player", MB_OK);
    waveOutGetErrorTextA(result, DeviceErrorText, sizeof(DeviceErrorText));
    MessageBoxA(MainWindow, DeviceErrorText, "Sombrel Player", MB_ICONEXCLAMATION);
}

// After a failed call fewer than 32 done-messages would come and the chime
// would never end, refusing Play for the rest of the run: end it now. The
// written buffers whose done-messages were not counted yet (some may have
// come while the error box was open) will still arrive; they are counted as
// handed back, so that a Play made before they arrive does not take them for
// its own.
void AbandonChime(bool opened, int32_t written) {
    IsChiming = 0;
    if (!opened) return;
    HandedBack += written - ChimeBuffersDone;
    waveOutReset(ChimeDevice);
    for (int32_t i = 0; i < ChimeBufferCount; ++i)
        if (ChimeHeaders[i].dwFlags & WHDR_PREPARED) waveOutUnprepareHeader(ChimeDevice, &ChimeHeaders[i], sizeof(WAVEHDR));
    waveOutClose(ChimeDevice);
}
}  // namespace

void StartChime() {
    if (IsPlaying == 1 || IsChiming == 1) return;
    IsChiming = 1;
    ChimeBuffersDone = 0;
    // Several million sines: the window does not answer meanwhile.
    SynthState.ChimePeak = MakeChime(ControlSettings.Value[Attenuator]);

    FillStreamFormat(&StreamFormat);
    MMRESULT result = waveOutOpen(&ChimeDevice, WAVE_MAPPER, &StreamFormat,
                                  reinterpret_cast<DWORD_PTR>(MainWindow), 0, CALLBACK_WINDOW);
    if (result != MMSYSERR_NOERROR) {
        ReportChimeError("Error 4558", result);
        AbandonChime(false, 0);
        return;
    }
    // ChimePcm is the playback area itself: nothing rewrites it until the
    // chime has ended, since StartChime refuses to run while it plays.
    for (int32_t i = 0; i < ChimeBufferCount; ++i) ChimeHeaders[i] = WAVEHDR{};
    for (int32_t i = 0; i < ChimeBufferCount; ++i) {
        WAVEHDR* header = &ChimeHeaders[i];
        header->lpData = reinterpret_cast<LPSTR>(ChimePcm + 2 * ChimeBufferFrames * i);
        header->dwBufferLength = ChimeBufferBytes;
        header->dwFlags = 0;
        header->dwLoops = 1;
        result = waveOutPrepareHeader(ChimeDevice, header, sizeof(WAVEHDR));
        if (result != MMSYSERR_NOERROR) {
            ReportChimeError("Error 4559", result);
            AbandonChime(true, i);
            return;
        }
        result = waveOutWrite(ChimeDevice, header, sizeof(WAVEHDR));
        if (result != MMSYSERR_NOERROR) {
            ReportChimeError("Error 4560", result);
            AbandonChime(true, i);
            return;
        }
    }
}

void OnChimeBufferDone(HWAVEOUT) {
    ChimeBuffersDone += 1;
    if (ChimeBuffersDone == ChimeBufferCount) {
        IsChiming = 0;
        CloseChime();
    }
}

void CloseChime() {
    MMRESULT result = waveOutReset(ChimeDevice);
    if (result != MMSYSERR_NOERROR) ReportChimeError("Error 4534", result);
    for (int32_t i = 0; i < ChimeBufferCount; ++i) {
        result = waveOutUnprepareHeader(ChimeDevice, &ChimeHeaders[i], sizeof(WAVEHDR));
        if (result != MMSYSERR_NOERROR) ReportChimeError("Error 4551", result);
    }
    result = waveOutClose(ChimeDevice);
    if (result != MMSYSERR_NOERROR) ReportChimeError("Error 4535", result);
}
