// SPDX-License-Identifier: Apache-2.0
#include <chrono>
#include <csignal>
#include <fstream>
#include <functional>
#include <map>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include <fcntl.h>
#include <sys/wait.h>
#include <unistd.h>

#include "CheckTest.h"

namespace {

using namespace checktest;
using testing::HasSubstr;

/// A watch as a process of its own, ended with this object.
class Watching {
  public:
    Watching(const std::vector<std::string>& words, const std::string& log) {
        std::vector<std::string> all = {TINTGATE_CHECK, "-t", "FOGRA39L", "--interval", "0.05"};
        all.insert(all.end(), words.begin(), words.end());
        std::vector<char*> arguments;
        for (std::string& word : all) {
            arguments.push_back(word.data());
        }
        arguments.push_back(nullptr);
        m_number = fork();
        if (m_number == 0) {
            const int file = open(log.c_str(), O_WRONLY | O_CREAT | O_APPEND, 0600);
            dup2(file, STDOUT_FILENO);
            dup2(file, STDERR_FILENO);
            execv(TINTGATE_CHECK, arguments.data());
            _exit(127);
        }
    }
    ~Watching() { end(SIGKILL); }
    Watching(const Watching&) = delete;
    Watching& operator=(const Watching&) = delete;

    /// The exit status, or -1 after a signal or if the process has ended before.
    int end(int signal) {
        int status = -1;
        if (m_number > 0) {
            kill(m_number, signal);
            waitpid(m_number, &status, 0);
            m_number = -1;
        }
        return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
    }

    int awaitEnd() {
        EXPECT_TRUE(support::awaitEnd(m_number, std::chrono::seconds(30)));
        return end(SIGKILL);
    }

  private:
    pid_t m_number = -1;
};

/// Waits up to half a minute, which a busy machine may take.
bool soon(const std::function<bool()>& holds) {
    for (int i = 0; i < 3000; ++i) {
        if (holds()) {
            return true;
        }
        std::this_thread::sleep_for(std::chrono::milliseconds(10));
    }
    return false;
}

class WatchTest : public CheckTest {
  protected:
    /// Names of the results without the 64 digits, with how many there are of each.
    std::map<std::string, int> results() const {
        std::map<std::string, int> names;
        for (const auto& entry : fs::recursive_directory_iterator(m_results)) {
            const std::string name = entry.path().lexically_relative(m_results);
            const std::size_t digits = name.find_last_of('.', name.rfind(".json") - 1);
            if (name.ends_with(".error.json")) {
                ++names[name.substr(0, name.size() - 11 - 65) + " error"];
            } else if (name.ends_with(".json")) {
                EXPECT_EQ(name.size() - digits, 70U) << name;
                ++names[name.substr(0, digits)];
            }
        }
        return names;
    }

    bool become(const std::map<std::string, int>& expected) const {
        return soon([&] { return results() == expected; });
    }

    int linesWith(const std::string& part) const {
        std::istringstream log(support::contentsOf(m_log));
        int count = 0;
        for (std::string line; std::getline(log, line);) {
            count += line.find(part) != line.npos ? 1 : 0;
        }
        return count;
    }

    void renameInto(const std::string& name, const std::string& text) const {
        fs::rename(m_scratch.write("exports/.draft", text), m_scratch.path("exports/" + name));
    }

