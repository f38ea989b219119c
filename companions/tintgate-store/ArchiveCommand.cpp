// SPDX-License-Identifier: Apache-2.0
#include <iostream>
#include <map>
#include <numeric>
#include <set>

#include "companions/tintgate-store/Bytes.h"
#include "companions/tintgate-store/Commands.h"
#include "companions/tintgate-store/Days.h"
#include "companions/tintgate-store/Failure.h"
#include "companions/tintgate-store/JobFiles.h"
#include "companions/tintgate-store/Jobs.h"
#include "companions/tintgate-store/LocalFile.h"
#include "companions/tintgate-store/MoveJobs.h"
#include "companions/tintgate-store/Rows.h"
#include "companions/tintgate-store/TicketName.h"

namespace admin {

namespace {

struct ArchiveOptions {
    std::string to;
    std::string closed;
    bool undated = false;
    bool dryRun = false;
};

/// Jobs of one parent, and that, by what they are called: the lowest number.
std::vector<std::vector<Job>> families(store::StoreEngine& store) {
    std::map<int, int> heads; // Of each number one that is nearer to the family's head.
    const auto headOf = [&](int id) {
        for (auto found = heads.find(id); found != heads.end() && found->second != id;
             found = heads.find(id)) {
            id = found->second;
        }
        return id;
    };
    const auto jobs = allJobs(store);
    for (const Job& job : jobs) {
        const int head = headOf(job.id);
        if (job.parent > 0) {
            const int other = headOf(job.parent);
            heads[std::max(head, other)] = std::min(head, other);
        }
    }
    std::map<int, std::vector<Job>> byHead;
    for (const Job& job : jobs) {
        byHead[headOf(job.id)].push_back(job);
    }
    std::vector<std::vector<Job>> all;
    for (auto& [head, family] : byHead) {
        all.push_back(std::move(family));
    }
    return all;
}

/// Whether a family's work is done: none of its jobs waits, at least one has a result, and the
/// latest measurement of them all was before that day.
bool isClosed(const std::vector<Job>& family, const std::string& day, bool undated) {
    bool hasResult = false;
    std::string measured;
    for (const Job& job : family) {
        if (job.waits()) {
            return false;
        }
        hasResult = hasResult || job.state() != "-";
        measured = std::max(measured, job.measured);
    }
    return hasResult && (measured.empty() ? undated : measured < day);
}

std::vector<Row> rowsOf(const std::vector<Stayed>& stayed) {
    std::vector<Row> rows;
    for (const auto& each : stayed) {
        rows.push_back({{"job", each.job}, {"why", textOrBytes(each.why)}});
    }
    return rows;
}

void archive(const Invocation& invocation, const ArchiveOptions& options) {
    const std::string day = dayBefore(daysOf(options.closed, "--closed"));
    const auto from = invocation.open();
    const auto to = store::openStore(completeAddress(options.to));
    MoveJobs move(*from, *to, options.dryRun);
    std::vector<std::set<int>> chosen;
    for (const auto& family : families(*from)) {
        if (isClosed(family, day, options.undated)) {
            auto& ids = chosen.emplace_back();
            for (const Job& job : family) {
                ids.insert(job.id);
            }
        }
    }
    {
        Progress progress(chosen.size(), "families of jobs");
        move.finishEarlierRun();
        for (std::size_t i = 0; i < chosen.size(); ++i) {
            move.move(chosen[i]);
            progress.done(i + 1);
        }
    }
    const Moved& moved = move.moved();
    if (invocation.json) {
        showObject({{"dryRun", options.dryRun},
                    {"jobs", moved.jobs},
                    {"files", moved.files},
                    {"versions", moved.versions},
                    {"bytes", moved.bytes},
                    {"stayed", rowsOf(moved.stayed)}},
                   true);
    } else {
        std::cout << (options.dryRun ? "Would move " : "Moved ")
                  << counted(std::ssize(moved.jobs), "job") << " with "
                  << counted(moved.files, "file") << " and " << counted(moved.versions, "version")
                  << ": " << counted(static_cast<std::int64_t>(moved.bytes), "byte") << '\n';
    }
    if (!moved.stayed.empty()) {
        finishStandardOutput();
        const Stayed& first = moved.stayed.front();
        throw Failure(Status::Exists, counted(std::ssize(moved.stayed), "job") + " stayed; job/" +
                                          std::to_string(first.job) + ": " + first.why);
    }
}

} // namespace

void addArchiveCommand(Command program, Invocation& invocation) {
    const auto options = std::make_shared<ArchiveOptions>();
    auto command = addCommand<ArchiveOptions>(
        program, invocation, "archive", "Move closed jobs to another store", options,
        [&](const ArchiveOptions& given) { archive(invocation, given); });
    command.option("to", options->to, "Store that takes them: folder or connection service")
        .required();
    command
        .option("--closed", options->closed,
                "Jobs whose latest measurement is older than this, such as 90d for 90 days")
        .required();
    command.flag("--undated", options->undated, "Also closed jobs without a date of measurement");
    command.flag("--dry-run", options->dryRun, "Move nothing, and say what would be moved");
    command.footer(
        "A job moves with its JDF and the JDF's versions; a JDF that another job names is copied. "
        "Jobs of one parent\nmove together, when none of them waits. Control strips, profiles and "
        "presets are copied if the other store\nlacks them, for reports. Make that store first. "
        "An archive that was cut off is run again: until a job is\nwhole in the other store, "
        "nothing of it is removed. Status 2 if jobs stay because the other store has\nothers of "
        "their numbers.");
}

} // namespace admin
