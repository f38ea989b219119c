// SPDX-License-Identifier: Apache-2.0
// The job form, in a module of its own: the file forms start without what only a job needs.
#pragma once

namespace cli {

/// Verifies the job that the tool's own arguments name (count as in main). Returns the process's
/// exit code. An exception passes through: a job id that is not a number ends the run (C8).
using VerifyJob = int (*)(int count, char* arguments[]);

/// The name under which the module exports a VerifyJob.
inline constexpr const char* verifyJobName = "tintgateVerifyJob";

/// The tool's own version; that of the library is a matter of its own.
inline constexpr int toolVersion[] = {1, 6, 20};

} // namespace cli
