// SPDX-License-Identifier: Apache-2.0
#include "analysis/Presets.h"

#include <algorithm>
#include <filesystem>
#include <string>

#include <gtest/gtest.h>

#include "ExitCodes.h"
#include "ScratchFolder.h"
#include "base/WideBytes.h"

using namespace analysis;
using Record = tolerancePresetParameterRecord;

namespace {

const char* const goodText = R"(<?xml version="1.0" encoding="UTF-8"?>
<!-- a comment -->
<tolerancePreset version="1">
  <id>12</id>
  <name> Haus &amp; Hof ü </name>
  <formula>CIECMC_2_1</formula>
  <editable>yes</editable>
  <showInClient>no</showInClient>
  <usedForDynamicWedge>yes</usedForDynamicWedge>
  <illuminationCondition>-1</illuminationCondition>
  <psd>no</psd>
  <criteria>
    <average tolerance="2.5" used="yes" decimals="2"/>
    <greyHueAverage tolerance="1000" used="no" decimals="10" psdTolerance="0" psdUsed="yes"/>
    <spotMaximum tolerance="1e1" used="yes" decimals="0" psdTolerance=" 4 " psdUsed="no"></spotMaximum>
  </criteria>
</tolerancePreset>
)";

/// A record full of what must survive or go.
Record filled() {
    Record record;
    record.filePath = "kept.xml";
    record.presetID = 77;
    record.name = "old";
    record.deltaEMode = 3;
    record.fograPSDPreset = 1;
    std::fill(std::begin(record.presetValues), std::end(record.presetValues), 9.0);
    std::fill(std::begin(record.usedForResult), std::end(record.usedForResult), 1);
    return record;
}

} // namespace

TEST(Presets, EverythingOfTheRecordComesFromTheFile) {
    for (const bool keepJobChoice : {false, true}) {
        Record record = filled();
        ASSERT_EQ(parsePreset(goodText, keepJobChoice, record), exitDone);
        EXPECT_EQ(record.presetID, keepJobChoice ? 77 : 12);
        EXPECT_EQ(record.deltaEMode, keepJobChoice ? 3 : 5);
        EXPECT_EQ(record.name, wxString(L"Haus & Hof ü"));
        EXPECT_EQ(record.filePath, "kept.xml");
        EXPECT_EQ(record.editable, 1);
        EXPECT_EQ(record.illuminationCondition, -1);
        EXPECT_EQ(record.fograPSDPreset, 0);
        for (int i = 0; i < presetValueCount; ++i) {
            EXPECT_EQ(record.presetValues[i], i == 0 ? 2.5 : i == 19 ? 10 : i == 22 ? 1000 : 0);
            EXPECT_EQ(record.usedForResult[i], i == 0 || i == 19 ? 1 : 0);
            EXPECT_EQ(record.decimalPlaces[i], i == 0 ? 2 : i == 22 ? 10 : 0);
        }
        for (int i = 0; i < psdPresetValueCount; ++i) {
            EXPECT_EQ(record.psdPresetValues[i], i == 21 ? 4 : 0);
            EXPECT_EQ(record.usedForPSDResult[i], i == 22 ? 1 : 0);
        }
    }
}

