// ASCII JSON, written straight into one buffer.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

namespace analysis {

/// Appends JSON in the order in which it is called, commas included; whether objects and arrays
/// close in turn is the caller's affair. No tree is built: a result of 100,000 patches is written
/// row by row. The text is ASCII whatever goes in.
class JsonWriter {
  public:
    /// `expected`: bytes to have room for at once.
    explicit JsonWriter(std::size_t expected);
    ~JsonWriter();
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

    std::string_view written() const;

    /// What was written, as wide text.
    std::wstring wide() const;

  private:
    void room(std::size_t bytes);
    void raw(std::string_view ascii);
    void separate();
    void lineBreak();
    void open(char bracket);
    void close(char bracket);
    void escaped(int character);

    char* m_begin = nullptr;
    char* m_at = nullptr;
    char* m_end = nullptr;
    int m_depth = 0;
    int m_compactFrom = 0; ///< Depth from which on all is compact; 0: nothing is.
    bool m_first = true;   ///< Nothing stands in the innermost bracket yet.
    bool m_afterKey = false;
};

} // namespace analysis
