// SPDX-License-Identifier: Apache-2.0
#include <filesystem>
#include <iostream>

#include "companions/tintgate-store/Bytes.h"
#include "companions/tintgate-store/Commands.h"
#include "companions/tintgate-store/Days.h"
#include "companions/tintgate-store/Failure.h"
#include "companions/tintgate-store/JobJdf.h"
#include "companions/tintgate-store/LocalFile.h"
#include "companions/tintgate-store/Removal.h"
#include "companions/tintgate-store/Rows.h"
#include "companions/tintgate-store/TicketName.h"
#include "companions/tintgate-store/XmlCheck.h"

namespace admin {

namespace {

namespace fs = std::filesystem;

struct FileOptions {
    std::string local;
    std::string path;
    std::string version;
    std::string keep;
    std::string older;
    std::vector<std::string> paths;
    bool all = false;
    bool dryRun = false;
};

int versionNumber(const FileOptions& options) {
    return wholeNumber(options.version, 1, std::numeric_limits<int>::max(), "version");
}

/// As XML's judge sees a content: "xml" is null for what is no XML, "fault" tells what is wrong.
template<class Write>
void judge(Row& row, bool named, Write write) {
    XmlCheck check;
    write(check.stream());
    const bool isXml = named || check.looksLikeXml();
    const std::string fault = check.fault();
    row["wellFormed"] = isXml ? Row(fault.empty()) : Row();
    row["fault"] = isXml && !fault.empty() ? Row(fault) : Row();
}

/// Adds the result for people: "well-formed", or the error.
void tellXml(Row& row) {
    row["xml"] = row["wellFormed"].is_null() ? Row()
                 : row["fault"].is_null()
                     ? Row("well-formed")
                     : Row("not well-formed, " + row["fault"].get<std::string>());
}

Row versionRow(const Row& number, std::uint64_t size, std::int64_t time) {
    return {{"version", number}, {"size", size}, {"time", time}, {"written", shownTime(time)}};
}

/// A JDF that can't be prepared is delivered unchanged, because it is still the job's.
void deliver(store::StoreEngine& store, const std::string& local, const std::string& path,
             int updates) {
    LocalInput input(local);
    store.putFile(path, input.stream());
    if (updates == 0 || !isJdfName(path)) {
        return;
    }
    try {
        readyJdf(store, path, updates);
    } catch (const Failure& failure) {
        std::cerr << "tintgate-store: warning: delivered unchanged, " << failure.what() << '\n';
    }
}

void put(const Invocation& invocation, const FileOptions& options) {
    const auto store = invocation.open();
    const int updates = updatesAtDelivery(*store);
    std::error_code none;
    if (options.local == "-" || !fs::is_directory(options.local, none)) {
        deliver(*store, options.local, options.path, updates);
        return;
    }
    std::vector<fs::path> files;
    for (const auto& entry : fs::recursive_directory_iterator(options.local)) {
        if (entry.is_regular_file()) {
            files.push_back(entry.path());
        }
    }
    std::sort(files.begin(), files.end());
    Progress progress(files.size(), "files");
    std::size_t count = 0;
    for (const auto& file : files) {
        deliver(*store, file.string(),
                (fs::path(options.path) / fs::relative(file, options.local)).string(), updates);
        progress.done(++count);
    }
}

void get(const Invocation& invocation, const FileOptions& options) {
    const auto store = invocation.open();
    writeLocalFile(options.local, [&](std::ostream& to) {
        if (options.version.empty()) {
            store->getFile(options.path, to);
        } else {
            store->getVersion(options.path, versionNumber(options), to);
        }
    });
}

void list(const Invocation& invocation, const FileOptions& options) {
    const auto store = invocation.open();
    const std::string prefix = shownPath(options.path);
    std::vector<Row> rows;
    for (const auto& file : store->files()) {
        const std::string path = shownPath(file.path);
        if (path.compare(0, prefix.size(), prefix) != 0) {
            continue;
        }
        Row row{{"path", textOrBytes(path)},
                {"size", file.size},
                {"time", file.time},
                {"written", shownTime(file.time)},
                {"versions", store->versions(file.path).size()}};
        row["wellFormed"] = row["fault"] = nullptr;
        if (isXmlName(path)) {
            judge(row, true, [&](std::ostream& to) { store->getFile(file.path, to); });
        }
        if (!invocation.json) {
            tellXml(row);
        }
        rows.push_back(row);
    }
    showRows({{"path", "PATH"},
              {"size", "SIZE"},
              {"written", "WRITTEN"},
              {"versions", "OLD VERSIONS"},
              {"xml", "XML"}},
             rows, invocation.json);
}

void versions(const Invocation& invocation, const FileOptions& options) {
    const auto store = invocation.open();
    const bool named = isXmlName(options.path);
    std::vector<Row> rows;
    for (const auto& version : store->versions(options.path)) {
        Row row = versionRow(version.number, version.size, version.time);
        judge(row, named,
              [&](std::ostream& to) { store->getVersion(options.path, version.number, to); });
        rows.push_back(row);
    }
    const std::string wanted = shownPath(options.path);
    for (const auto& file : store->files()) {
        if (shownPath(file.path) == wanted) {
            Row row = versionRow("now", file.size, file.time);
            judge(row, named, [&](std::ostream& to) { store->getFile(file.path, to); });
            rows.push_back(row);
        }
    }
    if (rows.empty()) {
        throw Failure(Status::NotThere, "there is no file " + printable(wanted));
    }
    if (!invocation.json) {
        std::for_each(rows.begin(), rows.end(), tellXml);
    }
    showRows({{"version", "VERSION"}, {"size", "SIZE"}, {"written", "WRITTEN"}, {"xml", "XML"}},
             rows, invocation.json);
}

void restore(const Invocation& invocation, const FileOptions& options) {
    invocation.open()->restoreVersion(options.path, versionNumber(options));
}

void prune(const Invocation& invocation, const FileOptions& options) {
    if (options.all != options.path.empty()) {
        throw Failure(Status::BadCommand, "give a path, or --all");
    }
    if (options.keep.empty() && options.older.empty()) {
        throw Failure(Status::BadCommand, "say --keep, --older or both");
    }
    store::Pruning which;
    if (!options.keep.empty()) {
        which.keepNewest =
            wholeNumber(options.keep, 0, std::numeric_limits<int>::max(), "number of versions");
    }
    if (!options.older.empty()) {
        which.writtenBefore = timeBefore(daysOf(options.older, "--older"));
    }
    const auto store = invocation.open();
    Removal removal(*store, options.dryRun);
    if (options.all) {
        for (const auto& file : store->files()) {
            removal.prune(file.path, which);
        }
    } else {
        removal.prune(options.path, which);
    }
    removal.show(invocation.json);
}

void remove(const Invocation& invocation, const FileOptions& options) {
    const auto store = invocation.open();
    // All are looked for before the first is removed.
    for (const auto& path : options.paths) {
        if (!store->fileAt(path) && store->versions(path).empty()) {
            throw Failure(Status::NotThere, "there is no file " + printable(shownPath(path)));
        }
    }
    Removal removal(*store, options.dryRun);
    for (const auto& path : options.paths) {
        removal.removeFile(path);
    }
    removal.show(invocation.json);
}

void clean(const Invocation& invocation) {
    const int removed = invocation.open()->removeLeftovers();
    if (invocation.json) {
        showObject({{"leftovers", removed}}, true);
        return;
    }
    std::cout << "Removed " << counted(removed, "leftover") << '\n';
}

} // namespace

void addFileCommands(Command program, Invocation& invocation) {
    auto group = program.group("file", "Files of the server and their old versions");
    const auto options = std::make_shared<FileOptions>();
    const auto command = [&](const char* word, const char* text, auto run) -> Command {
        return addCommand<FileOptions>(
            group, invocation, word, text, options,
            [&invocation, run](const FileOptions& given) { run(invocation, given); });
    };
    const auto withPath = [&](Command added) {
        added.option("path", options->path, "Server path, such as /jobs/7/job.jdf").required();
    };

    auto putting = command("put", "Deliver a file, or all files of a folder", put);
    putting.option("local", options->local, "File or folder; - for standard input").required();
    withPath(putting);
    putting.footer(
        "A replaced file is kept as a version. A name that ends in .jdf is a JDF, which is "
        "prepared for\nits updates if the store requires it: see jdf --help.");

    auto getting = command("get", "Download a file", get);
    withPath(getting);
    getting.option("local", options->local, "Target; - for standard output").required();
    getting.option("--version", options->version, "An older version, by its number");

    command("list", "List files, and whether each XML file is well-formed", list)
        .option("prefix", options->path, "Only paths with this prefix");
    withPath(command("versions", "List versions of a file, and whether each is well-formed XML",
                     versions));

    auto restoring = command("restore", "Restore an older version", restore);
    withPath(restoring);
    restoring.option("version", options->version, "Its number").required();
    restoring.footer("The replaced file is kept as a version too.");

    auto pruning = command("prune", "Remove older versions", prune);
    pruning.option("path", options->path, "Server path");
    pruning.flag("--all", options->all, "Versions of all files");
    pruning.option("--keep", options->keep, "Number of newest versions to keep");
    pruning.option("--older", options->older,
                   "Only those that were written so long ago, such as 90d for 90 days");
    pruning.flag("--dry-run", options->dryRun, "Remove nothing, and say what would be freed");
    pruning.footer("With both, a version goes if neither keeps it. The oldest go first: a version "
                   "that stays keeps all\nyounger ones. The file itself stays in any case.");

    auto removing = command("delete", "Remove files with all their versions", remove);
    removing.option("paths", options->paths, "Server paths").required();
    removing.flag("--dry-run", options->dryRun, "Remove nothing, and say what would be freed");
    removing.footer("There is no way back. Whether a job names the file is not looked at: "
                    "\"job delete\" removes the files\nof a job.");

    command("clean", "Remove leftovers of interrupted deliveries",
            [](const auto& invoked, const auto&) { clean(invoked); });
}

} // namespace admin
