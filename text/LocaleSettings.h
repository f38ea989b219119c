// SPDX-License-Identifier: Apache-2.0
// The user's language, in three numbering schemes (C167).
#pragma once

#include <wx/string.h>

namespace LocaleSettings {

/// The system's number for the first of the user's preferred languages that is known. 59 (English)
/// if none is known.
int MacGetUserLocale();

/// The same.
int GetSystemLanguagewX();

/// Windows language identifier of the user's language, not a code page (C155).
int GetSystemCodePage();

/// Same for a language number; a negative number means the user's language. Unknown numbers give
/// 1033 (English).
int GetSystemCodePage(int language);

/// The identifier of the user's language as decimal text.
wxString GetSystemLanguageString();

/// Text encoding of the user's language, a CFStringEncoding; for most languages 0, MacRoman. Some
/// of these encodings have no conversion here, see platform/CoreFoundationStrings.h.
int GetMacSystemEncoding();

} // namespace LocaleSettings
