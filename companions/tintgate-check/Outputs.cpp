// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-check/Outputs.h"

#include <cerrno>
#include <cstring>
#include <filesystem>
#include <system_error>

#include "ExitCodes.h"
#include "base/Utf8.h"
#include "base/WholeFile.h"
#include "colour/ColourFile.h"
#include "companions/tintgate-check/Words.h"
#include "report/OwnFile.h"

namespace check {
namespace {

namespace fs = std::filesystem;

/// Whether the file is an earlier output of this kind.
bool isOwn(Output output, const std::string& path) {
    constexpr std::size_t largestLabel = std::size_t{1} << 28;
    switch (output) {
    case Output::Page:
        return report::isOwnFile(report::OwnKind::Page, path);
    case Output::Result:
        return report::isOwnFile(report::OwnKind::Result, path);
    case Output::Broken:
        return report::isOwnFile(report::OwnKind::Broken, path);
    case Output::Label:
    case Output::Certificate:
        break;
    }
    std::error_code ignored;
    std::string bytes;
    return fs::is_regular_file(path, ignored) &&
           colour::readWholeFile(path, largestLabel, bytes) == colour::Failure::None &&
           label::isOurs(bytes);
}

Problem notWritten(const std::string& path, int reason) {
    const Say remedy =
        reason == ENOSPC || reason == EDQUOT || reason == EFBIG  ? Say::OutputFullRemedy
        : reason == EACCES || reason == EPERM || reason == EROFS ? Say::OutputForbiddenRemedy
        : reason == ENOENT || reason == ENOTDIR                  ? Say::OutputNoFolderRemedy
                                                                 : Say::OutputOtherRemedy;
    return {exitResultNotWritten,
            say(Say::OutputNotWritten, {path, std::strerror(reason)}),
            {},
            say(remedy)};
}

} // namespace

std::string Outputs::endingOf(Output output) const {
    switch (output) {
    case Output::Page:
        return ".html";
    case Output::Result:
        return ".json";
    case Output::Broken:
        return ".error.json";
    case Output::Label:
        return m_labels.format == label::Format::Png   ? ".label.png"
               : m_labels.format == label::Format::Svg ? ".label.svg"
                                                       : ".label.pdf";
    case Output::Certificate:
        break;
    }
    return ".pdf";
}

std::string Outputs::pathOf(const Measurement& measurement, Output output,
                            const std::string& mark) const {
    constexpr std::size_t longestName = 255;
    const fs::path place =
        m_folder.empty() ? fs::path(measurement.path) : fs::path(m_folder) / measurement.relative;
    const std::string ending = (mark.empty() ? "" : "." + mark) + endingOf(output);
    std::string name = place.stem();
    if (name.empty()) {
        name = "measurement";
    }
    return place.parent_path() /
           std::string(base::cutUtf8(name, longestName - ending.size())).append(ending);
}

std::optional<Problem> Outputs::check(const Measurement& measurement, Output output,
                                      const std::string& path) const {
    std::error_code ignored;
    if (!fs::exists(fs::status(path, ignored))) {
        return std::nullopt;
    }
    std::error_code different;
    bool isInput = fs::equivalent(path, measurement.path, different);
    for (const std::string& input : m_inputs) {
        isInput = isInput || fs::equivalent(path, input, different);
    }
    if (isInput) {
        return Problem{
            exitOutputIsInput, say(Say::OutputIsInput, {path}), {}, say(Say::OutputIsInputRemedy)};
    }
    if (!isOwn(output, path)) {
        return Problem{
            exitOutputNotOurs, say(Say::OutputNotOurs, {path}), {}, say(Say::OutputNotOursRemedy)};
    }
    return std::nullopt;
}

void Outputs::claim(Measurement& measurement) {
    if (m_page || m_result || m_labels.isAny()) {
        measurement.isSecond = !m_claimed.insert(pathOf(measurement, Output::Result)).second;
    }
}

std::optional<Problem> Outputs::write(const Measurement& measurement, Output output,
                                      std::string_view text, const std::string& mark) {
    const std::string path = pathOf(measurement, output, mark);
    if (measurement.isSecond) {
        return Problem{
            exitOutputNotOurs, say(Say::OutputTwice, {path}), {}, say(Say::OutputTwiceRemedy)};
    }
    if (auto problem = check(measurement, output, path)) {
        return problem;
    }
    std::error_code failure;
    const fs::path folder = fs::path(path).parent_path();
    if (!folder.empty()) {
        fs::create_directories(folder, failure);
        if (failure && !fs::is_directory(folder)) {
            return notWritten(path, failure.value());
        }
    }
    if (!base::writeWholeFile(path, text)) {
        return notWritten(path, errno);
    }
    return std::nullopt;
}

} // namespace check
