// SPDX-License-Identifier: Apache-2.0
// Explains exit codes of the tool.
#pragma once

#include <string>

namespace report {

/// Meaning, usual cause and remedy of a code, as complete lines of text. If a job can end with the
/// code, they include its cause in a job, who acts then and whether a retry helps. Throws Failure
/// (UnknownCode).
std::string explanationOf(int code);

} // namespace report
