// SPDX-License-Identifier: Apache-2.0
#include "report/label/Details.h"

#include <utility>

namespace label {
namespace {

constexpr std::pair<std::string_view, Field> names[] = {
    {"calibrated", Field::Calibrated}, {"colourants", Field::Colourants},
    {"condition", Field::Condition},   {"instrument", Field::Instrument},
    {"intent", Field::Intent},         {"operator", Field::Operator},
    {"paper", Field::Paper},           {"printer", Field::Printer},
    {"profile", Field::Profile},       {"software", Field::Software},
    {"workflow", Field::Workflow}};

} // namespace

std::optional<Field> fieldOf(std::string_view name) {
    for (const auto& [known, field] : names) {
        if (known == name) {
            return field;
        }
    }
    return std::nullopt;
}

std::string fieldNames() {
    std::string text;
    for (const auto& [name, field] : names) {
        text.append(text.empty() ? "" : ", ").append(name);
    }
    return text;
}

} // namespace label
