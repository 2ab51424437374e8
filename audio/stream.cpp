#include "audio/stream.h"
#include <cstring>
#include "app/commands.h"
#include "app/globals.h"
#include "engine/platform.h"

namespace {
constexpr DWORD SlotBytes = BlockFrames * 2 * sizeof(int16_t);  // 32 768

// Two boxes per failure: the call site's code with the caption it has always
// had, then the device's own description of the result.
void ReportStreamError(const char* code, const char* caption, MMRESULT result) {
    ++StreamBoxesOpen;
    MessageBoxA(MainWindow, code, caption, MB_OK);
    waveOutGetErrorTextA(result, DeviceErrorText, sizeof(DeviceErrorText));
    MessageBoxA(MainWindow, DeviceErrorText, "Sombrel Player", MB_ICONEXCLAMATION);
    --StreamBoxesOpen;
    // Hand the held-back notifications to the queue again: they run after the
    // operation that showed the box has finished and moved its slot index on,
    // in the order they came (each one releases DoneSlot, whatever it names).
    if (StreamBoxesOpen == 0) {
        while (DeferredRefills > 0) {
            --DeferredRefills;
            PostMessageA(MainWindow, MM_WOM_DONE, reinterpret_cast<WPARAM>(MainDevice), 0);
        }
    }
}

}  // namespace

void FillStreamFormat(WAVEFORMATEX* format) {
    format->wFormatTag = WAVE_FORMAT_PCM;
    format->nChannels = 2;
    format->nSamplesPerSec = SampleRate;
    format->wBitsPerSample = 16;
    format->nBlockAlign = static_cast<WORD>(format->wBitsPerSample * format->nChannels / 8);
    format->nAvgBytesPerSec = format->nBlockAlign * format->nSamplesPerSec;
    format->cbSize = 0;
}

bool StreamBoxIsOpen() { return StreamBoxesOpen > 0; }

void OpenStream(HWND receiver) {
    WriteSlot = 0;
    DoneSlot = 0;
    FillStreamFormat(&StreamFormat);
    const MMRESULT result = waveOutOpen(&MainDevice, WAVE_MAPPER, &StreamFormat,
                                        reinterpret_cast<DWORD_PTR>(receiver), 0,
                                        CALLBACK_WINDOW);
    if (result != MMSYSERR_NOERROR) ReportStreamError("Error 4528", "Sombrel Player", result);
}

void WriteBlock(const int16_t* block) {
    if (IsPlaying != 1) return;
    const int32_t slot = WriteSlot;
    std::memcpy(PcmRing[slot], block, SlotBytes);
    WAVEHDR* header = &WaveHeaders[slot];
    header->lpData = reinterpret_cast<LPSTR>(PcmRing[slot]);
    header->dwBufferLength = SlotBytes;
    header->dwFlags = 0;
    header->dwLoops = 1;
    MMRESULT result = waveOutPrepareHeader(MainDevice, header, sizeof(WAVEHDR));
    if (result != MMSYSERR_NOERROR) ReportStreamError("Error 4529", "Sombrel", result);
    result = waveOutWrite(MainDevice, header, sizeof(WAVEHDR));
    if (result == MMSYSERR_NOERROR)
        ++BuffersQueued;
    else
        ReportStreamError("Error 4530", "Sombrel", result);
    // Moves on after a failure too: the slot order is never resynchronised.
    WriteSlot = (slot + 1) % 3;
}

void ReleaseDoneBlock() {
    const int32_t slot = DoneSlot;
    const MMRESULT result = waveOutUnprepareHeader(MainDevice, &WaveHeaders[slot], sizeof(WAVEHDR));
    if (result != MMSYSERR_NOERROR) ReportStreamError("Error 4531", "Sombrel", result);
    DoneSlot = (slot + 1) % 3;
}

void StopStream() {
    if (IsPlaying != 1) return;
    MMRESULT result = waveOutReset(MainDevice);
    if (result != MMSYSERR_NOERROR) ReportStreamError("Error 4534", "Sombrel Player", result);
    IsPlaying = 0;
    // Every buffer the device held comes back with a notification of its
    // own, posted now but dispatched later (see OnBufferDone).
    HandedBack += BuffersQueued;
    BuffersQueued = 0;
    for (int32_t i = 0; i < 3; ++i) {
        // A header that was never prepared is left alone by the device.
        result = waveOutUnprepareHeader(MainDevice, &WaveHeaders[i], sizeof(WAVEHDR));
        if (result != MMSYSERR_NOERROR) ReportStreamError("Error 4532", "Sombrel", result);
    }
    result = waveOutClose(MainDevice);
    if (result != MMSYSERR_NOERROR) ReportStreamError("Error 4535", "Sombrel Player", result);
    WriteSlot = 0;
    DoneSlot = 0;
    EnableTimerControls();
    EmptyMeter(MainWindow, &MeterState);
}

// The engine's stop rule (stop time or alarm time reached inside a block).
void StopPlayback() { StopStream(); }
