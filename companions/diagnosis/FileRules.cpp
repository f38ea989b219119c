// SPDX-License-Identifier: Apache-2.0
#include "companions/diagnosis/FileRules.h"

#include <algorithm>
#include <map>
#include <string>
#include <string_view>

#include "ExitCodes.h"
#include "companions/diagnosis/Words.h"

namespace diagnosis {

namespace {

/// File names that the tool itself uses in a job's folder, and the effect on a job's own file.
struct ReservedName {
    const char* name;
    std::vector<int> codes;
    bool spoilsResult;
    const char* consequence;
};

const std::vector<ReservedName>& reservedNames() {
    static const std::vector<ReservedName> all = {
        {"Measured sample.txt",
         {exitReferenceMissing, exitTargetIsMeasurement, exitSampleMissing},
         true,
         "The measurement is written to this name and would be compared with itself."},
        {"Measured reference.txt",
         {},
         false,
         "References from the ticket are written to this name and replace the file."},
        {"NMPatchSetDefinition.it8",
         {exitReferenceMissing, exitMeasuringFailed},
         false,
         "The definition for the measuring tool has this name; it replaces the file and is removed "
         "after the measurement."},
        {"NMPatchSetDefinition.dcf",
         {exitReferenceMissing},
         false,
         "A definition for the measuring tool has this name and replaces the file."},
        {"output.json", {}, false, "The result is written to this name and replaces the file."},
        {"meta.json", {}, false, "The meta file is written to this name and replaces the file."},
    };
    return all;
}

/// Whether the load had read this key when it requested the file.
bool isAfter(const ReadOnlyServer& server, const AskedFile& file, const std::string& key) {
    const auto& keys = server.keys();
    return std::any_of(keys.begin(), keys.begin() + static_cast<std::ptrdiff_t>(file.asked),
                       [&](const AskedKey& asked) { return asked.key == key; });
}

/// The purpose of a file.
struct Role {
    const char* key; ///< The key that names the file, for the first strip.
    const char* what;
    std::vector<int> codes;
    bool spoilsResult = false;
};

Role roleOf(const ReadOnlyServer& server, const KZJobDataStruct& job, const AskedFile& file) {
    static const Role roles[] = {
        {"Output/Jdf/FileName", "JDF", {exitJdfMissing}},
        {"System/Folders/Temp", "JDF", {exitJdfMissing}},
        {"Workflow/RemoteOutFolder", "JDF", {exitJdfMissing}},
        {"Remote/JDFName", "JDF", {exitJdfMissing}},
        {"Footer/Dynstrip/IT8", "dynamic strip", {exitMeasuringFailed, exitInputMissing}},
        {"Footer/Dynstrip/File", "picture of the dynamic strip, which no run needs", {}},
        {"Footer/ControlstripIT8", "control strip", {exitMeasuringFailed}},
        {"Footer/ControlstripFile", "control strip", {exitMeasuringFailed}},
        {"Footer/Nesting/ControlstripFile", "control strip", {exitMeasuringFailed}},
    };
    if (!job.presetFile.empty() &&
        file.serverPath.ends_with("/tickets/" + bytesOf(job.presetFile))) {
        return {nullptr, "preset", {exitPresetFailed}};
    }
    const bool isJdf = isAfter(server, file, "Output/Jdf/FileName");
    if (isAfter(server, file, "Footer/Nesting/PSDAssessment") && !isJdf) {
        return {nullptr,
                "strip shared by the parent's jobs; the job uses its own, and the result goes to "
                "this job alone",
                {},
                true};
    }
    // A packaging job names its references by the key of a strip, which must not match below.
    const bool isReference = isAfter(server, file, "Workflow/Name") &&
                             !isAfter(server, file, "Footer/ControlstripIT8") && !isJdf;
    for (const Role& role : roles) {
        const bool isNamed = file.namedBy == role.key ||
                             file.namedBy == stripKey(jobkeys::stripOf(job.secondStrip), role.key);
        if (isNamed && !isReference) {
            return role;
        }
    }
    return {nullptr, "reference", {exitReferenceMissing, exitInputMissing}};
}

Finding judgeMissing(const ReadOnlyServer& server, const KZJobDataStruct& job,
                     const AskedFile& file) {
    const Role role = roleOf(server, job, file);
    const bool isNamed = !file.namedBy.empty() && role.what != std::string_view("preset");
    return {.where = "file " + file.serverPath,
            .text = "can't be downloaded: " + file.problem + ". It is the " + role.what +
                    (isNamed ? ", named by " + file.namedBy : "") + ".",
            .codes = role.codes,
            .spoilsResult = role.spoilsResult};
}

/// All files of a job are stored in one folder, under the last parts of their paths.
std::vector<Finding> judgeNames(const ReadOnlyServer& server, bool measures) {
    std::vector<Finding> findings;
    std::map<std::string, std::string> first; // Local name to server path.
    for (const AskedFile& file : server.files()) {
        const std::string name = fileName(file.localPath);
        for (const ReservedName& reserved : reservedNames()) {
            const bool isOwn = file.serverPath.ends_with(".dcf"); // Downloaded to be this file.
            if (name == reserved.name && !isOwn) {
                findings.push_back({"file " + file.serverPath,
                                    "has a name that is reserved in the job's folder. " +
                                        std::string(reserved.consequence),
                                    reserved.codes, reserved.spoilsResult});
            }
        }
        const auto [other, isNew] = first.emplace(name, file.serverPath);
        if (!isNew && other->second != file.serverPath) {
            // A comparison needs only the reference. Only nesting and the JDF are loaded later.
            const bool spoils = measures || isAfter(server, file, "General/ParentID");
            findings.push_back({"file " + file.serverPath,
                                "has the same name as " + other->second +
                                    ". In the job's folder, the later one replaces the other.",
                                {exitReferenceMissing, exitMeasuringFailed, exitPresetFailed},
                                spoils});
        }
    }
    return findings;
}

} // namespace

std::vector<Finding> judgeFiles(const ReadOnlyServer& server, const KZJobDataStruct& job,
                                bool measures) {
    std::vector<Finding> findings = judgeNames(server, measures);
    for (const AskedFile& file : server.files()) {
        // The definition next to a dynamic strip is optional.
        if (!file.problem.empty() && !file.serverPath.ends_with(".dcf")) {
            findings.push_back(judgeMissing(server, job, file));
        }
    }
    return findings;
}

} // namespace diagnosis
