#include "cli/CLogger.h"

#include <fcntl.h>
#include <regex>
#include <sys/stat.h>
#include <unistd.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "RunProgram.h"
#include "ScratchFolder.h"

namespace {

using support::contentsOf;

const std::string stamp =
    "(Mon|Tue|Wed|Thu|Fri|Sat|Sun), \\d\\d\\.\\d\\d\\.\\d{4} \\d\\d:\\d\\d:\\d\\d:\t";

class CLoggerTest : public testing::Test {
  protected:
    ~CLoggerTest() override { CLogger::DeleteLogger(); }

    support::ScratchFolder m_folder;
};

TEST_F(CLoggerTest, LinesHaveStampTabAndText) {
    const std::string path = m_folder.write("log", "last run's lines\n");
    char text[] = "100 %s as it stands";
    CLogger::InitLogger(path);
    CLogger::GetLogger()->Log("argument %d: %s", 1, "-help");
    CLogger::GetLogger()->Log(text);
    *CLogger::GetLogger() << std::string("streamed") << std::string("twice");
    CLogger::DeleteLogger();

    const std::regex expected(stamp + "argument 1: -help\n" + stamp + "100 %s as it stands\n" +
                              "\n" + stamp + "streamed\n" + "\n" + stamp + "twice\n");
    EXPECT_TRUE(std::regex_match(contentsOf(path), expected)) << contentsOf(path);
}

TEST_F(CLoggerTest, LongMessagesAreCut) {
    CLogger::InitLogger(m_folder.path("log"));
    CLogger::GetLogger()->Log("%s", std::string(5000, 'x').c_str());
    CLogger::DeleteLogger();
    EXPECT_THAT(contentsOf(m_folder.path("log")),
                testing::EndsWith(":\t" + std::string(1023, 'x') + "\n"));
}

TEST_F(CLoggerTest, OneLogAtATimeAndNoneIsHarmless) {
    CLogger::DeleteLogger();
    EXPECT_EQ(CLogger::GetLogger(), nullptr);
    CLogger::GetLogger()->Log("lost");

    CLogger* first = CLogger::InitLogger(m_folder.path("first"));
    EXPECT_EQ(CLogger::InitLogger(m_folder.path("second")), first);
    CLogger::GetLogger()->Log("kept");
    CLogger::DeleteLogger();
    CLogger::GetLogger()->Log("lost");

    CLogger::InitLogger(m_folder.path("third"));
    CLogger::GetLogger()->Log("next");
    CLogger::DeleteLogger();

    EXPECT_THAT(contentsOf(m_folder.path("first")), testing::EndsWith(":\tkept\n"));
    EXPECT_FALSE(support::exists(m_folder.path("second")));
    EXPECT_THAT(contentsOf(m_folder.path("third")), testing::EndsWith(":\tnext\n"));
}

TEST_F(CLoggerTest, IsForItsOwnerAlone) {
    const std::string old = m_folder.write("old", "");
    chmod(old.c_str(), 0644);
    for (const std::string& path : {old, m_folder.path("new")}) {
        CLogger::InitLogger(path);
        CLogger::DeleteLogger();
        EXPECT_EQ(support::modeOf(path), 0600u) << path;
    }
}

// Each name is one that somebody else could have put where the log goes.
TEST_F(CLoggerTest, StaysClosedWhereTheNameIsNotOurs) {
    const std::string victim = m_folder.write("victim", "untouched");
    const std::string link = m_folder.path("link");
    ASSERT_EQ(symlink(victim.c_str(), link.c_str()), 0);
    const std::string dangling = m_folder.path("dangling");
    ASSERT_EQ(symlink(m_folder.path("made").c_str(), dangling.c_str()), 0);
    const std::string pipe = m_folder.path("pipe");
    ASSERT_EQ(mkfifo(pipe.c_str(), 0666), 0);
    const int reader = open(pipe.c_str(), O_RDONLY | O_NONBLOCK);
    const std::string folder = m_folder.makeFolder("folder");
    const std::string missing = m_folder.path("missing/log");

    for (const std::string& path : {link, dangling, pipe, folder, missing}) {
        EXPECT_NE(CLogger::InitLogger(path), nullptr);
        CLogger::GetLogger()->Log("secret");
        CLogger::DeleteLogger();
    }
    EXPECT_EQ(contentsOf(victim), "untouched");
    EXPECT_FALSE(support::exists(m_folder.path("made")));
    char byte = 0;
    EXPECT_EQ(read(reader, &byte, 1), 0) << "the pipe was written to";
    close(reader);
}

// Only root can make another user's file, and only root could write into it.
TEST_F(CLoggerTest, LeavesAnotherUsersFileAlone) {
    const std::string path = m_folder.write("log", "untouched");
    support::giveTo(support::ordinaryUser, path);
    CLogger::InitLogger(path);
    CLogger::DeleteLogger();
    EXPECT_EQ(contentsOf(path), geteuid() == 0 ? "untouched" : "");
}

} // namespace
