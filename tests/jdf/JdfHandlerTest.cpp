// SPDX-License-Identifier: Apache-2.0
#include "jdf/JdfHandler.h"

#include <csignal>
#include <filesystem>
#include <vector>

#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <gtest/gtest.h>

#include "RunningProgram.h"
#include "ScratchFolder.h"

namespace {

namespace fs = std::filesystem;

const std::string opening =
    "<tazo:MeasurementData ID=\"BJDFLink0000006\" Class=\"Parameter\" Status=\"Available\">";
const std::string closing = "</tazo:MeasurementData>";
const std::string padding = "<!--" + std::string(5000, '-') + "-->\n";
const std::string sender = "<Sender printdate=\"\" printtime=\"\"/>\n";
const std::string media = "  <Media/>\n";
const std::string pool = " \t</ResourcePool>\n";
const std::string links = "  <MediaLink/>\n";
const std::string linkPool = "  </ResourceLinkPool>\n";
const std::string fresh = padding + sender + media + pool + links + linkPool;

/// A job with one patch and its measurement as `element`.
class JdfFile : public testing::Test {
  protected:
    JdfFile() {
        job.measurement.numPatches = 1;
        job.measurement.xyz = xyz;
        char buffer[1000];
        long length = 0;
        WriteJDFMeasureData(buffer, buffer, std::end(buffer), &length, job.measurement, &header,
                            "comment");
        element.assign(buffer, static_cast<std::size_t>(length));
    }

    int update(const std::string& path, bool replace = true) {
        job.jdfLocalFile = wxString(stringToWstring(path));
        return JdfHandler::AppendJDFFileData(job, "comment", &header, replace);
    }

