// SPDX-License-Identifier: Apache-2.0
#include <cstdlib>
#include <filesystem>
#include <string>

#include <gtest/gtest.h>

#include "ScratchFolder.h"
#include "platform/TemporaryFolder.h"

// Children run in other folders and find the folder in the same variable.
TEST(TemporaryFolder, IsAbsoluteForChildrenToo) {
    const support::ScratchFolder scratch;
    scratch.makeFolder("a b");
    std::filesystem::current_path(scratch.path());
    for (const char* variable : {"TMPDIR", "TMP", "TEMP"}) {
        setenv(variable, "no such folder", 1);
    }
    setenv("TMP", "a b", 1);
    EXPECT_EQ(platform::temporaryFolder(), scratch.path("a b"));
    EXPECT_EQ(std::getenv("TMP"), scratch.path("a b"));
    std::filesystem::current_path("/");
    EXPECT_EQ(platform::temporaryFolder(), scratch.path("a b"));
    for (const char* variable : {"TMPDIR", "TMP", "TEMP"}) {
        unsetenv(variable);
    }
}
