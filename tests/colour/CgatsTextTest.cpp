#include "colour/CgatsText.h"

#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <random>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "ScratchFolder.h"
#include "colour/Difference.h"

using namespace colour;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

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
    if (failure != Failure::None) {
        EXPECT_EQ(set.descriptor, "untouched");
    }
    return failure;
}

/// A text as it should be.
std::string table(const std::string& names, const std::string& rows,
                  const std::string& header = "CGATS.17\n") {
    return header + "BEGIN_DATA_FORMAT\n" + names + "\nEND_DATA_FORMAT\nNUMBER_OF_SETS " +
           std::to_string(std::count(rows.begin(), rows.end(), '\n')) + "\nBEGIN_DATA\n" + rows +
           "END_DATA\n";
}

std::string replaced(std::string text, const std::string& what, const std::string& by) {
    for (std::size_t at = 0; (at = text.find(what, at)) != std::string::npos; at += by.size())
        text.replace(at, what.size(), by);
    return text;
}

std::string notesOf(const DataSet& set) {
    std::string notes;
    for (const std::string& note : set.notes)
        notes += note + "\n";
    return notes;
}

const std::string labNames = "SAMPLE_ID LAB_L LAB_A LAB_B";

const std::string plain = "CGATS.17\n"
                          "ORIGINATOR \"Press\"\n"
                          "NUMBER_OF_FIELDS 8\n"
                          "BEGIN_DATA_FORMAT\n"
                          "SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B\n"
                          "END_DATA_FORMAT\n"
                          "NUMBER_OF_SETS 3\n"
                          "BEGIN_DATA\n"
                          "A1 0 0 0 0 95.5 0.25 -2.125\n"
                          "A2 100 0 0 0 55 -37.5 -50.75\n"
                          "A2 0 40.5 0 0 71.25 33 -0.5\n"
                          "END_DATA\n";

void expectPlain(const DataSet& set, const char* what) {
    SCOPED_TRACE(what);
    ASSERT_EQ(set.patchCount, 3U);
    EXPECT_THAT(set.ids, ElementsAre("A1", "A2", "A2"));
    EXPECT_EQ(set.deviceSpace, DeviceSpace::Cmyk);
    EXPECT_THAT(set.channels, ElementsAre("CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"));
    EXPECT_THAT(set.device, ElementsAre(0, 0, 0, 0, 100, 0, 0, 0, 0, 40.5, 0, 0));
    ASSERT_EQ(set.lab.size(), 3U);
    EXPECT_EQ(set.lab[0].L, 95.5);
    EXPECT_EQ(set.lab[0].a, 0.25);
    EXPECT_EQ(set.lab[0].b, -2.125);
    EXPECT_EQ(set.lab[1].a, -37.5);
    EXPECT_EQ(set.lab[2].L, 71.25);
    EXPECT_EQ(set.lab[2].b, -0.5);
    EXPECT_EQ(set.xyz.size(), 3U);
}

} // namespace