    support::ScratchFolder folder;
    double xyz[3] = {10, 20, 30};
    JDFMeasurementHeader header{.printDate = "2025-01-02",
                                .printTime = "10:11:12",
                                .measureDate = "2024-05-31",
                                .party = 1};
    KZJobDataStruct job;
    std::string element;
};

/// Applies the required faulty deletion, from one token to another.
std::string deleted(const std::string& text, const std::string& from, const std::string& to) {
    const auto at = text.find(from);
    const auto count = text.find(to, at) - at;
    return text.substr(0, at + count) + text.substr(at, text.size() - 2 * count - at);
}

std::string inserted(std::string text, const std::string& before, const std::string& what) {
    return text.insert(text.find(before), what);
}

TEST_F(JdfFile, ReceivesDateLinkResourceAndMeasurement) {
    const std::string stamped = "<Sender printdate=\"2025-01-02\" printtime=\"10:11:12\"/>\n";
    const std::string link =
        "<tazo:MeasurementDataLink rRef=\"BJDFLink0000006\" Usage=\"Input\"/>\n";
    const std::string holder = opening + element + closing + "\n";
    const std::string linked = padding + "<tazo:MeasurementDataLink/>";
    const std::string dated = linked + "<Sender printdate=\"2020\"/>" + media + pool + padding;
    const std::string old = opening + "<old/>" + closing;
    const std::string full = linked + old + media + pool + padding;
    const std::string broken = linked + "<tazo:MeasurementData ID=\"x\">" + media + pool + padding;
    const std::string unlinked = padding + old + media + pool + padding;
    const struct {
        const char* name;
        bool replace;
        std::string before, after;
    } cases[] = {
        {"fresh", false, fresh,
         padding + stamped + media + holder + pool + links + link + linkPool},
        {"behind an old one", false, linked + opening + "<old/>\n  " + closing + pool,
         linked + opening + "<old/>\n" + element + "  " + closing + pool},
        {"dates in later elements, the time before the date", false,
         linked + "<Sender/><x printtime=\"\"/><y printdate=\"\"/>" + pool,
         linked + "<Sender/><x printtime=\"\"/><y printdate=\"2025-01-02\"/>" + holder + pool},
        {"no closing quote", false, linked + pool + "<Sender printdate=\"x",
         linked + holder + pool + "<Sender printdate=\"2025-01-02x"},
        {"no pool of links", false, padding + sender + pool, element + padding + stamped + pool},
        {"a pool that ends with the file is none", false, linked + "</ResourcePool>",
         element + linked + "</ResourcePool>"},
        // The deletion that does not delete:
        {"an old date stands twice", false, dated,
         inserted(inserted(deleted(dated, "2020", "\""), "2020", "2025-01-02"), pool, holder)},
        {"an old measurement stays", true, full,
         inserted(deleted(full, opening, "</ResourcePool>"), closing, element)},
        {"remains without a closing tag stay", false, broken,
         inserted(deleted(broken, "<tazo:MeasurementData ID=", "</ResourcePool>"), pool, holder)},
        {"no link: the deletion leads to its end", true, unlinked,
         inserted(deleted(unlinked, opening, "</ResourcePool>"), " \t" + opening, element)},
    };
    for (const auto& c : cases) {
        const std::string path = folder.write("job.jdf", c.before);
        EXPECT_EQ(update(path, c.replace), 0) << c.name;
        EXPECT_EQ(support::contentsOf(path), c.after) << c.name;
    }
}

TEST_F(JdfFile, StaysUntouchedAfterAFailure) {
    const std::string path = folder.write("job.jdf", fresh);
    for (const auto& [patches, code] : {std::pair{0, -12}, {-1, -12}, {1'000'001, -1}}) {
        job.measurement.numPatches = patches;
        EXPECT_EQ(update(path), code);
    }
    // More than 900 bytes per patch: numbers of maximum length.
    std::vector<double> high(300, 1e30);
    std::vector<spectralRow> spectral(100);
    for (spectralRow& row : spectral) {
        std::fill_n(row.values, 36, -1e30);
    }
    job.measurement.numPatches = 100;
    job.measurement.xyz = high.data();
    job.measurement.spectral = spectral.data();
    EXPECT_EQ(update(path), -30);
    EXPECT_EQ(support::contentsOf(path), fresh);
    job.measurement.spectral = nullptr;
    EXPECT_EQ(update(path), 0);

    EXPECT_EQ(update(folder.path("missing")), -1);
    EXPECT_EQ(update(folder.path()), -1);
    EXPECT_EQ(update(folder.write("job.jdf", std::string(4999, ' '))), -1);
    // A running program's file can't be written, not even by root.
    fs::copy_file("/bin/sleep", path, fs::copy_options::overwrite_existing);
    fs::permissions(path, fs::perms(0700));
    const support::RunningProgram program(path);
    EXPECT_EQ(update(path), -1);
    EXPECT_EQ(support::contentsOf(path), support::contentsOf("/bin/sleep"));
    EXPECT_EQ(std::distance(fs::directory_iterator(folder.path()), {}), 1);
}

TEST_F(JdfFile, IsReplacedBehindALinkWithItsPermissions) {
    const std::string path = folder.write("target\xE4.jdf", fresh);
    fs::permissions(path, fs::perms(0640));
    fs::create_symlink("target\xE4.jdf", folder.path("link\xE4"));
    ASSERT_EQ(update(folder.path("link\xE4")), 0);
    EXPECT_TRUE(fs::is_symlink(folder.path("link\xE4")));
    EXPECT_NE(support::contentsOf(path).find(element), std::string::npos);
    EXPECT_EQ(support::modeOf(path), 0640U);
}

TEST_F(JdfFile, TakesNamesAsLongAsNamesGet) {
    const std::string path = folder.write(std::string(255, 'j'), fresh);
    ASSERT_EQ(update(path), 0);
    EXPECT_NE(support::contentsOf(path).find(element), std::string::npos);
    EXPECT_EQ(std::distance(fs::directory_iterator(folder.path()), {}), 1);
}

TEST_F(JdfFile, IsWholeAndAloneAfterARunThatWasKilled) {
    header.party = 0;
    const std::string path = folder.write("job.jdf", fresh + std::string(30'000'000, ' '));
    ASSERT_EQ(update(path, false), 0);
    const auto size = fs::file_size(path);
    for (int round = 0; round < 20; ++round) {
        const pid_t child = fork();
        if (child == 0) {
            while (update(path, false) == 0) {
            }
            _exit(1);
        }
        usleep(20'000 + round * 2'500U);
        kill(child, SIGKILL);
        waitpid(child, nullptr, 0);
        EXPECT_EQ(std::distance(fs::directory_iterator(folder.path()), {}), 1) << round;
        EXPECT_EQ((fs::file_size(path) - size) % element.size(), 0U) << round;
    }
}

#ifndef __SANITIZE_ADDRESS__ // It needs more address space than the limit allows.
TEST_F(JdfFile, GoesWithoutAnUpdateThatMemoryIsTooSmallFor) {
    const std::string path = folder.write("job.jdf", fresh);
    job.measurement.numPatches = 1'000'000; // May need 900 MB.
    job.measurement.xyz = nullptr;
    const std::pair<rlim_t, int> limits[] = {{500'000'000, -1}, {1'200'000'000, 0}};
    for (const auto& [room, code] : limits) {
        const pid_t child = fork();
        if (child == 0) {
            const rlimit limit = {room, room};
            setrlimit(RLIMIT_AS, &limit);
            _exit(update(path) == code ? 0 : 1);
        }
        int status = 0;
        waitpid(child, &status, 0);
        EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0) << room << ": " << status;
    }
}
#endif

} // namespace
