#include "companions/tintgate-report/Filter.h"

#include <algorithm>
#include <charconv>
#include <ctime>

namespace reporting {
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

} // namespace

std::optional<std::int64_t> timeOf(const std::string& text) {
    // What follows the last field, such as a zone, is let be.
    for (const char* form : {"%Y-%m-%dT%H:%M:%S", "%Y-%m-%d %H:%M:%S", "%Y-%m-%dT%H:%M",
                             "%Y-%m-%d %H:%M", "%Y-%m-%d", "%a %b %d %H:%M:%S %Y"}) {
        std::tm parts{};
        if (strptime(text.c_str(), form, &parts) != nullptr)
            return timegm(&parts);
    }
    return std::nullopt;
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

} // namespace reporting
