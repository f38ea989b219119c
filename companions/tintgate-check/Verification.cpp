// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-check/Verification.h"

#include <algorithm>
#include <filesystem>
#include <functional>
#include <new>
#include <utility>

#include "ExitCodes.h"
#include "analysis/Judgement.h"
#include "analysis/ResultJson.h"
#include "base/WideBytes.h"
#include "companions/tintgate-check/Words.h"
#include "report/Model.h"
#include "report/Page.h"

namespace check {
namespace {

namespace fs = std::filesystem;

Fate fateOf(analysis::Verdict verdict) {
    switch (verdict) {
    case analysis::Verdict::Passed:
        return Fate::Passed;
    case analysis::Verdict::Failed:
        return Fate::Failed;
    case analysis::Verdict::Incomplete:
        break;
    }
    return Fate::Incomplete;
}

/// The used criterion that a line names: the furthest above its tolerance, otherwise one without an
/// answer, otherwise the nearest to its tolerance. Null if none is used.
const analysis::Finding* decisive(const std::vector<analysis::Finding>& findings) {
    const auto weight = [](const analysis::Finding& finding) {
        const double share = finding.tolerance > 0 ? finding.rounded / finding.tolerance
                                                   : (finding.rounded > 0 ? 1e9 : 0);
        return !finding.answered ? std::pair(1, 0.0) : std::pair(finding.passed ? 0 : 2, share);
    };
    const analysis::Finding* found = nullptr;
    for (const analysis::Finding& finding : findings) {
        if (finding.used && (found == nullptr || weight(finding) > weight(*found))) {
            found = &finding;
        }
    }
    return found;
}

void describe(const analysis::Comparison& comparison, const analysis::Judgement& judgement,
              Outcome& outcome) {
    const analysis::Finding* const finding = decisive(judgement.findings);
    if (finding == nullptr) {
        return;
    }
    report::Criterion named;
    named.name = finding->criterion->name;
    named.title = finding->criterion->title;
    outcome.criterion = report::titleOf(named, texts());
    if (!finding->answered) {
        outcome.figures = finding->found == 0
                              ? say(Say::NoSuchPatches)
                              : std::to_string(finding->found) + " " + say(Say::Of) + " " +
                                    say(Say::PatchesMeasured, {std::to_string(finding->needed)});
        return;
    }
    report::Criterion criterion;
    criterion.unit = analysis::unit(finding->criterion->quantity);
    outcome.figures = texts().number(finding->rounded, finding->decimals) + " " + say(Say::Of) +
                      " " + texts().number(finding->tolerance, finding->decimals) + " " +
                      report::unitOf(criterion, colour::formulaName(comparison.formula));
}

/// The texts of the boundary are ASCII.
std::string narrow(const std::wstring& ascii) {
    return {ascii.begin(), ascii.end()};
}

void nullable(analysis::JsonWriter& json, std::string_view name, const std::string& text) {
    json.key(name);
    if (text.empty()) {
        json.null();
    } else {
        json.text(text);
    }
}

void writeError(analysis::JsonWriter& json, const std::optional<Problem>& problem) {
    json.key("error");
    if (!problem) {
        return json.null();
    }
    json.beginObject();
    json.member("code", std::int64_t{problem->code});
    json.member("meaning", problem->what);
    nullable(json, "cause", problem->cause);
    nullable(json, "remedy", problem->remedy);
    json.endObject();
}

/// `findings` writes the members of the verdict.
std::string jsonLine(const Aim& aim, const Outcome& outcome,
                     const std::function<void(analysis::JsonWriter&)>& findings) {
    constexpr std::size_t usualSize = 8192;
    analysis::JsonWriter json(usualSize);
    json.beginCompactObject();
    json.member("file", base::utf8FromWide(base::wideFromBytes(outcome.measurement.path)));
    nullable(json, "condition", aim.condition);
    writeError(json, outcome.problem);
    json.key("written");
    json.beginArray();
    for (const std::string& path : outcome.written) {
        json.text(base::utf8FromWide(base::wideFromBytes(path)));
    }
    json.endArray();
    if (findings) {
        findings(json);
    } else {
        json.key("verdict");
        json.null();
        json.member("passed", false);
    }
    json.endObject();
    json.endLine();
    return narrow(json.finish());
}

/// What the files themselves say about a comparison that could not be made.
Problem problemOfComparison(int code, const Aim& aim, const analysis::SharedFile& measurement,
                            const std::string& path) {
    Problem problem = problemOfFile(code, path);
    const auto& target = aim.references.target.set;
    if (code == exitNothingToPair && target && measurement.set) {
        const bool isRgb = measurement.set->deviceSpace == colour::DeviceSpace::Rgb &&
                           target->deviceSpace == colour::DeviceSpace::Cmyk;
        problem.what = say(isRgb ? Say::RgbMeasurement : Say::OtherChart);
        problem.remedy = say(isRgb ? Say::RgbMeasurementRemedy : Say::OtherChartRemedy);
    } else if (code == exitNoDeviceValues) {
        const bool areProfiles = !target && measurement.profile != nullptr;
        problem.what = say(areProfiles ? Say::BothProfiles : Say::NoCmyk);
        problem.cause.clear();
        problem.remedy = say(areProfiles ? Say::BothProfilesRemedy : Say::NoCmykRemedy);
    }
    return problem;
}

/// What the condition says of the print, for its page.
report::Facts factsOf(const Aim& aim) {
    report::Facts facts;
    for (const auto& [label, text] :
         {std::pair(Say::FactCondition, aim.condition), std::pair(Say::FactPrinter, aim.printer),
          std::pair(Say::FactPaper, aim.paper)}) {
        if (!text.empty()) {
            facts.emplace_back(sayOnPage(label), text);
        }
    }
    return facts;
}

/// A folder that the walk hands out: nothing in it could be taken.
Problem problemOfFolder(const std::string& path) {
    std::error_code failure;
    const fs::directory_iterator readable(path, failure);
    if (failure) {
        return {exitInputUnreadable,
                say(Say::FolderUnreadable, {failure.message()}),
                {},
                say(Say::FolderUnreadableRemedy)};
    }
    return {exitInputMissing,
            say(Say::FolderEmpty),
            {},
            say(Say::FolderEmptyRemedy, {measurementEndings()})};
}

class Verifier {
  public:
    Verifier(const Aim& aim, const Measurement& measurement, Outputs& outputs, const Wanted& wanted,
             std::string mark)
        : m_aim(aim), m_outputs(outputs), m_wanted(wanted), m_mark(std::move(mark)) {
        m_outcome.measurement = measurement;
    }