// One set of patches in every writing that is met. `remark` is a part of a note that must be there;
// without one nothing was assumed.
TEST(CgatsText, ReadsTextAsItIsMet) {
    const auto with = [](const std::string& what, const std::string& by) {
        return replaced(plain, what, by);
    };
    std::string crHeader = replaced(plain.substr(0, plain.find("A1")), "\n", "\r\n");
    crHeader += replaced(plain.substr(plain.find("A1")), "\n", "\r");
    const std::string names = "SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B\n";
    const std::string noFormat =
        replaced(with("BEGIN_DATA_FORMAT\n" + names, ""), "END_DATA_FORMAT\n", "");
    const std::string commas = replaced(replaced(plain, ".", ","), "CGATS,17", "CGATS.17");
    const std::string header = plain.substr(0, plain.find("A1"));
    const struct {
        const char* what;
        std::string text;
        const char* remark;
    } cases[] = {
        {"as it should be", plain, ""},
        {"CRLF", with("\n", "\r\n"), ""},
        {"CR alone", with("\n", "\r"), ""},
        {"CR CR LF", with("\n", "\r\r\n"), ""},
        {"CRLF header over CR rows", crHeader, ""},
        {"byte order mark", "\xEF\xBB\xBF" + plain, ""},
        {"Latin-1 in the header", with("Press", "M\xFCller \xB5"), ""},
        {"tabs", with(" ", "\t"), ""},
        {"aligned with blanks and tabs", with(" ", " \t  "), ""},
        {"trailing tabs", with("\n", "\t\t\t\n"), ""},
        {"comments", with("\n", " # one, \"two\n# three\n"), ""},
        {"small letters", with("END_DATA\n", "end_data\n"), ""},
        {"end of text sign", plain + "\x1A", ""},
        {"no line end behind END_DATA", plain.substr(0, plain.size() - 1), ""},
        {"blank lines behind END_DATA", plain + "\r\n\r\n\r\n", ""},
        {"another first line", with("CGATS.17", "IT8.7/3"), ""},
        {"a vendor's word first", with("CGATS.17", "ChartWare"), ""},
        {"a quoted sentence first", with("CGATS.17", "\"Created by hand, 2024\""), ""},
        {"a keyword at once", with("CGATS.17\n", ""), ""},
        {"declared keywords", with("ORIGINATOR", "KEYWORD \"ORIGINATOR\"\nORIGINATOR"), ""},
        {"repeated keywords", with("BEGIN_DATA_F", "ORIGINATOR \"B\"\nBEGIN_DATA_F"), ""},
        {"no NUMBER_OF_FIELDS", with("NUMBER_OF_FIELDS 8\n", ""), ""},
        {"no NUMBER_OF_SETS", with("NUMBER_OF_SETS 3\n", ""), ""},
        {"count too low", with("SETS 3", "SETS 2"), "NUMBER_OF_SETS says 2, there are 3"},
        {"count too high", with("SETS 3", "SETS 4000000000"), "there are 3 rows"},
        {"count beyond all numbers", with("SETS 3", "SETS 99999999999999999999"), ""},
        {"fields that lie", with("FIELDS 8", "FIELDS 9"), "NUMBER_OF_FIELDS says 9"},
        {"one name too few", with(" LAB_L LAB_A LAB_B\n", " LAB_L LAB_A LAB_B SPECTRAL_NM_7\n"),
         "8, there are 9"},
        {"names in lines", with("CMYK_K LAB_L", "CMYK_K\n\nLAB_L"), ""},
        {"format in one line", with("FORMAT\nSAMPLE", "FORMAT SAMPLE"), ""},
        {"format's end behind the names", with("\nEND_DATA_F", " END_DATA_F"), ""},
        {"no end of the format", with("END_DATA_FORMAT\n", ""), "END_DATA_FORMAT is missing"},
        {"names without a format", replaced(noFormat, "BEGIN_DATA\n", names + "BEGIN_DATA\n"),
         "no BEGIN_DATA_FORMAT"},
        {"names as the first row", replaced(noFormat, "BEGIN_DATA\n", "BEGIN_DATA\n" + names),
         "no BEGIN_DATA_FORMAT"},
        {"bare list of rows",
         names + plain.substr(plain.find("A1"), plain.find("END_DATA\n") - plain.find("A1")),
         "no BEGIN_DATA:"},
        {"END_DATA missing, count right", with("END_DATA\n", ""), "END_DATA is missing"},
        {"quoted cells", with("A2", "\"A2\""), ""},
        {"quoted numbers", with("71.25 33", "\"71.25\" \"33\""), ""},
        {"quoted names of columns", with("CMYK_C CMYK_M", "\"CMYK_C\" \"CMYK_M\""), ""},
        {"signs and exponents", with("0.25 -2.125", "+2.5E-01 -2125e-3"), ""},
        {"decimal commas", commas, "Commas"},
        {"decimal commas in quotes", replaced(commas, "-0,5", "\"-0,5\""), "Commas"},
        {"semicolons", with(" ", ";"), ""},
        {"commas between cells", with(" ", ","), ""},
        {"commas and blanks between cells", with(" ", ", "), ""},
        {"all cells quoted, empty ones at the end",
         "\"CGATS.17\",,\n\"ORIGINATOR\",\"Press, \"\"A\"\"\",\n\"NUMBER_OF_SETS\",\"3\",\n"
         "\"BEGIN_DATA_FORMAT\",,\n\"SAMPLE_ID\",\"CMYK_C\",\"CMYK_M\",\"CMYK_Y\",\"CMYK_K\","
         "\"LAB_L\",\"LAB_A\",\"LAB_B\",\"Note, if any\"\n\"END_DATA_FORMAT\",,\n\"BEGIN_DATA\","
         ",\n\"A1\",\"0\",\"0\",\"0\",\"0\",\"95.5\",\"0.25\",\"-2.125\",\"x, y\"\n"
         "\"A2\",\"100\",\"0\",\"0\",\"0\",\"55\",\"-37.5\",\"-50.75\",\n"
         "A2,0,40.5,0,0,71.25,33,-0.5,\n\"END_DATA\",,\n",
         ""},
        {"spreadsheet quoting", with("ORIGINATOR \"Press\"", "\"ORIGINATOR \"\"Press\"\"\""), ""},
        {"rows quoted by a spreadsheet",
         replaced(replaced(commas, "A2 0", "\"A2 0"), "-0,5\n", "-0,5\"\t\t\n"), "Commas"},
        {"rows over two lines", with(" 0 0 ", " 0\n0 "), "over several lines"},
        {"all rows in one line",
         header + "A1 0 0 0 0 95.5 0.25 -2.125 A2 100 0 0 0 55 -37.5 "
                  "-50.75 A2 0 40.5 0 0 71.25 33 -0.5 END_DATA\n",
         "several rows"},
        {"two rows in a later line", with("-50.75\n", "-50.75 "), "several rows"},
        {"tabs, a remark behind a row", replaced(with("-50.75\n", "-50.75 checked\n"), " ", "\t"),
         "Words behind"},
        {"a remark behind a row", with("-50.75\n", "-50.75 checked twice\n"), "Words behind"},
        {"unknown columns",
         replaced(replaced(with("SAMPLE_ID", "LGOROWLENGTH SAMPLE_ID Remark"), "A1 ",
                           "8 A1 \"a \"\"b\"\" 5\" "),
                  "A2 ", "8 A2 x "),
         "NUMBER_OF_FIELDS"},
        {"unknown last column, empty in some rows",
         replaced(with("LAB_B\n", "LAB_B Note\n"), "-2.125", "-2.125 ok"), "NUMBER_OF_FIELDS"},
        {"empty cell between tabs",
         replaced(
             replaced(replaced(with("SAMPLE_ID", "SAMPLE_ID Note"), "A1 ", "A1  "), "A2 ", "A2 x "),
             " ", "\t"),
         "NUMBER_OF_FIELDS"},
    };
    for (const auto& [what, text, remark] : cases) {
        const DataSet set = readWell(text);
        expectPlain(set, what);
        EXPECT_TRUE(looksLikeCgats(text)) << what;
        EXPECT_THAT(notesOf(set), HasSubstr(remark)) << what;
        if (*remark == '\0') {
            EXPECT_THAT(set.notes, IsEmpty()) << what;
        }
    }
}

