#include <chrono>
#include <string>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include "SuiteRoot.h"
#include "platform/Processes.h"

namespace {

// A program that was started, ended with the test.
class Child {
  public:
    explicit Child(const std::string& program) : m_number(fork()) {
        if (m_number == 0) {
            execl(program.c_str(), program.c_str(), "60", nullptr);
            _exit(127);
        }
        // Until the program has taken the place of the test.
        char path[4096];
        const std::string link = "/proc/" + std::to_string(m_number) + "/exe";
        for (int i = 0; i < 500; ++i) {
            const ssize_t length = readlink(link.c_str(), path, sizeof path);
            if (length > 0 && std::string(path, static_cast<std::size_t>(length)) == program) {
                break;
            }
            std::this_thread::sleep_for(std::chrono::milliseconds(10));
        }
    }
    ~Child() {
        kill(m_number, SIGKILL);
        waitpid(m_number, nullptr, 0);
    }
    Child(const Child&) = delete;
    Child& operator=(const Child&) = delete;

    ProcessSerialNumber number() const { return {0, static_cast<std::uint32_t>(m_number)}; }

    // Leaves it as a process that has ended and was not waited for.
    int endingSignal() const {
        siginfo_t info = {};
        waitid(P_PID, static_cast<id_t>(m_number), &info, WEXITED | WNOWAIT);
        return info.si_status;
    }

  private:
    const pid_t m_number;
};

std::vector<std::string> runningNames() {
    std::vector<std::string> names;
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

using Names = std::vector<std::string>;

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
        {"plain", "plain"},
        {"not-unicode\xff", "(none)"},
    };
    for (const auto& [executable, name] : cases) {
        const Child child(root.copyProgram("/bin/sleep", executable));
        EXPECT_EQ(runningNames(), Names{name}) << executable;
    }
}

TEST(Processes, OfAnotherRootOrThatHaveEndedAreNotSeen) {
    const support::SuiteRoot root;
    const Child ours(root.copyProgram("/bin/sleep", "Ours.app/run"));
    const Child second(root.copyProgram("/bin/sleep", "Second.app/run"));
    {
        // A root whose path is the beginning of ours, and one behind a link.
        const support::SuiteRoot other;
        setenv("TINTGATE_ROOT", root.path().substr(0, root.path().size() - 1).c_str(), 1);
        EXPECT_EQ(runningNames(), Names{});
        symlink(root.path().c_str(), other.path("link").c_str());
        setenv("TINTGATE_ROOT", other.path("link/").c_str(), 1);
        EXPECT_EQ(runningNames(), (Names{"Ours", "Second"}));
    }
    setenv("TINTGATE_ROOT", root.path().c_str(), 1);
    unlink(root.path("Ours.app/run").c_str());
    EXPECT_EQ(runningNames(), (Names{"Ours", "Second"})); // Replaced while it runs.

    const ProcessSerialNumber number = second.number();
    EXPECT_EQ(KillProcess(&number), noErr);
    EXPECT_EQ(second.endingSignal(), SIGTERM);
    EXPECT_EQ(runningNames(), Names{"Ours"});
    EXPECT_EQ(KillProcess(&number), procNotFound);
}

TEST(Processes, NeverEndOurselvesOrStrangers) {
    ProcessSerialNumber ourselves{0, static_cast<std::uint32_t>(getpid())};
    EXPECT_EQ(KillProcess(&ourselves), procNotFound); // Without a root we are an application.
    const support::SuiteRoot root;
    for (const std::uint32_t number : {0u, 1u, 0xFFFFFFFFu, static_cast<unsigned>(getppid())}) {
        const ProcessSerialNumber process{0, number};
        EXPECT_EQ(KillProcess(&process), procNotFound) << number;
    }
}

} // namespace
