// SPDX-License-Identifier: Apache-2.0
#include <filesystem>
#include <string>
#include <vector>

#include <ctime>
#include <fcntl.h>
#include <sys/stat.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "RunProgram.h"
#include "ScratchFolder.h"

namespace {

using testing::HasSubstr;

namespace fs = std::filesystem;

class Tidy : public testing::Test {
  protected:
    Tidy() { m_scratch.makeFolder("Tintgate"); }

    std::string path(const std::string& name) const { return m_scratch.path("Tintgate/" + name); }

    /// Makes a job's folder with a file and a folder in it, all of that age.
    void makeJob(const std::string& name, int days = 40) const {
        m_scratch.write("Tintgate/" + name + "/output.json", "{}");
        m_scratch.write("Tintgate/" + name + "/inner/file", "x");
        makeOld(path(name), days);
    }

    /// Does not follow links.
    static void makeOld(const std::string& folder, int days) {
        timespec times[2] = {};
        times[0].tv_sec = times[1].tv_sec = time(nullptr) - 86400 * days;
        const auto set = [&](const fs::path& path) {
            EXPECT_EQ(utimensat(AT_FDCWD, path.c_str(), times, AT_SYMLINK_NOFOLLOW), 0) << path;
        };
        for (const auto& entry : fs::recursive_directory_iterator(folder)) {
            set(entry.path());
        }
        set(folder);
    }

    support::Outcome tidy(const std::vector<std::string>& words, unsigned user = 0) const {
        std::vector<std::string> command = {TINTGATE_REPORT, "--tidy"};
        command.insert(command.end(), words.begin(), words.end());
        return run(command, user);
    }
    support::Outcome run(const std::vector<std::string>& command, unsigned user = 0) const {
        support::RunOptions options;
        options.environment["TMPDIR"] = m_scratch.path();
        options.folder = m_scratch.path();
        options.user = user;
        return support::run(command, options);
    }

    const support::ScratchFolder m_scratch;
};

TEST_F(Tidy, RemovesOldFoldersOfJobsAndNothingElse) {
    const std::string elsewhere = m_scratch.makeFolder("elsewhere");
    const std::string precious = m_scratch.write("elsewhere/file", "x");
    makeJob("JobID_1");
    makeJob("JobID_2", 29);
    makeJob("JobID_3");
    m_scratch.write("Tintgate/JobID_3/inner/file", "written today");
    makeJob("JobID_4");
    fs::create_symlink(precious, path("JobID_4/link"));
    fs::create_directory_symlink(elsewhere, path("JobID_4/inner/folder"));
    makeOld(path("JobID_4"), 40);
    fs::create_directory_symlink(elsewhere, path("JobID_5"));
    for (const char* name : {"JobID_6 copy", "JobID_", "JobID_x", "other"}) {
        makeJob(name);
    }
    makeJob(".tidy-JobID_7"); // Left by a call that was killed.

    const std::string dry = tidy({"30", "--dry-run"}).output;
    EXPECT_THAT(dry, HasSubstr("would remove JobID_1: 2 files, "));
    EXPECT_THAT(dry, HasSubstr("3 of 5 folders would be removed"));
    EXPECT_TRUE(support::exists(path("JobID_1/inner/file")));

    EXPECT_EQ(tidy({"30"}).exitCode, 0);
    for (const char* gone : {"JobID_1", "JobID_4", "JobID_7", ".tidy-JobID_7"}) {
        EXPECT_FALSE(support::exists(path(gone))) << gone;
    }
    for (const char* kept : {"JobID_2/inner/file", "JobID_3/output.json", "JobID_5/file",
                             "JobID_6 copy/inner/file", "JobID_", "JobID_x", "other"}) {
        EXPECT_TRUE(support::exists(path(kept))) << kept;
    }
    EXPECT_TRUE(support::exists(precious));
    EXPECT_THAT(tidy({"30"}).output, HasSubstr("0 of 2 folders removed"));
}

TEST_F(Tidy, KeepsWhatAProcessUsesOrNames) {
    fs::create_directory(m_scratch.path("bin"));
    fs::copy_file("/bin/sh", m_scratch.path("bin/Tintgate"));
    m_scratch.write("pause", "read line < pipe");
    m_scratch.makeFolder("other");
    const std::string job = "pause 1 KEY_KZ_JOB:=:12";
    const std::pair<std::string, const char*> cases[] = {
        {"cd Tintgate/JobID_12/inner; exec cat ../../../pipe",
         "kept JobID_12: in use by cat (process "},
        {"exec cat pipe 9< Tintgate/JobID_12/output.json", "kept JobID_12: in use by cat"},
        {"bin/Tintgate " + job, "kept JobID_12: in use by Tintgate"},
        {"/bin/sh pause '" + path("JobID_12/meta.json") + "'", "kept JobID_12: in use by "},
        // Not in use: another program's job number, and the tool in another temporary folder.
        {"/bin/sh " + job, "removed JobID_12:"},
        {"TMPDIR='" + m_scratch.path("other") + "' bin/Tintgate " + job, "removed JobID_12:"},
    };
    for (const auto& [program, line] : cases) {
        SCOPED_TRACE(program);
        makeJob("JobID_1");
        makeJob("JobID_12");
        // The program opens the pipe and reads until the folders are tidied.
        const auto outcome =
            run({"/bin/sh", "-c",
                 "rm -f pipe; mkfifo pipe; (" + program +
                     ") & exec 8> pipe; " TINTGATE_REPORT " --tidy 30; exec 8>&-; wait"});
        EXPECT_THAT(outcome.output, HasSubstr(line));
        EXPECT_THAT(outcome.output, HasSubstr("removed JobID_1:"));
        EXPECT_EQ(support::exists(path("JobID_12/output.json")), *line == 'k');
    }
}

TEST_F(Tidy, SaysWhatItCantDo) {
    for (const char* days : {"0", "-1", "x", "1e9"}) {
        EXPECT_EQ(tidy({days}).exitCode, 64) << days;
    }

    // A number that no tool here has: users can't see the folders of root's tools.
    makeJob("JobID_987001");
    fs::permissions(path("JobID_987001/inner"), fs::perms(0555));
    fs::permissions(m_scratch.path(), fs::perms(0777));
    for (const auto& entry : fs::recursive_directory_iterator(m_scratch.path())) {
        support::giveTo(support::ordinaryUser, entry.path());
    }
    makeOld(path("JobID_987001"), 40);
    const support::Outcome outcome = tidy({"30"}, support::ordinaryUser);
    EXPECT_EQ(outcome.exitCode, 10);
    EXPECT_THAT(outcome.output, HasSubstr("failed JobID_987001: Permission denied"));
    EXPECT_TRUE(support::exists(path(".tidy-JobID_987001/inner/file")));

    fs::rename(m_scratch.path("Tintgate"), m_scratch.path("moved"));
    fs::create_directory_symlink("moved", m_scratch.path("Tintgate"));
    EXPECT_EQ(tidy({"30"}).exitCode, 10);
    EXPECT_TRUE(support::exists(path(".tidy-JobID_987001/inner/file")));
}

} // namespace