TEST(Presets, AFaultIsNamedWithElementAndLine) {
    const struct {
        std::string from, to;
        std::size_t line;
        const char* description;
    } edits[] = {
        {"</tolerancePreset>", "</criteria>", 17, "Start-end tags mismatch"},
        {"ü", "\xFC", 5, "<name> is not UTF-8"},
        {"<!-- a comment -->", "<!DOCTYPE a>", 2, "a preset has no document type"},
        {" version=\"1\"", "", 3, "version of <tolerancePreset> is missing or empty"},
        {"<id>12</id>\n", "\n", 3, "<id> is missing or empty"},
        {">yes<", "><", 7, "<editable> is missing or empty"},
        {"used=\"yes\"", "", 13, "used of <average> is missing or empty"},
        {"<psd>no", "<psd>yes", 13, "psdTolerance of <average> is missing or empty"},
        {"<psd>no", "\n<psd>no</psd><psd>no", 12, "<psd> appears twice"},
        {"decimals=\"10\"", "decimals=\"10\" decimals=\"1\"", 14,
         "decimals of <greyHueAverage> appears twice"},
        {"2.5", "2,5", 13, "tolerance of <average> is not a number: 2,5"},
        {"1e1", "1e9", 15,
         "tolerance of <spotMaximum> is outside its range or not one of its choices: 1e9"},
        {"<average", "<avarage", 13, "<avarage> is unknown here"},
        {"<average", "<average colour=\"1\"", 13, "colour of <average> is unknown here"},
        {"<average", "more <average", 13, "text in <criteria> is unknown here"},
    };
    for (const auto& [from, to, line, description] : edits) {
        std::string text = goodText;
        text.replace(text.find(from), from.size(), to);
        Record record;
        PresetFault fault;
        EXPECT_NE(parsePreset(text, false, record, &fault), exitDone);
        EXPECT_EQ(fault.line, line) << description;
        EXPECT_EQ(fault.description, description);
    }
    // The parser counts in UTF-8.
    const std::string umlauts(30, '\xFC');
    Record record;
    PresetFault fault;
    EXPECT_EQ(parsePreset("<?xml version=\"1.0\" encoding=\"ISO-8859-1\"?>\n<!--" + umlauts +
                              "-->\n<tolerancePreset version=\"1\">\n\n\n<colour/>\n\n\n\n\n"
                              "</tolerancePreset>",
                          false, record, &fault),
              exitPresetUnknownEntry);
    EXPECT_EQ(fault.line, 6u);
}

