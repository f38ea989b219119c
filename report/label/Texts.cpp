// SPDX-License-Identifier: Apache-2.0
#include "report/label/Texts.h"

#include "base/Utf8.h"
#include "report/Model.h"
#include "report/label/Label.h"

namespace label {
namespace {

constexpr const char* fieldKeys[fieldCount] = {
    "condition",  "preset",  "date",   "printer",    "paper", "instrument", "operator", "software",
    "colourants", "profile", "intent", "calibrated", "job",   "workflow",   "notStated"};

Texts textsIn(const languages::Texts& say) {
    Texts texts = {
        .passed = say("label.passed"),
        .failed = say("label.failed"),
        .incomplete = say("label.incomplete"),
        .untitled = "–",
        .fields = {},
        .dates = {say("label.date.verified"), say("label.date.measured"), say("label.date.file")},
        .target = say("label.target"),
        .notStated = say("label.notStated"),
        .job = say("label.job"),
        .jobOfSheet = say("label.jobOfSheet"),
        .labelled = say("label.labelled"),
        .criteria = say("label.criteria"),
        .criterion = say("label.criterion"),
        .value = say("label.value"),
        .tolerance = say("label.tolerance"),
        .valueOfTolerance = say("label.valueOfTolerance"),
        .headOfValues = say("label.headOfValues"),
        .more = say("label.more"),
        .countedAll = say("label.countedAll"),
        .countFailed = say("label.countFailed"),
        .countOpen = say("label.countOpen"),
        .countPassed = say("label.countPassed"),
        .noCriterion = say("label.noCriterion"),
        .hash = say("label.hash"),
        .madeBy = "Tintgate {version}",
        .signature = say("label.signature"),
        .certificate = say("label.certificate"),
        .conditions = say("label.conditions"),
        .differences = say("label.differences"),
        .differencesAxis = say("label.differencesAxis"),
        .worstPatches = say("label.worstPatches"),
        .patch = say("label.patch"),
        .targetColour = say("label.targetColour"),
        .measuredColour = say("label.measuredColour"),
        .swatches = say("label.swatches"),
        .colours = say("label.colours"),
        .tones = say("label.tones"),
        .warnings = say("label.warnings"),
        .moreWarnings = say("label.moreWarnings"),
        .viewing = say("label.viewing"),
        .page = say("label.page"),
    };
    for (std::size_t i = 0; i < fieldCount; ++i) {
        texts.fields[i] = say.find(std::string("label.field.") + fieldKeys[i]).value_or("");
    }
    return texts;
}

struct Speech {
    languages::Texts say;
    Texts texts;
};

Speech& speech() {
    static Speech current{languages::english(), textsIn(languages::english())};
    return current;
}

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

void useLanguage(languages::Language language) {
    const languages::Texts say(language);
    speech() = {say, textsIn(say)};
}

const languages::Texts& say() {
    return speech().say;
}

const Texts& texts() {
    return speech().texts;
}

const std::string& verdictText(report::Verdict verdict) {
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
    return say().number(value, decimals);
}

std::string dateText(const std::string& stamp) {
    constexpr std::size_t day = 10;
    constexpr std::size_t minute = 16;
    constexpr std::size_t second = 19;
    if (stamp.size() < day || stamp[4] != '-') {
        return stamp;
    }
    std::string text = say().day(std::stoi(stamp.substr(8, 2)), std::stoi(stamp.substr(5, 2)),
                                 std::stoi(stamp.substr(0, 4)));
    if (stamp.size() >= minute) {
        text = say().time(text, stamp.substr(11, 5));
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
