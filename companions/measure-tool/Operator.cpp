// SPDX-License-Identifier: Apache-2.0
#include "companions/measure-tool/Operator.h"

#include <algorithm>
#include <chrono>

#include "companions/measure-tool/Text.h"

namespace measuretool {

Operator::Operator(const std::string& strip, Progress& progress, const RunLog& log)
    : m_strip(strip.empty() ? "the strip" : strip), m_progress(progress), m_log(log) {}

std::string Operator::timeLeft() const {
    const auto left = std::chrono::ceil<std::chrono::seconds>(m_end - Clock::now());
    return minutesText(std::max(left, std::chrono::seconds(0))) + " left, until " + m_until;
}

void Operator::askForExport(const std::string& path, Clock::time_point end) {
    m_path = path;
    m_end = end;
    const auto until = std::chrono::system_clock::now() +
                       std::chrono::ceil<std::chrono::seconds>(end - Clock::now());
    m_until = clockText(until);
    m_log.add("Waiting for " + path + ", until " + timeText(until));
    m_progress.say("Your turn: measure " + m_strip + " and export it as " + path);
    m_shown.clear();
    showTime();
    m_notification.show("Measure " + m_strip, {"Export it as " + path, timeLeft()});
}

void Operator::showTime() {
    const std::string time = timeLeft();
    if (time != m_shown) {
        m_progress.line(time);
    }
    m_shown = time;
}

void Operator::refuse(const std::string& problem) {
    m_log.add("Not accepted: " + problem);
    m_progress.say("Not accepted: " + problem);
    m_progress.say("Measure " + m_strip + " and export it again as " + m_path);
    m_shown.clear();
    showTime();
    m_notification.show("Measure " + m_strip + " again",
                        {"Not accepted: " + problem, "Export it as " + m_path, timeLeft()});
}

void Operator::remark(const std::string& sentence) {
    m_log.add(sentence);
    m_progress.say(sentence);
}

} // namespace measuretool
