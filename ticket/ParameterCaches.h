// Sets of values whose stored elements keep their addresses until the set is cleared. They let a
// table of pointers outlive the variables of those who filled it, and store what is equal once.
#pragma once

#include <functional>
#include <set>
#include <string>

#include "ticket/ParameterRecords.h"

/// Counted bytes of its own, with a view on them.
class BIN_STRING_BUFFER {
  public:
    /// A view that is not valid gives an empty buffer with an empty view.
    explicit BIN_STRING_BUFFER(const BIN_STRING& bytes);
    BIN_STRING_BUFFER(const BIN_STRING_BUFFER& other);
    BIN_STRING_BUFFER& operator=(const BIN_STRING_BUFFER& other);
    ~BIN_STRING_BUFFER() = default;

    const BIN_STRING* BinString() const { return &m_view; }

    bool operator<(const BIN_STRING_BUFFER& other) const { return m_bytes < other.m_bytes; }

  private:
    std::string m_bytes;
    BIN_STRING m_view; ///< On m_bytes.
};

/// Texts.
class STRINGCACHE {
  public:
    /// Stores a copy of the text, redirects the pointer to it and gives it back. Null stays null.
    const char* operator()(const char*& text);
    /// The same by value.
    const char* operator[](const char* text);

    /// True if the text is stored; null never is.
    bool find(const char* text) const;
    void clear() { m_texts.clear(); }

  private:
    std::set<std::string, std::less<>> m_texts;
};

/// Numbers. Of a double no NaN may come here, since it has no place in an order; 0.0 and -0.0 are
/// the same, and the first to come is stored.
template<class T>
class VALCACHE {
  public:
    /// Stores a copy of the value, redirects the pointer to it and gives it back. Null stays null.
    const T* operator()(const T*& value) {
        if (value != nullptr) {
            value = &*m_values.insert(*value).first;
        }
        return value;
    }
    void clear() { m_values.clear(); }

  private:
    std::set<T> m_values;
};

/// Binary values.
class BIN_STRING_CACHE {
  public:
    /// Stores a copy of the bytes, redirects the pointer to the copy's view and gives it back. Null
    /// stays null.
    const BIN_STRING* operator()(const BIN_STRING*& bytes);
    void clear() { m_buffers.clear(); }

  private:
    std::set<BIN_STRING_BUFFER> m_buffers;
};
