// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-report/PatchesCsv.h"

#include <charconv>
#include <cmath>
#include <string_view>

namespace report {
void appendCsvText(std::string& csv, std::string_view text) {
    const bool formula = !text.empty() && std::string_view("=+-@\t\r").find(text[0]) != text.npos;
    const bool quoted = text.find_first_of("\",\r\n") != text.npos;
    if (quoted) {
        csv += '"';
    }
    if (formula) {
        csv += '\'';
    }
    for (const char c : text) {
        csv.append(c == '"' ? 2 : 1, c);
    }
    if (quoted) {
        csv += '"';
    }
}

void appendCsvNumber(std::string& csv, double value) {
    char digits[400];
    if (std::isfinite(value)) {
        csv.append(
            digits,
            std::to_chars(digits, digits + sizeof digits, value, std::chars_format::fixed).ptr);
    }
}

std::string patchesCsv(const report::Result& result) {
    std::string csv = "id,name,";
    for (const std::string& channel : result.channels) {
        appendCsvText(csv, channel);
        csv += ',';
    }
    csv += "target_L,target_a,target_b,measured_L,measured_a,measured_b,difference,"
           "measured_id,measured_name\n";
    const std::size_t channels = result.channels.size();
    for (std::size_t i = 0; i < result.patches.size(); ++i) {
        const report::Patch& patch = result.patches[i];
        appendCsvText(csv, patch.id);
        csv += ',';
        appendCsvText(csv, patch.name);
        const auto number = [&](double value) {
            csv += ',';
            appendCsvNumber(csv, value);
        };
        for (std::size_t channel = 0; channel < channels; ++channel) {
            number(result.device[i * channels + channel]);
        }
        for (const colour::Lab& lab : {patch.target, patch.measured}) {
            for (const double value : {lab.L, lab.a, lab.b}) {
                number(value);
            }
        }
        number(patch.difference);
        for (const std::string& label : {patch.measuredId, patch.measuredName}) {
            csv += ',';
            appendCsvText(csv, label);
        }
        csv += '\n';
    }
    return csv;
}

} // namespace report
