// SPDX-License-Identifier: Apache-2.0
#include "colour/Cxf.h"

#include <cmath>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "RunProgram.h"
#include "ScratchFolder.h"
#include "Utf16.h"
#include "colour/ColourFile.h"

using namespace colour;
using testing::ElementsAre;
using testing::HasSubstr;

namespace {

const std::string core = "http://colorexchangeformat.com/CxF3-core";

/// Objects in a file with the ColorSpecifications "s" (D50, 2 degrees, 380 nm by 10, M1), "m0",
/// "d65", "ten" (10 degrees) and "lamp" (a special illuminant).
std::string file(const std::string& objects,
                 const std::string& start = "<CxF xmlns='" + core + "'>",
                 const std::string& end = "</CxF>") {
    const auto measuredUnder = [](const char* id, const char* light, const char* condition,
                                  const char* observer = "2_Degree") {
        return std::string("<ColorSpecification Id='") + id + "'><TristimulusSpec>" +
               (*light != '\0' ? "<Illuminant>" + std::string(light) + "</Illuminant>"
                               : "<CustomIlluminant StartWL='380'>1 1 1</CustomIlluminant>") +
               "<Observer>" + observer +
               "</Observer></TristimulusSpec><MeasurementSpec>"
               "<MeasurementType>Spectrum_Reflectance</MeasurementType>"
               "<WavelengthRange StartWL='380' Increment='10'/><Device><DeviceIllumination>" +
               condition + "</DeviceIllumination></Device></MeasurementSpec></ColorSpecification>";
    };
    return start + "<Resources><ObjectCollection>" + objects +
           "</ObjectCollection><ColorSpecificationCollection>" +
           measuredUnder("s", "D50", "M1_Daylight") +
           measuredUnder("m0", "D50", "M0_Incandescent") +
           measuredUnder("d65", "D65", "M1_Daylight") +
           measuredUnder("ten", "D50", "M1_Daylight", "10_Degree") +
           measuredUnder("lamp", "", "M1_Daylight") +
           "</ColorSpecificationCollection></Resources>" + end;
}

std::string object(const std::string& content, const std::string& attributes = "Id='1' Name='a'") {
    return "<Object ObjectType='Color' " + attributes + ">" + content + "</Object>";
}

std::string lab(const std::string& L, const std::string& conditions = "s") {
    return "<ColorValues><ColorCIELab ColorSpecification='" + conditions + "'><L>" + L +
           "</L><A>1</A><B>-2.5</B></ColorCIELab></ColorValues>";
}

std::string cmyk(const std::string& cyan, const std::string& spots = "") {
    const std::string kind = spots.empty() ? "ColorCMYK" : "ColorCMYKPlusN";
    return "<DeviceColorValues><" + kind + "><Cyan>" + cyan +
           "</Cyan><Magenta>0</Magenta><Yellow>100</Yellow><Black>0</Black>" + spots + "</" + kind +
           "></DeviceColorValues>";
}

std::string spot(const std::string& name, const std::string& percent) {
    return "<SpotColor><Name>" + name + "</Name><Percentage>" + percent +
           "</Percentage></SpotColor>";
}

std::string rgb(const std::string& content) {
    return "<DeviceColorValues><ColorRGB>" + content + "</ColorRGB></DeviceColorValues>";
}

std::string spectrum(const std::string& numbers, const std::string& attributes) {
    return "<ColorValues><ReflectanceSpectrum " + attributes + ">" + numbers +
           "</ReflectanceSpectrum></ColorValues>";
}

std::string repeated(const std::string& text, int times) {
    std::string result;
    for (int i = 0; i < times; ++i) {
        result += text;
    }
    return result;
}

std::string place(int row) {
    return "<TagCollection Name='Location'><Tag Name='Row' Value='" + std::to_string(row) +
           "'/><Tag Name='Column' Value='0'/></TagCollection>";
}

DataSet readWell(const std::string& text, const CgatsWants& wants = {}) {
    DataSet set;
    EXPECT_EQ(readCxf(text, wants, set), Failure::None) << text;
    return set;
}

std::vector<double> lightness(const DataSet& set) {
    std::vector<double> values;
    for (const Lab& one : set.lab) {
        values.push_back(one.L);
    }
    return values;
}

} // namespace

