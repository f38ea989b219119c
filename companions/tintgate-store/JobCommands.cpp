// SPDX-License-Identifier: Apache-2.0
#include <iostream>

#include "companions/tintgate-store/Bytes.h"
#include "companions/tintgate-store/Commands.h"
#include "companions/tintgate-store/Failure.h"
#include "companions/tintgate-store/JobFiles.h"
#include "companions/tintgate-store/Jobs.h"
#include "companions/tintgate-store/Removal.h"
#include "companions/tintgate-store/Rows.h"
#include "companions/tintgate-store/TicketName.h"

namespace admin {

namespace {

struct ResetOptions {
    std::string job;
    std::string strip;
    bool family = false;
};

struct DeleteOptions {
    std::vector<std::string> jobs;
    bool family = false;
    bool dryRun = false;
};

struct NoOptions {};

Row stripJson(const Strip& strip) {
    return {{"measurements", strip.measurements},
            {"passed", strip.isJudged() ? Row(*strip.approval > 0) : Row()},
            {"cutOff", strip.isCutOff()}};
}

Row stripText(const Strip& strip) {
    if (strip.isCutOff()) {
        return "cut off";
    }
    if (!strip.isJudged()) {
        return strip.measurements > 0 ? Row("measured") : Row();
    }
    return *strip.approval > 0 ? "passed" : "failed";
}

void list(const Invocation& invocation) {
    std::vector<Row> rows;
    for (const auto& job : allJobs(*invocation.open())) {
        Row row{{"job", job.id},
                {"title", textOrBytes(job.title)},
                {"state", job.state()},
                {"displayStatus", job.displayStatus},
                {"waits", job.waits()},
                {"twoStrips", job.twoStrips},
                {"strip1", invocation.json ? stripJson(job.strips[0]) : stripText(job.strips[0])},
                {"strip2", invocation.json ? stripJson(job.strips[1]) : stripText(job.strips[1])},
                {"parent", job.parent > 0 ? Row(job.parent) : Row()}};
        rows.push_back(row);
    }
    showRows({{"job", "JOB"},
              {"title", "TITLE"},
              {"state", "STATE"},
              {"displayStatus", "CODE"},
              {"strip1", "STRIP 1"},
              {"strip2", "STRIP 2"},
              {"parent", "PARENT"}},
             rows, invocation.json);
}

void tellReset(const ResetResult& result) {
    for (const auto& obstacle : result.obstacles) {
        std::cerr << "tintgate-store: warning: " << textOf({jobType, result.id})
                  << ": the next run can't succeed: " << obstacle << '\n';
    }
    std::cout << textOf({jobType, result.id}) << ": ";
    if (!result.there) {
        std::cout << "there is no such ticket\n";
        return;
    }
    std::string text;
    for (const auto& key : result.removed) {
        text += (text.empty() ? "removed " : ", ") + key;
    }
    if (result.reopened) {
        text += (text.empty() ? "" : "; ") + std::string("waits for its verification again");
    }
    std::cout << (text.empty() ? "nothing to do" : text) << '\n';
}

void reset(const Invocation& invocation, const ResetOptions& options) {
    const int id = jobNumber(options.job);
    std::vector<int> strips = {0, 1};
    if (!options.strip.empty()) {
        strips = {wholeNumber(options.strip, 1, 2, "strip") - 1};
    }
    const auto results = resetJob(*invocation.open(), id, strips, options.family);
    if (!results[0].there) {
        throw Failure(Status::NotThere, "there is no job " + std::to_string(id));
    }
    if (!invocation.json) {
        std::for_each(results.begin(), results.end(), tellReset);
        return;
    }
    std::vector<Row> rows;
    for (const auto& result : results) {
        rows.push_back({{"job", result.id},
                        {"there", result.there},
                        {"removed", result.removed},
                        {"reopened", result.reopened},
                        {"obstacles", result.obstacles}});
    }
    showRows({}, rows, true);
}

void remove(const Invocation& invocation, const DeleteOptions& options) {
    const auto store = invocation.open();
    std::set<int> jobs;
    for (const auto& text : options.jobs) {
        const int id = jobNumber(text);
        if (!store->exists(jobType, id)) {
            throw Failure(Status::NotThere, "there is no job " + std::to_string(id));
        }
        if (options.family) {
            jobs.merge(familyOf(*store, id));
        } else {
            jobs.insert(id);
        }
    }
    const JobFiles files(*store);
    Removal removal(*store, options.dryRun);
    for (const int job : jobs) {
        removal.removeJob(job, files, jobs);
    }
    removal.show(invocation.json);
}

} // namespace

void addJobCommands(Command program, Invocation& invocation) {
    addCommand<NoOptions>(
        program, invocation, "jobs", "List jobs and how far their verification is",
        std::make_shared<NoOptions>(), [&](const NoOptions&) { list(invocation); })
        .footer(
            "STATE: waiting, passed, failed, or - for a job that is not verified. CODE is the "
            "number that the\njob shows (211 passed, 212 failed). A strip is \"measured\" if it "
            "has a measurement without a result,\nand \"cut off\" if its result is not "
            "complete: see \"A job whose run was cut off\" in docs/stores.md.");

    auto group = program.group("job", "Jobs, with the files that belong to them");
    const auto removed = std::make_shared<DeleteOptions>();
    auto removing = addCommand<DeleteOptions>(
        group, invocation, "delete", "Remove jobs: ticket, JDF and the JDF's versions", removed,
        [&](const DeleteOptions& given) { remove(invocation, given); });
    removing.option("jobs", removed->jobs, "Numbers of the jobs").required();
    removing.flag("--family", removed->family, "The jobs of the same parent and the parent too");
    removing.flag("--dry-run", removed->dryRun, "Remove nothing, and say what would be freed");
    removing.footer(
        "There is no way back; \"archive\" moves jobs to another store instead. A JDF that another "
        "job names stays,\nand so do control strips, profiles and all other files of the server. "
        "A removal that was cut off is run again.");

    const auto options = std::make_shared<ResetOptions>();
    auto command = addCommand<ResetOptions>(
        program, invocation, "reset", "Let a job be measured again", options,
        [&](const ResetOptions& given) { reset(invocation, given); });
    command.option("job", options->job, "Number of the job").required();
    command.option("--strip", options->strip, "1 or 2; both where this is left out");
    command.flag("--family", options->family, "The jobs of the same parent and the parent too");
    command.footer(
        "For a job whose results were written in part only. Takes away the strip's count "
        "of measurements and\nits approval, and offers the job to the verifier again if "
        "it was closed. Measured values stay until\nnew ones take their place. The next "
        "run measures; a warning says why it can't succeed, as far as\nthe ticket shows it.");
}

} // namespace admin
