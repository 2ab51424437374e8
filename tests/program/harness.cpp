#include "tests/program/harness.h"

#include <cstdio>
#include <fstream>

std::vector<Box> Boxes;
bool (*HoldBox)(const Box&) = nullptr;

namespace {
const char KeyName[] = "Software\\Sombrel";

// A box's visible buttons and its icon (a static with SS_ICON).
BOOL CALLBACK ReadBoxChild(HWND child, LPARAM data) {
    char cls[16] = {};
    GetClassNameA(child, cls, sizeof(cls));
    Box* box = reinterpret_cast<Box*>(data);
    if (!IsWindowVisible(child)) return TRUE;
    box->Buttons += lstrcmpiA(cls, "Button") == 0;
    if (lstrcmpiA(cls, "Static") == 0 && (GetWindowLongA(child, GWL_STYLE) & SS_TYPEMASK) == SS_ICON)
        box->Icon = reinterpret_cast<HICON>(SendMessageA(child, STM_GETICON, 0, 0));
    return TRUE;
}

BOOL CALLBACK FindBox(HWND window, LPARAM data) {
    char cls[16] = {};
    GetClassNameA(window, cls, sizeof(cls));
    auto* found = reinterpret_cast<std::pair<DWORD, std::vector<HWND>>*>(data);
    DWORD pid = 0;
    GetWindowThreadProcessId(window, &pid);
    if (pid == found->first && lstrcmpA(cls, "#32770") == 0 && IsWindowVisible(window))
        found->second.insert(found->second.begin(), window);
    return TRUE;
}

void CALLBACK AnswerBox(HWND, UINT, UINT_PTR, DWORD) {
    auto own = std::make_pair(GetCurrentProcessId(), std::vector<HWND>());
    EnumThreadWindows(GetCurrentThreadId(), FindBox, reinterpret_cast<LPARAM>(&own));
    if (own.second.empty()) return;
    const Box box = ReadBox(own.second.back());
    if (box.Buttons == 0 || (HoldBox != nullptr && HoldBox(box))) return;  // not filled in yet, or held
    Boxes.push_back(box);
    PostMessageA(own.second.back(), WM_COMMAND, MAKEWPARAM(IDOK, BN_CLICKED), 0);
}

// Gives the key an empty access list (nobody may), or none (everybody may);
// an empty list still lets the owner change it.
bool SetAccess(HKEY hive, bool deny) {
    HKEY key = nullptr;
    if (RegCreateKeyExA(hive, KeyName, 0, nullptr, 0, WRITE_DAC, nullptr, &key, nullptr) != ERROR_SUCCESS) return false;
    SECURITY_DESCRIPTOR sd;
    ACL acl;
    InitializeSecurityDescriptor(&sd, SECURITY_DESCRIPTOR_REVISION);
    InitializeAcl(&acl, sizeof(acl), ACL_REVISION);
    SetSecurityDescriptorDacl(&sd, TRUE, deny ? &acl : nullptr, FALSE);
    const LONG r = RegSetKeySecurity(key, DACL_SECURITY_INFORMATION, &sd);
    RegCloseKey(key);
    return r == ERROR_SUCCESS;
}
}  // namespace

Box ReadBox(HWND box) {
    char caption[256] = {}, text[512] = {};
    GetWindowTextA(box, caption, sizeof(caption));
    GetDlgItemTextA(box, 0xFFFF, text, sizeof(text));  // the message's static text
    Box read{caption, text, nullptr, 0};
    EnumChildWindows(box, ReadBoxChild, reinterpret_cast<LPARAM>(&read));
    return read;
}

void StartAnsweringBoxes() { SetTimer(nullptr, 0, 20, AnswerBox); }

std::vector<std::string> BoxTexts() {
    std::vector<std::string> texts;
    for (const Box& box : Boxes) texts.push_back(box.Text);
    return Boxes.clear(), texts;
}

std::string WindowsPath(const std::string& path) {
    if (path.empty() || path[0] != '/') return path;
    std::string out = "Z:";
    for (char c : path) out += c == '/' ? '\\' : c;
    return out;
}

std::string WorkDir() { return WindowsPath(std::getenv("SOMBREL_WORK") ? std::getenv("SOMBREL_WORK") : "/tmp"); }

bool AskHarness(const char* request, const std::string& detail) {
    const std::string path = WorkDir() + "\\requests\\" + request;
    std::ofstream(path + ".part") << detail;
    if (!MoveFileExA((path + ".part").c_str(), path.c_str(), MOVEFILE_REPLACE_EXISTING)) return false;
    return PumpUntil([&] { return GetFileAttributesA((path + ".done").c_str()) != INVALID_FILE_ATTRIBUTES; }, 30000) &&
           DeleteFileA((path + ".done").c_str());
}

