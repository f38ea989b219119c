#include <string>

#include <gtest/gtest.h>

#include "SuiteRoot.h"
#include "platform/PlugIn.h"

namespace {

constexpr const char* type = "5CDEF0B8-6CFC-11D8-A365-003065B1346E";
constexpr const char* factory = "00112233-4455-6677-8899-AABBCCDDEEFF";

using OwnedUuid = platform::Owned<CFUUIDRef>;
using OwnedArray = platform::Owned<CFArrayRef>;

OwnedUuid uuid(const char* text) {
    const platform::Owned<CFStringRef> string(
        CFStringCreateWithCString(kCFAllocatorDefault, text, kCFStringEncodingUTF8));
    return OwnedUuid(CFUUIDCreateFromString(kCFAllocatorDefault, string.get()));
}

CFPlugInRef open(const std::string& path) {
    const platform::Owned<CFStringRef> string(
        CFStringCreateWithCString(kCFAllocatorDefault, path.c_str(), kCFStringEncodingMacRoman));
    const platform::Owned<CFURLRef> url(
        CFURLCreateWithFileSystemPath(kCFAllocatorDefault, string.get(), kCFURLPOSIXPathStyle, 1));
    return CFPlugInCreate(kCFAllocatorDefault, url.get());
}

OwnedArray factories(CFPlugInRef plugIn) {
    return OwnedArray(CFPlugInFindFactoriesForPlugInTypeInPlugIn(uuid(type).get(), plugIn));
}

void* firstInstance(CFPlugInRef plugIn) {
    const OwnedArray array = factories(plugIn);
    return CFPlugInInstanceCreate(
        nullptr, static_cast<CFUUIDRef>(CFArrayGetValueAtIndex(array.get(), 0)), uuid(type).get());
}

TEST(PlugIn, ReadsUuids) {
    const OwnedUuid lower = uuid("00112233-4455-6677-8899-aabbccddeeff");
    const CFUUIDBytes bytes = CFUUIDGetUUIDBytes(lower.get());
    for (int i = 0; i < 16; ++i) {
        EXPECT_EQ(bytes.bytes[i], i * 0x11);
    }
    for (const char* text :
         {"", "00112233445566778899aabbccddeeff", "00112233-4455-6677-8899-AABBCCDDEEF",
          "00112233-4455-6677-8899-AABBCCDDEEFG", "00112233-4455-6677-8899AABBCCDDEEFF-",
          "00112233-4455-6677-8899-AABBCCDDEEFF0"}) {
        EXPECT_EQ(uuid(text), nullptr) << text;
    }
}

TEST(PlugIn, LoadsABundleOnce) {
    const support::SuiteRoot root;
    const std::string path = root.makeBundle(
        "Good.Bundle", SAMPLE_PLUGIN,
        support::plugInEntries(SAMPLE_PLUGIN_NAME, "5cdef0b8-6cfc-11d8-a365-003065b1346e", factory,
                               "makeSample"));
    const CFPlugInRef plugIn = open(path);
    ASSERT_NE(plugIn, nullptr);
    EXPECT_EQ(open(path + "/"), plugIn);

    ASSERT_EQ(CFArrayGetCount(factories(plugIn).get()), 1);
    auto* const first = static_cast<int*>(firstInstance(plugIn));
    ASSERT_NE(first, nullptr);
    EXPECT_EQ(*first, 1);
    EXPECT_EQ(firstInstance(plugIn), first);
    EXPECT_EQ(*first, 2);
    // A UUID alone knows no bundle.
    EXPECT_EQ(CFPlugInInstanceCreate(nullptr, uuid(factory).get(), uuid(type).get()), nullptr);
}

TEST(PlugIn, TellsMissingTypesFromEmptyOnes) {
    const support::SuiteRoot root;
    const std::string other = support::plugInEntries("x", factory, factory, "makeSample");
    EXPECT_EQ(factories(open(root.makeBundle("Other.Bundle", "", other))), nullptr);
    EXPECT_EQ(factories(open(root.makeBundle("None.Bundle", "", ""))), nullptr);
    const std::string empty =
        "<key>CFPlugInTypes</key><dict><key>" + std::string(type) + "</key><array/></dict>";
    const OwnedArray array = factories(open(root.makeBundle("Empty.Bundle", "", empty)));
    ASSERT_NE(array, nullptr);
    EXPECT_EQ(CFArrayGetCount(array.get()), 0);
}

TEST(PlugIn, GivesNothingForWhatCannotBeLoaded) {
    const support::SuiteRoot root;
    const struct {
        const char* name;
        const char* sharedObject;
        const char* executable;
        const char* function;
    } cases[] = {
        {"NoObject", "", "libSample.so", "makeSample"},
        {"NoSharedObject", "/bin/true", "true", "makeSample"},
        {"Outside", SAMPLE_PLUGIN, "../MacOS/" SAMPLE_PLUGIN_NAME, "makeSample"},
        {"NoFunction", SAMPLE_PLUGIN, SAMPLE_PLUGIN_NAME, "makeAnything"},
        {"Nothing", SAMPLE_PLUGIN, SAMPLE_PLUGIN_NAME, "makeNothing"},
    };
    for (const auto& [name, sharedObject, executable, function] : cases) {
        const CFPlugInRef plugIn =
            open(root.makeBundle(std::string(name) + ".Bundle", sharedObject,
                                 support::plugInEntries(executable, type, factory, function)));
        ASSERT_NE(plugIn, nullptr) << name;
        EXPECT_EQ(firstInstance(plugIn), nullptr) << name;
    }
    EXPECT_EQ(open(root.path("Missing.Bundle")), nullptr);
    EXPECT_EQ(open(root.path()), nullptr);
    EXPECT_EQ(open(""), nullptr);
}

} // namespace