// The same numbers, digit by digit, as text and as XML.
TEST(Cxf, IsReadAsTheSameMeasurementInCgats) {
    const support::ScratchFolder folder;
    const support::Outcome made =
        support::run({"python3", TINTGATE_SOURCE_DIR "/tests/colour/cxf_samples.py",
                      "/usr/share/color/icc/FOGRA39L.ti3", folder.path()});
    ASSERT_EQ(made.exitCode, 0) << made.error;
    for (const char* form : {"cmyk", "spots", "lab", "spectra", "labels"}) {
        SCOPED_TRACE(form);
        ColourFile text;
        ColourFile cxf;
        ASSERT_EQ(loadColourFile(folder.path(std::string(form) + ".txt"), {}, text), Failure::None);
        ASSERT_EQ(loadColourFile(folder.path(std::string(form) + ".cxf"), {}, cxf), Failure::None);
        EXPECT_EQ(cxf.set->patchCount, 1617U);
        EXPECT_EQ(cxf.set->ids, text.set->ids);
        EXPECT_EQ(cxf.set->deviceSpace, text.set->deviceSpace);
        EXPECT_EQ(cxf.set->channels, text.set->channels);
        EXPECT_TRUE(cxf.set->device == text.set->device);
        EXPECT_TRUE(cxf.set->spectra == text.set->spectra);
        EXPECT_EQ(cxf.set->axis.base, text.set->axis.base);
        EXPECT_EQ(cxf.set->conditions.measurement, "M1");
        bool same = true;
        for (std::size_t i = 0; i < text.set->patchCount; ++i) {
            const Lab& a = text.set->lab[i];
            const Lab& b = cxf.set->lab[i];
            const Xyz& c = text.set->xyz[i];
            const Xyz& d = cxf.set->xyz[i];
            same = same && a.L == b.L && a.a == b.a && a.b == b.b && c.X == d.X && c.Y == d.Y &&
                   c.Z == d.Z;
        }
        EXPECT_TRUE(same);
    }
    // The measurement under M2 reflects a tenth less.
    ColourFile m1;
    ColourFile m2;
    ASSERT_EQ(loadColourFile(folder.path("spectra.cxf"), {.condition = "M3"}, m1), Failure::None);
    ASSERT_EQ(loadColourFile(folder.path("spectra.cxf"), {.condition = "M2"}, m2), Failure::None);
    EXPECT_EQ(m1.set->conditions.measurement, "M1"); // There is no M3.
    EXPECT_EQ(m2.set->conditions.measurement, "M2");
    EXPECT_NEAR(m2.set->spectra[0], 0.9 * m1.set->spectra[0], 1e-6);
    EXPECT_THAT(m2.set->notes,
                ElementsAre("There are measurements under M1, M2: those under M2 are used."));
}