    template<class Read>
    Outcome run(Read read) {
        std::function<void(analysis::JsonWriter&)> findings;
        analysis::Comparison comparison;
        analysis::Judgement judgement;
        analysis::SharedFile file;
        try {
            if (const int code = read(file)) {
                m_outcome.problem = problemOfFile(code, path());
            } else if (compare(std::move(file), comparison)) {
                judgement = analysis::judge(comparison, m_aim.preset, m_aim.options);
                m_outcome.fate = fateOf(judgement.verdict);
                describe(comparison, judgement, m_outcome);
                writeOutputs(comparison, judgement);
                findings = [&](analysis::JsonWriter& json) {
                    analysis::writeFindings(json, comparison, judgement, m_aim.preset,
                                            m_aim.options);
                };
            }
            return finished(findings);
        } catch (const std::bad_alloc&) {
            m_outcome.problem = problemOf(exitOutOfMemory);
        } catch (const std::exception&) {
            m_outcome.problem = problemOf(exitInternalFailure);
        }
        m_outcome.fate = Fate::NotDone;
        return finished({});
    }

    /// Of a measurement that nothing was read of.
    Outcome refuse(Problem problem) {
        m_outcome.problem = std::move(problem);
        return finished({});
    }

  private:
    Outcome finished(const std::function<void(analysis::JsonWriter&)>& findings) {
        if (m_wanted.json) {
            m_outcome.json = jsonLine(m_aim, m_outcome, findings);
        }
        return std::move(m_outcome);
    }

    const std::string& path() const { return m_outcome.measurement.path; }

    bool compare(analysis::SharedFile file, analysis::Comparison& comparison) {
        const std::wstring wide = base::wideFromBytes(path());
        const analysis::SharedFile kept = file;
        if (const int code = analysis::compare(m_aim.references, wide, std::move(file), m_aim.wants,
                                               comparison)) {
            m_outcome.problem = problemOfComparison(code, m_aim, kept, path());
            return false;
        }
        if (analysis::isSameFile(m_aim.references.targetPath, wide)) {
            analysis::warnOfSameFile(comparison);
        }
        return true;
    }

