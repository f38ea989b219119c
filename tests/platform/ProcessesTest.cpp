#include "platform/Processes.h"

#include <filesystem>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include <signal.h>
#include <unistd.h>

#include "RunningProgram.h"
#include "SuiteRoot.h"

namespace {

using support::RunningProgram;
using Names = std::vector<std::string>;

ProcessSerialNumber serialNumber(pid_t number) {
    return {0, static_cast<std::uint32_t>(number)};
}

Names runningNames() {
    Names names;
    ProcessSerialNumber process;
    while (GetNextProcess(&process) == noErr) {
        CFStringRef name = nullptr;
        char text[256] = "(none)";
        if (CopyProcessName(&process, &name) == noErr) {
            CFStringGetCString(name, text, sizeof text, kCFStringEncodingUTF8);
        }
        CFRelease(name);
        names.push_back(text);
    }
    return names;
}

TEST(Processes, AreNamedAfterTheirBundle) {
    const support::SuiteRoot root("a.app");
    const struct {
        const char* executable;
        const char* name;
    } cases[] = {
        {"Applications/Nerova/Nerova Verify.app/Contents/MacOS/nwjs", "Nerova Verify"},
        {"Outer.app/Frameworks/Inner.app/Contents/MacOS/run", "Inner"},
        {"T\xc3\xb6ne.app/x", "T\xc3\xb6ne"},
        {".app/alone", "alone"},
        {"usr/bin/tool.app", "tool.app"},
        {"not-unicode\xff", "(none)"},
    };
    for (const auto& [executable, name] : cases) {
        const RunningProgram program(root.copyProgram("/bin/sleep", executable));
        EXPECT_EQ(runningNames(), Names{name}) << executable;
    }
}

TEST(Processes, AreThoseThatRunBelowTheRoot) {
    const support::SuiteRoot root;
    const RunningProgram first(root.copyProgram("/bin/sleep", "First.app/run"));
    const RunningProgram second(root.copyProgram("/bin/sleep", "Second.app/run"));
    std::filesystem::remove(root.path("First.app/run")); // Replaced while it runs.
    EXPECT_EQ(runningNames(), (Names{"First", "Second"}));
    std::filesystem::create_directory_symlink(root.path(), root.path("link"));
    setenv("TINTGATE_ROOT", root.path("link/").c_str(), 1);
    EXPECT_EQ(runningNames(), (Names{"First", "Second"}));
    setenv("TINTGATE_ROOT", root.path().substr(0, root.path().size() - 1).c_str(), 1);
    EXPECT_EQ(runningNames(), Names{});
    setenv("TINTGATE_ROOT", root.path().c_str(), 1);

    const ProcessSerialNumber number = serialNumber(second.number());
    EXPECT_EQ(KillProcess(&number), noErr);
    EXPECT_EQ(second.endingSignal(), SIGTERM);
    EXPECT_EQ(runningNames(), Names{"First"}); // Though nobody has waited for the second.
    for (const pid_t stranger : {second.number(), 0, 1, -1, getppid()}) {
        const ProcessSerialNumber process = serialNumber(stranger);
        EXPECT_EQ(KillProcess(&process), procNotFound) << stranger;
    }
}

TEST(Processes, NeverEndThemselves) {
    unsetenv("TINTGATE_ROOT"); // Then this test is an application.
    const ProcessSerialNumber ourselves = serialNumber(getpid());
    EXPECT_EQ(KillProcess(&ourselves), procNotFound);
}

} // namespace
