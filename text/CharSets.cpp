// SPDX-License-Identifier: Apache-2.0
#include "text/CharSets.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <new>
#include <utility>

namespace CharSets {
namespace {

struct Escape {
    char character;
    const char* replacement;
};

// In ascending byte order, which is the order of the passes. From 0xC4 up: Windows-1252.
constexpr Escape escapes[] = {
    {'\x22', "&quot;"}, {'\x26', "&amp;"},  {'\x27', "&apos;"}, {'\x3C', "&lt;"},
    {'\x3E', "&gt;"},   {'\xC4', "&#196;"}, {'\xD6', "&#214;"}, {'\xDC', "&#220;"},
    {'\xDF', "&#223;"}, {'\xE4', "&#228;"}, {'\xF6', "&#246;"}, {'\xFC', "&#252;"},
};

bool isContinuation(char c) {
    return (c & 0xC0) == 0x80;
}

/// Whether a multi-byte sequence starts here. Never reads past a byte that is not a continuation
/// byte, so it never reads past the terminator.
bool startsSequence(const char* p) {
    if ((*p & 0xE0) == 0xC0) {
        return isContinuation(p[1]);
    }
    if ((*p & 0xF0) == 0xE0) {
        return isContinuation(p[1]) && isContinuation(p[2]);
    }
    // The correct mask would be 0xF8 (C149).
    if ((*p & 0xF1) == 0xF0) {
        return isContinuation(p[1]) && isContinuation(p[2]) && isContinuation(p[3]);
    }
    return false;
}

} // namespace

void ReplaceConflictingXMLDataInString(std::string& text) {
    // Each pass starts where the previous one ended, and no replacement contains a character that a
    // later pass looks for. So all passes together walk the text once, from front to back.
    std::string escaped;
    std::string::size_type start = 0;
    for (const Escape& escape : escapes) {
        for (auto found = text.find(escape.character, start); found != std::string::npos;
             found = text.find(escape.character, start)) {
            escaped.append(text, start, found - start);
            escaped += escape.replacement;
            start = found + 1;
        }
    }
    if (start != 0) {
        escaped.append(text, start);
        text = std::move(escaped);
    }
}

bool IsUtf8Coded(const char* text) {
    if (text == nullptr) {
        return false;
    }
    for (; *text != '\0'; ++text) {
        if (startsSequence(text)) {
            return true;
        }
    }
    return false;
}

bool IsUtf8Coded(const std::string& text) {
    return IsUtf8Coded(text.c_str());
}

bool NeedsConversion(const char*) {
    return false;
}

bool NeedsConversion(const std::string&) {
    return false;
}

unsigned long RequiredBufferSize(const char*) {
    return 0;
}

unsigned long RequiredBufferSize(const std::string&) {
    return 0;
}

char* Win2Utf8(char* target, const char* source, unsigned long size) {
    return stracpy(target, source, size);
}

char* Win2Utf8Decomposed(char* target, const char* source, unsigned long size) {
    return stracpy(target, source, size);
}

char* Utf82Win(char* target, const char* source, unsigned long size) {
    return stracpy(target, source, size);
}

std::string Win2Utf8(const std::string& text) {
    return text;
}

std::string Win2Utf8Decomposed(const std::string& text) {
    return text;
}

std::string Utf82Win(const std::string& text) {
    return text;
}

char* DuplicateAndConvert(const char* text, DIRECTION, ALLOC_METHOD method) {
    if (text == nullptr) {
        return nullptr;
    }
    const std::size_t size = std::strlen(text) + 1;
    char* copy = method == ALLOC_MALLOC ? static_cast<char*>(std::malloc(size))
                                        : new (std::nothrow) char[size];
    return copy == nullptr ? nullptr : static_cast<char*>(std::memcpy(copy, text, size));
}

char* stracpy(char* target, const char* source, unsigned long size) {
    if (size != 0) {
        target[size - 1] = '\0';
        std::strncpy(target, source == nullptr ? "" : source, size - 1);
    }
    return target;
}

void DBCS::ReplaceAll(std::string& text, char from, char to) {
    std::replace(text.begin(), text.end(), from, to);
}

std::string::size_type DBCS::LastAsciiPos(const std::string& text) {
    return text.length() - 1;
}

FilterString::FilterString(bool passAll) : m_table{} {
    if (passAll) {
        setBypass('\0', '\xFF');
    }
}

void FilterString::setBypass(char first, char last) {
    for (int i = static_cast<unsigned char>(first); i <= static_cast<unsigned char>(last); ++i) {
        m_table[i] = static_cast<char>(i);
    }
}

void FilterString::setBypass(const char* set) {
    for (; set != nullptr && *set != '\0'; ++set) {
        entry(*set) = *set;
    }
}

void FilterString::setRemove(char first, char last) {
    setReplace(first, last, '\0');
}

void FilterString::setRemove(const char* set) {
    setReplace(set, '\0');
}

void FilterString::setReplace(char first, char last, char with) {
    for (int i = static_cast<unsigned char>(first); i <= static_cast<unsigned char>(last); ++i) {
        m_table[i] = with;
    }
}

void FilterString::setReplace(const char* set, char with) {
    for (; set != nullptr && *set != '\0'; ++set) {
        entry(*set) = with;
    }
}

char FilterString::operator()(char c) const {
    return m_table[static_cast<unsigned char>(c)];
}

std::string FilterString::operator()(const std::string& text) const {
    std::string filtered;
    filtered.reserve(text.size());
    for (const char c : text) {
        if (const char mapped = (*this)(c); mapped != '\0') {
            filtered += mapped;
        }
    }
    return filtered;
}

} // namespace CharSets
