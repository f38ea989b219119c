// SPDX-License-Identifier: Apache-2.0
#include "colour/CgatsText.h"

#include <algorithm>
#include <cmath>
#include <random>
#include <sstream>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "Utf16.h"
#include "colour/Difference.h"

using namespace colour;
using testing::ElementsAre;
using testing::HasSubstr;

namespace {

DataSet readWell(const std::string& text, bool spectra = true) {
    DataSet set;
    EXPECT_EQ(readCgats(text, {spectra}, set), Failure::None) << text;
    return set;
}

Failure failureOf(const std::string& text) {
    DataSet set;
    set.descriptor = "untouched";
    const Failure failure = readCgats(text, {}, set);
    EXPECT_EQ(set.descriptor, "untouched");
    return failure;
}

/// A correct text.
std::string table(const std::string& names, const std::string& rows,
                  const std::string& header = "CGATS.17\n") {
    return header + "BEGIN_DATA_FORMAT\n" + names + "\nEND_DATA_FORMAT\nNUMBER_OF_SETS " +
           std::to_string(std::count(rows.begin(), rows.end(), '\n')) + "\nBEGIN_DATA\n" + rows +
           "END_DATA\n";
}

std::string replaced(std::string text, const std::string& what, const std::string& by) {
    for (std::size_t at = 0; (at = text.find(what, at)) != std::string::npos; at += by.size()) {
        text.replace(at, what.size(), by);
    }
    return text;
}

std::string notesOf(const DataSet& set) {
    std::string notes;
    for (const std::string& note : set.notes) {
        notes += note + "\n";
    }
    return notes;
}

const std::string labNames = "SAMPLE_ID LAB_L LAB_A LAB_B";

const std::string plainNames = "SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B";
const std::string plain = table(plainNames,
                                "A1 0 0 0 0 95.5 0.25 -2.125\nA2 100 0 0 0 55 -37.5 -50.75\n"
                                "A2 0 40.5 0 0 71.25 33 -0.5\n",
                                "CGATS.17\nORIGINATOR \"Press\"\nNUMBER_OF_FIELDS 8\n");

/// L*, a*, b* of all patches in one list.
std::vector<double> labsOf(const DataSet& set) {
    std::vector<double> values;
    for (const Lab& lab : set.lab) {
        values.insert(values.end(), {lab.L, lab.a, lab.b});
    }
    return values;
}

/// "cmyk CMYK SPOT_1 100 0 0 0 50": space, names and values of the device channels.
std::string deviceOf(const DataSet& set) {
    const char* const spaces[] = {"none", "cmyk", "rgb", "other"};
    std::ostringstream text;
    text << spaces[static_cast<int>(set.deviceSpace)];
    for (const std::string& channel : set.channels) {
        text << ' ' << channel;
    }
    for (const double value : set.device) {
        text << ' ' << value;
    }
    return replaced(text.str(), "CMYK_C CMYK_M CMYK_Y CMYK_K", "CMYK");
}

/// Reads one patch with a spectrum of 400 to 700 nm with equal values.
DataSet readSpectrum(const std::string& name, const std::string& value,
                     std::string columns = "SAMPLE_ID", std::string row = "1", bool wanted = true) {
    for (int nm = 700; nm >= 400; nm -= 20) {
        columns += " " + replaced(name, "*", std::to_string(nm));
        row += " " + replaced(value, "*", std::to_string(nm));
    }
    return readWell(table(columns, row + "\n"), wanted);
}

void expectPlain(const DataSet& set, const char* what) {
    SCOPED_TRACE(what);
    EXPECT_THAT(set.ids, ElementsAre("A1", "A2", "A2"));
    EXPECT_THAT(set.channels, ElementsAre("CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"));
    EXPECT_EQ(deviceOf(set), "cmyk CMYK 0 0 0 0 100 0 0 0 0 40.5 0 0");
    EXPECT_THAT(labsOf(set), ElementsAre(95.5, 0.25, -2.125, 55, -37.5, -50.75, 71.25, 33, -0.5));
}

} // namespace

