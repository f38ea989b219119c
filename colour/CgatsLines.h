// SPDX-License-Identifier: Apache-2.0
// The small grammar below CGATS text: line ends, blanks, words, quotes, keyword lines, character
// sets.
#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace colour::cgats {

enum CharKind : std::uint8_t { PlainChar, BlankChar, LineEndChar };

/// What every byte is between the cells of a line. Blanks and tabs always separate; spreadsheets
/// add a semicolon or a comma.
class CharTable {
  public:
    /// `separator` is 0 for blanks and tabs alone, else the sign that separates too.
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

    /// What separates cells so strictly that nothing between two of them is an empty cell.
    char cellSeparator() const { return m_separator == 0 ? '\t' : m_separator; }

    /// The second sign that may stand for a decimal point: the comma, where it separates no cells.
    char decimalComma() const { return m_separator == ',' ? '.' : ','; }

  private:
    std::array<CharKind, 256> m_kinds{};
    char m_separator;
};

inline constexpr CharTable blanksSeparate{0};
inline constexpr CharTable semicolonsSeparate{';'};
inline constexpr CharTable commasSeparate{','};
inline constexpr CharTable anySeparates{',', ';'}; ///< For keywords, which hold none of these.

/// One cell or word. The view lies in the text: between the quotes where it was quoted.
struct Word {
    std::string_view text;
    bool quoted = false;
    bool doubledQuotes = false; ///< `text` still holds "" for each quote.
};

/// Takes the word at `at`, which is behind it afterwards.
///
/// A quote closes only in front of a blank, a line end or the end: a stray one inside a text does
/// not cut it. A quoted word ends at the line's end at the latest, so that a forgotten quote costs
/// one line and not the file.
/// REQUIRES: at < end, and *at is a plain character.
Word takeWord(const char*& at, const char* end, const CharTable& chars);

/// The word's text with doubled quotes made single.
std::string wordText(const Word& word);

/// Next character that is no blank, or `end`.
inline const char* skipBlanks(const char* at, const char* end, const CharTable& chars) {
    while (at != end && chars.isBlank(*at)) {
        ++at;
    }
    return at;
}

/// The first CR, LF or `end`.
const char* lineEndOf(const char* at, const char* end);

/// Words of one line, up to a comment, at most `limit`. False if there were more.
bool splitWords(std::string_view line, const CharTable& chars, std::size_t limit,
                std::vector<Word>& words);

/// Cells of one line between the strict separators of `chars`, empty ones included, blanks around
/// them cut off, at most `limit`. False if there were more.
bool splitCells(std::string_view line, const CharTable& chars, std::size_t limit,
                std::vector<Word>& cells);

/// A line whose whole contents a spreadsheet put in quotes, as in "DESCRIPTOR ""a, b""".
/// True if it is one; then `inner` holds what stood in the quotes.
bool unwrapLine(std::string_view line, std::string& inner);

/// A line of the header: its first word in capitals and the value behind it.
struct KeywordLine {
    std::string keyword;
    std::string value; ///< The quoted text, else the rest of the line without its comment. UTF-8.
};

/// Longest part of a header value that is kept, in bytes.
inline constexpr std::size_t maxHeaderValue = 4096;

/// REQUIRES: the line is neither blank nor a comment.
KeywordLine keywordLine(std::string_view line);

/// Capitals of ASCII letters; all else stays.
std::string upperCase(std::string_view text);

/// True if the texts are equal but for the case of ASCII letters.
bool sameWord(std::string_view left, std::string_view right);

bool isAscii(std::string_view text);

/// The text itself where it is UTF-8, else from Windows-1252, of which Latin-1 is a part.
std::string toUtf8(std::string_view text);

} // namespace colour::cgats
