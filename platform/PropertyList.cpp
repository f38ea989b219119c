// SPDX-License-Identifier: Apache-2.0
#include "platform/PropertyList.h"

#include <charconv>
#include <cstdint>
#include <ctime>
#include <filesystem>
#include <limits>

#include <plist/plist.h>

#include "base/Malloc.h"
#include "base/WholeFile.h"

namespace platform {

namespace {

// libplist uses 32-bit sizes.
constexpr std::uintmax_t largestFile = std::numeric_limits<std::uint32_t>::max();
constexpr std::int64_t secondsFrom1970To2001 = 978307200;

using OwnedText = base::Malloced<char>;

std::optional<std::string> readFile(const std::string& path) {
    std::error_code failure;
    if (!std::filesystem::is_regular_file(path, failure)) {
        return std::nullopt;
    }
    std::string bytes;
    return base::readWholeFile(path, largestFile, bytes) == base::Reading::Done
               ? std::optional(std::move(bytes))
               : std::nullopt;
}

std::optional<std::uint32_t> elementNumber(const std::string& name) {
    std::uint32_t number = 0;
    const char* const end = name.data() + name.size();
    const auto [stopped, failure] = std::from_chars(name.data(), end, number);
    if (failure != std::errc() || stopped != end) {
        return std::nullopt;
    }
    return number;
}

plist_t child(plist_t node, const std::string& name) {
    switch (plist_get_node_type(node)) {
    case PLIST_DICT:
        return plist_dict_get_item(node, name.c_str());
    case PLIST_ARRAY:
        if (const auto number = elementNumber(name);
            number && *number < plist_array_get_size(node)) {
            return plist_array_get_item(node, *number);
        }
        return nullptr;
    default:
        return nullptr;
    }
}

std::string dateText(std::int64_t secondsSince2001) {
    const std::time_t time = secondsSince2001 + secondsFrom1970To2001;
    std::tm parts{};
    gmtime_r(&time, &parts);
    char text[64];
    return {text, std::strftime(text, sizeof text, "%Y-%m-%dT%H:%M:%SZ", &parts)};
}

std::string realText(double value) {
    char text[64];
    return {text, std::to_chars(text, text + sizeof text, value).ptr};
}

} // namespace

PropertyList::PropertyList(void* root) : m_root(root, plist_free) {}

std::optional<PropertyList> PropertyList::read(const std::string& path) {
    const auto bytes = readFile(path);
    if (!bytes || bytes->empty()) {
        return std::nullopt;
    }
    plist_t root = nullptr;
    plist_from_memory(bytes->data(), static_cast<std::uint32_t>(bytes->size()), &root);
    if (root == nullptr) {
        return std::nullopt;
    }
    return PropertyList(root);
}

void* PropertyList::find(const Way& way) const {
    plist_t node = m_root.get();
    for (const std::string& name : way) {
        node = node == nullptr ? nullptr : child(node, name);
    }
    return node;
}

bool PropertyList::exists(const Way& way) const {
    return find(way) != nullptr;
}

std::optional<std::string> PropertyList::text(const Way& way) const {
    const plist_t node = find(way);
    if (node == nullptr) {
        return std::nullopt;
    }
    switch (plist_get_node_type(node)) {
    case PLIST_STRING: {
        char* text = nullptr;
        plist_get_string_val(node, &text);
        const OwnedText owner(text);
        return text == nullptr ? std::string() : std::string(text);
    }
    case PLIST_BOOLEAN: {
        std::uint8_t value = 0;
        plist_get_bool_val(node, &value);
        return value != 0 ? "true" : "false";
    }
    case PLIST_UINT: {
        // Negative numbers use the same 64 bits.
        std::uint64_t value = 0;
        plist_get_uint_val(node, &value);
        return std::to_string(static_cast<std::int64_t>(value));
    }
    case PLIST_REAL: {
        double value = 0;
        plist_get_real_val(node, &value);
        return realText(value);
    }
    case PLIST_DATE: {
        std::int32_t seconds = 0;
        std::int32_t microseconds = 0;
        plist_get_date_val(node, &seconds, &microseconds);
        return dateText(seconds);
    }
    default:
        return std::nullopt;
    }
}

std::optional<std::vector<std::string>> PropertyList::names(const Way& way) const {
    const plist_t node = find(way);
    if (node == nullptr || plist_get_node_type(node) != PLIST_DICT) {
        return std::nullopt;
    }
    std::vector<std::string> names;
    plist_dict_iter iterator = nullptr;
    plist_dict_new_iter(node, &iterator);
    const base::Malloced<void> owner(iterator);
    for (;;) {
        char* name = nullptr;
        plist_t value = nullptr;
        plist_dict_next_item(node, iterator, &name, &value);
        const OwnedText nameOwner(name);
        if (value == nullptr) {
            return names;
        }
        names.emplace_back(name);
    }
}

std::optional<std::size_t> PropertyList::count(const Way& way) const {
    const plist_t node = find(way);
    if (node == nullptr || plist_get_node_type(node) != PLIST_ARRAY) {
        return std::nullopt;
    }
    return plist_array_get_size(node);
}

} // namespace platform
