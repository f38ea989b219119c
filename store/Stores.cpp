// SPDX-License-Identifier: Apache-2.0
#include "store/Engines.h"

#include <algorithm>
#include <climits>
#include <utility>

#include <unistd.h>

#include "store/KeyBytes.h"
#include "store/WriteFailures.h"

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

void grantRights(const std::string& address, const std::string& role, Rights rights) {
    kindOf(address).grant(address, role, rights);
}

std::string thisOrigin() {
    char machine[HOST_NAME_MAX + 1] = {};
    gethostname(machine, sizeof machine - 1);
    return std::to_string(geteuid()) + "@" + machine;
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

namespace {

constexpr std::pair<Event, std::string_view> eventNames[] = {
    {Event::Login, "login"},
    {Event::Refusal, "refusal"},
    {Event::LostWrite, "lost write"},
    {Event::Administration, "administration"},
};

} // namespace

std::string_view eventName(Event event) {
    for (const auto& [known, name] : eventNames) {
        if (known == event) {
            return name;
        }
    }
    return {};
}

std::optional<Event> eventNamed(std::string_view name) {
    for (const auto& [event, known] : eventNames) {
        if (known == name) {
            return event;
        }
    }
    return std::nullopt;
}

void showDamagedKey(int type, int id, std::string_view key, const StoreEngine::ShowFault& show) {
    show(ticketNameOf(type, id), "its key " + std::string(key) + " can't be decoded");
}

void showOverview(std::int64_t block, const StoreEngine::ShowFault& show) {
    const std::int64_t first = block * jobsOfBlock;
    show("jobs " + std::to_string(first) + " to " + std::to_string(first + jobsOfBlock - 1),
         "the overview of jobs does not agree with their tickets");
}

std::string gapIn(const std::vector<FileVersion>& versions, int highestVersion) {
    for (std::size_t i = 0; i < versions.size(); ++i) {
        const int next = i + 1 < versions.size() ? versions[i + 1].number : highestVersion + 1;
        if (next != versions[i].number + 1) {
            return "version " + std::to_string(versions[i].number + 1) + " is missing";
        }
    }
    return {};
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
