// SPDX-License-Identifier: Apache-2.0
#include "companions/tintgate-store/CopyStore.h"

#include <iterator>
#include <vector>

#include "companions/tintgate-store/Commands.h"
#include "companions/tintgate-store/Rows.h"
#include "companions/tintgate-store/Spool.h"
#include "companions/tintgate-store/TicketName.h"

namespace admin {

namespace {

using store::StoreEngine;

struct ListedFile {
    store::FileEntry entry;
    std::vector<store::FileVersion> versions;
    int highestVersion = 0; ///< May have been pruned.
};

class Copy {
  public:
    Copy(StoreEngine& from, StoreEngine& to) : m_from(from), m_to(to) {}

    void run() {
        const std::vector<TicketName> tickets = listTickets();
        const std::vector<ListedFile> files = listFiles();
        std::size_t total = tickets.size();
        for (const auto& file : files) {
            total += 1 + file.versions.size();
        }
        Progress progress(total, "tickets and files");
        m_progress = &progress;
        const auto users = copyUsers();
        copyTickets(tickets);
        copyFiles(files);
        m_to.finishCopy();
        m_told = counted(std::ssize(tickets), "ticket") + ", " +
                 counted(std::ssize(files), "file") + " and " + counted(users, "user");
    }

    const std::string& told() const { return m_told; }

  private:
    std::vector<TicketName> listTickets() {
        std::vector<TicketName> tickets;
        for (int type = 0; TICKET_TYPE_Valid(type); ++type) {
            for (const int id : m_from.ids(type)) {
                tickets.push_back({type, id});
            }
        }
        return tickets;
    }

    std::vector<ListedFile> listFiles() {
        std::vector<ListedFile> files;
        for (auto& entry : m_from.files()) {
            auto versions = m_from.versions(entry.path);
            const int highest = m_from.highestVersion(entry.path);
            files.push_back({std::move(entry), std::move(versions), highest});
        }
        return files;
    }

    std::int64_t copyUsers() {
        const auto users = m_from.users();
        for (const auto& former : m_to.users()) {
            m_to.removeUser(former.name);
        }
        for (const auto& user : users) {
            m_to.putUser(user);
        }
        return std::ssize(users);
    }

    void copyTickets(const std::vector<TicketName>& tickets) {
        for (int type = 0; TICKET_TYPE_Valid(type); ++type) {
            for (const int id : m_to.ids(type)) {
                if (!m_from.exists(type, id)) {
                    m_to.remove(type, id);
                }
            }
        }
        store::Scope everything;
        everything.everything = true;
        everything.make = true;
        for (const auto& [type, id] : tickets) {
            if (const auto content = m_from.content(type, id, store::KeyFilter())) {
                m_to.change(type, id, everything,
                            [&](store::TicketContent& stored) { stored.transfer(*content, true); });
            }
            m_progress->done(++m_done);
        }
        for (const auto& [type, id] : m_from.highestIds()) {
            m_to.raiseHighestId(type, id);
        }
    }

    void copyFiles(const std::vector<ListedFile>& files) {
        for (const auto& [entry, versions, highest] : files) {
            copyVersion(entry.path, {0, entry.size, entry.time});
            for (const auto& version : versions) {
                copyVersion(entry.path, version);
            }
            if (highest > (versions.empty() ? 0 : versions.back().number)) {
                m_to.raiseHighestVersion(entry.path, highest);
            }
        }
    }

    void copyVersion(const std::string& path, const store::FileVersion& version) {
        Spool spool;
        if (version.number == 0) {
            m_from.getFile(path, spool.toWrite());
        } else {
            m_from.getVersion(path, version.number, spool.toWrite());
        }
        m_to.placeVersion(path, version, spool.toRead());
        m_progress->done(++m_done);
    }

    StoreEngine& m_from;
    StoreEngine& m_to;
    Progress* m_progress = nullptr;
    std::size_t m_done = 0;
    std::string m_told;
};

} // namespace

std::string copyStore(StoreEngine& from, StoreEngine& to) {
    Copy copy(from, to);
    copy.run();
    return copy.told();
}

} // namespace admin
