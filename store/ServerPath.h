// SPDX-License-Identifier: Apache-2.0
// Server paths: which of them name a file of a store.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace store {

/// What names of a store's own start with. No part of a server path does.
inline constexpr std::string_view ownPrefix = ".tintgate-";

/// The parts of a server path that StoreEngine allows; not none. Throws StoreFailure (BadPath) for
/// any other.
std::vector<std::string> partsOfServerPath(std::string_view path);

/// Parts from the first on, joined by slashes.
std::string joinedParts(const std::vector<std::string>& parts, std::size_t count);

/// A server path as a message shows it: short, and without what would upset a terminal.
std::string shownServerPath(std::string_view path);

} // namespace store
