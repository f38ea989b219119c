// SPDX-License-Identifier: Apache-2.0
// ASCII JSON, written as the wide text that callers of the library get.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

namespace analysis {

/// Appends JSON in the order in which it is called, commas included; whether objects and arrays
/// close in turn is the caller's affair. No tree is built: a result of 100,000 patches is written
/// row by row. The text is ASCII whatever goes in.
class JsonWriter {
  public:
    /// `expected`: characters to have room for at once.
    explicit JsonWriter(std::size_t expected) { m_text.reserve(expected); }
    JsonWriter(const JsonWriter&) = delete;
    JsonWriter& operator=(const JsonWriter&) = delete;

    /// Members and items stand on lines of their own, indented by two blanks a level.
    void beginObject() { open('{'); }
    void endObject() { close('}'); }
    void beginArray() { open('['); }
    void endArray() { close(']'); }

    /// From here to the matching end everything stands on one line.
    void beginCompactObject();
    void beginCompactArray();

    void key(std::string_view name); ///< ASCII without anything to escape.

    void text(std::string_view utf8); ///< Invalid bytes become U+FFFD.
    void number(double value);        ///< At most six decimals; null where not finite.
    void integer(std::int64_t value);
    void boolean(bool value);
    void null();

    void member(std::string_view name, std::string_view utf8);
    void member(std::string_view name, const char* utf8);
    void member(std::string_view name, double value);
    void member(std::string_view name, std::int64_t value);
    void member(std::string_view name, bool value);

    /// The line end of the whole text.
    void endLine() { raw("\n"); }

    /// What was written, which ends the writing.
    std::wstring finish();

  private:
    /// Characters are gathered as bytes and widened a block at a time: a second buffer of the whole
    /// text would cost its pages.
    static constexpr std::size_t blockSize = 4096;
    static constexpr std::size_t mostRoom = 512;

    void room(std::size_t bytes);
    void widen(std::size_t count);
    void raw(std::string_view ascii);
    void separate();
    void lineBreak();
    void open(char bracket);
    void close(char bracket);
    void plain(const char*& from, const char* end);
    void escaped(char32_t character);

    std::wstring m_text;
    std::array<char, blockSize + mostRoom> m_block;
    char* m_at = m_block.data();
    int m_depth = 0;
    int m_compactFrom = 0; ///< Depth from which on all is compact; 0: nothing is.
    bool m_first = true;   ///< Nothing stands in the innermost bracket yet.
    bool m_afterKey = false;
};

} // namespace analysis
