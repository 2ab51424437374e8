#include "tests/program/driver.h"
#include "tests/program/window_ids.h"
#include <winternl.h>
#include <cstdio>
#include <cstring>

DriverConfig Config;

namespace {
const char MainClass[] = "Sombrel Player";

struct FindMain {
    DWORD ProcessId;
    HWND Found;
};

BOOL CALLBACK FindMainWindow(HWND window, LPARAM data) {
    FindMain* find = reinterpret_cast<FindMain*>(data);
    DWORD pid = 0;
    GetWindowThreadProcessId(window, &pid);
    if (pid == find->ProcessId && ClassOf(window) == MainClass && IsWindowVisible(window)) {
        find->Found = window;
        return FALSE;
    }
    return TRUE;
}

struct BoxSearch {
    DWORD ProcessId;
    std::vector<HWND> Found;
};

BOOL CALLBACK FindBoxes(HWND window, LPARAM data) {
    BoxSearch* search = reinterpret_cast<BoxSearch*>(data);
    DWORD pid = 0;
    GetWindowThreadProcessId(window, &pid);
    if (pid == search->ProcessId && IsWindowVisible(window) && ClassOf(window) == "#32770")
        search->Found.push_back(window);
    return TRUE;
}

struct ChildSearch {
    const char* Class;
    const char* Text;
    HWND Found;
};

BOOL CALLBACK FindChild(HWND window, LPARAM data) {
    ChildSearch* search = reinterpret_cast<ChildSearch*>(data);
    if (ClassOf(window) == search->Class && TextOf(window) == search->Text) {
        search->Found = window;
        return FALSE;
    }
    return TRUE;
}

struct SliderSearch {
    int32_t Id;
    HWND Found;
};

BOOL CALLBACK FindSlider(HWND window, LPARAM data) {
    SliderSearch* search = reinterpret_cast<SliderSearch*>(data);
    if (GetDlgCtrlID(window) == search->Id && _stricmp(ClassOf(window).c_str(), "ScrollBar") == 0) {
        search->Found = window;
        return FALSE;
    }
    return TRUE;
}

struct WindowTally {
    DWORD ProcessId;
    int32_t Count;
};

BOOL CALLBACK CountChild(HWND, LPARAM data) {
    ++reinterpret_cast<WindowTally*>(data)->Count;
    return TRUE;
}

BOOL CALLBACK CountTopLevel(HWND window, LPARAM data) {
    WindowTally* tally = reinterpret_cast<WindowTally*>(data);
    DWORD pid = 0;
    GetWindowThreadProcessId(window, &pid);
    if (pid == tally->ProcessId) {
        ++tally->Count;
        EnumChildWindows(window, CountChild, data);
    }
    return TRUE;
}

std::string StripAmpersand(std::string text) {
    std::string out;
    for (char c : text)
        if (c != '&') out += c;
    return out;
}

struct BoxParts {
    Box* Target;
};

BOOL CALLBACK ReadBoxChild(HWND child, LPARAM data) {
    Box* box = reinterpret_cast<BoxParts*>(data)->Target;
    const std::string cls = ClassOf(child);
    const LONG style = GetWindowLongA(child, GWL_STYLE);
    if (_stricmp(cls.c_str(), "Static") == 0) {
        if ((style & SS_TYPEMASK) == SS_ICON) {
            if (IsWindowVisible(child) && SendMessageA(child, STM_GETICON, 0, 0) != 0)
                box->HasIcon = true;
        } else if (!TextOf(child).empty()) {
            box->Text = TextOf(child);
        }
    } else if (_stricmp(cls.c_str(), "Button") == 0 && IsWindowVisible(child)) {
        box->Buttons.push_back(StripAmpersand(TextOf(child)));
    }
    return TRUE;
}
}  // namespace

std::string WindowsPath(const std::string& path) {
    if (path.empty() || path[0] != '/') return path;
    std::string out = "Z:";
    for (char c : path) out += c == '/' ? '\\' : c;
    return out;
}