// What becomes of the text above with a word of it replaced.
TEST(Presets, OneCodeForOneCause) {
    const std::tuple<std::string, std::string, int> edits[] = {
        {"</tolerancePreset>", "", exitPresetNotXml},
        {"</tolerancePreset>", "</tolerancePreset>more", exitPresetNotXml},
        {"<psd>", std::string("\0<psd>", 6), exitPresetNotXml},
        {"ü", "\xFC", exitPresetNotXml},
        {"<tolerancePreset", "<!DOCTYPE a><tolerancePreset", exitPresetWrongKind},
        {" version=\"1\"", "", exitPresetValueMissing},
        {"<id>12</id>", "", exitPresetValueMissing},
        {"used=\"yes\"", "", exitPresetValueMissing},
        {"<psd>no", "<psd>yes", exitPresetValueMissing},
        {"<id>12</id>", "<id>12</id><id>12</id>", exitPresetValueRepeated},
        {"greyHueAverage", "average", exitPresetValueRepeated},
        {"used=\"yes\"", "used=\"yes\" used=\"yes\"", exitPresetValueRepeated},
        {"2.5", "2,5", exitPresetNotNumeric},
        {"2.5", "nan", exitPresetNotNumeric},
        {"2.5", "-2.5", exitPresetOutOfRange},
        {"2.5", "1e999", exitPresetOutOfRange},
        {"\"1000\"", "\"1000.0001\"", exitPresetOutOfRange},
        {"\"10\"", "\"11\"", exitPresetOutOfRange},
        {"version=\"1\"", "version=\"2\"", exitPresetOutOfRange},
        {"CIECMC_2_1", "CIE2001", exitPresetOutOfRange},
        {"<psd>", "<colour/><psd>", exitPresetUnknownEntry},
        {"<average", "<avarage", exitPresetUnknownEntry},
        {"<psd>", "true <psd>", exitPresetUnknownEntry},
        {"<psd>", "<repeats/><psd>", exitPresetValueMissing},
        {"<psd>", "<repeats>both</repeats><psd>", exitPresetOutOfRange},
        {"<psd>", "<repeats>mean</repeats><repeats>mean</repeats><psd>", exitPresetValueRepeated},
        {"<psd>", "<minimumGreys>0</minimumGreys><psd>", exitPresetOutOfRange},
        {"<psd>", "<inks> </inks><psd>", exitPresetValueMissing},
        {"<psd>", "<inks>Orange,,Violet</inks><psd>", exitPresetValueMissing},
        {"<psd>", "<inks>Orange,</inks><psd>", exitPresetValueMissing},
        {"<psd>", "<inks>Orange, Violet, ORANGE</inks><psd>", exitPresetValueRepeated},
        {"<psd>", "<inks>cyan, Orange</inks><psd>", exitPresetOutOfRange},
        {"<psd>", "<inks>Orange, K</inks><psd>", exitPresetOutOfRange},
        {"<psd>", "<inks>Orange\nViolet</inks><psd>", exitPresetOutOfRange},
        {"<psd>", "<inks>" + std::string(101, 'a') + "</inks><psd>", exitPresetOutOfRange},
        {"<psd>", "<inks>Gr\xFCn</inks><psd>", exitPresetNotXml},
        {"<psd>", "<inks><ink>Orange</ink></inks><psd>", exitPresetUnknownEntry},
        {"<psd>", "<paper>white</paper><psd>", exitPresetOutOfRange},
        {"<psd>", "<toneAims>D</toneAims><psd>", exitPresetOutOfRange},
        {"<psd>", "<toneAimsBlack/><psd>", exitPresetValueMissing},
        {"<psd>", "<greyWeights>equal</greyWeights><greyWeights>equal</greyWeights><psd>",
         exitPresetValueRepeated},
        {"<psd>", "<spotToneAims>A</spotToneAims><psd>", exitPresetOutOfRange},
        {"<psd>", "<psd required=\"yes\">", exitPresetUnknownEntry},
        {"Condition>-1", "Condition required=\"1\">-1", exitPresetOutOfRange},
        {"Condition>-1", "Condition required=\"yes\">4", exitPresetOutOfRange},
        {"<average", "<repeatSpread tolerance=\"1\" decimals=\"0\"/><average",
         exitPresetValueMissing},
    };
    const auto expect = [](const std::string& text, int code) {
        Record record = filled();
        EXPECT_EQ(parsePreset(text, false, record), code);
        EXPECT_TRUE(record.name == "old" && record.presetID == 77 && record.deltaEMode == 3 &&
                    record.presetValues[0] == 9.0 && record.fograPSDPreset == 1);
    };
    for (const auto& [from, to, code] : edits) {
        SCOPED_TRACE(from + " -> " + to);
        std::string text = goodText;
        expect(text.replace(text.find(from), from.size(), to), code);
    }
    std::string deep;
    for (const char* tag : {"<a>", "</a>"}) {
        for (int i = 0; i < 100000; ++i) {
            deep += tag;
        }
    }
    expect(deep, exitPresetWrongKind);
    expect(goodText + std::string(maxPresetBytes, ' '), exitPresetWrongKind);
    for (const char* noXml : {"", " \n", "CGATS.17\n"}) {
        expect(noXml, exitPresetNotXml);
    }
}

TEST(Presets, Files) {
    const support::ScratchFolder folder;
    Record record;
    EXPECT_EQ(readPreset(folder.path("none.xml"), false, record), exitPresetMissing);
    EXPECT_EQ(readPreset(folder.path(), false, record), exitPresetUnreadable);
    EXPECT_EQ(readPreset("/dev/zero", false, record), exitPresetWrongKind);
    for (const char* name : {"p\xFF.xml", "q.xml"}) { // the first path stays
        ASSERT_EQ(readPreset(folder.write(name, goodText), false, record), exitDone);
        EXPECT_EQ(base::bytesFromWide(record.filePath.ToStdWstring()), folder.path("p\xFF.xml"));
    }
    // What is shipped: 7 is a PSD preset, and each uses some criterion.
    for (int id = 1; id <= 11; ++id) {
        const std::string number = std::to_string(id);
        const std::string file =
            "/presets/CVP_" + std::string(4 - number.size(), '0') + number + ".xml";
        record.filePath.clear();
        ASSERT_EQ(readPreset(TINTGATE_SOURCE_DIR + file, false, record), exitDone) << file;
        EXPECT_EQ(record.presetID, id);
        EXPECT_EQ(record.fograPSDPreset, id == 7 ? 1 : 0);
        PresetOptions options;
        ASSERT_EQ(readPresetOptions(record, options), exitDone);
        EXPECT_TRUE(std::any_of(std::begin(criteria), std::end(criteria), [&](const Criterion& c) {
            return settingOf(c, record, options).used;
        })) << file;
        EXPECT_EQ(options.asksMeasures(), id > 7 || id == 4 || id == 5) << file;
    }
}