// One set of patches in all notations found in practice. `remark` is part of an expected note; if
// empty, no note is expected.
TEST(CgatsText, ReadsTextAsItIsMet) {
    const auto with = [](const std::string& what, const std::string& by) {
        return replaced(plain, what, by);
    };
    const std::string names = plainNames + "\n";
    const std::string noFormat =
        replaced(with("BEGIN_DATA_FORMAT\n" + names, ""), "END_DATA_FORMAT\n", "");
    const std::string commas = replaced(replaced(plain, ".", ","), "CGATS,17", "CGATS.17");
    const struct {
        const char* what;
        std::string text;
        const char* remark;
    } cases[] = {
        {"CRLF", with("\n", "\r\n"), ""},
        {"CR alone", with("\n", "\r"), ""},
        {"byte order mark", "\xEF\xBB\xBF" + plain, ""},
        {"UTF-16, low byte first", support::utf16(plain, "LE"), ""},
        {"UTF-16, high byte first, CRLF", support::utf16(with("\n", "\r\n"), "BE"), ""},
        {"aligned with blanks and tabs", with(" ", " \t  "), ""},
        {"comments", with("\n", " # one, \"two\n# three\n"), ""},
        {"end of text sign", plain + "\x1A", ""},
        {"a vendor's word first", with("CGATS.17", "ChartWare"), ""},
        {"a keyword at once", with("CGATS.17\n", ""), ""},
        {"declared keywords", with("ORIGINATOR", "KEYWORD \"ORIGINATOR\"\nORIGINATOR"), ""},
        {"a keyword behind the format", with("NUMBER_OF_S", "DEVICE 28\nNUMBER_OF_S"), ""},
        {"no NUMBER_OF_SETS", with("NUMBER_OF_SETS 3\n", ""), ""},
        {"count too low", with("SETS 3", "SETS 2"), "NUMBER_OF_SETS is 2, but there are 3"},
        {"count too high", with("SETS 3", "SETS 4000000000"), "there are 3 rows"},
        {"a name too many", with("LAB_B\n", "LAB_B SPECTRAL_NM_7\n"), "8, but there are 9"},
        {"names in lines", with("CMYK_K LAB_L", "CMYK_K\n\nLAB_L"), ""},
        {"no end of the format", with("END_DATA_FORMAT\n", ""), "END_DATA_FORMAT is missing"},
        {"names without a format", replaced(noFormat, "BEGIN_DATA\n", names + "BEGIN_DATA\n"),
         "BEGIN_DATA_FORMAT is missing"},
        {"names as the first row", replaced(noFormat, "BEGIN_DATA\n", "BEGIN_DATA\n" + names),
         "BEGIN_DATA_FORMAT is missing"},
        {"bare list of rows",
         names + plain.substr(plain.find("A1"), plain.find("END_DATA\n") - plain.find("A1")),
         "BEGIN_DATA is missing"},
        {"END_DATA missing, count right", with("END_DATA\n", ""), "END_DATA is missing"},
        {"quoted numbers", with("71.25 33", "\"71.25\" \"33\""), ""},
        {"decimal commas", commas, "Commas"},
        {"semicolons", with(" ", ";"), ""},
        {"all cells quoted, empty ones at the end",
         "\"CGATS.17\",,\n\"ORIGINATOR\",\"Press, \"\"A\"\"\",\n\"NUMBER_OF_SETS\",\"3\",\n"
         "\"BEGIN_DATA_FORMAT\",,\n\"SAMPLE_ID\",\"CMYK_C\",\"CMYK_M\",\"CMYK_Y\",\"CMYK_K\","
         "\"LAB_L\",\"LAB_A\",\"LAB_B\",\"Note, if any\"\n\"END_DATA_FORMAT\",,\n\"BEGIN_DATA\","
         ",\n\"A1\",\"0\",\"0\",\"0\",\"0\",\"95.5\",\"0.25\",\"-2.125\",\"x, y\"\n"
         "\"A2\",\"100\",\"0\",\"0\",\"0\",\"55\",\"-37.5\",\"-50.75\",\n"
         "A2,0,40.5,0,0,71.25,33,-0.5,\n\"END_DATA\",,\n",
         ""},
        {"rows quoted by a spreadsheet",
         replaced(replaced(commas, "A2 0", "\"A2 0"), "-0,5\n", "-0,5\"\t\t\n"), "Commas"},
        {"rows over two lines", with(" 0 0 ", " 0\n0 "), "over several lines"},
        {"two rows in a line", with("-50.75\n", "-50.75 "), "several rows"},
        {"a remark behind a row", with("-50.75\n", "-50.75 checked twice\n"), "Words after"},
        {"unknown columns",
         replaced(replaced(with("SAMPLE_ID", "LGOROWLENGTH SAMPLE_ID Remark"), "A1 ",
                           "8 A1 \"a \"\"b\"\" 5\" "),
                  "A2 ", "8 A2 x "),
         "NUMBER_OF_FIELDS"},
        {"unknown last column, empty in some rows",
         replaced(with("LAB_B\n", "LAB_B Note\n"), "-2.125", "-2.125 ok"), "NUMBER_OF_FIELDS"},
    };
    for (const auto& [what, text, remark] : cases) {
        const DataSet set = readWell(text);
        expectPlain(set, what);
        EXPECT_TRUE(looksLikeCgats(text)) << what;
        EXPECT_THAT(notesOf(set), HasSubstr(remark)) << what;
        EXPECT_EQ(set.notes.empty(), *remark == '\0') << what;
    }
}

TEST(CgatsText, LetsTheFirstRowPartNamesOfBlanksAndTabs) {
    const struct {
        const char* what;
        std::string format; ///< Preceded by the stated number of fields.
        std::string row;
        std::string id;
        std::string name;
    } cases[] = {
        {"rows of tabs",
         "10 SAMPLE_ID SAMPLE_NAME|CMYK_C|CMYK_M|CMYK_Y|CMYK_K|LAB_L|LAB_A|LAB_B|NOTE",
         "1|A1|100|0|0|0|55|-37|-50|7", "1", "A1"},
        {"the same, names with blanks",
         "9 SAMPLE_ID SAMPLE_NAME|CMYK_C|CMYK_M|CMYK_Y|CMYK_K|LAB_L|LAB_A|LAB_B",
         "1|Cyan solid|100|0|0|0|55|-37|-50", "1", "Cyan solid"},
        {"rows like the names",
         "8 SAMPLE_ID SAMPLE_NAME|CMYK_C|CMYK_M|CMYK_Y|CMYK_K|LAB_L|LAB_A|LAB_B",
         "1 A1|100|0|0|0|55|-37|-50", "1", "A1"},
        {"a name of two words, a count of words",
         "9 Patch label|CMYK_C|CMYK_M|CMYK_Y|CMYK_K|LAB_L|LAB_A|LAB_B", "Cyan|100|0|0|0|55|-37|-50",
         "", ""},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        const std::size_t blank = c.format.find(' ');
        const DataSet set = readWell(
            replaced(table(c.format.substr(blank + 1), c.row + "\n",
                           "CGATS.17\nNUMBER_OF_FIELDS " + c.format.substr(0, blank) + "\n"),
                     "|", "\t"));
        EXPECT_EQ(deviceOf(set), "cmyk CMYK 100 0 0 0");
        EXPECT_THAT(labsOf(set), ElementsAre(55, -37, -50));
        EXPECT_EQ(set.ids.empty() ? "" : set.ids[0], c.id);
        EXPECT_EQ(set.names.empty() ? "" : set.names[0], c.name);
    }
}

