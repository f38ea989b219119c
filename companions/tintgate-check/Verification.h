// SPDX-License-Identifier: Apache-2.0
// One measurement, verified.
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "companions/tintgate-check/Aim.h"
#include "companions/tintgate-check/Measurements.h"
#include "companions/tintgate-check/Outputs.h"
#include "companions/tintgate-check/Problem.h"
#include "report/Result.h"

namespace check {

enum class Fate { Passed, Failed, Incomplete, NotDone };

/// What is kept of a measurement. The result itself is kept only if it is wanted.
struct Outcome {
    Measurement measurement;
    Fate fate = Fate::NotDone;
    std::string
        criterion;       ///< The one that decides, or that is nearest to its tolerance; its title.
    std::string figures; ///< Its value and tolerance: "7.31 of 5.00 ΔE00"; or why it has none.
    std::optional<Problem> problem; ///< Always with NotDone; otherwise of an output.
    std::vector<std::string> written;
    std::string json;                       ///< A line of JSON with its line end, if wanted.
    std::shared_ptr<report::Result> result; ///< If wanted.
    bool isSkipped = false;                 ///< In a watch: nothing was done, or nothing is new.

    Status status() const;
};

struct Wanted {
    bool json = false;
    bool result = false;
};

/// Reads the measurement, compares and judges it, and writes its outputs. Whatever goes wrong is in
/// the outcome; nothing is thrown. Threads may share the aim and the outputs.
Outcome verify(const Aim& aim, const Measurement& measurement, Outputs& outputs,
               const Wanted& wanted);

/// The same of a measurement whose bytes have been read. The names of its outputs carry `mark`.
Outcome verifyBytes(const Aim& aim, const Measurement& measurement, std::string_view bytes,
                    Outputs& outputs, const Wanted& wanted, const std::string& mark);

/// The outcome of a measurement that could not be read, for a code of docs/exit-codes.csv.
Outcome refuse(const Aim& aim, const Measurement& measurement, int code, const Wanted& wanted);

/// What is written for a measurement that can't be used, in the place of a result.
std::string brokenJson(const Aim& aim, const Outcome& outcome, const std::string& mark);

} // namespace check
