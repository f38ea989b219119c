// SPDX-License-Identifier: Apache-2.0
// A file that names colour: CGATS text, CxF3 or ICC profile, told apart by its bytes, never by its
// name.
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "colour/CgatsText.h"
#include "colour/DataSet.h"
#include "colour/Failure.h"
#include "colour/Profile.h"

namespace colour {

/// Exactly one of the two is set after a successful load.
struct ColourFile {
    std::optional<DataSet> set;
    std::optional<Profile> profile;
};

/// Loads the file at `path` (bytes as the file system has them). On failure `file` is untouched.
Failure loadColourFile(const std::string& path, const CgatsWants& wants, ColourFile& file);

/// Loads the file at `path` as a profile; NotRecognised if it is anything else. It need not be read
/// to its end for that. On failure `profile` may hold no profile.
Failure loadProfile(const std::string& path, Profile& profile);

/// The same of a file's bytes.
Failure readColourFile(std::string_view bytes, const CgatsWants& wants, ColourFile& file);

/// Whole contents of a file; Missing, Unreadable, TooLarge (above `limit`) or OutOfMemory. Devices
/// and pipes are read to their end, but no more than 512 MB of them (TooLarge), and a pipe that
/// stays silent for 30 seconds is Unreadable, and so is one that nobody opens to write within 2.
Failure readWholeFile(const std::string& path, std::size_t limit, std::string& bytes);

/// True unless `path` is a regular file with contents of another kind than CGATS text. False for a
/// regular file that can't be read.
bool isEmptyOrCgats(const std::string& path);

} // namespace colour