bool LaunchProgram(Program* program, const std::string& exe) {
    std::memset(program, 0, sizeof(*program));
    const std::string path = exe.empty() ? Config.ProgramPath : exe;
    std::string commandLine = "\"" + path + "\"";
    std::string directory = path.substr(0, path.find_last_of('\\'));
    STARTUPINFOA startup = {};
    startup.cb = sizeof(startup);
    LARGE_INTEGER frequency, start, shown;
    QueryPerformanceFrequency(&frequency);
    QueryPerformanceCounter(&start);
    if (!CreateProcessA(path.c_str(), &commandLine[0], nullptr, nullptr, FALSE, 0, nullptr,
                        directory.c_str(), &startup, &program->Process)) {
        std::fprintf(stderr, "CreateProcessA(%s) failed, error %lu\n", path.c_str(), GetLastError());
        return false;
    }
    FindMain find = {program->Process.dwProcessId, nullptr};
    const bool found = WaitFor([&] {
        EnumWindows(FindMainWindow, reinterpret_cast<LPARAM>(&find));
        return find.Found != nullptr;
    }, 30000);
    QueryPerformanceCounter(&shown);
    program->Window = find.Found;
    program->MillisecondsToShow =
        1000.0 * static_cast<double>(shown.QuadPart - start.QuadPart) / frequency.QuadPart;
    return found;
}

int32_t CloseProgram(Program* program, DWORD ms) {
    if (program->Process.hProcess == nullptr) return -1;
    if (program->Window != nullptr) PostMessageA(program->Window, WM_CLOSE, 0, 0);
    DWORD code = 0;
    if (WaitForSingleObject(program->Process.hProcess, ms) != WAIT_OBJECT_0) {
        TerminateProcess(program->Process.hProcess, 99);
        WaitForSingleObject(program->Process.hProcess, 5000);
        code = static_cast<DWORD>(-1);
    } else {
        GetExitCodeProcess(program->Process.hProcess, &code);
    }
    CloseHandle(program->Process.hProcess);
    CloseHandle(program->Process.hThread);
    program->Process.hProcess = nullptr;
    program->Window = nullptr;
    return static_cast<int32_t>(code);
}

void EndProgram(Program* program) {
    if (program->Process.hProcess == nullptr) return;
    TerminateProcess(program->Process.hProcess, 98);
    WaitForSingleObject(program->Process.hProcess, 5000);
    CloseHandle(program->Process.hProcess);
    CloseHandle(program->Process.hThread);
    program->Process.hProcess = nullptr;
}

HWND Control(const Program& program, int32_t id) { return GetDlgItem(program.Window, id); }

HWND Slider(const Program& program, int32_t id) {
    // The Volume slider's id is 0, which the labels and frames share, so
    // GetDlgItem may answer with one of those: look for the scroll bar.
    SliderSearch search = {id, nullptr};
    EnumChildWindows(program.Window, FindSlider, reinterpret_cast<LPARAM>(&search));
    return search.Found;
}

HWND ChildByText(const Program& program, const char* cls, const char* text) {
    ChildSearch search = {cls, text, nullptr};
    EnumChildWindows(program.Window, FindChild, reinterpret_cast<LPARAM>(&search));
    return search.Found;
}

std::string ClassOf(HWND window) {
    char name[128] = {0};
    GetClassNameA(window, name, sizeof(name));
    return name;
}

std::string TextOf(HWND window) {
    char text[512] = {0};
    DWORD_PTR length = 0;
    // WM_GETTEXT is sent: with a timeout, a busy program cannot hang the driver.
    SendMessageTimeoutA(window, WM_GETTEXT, sizeof(text), reinterpret_cast<LPARAM>(text),
                        SMTO_NORMAL, 5000, &length);
    return text;
}

RECT ClientRectOf(const Program& program, HWND child) {
    RECT r;
    GetWindowRect(child, &r);
    POINT corners[2] = {{r.left, r.top}, {r.right, r.bottom}};
    MapWindowPoints(nullptr, program.Window, corners, 2);
    return RECT{corners[0].x, corners[0].y, corners[1].x, corners[1].y};
}

RECT OuterRect(HWND window) {
    RECT r = {};
    GetWindowRect(window, &r);
    return r;
}

bool IsChecked(HWND button) {
    DWORD_PTR state = 0;
    SendMessageTimeoutA(button, BM_GETCHECK, 0, 0, SMTO_NORMAL, 5000, &state);
    return state == BST_CHECKED;
}

