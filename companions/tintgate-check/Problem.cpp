// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-check/Problem.h"

#include <algorithm>
#include <cerrno>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string_view>

#include <unistd.h>

#include "ExitCodes.h"
#include "companions/tintgate-check/Words.h"

namespace check {
namespace {

namespace fs = std::filesystem;

/// Other kinds of files, recognised by their first bytes.
struct OtherKind {
    std::string_view start;
    Say what;
    Say remedy;
};

constexpr OtherKind otherKinds[] = {
    {"PK\x03\x04", Say::IsSpreadsheet, Say::IsSpreadsheetRemedy},
    {"\xD0\xCF\x11\xE0", Say::IsSpreadsheet, Say::IsSpreadsheetRemedy}, // the older workbooks
    {"%PDF", Say::IsPdf, Say::IsPdfRemedy},
    {"\xFF\xD8\xFF", Say::IsPicture, Say::IsPictureRemedy},
    {"\x89PNG", Say::IsPicture, Say::IsPictureRemedy},
    {"II*", Say::IsPicture, Say::IsPictureRemedy},
    {std::string_view("MM\0*", 4), Say::IsPicture, Say::IsPictureRemedy},
};

std::string startOf(const std::string& path) {
    std::string bytes(2048, '\0');
    std::ifstream file(path, std::ios::binary);
    file.read(bytes.data(), static_cast<std::streamsize>(bytes.size()));
    bytes.resize(static_cast<std::size_t>(std::max(file.gcount(), std::streamsize{0})));
    return bytes;
}

/// Of a regular file that is neither text, CxF nor profile.
void describeOtherKind(const std::string& path, Problem& problem) {
    const auto set = [&](Say what, Say remedy) {
        problem.what = say(what);
        problem.cause.clear();
        problem.remedy = say(remedy, {path});
    };
    const std::string start = startOf(path);
    if (start.empty()) {
        return set(Say::EmptyFile, Say::EmptyFileRemedy);
    }
    for (const OtherKind& kind : otherKinds) {
        if (start.starts_with(kind.start)) {
            return set(kind.what, kind.remedy);
        }
    }
    if (start.find("<tolerancePreset") != start.npos) {
        return set(Say::IsPreset, Say::IsPresetRemedy);
    }
    if (start.find("\"tintgate-result\"") != start.npos) {
        return set(Say::IsResult, Say::IsResultRemedy);
    }
}

} // namespace

Problem problemOf(int code) {
    const auto found = std::find_if(std::begin(exitCodeTexts), std::end(exitCodeTexts),
                                    [&](const ExitCodeText& text) { return text.code == code; });
    if (found == std::end(exitCodeTexts)) {
        return problemOf(exitInternalFailure);
    }
    return {code, found->meaning, found->cause, found->remedy};
}

Problem problemOfFile(int code, const std::string& path) {
    Problem problem = problemOf(code);
    std::error_code ignored;
    const fs::file_status status = fs::status(path, ignored);
    switch (code) {
    case exitInputMissing: {
        const bool isPattern = path.find_first_of("*?[") != path.npos;
        problem.what = say(isPattern ? Say::NoMatch : Say::NoFile, {path});
        problem.cause.clear();
        problem.remedy = say(isPattern ? Say::NoMatchRemedy : Say::NoFileRemedy);
        break;
    }
    case exitInputUnreadable:
        if (fs::is_directory(status)) {
            problem.what = say(Say::IsFolder);
            problem.cause.clear();
            problem.remedy = say(Say::IsFolderRemedy);
        } else if (access(path.c_str(), R_OK) != 0 && errno == EACCES) {
            problem.what = say(Say::NotAllowedToRead);
            problem.cause.clear();
            problem.remedy = say(Say::NotAllowedToReadRemedy);
        }
        break;
    case exitInputNotRecognised:
        if (fs::is_regular_file(status)) {
            describeOtherKind(path, problem);
        }
        break;
    default:
        break;
    }
    return problem;
}

} // namespace check
