// SPDX-License-Identifier: Apache-2.0
#include "store/Engines.h"

#include <algorithm>

#include "store/KeyBytes.h"

namespace store {

namespace {

const EngineKind& kindOf(const std::string& address) {
    return address.empty() || address[0] == '/' ? sqliteKind : postgresKind;
}

} // namespace

std::unique_ptr<StoreEngine> openStore(const std::string& address, Access access) {
    return kindOf(address).open(address, access);
}

void makeStore(const std::string& address, const std::string& serverName) {
    kindOf(address).make(address, serverName);
}

std::unique_ptr<StoreEngine> openCopy(const std::string& address) {
    return kindOf(address).openCopy(address);
}

bool bringStoreUpToDate(const std::string& address) {
    return kindOf(address).bringUpToDate(address);
}

std::shared_ptr<Elements> decoded(std::string_view bytes) {
    auto elements = elementsFromBytes(bytes);
    if (elements == nullptr) {
        throw StoreFailure(Fault::Damaged, "a key of the store can't be read");
    }
    return elements;
}

std::vector<std::pair<std::string, std::string>> systemKeys(const std::string& serverName) {
    constexpr int majorVersion = 5; // Clients log out from lower versions.
    const auto stored = [](Value value) {
        Elements elements;
        elements.put(0, std::move(value));
        return keyBytes(elements);
    };
    return {{"System/Product/MajorVersion", stored(majorVersion)},
            {"System/ServerName", stored(Text{std::make_shared<Bytes>(serverName)})}};
}

std::size_t countPruned(const std::vector<FileVersion>& versions, const Pruning& which) {
    const auto keep = static_cast<std::size_t>(std::max(which.keepNewest, 0));
    std::size_t count = 0;
    while (count + keep < versions.size() && versions[count].time < which.writtenBefore) {
        ++count;
    }
    return count;
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

int lowestFree(const std::vector<int>& ids) {
    int free = 1;
    for (const int id : ids) {
        if (id > free) {
            break;
        }
        free = id < free ? free : id + 1;
    }
    return free;
}

void checkFormat(std::int64_t found, std::int64_t present) {
    if (found != present) {
        throw StoreFailure(found > present ? Fault::Newer : Fault::Older,
                           "the store has format " + std::to_string(found) + ", not " +
                               std::to_string(present));
    }
}

} // namespace store
