// SPDX-License-Identifier: Apache-2.0
// Files that are written for a measurement: where, and what they may replace.
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <unordered_set>
#include <vector>

#include "companions/tintgate-check/Labels.h"
#include "companions/tintgate-check/Measurements.h"
#include "companions/tintgate-check/Problem.h"

namespace check {

enum class Output { Page, Result, Broken, Label, Certificate };

class Outputs {
  public:
    /// `folder` is that of --out, or empty: next to the measurement. None of the files of `inputs`
    /// is ever written to.
    Outputs(std::string folder, bool page, bool result, LabelWanted labels,
            std::vector<std::string> inputs)
        : m_folder(std::move(folder)), m_page(page), m_result(result), m_labels(std::move(labels)),
          m_inputs(std::move(inputs)) {}

    bool wantsPage() const { return m_page; }
    bool wantsResult() const { return m_result; }
    const LabelWanted& labels() const { return m_labels; }

    /// The path of an output. `mark`, if not empty, follows the name: NAME.MARK.json.
    std::string pathOf(const Measurement& measurement, Output output,
                       const std::string& mark = {}) const;

    /// To be called for the measurements of a run in their order, before any of them is written:
    /// of those with the same outputs, all but the first are marked as such.
    void claim(Measurement& measurement);

    /// Writes it whole, in place of an earlier output of ours; makes the folder if it is missing.
    /// Everything else in that place is left alone, and so is an output of another measurement of
    /// this run. Returns what went wrong, or nothing. Threads may call it at once.
    std::optional<Problem> write(const Measurement& measurement, Output output,
                                 std::string_view text, const std::string& mark = {});

  private:
    std::string endingOf(Output output) const;
    std::optional<Problem> check(const Measurement& measurement, Output output,
                                 const std::string& path) const;

    const std::string m_folder;
    const bool m_page;
    const bool m_result;
    const LabelWanted m_labels;
    const std::vector<std::string> m_inputs;
    std::unordered_set<std::string> m_claimed; ///< Where results would be.
};

} // namespace check
