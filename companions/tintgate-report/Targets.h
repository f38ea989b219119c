// SPDX-License-Identifier: Apache-2.0
// The target colours of a store's jobs.
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
    std::string name; ///< Name of the file, or of stored references.
    std::string key;  ///< Equal for equal colours (Sample::targetKey).
    InkColours aims;  ///< Aims of paper and solids.
};

/// Finds each job's references by the rules of docs/jobs.md. A file's version at the time of the
/// measurement is used: the store keeps old versions. If it is gone, its path is the key.
class Targets {
  public:
    explicit Targets(store::StoreEngine& store) : m_store(store) {}

    /// Keys of a job that `of` needs.
    static std::vector<std::string> keys(Strip strip);

    /// `time` is the measurement's local time in the room, treated as this machine's local time.
    Target of(const store::TicketContent& job, Strip strip, std::int64_t time);

  private:
    struct Content {
        std::int64_t time = 0; ///< Time of writing.
        int version = 0;       ///< 0 is the current file.
        std::optional<Target> target;
    };

    Target ofFile(const std::string& path, std::int64_t time);
    std::vector<Content>& contentsOf(const std::string& path);
    Target read(const std::string& path, int version);

    store::StoreEngine& m_store;
    std::optional<std::map<std::string, std::int64_t>> m_times; ///< Times of all files.
    std::map<std::string, std::vector<Content>> m_contents;     ///< By time.
};

} // namespace report
