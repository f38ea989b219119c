// SPDX-License-Identifier: Apache-2.0
// The text files of a job. The sample file, against a C++ stream that writes the same text. The
// definition, against a bare loop that copies the strip's lines.
#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <iomanip>
#include <limits>
#include <random>
#include <sstream>
#include <string>
#include <vector>

#include <wx/convauto.h>
#include <wx/textfile.h>

#include "ScratchFolder.h"
#include "Timing.h"
#include "job/KZVerifyJobProcessor.h"

namespace {

using bench::secondsOf;

/// Takes turns; each side counts with its best time.
void compare(const std::string& name, const std::function<void()>& ours,
             const std::function<void()>& peer) {
    double best = std::numeric_limits<double>::max();
    double peerBest = best;
    for (int round = 0; round < 9; ++round) {
        best = std::min(best, secondsOf(ours));
        peerBest = std::min(peerBest, secondsOf(peer));
    }
    std::printf("%-40s %8.2f ms, %.2f times the peer's %.2f ms\n", name.c_str(), best * 1e3,
                best / peerBest, peerBest * 1e3);
}

struct Measurement {
    explicit Measurement(std::size_t patches)
        : cmyk(patches * 4), lab(patches * 3), xyz(patches * 3), spectra(patches) {
        std::mt19937_64 random(7);
        std::uniform_real_distribution<double> percent(0, 100);
        for (auto* values : {&cmyk, &lab, &xyz}) {
            std::generate(values->begin(), values->end(), [&] { return percent(random); });
        }
        for (spectralRow& row : spectra) {
            row.base = 380;
            row.stepsize = 10;
            row.length = spectralValueCount;
            std::generate(row.values, row.values + spectralValueCount,
                          [&] { return percent(random) / 100; });
        }
        record.numPatches = static_cast<int>(patches);
        record.cmyk = cmyk.data();
        record.lab = lab.data();
        record.xyz = xyz.data();
        record.spectral = spectra.data();
    }

    std::vector<double> cmyk, lab, xyz;
    std::vector<spectralRow> spectra;
    measurementDataRecord record;
};

void streamRows(const Measurement& from, const std::string& path) {
    std::ofstream file(path);
    std::ostringstream row;
    const auto put = [&](const double* values, int count) {
        for (int i = 0; i < count; ++i) {
            row << '\t' << values[i];
        }
    };
    for (std::size_t patch = 0; patch < from.spectra.size(); ++patch) {
        row.str("");
        row << patch + 1;
        put(&from.cmyk[patch * 4], 4);
        put(&from.lab[patch * 3], 3);
        row << std::setprecision(7);
        put(&from.xyz[patch * 3], 3);
        row << std::setprecision(8);
        put(from.spectra[patch].values, spectralValueCount);
        file << row.str() << '\n';
    }
}

void walkLines(const std::string& strip, const std::string& path) {
    wxTextFile file;
    file.Open(strip, wxConvAuto());
    std::ofstream output(path);
    for (std::size_t i = 0; i < file.GetLineCount(); ++i) {
        output << (file.GetLine(i) + "\r\n").utf8_string();
    }
}

void writeStrip(const std::string& path, int sets) {
    std::ofstream strip(path);
    strip << "CGATS.17\nDEVICE 21\nNUMBER_OF_STRIPS 21\nNUMBER_OF_SETS " << sets
          << "\nNUMBER_OF_FIELDS 11\nBEGIN_DATA_FORMAT\nSAMPLE_ID\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K\t"
             "LAB_L\tLAB_A\tLAB_B\tXYZ_X\tXYZ_Y\tXYZ_Z\nEND_DATA_FORMAT\nBEGIN_DATA\n";
    for (int i = 1; i <= sets; ++i) {
        strip << i << "\t0.00\t40.00\t27.00\t0.00\t69.12\t31.05\t4.60\t44.21\t37.90\t28.13\n";
    }
    strip << "END_DATA\n";
}

} // namespace

int main() {
    const support::ScratchFolder folder;
    setenv("TMPDIR", folder.path().c_str(), 1);
    KZVerifyJobProcessor processor;
    KZJobDataStruct job;
    for (const int patches : {1617, 16170}) {
        const Measurement measurement(static_cast<std::size_t>(patches));
        job.measurement = measurement.record;
        job.sampleFile = folder.path("samples");
        compare(
            "sample file of " + std::to_string(patches) + " patches",
            [&] { processor.WriteTemporarySampleFile(job, false); },
            [&] { streamRows(measurement, folder.path("peer")); });

        const std::string strip = folder.path("strip");
        writeStrip(strip, patches);
        compare(
            "definition of " + std::to_string(patches) + " patches",
            [&] { processor.WriteTemporaryMeasurementDefinitionFile(strip, &job); },
            [&] { walkLines(strip, folder.path("peer")); });
    }
}
