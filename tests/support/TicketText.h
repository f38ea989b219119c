// SPDX-License-Identifier: Apache-2.0
// Parameters as short lines of text, so that a table of test cases shows them side by side.
//
// Records are separated by blanks and have the form key[position]=value:
//
//   a[-1]=5      int               b[0]=2.5     double; also nan, inf, -inf
//   c[1]='text   string            d[-1]=#00ff  binary, in hexadecimal
//   e[0]=u5      unsigned int      f[0]=l-5     long long
//   g[0]=U5      unsigned 64-bit   h[0]=p16     pointer
//   i[-1]=-      deletion
//
// Without a position, a list of values is a whole vector as it is sent: a=1,2,3 means a[-1]=1
// a[1]=2 a[2]=3.
#pragma once

#include <charconv>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <memory>
#include <sstream>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

#include "ticket/TicketRecords.h"

namespace support {

/// Converts hexadecimal digits, two per byte. Blanks between bytes are skipped.
inline std::string bytesOf(const std::string& digits) {
    std::string bytes;
    for (std::size_t i = 0; i + 1 < digits.size(); i += digits[i] == ' ' ? 1 : 2) {
        if (digits[i] != ' ') {
            bytes += static_cast<char>(std::stoi(digits.substr(i, 2), nullptr, 16));
        }
    }
    return bytes;
}

inline std::string valueText(PARAM_TYPE type, const void* value) {
    if (type == PARAM_DELETE) {
        return "-";
    }
    if (type == PARAM_POINTER) {
        return "p" + std::to_string(reinterpret_cast<std::uintptr_t>(value));
    }
    if (value == nullptr) {
        return "null";
    }
    switch (type) {
    case PARAM_INT:
        return std::to_string(*static_cast<const int*>(value));
    case PARAM_UINT:
        return "u" + std::to_string(*static_cast<const unsigned*>(value));
    case PARAM_INT64:
        return "l" + std::to_string(*static_cast<const long long*>(value));
    case PARAM_UINT64:
        return "U" + std::to_string(*static_cast<const unsigned long long*>(value));
    case PARAM_STRING:
        return std::string("'") + static_cast<const char*>(value);
    case PARAM_DOUBLE: {
        char text[40] = {};
        std::to_chars(text, std::end(text), *static_cast<const double*>(value));
        return std::strpbrk(text, ".en") != nullptr ? text : std::string(text) + ".0";
    }
    case PARAM_BINARY: {
        std::string text = "#";
        for (const unsigned char byte : *static_cast<const BIN_STRING*>(value)) {
            char digits[3];
            std::snprintf(digits, sizeof digits, "%02x", byte);
            text += digits;
        }
        return text;
    }
    default:
        return "?" + std::to_string(type);
    }
}

inline std::string tableText(const SETMULTIPAR* table) {
    std::string text;
    for (; table != nullptr && table->key != nullptr; ++table) {
        text += (text.empty() ? "" : " ") + std::string(table->key) + "[" +
                std::to_string(table->position) + "]=" + valueText(table->type, table->value);
    }
    return text;
}

/// The results of a table's records, as ones and zeros.
inline std::string resultText(const SETMULTIPAR* table) {
    std::string text;
    for (; table->key != nullptr; ++table) {
        text += table->ok() ? '1' : '0';
    }
    return text;
}

/// The callback of a walk whose context is a vector of records.
inline bool collect(void* records, const char* key, PARAM_TYPE type, const void* value,
                    int position) {
    static_cast<std::vector<SETMULTIPAR>*>(records)->push_back(
        {.key = key, .type = type, .value = value, .position = position});
    return true;
}

/// A ticket's values in the order of a walk, as a table.
inline std::vector<SETMULTIPAR> walked(const STICKET_ACCESS& access) {
    std::vector<SETMULTIPAR> table;
    ticket::single::Walk::call(access, collect, static_cast<void*>(&table), "", 8000);
    table.emplace_back();
    return table;
}

/// The same as text; "null" if there is no ticket.
inline std::string ticketText(const STICKET_ACCESS* access) {
    return access == nullptr ? "null" : tableText(walked(*access).data());
}

/// A table parsed from text. Owns everything that it points to.
class RecordTable {
  public:
    explicit RecordTable(const std::string& text) {
        std::istringstream words(text);
        for (std::string word; words >> word;) {
            addWord(word);
        }
        m_records.emplace_back();
    }
    RecordTable(const RecordTable&) = delete;

    SETMULTIPAR* records() { return m_records.data(); }

  private:
    void addWord(const std::string& word) {
        const auto equals = word.find('=');
        if (equals == std::string::npos) {
            throw std::invalid_argument("no value in " + word);
        }
        std::string key = word.substr(0, equals);
        const std::string values = word.substr(equals + 1);
        const auto bracket = key.rfind('[');
        if (bracket != std::string::npos) {
            const int position = std::stoi(key.substr(bracket + 1));
            add(key.substr(0, bracket), values, position);
            return;
        }
        std::istringstream list(values);
        int position = POSITION_WHOLE;
        for (std::string value; std::getline(list, value, ',');) {
            add(key, value, position);
            position = position == POSITION_WHOLE ? 1 : position + 1;
        }
    }

    void add(const std::string& key, const std::string& value, int position) {
        SETMULTIPAR record;
        const bool again = !m_records.empty() && key == m_records.back().key;
        // Equal keys share one address, as in a list.
        record.key = again ? m_records.back().key : own(key)->c_str();
        record.position = position;
        const std::string rest = value.substr(value.empty() ? 0 : 1);
        const auto set = [&](PARAM_TYPE type, const void* of) {
            record.type = type;
            record.value = of;
        };
        switch (value.empty() ? '\0' : value.front()) {
        case '\'':
            set(PARAM_STRING, own(rest)->c_str());
            break;
        case '#':
            set(PARAM_BINARY, own(BIN_STRING(*own(bytesOf(rest)))));
            break;
        case 'p':
            set(PARAM_POINTER, reinterpret_cast<const void*>(std::stoull(rest)));
            break;
        case 'u':
            set(PARAM_UINT, own(static_cast<unsigned>(std::stoul(rest))));
            break;
        case 'l':
            set(PARAM_INT64, own(std::stoll(rest)));
            break;
        case 'U':
            set(PARAM_UINT64, own(std::stoull(rest)));
            break;
        default:
            if (value.find_first_of(".en") != std::string::npos) {
                set(PARAM_DOUBLE, own(std::stod(value)));
            } else if (value != "-") {
                set(PARAM_INT, own(std::stoi(value)));
            }
        }
        m_records.push_back(record);
    }

    template<class T>
    const T* own(T value) {
        const auto owned = std::make_shared<const T>(std::move(value));
        m_owned.push_back(owned);
        return owned.get();
    }

    std::vector<SETMULTIPAR> m_records;
    std::vector<std::shared_ptr<const void>> m_owned;
};

} // namespace support