int32_t SliderPosition(HWND slider) {
    DWORD_PTR position = 0;
    SendMessageTimeoutA(slider, SBM_GETPOS, 0, 0, SMTO_NORMAL, 5000, &position);
    return static_cast<int32_t>(position);
}

bool Click(const Program& program, int32_t id) {
    DWORD_PTR result = 0;
    return SendMessageTimeoutA(Control(program, id), BM_CLICK, 0, 0, SMTO_NORMAL, 10000, &result) != 0;
}

void ClickAsync(const Program& program, int32_t id) {
    PostMessageA(Control(program, id), BM_CLICK, 0, 0);
}

void Scroll(const Program& program, int32_t sliderId, int32_t code, int32_t position) {
    DWORD_PTR result = 0;
    SendMessageTimeoutA(program.Window, WM_HSCROLL, MAKEWPARAM(code, position),
                        reinterpret_cast<LPARAM>(Slider(program, sliderId)), SMTO_NORMAL, 10000,
                        &result);
}

bool Settle(const Program& program, DWORD ms) {
    DWORD_PTR result = 0;
    return SendMessageTimeoutA(program.Window, WM_NULL, 0, 0, SMTO_NORMAL, ms, &result) != 0;
}

std::vector<Box> OpenBoxes(const Program& program) {
    BoxSearch search = {program.Process.dwProcessId, {}};
    EnumWindows(FindBoxes, reinterpret_cast<LPARAM>(&search));
    std::vector<Box> boxes;
    for (auto it = search.Found.rbegin(); it != search.Found.rend(); ++it) {
        Box box;
        box.Window = *it;
        box.Caption = TextOf(*it);
        box.HasIcon = false;
        BoxParts parts = {&box};
        EnumChildWindows(*it, ReadBoxChild, reinterpret_cast<LPARAM>(&parts));
        boxes.push_back(box);
    }
    return boxes;
}

bool WaitForBox(const Program& program, Box* box, DWORD ms) {
    std::vector<Box> boxes;
    if (!WaitFor([&] {
            boxes = OpenBoxes(program);
            // A box is read once it has its text: it is created empty.
            return !boxes.empty() && !boxes.back().Buttons.empty();
        }, ms))
        return false;
    *box = boxes.back();
    return true;
}

bool CloseBox(const Box& box) {
    PostMessageA(box.Window, WM_COMMAND, MAKEWPARAM(IDOK, BN_CLICKED), 0);
    return WaitFor([&] { return !IsWindow(box.Window) || !IsWindowVisible(box.Window); }, 10000);
}

int32_t KernelHandleCount(DWORD processId) {
    struct Entry {
        ULONG ProcessId;
        UCHAR ObjectType;
        UCHAR Flags;
        USHORT Handle;
        PVOID Object;
        ACCESS_MASK Access;
    };
    struct List {
        ULONG Count;
        Entry Handles[1];
    };
    static std::vector<char> buffer(1 << 23);
    ULONG length = 0;
    const auto SystemHandleList = static_cast<SYSTEM_INFORMATION_CLASS>(16);
    if (NtQuerySystemInformation(SystemHandleList, buffer.data(), static_cast<ULONG>(buffer.size()),
                                 &length) != 0)
        return -1;
    const List* list = reinterpret_cast<const List*>(buffer.data());
    int32_t count = 0;
    for (ULONG i = 0; i < list->Count; ++i)
        if (list->Handles[i].ProcessId == processId) ++count;
    return count;
}

int32_t GdiObjectCount(HANDLE process) {
    // The GDI handle table is mapped into each process and its address is in
    // the process's PEB (64-bit offset 0xF8); an entry is in use when its
    // type byte is not 0. Entries are 24 bytes: object, owner, unique, type.
    PROCESS_BASIC_INFORMATION info = {};
    ULONG length = 0;
    if (NtQueryInformationProcess(process, ProcessBasicInformation, &info, sizeof(info), &length) != 0)
        return -1;
    uint64_t table = 0;
    SIZE_T read = 0;
    if (!ReadProcessMemory(process, reinterpret_cast<char*>(info.PebBaseAddress) + 0xF8, &table,
                           sizeof(table), &read) || table == 0)
        return -1;
    constexpr size_t Entries = 65536, EntrySize = 24;
    static std::vector<uint8_t> cells(Entries * EntrySize);
    if (!ReadProcessMemory(process, reinterpret_cast<void*>(table), cells.data(), cells.size(), &read))
        return -1;
    int32_t count = 0;
    for (size_t i = 0; i < Entries; ++i)
        if (cells[i * EntrySize + 14] != 0) ++count;
    return count;
}

