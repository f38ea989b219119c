// SPDX-License-Identifier: Apache-2.0
#include "report/Result.h"

#include <algorithm>
#include <limits>
#include <map>
#include <stdexcept>

#include <nlohmann/json.hpp>

namespace report {
namespace {

using Json = nlohmann::json;

constexpr int knownVersion = 1;

double number(const Json& value) {
    return value.is_null() ? std::numeric_limits<double>::quiet_NaN() : value.get<double>();
}

/// Reads an integer. Real numbers are refused, because they may not fit.
std::int64_t whole(const Json& value) {
    if (!value.is_number_integer()) {
        throw std::runtime_error("a number that is not whole");
    }
    return value.get<std::int64_t>();
}

std::size_t count(const Json& value) {
    if (whole(value) < 0) {
        throw std::runtime_error("a count below 0");
    }
    return value.get<std::size_t>();
}

std::optional<double> optionalNumber(const Json& value) {
    return value.is_null() ? std::nullopt : std::optional(value.get<double>());
}

/// Nothing if the member is null or absent, as in results of older versions.
std::optional<std::size_t> optionalCount(const Json& json, const char* key) {
    const auto found = json.find(key);
    return found == json.end() || found->is_null() ? std::nullopt : std::optional(count(*found));
}

template<class Value>
Value oneOf(const Json& text, const std::map<std::string, Value>& words) {
    const auto found = words.find(text.get<std::string>());
    if (found == words.end()) {
        throw std::runtime_error("unknown word \"" + text.get<std::string>() + "\"");
    }
    return found->second;
}

colour::Lab lab(const Json& values) {
    return {number(values.at(0)), number(values.at(1)), number(values.at(2))};
}

Criterion criterion(const Json& json) {
    Criterion c;
    c.name = json.at("name");
    c.title = json.at("title");
    c.unit = json.at("unit");
    c.used = json.at("used");
    c.outcome = oneOf<Outcome>(json.at("outcome"), {{"pass", Outcome::Pass},
                                                    {"fail", Outcome::Fail},
                                                    {"unanswered", Outcome::Unanswered},
                                                    {"unjudged", Outcome::Unjudged}});
    c.tolerance = optionalNumber(json.at("tolerance"));
    c.value = optionalNumber(json.at("value"));
    c.rounded = optionalNumber(json.at("rounded"));
    if (const Json& decimals = json.at("decimals"); !decimals.is_null()) {
        c.decimals = static_cast<int>(std::clamp<std::int64_t>(whole(decimals), 0, 6));
    }
    c.patches = count(json.at("patches"));
    if (const Json& worst = json.at("worstPatch"); !worst.is_null()) {
        c.worstPatch = count(worst);
    }
    if (const auto found = json.find("found"); found != json.end()) {
        c.found = count(*found);
        c.needed = count(json.at("needed"));
        c.listed = optionalCount(json, "listed").value_or(0);
    }
    return c;
}

Input input(const Json& json) {
    Input input;
    input.path = json.at("path");
    input.kind = json.at("kind");
    if (const auto found = json.find("identity"); found != json.end() && found->is_string()) {
        input.identity = found->get<std::string>();
    }
    for (const char* key : {"description", "originator", "created", "instrumentation", "printing",
                            "illuminant", "observer", "measurementCondition"}) {
        if (const auto found = json.find(key); found != json.end() && found->is_string()) {
            input.statements.emplace_back(key, found->get<std::string>());
        }
    }
    if (json.value("calculatedFromSpectra", false)) {
        input.statements.emplace_back("calculatedFromSpectra", "");
    }
    if (const auto found = json.find("measurementCondition");
        found != json.end() && found->is_string()) {
        input.measurementCondition = *found;
    }
    return input;
}

Statistics statistics(const Json& json) {
    return {number(json.at("mean")), number(json.at("median")), number(json.at("percentile95")),
            number(json.at("maximum")), number(json.at("standardDeviation"))};
}

/// Consumes the rows of the long arrays during parsing, so that the parser drops them.
class Rows {
  public:
    explicit Rows(Result& result) : m_result(result) {}

