// SPDX-License-Identifier: Apache-2.0
#include "ticket/ParameterCaches.h"

#include <string_view>

BIN_STRING_BUFFER::BIN_STRING_BUFFER(const BIN_STRING& bytes) {
    if (bytes.valid()) {
        m_bytes.assign(bytes.begin(), bytes.end());
        m_view = m_bytes;
    }
}

BIN_STRING_BUFFER::BIN_STRING_BUFFER(const BIN_STRING_BUFFER& other)
    : m_bytes(other.m_bytes), m_view(m_bytes) {}

BIN_STRING_BUFFER& BIN_STRING_BUFFER::operator=(const BIN_STRING_BUFFER& other) {
    m_bytes = other.m_bytes;
    m_view = m_bytes;
    return *this;
}

const char* STRINGCACHE::operator()(const char*& text) {
    return text = (*this)[text];
}

const char* STRINGCACHE::operator[](const char* text) {
    if (text == nullptr) {
        return nullptr;
    }
    if (m_last == nullptr || *m_last != text) {
        // Looks up the pointer's text directly, so that a text already stored costs no allocation.
        const std::string_view wanted = text;
        auto place = m_texts.lower_bound(wanted);
        if (place == m_texts.end() || *place != wanted) {
            place = m_texts.emplace_hint(place, wanted);
        }
        m_last = &*place;
    }
    return m_last->c_str();
}

bool STRINGCACHE::find(const char* text) const {
    return text != nullptr && m_texts.contains(std::string_view(text));
}

const BIN_STRING* BIN_STRING_CACHE::operator()(const BIN_STRING*& bytes) {
    if (bytes != nullptr) {
        bytes = m_buffers.emplace(*bytes).first->BinString();
    }
    return bytes;
}
