#include "app/globals.h"

// Static storage: zero-filled before WinMain runs and never freed.
uint8_t IsPlaying;
uint8_t IsChiming;
int32_t ChimeBuffersDone;
uint8_t HasPlayed;
uint8_t SettingsLoaded;
int32_t PanelHeight;
uint8_t FieldValid[4];

HWND MainWindow;
HWAVEOUT ChimeDevice;
WAVEFORMATEX StreamFormat;
char DeviceErrorText[400];

HWAVEOUT MainDevice;
WAVEHDR WaveHeaders[3];
int16_t PcmRing[3][BlockFrames * 2];
int32_t WriteSlot;
int32_t DoneSlot;
int32_t StreamBoxesOpen;
int32_t DeferredRefills;
int32_t BuffersQueued;
int32_t HandedBack;

char MessageText[200];
char ModulePath[500];

HWND SliderBars[SliderCount];
HWND SliderLabels[5];
HWND PlayButton;
HWND StopButton;
HWND EqPanelButton;
HWND ChimeButton;
HWND HelpButton;
HWND EqCloseButton;
HWND StopTimeGroup;
HWND StopTimeBox;
HWND HourField;
HWND HourLabel;
HWND MinuteField;
HWND MinuteLabel;
HWND AmButton;
HWND PmButton;
HWND AlarmBox;
HWND ProfileGroup;
HWND ProfileButtons[ProfileButtonCount];
HWND FadeInBox;
HWND FadeInField;
HWND FadeInLabel;
HWND FadeOutBox;
HWND FadeOutField;
HWND FadeOutLabel;
HWND EqLockBox;
HWND EqFrame;
HWND EqFrequencyReadout;
HWND EqLevelReadout;
HWND EqLevelLabel;
HWND EqFrequencyLabel;
HWND EqMemoryButtons[3];
HWND EqDefeatButton;

HICON ButtonIcons[8];
HBRUSH WhiteFieldBrush;
HBRUSH RedFieldBrush;

MeterRecord MeterState;