TEST(CgatsText, KeepsHeaderTextsAsUtf8) {
    const DataSet set =
        readWell(table(labNames, "1 50 0 0\n",
                       "IT8.7/4\nORIGINATOR \"M\xC3\xBCller \xC2\xB5\"\nORIGINATOR \"second\"\n"
                       "descriptor \"Stra\xDF"
                       "e 5\x94 \"\"x\"\"\"\nCREATED 3 May 2024   # checked\n"
                       "INSTRUMENTATION\t\"a\tb, \x80 5\" tail\n"));
    EXPECT_EQ(set.originator, "Müller µ");
    EXPECT_EQ(set.descriptor, "Straße 5” \"x\""); // 94 is a quote in Windows-1252
    EXPECT_EQ(set.created, "3 May 2024");
    EXPECT_EQ(set.instrumentation, "a\tb, € 5");
}

TEST(CgatsText, TellsIdsAndNames) {
    const struct {
        const char* columns;
        const char* row;
        const char* id;
        const char* name;
    } cases[] = {
        {"SampleID LAB_L LAB_A LAB_B", "007 50 0 0", "007", ""},
        {"SAMPLE_NO LAB_L LAB_A LAB_B", "A-1 50 0 0", "A-1", ""},
        {"SAMPLE_NO SAMPLE_ID SAMPLE_NAME LAB_L LAB_A LAB_B", "1 X9 \"Deep blue\" 50 0 0", "X9",
         "Deep blue"},
        {"SAMPLE_LOC Sample_Name LAB_L LAB_A LAB_B", "B7 \"a \"\"b\"\"\" 50 0 0", "", "a \"b\""},
        {"SAMPLE_LOC LAB_L LAB_A LAB_B", "B7 50 0 0", "", "B7"},
        {"SAMPLE_ID SAMPLE_NAME LAB_L LAB_A LAB_B", "3 Paper white 50 0 0", "3", "Paper white"},
        {"SAMPLE_ID LAB_L LAB_A LAB_B", "3 a b c d 50 0 0", "3 a b c d", ""}, // as long as two rows
        {"SAMPLE_ID SAMPLE_NAME LAB_L LAB_A LAB_B", "3 Cyan 100 50 0 0\n4 Cyan 70 60 0 0", "3",
         "Cyan 100"},
        {"SAMPLE_ID\tSAMPLE_NAME\tLAB_L\tLAB_A\tLAB_B", "3\tPaper 100 %\t50\t0\t0", "3",
         "Paper 100 %"},
        {"SAMPLE_ID\tSAMPLE_NAME\tLAB_L\tLAB_A\tLAB_B", "3\t\t50\t0\t0", "3", ""},
        {"SAMPLE_ID\tSAMPLE_NAME\tLAB_L\tLAB_A\tLAB_B", "\tx y\t50\t0\t0", "", "x y"},
        {"SAMPLE_ID SAMPLE_NAME LAB_L LAB_A LAB_B", "END \"M\xFC\" 50 0 0", "END", "Mü"},
        {"LAB_L LAB_A LAB_B", "50 0 0", "", ""},
    };
    for (const auto& [columns, row, id, name] : cases) {
        const DataSet set = readWell(table(columns, std::string(row) + "\n"));
        EXPECT_EQ(set.ids.empty() ? "" : set.ids[0], id) << columns << row;
        EXPECT_EQ(set.names.empty() ? "" : set.names[0], name) << columns << row;
        EXPECT_EQ(set.lab[0].L, 50) << columns;
    }
}

TEST(CgatsText, TellsDeviceChannels) {
    const struct {
        const char* columns;
        DeviceSpace space;
        std::vector<std::string> channels;
        std::vector<double> values; ///< The row is 10 20 30 40 50 60.
    } cases[] = {
        {"CMYK_K CMYK_C cmyk_m CMYK_Y x y",
         DeviceSpace::Cmyk,
         {"CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"},
         {20, 30, 40, 10}},
        {"C M Y K x y",
         DeviceSpace::Cmyk,
         {"CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"},
         {10, 20, 30, 40}},
        {"CMYK_C CMYK_M CMYK_Y CMYK_K CMYK_Orange SPOT_2",
         DeviceSpace::Cmyk,
         {"CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K", "CMYK_Orange", "SPOT_2"},
         {10, 20, 30, 40, 50, 60}},
        {"CMYKcm_C CMYKcm_M CMYKcm_Y CMYKcm_K CMYKcm_c CMYKcm_m",
         DeviceSpace::Cmyk,
         {"CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K", "CMYKcm_c", "CMYKcm_m"},
         {10, 20, 30, 40, 50, 60}},
        {"CMYKOG_1 CMYKOG_2 CMYKOG_3 CMYKOG_4 CMYKOG_5 CMYKOG_6",
         DeviceSpace::Cmyk,
         {"CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K", "CMYKOG_5", "CMYKOG_6"},
         {10, 20, 30, 40, 50, 60}},
        {"6CLR_1 6CLR_2 6CLR_3 6CLR_4 6CLR_5 6CLR_6",
         DeviceSpace::Other,
         {"6CLR_1", "6CLR_2", "6CLR_3", "6CLR_4", "6CLR_5", "6CLR_6"},
         {10, 20, 30, 40, 50, 60}},
        {"x y z RGB_R RGB_G RGB_B", DeviceSpace::Rgb, {"RGB_R", "RGB_G", "RGB_B"}, {40, 50, 60}},
        {"a b c d e f", DeviceSpace::None, {}, {}},
    };
    for (const auto& c : cases) {
        const DataSet set = readWell(
            table(c.columns + std::string(" LAB_L LAB_A LAB_B"), "10 20 30 40 50 60 70 80 90\n"));
        EXPECT_EQ(set.deviceSpace, c.space) << c.columns;
        EXPECT_EQ(set.channels, c.channels) << c.columns;
        EXPECT_EQ(set.device, c.values) << c.columns;
        EXPECT_EQ(set.lab.at(0).a, 80) << c.columns;
    }
}