    bool operator()(int depth, Json::parse_event_t event, Json& parsed) {
        if (event == Json::parse_event_t::key && depth <= 2) {
            (depth == 1 ? m_outer : m_inner) = parsed.get<std::string>();
        }
        if (event != Json::parse_event_t::array_end) {
            return true;
        }
        if (depth == 2 && m_outer == "patches") {
            takePatch(parsed);
        } else if (depth == 3 && m_outer == "unpaired") {
            takeUnpaired(parsed);
        } else {
            return true;
        }
        return false;
    }

    /// Throws if patches have different numbers of device values.
    void check() const {
        if (m_result.device.size() != m_result.channels.size() * m_result.patches.size() ||
            m_uneven) {
            throw std::runtime_error("device values do not match their channels");
        }
        if (m_result.patches.empty()) {
            throw std::runtime_error("no patches");
        }
    }

  private:
    void takePatch(const Json& row) {
        const bool isRelabelled = row.size() > 7; // otherwise, the sheet has the same labels
        m_result.patches.push_back({row.at(0), row.at(1), lab(row.at(3)), lab(row.at(4)),
                                    number(row.at(5)), row.at(isRelabelled ? 6 : 0),
                                    row.at(isRelabelled ? 7 : 1)});
        const Json& device = row.at(2);
        if (m_result.patches.size() == 1) {
            m_channels = device.size();
        }
        m_uneven = m_uneven || device.size() != m_channels;
        for (const Json& value : device) {
            m_result.device.push_back(number(value));
        }
    }

    void takeUnpaired(const Json& row) {
        Unpaired& list = m_inner == "target"        ? m_result.unpairedTarget
                         : m_inner == "measurement" ? m_result.unpairedMeasurement
                                                    : m_result.unpairedPatchSet;
        ++list.count;
        if (list.labels.size() < Result::mostLabels) {
            const std::string id = row.at(0);
            list.labels.push_back(id.empty() ? row.at(1).get<std::string>() : id);
        }
    }

