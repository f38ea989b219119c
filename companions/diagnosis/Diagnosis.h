// SPDX-License-Identifier: Apache-2.0
// Finds out why a job's run fails or gives a wrong result. Runs the tool's own code on the job up
// to the point where a measurement would start, and evaluates its reads.
#pragma once

#include <string>
#include <vector>

namespace diagnosis {

/// The run to examine.
struct Request {
    int job = 0;
    std::string selector = "0"; ///< Strip selector as passed by a client.
    bool remeasure = false;
    std::string user;  ///< Name of the user who logs in, as a person types it, or empty.
    std::string login; ///< The same name as the bytes of a login.
};

/// A property of the job that differs from what a run needs or a person expects.
struct Finding {
    std::string where; ///< The key, file, or other place: "job/7 Input/SubType".
    std::string text;  ///< The problem and its consequence. Sentences, in UTF-8 or raw bytes.
    /// Exit codes that it can cause. Empty if it makes no run fail.
    std::vector<int> codes = {};
    bool spoilsResult = false; ///< A run that ends with 0 has a wrong result.
};

/// A read of the store, for people who want to see all reads.
struct Asked {
    std::string where;
    std::string answer;
};

struct Diagnosis {
    /// The exit code of the run, as far as it can be predicted: 0 for a job that reaches its
    /// measurement or whose comparison succeeds.
    int code = 0;
    bool measures = false;         ///< The run would measure; otherwise it compares.
    std::vector<Finding> causes;   ///< Causes of the code. Not empty if the code is not 0.
    std::vector<Finding> spoilers; ///< Causes of a wrong result.
    std::vector<Finding> notices;  ///< Anything else, including what would fail next.
    std::vector<Finding> machine;  ///< About this machine, which need not be the client's.
    std::vector<Asked> asked;      ///< Reads, in their order.

    bool isSound() const { return code == 0 && spoilers.empty(); }
};

/// Examines a job of the store at an address. The store and the tool's folders are not changed; a
/// folder in the temporary folder is created and removed. Call it once per process, because the
/// tool's job processor requires that.
///
/// Throws store::StoreFailure if the store fails.
Diagnosis diagnose(const std::string& address, const Request& request);

} // namespace diagnosis
