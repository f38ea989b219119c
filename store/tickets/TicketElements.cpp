// SPDX-License-Identifier: Apache-2.0
#include "store/tickets/TicketElements.h"

#include <algorithm>
#include <cstring>
#include <type_traits>
#include <utility>

namespace store {

namespace {

bool isHole(const Value& value) {
    return typeOf(value) == PARAM_DELETE;
}

/// Reads a number of the requested type.
bool readNumber(const Elements& elements, void* out, int position) {
    const std::string& bytes = elements.numbers();
    const auto index = static_cast<std::size_t>(std::max(position, 0));
    const auto copy = [&](auto size) {
        if (out == nullptr || position < POSITION_WHOLE || index >= bytes.size() / size) {
            return false;
        }
        std::memcpy(out, bytes.data() + index * size, size);
        return true;
    };
    if (numberSize(elements.numberType()) == 8) {
        return copy(std::integral_constant<std::size_t, 8>());
    }
    return copy(std::integral_constant<std::size_t, 4>());
}

/// Reads everything else.
bool readValue(const Elements& key, PARAM_TYPE type, void* out, int position,
               HandedOut& handedOut) {
    if (type == PARAM_COUNT) {
        if (position != POSITION_WHOLE || out == nullptr) {
            return false;
        }
        const auto count = static_cast<unsigned long>(key.count());
        std::memcpy(out, &count, sizeof count);
        return true;
    }
    if (key.numberType() != PARAM_DELETE && type != PARAM_DELETE) {
        return false; // Not the requested type.
    }
    const Value* value = position == POSITION_WHOLE ? key.first() : key.at(position);
    if (value == nullptr) {
        return false;
    }
    if (type == PARAM_DELETE) {
        if (out != nullptr) {
            const PARAM_TYPE stored = typeOf(*value);
            std::memcpy(out, &stored, sizeof stored);
        }
        return true;
    }
    if (typeOf(*value) != type || out == nullptr) {
        return false;
    }
    giveValue(*value, out, handedOut);
    return true;
}

/// Compares the bytes of numbers: a NaN equals itself, and 0.0 does not equal -0.0.
bool sameBits(const Value& a, const Value& b) {
    return a.index() == b.index() &&
           std::visit(
               [&](const auto& value) {
                   using T = std::decay_t<decltype(value)>;
                   const T& there = *std::get_if<T>(&b);
                   if constexpr (std::is_same_v<T, Text> || std::is_same_v<T, Binary>) {
                       return value.bytes->text == there.bytes->text;
                   } else if constexpr (std::is_empty_v<T>) {
                       return true;
                   } else {
                       return std::memcmp(&value, &there, sizeof value) == 0;
                   }
               },
               a);
}

bool removeElement(std::shared_ptr<Elements>& key, int position) {
    if (position == POSITION_WHOLE) {
        key.reset();
        return true;
    }
    if (!key || position < 0 || position >= key->count()) {
        return false;
    }
    auto& elements = own(key);
    elements.remove(position);
    if (elements.empty()) {
        key.reset();
    }
    return true;
}

} // namespace

Elements Elements::ofNumbers(PARAM_TYPE type, std::string bytes) {
    Elements elements;
    elements.m_filled = bytes.size() / numberSize(type);
    elements.m_numbers = std::move(bytes);
    elements.m_numberType = type;
    return elements;
}

void Elements::unpack() const {
    if (m_numberType == PARAM_DELETE) {
        return;
    }
    const std::size_t size = numberSize(m_numberType);
    std::vector<Value> values;
    values.reserve(m_filled);
    for (std::size_t at = 0; at + size <= m_numbers.size(); at += size) {
        values.push_back(*takeValue(m_numberType, m_numbers.data() + at));
    }
    m_near = std::move(values);
    m_numberType = PARAM_DELETE;
    m_numbers = {};
}

int Elements::count() const {
    if (m_numberType != PARAM_DELETE) {
        return static_cast<int>(m_filled);
    }
    return m_far.empty() ? static_cast<int>(m_near.size()) : m_far.rbegin()->first + 1;
}

const Value* Elements::at(int position) const {
    unpack();
    if (position < 0) {
        return nullptr;
    }
    if (static_cast<std::size_t>(position) < m_near.size()) {
        const auto& value = m_near[static_cast<std::size_t>(position)];
        return isHole(value) ? nullptr : &value;
    }
    const auto found = m_far.find(position);
    return found == m_far.end() ? nullptr : &found->second;
}

bool Elements::equals(const Elements& other) const {
    if (m_filled != other.m_filled || count() != other.count()) {
        return false;
    }
    if (m_numberType != PARAM_DELETE && m_numberType == other.m_numberType) {
        return m_numbers == other.m_numbers;
    }
    bool same = true;
    visit([&](int position, const Value& value) {
        const Value* const there = other.at(position);
        same = there != nullptr && sameBits(value, *there);
        return same;
    });
    return same;
}

const Value* Elements::first() const {
    unpack();
    for (const auto& value : m_near) {
        if (!isHole(value)) {
            return &value;
        }
    }
    return m_far.empty() ? nullptr : &m_far.begin()->second;
}

void Elements::put(int position, Value value) {
    unpack();
    const auto index = static_cast<std::size_t>(position);
    if (index < m_near.size()) {
        m_filled += isHole(m_near[index]) ? 1 : 0;
        m_near[index] = std::move(value);
    } else if (index == m_near.size() && m_far.empty()) {
        m_near.push_back(std::move(value));
        ++m_filled;
    } else {
        m_filled += m_far.insert_or_assign(position, std::move(value)).second ? 1 : 0;
        settle();
    }
}

bool Elements::remove(int position) {
    if (position < 0 || position >= count()) {
        return false;
    }
    unpack();
    const auto index = static_cast<std::size_t>(position);
    if (index < m_near.size()) {
        m_filled -= isHole(m_near[index]) ? 0 : 1;
        m_near.erase(m_near.begin() + position);
    } else {
        m_filled -= m_far.erase(position);
    }
    for (auto behind = m_far.upper_bound(position); behind != m_far.end();) {
        auto node = m_far.extract(behind++);
        --node.key();
        m_far.insert(behind, std::move(node));
    }
    if (m_far.empty()) {
        while (!m_near.empty() && isHole(m_near.back())) {
            m_near.pop_back();
        }
    }
    return true;
}

std::size_t Elements::nearLimit() const {
    return 64 + 4 * m_filled;
}

/// Moves elements to m_near that now fit there.
void Elements::settle() {
    while (!m_far.empty() && static_cast<std::size_t>(m_far.begin()->first) < nearLimit()) {
        const auto next = m_far.begin();
        m_near.resize(static_cast<std::size_t>(next->first));
        m_near.push_back(std::move(next->second));
        m_far.erase(next);
    }
}

bool setElement(std::shared_ptr<Elements>& key, PARAM_TYPE type, const void* value, int position) {
    if (type == PARAM_DELETE) {
        return removeElement(key, position);
    }
    if (position < POSITION_APPEND || position > highestPosition) {
        return false;
    }
    // Copied before any change, because the value may be in this key.
    auto taken = takeValue(type, value);
    if (!taken) {
        return false;
    }
    if (position == POSITION_APPEND && key) {
        position = key->count();
        if (position > highestPosition) {
            return false;
        }
    }
    if (!key || position == POSITION_WHOLE) {
        auto fresh = std::make_shared<Elements>();
        fresh->put(std::max(position, 0), std::move(*taken));
        key = std::move(fresh);
    } else {
        own(key).put(position, std::move(*taken));
    }
    return true;
}

bool readElement(const Elements* key, PARAM_TYPE type, void* out, int position,
                 HandedOut& handedOut) {
    if (key == nullptr) {
        return false;
    }
    if (key->numberType() == type && type != PARAM_DELETE) {
        return readNumber(*key, out, position);
    }
    return readValue(*key, type, out, position, handedOut);
}

} // namespace store
