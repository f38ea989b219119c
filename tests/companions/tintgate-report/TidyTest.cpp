#include <filesystem>
#include <string>
#include <vector>

#include <csignal>
#include <ctime>
#include <fcntl.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "RunProgram.h"
#include "ScratchFolder.h"

namespace {

using testing::AllOf;
using testing::HasSubstr;

namespace fs = std::filesystem;

/// A program that runs in a folder, or with a file open.
class Process {
  public:
    Process(const std::string& folder, const std::string& file) {
        m_number = fork();
        if (m_number != 0)
            return;
        if ((!folder.empty() && chdir(folder.c_str()) != 0) ||
            (!file.empty() && dup2(open(file.c_str(), O_RDONLY), 9) != 9))
            _exit(126);
        execl(sleep, sleep, "60", nullptr);
        _exit(127);
    }
    ~Process() {
        kill(m_number, SIGKILL);
        waitpid(m_number, nullptr, 0);
    }
    Process(const Process&) = delete;
    Process& operator=(const Process&) = delete;

    /// Waits until the program itself runs.
    bool runs() const {
        for (int waited = 0; waited < 500; ++waited) {
            std::error_code gone;
            if (fs::read_symlink("/proc/" + std::to_string(m_number) + "/exe", gone) == sleep)
                return true;
            usleep(10'000);
        }
        return false;
    }

  private:
    static constexpr const char* sleep = "/usr/bin/sleep";
    pid_t m_number;
};

class Tidy : public testing::Test {
  protected:
    Tidy() { m_scratch.makeFolder("Tintgate"); }

    std::string path(const std::string& name) const { return m_scratch.path("Tintgate/" + name); }

    /// A job's folder with a file and a folder in it, all of that age.
    void makeJob(const std::string& name, int days = 40) const {
        m_scratch.makeFolder("Tintgate/" + name);
        m_scratch.write("Tintgate/" + name + "/output.json", "{}");
        m_scratch.makeFolder("Tintgate/" + name + "/inner");
        m_scratch.write("Tintgate/" + name + "/inner/file", "x");
        makeOld(path(name), days);
    }

    /// Links too, not what they lead to.
    static void makeOld(const std::string& folder, int days) {
        timespec times[2] = {};
        times[0].tv_sec = times[1].tv_sec = time(nullptr) - 86400 * days;
        const auto set = [&](const fs::path& path) {
            EXPECT_EQ(utimensat(AT_FDCWD, path.c_str(), times, AT_SYMLINK_NOFOLLOW), 0) << path;
        };
        for (const auto& entry : fs::recursive_directory_iterator(folder))
            set(entry.path());
        set(folder);
    }

    support::Outcome tidy(std::vector<std::string> words, unsigned user = 0) const {
        support::RunOptions options;
        options.environment["TMPDIR"] = m_scratch.path();
        options.user = user;
        words.insert(words.begin(), TINTGATE_REPORT);
        return support::run(words, options);
    }

