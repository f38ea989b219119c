// JDFs in a store, prepared by the administration tool and then updated as the job's results are
// written back. An XML library judges what has become of them.

#include <cstring>
#include <regex>
#include <sstream>
#include <string>
#include <vector>

#include <expat.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>
#include <pugixml.hpp>

#include "RunProgram.h"
#include "ScratchFolder.h"
#include "comgui/StoreEngine.h"
#include "jdf/JdfHandler.h"

namespace {

using nlohmann::json;
using support::Outcome;
using testing::ElementsAre;
using testing::HasSubstr;

const std::string jdfPath = "/server/temp/job-7.jdf";

// Lines of a nested JDF, of which each has something that a careless hand would lose.
const std::string head =
    "\xEF\xBB\xBF<?xml version=\"1.0\"?>\r\n<!DOCTYPE JDF [<!ENTITY e \"x\">]>\n"
    "<JDF xmlns=\"http://www.CIP4.org/JDFSchema_1_1\" xmlns:tazo='urn:t' "
    "ID=\"J\">\r\n<!-- no </ResourcePool> here --><Note t=\"&lt;\xC3\xBC\">&e;"
    "<![CDATA[ \"dvalue ]]></Note>\n";
const std::string sender = "<Sender a='1' printtime=\"08:00:00\" printdate = '2020-01-02'\n/>\n";
const std::string emptySender = "<Sender printdate=\"\" printtime=\"\" a='1'\n/>\n";
const std::string receiver =
    "<Receiver printdate=\"2020-03-04\" x=\"\" printtime=\"\">R</Receiver>\n";
const std::string emptyReceiver = "<Receiver printdate=\"\" x=\"\" printtime=\"\">R</Receiver>\n";
const std::string media = " <ResourcePool>\n  <Media/>\n";
const std::string poolEnd = "\t </ResourcePool>\n";
const std::string links = "<ResourceLinkPool><MediaLink rRef='M'/>";
const std::string tail =
    "</ResourceLinkPool>\n<JDF ID='K'><ResourcePool/><x printdate=\"2020\"/></JDF>"
    "\n</JDF>\n<!-- the end -->\n";
const std::string delivered = head + sender + receiver + media + poolEnd + links + tail;

std::string holder(const std::string& attributes = "") {
    return "<tazo:MeasurementData" + attributes +
           " Class=\"Parameter\" ID=\"BJDFLink0000006\" Status=\"Available\">"
           "</tazo:MeasurementData>";
}
std::string linkTo(const std::string& attributes = "") {
    return "<tazo:MeasurementDataLink" + attributes + " rRef=\"BJDFLink0000006\" Usage=\"Input\"/>";
}
const std::string prepared = head + emptySender + emptyReceiver + media + holder() + "\n" +
                             poolEnd + links + linkTo() + "\n" + tail;

std::string withoutBlanks(std::string text) {
    return text.erase(text.find_last_not_of(' ') + 1);
}

/// Large enough for updates, with nothing behind its end.
std::string enlarged(std::string text) {
    return text.insert(head.size(), "<!--" + std::string(9000, '.') + "-->");
}

struct Written {
    int party; ///< 1 the sender, 2 the receiver: that of a remeasure.
    int strip;
};

/// A job's JDF in a store.
class JdfUpdates : public testing::TestWithParam<bool> {
  protected:
    JdfUpdates() {
        store::makeStore(m_address, "Press room");
        m_store = store::openStore(m_address);
        setText("Output/Jdf/FileName", "job-7.jdf");
        setText("System/Folders/Temp", "/server/temp");
        for (int i = 0; i < patches; ++i) {
            std::fill_n(m_spectral[i].values, 36, 0.125 * i);
        }
    }

