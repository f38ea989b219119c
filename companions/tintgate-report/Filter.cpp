// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-report/Filter.h"

#include <algorithm>
#include <charconv>
#include <cstdio>
#include <ctime>

namespace report {
namespace {

constexpr std::int64_t secondsOfDay = 86400;

char lower(char c) {
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
}

bool holds(const std::string& text, const std::string& part) {
    return part.empty() ||
           std::search(text.begin(), text.end(), part.begin(), part.end(),
                       [](char a, char b) { return lower(a) == lower(b); }) != text.end();
}

/// Numeric dates with an unknown order of day and month: 11/21/2026, 20.11.2026. Accepted only if
/// one of the two is above 12 or both are equal. A time as written by chart exporters, as in
/// "11/05/2026 # Time: 09:15", shows that the month is first.
std::optional<std::int64_t> timeOfNumbers(const std::string& text) {
    int first = 0;
    int second = 0;
    int year = 0;
    char separator[2] = {};
    int used = 0;
    if (std::sscanf(text.c_str(), " %2d%1[./]%2d%*1[./]%4d%n", &first, separator, &second, &year,
                    &used) != 4 ||
        year < 1970) {
        return std::nullopt;
    }
    std::tm parts{};
    const bool exporters =
        std::sscanf(text.c_str() + used, " # Time: %2d:%2d", &parts.tm_hour, &parts.tm_min) == 2;
    if (!exporters) {
        parts = {};
        std::sscanf(text.c_str() + used, " %2d:%2d", &parts.tm_hour, &parts.tm_min);
    }
    constexpr int months = 12;
    const bool monthFirst = exporters || second > months;
    if (!exporters && first <= months && second <= months && first != second) {
        return std::nullopt;
    }
    const int month = monthFirst ? first : second;
    const int day = monthFirst ? second : first;
    constexpr int longestMonth = 31;
    if (month < 1 || month > months || day < 1 || day > longestMonth || parts.tm_hour > 23 ||
        parts.tm_min > 59) {
        return std::nullopt;
    }
    parts.tm_year = year - 1900;
    parts.tm_mon = month - 1;
    parts.tm_mday = day;
    return timegm(&parts);
}

} // namespace

std::optional<std::int64_t> timeOf(const std::string& text) {
    // Text after the last field, such as a zone, is ignored.
    for (const char* form :
         {"%Y-%m-%dT%H:%M:%S", "%Y-%m-%d %H:%M:%S", "%Y-%m-%dT%H:%M", "%Y-%m-%d %H:%M", "%Y-%m-%d",
          "%Y/%m/%d %H:%M:%S", "%Y/%m/%d %H:%M", "%Y/%m/%d", "%a %b %d %H:%M:%S %Y",
          "%B %d, %Y %H:%M:%S", "%B %d, %Y %H:%M", "%B %d, %Y", "%d %B %Y"}) {
        std::tm parts{};
        constexpr int earliestYear = 70; // %Y would read 11/05/2026 as year 11.
        if (strptime(text.c_str(), form, &parts) != nullptr && parts.tm_year >= earliestYear) {
            return timegm(&parts);
        }
    }
    return timeOfNumbers(text);
}

std::int64_t localTime(std::int64_t secondsSince1970) {
    const std::time_t seconds = secondsSince1970;
    std::tm parts{};
    localtime_r(&seconds, &parts);
    return timegm(&parts);
}

bool Filter::takesTime(std::int64_t time) const {
    return (!since || time >= *since) && (!until || time < *until);
}

bool Filter::takes(const report::Sample& sample) const {
    return takesTime(sample.time) && holds(sample.paper, paper) &&
           (holds(sample.preset, preset) || std::to_string(sample.presetId) == preset) &&
           holds(sample.instrument, instrument) && holds(sample.workflow, workflow);
}

std::optional<std::int64_t> dayOf(const std::string& text) {
    std::int64_t days = 0;
    const char* const end = text.data() + text.size();
    const auto [rest, error] = std::from_chars(text.data(), end, days);
    constexpr std::int64_t mostDays = 1'000'000;
    if (error == std::errc() && rest + 1 == end && *rest == 'd' && days >= 0 && days <= mostDays) {
        const std::int64_t now = localTime(std::time(nullptr));
        return now - now % secondsOfDay - days * secondsOfDay;
    }
    std::tm parts{};
    const char* const behind = strptime(text.c_str(), "%Y-%m-%d", &parts);
    return behind != nullptr && *behind == '\0' ? std::optional<std::int64_t>(timegm(&parts))
                                                : std::nullopt;
}

} // namespace report
