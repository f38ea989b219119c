#include "jdf/JdfHandler.h"

#include <cmath>
#include <cstring>
#include <filesystem>
#include <vector>

#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include "RunProgram.h"
#include "ScratchFolder.h"

namespace {

const std::string link = "<tazo:MeasurementDataLink rRef=\"BJDFLink0000006\" Usage=\"Input\"/>\n";
const std::string opening =
    "<tazo:MeasurementData ID=\"BJDFLink0000006\" Class=\"Parameter\" Status=\"Available\">";
const std::string closing = "</tazo:MeasurementData>";
const std::string padding = "<!--" + std::string(5000, '-') + "-->\n";
const std::string party = "<Sender printdate=\"\" printtime=\"\"/>\n<Receiver/>\n";
const std::string resources = "  <Media/>\n \t</ResourcePool>\n";
const std::string links = "  <MediaLink/>\n  </ResourceLinkPool>\n";
const std::string tail = "</JDF>\n";

/// A job with one patch, whose measurement comes out as `element`.
class JdfFile : public testing::Test {
  protected:
    JdfFile() {
        std::strcpy(header.printDate, "2025-01-02");
        std::strcpy(header.printTime, "10:11:12");
        std::strcpy(header.measureDate, "2024-05-31");
        header.party = 1;
        job.measurement.numPatches = 1;
        job.measurement.xyz = xyz;

        std::string buffer(1000, ' ');
        long length = 0;
        EXPECT_EQ(WriteJDFMeasureData(buffer.data(), buffer.data(), buffer.data() + 1000, &length,
                                      job.measurement, &header, "comment"),
                  0);
        element = buffer.substr(0, static_cast<std::size_t>(length));
    }

    int update(const std::string& contents, bool replace = true) {
        return updateAt(folder.write("job.jdf", contents), replace);
    }

    int updateAt(const std::string& path, bool replace = true) {
        job.jdfLocalFile = wxString(stringToWstring(path));
        return JdfHandler::AppendJDFFileData(job, "comment", &header, replace);
    }

    std::string contents() { return support::contentsOf(folder.path("job.jdf")); }