TEST(Cxf, RefusesWhatItCantTrust) {
    const std::string good = object(lab("50") + cmyk("10"));
    const std::string start = "<CxF xmlns='" + core + "'>";
    const std::string bands = repeated("0.5 ", 36);
    const std::string entity = "<!DOCTYPE CxF [<!ENTITY a 'aaaa'><!ENTITY b '&a;&a;&a;'>]>";
    const struct {
        const char* what;
        std::string text;
        Failure expected;
    } cases[] = {
        {"nothing", "", Failure::NotRecognised},
        {"another root", "<html><body/></html>", Failure::NotRecognised},
        {"the root of another format", "<Palette xmlns='" + core + "'/>", Failure::NotRecognised},
        {"version 2", file(good, "<CxF xmlns='http://www.gretagmacbeth.com/CxF'>"),
         Failure::NotRecognised},
        {"a document type", "<!DOCTYPE CxF>" + file(good), Failure::XmlRefused},
        {"an external entity",
         "<!DOCTYPE CxF [<!ENTITY x SYSTEM 'file:///etc/passwd'>]>" + file(good),
         Failure::XmlRefused},
        {"an entity bomb", entity + file(good), Failure::XmlRefused},
        {"a document type below", file(good + "<!DOCTYPE CxF>"), Failure::XmlRefused},
        {"deep nesting", start + repeated("<a>", 100) + repeated("</a>", 100) + "</CxF>",
         Failure::XmlRefused},
        {"deep nesting, cut off", start + repeated("<a>", 500'000), Failure::XmlRefused},
        {"cut off in a tag", file(good).substr(0, 120), Failure::Damaged},
        {"cut off between tags", file(good).substr(0, file(good).size() - 6), Failure::Damaged},
        {"tags that cross",
         start + "<Resources><ObjectCollection></Resources></ObjectCollection></CxF>",
         Failure::Damaged},
        {"two roots", file(good) + file(good), Failure::Damaged},
        {"no resources", start + "</CxF>", Failure::NoPatches},
        {"no objects", file(""), Failure::NoPatches},
        {"objects outside the collection", start + "<Resources>" + good + "</Resources></CxF>",
         Failure::NoPatches},
        {"objects of another namespace",
         file("<x:Object xmlns:x='urn:other' Id='1'>" + lab("50") + "</x:Object>"),
         Failure::NoPatches},
        {"an empty object", file(object("")), Failure::NoPatches},
        {"densities and sRGB alone",
         file(object("<ColorValues><ColorDensity><Density>1</Density></ColorDensity><ColorSRGB>"
                     "<R>1</R><G>1</G><B>1</B></ColorSRGB></ColorValues>")),
         Failure::NoPatches},
        {"a text for L*", file(object(lab("dark"))), Failure::NotNumeric},
        {"not a number", file(object(lab("NaN"))), Failure::NotNumeric},
        {"infinity", file(object(lab("INF"))), Failure::NotNumeric},
        {"a decimal comma", file(object(lab("50,5"))), Failure::NotNumeric},
        {"an unknown entity", file(object(lab("&x;"))), Failure::NotNumeric},
        {"a number out of range", file(object(lab("1e12"))), Failure::NotNumeric},
        {"no L*",
         file(object("<ColorValues><ColorCIELab><A>1</A><B>1</B></ColorCIELab>"
                     "</ColorValues>")),
         Failure::NotNumeric},
        {"no cyan",
         file(object(lab("50") + "<DeviceColorValues><ColorCMYK><Magenta>0</Magenta>"
                                 "</ColorCMYK></DeviceColorValues>")),
         Failure::NotNumeric},
        {"an ink without a name", file(object(lab("50") + cmyk("0", spot("", "10")))),
         Failure::NotNumeric},
        {"a text for an ink", file(object(lab("50") + cmyk("0", spot("Orange", "much")))),
         Failure::NotNumeric},
        {"a range of 0",
         file(object(lab("50") + rgb("<MaxRange>0</MaxRange><R>1</R><G>1</G><B>1</B>"))),
         Failure::NotNumeric},
        {"CMYK beside RGB",
         file(object(lab("50") + cmyk("0")) + object(lab("50") + rgb("<R>1</R><G>1</G><B>1</B>"))),
         Failure::Damaged},
        {"L*a*b* of one, a spectrum of the other",
         file(object(lab("50")) + object(spectrum(bands, "ColorSpecification='s'"))),
         Failure::Damaged},
        {"a text in a spectrum", file(object(spectrum("0.5 x 0.5", "ColorSpecification='s'"))),
         Failure::NotNumeric},
        {"an empty spectrum", file(object(spectrum("", "ColorSpecification='s'"))),
         Failure::NoColourValues},
        {"spectra of a few bands", file(object(spectrum("0.5 0.5 0.5", "ColorSpecification='s'"))),
         Failure::SpectraUnusable},
        {"spectra of two lengths",
         file(object(spectrum(bands, "ColorSpecification='s'")) +
              object(spectrum(bands + "0.5", "ColorSpecification='s'"))),
         Failure::SpectraUnusable},
        {"wavelengths that nothing states", file(object(spectrum("0.5 0.5 0.5 0.5", ""))),
         Failure::SpectraUnusable},
    };
    for (const auto& [what, text, expected] : cases) {
        DataSet set;
        set.descriptor = "untouched";
        EXPECT_EQ(readCxf(text, {}, set), expected) << what;
        EXPECT_EQ(set.descriptor, "untouched") << what;
    }
}

TEST(Cxf, ReadsFilesAsTheyAreMet) {
    const std::string good = object(lab("50") + cmyk("10"));
    const std::string prefixed = [&] {
        std::string text = file(good, "<q:CxF xmlns:q='" + core + "'>", "</q:CxF>");
        for (std::size_t at = 0; (at = text.find('<', at)) != text.npos; ++at) {
            const std::size_t name = text[at + 1] == '/' ? at + 2 : at + 1;
            if (text[name + 1] != ':') {
                text.insert(name, "q:");
            }
        }
        return text;
    }();
    const std::string bands = repeated("0.5 ", 36);
    const struct {
        const char* what;
        std::string text;
        std::vector<double> device;
        const char* note = "";
    } cases[] = {
        {"plain", file(good), {10, 0, 100, 0}},
        {"another prefix", prefixed, {10, 0, 100, 0}},
        {"no namespace", file(good, "<CxF>"), {10, 0, 100, 0}, "does not state the namespace"},
        {"a prefix bound below the root",
         file("<y:Object xmlns:y='" + core + "' Id='1'>" + lab("50") + cmyk("10") + "</y:Object>"),
         {10, 0, 100, 0}},
        {"a foreign element in between",
         file("<x:Note xmlns:x='urn:other'>&amp;</x:Note>" + good),
         {10, 0, 100, 0}},
        {"a declaration and UTF-8's mark",
         "\xEF\xBB\xBF<?xml version='1.0'?>\n" + file(good),
         {10, 0, 100, 0}},
        {"UTF-16",
         support::utf16("<?xml version='1.0' encoding='UTF-16'?>" + file(good), "LE"),
         {10, 0, 100, 0}},
        {"comments and CDATA within numbers",
         file(object(lab("5<!-- -->0") + cmyk("<![CDATA[1]]>0"))),
         {10, 0, 100, 0}},
        {"blanks around numbers", file(object(lab("\n  +5e1\t") + cmyk(" 10 "))), {10, 0, 100, 0}},
        {"a spectrum that is claimed and not there",
         file(object("<ColorValues/>" + lab("50", "none") + cmyk("10"))),
         {10, 0, 100, 0}},
        {"inks by name in any order",
         file(object(lab("50") + cmyk("0", spot("Violet", "7") + spot("Orange", "5"))) +
              object(lab("50") + cmyk("1", spot("Orange", "6")))),
         {0, 0, 100, 0, 7, 5, 1, 0, 100, 0, 0, 6}},
        {"process inks by name",
         file(object(lab("50") + "<DeviceColorValues><ColorCustom>" + spot("BLACK", "4") +
                     spot("cyan", "1") + spot("Magenta", "2") + spot("Gold", "9") +
                     spot("yellow", "3") + "</ColorCustom></DeviceColorValues>")),
         {1, 2, 3, 4, 9}},
        {"RGB of another range",
         file(object(lab("50") + rgb("<MaxRange>1000</MaxRange><R>500</R><G>0</G><B>1000</B>"))),
         {50, 0, 100}},
        {"RGB of bytes",
         file(object(lab("50") + rgb("<R>51</R><G>0</G><B>255</B>"))),
         {20, 0, 100}},
        {"a chart that nobody measured",
         file(object(cmyk("10")) + object(cmyk("20"))),
         {10, 0, 100, 0, 20, 0, 100, 0}},
        {"hue and chroma",
         file(object("<ColorValues><ColorCIELCh><L>50</L><C>2.6926</C><H>291.8014</H></ColorCIELCh>"
                     "</ColorValues>" +
                     cmyk("10"))),
         {10, 0, 100, 0}},
        {"some objects without L*a*b*",
         file(object(lab("50") + spectrum(bands, "ColorSpecification='s'") + cmyk("10")) +
              object(spectrum(bands, "ColorSpecification='s'") + cmyk("20"))),
         {10, 0, 100, 0, 20, 0, 100, 0},
         "Only 1 object has"},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        EXPECT_TRUE(looksLikeCxf(c.text));
        const DataSet set = readWell(c.text);
        EXPECT_EQ(set.device, c.device);
        EXPECT_FALSE(set.calculated);
        std::string notes;
        for (const std::string& note : set.notes) {
            notes += note;
        }
        EXPECT_THAT(notes, HasSubstr(c.note));
        EXPECT_EQ(set.notes.empty(), *c.note == '\0') << notes;
        if (set.hasColour() && notes.empty()) {
            EXPECT_NEAR(set.lab[0].L, 50, 1e-9);
            EXPECT_NEAR(set.lab[0].a, 1, 1e-4);
            EXPECT_NEAR(set.lab[0].b, -2.5, 1e-4);
        }
    }
}

// The spectra are a flat grey of 50 %, whatever conditions the file states.
TEST(Cxf, CalculatesColoursThatAreStatedForOtherLight) {
    const double grey = 116 * std::cbrt(0.5) - 16;
    const std::string bands = spectrum(repeated("0.5 ", 36), "ColorSpecification='s'");
    const std::string coarse = spectrum("0.5 0.5", "ColorSpecification='s'");
    const std::string xyz = "<ColorValues><ColorCIEXYZ ColorSpecification='s'><X>96.422</X>"
                            "<Y>100</Y><Z>82.521</Z></ColorCIEXYZ></ColorValues>";
    const struct {
        const char* what;
        std::string objects;
        double L;
        bool calculated;
        const char* illuminant;
        const char* observer;
    } cases[] = {
        {"D65", object(lab("70", "d65") + bands), grey, true, "D65", "2"},
        {"10 degrees", object(lab("70", "ten") + bands), grey, true, "D50", "10"},
        {"an illuminant of its own", object(lab("70", "lamp") + bands), grey, true, "custom", "2"},
        {"the usual ones", object(lab("70", "s") + bands), 70, false, "D50", "2"},
        {"nothing stated", object(lab("70", "none") + bands), 70, false, "", ""},
        {"the usual ones beside others", object(lab("9", "d65") + lab("70", "s") + bands), 70,
         false, "D50", "2"},
        {"spectra alone", object(bands), grey, false, "", ""},
        {"values that do not count", object(lab("70", "ten") + bands) + object(bands, "Id='2'"),
         grey, false, "", ""},
        {"D65 without spectra", object(lab("70", "d65")), 70, false, "D65", "2"},
        {"10 degrees without spectra", object(lab("70", "ten")), 70, false, "D50", "10"},
        {"spectra that are too coarse", object(lab("70", "ten") + coarse), 70, false, "D50", "10"},
        {"an object of other conditions",
         object(lab("70", "s")) + object(lab("71", "ten"), "Id='2'"), 70, false, "D50", "10"},
        {"the same with the usual ones last",
         object(lab("70", "ten")) + object(lab("71", "none"), "Id='2'"), 70, false, "D50", "10"},
        {"L*a*b* for other light than XYZ", object(lab("70", "d65") + xyz), 100, false, "D50", "2"},
    };
    for (const auto& c : cases) {
        for (const bool wantsSpectra : {false, true}) {
            SCOPED_TRACE(c.what);
            const DataSet set = readWell(file(c.objects), {.spectra = wantsSpectra});
            EXPECT_NEAR(set.lab[0].L, c.L, 0.001);
            EXPECT_EQ(set.calculated, c.calculated);
            EXPECT_EQ(set.conditions.illuminant, c.illuminant);
            EXPECT_EQ(set.conditions.observer, c.observer);
        }
    }
}

TEST(Cxf, JoinsTargetsAndMeasurements) {
    const auto target = [](int row, const char* name) {
        return object(cmyk(std::to_string(row)) + (row < 9 ? place(row) : ""),
                      "Id='t" + std::to_string(row) + "' Name='" + name + "'");
    };
    const auto measured = [](int row, const char* name, const char* L) {
        return object(lab(L) + (row < 9 ? place(row) : ""),
                      "Id='m" + std::string(L) + "' Name='" + name + "'");
    };
    const struct {
        const char* what;
        std::string objects;
        std::vector<double> cyan;
        std::vector<double> L;
        const char* note = "";
    } cases[] = {
        {"by place, though names say otherwise",
         measured(2, "a", "20") + target(1, "a") + target(2, "b") + measured(1, "b", "10"),
         {1, 2},
         {10, 20}},
        {"by name",
         measured(11, "b", "20") + measured(10, "a", "10") + target(10, "a") + target(11, "b"),
         {10, 11},
         {10, 20}},
        {"by order",
         target(10, "a") + target(11, "b") + measured(10, "x", "10") + measured(11, "y", "20"),
         {10, 11},
         {10, 20},
         "in their order"},
        {"measured twice",
         target(1, "a") + measured(1, "x", "10") + measured(1, "y", "11"),
         {1, 1},
         {10, 11}},
        {"one not measured",
         target(1, "a") + target(2, "b") + measured(2, "x", "20"),
         {2},
         {20},
         "1 object has device values without a measurement"},
        {"one without a target",
         target(1, "a") + measured(1, "x", "10") + measured(3, "y", "30"),
         {1},
         {10},
         "1 object has colours without device values"},
        {"none in common",
         target(1, "a") + measured(3, "x", "10") + measured(4, "y", "20"),
         {1},
         {},
         "2 objects have colours without device values"},
        {"a paper beside whole objects",
         object(lab("50") + cmyk("1")) + object(lab("95"), "Id='p' Name='Substrate'"),
         {1},
         {50},
         "1 object has colours without device values"},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        const DataSet set = readWell(file(c.objects));
        std::vector<double> cyan;
        for (std::size_t i = 0; i < set.patchCount; ++i) {
            cyan.push_back(set.device[4 * i]);
        }
        EXPECT_EQ(cyan, c.cyan);
        EXPECT_EQ(lightness(set), c.L);
        EXPECT_THAT(set.notes.empty() ? "" : set.notes[0], HasSubstr(c.note));
    }
}

TEST(Cxf, ChoosesAmongConditionsAndLights) {
    const std::string both = object(lab("30", "m0") + lab("40", "s") + lab("50", "d65"));
    const std::string byType = "<Object ObjectType='M2_Measurement' Id='1'>" + lab("60", "none") +
                               "</Object><Object ObjectType='M0_Measurement' Id='2'>" +
                               lab("70", "none") + "</Object>";
    const struct {
        std::string objects;
        std::string wanted;
        std::vector<double> L;
        std::string condition;
        std::string illuminant;
    } cases[] = {{both, "", {40}, "M1", "D50"},
                 {both, "M0", {30}, "M0", "D50"},
                 {both, "M2", {40}, "M1", "D50"},
                 {object(lab("50", "d65")), "", {50}, "M1", "D65"},
                 {byType, "", {70}, "M0", ""},
                 {byType, "M2", {60}, "M2", ""},
                 {object(lab("80", "none")), "M2", {80}, "", ""}};
    for (const auto& c : cases) {
        SCOPED_TRACE(c.objects + c.wanted);
        const DataSet set = readWell(file(c.objects), {.condition = c.wanted});
        EXPECT_EQ(lightness(set), c.L);
        EXPECT_EQ(set.conditions.measurement, c.condition);
        EXPECT_EQ(set.conditions.illuminant, c.illuminant);
    }
}

// The form with L*a*b* writes what it reads.
TEST(Cxf, KeepsItsInksInCgats) {
    for (const std::string& objects :
         {object(lab("50") + cmyk("0", spot("Deep \"Sea\" 485", "7") + spot("Orange", "5"))),
          object(lab("50") + "<DeviceColorValues><ColorCustom>" + spot("Gold", "9") +
                 spot("Grün", "8") + "</ColorCustom></DeviceColorValues>")}) {
        const DataSet set = readWell(file(objects));
        DataSet back;
        ASSERT_EQ(readCgats(writeCgats(set), {}, back), Failure::None) << writeCgats(set);
        EXPECT_EQ(back.channels, set.channels);
        EXPECT_EQ(back.device, set.device);
        EXPECT_EQ(back.deviceSpace, set.deviceSpace);
    }
}

TEST(Cxf, BearsHostileSizes) {
    // Refused before parsing, because the tree would take a gigabyte.
    DataSet set;
    EXPECT_EQ(readCxf(file(repeated("<a/>", 20'000'001)), {}, set), Failure::TooLarge);
    std::string inks;
    for (int i = 0; i < 100; ++i) {
        inks += spot("Ink " + std::to_string(i), "1");
    }
    EXPECT_EQ(readCxf(file(object(lab("50") + cmyk("1", inks))), {}, set), Failure::TooLarge);
    EXPECT_EQ(
        readWell(file(object(lab("50"), "Id='" + std::string(1 << 20, 'i') + "'"))).patchCount, 1U);
}
