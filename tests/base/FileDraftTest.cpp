// SPDX-License-Identifier: Apache-2.0
#include "base/FileDraft.h"

#include <cerrno>
#include <csignal>
#include <filesystem>
#include <string>

#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

#include "ScratchFolder.h"

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

TEST(FileDraft, TakesTheFirstFreeName) {
    const ScratchFolder folder;
    folder.write("1", "theirs");
    base::FileDraft draft(folder.path("1"));
    ASSERT_TRUE(draft.isOpen() && draft.write("ours"));
    EXPECT_FALSE(draft.nameFresh(folder.path("1")));
    EXPECT_EQ(errno, EEXIST);
    EXPECT_TRUE(draft.nameFresh(folder.path("2")));
    EXPECT_EQ(contentsOf(folder.path("1")), "theirs");
    EXPECT_EQ(contentsOf(folder.path("2")), "ours");
}

} // namespace