    const std::string m_exports = m_scratch.makeFolder("exports");
    const std::string m_results = m_scratch.makeFolder("results");
    const std::string m_log = m_scratch.path("log");
    const std::vector<std::string> m_words = {"--watch", m_exports, "--out", m_results};
};

TEST_F(WatchTest, VerifiesEachContentOnce) {
    m_scratch.write("exports/early.txt", wedge(0));
    {
        Watching watching(m_words, m_log);
        ASSERT_TRUE(become({{"early", 1}}));
        renameInto("a.txt", wedge(1));
        m_scratch.write("exports/new/folder/b.txt", wedge(2));
        m_scratch.write("exports/copy.txt", wedge(0)); // of the first
        fs::create_hard_link(m_scratch.write("exports/ignored.md", wedge(3)),
                             m_scratch.path("exports/linked.txt"));
        std::map<std::string, int> expected = {
            {"early", 1}, {"a", 1}, {"new/folder/b", 1}, {"linked", 1}};
        ASSERT_TRUE(become(expected)) << support::contentsOf(m_log);

        // The same name with other content is a new measurement; the same content is not.
        m_scratch.write("exports/a.txt", wedge(4));
        expected["a"] = 2;
        ASSERT_TRUE(become(expected));
        m_scratch.write("exports/a.txt", wedge(1));

        // A broken one is reported once, however often it comes.
        m_scratch.write("exports/broken.txt", "no measurement");
        expected["broken error"] = 1;
        ASSERT_TRUE(become(expected));
        m_scratch.write("exports/broken.txt", "no measurement");
        renameInto("last.txt", wedge(5));
        expected["last"] = 1;
        ASSERT_TRUE(become(expected));
        EXPECT_EQ(watching.end(SIGTERM), 0);
        EXPECT_EQ(linesWith("broken.txt"), 1);
        EXPECT_EQ(linesWith("last.txt"), 1);
        EXPECT_EQ(linesWith("copy.txt"), 0);
    }
    // A restart does only what is new, and a page that was left without a result is replaced.
    const auto before = results();
    m_scratch.write("exports/later.txt", wedge(6));
    Watching watching(m_words, m_log);
    auto expected = before;
    expected["later"] = 1;
    ASSERT_TRUE(become(expected));
    EXPECT_EQ(watching.end(SIGINT), 0);
    EXPECT_EQ(linesWith("broken.txt"), 1);
    EXPECT_EQ(linesWith("early.txt"), 1);
}

TEST_F(WatchTest, PollsWhereNothingIsReported) {
    std::vector<std::string> words = m_words;
    words.insert(words.end(), {"--poll", "--page"});
    Watching watching(words, m_log);
    ASSERT_TRUE(soon([&] { return support::exists(m_log) && linesWith("Watching") == 1; }));
    // Written in pieces: nothing is said of it before its end.
    const std::string text = wedge(0);
    std::ofstream file(m_scratch.path("exports/slow.txt"));
    for (std::size_t at = 0; at < text.size(); at += text.size() / 20) {
        file << text.substr(at, text.size() / 20) << std::flush;
        std::this_thread::sleep_for(std::chrono::milliseconds(20));
    }
    file.close();
    ASSERT_TRUE(become({{"slow", 1}}));
    // A share that goes away and comes back.
    fs::rename(m_exports, m_exports + ".away");
    ASSERT_TRUE(soon([&] { return linesWith("is not there") == 1; }));
    fs::rename(m_exports + ".away", m_exports);
    m_scratch.write("exports/more.txt", wedge(1));
    ASSERT_TRUE(become({{"slow", 1}, {"more", 1}}));
    EXPECT_EQ(watching.end(SIGTERM), 0);
    EXPECT_EQ(linesWith("slow.txt"), 1);
}

TEST_F(WatchTest, EndsIfItCannotGoOn) {
    Watching first(m_words, m_log);
    ASSERT_TRUE(soon([&] { return support::exists(m_log) && linesWith("Watching") == 1; }));
    std::vector<std::string> words = {"-t", "FOGRA39L"};
    words.insert(words.end(), m_words.begin(), m_words.end());
    const support::Outcome second = check(words);
    EXPECT_EQ(second.exitCode, 3);
    EXPECT_THAT(second.error, HasSubstr("Another tintgate-check watches"));
    fs::rename(m_exports, m_exports + ".away");
    EXPECT_EQ(first.awaitEnd(), 3);
    EXPECT_EQ(linesWith("is not there"), 1);
}

/// A result that can't be written is reported once, and written later.
TEST_F(WatchTest, TriesAgainWhatCannotBeWritten) {
    m_scratch.write("results/sub", "a file where a folder is needed");
    Watching watching(m_words, m_log);
    m_scratch.write("exports/sub/proof.txt", wedge(0));
    ASSERT_TRUE(soon([&] { return support::exists(m_log) && linesWith("sub/proof.txt") == 1; }));
    fs::remove(m_scratch.path("results/sub"));
    ASSERT_TRUE(become({{"sub/proof", 1}}));
    EXPECT_EQ(watching.end(SIGTERM), 0);
}

} // namespace
