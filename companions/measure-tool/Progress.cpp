#include "companions/measure-tool/Progress.h"

#include <unistd.h>

#include "companions/measure-tool/Patches.h"

namespace measuring {
namespace {

constexpr std::chrono::milliseconds betweenLooks{40};
constexpr const char* startOfCleanLine = "\r\x1b[K";

} // namespace

Progress::Progress() {
    for (std::FILE* stream : {stderr, stdout})
        if (m_terminal == nullptr && isatty(fileno(stream)) != 0)
            m_terminal = stream;
}

Progress::~Progress() {
    if (m_open)
        std::fputc('\n', m_terminal);
}

void Progress::show(const colour::DataSet& measurement, std::size_t done, std::size_t total) {
    const auto now = std::chrono::steady_clock::now();
    if (m_terminal == nullptr || (now < m_next && done < total))
        return;
    m_next = now + betweenLooks;
    const std::size_t patch = done - 1;
    const colour::Lab& lab = measurement.lab[patch];
    std::fprintf(m_terminal, "%sPatch %zu of %zu    %s    L*a*b* %.2f %.2f %.2f", startOfCleanLine,
                 done, total, deviceText(measurement, patch).c_str(), lab.L, lab.a, lab.b);
    std::fflush(m_terminal);
    m_open = true;
}

void Progress::say(const char* sentence) {
    if (m_terminal == nullptr)
        return;
    std::fprintf(m_terminal, "%s%s\n", m_open ? "\n" : "", sentence);
    m_open = false;
}

} // namespace measuring
