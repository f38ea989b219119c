// SPDX-License-Identifier: Apache-2.0
// Exit codes of the tool, explained.
#pragma once

#include <string>

namespace report {

/// Meaning, usual cause and remedy of a code, as lines of text with a line end. If a job can end
/// with the code, its cause in a job, who acts then and whether a retry helps follow. Throws
/// Failure (UnknownCode).
std::string explanationOf(int code);

} // namespace report
