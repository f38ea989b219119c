// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-store/Days.h"

#include <charconv>
#include <cstring>
#include <ctime>

#include "companions/tintgate-store/Bytes.h"
#include "companions/tintgate-store/Failure.h"

namespace admin {

namespace {

constexpr std::int64_t secondsOfDay = 86'400;

} // namespace

bool isDay(const std::string& text) {
    constexpr std::size_t length = std::strlen("2024-05-01");
    std::tm parts{};
    const char* const rest = strptime(text.c_str(), "%Y-%m-%d", &parts);
    return text.size() == length && rest == text.c_str() + length;
}

int daysOf(const std::string& text, const std::string& what) {
    constexpr int mostDays = 36'500;
    int days = 0;
    const char* const end = text.data() + text.size();
    const auto [rest, error] = std::from_chars(text.data(), end, days);
    if (error != std::errc() || rest + 1 != end || *rest != 'd' || days < 0 || days > mostDays) {
        throw Failure(Status::BadInput,
                      what + " takes a number of days such as 90d, not " + printable(text));
    }
    return days;
}

std::string dayBefore(int days) {
    const std::time_t now = std::time(nullptr);
    std::tm parts{};
    localtime_r(&now, &parts);
    parts.tm_mday -= days;
    parts.tm_hour = 12; // Away from hours that a change of the clock leaves out.
    parts.tm_isdst = -1;
    std::mktime(&parts);
    char text[32];
    return {text, std::strftime(text, sizeof text, "%Y-%m-%d", &parts)};
}

std::int64_t timeBefore(int days) {
    return std::time(nullptr) - days * secondsOfDay;
}

std::string shownTime(std::int64_t seconds) {
    const std::time_t time = seconds;
    std::tm parts = {};
    localtime_r(&time, &parts);
    char text[32];
    std::strftime(text, sizeof text, "%Y-%m-%d %H:%M:%S", &parts);
    return text;
}

} // namespace admin
