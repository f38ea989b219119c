// SPDX-License-Identifier: Apache-2.0
// JDFs in a store, prepared by the administration tool and then updated by write-backs of the job's
// results. An XML library checks the outcome.

#include <filesystem>
#include <random>
#include <regex>
#include <sstream>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>
#include <pugixml.hpp>

#include "StoreProgram.h"
#include "jdf/JdfHandler.h"
#include "store/StoreEngine.h"

namespace {

using nlohmann::json;
using testing::HasSubstr;

const std::string jdfPath = "/server/temp/job-7.jdf";

// Lines of a nested JDF. Each contains something that a careless edit would lose.
const std::string head =
    "\xEF\xBB\xBF<?xml version=\"1.0\"?>\r\n<!DOCTYPE JDF [<!ENTITY e \"x\">]>\n"
    "<JDF xmlns=\"http://www.CIP4.org/JDFSchema_1_1\" xmlns:tazo='urn:t' "
    "ID=\"J\">\r\n<!-- no </ResourcePool> here --><Note t=\"&lt;\xC3\xBC\">&e;"
    "<![CDATA[ \"dvalue ]]></Note>\n";
const std::string parties =
    "<Sender a='1' printtime=\"08:00:00\" printdate = '2020-01-02'\n/>\n"
    "<Receiver printdate=\"2020-03-04\" x=\"\" printtime=\"\">R</Receiver>\n";
const std::string emptied = "<Sender printdate=\"\" printtime=\"\" a='1'\n/>\n"
                            "<Receiver printdate=\"\" x=\"\" printtime=\"\">R</Receiver>\n";
const std::string media = " <ResourcePool>\n  <Media/>\n";
const std::string links = "\t </ResourcePool>\n<ResourceLinkPool><MediaLink rRef='M'/>";
const std::string tail =
    "</ResourceLinkPool>\n<JDF ID='K'><ResourcePool/><x printdate=\"2020\"/></JDF>"
    "\n</JDF>\n<!-- the end -->\n";
const std::string delivered = head + parties + media + links + tail;

std::string holder(const std::string& attributes = "") {
    return "<tazo:MeasurementData" + attributes +
           " Class=\"Parameter\" ID=\"BJDFLink0000006\" Status=\"Available\">"
           "</tazo:MeasurementData>";
}
std::string linkTo(const std::string& attributes = "") {
    return "<tazo:MeasurementDataLink" + attributes + " rRef=\"BJDFLink0000006\" Usage=\"Input\"/>";
}
const std::string prepared =
    head + emptied + media + holder() + "\n" + links + linkTo() + "\n" + tail;

std::string withoutBlanks(std::string text) {
    return text.erase(text.find_last_not_of(' ') + 1);
}

/// Makes the text large enough for updates, with nothing after its end.
std::string enlarged(std::string text) {
    return text.insert(head.size(), "<!--" + std::string(9000, '.') + "-->");
}

/// A job's JDF in a store.
class JdfUpdates : public StoreProgram {
  protected:
    JdfUpdates() {
        m_store = store::openStore(m_address);
        m_store->create(3, 7);
        setText("Output/Jdf/FileName", "job-7.jdf");
        setText("System/Folders/Temp", "/server/temp");
        for (int i = 0; i < patches; ++i) {
            std::fill_n(m_spectral[i].values, 36, 0.125 * i);
        }
    }

    void setText(const std::string& key, const std::string& value) const {
        answer({"key", "set", "job/7", key, "string", value});
    }
    void put(const std::string& text) {
        std::istringstream from(text);
        m_store->putFile(jdfPath, from);
    }
    std::string stored() {
        std::ostringstream to;
        m_store->getFile(jdfPath, to);
        return to.str();
    }
    int lastVersion() { return m_store->versions(jdfPath).back().number; }
    /// The content that the latest delivery replaced.
    std::string replaced() {
        return answer({"file", "get", jdfPath, "-", "--version", std::to_string(lastVersion())});
    }

