// SPDX-License-Identifier: Apache-2.0
#include "analysis/OutputFile.h"

#include <csignal>
#include <filesystem>

#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <gtest/gtest.h>

#include "ExitCodes.h"
#include "RunProgram.h"
#include "ScratchFolder.h"

namespace {

/// Status of writing "new" to `path` in a child process: as an ordinary user, or with a limit of
/// two bytes per file, which acts like a full disk.
int statusInChild(const std::string& path, unsigned user, bool diskFull) {
    const pid_t child = fork();
    if (child == 0) {
        if (diskFull) {
            std::signal(SIGXFSZ, SIG_IGN);
            const rlimit limit{2, 2};
            setrlimit(RLIMIT_FSIZE, &limit);
        }
        if (user != 0 && !support::becomeUser(user)) {
            _exit(127);
        }
        _exit(analysis::writeOutputFile(path, "new"));
    }
    int status = 0;
    waitpid(child, &status, 0);
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

TEST(OutputFile, IsReplacedWholeOrStaysAsItWas) {
    constexpr unsigned other = support::ordinaryUser;
    const struct {
        const char* what;
        mode_t folderMode, fileMode;
        unsigned user;
        bool diskFull;
        int status;
    } cases[] = {
        {"another mode", 0755, 0640, 0, false, exitDone},
        {"full disk", 0755, 0644, 0, true, exitOutputIncomplete},
        {"read-only file", 0777, 0444, other, false, exitOutputNotWritable},
        {"read-only folder, own file", 0555, 0666, other, false, exitDone},
        {"full disk in a read-only folder", 0555, 0666, other, true, exitOutputIncomplete},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        const support::ScratchFolder scratch;
        chmod(scratch.path().c_str(), 0755);
        const std::string folder = scratch.makeFolder("out");
        const std::string path = scratch.write("out/lab.txt", "a longer text that was there");
        chmod(path.c_str(), c.fileMode);
        chmod(folder.c_str(), c.folderMode);
        EXPECT_EQ(statusInChild(path, c.user, c.diskFull), c.status);
        EXPECT_EQ(support::contentsOf(path),
                  c.status == exitDone ? "new" : "a longer text that was there");
        EXPECT_EQ(support::modeOf(path), c.fileMode);
        EXPECT_EQ(std::distance(std::filesystem::directory_iterator(folder), {}), 1);
    }
}

TEST(OutputFile, IsWrittenThroughLinks) {
    const support::ScratchFolder scratch;
    const std::string path = scratch.write("lab.txt", "longer");
    const std::string link = scratch.path("link");
    std::filesystem::create_symlink(path, link);
    EXPECT_EQ(analysis::writeOutputFile(link, ""), exitDone);
    EXPECT_TRUE(std::filesystem::is_symlink(link));
    EXPECT_EQ(support::contentsOf(path), "");
    // Written through a link only: in tests run by root, a fault could replace the device.
    std::filesystem::remove(link);
    std::filesystem::create_symlink("/dev/full", link);
    EXPECT_EQ(analysis::writeOutputFile(link, "x"), exitOutputIncomplete);
}

TEST(OutputFile, SaysWhatIsWrongWithThePath) {
    const support::ScratchFolder scratch;
    for (const std::string& path : {scratch.path(), scratch.path("no/such"), std::string()}) {
        EXPECT_EQ(analysis::writeOutputFile(path, "x"), exitOutputNotWritable) << path;
    }
    EXPECT_EQ(analysis::writeOutputFile(scratch.path(std::string(255, 'n')), "x"), exitDone);
}

} // namespace