TEST(CgatsText, KeepsHeaderTextsAsUtf8) {
    const DataSet set =
        readWell(table(labNames, "1 50 0 0\n",
                       "IT8.7/4\nORIGINATOR \"M\xC3\xBCller\"\nORIGINATOR \"second\"\n"
                       "descriptor \"\xDF 5\x94 \"\"x\"\"\"\nCREATED 3 May 2024   # checked\n"
                       "INSTRUMENTATION\t\"a\tb, \x80 5\" tail\n"));
    EXPECT_EQ(set.originator, "Müller");
    EXPECT_EQ(set.descriptor, "ß 5” \"x\""); // 94 is a quote in Windows-1252
    EXPECT_EQ(set.created, "3 May 2024");
    EXPECT_EQ(set.instrumentation, "a\tb, € 5");
    // The time of day follows in a comment of a special form.
    const auto createdOf = [](const std::string& line) {
        return readWell(table(labNames, "1 50 0 0\n", "CGATS.17\n" + line + "\n")).created;
    };
    EXPECT_EQ(createdOf("CREATED \"11/21/2026\"  # Time: 09:15"), "11/21/2026 # Time: 09:15");
    EXPECT_EQ(createdOf("CREATED \"11/21/2026  # Time: 09:15\""), "11/21/2026  # Time: 09:15");
}

// The columns precede those of Lab. In a row with tabs, only tabs separate cells.
TEST(CgatsText, TellsIdsAndNames) {
    const std::tuple<std::string, std::string, std::string, std::string> cases[] = {
        {"SampleID", "007", "007", ""},
        {"SAMPLE_NO SAMPLE_ID SAMPLE_NAME", "1 X9 \"Deep blue\"", "X9", "Deep blue"},
        {"SAMPLE_LOC Sample_Name", "B7 \"a \"\"b\"\"\"", "", "a \"b\""},
        {"SAMPLE_ID SAMPLE_NAME", "3 Paper white", "3", "Paper white"},
        {"SAMPLE_ID", "3 a b c d", "3 a b c d", ""}, // as long as two rows
        {"SAMPLE_ID SAMPLE_NAME", "3 Cyan 100 50 0 0\n4 Cyan 70", "3", "Cyan 100"},
        {"SAMPLE_ID\tSAMPLE_NAME", "3\tPaper 100 %", "3", "Paper 100 %"},
        {"SAMPLE_ID\tSAMPLE_NAME", "\tx y", "", "x y"},
        {"SAMPLE_ID SAMPLE_NAME", "END \"M\xFC\"", "END", "Mü"},
    };
    for (const auto& [columns, cells, id, name] : cases) {
        std::string text = table(columns + " LAB_L LAB_A LAB_B", cells + " 50 0 0\n");
        if (columns.find('\t') != std::string::npos) {
            text = replaced(replaced(text, " LAB", "\tLAB"), " 50 0 0", "\t50\t0\t0");
        }
        const DataSet set = readWell(text);
        EXPECT_EQ(set.ids.empty() ? "" : set.ids[0], id) << text;
        EXPECT_EQ(set.names.empty() ? "" : set.names[0], name) << text;
        EXPECT_EQ(set.lab[0].L, 50) << text;
    }
}

