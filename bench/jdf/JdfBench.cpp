// SPDX-License-Identifier: Apache-2.0
// Updating a JDF file, against the minimum of any update: read the file, insert the text once,
// write the file.
#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <filesystem>
#include <fstream>
#include <functional>
#include <limits>
#include <memory>
#include <string>
#include <vector>

#include <fcntl.h>
#include <unistd.h>

#include "jdf/JdfHandler.h"

namespace {

/// Processor seconds, including system calls, of the fastest of several runs. The preparation
/// before each is not timed. Elapsed time would be less reliable, because the disk and other
/// programs disturb it.
double fastest(const std::function<void()>& prepare, const std::function<void()>& work) {
    double best = std::numeric_limits<double>::max();
    for (int run = 0; run < 15; ++run) {
        prepare();
        const std::clock_t start = std::clock();
        work();
        best = std::min(best, static_cast<double>(std::clock() - start) / CLOCKS_PER_SEC);
    }
    return best;
}

void require(bool done, const char* what) {
    if (!done) {
        std::fprintf(stderr, "%s failed\n", what);
        std::exit(1);
    }
}

/// A job's JDF with its measurement resource in the middle, after the dates to be stamped.
std::string fileOf(std::size_t size) {
    const std::string line =
        "    <Media ID=\"M0001\" Class=\"Consumable\" Status=\"Available\" Weight=\"115\"/>\n";
    std::string half;
    while (half.size() < size / 2) {
        half += line;
    }
    return "<JDF>\n<Sender printdate=\"\" printtime=\"\"/>\n<ResourcePool>\n" + half +
           "  </ResourcePool>\n  <ResourceLinkPool>\n" + half + "  </ResourceLinkPool>\n</JDF>\n";
}

struct Measurement {
    explicit Measurement(int patches)
        : xyz(std::size_t(patches) * 3), cmyk(std::size_t(patches) * 4),
          spectral(std::size_t(patches)) {
        for (std::size_t i = 0; i < xyz.size(); ++i) {
            xyz[i] = static_cast<double>(i % 9973) / 100;
        }
        for (std::size_t i = 0; i < cmyk.size(); ++i) {
            cmyk[i] = static_cast<double>(i % 256);
        }
        for (std::size_t i = 0; i < spectral.size(); ++i) {
            for (int j = 0; j < spectralValueCount; ++j) {
                spectral[i].values[j] = static_cast<double>((i * 7919 + j) % 999983) / 1e6;
            }
        }
        job.measurement.numPatches = patches;
        job.measurement.hasSpectral = 1;
        job.measurement.xyz = xyz.data();
        job.measurement.cmyk = cmyk.data();
        job.measurement.spectral = spectral.data();
    }

    std::vector<double> xyz, cmyk;
    std::vector<spectralRow> spectral;
    KZJobDataStruct job;
};

/// Reads, inserts and writes, without any analysis.
void bare(const std::string& path, const std::string& text, long at) {
    const int in = open(path.c_str(), O_RDONLY);
    const long size = lseek(in, 0, SEEK_END);
    const long all = size + static_cast<long>(text.size());
    const std::unique_ptr<char[]> buffer(new char[static_cast<std::size_t>(all)]);
    require(pread(in, buffer.get(), static_cast<std::size_t>(size), 0) == size, "reading");
    close(in);
    std::memmove(buffer.get() + at + text.size(), buffer.get() + at,
                 static_cast<std::size_t>(size - at));
    std::memcpy(buffer.get() + at, text.data(), text.size());
    const int out = open((path + ".new").c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0600);
    require(write(out, buffer.get(), static_cast<std::size_t>(all)) == all, "writing");
    close(out);
    std::filesystem::rename(path + ".new", path);
}

/// Returns the update's time in seconds.
double compare(std::size_t size, int patches, const std::string& path) {
    const std::string before = fileOf(size);
    Measurement measurement(patches);
    measurement.job.jdfLocalFile = wxString::FromUTF8(path);
    const auto prepare = [&] { std::ofstream(path, std::ios::binary) << before; };

    const double update = fastest(prepare, [&] {
        JDFMeasurementHeader header;
        JdfHandler::SetJDFMeasurementHeaderDefaults(&header);
        header.party = 1;
        header.writePatchDefinitions = true;
        require(JdfHandler::AppendJDFFileData(measurement.job, "comment", &header, true) == 0,
                "the update");
    });
    const std::size_t grown = std::filesystem::file_size(path) - before.size();
    const std::string text(grown, 'x');
    const double least = fastest(
        prepare, [&] { bare(path, text, static_cast<long>(before.find("  </ResourcePool>"))); });

    std::printf("%6d patches, %5.1f MB and %4.1f MB new %8.2f ms, %.2f times the bare work\n",
                patches, static_cast<double>(before.size()) / 1e6, static_cast<double>(grown) / 1e6,
                update * 1e3, update / least);
    return update;
}

} // namespace

int main() {
    const std::string path =
        std::filesystem::temp_directory_path() / ("jdf_bench" + std::to_string(getpid()));
    const double first = compare(2'000'000, 1617, path);
    for (const int factor : {2, 4, 8, 16}) {
        const double update = compare(std::size_t{2'000'000} * factor, 1617 * factor, path);
        std::printf("%30d times as much, %.2f times the time\n", factor, update / first);
    }
    compare(2'000'000, 16 * 1617, path);
    compare(32'000'000, 1617, path);
    std::filesystem::remove(path);
}
