// SPDX-License-Identifier: Apache-2.0
// Converts between the user interface's code page and the text on the wire, and filters bytes
// (C164).
//
// On this platform the code page conversions are empty (C147): text passes unchanged, and
// CharSetsWx does the real work. The interface is kept for a port with a native code page.
#pragma once

#include <string>

namespace CharSets {

enum DIRECTION : int { WIN2UTF8, UTF82WIN };         ///< Accepted and ignored.
enum ALLOC_METHOD : int { ALLOC_MALLOC, ALLOC_NEW }; ///< Any value but 0 means new[].

/// Escapes text for XML: the five special characters of XML and seven Windows-1252 letters.
///
/// Each character has a pass, in ascending byte order, which starts after the last replacement of
/// any earlier pass. So `&"` becomes `&&quot;`: the quote is replaced first, and the ampersand
/// precedes it (C148). Don't use this for text that must be escaped in full.
void ReplaceConflictingXMLDataInString(std::string& text);

/// True if the text, up to its terminator, contains a well-formed multi-byte sequence. False for
/// ASCII text and for null.
///
/// The lead byte of a four-byte sequence is tested with the mask 0xF1 (C149): 0xF0, F2, F4, F6, F8,
/// FA, FC and FE pass, the odd values don't.
bool IsUtf8Coded(const char* text);
bool IsUtf8Coded(const std::string& text);

bool NeedsConversion(const char* text);        ///< Always false.
bool NeedsConversion(const std::string& text); ///< Always false.

unsigned long RequiredBufferSize(const char* text);        ///< Always 0.
unsigned long RequiredBufferSize(const std::string& text); ///< Always 0.

// Bounded copies, as stracpy makes them.
char* Win2Utf8(char* target, const char* source, unsigned long size);
char* Win2Utf8Decomposed(char* target, const char* source, unsigned long size);
char* Utf82Win(char* target, const char* source, unsigned long size);

// Plain copies.
std::string Win2Utf8(const std::string& text);
std::string Win2Utf8Decomposed(const std::string& text);
std::string Utf82Win(const std::string& text);

/// Returns a copy that the caller frees: with free() for ALLOC_MALLOC, otherwise with delete[].
/// Returns null for a null text and if memory runs out.
char* DuplicateAndConvert(const char* text, DIRECTION direction, ALLOC_METHOD method);

/// Copies into a field of `size` bytes: at most size - 1 characters, with the rest of the field
/// zeroed. A null source counts as empty. If size is 0, nothing is written. Returns the target.
char* stracpy(char* target, const char* source, unsigned long size);

namespace DBCS {

/// Replaces every byte `from` by `to`. Despite the name, it ignores double-byte characters (C150).
void ReplaceAll(std::string& text, char from, char to);

/// Length minus one; std::string::npos for an empty text.
std::string::size_type LastAsciiPos(const std::string& text);

} // namespace DBCS

/// Maps each single byte to itself, to another byte, or to nothing. Later rules override earlier
/// ones.
///
/// Ranges include both ends and are unsigned. An inverted range and a null set have no effect.
class FilterString {
  public:
    /// If passAll is true, every byte is kept; otherwise every byte is dropped.
    explicit FilterString(bool passAll);

    void setBypass(char first, char last);
    void setBypass(const char* set);
    void setRemove(char first, char last);
    void setRemove(const char* set);
    void setReplace(char first, char last, char with);
    void setReplace(const char* set, char with);

    /// Returns 0 if the byte is dropped.
    char operator()(char c) const;
    std::string operator()(const std::string& text) const;

  private:
    char& entry(char c) { return m_table[static_cast<unsigned char>(c)]; }

    char m_table[256];
};

} // namespace CharSets