    Result& m_result;
    std::string m_outer;
    std::string m_inner;
    std::size_t m_channels = 0;
    bool m_uneven = false;
};

Tones tones(const Json& json) {
    Tones tones;
    if (const auto method = json.find("method"); method != json.end() && method->is_string()) {
        tones.method = *method;
    }
    tones.aims = json.value("aims", "");
    for (const Json& item : json.at("inks")) {
        InkTones& ink = tones.inks.emplace_back();
        ink.channel = count(item.at("channel"));
        ink.aims = item.value("aims", "");
        for (const Json& step : item.at("steps")) {
            ink.steps.push_back(
                {number(step.at(0)), number(step.at(1)), number(step.at(2)), count(step.at(4))});
        }
    }
    return tones;
}

std::optional<colour::Lab> optionalLab(const Json& json) {
    return json.is_null() ? std::nullopt : std::optional(lab(json));
}

/// What is there only if the preset asks for it.
void fillMeasures(Result& result, const Json& json) {
    if (const auto papers = json.find("papers"); papers != json.end()) {
        result.papers = {papers->at("aims"), papers->at("adjusted"),
                         optionalLab(papers->at("target")), optionalLab(papers->at("measured")),
                         number(papers->at("difference"))};
    }
    if (const auto found = json.find("tones"); found != json.end()) {
        result.tones = tones(*found);
    }
    if (const auto found = json.find("spotTones"); found != json.end()) {
        result.spotTones = tones(*found);
    }
    if (const auto greys = json.find("greys"); greys != json.end()) {
        constexpr double none = std::numeric_limits<double>::quiet_NaN();
        for (const Json& row : greys->at("rows")) {
            const Json& aim = row.at(4);
            result.greys.push_back({count(row.at(0)), number(row.at(1)), lab(row.at(3)),
                                    aim.is_null() ? none : number(aim.at(0)),
                                    aim.is_null() ? none : number(aim.at(1))});
        }
    }
}

void checkFormat(const Json& json) {
    if (!json.is_object() || json.value("format", Json()) != "tintgate-result") {
        throw std::runtime_error("not a result");
    }
    if (json.at("formatVersion") != knownVersion) {
        throw std::runtime_error("a format that this version does not know");
    }
}

void fill(Result& result, const Json& json) {
    result.toolVersion = json.at("tool").at("version");
    result.libraryVersion = json.at("library").at("version");
    result.verdict = oneOf<Verdict>(json.at("verdict"), {{"passed", Verdict::Passed},
                                                         {"failed", Verdict::Failed},
                                                         {"incomplete", Verdict::Incomplete}});
    result.formula = json.at("formula").at("name");
    result.presetName = json.at("preset").at("name");
    const Json& preset = json.at("preset");
    result.presetId = whole(preset.at("id"));
    result.presetCondition = whole(preset.at("illuminationCondition"));
    result.conditionRequired = preset.value("conditionRequired", false);
    result.repeats.averaged = preset.value("repeats", "each") == "mean";
    const Json& inputs = json.at("inputs");
    result.target = input(inputs.at("target"));
    result.measurement = input(inputs.at("measurement"));
    if (!inputs.at("patchSet").is_null()) {
        result.patchSet = input(inputs.at("patchSet"));
    }
    const Json& pairing = json.at("pairing");
    result.selection = pairing.at("selection");
    result.targetBy = pairing.at("target");
    result.measurementBy = pairing.at("measurement");
    if (const auto listed = pairing.find("unpairedTarget"); listed != pairing.end()) {
        result.unpairedTarget.count = count(*listed); // these are not listed
    }
    result.statistics = statistics(json.at("statistics"));
    if (const auto repeats = json.find("repeats"); repeats != json.end()) {
        result.repeats.patches = count(repeats->at("patches"));
        result.repeats.readings = count(repeats->at("readings"));
        result.repeats.largestDistance = optionalNumber(repeats->at("largestDistance"));
        result.repeats.worstPatch = optionalCount(*repeats, "worstPatch");
        if (const auto each = repeats->find("each"); each != repeats->end()) {
            for (const Json& row : *each) {
                result.repeats.each.push_back(
                    {count(row.at(0)), count(row.at(1)), number(row.at(2)), number(row.at(3))});
            }
        }
    }
    fillMeasures(result, json);
    for (const Json& item : json.at("criteria")) {
        result.criteria.push_back(criterion(item));
    }
    for (const Json& item : json.at("warnings")) {
        result.warnings.push_back(
            {item.at("text"), item.value("keepsOpen", false), item.value("code", "")});
    }
    for (const Json& item : json.at("deviceChannels")) {
        result.channels.push_back(item);
    }
}

void checkWorstPatches(const Result& result) {
    for (const Criterion& c : result.criteria) {
        if (c.worstPatch && *c.worstPatch >= result.patches.size()) {
            throw std::runtime_error("a criterion names a patch that is not there");
        }
    }
    if (result.repeats.worstPatch && *result.repeats.worstPatch >= result.patches.size()) {
        throw std::runtime_error("the repeats name a patch that is not there");
    }
    const auto check = [&](std::size_t patch) {
        if (patch >= result.patches.size()) {
            throw std::runtime_error("a measure names a patch that is not there");
        }
    };
    for (const RepeatedPatch& repeated : result.repeats.each) {
        check(repeated.patch);
    }
    for (const Grey& grey : result.greys) {
        check(grey.patch);
    }
    for (const auto* tones : {&result.tones, &result.spotTones}) {
        for (const InkTones& ink : tones->has_value() ? (*tones)->inks : std::vector<InkTones>()) {
            if (ink.channel >= result.channels.size()) {
                throw std::runtime_error("tone values of an ink that is not there");
            }
            for (const ToneStep& step : ink.steps) {
                check(step.patch);
            }
        }
    }
}

} // namespace

std::optional<Result> readResult(std::string_view text, std::string& problem) {
    try {
        Result result;
        Rows rows(result);
        const Json json = Json::parse(text, std::ref(rows));
        checkFormat(json);
        fill(result, json);
        rows.check();
        checkWorstPatches(result);
        return result;
    } catch (const std::exception& failure) {
        problem = failure.what();
        return std::nullopt;
    }
}

} // namespace report
