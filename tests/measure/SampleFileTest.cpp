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

/// A record whose arrays are the test's: device values at first.
struct Samples {
    explicit Samples(std::size_t patches)
        : cmyk(4 * patches), lab(3 * patches), xyz(3 * patches), spectra(patches) {
        record.numPatches = static_cast<int>(patches);
        record.cmyk = cmyk.data();
    }

    void addSpectra(int base, int stepsize, int length) {
        record.spectral = spectra.data();
        record.spectral->base = base; // The first row's range is that of all.
        record.spectral->stepsize = stepsize;
        record.spectral->length = length;
    }

    std::vector<double> cmyk, lab, xyz;
    std::vector<spectralRow> spectra;
    measurementDataRecord record;
};

class SampleFile : public testing::Test {
  protected:
    SampleFile() {
        setenv("TMPDIR", m_folder.path().c_str(), 1);
        m_job.illuminationMode = -3;
        m_job.referenceFile = stringToWstring(m_reference);
        m_job.sampleFile = m_sample;
    }

    int write(const Samples& samples, bool reference) {
        m_job.measurement = samples.record;
        return KZVerifyJobProcessor().WriteTemporarySampleFile(m_job, reference);
    }
    std::string written(const Samples& samples) {
        EXPECT_EQ(write(samples, false), 0);
        return support::contentsOf(m_sample);
    }

    const support::ScratchFolder m_folder;
    const std::string m_sample = m_folder.path("sample");
    const std::string m_reference = m_folder.path("J\xf6rg"); // Not valid UTF-8.
    KZJobDataStruct m_job;
};

TEST_F(SampleFile, GivesTheFirstRowFewerDigits) {
    Samples samples(3);
    samples.record.lab = samples.lab.data();
    samples.record.xyz = samples.xyz.data();
    samples.addSpectra(380, 10, 2);
    for (std::size_t i = 0; i < 3; ++i) {
        std::ranges::copy(std::vector{12.3456789, 100., 0., -0.0}, &samples.cmyk[4 * i]);
        std::ranges::copy(std::vector{95.123456789, -0.00001234567, 1234567.8},
                          &samples.lab[3 * i]);
        std::ranges::copy(std::vector{84.123456789, 1e-7, infinity}, &samples.xyz[3 * i]);
        std::ranges::copy(std::vector{0.0123456789012, 1.}, samples.spectra[i].values);
    }
    const std::string rest = "\t84.12346\t1e-07\tinf\t0.012345679\t1\n";
    const std::string later = "12.345679\t100\t0\t-0\t95.123457\t-1.234567e-05\t1234567.8" + rest;
    EXPECT_EQ(written(samples),
              "CGATS.17\nKEYWORD ILLUMINATION_CONDITION\nILLUMINATION_CONDITION -3\n"
              "NUMBER_OF_FIELDS 13\nBEGIN_DATA_FORMAT\nSAMPLE_ID\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K\t"
              "LAB_L\tLAB_A\tLAB_B\tXYZ_X\tXYZ_Y\tXYZ_Z\tSPECTRAL_380\tSPECTRAL_390\n"
              "END_DATA_FORMAT\nNUMBER_OF_SETS 3\nBEGIN_DATA\n"
              "1\t12.3457\t100\t0\t-0\t95.1235\t-1.23457e-05\t1.23457e+06" +
                  rest + "2\t" + later + "3\t" + later + "END_DATA\n");
}

TEST_F(SampleFile, HasTheColumnsThatAreThere) {
    std::string wavelengths;
    for (int nm = 380; nm <= 730; nm += 10) {
        wavelengths += "\tSPECTRAL_" + std::to_string(nm);
    }
    const std::string labNames = "\tLAB_L\tLAB_A\tLAB_B";
    const std::string xyzNames = "\tXYZ_X\tXYZ_Y\tXYZ_Z";
    struct Case {
        bool lab, xyz;
        int base, stepsize, length;
        std::string fields, names, value;
    };
    const Case cases[] = {
        {false, false, 380, 10, -1, "5", "", "-1.23457e-300"},
        {false, false, 380, 10, 37, "5", "", "-1.23457e-300"},
        {true, false, 380, 10, -1, "8", labNames, "-1.23457e-300"},
        {false, true, 380, 10, 0, "8", xyzNames, "-1.234568e-300"},
        {true, false, 380, 10, 36, "44", labNames + wavelengths, "-1.2345679e-300"},
        {false, false, 400, -5, 2, "7", "\tSPECTRAL_400\tSPECTRAL_395", "-1.2345679e-300"},
        {false, false, 2147483647, 2147483647, 2, "7", "\tSPECTRAL_2147483647\tSPECTRAL_4294967294",
         "-1.2345679e-300"},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.names);
        Samples samples(2);
        for (auto* values : {&samples.cmyk, &samples.lab, &samples.xyz}) {
            values->assign(values->size(), -1.23456789e-300);
        }
        std::fill_n(samples.spectra[1].values, 36, -1.23456789e-300);
        samples.record.lab = c.lab ? samples.lab.data() : nullptr;
        samples.record.xyz = c.xyz ? samples.xyz.data() : nullptr;
        samples.addSpectra(c.base, c.stepsize, c.length);
        std::string lastRow = "\n2";
        for (int i = 1; i < std::stoi(c.fields); ++i) {
            lastRow += "\t" + c.value;
        }
        const std::string text = written(samples);
        EXPECT_NE(text.find("\nNUMBER_OF_FIELDS " + c.fields + "\n"), text.npos) << text;
        EXPECT_NE(text.find("\tCMYK_K" + c.names + "\n"), text.npos) << text;
        EXPECT_NE(text.find(lastRow + "\nEND_DATA\n"), text.npos) << text;
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
    EXPECT_EQ(write(Samples(0), true), -1) << "a null array of device values";
    EXPECT_EQ(support::contentsOf(m_reference), "");

    Samples samples(1);
    samples.addSpectra(380, 10, 36);
    samples.record.numPatches = 0;
    EXPECT_EQ(write(samples, true), 0);
    EXPECT_EQ(support::contentsOf(m_reference),
              "CGATS.17\nKEYWORD ILLUMINATION_CONDITION\nILLUMINATION_CONDITION -3\n"
              "NUMBER_OF_FIELDS 5\nBEGIN_DATA_FORMAT\n"
              "SAMPLE_ID\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K\nEND_DATA_FORMAT\n"
              "NUMBER_OF_SETS 0\nBEGIN_DATA\nEND_DATA\n");
    EXPECT_EQ(support::contentsOf(m_sample), "old sample");
    m_job.sampleFile = m_folder.path("no such folder/sample");
    EXPECT_EQ(write(samples, false), 0) << "what can't be written is not reported";
}

} // namespace