TEST(CgatsText, TellsDeviceChannelsAndTheirScales) {
    const char* const six = "10 20 30 40 50 60";
    const std::tuple<std::string, const char*, const char*> cases[] = {
        {"CMYK_K CMYK_C cmyk_m CMYK_Y x y", six, "cmyk CMYK 20 30 40 10"},
        {"C M Y K CMYK_Orange SPOT_2", six, "cmyk CMYK CMYK_Orange SPOT_2 10 20 30 40 50 60"},
        {"CMYKcm_C CMYKcm_M CMYKcm_Y CMYKcm_K CMYKcm_c CMYKcm_m", six,
         "cmyk CMYK CMYKcm_c CMYKcm_m 10 20 30 40 50 60"},
        {"CMYKOG_1 CMYKOG_2 CMYKOG_3 CMYKOG_4 CMYKOG_5 CMYKOG_6", six,
         "cmyk CMYK CMYKOG_5 CMYKOG_6 10 20 30 40 50 60"},
        {"a b 4CLR_1 4CLR_2 4CLR_3 4CLR_4", six, "other 4CLR_1 4CLR_2 4CLR_3 4CLR_4 30 40 50 60"},
        {"6CLR_6 6CLR_1 6CLR_2 6CLR_3 6CLR_4 6CLR_5", six,
         "cmyk CMYK 6CLR_5 6CLR_6 20 30 40 50 60 10"},
        {"PC6_1 PC6_2 PC6_3 PC6_4 PC6_5 PC6_6", six, "cmyk CMYK PC6_5 PC6_6 10 20 30 40 50 60"},
        {"PCA_1 PCA_2 PCA_3 PCA_4 PCA_A PCA_5", six, "cmyk CMYK PCA_5 PCA_A 10 20 30 40 60 50"},
        {"a b c d e f", six, "none"},
        {"R G B", "100 50 0", "rgb RGB_R RGB_G RGB_B 100 50 0"},
        {"R G B", "51 0 0 \n255 255 255", "rgb RGB_R RGB_G RGB_B 20 0 0 100 100 100"},
        {"R G B", "0.5 0 1", "rgb RGB_R RGB_G RGB_B 50 0 100"},
        {"R G B", "65535 0 0", "rgb RGB_R RGB_G RGB_B 100 0 0"},
        {"C M Y K", "100.4 0 0 1", "cmyk CMYK 100.4 0 0 1"},
        {"C M Y K", "25.5 0 0 102 \n0 0 255 0", "cmyk CMYK 10 0 0 40 0 0 100 0"},
    };
    for (const auto& [columns, rows, device] : cases) {
        const std::string cells = replaced(rows, " \n", " 70 80 90\n") + " 70 80 90\n";
        const DataSet set = readWell(table(columns + " LAB_L LAB_A LAB_B", cells));
        EXPECT_EQ(deviceOf(set), device) << columns;
        EXPECT_EQ(set.lab.at(0).a, 80) << columns;
    }
}

TEST(CgatsText, NamesInksFromWhereTheyCanBeTrusted) {
    const auto channel = [](int number, const std::string& name) {
        return "LGOMCCHANNEL0" + std::to_string(number) + " \"InkName = '" + name +
               "' InkSample = '[1 2 3]'\"\n";
    };
    const std::string process =
        channel(1, "Cyan") + channel(2, "MAGENTA") + channel(3, "Yellow") + channel(4, "Black");
    const std::string columns = " CMYK_C CMYK_M CMYK_Y CMYK_K CMYKOG_O CMYKOG_G";
    const std::string plus = "PLUS_1_COLOR Red|87|0|0|1|2|50|50|1\n";
    const std::pair<std::string, std::vector<std::string>> cases[] = {
        {process + channel(5, "Gold") + channel(6, "Deep Sea") + "COLOR_REP \"CMYKOG\"\n",
         {"SPOT_Gold", "SPOT_Deep Sea"}},
        {"COLOR_REP \"CMYKOG_LAB\"\n", {"SPOT_Orange", "SPOT_Green"}},
        {"COLOR_REP \"CMYKcm\"\n", {"SPOT_Light cyan", "SPOT_Light magenta"}},
        {process + channel(5, "Gold"), {"CMYKOG_O", "CMYKOG_G"}}, // One has no name,
        {"COLOR_REP \"CMYKOGV\"\n", {"CMYKOG_O", "CMYKOG_G"}},    // one is too many,
        {"COLOR_REP \"CMYKXZ\"\n", {"CMYKOG_O", "CMYKOG_G"}},     // unknown letters,
        {channel(1, "Gold") + process.substr(process.find('\n') + 1) + channel(5, "Cyan") +
             channel(6, "x"),
         {"CMYKOG_O", "CMYKOG_G"}},        // another order,
        {plus, {"CMYKOG_O", "CMYKOG_G"}}}; // an exporter's defaults.
    for (const auto& [header, expected] : cases) {
        const DataSet set =
            readWell(table(labNames + columns, "1 50 0 0 0 0 0 0 5 6\n", "CGATS.17\n" + header));
        ASSERT_EQ(set.channels.size(), 6U) << header;
        EXPECT_EQ(std::vector(set.channels.begin() + 4, set.channels.end()), expected) << header;
    }
}

TEST(CgatsText, TellsSpectralColumns) {
    for (const char* name : {"SPECTRAL_NM*", "SPECTRAL_NM_*", "SPEC_*", "nm*", "*nm", "R_*", "*_NM",
                             "spectral_dec*", "*", "nm*.00"}) {
        const DataSet set = readSpectrum(name, "0.*"); // sorted by the reader
        ASSERT_EQ(set.axis.length, 16) << name;
        EXPECT_EQ(set.axis.base, 400) << name;
        EXPECT_EQ(set.axis.step, 20) << name;
        EXPECT_EQ(set.spectra[15], 0.7) << name;
        EXPECT_EQ(set.lab.size(), 1U);
    }
    // Pairs of wavelength and value, in percent according to their name.
    const DataSet pairs = readSpectrum("SPECTRAL_NM SPECTRAL_PCT", "* 1.5");
    EXPECT_EQ(pairs.axis.base, 400);
    EXPECT_THAT(pairs.spectra, testing::ElementsAreArray(std::vector<double>(16, 0.015)));
    // Rows with different wavelengths are not spectra on one axis.
    EXPECT_EQ(failureOf(table("SPECTRAL_NM SPECTRAL_PCT SPECTRAL_NM SPECTRAL_PCT",
                              "400 50 700 50\n400 50 705 50\n")),
              Failure::SpectraUnusable);
}

