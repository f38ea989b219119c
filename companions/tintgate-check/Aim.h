// SPDX-License-Identifier: Apache-2.0
// What measurements are held against in one run: read once, and only read afterwards.
#pragma once

#include <string>

#include "analysis/Inputs.h"
#include "analysis/Presets.h"
#include "companions/tintgate-check/Conditions.h"

namespace check {

/// What the command line says of it; everything may be empty.
struct AimWanted {
    std::string condition;
    std::string target;
    std::string preset;
    std::string patchSet;
};

struct Aim {
    std::string condition; ///< Its name; empty if the command line alone decides.
    std::string paper;     ///< Texts of the condition; may be empty.
    std::string printer;
    std::string targetPath; ///< All paths are bytes as the file system has them.
    std::string presetPath;
    std::string patchSetPath; ///< May be empty.

    tolerancePresetParameterRecord preset;
    analysis::PresetOptions options;
    analysis::ComparisonWants wants;
    std::string measurementCondition; ///< "M1": what is read of files with several.
    analysis::References references;
};

/// Finds and loads it. What the command line names takes the place of the condition's. Without a
/// preset it is the contract proof. Throws Failure: BadCommand for a name that nothing has, NotDone
/// for a file that can't be used.
Aim loadAim(const Conditions& conditions, const AimWanted& wanted);

} // namespace check
