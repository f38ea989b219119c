// SPDX-License-Identifier: Apache-2.0
// The language settings of the user's session.
#pragma once

#include "platform/CoreFoundation.h"

/// A user preference. The only known key is "AppleLanguages": the preferred languages in descending
/// order, strings such as "de_DE" or "zh-Hans".
///
/// The first non-empty variable of LANGUAGE, LC_ALL, LC_MESSAGES and LANG gives the whole list.
/// LANGUAGE is a list separated by ":" and may have empty entries. Code set and modifier are
/// removed: zh_CN.UTF-8 becomes zh_CN. The text is read as MacRoman, in which every byte is valid
/// and survives a round trip.
///
/// Null for any other key and if all of these variables are empty.
CFArrayRef CFPreferencesCopyValue(const char* key);

/// The part of a locale that this program needs.
struct LocaleRef {
    char language[6];
};

enum : unsigned { kLocaleLanguageMask = 1 };

/// The language is the text before the first underscore or hyphen, cut to five characters. Returns
/// 0.
int LocaleRefFromLocaleString(const char* text, LocaleRef* locale);

/// Copies the language part to a buffer of `size` bytes. Returns 0. For another part or a buffer
/// that is too small, returns -50 and leaves the buffer unchanged.
int LocaleRefGetPartString(const LocaleRef& locale, unsigned part, unsigned long size,
                           char* buffer);
