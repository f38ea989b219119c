// SPDX-License-Identifier: Apache-2.0
#include "report/PageFile.h"

#include <cerrno>
#include <cstring>

#include "base/FileDraft.h"
#include "base/WholeFile.h"

namespace report {
namespace {

bool holds(const std::string& path, std::string_view page) {
    std::string bytes;
    return base::readWholeFile(path, page.size(), bytes) == base::Reading::Done && bytes == page;
}

} // namespace

std::string pageStem(const Meta& meta) {
    const std::string& t = meta.created;
    return "report-strip" + std::to_string(meta.strip) + "-" + t.substr(0, 10) + "-" +
           t.substr(11, 2) + t.substr(14, 2) + t.substr(17, 2);
}

std::string keepPage(const std::string& folder, const std::string& stem, std::string_view page,
                     std::string& problem) {
    constexpr int mostOfOneName = 10'000;
    base::FileDraft draft(folder + "/");
    if (!draft.isOpen() || !draft.write(page)) {
        problem = std::strerror(errno);
        return {};
    }
    for (int number = 1; number <= mostOfOneName; ++number) {
        const std::string path =
            folder + "/" + stem + (number == 1 ? "" : "-" + std::to_string(number)) + ".html";
        if (draft.nameFresh(path)) {
            return path;
        }
        if (errno != EEXIST) {
            problem = std::strerror(errno);
            return {};
        }
        if (holds(path, page)) {
            return path;
        }
    }
    problem = "every name is taken";
    return {};
}

} // namespace report