TEST(CgatsText, TellsSpectralColumns) {
    const auto spectral = [](const std::string& before, const std::string& after, bool backwards) {
        std::string names = "SAMPLE_ID";
        std::string row = "1";
        for (int i = 0; i < 36; ++i) {
            const int wavelength = backwards ? 730 - 10 * i : 380 + 10 * i;
            names += "\t" + before + std::to_string(wavelength) + after;
            row += "\t0." + std::to_string(wavelength);
        }
        return table(names, row + "\n");
    };
    const std::pair<const char*, const char*> spellings[] = {
        {"SPECTRAL_NM", ""}, {"SPECTRAL_NM_", ""}, {"SPECTRAL_", ""}, {"SPEC_", ""},
        {"NM_", ""},         {"nm", ""},           {"", "nm"},        {"R_", ""},
        {"", "_NM"},         {"spectral_dec", ""}, {"", ""},          {"SPECTRAL_", ".00"}};
    for (const auto& [before, after] : spellings) {
        for (const bool backwards : {false, true}) {
            const DataSet set = readWell(spectral(before, after, backwards));
            EXPECT_EQ(set.axis.base, 380) << before << after;
            EXPECT_EQ(set.axis.step, 10) << before << after;
            ASSERT_EQ(set.axis.length, 36) << before << after;
            EXPECT_EQ(set.spectra[0], 0.380) << before << after;
            EXPECT_EQ(set.spectra[35], 0.730) << before << after;
            EXPECT_EQ(set.lab.size(), 1U);
        }
    }

    // Pairs of wavelength and value, percent by their name, in any order.
    std::string names = "SAMPLE_ID";
    std::string row = "1";
    for (int i = 0; i < 31; ++i) {
        names += " SPECTRAL_NM SPECTRAL_PCT";
        row += " " + std::to_string(700 - 10 * i) + " 1.5";
    }
    const DataSet pairs = readWell(table(names, row + "\n" + row + "\n"));
    EXPECT_EQ(pairs.axis.base, 400);
    EXPECT_EQ(pairs.axis.length, 31);
    EXPECT_THAT(pairs.spectra, testing::Each(0.015));
    // Rows that state other wavelengths are no spectra of one axis.
    EXPECT_EQ(failureOf(table(names, row + "\n" + replaced(row, "700", "705") + "\n")),
              Failure::SpectraUnusable);
}

