// SPDX-License-Identifier: Apache-2.0
// Labels and certificates of one result, and whether a label belongs to it.
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <vector>

#include <CLI/CLI.hpp>

#include "companions/tintgate-report/Failure.h"
#include "report/label/Label.h"

namespace report {

struct LabelOptions {
    std::string label;       ///< Its path; empty for none.
    std::string certificate; ///< Likewise.
    std::string match;       ///< The text of a label, "-" for standard input; empty for none.
    std::string sizeText;
    std::string sheetText;
    std::string operatorName;
    std::vector<std::string> fields; ///< "printer=Proofer 2"
    double dpi = label::standardDpi;

    // Filled in by settle().
    label::Format format = label::Format::Pdf;
    label::Size size = label::standardSize;
    label::Size sheet = label::a4;
    label::Details details;

    bool areDrawn() const { return !label.empty() || !certificate.empty(); }
};

void addLabelOptions(CLI::App& program, LabelOptions& options);

/// Turns words into sizes and the like. Throws CLI::ParseError.
void settle(LabelOptions& options);

/// Writes the label and the certificate that `options` ask for. Passes each field that had no room
/// to `say`. Throws Failure.
void writeLabels(const LabelOptions& options, const std::string& result, const std::string& meta,
                 std::optional<languages::Language> language,
                 const std::function<void(const std::string&)>& say);

/// Prints whether the label's text and the result belong together. Done, OtherResult or NoLabel.
/// Throws Failure.
Status matchLabel(const LabelOptions& options, const std::string& result, const std::string& meta);

} // namespace report
