// SPDX-License-Identifier: Apache-2.0
#include "companions/measure-tool/Progress.h"

#include <unistd.h>

#include "companions/measure-tool/Patches.h"
#include "companions/measure-tool/Text.h"

namespace measuretool {
namespace {

constexpr std::chrono::milliseconds betweenLooks{40};
constexpr const char* startOfCleanLine = "\r\x1b[K";

} // namespace

Progress::Progress() {
    for (std::FILE* stream : {stderr, stdout}) {
        if (m_terminal == nullptr && isatty(fileno(stream)) != 0) {
            m_terminal = stream;
        }
    }
}

Progress::~Progress() {
    if (m_open) {
        std::fputc('\n', m_terminal);
    }
}

void Progress::begin(const colour::DataSet& chart) {
    const std::string first = deviceText(chart, 0);
    line("Measuring " + std::to_string(chart.patchCount) + " patches" +
         (first.empty() ? "" : ", the first is " + first));
}

void Progress::show(const colour::DataSet& measurement, std::size_t done, std::size_t total) {
    const auto now = std::chrono::steady_clock::now();
    if (m_terminal == nullptr || (now < m_next && done < total)) {
        return;
    }
    m_next = now + betweenLooks;
    const std::size_t patch = done - 1;
    const colour::Lab& lab = measurement.lab[patch];
    char colour[128];
    std::snprintf(colour, sizeof colour, "L*a*b* %.2f %.2f %.2f", lab.L, lab.a, lab.b);
    line("Patch " + std::to_string(done) + " of " + std::to_string(total) + "    " +
         deviceText(measurement, patch) + "    " + colour);
}

void Progress::say(const std::string& sentence) {
    if (m_terminal == nullptr) {
        return;
    }
    std::fprintf(m_terminal, "%s%s\n", m_open ? startOfCleanLine : "", printable(sentence).c_str());
    std::fflush(m_terminal);
    m_open = false;
}

void Progress::line(const std::string& text) {
    if (m_terminal == nullptr) {
        return;
    }
    std::fprintf(m_terminal, "%s%s", startOfCleanLine, printable(text).c_str());
    std::fflush(m_terminal);
    m_open = true;
}

} // namespace measuretool
