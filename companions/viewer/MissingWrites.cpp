// SPDX-License-Identifier: Apache-2.0
#include "companions/viewer/MissingWrites.h"

#include <algorithm>
#include <cstdio>
#include <ctime>

#include <sys/stat.h>

namespace viewer {

namespace {

/// Converts 2024-05-01T12:34:56+02:00 to seconds since 1970.
std::int64_t secondsOf(const std::string& stamp) {
    std::tm parts = {};
    const char* const zone = strptime(stamp.c_str(), "%Y-%m-%dT%H:%M:%S", &parts);
    char sign = '+';
    int hours = 0;
    int minutes = 0;
    if (zone == nullptr || std::sscanf(zone, "%c%2d:%2d", &sign, &hours, &minutes) != 3) {
        return 0;
    }
    const std::int64_t offset = (hours * 60 + minutes) * std::int64_t{60};
    return timegm(&parts) - (sign == '-' ? -offset : offset);
}

} // namespace

std::string missingWrites(const std::vector<store::WriteFailure>& failures,
                          const std::string& folder, const report::Meta& meta,
                          const languages::Texts& say) {
    struct stat sample;
    if (stat((folder + "/Measured sample.txt").c_str(), &sample) != 0) {
        return {};
    }
    constexpr std::int64_t roundedUp = 1; // The meta file's time has no fraction.
    const std::int64_t last = secondsOf(meta.created) + roundedUp;
    const auto isOfRun = [&](const store::WriteFailure& failure) {
        return failure.time >= sample.st_mtim.tv_sec && failure.time <= last;
    };
    const auto first = std::find_if(failures.begin(), failures.end(), isOfRun);
    if (first == failures.end()) {
        return {};
    }
    const auto count = std::count_if(first, failures.end(), isOfRun);
    return say("viewer.missingWrites", {{"server", first->server},
                                        {"count", static_cast<std::size_t>(count)},
                                        {"what", first->target + " " + first->key},
                                        {"reason", first->reason},
                                        {"job", std::to_string(meta.jobId)}});
}

} // namespace viewer
