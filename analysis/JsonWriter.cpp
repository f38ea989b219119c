// SPDX-License-Identifier: Apache-2.0
#include "analysis/JsonWriter.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <cmath>
#include <cstring>
#include <utility>

#include "base/Utf8.h"

namespace analysis {
namespace {

constexpr std::size_t longestNumber = 32;

/// "000102" ... "99": two digits at a time.
constexpr auto digitPairs = [] {
    std::array<char, 200> pairs{};
    for (std::size_t i = 0; i < 100; ++i) {
        pairs[i * 2] = static_cast<char>('0' + i / 10);
        pairs[i * 2 + 1] = static_cast<char>('0' + i % 10);
    }
    return pairs;
}();

bool needsNoEscape(char c) {
    return c >= 0x20 && c < 0x7F && c != '"' && c != '\\';
}

char* writePair(char* at, std::uint32_t below100) {
    std::memcpy(at, &digitPairs[std::size_t{below100} * 2], 2);
    return at + 2;
}

char* writeWhole(char* at, std::uint64_t value) {
    if (value < 10) {
        *at = static_cast<char>('0' + value);
        return at + 1;
    }
    if (value < 100) {
        return writePair(at, static_cast<std::uint32_t>(value));
    }
    return std::to_chars(at, at + 20, value).ptr;
}

/// Six decimals without trailing zeros. `millionths` is less than a million. Most values from
/// instruments have two decimals.
char* writeFraction(char* at, std::uint32_t millionths) {
    if (millionths == 0) {
        return at;
    }
    *at++ = '.';
    at = writePair(at, millionths / 10000);
    if (const std::uint32_t rest = millionths % 10000; rest != 0) {
        at = writePair(at, rest / 100);
        at = writePair(at, rest % 100);
    }
    while (at[-1] == '0') {
        --at;
    }
    return at;
}

/// The shortest form of a value rounded to six decimals, halves to even like printf. Multiplying by
/// a million rounds too, so values near a half use the exact conversion, as do values that don't
/// fit.
char* writeNumber(char* at, double value) {
    const double size = std::abs(value);
    if (size >= 1e9) {
        return std::to_chars(at, at + longestNumber, value).ptr;
    }
    const double scaled = size * 1e6;
    auto millionths = static_cast<std::uint64_t>(scaled);
    const double rest = scaled - static_cast<double>(millionths);
    if (std::abs(rest - 0.5) <= scaled * 2.3e-16) {
        char digits[longestNumber];
        const char* const end =
            std::to_chars(digits, digits + longestNumber, size, std::chars_format::fixed, 6).ptr;
        std::uint64_t whole = 0;
        std::uint32_t fraction = 0;
        std::from_chars(digits, end - 7, whole);
        std::from_chars(end - 6, end, fraction);
        millionths = whole * 1000000 + fraction;
    } else {
        millionths += rest > 0.5;
    }
    if (value < 0 && millionths > 0) {
        *at++ = '-';
    }
    at = writeWhole(at, millionths / 1000000);
    return writeFraction(at, static_cast<std::uint32_t>(millionths % 1000000));
}

} // namespace

/// Makes room for this many bytes, at most mostRoom.
void JsonWriter::room(std::size_t bytes) {
    if (static_cast<std::size_t>(m_block.data() + m_block.size() - m_at) < bytes) {
        widen(blockSize);
    }
}

/// Moves the first bytes of the block to the text, and the rest to the start of the block.
void JsonWriter::widen(std::size_t count) {
    const std::size_t before = m_text.size();
    m_text.resize(before + count);
    std::copy_n(m_block.data(), count, m_text.data() + before);
    m_at = std::copy(m_block.data() + count, m_at, m_block.data());
}

void JsonWriter::raw(std::string_view ascii) {
    for (; !ascii.empty(); ascii.remove_prefix(std::min(ascii.size(), mostRoom))) {
        const std::string_view piece = ascii.substr(0, mostRoom);
        room(piece.size());
        m_at = std::copy(piece.begin(), piece.end(), m_at);
    }
}

void JsonWriter::lineBreak() {
    if (m_compactFrom > 0) {
        return;
    }
    const auto indent = static_cast<std::size_t>(m_depth) * 2;
    room(1 + indent);
    *m_at++ = '\n';
    m_at = std::fill_n(m_at, indent, ' ');
}

/// Called before every value and every key.
void JsonWriter::separate() {
    if (m_afterKey) {
        m_afterKey = false;
        return;
    }
    if (!m_first) {
        room(1);
        *m_at++ = ',';
    }
    if (m_depth > 0) {
        lineBreak();
    }
    m_first = false;
}

void JsonWriter::open(char bracket) {
    separate();
    room(1);
    *m_at++ = bracket;
    ++m_depth;
    m_first = true;
}

void JsonWriter::close(char bracket) {
    --m_depth;
    if (!m_first) {
        lineBreak();
    }
    room(1);
    *m_at++ = bracket;
    m_first = false;
    if (m_depth < m_compactFrom) {
        m_compactFrom = 0;
    }
}

void JsonWriter::beginCompactObject() {
    beginObject();
    if (m_compactFrom == 0) {
        m_compactFrom = m_depth;
    }
}

void JsonWriter::beginCompactArray() {
    beginArray();
    if (m_compactFrom == 0) {
        m_compactFrom = m_depth;
    }
}

void JsonWriter::key(std::string_view name) {
    separate();
    room(name.size() + 4);
    *m_at++ = '"';
    std::memcpy(m_at, name.data(), name.size());
    m_at += name.size();
    *m_at++ = '"';
    *m_at++ = ':';
    if (m_compactFrom == 0) {
        *m_at++ = ' ';
    }
    m_afterKey = true;
}

void JsonWriter::escaped(char32_t character) {
    constexpr char hex[] = "0123456789abcdef";
    const auto unit = [&](unsigned u) {
        const char text[] = {'\\',       'u', hex[u >> 12], hex[u >> 8 & 15], hex[u >> 4 & 15],
                             hex[u & 15]};
        raw({text, sizeof text});
    };
    switch (character) {
    case '"':
        return raw("\\\"");
    case '\\':
        return raw("\\\\");
    case '\n':
        return raw("\\n");
    case '\r':
        return raw("\\r");
    case '\t':
        return raw("\\t");
    default:
        break;
    }
    if (character < 0x10000) {
        return unit(static_cast<unsigned>(character));
    }
    const auto beyond = static_cast<unsigned>(character) - 0x10000;
    unit(0xD800 | beyond >> 10);
    unit(0xDC00 | (beyond & 0x3FF));
}

/// Writes characters that need no escape, up to one that does or to the end of the block.
void JsonWriter::plain(const char*& from, const char* end) {
    const char* const last = m_block.data() + m_block.size();
    char* at = m_at;
    while (from != end && at != last && needsNoEscape(*from)) {
        *at++ = *from++;
    }
    m_at = at;
}

void JsonWriter::text(std::string_view utf8) {
    separate();
    room(1);
    *m_at++ = '"';
    const char* from = utf8.data();
    const char* const end = from + utf8.size();
    while (true) {
        room(1);
        plain(from, end);
        if (from == end) {
            break;
        }
        if (!needsNoEscape(*from)) {
            std::string_view rest(from, static_cast<std::size_t>(end - from));
            const auto character = base::takeUtf8(rest);
            from = character ? rest.data() : from + 1;
            escaped(character.value_or(0xFFFD));
        }
    }
    room(1);
    *m_at++ = '"';
}

void JsonWriter::number(double value) {
    if (!std::isfinite(value)) {
        return null();
    }
    separate();
    room(longestNumber);
    m_at = writeNumber(m_at, value);
}

void JsonWriter::integer(std::int64_t value) {
    separate();
    room(longestNumber);
    m_at = std::to_chars(m_at, m_at + longestNumber, value).ptr;
}

void JsonWriter::boolean(bool value) {
    separate();
    raw(value ? "true" : "false");
}

void JsonWriter::null() {
    separate();
    raw("null");
}

void JsonWriter::member(std::string_view name, std::string_view utf8) {
    key(name);
    text(utf8);
}

void JsonWriter::member(std::string_view name, const char* utf8) {
    member(name, std::string_view(utf8));
}

void JsonWriter::member(std::string_view name, double value) {
    key(name);
    number(value);
}

void JsonWriter::member(std::string_view name, std::int64_t value) {
    key(name);
    integer(value);
}

void JsonWriter::member(std::string_view name, bool value) {
    key(name);
    boolean(value);
}

std::wstring JsonWriter::finish() {
    widen(static_cast<std::size_t>(m_at - m_block.data()));
    return std::move(m_text);
}

} // namespace analysis
