#include <algorithm>
#include <bit>
#include <cmath>
#include <iomanip>
#include <limits>
#include <random>
#include <sstream>
#include <vector>

#include <gtest/gtest.h>

#include "ScratchFolder.h"
#include "job/KZVerifyJobProcessor.h"
#include "measure/NumberText.h"

namespace {

constexpr double infinity = std::numeric_limits<double>::infinity();

/// A record of three equal patches, with device values alone at first.
class SampleFile : public testing::Test {
  protected:
    SampleFile() {
        setenv("TMPDIR", m_folder.path().c_str(), 1);
        m_job.illuminationMode = -3;
        m_job.referenceFile = stringToWstring(m_reference);
        m_job.sampleFile = m_sample;
        m_job.measurement.numPatches = 3;
        m_job.measurement.cmyk = m_cmyk;
        for (int i = 0; i < 3; ++i) {
            std::ranges::copy(std::vector{12.3456789, 100., 0., -0.0}, m_cmyk + 4 * i);
            std::ranges::copy(std::vector{95.123456789, -1.234567e-5, 1234567.8}, m_lab + 3 * i);
            std::ranges::copy(std::vector{84.123456789, 1e-7, infinity}, m_xyz + 3 * i);
            std::ranges::fill(m_spectra[i].values, -1.23456789e-300);
        }
    }

    void addSpectra(int base, int stepsize, int length) {
        m_job.measurement.spectral = m_spectra;
        m_spectra[0].base = base; // The first row's range is that of all.
        m_spectra[0].stepsize = stepsize;
        m_spectra[0].length = length;
    }

    int write(bool reference) {
        return KZVerifyJobProcessor().WriteTemporarySampleFile(m_job, reference);
    }

