// SPDX-License-Identifier: Apache-2.0
// The store through the real bundle and the manager, against bare SQLite and bare loops.
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <memory>
#include <set>
#include <string>
#include <vector>

#include <sqlite3.h>

#include "ScratchFolder.h"
#include "Shared-Components/Tintgate/NerovaKZComm/CKZConnector.h"
#include "Shared-Components/Tintgate/NerovaKZComm/ComGUIManager.h"
#include "StoreBench.h"
#include "SuiteRoot.h"
#include "base/WideBytes.h"
#include "store/CachingStorage.h"
#include "store/StoreEngine.h"
#include "store/Users.h"
#include "ticket/ParameterList.h"
#include "ticket/TicketUpdateList.h"

namespace {

using namespace bench;

class BareDatabase {
  public:
    explicit BareDatabase(const std::string& path) {
        check(sqlite3_open(path.c_str(), &m_database) == SQLITE_OK, "opening");
        run("PRAGMA synchronous = FULL");
    }
    ~BareDatabase() { sqlite3_close(m_database); }
    BareDatabase(const BareDatabase&) = delete;
    BareDatabase& operator=(const BareDatabase&) = delete;

    void run(const char* statements) {
        check(sqlite3_exec(m_database, statements, nullptr, nullptr, nullptr) == SQLITE_OK,
              sqlite3_errmsg(m_database));
    }
    sqlite3_stmt* prepare(const char* text) {
        sqlite3_stmt* statement = nullptr;
        check(sqlite3_prepare_v2(m_database, text, -1, &statement, nullptr) == SQLITE_OK, text);
        return statement;
    }

  private:
    sqlite3* m_database = nullptr;
};

/// Adds `count` keys of three elements to ticket 2 and returns their names.
std::vector<std::string> makeArrays(ComGUIManager& manager, int count) {
    std::vector<std::string> names;
    SETMULTIPAR_LIST list(true);
    const int numbers[] = {1, 2, 3};
    for (int i = 0; i < count; ++i) {
        names.push_back("Array/" + std::to_string(i));
        list.DelParameter(names.back().c_str(), POSITION_WHOLE);
        list.xSetNumbers(names.back().c_str(), PARAM_INT, numbers, 3);
    }
    check(manager.GetClientContainer()->SetMultiParameter(3, 2, list.Table(false)),
          "making arrays");
    return names;
}

} // namespace

