// SPDX-License-Identifier: Apache-2.0
// Pages created by the viewer on this machine.
#pragma once

#include <map>
#include <string>
#include <vector>

#include "report/Page.h"
#include "report/Sample.h"

namespace report {

/// The pages of jobs on this machine.
class LocalPages {
  public:
    LocalPages();

    /// The page of the run that wrote the sample: the first one since then. Empty if there is none.
    std::string of(const Sample& sample) const;

  private:
    std::string m_folder;
    std::map<std::string, std::vector<Listed>> m_pages;
};

} // namespace report
