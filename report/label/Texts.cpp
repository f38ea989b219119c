// SPDX-License-Identifier: Apache-2.0
#include "report/label/Texts.h"

#include "base/Utf8.h"
#include "report/Model.h"

namespace label {
namespace {

constexpr Texts english = {
    .passed = "PASSED",
    .failed = "FAILED",
    .incomplete = "INCOMPLETE",
    .untitled = "–",
    .fields = {"Condition", "Preset", "Date", "Printer", "Paper", "Instrument", "Operator",
               "Software", "Colourants", "Profile", "Intent", "Calibrated", "Job", "Workflow",
               "Not stated"},
    .dates = {"Verified", "Measured", "File dated"},
    .target = "Target",
    .notStated = "not stated",
    .job = "{job}, strip {strip}",
    .jobOfSheet = "{job} of {parent}, strip {strip}",
    .labelled = "{label}: ",
    .criteria = "Criteria",
    .criterion = "Criterion",
    .value = "Value",
    .tolerance = "Tolerance",
    .valueOfTolerance = "{value} / {tolerance}",
    .headOfValues = "value / tolerance, {unit}",
    .more = "and {count} more: {outcomes}",
    .countedAll = "{count} criteria: {outcomes}",
    .countFailed = "{count} failed",
    .countOpen = "{count} without data",
    .countPassed = "{count} passed",
    .noCriterion = "The preset judges no criterion.",
    .hash = "SHA-256 of the result: {hash}",
    .madeBy = "Tintgate {version}",
    .signature = "Signature",
    .certificate = "Certificate of colour verification",
    .conditions = "Conditions",
    .differences = "Colour differences",
    .differencesAxis = "Number of patches by {unit}",
    .worstPatches = "Largest differences: {count} of {all} patches",
    .patch = "Patch",
    .targetColour = "Target L* a* b*",
    .measuredColour = "Measured L* a* b*",
    .swatches = "Target, measured",
    .colours = "Colours: lines lead from the target to what was measured",
    .warnings = "Warnings",
    .moreWarnings = "and {count} more",
    .viewing =
        "Compare under D50 (ISO 3664): P1, 2000 lx, for comparison with a print; P2, 500 lx, "
        "for practical appraisal. Swatches help to recognise a patch and are no measurement.",
    .page = "Page {page} of {pages}",
};

/// Characters that change the direction of the text after them: a job's name could use them to
/// make another text of what the label prints.
bool turnsDirection(char32_t c) {
    return (c >= 0x202A && c <= 0x202E) || (c >= 0x2066 && c <= 0x2069) || c == 0x200E ||
           c == 0x200F || c == 0x061C;
}

bool isBlank(char32_t c) {
    return c <= 0x20 || (c >= 0x7F && c <= 0xA0) || c == 0x2028 || c == 0x2029;
}

} // namespace

const Texts& texts() {
    return english;
}

const char* verdictText(report::Verdict verdict) {
    return verdict == report::Verdict::Passed   ? texts().passed
           : verdict == report::Verdict::Failed ? texts().failed
                                                : texts().incomplete;
}

std::string filled(std::string_view text,
                   std::initializer_list<std::pair<std::string_view, std::string>> values) {
    std::string result;
    while (!text.empty()) {
        const std::size_t open = text.find('{');
        result += text.substr(0, open);
        if (open == text.npos) {
            break;
        }
        const std::size_t close = text.find('}', open);
        const std::string_view name = text.substr(open + 1, close - open - 1);
        for (const auto& [known, value] : values) {
            if (known == name) {
                result += value;
            }
        }
        text.remove_prefix(close == text.npos ? text.size() : close + 1);
    }
    return result;
}

std::string numberText(double value, int decimals) {
    return report::fixedText(value, decimals);
}

std::string dateText(const std::string& stamp) {
    constexpr std::size_t day = 10;
    constexpr std::size_t minute = 16;
    constexpr std::size_t second = 19;
    if (stamp.size() < day || stamp[4] != '-') {
        return stamp;
    }
    std::string text =
        languages::english().day(std::stoi(stamp.substr(8, 2)), std::stoi(stamp.substr(5, 2)),
                                 std::stoi(stamp.substr(0, 4)));
    if (stamp.size() >= minute) {
        text += ", " + stamp.substr(11, 5);
    }
    if (stamp.size() > second) {
        text += " (UTC" + stamp.substr(second) + ")";
    }
    return text;
}

std::string printable(std::string_view text) {
    std::string result;
    std::size_t count = 0;
    bool isBlankDue = false;
    while (!text.empty()) {
        char32_t c = 0xFFFD;
        if (const auto taken = base::takeUtf8(text)) {
            c = *taken;
        } else {
            text.remove_prefix(1);
        }
        if (turnsDirection(c)) {
            continue;
        }
        if (isBlank(c)) {
            isBlankDue = !result.empty();
            continue;
        }
        if (count >= longestText) {
            return result + "…";
        }
        if (isBlankDue) {
            result += ' ';
            ++count;
            isBlankDue = false;
        }
        base::appendUtf8(result, c);
        ++count;
    }
    return result;
}

} // namespace label