TEST(CgatsText, DecidesScalesByWholeColumns) {
    const auto spectra = [](const std::string& name, double value, const std::string& more) {
        std::string names = more.empty() ? "ID" : "ID XYZ_X XYZ_Y XYZ_Z";
        std::string row = "1" + more;
        for (int nm = 400; nm <= 700; nm += 10) {
            names += " " + name + std::to_string(nm);
            row += " " + std::to_string(value);
        }
        return readWell(table(names, row + "\n"));
    };
    const auto device = [](const std::string& columns, const std::string& rows) {
        return readWell(table(columns, rows)).device;
    };
    const auto xyz = [](const std::string& columns, const std::string& rows) {
        return readWell(table(columns, rows)).xyz.at(0).Y;
    };
    EXPECT_THAT(device("RGB_R RGB_G RGB_B", "100 50 0\n"), ElementsAre(100, 50, 0));
    EXPECT_THAT(device("RGB_R RGB_G RGB_B", "51 0 0\n255 255 255\n"),
                ElementsAre(20, 0, 0, 100, 100, 100));
    EXPECT_THAT(device("RGB_R RGB_G RGB_B", "0.5 0 1\n"), ElementsAre(50, 0, 100));
    EXPECT_THAT(device("RGB_R RGB_G RGB_B", "65535 0 0\n"), ElementsAre(100, 0, 0));
    EXPECT_THAT(device("CMYK_C CMYK_M CMYK_Y CMYK_K", "100.4 0 0 1\n"),
                ElementsAre(100.4, 0, 0, 1));
    EXPECT_THAT(device("CMYK_C CMYK_M CMYK_Y CMYK_K", "25.5 0 0 102\n0 0 255 0\n"),
                ElementsAre(10, 0, 0, 40, 0, 0, 100, 0));
    EXPECT_THAT(device("CMYK_C CMYK_M CMYK_Y CMYK_K", "300 0 0 0\n"), ElementsAre(300, 0, 0, 0));

    EXPECT_EQ(xyz("XYZ_X XYZ_Y XYZ_Z", "0.5 0.25 0.5\n0.9 1 1.1\n"), 25);
    EXPECT_EQ(xyz("XYZ_X XYZ_Y XYZ_Z", "0.5 0.25 0.5\n80 85 70\n"), 0.25);
    // A black patch alone: Lab tells that 0.9 is of 100 (L* 8.1) or of 1 (L* 96).
    EXPECT_EQ(xyz("XYZ_X XYZ_Y XYZ_Z LAB_L LAB_A LAB_B", "0.8 0.9 0.7 8.1 0 0\n"), 0.9);
    EXPECT_EQ(xyz("XYZ_X XYZ_Y XYZ_Z LAB_L LAB_A LAB_B", "0.8 0.9 0.7 96 0 0\n"), 90);

    // ArgyllCMS never writes 0 to 1.
    const std::string dark = "CTI3\nDESCRIPTOR \"Blacks\"\n";
    const DataSet blacks =
        readWell(table("RGB_R RGB_G RGB_B XYZ_X XYZ_Y XYZ_Z", "1 0.5 0 0.5 0.25 0.5\n", dark));
    EXPECT_THAT(blacks.device, ElementsAre(1, 0.5, 0));
    EXPECT_EQ(blacks.xyz.at(0).Y, 0.25);

    EXPECT_EQ(spectra("nm", 0.5, "").spectra[0], 0.5);
    EXPECT_EQ(spectra("nm", 1.25, "").spectra[0], 1.25); // brightened
    EXPECT_EQ(spectra("nm", 62.5, "").spectra[0], 0.625);
    EXPECT_EQ(spectra("SPECTRAL_PCT", 1.5, "").spectra[0], 0.015);
    EXPECT_EQ(spectra("nm", 1.5, " 1.4 1.5 1.2").spectra[0], 0.015); // a black, as its Y tells
    EXPECT_EQ(spectra("nm", 2.5, " 241 250 206").spectra[0], 2.5);   // a fluorescent white

    EXPECT_THAT(notesOf(readWell(table("XYZ_X XYZ_Y XYZ_Z", "0.5 0.25 0.5\n"))),
                HasSubstr("XYZ is taken as 0 to 1"));
}

TEST(CgatsText, WorksOutWhatIsNotStated) {
    const std::string white = "95.5 0.25 -2";
    const DataSet labOnly = readWell(table("LAB_L LAB_A LAB_B", white + "\n"));
    EXPECT_EQ(labOnly.xyz.at(0).Y, xyzFromLab({95.5, 0.25, -2}).Y);
    const DataSet xyzOnly = readWell(table("XYZ_X XYZ_Y XYZ_Z", "20 30 40\n"));
    EXPECT_EQ(xyzOnly.lab.at(0).a, labFromXyz({20, 30, 40}).a);

    std::string names = "LAB_L LAB_A LAB_B";
    std::string row = white;
    for (int nm = 380; nm <= 730; nm += 10) {
        names += " nm" + std::to_string(nm);
        row += " 0.5";
    }
    const DataSet both = readWell(table(names, row + "\n"));
    EXPECT_EQ(both.lab.at(0).L, 95.5);       // as stated
    EXPECT_NEAR(both.xyz.at(0).Y, 50, 1e-9); // from the spectrum
    const DataSet unwanted = readWell(table(names, row + "\n"), false);
    EXPECT_THAT(unwanted.spectra, IsEmpty());
    EXPECT_EQ(unwanted.axis.length, 0);
    // A store without Lab leaves zeros: then the spectrum tells, wanted or not.
    for (const bool wanted : {true, false}) {
        const DataSet zeros = readWell(table(names, replaced(row, white, "0 0 0") + "\n"), wanted);
        EXPECT_NEAR(zeros.lab.at(0).L, 76.069, 1e-3);
        EXPECT_THAT(notesOf(zeros), HasSubstr("Lab is zero throughout"));
    }
    // A whole group without numbers is absent.
    const DataSet half = readWell(
        table("LAB_L LAB_A LAB_B XYZ_X XYZ_Y XYZ_Z", "50 1 2 - - -\n60 1 2 n/a n/a n/a\n"));
    EXPECT_EQ(half.lab.at(1).L, 60);
    EXPECT_EQ(half.xyz.at(1).Y, xyzFromLab({60, 1, 2}).Y);
    EXPECT_THAT(notesOf(half), HasSubstr("XYZ columns hold no numbers"));
}

