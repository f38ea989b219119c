// SPDX-License-Identifier: Apache-2.0
#include "analysis/MetaJson.h"

#include <ctime>

#include <nlohmann/json.hpp>

#include "analysis/Version.h"
#include "base/WideBytes.h"
#include "colour/Difference.h"

namespace analysis {
namespace {

using Json = nlohmann::ordered_json;

/// A missing text is null, so that a page needs only one test.
Json optional(const wxString& text) {
    return text.empty() ? Json() : Json(base::utf8FromWide(text.ToStdWstring()));
}

/// Local time with its offset from UTC: 2024-05-01T12:34:56+02:00.
std::string now() {
    const std::time_t seconds = std::time(nullptr);
    std::tm local{};
    localtime_r(&seconds, &local);
    char text[40];
    std::strftime(text, sizeof text, "%Y-%m-%dT%H:%M:%S%z", &local);
    std::string stamp = text;
    return stamp.insert(stamp.size() - 2, ":");
}

/// A file in the job's folder, which contains the texts of a run.
Json inFolder(const wxString& folder, const char* name) {
    return folder.empty() ? Json() : Json(base::utf8FromWide(folder.ToStdWstring()) + "/" + name);
}

Json jobOf(const KZJobDataStruct& job) {
    return {{"id", job.jobID},
            {"title", optional(job.title)},
            {"type", job.jobType},
            {"parentId", job.parentID > 0 ? Json(job.parentID) : Json()},
            {"strip", job.secondStrip != 0 ? 2 : 1},
            {"dynamicStrip", job.useDynstrip == 1},
            {"nestedStrip", job.nestedStrip == 1},
            {"inline", job.inlineVerifyJob == 1},
            {"measurements", job.measurementStatus},
            {"psdAssessment", optional(job.psdAssessment)}};
}

Json presetOf(const KZJobDataStruct& job) {
    const tolerancePresetParameterRecord& preset = job.tolerance;
    return {{"id", job.presetID},
            {"name", optional(preset.name)},
            {"psd", preset.fograPSDPreset > 0},
            {"formula", colour::formulaName(colour::formulaFromNumber(preset.deltaEMode))},
            {"illuminationCondition", preset.illuminationCondition}};
}

Json filesOf(const KZJobDataStruct& job) {
    return {{"folder", optional(job.tempDir)},
            {"result", inFolder(job.tempDir, "output.json")},
            {"meta", inFolder(job.tempDir, "meta.json")},
            {"reference", optional(job.referenceFile)},
            {"measurement", optional(job.sampleFile)},
            {"controlStrip", optional(job.controlStripFile)},
            {"dynamicStrip", optional(job.dynstripFile)},
            {"preset", optional(job.tolerance.filePath)},
            {"jdf", optional(job.jdfLocalFile)},
            {"jdfOnServer", optional(job.jdfServerFile)}};
}

} // namespace

std::wstring metaJson(const KZJobDataStruct& job) {
    const Json meta = {
        {"format", "tintgate-meta"},
        {"formatVersion", 1},
        {"tool", {{"name", "Tintgate"}, {"version", toolVersion}}},
        {"library", {{"name", "libTintgate"}, {"version", libraryVersion}}},
        {"created", now()},
        {"language", optional(job.language)},
        {"job", jobOf(job)},
        {"instrument", {{"id", job.deviceID}, {"name", optional(job.instrumentName)}}},
        {"illuminationMode", job.illuminationMode},
        {"preset", presetOf(job)},
        {"paper", optional(job.paperName)},
        {"workflow",
         {{"name", optional(job.workflowName)}, {"measurement", job.measurementWorkflow}}},
        {"server",
         {{"host", optional(job.serverHost)},
          {"name", optional(job.serverName)},
          {"user", optional(job.userName)}}},
        {"files", filesOf(job)},
    };
    const std::string text = meta.dump(2, ' ', true, Json::error_handler_t::replace) + '\n';
    return std::wstring(text.begin(), text.end());
}

} // namespace analysis
