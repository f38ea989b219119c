// SPDX-License-Identifier: Apache-2.0
// A file with colours: CGATS text, CxF3 or ICC profile, recognised by its bytes, never by its name.
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "colour/CgatsText.h"
#include "colour/DataSet.h"
#include "colour/Failure.h"
#include "colour/Profile.h"

namespace colour {

/// After a successful load, exactly one of the two is set.
struct ColourFile {
    std::optional<DataSet> set;
    std::optional<Profile> profile;
};

/// Loads the file at `path` (bytes of the file system). On failure, `file` is unchanged.
Failure loadColourFile(const std::string& path, const CgatsWants& wants, ColourFile& file);

/// Loads the file at `path` as a profile. Anything else is NotRecognised, possibly before all of it
/// is read. On failure, `profile` may be empty.
Failure loadProfile(const std::string& path, Profile& profile);

/// Same for the bytes of a file.
Failure readColourFile(std::string_view bytes, const CgatsWants& wants, ColourFile& file);

/// base::readWholeFile with its outcome as a Failure: Missing, Unreadable, TooLarge (above `limit`)
/// or OutOfMemory.
Failure readWholeFile(const std::string& path, std::size_t limit, std::string& bytes);

/// True unless `path` is a regular file with non-CGATS contents. False for an unreadable regular
/// file.
bool isEmptyOrCgats(const std::string& path);

} // namespace colour