    /// Updates the local copy like a write-back of a result. Each update has its own day, and those
    /// of odd days have spectra.
    void update(char party, char strip) {
        JDFMeasurementHeader header;
        JdfHandler::SetJDFMeasurementHeaderDefaults(&header);
        header.party = party == 's' ? 1 : 2;
        header.secondStrip = strip == '2' ? 1 : 0;
        header.writePatchDefinitions = true;
        std::snprintf(header.measureDate, sizeof header.measureDate, "2024-05-%02d", ++m_day);
        KZJobDataStruct job;
        job.secondStrip = header.secondStrip;
        job.jdfLocalFile = m_folder.path("local.jdf");
        job.measurement.numPatches = patches;
        job.measurement.xyz = m_values;
        job.measurement.cmyk = m_values;
        job.measurement.hasSpectral = m_day % 2;
        job.measurement.spectral = m_day % 2 == 1 ? m_spectral : nullptr;
        ASSERT_EQ(JdfHandler::AppendJDFFileData(job, "Remote confirmation M1", &header, true), 0);
    }
    /// Performs runs, one per word. A run downloads the JDF and updates it once, or once for each
    /// job of a sheet. "s" means the sender, "r" the receiver (a remeasure); the strip follows.
    void runJobs(const std::string& runs) {
        std::istringstream words(runs);
        for (std::string run; words >> run;) {
            m_folder.write("local.jdf", stored());
            for (std::size_t i = 0; i < run.size(); i += 2) {
                update(run[i], run[i + 1]);
                put(support::contentsOf(m_folder.path("local.jdf")));
            }
        }
    }

    /// Strip and day of each measurement, such as "1:01 2:02", read by the XML library, or
    /// "damaged".
    static std::string measurements(const std::string& text) {
        // The update omits the blank between two spectral values.
        const auto readable = std::regex_replace(text, std::regex("\"dvalue"), "\" dvalue");
        pugi::xml_document document;
        if (!document.load_string(readable.c_str())) {
            return "damaged";
        }
        std::string found;
        for (const auto& node : document.select_nodes("/*/*[local-name()='ResourcePool']"
                                                      "/tazo:MeasurementData/*")) {
            const auto element = node.node();
            const std::string date = element.attribute("Date").value();
            found += (found.empty() ? "" : " ") +
                     std::string(element.name() == std::string("tazo:Measurement2") ? "2:" : "1:") +
                     date.substr(date.size() - 2);
            EXPECT_EQ(element.select_nodes("tazo:PatchData").size(), 3U);
            EXPECT_EQ(element.select_nodes("*/@dvalue35").size(), date.back() % 2 == 1 ? 3U : 0U);
        }
        return found;
    }
    /// The text without the updates' additions and without the blanks after its end.
    static std::string rest(const std::string& text) {
        const std::regex measurement("<tazo:Measurement(2?) [^]*?</tazo:Measurement\\1>\n");
        const std::regex date("(<(?:Sender|Receiver)(?=\\s)[^>]*\\sprint(?:date|time)=\")[^\"]+");
        auto result = std::regex_replace(withoutBlanks(text), measurement, "");
        result = std::regex_replace(result, date, "$1");
        return std::regex_replace(result, date, "$1");
    }
    void expectWhole(const std::string& text, const std::string& expected) {
        EXPECT_EQ(measurements(stored()), expected);
        EXPECT_EQ(rest(stored()), text);
    }