bool ForgetStoredSettings() {
    for (HKEY hive : {HKEY_LOCAL_MACHINE, HKEY_CURRENT_USER})
        if (KeyExists(hive) && SetAccess(hive, false)) RegDeleteKeyA(hive, KeyName);
    return !KeyExists(HKEY_LOCAL_MACHINE) && !KeyExists(HKEY_CURRENT_USER);
}

bool KeyExists(HKEY hive) {
    HKEY key = nullptr;
    if (RegOpenKeyExA(hive, KeyName, 0, KEY_QUERY_VALUE, &key) != ERROR_SUCCESS &&
        RegOpenKeyExA(hive, KeyName, 0, WRITE_DAC, &key) != ERROR_SUCCESS)  // a denied key exists too
        return false;
    RegCloseKey(key);
    return true;
}

bool StoreRaw(const char* name, DWORD type, const void* data, DWORD length, HKEY hive) {
    return RegSetKeyValueA(hive, KeyName, name, type, data, length) == ERROR_SUCCESS;  // the key made when missing
}

bool StoreNumber(const char* name, int32_t number, HKEY hive) {
    const std::string text = std::to_string(number) + std::string(4, '\0');
    return StoreRaw(name, REG_DWORD, text.data(), 4, hive);
}

std::string RawValue(const char* name, HKEY hive) {
    BYTE data[64];
    DWORD type = 0, length = sizeof(data);
    const bool read = RegGetValueA(hive, KeyName, name, RRF_RT_ANY | RRF_NOEXPAND, &type, data, &length) == ERROR_SUCCESS;
    std::string out = read ? std::to_string(type) + ":" : "";
    const char* hex = "0123456789abcdef";
    for (DWORD b = 0; read && b < length; ++b) out += {' ', hex[data[b] >> 4], hex[data[b] & 15]};
    return out;
}

int32_t ValueCount(HKEY hive) {
    HKEY key = nullptr;
    DWORD count = 0;
    if (RegOpenKeyExA(hive, KeyName, 0, KEY_QUERY_VALUE, &key) != ERROR_SUCCESS) return -1;
    RegQueryInfoKeyA(key, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, &count, nullptr, nullptr, nullptr, nullptr);
    RegCloseKey(key);
    return static_cast<int32_t>(count);
}

bool DenyKey(HKEY hive) { return SetAccess(hive, true); }

namespace {
BOOL CALLBACK FindMain(HWND window, LPARAM data) {
    auto* program = reinterpret_cast<Program*>(data);
    char cls[32] = {};
    DWORD pid = 0;
    GetClassNameA(window, cls, sizeof(cls));
    GetWindowThreadProcessId(window, &pid);
    const bool found = pid == program->Process.dwProcessId && lstrcmpA(cls, "Sombrel Player") == 0 && IsWindowVisible(window);
    return found ? (program->Window = window, FALSE) : TRUE;
}
}  // namespace

bool Launch(Program* program, const std::string& exe) {
    *program = Program{};
    std::string command = "\"" + exe + "\"";
    const std::string folder = exe.substr(0, exe.find_last_of('\\'));
    STARTUPINFOA startup = {};
    startup.cb = sizeof(startup);
    if (!CreateProcessA(exe.c_str(), &command[0], nullptr, nullptr, FALSE, 0, nullptr, folder.c_str(), &startup,
                        &program->Process))
        return false;
    return PumpUntil([&] {
        EnumWindows(FindMain, reinterpret_cast<LPARAM>(program));
        return program->Window != nullptr;
    }, 30000);
}

std::vector<HWND> OpenBoxes(const Program& program) {
    auto found = std::make_pair(program.Process.dwProcessId, std::vector<HWND>());
    EnumWindows(FindBox, reinterpret_cast<LPARAM>(&found));
    return found.second;
}

bool Click(const Program& program, int32_t id) {
    DWORD_PTR result = 0;
    return SendMessageTimeoutA(GetDlgItem(program.Window, id), BM_CLICK, 0, 0, SMTO_NORMAL, 10000, &result) != 0;
}

int32_t Close(Program* program) {
    if (program->Process.hProcess == nullptr) return -1;
    PostMessageA(program->Window, WM_CLOSE, 0, 0);
    const bool ended = PumpUntil([&] {
        for (HWND box : OpenBoxes(*program)) {
            const Box read = ReadBox(box);
            if (read.Buttons == 0) continue;
            Boxes.push_back(read);
            PostMessageA(box, WM_COMMAND, MAKEWPARAM(IDOK, BN_CLICKED), 0);
            PumpUntil([&] { return !IsWindowVisible(box); }, 5000);
        }
        return WaitForSingleObject(program->Process.hProcess, 0) == WAIT_OBJECT_0;
    }, 30000);
    DWORD code = static_cast<DWORD>(-1);
    if (ended) GetExitCodeProcess(program->Process.hProcess, &code);
    else TerminateProcess(program->Process.hProcess, 99);
    CloseHandle(program->Process.hProcess);
    CloseHandle(program->Process.hThread);
    program->Process.hProcess = nullptr;
    return static_cast<int32_t>(code);
}