TEST(CgatsText, DecidesScalesByWholeColumns) {
    const std::string xyz = "XYZ_X XYZ_Y XYZ_Z";
    const std::tuple<std::string, const char*, double> lights[] = {
        {xyz, "0.5 0.25 0.5\n0.9 1 1.1\n", 25},
        {xyz, "0.5 0.25 0.5\n80 85 70\n", 0.25},
        // A single black patch: Lab shows whether 0.9 is of 100 (L* 8.1) or of 1 (L* 96).
        {xyz + " LAB_L LAB_A LAB_B", "0.8 0.9 0.7 8.1 0 0\n", 0.9},
        {xyz + " LAB_L LAB_A LAB_B", "0.8 0.9 0.7 96 0 0\n", 90},
    };
    for (const auto& [columns, rows, Y] : lights) {
        EXPECT_EQ(readWell(table(columns, rows)).xyz.at(0).Y, Y) << rows;
    }

    // ArgyllCMS never writes 0 to 1.
    const DataSet blacks = readWell(table("RGB_R RGB_G RGB_B " + xyz, "1 0.5 0 0.5 0.25 0.5\n",
                                          "CTI3\nDESCRIPTOR \"Blacks\"\n"));
    EXPECT_THAT(blacks.device, ElementsAre(1, 0.5, 0));
    EXPECT_EQ(blacks.xyz.at(0).Y, 0.25);

    EXPECT_EQ(readSpectrum("nm*", "1.25").spectra.at(0), 1.25); // brightened
    EXPECT_EQ(readSpectrum("nm*", "62.5").spectra.at(0), 0.625);
    EXPECT_EQ(readSpectrum("SPECTRAL_PCT*", "1.5").spectra.at(0), 0.015);
    // Y distinguishes a black from a fluorescent white.
    EXPECT_EQ(readSpectrum("nm*", "1.5", xyz, "1.4 1.5 1.2").spectra.at(0), 0.015);
    EXPECT_EQ(readSpectrum("nm*", "2.5", xyz, "241 250 206").spectra.at(0), 2.5);
}

TEST(CgatsText, WorksOutWhatIsNotStated) {
    const DataSet xyzOnly = readWell(table("XYZ_X XYZ_Y XYZ_Z", "20 30 40\n"));
    EXPECT_EQ(xyzOnly.lab.at(0).a, labFromXyz({20, 30, 40}).a);
    const DataSet both = readSpectrum("nm*", "0.5", "LAB_L LAB_A LAB_B", "95.5 0.25 -2");
    EXPECT_EQ(both.lab.at(0).L, 95.5);       // as stated
    EXPECT_NEAR(both.xyz.at(0).Y, 50, 1e-9); // from the spectrum
    // A store without Lab writes zeros: then the spectrum is used, requested or not.
    for (const bool wanted : {true, false}) {
        const DataSet zeros = readSpectrum("nm*", "0.5", "LAB_L LAB_A LAB_B", "0 0 0", wanted);
        EXPECT_NEAR(zeros.lab.at(0).L, 76.069, 1e-3);
        EXPECT_THAT(notesOf(zeros), HasSubstr("Lab is zero throughout"));
    }
    // A group without any number counts as absent.
    const DataSet half = readWell(table(labNames + " XYZ_X XYZ_Y XYZ_Z", "1 60 1 2 - n/a -\n"));
    EXPECT_EQ(half.xyz.at(0).Y, xyzFromLab({60, 1, 2}).Y);
    EXPECT_THAT(notesOf(half), HasSubstr("XYZ columns contain no numbers"));
}

TEST(CgatsText, JoinsTables) {
    const std::string inks = "SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K";
    // The same ids in another order. The second 1 is joined with the second 1.
    const DataSet joined = readWell(table(inks, "1 0 0 0 0\n2 100 0 0 0\n1 0 0 0 100\n") +
                                    table(labNames, "2 55 0 0\n1 95 0 0\n1 16 0 0\n"));
    EXPECT_THAT(joined.ids, ElementsAre("1", "2", "1"));
    EXPECT_THAT(labsOf(joined), ElementsAre(95, 0, 0, 55, 0, 0, 16, 0, 0));
    EXPECT_EQ(deviceOf(joined), "cmyk CMYK 0 0 0 0 100 0 0 0 0 0 0 100");

    // Pages of one chart; the second uses the format of the first. Ids that restart with other
    // inks.
    const std::string page = table(labNames, "1 50 0 0\n2 60 0 0\n");
    const DataSet pages = readWell(page + "BEGIN_DATA\n3 70 0 0\nEND_DATA\n");
    EXPECT_THAT(labsOf(pages), ElementsAre(50, 0, 0, 60, 0, 0, 70, 0, 0));
    EXPECT_EQ(readWell(table(inks, "1 10 0 0 0\n") + table(inks, "1 30 0 0 0\n")).patchCount, 2U);

    const std::string curve = table("RGB_I RGB_R RGB_G RGB_B", "0 0 0 0\n1 1 1 1\n", "CAL\n");
    const std::string extremes =
        table("INDEX RGB_R RGB_G RGB_B XYZ_X XYZ_Y XYZ_Z", "0 0 0 0 1 1 1\n1 9 9 9 8 8 8\n");
    const std::string other = table("ID XYZ_X XYZ_Y XYZ_Z", "7 1 2 3\n");
    for (const std::string& text :
         {page + page, page + extremes, page + curve, curve + page, page + other}) {
        const DataSet set = readWell(text);
        EXPECT_THAT(labsOf(set), ElementsAre(50, 0, 0, 60, 0, 0)) << text;
        EXPECT_EQ(deviceOf(set), "none") << text;
        EXPECT_THAT(notesOf(set), HasSubstr("left out")) << text;
    }
}

