// SPDX-License-Identifier: Apache-2.0
// The same measurement as CGATS text and as CxF3 gives the same result.
#include "LibraryTest.h"

#include <nlohmann/json.hpp>

#include "ExitCodes.h"
#include "RunProgram.h"

namespace {

using Json = nlohmann::json;

const std::string fogra = "/usr/share/color/icc/FOGRA30L.ti3";

class CxfResult : public LibraryTest {
  protected:
    CxfResult() {
        const support::Outcome made =
            support::run({"python3", TINTGATE_SOURCE_DIR "/tests/colour/cxf_samples.py",
                          "/usr/share/color/icc/FOGRA39L.ti3", scratch.path()});
        EXPECT_EQ(made.exitCode, 0) << made.error;
        preset.presetValues[0] = 4;
        preset.usedForResult[0] = 1;
        preset.deltaEMode = 4;
        preset.illuminationCondition = -1;
    }

    /// The result without what it quotes from the files.
    Json resultOf(const std::string& target, const std::string& measurement) {
        EXPECT_EQ(analyse(target, measurement), 0) << target << measurement;
        Json result = Json::parse(json);
        result["inputs"] = result["inputs"]["target"]["identity"];
        return result;
    }
};

// Equal to the last printed digit, as the target and as the measurement.
TEST_F(CxfResult, IsThatOfTheSameMeasurementInCgats) {
    for (const std::string form : {"cmyk", "spots", "lab", "labels", "spectra"}) {
        SCOPED_TRACE(form);
        const std::string text = scratch.path(form + ".txt");
        const std::string cxf = scratch.path(form + ".cxf");
        const std::string other = form == "spots" ? scratch.path("lab.txt") : fogra;
        Json ofText = resultOf(text, other);
        Json ofCxf = resultOf(cxf, other);
        if (form == "spectra") { // The reader warns of a second condition.
            EXPECT_EQ(ofCxf["warnings"].size(), ofText["warnings"].size() + 1);
            ofCxf["warnings"] = ofText["warnings"];
        }
        EXPECT_TRUE(ofCxf == ofText) << Json::diff(ofText, ofCxf).dump(1).substr(0, 2000);
        EXPECT_GE(ofText["patches"].size(), 84U);
        if (form != "spectra") {
            EXPECT_TRUE(resultOf(other, cxf) == resultOf(other, text));
        }
    }
}

TEST_F(CxfResult, IsOfTheConditionThatThePresetIsMeantFor) {
    const std::string spectra = scratch.path("spectra.cxf");
    const auto stated = [&](int condition) {
        preset.illuminationCondition = condition;
        EXPECT_EQ(analyse(fogra, spectra), 0);
        return Json::parse(json)["inputs"]["measurement"]["measurementCondition"];
    };
    EXPECT_EQ(stated(-1), "M1");
    EXPECT_EQ(stated(2), "M2");
    EXPECT_EQ(stated(3), "M1");
}

TEST_F(CxfResult, HasADistinctCodeForEachFault) {
    const std::string bare = "<CxF xmlns='http://colorexchangeformat.com/CxF3-core'>";
    const std::string objects = "<Resources><ObjectCollection><Object Id='1'>";
    const struct {
        std::string text;
        int code;
    } cases[] = {
        {"<!DOCTYPE CxF>" + bare + "</CxF>", exitInputXmlRefused},
        {bare, exitInputDamaged},
        {bare + "</CxF>", exitNoPatches},
        {"<CxF xmlns='urn:other'/>", exitInputNotRecognised},
        {bare + objects +
             "<DeviceColorValues><ColorCMYK><Cyan>0</Cyan><Magenta>0</Magenta><Yellow>0"
             "</Yellow><Black>0</Black></ColorCMYK></DeviceColorValues></Object>"
             "</ObjectCollection></Resources></CxF>",
         exitNoColourValues},
        {bare + objects +
             "<ColorValues><ColorCIELab><L>x</L><A>0</A><B>0</B></ColorCIELab>"
             "</ColorValues></Object></ObjectCollection></Resources></CxF>",
         exitValueNotNumeric},
    };
    for (const auto& [text, code] : cases) {
        EXPECT_EQ(analyse(scratch.write("faulty.cxf", text), fogra), code) << text;
        EXPECT_EQ(analyse(fogra, scratch.path("faulty.cxf")), code) << text;
    }
}

} // namespace
