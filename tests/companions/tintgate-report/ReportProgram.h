// SPDX-License-Identifier: Apache-2.0
// Runs tintgate-report on the result files of a job.
#pragma once

#include <filesystem>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "RunProgram.h"
#include "ScratchFolder.h"

/// A folder with both result files of a job.
class ReportProgram : public testing::Test {
  protected:
    ReportProgram() {
        for (const char* name : {"meta.json", "output.json"}) {
            std::filesystem::copy_file(data + name, m_scratch.path(name));
        }
    }

    static support::Outcome report(std::vector<std::string> words,
                                   const support::RunOptions& options = {}) {
        words.insert(words.begin(), TINTGATE_REPORT);
        return support::run(words, options);
    }

    inline static const std::string data = TINTGATE_SOURCE_DIR "/tests/data/report/";
    const support::ScratchFolder m_scratch;
    const std::string m_meta = m_scratch.path("meta.json");
    const std::string m_result = m_scratch.path("output.json");
};
