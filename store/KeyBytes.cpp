// SPDX-License-Identifier: Apache-2.0
#include "store/KeyBytes.h"

#include <algorithm>
#include <bit>
#include <cstdint>
#include <cstring>
#include <optional>
#include <type_traits>
#include <utility>

namespace store {

namespace {

constexpr char version = 1;

template<class T>
T littleEndian(T value) {
    if constexpr (std::endian::native == std::endian::big) {
        char raw[sizeof value];
        std::memcpy(raw, &value, sizeof value);
        std::reverse(raw, raw + sizeof value);
        std::memcpy(&value, raw, sizeof value);
    }
    return value;
}

template<class T>
void append(std::string& bytes, T value) {
    value = littleEndian(value);
    char raw[sizeof value];
    std::memcpy(raw, &value, sizeof value);
    bytes.append(raw, sizeof raw);
}

void appendCounted(std::string& bytes, const std::string& text) {
    append(bytes, static_cast<std::uint64_t>(text.size()));
    bytes += text;
}

void appendValue(std::string& bytes, const Value& value) {
    std::visit(
        [&](const auto& kept) {
            using T = std::decay_t<decltype(kept)>;
            if constexpr (std::is_same_v<T, Text> || std::is_same_v<T, Binary>) {
                appendCounted(bytes, kept.bytes->text);
            } else if constexpr (std::is_same_v<T, void*>) {
                append(bytes, reinterpret_cast<std::uint64_t>(kept));
            } else if constexpr (!std::is_empty_v<T>) {
                append(bytes, kept);
            }
        },
        value);
}

/// Writes runs. The length of a run is filled in at its end.
class Writer {
  public:
    explicit Writer(std::string& bytes) : m_bytes(bytes) {}
    ~Writer() { end(); }

    void add(int position, const Value& value) {
        if (position != m_next) {
            begin(PARAM_DELETE);
            m_length = static_cast<std::uint32_t>(position - m_next);
        }
        if (typeOf(value) != m_type) {
            begin(typeOf(value));
        }
        appendValue(m_bytes, value);
        ++m_length;
        m_next = position + 1;
    }

  private:
    void begin(PARAM_TYPE type) {
        end();
        m_type = type;
        m_length = 0;
        m_bytes += static_cast<char>(type);
        m_lengthAt = m_bytes.size();
        m_bytes.append(sizeof m_length, '\0');
    }

    void end() {
        if (m_lengthAt != 0) {
            const std::uint32_t length = littleEndian(m_length);
            std::memcpy(&m_bytes[m_lengthAt], &length, sizeof length);
        }
    }

    std::string& m_bytes;
    int m_next = 0;
    PARAM_TYPE m_type = PARAM_DELETE;
    std::uint32_t m_length = 0;
    std::size_t m_lengthAt = 0; ///< 0 if there is no run yet.
};

/// The unread bytes. Empty after a failure.
class Reader {
  public:
    explicit Reader(std::string_view bytes) : m_bytes(bytes) {}

    std::size_t left() const { return m_bytes.size(); }

    template<class T>
    bool take(T& value) {
        if (m_bytes.size() < sizeof value) {
            return false;
        }
        std::memcpy(&value, m_bytes.data(), sizeof value);
        value = littleEndian(value);
        m_bytes.remove_prefix(sizeof value);
        return true;
    }

    bool takeCounted(std::string& text) {
        std::uint64_t size = 0;
        if (!take(size) || size > m_bytes.size()) {
            return false;
        }
        text.assign(m_bytes.substr(0, static_cast<std::size_t>(size)));
        m_bytes.remove_prefix(static_cast<std::size_t>(size));
        return true;
    }

