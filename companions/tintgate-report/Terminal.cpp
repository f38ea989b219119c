// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-report/Terminal.h"

#include <algorithm>
#include <cstdlib>

#include <glib.h>
#include <unistd.h>

#include "companions/tintgate-store/Bytes.h"

namespace report {
namespace {

const char* sequenceOf(Tone tone) {
    switch (tone) {
    case Tone::Plain:
        break;
    case Tone::Bold:
        return "\x1b[1m";
    case Tone::Soft:
        return "\x1b[2m";
    case Tone::Passed:
        return "\x1b[32m";
    case Tone::Failed:
        return "\x1b[1;31m";
    case Tone::Open:
        return "\x1b[33m";
    }
    return "";
}

} // namespace

std::string Painter::operator()(Tone tone, std::string_view text) const {
    const std::string shown = admin::printable(text);
    if (!m_colours || tone == Tone::Plain || shown.empty()) {
        return shown;
    }
    return sequenceOf(tone) + shown + "\x1b[0m";
}

bool terminalTakesColours() {
    const char* const off = std::getenv("NO_COLOR");
    const char* const kind = std::getenv("TERM");
    return isatty(STDOUT_FILENO) != 0 && (off == nullptr || *off == '\0') && kind != nullptr &&
           std::string_view(kind) != "dumb" && *kind != '\0';
}

std::size_t columnsOf(std::string_view text) {
    std::size_t columns = 0;
    const char* const end = text.data() + text.size();
    for (const char* at = text.data(); at < end; at = g_utf8_next_char(at)) {
        const gunichar c = g_utf8_get_char(at);
        columns += g_unichar_iszerowidth(c) != 0 ? 0 : g_unichar_iswide(c) != 0 ? 2 : 1;
    }
    return columns;
}

std::string tableText(const std::vector<std::vector<Cell>>& lines, const Painter& paint) {
    std::vector<std::size_t> widths;
    for (const auto& cells : lines) {
        widths.resize(std::max(widths.size(), cells.size()));
        for (std::size_t i = 0; i < cells.size(); ++i) {
            widths[i] = std::max(widths[i], columnsOf(admin::printable(cells[i].text)));
        }
    }
    std::string text;
    for (const auto& cells : lines) {
        std::string line;
        for (std::size_t i = 0; i < cells.size(); ++i) {
            const Cell& cell = cells[i];
            const std::size_t gap = widths[i] - columnsOf(admin::printable(cell.text));
            line +=
                "  " + std::string(cell.toTheRight ? gap : 0, ' ') + paint(cell.tone, cell.text);
            if (!cell.toTheRight && i + 1 < cells.size()) {
                line.append(gap, ' ');
            }
        }
        text += line.substr(0, line.find_last_not_of(' ') + 1) + '\n';
    }
    return text;
}

} // namespace report
