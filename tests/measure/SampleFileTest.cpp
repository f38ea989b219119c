#include <algorithm>
#include <cmath>
#include <cstring>
#include <iomanip>
#include <limits>
#include <random>
#include <sstream>
#include <vector>

#include <gtest/gtest.h>

#include "ScratchFolder.h"
#include "job/KZVerifyJobProcessor.h"

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
    const auto put = [](double* place, std::initializer_list<double> values) {
        std::copy(values.begin(), values.end(), place);
    };
    for (std::size_t i = 0; i < 3; ++i) {
        put(&samples.cmyk[4 * i], {12.3456789, 100., 0., -0.0});
        put(&samples.lab[3 * i], {95.123456789, -0.00001234567, 1234567.8});
        put(&samples.xyz[3 * i], {84.123456789, 1e-7, infinity});
        put(samples.spectra[i].values, {0.0123456789012, 1.});
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
    constexpr int none = -2;
    const struct {
        bool lab, xyz;
        int base, stepsize, length;
        const char *fields, *names, *secondRow;
    } cases[] = {
        {false, false, 0, 0, none, "5", "", "1.23457"},
        {true, false, 0, 0, none, "8", "\tLAB_L\tLAB_A\tLAB_B", "1.23457"},
        {false, true, 0, 0, none, "8", "\tXYZ_X\tXYZ_Y\tXYZ_Z", "1.234568"},
        {false, false, 400, -5, 2, "7", "\tSPECTRAL_400\tSPECTRAL_395", "1.2345679"},
        {false, false, 2147483647, 2147483647, 2, "7", "\tSPECTRAL_2147483647\tSPECTRAL_4294967294",
         "1.2345679"},
        {false, true, 380, 10, 0, "8", "\tXYZ_X\tXYZ_Y\tXYZ_Z", "1.234568"},
        {false, false, 380, 10, 37, "5", "", "1.23457"},
        {false, false, 380, 10, -1, "5", "", "1.23457"},
    };
    for (const auto& [lab, xyz, base, stepsize, length, fields, names, secondRow] : cases) {
        Samples samples(2);
        samples.cmyk[4] = 1.23456789;
        samples.record.lab = lab ? samples.lab.data() : nullptr;
        samples.record.xyz = xyz ? samples.xyz.data() : nullptr;
        if (length != none) {
            samples.addSpectra(base, stepsize, length);
        }
        const std::string text = written(samples);
        EXPECT_NE(text.find(std::string("\nNUMBER_OF_FIELDS ") + fields + "\n"), text.npos) << text;
        EXPECT_NE(text.find(std::string("\tCMYK_K") + names + "\n"), text.npos) << text;
        EXPECT_NE(text.find(std::string("\n2\t") + secondRow + "\t0\t"), text.npos) << text;
    }
}

/// The requirement as it is put: one stream for all rows, emptied between them. Device values
/// alone, or all groups.
std::string streamedRows(const Samples& samples) {
    std::ostringstream stream;
    std::string rows;
    const auto put = [&stream](const double* values, int count) {
        for (int i = 0; i < count; ++i) {
            stream << '\t' << values[i];
        }
    };
    for (std::size_t i = 0; i < samples.spectra.size(); ++i) {
        stream.str("");
        stream << i + 1;
        put(&samples.cmyk[4 * i], 4);
        if (samples.record.lab != nullptr) {
            put(&samples.lab[3 * i], 3);
            stream << std::setprecision(7);
            put(&samples.xyz[3 * i], 3);
            stream << std::setprecision(8);
            put(samples.spectra[i].values, 36);
        }
        rows += stream.str() + "\n";
    }
    return rows;
}

TEST_F(SampleFile, WritesNumbersAsAStreamDoes) {
    std::mt19937_64 random(20251125);
    using Limits = std::numeric_limits<double>;
    const double special[] = {0.0,          -0.0,          infinity,          -infinity,
                              std::nan(""), -std::nan(""), Limits::max(),     Limits::denorm_min(),
                              999999.5,     9999999.5,     99999999.5,        0.00009999999995,
                              2.5e-5,       9.9999995,     99999.995,         0.09999999499999999,
                              0.0001,       100000,        1.9073486328125e-6};
    const auto any = [&]() -> double {
        switch (random() % 3) {
        case 0:
            return special[random() % std::size(special)];
        case 1: { // Any bits at all.
            const std::uint64_t bits = random();
            double value;
            std::memcpy(&value, &bits, sizeof value);
            return value;
        }
        default: { // Few digits, as instruments give, and many that lie between two texts.
            const double value = static_cast<double>(random() % (1u << random() % 28));
            return std::ldexp(random() % 2 == 0 ? value : -value, -static_cast<int>(random() % 20));
        }
        }
    };
    Samples samples(1617);
    for (auto* values : {&samples.cmyk, &samples.lab, &samples.xyz}) {
        std::generate(values->begin(), values->end(), any);
    }
    for (spectralRow& row : samples.spectra) {
        std::generate(row.values, row.values + 36, any);
    }
    const auto rows = [&] {
        const std::string text = written(samples);
        const std::string start = "\nBEGIN_DATA\n";
        return text.substr(text.find(start) + start.size());
    };
    EXPECT_TRUE(rows() == streamedRows(samples) + "END_DATA\n") << "6 digits";
    samples.record.lab = samples.lab.data();
    samples.record.xyz = samples.xyz.data();
    samples.addSpectra(380, 10, 36);
    EXPECT_TRUE(rows() == streamedRows(samples) + "END_DATA\n") << "7 and 8 digits";
    const std::string text = support::contentsOf(m_sample);
    EXPECT_NE(text.find("\nNUMBER_OF_FIELDS 47\n"), text.npos);
    EXPECT_NE(text.find("\tSPECTRAL_730\nEND_DATA_FORMAT\n"), text.npos);
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
