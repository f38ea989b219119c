// SPDX-License-Identifier: Apache-2.0
// Why a job's run fails, or gives a wrong result: the tool's own code run on the job up to where a
// measurement would start, and its reads judged.
#pragma once

#include <string>
#include <vector>

namespace diagnosis {

/// The call to examine.
struct Request {
    int job = 0;
    std::string selector = "0"; ///< Strip selector as a client passes it.
    bool remeasure = false;
    std::string user;  ///< Name of the user who logs in, as a person writes it, or empty.
    std::string login; ///< The same name in the bytes of a login.
};

/// Something about the job that differs from what a run needs or a person expects.
struct Finding {
    std::string where; ///< The key, file, or other place: "job/7 Input/SubType".
    std::string text;  ///< What is the matter and what follows. Sentences, in UTF-8 or raw bytes.
    /// Exit codes that a run can end with because of it, none if no run fails because of it.
    std::vector<int> codes = {};
    bool spoilsResult = false; ///< A run that ends with 0 has a wrong result because of it.
};

/// What was asked of the store, for people who want all of it.
struct Asked {
    std::string where;
    std::string answer;
};

struct Diagnosis {
    /// The exit code of such a run, as far as it can be foreseen: 0 for a job that reaches its
    /// measurement or whose comparison succeeds.
    int code = 0;
    bool measures = false;         ///< The run would measure; otherwise it compares.
    std::vector<Finding> causes;   ///< Of the code. Not empty if the code is not 0.
    std::vector<Finding> spoilers; ///< Of the result.
    std::vector<Finding> notices;  ///< Anything else, including what would fail next.
    std::vector<Finding> machine;  ///< About this machine, which need not be the client's.
    std::vector<Asked> asked;      ///< Reads in their order.

    bool isSound() const { return code == 0 && spoilers.empty(); }
};

/// Examines a job of the store at an address. Nothing in the store and in the tool's folders
/// changes; a folder under the temporary folder is made and removed. Once per process, since that
/// is what the tool's job processor is made for.
///
/// Throws store::StoreFailure if the store fails on the way.
Diagnosis diagnose(const std::string& address, const Request& request);

} // namespace diagnosis
