// SPDX-License-Identifier: Apache-2.0
// What the user's session says about languages.
#pragma once

#include "platform/CoreFoundation.h"

/// A user's preference. The one key known is "AppleLanguages": the preferred languages in falling
/// order, strings such as "de_DE" or "zh-Hans".
///
/// The first of LANGUAGE, LC_ALL, LC_MESSAGES and LANG that is not empty gives the whole list.
/// LANGUAGE is a list with ":" in between, and may have empty entries. Code set and modifier are
/// cut off: zh_CN.UTF-8 is zh_CN. The text is taken as MacRoman, in which every byte is valid and
/// comes back the same.
///
/// Null for another key, and when none of the variables says anything.
CFArrayRef CFPreferencesCopyValue(const char* key);

/// A locale, as far as it is asked about.
struct LocaleRef {
    char language[6];
};

enum : unsigned { kLocaleLanguageMask = 1 };

/// The language is what stands in front of the first underscore or hyphen, cut to five characters.
/// Returns 0.
int LocaleRefFromLocaleString(const char* text, LocaleRef* locale);

/// Copies the language part to a buffer of size bytes. Returns 0, or -50 with the buffer untouched
/// for another part or a buffer that is too small.
int LocaleRefGetPartString(const LocaleRef& locale, unsigned part, unsigned long size,
                           char* buffer);
