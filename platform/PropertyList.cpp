// SPDX-License-Identifier: Apache-2.0
#include "platform/PropertyList.h"

#include <charconv>
#include <cstdint>
#include <ctime>
#include <filesystem>
#include <limits>

#include <plist/plist.h>

#include "base/Malloc.h"
#include "base/SharedObject.h"
#include "base/WholeFile.h"

namespace platform {

namespace {

// libplist uses 32-bit sizes.
constexpr std::uintmax_t largestFile = std::numeric_limits<std::uint32_t>::max();
constexpr std::int64_t secondsFrom1970To2001 = 978307200;

// clang-format off
#define TINTGATE_LIBPLIST_FUNCTIONS(X)                                                            \
    X(array_get_item) X(array_get_size) X(dict_get_item) X(dict_new_iter) X(dict_next_item)       \
    X(free) X(from_memory) X(get_bool_val) X(get_date_val) X(get_node_type) X(get_real_val)       \
    X(get_string_val) X(get_uint_val)
// clang-format on

/// The libplist functions in use, without the plist_ prefix.
struct LibPlist {
#define TINTGATE_LIBPLIST_MEMBER(name) decltype(&plist_##name) name = nullptr;
    TINTGATE_LIBPLIST_FUNCTIONS(TINTGATE_LIBPLIST_MEMBER)
#undef TINTGATE_LIBPLIST_MEMBER
};

/// Opens the library when the first list is read. Linking it would cost every program that can read
/// lists a twentieth of its startup. Returns nothing if the library is not installed.
std::optional<LibPlist> loadLibPlist() {
    const base::SharedObject library("libplist-2.0.so.3");
    LibPlist functions;
    bool complete = true;
#define TINTGATE_LIBPLIST_FIND(name)                                                               \
    complete = library.find("plist_" #name, functions.name) && complete;
    TINTGATE_LIBPLIST_FUNCTIONS(TINTGATE_LIBPLIST_FIND)
#undef TINTGATE_LIBPLIST_FIND
    return complete ? std::optional(functions) : std::nullopt;
}

const std::optional<LibPlist>& libPlist() {
    static const std::optional<LibPlist> functions = loadLibPlist();
    return functions;
}

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
    switch (libPlist()->get_node_type(node)) {
    case PLIST_DICT:
        return libPlist()->dict_get_item(node, name.c_str());
    case PLIST_ARRAY:
        if (const auto number = elementNumber(name);
            number && *number < libPlist()->array_get_size(node)) {
            return libPlist()->array_get_item(node, *number);
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

PropertyList::PropertyList(void* root) : m_root(root, libPlist()->free) {}

std::optional<PropertyList> PropertyList::read(const std::string& path) {
    const auto bytes = readFile(path);
    if (!bytes || bytes->empty() || !libPlist()) {
        return std::nullopt;
    }
    plist_t root = nullptr;
    libPlist()->from_memory(bytes->data(), static_cast<std::uint32_t>(bytes->size()), &root);
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
    switch (libPlist()->get_node_type(node)) {
    case PLIST_STRING: {
        char* text = nullptr;
        libPlist()->get_string_val(node, &text);
        const OwnedText owner(text);
        return text == nullptr ? std::string() : std::string(text);
    }
    case PLIST_BOOLEAN: {
        std::uint8_t value = 0;
        libPlist()->get_bool_val(node, &value);
        return value != 0 ? "true" : "false";
    }
    case PLIST_UINT: {
        // Negative numbers use the same 64 bits.
        std::uint64_t value = 0;
        libPlist()->get_uint_val(node, &value);
        return std::to_string(static_cast<std::int64_t>(value));
    }
    case PLIST_REAL: {
        double value = 0;
        libPlist()->get_real_val(node, &value);
        return realText(value);
    }
    case PLIST_DATE: {
        std::int32_t seconds = 0;
        std::int32_t microseconds = 0;
        libPlist()->get_date_val(node, &seconds, &microseconds);
        return dateText(seconds);
    }
    default:
        return std::nullopt;
    }
}

std::optional<std::vector<std::string>> PropertyList::names(const Way& way) const {
    const plist_t node = find(way);
    if (node == nullptr || libPlist()->get_node_type(node) != PLIST_DICT) {
        return std::nullopt;
    }
    std::vector<std::string> names;
    plist_dict_iter iterator = nullptr;
    libPlist()->dict_new_iter(node, &iterator);
    const base::Malloced<void> owner(iterator);
    for (;;) {
        char* name = nullptr;
        plist_t value = nullptr;
        libPlist()->dict_next_item(node, iterator, &name, &value);
        const OwnedText nameOwner(name);
        if (value == nullptr) {
            return names;
        }
        names.emplace_back(name);
    }
}

std::optional<std::size_t> PropertyList::count(const Way& way) const {
    const plist_t node = find(way);
    if (node == nullptr || libPlist()->get_node_type(node) != PLIST_ARRAY) {
        return std::nullopt;
    }
    return libPlist()->array_get_size(node);
}

} // namespace platform
