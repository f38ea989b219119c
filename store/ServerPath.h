// SPDX-License-Identifier: Apache-2.0
// Server paths that name a file of a store.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace store {

/// Prefix of a store's internal names. No part of a server path starts with it.
inline constexpr std::string_view ownPrefix = ".tintgate-";

/// The parts of a valid server path (see StoreEngine), at least one. Throws StoreFailure (BadPath)
/// for an invalid path.
std::vector<std::string> partsOfServerPath(std::string_view path);

/// The first `count` parts, joined by slashes.
std::string joinedParts(const std::vector<std::string>& parts, std::size_t count);

/// A server path for messages: short, and without characters that control a terminal.
std::string shownServerPath(std::string_view path);

} // namespace store
