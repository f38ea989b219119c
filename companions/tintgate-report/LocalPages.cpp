// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-report/LocalPages.h"

#include "companions/tintgate-report/Filter.h"
#include "jobkeys/Tickets.h"
#include "platform/TemporaryFolder.h"
#include "report/Reports.h"

namespace report {

LocalPages::LocalPages() : m_folder(platform::temporaryFolder() + "/Tintgate") {
    for (report::Listed& page : report::reportsBelow(m_folder)) {
        m_pages[page.path.substr(0, page.path.find('/'))].push_back(std::move(page));
    }
}

std::string LocalPages::of(const report::Sample& sample) const {
    const std::string folder = jobkeys::jobFolderName(*sample.jobId);
    const auto found = m_pages.find(folder);
    if (found == m_pages.end()) {
        return {};
    }
    const std::string start = folder + "/report-strip" + std::to_string(sample.strip) + "-";
    std::string earliest;
    for (const report::Listed& page : found->second) { // Latest first.
        const auto made = timeOf(page.summary.created);
        if (page.path.starts_with(start) &&
            (sample.title.empty() || page.summary.title == sample.title) && made &&
            *made >= sample.time) {
            earliest = m_folder + "/" + page.path;
        }
    }
    return earliest;
}

} // namespace report
