// SPDX-License-Identifier: Apache-2.0
#include "companions/diagnosis/ValueRules.h"

#include <algorithm>
#include <fstream>
#include <optional>
#include <string>
#include <utility>

#include "ExitCodes.h"
#include "companions/diagnosis/KeyRules.h"
#include "companions/diagnosis/Words.h"
#include "jobkeys/JobState.h"
#include "jobkeys/Lookups.h"
#include "jobkeys/PatchArrays.h"

namespace diagnosis {

namespace {

/// The keys of one job, and the findings on their values.
class Values {
  public:
    explicit Values(const Examined& run)
        : m_run(run), m_strip(jobkeys::stripOf(run.job.secondStrip)) {}

    void judgeReferences();
    void judgePatches();
    void judgeComparison();
    void judgeRoad();
    void judgeInstrument();

    std::vector<Finding> findings;

  private:
    std::optional<int> numberOf(const std::string& key) const {
        return numberIn(findKey(m_run.server.keys(), jobType, m_run.job.jobID, key));
    }
    bool isDynamic() const { return jobkeys::isDynamic(m_strip, m_run.job.useDynstrip); }

    void add(const std::string& key, std::string text, std::vector<int> codes = {},
             bool spoilsResult = false) {
        findings.push_back({ticketName(jobType, m_run.job.jobID) + " " + key, std::move(text),
                            std::move(codes), spoilsResult});
    }

    const Examined& m_run;
    const Strip m_strip;
};

void Values::judgeReferences() {
    const std::string key = stripKey(m_strip, "Workflow/Verify/MeasurementWorkflow");
    const std::optional<int> workflow = numberOf(key);
    const bool isPackaging = numberOf("Job/FromEsko") == 1 && workflow == 4;
    if (workflow && (*workflow < 1 || *workflow > 3) && !isDynamic() && !isPackaging) {
        add(key,
            "is " + std::to_string(*workflow) +
                ". References require 1 (profile), 2 (characterization data), 3 (ticket or "
                "profile), or 4 if Job/FromEsko is 1. Without references, the preset is not "
                "loaded.",
            {exitPresetFailed});
    }
}

void Values::judgePatches() {
    for (const char* name : {"Reference/Numpatches", "Numpatches"}) {
        const std::string key = measurementKey(m_strip, name);
        const std::optional<int> patches = numberOf(key);
        if (patches && *patches > jobkeys::mostPatches) {
            add(key,
                "is " + std::to_string(*patches) + ". More than 1,000,000 patches are not loaded.",
                {exitPresetFailed, exitSampleMissing});
        }
    }
    const std::string key = measurementKey(m_strip, "SpectralValues/Length");
    const std::optional<int> length = numberOf(key);
    if (length && (*length < 0 || *length > spectralValueCount)) {
        add(key, "is " + std::to_string(*length) +
                     ", not 0 to 36. The measurement counts as one without spectra.");
    }
}

void Values::judgeComparison() {
    const std::string formulaKey = stripKey(m_strip, "Workflow/Verify/DeltaEMode");
    const std::optional<int> formula = numberOf(formulaKey);
    if (formula && *formula != 0 && (*formula < 2 || *formula > 5)) {
        add(formulaKey,
            "is " + std::to_string(*formula) +
                ", which counts as CIE76. The formulas are 0, 2, 3, 4 and 5.",
            {}, true);
    }
    const std::string presetKey = stripKey(m_strip, "Workflow/Verify/ComparisonMethod");
    const std::optional<int> preset = numberOf(presetKey);
    if (preset && (!TICKET_ID_Valid(*preset) || !m_run.engine.exists(presetType, *preset))) {
        add(presetKey,
            "is " + std::to_string(*preset) + ", but there is no ticket " +
                ticketName(presetType, *preset) + ".",
            {exitPresetFailed});
    }
}

/// Values that make a run do something else than a person may expect.
void Values::judgeRoad() {
    if (m_strip == Strip::Second &&
        numberOf(jobkeys::verifyActiveKey) != jobkeys::activeForTwoStrips) {
        add("Workflow/Verify/Active",
            "is not 3: the job counts as one with a single strip, and a run on the second strip "
            "closes it.");
    }
    const std::string patches = measurementKey(m_strip, "Numpatches");
    if (m_run.measures && !m_run.remeasure && m_run.job.measurementStatus < 1 &&
        m_run.engine.key(jobType, m_run.job.jobID, patches) != nullptr) {
        add(measurementKey(m_strip, "Status"),
            "is missing or 0, so the job is measured although the ticket has " + patches + ".");
    }
}

/// The number of the instrument is read from the strip's file. It is 0 if it can't be read.
void Values::judgeInstrument() {
    const KZJobDataStruct& job = m_run.job;
    if (job.deviceID != 0 || job.controlStripFile.empty() || isDynamic()) {
        return;
    }
    std::ifstream strip(bytesOf(job.controlStripFile));
    std::string line;
    while (std::getline(strip, line) && line.find("DEVICE") == std::string::npos) {
        line.clear();
    }
    line.resize(std::min(line.find('\r'), line.size()));
    const bool isInline = job.inlineVerifyJob == 1;
    findings.push_back(
        {.where = "control strip " + fileName(bytesOf(job.controlStripFile)),
         .text = "The instrument number reads as 0: " +
                 (line.empty() ? "no line contains the word DEVICE."
                               : "the first line with the word DEVICE is \"" + line +
                                     "\", but must be the word, one blank and a number.") +
                 (isInline ? " With sub type 96, such a job counts as measured by an inline "
                             "instrument: it is compared and never measured."
                           : ""),
         .codes = isInline ? std::vector<int>{exitStoredDataFailed, exitSampleMissing}
                           : std::vector<int>{}});
}

} // namespace

std::vector<Finding> judgeValues(const Examined& run) {
    Values values(run);
    values.judgeReferences();
    values.judgePatches();
    values.judgeComparison();
    values.judgeRoad();
    values.judgeInstrument();
    return std::move(values.findings);
}

} // namespace diagnosis