    void setText(const std::string& key, const std::string& value) {
        m_store->create(3, 7);
        EXPECT_EQ(run({"key", "set", "job/7", key, "string", value}).exitCode, 0);
    }
    Outcome run(std::vector<std::string> arguments) const {
        arguments.insert(arguments.begin(), {TINTGATE_STORE_PROGRAM, "--store", m_address});
        return support::run(arguments);
    }
    std::string answer(const std::vector<std::string>& arguments) const {
        const Outcome outcome = run(arguments);
        EXPECT_EQ(outcome.exitCode, 0) << testing::PrintToString(arguments) << outcome.error;
        return outcome.output;
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
    std::string version(int number) {
        std::ostringstream to;
        m_store->getVersion(jdfPath, number, to);
        return to.str();
    }

    /// Updates the local copy as a result is written back, and uploads it. Each is of a day of its
    /// own.
    void update(const Written& written) {
        JDFMeasurementHeader header;
        JdfHandler::SetJDFMeasurementHeaderDefaults(&header);
        header.party = static_cast<unsigned char>(written.party);
        header.secondStrip = written.strip == 2 ? 1 : 0;
        header.writePatchDefinitions = true;
        std::snprintf(header.measureDate, sizeof header.measureDate, "2024-05-%02d", ++m_day);
        KZJobDataStruct job;
        job.secondStrip = header.secondStrip;
        job.jdfLocalFile = m_folder.path("local.jdf");
        job.measurement.numPatches = patches;
        job.measurement.xyz = m_values;
        job.measurement.cmyk = m_values;
        job.measurement.hasSpectral = GetParam() ? 1 : 0;
        job.measurement.spectral = GetParam() ? m_spectral : nullptr;
        ASSERT_EQ(JdfHandler::AppendJDFFileData(job, "Remote confirmation M1", &header, true), 0);
        put(support::contentsOf(m_folder.path("local.jdf")));
    }
    /// A run: it downloads the JDF, and writes to it once, or for each job of a sheet.
    void runJob(const std::vector<Written>& results) {
        m_folder.write("local.jdf", stored());
        for (const auto& written : results) {
            update(written);
        }
    }

    static std::string withMissingBlanks(const std::string& text) {
        return std::regex_replace(text, std::regex("\"dvalue"), "\" dvalue");
    }
    /// "1:2024-05-01" and so on: strip and date of each measurement, read by the XML library.
    std::vector<std::string> measurements(const std::string& text) {
        pugi::xml_document document;
        const std::string readable = withMissingBlanks(text);
        const auto result = document.load_buffer(readable.data(), readable.size());
        EXPECT_TRUE(result) << result.description() << " at " << result.offset;
        std::vector<std::string> found;
        const auto all = document.select_nodes("/*/*[local-name()='ResourcePool']"
                                               "/tazo:MeasurementData/*");
        for (const auto& node : all) {
            const auto element = node.node();
            const std::string name = element.name();
            found.push_back((name == "tazo:Measurement2" ? "2:" : "1:") +
                            std::string(element.attribute("Date").value()));
            EXPECT_EQ(element.select_nodes("tazo:PatchData").size(), 3U);
            EXPECT_EQ(element.select_nodes("*/@dvalue35").size(), GetParam() ? 3U : 0U);
            EXPECT_NE(element.attribute("TotalPass"), nullptr);
        }
        return found;
    }
    /// Whether a reader that knows namespaces takes the text.
    static bool isWellFormed(const std::string& text) {
        const std::string readable = withMissingBlanks(text);
        const std::unique_ptr<XML_ParserStruct, decltype(&XML_ParserFree)> parser(
            XML_ParserCreateNS(nullptr, ' '), XML_ParserFree);
        return XML_Parse(parser.get(), readable.data(), static_cast<int>(readable.size()), 1) ==
               XML_STATUS_OK;
    }
    /// The text without what updates put into it, and without the blanks behind its end.
    static std::string rest(const std::string& text) {
        const std::regex measurement("<tazo:Measurement(2?) [^]*?</tazo:Measurement\\1>\n");
        const std::regex date("(<(?:Sender|Receiver)[^>]*\\sprint(?:date|time)=\")[^\"]+");
        auto result = std::regex_replace(withoutBlanks(text), measurement, "");
        result = std::regex_replace(result, date, "$1");
        return std::regex_replace(result, date, "$1");
    }
    void expectWhole(const std::string& text, const std::vector<std::string>& expected) {
        const std::string now = stored();
        EXPECT_TRUE(isWellFormed(now));
        EXPECT_EQ(measurements(now), expected);
        EXPECT_EQ(rest(now), text);
    }

    static constexpr int patches = 3;
    double m_values[12] = {1, 200, 3, 40, 50, 60, 70, 80, 90, 1e3, 1e3, 255};
    spectralRow m_spectral[patches] = {};
    int m_day = 0;
    const support::ScratchFolder m_folder;
    const std::string m_address = m_folder.path("store");
    std::unique_ptr<store::StoreEngine> m_store;
};

INSTANTIATE_TEST_SUITE_P(WithoutAndWithSpectra, JdfUpdates, testing::Bool());

TEST_P(JdfUpdates, LoseNothingOfAPreparedJdf) {
    const struct {
        const char* name;
        std::vector<std::vector<Written>> runs;
        std::vector<std::string> expected;
        std::size_t blanks; ///< That are left of those for six.
    } cases[] = {
        {"first strip", {{{1, 1}}}, {"1:2024-05-01"}, 2052},
        {"both strips", {{{1, 1}}, {{1, 2}}}, {"1:2024-05-01", "2:2024-05-02"}, 2052 - 36},
        {"remeasured", {{{1, 1}}, {{2, 1}}}, {"1:2024-05-01", "1:2024-05-02"}, 2052},
        {"nested",
         {{{1, 2}, {1, 2}, {1, 2}}},
         {"2:2024-05-01", "2:2024-05-02", "2:2024-05-03"},
         2052 - 4 * 36},
        {"six",
         {{{1, 1}}, {{1, 2}}, {{1, 1}}, {{1, 2}}, {{1, 1}, {1, 1}}},
         {"1:2024-05-01", "2:2024-05-02", "1:2024-05-03", "2:2024-05-04", "1:2024-05-05",
          "1:2024-05-06"},
         0},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.name);
        m_day = 0;
        put(delivered);
        const std::string told = answer({"jdf", "ready", "7", "--updates", "6"});
        EXPECT_THAT(told, HasSubstr("emptied printdate of Sender (2020-01-02)"));
        const std::string ready = stored();
        EXPECT_EQ(withoutBlanks(ready), prepared);
        EXPECT_EQ(ready.size(), 5000U + 2052);
        const int kept = m_store->versions(jdfPath).back().number;
        EXPECT_EQ(version(kept), delivered);

        EXPECT_EQ(answer({"jdf", "ready", "job/7", "--updates", "6"}), jdfPath + ": was ready\n");
        EXPECT_EQ(m_store->versions(jdfPath).back().number, kept);

        for (const auto& results : c.runs) {
            runJob(results);
        }
        expectWhole(prepared, c.expected);
        const std::size_t padding = 5000 - prepared.size(); // Updates want that many bytes.
        EXPECT_EQ(stored().size() - withoutBlanks(stored()).size(), padding + c.blanks);
    }
    // Made ready again it bears more of them; a JDF that isn't is damaged by the second.
    answer({"jdf", "ready", "7"});
    EXPECT_EQ(measurements(stored()).size(), 6U);
    for (int i = 0; i < 8; ++i) {
        runJob({{1, 1}});
    }
    EXPECT_EQ(measurements(stored()).size(), 14U);
    EXPECT_EQ(rest(stored()), prepared);
    put(enlarged(delivered));
    runJob({{1, 1}, {1, 1}});
    EXPECT_FALSE(isWellFormed(stored()));
}

TEST_P(JdfUpdates, FindTheirWayInJdfsOfOtherShapes) {
    const std::string none = " xmlns:tazo=\"urn:tazo\"";
    const std::string full = "<tazo:MeasurementData ID=\"BJDFLink0000006\" Class=\"Parameter\" "
                             "Status=\"Available\">";
    const std::string declared = "<JDF xmlns:tazo='t'>";
    const struct {
        const char* name;
        std::string before, after; ///< Without blanks; empty where nothing is prepared.
        std::string words;
    } cases[] = {
        {"no namespace, no pools", "<JDF><x/></JDF>",
         "<JDF><x/><ResourcePool>" + holder(none) + "</ResourcePool>\n<ResourceLinkPool>" +
             linkTo(none) + "</ResourceLinkPool>\n</JDF>",
         ""},
        {"empty pools, all with a prefix",
         "<j:JDF xmlns:j='j'><j:ResourcePool/>"
         "<j:ResourceLinkPool a='/>' /></j:JDF>",
         "<j:JDF xmlns:j='j'><j:ResourcePool>" + holder(none) +
             "</j:ResourcePool><j:ResourceLinkPool a='/>' >" + linkTo(none) +
             "</j:ResourceLinkPool></j:JDF>",
         ""},
        {"our element, as an update made it",
         declared + "<ResourcePool>" + full + "</tazo:MeasurementData></ResourcePool>" + linkTo() +
             "</JDF>",
         declared + "<ResourcePool>" + holder() + "</ResourcePool>" + linkTo() + "</JDF>", ""},
        {"our element, empty",
         declared + "<ResourcePool><tazo:MeasurementData ID='a'/></ResourcePool>" + linkTo() +
             "</JDF>",
         declared +
             "<ResourcePool><tazo:MeasurementData ID='a'></tazo:MeasurementData>"
             "</ResourcePool>" +
             linkTo() + "</JDF>",
         ""},
        {"our element, with blanks in its end tag",
         declared + "<ResourcePool>" + full + "</tazo:MeasurementData\n></ResourcePool>" +
             linkTo() + "</JDF>",
         declared + "<ResourcePool>" + holder() + "</ResourcePool>" + linkTo() + "</JDF>", ""},
        {"a date that only looks like the sender's",
         declared +
             "<SenderId/><Sender aprintdate=\"2020\" printtime='1' printdate=\"\"/>"
             "<ResourcePool/>" +
             linkTo() + "</JDF>",
         declared +
             "<SenderId/><Sender printdate=\"\" printtime=\"\" aprintdate=\"2020\"/>"
             "<ResourcePool>" +
             holder() + "</ResourcePool>" + linkTo() + "</JDF>",
         ""},
        {"a date in a comment", "<JDF>\n<!-- <Sender printdate=\"2020\"/> --><Sender/></JDF>", "",
         "line 2 would mislead the update: a date"},
        {"the date of another", "<JDF><SenderId/><x printtime=\"2020\"/></JDF>", "", "a date"},
        {"an end tag in a comment", "<JDF><!-- </tazo:MeasurementData> --><x/></JDF>", "",
         "no tag"},
        {"our tag in a comment", "<JDF><!-- " + full + " --><x/></JDF>", "", "own opening tag"},
        {"an empty document", "<JDF/>", "", "nothing in the document"},
        {"not well-formed", "<JDF>\n</x>", "", "line 2: mismatched tag"},
        {"UTF-16", std::string("<\0a\0/\0>\0", 8), "", "UTF-16"},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.name);
        m_day = 0;
        put(c.before);
        const Outcome outcome = run({"jdf", "ready", "7"});
        EXPECT_EQ(outcome.exitCode, c.after.empty() ? 15 : 0) << outcome.error;
        EXPECT_THAT(outcome.error, HasSubstr(c.words));
        EXPECT_EQ(withoutBlanks(stored()), c.after.empty() ? c.before : c.after);
        if (!c.after.empty()) {
            runJob({{1, 1}});
            runJob({{1, 2}});
            expectWhole(c.after, {"1:2024-05-01", "2:2024-05-02"});
        }
    }
}

