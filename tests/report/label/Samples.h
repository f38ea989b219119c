// SPDX-License-Identifier: Apache-2.0
// Results and jobs for labels, of random and of hostile content.
#pragma once

#include <random>
#include <string>
#include <vector>

#include "report/Meta.h"
#include "report/Result.h"
#include "report/label/Label.h"

/// What titles, papers and the like may contain. All of it must end up on a label in some way.
inline const std::vector<std::string>& hostileTexts() {
    static const std::vector<std::string> texts = {
        "",
        "proof.txt",
        "Größenangabe für Übergänge & Ränder <b>",
        "Donaudampfschifffahrtsgesellschaftskapitänsmützenabzeichenprüfdruck_Seite_1_bis_64.pdf",
        "プルーフ用紙 二三五 グラム、半光沢",
        "印刷色彩校样：涂布纸，第三版",
        "إثبات الألوان 235 غم",
        "הגהת צבע",
        "\xFF\xFE broken \xC3 bytes\n\tand\x01 controls",
        "\xE2\x80\xAE"
        "DESSAP si siht",
        std::string(3000, 'W'),
        "a b " + std::string(120, '|'),
        "Q\xCC\x84\xCC\x81\xCC\xA7 stacked accents \xE1\xBB\x97\xE1\xBA\xAD",
        "한국어 교정쇄 🖨 ✓",
    };
    return texts;
}

inline report::Meta jobOf(const std::string& title, const std::string& instrument,
                          const std::string& paper, const std::string& workflow,
                          const std::string& user) {
    report::Meta meta;
    meta.created = "2024-05-01T12:34:56+02:00";
    meta.jobId = 4711;
    meta.strip = 2;
    meta.title = title;
    meta.instrument = instrument;
    meta.paper = paper;
    meta.workflow = workflow;
    meta.user = user;
    return meta;
}

struct LabelSample {
    report::Result result;
    report::Meta meta;
    bool hasMeta = false;
    label::Details details;

    label::Subject subject() const {
        label::Subject subject{result, label::hashOf("result"), hasMeta ? &meta : nullptr};
        subject.date = "2026-11-25T09:15";
        subject.kindOfDate = label::DateKind::Measured;
        subject.details = details;
        return subject;
    }
};

class LabelSamples {
  public:
    explicit LabelSamples(unsigned seed) : m_random(seed) {}

    LabelSample next(std::size_t mostCriteria = 20, std::size_t mostPatches = 40) {
        LabelSample sample;
        report::Result& result = sample.result;
        result.toolVersion = "1.6.20";
        result.formula = one<std::string>({"CIE2000", "CIE76", "CIECMC_2_1"});
        result.verdict = one<report::Verdict>(
            {report::Verdict::Passed, report::Verdict::Failed, report::Verdict::Incomplete});
        result.presetName = text();
        result.target.path = "/t/" + text();
        result.target.kind = one<std::string>({"text", "profile"});
        result.target.statements = {{"description", text()}};
        result.measurement.path = "/m/" + text();
        result.measurement.measurementCondition = one<std::string>({"", "M0", "M1"});
        result.measurement.statements = {{"instrumentation", text()}, {"printing", text()}};
        result.channels = {"CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K"};
        addPatches(result, 1 + upTo(mostPatches - 1));
        addCriteria(result, upTo(mostCriteria));
        if (upTo(1) == 1) {
            addTones(result);
        }
        for (std::size_t i = upTo(3); i > 0; --i) {
            result.warnings.push_back({text(), upTo(1) == 1});
        }
        sample.hasMeta = upTo(1) == 1;
        sample.meta = jobOf(text(), text(), text(), text(), text());
        for (std::size_t i = 0; i < label::fieldCount; ++i) {
            if (upTo(2) == 0) {
                sample.details[static_cast<label::Field>(i)] = text();
            }
        }
        return sample;
    }

  private:
    std::size_t upTo(std::size_t most) {
        return std::uniform_int_distribution<std::size_t>(0, most)(m_random);
    }
    double number(double most) { return std::uniform_real_distribution<>(0, most)(m_random); }
    template<class Value>
    Value one(const std::vector<Value>& values) {
        return values[upTo(values.size() - 1)];
    }
    std::string text() { return one(hostileTexts()); }

    void addPatches(report::Result& result, std::size_t count) {
        for (std::size_t i = 0; i < count; ++i) {
            const colour::Lab target = {number(100), number(160) - 80, number(160) - 80};
            const colour::Lab measured = {target.L + number(4), target.a - number(4), target.b};
            result.patches.push_back({upTo(3) == 0 ? text() : "A" + std::to_string(i), "", target,
                                      measured, number(6), text(), ""});
            for (int channel = 0; channel < 4; ++channel) {
                result.device.push_back(static_cast<double>(upTo(100)));
            }
        }
        result.statistics = {2.5, 2, 5, 6, 1};
    }

    void addTones(report::Result& result) {
        report::Tones& tones = result.tones.emplace();
        tones.method = "density";
        for (std::size_t channel = 0; channel < 1 + upTo(3); ++channel) {
            report::InkTones& ink = tones.inks.emplace_back();
            ink.channel = channel;
            ink.aims = "target";
            for (double nominal = 10; nominal < 100; nominal += 10) {
                ink.steps.push_back({nominal, nominal + number(40) - 10, nominal + 12,
                                     upTo(result.patches.size() - 1)});
            }
        }
    }

    void addCriteria(report::Result& result, std::size_t count) {
        for (std::size_t i = 0; i < count; ++i) {
            report::Criterion criterion;
            criterion.name = "criterion" + std::to_string(i);
            criterion.title = one<std::string>({"Solid cyan", "All patches, 95th percentile",
                                                "CMY greys, average chromaticness difference",
                                                "タイプ別の平均色差（グレーバランス）"});
            criterion.unit = one<std::string>({"dE", "dE", "dCh", "dH"});
            criterion.used = upTo(4) != 0;
            criterion.outcome = one<report::Outcome>(
                {report::Outcome::Pass, report::Outcome::Fail, report::Outcome::Unanswered});
            criterion.tolerance = one<double>({3, 2.5, 0, 12.125});
            if (criterion.outcome != report::Outcome::Unanswered) {
                criterion.value = number(9);
                criterion.rounded = criterion.value;
                criterion.worstPatch = upTo(result.patches.size() - 1);
            }
            result.criteria.push_back(criterion);
        }
    }

    std::mt19937 m_random;
};
