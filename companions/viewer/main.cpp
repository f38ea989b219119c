// SPDX-License-Identifier: Apache-2.0
// Shows a verified job: creates a page of its result and opens it. The tool looks for this program
// at "/Applications/Nerova/Nerova Verify.app/Contents/MacOS/Nerova Verify" below the system root.
#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstring>
#include <new>
#include <optional>
#include <string>
#include <string_view>
#include <unistd.h>
#include <vector>

#include "CompanionStatuses.h"
#include "base/WholeFile.h"
#include "companions/viewer/Browser.h"
#include "companions/viewer/LabelProgram.h"
#include "companions/viewer/LabelSettings.h"
#include "companions/viewer/MissingWrites.h"
#include "platform/TemporaryFolder.h"
#include "report/Meta.h"
#include "report/Page.h"
#include "report/PageFile.h"
#include "report/Reports.h"
#include "report/Result.h"

namespace {

using Status = NerovaVerifyStatus; ///< Listed in docs/companion-statuses.csv.

constexpr std::size_t mostBytes = std::size_t{1} << 30; ///< Limit of a result: millions of patches.

constexpr const char* help = R"(Shows the result of a verified job as a page in the browser.

  Nerova Verify                       the index of all reports in the temporary folder
  Nerova Verify -detail -meta PATH    the report of the job whose meta file is PATH

The page is written next to the meta file, as report-strip1-2024-05-01-123456.html, and opened if
there is a display. PATH is all words after -meta, joined by single blanks. On a terminal, the
page's path is printed.

)";

int end(Status status) {
    return static_cast<int>(status);
}

int fail(Status status, const std::string& words) {
    std::fprintf(stderr, "Nerova Verify: %s\n", words.c_str());
    return end(status);
}

bool read(const std::string& path, std::string& bytes) {
    return base::readWholeFile(path, mostBytes, bytes) == base::Reading::Done;
}

std::string folderOf(const std::string& path) {
    const std::size_t slash = path.rfind('/');
    return slash == path.npos ? "." : slash == 0 ? "/" : path.substr(0, slash);
}

int show(const std::string& page) {
    if (isatty(STDOUT_FILENO)) {
        std::printf("%s\n", page.c_str());
    }
    std::string problem;
    if (viewer::hasDisplay() && !viewer::openFile(page, problem)) {
        return fail(Status::PageNotOpened, page + " can't be opened: " + problem);
    }
    return end(Status::Done);
}

/// Has labels made as this machine's settings want it. False if that could not be started.
bool startLabels(const report::Result& result, const std::string& page,
                 const viewer::LabelInput& input) {
    std::string problem;
    const auto settings = viewer::readLabelSettings(viewer::labelSettingsPath(), problem);
    const bool isPassed = result.verdict == report::Verdict::Passed;
    if (settings && (!settings->areWanted() || (settings->onlyPassed && !isPassed))) {
        return true;
    }
    if (settings && viewer::startLabelProgram(*settings, page, input, problem)) {
        return true;
    }
    fail(Status::LabelNotStarted, "no label is made: " + problem);
    return false;
}

int showReport(const std::string& metaPath) {
    std::string metaBytes;
    std::string bytes;
    std::string problem;
    if (!read(metaPath, metaBytes)) {
        return fail(Status::MetaMissing, "can't read " + metaPath);
    }
    const std::optional<report::Meta> meta = report::readMeta(metaBytes, problem);
    if (!meta) {
        return fail(Status::MetaBroken, metaPath + " is broken: " + problem);
    }
    const std::string folder = folderOf(metaPath);
    const std::string resultPath = folder + "/output.json";
    if (!read(resultPath, bytes)) {
        return fail(Status::ResultMissing, "can't read " + resultPath);
    }
    std::optional<report::Result> result = report::readResult(bytes, problem);
    if (!result) {
        return fail(Status::ResultBroken, resultPath + " is broken: " + problem);
    }
    const store::WriteFailures failures(platform::temporaryFolder());
    const languages::Texts say(report::languageOf(&*meta));
    const std::string missing = viewer::missingWrites(failures.all(), folder, *meta, say);
    if (!missing.empty()) {
        result->warnings.insert(result->warnings.begin(), report::Warning{.text = missing});
    }
    const std::string page = report::keepPage(folder, report::pageStem(*meta),
                                              report::pageOf(*result, &*meta, say), problem);
    if (page.empty()) {
        return fail(Status::PageNotWritten, "can't write a page in " + folder + ": " + problem);
    }
    const bool isLabelled = startLabels(*result, page, {bytes, metaBytes});
    const int shown = show(page);
    return shown == end(Status::Done) && !isLabelled ? end(Status::LabelNotStarted) : shown;
}

int showIndex() {
    const std::string temporary = platform::temporaryFolder();
    if (temporary.empty()) {
        return fail(Status::PageNotWritten, "there is no usable temporary folder");
    }
    // The tool's working folder, or the temporary folder if that does not exist yet.
    const std::string working = temporary + "/Tintgate";
    const std::string folder = access(working.c_str(), W_OK | X_OK) == 0 ? working : temporary;
    const std::string path = folder + "/reports.html";
    const languages::Texts say(languages::languageOfUser());
    if (!base::replaceWholeFile(path, report::indexOf(report::reportsBelow(folder), folder, say))) {
        return fail(Status::PageNotWritten, "can't write " + path + ": " + std::strerror(errno));
    }
    return show(path);
}

int run(const std::vector<std::string_view>& words) {
    if (words.empty()) {
        return showIndex();
    }
    if (words.size() == 1 && (words[0] == "--help" || words[0] == "-h")) {
        return end(std::fputs((std::string(help) + nerovaVerifyStatusHelp).c_str(), stdout) < 0
                       ? Status::PageNotWritten
                       : Status::Done);
    }
    const std::size_t meta = words[0] == "-detail" ? 1 : 0;
    if (words.size() < meta + 2 || words[meta] != "-meta") {
        return fail(Status::BadCommand, "invalid arguments; see --help");
    }
    // Callers do not quote the path, so blanks split it into words.
    std::string path(words[meta + 1]);
    for (std::size_t i = meta + 2; i < words.size(); ++i) {
        path.append(" ").append(words[i]);
    }
    return showReport(path);
}

} // namespace

int main(int argumentCount, char** arguments) {
    // The page is wanted even if the terminal of the run is closed meanwhile.
    std::signal(SIGHUP, SIG_IGN);
    try {
        return run({arguments + (argumentCount > 0), arguments + argumentCount});
    } catch (const std::bad_alloc&) {
        return fail(Status::OutOfMemory, "out of memory");
    }
}
