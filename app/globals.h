// app/globals.h: the Windows program's process-wide state, declared once.
//
// Everything here lives from static initialisation to the end of the
// process; nothing is freed. The portable state the engine reaches
// (ControlSettings, CachedSettings, SynthState, EqChanged, EqMemories) is in
// app/core_state.h. One thread touches all of it.
#pragma once
#include <cstdint>
#include <windows.h>
#include <mmsystem.h>
#include "app/control_settings.h"
#include "app/ids.h"
#include "app/meter.h"
#include "engine/synth_state.h"

// Program state flags.
extern uint8_t IsPlaying;            // the main stream is running
extern uint8_t IsChiming;            // the alarm chime is playing on its own device
extern int32_t ChimeBuffersDone;     // chime done-notifications counted so far
extern uint8_t HasPlayed;            // Play was started at least once in this run
extern uint8_t SettingsLoaded;       // the stored settings were read (once per run)
extern int32_t PanelHeight;          // outer window height: 270 closed, 580 with the equaliser
extern uint8_t FieldValid[4];        // minute, hour, fade-in, fade-out field passed its last check

// Shared with the chime.
extern HWND MainWindow;              // the one window: owner of every box, receiver of both devices
extern HWAVEOUT ChimeDevice;         // the chime's own open wave-out device
extern WAVEFORMATEX StreamFormat;    // filled before either device is opened
extern char DeviceErrorText[400];    // the device's own text of its last failure

// Main stream (audio/stream.cpp works on these).
extern HWAVEOUT MainDevice;                  // open wave-out device of the rain
extern WAVEHDR WaveHeaders[3];               // header i belongs to ring slot i
extern int16_t PcmRing[3][BlockFrames * 2];  // three blocks of 8192 stereo frames
extern int32_t WriteSlot;                    // ring slot the next block is copied into
extern int32_t DoneSlot;                     // ring slot the next done-notification releases
extern int32_t StreamBoxesOpen;              // stream error boxes now on screen (they dispatch messages)
extern int32_t DeferredRefills;              // done-notifications held back while such a box was open
extern int32_t BuffersQueued;                // buffers the main device holds (written, not yet done)
extern int32_t HandedBack;                   // done-notifications still to come for buffers a stop handed back

// Text buffers.
extern char MessageText[200];        // formatting buffer for registry messages
extern char ModulePath[500];         // the program's path, cut to its directory for Help

// Controls: slider handles by id (= ControlSettings field) and every other child.
extern HWND SliderBars[SliderCount];         // ids 0..4 main sliders, 5..35 equaliser bands
extern HWND SliderLabels[5];                 // " Volume" .. " Treble"
extern HWND PlayButton;                      // icon 102, id 1030
extern HWND StopButton;                      // icon 103, id 1031
extern HWND EqPanelButton;                   // icon 107, id 1055
extern HWND ChimeButton;                     // icon 105, id 1029
extern HWND HelpButton;                      // icon 104, id 1051
extern HWND EqCloseButton;                   // icon 108, id 1069
extern HWND StopTimeGroup;                   // frame around the stop-time row
extern HWND StopTimeBox;                     // "Stop Time" check box
extern HWND HourField;                       // hour edit field
extern HWND HourLabel;                       // " HR"
extern HWND MinuteField;                     // minute edit field
extern HWND MinuteLabel;                     // " MIN" beside the minute field
extern HWND AmButton;                        // "AM" radio button
extern HWND PmButton;                        // "PM" radio button
extern HWND AlarmBox;                        // "Alarm" check box
extern HWND ProfileGroup;                    // "Masking Profile" frame
extern HWND ProfileButtons[ProfileButtonCount]; // " White " .. " Traffic", ids 1043..1050
extern HWND FadeInBox;                       // "Fade In" check box
extern HWND FadeInField;                     // fade-in minutes field
extern HWND FadeInLabel;                     // " MIN" beside it
extern HWND FadeOutBox;                      // "Fade Out" check box
extern HWND FadeOutField;                    // fade-out minutes field
extern HWND FadeOutLabel;                    // " MIN" beside it
extern HWND EqLockBox;                       // "EQ Lock" check box
extern HWND EqFrame;                         // "WYSIWYG 31 Band Graphic Equalizer" frame
extern HWND EqFrequencyReadout;              // band frequency readout
extern HWND EqLevelReadout;                  // band level readout
extern HWND EqLevelLabel;                    // " Level (dB)"
extern HWND EqFrequencyLabel;                // " Frequency (Hz)"
extern HWND EqMemoryButtons[3];              // " M1", " M2", " M3"
extern HWND EqDefeatButton;                  // " EQ Defeat"

// Resources made once at window creation.
extern HICON ButtonIcons[8];                 // icons 102..108 by (id - 101); [0] unused
extern HBRUSH WhiteFieldBrush;               // background of a time field shown normally
extern HBRUSH RedFieldBrush;                 // background of a time field that failed its check

// The level meter.
extern MeterRecord MeterState;               // rectangles, brushes and peaks of the meter
