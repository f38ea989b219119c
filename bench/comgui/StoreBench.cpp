// The store through the real bundle and the manager, against bare SQLite and bare loops.
//
// The two sides of a ratio run by turns, each at its best of several, so that a machine that is
// busy with something else slows both.
#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <functional>
#include <limits>
#include <memory>
#include <random>
#include <set>
#include <string>
#include <vector>

#include <sqlite3.h>

#include "ScratchFolder.h"
#include "Shared-Components/Tintgate/NerovaKZComm/CKZConnector.h"
#include "Shared-Components/Tintgate/NerovaKZComm/ComGUIManager.h"
#include "SuiteRoot.h"
#include "comgui/StoreEngine.h"
#include "comgui/StoreKeep.h"
#include "comgui/Users.h"
#include "platform/WideBytes.h"

namespace {

constexpr int elements = 58'212; // 1,617 patches of 36 spectral samples.
constexpr int jobs = 10'000;
constexpr const char* arrayKey = "Remote/Measurement/Spectral";
constexpr const char* overviewKeys[] = {"Input/SubType", "Job/Display/Status",
                                        "Remote/ShowInVerifier", "Input/FileType",
                                        "Workflow/Verify/Active"};

double secondsOf(const std::function<void()>& work) {
    const auto start = std::chrono::steady_clock::now();
    work();
    return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
}

/// Before is not timed.
void compare(const char* name, double limit, int rounds, const std::function<void()>& before,
             const std::function<void()>& ours, const std::function<void()>& bare) {
    double best = std::numeric_limits<double>::max();
    double bareBest = best;
    for (int round = 0; round < rounds; ++round) {
        before();
        best = std::min(best, secondsOf(ours));
        before();
        bareBest = std::min(bareBest, secondsOf(bare));
    }
    std::printf("%-48s %7.2f ms, %.2f times the bare %.2f ms (at most %.0f)\n", name, best * 1e3,
                best / bareBest, bareBest * 1e3, limit);
}

void check(bool done, const char* what) {
    if (!done) {
        std::fprintf(stderr, "%s failed\n", what);
        std::exit(1);
    }
}

/// Keeps a result from being optimised away.
volatile double g_sink;

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

struct Call {
    const double* values;
    std::size_t count;
};

/// What a slot has to do at the least: tell by type, id and key whether this is the one.
int bareGet(const Call* call, int type, int id, const char* key, int position, double* out) {
    if (type != 3 || id != 1 || std::strcmp(key, arrayKey) != 0 ||
        static_cast<std::size_t>(position) >= call->count) {
        return 0;
    }
    *out = call->values[position];
    return 1;
}

using BareSlot = int (*)(const Call*, int, int, const char*, int, double*);
volatile BareSlot g_slot = bareGet; // Asked for at each call, as a slot of a table is.

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
        store::StoreKeep keep(engine);
        // Made without waiting for the disk: the log is written through at the end.
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
        bare.run("COMMIT");
    }

    CKZConnector connector(platform::wideFromBytes(address), L"bench", L"bench", 0x5071103, false,
                           false);
    check(connector.IsLoggedIn(), "the login");
    ComGUIManager& manager = *connector.getComGUIMngrInstance();

    // Reflectances, as measured: no two alike, in no order.
    std::mt19937 random(3); // NOLINT: the same each time
    std::vector<double> values(elements);
    for (double& value : values) {
        value = std::uniform_real_distribution<double>(0, 1)(random);
    }
    BareDatabase bare(address + "/tickets.db");
    bare.run("CREATE TABLE bench (id INTEGER PRIMARY KEY, value BLOB)");
    bare.run("INSERT INTO bench VALUES (1, x'00')");
    const int bytes = elements * static_cast<int>(sizeof(double));
    // Somebody else commits, so that neither side can use what it fetched before.
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
            const Call call = {copy.data(), copy.size()};
            double sum = 0;
            for (int i = 0; i < elements; ++i) {
                double value = 0;
                g_slot(&call, 3, 1, arrayKey, i, &value);
                sum += value;
            }
            g_sink = sum;
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
    for (sqlite3_stmt* const statement : {write, read, select}) {
        sqlite3_finalize(statement);
    }
}
