// SPDX-License-Identifier: Apache-2.0
#include "store/JobOverview.h"

#include <algorithm>

#include "store/StoreEngine.h"

namespace store {

namespace {

constexpr char nothing = 0;
constexpr char number = PARAM_INT;
constexpr char somethingElse = '\xFF';

/// Whether an entry has the form that slotOf and the store write.
bool isSound(const char* entry) {
    if (entry[0] != 0 && entry[0] != 1) {
        return false;
    }
    for (std::size_t key = 0; key < overviewKeys.size(); ++key) {
        const char tag = entry[1 + key * slotBytes];
        if (tag != nothing && (entry[0] == 0 || (tag != number && tag != somethingElse))) {
            return false;
        }
    }
    return true;
}

} // namespace

std::size_t overviewKey(std::string_view name) {
    return static_cast<std::size_t>(std::find(overviewKeys.begin(), overviewKeys.end(), name) -
                                    overviewKeys.begin());
}

std::string slotOf(const Elements* elements) {
    std::string slot(slotBytes, '\0');
    if (elements == nullptr) {
        return slot;
    }
    slot[0] = somethingElse;
    if (elements->count() != 1) {
        return slot;
    }
    if (const auto* const value = std::get_if<int>(elements->at(0))) {
        slot[0] = number;
        for (std::size_t i = 1; i < slotBytes; ++i) {
            slot[i] = static_cast<char>(static_cast<unsigned>(*value) >> (8 * (i - 1)));
        }
    }
    return slot;
}

void JobOverview::clear() {
    m_bytes.clear();
    m_start.clear();
    m_ids.clear();
}

void JobOverview::add(int block, std::string_view bytes) {
    constexpr int blocks = 0x1000000 / jobsOfBlock; // Ids go up to 16,777,215.
    if (block < static_cast<int>(m_start.size()) || block >= blocks || bytes.size() != blockBytes) {
        throw StoreFailure(Fault::Damaged, "the store's overview of jobs can't be read");
    }
    for (int i = 0; i < jobsOfBlock; ++i) {
        const char* const entry = bytes.data() + entryOffset(i);
        if (!isSound(entry)) {
            throw StoreFailure(Fault::Damaged, "the store's overview of jobs can't be read");
        }
        if (entry[0] != 0) {
            m_ids.push_back(block * jobsOfBlock + i);
        }
    }
    m_start.resize(static_cast<std::size_t>(block), none);
    m_start.push_back(m_bytes.size());
    m_bytes += bytes;
}

JobOverview::Holds JobOverview::find(int id, std::size_t key, int& value) const {
    const auto block = static_cast<std::size_t>(blockOf(id));
    if (id < 0 || block >= m_start.size() || m_start[block] == none) {
        return Holds::Nothing;
    }
    const char* const slot = m_bytes.data() + m_start[block] + slotOffset(id, key);
    if (slot[0] != number) {
        return slot[0] == nothing ? Holds::Nothing : Holds::SomethingElse;
    }
    unsigned read = 0;
    for (std::size_t i = 1; i < slotBytes; ++i) {
        read |= static_cast<unsigned>(static_cast<unsigned char>(slot[i])) << (8 * (i - 1));
    }
    value = static_cast<int>(read);
    return Holds::Number;
}

} // namespace store
