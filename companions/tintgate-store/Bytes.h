// SPDX-License-Identifier: Apache-2.0
// Bytes as text: base64, UTF-8, and text that is safe for terminals.
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include <nlohmann/json.hpp>

namespace admin {

using Json = nlohmann::json;

std::string toBase64(std::string_view bytes);
/// Nothing for text that toBase64 would not write.
std::optional<std::string> fromBase64(std::string_view text);

/// A JSON string, or {"base64": "..."} for bytes that are not UTF-8.
Json textOrBytes(const std::string& bytes);

/// Escapes control characters, and bytes that are not UTF-8, as \xNN, so that stored data can't
/// control a terminal.
std::string printable(std::string_view bytes);

} // namespace admin
