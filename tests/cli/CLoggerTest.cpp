// SPDX-License-Identifier: Apache-2.0
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

class CLoggerTest : public testing::Test {
  protected:
    ~CLoggerTest() override { CLogger::DeleteLogger(); }

    support::ScratchFolder m_folder;
};

TEST_F(CLoggerTest, LinesHaveStampTabAndText) {
    const std::string path = m_folder.write("log", "last run's lines\n");
    chmod(path.c_str(), 0644);
    char text[] = "100 %s as it stands";
    CLogger::InitLogger(path);
    CLogger::GetLogger()->Log("argument %d: %s", 1, "-help");
    CLogger::GetLogger()->Log(text);
    *CLogger::GetLogger() << std::string("streamed") << std::string("twice");
    CLogger::GetLogger()->Log("%s", std::string(5000, 'x').c_str());
    CLogger::DeleteLogger();

    const std::regex stamp(
        "(Mon|Tue|Wed|Thu|Fri|Sat|Sun), \\d\\d\\.\\d\\d\\.\\d{4} \\d\\d:\\d\\d:\\d\\d:\t");
    EXPECT_EQ(
        std::regex_replace(contentsOf(path), stamp, "STAMP "),
        "STAMP argument 1: -help\nSTAMP 100 %s as it stands\n\nSTAMP streamed\n\nSTAMP twice\n"
        "STAMP " +
            std::string(1023, 'x') + "\n");
    EXPECT_EQ(support::modeOf(path), 0600u) << "it holds passwords";
}

TEST_F(CLoggerTest, OneLogAtATimeAndNoneIsHarmless) {
    CLogger::DeleteLogger();
    EXPECT_EQ(CLogger::GetLogger(), nullptr);
    CLogger::GetLogger()->Log("lost");

    CLogger* first = CLogger::InitLogger(m_folder.path("first"));
    EXPECT_EQ(CLogger::InitLogger(m_folder.path("second")), first);
    CLogger::GetLogger()->Log("kept");
    CLogger::DeleteLogger();
    EXPECT_THAT(contentsOf(m_folder.path("first")), testing::EndsWith(":\tkept\n"));
    EXPECT_FALSE(support::exists(m_folder.path("second")));
}

// Names that another user could have put in the log's place. Only root can create another user's
// file, and only root could write to it.
TEST_F(CLoggerTest, StaysClosedWhereTheNameIsNotOurs) {
    const std::string victim = m_folder.write("victim", "untouched");
    symlink(victim.c_str(), m_folder.path("link").c_str());
    symlink(m_folder.path("made").c_str(), m_folder.path("dangling").c_str());
    mkfifo(m_folder.path("pipe").c_str(), 0666);
    const int reader = open(m_folder.path("pipe").c_str(), O_RDONLY | O_NONBLOCK);
    m_folder.makeFolder("folder");
    support::giveTo(support::ordinaryUser, m_folder.write("theirs", "untouched"));
    for (const char* name : {"link", "dangling", "pipe", "folder", "missing/log", "theirs"}) {
        EXPECT_NE(CLogger::InitLogger(m_folder.path(name)), nullptr);
        CLogger::GetLogger()->Log("secret");
        CLogger::DeleteLogger();
    }
    EXPECT_EQ(contentsOf(victim), "untouched");
    EXPECT_FALSE(support::exists(m_folder.path("made")));
    char byte = 0;
    EXPECT_EQ(read(reader, &byte, 1), 0) << "the pipe was written to";
    close(reader);
    if (geteuid() == 0) {
        EXPECT_EQ(contentsOf(m_folder.path("theirs")), "untouched");
    }
}

} // namespace
