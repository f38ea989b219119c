// SPDX-License-Identifier: Apache-2.0
// Between the user interface's code page and the text on the wire, and byte filters (C164).
//
// On this platform the code page conversions are empty (C147): text passes unchanged, and
// CharSetsWx does the real work. The interface is the one that a port with a native code page
// needs.
#pragma once

#include <string>

namespace CharSets {

enum DIRECTION : int { WIN2UTF8, UTF82WIN };         ///< Accepted and not looked at.
enum ALLOC_METHOD : int { ALLOC_MALLOC, ALLOC_NEW }; ///< Any value but 0 means new[].

/// Escapes text for XML: the five characters of XML's own and seven Windows-1252 letters.
///
/// One pass for each character, in the order of the bytes, and each pass starts behind the last
/// replacement of all passes before it. So `&"` becomes `&&quot;`: the ampersand lies in front of
/// the quote that went first (C148). Text that must be escaped in full needs another function.
void ReplaceConflictingXMLDataInString(std::string& text);

/// True when the text, up to its terminator, holds a well-formed multi-byte sequence: false for
/// ASCII and for null.
///
/// The lead byte of four is tested with the mask 0xF1 (C149): 0xF0, F2, F4, F6, F8, FA, FC and FE
/// pass, the odd ones don't.
bool IsUtf8Coded(const char* text);
bool IsUtf8Coded(const std::string& text);

bool NeedsConversion(const char* text);        ///< Always false.
bool NeedsConversion(const std::string& text); ///< Always false.

unsigned long RequiredBufferSize(const char* text);        ///< Always 0.
unsigned long RequiredBufferSize(const std::string& text); ///< Always 0.

// Bounded copies as stracpy makes them.
char* Win2Utf8(char* target, const char* source, unsigned long size);
char* Win2Utf8Decomposed(char* target, const char* source, unsigned long size);
char* Utf82Win(char* target, const char* source, unsigned long size);

// Plain copies.
std::string Win2Utf8(const std::string& text);
std::string Win2Utf8Decomposed(const std::string& text);
std::string Utf82Win(const std::string& text);

/// A copy that the caller frees, with free() for ALLOC_MALLOC and with delete[] otherwise. Null for
/// a null text and when memory is short.
char* DuplicateAndConvert(const char* text, DIRECTION direction, ALLOC_METHOD method);

/// Copies into a field of `size` bytes: at most size - 1 characters, the rest of the field zero. A
/// null source counts as empty. With size 0 nothing is touched. Returns the target.
char* stracpy(char* target, const char* source, unsigned long size);

namespace DBCS {

/// Every byte `from` becomes `to`. In spite of the name nothing here knows double bytes (C150).
void ReplaceAll(std::string& text, char from, char to);

/// Length minus one; std::string::npos for an empty text.
std::string::size_type LastAsciiPos(const std::string& text);

} // namespace DBCS

/// Maps single bytes: to themselves, to another byte, or to nothing. Later rules win.
///
/// Ranges include both ends and are taken as unsigned; one with first above last does nothing, nor
/// does a null set.
class FilterString {
  public:
    /// With passAll every byte stays, without it every byte is dropped.
    explicit FilterString(bool passAll);

    void setBypass(char first, char last);
    void setBypass(const char* set);
    void setRemove(char first, char last);
    void setRemove(const char* set);
    void setReplace(char first, char last, char with);
    void setReplace(const char* set, char with);

    /// 0 when the byte is dropped.
    char operator()(char c) const;
    std::string operator()(const std::string& text) const;

  private:
    char& entry(char c) { return m_table[static_cast<unsigned char>(c)]; }

    char m_table[256];
};

} // namespace CharSets