int32_t WindowCount(DWORD processId) {
    WindowTally tally = {processId, 0};
    EnumWindows(CountTopLevel, reinterpret_cast<LPARAM>(&tally));
    return tally.Count;
}

uint32_t Rgb(uint8_t r, uint8_t g, uint8_t b) {
    return (static_cast<uint32_t>(r) << 16) | (static_cast<uint32_t>(g) << 8) | b;
}

namespace {
bool CaptureScreenRect(int32_t x, int32_t y, int32_t width, int32_t height, Picture* picture) {
    HDC screen = GetDC(nullptr);
    HDC memory = CreateCompatibleDC(screen);
    BITMAPINFO info = {};
    info.bmiHeader.biSize = sizeof(BITMAPINFOHEADER);
    info.bmiHeader.biWidth = width;
    info.bmiHeader.biHeight = -height;  // top row first
    info.bmiHeader.biPlanes = 1;
    info.bmiHeader.biBitCount = 32;
    info.bmiHeader.biCompression = BI_RGB;
    void* bits = nullptr;
    HBITMAP bitmap = CreateDIBSection(screen, &info, DIB_RGB_COLORS, &bits, nullptr, 0);
    HGDIOBJ old = SelectObject(memory, bitmap);
    const BOOL copied = BitBlt(memory, 0, 0, width, height, screen, x, y, SRCCOPY);
    GdiFlush();
    picture->Width = width;
    picture->Height = height;
    picture->Pixels.assign(static_cast<const uint32_t*>(bits),
                           static_cast<const uint32_t*>(bits) + static_cast<size_t>(width) * height);
    for (uint32_t& p : picture->Pixels) p &= 0x00FFFFFF;
    SelectObject(memory, old);
    DeleteObject(bitmap);
    DeleteDC(memory);
    ReleaseDC(nullptr, screen);
    return copied != FALSE;
}
}  // namespace

bool CaptureClient(const Program& program, Picture* picture) {
    RECT client;
    GetClientRect(program.Window, &client);
    POINT origin = {0, 0};
    ClientToScreen(program.Window, &origin);
    return CaptureScreenRect(origin.x, origin.y, client.right, client.bottom, picture);
}

bool AskHarness(const char* request, const std::string& detail, DWORD ms) {
    if (Config.Requests.empty()) return false;
    const std::string path = Config.Requests + "\\" + request;
    const std::string done = path + ".done";
    DeleteFileA(done.c_str());
    // Written under another name and renamed, so the harness never reads a
    // request half written.
    const std::string temporary = path + ".part";
    FILE* f = std::fopen(temporary.c_str(), "wb");
    if (f == nullptr) return false;
    std::fputs(detail.c_str(), f);
    std::fclose(f);
    if (!MoveFileExA(temporary.c_str(), path.c_str(), MOVEFILE_REPLACE_EXISTING)) return false;
    return WaitFor([&] { return GetFileAttributesA(done.c_str()) != INVALID_FILE_ATTRIBUTES; }, ms);
}

int64_t FileSize(const std::string& path) {
    WIN32_FILE_ATTRIBUTE_DATA data;
    if (!GetFileAttributesExA(path.c_str(), GetFileExInfoStandard, &data)) return -1;
    return (static_cast<int64_t>(data.nFileSizeHigh) << 32) | data.nFileSizeLow;
}

bool ShowsPlaying(const Program& program) {
    for (int32_t id : DisabledWhilePlaying)
        if (IsWindowEnabled(Control(program, id))) return false;
    return true;
}

bool ShowsStopped(const Program& program) {
    for (int32_t id : DisabledWhilePlaying)
        if (id != FadeOutId && id != FadeOutFieldId && !IsWindowEnabled(Control(program, id))) return false;
    return true;
}
