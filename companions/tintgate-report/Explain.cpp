// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-report/Explain.h"

#include <algorithm>
#include <iterator>
#include <string_view>

#include "ExitCodes.h"
#include "companions/tintgate-report/CheckPreset.h"
#include "companions/tintgate-report/Failure.h"

namespace report {
namespace {

/// The text after its label, wrapped at blanks to fit a terminal.
std::string paragraph(const std::string& label, const std::string& text) {
    constexpr std::size_t indent = 8;
    constexpr std::size_t width = 79;
    std::string lines = label;
    lines.resize(indent, ' ');
    std::size_t column = indent;
    for (std::size_t start = 0; start < text.size();) {
        const std::size_t end = std::min(text.find(' ', start), text.size());
        if (column > indent && column + 1 + end - start > width) {
            lines += '\n' + std::string(indent, ' ');
            column = indent;
        }
        if (column > indent) {
            lines += ' ';
            ++column;
        }
        lines += text.substr(start, end - start);
        column += end - start;
        start = end + 1;
    }
    return lines + '\n';
}

/// Most job codes have several causes, and this program does not know the job.
constexpr char finder[] = "'tintgate-store diagnose JOB' names what is wrong with a job.";

/// The meaning of a code if a job on the print server ended with it.
std::string jobParagraph(const ExitCodeText& code) {
    std::string text;
    if (std::string_view(code.jobCause) != code.cause) {
        text += code.jobCause + std::string(". ");
    }
    text += "Who acts: " + std::string(code.jobActor) + ". Retry: " + code.jobRetry + ". " + finder;
    return paragraph("Job", text);
}

/// The folder named in remedies about presets. Nothing if it is unknown.
std::string presetsParagraph(int code) {
    const bool isAboutPresets =
        (code >= exitPresetMissing && code <= exitPresetUnknownEntry) || code == exitPresetFailed;
    const std::string folder = isAboutPresets ? installedPresets() : "";
    return folder.empty() ? "" : paragraph("Presets", folder);
}

} // namespace

std::string explanationOf(int code) {
    const auto found = std::find_if(std::begin(exitCodeTexts), std::end(exitCodeTexts),
                                    [&](const ExitCodeText& text) { return text.code == code; });
    if (found == std::end(exitCodeTexts)) {
        throw Failure(Status::UnknownCode,
                      "Tintgate has no exit code " + std::to_string(code) +
                          (code > 128 && code < 160 ? "; a shell gives 128 and the number of the "
                                                      "signal that ended a program"
                                                    : ""));
    }
    std::string text = paragraph(std::to_string(code), found->meaning + std::string(".")) +
                       paragraph("Cause", found->cause + std::string(".")) +
                       paragraph("Remedy", found->remedy + std::string("."));
    text += presetsParagraph(code);
    if (found->jobActor != nullptr) {
        text += jobParagraph(*found);
    }
    return text;
}

} // namespace report
