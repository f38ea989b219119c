// SPDX-License-Identifier: Apache-2.0
#include "platform/PlugIn.h"

#include <cstring>
#include <filesystem>
#include <map>
#include <optional>

#include <dlfcn.h>

#include "platform/PropertyList.h"

namespace {

constexpr const char* typesEntry = "CFPlugInTypes";
constexpr const char* factoriesEntry = "CFPlugInFactories";
constexpr const char* executableEntry = "CFBundleExecutable";

int hexadecimalDigit(char c) {
    if (c >= '0' && c <= '9') {
        return c - '0';
    }
    if (c >= 'a' && c <= 'f') {
        return c - 'a' + 10;
    }
    if (c >= 'A' && c <= 'F') {
        return c - 'A' + 10;
    }
    return -1;
}

std::optional<CFUUIDBytes> parseUuid(const std::string& text) {
    constexpr const char* shape = "xxxxxxxx-xxxx-xxxx-xxxx-xxxxxxxxxxxx";
    if (text.size() != std::strlen(shape)) {
        return std::nullopt;
    }
    CFUUIDBytes uuid = {};
    std::size_t digits = 0;
    for (std::size_t i = 0; i < text.size(); ++i) {
        if (shape[i] == '-') {
            if (text[i] != '-') {
                return std::nullopt;
            }
            continue;
        }
        const int digit = hexadecimalDigit(text[i]);
        if (digit < 0) {
            return std::nullopt;
        }
        unsigned char& byte = uuid.bytes[digits++ / 2];
        byte = static_cast<unsigned char>(byte << 4 | digit);
    }
    return uuid;
}

bool isSame(const CFUUIDBytes& a, const CFUUIDBytes& b) {
    return std::memcmp(a.bytes, b.bytes, sizeof a.bytes) == 0;
}

std::string utf8(CFStringRef string) {
    const CFIndex size =
        CFStringGetMaximumSizeForEncoding(CFStringGetLength(string), kCFStringEncodingUTF8) + 1;
    std::string text(static_cast<std::size_t>(size), '\0');
    if (!CFStringGetCString(string, text.data(), size, kCFStringEncodingUTF8)) {
        return {};
    }
    text.resize(std::strlen(text.c_str()));
    return text;
}

// An element of an array of factories. It records its bundle, so that two bundles may list the same
// factory UUID.
class Factory : public platform::Uuid {
  public:
    Factory(const CFUUIDBytes& bytes, __CFBundle* bundle) : Uuid(bytes), bundle(bundle) {}

    __CFBundle* const bundle;
};

} // namespace

class __CFBundle {
  public:
    static std::unique_ptr<__CFBundle> read(const std::string& folder) {
        auto info = platform::PropertyList::read(folder + "/Contents/Info.plist");
        if (!info || !info->names({})) {
            return nullptr;
        }
        return std::unique_ptr<__CFBundle>(new __CFBundle(folder, std::move(*info)));
    }

    std::unique_ptr<platform::Array> factories(const CFUUIDBytes& type) {
        const auto entry = nameOf(type, typesEntry);
        const auto count = entry ? m_info.count({typesEntry, *entry}) : std::nullopt;
        if (!count) {
            return nullptr;
        }
        auto array = std::make_unique<platform::Array>();
        for (std::size_t i = 0; i < *count; ++i) {
            const auto text = m_info.text({typesEntry, *entry, std::to_string(i)});
            if (const auto uuid = text ? parseUuid(*text) : std::nullopt) {
                array->elements.push_back(std::make_unique<Factory>(*uuid, this));
            }
        }
        return array;
    }

    platform::PlugInFactory function(const CFUUIDBytes& factory) {
        const auto entry = nameOf(factory, factoriesEntry);
        const auto name = entry ? m_info.text({factoriesEntry, *entry}) : std::nullopt;
        if (!name || name->empty() || !load()) {
            return nullptr;
        }
        return reinterpret_cast<platform::PlugInFactory>(dlsym(m_sharedObject, name->c_str()));
    }

  private:
    __CFBundle(std::string folder, platform::PropertyList info)
        : m_folder(std::move(folder)), m_info(std::move(info)) {}

    // The UUID's entry name in a dictionary, with its original spelling.
    std::optional<std::string> nameOf(const CFUUIDBytes& uuid, const char* dictionary) const {
        for (const std::string& name :
             m_info.names({dictionary}).value_or(std::vector<std::string>())) {
            const auto other = parseUuid(name);
            if (other && isSame(*other, uuid)) {
                return name;
            }
        }
        return std::nullopt;
    }

    bool load() {
        const std::string name = m_info.text({executableEntry}).value_or("");
        if (m_sharedObject == nullptr && !name.empty() && name.find('/') == std::string::npos) {
            const std::string path = m_folder + "/Contents/MacOS/" + name;
            m_sharedObject = dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
        }
        return m_sharedObject != nullptr;
    }

    const std::string m_folder;
    const platform::PropertyList m_info;
    void* m_sharedObject = nullptr; // Never closed: instances may outlive every owner.
};

CFURLRef CFURLCreateWithFileSystemPath(CFAllocatorRef, CFStringRef path, CFURLPathStyle style,
                                       Boolean) {
    if (path == nullptr || style != kCFURLPOSIXPathStyle) {
        return nullptr;
    }
    std::string bytes = utf8(path);
    return bytes.empty() ? nullptr : new platform::Url(std::move(bytes));
}

CFUUIDRef CFUUIDCreateFromString(CFAllocatorRef, CFStringRef text) {
    const auto bytes = text == nullptr ? std::nullopt : parseUuid(utf8(text));
    return bytes ? new platform::Uuid(*bytes) : nullptr;
}

CFUUIDBytes CFUUIDGetUUIDBytes(CFUUIDRef uuid) {
    return uuid->bytes;
}

CFPlugInRef CFPlugInCreate(CFAllocatorRef, CFURLRef folder) {
    // Never destroyed: plug-in threads may still be running at exit.
    static auto& bundles = *new std::map<std::string, std::unique_ptr<__CFBundle>>;
    if (folder == nullptr) {
        return nullptr;
    }
    std::error_code failure;
    const std::string path = std::filesystem::canonical(folder->path, failure).string();
    if (failure) {
        return nullptr;
    }
    const auto known = bundles.find(path);
    if (known != bundles.end()) {
        return known->second.get();
    }
    std::unique_ptr<__CFBundle> bundle = __CFBundle::read(path);
    return bundle == nullptr ? nullptr : (bundles[path] = std::move(bundle)).get();
}

CFArrayRef CFPlugInFindFactoriesForPlugInTypeInPlugIn(CFUUIDRef type, CFPlugInRef plugIn) {
    if (type == nullptr || plugIn == nullptr) {
        return nullptr;
    }
    return plugIn->factories(type->bytes).release();
}

void* CFPlugInInstanceCreate(CFAllocatorRef, CFUUIDRef factory, CFUUIDRef type) {
    const auto* const bound = dynamic_cast<const Factory*>(factory);
    const platform::PlugInFactory function =
        bound == nullptr ? nullptr : bound->bundle->function(bound->bytes);
    return function == nullptr ? nullptr : function(nullptr, type);
}
