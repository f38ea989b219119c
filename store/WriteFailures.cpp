// SPDX-License-Identifier: Apache-2.0
#include "store/WriteFailures.h"

#include <utility>

#include <unistd.h>

#include "jobkeys/Tickets.h"

namespace store {

std::string ticketNameOf(int type, int id) {
    return (type == jobkeys::jobType ? "job" : std::to_string(type)) + "/" + std::to_string(id);
}

WriteFailures::WriteFailures(const std::string& folder)
    : m_file(folder.empty()
                 ? ""
                 : folder + "/tintgate-failed-writes-" + std::to_string(geteuid()) + ".txt",
             false) {}

void WriteFailures::add(const WriteFailure& failure) const {
    m_file.append(
        lineText(failure.time, {failure.server, failure.target, failure.key, failure.reason}));
}

std::vector<WriteFailure> WriteFailures::all() const {
    std::vector<WriteFailure> failures;
    constexpr std::size_t parts = 4;
    for (auto& line : m_file.lines(parts)) {
        failures.push_back({line.time, std::move(line.parts[0]), std::move(line.parts[1]),
                            std::move(line.parts[2]), std::move(line.parts[3])});
    }
    return failures;
}

} // namespace store
