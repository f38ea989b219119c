// SPDX-License-Identifier: Apache-2.0
#include "companions/measure-tool/Text.h"

#include <cstdio>
#include <ctime>

#include "base/Utf8.h"

namespace measuretool {

std::string printable(std::string_view text) {
    std::string result;
    while (!text.empty()) {
        const auto character = base::takeUtf8(text);
        if (!character) {
            text.remove_prefix(1);
        }
        const bool control =
            !character || *character < 0x20 || (*character >= 0x7F && *character < 0xA0);
        base::appendUtf8(result, control ? U'?' : *character);
    }
    return result;
}

std::string minutesText(std::chrono::seconds time) {
    const long long count = time.count();
    char text[32];
    std::snprintf(text, sizeof text, "%lld:%02lld", count / 60, count % 60);
    return text;
}

std::string clockText(std::chrono::system_clock::time_point time) {
    const std::time_t seconds = std::chrono::system_clock::to_time_t(time);
    std::tm parts{};
    localtime_r(&seconds, &parts);
    char text[sizeof "15:32"];
    std::strftime(text, sizeof text, "%H:%M", &parts);
    return text;
}

std::string timeText(std::chrono::system_clock::time_point time) {
    const std::time_t seconds = std::chrono::system_clock::to_time_t(time);
    std::tm parts{};
    gmtime_r(&seconds, &parts);
    char text[sizeof "2024-05-01T12:34:56Z"];
    std::strftime(text, sizeof text, "%Y-%m-%dT%H:%M:%SZ", &parts);
    return text;
}

} // namespace measuretool
