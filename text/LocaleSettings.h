// SPDX-License-Identifier: Apache-2.0
// The language of the machine's user, in three numberings (C167).
#pragma once

#include <wx/string.h>

namespace LocaleSettings {

/// Language number of the system's own, after the user's preferred languages: the first that is
/// known. 59, English, when none is.
int MacGetUserLocale();

/// The same.
int GetSystemLanguagewX();

/// Windows language identifier of the user's language, and not a code page (C155).
int GetSystemCodePage();

/// The same for a language number; a negative one means the user's language. 1033, English, for
/// unknown numbers.
int GetSystemCodePage(int language);

/// The identifier of the user's language as decimal text.
wxString GetSystemLanguageString();

/// Text encoding of the user's language, a CFStringEncoding: 0, MacRoman, for most. Not all of them
/// have a conversion here, see platform/CoreFoundationStrings.h.
int GetMacSystemEncoding();

} // namespace LocaleSettings
