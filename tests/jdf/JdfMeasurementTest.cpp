#include "jdf/JdfMeasurement.h"

#include <cmath>
#include <cstring>
#include <string>
#include <vector>

#include <gtest/gtest.h>

namespace {

struct Patches {
    std::vector<double> xyz;
    std::vector<double> cmyk;
    std::vector<spectralRow> spectral;

    measurementDataRecord record() {
        measurementDataRecord record;
        record.numPatches = static_cast<int>(xyz.size() / 3);
        record.xyz = xyz.data();
        record.cmyk = cmyk.data();
        record.spectral = spectral.empty() ? nullptr : spectral.data();
        record.hasSpectral = record.spectral != nullptr;
        return record;
    }
};

/// Two patches with values at the edges of their conversions.
Patches twoPatches() {
    Patches patches{{1.239, 20.0, -0.019, 95.05, 100.0, 1e30},
                    {255, 0, 1.274, 1.276, -2.55, 127.5, 254.9, 1e30},
                    {{{}, 380, 10, 36}, {{}, 400, 20, 99}}};
    std::fill_n(patches.spectral[0].values, 36, 0.5);
    patches.spectral[1].values[0] = -0.0000125;
    patches.spectral[1].values[1] = 1e9;
    patches.spectral[1].values[2] = NAN;
    return patches;
}

JDFMeasurementHeader headerOf(unsigned char strip) {
    JDFMeasurementHeader header;
    std::strcpy(header.measureDate, "2024-05-31");
    std::strcpy(header.measureTime, "13:37:00");
    std::strcpy(header.deltaEType, "CIELAB");
    std::strcpy(header.cmmVersion, "1.1.2.3");
    header.secondStrip = strip;
    header.approval = true;
    header.paperWhitePass = true;
    header.maxTolerance = 5;
    header.maxDeltaE = 3.1234567;
    header.averageTolerance = -0.0000019;
    header.averageDeltaE = 1.0000009;
    header.writePatchDefinitions = true;
    return header;
}

std::string spectrum(int patch, const std::string& first, const std::string& others, int from) {
    std::string line = "<tazo:SpectralData" + std::to_string(patch) + " " + first;
    for (int i = from; i < 36; ++i) {
        line += "dvalue" + std::to_string(i) + "=\"" + others + "\"";
    }
    return line + "/>\r\n";
}

struct Written {
    int code;
    std::string contents;
};

/// Writes into `abc`, behind its first byte.
Written written(const measurementDataRecord& record, JDFMeasurementHeader header,
                const char* comment, long capacity = 10'000) {
    std::string buffer(static_cast<std::size_t>(capacity), '.');
    buffer.replace(0, 3, "abc");
    long length = 3;
    const int code = WriteJDFMeasureData(buffer.data() + 1, buffer.data(), buffer.data() + capacity,
                                         &length, record, &header, comment);
    return {code, buffer.substr(0, static_cast<std::size_t>(length))};
}

const std::string attributes =
    "Approval=\"true\" MaxDeltaE=\"3123456\" TotalPass=\"false\" CMMVersion=\"1.1.2.3\" "
    "MaxToleranc=\"5000000\" TypeOfDeltaE=\"CIE Lab\" AverageDeltaE=\"1000000\" "
    "SpectralCount=\"2\" PaperWhitePass=\"true\" AverageToleranc=\"-1\">";
const std::string fileSpec =
    "<FileSpec URL=\"cid:\" MimeType=\"application/icc\" UserFileName=\"\" "
    "DescriptiveName=\"EmbeddedProfileName\"/>\n";
const std::string definitions =
    "<tazo:PatchDefinitionData0 CValue=\"100000000\" KValue=\"1000000\" MValue=\"0\" "
    "YValue=\"0\"/>\r\n"
    "<tazo:PatchDefinitionData1 CValue=\"65535000000\" KValue=\"0\" MValue=\"50000000\" "
    "YValue=\"100000000\"/>\r\n";
const std::string colours =
    "<tazo:PatchData XValue=\"123\" YValue=\"2000\" ZValue=\"-1\"/>\r\n"
    "<tazo:PatchData XValue=\"9505\" YValue=\"10000\" ZValue=\"-9223372036854775808\"/>\r\n";
const std::string spectra =
    spectrum(0, "", "500000", 0) +
    spectrum(1, "dvalue0=\"-13\"dvalue1=\"-2147483648\"dvalue2=\"-2147483648\"", "0", 3);

TEST(JdfMeasurement, WritesTheElementOfEachStrip) {
    Patches patches = twoPatches();
    const std::string inside = attributes + fileSpec + definitions + colours + spectra;
    const std::string start = " Date=\"2024-05-31\" Time=\"13:37:00\" Comment=\"Proof 100%s\" ";
    const std::string expected[] = {
        "<tazo:Measurement" + start + inside + "</tazo:Measurement>\n",
        "<tazo:Measurement2" + start + inside + "</tazo:Measurement2>\n",
        inside, // neither strip
    };
    for (unsigned char strip = 0; strip < 3; ++strip) {
        const Written result = written(patches.record(), headerOf(strip), "Proof 100%s");
        EXPECT_EQ(result.code, 0);
        EXPECT_EQ(result.contents, "a" + expected[strip] + "bc");
    }
}

TEST(JdfMeasurement, LeavesOutWhatIsNotThereAndCutsWhatIsTooLong) {
    Patches patches = twoPatches();
    measurementDataRecord record = patches.record();
    record.spectral = nullptr; // the flag alone makes the count
    JDFMeasurementHeader header = headerOf(0);
    header.writePatchDefinitions = false;
    std::memset(header.cmmVersion, '9', sizeof header.cmmVersion);
    std::memset(header.profileName, 'p', sizeof header.profileName);
    const std::string longComment(181, 'c');
    std::string text = written(record, header, longComment.c_str()).contents;
    EXPECT_NE(text.find("Comment=\"" + longComment.substr(1) + "\" "), std::string::npos);
    EXPECT_NE(text.find("cid:" + std::string(180, 'p') + "\""), std::string::npos);
    EXPECT_NE(text.find("CMMVersion=\"9999999999999999\" "), std::string::npos);
    EXPECT_NE(text.find("/>\n" + colours + "</tazo:Measurement>\nbc"), std::string::npos);

    record.xyz = nullptr;
    record.cmyk = nullptr;
    record.hasSpectral = 0;
    text = written(record, headerOf(0), "").contents;
    EXPECT_NE(text.find("SpectralCount=\"0\""), std::string::npos);
    EXPECT_NE(text.find(fileSpec + "</tazo:Measurement>\n"), std::string::npos);

    header.measureTime[0] = header.measureDate[0] = '\0'; // now
    text = written(record, header, "").contents;
    EXPECT_TRUE(std::isdigit(text.at(text.find("Date=\"") + 6)));
    EXPECT_EQ(text.at(text.find("Time=\"") + 8), ':');
    header.measureTime[0] = '1'; // either of the two is enough
    EXPECT_NE(written(record, header, "").contents.find("Date=\"\" Time=\"1"), std::string::npos);
}

TEST(JdfMeasurement, CountsEachPieceAgainstTheLimit) {
    Patches patches = twoPatches();
    const std::string whole = written(patches.record(), headerOf(0), "").contents;
    const auto size = static_cast<long>(whole.size());
    EXPECT_EQ(written(patches.record(), headerOf(0), "", size + 1).contents, whole);

    // One byte less: the closing tag has no room.
    const Written open = written(patches.record(), headerOf(0), "", size);
    EXPECT_EQ(open.code, -30);
    EXPECT_EQ(open.contents, whole.substr(0, whole.find("</tazo:M")) + "bc");

    // The last piece of the last spectrum: those before it stay.
    const Written cut = written(patches.record(), headerOf(0), "", size - 20);
    EXPECT_EQ(cut.code, -30);
    const auto piece = cut.contents.size() - 2 - cut.contents.rfind("<tazo:SpectralData1");
    EXPECT_GT(piece, 200U);
    EXPECT_EQ(cut.contents, whole.substr(0, cut.contents.size() - 2) + "bc");

    // Up to FileSpec a piece is tried though those before it had no room.
    measurementDataRecord none;
    const std::string opening =
        "a<tazo:Measurement Date=\"2024-05-31\" Time=\"13:37:00\" Comment=\"\" ";
    const std::string third = attributes.substr(attributes.find("Spectral"));
    const std::string expected = opening + "SpectralCount=\"0" + third.substr(16) + "bc";
    const Written some = written(none, headerOf(0), "", static_cast<long>(expected.size()) + 1);
    EXPECT_EQ(some.code, -30);
    EXPECT_EQ(some.contents, expected);
}

} // namespace
