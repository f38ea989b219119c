// SPDX-License-Identifier: Apache-2.0
// Writes ASCII JSON as wide text, the form that the library returns.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

namespace analysis {

/// Appends JSON in the order of the calls, with the commas. The caller must close objects and
/// arrays in the right order. No tree is built: a result of 100,000 patches is written row by row.
/// The text is ASCII for any input.
class JsonWriter {
  public:
    /// `expected`: number of characters to reserve.
    explicit JsonWriter(std::size_t expected) { m_text.reserve(expected); }
    JsonWriter(const JsonWriter&) = delete;
    JsonWriter& operator=(const JsonWriter&) = delete;

    /// Each member and item is on its own line, indented by two blanks per level.
    void beginObject() { open('{'); }
    void endObject() { close('}'); }
    void beginArray() { open('['); }
    void endArray() { close(']'); }

    /// Everything up to the matching end is on one line.
    void beginCompactObject();
    void beginCompactArray();

    void key(std::string_view name); ///< ASCII with nothing to escape.

    void text(std::string_view utf8); ///< Invalid bytes become U+FFFD.
    void number(double value);        ///< At most six decimals. Null if not finite.
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

    /// Returns the text. Nothing may be written after that.
    std::wstring finish();

  private:
    /// Characters are collected as bytes and widened one block at a time. A second buffer for the
    /// whole text would take more memory.
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
    int m_compactFrom = 0; ///< Depth from which everything is compact. 0: nothing is.
    bool m_first = true;   ///< The innermost bracket is still empty.
    bool m_afterKey = false;
};

} // namespace analysis
