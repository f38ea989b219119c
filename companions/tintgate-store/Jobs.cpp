// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-store/Jobs.h"

#include <algorithm>
#include <functional>
#include <set>

#include "companions/tintgate-store/Days.h"
#include "companions/tintgate-store/KeyValue.h"
#include "companions/tintgate-store/TicketName.h"
#include "jobkeys/JobState.h"
#include "jobkeys/Lookups.h"
#include "jobkeys/StripKeys.h"

namespace admin {

using namespace jobkeys;

namespace {

std::string measured(int strip, const char* name) {
    return measurementKey(strips[strip], name);
}

std::string statusKey(int strip) {
    return measured(strip, "Status");
}

std::string approvalKey(int strip) {
    return measured(strip, "Approval");
}

/// The last key of a result, with and without a PSD preset.
constexpr const char* lastKeys[] = {"Values/Decimal", "Values/PSDDecimal"};

using Elements = std::shared_ptr<const store::Elements>;

template<int strip>
void noteLastKey(Job& job, const Elements& value) {
    job.strips[strip].hasLastKey = job.strips[strip].hasLastKey || value != nullptr;
}

/// Days that are not written as a run of the tool does it are passed over.
void noteDate(Job& job, const Elements& value) {
    const std::string day = textOf(value).value_or("");
    if (isDay(day)) {
        job.measured =
            std::max(job.measured, day); // In this form the later day is the greater text.
    }
}

/// The meaning of each key for a job.
const std::vector<std::pair<std::string, void (*)(Job&, const Elements&)>> readers = {
    {"Input/Title",
     [](Job& job, const Elements& value) { job.title = textOf(value).value_or(""); }},
    {"General/ParentID",
     [](Job& job, const Elements& value) { job.parent = integerOf(value).value_or(0); }},
    {displayStatusKey,
     [](Job& job, const Elements& value) { job.displayStatus = integerOf(value).value_or(0); }},
    {showInVerifierKey,
     [](Job& job, const Elements& value) {
         job.hasShowInVerifier = integerOf(value).has_value();
         job.showInVerifier = integerOf(value).value_or(0);
     }},
    {fileTypeKey,
     [](Job& job, const Elements& value) { job.fileType = integerOf(value).value_or(0); }},
    {verifyActiveKey,
     [](Job& job, const Elements& value) {
         job.twoStrips = integerOf(value) == activeForTwoStrips;
     }},
    {statusKey(0),
     [](Job& job, const Elements& value) {
         job.strips[0].measurements = integerOf(value).value_or(0);
     }},
    {statusKey(1),
     [](Job& job, const Elements& value) {
         job.strips[1].measurements = integerOf(value).value_or(0);
     }},
    {approvalKey(0),
     [](Job& job, const Elements& value) { job.strips[0].approval = integerOf(value); }},
    {approvalKey(1),
     [](Job& job, const Elements& value) { job.strips[1].approval = integerOf(value); }},
    {measured(0, "Date"), noteDate},
    {measured(1, "Date"), noteDate},
    {measured(0, lastKeys[0]), noteLastKey<0>},
    {measured(0, lastKeys[1]), noteLastKey<0>},
    {measured(1, lastKeys[0]), noteLastKey<1>},
    {measured(1, lastKeys[1]), noteLastKey<1>},
};

Job jobOf(int id, const std::function<Elements(const std::string& key)>& valueOf) {
    Job job;
    job.id = id;
    for (const auto& [key, read] : readers) {
        read(job, valueOf(key));
    }
    return job;
}

void removeKey(store::TicketContent& content, const std::string& key, ResetResult& result) {
    if (!content.find(key)) {
        return;
    }
    SETMULTIPAR table[2];
    table[0].key = key.c_str();
    table[0].position = POSITION_WHOLE;
    content.apply(table);
    result.removed.push_back(key);
}

/// Writing results ends with a 0 for the verifier. If there was no value before, the job was listed
/// for another reason, which still applies.
void reopen(store::TicketContent& content, ResetResult& result) {
    const Job job = jobOf(0, [&](const std::string& key) { return content.find(key); });
    if (job.waits() || !job.hasShowInVerifier) {
        return;
    }
    auto shown = std::make_shared<store::Elements>();
    shown->put(0, 1);
    content.put(showInVerifierKey, shown);
    result.reopened = true;
}

/// Reasons why a run that measures this strip would fail.
std::vector<std::string> obstaclesOf(store::StoreEngine& store, int id, jobkeys::Strip strip) {
    const auto number = [&](const std::string& key) {
        return integerOf(store.key(jobType, id, key)).value_or(0);
    };
    const auto text = [&](const std::string& key) {
        return textOf(store.key(jobType, id, key)).value_or("");
    };
    const std::string name = "strip " + std::to_string(numberOf(strip)) + ": ";
    const std::string data = stripKey(strip, characterisationKey);
    const std::string reference = stripKey(strip, workflowKey);
    const int workflow = number(reference);
    const bool dynamic = isDynamic(strip, number("Footer/Dynstrip/UseDynstrip"));
    std::vector<std::string> obstacles;
    switch (referenceWay(number("Job/FromEsko") == 1, workflow, dynamic, false)) {
    case ReferenceWay::Packaging:
    case ReferenceWay::DynamicStrip:
        break;
    case ReferenceWay::Profile:
        if (referenceProfile(strip, text).empty()) {
            obstacles.push_back(name + "it has no profile as reference (" +
                                stripKey(strip, stripProfileKey) + ", " + usedProfileKey + ")" +
                                (workflow == 3 ? "; references in the ticket count only for a "
                                                 "strip that is measured"
                                               : ""));
        }
        break;
    case ReferenceWay::Characterisation:
        if (text(data).empty()) {
            obstacles.push_back(name + "it has no reference (" + data + ")");
        }
        break;
    case ReferenceWay::Stored:
    case ReferenceWay::None:
        obstacles.push_back(name + "it has no reference (" + reference + ")");
        break;
    }
    if (dynamic ? text(dynamicStripKey).empty() : fixedStripName(strip, text).empty()) {
        obstacles.push_back(
            name + "it has no control strip (" +
            (dynamic ? dynamicStripKey
                     : stripKey(strip, stripFileKey) + ", " + stripKey(strip, nestedStripFileKey)) +
            ")");
    }
    return obstacles;
}

std::vector<std::string> obstaclesOf(store::StoreEngine& store, int id,
                                     const std::vector<int>& strips) {
    const Job job = jobOf(id, [&](const std::string& key) { return store.key(jobType, id, key); });
    std::vector<std::string> obstacles;
    if (job.fileType == unsuitableFileType) {
        obstacles.push_back("a file of this type is never verified (" + std::string(fileTypeKey) +
                            ")");
    } else if (!job.waits()) {
        obstacles.push_back("it does not wait (" + std::string(displayStatusKey) + " 208 or " +
                            showInVerifierKey + " 1), so that only a remeasure finds it");
    }
    for (const int strip : strips) {
        if (strip == 0 || job.twoStrips) {
            const auto more = obstaclesOf(store, id, jobkeys::strips[strip]);
            obstacles.insert(obstacles.end(), more.begin(), more.end());
        }
    }
    return obstacles;
}

ResetResult resetOne(store::StoreEngine& store, int id, const std::vector<int>& strips) {
    store::Scope scope;
    for (const char* const key : {displayStatusKey, showInVerifierKey, fileTypeKey}) {
        scope.keys.emplace(key, true);
    }
    for (const int strip : strips) {
        scope.keys.emplace(statusKey(strip), true);
        scope.keys.emplace(approvalKey(strip), true);
    }
    ResetResult result;
    result.id = id;
    result.there = store.change(jobType, id, scope, [&](store::TicketContent& content) {
        for (const int strip : strips) {
            removeKey(content, statusKey(strip), result);
            removeKey(content, approvalKey(strip), result);
        }
        reopen(content, result);
    });
    if (result.there) {
        result.obstacles = obstaclesOf(store, id, strips);
    }
    return result;
}

} // namespace

bool Job::waits() const {
    return (displayStatus == waitingStatus || showInVerifier == 1) &&
           fileType != unsuitableFileType;
}

std::string Job::state() const {
    return waits()                           ? "waiting"
           : displayStatus == verifiedStatus ? "passed"
           : displayStatus == failedStatus   ? "failed"
                                             : "-";
}

std::vector<Job> allJobs(store::StoreEngine& store) {
    std::vector<std::string> names;
    for (const auto& [key, read] : readers) {
        names.push_back(key);
    }
    std::map<int, Job> jobs;
    for (const int id : store.ids(jobType)) {
        jobs[id].id = id;
    }
    constexpr std::size_t anySize = static_cast<std::size_t>(-1) / 2;
    store.keysOfAll(jobType, names, anySize, [&](int id, std::size_t name, Elements elements) {
        jobs[id].id = id;
        readers[name].second(jobs[id], elements);
    });
    std::vector<Job> sorted;
    for (auto& [id, job] : jobs) {
        sorted.push_back(std::move(job));
    }
    return sorted;
}

std::set<int> familyOf(store::StoreEngine& store, int id) {
    const auto jobs = allJobs(store);
    const auto self =
        std::find_if(jobs.begin(), jobs.end(), [&](const Job& job) { return job.id == id; });
    const int parent = self == jobs.end() ? 0 : self->parent;
    std::set<int> ids = {id};
    if (parent > 0) {
        ids.insert(parent);
    }
    for (const auto& job : jobs) {
        if (job.parent == id || (parent > 0 && job.parent == parent)) {
            ids.insert(job.id);
        }
    }
    return ids;
}

std::vector<ResetResult> resetJob(store::StoreEngine& store, int id, const std::vector<int>& strips,
                                  bool family) {
    std::vector<ResetResult> results = {resetOne(store, id, strips)};
    if (family && results[0].there) {
        for (const int relative : familyOf(store, id)) {
            if (relative != id) {
                results.push_back(resetOne(store, relative, strips));
            }
        }
    }
    return results;
}

} // namespace admin