TEST_P(JdfUpdates, ThatDidDamageAreUndone) {
    put(enlarged(delivered));
    runJob({{1, 1}});
    runJob({{1, 2}, {1, 2}});
    runJob({{2, 1}});
    ASSERT_FALSE(isWellFormed(stored()));
    const std::string damaged = stored();
    const std::vector<std::string> all = {"1:2024-05-01", "2:2024-05-02", "2:2024-05-03",
                                          "1:2024-05-04"};
    const auto rebuilt = json::parse(answer({"jdf", "rebuild", "7", "--json"}));
    EXPECT_EQ(rebuilt[0]["base"], 1);
    EXPECT_EQ(rebuilt[0]["measurements"], 4);
    EXPECT_EQ(withoutBlanks(version(m_store->versions(jdfPath).back().number)), damaged);
    const std::string whole = enlarged(prepared);
    expectWhole(whole, all);

    const std::size_t versions = m_store->versions(jdfPath).size();
    EXPECT_EQ(json::parse(answer({"jdf", "rebuild", "7", "--json"}))[0]["changed"], false);
    EXPECT_EQ(m_store->versions(jdfPath).size(), versions);
    runJob({{1, 1}});
    runJob({{1, 1}});
    EXPECT_EQ(measurements(stored()).size(), 6U);
    EXPECT_EQ(rest(stored()), whole);

    // Another document under the same name has nothing to do with what was before.
    put("<JDF><new/></JDF>");
    answer({"jdf", "rebuild", "7", "--from", std::to_string(versions + 4)});
    EXPECT_THAT(stored(), HasSubstr("<JDF><new/>"));
    EXPECT_TRUE(measurements(stored()).empty());
    put("<JDF>");
    EXPECT_EQ(run({"jdf", "rebuild", "7", "--from", "99"}).exitCode, 15);
    EXPECT_EQ(stored(), "<JDF>");
}

