// SPDX-License-Identifier: Apache-2.0
// Finds a job's control strip, references and JDF in its ticket. A lookup asks for texts with
//
//   std::string text(const std::string& key);     empty if the ticket has no text for this key
//
// and reads the next key only if the previous one was not usable.
#pragma once

#include <algorithm>
#include <iterator>
#include <string>

#include "jobkeys/StripKeys.h"

namespace jobkeys {

inline constexpr const char* stripFileKey = "Footer/ControlstripFile";
inline constexpr const char* nestedStripFileKey = "Footer/Nesting/ControlstripFile";
inline constexpr const char* stripProfileKey = "Footer/ControlstripInputProfile";
inline constexpr const char* usedProfileKey = "Remote/UsedICCProfile";
inline constexpr const char* characterisationKey = "Workflow/Verify/CharacterizationData";
inline constexpr const char* workflowKey = "Workflow/Verify/MeasurementWorkflow";
inline constexpr const char* dynamicStripKey = "Footer/Dynstrip/IT8";
inline constexpr const char* jdfNameKey = "Output/Jdf/FileName";
inline constexpr const char* temporaryFolderKey = "System/Folders/Temp";
inline constexpr const char* outFolderKey = "Workflow/RemoteOutFolder";
inline constexpr const char* remoteJdfKey = "Remote/JDFName";

/// A dynamic strip replaces the first strip only.
constexpr bool isDynamic(Strip strip, int useDynstrip) {
    return useDynstrip == 1 && strip == Strip::First;
}

/// The name of a strip that is not dynamic. Its own key is used if it has at least four bytes.
template<class Text>
std::string fixedStripName(Strip strip, Text text) {
    constexpr std::size_t shortestName = 4; // In bytes (C33).
    std::string name = text(stripKey(strip, stripFileKey));
    return name.size() >= shortestName ? name : text(stripKey(strip, nestedStripFileKey));
}

/// Where a strip's references come from.
enum class ReferenceWay {
    Packaging,        ///< Packaging workflow: characterization data, or else the strip's values.
    Profile,          ///< referenceProfile.
    DynamicStrip,     ///< The values of the strip itself.
    Characterisation, ///< The file of characterisationKey.
    Stored,           ///< Values in the ticket.
    None,
};

/// True if references in the ticket are looked for: those of a strip that was measured.
constexpr bool mayUseStored(int workflow, int measurementStatus) {
    return workflow == 3 && measurementStatus > 0;
}

/// The first source whose condition is true. `workflow` is the value of workflowKey. References are
/// stored if mayUseStored, and the ticket has at least one.
constexpr ReferenceWay referenceWay(bool fromPackaging, int workflow, bool isDynamic,
                                    bool hasStored) {
    return fromPackaging && workflow == 4                   ? ReferenceWay::Packaging
           : workflow == 1 || (workflow == 3 && !hasStored) ? ReferenceWay::Profile
           : isDynamic                                      ? ReferenceWay::DynamicStrip
           : workflow == 2                                  ? ReferenceWay::Characterisation
           : workflow == 3                                  ? ReferenceWay::Stored
                                                            : ReferenceWay::None;
}

/// The server path of the profile that supplies a strip's references.
template<class Text>
std::string referenceProfile(Strip strip, Text text) {
    const std::string path = text(stripKey(strip, stripProfileKey));
    return path.empty() ? text(usedProfileKey) : path;
}

/// The folder of the JDF that jdfNameKey names. For a job of type 1, remoteJdfKey has the whole
/// path instead.
template<class Text>
std::string jdfFolder(Text text) {
    const std::string folder = text(temporaryFolderKey);
    return folder.empty() ? text(outFolderKey) : folder;
}

/// Tests "Input/SubType": whether the server marks the job as a verification.
constexpr bool isVerification(int subType) {
    return subType == 80 || subType == 81 || subType == 86;
}

} // namespace jobkeys
