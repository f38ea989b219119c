// SPDX-License-Identifier: Apache-2.0
#include "store/postgres/PostgresVerify.h"

#include <map>
#include <set>
#include <utility>

#include "store/Engines.h"
#include "store/JobOverview.h"
#include "store/KeyBytes.h"

namespace store::postgres {

namespace {

constexpr Statement oneMoment = {"SET TRANSACTION ISOLATION LEVEL REPEATABLE READ READ ONLY"};

// In steps: one statement for all would take longer than the server lets it, and more memory than
// there is.
constexpr Statement someTickets = {
    "SELECT number, type, id FROM tintgate.tickets WHERE number > $1 ORDER BY number LIMIT 1000"};
constexpr Statement keysOf = {
    "SELECT name, value, hash = sha256(name) FROM tintgate.keys WHERE ticket = $1"};
constexpr Statement usedUp = {
    "SELECT count(*) FROM (SELECT type, max(id) AS highest FROM tintgate.tickets GROUP BY type)"
    " AS used LEFT JOIN tintgate.highest_ids USING (type) WHERE highest > coalesce(id, 0)"};
constexpr Statement blocks = {"SELECT number, content FROM tintgate.job_blocks"};

// To hash the bytes reads them.
constexpr Statement someContents = {
    "SELECT number, size, coalesce(bytes, 0), coalesce(highest + 1, 0) = coalesce(pieces, 0),"
    " (SELECT path FROM tintgate.files WHERE content = number"
    "  UNION ALL SELECT path FROM tintgate.versions WHERE content = contents.number LIMIT 1)"
    " FROM (SELECT number, size FROM tintgate.contents WHERE number > $1 ORDER BY number LIMIT 50)"
    " AS contents LEFT JOIN LATERAL (SELECT sum(length(bytes))::bigint AS bytes,"
    " count(md5(bytes)) AS pieces, max(position) AS highest FROM tintgate.pieces"
    " WHERE content = contents.number) AS stored ON true ORDER BY number"};
constexpr Statement allPaths = {"SELECT path, content IS NULL, last_version FROM tintgate.files"};
constexpr Statement versionsOfAll = {
    "SELECT path, number FROM tintgate.versions ORDER BY path, number"};

/// The overview as the tickets say it must be.
using Blocks = std::map<std::int64_t, std::string>;

class Verification {
  public:
    Verification(Connection& connection, const StoreEngine::ShowFault& show)
        : m_connection(connection), m_show(show) {}

    Verified run() {
        Transaction transaction(m_connection);
        m_connection.send(oneMoment);
        transaction.finish();
        verifyTickets();
        verifyContents();
        verifyPaths();
        transaction.commit();
        return m_found;
    }

  private:
    void verifyTickets() {
        Blocks expected;
        std::int64_t last = 0;
        for (int rows = 1; rows != 0;) {
            const Result tickets = m_connection.run(someTickets, last);
            rows = tickets.rows();
            for (int row = 0; row < rows; ++row) {
                last = tickets.number(row, 0);
                verifyTicket(last, static_cast<int>(tickets.number(row, 1)),
                             static_cast<int>(tickets.number(row, 2)), expected);
            }
            m_found.tickets += rows;
        }
        if (m_connection.run(usedUp).number(0, 0) != 0) {
            m_show("the database", "it gives the number of a ticket a second time");
        }
        verifyOverview(expected);
    }

    void verifyTicket(std::int64_t number, int type, int id, Blocks& expected) {
        std::string* block = nullptr;
        if (type == jobType) {
            block = &expected.try_emplace(blockOf(id), blockBytes, '\0').first->second;
            (*block)[entryOffset(id)] = 1;
        }
        const Result keys = m_connection.run(keysOf, number);
        for (int row = 0; row < keys.rows(); ++row) {
            const std::string_view name = keys.bytes(row, 0);
            const auto elements = elementsFromBytes(keys.bytes(row, 1));
            if (elements == nullptr) {
                showDamagedKey(type, id, name, m_show);
            }
            if (keys.number(row, 2) == 0) {
                m_show("the database", "its index of keys does not agree with their names");
            }
            const std::size_t slot = overviewKey(name);
            if (block != nullptr && slot != overviewKeys.size()) {
                const Elements unreadable;
                block->replace(slotOffset(id, slot), slotBytes,
                               slotOf(elements == nullptr ? &unreadable : elements.get()));
            }
        }
    }

    void verifyOverview(Blocks& expected) {
        const Result rows = m_connection.run(blocks);
        for (int row = 0; row < rows.rows(); ++row) {
            const std::int64_t number = rows.number(row, 0);
            const auto known = expected.find(number);
            if (rows.bytes(row, 1) !=
                (known == expected.end() ? std::string(blockBytes, '\0') : known->second)) {
                showOverview(number, m_show);
            }
            expected.erase(number);
        }
        for (const auto& [number, block] : expected) {
            showOverview(number, m_show);
        }
    }

    void verifyContents() {
        std::int64_t last = 0;
        for (int rows = 1; rows != 0;) {
            const Result contents = m_connection.run(someContents, last);
            rows = contents.rows();
            for (int row = 0; row < rows; ++row) {
                last = contents.number(row, 0);
                const bool isOurs = !contents.isNull(row, 4);
                const std::string where =
                    isOurs ? "/" + contents.text(row, 4) : "content " + std::to_string(last);
                if (!isOurs) {
                    m_show(where, "belongs to no file");
                }
                if (contents.number(row, 1) != contents.number(row, 2) ||
                    contents.number(row, 3) == 0) {
                    m_show(where, "a part of its content is missing");
                }
                m_found.bytes += static_cast<std::uint64_t>(contents.number(row, 1));
            }
        }
    }

    void verifyPaths() {
        const Result paths = m_connection.run(allPaths);
        std::set<std::string_view> folders;
        std::map<std::string_view, int> files; // And the highest version that each ever had.
        for (int row = 0; row < paths.rows(); ++row) {
            if (paths.number(row, 1) != 0) {
                folders.insert(paths.bytes(row, 0));
            } else {
                files.emplace(paths.bytes(row, 0), static_cast<int>(paths.number(row, 2)));
            }
        }
        for (const auto& [path, highest] : files) {
            const std::size_t slash = path.rfind('/');
            if (slash != path.npos && !folders.contains(path.substr(0, slash))) {
                m_show("/" + std::string(path), "is in no folder");
            }
        }
        m_found.files = std::ssize(files);
        const Result versions = m_connection.run(versionsOfAll);
        m_found.versions = versions.rows();
        std::vector<FileVersion> ofOne;
        for (int row = 0; row < versions.rows(); ++row) {
            const std::string_view path = versions.bytes(row, 0);
            ofOne.push_back({static_cast<int>(versions.number(row, 1)), 0, 0});
            if (row + 1 < versions.rows() && versions.bytes(row + 1, 0) == path) {
                continue;
            }
            const auto file = files.find(path);
            const std::string fault =
                file == files.end() ? "has versions, but no file" : gapIn(ofOne, file->second);
            if (!fault.empty()) {
                m_show("/" + std::string(path), fault);
            }
            ofOne.clear();
        }
    }

    Connection& m_connection;
    const StoreEngine::ShowFault& m_show;
    Verified m_found;
};

} // namespace

Verified verifyStore(Connection& connection, const StoreEngine::ShowFault& show) {
    return Verification(connection, show).run();
}

} // namespace store::postgres