class JdfCommands : public JdfUpdates {};
INSTANTIATE_TEST_SUITE_P(Once, JdfCommands, testing::Values(false));

TEST_P(JdfCommands, SayWhatIsMissing) {
    const auto refused = [&](const std::vector<std::string>& arguments, int code) {
        const Outcome outcome = run(arguments);
        EXPECT_EQ(outcome.exitCode, code) << testing::PrintToString(arguments);
        return outcome.error;
    };
    EXPECT_THAT(refused({"jdf", "ready", "8"}, 1), HasSubstr("no job/8"));
    EXPECT_THAT(refused({"jdf", "ready", "7"}, 1), HasSubstr("not there: " + jdfPath));
    EXPECT_THAT(refused({"jdf", "rebuild", "preset/1"}, 3), HasSubstr("no job"));
    put(delivered);
    EXPECT_THAT(refused({"jdf", "ready", "7", "--updates", "17"}, 16), HasSubstr("too many"));
    refused({"jdf", "ready", "7", "--updates", "0"}, 3);
    EXPECT_EQ(stored(), delivered);
    answer({"jdf", "ready", "7", "--updates", "16"});
    EXPECT_EQ(stored().size(), 5000U + 2358684);

    // The folder's other key; and the second JDF of a job that is printed elsewhere.
    answer({"key", "delete", "job/7", "System/Folders/Temp"});
    EXPECT_THAT(refused({"jdf", "ready", "7"}, 1), HasSubstr("names no JDF"));
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

TEST_P(JdfCommands, PrepareAtDeliveryWhereTheStoreSaysSo) {
    const auto deliver = [&](const std::string& local, const std::string& path) {
        const Outcome outcome = run({"file", "put", local, path});
        EXPECT_EQ(outcome.exitCode, 0);
        return outcome.error;
    };
    const std::string file = m_folder.write("given", delivered);
    deliver(file, jdfPath);
    EXPECT_EQ(stored(), delivered);
    answer({"key", "set", "system", "System/Jdf/Updates", "int", "6"});
    EXPECT_EQ(deliver(file, jdfPath), "");
    EXPECT_EQ(withoutBlanks(stored()), prepared);
    EXPECT_EQ(stored().size(), 5000U + 2052);
    EXPECT_EQ(version(m_store->versions(jdfPath).back().number), delivered);
    EXPECT_EQ(answer({"jdf", "ready", "7"}), jdfPath + ": was ready\n");

    m_folder.makeFolder("tree");
    m_folder.write("tree/A.JDF", delivered);
    m_folder.write("tree/a.xml", delivered);
    m_folder.write("tree/broken.jdf", "<JDF>");
    EXPECT_THAT(deliver(m_folder.path("tree"), "/tree"),
                HasSubstr("delivered as it is, /tree/broken.jdf: it is not well-formed"));
    EXPECT_EQ(withoutBlanks(answer({"file", "get", "/tree/A.JDF", "-"})), prepared);
    EXPECT_EQ(answer({"file", "get", "/tree/a.xml", "-"}), delivered);
    EXPECT_EQ(answer({"file", "get", "/tree/broken.jdf", "-"}), "<JDF>");
}

} // namespace