TEST(CgatsText, JoinsTables) {
    const std::string device =
        table("SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K", "1 0 0 0 0\n2 100 0 0 0\n1 0 0 0 100\n");
    // The same ids in another order; the second 1 belongs to the second 1.
    const DataSet joined =
        readWell(device + table(labNames, "2 55 0 0\n1 95 0 0\n1 16 0 0\n", "CGATS.17\n"));
    EXPECT_THAT(joined.ids, ElementsAre("1", "2", "1"));
    ASSERT_EQ(joined.lab.size(), 3U);
    EXPECT_EQ(joined.lab[0].L, 95);
    EXPECT_EQ(joined.lab[1].L, 55);
    EXPECT_EQ(joined.lab[2].L, 16);
    EXPECT_EQ(joined.device[4], 100);

    // Pages of one chart, the second with the format of the first.
    const std::string page = table(labNames, "1 50 0 0\n2 60 0 0\n");
    const DataSet pages = readWell(page + "BEGIN_DATA\n3 70 0 0\nEND_DATA\n");
    EXPECT_THAT(pages.ids, ElementsAre("1", "2", "3"));
    EXPECT_EQ(pages.lab[2].L, 70);
    const std::string page1 = table("ID CMYK_C CMYK_M CMYK_Y CMYK_K", "1 10 0 0 0\n2 20 0 0 0\n");
    const std::string page2 = table("ID CMYK_C CMYK_M CMYK_Y CMYK_K", "1 30 0 0 0\n2 40 0 0 0\n");
    EXPECT_EQ(readWell(page1 + page2).patchCount, 4U); // ids start anew, the inks differ

    const struct {
        const char* what;
        std::string second;
    } skipped[] = {
        {"the same again", page},
        {"density extremes",
         table("INDEX RGB_R RGB_G RGB_B XYZ_X XYZ_Y XYZ_Z", "0 0 0 0 1 1 1\n1 9 9 9 8 8 8\n")},
        {"a calibration curve", table("RGB_I RGB_R RGB_G RGB_B", "0 0 0 0\n1 1 1 1\n", "CAL\n")},
        {"other patches, other columns", table("ID XYZ_X XYZ_Y XYZ_Z", "7 1 2 3\n")},
        {"no rows", table(labNames, "")},
    };
    for (const auto& [what, second] : skipped) {
        const DataSet set = readWell(page + second);
        EXPECT_EQ(set.patchCount, 2U) << what;
        EXPECT_FALSE(set.hasDevice()) << what;
        EXPECT_THAT(notesOf(set), HasSubstr("left out")) << what;
    }
    EXPECT_EQ(readWell(skipped[2].second + page).lab.size(), 2U); // the curve first
}

TEST(CgatsText, FindsConditions) {
    const struct {
        const char* header;
        Conditions expected;
    } cases[] = {
        {"ILLUMINANT \"D50\"\nOBSERVER \"CIE 2 degree\"\n", {"D50", "2", ""}},
        {"WEIGHTING_FUNCTION \"ILLUMINANT, D65\"\nWEIGHTING_FUNCTION \"OBSERVER, 10 degree\"\n",
         {"D65", "10", ""}},
        {"INSTRUMENTATION \"D50, 2 degree, geometry 45/0, no polarisation filter, white "
         "backing\"\n",
         {"D50", "2", ""}},
        {"MEASUREMENT_SOURCE \"Illumination=D50\tObserverAngle=2\xB0\tWhiteBase=Abs\tFilter=No\"\n",
         {"D50", "2", ""}},
        {"MEASUREMENT_SOURCE \"Illumination=D65 ObserverAngle=10 Filter=UVcut\"\n",
         {"D65", "10", "M2"}},
        {"MEASUREMENT_CONDITION \"M1\"\nFILTER \"UVcut\"\n", {"", "", "M1"}},
        {"INSTRUMENTATION \"Spectro 9, M0, 10\u00B0 observer\"\n", {"", "10", "M0"}},
        {"FILTER \"Pol\"\n", {"", "", "M3"}},
        {"FILTER \"No UV cut\"\n", {"", "", ""}},
        {"KEYWORD ILLUMINATION_CONDITION\nILLUMINATION_CONDITION 2\n", {"", "", "M2"}},
        {"ILLUMINATION_CONDITION -1\n", {"", "", ""}},
        {"INSTRUMENTATION \"M0, M1 and M2, D50 or D65, 2 degree or 10 degree\"\n", {"", "", ""}},
        {"INSTRUMENTATION \"geometry 45/0 degree, 12 degree, serial 1D50 M4\"\n", {"", "", ""}},
        {"ILLUMINANT F11\nOBSERVER 1964\n", {"F11", "10", ""}},
        {"DESCRIPTOR \"M1 D65\"\n", {"", "", ""}},
    };
    for (const auto& [header, expected] : cases) {
        const Conditions found =
            readWell(table(labNames, "1 50 0 0\n", std::string("CGATS.17\n") + header)).conditions;
        EXPECT_EQ(found, expected)
            << header << found.illuminant << "/" << found.observer << "/" << found.measurement;
    }
    EXPECT_THAT(notesOf(readWell(table(labNames, "1 50 0 0\n", "CGATS.17\nILLUMINANT D65\n"))),
                HasSubstr("other conditions than D50"));
}

