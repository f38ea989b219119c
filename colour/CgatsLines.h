// SPDX-License-Identifier: Apache-2.0
// The lexical level of CGATS text: line ends, blanks, words, quotes, keyword lines, character sets.
#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace colour::cgats {

enum CharKind : std::uint8_t { PlainChar, BlankChar, LineEndChar };

/// The role of every byte between the cells of a line. Blanks and tabs always separate;
/// spreadsheets also use a semicolon or a comma.
class CharTable {
  public:
    /// `separator` is an additional separator, or 0 for only blanks and tabs.
    explicit constexpr CharTable(char separator, char another = 0) : m_separator(separator) {
        for (const char blank : {' ', '\t', '\v', '\f', '\x1a'}) { // 1A ends texts of old systems
            m_kinds[static_cast<unsigned char>(blank)] = BlankChar;
        }
        for (const char lineEnd : {'\n', '\r'}) {
            m_kinds[static_cast<unsigned char>(lineEnd)] = LineEndChar;
        }
        for (const char more : {separator, another}) {
            if (more != 0) {
                m_kinds[static_cast<unsigned char>(more)] = BlankChar;
            }
        }
    }

    bool isPlain(char c) const { return m_kinds[static_cast<unsigned char>(c)] == PlainChar; }
    bool isBlank(char c) const { return m_kinds[static_cast<unsigned char>(c)] == BlankChar; }
    bool isLineEnd(char c) const { return m_kinds[static_cast<unsigned char>(c)] == LineEndChar; }

    /// The strict separator: with nothing between two of them, there is an empty cell.
    char cellSeparator() const { return m_separator == 0 ? '\t' : m_separator; }

    /// The alternative decimal point: the comma, unless it separates cells.
    char decimalComma() const { return m_separator == ',' ? '.' : ','; }

  private:
    std::array<CharKind, 256> m_kinds{};
    char m_separator;
};

inline constexpr CharTable blanksSeparate{0};
inline constexpr CharTable semicolonsSeparate{';'};
inline constexpr CharTable commasSeparate{','};
inline constexpr CharTable anySeparates{',', ';'}; ///< For keywords, which contain none of these.

/// One cell or word. The view points into the text, inside the quotes if it is quoted.
struct Word {
    std::string_view text;
    bool quoted = false;
    bool doubledQuotes = false; ///< `text` still has "" for each quote.
};

/// Takes the word at `at` and moves `at` past it.
///
/// A quote closes only before a blank, a line end or the end, so a stray quote inside a text does
/// not cut it. A quoted word ends with its line at the latest, so that a missing quote affects only
/// one line. REQUIRES: at < end, and *at is a plain character.
Word takeWord(const char*& at, const char* end, const CharTable& chars);

/// The word's text with doubled quotes reduced to single ones.
std::string wordText(const Word& word);

/// The next non-blank character, or `end`.
inline const char* skipBlanks(const char* at, const char* end, const CharTable& chars) {
    while (at != end && chars.isBlank(*at)) {
        ++at;
    }
    return at;
}

/// The first CR or LF, or `end`.
const char* lineEndOf(const char* at, const char* end);

/// Words of one line, at most `limit`, without a comment. False if there are more.
bool splitWords(std::string_view line, const CharTable& chars, std::size_t limit,
                std::vector<Word>& words);

/// Cells of one line between the strict separators of `chars`, including empty ones, trimmed, at
/// most `limit`. False if there are more.
bool splitCells(std::string_view line, const CharTable& chars, std::size_t limit,
                std::vector<Word>& cells);

/// Handles a line that a spreadsheet has quoted as a whole, as in "DESCRIPTOR ""a, b""". If it is
/// one, returns true and stores the quoted text in `inner`.
bool unwrapLine(std::string_view line, std::string& inner);

/// A line of the header: its first word in upper case, and the value after it.
struct KeywordLine {
    std::string keyword;
    std::string value; ///< The quoted text, or else the rest of the line without a comment. UTF-8.
};

/// Maximum length of a header value in bytes; the rest is dropped.
inline constexpr std::size_t maxHeaderValue = 4096;

/// REQUIRES: the line is neither blank nor a comment.
KeywordLine keywordLine(std::string_view line);

/// Converts ASCII letters to upper case.
std::string upperCase(std::string_view text);

/// True if the texts are equal, ignoring the case of ASCII letters.
bool sameWord(std::string_view left, std::string_view right);

bool isAscii(std::string_view text);

/// Returns UTF-8 text unchanged. Other text is converted from Windows-1252, which includes Latin-1.
std::string toUtf8(std::string_view text);

} // namespace colour::cgats
