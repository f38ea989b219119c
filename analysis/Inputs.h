// SPDX-License-Identifier: Apache-2.0
// The files of a comparison. They are read once and shared by all comparisons that need them.
#pragma once

#include <memory>
#include <string>
#include <string_view>

#include "colour/ColourFile.h"

namespace analysis {

/// The contents of a colour file. Nothing changes them, so comparisons in several threads can share
/// them. Neither pointer is set if no file is given; otherwise exactly one is.
struct SharedFile {
    std::shared_ptr<const colour::DataSet> set;
    std::shared_ptr<const colour::Profile> profile;
    std::string identity; ///< colour::identityOf if already known, otherwise empty.

    bool isGiven() const { return set != nullptr || profile != nullptr; }
};

// Each of these returns 0 or a code of docs/exit-codes.csv. On failure `file` is unchanged.

/// Loads a target or a measurement, which must have colour values.
int loadSide(const std::wstring& path, const colour::CgatsWants& wants, SharedFile& file);

/// The same from the bytes of a file.
int readSide(std::string_view bytes, const colour::CgatsWants& wants, SharedFile& file);

/// Loads a patch set. A patch set selects by process colours, so it must be a text that has them.
int loadPatchSet(const std::wstring& path, SharedFile& file);

/// The files that measurements are compared with.
struct References {
    std::wstring targetPath;
    std::wstring patchSetPath; ///< May be empty.
    SharedFile target;
    SharedFile patchSet;
};

/// Loads the target and, if its path is not empty, the patch set. `wants` is of the target
/// (targetWants in analysis/Comparison.h).
int loadReferences(const std::wstring& targetPath, const std::wstring& patchSetPath,
                   const colour::CgatsWants& wants, References& references);

/// True if both paths lead to the same file, even under different names.
bool isSameFile(const std::wstring& left, const std::wstring& right);

} // namespace analysis