TEST(CgatsText, NamesOneCauseForEachFailure) {
    const auto rows = [](const std::string& text) { return table(labNames, text); };
    const struct {
        const char* what;
        std::string text;
        Failure failure;
    } cases[] = {
        {"nothing", "", Failure::NotRecognised},
        {"a NUL", replaced(plain, "Press", std::string(1, '\0')), Failure::NotRecognised},
        {"prose", "Dear Sir,\n\nwhat a fine day.\n", Failure::NotRecognised},
        {"XML", "<?xml version=\"1.0\"?>\n<Preset><X/></Preset>\n", Failure::NotRecognised},
        {"a first line alone", "CGATS.17\n", Failure::Damaged},
        {"a header alone", "CGATS.17\nNUMBER_OF_SETS 9\n", Failure::Damaged},
        {"no names", "CGATS.17\nEND_DATA_FORMAT\nBEGIN_DATA\n1 50 0 0\nEND_DATA\n",
         Failure::Damaged},
        {"a short row", rows("1 50 0 0\n2 50 0\n"), Failure::Damaged},
        {"a long row between tabs", replaced(rows("1 50 0 0\n2 50 0 0 7 8\n"), " ", "\t"),
         Failure::Damaged},
        {"a long row", rows("1 50 0 0\n2 50 0 0 7 8\n"), Failure::Damaged},
        {"no END_DATA, fewer rows than stated",
         "CGATS.17\nBEGIN_DATA_FORMAT\n" + labNames +
             "\nEND_DATA_FORMAT\nNUMBER_OF_SETS 2\nBEGIN_DATA\n1 50 0 0\n",
         Failure::Damaged},
        {"no END_DATA, no count",
         "CGATS.17\nBEGIN_DATA_FORMAT\n" + labNames + "\nEND_DATA_FORMAT\nBEGIN_DATA\n1 50 0 0\n",
         Failure::Damaged},
        {"no rows", rows(""), Failure::NoPatches},
        {"a curve", table("RGB_I RGB_R RGB_G RGB_B", "0 0 0 0\n"), Failure::NoPatches},
        {"no colour", table("SAMPLE_ID D_RED D_GREEN LAB_L", "1 0.1 0.2 50\n"),
         Failure::NoColourValues},
        {"a text for a number", rows("1 50 0 0\n2 50 x 0\n"), Failure::NotNumeric},
        {"an empty cell for a number",
         table("SAMPLE_ID\tLAB_L\tLAB_A\tLAB_B", "1\t50\t0\t0\n2\t50\t\t0\n"), Failure::NotNumeric},
        {"no number", rows("1 nan 0 0\n2 50 0 0\n"), Failure::NotNumeric},
        {"infinity", rows("1 inf 0 0\n2 50 0 0\n"), Failure::NotNumeric},
        {"beyond all colours", rows("1 1e10 0 0\n2 50 0 0\n"), Failure::NotNumeric},
        {"a thousand or one point something", rows("1 1,234 0 0\n2 50.5 0 0\n"),
         Failure::NotNumeric},
        {"beyond a double", rows("1 1e999 0 0\n2 50 0 0\n"), Failure::NotNumeric},
        {"point and comma", rows("1 1,234.5 0 0\n2 50 0 0\n"), Failure::NotNumeric},
        {"all colour cells texts", rows("1 x y z\n"), Failure::NotNumeric},
        {"uneven wavelengths", table("ID nm400 nm410 nm425", "1 0.1 0.1 0.1\n"),
         Failure::SpectraUnusable},
        {"too few wavelengths", table("ID nm400 nm410 nm420", "1 0.1 0.1 0.1\n"),
         Failure::SpectraUnusable},
    };
    for (const auto& [what, text, failure] : cases)
        EXPECT_EQ(failureOf(text), failure) << what;
}

// However a text is cut, its rest never passes for a set: patches would be missing unnoticed.
TEST(CgatsText, NeverTakesACutTextForAWholeOne) {
    for (const std::string& text : {plain, replaced(plain, "NUMBER_OF_SETS 3\n", ""),
                                    replaced(plain, "\n", "\r\n"), replaced(plain, " ", "\t")}) {
        const std::size_t whole = text.rfind("END_DATA") + 8;
        for (std::size_t length = 0; length < whole; ++length) {
            const std::string cut = text.substr(0, length);
            DataSet set;
            if (readCgats(cut, {}, set) == Failure::None) {
                // All rows are there and whole, as many as stated.
                expectPlain(set, cut.c_str());
                EXPECT_THAT(cut, HasSubstr("NUMBER_OF_SETS"));
            }
        }
    }
}

