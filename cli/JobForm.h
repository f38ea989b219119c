// SPDX-License-Identifier: Apache-2.0
// The job form, in a separate module, so that the file forms start without what only a job needs.
#pragma once

namespace cli {

/// Verifies the job that the tool's arguments describe (count as in main) and returns the exit code
/// of the process. Exceptions pass through: a job id that is not a number ends the run (C8).
using VerifyJob = int (*)(int count, char* arguments[]);

/// The name under which the module exports a VerifyJob.
inline constexpr const char* verifyJobName = "tintgateVerifyJob";

/// The tool's own version, independent of the library's.
inline constexpr int toolVersion[] = {1, 6, 20};

} // namespace cli
