// SPDX-License-Identifier: Apache-2.0
// Looks up presets and instruments of a store's jobs in the server's files.
#pragma once

#include <map>
#include <optional>
#include <set>
#include <string>
#include <utility>

#include "companions/tintgate-report/TicketKeys.h"
#include "job/AnalysisLibrary.h"
#include "store/StoreEngine.h"

namespace report {

struct Preset {
    std::string name;
    std::optional<tolerancePresetParameterRecord> values; ///< From the file; none without it.

    bool psd() const { return values && values->fograPSDPreset > 0; }
};

/// Presets and instruments, each looked up once.
class ServerLookups {
  public:
    explicit ServerLookups(store::StoreEngine& store) : m_store(store) {}

    /// The tool uses the preset's file, so only the name is taken from its ticket.
    const Preset& preset(int id, const std::string& installFolder);

    /// The instrument of the control strip that the job names. Empty if unknown.
    std::string instrument(const store::TicketContent& job, Strip strip);

    const std::set<int>& presetsWithoutFile() const { return m_missing; }

  private:
    store::StoreEngine& m_store;
    std::map<std::pair<int, std::string>, Preset> m_presets;
    std::map<std::string, std::string> m_strips;
    std::set<int> m_missing;
};

} // namespace report
