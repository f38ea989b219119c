// SPDX-License-Identifier: Apache-2.0
// Finds keys with similar names, to detect misspelt ones.
#pragma once

#include <map>
#include <string>
#include <utility>
#include <vector>

#include "companions/diagnosis/ReadOnlyServer.h"
#include "store/StoreEngine.h"

namespace diagnosis {

/// Searches the tickets whose keys were read. Keeps references to both arguments.
class SimilarKeys {
  public:
    SimilarKeys(store::StoreEngine& engine, const std::vector<AskedKey>& asked)
        : m_engine(engine), m_asked(asked) {}

    /// A key of the same ticket that was not read and differs in at most two characters, ignoring
    /// case: a misspelt key, or the other strip's. Empty if there is none.
    std::string like(const AskedKey& wanted);

  private:
    bool isAsked(const AskedKey& wanted, const std::string& name) const;

    store::StoreEngine& m_engine;
    const std::vector<AskedKey>& m_asked;
    std::map<std::pair<int, int>, std::vector<std::string>> m_names; ///< Key names by ticket.
};

} // namespace diagnosis
