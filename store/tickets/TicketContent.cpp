// SPDX-License-Identifier: Apache-2.0
#include "store/tickets/TicketContent.h"

#include <algorithm>
#include <unordered_set>
#include <vector>

namespace store {

namespace {

bool keyAllowed(std::string_view key) {
    return !key.empty() && key.back() != '*';
}

bool startsWith(std::string_view text, std::string_view prefix) {
    return text.substr(0, prefix.size()) == prefix;
}

/// Whether a record and the next one begin an array of numbers.
bool beginsArray(const SETMULTIPAR* record) {
    return numberSize(record->type) != 0 && record->position == 0 && record[1].position == 1 &&
           record[1].key == record->key && record[1].type == record->type;
}

/// Has the effect of setElement on consecutive records that fill positions 0, 1, 2, ... of a
/// missing key with numbers of one type, as for a measured array, but without creating a Value for
/// each. Sets their results and moves the record to the last of them.
template<std::size_t Size>
std::shared_ptr<Elements> takeArray(SETMULTIPAR*& record) {
    const SETMULTIPAR first = *record;
    std::string bytes;
    int count = 0;
    for (; count <= highestPosition && record->key == first.key && record->type == first.type &&
           record->position == count && record->value != nullptr;
         ++record, ++count) {
        bytes.append(static_cast<const char*>(record->value), Size);
        record->result = 1;
    }
    --record;
    return std::make_shared<Elements>(Elements::ofNumbers(first.type, std::move(bytes)));
}

} // namespace

void clearResults(SETMULTIPAR* table) {
    for (; table->key != nullptr; ++table) {
        table->result = 0;
    }
}

KeyFilter::KeyFilter(const char* const* table) : m_all(table == nullptr || *table == nullptr) {
    if (m_all) {
        return;
    }
    for (; *table != nullptr; ++table) {
        std::string key = *table;
        if (!key.empty() && key.back() == '*') {
            key.pop_back();
            m_prefixes.insert(std::move(key));
        } else {
            m_exact.insert(std::move(key));
        }
    }
}

bool KeyFilter::takes(std::string_view key) const {
    return m_all || m_exact.find(key) != m_exact.end() ||
           std::any_of(m_prefixes.begin(), m_prefixes.end(),
                       [&](const auto& prefix) { return startsWith(key, prefix); });
}

/// A table being applied to a ticket.
///
/// Deleted keys stay in the map, without elements, until the end, and old elements stay alive,
/// because later records may point to them. They also allow undoing the table.
class TicketContent::Application {
  public:
    Application(Keys& keys, bool single) : m_keys(keys), m_single(single) {}

    std::shared_ptr<Elements>& at(const char* key) {
        if (key != m_lastPointer) {
            m_last = m_keys.try_emplace(key).first;
            m_lastPointer = key;
            remember(m_last);
        }
        return m_last->second;
    }

    void finish() {
        for (const auto& touched : m_touched) {
            if (!touched.key->second) {
                m_keys.erase(touched.key);
            }
        }
    }

    void undo() {
        for (auto& touched : m_touched) {
            if (!m_single) {
                touched.key->second = std::move(touched.former);
            }
        }
        finish();
    }

  private:
    struct Touched {
        Keys::iterator key;
        std::shared_ptr<Elements> former;
    };

    void remember(Keys::iterator key) {
        if (m_seen.insert(&key->first).second) {
            // A single record has nothing to undo and copies its value before any change. Keeping
            // its old elements would only force a copy of them.
            m_touched.push_back({key, m_single ? nullptr : key->second});
        }
    }

    Keys& m_keys;
    const bool m_single;
    const char* m_lastPointer = nullptr;
    Keys::iterator m_last;
    std::vector<Touched> m_touched;
    std::unordered_set<const std::string*> m_seen;
};

std::shared_ptr<const Elements> TicketContent::find(std::string_view key) const {
    const auto found = m_keys.find(key);
    return found == m_keys.end() ? nullptr : found->second;
}

void TicketContent::put(std::string key, std::shared_ptr<Elements> elements) {
    m_keys.insert_or_assign(std::move(key), std::move(elements));
}

void TicketContent::apply(SETMULTIPAR* table) {
    if (table == nullptr || table->key == nullptr) {
        return;
    }
    Application application(m_keys, table[1].key == nullptr);
    try {
        for (auto* record = table; record->key != nullptr; ++record) {
            record->result = 0;
            if (!keyAllowed(record->key)) {
                continue;
            }
            auto& elements = application.at(record->key);
            if (!elements && record->value != nullptr && beginsArray(record)) {
                elements =
                    numberSize(record->type) == 8 ? takeArray<8>(record) : takeArray<4>(record);
            } else {
                record->result =
                    setElement(elements, record->type, record->value, record->position) ? 1 : 0;
            }
        }
        application.finish();
    } catch (...) {
        application.undo();
        clearResults(table);
        throw;
    }
}

bool TicketContent::equals(const TicketContent& other) const {
    return m_keys.size() == other.m_keys.size() &&
           std::equal(m_keys.begin(), m_keys.end(), other.m_keys.begin(),
                      [](const auto& a, const auto& b) {
                          return a.first == b.first &&
                                 (a.second == b.second || a.second->equals(*b.second));
                      });
}

TicketContent TicketContent::select(const KeyFilter& filter) const {
    if (filter.all()) {
        return *this;
    }
    TicketContent selected;
    for (const auto& key : filter.exact()) {
        if (const auto found = m_keys.find(key); found != m_keys.end()) {
            selected.m_keys.insert(*found);
        }
    }
    for (const auto& prefix : filter.prefixes()) {
        for (auto found = m_keys.lower_bound(prefix);
             found != m_keys.end() && startsWith(found->first, prefix); ++found) {
            selected.m_keys.insert(*found);
        }
    }
    return selected;
}

void TicketContent::transfer(const TicketContent& source, bool replace) {
    if (replace) {
        m_keys = source.m_keys;
        return;
    }
    for (const auto& [key, elements] : source.m_keys) {
        m_keys.insert_or_assign(key, elements);
    }
}

void TicketContent::walk(SCollect callback, void* context) const {
    bool goOn = true;
    for (const auto& [key, elements] : m_keys) {
        elements->visit([&, name = key.c_str()](int position, const Value& value) {
            goOn = callback(context, name, typeOf(value), valuePointer(value), position);
            return goOn;
        });
        if (!goOn) {
            return;
        }
    }
}

} // namespace store
