// SPDX-License-Identifier: Apache-2.0
#include "companions/diagnosis/SimilarKeys.h"

#include <algorithm>
#include <cctype>
#include <utility>

namespace diagnosis {

namespace {

constexpr std::size_t tooFar = 3;

/// Number of differing characters, at most tooFar. Keys are short, so the plain table is
/// sufficient.
std::size_t distanceOf(const std::string& a, const std::string& b) {
    if (a.size() > b.size() + 2 || b.size() > a.size() + 2) {
        return tooFar;
    }
    std::vector<std::size_t> row(b.size() + 1);
    for (std::size_t j = 0; j <= b.size(); ++j) {
        row[j] = j;
    }
    for (std::size_t i = 1; i <= a.size(); ++i) {
        std::size_t diagonal = std::exchange(row[0], i);
        for (std::size_t j = 1; j <= b.size(); ++j) {
            const bool same = std::tolower(static_cast<unsigned char>(a[i - 1])) ==
                              std::tolower(static_cast<unsigned char>(b[j - 1]));
            const std::size_t value =
                std::min({row[j] + 1, row[j - 1] + 1, diagonal + (same ? 0 : 1)});
            diagonal = std::exchange(row[j], value);
        }
    }
    return std::min(row[b.size()], tooFar);
}

} // namespace

bool SimilarKeys::isAsked(const AskedKey& wanted, const std::string& name) const {
    return std::any_of(m_asked.begin(), m_asked.end(), [&](const AskedKey& asked) {
        return asked.key == name && asked.type == wanted.type && asked.id == wanted.id;
    });
}

std::string SimilarKeys::like(const AskedKey& wanted) {
    auto& names = m_names[{wanted.type, wanted.id}];
    if (names.empty()) {
        const auto content = m_engine.content(wanted.type, wanted.id, store::KeyFilter());
        if (content != nullptr) {
            for (const auto& [key, elements] : content->keys()) {
                names.push_back(key);
            }
        }
    }
    std::string best;
    std::size_t least = tooFar;
    for (const std::string& name : names) {
        const std::size_t distance = isAsked(wanted, name) ? tooFar : distanceOf(wanted.key, name);
        if (distance < least) {
            least = distance;
            best = name;
        }
    }
    return best;
}

} // namespace diagnosis