    static constexpr int patches = 3;
    double m_values[12] = {1, 200, 3, 40, 50, 60, 70, 80, 90, 1e3, 1e3, 255};
    spectralRow m_spectral[patches] = {};
    int m_day = 0;
    std::unique_ptr<store::StoreEngine> m_store;
};

TEST_F(JdfUpdates, LoseNothingOfAPreparedJdf) {
    const struct {
        const char* runs;
        const char* measurements;
        std::size_t blanks; ///< Remaining blanks of those for six.
    } cases[] = {
        {"s1 r1", "1:01 1:02", 2052},
        {"s2s2s2", "2:01 2:02 2:03", 2052 - 4 * 36},
        {"s1 s2 s1 s2 s1s1", "1:01 2:02 1:03 2:04 1:05 1:06", 0},
    };
    for (const auto& [runs, expected, blanks] : cases) {
        SCOPED_TRACE(runs);
        m_day = 0;
        put(delivered);
        EXPECT_THAT(answer({"jdf", "ready", "7", "--updates", "6"}),
                    HasSubstr("emptied printdate of Sender (2020-01-02)"));
        EXPECT_EQ(withoutBlanks(stored()), prepared);
        EXPECT_EQ(stored().size(), 5000U + 2052);
        EXPECT_EQ(replaced(), delivered);
        const int kept = lastVersion();
        EXPECT_EQ(answer({"jdf", "ready", "job/7", "--updates", "6"}), jdfPath + ": was ready\n");
        EXPECT_EQ(lastVersion(), kept);

        runJobs(runs);
        expectWhole(prepared, expected);
        const std::size_t padding = 5000 - prepared.size(); // Updates require that many bytes.
        EXPECT_EQ(stored().size() - withoutBlanks(stored()).size(), padding + blanks);
    }
    // If prepared again, it accepts more. If not, the second one damages it.
    answer({"jdf", "ready", "7"});
    runJobs("s1 s1 s1");
    expectWhole(prepared, "1:01 2:02 1:03 2:04 1:05 1:06 1:07 1:08 1:09");
    put(enlarged(delivered));
    runJobs("s1s1");
    EXPECT_EQ(measurements(stored()), "damaged");
}

TEST_F(JdfUpdates, FindTheirWayInJdfsOfOtherShapes) {
    const std::string none = " xmlns:tazo=\"urn:tazo\"";
    const std::string full = "<tazo:MeasurementData ID=\"BJDFLink0000006\" Class=\"Parameter\" "
                             "Status=\"Available\">";
    const auto pooled = [](const std::string& inside, const std::string& party = "") {
        return "<JDF xmlns:tazo='t'>" + party + "<ResourcePool>" + inside + "</ResourcePool>" +
               linkTo() + "</JDF>";
    };
    // Before and after preparation, without blanks.
    const std::pair<std::string, std::string> cases[] = {
        {"<JDF><x/></JDF>", "<JDF><x/><ResourcePool>" + holder(none) +
                                "</ResourcePool>\n<ResourceLinkPool>" + linkTo(none) +
                                "</ResourceLinkPool>\n</JDF>"},
        {"<j:JDF xmlns:j='j'><j:ResourcePool/><j:ResourceLinkPool a='/>' /></j:JDF>",
         "<j:JDF xmlns:j='j'><j:ResourcePool>" + holder(none) +
             "</j:ResourcePool><j:ResourceLinkPool a='/>' >" + linkTo(none) +
             "</j:ResourceLinkPool></j:JDF>"},
        {pooled(full + "</tazo:MeasurementData>"), pooled(holder())}, // As written by an update.
        {pooled(full.substr(0, full.size() - 1) + "/>"), pooled(holder())},
        {pooled("<tazo:MeasurementData ID='a'/>"),
         pooled("<tazo:MeasurementData ID='a'></tazo:MeasurementData>")},
        {pooled(holder(), "<Sender printdate=\"\" printtime='1'/>"),
         pooled(holder(), "<Sender printdate=\"\" printtime=\"\"/>")},
        // A date that only resembles the sender's.
        {pooled(holder(), "<SenderId/><Sender aprintdate=\"2020\" printtime='1' printdate=\"\"/>"),
         pooled(holder(),
                "<SenderId/><Sender printdate=\"\" printtime=\"\" aprintdate=\"2020\"/>")},
        // Dates of other elements, which an update would find first.
        {pooled(holder(), "<Senders><Note printdate=\"\"/></Senders><Sender/>"),
         pooled(holder(), "<Senders><Note printdate =\"\"/></Senders>"
                          "<Sender printdate=\"\" printtime=\"\"/>")},
        {pooled(holder(), "<SenderId aprintdate=\"2020\"/><Note printtime=\"\"/>"),
         pooled(holder(), "<SenderId aprintdate =\"2020\"/><Note printtime =\"\"/>")},
    };
    for (const auto& [before, after] : cases) {
        SCOPED_TRACE(before);
        m_day = 0;
        put(before);
        answer({"jdf", "ready", "7"});
        EXPECT_EQ(withoutBlanks(stored()), after);
        runJobs("s1 s2");
        expectWhole(after, "1:01 2:02");
    }

    const std::pair<std::string, const char*> refused[] = {
        {"<JDF>\n<!-- <Sender printdate=\"2020\"/> --><Sender/></JDF>",
         "line 2 would mislead the update: there is a date"},
        {"<JDF><![CDATA[<Sender printdate=\"\"]]><Sender/></JDF>", "not the Sender's"},
        {"<JDF><SenderId/><Receiver printdate=\"\"/></JDF>", "not the Sender's"},
        {"<JDF><!-- </tazo:MeasurementData> --><x/></JDF>", "no tag"},
        {"<JDF><!-- " + full + " --><x/></JDF>", "own opening tag"},
        {std::string("<\0a\0/\0>\0", 8), "UTF-16"},
    };
    for (const auto& [text, words] : refused) {
        put(text);
        expectRefusal({"jdf", "ready", "7"}, 15, words);
        EXPECT_EQ(stored(), text);
    }
}

// JDFs with elements in any order: once prepared, they accept updates and can be prepared again.
TEST_F(JdfUpdates, LeaveNoTraceInAnyJdfThatIsReady) {
    const std::string pieces[] = {
        "<Sender/>",
        "<Sender printtime=\"1\" printdate='2'><Note printdate=\"3\"/></Sender>",
        "<Receiver printdate=\"4\"/>",
        "<Receiver x=\"\" printtime=\"\">",
        "</Receiver>",
        "<SenderInfo printdate=\"\"/>",
        "<Senders>",
        "</Senders>",
        "<Note printdate=\"\" printtime=\"5\"/>",
        "<ReceiverId/>",
        "<!-- <Receiver -->",
        "<ResourcePool>",
        "</ResourcePool>",
        "<ResourcePool/>",
        "<ResourceLinkPool/>",
        holder(),
        "<tazo:MeasurementData ID=\"BJDFLink0000006\" Class=\"Parameter\" Status=\"Available\"/>",
        "<tazo:MeasurementData ID=\"x\">\n</tazo:MeasurementData >",
    };
    std::mt19937 random(1);
    int whole = 0;
    for (int round = 0; round < 60; ++round) {
        std::string text = "<JDF xmlns:tazo='t'>";
        for (auto count = random() % 9; count > 0; --count) {
            text += pieces[random() % std::size(pieces)] + (random() % 2 == 0 ? "\n  " : "");
        }
        text += "</JDF>";
        if (!pugi::xml_document().load_string(text.c_str())) {
            continue;
        }
        SCOPED_TRACE(text);
        put(text);
        const auto ready = run({"jdf", "ready", "7", "--updates", "4"});
        if (ready.exitCode != 0) {
            EXPECT_EQ(ready.exitCode, 15);
            EXPECT_EQ(stored(), text);
            continue;
        }
        const std::string before = rest(stored());
        runJobs("s1");
        for (const char party : {'r', 's', 'r'}) {
            update(party, '2');
        }
        put(support::contentsOf(m_folder.path("local.jdf")));
        EXPECT_EQ(rest(stored()), before);
        answer({"jdf", "ready", "7", "--updates", "1"});
        runJobs("r1");
        EXPECT_EQ(rest(stored()), before);
        ++whole;
    }
    EXPECT_GT(whole, 10);
}

TEST_F(JdfUpdates, ThatDidDamageAreUndone) {
    put(enlarged(delivered));
    runJobs("s1 s2s2 r1");
    put(stored() + "<tazo:Measurement a='1'><b></tazo:Measurement>"); // No version to rebuild from.
    const std::string damaged = stored();
    ASSERT_EQ(measurements(damaged), "damaged");
    const auto rebuilt = json::parse(answer({"jdf", "rebuild", "7", "--json"}));
    EXPECT_EQ(rebuilt[0]["base"], 1);
    EXPECT_EQ(rebuilt[0]["measurements"], 4);
    EXPECT_EQ(replaced(), damaged);
    const std::string whole = enlarged(prepared);
    expectWhole(whole, "1:01 2:02 2:03 1:04");

    const int kept = lastVersion();
    EXPECT_EQ(json::parse(answer({"jdf", "rebuild", "7", "--json"}))[0]["changed"], false);
    EXPECT_EQ(lastVersion(), kept);
    runJobs("s1 s1");
    answer({"jdf", "rebuild", "7", "--from", std::to_string(lastVersion())});
    expectWhole(whole, "1:01 2:02 2:03 1:04 1:05 1:06");

    // Another document of the same name is unrelated to the previous one, and may be the damaged
    // one: a person must decide.
    put("<JDF><new/></JDF>");
    for (const std::string& current : {stored(), enlarged(delivered), std::string("<JDF><new>")}) {
        put(current);
        expectRefusal({"jdf", "rebuild", "7"}, 17, "version 1 and version ");
        EXPECT_EQ(stored(), current);
    }
    put("<JDF><new/></JDF>");
    answer({"jdf", "rebuild", "7", "--from", std::to_string(lastVersion() + 1)});
    EXPECT_THAT(stored(), HasSubstr("<JDF><new/>"));
    EXPECT_EQ(measurements(stored()), "");
}

TEST_F(JdfUpdates, OfStripsAtOverlappingTimesAreBroughtTogether) {
    put(delivered);
    answer({"jdf", "ready", "7"});
    const std::string downloaded = stored(); // As downloaded by the second strip's run.
    runJobs("s1");
    m_folder.write("local.jdf", downloaded);
    update('s', '2');
    put(support::contentsOf(m_folder.path("local.jdf")));
    ASSERT_EQ(measurements(stored()), "2:02");
    answer({"jdf", "rebuild", "7"});
    expectWhole(prepared, "1:01 2:02");
}

TEST_F(JdfUpdates, RefuseTextsThatTakeMoreThanTheirShare) {
    std::string many = "<JDF>";
    for (int i = 0; i < 2'000'000; ++i) {
        many += "<a/>";
    }
    many += "</JDF>";
    put("");
    m_folder.write("store/files" + jdfPath, many); // Avoids waiting for the disk.
    expectRefusal({"jdf", "ready", "7"}, 16, "more than 2000000 elements");
    std::filesystem::resize_file(m_address + "/files" + jdfPath, (256U << 20) + 1);
    expectRefusal({"jdf", "ready", "7"}, 16, "256 MiB");
    expectRefusal({"jdf", "rebuild", "7"}, 16, "256 MiB");
    EXPECT_TRUE(m_store->versions(jdfPath).empty());
}

TEST_F(JdfUpdates, AreOfTheJdfsThatAJobNames) {
    expectRefusal({"jdf", "ready", "7"}, 1, "does not exist: " + jdfPath);
    put(delivered);
    expectRefusal({"jdf", "ready", "7", "--updates", "17"}, 16, "too many");

    // The alternative key for the folder, and the second JDF of a job printed elsewhere.
    answer({"key", "delete", "job/7", "System/Folders/Temp"});
    expectRefusal({"jdf", "ready", "7"}, 1, "names no JDF");
    setText("Workflow/RemoteOutFolder", "/server/temp");
    setText("Remote/JDFName", "/in/remote.jdf");
    answer({"file", "put", m_folder.write("remote.jdf", "<JDF><x/></JDF>"), "/in/remote.jdf"});
    EXPECT_EQ(json::parse(answer({"jdf", "ready", "7", "--json"})).size(), 1U);
    answer({"key", "set", "job/7", "Input/SubType", "int", "81"});
    const auto both = json::parse(answer({"jdf", "ready", "7", "--json"}));
    ASSERT_EQ(both.size(), 2U);
    EXPECT_EQ(both[1]["path"], "/in/remote.jdf");
    EXPECT_EQ(both[1]["changes"].size(), 3U);
}

TEST_F(JdfUpdates, ArePreparedForAtDeliveryWhereTheStoreSaysSo) {
    const std::string tree = m_folder.makeFolder("tree");
    const std::pair<std::string, std::string> files[] = {
        {"a.JDF", delivered}, {"a.xml", delivered}, {"broken.jdf", "<JDF>"}};
    for (const auto& [name, text] : files) {
        m_folder.write("tree/" + name, text);
    }
    const auto putTree = [&](const std::string& prepared, const std::string& words) {
        EXPECT_THAT(run({"file", "put", tree, "/tree"}).error, HasSubstr(words));
        for (const auto& [name, text] : files) {
            EXPECT_EQ(withoutBlanks(answer({"file", "get", "/tree/" + name, "-"})),
                      name == "a.JDF" ? prepared : text);
        }
    };
    putTree(delivered, "");
    answer({"key", "set", "system", "System/Jdf/Updates", "int", "6"});
    putTree(prepared, "delivered unchanged, /tree/broken.jdf: it is not well-formed");
    EXPECT_EQ(m_store->versions("/tree/a.JDF").size(), 2U); // Stored as delivered both times.
}

} // namespace
