// SPDX-License-Identifier: Apache-2.0
#include "analysis/Inputs.h"

#include <filesystem>
#include <system_error>
#include <utility>

#include "ExitCodes.h"
#include "analysis/Status.h"
#include "base/WideBytes.h"

namespace analysis {
namespace {

SharedFile shared(colour::ColourFile&& file) {
    SharedFile result;
    if (file.set) {
        result.set = std::make_shared<const colour::DataSet>(std::move(*file.set));
    } else {
        result.profile = std::make_shared<const colour::Profile>(std::move(*file.profile));
    }
    return result;
}

int takeSide(colour::Failure failure, colour::ColourFile&& loaded, SharedFile& file) {
    if (const int status = statusOf(failure)) {
        return status;
    }
    if (loaded.set && !loaded.set->hasColour()) {
        return exitNoColourValues;
    }
    file = shared(std::move(loaded));
    return exitDone;
}

} // namespace

int loadSide(const std::wstring& path, const colour::CgatsWants& wants, SharedFile& file) {
    colour::ColourFile loaded;
    const colour::Failure failure =
        colour::loadColourFile(base::bytesFromWide(path), wants, loaded);
    return takeSide(failure, std::move(loaded), file);
}

int readSide(std::string_view bytes, const colour::CgatsWants& wants, SharedFile& file) {
    colour::ColourFile loaded;
    const colour::Failure failure = colour::readColourFile(bytes, wants, loaded);
    return takeSide(failure, std::move(loaded), file);
}

int loadPatchSet(const std::wstring& path, SharedFile& file) {
    colour::ColourFile loaded;
    if (const int status = statusOf(
            colour::loadColourFile(base::bytesFromWide(path), {.spectra = false}, loaded))) {
        return status;
    }
    if (loaded.profile) {
        return exitPatchSetNotText;
    }
    if (!loaded.set->hasCmyk()) {
        return exitNoDeviceValues;
    }
    file = shared(std::move(loaded));
    return exitDone;
}

int loadReferences(const std::wstring& targetPath, const std::wstring& patchSetPath,
                   const colour::CgatsWants& wants, References& references) {
    References loaded{targetPath, patchSetPath, {}, {}};
    if (const int status = loadSide(targetPath, wants, loaded.target)) {
        return status;
    }
    if (!patchSetPath.empty()) {
        if (const int status = loadPatchSet(patchSetPath, loaded.patchSet)) {
            return status;
        }
    }
    references = std::move(loaded);
    return exitDone;
}

bool isSameFile(const std::wstring& left, const std::wstring& right) {
    std::error_code error; // Devices and pipes, and files that are not there, are not the same.
    return std::filesystem::equivalent(base::bytesFromWide(left), base::bytesFromWide(right),
                                       error);
}

} // namespace analysis
