// SPDX-License-Identifier: Apache-2.0
#include "ticket/StringPrefixSet.h"

#include <algorithm>

bool STRINGPREFIXSET::LESS::operator()(const std::string& a, const std::string& b) const {
    const std::size_t length = std::min(a.size(), b.size());
    return a.compare(0, length, b, 0, length) < 0;
}

STRINGPREFIXSET::const_iterator STRINGPREFIXSET::find(const std::string& text) const {
    const const_iterator first = m_prefixes.find(text);
    return first != end() && first->size() > text.size() ? end() : first;
}

void STRINGPREFIXSET::insert(const std::string& prefix) {
    // Erases by iterator: erasing by key would remove all longer prefixes at once.
    const const_iterator first = m_prefixes.find(prefix);
    if (first != end() && first->size() > prefix.size()) {
        m_prefixes.erase(first);
    }
    m_prefixes.insert(prefix);
}

std::size_t STRINGPREFIXSET::erase(const std::string& prefix) {
    return find(prefix) == end() ? 0 : m_prefixes.erase(prefix);
}
