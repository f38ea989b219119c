// SPDX-License-Identifier: Apache-2.0
#include <filesystem>

#include "companions/tintgate-report/Failure.h"
#include "companions/tintgate-report/Files.h"
#include "companions/tintgate-report/Trend.h"
#include "jobkeys/Tickets.h"
#include "report/Page.h"
#include "report/PageFile.h"

namespace report {
namespace {

namespace fs = std::filesystem;

/// The path of the job's page from the trend's page.
std::string pageFor(const LoadedResult& loaded, const PagePlace& place,
                    std::optional<languages::Language> language) {
    if (place.folder.empty()) {
        return {};
    }
    const std::string stem = loaded.meta ? report::pageStem(*loaded.meta) : loaded.stem();
    const std::string viewers = loaded.folder() + "/" + stem + ".html";
    std::error_code ignored;
    if (loaded.meta && fs::is_regular_file(viewers, ignored)) {
        return relativeTo(place.folder, viewers);
    }

    if (place.name.empty()) {
        return {};
    }
    const std::string folder = place.folder + "/" + place.name;
    std::error_code failure;
    fs::create_directory(folder, failure);
    const std::string name =
        loaded.meta ? "job-" + std::to_string(loaded.meta->jobId) + "-" + stem.substr(7) : stem;
    std::string problem = failure.message();
    const std::string page =
        failure ? "" : report::keepPage(folder, name, pageOf(loaded, language), problem);
    if (page.empty()) {
        throw Failure(Status::NotWritten, "can't write a page in " + folder + ": " + problem);
    }
    return place.name + page.substr(folder.size());
}

/// The folder that one printer's results share: the result's folder, or for a job's result the
/// parent of the job's folder (JobID_7).
std::string printersFolder(const LoadedResult& loaded) {
    std::error_code failure;
    fs::path folder = fs::canonical(loaded.folder(), failure);
    if (failure) {
        return loaded.folder();
    }
    if (loaded.meta && folder.filename().string().starts_with(jobkeys::jobFolderPrefix)) {
        folder = folder.parent_path();
    }
    return fs::proximate(folder).string();
}

} // namespace

Gathered gatherFiles(const std::vector<std::string>& arguments, const Filter& filter,
                     SeriesBy seriesBy, const PagePlace& place,
                     std::optional<languages::Language> language, const languages::Texts& say,
                     const std::function<void(const std::string&)>& complain) {
    Gathered gathered;
    std::size_t byFile = 0;
    for (const std::string& path : filesOf(arguments)) {
        try {
            std::string note;
            const LoadedResult loaded = loadResult(path, "", note);
            if (!note.empty()) {
                complain(note);
            }
            report::Sample sample = report::sampleOf(loaded.result, loaded.metaOrNull());
            if (seriesBy == SeriesBy::Folders) {
                sample.folder = printersFolder(loaded);
            }
            bool guessed = false;
            sample.time = timeOfResult(loaded, guessed);
            if (!filter.takes(sample)) {
                continue;
            }
            byFile += guessed;
            sample.page = pageFor(loaded, place, language);
            gathered.samples.push_back(std::move(sample));
        } catch (const Failure& failure) {
            if (failure.status == Status::NotWritten) {
                throw;
            }
            complain(failure.what());
            ++gathered.leftOut;
        }
    }
    if (byFile != 0) {
        gathered.notes.push_back(say("trendNote.byFile", {{"count", byFile}}));
    }
    if (gathered.leftOut != 0) {
        gathered.notes.push_back(say("trendNote.leftOut", {{"count", gathered.leftOut}}));
    }
    return gathered;
}

} // namespace report
