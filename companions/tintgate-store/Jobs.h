// SPDX-License-Identifier: Apache-2.0
// Jobs and the state of their verification.
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
    std::optional<int> approval; ///< 0 failed, above 0 passed; below 0 there is no result.
    bool hasLastKey = false;     ///< The last key of a result exists.

    bool isJudged() const { return approval.value_or(-1) >= 0; }
    /// The run that wrote the result was interrupted before its last key. If the strip was measured
    /// before, the last key is from the former result, so this is not detected.
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
    /// "passed", "failed" or "waiting"; otherwise "-".
    std::string state() const;
};

/// All jobs, by id.
std::vector<Job> allJobs(store::StoreEngine& store);

/// The job itself, its parent, and the jobs that either of them is the parent of. Only ids that a
/// job has or names; see exists.
std::set<int> familyOf(store::StoreEngine& store, int id);

struct ResetResult {
    int id = 0;
    bool there = true; ///< False if the ticket is missing.
    std::vector<std::string> removed;
    bool reopened = false;
    std::vector<std::string> obstacles; ///< Why the next run can't succeed; one sentence each.
};

/// Removes the results of strips, so that a job with an interrupted write-back can run again: the
/// count of measurements, without which the job is measured again, and the approval, which would
/// close a job of two strips too early. If the run had closed the job and nothing else lists it,
/// the job is offered to the verifier again. Each ticket is changed in one transaction. Then checks
/// for obstacles to the next run, which measures: it must find the job, its references and its
/// strip. Does not check whether the files exist.
///
/// Strips are 0 and 1. With `family`, also resets all jobs of the same parent, the parent, and all
/// jobs that have this job as their parent. The job itself comes first.
std::vector<ResetResult> resetJob(store::StoreEngine& store, int id, const std::vector<int>& strips,
                                  bool family);

} // namespace admin
