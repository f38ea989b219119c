// SPDX-License-Identifier: Apache-2.0
// A store on a PostgreSQL server through the real bundle and the manager, against statements sent
// directly with libpq. scripts/with-postgres.sh runs it with a private server.
#include <memory>
#include <string>

#include <endian.h>
#include <libpq-fe.h>

#include "Postgres.h"
#include "Shared-Components/Tintgate/NerovaKZComm/CKZConnector.h"
#include "Shared-Components/Tintgate/NerovaKZComm/ComGUIManager.h"
#include "StoreBench.h"
#include "SuiteRoot.h"
#include "store/StoreEngine.h"
#include "store/Users.h"

namespace {

using bench::check;
using Result = std::unique_ptr<PGresult, void (*)(PGresult*)>;

/// Executes a prepared statement with binary values.
Result execute(PGconn* connection, const char* name, const std::vector<std::string_view>& values) {
    std::vector<const char*> pointers;
    std::vector<int> lengths;
    for (const auto value : values) {
        pointers.push_back(value.data());
        lengths.push_back(static_cast<int>(value.size()));
    }
    const std::vector<int> binary(values.size(), 1);
    Result result(PQexecPrepared(connection, name, static_cast<int>(values.size()), pointers.data(),
                                 lengths.data(), binary.data(), 1),
                  PQclear);
    const ExecStatusType status = PQresultStatus(result.get());
    check(status == PGRES_TUPLES_OK || status == PGRES_COMMAND_OK, PQerrorMessage(connection));
    return result;
}

void prepare(PGconn* connection, const char* name, const char* text) {
    PQclear(PQprepare(connection, name, text, 0, nullptr));
}

int bigEndian(const char* number) {
    std::uint32_t bytes = 0;
    std::memcpy(&bytes, number, sizeof bytes);
    return static_cast<int>(be32toh(bytes));
}

std::string_view bytesOf(const std::vector<double>& values, std::size_t count) {
    return {reinterpret_cast<const char*>(values.data()), count * sizeof(double)};
}

/// The keys of a measurement of 1,617 patches with spectra: first arrays of numbers, then single
/// numbers.
struct Key {
    std::string name;
    int count;
};

std::vector<Key> measurementKeys() {
    const std::string base = "Remote/Measurement/";
    constexpr int patches = bench::elements / 36;
    std::vector<Key> keys;
    for (const char* name :
         {"XYZValues/XValues", "XYZValues/YValues", "XYZValues/ZValues", "LabValues/LValues",
          "LabValues/AValues", "LabValues/BValues", "CMYKValues/CValues", "CMYKValues/MValues",
          "CMYKValues/YValues", "CMYKValues/KValues"}) {
        keys.push_back({base + name, patches});
    }
    keys.push_back({base + "SpectralValues/DValues", bench::elements});
    for (const char* name :
         {"Numpatches", "Status", "Approval", "Illumination/Mode", "SpectralValues/Base",
          "SpectralValues/Length", "SpectralValues/Stepsize"}) {
        keys.push_back({base + name, 1});
    }
    return keys;
}

} // namespace