  private:
    std::string_view m_bytes;
};

/// Appends a run of numbers, as far as they are present, to the elements.
template<class Stored, class Kept = Stored>
bool takeNumbers(Reader& reader, Elements& elements, int position, std::uint32_t length) {
    if (length > reader.left() / sizeof(Stored)) {
        return false;
    }
    elements.reserve(static_cast<int>(length));
    for (std::uint32_t i = 0; i < length; ++i) {
        Stored number{};
        reader.take(number);
        if constexpr (std::is_pointer_v<Kept>) {
            elements.put(position++, reinterpret_cast<Kept>(number));
        } else {
            elements.put(position++, number);
        }
    }
    return true;
}

template<class Kept>
bool takeBytes(Reader& reader, Elements& elements, int position, std::uint32_t length) {
    for (std::uint32_t i = 0; i < length; ++i) {
        std::string text;
        if (!reader.takeCounted(text) ||
            (std::is_same_v<Kept, Text> && text.find('\0') != std::string::npos)) {
            return false;
        }
        elements.put(position++, Kept{std::make_shared<Bytes>(std::move(text))});
    }
    return true;
}

bool takeRun(PARAM_TYPE type, Reader& reader, Elements& elements, int position,
             std::uint32_t length) {
    switch (type) {
    case PARAM_DELETE:
        return reader.left() != 0;
    case PARAM_POINTER:
        return takeNumbers<std::uint64_t, void*>(reader, elements, position, length);
    case PARAM_INT:
        return takeNumbers<int>(reader, elements, position, length);
    case PARAM_DOUBLE:
        return takeNumbers<double>(reader, elements, position, length);
    case PARAM_STRING:
        return takeBytes<Text>(reader, elements, position, length);
    case PARAM_BINARY:
        return takeBytes<Binary>(reader, elements, position, length);
    case PARAM_INT64:
        return takeNumbers<long long>(reader, elements, position, length);
    case PARAM_UINT:
        return takeNumbers<unsigned int>(reader, elements, position, length);
    case PARAM_UINT64:
        return takeNumbers<unsigned long long>(reader, elements, position, length);
    default:
        return false;
    }
}

/// The bytes of a single run of numbers, which only need to be copied.
std::optional<Elements> packed(std::string_view bytes) {
    constexpr std::size_t header = 1 + 1 + sizeof(std::uint32_t);
    Reader reader(bytes);
    char first = 0;
    std::uint8_t type = 0;
    std::uint32_t length = 0;
    if (std::endian::native != std::endian::little || !reader.take(first) || first != version ||
        !reader.take(type) || !reader.take(length)) {
        return std::nullopt;
    }
    const std::size_t size = numberSize(static_cast<PARAM_TYPE>(type));
    if (size == 0 || length == 0 || length > std::uint32_t{highestPosition} + 1 ||
        reader.left() != length * size) {
        return std::nullopt;
    }
    return Elements::ofNumbers(static_cast<PARAM_TYPE>(type), std::string(bytes.substr(header)));
}

} // namespace

std::string keyBytes(const Elements& elements) {
    std::string bytes(1, version);
    const auto count = static_cast<std::size_t>(elements.filled());
    bytes.reserve(16 + 8 * count);
    if (std::endian::native == std::endian::little && elements.numberType() != PARAM_DELETE) {
        bytes += static_cast<char>(elements.numberType());
        append(bytes, static_cast<std::uint32_t>(count));
        bytes += elements.numbers();
        return bytes;
    }
    {
        Writer writer(bytes); // Its destructor fills in a length.
        elements.visit([&](int position, const Value& value) {
            writer.add(position, value);
            return true;
        });
    }
    return bytes;
}

bool haveSameKeys(const TicketContent& one, const TicketContent& other) {
    const auto& left = one.keys();
    const auto& right = other.keys();
    return std::equal(
        left.begin(), left.end(), right.begin(), right.end(), [](const auto& a, const auto& b) {
            return a.first == b.first &&
                   (a.second == b.second || keyBytes(*a.second) == keyBytes(*b.second));
        });
}

std::shared_ptr<Elements> elementsFromBytes(std::string_view bytes) {
    if (auto numbers = packed(bytes)) {
        return std::make_shared<Elements>(std::move(*numbers));
    }
    Reader reader(bytes);
    char first = 0;
    if (!reader.take(first) || first != version || reader.left() == 0) {
        return nullptr;
    }
    auto elements = std::make_shared<Elements>();
    std::int64_t position = 0;
    while (reader.left() != 0) {
        std::uint8_t type = 0;
        std::uint32_t length = 0;
        if (!reader.take(type) || !reader.take(length) || length == 0 ||
            position + length > std::int64_t{highestPosition} + 1 ||
            !takeRun(static_cast<PARAM_TYPE>(type), reader, *elements, static_cast<int>(position),
                     length)) {
            return nullptr;
        }
        position += length;
    }
    return elements;
}

} // namespace store
