// SPDX-License-Identifier: Apache-2.0
// The kinds of stores, and their common parts.
#pragma once

#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "store/KeyBytes.h"
#include "store/StoreEngine.h"

namespace store {

/// One kind of store. Its functions correspond to those of StoreEngine.h.
struct EngineKind {
    std::unique_ptr<StoreEngine> (*open)(const std::string& address, Access access);
    void (*make)(const std::string& address, const std::string& serverName);
    std::unique_ptr<StoreEngine> (*openCopy)(const std::string& address);
    bool (*bringUpToDate)(const std::string& address);
    void (*grant)(const std::string& address, const std::string& role, Rights rights);
};

extern const EngineKind sqliteKind;
extern const EngineKind postgresKind;

inline constexpr int highestTicketId = 0xFFFFFF;

/// Decodes the stored bytes of a key. Throws StoreFailure (Damaged).
std::shared_ptr<Elements> decoded(std::string_view bytes);

/// Names and stored values of the keys of the system ticket that every client reads.
std::vector<std::pair<std::string, std::string>> systemKeys(const std::string& serverName);

/// The reverse of eventName.
std::optional<Event> eventNamed(std::string_view name);
/// Of an entry's text. A log is bounded in bytes by this and its number of entries.
inline constexpr std::size_t longestLogged = 500;

/// Shows that a key can't be decoded.
void showDamagedKey(int type, int id, std::string_view key, const StoreEngine::ShowFault& show);

/// Shows that a block of the overview is not what its jobs' tickets say.
void showOverview(std::int64_t block, const StoreEngine::ShowFault& show);

/// What is wrong with the numbers of a file's versions, by number; empty if nothing is.
/// highestVersion is the highest one that was ever given.
std::string gapIn(const std::vector<FileVersion>& versions, int highestVersion);

/// The lowest number from 1 on that is not among the ascending ids.
int lowestFree(const std::vector<int>& ids);

/// Throws the matching failure if the store's format is not the present one.
void checkFormat(std::int64_t found, std::int64_t present);

} // namespace store
