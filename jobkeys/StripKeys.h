// SPDX-License-Identifier: Apache-2.0
// The keys of a job's ticket that differ between its two control strips. There are two families:
// keys below "Remote/Measurement/" (for the second strip "Remote/Measurement2/"), and keys with a
// "2" at the end for the second strip. Keys shared by both strips are written where they are used.
#pragma once

#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>

namespace jobkeys {

enum class Strip { First, Second };

inline constexpr Strip strips[] = {Strip::First, Strip::Second};

/// 1 or 2.
constexpr int numberOf(Strip strip) {
    return strip == Strip::First ? 1 : 2;
}

/// The strip selector of a call. Nothing if the text does not start with an integer that fits an
/// int.
inline std::optional<int> stripSelectorOf(const std::wstring& text) {
    try {
        return std::stoi(text);
    } catch (const std::logic_error&) {
        return std::nullopt;
    }
}

/// Decodes KZJobDataStruct::secondStrip: 0 is the first strip, any other value the second (C28).
constexpr Strip stripOf(int secondStrip) {
    return secondStrip == 0 ? Strip::First : Strip::Second;
}

/// The root of a strip's measurement, without a trailing slash.
constexpr std::string_view measurementRoot(Strip strip) {
    return strip == Strip::First ? "Remote/Measurement" : "Remote/Measurement2";
}

/// The key of an entry of the strip's measurement, such as "Status" or "XYZValues/XValues".
inline std::string measurementKey(Strip strip, std::string_view name) {
    return std::string(measurementRoot(strip)).append("/").append(name);
}

/// The key of an entry of the references that the strip's measurement contains.
inline std::string referenceKey(Strip strip, std::string_view name) {
    return measurementKey(strip, "Reference/").append(name);
}

/// The strip's form of a key such as "Footer/ControlstripFile".
inline std::string stripKey(Strip strip, std::string_view key) {
    return std::string(key).append(strip == Strip::First ? "" : "2");
}

} // namespace jobkeys
