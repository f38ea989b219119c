// SPDX-License-Identifier: Apache-2.0
#include "platform/PlugIn.h"

#include <string>

#include <gtest/gtest.h>

#include "SuiteRoot.h"

namespace {

using platform::Owned;

constexpr const char* type = "5CDEF0B8-6CFC-11D8-A365-003065B1346E";
constexpr const char* factory = "00112233-4455-6677-8899-AABBCCDDEEFF";

CFPlugInRef open(const std::string& path) {
    const Owned<CFStringRef> string(CFStringCreateWithCString(nullptr, path.c_str(), 0));
    const Owned<CFURLRef> url(
        CFURLCreateWithFileSystemPath(nullptr, string.get(), kCFURLPOSIXPathStyle, 1));
    return CFPlugInCreate(nullptr, url.get());
}

/// The object of the first factory for the type. Null without a factory.
void* firstInstance(CFPlugInRef plugIn) {
    const Owned<CFStringRef> text(CFStringCreateWithCString(nullptr, type, 0));
    const Owned<CFUUIDRef> uuid(CFUUIDCreateFromString(nullptr, text.get()));
    const Owned<CFArrayRef> factories(
        CFPlugInFindFactoriesForPlugInTypeInPlugIn(uuid.get(), plugIn));
    return factories == nullptr
               ? nullptr
               : CFPlugInInstanceCreate(
                     nullptr, static_cast<CFUUIDRef>(CFArrayGetValueAtIndex(factories.get(), 0)),
                     uuid.get());
}

} // namespace

TEST(PlugIn, IsLoadedOnceAndOnlyAsItIsListed) {
    const support::SuiteRoot root;
    const struct {
        const char* sharedObject;
        const char* executable;
        std::string type;
        const char* function;
    } cases[] = {
        {SAMPLE_PLUGIN, SAMPLE_PLUGIN_NAME, "5cdef0b8-6cfc-11d8-a365-003065b1346e", "makeSample"},
        {SAMPLE_PLUGIN, SAMPLE_PLUGIN_NAME, factory, "makeSample"},
        {SAMPLE_PLUGIN, SAMPLE_PLUGIN_NAME, type + std::string("F"), "makeSample"},
        {SAMPLE_PLUGIN, SAMPLE_PLUGIN_NAME, "5CDEF0B8-6CFC-11D8-A365003065B1346E-", "makeSample"},
        {"", SAMPLE_PLUGIN_NAME, type, "makeSample"},
        {"/bin/true", "true", type, "makeSample"},
        {SAMPLE_PLUGIN, "../MacOS/" SAMPLE_PLUGIN_NAME, type, "makeSample"},
        {SAMPLE_PLUGIN, SAMPLE_PLUGIN_NAME, type, "makeAnything"},
        {SAMPLE_PLUGIN, SAMPLE_PLUGIN_NAME, type, "makeNothing"},
    };
    for (const auto& c : cases) {
        const std::string name = std::to_string(&c - cases) + ".Bundle";
        const CFPlugInRef plugIn = open(
            root.makeBundle(name, c.sharedObject,
                            support::plugInEntries(c.executable, c.type, factory, c.function)));
        EXPECT_EQ(open(root.path(name + "/")), plugIn);
        EXPECT_EQ(firstInstance(plugIn) != nullptr, &c == cases) << name;
    }
    for (const std::string& path : {root.path("Missing.Bundle"), root.path(), std::string()}) {
        EXPECT_EQ(open(path), nullptr);
    }
}
