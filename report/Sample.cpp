// SPDX-License-Identifier: Apache-2.0
#include "report/Sample.h"

#include <cmath>
#include <iterator>

namespace report {
namespace {

constexpr const char* inkCriteria[inkCount] = {"paperWhite", "solidCyan", "solidMagenta",
                                               "solidYellow", "solidBlack"};

constexpr double deviceTolerance = 0.5;

bool near(double value, double wanted) {
    return std::abs(value - wanted) <= deviceTolerance;
}

void addInks(Sample& sample, const Result& result) {
    const std::size_t channels = result.channels.size();
    InkMeans measured;
    InkMeans aimed;
    for (std::size_t i = 0; i < result.patches.size(); ++i) {
        if (const auto ink = inkOf(result.device.data() + i * channels, channels)) {
            measured.add(*ink, result.patches[i].measured);
            aimed.add(*ink, result.patches[i].target);
        }
    }
    sample.inks = measured.means();
    sample.aims = aimed.means();
    // Adjusted aims make both papers one, and relative colours lose theirs.
    if (result.papers && result.papers->adjusted) {
        sample.inks[static_cast<std::size_t>(Ink::Paper)] = result.papers->measured;
        sample.aims[static_cast<std::size_t>(Ink::Paper)] = result.papers->target;
    }
}

/// The tone value at 50 percent of each process ink that has this tint.
void addToneValues(Sample& sample, const Tones& tones) {
    constexpr double half = 50;
    constexpr const char* names[] = {"Cyan", "Magenta", "Yellow", "Black"};
    for (const InkTones& ink : tones.inks) {
        for (const ToneStep& step : ink.steps) {
            if (ink.channel >= std::size(names) || !near(step.nominal, half)) {
                continue;
            }
            const std::string name = names[ink.channel];
            Criterion figure;
            figure.name = toneAtHalf + name;
            figure.title = "Tone value at 50 %, " + name;
            figure.unit = "TV";
            figure.value = step.measured;
            figure.patches = 1;
            sample.criteria.push_back(figure);
            break;
        }
    }
}

std::string statementOf(const Input& input, const char* wanted) {
    for (const auto& [key, text] : input.statements) {
        if (key == wanted) {
            return text;
        }
    }
    return {};
}

std::string fileName(const std::string& path) {
    return path.substr(path.rfind('/') + 1);
}

} // namespace

const char* inkCriterion(Ink ink) {
    return inkCriteria[static_cast<std::size_t>(ink)];
}

std::optional<Ink> inkOf(const double* device, std::size_t channels) {
    if (channels < 4) {
        return std::nullopt;
    }
    std::optional<std::size_t> full;
    for (std::size_t i = 0; i < channels; ++i) {
        if (near(device[i], 0)) {
            continue;
        }
        if (full || i >= 4 || !near(device[i], 100)) {
            return std::nullopt;
        }
        full = i;
    }
    return full ? allInks[*full + 1] : Ink::Paper;
}

void InkMeans::add(Ink ink, const colour::Lab& lab) {
    if (!std::isfinite(lab.L) || !std::isfinite(lab.a) || !std::isfinite(lab.b)) {
        return;
    }
    Sum& sum = m_sums[static_cast<std::size_t>(ink)];
    sum.lab = {sum.lab.L + lab.L, sum.lab.a + lab.a, sum.lab.b + lab.b};
    ++sum.count;
}

InkColours InkMeans::means() const {
    InkColours means;
    for (std::size_t i = 0; i < inkCount; ++i) {
        const auto& [lab, count] = m_sums[i];
        const auto n = static_cast<double>(count);
        if (count != 0) {
            means[i] = colour::Lab{lab.L / n, lab.a / n, lab.b / n};
        }
    }
    return means;
}

Sample sampleOf(const Result& result, const Meta* meta) {
    Sample sample;
    sample.title = fileName(result.measurement.path);
    sample.instrument = statementOf(result.measurement, "instrumentation");
    sample.printer = statementOf(result.measurement, "printing");
    sample.target = fileName(result.target.path);
    sample.targetKey = result.target.identity;
    if (sample.targetKey.empty()) {
        sample.targetKey = sample.target + '\n' + statementOf(result.target, "description");
    }
    if (meta != nullptr) {
        sample.title = meta->title;
        sample.jobId = meta->jobId;
        sample.strip = meta->strip;
        sample.paper = meta->paper;
        sample.workflow = meta->workflow;
        if (!meta->instrument.empty()) {
            sample.instrument = meta->instrument;
        }
    }
    sample.preset = result.presetName;
    sample.presetId = result.presetId;
    sample.formula = result.formula;
    sample.verdict = result.verdict;
    sample.criteria = result.criteria;
    if (result.tones) {
        addToneValues(sample, *result.tones);
    }
    // RGB and the like have channels that are no process inks.
    if (result.channels.size() >= 4 && result.channels[0].ends_with("C") &&
        result.channels[3].ends_with("K")) {
        addInks(sample, result);
    }
    return sample;
}

} // namespace report
