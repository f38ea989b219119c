// SPDX-License-Identifier: Apache-2.0
// Runs the administration tool on the test's own store.
#pragma once

#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "RunProgram.h"
#include "ScratchFolder.h"

class StoreProgram : public testing::Test {
  protected:
    StoreProgram() { answer({"make", "--name", "Press room"}); }

    support::Outcome run(std::vector<std::string> arguments,
                         support::RunOptions options = {}) const {
        options.environment.insert({"TINTGATE_STORE", m_address});
        arguments.insert(arguments.begin(), TINTGATE_STORE_PROGRAM);
        return support::run(arguments, options);
    }
    /// Standard output of a run that must succeed.
    std::string answer(const std::vector<std::string>& arguments) const {
        const support::Outcome outcome = run(arguments);
        EXPECT_EQ(outcome.exitCode, 0) << testing::PrintToString(arguments) << outcome.error;
        return outcome.output;
    }
    void expectRefusal(const std::vector<std::string>& arguments, int exitCode,
                       const std::string& words = "") const {
        const support::Outcome outcome = run(arguments);
        EXPECT_EQ(outcome.exitCode, exitCode) << testing::PrintToString(arguments);
        EXPECT_THAT(outcome.error, testing::HasSubstr(words)) << testing::PrintToString(arguments);
        EXPECT_EQ(outcome.output, "");
    }

    const support::ScratchFolder m_folder;
    const std::string m_address = m_folder.path("store");
};
