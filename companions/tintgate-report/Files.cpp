// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-report/Files.h"

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <memory>

#include <sys/stat.h>

#include "base/WholeFile.h"
#include "companions/tintgate-report/Failure.h"
#include "companions/tintgate-report/Filter.h"
#include "report/OwnFile.h"
#include "report/Page.h"
#include "report/PageFile.h"
#include "report/label/CodeText.h"

namespace report {
namespace {

namespace fs = std::filesystem;

constexpr std::size_t mostBytes = std::size_t{1} << 30; ///< Of a result: millions of patches.

std::string bytesOf(const std::string& path, std::size_t most = mostBytes) {
    std::string bytes;
    switch (base::readWholeFile(path == "-" ? "/dev/stdin" : path, most, bytes)) {
    case base::Reading::Done:
        return bytes;
    case base::Reading::Missing:
        throw Failure(Status::Unreadable, path + " is not there");
    case base::Reading::TooLarge:
        throw Failure(Status::Unreadable, path + " is too large");
    default:
        throw Failure(Status::Unreadable, path + " can't be read");
    }
}

report::Meta metaOf(const std::string& path) {
    std::string problem;
    if (auto meta = report::readMeta(bytesOf(path), problem)) {
        return *meta;
    }
    throw Failure(Status::Broken, path + " is broken: " + problem);
}

/// Standard output and whatever else is not a plain file.
void writeInPlace(const std::string& path, std::string_view text) {
    const bool standardOutput = path == "-";
    const std::unique_ptr<std::FILE, int (*)(std::FILE*)> opened(
        standardOutput ? nullptr : std::fopen(path.c_str(), "wbe"),
        [](std::FILE* file) { return file != nullptr ? std::fclose(file) : 0; });
    std::FILE* const file = standardOutput ? stdout : opened.get();
    if (file == nullptr || std::fwrite(text.data(), 1, text.size(), file) != text.size() ||
        std::fflush(file) != 0) {
        throw Failure(Status::NotWritten, (standardOutput ? "standard output" : path) +
                                              " can't be written: " + std::strerror(errno));
    }
}

} // namespace

std::string LoadedResult::folder() const {
    const std::size_t slash = path.rfind('/');
    return slash == path.npos ? "." : slash == 0 ? "/" : path.substr(0, slash);
}

std::string LoadedResult::stem() const {
    const std::string name = path == "-" ? "result" : fs::path(path).filename().string();
    return name.ends_with(".json") && name.size() > 5 ? name.substr(0, name.size() - 5) : name;
}

LoadedResult loadResult(const std::string& path, const std::string& metaPath, std::string& note,
                        Hash hash) {
    LoadedResult loaded;
    loaded.path = path;
    std::string problem;
    const std::string bytes = bytesOf(path);
    auto result = report::readResult(bytes, problem);
    if (!result) {
        throw Failure(Status::Broken, path + " is broken: " + problem);
    }
    loaded.result = std::move(*result);
    if (hash == Hash::Wanted) {
        loaded.hash = label::hashOf(bytes);
    }
    if (!metaPath.empty()) {
        loaded.meta = metaOf(metaPath);
        return loaded;
    }
    const std::string beside = loaded.folder() + "/meta.json";
    std::error_code ignored;
    if (loaded.stem() != "output" || !fs::exists(fs::symlink_status(beside, ignored))) {
        return loaded;
    }
    try {
        loaded.meta = metaOf(beside);
    } catch (const Failure& failure) {
        note = failure.what() + std::string("; the result goes without it");
    }
    return loaded;
}

std::int64_t timeOfResult(const LoadedResult& loaded, bool& byFile) {
    byFile = false;
    if (loaded.meta) {
        if (const auto time = timeOf(loaded.meta->created)) {
            return *time;
        }
    }
    for (const auto& [label, text] : loaded.result.measurement.statements) {
        if (label == "created") {
            if (const auto time = timeOf(text)) {
                return *time;
            }
        }
    }
    struct stat status {};
    byFile = true;
    stat(loaded.path.c_str(), &status);
    return localTime(status.st_mtime);
}

std::string standardInput(std::size_t mostBytes) {
    return bytesOf("-", mostBytes);
}

std::string pageOf(const LoadedResult& loaded, std::optional<languages::Language> language) {
    const Meta* const meta = loaded.metaOrNull();
    return pageOf(loaded.result, meta, languages::Texts(language ? *language : languageOf(meta)));
}

std::vector<std::string> filesOf(const std::vector<std::string>& arguments) {
    std::vector<std::string> files;
    for (const std::string& argument : arguments) {
        std::error_code failure;
        if (!fs::is_directory(argument, failure)) {
            files.push_back(argument);
            continue;
        }
        std::vector<std::string> inside;
        constexpr auto options = fs::directory_options::skip_permission_denied;
        for (fs::recursive_directory_iterator at(argument, options, failure), end;
             !failure && at != end; at.increment(failure)) {
            // Other JSON may be there, too.
            if (at->path().filename().string().ends_with(".json") &&
                report::isOwnFile(report::OwnKind::Result, at->path())) {
                inside.push_back(at->path());
            }
        }
        if (failure) {
            throw Failure(Status::Unreadable, argument + " can't be read: " + failure.message());
        }
        std::sort(inside.begin(), inside.end());
        files.insert(files.end(), inside.begin(), inside.end());
    }
    return files;
}

std::string relativeTo(const std::string& folder, const std::string& path) {
    std::error_code failure;
    return fs::relative(path, folder, failure).string();
}

void writeOutput(const std::string& path, std::string_view text) {
    std::error_code ignored;
    if (path == "-" || fs::is_other(fs::status(path, ignored))) {
        return writeInPlace(path, text);
    }
    if (!base::writeWholeFile(path, text)) {
        throw Failure(Status::NotWritten, path + " can't be written: " + std::strerror(errno));
    }
}

} // namespace report
