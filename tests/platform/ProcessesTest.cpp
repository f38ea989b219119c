// SPDX-License-Identifier: Apache-2.0
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
using Names = std::vector<std::u16string>;

Names runningNames() {
    Names names;
    ProcessSerialNumber process;
    while (GetNextProcess(&process) == noErr) {
        CFStringRef name = nullptr;
        CopyProcessName(&process, &name);
        names.push_back(name == nullptr ? u"(none)" : name->units);
        CFRelease(name);
    }
    return names;
}

OSErr killProcess(pid_t number) {
    const ProcessSerialNumber process = {0, static_cast<std::uint32_t>(number)};
    return KillProcess(&process);
}

} // namespace

TEST(Processes, AreNamedAfterTheirBundle) {
    const support::SuiteRoot root("a.app");
    const std::pair<const char*, const char16_t*> cases[] = {
        {"Applications/Nerova/Nerova Verify.app/Contents/MacOS/nwjs", u"Nerova Verify"},
        {"Outer.app/Frameworks/Inner.app/Contents/MacOS/run", u"Inner"},
        {"T\xc3\xb6ne.app/x", u"Töne"},
        {".app/alone", u"alone"},
        {"usr/bin/tool.app", u"tool.app"},
        {"not-unicode\xff", u"(none)"},
    };
    for (const auto& [executable, name] : cases) {
        const RunningProgram program(root.copyProgram("/bin/sleep", executable));
        EXPECT_EQ(runningNames(), Names{name}) << executable;
    }
}

TEST(Processes, AreThoseThatRunBelowTheRoot) {
    const support::SuiteRoot root;
    const RunningProgram first(root.copyProgram("/bin/sleep", "bin/First"));
    const RunningProgram second(root.copyProgram("/bin/sleep", "Second.app/run"));
    std::filesystem::remove(root.path("bin/First")); // Replaced while running.
    EXPECT_EQ(runningNames(), (Names{u"First", u"Second"}));
    std::filesystem::create_directory_symlink(root.path(), root.path("link"));
    setenv("TINTGATE_ROOT", root.path("link/").c_str(), 1);
    EXPECT_EQ(runningNames(), (Names{u"First", u"Second"}));
    setenv("TINTGATE_ROOT", root.path().substr(0, root.path().size() - 1).c_str(), 1);
    EXPECT_EQ(runningNames(), Names{});
    setenv("TINTGATE_ROOT", root.path().c_str(), 1);

    EXPECT_EQ(killProcess(second.number()), noErr);
    EXPECT_EQ(second.endingSignal(), SIGTERM);
    EXPECT_EQ(runningNames(), Names{u"First"}); // The second is a zombie.
    for (const pid_t stranger : {second.number(), 0, 1, -1, getppid()}) {
        EXPECT_EQ(killProcess(stranger), procNotFound) << stranger;
    }
    unsetenv("TINTGATE_ROOT"); // This test then counts as an application too.
    EXPECT_EQ(killProcess(getpid()), procNotFound);
}