    support::ScratchFolder folder;
    double xyz[3] = {10, 20, 30};
    JDFMeasurementHeader header;
    KZJobDataStruct job;
    std::string element;
};

/// What the required delete leaves of a text.
std::string deleted(const std::string& text, const std::string& from, const std::string& to) {
    const auto at = text.find(from);
    const auto count = text.find(to, at) - at;
    return text.substr(0, at + count) + text.substr(at, text.size() - 2 * count - at);
}

std::string replaced(std::string text, const std::string& from, const std::string& to) {
    return text.replace(text.find(from), from.size(), to);
}

TEST_F(JdfFile, ReceivesDateLinkResourceAndMeasurement) {
    const std::string stamped =
        "<Sender printdate=\"2025-01-02\" printtime=\"10:11:12\"/>\n<Receiver/>\n";
    const std::string holder = opening + element + closing + "\n";
    const struct {
        const char* name;
        std::string before;
        std::string after;
    } cases[] = {
        {"fresh", padding + party + resources + links + tail,
         padding + stamped + "  <Media/>\n" + holder + " \t</ResourcePool>\n  <MediaLink/>\n" +
             link + "  </ResourceLinkPool>\n" + tail},
        {"with a link and a measurement",
         padding + party + "<tazo:MeasurementDataLink/>" + opening + "<old/>\n  " + closing +
             "\n</ResourcePool>\n" + tail,
         padding + stamped + "<tazo:MeasurementDataLink/>" + opening + "<old/>\n" + element + "  " +
             closing + "\n</ResourcePool>\n" + tail},
        {"without a party", padding + "<tazo:MeasurementDataLink/></ResourcePool>\n",
         padding + "<tazo:MeasurementDataLink/>" + holder + "</ResourcePool>\n"},
        {"date in a later element, no end of the time",
         padding + "<Sender/><x printdate=\"\"/><tazo:MeasurementDataLink/>" + resources +
             "printtime=",
         padding + "<Sender/><x printdate=\"2025-01-02\"/><tazo:MeasurementDataLink/>  <Media/>\n" +
             holder + " \t</ResourcePool>\nprinttime="},
        {"no closing quote", padding + resources + links + "<Sender printdate=\"x",
         padding + "  <Media/>\n" + holder + " \t</ResourcePool>\n  <MediaLink/>\n" + link +
             "  </ResourceLinkPool>\n<Sender printdate=\"2025-01-02x"},
        {"no pool of links", padding + party + resources, element + padding + stamped + resources},
        {"no pool", padding + party + links,
         element + padding + stamped + "  <MediaLink/>\n" + link + "  </ResourceLinkPool>\n"},
    };
    for (const auto& c : cases) {
        EXPECT_EQ(update(c.before, false), 0) << c.name;
        EXPECT_EQ(contents(), c.after) << c.name;
    }
}

TEST_F(JdfFile, KeepsWhatItShouldDelete) {
    // A date that was there stands twice behind the new one.
    std::string before =
        padding + "<Sender printdate=\"2020\"/>\n" + resources + links + tail + padding;
    ASSERT_EQ(update(before), 0);
    EXPECT_NE(contents().find("<Sender printdate=\"2025-01-0220202020\"/>\n"), std::string::npos);
    std::string shorter = before.substr(0, before.size() - 8); // twice the four digits
    EXPECT_EQ(contents().substr(contents().size() - 100), shorter.substr(shorter.size() - 100));

    // An element that is replaced follows once more, and the new one goes into the first.
    header.party = 0;
    before = padding + "<tazo:MeasurementDataLink/>" + opening + "<old/>" + closing + "\n" +
             resources + tail + padding;
    ASSERT_EQ(update(before), 0);
    const std::string twice = deleted(before, opening, "</ResourcePool>");
    EXPECT_EQ(contents(), replaced(twice, closing, element + closing));

    // The remains of an element without a closing tag.
    before = padding + "<tazo:MeasurementDataLink/><tazo:MeasurementData ID=\"x\">" + resources +
             tail + padding;
    ASSERT_EQ(update(before), 0);
    const std::string remains = deleted(before, "<tazo:MeasurementData ID=", "</ResourcePool>");
    const auto pool = remains.find(" \t</ResourcePool>");
    ASSERT_NE(pool, std::string::npos);
    EXPECT_EQ(contents(),
              remains.substr(0, pool) + opening + element + closing + "\n" + remains.substr(pool));

    // Without a pool of links the deletion takes place too, and leads to another position.
    before = padding + opening + "<old/>" + closing + "\n" + resources + tail + padding;
    ASSERT_EQ(update(before), 0);
    const std::string unlinked = deleted(before, opening, "</ResourcePool>");
    const auto at = before.find(" \t</ResourcePool>");
    EXPECT_EQ(contents(), unlinked.substr(0, at) + element + unlinked.substr(at));
}

TEST_F(JdfFile, OfTheSecondStripGoesBehindTheFirst) {
    job.secondStrip = header.secondStrip = 1;
    header.party = 2;
    const std::string before = padding + "<Receiver printtime=\"\" printdate=\"\">" +
                               "<tazo:MeasurementDataLink/>" + opening + "<first/>" + closing +
                               resources;
    ASSERT_EQ(update(before, false), 0);
    EXPECT_NE(contents().find("<first/><tazo:Measurement2 Date=\"2024-05-31\""), std::string::npos);
    // The time is looked for behind the date only.
    EXPECT_NE(contents().find("<Receiver printtime=\"\" printdate=\"2025-01-02\">"),
              std::string::npos);
}

TEST_F(JdfFile, StaysUntouchedAfterAFailure) {
    const std::string fresh = padding + party + resources + links + tail;
    job.measurement.numPatches = 0;
    EXPECT_EQ(updateAt(folder.path("missing")), -12);
    EXPECT_EQ(update(fresh), -12);
    job.measurement.numPatches = 1;
    EXPECT_EQ(updateAt(folder.path("missing")), -1);
    EXPECT_EQ(updateAt(folder.path()), -1);
    EXPECT_EQ(update(std::string(4999, ' ')), -1);
    EXPECT_EQ(contents(), std::string(4999, ' '));
    job.measurement.numPatches = 1'000'001;
    EXPECT_EQ(update(fresh), -1);

    // More than 900 bytes a patch: numbers as long as they get.
    std::vector<double> high(400, 1e30);
    std::vector<spectralRow> spectral(100);
    for (spectralRow& row : spectral) {
        std::fill_n(row.values, 36, -1000.0);
    }
    job.measurement.numPatches = 100;
    job.measurement.xyz = job.measurement.cmyk = high.data();
    job.measurement.spectral = spectral.data();
    header.writePatchDefinitions = true;
    EXPECT_EQ(update(fresh), -30);
    EXPECT_EQ(contents(), fresh);
    job.measurement.spectral = nullptr;
    EXPECT_EQ(update(fresh), 0);
    EXPECT_NE(contents(), fresh);
    EXPECT_EQ(std::distance(std::filesystem::directory_iterator(folder.path()), {}), 1);
}

TEST_F(JdfFile, IsReplacedBehindALinkWithItsPermissions) {
    const std::string path = folder.write("target\xE4.jdf", padding + resources + links + tail);
    std::filesystem::permissions(path, std::filesystem::perms(0640));
    std::filesystem::create_symlink("target\xE4.jdf", folder.path("job.jdf"));
    ASSERT_EQ(updateAt(folder.path("job.jdf")), 0);
    EXPECT_TRUE(std::filesystem::is_symlink(folder.path("job.jdf")));
    EXPECT_NE(support::contentsOf(path).find(element), std::string::npos);
    EXPECT_EQ(support::modeOf(path), 0640U);
    ASSERT_EQ(updateAt(path), 0); // a name that is not UTF-8
}

TEST_F(JdfFile, ThatMayNotBeWrittenGivesMinusOne) {
    const std::string path = folder.write("job.jdf", padding + resources + links + tail);
    std::filesystem::permissions(path, std::filesystem::perms(0444));
    support::giveTo(support::ordinaryUser, folder.path());
    const pid_t child = fork();
    ASSERT_GE(child, 0);
    if (child == 0) { // permissions do not bind root
        _exit(support::becomeUser(support::ordinaryUser) ? updateAt(path) + 100 : 0);
    }
    int status = 0;
    ASSERT_EQ(waitpid(child, &status, 0), child);
    ASSERT_TRUE(WIFEXITED(status));
    EXPECT_EQ(WEXITSTATUS(status) - 100, -1);
    EXPECT_EQ(contents(), padding + resources + links + tail);
}

TEST(JdfHeader, HasDefaults) {
    JDFMeasurementHeader header;
    std::memset(static_cast<void*>(&header), 0x55, sizeof header);
    JdfHandler::SetJDFMeasurementHeaderDefaults(&header);
    EXPECT_EQ(std::string(header.printDate).size(), 10U);
    EXPECT_EQ(std::string(header.printTime).size(), 8U);
    for (const char* empty : {header.measureDate, header.measureTime, header.profileName}) {
        EXPECT_STREQ(empty, "");
    }
    EXPECT_STREQ(header.deltaEType, "CMC");
    EXPECT_STREQ(header.cmmVersion, "1.1.2.3");
    EXPECT_FALSE(header.approval || header.totalPass || header.paperWhitePass ||
                 header.writePatchDefinitions || header.party);
    EXPECT_EQ(header.maxTolerance + header.maxDeltaE + header.averageTolerance +
                  header.averageDeltaE,
              0.0);
    EXPECT_EQ(header.secondStrip, 0x55); // the caller's
}

} // namespace
