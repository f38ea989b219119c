// SPDX-License-Identifier: Apache-2.0
// Keys that look like another one, for misspelt names.
#pragma once

#include <map>
#include <string>
#include <utility>
#include <vector>

#include "companions/diagnosis/ReadOnlyServer.h"
#include "store/StoreEngine.h"

namespace diagnosis {

/// Of the tickets of a store whose keys were asked. Refers to both.
class SimilarKeys {
  public:
    SimilarKeys(store::StoreEngine& engine, const std::vector<AskedKey>& asked)
        : m_engine(engine), m_asked(asked) {}

    /// A key of the same ticket that nobody asked for and that differs in at most two characters,
    /// not counting case: a misspelt one, or that of the other strip. Empty if there is none.
    std::string like(const AskedKey& wanted);

  private:
    bool isAsked(const AskedKey& wanted, const std::string& name) const;

    store::StoreEngine& m_engine;
    const std::vector<AskedKey>& m_asked;
    std::map<std::pair<int, int>, std::vector<std::string>> m_names; ///< Of each ticket.
};

} // namespace diagnosis
