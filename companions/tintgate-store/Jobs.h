// SPDX-License-Identifier: Apache-2.0
// Jobs, as their verification goes.
#pragma once

#include <map>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include "store/StoreEngine.h"

namespace admin {

/// One strip, as a job's ticket describes it.
struct Strip {
    int measurements = 0;
    std::optional<int> approval; ///< 0 failed, above passed; there is no result below 0.
    bool hasLastKey = false;     ///< The last key of a result.

    bool isJudged() const { return approval.value_or(-1) >= 0; }
    /// The run that wrote the result was cut off before its last key. Of a strip that was measured
    /// before, the last key is that of the former result, so that this is not noticed.
    bool isCutOff() const { return isJudged() && !hasLastKey; }
};

struct Job {
    int id = 0;
    int parent = 0;
    std::string title;
    std::string measured; ///< The day of the latest measurement, such as 2024-05-01, or empty.
    int displayStatus = 0;
    int showInVerifier = 0;
    int fileType = 0;
    bool twoStrips = false;
    bool hasShowInVerifier = false;
    Strip strips[2];

    /// Whether a run that does not remeasure finds the job.
    bool waits() const;
    /// "passed", "failed" or "waiting"; else "-".
    std::string state() const;
};

/// All jobs, by id.
std::vector<Job> allJobs(store::StoreEngine& store);

/// The job itself, its parent, and the jobs that either of them is the parent of. Only ids that a
/// job has or names; see exists.
std::set<int> familyOf(store::StoreEngine& store, int id);

struct ResetResult {
    int id = 0;
    bool there = true; ///< False for a ticket that is missing.
    std::vector<std::string> removed;
    bool reopened = false;
    std::vector<std::string> obstacles; ///< Why the next run can't succeed; each a sentence.
};

/// Takes the results of strips away, so that a job whose write-back was cut off can run again: the
/// count of measurements, without which the job is measured anew, and the approval, which would
/// close a job of two strips too early. A job that the run had closed, and that nobody would find
/// any more, is offered to the verifier again. One step for each ticket. Then looks for what is in
/// the way of the next run, which measures: it has to find the job, its references, and its strip.
/// Whether the files are there is not looked at.
///
/// Strips are 0 and 1. With family: also for all jobs of the same parent, for the parent, and for
/// all jobs whose parent this one is. The job itself comes first.
std::vector<ResetResult> resetJob(store::StoreEngine& store, int id, const std::vector<int>& strips,
                                  bool family);

} // namespace admin
