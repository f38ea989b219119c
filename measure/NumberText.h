// SPDX-License-Identifier: Apache-2.0
#pragma once

/// Room for "-1.2345678e-308", which has all that a number text can have.
constexpr int longestNumberText = 16;

/// Writes what a C++ stream in its general format and the "C" locale writes with so many
/// significant digits, 6 to 8. Returns where the text ends.
char* writeNumberText(char* at, double value, int digits);
