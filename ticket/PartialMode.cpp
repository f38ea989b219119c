// SPDX-License-Identifier: Apache-2.0
#include "ticket/PartialMode.h"

#include <utility>

PARTIAL_MODE::PARTIAL_MODE(const char* const* table) {
    if (table != nullptr) {
        set(table);
    }
}

void PARTIAL_MODE::set(const char* const* table) {
    if (table == nullptr) {
        clear();
        return;
    }
    const bool subtract = *table != nullptr && **table == '\0';
    if (subtract) {
        ++table;
    }
    for (; *table != nullptr; ++table) {
        if (subtract) {
            erase(*table);
        } else {
            insert(*table);
        }
    }
}

void PARTIAL_MODE::set(const std::set<std::string>& keys, bool remove) {
    if (keys.empty()) {
        clear();
        return;
    }
    for (const std::string& key : keys) {
        if (remove) {
            erase(key);
        } else {
            insert(key);
        }
    }
}

void PARTIAL_MODE::insert(std::string key) {
    if (wildcard(key)) {
        m_prefixes.insert(key);
    } else {
        m_exact.insert(std::move(key));
    }
}

void PARTIAL_MODE::erase(std::string key) {
    if (wildcard(key)) {
        m_prefixes.erase(key);
    } else {
        m_exact.erase(key);
    }
}

void PARTIAL_MODE::clear() {
    m_exact.clear();
    m_prefixes.clear();
}

bool PARTIAL_MODE::wildcard(std::string& key) {
    if (key.empty() || key.back() != '*') {
        return false;
    }
    key.pop_back();
    return true;
}

bool PARTIAL_MODE::multi_contains(const std::string& key) const {
    return m_exact.contains(key) || m_prefixes.find(key) != m_prefixes.end();
}

PARTIAL_TABLE::PARTIAL_TABLE(const PARTIAL_MODE& mode) : m_keys(mode.m_exact) {
    for (const std::string& prefix : mode.m_prefixes) {
        m_keys.insert(prefix + '*');
    }
    if (m_keys.empty()) {
        return;
    }
    m_table = std::make_unique<const char*[]>(m_keys.size() + 1);
    std::size_t count = 0;
    for (const std::string& key : m_keys) {
        m_table[count++] = key.c_str();
    }
}
