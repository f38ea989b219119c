// SPDX-License-Identifier: Apache-2.0
#include "base/FileDraft.h"

#include <cerrno>
#include <csignal>
#include <cstddef>
#include <fcntl.h>
#include <filesystem>
#include <string>
#include <utility>

#include <gtest/gtest.h>
#include <linux/filter.h>
#include <linux/seccomp.h>
#include <sys/prctl.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include "ScratchFolder.h"
#include "base/WholeFile.h"

namespace fs = std::filesystem;

using support::contentsOf;
using support::modeOf;
using support::ScratchFolder;

namespace {

std::size_t filesIn(const ScratchFolder& folder) {
    return static_cast<std::size_t>(
        std::distance(fs::directory_iterator(folder.path()), fs::directory_iterator()));
}

TEST(WriteWholeFile, KeepsLinksAndPermissionsAndLeavesNothingBeside) {
    const ScratchFolder folder;
    const std::string file = folder.write("a", "old");
    const std::string link = folder.path("link");
    fs::create_symlink("a", link);
    ASSERT_EQ(chmod(file.c_str(), 0640), 0);

    ASSERT_TRUE(base::writeWholeFile(link, "new"));
    EXPECT_TRUE(fs::is_symlink(link));
    EXPECT_EQ(contentsOf(folder.path("a")), "new");
    EXPECT_EQ(modeOf(file), 0640u);
    ASSERT_TRUE(base::replaceWholeFile(link, "own"));
    EXPECT_FALSE(fs::is_symlink(link));
    EXPECT_EQ(contentsOf(file), "new");

    const mode_t mask = umask(027);
    ASSERT_TRUE(base::writeWholeFile(folder.path("fresh"), ""));
    umask(mask);
    EXPECT_EQ(modeOf(folder.path("fresh")), 0640u);
    EXPECT_EQ(filesIn(folder), 3u);
}

TEST(WriteWholeFile, LeavesTheOldFileIfItFails) {
    const ScratchFolder folder;
    folder.write("a", "old");
    EXPECT_FALSE(base::writeWholeFile(folder.path("missing/a"), "new"));
    EXPECT_EQ(errno, ENOENT);

    // A file size limit simulates a full disk.
    const auto before = std::signal(SIGXFSZ, SIG_IGN);
    rlimit limit = {};
    ASSERT_EQ(getrlimit(RLIMIT_FSIZE, &limit), 0);
    const rlimit small = {1000, limit.rlim_max};
    ASSERT_EQ(setrlimit(RLIMIT_FSIZE, &small), 0);
    EXPECT_FALSE(base::writeWholeFile(folder.path("a"), std::string(5000, 'x')));
    EXPECT_EQ(errno, EFBIG);
    setrlimit(RLIMIT_FSIZE, &limit);
    std::signal(SIGXFSZ, before);

    EXPECT_EQ(contentsOf(folder.path("a")), "old");
    EXPECT_EQ(filesIn(folder), 1u);
}

void takeTheFirstFreeName() {
    const ScratchFolder folder;
    folder.write("1", "theirs");
    base::FileDraft draft(folder.path("1"));
    ASSERT_TRUE(draft.isOpen() && draft.write("ours"));
    EXPECT_FALSE(draft.nameFresh(folder.path("1")));
    EXPECT_EQ(errno, EEXIST);
    EXPECT_TRUE(draft.nameFresh(folder.path("2")));
    EXPECT_EQ(contentsOf(folder.path("1")), "theirs");
    EXPECT_EQ(contentsOf(folder.path("2")), "ours");
    ASSERT_TRUE(base::writeWholeFile(folder.path("1"), "replaced"));
    EXPECT_EQ(contentsOf(folder.path("1")), "replaced");
    EXPECT_FALSE(base::FileDraft(folder.path("3")).replace(folder.path("missing/3")));
    EXPECT_EQ(filesIn(folder), 2u);
}

/// Has the kernel refuse, for this process, files without a name and, if asked for, hard links: as
/// file systems do that lack them.
void refuse(bool links) {
    const auto refused = [](__u32 error) {
        return sock_filter BPF_STMT(BPF_RET | BPF_K, SECCOMP_RET_ERRNO | error);
    };
    const auto at = [](std::size_t offset) {
        return sock_filter BPF_STMT(BPF_LD | BPF_W | BPF_ABS, static_cast<__u32>(offset));
    };
    sock_filter rules[] = {
        at(offsetof(seccomp_data, nr)),
        BPF_JUMP(BPF_JMP | BPF_JEQ | BPF_K, __NR_linkat, 0, 2),
        BPF_STMT(BPF_RET | BPF_K, SECCOMP_RET_ALLOW),
        refused(EPERM),
        BPF_JUMP(BPF_JMP | BPF_JEQ | BPF_K, __NR_openat, 0, 3),
        at(offsetof(seccomp_data, args[2])),
        BPF_JUMP(BPF_JMP | BPF_JSET | BPF_K, O_TMPFILE & ~O_DIRECTORY, 0, 1),
        refused(EOPNOTSUPP),
        BPF_STMT(BPF_RET | BPF_K, SECCOMP_RET_ALLOW),
    };
    if (links) {
        std::swap(rules[2], rules[3]);
    }
    const sock_fprog program = {std::size(rules), rules};
    ASSERT_EQ(prctl(PR_SET_NO_NEW_PRIVS, 1, 0, 0, 0), 0);
    ASSERT_EQ(prctl(PR_SET_SECCOMP, SECCOMP_MODE_FILTER, &program), 0);
}

TEST(FileDraft, TakesTheFirstFreeName) {
    takeTheFirstFreeName();
    for (const bool links : {false, true}) {
        const auto run = [&] {
            refuse(links);
            takeTheFirstFreeName();
            _exit(HasFailure() ? 1 : 0);
        };
        EXPECT_EXIT(run(), testing::ExitedWithCode(0), "") << links;
    }
}

} // namespace
