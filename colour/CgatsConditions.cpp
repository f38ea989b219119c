// SPDX-License-Identifier: Apache-2.0
// Statements found in practice:
//
//     ILLUMINANT "D50"                              OBSERVER "CIE 2 degree"
//     WEIGHTING_FUNCTION "ILLUMINANT, D50"          WEIGHTING_FUNCTION "OBSERVER, 2 degree"
//     MEASUREMENT_CONDITION "M1"                    ILLUMINATION_CONDITION 1
//     INSTRUMENTATION "D50, 2 degree, geometry 45/0, no polarisation filter, white backing"
//     MEASUREMENT_SOURCE "Illumination=D50  ObserverAngle=2  WhiteBase=Abs  Filter=UVcut"
//     MEASUREMENT_SOURCE "MeasurementCondition=M1	Filter=D50"
//     MEASUREMENT_GEOMETRY "ISO 13655 - Reflection, M1"
//     FILTER "POL"                                  FILTER "D50"
#include "colour/CgatsConditions.h"

#include <algorithm>
#include <optional>
#include <vector>

#include "colour/CgatsLines.h"

namespace colour::cgats {

namespace {

bool isWordSign(char c) {
    return (c >= '0' && c <= '9') || (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z');
}

bool isDigit(char c) {
    return c >= '0' && c <= '9';
}

/// Runs of ASCII letters and digits, in upper case.
std::vector<std::string> wordsOf(std::string_view text) {
    std::vector<std::string> words;
    for (std::size_t i = 0; i < text.size();) {
        std::size_t end = i;
        while (end < text.size() && isWordSign(text[end])) {
            ++end;
        }
        if (end > i) {
            words.push_back(upperCase(text.substr(i, end - i)));
        }
        i = std::max(end, i + 1);
    }
    return words;
}

bool isMeasurementCondition(std::string_view word) {
    return word.size() == 2 && word[0] == 'M' && word[1] >= '0' && word[1] <= '3';
}

/// D50 and similar, F1 to F12, and, for a dedicated keyword, A, C and E.
bool isIlluminant(std::string_view word, bool ownKeyword) {
    for (const char* daylight : {"D50", "D55", "D65", "D75"}) {
        if (word == daylight) {
            return true;
        }
    }
    if (!ownKeyword) {
        return false;
    }
    const bool fluorescent = word.size() >= 2 && word.size() <= 3 && word[0] == 'F' &&
                             std::all_of(word.begin() + 1, word.end(), isDigit);
    return fluorescent || word == "A" || word == "C" || word == "E";
}

/// "2" or "10" from a number of degrees: "2 degree", "10°", "2-deg".
std::optional<std::string> observerIn(std::string_view text) {
    const std::string upper = upperCase(text);
    std::optional<std::string> found;
    for (std::size_t i = 0; i < upper.size(); ++i) {
        if (!isDigit(upper[i])) {
            continue;
        }
        std::size_t end = i;
        while (end < upper.size() && isDigit(upper[end])) {
            ++end;
        }
        const std::string number = upper.substr(i, end - i);
        const bool alone = i == 0 || (!isWordSign(upper[i - 1]) && upper[i - 1] != '.' &&
                                      upper[i - 1] != '/' && upper[i - 1] != ':');
        std::size_t unit = end;
        while (unit < upper.size() && (upper[unit] == ' ' || upper[unit] == '-')) {
            ++unit;
        }
        const bool degrees = upper.compare(unit, 3, "DEG") == 0 || upper.compare(unit, 2, "°") == 0;
        if (alone && degrees && (number == "2" || number == "10")) {
            if (found && *found != number) {
                return std::nullopt;
            }
            found = number;
        }
        i = end;
    }
    return found;
}

/// Like observerIn, for a text that is only about the observer: "2", "CIE 1931".
std::optional<std::string> observerAlone(std::string_view text) {
    if (auto observer = observerIn(text)) {
        return observer;
    }
    std::optional<std::string> found;
    for (const std::string& word : wordsOf(text)) {
        std::string number;
        if (word == "2" || word == "2DEG" || word == "1931") {
            number = "2";
        } else if (word == "10" || word == "10DEG" || word == "1964") {
            number = "10";
        }
        if (number.empty() || number == found) {
            continue;
        }
        if (found) {
            return std::nullopt;
        }
        found = number;
    }
    return found;
}

} // namespace

void ConditionFinder::Statement::add(Rank newRank, const std::string& newValue) {
    if (newRank < rank) {
        rank = newRank;
        value = newValue;
        contradicted = false;
    } else if (newRank == rank && value != newValue) {
        contradicted = true;
    }
}

void ConditionFinder::see(std::string_view keyword, std::string_view value) {
    const auto is = [&](std::initializer_list<std::string_view> names) {
        return std::find(names.begin(), names.end(), keyword) != names.end();
    };
    const bool weighting = keyword == "WEIGHTING_FUNCTION";
    const std::string upper = upperCase(value);
    if (is({"ILLUMINANT", "ILLUMINATION", "ILLUMINATION_NAME"}) ||
        (weighting && upper.find("ILLUMINANT") != std::string::npos)) {
        for (const std::string& word : wordsOf(value)) {
            if (isIlluminant(word, true)) {
                m_illuminant.add(Keyword, word);
            } else if (isMeasurementCondition(word)) {
                m_measurement.add(Keyword, word);
            }
        }
    }
    if (is({"OBSERVER", "OBSERVER_ANGLE", "STANDARD_OBSERVER"})) {
        if (const auto observer = observerAlone(value)) {
            m_observer.add(Keyword, *observer);
        }
    }
    if (weighting) {
        const std::size_t at = upper.find("OBSERVER");
        if (at != std::string::npos) {
            if (const auto observer = observerAlone(value.substr(at))) {
                m_observer.add(Keyword, *observer);
            }
        }
    }
    if (keyword == "ILLUMINATION_CONDITION" && value.size() == 1 && value[0] >= '0' &&
        value[0] <= '3') {
        // The measuring tool's mode, with the condition numbers of ISO 13655.
        m_measurement.add(Keyword, "M" + std::string(value));
    } else if (is({"ILLUMINATION_CONDITION", "MEASUREMENT_CONDITION", "MEASUREMENT_CONDITIONS",
                   "MEASUREMENT_MODE", "MEASUREMENT_STANDARD"})) {
        for (const std::string& word : wordsOf(value)) {
            if (isMeasurementCondition(word)) {
                m_measurement.add(Keyword, word);
            }
        }
    }
    if (keyword == "MEASUREMENT_GEOMETRY") {
        seeProse(Geometry, value);
    }
    if (is({"INSTRUMENTATION", "MEASUREMENT_SOURCE", "MEASUREMENT_CONDITION",
            "MEASUREMENT_CONDITIONS", "COMPUTATIONAL_PARAMETER"})) {
        seeProse(Prose, value);
    }
    if (keyword == "MEASUREMENT_SOURCE" && upper.find("TUNGSTEN") != std::string::npos) {
        m_measurement.add(Hint, "M0");
    }
    if (is({"FILTER", "FILTER_STATUS"})) {
        seeFilter(value);
    }
    if (is({"POLARIZATION", "POLARISATION"}) &&
        (upper == "YES" || upper == "TRUE" || upper == "1")) {
        m_measurement.add(Filter, "M3");
    }
}

/// Searches a text for all three, and for named parts such as Filter=UVcut.
void ConditionFinder::seeProse(Rank rank, std::string_view text) {
    std::string rest; // without the named parts
    for (std::size_t at = 0; at < text.size();) {
        const std::size_t end = std::min(text.find_first_of(" \t,;", at), text.size());
        const std::string_view part = text.substr(at, end - at);
        const std::size_t equals = part.find('=');
        if (equals == std::string_view::npos) {
            rest.append(part);
        } else {
            seeNamed(upperCase(part.substr(0, equals)), part.substr(equals + 1));
        }
        if (end < text.size()) {
            rest += text[end];
        }
        at = end + 1;
    }
    for (const std::string& word : wordsOf(rest)) {
        if (isIlluminant(word, false)) {
            m_illuminant.add(rank, word);
        } else if (isMeasurementCondition(word)) {
            m_measurement.add(rank, word);
        }
    }
    if (const auto observer = observerIn(rest)) {
        m_observer.add(rank, *observer);
    }
}

/// `name` in upper case.
void ConditionFinder::seeNamed(std::string_view name, std::string_view value) {
    if (name.ends_with("OBSERVERANGLE") || name.ends_with("OBSERVER")) {
        if (const auto observer = observerAlone(value)) {
            m_observer.add(Named, *observer);
        }
    } else if (name.ends_with("MEASUREMENTCONDITION")) {
        for (const std::string& word : wordsOf(value)) {
            if (isMeasurementCondition(word)) {
                m_measurement.add(Named, word);
            }
        }
    } else if (name.ends_with("ILLUMINATION") || name.ends_with("ILLUMINANT")) {
        for (const std::string& word : wordsOf(value)) {
            if (isIlluminant(word, true)) {
                m_illuminant.add(Named, word);
            } else if (isMeasurementCondition(word)) {
                m_measurement.add(Named, word);
            }
        }
    } else if (name.ends_with("FILTER")) {
        seeFilter(value);
    }
}

/// ISO 13655: M1 is daylight, which some software calls a D50 filter; M2 excludes ultraviolet; M3
/// is polarised. "No filter" means M0, but devices that only support M1 write it too.
void ConditionFinder::seeFilter(std::string_view text) {
    const std::vector<std::string> words = wordsOf(text);
    const auto holds = [&](std::initializer_list<std::string_view> names) {
        return std::any_of(words.begin(), words.end(), [&](const std::string& word) {
            return std::find(names.begin(), names.end(), word) != names.end();
        });
    };
    for (const std::string& word : words) {
        if (isMeasurementCondition(word)) {
            m_measurement.add(Filter, word);
        }
    }
    if (holds({"NO"})) {
        m_measurement.add(Hint, "M0");
    } else if (holds({"NONE", "INCLUDED", "UVIN", "UVINC"})) {
        return;
    } else if (holds({"POL", "POLARIZED", "POLARISED", "POLARIZATION", "POLARISATION", "POLARIZER",
                      "POLARISER"})) {
        m_measurement.add(Filter, "M3");
    } else if (holds({"UV", "UVCUT", "UVEX", "UVEXCLUDED", "UVFILTER"})) {
        m_measurement.add(Filter, "M2");
    } else if (holds({"D50"})) {
        m_measurement.add(Filter, "M1");
    }
}

Conditions ConditionFinder::result() const {
    return {m_illuminant.result(), m_observer.result(), m_measurement.result()};
}

} // namespace colour::cgats
