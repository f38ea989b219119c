// SPDX-License-Identifier: Apache-2.0
// The keys by which clients select jobs, and the meaning of their values.
#pragma once

#include <array>
#include <string_view>

namespace jobkeys {

inline constexpr const char* subTypeKey = "Input/SubType";
inline constexpr const char* displayStatusKey = "Job/Display/Status";
inline constexpr const char* showInVerifierKey = "Remote/ShowInVerifier";
inline constexpr const char* fileTypeKey = "Input/FileType";
inline constexpr const char* verifyActiveKey = "Workflow/Verify/Active";

/// In the order in which a client reads them.
inline constexpr std::array<std::string_view, 5> overviewKeys = {
    subTypeKey, displayStatusKey, showInVerifierKey, fileTypeKey, verifyActiveKey};

// Values of displayStatusKey.
inline constexpr int waitingStatus = 208;
inline constexpr int verifiedStatus = 211;
inline constexpr int failedStatus = 212;

/// Value of fileTypeKey: a file that is never verified.
inline constexpr int unsuitableFileType = 4096;

/// Value of verifyActiveKey.
inline constexpr int activeForTwoStrips = 3;

} // namespace jobkeys
