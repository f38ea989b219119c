// SPDX-License-Identifier: Apache-2.0
#include "analysis/OutputFile.h"

#include <algorithm>
#include <cerrno>
#include <filesystem>
#include <system_error>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include "ExitCodes.h"
#include "base/Descriptor.h"
#include "base/FileDraft.h"
#include "colour/ColourFile.h"

namespace analysis {
namespace {

/// A larger old file is not kept in memory to be restored.
constexpr std::size_t largestKept = std::size_t{1} << 30;

/// Puts back what the first `written` bytes have replaced. It needs no room on the disk.
void restore(const base::Descriptor& file, std::string_view old, std::size_t written) {
    if (::lseek(file.get(), 0, SEEK_SET) == 0 &&
        base::writeAll(file, old.substr(0, written)) == std::min(old.size(), written)) {
        static_cast<void>(::ftruncate(file.get(), static_cast<off_t>(old.size())) == 0);
    }
}

int writeInPlace(const std::string& path, std::string_view bytes) {
    std::string old;
    struct stat status {};
    if (::stat(path.c_str(), &status) == 0 && S_ISREG(status.st_mode) &&
        colour::readWholeFile(path, largestKept, old) != colour::Failure::None) {
        return exitOutputNotWritable; // could not be restored after a failure
    }
    base::Descriptor file(::open(path.c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0666));
    if (!file.isOpen() || ::fstat(file.get(), &status) != 0) {
        return exitOutputNotWritable;
    }
    const std::size_t written = base::writeAll(file, bytes);
    const bool regular = S_ISREG(status.st_mode);
    if (written < bytes.size()) {
        if (regular) {
            restore(file, old, written);
        }
        return exitOutputIncomplete;
    }
    if (regular && ::ftruncate(file.get(), static_cast<off_t>(bytes.size())) != 0) {
        return exitOutputIncomplete;
    }
    return file.close() ? exitDone : exitOutputIncomplete;
}

int replaceWhole(const std::string& path, std::string_view bytes, bool exists) {
    base::FileDraft draft(path);
    if (!draft.isOpen()) {
        return exists ? writeInPlace(path, bytes) : static_cast<int>(exitOutputNotWritable);
    }
    if (!draft.write(bytes) || !draft.keepAccessOf(path)) {
        return exitOutputIncomplete;
    }
    if (draft.replace(path)) {
        return exitDone;
    }
    const bool isFull = errno == ENOSPC || errno == EDQUOT || errno == EIO;
    return isFull ? exitOutputIncomplete : exitOutputNotWritable;
}

} // namespace

int writeOutputFile(const std::string& path, std::string_view bytes) {
    struct stat old {};
    const bool exists = ::lstat(path.c_str(), &old) == 0;
    if (exists && S_ISDIR(old.st_mode)) {
        return exitOutputNotWritable;
    }
    // A rename would replace a file that its owner has made read-only.
    if (exists && ::access(path.c_str(), W_OK) != 0 && errno != ENOENT) {
        return exitOutputNotWritable;
    }
    if (exists && !S_ISREG(old.st_mode)) {
        return writeInPlace(path, bytes);
    }

    return replaceWhole(path, bytes, exists);
}

int checkOutput(const std::string& path, std::initializer_list<std::string> inputs) {
    for (const std::string& input : inputs) {
        std::error_code error; // Devices and pipes, and files that are not there, are not the same.
        if (std::filesystem::equivalent(path, input, error)) {
            return exitOutputIsInput;
        }
    }
    return colour::isEmptyOrCgats(path) ? exitDone : exitOutputNotOurs;
}

} // namespace analysis