// Notations of measuring software, of published data sets and of our own measuring tool.
TEST(CgatsText, FindsConditions) {
    const std::string source = "MEASUREMENT_SOURCE \"";
    const std::pair<std::string, Conditions> cases[] = {
        {"ILLUMINANT \"D50\"\nOBSERVER \"CIE 2 degree\"\n", {"D50", "2", ""}},
        {"ILLUMINATION_NAME D50\nOBSERVER_ANGLE 2.0\n", {"D50", "2", ""}},
        {"OBSERVER_ANGLE \"10\"\n", {"", "10", ""}},
        {"WEIGHTING_FUNCTION \"ILLUMINANT, D65\"\nWEIGHTING_FUNCTION \"OBSERVER, 10 degree\"\n",
         {"D65", "10", ""}},
        {"WEIGHTING_FUNCTION \"ILLUMINANT,D65\"\nWEIGHTING_FUNCTION\t\"OBSERVER. 10 degree\"\n",
         {"D65", "10", ""}},
        {source + "Illumination=D65 ObserverAngle=10 Filter=UVcut\"\n", {"D65", "10", "M2"}},
        {source + "Illumination=D50\tObserverAngle=2\xB0\tWhiteBase=Absolute\tFilter=Unknow\"\n",
         {"D50", "2", ""}},
        {source + "\"Illumination=D50 ObserverAngle=2degree WhiteBase=Abs Filter=No\"\"\n",
         {"D50", "2", "M0"}},
        {source + "MeasurementCondition=M1\tFilter=D50\"\n", {"", "", "M1"}},
        {source + "MeasurementCondition=M1\tFilter=no\"\n", {"", "", "M1"}},
        {source + "MeasurementCondition=M2 Filter=UVcut\"\nFILTER \"D50\"\n", {"", "", "M2"}},
        {source + "GAS-FILLED TUNGSTEN\"\n", {"", "", "M0"}},
        {source + "GAS-FILLED TUNGSTEN\"\nINSTRUMENTATION \"M2\"\n", {"", "", "M2"}},
        {"MEASUREMENT_CONDITION \"Unknown\"\nFILTER \"UV\"\n", {"", "", "M2"}},
        {"MEASUREMENT_CONDITION \"M1\"\nFILTER \"UVcut\"\n", {"", "", "M1"}},
        {"FILTER \"M1\"\nINSTRUMENTATION \"x, ISO 13655:2009 M0\"\n", {"", "", "M1"}},
        {"FILTER \"Pol\"\n", {"", "", "M3"}},
        {source + "Filter=Polarizer\"\n", {"", "", "M3"}},
        {"POLARIZATION \"yes\"\n", {"", "", "M3"}},
        {"FILTER \"No UV cut\"\n", {"", "", "M0"}},
        {"FILTER \"None\"\nFILTER \"Unknown\"\n", {"", "", ""}},
        {"MEASUREMENT_GEOMETRY \"ISO 13655 - Reflection, M1\"\nINSTRUMENTATION \"M0\"\n",
         {"", "", "M1"}},
        {"INSTRUMENTATION \"D50, 2 degree, no polarisation filter, ISO 13655:2009 M1\"\n",
         {"D50", "2", "M1"}},
        {"KEYWORD ILLUMINATION_CONDITION\nILLUMINATION_CONDITION 2\n", {"", "", "M2"}},
        {"INSTRUMENTATION \"M0, M1 and M2, D50 or D65, 2 degree or 10 degree\"\n", {"", "", ""}},
    };
    for (const auto& [header, expected] : cases) {
        const DataSet set = readWell(table(labNames, "1 50 0 0\n", "CGATS.17\n" + header));
        EXPECT_EQ(set.conditions, expected) << header;
    }
}

// The spectrum is a flat grey of 50 %, whatever conditions the text states.
TEST(CgatsText, CalculatesColoursThatAreStatedForOtherLight) {
    const std::string spectrum = "SPECTRAL_400 SPECTRAL_420 SPECTRAL_440 SPECTRAL_460 SPECTRAL_480 "
                                 "SPECTRAL_500 SPECTRAL_520 SPECTRAL_540 SPECTRAL_560 SPECTRAL_580 "
                                 "SPECTRAL_600 SPECTRAL_620 SPECTRAL_640 SPECTRAL_660 SPECTRAL_680 "
                                 "SPECTRAL_700";
    std::string halves;
    for (int i = 0; i < 16; ++i) {
        halves += " 0.5";
    }
    const struct {
        const char* header;
        std::string columns, row;
        bool calculated;
    } cases[] = {
        {"ILLUMINANT D65\n", spectrum, halves, true},
        {"OBSERVER 10\n", spectrum, halves, true},
        {"ILLUMINANT D50\nOBSERVER 2\n", spectrum, halves, false},
        {"ILLUMINANT D65\n", "", "", false},
        {"ILLUMINANT D65\n", "SPECTRAL_400 SPECTRAL_700", " 0.5 0.5", false}, // too coarse
    };
    for (const auto& c : cases) {
        for (const bool wanted : {false, true}) {
            const DataSet set =
                readWell(table(labNames + " " + c.columns, "1 70 9 9" + c.row + "\n",
                               std::string("CGATS.17\n") + c.header),
                         wanted);
            SCOPED_TRACE(c.header + c.columns);
            EXPECT_EQ(set.calculated, c.calculated);
            EXPECT_NEAR(set.lab[0].L, c.calculated ? 76.0693 : 70, 1e-4); // 116 cbrt(0.5) - 16
            EXPECT_NEAR(set.lab[0].a, c.calculated ? 0 : 9, 1e-2);
            EXPECT_EQ(set.spectra.empty(), !wanted || c.columns.empty());
            const DataSet again = readWell(writeCgats(set));
            EXPECT_NEAR(again.lab[0].L, set.lab[0].L, 1e-9);
            EXPECT_EQ(again.conditions.areUsual(), c.calculated || set.conditions.areUsual());
        }
    }
    // Even without other values: the colours must not be mistaken for those of D65.
    const DataSet alone =
        readWell(table("SAMPLE_ID " + spectrum, "1" + halves + "\n", "CGATS.17\nILLUMINANT D65\n"));
    EXPECT_TRUE(alone.calculated);
    EXPECT_NEAR(alone.lab[0].L, 76.0693, 1e-4);
}

