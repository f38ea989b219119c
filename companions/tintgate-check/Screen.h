// SPDX-License-Identifier: Apache-2.0
// Verdicts for a terminal: one measurement on a screen, or a line for each of many.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "companions/tintgate-check/Aim.h"
#include "companions/tintgate-check/Verification.h"
#include "companions/tintgate-report/Terminal.h"

namespace check {

/// How many characters fit a line: those of the terminal, within 60 and 100; 80 if standard output
/// is none.
std::size_t screenWidth();

/// One measurement: the verdict first, then criteria, the worst patches, warnings, what to do.
/// REQUIRES: an outcome with a result or a problem.
std::string screenText(const Outcome& outcome, const Aim& aim, bool isReferenceData,
                       const report::Painter& paint, std::size_t width);

/// What keeps a run from being done.
std::string problemText(const Problem& problem, const report::Painter& paint, std::size_t width);

/// The line of one measurement among many. `width` 0 does not shorten it.
std::string lineText(const Outcome& outcome, const report::Painter& paint, std::size_t width);

/// The end of a run over many: how many passed and so on, and the names of those that did not.
class Totals {
  public:
    void add(const Outcome& outcome);

    std::size_t count() const { return m_count; }
    Status status() const;
    std::string text(const report::Painter& paint, std::size_t width) const;

  private:
    struct Trouble {
        Problem problem;
        std::vector<std::string> names;
    };

    std::size_t m_count = 0;
    std::size_t m_passed = 0;
    std::size_t m_notDone = 0;
    std::vector<std::string> m_failed;
    std::vector<std::string> m_incomplete;
    std::vector<Trouble> m_troubles; ///< Problems of one kind with the files that have it.
};

} // namespace check
