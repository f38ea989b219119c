// SPDX-License-Identifier: Apache-2.0
#include "colour/CgatsLines.h"

#include <algorithm>
#include <cstring>

#include "base/Utf8.h"

namespace colour::cgats {

namespace {

char upper(char c) {
    return c >= 'a' && c <= 'z' ? static_cast<char>(c - 'a' + 'A') : c;
}

bool isKeywordSign(char c) {
    return (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') || c == '_';
}

/// True for a quote that is not followed by more of its text.
bool closes(const char* quote, const char* end, const CharTable& chars) {
    return quote + 1 == end || !chars.isPlain(quote[1]);
}

/// 80 to 9F of Windows-1252. The five undefined codes keep their Latin-1 meaning.
constexpr char16_t windowsSigns[32] = {
    0x20AC, 0x0081, 0x201A, 0x0192, 0x201E, 0x2026, 0x2020, 0x2021, 0x02C6, 0x2030, 0x0160,
    0x2039, 0x0152, 0x008D, 0x017D, 0x008F, 0x0090, 0x2018, 0x2019, 0x201C, 0x201D, 0x2022,
    0x2013, 0x2014, 0x02DC, 0x2122, 0x0161, 0x203A, 0x0153, 0x009D, 0x017E, 0x0178};

/// Truncates a text that is too long, never inside a UTF-8 character.
std::string_view bounded(std::string_view text) {
    return base::cutUtf8(text, maxHeaderValue);
}

std::string_view trimmed(std::string_view text, const CharTable& chars) {
    while (!text.empty() && !chars.isPlain(text.front())) {
        text.remove_prefix(1);
    }
    while (!text.empty() && !chars.isPlain(text.back())) {
        text.remove_suffix(1);
    }
    return text;
}

} // namespace

Word takeWord(const char*& at, const char* end, const CharTable& chars) {
    Word word;
    if (*at != '"') {
        const char* const start = at;
        do {
            ++at;
        } while (at != end && chars.isPlain(*at));
        word.text = {start, static_cast<std::size_t>(at - start)};
        return word;
    }
    word.quoted = true;
    const char* const start = ++at;
    for (; at != end && !chars.isLineEnd(*at); ++at) {
        if (*at != '"') {
            continue;
        }
        if (closes(at, end, chars)) {
            word.text = {start, static_cast<std::size_t>(at - start)};
            ++at;
            return word;
        }
        if (at[1] == '"') {
            word.doubledQuotes = true;
            ++at;
        }
    }
    word.text = trimmed({start, static_cast<std::size_t>(at - start)}, chars);
    return word;
}

std::string wordText(const Word& word) {
    if (!word.doubledQuotes) {
        return std::string(word.text);
    }
    std::string text;
    text.reserve(word.text.size());
    for (std::size_t i = 0; i < word.text.size(); ++i) {
        text += word.text[i];
        if (word.text[i] == '"' && i + 1 < word.text.size() && word.text[i + 1] == '"') {
            ++i;
        }
    }
    return text;
}

const char* lineEndOf(const char* at, const char* end) {
    while (at != end && *at != '\n' && *at != '\r') {
        ++at;
    }
    return at;
}

bool splitWords(std::string_view line, const CharTable& chars, std::size_t limit,
                std::vector<Word>& words) {
    words.clear();
    const char* const end = line.data() + line.size();
    const char* at = skipBlanks(line.data(), end, chars);
    while (at != end && *at != '#') {
        if (words.size() == limit) {
            return false;
        }
        words.push_back(takeWord(at, end, chars));
        at = skipBlanks(at, end, chars);
    }
    return true;
}

bool splitCells(std::string_view line, const CharTable& chars, std::size_t limit,
                std::vector<Word>& cells) {
    cells.clear();
    const char separator = chars.cellSeparator();
    const char* const end = line.data() + line.size();
    const char* at = line.data();
    while (true) {
        if (cells.size() == limit) {
            return false;
        }
        while (at != end && *at != separator && chars.isBlank(*at)) {
            ++at;
        }
        Word cell;
        if (at != end && *at == '"') {
            cell = takeWord(at, end, chars);
            at = std::find(at, end, separator);
        } else {
            const char* const next = std::find(at, end, separator);
            cell.text = trimmed({at, static_cast<std::size_t>(next - at)}, chars);
            at = next;
        }
        cells.push_back(cell);
        if (at == end) {
            return true;
        }
        ++at;
    }
}

bool unwrapLine(std::string_view line, std::string& inner) {
    const char* const end = line.data() + line.size();
    const char* at = skipBlanks(line.data(), end, blanksSeparate);
    if (at == end || *at != '"') {
        return false;
    }
    const Word word = takeWord(at, end, blanksSeparate);
    const bool alone = std::all_of(
        at, end, [](char c) { return blanksSeparate.isBlank(c) || c == ',' || c == ';'; });
    if (!alone || word.text.find(' ') == std::string_view::npos) {
        return false;
    }
    inner = wordText(word);
    // A spreadsheet doubles every quote inside. Single quotes belong to separate cells.
    const auto quotes = [](std::string_view text) {
        return std::count(text.begin(), text.end(), '"');
    };
    return quotes(word.text) == 2 * quotes(inner);
}

KeywordLine keywordLine(std::string_view line) {
    // Trailing separators are a spreadsheet's empty cells.
    while (!line.empty() && (line.back() == ',' || line.back() == ';' || line.back() == '\t')) {
        line.remove_suffix(1);
    }

    KeywordLine result;
    std::string inner;
    if (unwrapLine(line, inner)) {
        // A quoted sentence is not a keyword line, whatever its first word is.
        const auto signs = static_cast<std::size_t>(
            std::find_if_not(inner.begin(), inner.end(), isKeywordSign) - inner.begin());
        if (signs >= 2 && signs < inner.size() && !blanksSeparate.isPlain(inner[signs])) {
            line = inner;
        }
    }
    const char* const end = line.data() + line.size();
    const char* at = skipBlanks(line.data(), end, anySeparates);
    if (at == end) {
        return result;
    }
    std::string_view name = takeWord(at, end, anySeparates).text;
    if (name.ends_with(':')) {
        name.remove_suffix(1);
    }
    result.keyword = upperCase(name.substr(0, 256)); // no keyword is longer

    at = skipBlanks(at, end, anySeparates);
    if (at == end || *at == '#') {
        return result;
    }
    if (*at == '"') {
        Word value = takeWord(at, end, blanksSeparate);
        value.text = bounded(value.text);
        result.value = bounded(toUtf8(wordText(value)));
        return result;
    }
    std::string_view rest(at, static_cast<std::size_t>(end - at));
    for (std::size_t i = rest.find('#'); i != std::string_view::npos; i = rest.find('#', i + 1)) {
        if (blanksSeparate.isBlank(rest[i - 1])) {
            rest = rest.substr(0, i);
            break;
        }
    }
    result.value = bounded(toUtf8(bounded(trimmed(rest, blanksSeparate))));
    return result;
}

std::string upperCase(std::string_view text) {
    std::string result(text);
    std::transform(result.begin(), result.end(), result.begin(), upper);
    return result;
}

bool sameWord(std::string_view left, std::string_view right) {
    return std::equal(left.begin(), left.end(), right.begin(), right.end(),
                      [](char a, char b) { return upper(a) == upper(b); });
}

bool isAscii(std::string_view text) {
    std::uint64_t bits = 0;
    for (; text.size() >= sizeof bits; text.remove_prefix(sizeof bits)) {
        std::uint64_t eight = 0;
        std::memcpy(&eight, text.data(), sizeof eight);
        bits |= eight;
    }
    for (const char c : text) {
        bits |= static_cast<unsigned char>(c);
    }
    return (bits & 0x8080808080808080) == 0;
}

std::string toUtf8(std::string_view text) {
    if (isAscii(text) || base::isUtf8(text)) {
        return std::string(text);
    }
    std::string result;
    result.reserve(text.size() + text.size() / 8);
    for (const char c : text) {
        const auto byte = static_cast<unsigned char>(c);
        if (byte < 0x80) {
            result += c;
            continue;
        }
        const char16_t sign = byte < 0xA0 ? windowsSigns[byte - 0x80] : byte;
        base::appendUtf8(result, sign);
    }
    return result;
}

} // namespace colour::cgats