TEST(CgatsText, NamesOneCauseForEachFailure) {
    const auto rows = [](const std::string& text) { return table(labNames, text); };
    const std::pair<std::string, Failure> cases[] = {
        {"", Failure::NotRecognised},
        {replaced(plain, "Press", std::string(1, '\0')), Failure::NotRecognised},
        {"Dear Sir,\n\nwhat a fine day.\n", Failure::NotRecognised},
        {"CGATS.17\nNUMBER_OF_SETS 9\n", Failure::Damaged},
        {rows("1 50 0 0\n2 50 0\n"), Failure::Damaged},
        {rows("1 50 0 0\n2 50 0 0 7 8\n"), Failure::Damaged},
        {replaced(rows("1 50 0 0\n2 50 0 0 7 8\n"), " ", "\t"), Failure::Damaged},
        {rows(""), Failure::NoPatches},
        {table("RGB_I RGB_R RGB_G RGB_B", "0 0 0 0\n"), Failure::NoPatches},
        {table("SAMPLE_ID D_RED D_GREEN LAB_L", "1 0.1 0.2 50\n"), Failure::NoColourValues},
        {rows("1 50 0 0\n2 50 x 0\n"), Failure::NotNumeric},
        {replaced(rows("1 50 0 0\n2 50  0\n"), " ", "\t"), Failure::NotNumeric}, // an empty cell
        {rows("1 1e10 0 0\n2 50 0 0\n"), Failure::NotNumeric},    // above the limit of colours
        {rows("1 1,234 0 0\n2 50.5 0 0\n"), Failure::NotNumeric}, // a thousand or a decimal ...
        {table("ID nm400 nm425 nm700", "1 0.1 0.1 0.1\n"), Failure::SpectraUnusable},
        {table("ID nm400 nm410 nm420", "1 0.1 0.1 0.1\n"), Failure::SpectraUnusable},
    };
    for (const auto& [text, failure] : cases) {
        EXPECT_EQ(failureOf(text), failure) << text;
    }
}

// A truncated text must never pass for a complete set: missing patches would go unnoticed.
TEST(CgatsText, NeverTakesACutTextForAWholeOne) {
    for (const std::string& text : {plain, replaced(plain, "NUMBER_OF_SETS 3\n", ""),
                                    replaced(plain, "\n", "\r\n"), replaced(plain, " ", "\t")}) {
        const std::size_t whole = text.rfind("END_DATA") + 8;
        for (std::size_t length = 0; length < whole; ++length) {
            const std::string cut = text.substr(0, length);
            DataSet set;
            if (readCgats(cut, {}, set) == Failure::None) {
                // All rows are present and complete, and their number is as stated.
                expectPlain(set, cut.c_str());
                EXPECT_THAT(cut, HasSubstr("NUMBER_OF_SETS"));
            }
        }
    }
}