TEST(CgatsText, BearsHostileSizes) {
    const std::string names = "CGATS.17\nBEGIN_DATA_FORMAT\n";
    std::string manyColumns = names;
    for (int i = 0; i < 200'000; ++i)
        manyColumns += "C" + std::to_string(i) + " ";
    EXPECT_EQ(failureOf(manyColumns + "\nEND_DATA_FORMAT\nBEGIN_DATA\nEND_DATA\n"),
              Failure::TooLarge);

    constexpr std::size_t length = 2'000'000;
    const std::string long1(length, 'x');
    EXPECT_EQ(failureOf(long1), Failure::NotRecognised);
    EXPECT_EQ(failureOf("CGATS.17\nORIGINATOR \"" + long1), Failure::Damaged);
    EXPECT_EQ(failureOf(table(labNames, "1 " + long1 + " 0 0\n2 1 0 0\n")), Failure::NotNumeric);
    std::string numbers;
    for (std::size_t i = 0; i < 220'000; ++i)
        numbers += "0 ";
    EXPECT_EQ(failureOf(table(labNames, "1 0 0 0\n1 0 " + numbers + "0\n")), Failure::Damaged);
    EXPECT_EQ(readWell(table("a b c d e f g " + labNames, numbers + "\n")).patchCount,
              20'000U); // all in one line
    EXPECT_EQ(readWell(table(labNames, "1 50 0 0\n", "CGATS.17\nORIGINATOR \"" + long1 + "\"\n"))
                  .originator.size(),
              4096U);

    std::string tables = table(labNames, "1 50 0 0\n");
    for (int i = 0; i < 5'000; ++i)
        tables += "BEGIN_DATA\n" + std::to_string(i % 3) + " 50 0 0\nEND_DATA\n";
    EXPECT_EQ(readWell(tables).patchCount, 5'001U);
}

// Every number as strtod gives it, in all writings that occur.
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
        if (i % 5 == 0)
            number *= std::pow(10, static_cast<double>(engine() % 50) - 43);
        std::snprintf(text, sizeof text, formats[engine() % std::size(formats)], number);
        rows += std::string(text) + (i % 3 == 2 ? "\n" : " ");
        expected.push_back(std::strtod(text, nullptr));
    }
    rows += "123456.78901234567890 .5 5.\n-0.00 007.50 1000000000\n"
            "0.000000000000000000000000001 1e-400 12345678\n";
    expected.insert(expected.end(),
                    {123456.78901234567890, .5, 5., -0., 7.5, 1e9, 1e-27, 0, 12345678});
    const DataSet set = readWell(table("LAB_L LAB_A LAB_B", rows));
    ASSERT_EQ(set.lab.size() * 3, expected.size());
    for (std::size_t i = 0; i < expected.size(); ++i) {
        const Lab& lab = set.lab[i / 3];
        ASSERT_EQ(i % 3 == 0 ? lab.L : i % 3 == 1 ? lab.a : lab.b, expected[i]) << "number " << i;
    }
}

// Characterisation data as printers get it, held against a reader that only splits words.
TEST(CgatsText, ReadsPublishedCharacterisationData) {
    const std::pair<const char*, std::size_t> files[] = {
        {"FOGRA28L.ti3", 1485}, {"FOGRA39L.ti3", 1617}, {"TR002.ti3", 928}, {"TR006.ti3", 1617}};
    for (const auto& [name, patches] : files) {
        const std::string text = support::contentsOf(std::string("/usr/share/color/icc/") + name);
        const DataSet set = readWell(text);
        EXPECT_EQ(set.conditions, (Conditions{"D50", "2", ""})) << name;
        EXPECT_THAT(set.notes, IsEmpty()) << name;
        ASSERT_EQ(set.patchCount, patches) << name;
        std::istringstream rows(text.substr(text.find("BEGIN_DATA\r\n") + 12));
        for (std::size_t row = 0; row < patches; ++row) {
            std::string words[11];
            for (std::string& word : words)
                rows >> word;
            const Xyz& xyz = set.xyz[row];
            const Lab& lab = set.lab[row];
            const double* const cmyk = set.device.data() + 4 * row;
            const double values[] = {cmyk[0], cmyk[1], cmyk[2], cmyk[3], xyz.X,
                                     xyz.Y,   xyz.Z,   lab.L,   lab.a,   lab.b};
            ASSERT_EQ(set.ids[row], words[0]) << name;
            for (int i = 0; i < 10; ++i)
                ASSERT_EQ(values[i], std::strtod(words[i + 1].c_str(), nullptr)) << name << row;
        }
    }
}

// The sample and definition texts of this system, as measure/ writes them.
TEST(CgatsText, ReadsTheDefinitionsOfTheSystem) {
    const std::string definition =
        "CGATS.17\r\nORIGINATOR \"Nerova Verify\"\r\nNUMBER_OF_FIELDS\t11\r\n"
        "BEGIN_DATA_FORMAT\r\nSAMPLE_ID\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K\tLAB_L\tLAB_A\tLAB_B\t"
        "XYZ_X\tXYZ_Y\tXYZ_Z\r\nEND_DATA_FORMAT\r\nDEVICE 28\r\nKEYWORD LOWRES\r\nLOWRES 0\r\n"
        "KEYWORD NUMBER_OF_SETS\r\nNUMBER_OF_SETS\t1\r\nBEGIN_DATA\r\n"
        "1\t100\t0\t0\t0\t55\t-37\t-50\t15\t22\t53\r\n"
        "2\t0.00\t0.00\t0.00\t0.00\t95.00\t0.00\t0.00\t84.00\t87.00\t74.00\r\nEND_DATA";
    for (const std::string& text :
         {definition, definition + "\r\n\r\n", replaced(definition, "NUMBER_OF_SETS\t1\r\n", "")}) {
        const DataSet patches = readWell(text);
        EXPECT_EQ(patches.patchCount, 2U);
        EXPECT_EQ(patches.lab[1].L, 95);
        EXPECT_EQ(cgatsKeyword(text, "DEVICE"), "28");
    }
}

TEST(CgatsText, FindsKeywordsInUnfinishedTexts) {
    const struct {
        const char* text;
        std::optional<std::string> expected;
    } cases[] = {
        {"DEVICE 28", "28"},
        {"\xEF\xBB\xBF"
         "device\t\"Spectro \"\"9\"\"\"\r\n",
         "Spectro \"9\""},
        {"KEYWORD DEVICE\rDEVICE 5 # chosen\rDEVICE 6\r", "5"},
        {"\"DEVICE \"\"Spectro, big\"\"\"\t\t\n", "Spectro, big"},
        {"DEVICE\n", ""},
        {"KEYWORD\tDEVICE\n", std::nullopt},
        {"DEVICE_CLASS \"OUTPUT\"\nDEVICEMODE 0\n", std::nullopt},
        {"# DEVICE 7\nORIGINATOR \"DEVICE 9\"\n", std::nullopt},
        {"BEGIN_DATA_FORMAT\nSAMPLE_ID\nEND_DATA_FORMAT\nBEGIN_DATA\nDEVICE 3\nEND_DATA\nDEVICE 4",
         "4"},
        {"BEGIN_DATA\nDEVICE 3\n", std::nullopt},
        {"DEVICE  M\xFC"
         "ller X  \n",
         "Müller X"},
        {"", std::nullopt},
    };
    for (const auto& [text, expected] : cases)
        EXPECT_EQ(cgatsKeyword(text, "DEVICE"), expected) << text;
}
