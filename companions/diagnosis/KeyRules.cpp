// SPDX-License-Identifier: Apache-2.0
#include "companions/diagnosis/KeyRules.h"

#include <algorithm>
#include <variant>

#include <wx/string.h>

#include "jobkeys/Lookups.h"

namespace diagnosis {

namespace {

/// How the second strip's key is derived from the first strip's.
enum class Form { Shared, Suffix, Measurement };

/// When to report a key that can't be read. Many keys are absent from correct tickets. These are
/// reported only if the ticket has something that looks like a mistake.
enum class Report { Always, IfSuspicious };

struct Rule {
    int ticketType;
    Form form;
    const char* key;      ///< The first strip's key; for Form::Measurement without its root.
    const char* previous; ///< Applies only if this key was read directly before it. May be null.
    Report report;
    bool emptyCounts; ///< An empty text counts as missing.
    bool spoilsResult;
    std::vector<int> codes;
    const char* consequence; ///< One or more sentences.
};

constexpr bool emptyIsFine = false;
constexpr bool emptyToo = true;

const char* const ownStrip = jobkeys::stripFileKey;
const char* const modeKey = "Footer/Nesting/ControlstripMode";
const char* const characterisation = jobkeys::characterisationKey;
const char* const assessment = "Footer/Nesting/PSDAssessment";
const char* const jdfFolder = jobkeys::temporaryFolderKey;
const char* const profile = jobkeys::stripProfileKey;
const char* const dynamicEnds =
    "The lookup of the dynamic strip stops here: there is no control strip, and the workflow is "
    "not read.";
const char* const spectraNeedIt =
    "Without it, the stored measurement is not read, even if there are no spectra (Length 0).";
const char* const fileOfPresetCounts = "It is for clients; the run uses the preset's file.";

const std::vector<Rule>& rules() {
    using enum Form;
    using enum Report;
    // clang-format off
    static const std::vector<Rule> all = {
        {systemType, Shared, "System/Product/MajorVersion", nullptr, Always, emptyIsFine, false, {151},
         "A login needs a server of version 5 or later."},

        {jobType, Shared, "System/InstallFolder", nullptr, Always, emptyToo, false, {103, 106, 10, 20},
         "Without the install folder, no strip, preset or characterization file is found, and "
         "Footer/Dynstrip/UseDynstrip is not read."},
        {jobType, Shared, "Input/Title", nullptr, IfSuspicious, emptyIsFine, false, {}, "It is shown to people only."},
        {jobType, Shared, "CMM/PaperName", nullptr, IfSuspicious, emptyIsFine, false, {}, "It is shown to people only."},
        {jobType, Shared, "Workflow/Name", nullptr, IfSuspicious, emptyIsFine, false, {}, "It is shown to people only."},
        {jobType, Shared, "Job/FromEsko", nullptr, IfSuspicious, emptyIsFine, false, {}, "It counts as 0."},
        {jobType, Shared, "Input/SubType", nullptr, IfSuspicious, emptyIsFine, false, {}, "It counts as 0."},

        {jobType, Shared, "Footer/Dynstrip/UseDynstrip", nullptr, IfSuspicious, emptyIsFine, false, {},
         "It counts as 0, a fixed control strip."},
        {jobType, Shared, "Footer/Dynstrip/DeviceID", nullptr, Always, emptyIsFine, false, {106, 20}, dynamicEnds},
        {jobType, Shared, "Footer/Dynstrip/IT8", nullptr, Always, emptyToo, false, {106, 20}, dynamicEnds},
        {jobType, Shared, "Footer/Dynstrip/File", nullptr, Always, emptyIsFine, true, {},
         "Without it, the workflow is not read: the references come from the strip, and the JDF is not updated."},
        {jobType, Suffix, "Footer/Nesting/ControlstripFile", ownStrip, Always, emptyIsFine, false, {103, 106},
         "One of them must name the control strip, with at least 4 bytes. Without a strip, the workflow is not read, and no references and no preset are looked up."},

        {jobType, Suffix, "Workflow/Verify/MeasurementWorkflow", nullptr, Always, emptyIsFine, false, {103},
         "It counts as 0: a fixed control strip then has no references, and without references the preset is not loaded."},
        {jobType, Measurement, "Illumination/Mode", nullptr, IfSuspicious, emptyIsFine, false, {}, "It counts as 1 (M1)."},
        {jobType, Measurement, "Status", nullptr, IfSuspicious, emptyIsFine, true, {}, "It counts as 0: the job is measured."},
        {jobType, Measurement, "Reference/Numpatches", nullptr, Always, emptyIsFine, true, {103},
         "Without it, the references in the ticket are ignored: a profile is looked up instead."},
        {jobType, Suffix, characterisation, nullptr, Always, emptyToo, false, {103},
         "Without it, there are no references, and without references the preset is not loaded."},
        {jobType, Shared, "Remote/UsedICCProfile", profile, Always, emptyToo, false, {103},
         "One of them must name the reference profile. Without references, the preset is not loaded."},
        {jobType, Shared, "Footer/ControlstripIT8", nullptr, Always, emptyToo, false, {103},
         "A packaging job (Job/FromEsko 1, workflow 4) needs its strip's server path here."},
        {jobType, Suffix, "Workflow/Verify/DeltaEMode", nullptr, Always, emptyIsFine, false, {103},
         "Without it, the preset is not loaded."},
        {jobType, Suffix, "Workflow/Verify/ComparisonMethod", nullptr, Always, emptyIsFine, false, {103},
         "It is the number of the preset. Without it, no preset is loaded."},

        {presetType, Shared, "Name", nullptr, Always, emptyToo, false, {103},
         "A preset without a name is not used: its file is not fetched."},
        {presetType, Shared, "Editable", nullptr, IfSuspicious, emptyIsFine, false, {}, fileOfPresetCounts},
        {presetType, Shared, "ShowInClient", nullptr, IfSuspicious, emptyIsFine, false, {}, fileOfPresetCounts},
        {presetType, Shared, "UsedForDynamicWedge", nullptr, IfSuspicious, emptyIsFine, false, {}, fileOfPresetCounts},
        {presetType, Shared, "IlluminationCondition", nullptr, IfSuspicious, emptyIsFine, false, {}, fileOfPresetCounts},

        {jobType, Shared, "General/ParentID", nullptr, IfSuspicious, emptyIsFine, false, {},
         "It counts as 0: the job is not nested."},
        {jobType, Shared, modeKey, nullptr, IfSuspicious, emptyIsFine, true, {},
         "It counts as 0: the job uses its own strip, and the result goes to this job alone."},
        {jobType, Shared, assessment, modeKey, Always, emptyIsFine, true, {},
         "Without it (an empty text is enough), the strip shared by the parent's jobs is not looked up, "
         "and the result goes to this job alone."},
        {jobType, Suffix, "Footer/Nesting/ControlstripFile", assessment, Always, emptyIsFine, true, {},
         "The strip shared by the parent's jobs is not found: the job uses its own, and the result goes to this job alone."},

        {jobType, Shared, "Output/Prn/Specific/Measurement/VerifyMode", nullptr, Always, emptyIsFine, false, {},
         "The measuring condition of the inline instrument counts as unknown (-1)."},

        {jobType, Shared, "Output/Jdf/FileName", nullptr, Always, emptyToo, false, {255, 111},
         "Every job needs the name of its JDF, regardless of its workflow."},
        {jobType, Shared, "Workflow/RemoteOutFolder", jdfFolder, Always, emptyToo, false, {255, 111},
         "One of them must name the folder of the JDF."},
        {jobType, Shared, "Remote/JDFName", nullptr, Always, emptyToo, false, {255, 111},
         "A job of sub type 80, 81 or 86 names the server path of its JDF here."},

        {jobType, Measurement, "Numpatches", nullptr, Always, emptyIsFine, false, {107},
         "It is the number of measured patches. Without it, the stored measurement is not read."},
        {jobType, Measurement, "SpectralValues/Base", nullptr, Always, emptyIsFine, false, {107}, spectraNeedIt},
        {jobType, Measurement, "SpectralValues/Length", nullptr, Always, emptyIsFine, false, {107}, spectraNeedIt},
        {jobType, Measurement, "SpectralValues/Stepsize", nullptr, Always, emptyIsFine, false, {107}, spectraNeedIt},
    };
    // clang-format on
    return all;
}

std::string keyOf(const Rule& rule, Strip strip) {
    return rule.form == Form::Shared   ? rule.key
           : rule.form == Form::Suffix ? stripKey(strip, rule.key)
                                       : measurementKey(strip, rule.key);
}

const char* typeName(PARAM_TYPE type) {
    constexpr const char* names[] = {"nothing", "pointer", "int",   "double", "string",
                                     "binary",  "count",   "int64", "uint",   "uint64"};
    return names[type];
}

std::string article(PARAM_TYPE type) {
    return (type == PARAM_INT || type == PARAM_INT64 ? "an " : "a ") + std::string(typeName(type));
}

/// Same check as in the load, which treats text that it can't decode as empty.
bool isUtf8(const std::string& text) {
    return text.empty() || !wxString::FromUTF8(text).empty();
}

/// A load reads two keys twice: the strip's name, for the strip itself and for a nested job.
bool applies(const Rule& rule, const std::vector<AskedKey>& keys, std::size_t index, Strip strip) {
    const AskedKey& asked = keys[index];
    if (asked.type != rule.ticketType || asked.key != keyOf(rule, strip)) {
        return false;
    }
    // A packaging job does not need characterization data.
    if (rule.key == characterisation && index + 1 < keys.size() &&
        keys[index + 1].key.starts_with("Footer/Controlstrip")) {
        return false;
    }
    if (rule.previous == nullptr) {
        return true;
    }
    if (index == 0) {
        return false;
    }
    const AskedKey& before = keys[index - 1];
    return before.key == modeKey
               ? numberIn(&before) == 1
               : before.key == rule.previous || before.key == stripKey(strip, rule.previous);
}

/// Whether the key is read because the one before it was not usable.
bool isFallback(const Rule& rule) {
    return rule.previous == ownStrip || rule.previous == profile || rule.previous == jdfFolder;
}

/// Describes missing elements of an array. Empty if there are none.
std::string arrayProblem(const AskedKey& asked, int wanted) {
    if (!asked.found) {
        return "is missing";
    }
    if (asked.firstUnread >= 0) {
        const store::Value* const value = asked.stored->at(asked.firstUnread);
        const std::string element = "element " + std::to_string(asked.firstUnread);
        return value == nullptr ? "lacks " + element
                                : "contains " + article(store::typeOf(*value)) + " as " + element +
                                      ", but " + article(asked.wanted) + " is read";
    }
    const int count = asked.stored == nullptr ? 0 : asked.stored->count();
    return count >= wanted ? ""
                           : "contains " + std::to_string(count) + " of " + std::to_string(wanted) +
                                 " elements";
}

/// Checks arrays of patches. Missing elements count as 0, so nothing fails.
void judgeArray(const AskedKey& asked, int patches, int samples, std::vector<Finding>* findings) {
    const bool isPatches =
        asked.key.ends_with("Values") && asked.key.starts_with("Remote/Measurement");
    const bool isInline = asked.key.ends_with("Values/Measured");
    if (asked.type != jobType || (!isPatches && !isInline)) {
        return;
    }
    const bool isSpectra = asked.key.ends_with("/DValues");
    if (isSpectra && samples < 1) {
        return;
    }
    const int wanted = isInline ? 1 : isSpectra ? patches * samples : patches;
    const std::string problem = arrayProblem(asked, wanted);
    if (!problem.empty()) {
        findings->push_back({.where = keyName(asked),
                             .text = problem + ". " +
                                     (isSpectra ? "The measurement counts as one without spectra."
                                                : "The missing values count as 0."),
                             .spoilsResult = isPatches && !isSpectra});
    }
}

} // namespace

std::string ticketName(int type, int id) {
    return type == systemType && id == 0 ? "system"
           : type == jobType             ? "job/" + std::to_string(id)
           : type == presetType          ? "preset/" + std::to_string(id)
                                         : std::to_string(type) + "/" + std::to_string(id);
}

std::string keyName(const AskedKey& asked) {
    return ticketName(asked.type, asked.id) + " " + asked.key;
}

const AskedKey* findKey(const std::vector<AskedKey>& keys, int type, int id,
                        const std::string& key) {
    const auto found = std::find_if(keys.begin(), keys.end(), [&](const AskedKey& asked) {
        return asked.type == type && asked.id == id && asked.key == key;
    });
    return found == keys.end() ? nullptr : &*found;
}

std::optional<int> numberIn(const AskedKey* asked) {
    const store::Value* const value =
        asked != nullptr && asked->found ? asked->stored->first() : nullptr;
    const int* const number = value == nullptr ? nullptr : std::get_if<int>(value);
    return number == nullptr ? std::nullopt : std::optional(*number);
}

std::string problemOf(const AskedKey& asked, bool emptyCounts) {
    const store::Value* const value = asked.stored == nullptr ? nullptr : asked.stored->first();
    if (value == nullptr) {
        return "is missing";
    }
    if (!asked.found) {
        return "is stored as " + article(store::typeOf(*value)) + ", but " + article(asked.wanted) +
               " is read";
    }
    if (const auto* const text = std::get_if<store::Text>(value)) {
        if (emptyCounts && text->bytes->text.empty()) {
            return "is empty";
        }
        if (!isUtf8(text->bytes->text)) {
            return "is not valid UTF-8";
        }
    }
    return "";
}

std::vector<Finding> judgeKeys(const std::vector<AskedKey>& keys, int job, Strip strip,
                               const std::function<std::string(const AskedKey&)>& similar) {
    std::vector<Finding> findings;
    int patches = 0; // Of the data set whose arrays follow; `samples` are those of one spectrum.
    int samples = 0;
    for (std::size_t i = 0; i < keys.size(); ++i) {
        const AskedKey& asked = keys[i];
        if (asked.type == jobType && asked.id != job) {
            continue; // Belongs to another job in the list.
        }
        if (asked.isArray) {
            judgeArray(asked, patches, samples, &findings);
            continue;
        }
        if (asked.key.ends_with("/Numpatches")) {
            patches = numberIn(&asked).value_or(0);
        } else if (asked.key.ends_with("SpectralValues/Length")) {
            samples = numberIn(&asked).value_or(0);
        }
        for (const Rule& rule : rules()) {
            if (!applies(rule, keys, i, strip)) {
                continue;
            }
            const std::string problem = problemOf(asked, rule.emptyCounts);
            const std::string other = asked.found ? "" : similar(asked);
            const bool isSuspicious = asked.stored != nullptr || !other.empty();
            if (problem.empty() || (rule.report == Report::IfSuspicious && !isSuspicious)) {
                continue;
            }
            std::string where = keyName(asked);
            std::string text = problem + (other.empty() ? "" : "; the ticket has " + other);
            if (isFallback(rule)) {
                const AskedKey& first = keys[i - 1];
                const std::string likeFirst = first.found ? "" : similar(first);
                const std::string fault = problemOf(first, true);
                where = keyName(first) + " and " + asked.key;
                text = "The former " + (fault.empty() ? "is too short" : fault) +
                       (likeFirst.empty() ? "" : "; the ticket has " + likeFirst) +
                       ". The latter " + text;
            }
            findings.push_back({.where = where,
                                .text = text + ". " + rule.consequence,
                                .codes = rule.codes,
                                .spoilsResult = rule.spoilsResult});
        }
    }
    return findings;
}

} // namespace diagnosis