    const support::ScratchFolder m_folder;
    const std::string m_sample = m_folder.path("sample");
    const std::string m_reference = m_folder.path("J\xf6rg"); // Not valid UTF-8.
    double m_cmyk[12], m_lab[9], m_xyz[9];
    spectralRow m_spectra[3];
    KZJobDataStruct m_job;
};

TEST_F(SampleFile, GivesTheFirstRowFewerDigits) {
    m_job.measurement.lab = m_lab;
    m_job.measurement.xyz = m_xyz;
    addSpectra(380, 10, 2);
    EXPECT_EQ(write(false), 0);
    const std::string rest = "\t84.12346\t1e-07\tinf\t-1.2345679e-300\t-1.2345679e-300\n";
    const std::string later = "12.345679\t100\t0\t-0\t95.123457\t-1.234567e-05\t1234567.8" + rest;
    EXPECT_EQ(support::contentsOf(m_sample),
              "CGATS.17\nKEYWORD ILLUMINATION_CONDITION\nILLUMINATION_CONDITION -3\n"
              "NUMBER_OF_FIELDS 13\nBEGIN_DATA_FORMAT\nSAMPLE_ID\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K\t"
              "LAB_L\tLAB_A\tLAB_B\tXYZ_X\tXYZ_Y\tXYZ_Z\tSPECTRAL_380\tSPECTRAL_390\n"
              "END_DATA_FORMAT\nNUMBER_OF_SETS 3\nBEGIN_DATA\n"
              "1\t12.3457\t100\t0\t-0\t95.1235\t-1.23457e-05\t1.23457e+06" +
                  rest + "2\t" + later + "3\t" + later + "END_DATA\n");
}

TEST_F(SampleFile, HasTheColumnsThatAreThere) {
    const std::string labText = "\t95.1235\t-1.23457e-05\t1.23457e+06";
    std::string wavelengths;
    std::string reflectances;
    for (int nm = 380; nm <= 730; nm += 10) {
        wavelengths += "\tSPECTRAL_" + std::to_string(nm);
        reflectances += "\t-1.2345679e-300";
    }
    struct Case {
        bool lab, xyz;
        int base, stepsize, length;
        std::string fields, names, values; ///< Names and values behind the device values.
    };
    const Case cases[] = {
        {false, false, 380, 10, -1, "5", "", ""},
        {false, false, 380, 10, 37, "5", "", ""},
        {true, false, 380, 10, -1, "8", "\tLAB_L\tLAB_A\tLAB_B", labText},
        {false, true, 380, 10, 0, "8", "\tXYZ_X\tXYZ_Y\tXYZ_Z", "\t84.12346\t1e-07\tinf"},
        {false, false, 380, 10, 36, "41", wavelengths, reflectances},
        {false, false, 400, -5, 1, "6", "\tSPECTRAL_400", "\t-1.2345679e-300"},
        {false, false, 2147483647, 2147483647, 2, "7", "\tSPECTRAL_2147483647\tSPECTRAL_4294967294",
         "\t-1.2345679e-300\t-1.2345679e-300"},
    };
    for (const Case& c : cases) {
        m_job.measurement.lab = c.lab ? m_lab : nullptr;
        m_job.measurement.xyz = c.xyz ? m_xyz : nullptr;
        addSpectra(c.base, c.stepsize, c.length);
        EXPECT_EQ(write(false), 0);
        const std::string text = support::contentsOf(m_sample);
        EXPECT_NE(text.find("\nNUMBER_OF_FIELDS " + c.fields + "\n"), text.npos) << text;
        EXPECT_NE(text.find("\tCMYK_K" + c.names + "\n"), text.npos) << text;
        EXPECT_NE(text.find("\n1\t12.3457\t100\t0\t-0" + c.values + "\n2\t"), text.npos) << text;
    }
}

TEST(NumberText, IsThatOfAStream) {
    std::mt19937_64 random(20251125);
    std::vector<double> values = {
        0.0,       -0.0,       infinity,       -infinity, std::nan(""),        -std::nan(""),
        999999.5,  9999999.5,  99999999.5,     2.5e-5,    0.00009999999995,    9.9999995,
        99999.995, 1.9073e-06, std::exp2(-19), 100000,    0.09999999499999999, 0.0001};
    for (int i = 0; i < 20'000; ++i) {
        values.push_back(std::bit_cast<double>(random())); // Any bits at all.
        // Few digits, as instruments give, and many that lie between two texts.
        const double few = static_cast<double>(random() % (1u << random() % 28));
        values.push_back(std::ldexp(i % 2 == 0 ? few : -few, -static_cast<int>(random() % 20)));
    }
    std::ostringstream stream;
    for (const double value : values) {
        for (const int digits : {6, 7, 8}) {
            stream.str("");
            stream << std::setprecision(digits) << value;
            char text[longestNumberText];
            ASSERT_EQ(std::string(text, writeNumberText(text, value, digits)), stream.str())
                << digits;
        }
    }
}

TEST_F(SampleFile, ReplacesOneFileOrTheOther) {
    m_folder.write("sample", "old sample");
    m_folder.write("J\xf6rg", std::string(1000, 'x'));
    m_job.measurement.cmyk = nullptr;
    EXPECT_EQ(write(true), -1);
    EXPECT_EQ(support::contentsOf(m_reference), "");

    m_job.measurement.cmyk = m_cmyk;
    m_job.measurement.numPatches = 0; // So no row of spectra is looked at.
    addSpectra(380, 10, 36);
    EXPECT_EQ(write(true), 0);
    const std::string text = support::contentsOf(m_reference);
    EXPECT_NE(text.find("\nNUMBER_OF_FIELDS 5\n"), text.npos) << text;
    EXPECT_NE(text.find("\nNUMBER_OF_SETS 0\nBEGIN_DATA\nEND_DATA\n"), text.npos) << text;
    EXPECT_EQ(support::contentsOf(m_sample), "old sample");
    m_job.sampleFile = m_folder.path("no such folder/sample");
    EXPECT_EQ(write(false), 0) << "what can't be written is not reported";
}

} // namespace