int main() {
    const support::ScratchFolder folder;
    const support::SuiteRoot root;
    root.installPlistReader(PLIST_READER);
    root.writePreferences("Qen/com.qen.packageversion.plist",
                          {{"Nerova Hue Workbench/library_path", root.path("suite")}});
    std::filesystem::create_directories(root.path("suite/lib"));
    std::filesystem::create_directory_symlink(COMGUI_BUNDLE, root.path("suite/lib/ComGUI.Bundle"));

    const std::string address = folder.path("store");
    store::makeStore(address, "Bench");
    {
        const std::shared_ptr<store::StoreEngine> engine = store::openStore(address);
        engine->putUser({"bench", store::passwordHash("bench"), false});
        store::CachingStorage keep(engine);
        // Does not wait for the disk; the log is written at the end.
        BareDatabase bare(address + "/tickets.db");
        bare.run("BEGIN");
        std::string sql;
        for (int id = 1; id <= jobs; ++id) {
            const std::string text = std::to_string(id);
            sql += "INSERT INTO tickets (type, id) VALUES (3, " + text + ");";
        }
        bare.run(sql.c_str());
        for (const char* key : overviewKeys) {
            // Version 1, one int: 208 throughout for the status, and some small number elsewhere.
            const bool status = std::strcmp(key, "Job/Display/Status") == 0;
            bare.run(("INSERT INTO keys SELECT number, CAST('" + std::string(key) +
                      "' AS BLOB), CAST(x'010201000000' || " +
                      (status ? "x'd0'" : "CAST(char(id * 7919 % 100) AS BLOB)") +
                      " || x'000000' AS BLOB) FROM tickets WHERE type = 3")
                         .c_str());
        }
        bare.run("DROP TABLE job_blocks; PRAGMA user_version = 1; COMMIT");
    }
    check(store::bringStoreUpToDate(address), "making the overview of jobs");

    CKZConnector connector(base::wideFromBytes(address), L"bench", L"bench", 0x5071103, false,
                           false);
    check(connector.IsLoggedIn(), "the login");
    ComGUIManager& manager = *connector.getComGUIMngrInstance();

    std::vector<double> values = measuredValues(elements);
    BareDatabase bare(address + "/tickets.db");
    bare.run("CREATE TABLE bench (id INTEGER PRIMARY KEY, value BLOB)");
    bare.run("INSERT INTO bench VALUES (1, x'00')");
    const int bytes = elements * static_cast<int>(sizeof(double));
    // Another connection commits, so that neither side can reuse what it has fetched.
    BareDatabase somebody(address + "/tickets.db");
    const auto touch = [&] {
        somebody.run("UPDATE tickets SET changes = changes + 1 WHERE id = 5");
    };
    sqlite3_stmt* const write = bare.prepare("UPDATE bench SET value = ? WHERE id = 1");
    compare(
        "writing 58,212 doubles as one table", 3, 15, touch,
        [&] {
            check(manager.SetMultiParameter(1, 3, PARAM_DOUBLE, arrayKey, elements, values.data()),
                  "writing the array");
        },
        [&] {
            bare.run("BEGIN IMMEDIATE");
            sqlite3_bind_blob(write, 1, values.data(), bytes, SQLITE_STATIC);
            check(sqlite3_step(write) == SQLITE_DONE, "the bare write");
            sqlite3_reset(write);
            bare.run("COMMIT");
            std::set<double> set;
            for (const double value : values) {
                set.insert(value);
            }
            g_sink = *set.begin();
        });

    sqlite3_stmt* const read = bare.prepare("SELECT value FROM bench WHERE id = 1");
    compare(
        "reading them one by one", 3, 41, touch,
        [&] {
            const wxArrayDouble array = manager.GetDoubleArray(3, 1, arrayKey);
            check(array.GetCount() == elements && array[elements - 1] == values.back(),
                  "reading the array");
        },
        [&] {
            std::vector<double> copy(elements);
            check(sqlite3_step(read) == SQLITE_ROW, "the bare read");
            std::memcpy(copy.data(), sqlite3_column_blob(read, 0), static_cast<std::size_t>(bytes));
            sqlite3_reset(read);
            readBare(copy);
        });

    std::string list;
    for (const char* key : overviewKeys) {
        list += std::string(list.empty() ? "" : ", ") + "CAST('" + key + "' AS BLOB)";
    }
    sqlite3_stmt* const select =
        bare.prepare(("SELECT t.id, k.name, k.value FROM tickets t JOIN keys k"
                      " ON k.ticket = t.number WHERE t.type = 3 AND k.name IN (" +
                      list + ")")
                         .c_str());
    compare(
        "the verifier's jobs among 10,000", 2, 15, touch,
        [&] {
            int* ids = nullptr;
            int count = 0;
            check(connector.GetVerifierJobTicketIDs(&ids, &count, false) == 0 && count == jobs,
                  "listing the jobs");
            std::free(ids);
        },
        [&] {
            std::size_t rows = 0;
            while (sqlite3_step(select) == SQLITE_ROW) {
                rows += static_cast<std::size_t>(sqlite3_column_bytes(select, 2)) == 10;
            }
            sqlite3_reset(select);
            check(rows == 5 * jobs, "the bare select");
        });

    // The first edit of a key's element fetches the key. Its cost must not grow with the number of
    // the ticket's keys.
    sqlite3_stmt* const readKey =
        bare.prepare("SELECT k.value FROM tickets t JOIN keys k ON k.ticket = t.number"
                     " WHERE t.type = 3 AND t.id = 2 AND k.name = ?");
    for (const int keys : {5'000, 20'000}) {
        const std::vector<std::string> names = makeArrays(*connector.getComGUIMngrInstance(), keys);
        compare((std::to_string(keys) + " edits of one element each").c_str(), 5, 7, touch,
                [&] {
                    TICKET_UPDATE_LIST list(manager.GetClientContainer());
                    const int value = 7;
                    for (const auto& name : names) {
                        check(list.xSetParameter(3, 2, name.c_str(), PARAM_INT, &value, 1, false),
                              "editing an element");
                    }
                },
                [&] {
                    for (const auto& name : names) {
                        sqlite3_bind_blob(readKey, 1, name.data(), static_cast<int>(name.size()),
                                          SQLITE_STATIC);
                        check(sqlite3_step(readKey) == SQLITE_ROW, "the bare read of a key");
                        g_sink = sqlite3_column_bytes(readKey, 0);
                        sqlite3_reset(readKey);
                    }
                });
    }
    for (sqlite3_stmt* const statement : {write, read, select, readKey}) {
        sqlite3_finalize(statement);
    }
}
