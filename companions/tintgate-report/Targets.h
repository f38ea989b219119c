// SPDX-License-Identifier: Apache-2.0
// What the jobs of a store were aimed at.
#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "companions/tintgate-report/TicketKeys.h"
#include "report/Sample.h"
#include "store/StoreEngine.h"

namespace report {

struct Target {
    std::string name; ///< Of its file; that of stored references for these.
    std::string key;  ///< Equal for the same colours (Sample::targetKey).
    InkColours aims;  ///< Of paper and solids.
};

/// Finds each job's references by the rules of docs/jobs.md. A file counts as it was when the job
/// was measured: the store keeps what was replaced since. If it is gone, its path is the key.
class Targets {
  public:
    explicit Targets(store::StoreEngine& store) : m_store(store) {}

    /// Names of the job's keys that `of` needs.
    static std::vector<std::string> keys(Strip strip);

    /// `time` is the measurement's on the room's own clock, taken for that of this machine.
    Target of(const store::TicketContent& job, Strip strip, std::int64_t time);

  private:
    struct Content {
        std::int64_t time = 0; ///< When it was written.
        int version = 0;       ///< 0 is the file itself.
        std::optional<Target> target;
    };

    Target ofFile(const std::string& path, std::int64_t time);
    std::vector<Content>& contentsOf(const std::string& path);
    Target read(const std::string& path, int version);

    store::StoreEngine& m_store;
    std::optional<std::map<std::string, std::int64_t>> m_times; ///< Of all files.
    std::map<std::string, std::vector<Content>> m_contents;     ///< By time.
};

} // namespace report
