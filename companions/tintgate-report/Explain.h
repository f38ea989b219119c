// Exit codes of the tool, explained.
#pragma once

#include <string>

namespace reporting {

/// Meaning, usual cause and remedy of a code, as lines of text with a line end. Throws Failure
/// (UnknownCode).
std::string explanationOf(int code);

} // namespace reporting