TEST(CgatsText, BearsHostileSizes) {
    const auto many = [](std::size_t count, const std::string& what) {
        std::string text;
        for (std::size_t i = 0; i < count; ++i) {
            text += what;
        }
        return text;
    };
    const std::string longText = many(2'000'000, "x");
    const std::pair<std::string, Failure> failing[] = {
        {"CGATS.17\nBEGIN_DATA_FORMAT\n" + many(200'000, "COLUMN ") +
             "\nEND_DATA_FORMAT\nBEGIN_DATA\nEND_DATA\n",
         Failure::TooLarge},
        {longText, Failure::NotRecognised},
        {"CGATS.17\nORIGINATOR \"" + longText, Failure::Damaged},
        {table(labNames, "1 0 0 0\n1 0 " + many(220'000, "0 ") + "0\n"), Failure::Damaged},
    };
    for (const auto& [text, failure] : failing) {
        EXPECT_EQ(failureOf(text), failure) << text.substr(0, 80);
    }
    EXPECT_EQ(readWell(table(labNames, many(20'000, "0 0 0 0 ") + "\n")).patchCount, 20'000U);
    const std::string page = "BEGIN_DATA\n1 50 0 0\nEND_DATA\nBEGIN_DATA\n2 50 0 0\nEND_DATA\n";
    EXPECT_EQ(readWell(table(labNames, "3 50 0 0\n") + many(2500, page)).patchCount, 5001U);
}

// Every number must equal strtod's result, in all notations that occur.
TEST(CgatsText, ReadsNumbersToTheLastBit) {
    std::mt19937_64 engine(7);
    std::uniform_real_distribution<double> value(-120, 120);
    std::string rows;
    std::vector<double> expected;
    const char* const formats[] = {"%.0f", "%.2f",  "%.4f",  "%.7g",
                                   "%.8g", "%.17g", "%.25f", "%.9e"};
    for (int i = 0; i < 90'000; ++i) {
        char text[64];
        double number = value(engine);
        if (i % 5 == 0) {
            number *= std::pow(10, static_cast<double>(engine() % 50) - 43);
        }
        std::snprintf(text, sizeof text, formats[engine() % std::size(formats)], number);
        rows += std::string(text) + (i % 3 == 2 ? "\n" : " ");
        expected.push_back(std::strtod(text, nullptr));
    }
    rows += "123456.78901234567890 .5 5.\n-0.00 007.50 1000000000\n"
            "0.000000000000000000000000001 1e-400 12345678\n";
    expected.insert(expected.end(),
                    {123456.78901234567890, .5, 5., -0., 7.5, 1e9, 1e-27, 0, 12345678});
    const std::vector<double> found = labsOf(readWell(table("LAB_L LAB_A LAB_B", rows)));
    ASSERT_EQ(found.size(), expected.size());
    for (std::size_t i = 0; i < found.size(); ++i) {
        ASSERT_EQ(found[i], expected[i]) << "number " << i;
    }
}

TEST(CgatsText, FindsKeywordsInUnfinishedTexts) {
    const std::pair<std::string, std::optional<std::string>> cases[] = {
        {"DEVICE 28", "28"},
        {"device\t\"Spectro \"\"9\"\"\"\r\n", "Spectro \"9\""},
        {"KEYWORD DEVICE\rDEVICE 5 # chosen\rDEVICE 6\r", "5"},
        {"\"DEVICE \"\"Spectro, big\"\"\"\t\t\n", "Spectro, big"},
        {"KEYWORD\tDEVICE\n", std::nullopt},
        {support::utf16("DEVICE \"Grün 𝄞\"\r\n", "BE"), "Grün 𝄞"},
        {"# DEVICE 7\nORIGINATOR \"DEVICE 9\"\n", std::nullopt},
        {replaced(plain, "A1 0 0", "DEVICE 3 0") + "DEVICE  M\xFC X  \n", "Mü X"},
    };
    for (const auto& [text, expected] : cases) {
        EXPECT_EQ(cgatsKeyword(text, "DEVICE"), expected) << text;
    }
}

// Whatever way they are found, spectra of paper and single inks are those of a full reading.
TEST(CgatsText, SpectraOfSingleInksAreThoseOfAFullReading) {
    std::string names = "SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B";
    for (int nm = 400; nm <= 700; nm += 20) {
        names += " SPECTRAL_NM" + std::to_string(nm);
    }
    const auto rowsOf = [](double full) {
        std::string rows;
        int number = 0;
        for (const char* inks : {"0 0 0 0", "40 30 0 0", "100 0 0 0", "0 0 0 0.4", "0 50 50 50",
                                 "0 0 0 70", "0 0.4 0.4 100"}) {
            rows += "A" + std::to_string(++number) + ' ' + inks + " 60 0 0";
            for (int i = 0; i < 16; ++i) {
                rows += ' ' + std::to_string(full * (0.2 + 0.01 * i + 0.05 * number));
            }
            rows += '\n';
        }
        return rows;
    };
    const std::string text = table(names, rowsOf(1));
    const std::string noInks = replaced(replaced(names, "CMYK_C", "A"), "CMYK_M", "B");
    const struct {
        const char* what;
        std::string text;
        bool some; ///< Not all spectra are read.
    } cases[] = {
        {"plain", text, true},
        {"percent", table(names, rowsOf(100)), true},
        {"comments and blank lines", replaced(text, "A3", "# one\n\n\t\nA3"), true},
        {"CRLF",
         replaced(replaced(text, "\nBEGIN_DATA\n", "\r\nBEGIN_DATA  \r\n"), "END_DATA\n",
                  "END_DATA \r\n"),
         true},
        {"rows over several lines", replaced(text, "A2 40", "A2\n40"), false},
        {"no process inks", table(noInks, rowsOf(1)), false},
        {"another light", table(names, rowsOf(1), "CGATS.17\nILLUMINANT D65\n"), true},
    };
    for (const auto& [what, given, some] : cases) {
        SCOPED_TRACE(what);
        DataSet full, part;
        const Failure expected = readCgats(given, {}, full);
        ASSERT_EQ(readCgats(given, {.singleInks = true}, part), expected);
        if (expected != Failure::None) {
            continue;
        }
        EXPECT_EQ(part.axis.length, full.axis.length);
        EXPECT_EQ(part.spectrumRows.empty(), !some);
        EXPECT_EQ(part.notes, full.notes);
        EXPECT_EQ(part.device, full.device);
        for (const std::size_t row : {0, 2, 3, 5, 6}) {
            ASSERT_NE(part.spectrumOf(row), nullptr) << row;
            EXPECT_TRUE(
                std::equal(part.spectrumOf(row), part.spectrumOf(row) + 16, full.spectrumOf(row)));
        }
        EXPECT_EQ(part.spectrumOf(1) == nullptr, some);
    }
}