    /// The result comes last: if it is there, all outputs are.
    void writeOutputs(const analysis::Comparison& comparison,
                      const analysis::Judgement& judgement) {
        const LabelWanted& labels = m_outputs.labels();
        if (!m_outputs.wantsPage() && !m_outputs.wantsResult() && !m_wanted.result &&
            !labels.isAny()) {
            return;
        }
        const std::string json =
            narrow(analysis::resultJson(comparison, judgement, m_aim.preset, m_aim.options));
        if (m_outputs.wantsPage() || m_wanted.result || labels.isAny()) {
            std::string problem;
            auto result = report::readResult(json, problem);
            if (!result) {
                throw std::runtime_error(problem);
            }
            const auto made = shown(*result, json);
            if (m_wanted.result) {
                m_outcome.result = std::make_shared<report::Result>(std::move(*result));
            }
            for (const auto& [output, bytes] : made) {
                if (!write(output, bytes)) {
                    return;
                }
            }
            if (m_outcome.problem) {
                return;
            }
        }
        if (m_outputs.wantsResult()) {
            write(Output::Result, json);
        }
    }

    /// The outputs that show a result: page, label and certificate. What can't be drawn is missing,
    /// and the outcome has a problem then.
    std::vector<std::pair<Output, std::string>> shown(const report::Result& result,
                                                      const std::string& json) {
        std::vector<std::pair<Output, std::string>> made;
        if (m_outputs.wantsPage()) {
            made.emplace_back(Output::Page,
                              report::pageOf(result, nullptr, texts(), factsOf(m_aim)));
        }
        try {
            const LabelWanted& labels = m_outputs.labels();
            if (labels.format) {
                made.emplace_back(Output::Label, drawnLabel(labels, m_aim, result, json));
            }
            if (labels.certificate) {
                made.emplace_back(Output::Certificate,
                                  drawnCertificate(labels, m_aim, result, json));
            }
        } catch (const label::CannotDraw& failure) {
            m_outcome.problem = Problem{exitResultNotWritten,
                                        say(Say::LabelNotDrawn, {failure.what()}),
                                        {},
                                        say(Say::LabelNotDrawnRemedy)};
        }
        return made;
    }

    bool write(Output output, std::string_view text) {
        m_outcome.problem = m_outputs.write(m_outcome.measurement, output, text, m_mark);
        if (m_outcome.problem) {
            return false;
        }
        m_outcome.written.push_back(m_outputs.pathOf(m_outcome.measurement, output, m_mark));
        return true;
    }

    const Aim& m_aim;
    Outputs& m_outputs;
    const Wanted& m_wanted;
    const std::string m_mark;
    Outcome m_outcome;
};

} // namespace

Status Outcome::status() const {
    if (problem) {
        return Status::NotDone;
    }
    switch (fate) {
    case Fate::Passed:
        return Status::Passed;
    case Fate::Failed:
        return Status::Failed;
    case Fate::Incomplete:
        return Status::Incomplete;
    case Fate::NotDone:
        break;
    }
    return Status::NotDone;
}

Outcome verify(const Aim& aim, const Measurement& measurement, Outputs& outputs,
               const Wanted& wanted) {
    Verifier verifier(aim, measurement, outputs, wanted, {});
    std::error_code ignored;
    if (measurement.inFolder && fs::is_directory(measurement.path, ignored)) {
        return verifier.refuse(problemOfFolder(measurement.path));
    }
    return verifier.run([&](analysis::SharedFile& file) {
        return analysis::loadSide(base::wideFromBytes(measurement.path),
                                  analysis::measurementWants(aim.wants, aim.measurementCondition),
                                  file);
    });
}

Outcome verifyBytes(const Aim& aim, const Measurement& measurement, std::string_view bytes,
                    Outputs& outputs, const Wanted& wanted, const std::string& mark) {
    return Verifier(aim, measurement, outputs, wanted, mark).run([&](analysis::SharedFile& file) {
        return analysis::readSide(
            bytes, analysis::measurementWants(aim.wants, aim.measurementCondition), file);
    });
}

Outcome refuse(const Aim& aim, const Measurement& measurement, int code, const Wanted& wanted) {
    Outcome outcome;
    outcome.measurement = measurement;
    outcome.problem = problemOfFile(code, measurement.path);
    if (wanted.json) {
        outcome.json = jsonLine(aim, outcome, {});
    }
    return outcome;
}

std::string brokenJson(const Aim& aim, const Outcome& outcome, const std::string& mark) {
    constexpr std::size_t usualSize = 1024;
    analysis::JsonWriter json(usualSize);
    json.beginObject();
    json.member("format", "tintgate-error");
    json.member("formatVersion", std::int64_t{1});
    json.member("file", base::utf8FromWide(base::wideFromBytes(outcome.measurement.path)));
    json.member("sha256", mark);
    nullable(json, "condition", aim.condition);
    writeError(json, outcome.problem);
    json.endObject();
    json.endLine();
    return narrow(json.finish());
}

} // namespace check