// Options without a place in the record follow it by its filePath.
TEST(Presets, StateMoreThanTheRecordHolds) {
    const support::ScratchFolder folder;
    std::string text = goodText;
    const auto change = [&](const std::string& from, const std::string& to) {
        text.replace(text.find(from), from.size(), to);
    };
    change("Condition>-1", "Condition required=\"yes\">3");
    change("<psd>", "<minimumGreys> 3 </minimumGreys><repeats>mean</repeats>"
                    "<inks>\n Deep Sea,485,k\t, Grün\n</inks><paper>relative</paper>"
                    "<toneAims>A</toneAims><toneAimsBlack> target </toneAimsBlack>"
                    "<spotToneAims>target</spotToneAims><greyWeights>falling</greyWeights><psd>");
    change("<average", "<repeatSpread tolerance=\"1.5\" used=\"yes\" decimals=\"1\" "
                       "psdTolerance=\"2.5\" psdUsed=\"no\"/><average");
    const auto spread = [](const Record& record, const PresetOptions& options) {
        return settingOf(*criterionOfName("repeatSpread"), record, options);
    };
    const std::string path = folder.write("p.xml", text);
    Record record;
    PresetOptions options;
    ASSERT_EQ(readPreset(path, false, record), exitDone);
    for (const bool isThere : {true, false}) { // what was read is not read again
        options = {};
        ASSERT_EQ(readPresetOptions(record, options), exitDone);
        EXPECT_TRUE(options.conditionRequired);
        EXPECT_EQ(options.repeats, RepeatMode::Mean);
        EXPECT_EQ(options.minimumGreys, 3);
        EXPECT_THAT(options.inks, testing::ElementsAre("Deep Sea", "485", "k", "Grün"));
        EXPECT_EQ(options.paperAims, PaperAims::Relative);
        EXPECT_EQ(options.toneAims, ToneAims::CurveA);
        EXPECT_EQ(options.toneAimsBlack, ToneAims::Target);
        EXPECT_TRUE(options.spotToneFromTarget);
        EXPECT_EQ(options.greyWeights, GreyWeights::Falling);
        EXPECT_EQ(spread(record, options).tolerance, 1.5);
        EXPECT_TRUE(spread(record, options).used);
        EXPECT_EQ(spread(record, options).decimals, 1);
        EXPECT_EQ(settingOf(*criterionOfName("average"), record, options).tolerance, 2.5);
        if (isThere) {
            std::filesystem::remove(path);
        }
    }
    // Another file than the last one is read, and must be there.
    change("<psd>no", "<psd>yes");
    change("decimals=\"2\"/>", "decimals=\"2\" psdTolerance=\"7\" psdUsed=\"no\"/>");
    Record other;
    other.filePath = wxString(base::wideFromBytes(folder.write("q.xml", text)));
    other.fograPSDPreset = 1;
    ASSERT_EQ(readPresetOptions(other, options), exitDone);
    EXPECT_EQ(spread(other, options).tolerance, 2.5);
    EXPECT_FALSE(spread(other, options).used);
    other.filePath += "x";
    EXPECT_EQ(readPresetOptions(other, options), exitPresetMissing);
    EXPECT_EQ(options.minimumGreys, 3);
    ASSERT_EQ(readPresetOptions(Record(), options), exitDone);
    EXPECT_EQ(options.minimumGreys, 5);
    EXPECT_FALSE(options.conditionRequired);
    EXPECT_EQ(options.repeats, RepeatMode::Each);
}
