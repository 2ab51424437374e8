// tests/program/program_fixture.h: the fixture most program tests share: a
// fresh program per test on its first start (no stored settings), closed
// (or ended) afterwards with any box it left open answered first.
#pragma once
#include <gtest/gtest.h>
#include <windows.h>
#include <vector>

#include "tests/program/driver.h"
#include "tests/program/settings_store.h"

class ProgramTest : public ::testing::Test {
protected:
    Program P = {};
    void SetUp() override {
        // Each test meets a first start: a run with Play stores its settings.
        ASSERT_TRUE(ForgetStoredSettings()) << "the key HKLM\\Software\\Sombrel could not be removed";
        ASSERT_TRUE(LaunchProgram(&P)) << "LaunchProgram(" << Config.ProgramPath
                                       << ") found no visible window of class \"Sombrel Player\" within 30 s";
    }
    void TearDown() override {
        for (int i = 0; i < 40; ++i) {
            std::vector<Box> boxes = OpenBoxes(P);
            if (boxes.empty()) break;
            CloseBox(boxes.back());
        }
        if (CloseProgram(&P) < 0) EndProgram(&P);
    }
    HWND C(int32_t id) { return Control(P, id); }
    bool Enabled(int32_t id) { return IsWindowEnabled(C(id)) != FALSE; }
    bool Playing() { return ShowsPlaying(P); }
    // Everything but the Fade Out pair enabled: the stopped state.
    bool Stopped() { return ShowsStopped(P); }
    void ExpectNoBox(const char* after) {
        ASSERT_TRUE(Settle(P)) << after << ": SendMessageTimeout(WM_NULL) timed out; expected the program back in its message loop";
        std::vector<Box> boxes = OpenBoxes(P);
        EXPECT_TRUE(boxes.empty()) << after << ": a box is open, caption \""
                                   << (boxes.empty() ? "" : boxes[0].Caption) << "\", text \""
                                   << (boxes.empty() ? "" : boxes[0].Text) << "\"; expected none";
    }
};
