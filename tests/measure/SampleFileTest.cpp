// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <bit>
#include <climits>
#include <cmath>
#include <limits>
#include <random>
#include <span>
#include <sstream>

#include <gtest/gtest.h>

#include "ScratchFolder.h"
#include "job/KZVerifyJobProcessor.h"

namespace {

constexpr double infinity = std::numeric_limits<double>::infinity();

/// Numbers whose texts might differ: edge cases, random bits, and few digits as instruments return.
double anyNumber(std::mt19937_64& random) {
    static const double edges[] = {-0.0,      infinity,  -std::nan(""),       999999.5,
                                   9999999.5, 9.9999995, 0.00009999999999995, 1e5};
    const std::uint64_t bits = random();
    switch (random() % 4) {
    case 0:
        return edges[bits % std::size(edges)];
    case 1:
        return std::bit_cast<double>(bits);
    default:
        return std::ldexp(bits % (1u << random() % 28), -static_cast<int>(random() % 20));
    }
}

/// Writes the rows with a single stream. The precision set for XYZ and spectra stays set, so only
/// the first row has six digits in the columns before them.
std::string streamed(const KZJobDataStruct& job) {
    const measurementDataRecord& record = job.measurement;
    const bool hasSpectra = record.spectral != nullptr && record.numPatches > 0 &&
                            record.spectral[0].length >= 0 && record.spectral[0].length <= 36;
    const int length = hasSpectra ? record.spectral[0].length : 0;
    std::ostringstream names, rows;
    names << (record.lab != nullptr ? "\tLAB_L\tLAB_A\tLAB_B" : "")
          << (record.xyz != nullptr ? "\tXYZ_X\tXYZ_Y\tXYZ_Z" : "");
    for (long long i = 0; i < length; ++i) {
        names << "\tSPECTRAL_" << record.spectral[0].base + i * record.spectral[0].stepsize;
    }
    for (int patch = 0; patch < record.numPatches; ++patch) {
        const auto add = [&](const double* values, int count) {
            for (int i = 0; i < count; ++i) {
                rows << '\t' << values[i];
            }
        };
        rows << patch + 1;
        add(record.cmyk + 4 * patch, 4);
        if (record.lab != nullptr) {
            add(record.lab + 3 * patch, 3);
        }
        if (record.xyz != nullptr) {
            rows.precision(7);
            add(record.xyz + 3 * patch, 3);
        }
        if (length > 0) {
            rows.precision(8);
            add(record.spectral[patch].values, length);
        }
        rows << "\n";
    }
    const auto fields = 5 + std::ranges::count(names.str(), '\t');
    return "CGATS.17\nKEYWORD ILLUMINATION_CONDITION\nILLUMINATION_CONDITION -3\n"
           "NUMBER_OF_FIELDS " +
           std::to_string(fields) +
           "\nBEGIN_DATA_FORMAT\nSAMPLE_ID\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K" + names.str() +
           "\nEND_DATA_FORMAT\nNUMBER_OF_SETS " + std::to_string(record.numPatches) +
           "\nBEGIN_DATA\n" + rows.str() + "END_DATA\n";
}

class SampleFile : public testing::Test {
  protected:
    SampleFile() {
        setenv("TMPDIR", m_folder.path().c_str(), 1);
        m_job.illuminationMode = -3;
        m_job.referenceFile = stringToWstring(m_reference);
        m_job.sampleFile = m_sample;
        m_job.measurement.cmyk = m_cmyk;
    }

    int write(bool reference) {
        return KZVerifyJobProcessor().WriteTemporarySampleFile(m_job, reference);
    }

    const support::ScratchFolder m_folder;
    const std::string m_sample = m_folder.path("sample");
    const std::string m_reference = m_folder.path("J\xf6rg"); // Not valid UTF-8.
    double m_cmyk[12] = {}, m_lab[9] = {}, m_xyz[9] = {};
    spectralRow m_spectra[3] = {};
    KZJobDataStruct m_job;
};

TEST_F(SampleFile, IsWhatAStreamWrites) {
    std::mt19937_64 random(20251125);
    const int lengths[] = {-1, 0, 1, 2, 36, 37, INT_MAX};
    for (int round = 0; round < 1500; ++round) {
        m_job.measurement.numPatches = static_cast<int>(random() % 4);
        m_job.measurement.lab = random() % 2 == 0 ? m_lab : nullptr;
        m_job.measurement.xyz = random() % 2 == 0 ? m_xyz : nullptr;
        m_job.measurement.spectral = nullptr;
        if (random() % 3 != 0) {
            m_job.measurement.spectral = m_spectra;
            m_spectra[0].base = static_cast<int>(random()); // The first row's range applies to all.
            m_spectra[0].stepsize = static_cast<int>(random());
            m_spectra[0].length = lengths[random() % std::size(lengths)];
        }
        for (const std::span<double> values :
             {std::span<double>(m_cmyk), std::span<double>(m_lab), std::span<double>(m_xyz),
              std::span<double>(m_spectra[0].values), std::span<double>(m_spectra[2].values)}) {
            std::ranges::generate(values, [&] { return anyNumber(random); });
        }
        ASSERT_EQ(write(false), 0);
        ASSERT_EQ(support::contentsOf(m_sample), streamed(m_job)) << round;
    }
}

TEST_F(SampleFile, ReplacesOneFileOrTheOther) {
    m_folder.write("sample", "old sample");
    m_folder.write("J\xf6rg", std::string(1000, 'x'));
    m_job.measurement.cmyk = nullptr;
    EXPECT_EQ(write(true), -1);
    EXPECT_EQ(support::contentsOf(m_reference), "");
    EXPECT_EQ(support::contentsOf(m_sample), "old sample");
    m_job.measurement.cmyk = m_cmyk;
    m_job.sampleFile = m_folder.path("no such folder/sample");
    EXPECT_EQ(write(false), 0) << "what can't be written is not reported";
}

} // namespace