    const support::ScratchFolder m_scratch;
};

TEST_F(Tidy, RemovesOldFoldersOfJobsAndNothingElse) {
    const std::string precious = m_scratch.write("precious", "x");
    const std::string elsewhere = m_scratch.makeFolder("elsewhere");
    m_scratch.write("elsewhere/file", "x");
    makeJob("JobID_1");
    makeJob("JobID_2", 29);
    makeJob("JobID_3");
    m_scratch.write("Tintgate/JobID_3/inner/file", "written today");
    makeJob("JobID_4");
    fs::create_symlink(precious, path("JobID_4/link"));
    fs::create_directory_symlink(elsewhere, path("JobID_4/inner/folder"));
    makeOld(path("JobID_4"), 40);
    fs::create_directory_symlink(elsewhere, path("JobID_5"));
    for (const char* name : {"JobID_6 copy", "JobID_", "JobID_x", "other"})
        makeJob(name);
    makeJob(".tidy-JobID_7"); // Of a call that was cut off.

    const support::Outcome dry = tidy({"--tidy", "30", "--dry-run"});
    EXPECT_EQ(dry.exitCode, 0) << dry.error;
    EXPECT_THAT(dry.output, HasSubstr("would remove JobID_1: 2 files, "));
    EXPECT_THAT(dry.output, HasSubstr("3 of 5 folders would be removed"));
    EXPECT_TRUE(support::exists(path("JobID_1/inner/file")));

    const support::Outcome outcome = tidy({"--tidy", "30"});
    EXPECT_EQ(outcome.exitCode, 0) << outcome.error;
    for (const char* gone : {"JobID_1", "JobID_4", "JobID_7", ".tidy-JobID_7"})
        EXPECT_FALSE(support::exists(path(gone))) << gone;
    for (const char* kept : {"JobID_2/inner/file", "JobID_3/output.json", "JobID_5/file",
                             "JobID_6 copy/inner/file", "JobID_", "JobID_x", "other"})
        EXPECT_TRUE(support::exists(path(kept))) << kept;
    EXPECT_TRUE(support::exists(precious));
    EXPECT_TRUE(support::exists(elsewhere + "/file"));
    EXPECT_THAT(tidy({"--tidy", "30"}).output, HasSubstr("0 of 2 folders removed"));
}

TEST_F(Tidy, KeepsWhatAProcessUses) {
    for (const char* name : {"JobID_1", "JobID_2", "JobID_3"})
        makeJob(name);
    {
        const Process works(path("JobID_1/inner"), "");
        const Process reads("", path("JobID_2/output.json"));
        ASSERT_TRUE(works.runs() && reads.runs());
        const support::Outcome outcome = tidy({"--tidy", "30"});
        EXPECT_EQ(outcome.exitCode, 0) << outcome.error;
        EXPECT_THAT(outcome.output, HasSubstr("kept JobID_1: in use by sleep (process "));
        EXPECT_THAT(outcome.output, HasSubstr("kept JobID_2: in use by sleep (process "));
    }
    EXPECT_TRUE(support::exists(path("JobID_1/output.json")));
    EXPECT_TRUE(support::exists(path("JobID_2/output.json")));
    EXPECT_FALSE(support::exists(path("JobID_3")));
    EXPECT_EQ(tidy({"--tidy", "30"}).exitCode, 0);
    EXPECT_FALSE(support::exists(path("JobID_1")));
}

TEST_F(Tidy, KeepsWhatArgumentsName) {
    fs::create_directory(m_scratch.path("bin"));
    fs::copy_file("/bin/sh", m_scratch.path("bin/Tintgate"));
    m_scratch.write("pause", "read line");
    fs::create_directory(m_scratch.path("other"));
    for (const char* name : {"JobID_1", "JobID_12"})
        makeJob(name);
    support::RunOptions options;
    options.environment["TMPDIR"] = m_scratch.path();
    options.folder = m_scratch.path();
    // The program waits at a pipe until the folders are tidied.
    const auto besides = [&](const std::string& program, const std::string& argument) {
        return support::run({"/bin/sh", "-c",
                             "rm -f pipe; mkfifo pipe; " + program + " pause 1 '" + argument +
                                 "' < pipe & exec 8> pipe; " TINTGATE_REPORT " --tidy 30"},
                            options)
            .output;
    };
    const std::string job = "KEY_KZ_JOB:=:12";
    EXPECT_THAT(besides("bin/Tintgate", job),
                AllOf(HasSubstr("kept JobID_12: in use by Tintgate (process "),
                      HasSubstr("removed JobID_1:")));
    EXPECT_THAT(besides("/bin/sh", path("JobID_12/meta.json")), HasSubstr("kept JobID_12: in use"));
    EXPECT_TRUE(support::exists(path("JobID_12/output.json")));
    // Neither another program's number nor the tool elsewhere.
    EXPECT_THAT(besides("/bin/sh", job), HasSubstr("removed JobID_12:"));
    makeJob("JobID_12");
    EXPECT_THAT(besides("TMPDIR=" + m_scratch.path("other") + " bin/Tintgate", job),
                HasSubstr("removed JobID_12:"));
}

TEST_F(Tidy, SaysWhatItCantDo) {
    for (const char* days : {"0", "-1", "x", "1e9"})
        EXPECT_EQ(tidy({"--tidy", days}).exitCode, 64) << days;
    EXPECT_EQ(tidy({"--dry-run"}).exitCode, 64);

    // A number that no tool on this machine has, since those of root tell this user no folder.
    makeJob("JobID_987001");
    fs::permissions(path("JobID_987001/inner"), fs::perms(0555));
    fs::permissions(m_scratch.path(), fs::perms(0777));
    for (const auto& entry : fs::recursive_directory_iterator(m_scratch.path()))
        support::giveTo(support::ordinaryUser, entry.path());
    makeOld(path("JobID_987001"), 40);
    const support::Outcome outcome = tidy({"--tidy", "30"}, support::ordinaryUser);
    EXPECT_EQ(outcome.exitCode, 10);
    EXPECT_THAT(outcome.output, HasSubstr("failed JobID_987001: Permission denied"));
    EXPECT_TRUE(support::exists(path(".tidy-JobID_987001/inner/file")));

    fs::rename(m_scratch.path("Tintgate"), m_scratch.path("moved"));
    EXPECT_THAT(tidy({"--tidy", "30"}).output, HasSubstr("0 of 0 folders"));
    fs::create_directory_symlink("moved", m_scratch.path("Tintgate"));
    EXPECT_EQ(tidy({"--tidy", "30"}).exitCode, 10);
    EXPECT_TRUE(support::exists(path(".tidy-JobID_987001/inner/file")));
}

} // namespace
