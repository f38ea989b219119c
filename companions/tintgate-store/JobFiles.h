// SPDX-License-Identifier: Apache-2.0
// Which server files the jobs of a store name.
#pragma once

#include <map>
#include <set>
#include <string>
#include <vector>

#include "store/StoreEngine.h"

namespace admin {

/// The files of all jobs, as their tickets named them when this was made. Paths have no slash in
/// front; what names no file of a store is passed over.
class JobFiles {
  public:
    explicit JobFiles(store::StoreEngine& store);

    /// The job's JDFs: they are made for it and mean nothing without it.
    std::vector<std::string> own(int job) const;
    /// Files of the server that the job refers to: control strips, profiles, characterisation data
    /// and the files of its presets.
    std::vector<std::string> shared(int job) const;
    /// Numbers of the presets that the job is judged by.
    const std::set<int>& presets(int job) const;

    /// Whether a job that is not in the group names the file.
    bool isNamedOutside(const std::string& path, const std::set<int>& group) const;

  private:
    struct Names {
        std::vector<std::string> own;
        std::vector<std::string> shared;
        std::set<int> presets;
    };

    std::map<int, Names> m_jobs;
    std::map<std::string, std::vector<int>> m_namedBy; ///< By path.
};

} // namespace admin