int main() {
    bench::keepFreedMemory();
    const support::PostgresRoom room;
    const support::SuiteRoot root;
    root.installPlistReader(PLIST_READER);
    root.installCommBundle(COMGUI_BUNDLE);
    store::makeStore("room", "Bench");
    store::openStore("room")->putUser({"bench", store::passwordHash("bench"), false});
    // Also commits in between, so that neither side can reuse what it has fetched.
    const support::BarePostgres somebody("room");
    somebody.run("INSERT INTO tintgate.tickets (type, id) SELECT 3, generate_series(1, " +
                 std::to_string(bench::jobs) + ")");
    std::string list;
    for (const std::string key : bench::overviewKeys) {
        // Version 1, one int: 208 throughout for the status, and some small number elsewhere.
        somebody.run("INSERT INTO tintgate.keys (ticket, name, value, change) SELECT number, '" +
                     key + "', '\\x010201000000' || set_byte('\\x00000000', 0, " +
                     (key == "Job/Display/Status" ? "208" : "id * 7919 % 100") +
                     "), 0 FROM tintgate.tickets WHERE type = 3");
        list += (list.empty() ? "'" : ", '") + key + "'";
    }
    somebody.run("DROP TABLE tintgate.job_blocks; ALTER TABLE tintgate.files DROP last_version;"
                 "UPDATE tintgate.store SET format = 2");
    check(store::bringStoreUpToDate("room"), "making the overview of jobs");
    somebody.run("CREATE TABLE bench (id int PRIMARY KEY, name bytea, value bytea);"
                 "ALTER TABLE bench ALTER value SET STORAGE EXTERNAL");
    somebody.run("ANALYZE");

    // A new connection, like the store's: earlier work of a server process affects its memory.
    const support::BarePostgres bare("room");
    PGconn* const connection = bare.get();
    CKZConnector connector(L"room", L"bench", L"bench", 0x5071103, false, false);
    check(connector.IsLoggedIn(), "the login");
    ComGUIManager& manager = *connector.getComGUIMngrInstance();
    const std::vector<double> values = bench::measuredValues(bench::elements);
    const auto touch = [&] {
        somebody.run("UPDATE tintgate.tickets SET changes = changes + 1 WHERE type = 3 AND id = 5");
    };

    prepare(connection, "list",
            ("SELECT id, name, value FROM tintgate.tickets JOIN tintgate.keys ON ticket = number"
             " WHERE type = 3 AND name IN (" +
             list + ")")
                .c_str());
    bench::compare(
        "the verifier's jobs among 10,000", 1.5, 25, touch,
        [&] {
            int* ids = nullptr;
            int count = 0;
            check(connector.GetVerifierJobTicketIDs(&ids, &count, false) == 0 &&
                      count == bench::jobs,
                  "listing the jobs");
            std::free(ids);
        },
        [&] {
            const Result rows = execute(connection, "list", {});
            check(PQntuples(rows.get()) == 5 * bench::jobs, "the bare select");
            long long sum = 0;
            for (int row = 0; row < PQntuples(rows.get()); ++row) {
                sum += bigEndian(PQgetvalue(rows.get(), row, 0)) + *PQgetvalue(rows.get(), row, 1) +
                       PQgetvalue(rows.get(), row, 2)[6];
            }
            bench::g_sink = static_cast<double>(sum);
        });

    prepare(connection, "put", "INSERT INTO bench (id, name, value) VALUES (1, $1, $2)");
    execute(connection, "put", {bench::arrayKey, bytesOf(values, values.size())});
    prepare(connection, "get", "SELECT value FROM bench WHERE id = 1");
    auto* const doubles = const_cast<double*>(values.data());
    check(manager.SetMultiParameter(1, 3, PARAM_DOUBLE, bench::arrayKey, bench::elements, doubles),
          "writing the array");
    bench::compare(
        "reading 58,212 doubles one by one", 3, 41, touch,
        [&] {
            const wxArrayDouble array =
                manager.GetDoubleArray(3, 1, const_cast<char*>(bench::arrayKey));
            check(array.GetCount() == values.size() && array[values.size() - 1] == values.back(),
                  "reading the array");
        },
        [&] {
            const Result row = execute(connection, "get", {});
            std::vector<double> copy(values.size());
            std::memcpy(copy.data(), PQgetvalue(row.get(), 0, 0), copy.size() * sizeof(double));
            bench::readBare(copy);
        });

    // As in a write-back: one table per key.
    const std::vector<Key> keys = measurementKeys();
    prepare(connection, "lock",
            "UPDATE tintgate.tickets SET changes = changes + 1"
            " WHERE type = 3 AND id = 2 RETURNING number");
    prepare(connection, "write",
            "INSERT INTO tintgate.keys (ticket, name, value, change) SELECT number, $1, $2, changes"
            " FROM tintgate.tickets WHERE type = 3 AND id = 2"
            " ON CONFLICT (ticket, hash) DO UPDATE SET value = excluded.value");
    bench::compare(
        "writing a measurement of 18 keys", 2, 25, touch,
        [&] {
            for (const Key& key : keys) {
                const bool done =
                    key.count == 1 ? connector.SetJobTicketKeyValue(3, 1, key.name.c_str(),
                                                                    PARAM_INT, doubles, -1) == 0
                                   : connector.SetJobArrayParameter(
                                         3, 1, key.name.c_str(), PARAM_DOUBLE, key.count, doubles);
                check(done, "writing a key");
            }
        },
        [&] {
            for (const Key& key : keys) {
                PQclear(PQexec(connection, "BEGIN"));
                execute(connection, "lock", {});
                execute(connection, "write",
                        {key.name, bytesOf(values, static_cast<std::size_t>(key.count))});
                PQclear(PQexec(connection, "COMMIT"));
            }
        });
}
