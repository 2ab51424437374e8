// Sombrel.exe started as a user starts it, from its own folder: the exit
// code, the settings written at the end of a run with Play and read at the
// next start, and Help opening the manual that lies beside the program.
// Usage: launch_tests SOMBREL.EXE [gtest options]; scripts/test also runs it
// on the program unpacked from the release zip. With --figures SOMBREL.EXE
// SECONDS it starts the program and plays it for scripts/measure-program.
#include <gtest/gtest.h>
#include <windows.h>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <string>
#include "tests/program/harness.h"

namespace {

std::string Exe;  // the program under test, a Windows path
std::string Marker() { return WorkDir() + "\\opened.txt"; }
bool Opened() { return GetFileAttributesA(Marker().c_str()) != INVALID_FILE_ATTRIBUTES; }
HWND Volume(const Program& p) { return FindWindowExA(p.Window, nullptr, "ScrollBar", nullptr); }

TEST(Launch, ARunWithPlayStoresTheSettingsForTheNextStartAndEveryRunEndsWithZero) {
    ASSERT_TRUE(ForgetStoredSettings());
    Program p;
    ASSERT_TRUE(Launch(&p, Exe)) << Exe;
    EXPECT_EQ(Close(&p), 0);
    EXPECT_FALSE(KeyExists()) << "a run without Play stored the settings";
    ASSERT_TRUE(Launch(&p, Exe));
    DWORD_PTR result = 0;
    SendMessageTimeoutA(p.Window, WM_HSCROLL, MAKEWPARAM(SB_THUMBPOSITION, 200), reinterpret_cast<LPARAM>(Volume(p)), SMTO_NORMAL, 10000, &result);
    ASSERT_TRUE(Click(p, 1030));
    EXPECT_EQ(Close(&p), 0) << "closed while playing";
    EXPECT_EQ(ReadNumber("Attenuator"), 200);
    ASSERT_TRUE(Launch(&p, Exe));
    EXPECT_EQ(SendMessageA(Volume(p), SBM_GETPOS, 0, 0), 200) << "the volume at the next start";
    EXPECT_EQ(Close(&p), 0);
    EXPECT_EQ(BoxTexts(), std::vector<std::string>{});
    ForgetStoredSettings();
}

TEST(Launch, HelpShowsTheAboutBoxThenOpensTheManualBesideTheProgramAndSaysNothingWithoutIt) {
    char self[MAX_PATH];
    GetModuleFileNameA(nullptr, self, sizeof(self));
    const std::string command = std::string("\"") + self + "\" --mark-opened \"" + Marker() + "\" \"%1\"";
    RegSetValueA(HKEY_CLASSES_ROOT, ".pdf", REG_SZ, "SombrelTestPdf", 14);
    RegSetValueA(HKEY_CLASSES_ROOT, "SombrelTestPdf\\shell\\open\\command", REG_SZ, command.c_str(), static_cast<DWORD>(command.size()));
    const std::string alone = WorkDir() + "\\no-manual";  // a copy of the program with no manual beside it
    CreateDirectoryA(alone.c_str(), nullptr);
    ASSERT_TRUE(CopyFileA(Exe.c_str(), (alone + "\\Sombrel.exe").c_str(), FALSE));
    for (const std::string& exe : {Exe, alone + "\\Sombrel.exe"}) {
        DeleteFileA(Marker().c_str());
        Program p;
        ASSERT_TRUE(Launch(&p, exe)) << exe;
        PostMessageA(GetDlgItem(p.Window, 1051), BM_CLICK, 0, 0);
        ASSERT_TRUE(PumpUntil([&] { return !OpenBoxes(p).empty() && ReadBox(OpenBoxes(p)[0]).Buttons > 0; }, 20000)) << "no about box";
        const Box about = ReadBox(OpenBoxes(p)[0]);
        EXPECT_TRUE(about.Caption == "Sombrel Player" && about.Text.find("Sombrel Player") != std::string::npos &&
                    about.Text.find("1.00") != std::string::npos && about.Icon == nullptr && about.Buttons == 1) << about.Text;
        EXPECT_FALSE(PumpUntil(Opened, 1500)) << "the manual was opened while the about box was open";
        PostMessageA(OpenBoxes(p)[0], WM_COMMAND, MAKEWPARAM(IDOK, BN_CLICKED), 0);
        if (exe == Exe) {
            ASSERT_TRUE(PumpUntil(Opened, 20000)) << "the manual was not opened";
            std::string opened;
            std::getline(std::ifstream(Marker().c_str()), opened);
            EXPECT_EQ(lstrcmpiA(opened.c_str(), (Exe.substr(0, Exe.find_last_of('\\')) + "\\Sombrel.pdf").c_str()), 0) << opened;
        } else {  // what the shell says is its own: no box of the program's
            PumpUntil([] { return false; }, 2000);
            for (HWND box : OpenBoxes(p)) EXPECT_NE(ReadBox(box).Caption.substr(0, 7), "Sombrel") << ReadBox(box).Text;
            EXPECT_FALSE(Opened());
        }
        EXPECT_TRUE(Click(p, 1030) && Click(p, 1031)) << "Play and Stop";
        EXPECT_EQ(Close(&p), 0);
        Boxes.clear();  // the shell's, if any
    }
    RegDeleteTreeA(HKEY_CLASSES_ROOT, "SombrelTestPdf");
    RegDeleteTreeA(HKEY_CLASSES_ROOT, ".pdf");
}

}  // namespace

int main(int argc, char** argv) {
    if (argc == 4 && std::string(argv[1]) == "--mark-opened") {  // the shell opening a manual
        std::ofstream(argv[2]) << argv[3] << '\n';
        return 0;
    }
    if (argc == 4 && std::string(argv[1]) == "--figures") {  // for scripts/measure-program
        Program p;
        const ULONGLONG start = GetTickCount64();
        if (!Launch(&p, WindowsPath(argv[2]))) return 1;
        std::printf("time-to-window-ms %llu\n", GetTickCount64() - start);
        if (!Click(p, 1030)) return 1;
        std::printf("playing-pid %lu\n", p.Process.dwProcessId);
        std::fflush(stdout);
        Sleep(static_cast<DWORD>(std::atof(argv[3]) * 1000));
        return Click(p, 1031) && Close(&p) == 0 ? 0 : 1;
    }
    ::testing::InitGoogleTest(&argc, argv);
    if (argc < 2) return std::fprintf(stderr, "usage: launch_tests SOMBREL.EXE [gtest options]\n"), 2;
    Exe = WindowsPath(argv[1]);
    return RUN_ALL_TESTS();
}
