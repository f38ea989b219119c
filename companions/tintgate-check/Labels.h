// SPDX-License-Identifier: Apache-2.0
// Labels and certificates of verified measurements.
#pragma once

#include <optional>
#include <string>

#include <CLI/CLI.hpp>

#include "companions/tintgate-check/Aim.h"
#include "report/Result.h"
#include "report/label/Label.h"

namespace check {

struct LabelWanted {
    std::optional<label::Format> format; ///< Of labels; none are made without it.
    bool certificate = false;
    label::Size size = label::standardSize;
    label::Size sheet = label::a4;
    double dpi = label::standardDpi;
    std::string operatorName; ///< May be empty.

    bool isAny() const { return format || certificate; }
};

/// The options as they are typed.
struct LabelWords {
    std::string format;
    std::string size;
    std::string sheet;
    std::string operatorName;
    double dpi = label::standardDpi;
    bool certificate = false;
};

void addLabelOptions(CLI::App& program, LabelWords& words);

/// Throws CLI::ParseError for words that mean nothing.
LabelWanted readLabelWords(const LabelWords& words);

/// `json` is the text of the result. The date is that of this moment. Throws label::CannotDraw.
std::string drawnLabel(const LabelWanted& wanted, const Aim& aim, const report::Result& result,
                       const std::string& json);
std::string drawnCertificate(const LabelWanted& wanted, const Aim& aim,
                             const report::Result& result, const std::string& json);

} // namespace check
