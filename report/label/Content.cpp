// SPDX-License-Identifier: Apache-2.0
#include "report/label/Content.h"

#include <algorithm>

#include "report/label/Texts.h"

namespace label {
namespace {

/// The margin information that a contract proof must have. The names of the standard's parts are
/// in docs/labels.md.
constexpr Field required[] = {Field::Condition, Field::Date,       Field::Printer, Field::Paper,
                              Field::Software,  Field::Colourants, Field::Profile};

std::string fileName(const std::string& path) {
    return path.substr(path.rfind('/') + 1);
}

std::string statementOf(const report::Input& input, const char* wanted) {
    for (const auto& [label, text] : input.statements) {
        if (label == wanted) {
            return text;
        }
    }
    return {};
}

std::string firstOf(std::initializer_list<std::string> texts) {
    for (const std::string& text : texts) {
        if (!text.empty()) {
            return text;
        }
    }
    return {};
}

std::string conditionOf(const Subject& subject) {
    const report::Input& target = subject.result.target;
    return firstOf({statementOf(target, "description"), statementOf(target, "printing"),
                    fileName(target.path)});
}

std::string instrumentOf(const Subject& subject, const std::string& given) {
    const report::Input& measurement = subject.result.measurement;
    std::string text =
        firstOf({given, subject.meta != nullptr ? subject.meta->instrument : std::string(),
                 statementOf(measurement, "instrumentation")});
    if (!measurement.measurementCondition.empty()) {
        text += (text.empty() ? "" : ", ") + measurement.measurementCondition;
    }
    return text;
}

std::string jobOf(const report::Meta* meta) {
    if (meta == nullptr) {
        return {};
    }
    return filled(meta->parentId ? texts().jobOfSheet : texts().job,
                  {{"job", std::to_string(meta->jobId)},
                   {"parent", std::to_string(meta->parentId.value_or(0))},
                   {"strip", std::to_string(meta->strip)}});
}

/// What result and job state of a field, or what the caller does.
std::string textOf(Field field, const Subject& subject) {
    const auto found = subject.details.find(field);
    const std::string given =
        found == subject.details.end() ? std::string() : printable(found->second);
    const report::Meta* const meta = subject.meta;
    const report::Input& target = subject.result.target;
    switch (field) {
    case Field::Condition:
        return firstOf({given, conditionOf(subject)});
    case Field::Preset:
        return subject.result.presetName;
    case Field::Date:
        return dateText(subject.stamp());
    case Field::Printer:
        return firstOf({given, statementOf(subject.result.measurement, "printing")});
    case Field::Paper:
        return firstOf({given, meta != nullptr ? meta->paper : std::string()});
    case Field::Instrument:
        return instrumentOf(subject, given);
    case Field::Operator:
        return firstOf({given, meta != nullptr ? meta->user : std::string()});
    case Field::Profile:
        return firstOf({given, fileName(target.path)});
    case Field::Job:
        return jobOf(meta);
    case Field::Workflow:
        return firstOf({given, meta != nullptr ? meta->workflow : std::string()});
    case Field::Software:
    case Field::Colourants:
    case Field::Intent:
    case Field::Calibrated:
        return given;
    case Field::NotStated:
        break;
    }
    return {};
}

std::string labelOf(Field field, const Subject& subject) {
    if (field == Field::Date) {
        return texts().dates[static_cast<std::size_t>(subject.dateKind())];
    }
    if (field == Field::Profile && subject.result.target.kind != "profile" &&
        !subject.details.contains(field)) {
        return texts().target;
    }
    return texts().fields[static_cast<std::size_t>(field)];
}

std::vector<Entry> entriesOf(const Subject& subject) {
    std::vector<Entry> entries;
    std::string missing;
    for (std::size_t i = 0; i + 1 < fieldCount; ++i) {
        const Field field = static_cast<Field>(i);
        const std::string text = printable(textOf(field, subject));
        const bool isRequired =
            std::find(std::begin(required), std::end(required), field) != std::end(required);
        if (!text.empty() || isRequired) {
            entries.push_back({field, labelOf(field, subject), text, !text.empty()});
        }
        if (text.empty() && isRequired) {
            missing += (missing.empty() ? "" : ", ") + labelOf(field, subject);
        }
    }
    if (!missing.empty()) {
        entries.push_back({Field::NotStated, labelOf(Field::NotStated, subject), missing, true});
    }
    return entries;
}

} // namespace

std::string Subject::stamp() const {
    return meta != nullptr ? meta->created : date;
}

DateKind Subject::dateKind() const {
    return meta != nullptr ? DateKind::Verified : kindOfDate;
}

Content contentOf(const Subject& subject) {
    Content content;
    content.model = report::makeModel(subject.result, subject.meta, say());
    content.title = printable(content.model.title);
    if (content.title.empty()) {
        content.title = texts().untitled;
    }
    content.entries = entriesOf(subject);
    content.code = {subject.result.verdict, subject.stamp(), subject.hash,
                    subjectOf(subject.result, subject.meta)};
    content.toolVersion = printable(subject.result.toolVersion);
    return content;
}

std::string restText(const std::vector<report::Figure>& judged, std::size_t first) {
    std::size_t failed = 0;
    std::size_t open = 0;
    for (std::size_t i = first; i < judged.size(); ++i) {
        failed += judged[i].outcome == report::Outcome::Fail;
        open += judged[i].outcome == report::Outcome::Unanswered ||
                judged[i].outcome == report::Outcome::Unjudged;
    }
    const std::size_t all = judged.size() - first;
    std::string outcomes;
    for (const auto& [count, text] :
         {std::pair{failed, texts().countFailed}, std::pair{open, texts().countOpen},
          std::pair{all - failed - open, texts().countPassed}}) {
        if (count > 0) {
            outcomes +=
                (outcomes.empty() ? "" : ", ") + filled(text, {{"count", std::to_string(count)}});
        }
    }
    return filled(first == 0 ? texts().countedAll : texts().more,
                  {{"count", std::to_string(all)}, {"outcomes", outcomes}});
}

} // namespace label
