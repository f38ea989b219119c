#include "platform/PlugIn.h"

#include <string>

#include <gtest/gtest.h>

#include "SuiteRoot.h"

namespace {

using support::plugInEntries;
using OwnedUuid = platform::Owned<CFUUIDRef>;
using OwnedArray = platform::Owned<CFArrayRef>;
using OwnedString = platform::Owned<CFStringRef>;

constexpr const char* type = "5CDEF0B8-6CFC-11D8-A365-003065B1346E";
constexpr const char* factory = "00112233-4455-6677-8899-AABBCCDDEEFF";

OwnedUuid uuid(const char* text) {
    const OwnedString string(CFStringCreateWithCString(nullptr, text, kCFStringEncodingUTF8));
    return OwnedUuid(CFUUIDCreateFromString(nullptr, string.get()));
}

CFPlugInRef open(const std::string& path) {
    const OwnedString string(CFStringCreateWithCString(nullptr, path.c_str(), 0));
    const platform::Owned<CFURLRef> url(
        CFURLCreateWithFileSystemPath(nullptr, string.get(), kCFURLPOSIXPathStyle, 1));
    return CFPlugInCreate(nullptr, url.get());
}

OwnedArray factories(CFPlugInRef plugIn) {
    return OwnedArray(CFPlugInFindFactoriesForPlugInTypeInPlugIn(uuid(type).get(), plugIn));
}

void* firstInstance(CFPlugInRef plugIn) {
    const OwnedArray array = factories(plugIn);
    const auto* const first = static_cast<CFUUIDRef>(CFArrayGetValueAtIndex(array.get(), 0));
    return CFPlugInInstanceCreate(nullptr, first, uuid(type).get());
}

TEST(PlugIn, ReadsUuids) {
    const CFUUIDBytes bytes =
        CFUUIDGetUUIDBytes(uuid("00112233-4455-6677-8899-aabbccddeeff").get());
    for (int i = 0; i < 16; ++i) {
        EXPECT_EQ(bytes.bytes[i], i * 0x11);
    }
    for (const char* text :
         {"", "00112233-4455-6677-8899-AABBCCDDEEF", "00112233-4455-6677-8899-AABBCCDDEEFG",
          "00112233-4455-6677-8899AABBCCDDEEFF-"}) {
        EXPECT_EQ(uuid(text), nullptr) << text;
    }
}

TEST(PlugIn, LoadsABundleOnce) {
    const support::SuiteRoot root;
    // UUIDs are the same in either case.
    const CFPlugInRef plugIn = open(
        root.makeBundle("Good.Bundle", SAMPLE_PLUGIN,
                        plugInEntries(SAMPLE_PLUGIN_NAME, "5cdef0b8-6cfc-11d8-a365-003065b1346e",
                                      factory, "makeSample")));
    ASSERT_NE(plugIn, nullptr);
    EXPECT_EQ(open(root.path("Good.Bundle/")), plugIn);
    auto* const instances = static_cast<int*>(firstInstance(plugIn));
    ASSERT_NE(instances, nullptr);
    EXPECT_EQ(firstInstance(plugIn), instances);
    EXPECT_EQ(*instances, 2);
}

TEST(PlugIn, GivesNothingForWhatCannotBeLoaded) {
    const support::SuiteRoot root;
    const auto make = [&](const std::string& sharedObject, const std::string& entries) {
        static int number = 0;
        const std::string name = std::to_string(++number) + ".Bundle";
        const CFPlugInRef plugIn = open(root.makeBundle(name, sharedObject, entries));
        EXPECT_NE(plugIn, nullptr);
        return plugIn;
    };
    for (const auto& [sharedObject, executable, function] :
         {std::tuple{"", SAMPLE_PLUGIN_NAME, "makeSample"},
          std::tuple{"/bin/true", "true", "makeSample"},
          std::tuple{SAMPLE_PLUGIN, "../MacOS/" SAMPLE_PLUGIN_NAME, "makeSample"},
          std::tuple{SAMPLE_PLUGIN, SAMPLE_PLUGIN_NAME, "makeAnything"},
          std::tuple{SAMPLE_PLUGIN, SAMPLE_PLUGIN_NAME, "makeNothing"}}) {
        const std::string entries = plugInEntries(executable, type, factory, function);
        EXPECT_EQ(firstInstance(make(sharedObject, entries)), nullptr) << executable << function;
    }
    // A type that is missing gives no array; one without factories gives an empty one.
    EXPECT_EQ(factories(make("", plugInEntries("x", factory, factory, "makeSample"))), nullptr);
    const std::string empty =
        "<key>CFPlugInTypes</key><dict><key>" + std::string(type) + "</key><array/></dict>";
    EXPECT_EQ(CFArrayGetCount(factories(make("", empty)).get()), 0);
    for (const std::string& path : {root.path("Missing.Bundle"), root.path(), std::string()}) {
        EXPECT_EQ(open(path), nullptr);
    }
}

} // namespace
