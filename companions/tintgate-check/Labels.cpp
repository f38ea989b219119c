// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-check/Labels.h"

#include <ctime>

namespace check {
namespace {

/// 2024-05-01T12:34:56+02:00
std::string stampOfNow() {
    const std::time_t now = std::time(nullptr);
    std::tm parts{};
    localtime_r(&now, &parts);
    char text[32];
    std::string stamp(text, std::strftime(text, sizeof text, "%Y-%m-%dT%H:%M:%S%z", &parts));
    constexpr std::size_t minutesOfZone = 2;
    return stamp.insert(stamp.size() - minutesOfZone, ":");
}

/// The condition's name, and what the target says it is.
std::string conditionText(const Aim& aim, const report::Result& result) {
    for (const auto& [label, text] : result.target.statements) {
        if (label == "description" && !text.empty()) {
            return aim.condition + " (" + text + ")";
        }
    }
    return aim.condition;
}

label::Subject subjectOf(const LabelWanted& wanted, const Aim& aim, const report::Result& result,
                         const std::string& json) {
    label::Subject subject{result, label::hashOf(json)};
    subject.date = stampOfNow();
    if (!aim.condition.empty()) {
        subject.details[label::Field::Condition] = conditionText(aim, result);
    }
    for (const auto& [field, text] :
         {std::pair{label::Field::Printer, aim.printer}, std::pair{label::Field::Paper, aim.paper},
          std::pair{label::Field::Operator, wanted.operatorName}}) {
        if (!text.empty()) {
            subject.details[field] = text;
        }
    }
    return subject;
}

} // namespace

void addLabelOptions(CLI::App& program, LabelWords& words) {
    const char* const labels = "Labels and certificates";
    program
        .add_flag(
            "--label{pdf}", words.format,
            "Write NAME.label.pdf, a label for the print;\n--label=svg and --label=png do too")
        ->group(labels);
    program
        .add_option("--label-size", words.size,
                    "Width x height: 62x100mm, 4x2in and so on;\n100x50mm if left out")
        ->type_name("SIZE")
        ->group(labels);
    program
        .add_option("--label-dpi", words.dpi,
                    "Dots per inch of a .png: the printer's, such as\n203; 300 if left out")
        ->type_name("NUMBER")
        ->check(CLI::Range(label::leastDpi, label::mostDpi))
        ->group(labels);
    program
        .add_flag("--pdf", words.certificate, "Write NAME.pdf, a certificate of one or two\nsheets")
        ->group(labels);
    program
        .add_option(
            "--sheet", words.sheet,
            "Of the certificate: A4 or Letter; as usual in the\ncountry of LC_PAPER if left out")
        ->type_name("NAME")
        ->group(labels);
    program.add_option("--operator", words.operatorName, "Who answers for the prints")
        ->type_name("NAME")
        ->group(labels);
}

LabelWanted readLabelWords(const LabelWords& words) {
    LabelWanted wanted;
    if (!words.format.empty()) {
        wanted.format = label::formatOf("." + words.format);
        if (!wanted.format) {
            throw CLI::ValidationError("--label", "takes pdf, svg or png");
        }
    }
    wanted.certificate = words.certificate;
    if (!words.size.empty()) {
        const auto size = label::sizeOf(words.size);
        if (!size) {
            throw CLI::ValidationError("--label-size", label::sizeRule);
        }
        wanted.size = *size;
    }
    wanted.sheet = label::usualSheet();
    if (!words.sheet.empty()) {
        const auto sheet = label::sheetOf(words.sheet);
        if (!sheet) {
            throw CLI::ValidationError("--sheet", "takes A4 or Letter");
        }
        wanted.sheet = *sheet;
    }
    wanted.dpi = words.dpi;
    wanted.operatorName = words.operatorName;
    return wanted;
}

std::string drawnLabel(const LabelWanted& wanted, const Aim& aim, const report::Result& result,
                       const std::string& json) {
    return label::drawLabel(subjectOf(wanted, aim, result, json), wanted.size, *wanted.format,
                            wanted.dpi)
        .bytes;
}

std::string drawnCertificate(const LabelWanted& wanted, const Aim& aim,
                             const report::Result& result, const std::string& json) {
    return label::drawCertificate(subjectOf(wanted, aim, result, json), wanted.sheet).bytes;
}

} // namespace check
