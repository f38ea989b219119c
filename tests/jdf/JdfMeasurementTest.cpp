// SPDX-License-Identifier: Apache-2.0
#include "jdf/JdfMeasurement.h"

#include <cmath>
#include <cstring>
#include <string>

#include <gtest/gtest.h>

#include "ScratchFolder.h"

namespace {

/// Two patches with values at the edges of their conversions. tests/data/jdf/measurement.txt is the
/// expected element.
class Element : public testing::Test {
  protected:
    Element() {
        std::fill_n(spectral[0].values, 36, 0.5);
        record.numPatches = 2;
        record.hasSpectral = 1;
        record.xyz = xyz;
        record.cmyk = cmyk;
        record.spectral = spectral;
    }

    /// The text inserted into `abc`, after its first byte.
    std::string written(long capacity = 10'000, const wxString& comment = "Proof 100%s") {
        std::string buffer = "abc" + std::string(10'000, '.');
        long length = 3;
        code = WriteJDFMeasureData(buffer.data() + 1, buffer.data(), buffer.data() + capacity,
                                   &length, record, &header, comment);
        return buffer.substr(0, static_cast<std::size_t>(length));
    }

    double xyz[6] = {1.239, 20.0, -0.019, 95.05, 100.0, 1e30};
    double cmyk[8] = {255, 0, 1.274, 1.276, -2.55, 127.5, 254.9, 1e30};
    spectralRow spectral[2] = {{{}, 0, 0, 99}, {{-0.0000125, 1e9, NAN}, 400, 20, 0}};
    measurementDataRecord record;
    JDFMeasurementHeader header{.measureDate = "2024-05-31",
                                .measureTime = "13:37:00",
                                .deltaEType = "CIELAB",
                                .cmmVersion = "1.1.2.3",
                                .approval = true,
                                .paperWhitePass = true,
                                .maxTolerance = 5,
                                .maxDeltaE = 3.1234567,
                                .averageTolerance = -0.0000019,
                                .averageDeltaE = 1.0000009,
                                .writePatchDefinitions = true};
    int code = 1;
};

TEST_F(Element, IsThatOfItsStrip) {
    const std::string first =
        support::contentsOf(TINTGATE_SOURCE_DIR "/tests/data/jdf/measurement.txt");
    EXPECT_EQ(written(), "a" + first + "bc");
    EXPECT_EQ(code, 0);
    std::string second = first;
    second.insert(second.rfind('>'), "2").insert(second.find(' '), "2");
    header.secondStrip = 1;
    EXPECT_EQ(written(), "a" + second + "bc");
    header.secondStrip = 2; // not a strip, so without its own tags
    const auto inside = first.find("Approval");
    EXPECT_EQ(written(), "a" + first.substr(inside, first.rfind("</") - inside) + "bc");
}

TEST_F(Element, LeavesOutWhatIsNotThereAndCutsWhatIsTooLong) {
    record.spectral = nullptr; // the flag alone determines the count
    record.xyz = record.cmyk = nullptr;
    std::memset(header.cmmVersion, '9', sizeof header.cmmVersion);
    std::memset(header.profileName, 'p', sizeof header.profileName);
    header.measureDate[0] = '\0'; // the time alone is sufficient
    const std::string text = written(10'000, wxString('c', 181));
    for (const std::string& part :
         {"Date=\"\" Time=\"13:37:00\" Comment=\"" + std::string(180, 'c') + "\"",
          "cid:" + std::string(180, 'p') + "\"",
          std::string("CMMVersion=\"9999999999999999\" MaxTol"),
          std::string("Name\"/>\n</tazo:Measurement>\nbc")}) {
        EXPECT_NE(text.find(part), std::string::npos) << part;
    }
    header.measureTime[0] = '\0'; // now
    EXPECT_TRUE(std::isdigit(written().at(text.find("Date=\"") + 6)));
}

TEST_F(Element, CountsEachPieceAgainstTheLimit) {
    const std::string whole = written();
    const auto size = static_cast<long>(whole.size());
    EXPECT_EQ(written(size + 1), whole);
    // One byte less: the closing tag does not fit.
    EXPECT_EQ(written(size), whole.substr(0, whole.find("</tazo:M")) + "bc");
    EXPECT_EQ(code, -30);
    // The last piece of the last spectrum does not fit; its pieces of more than 200 bytes stay.
    const std::string cut = written(size - 20);
    EXPECT_EQ(cut, whole.substr(0, cut.size() - 2) + "bc");
    EXPECT_GT(cut.size() - 2, whole.find("<tazo:SpectralData1") + 400);
    // Up to FileSpec, a piece is tried even if earlier ones did not fit.
    const auto third = whole.find("Spectral");
    const std::string some = whole.substr(0, whole.find("Approval")) +
                             whole.substr(third, whole.find("<FileSpec") - third) + "bc";
    EXPECT_EQ(written(static_cast<long>(some.size()) + 1), some);
    EXPECT_EQ(code, -30);
}

} // namespace
