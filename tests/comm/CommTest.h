// SPDX-License-Identifier: Apache-2.0
// A suite in the test's own system root, with the scripted plug-in as its comm bundle.
#pragma once

#include <string>
#include <utility>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <dlfcn.h>

#include "SuiteRoot.h"
#include "tests/comm/ScriptedPlugIn.h"

using Calls = std::vector<std::string>;

class CommTest : public testing::Test {
  protected:
    static constexpr int job = 12; ///< A ticket of type 3.

    CommTest() {
        m_root.installPlistReader(PLIST_READER);
        const std::string bundle = m_root.makeBundle(
            "Scripted.Bundle", SCRIPTED_PLUGIN,
            support::plugInEntries(SCRIPTED_PLUGIN_NAME, comGUIPlugInType,
                                   "00112233-4455-6677-8899-AABBCCDDEEFF", "makeScriptedPlugIn"));
        m_root.installCommBundle(bundle);
        const std::string path = bundle + "/Contents/MacOS/" SCRIPTED_PLUGIN_NAME;
        plugIn = reinterpret_cast<ScriptedPlugIn* (*)()>(
            dlsym(dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL), "scriptedPlugIn"))();
        plugIn->set(3, job, "");
    }

    /// The calls since the previous takeCalls.
    Calls takeCalls() { return std::exchange(plugIn->calls, {}); }

    const support::SuiteRoot m_root;
    ScriptedPlugIn* plugIn = nullptr;
};
