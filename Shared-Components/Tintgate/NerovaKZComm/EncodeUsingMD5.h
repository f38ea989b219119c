// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

/// The MD5 digest (RFC 1321) of exactly the text's bytes, as 32 upper-case hexadecimal digits. The
/// login does not use it (C170): passwords reach the plug-in unchanged.
std::string EncodeUsingMD5(std::string text);
