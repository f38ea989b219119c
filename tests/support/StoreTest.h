// SPDX-License-Identifier: Apache-2.0
// The test's own store, and processes that use it.
#pragma once

#include <cstdio>
#include <cstdlib>
#include <functional>
#include <memory>
#include <optional>
#include <sstream>
#include <string>
#include <vector>

#include <sys/wait.h>
#include <unistd.h>

#include <gtest/gtest.h>

#include "Postgres.h"
#include "RunProgram.h"
#include "ScratchFolder.h"
#include "TicketText.h"
#include "store/CachingStorage.h"
#include "store/StoreEngine.h"
#include "store/sqlite/Sqlite.h"

/// Runs `work` in a new process, whose exit code is its result, or 99 after an exception.
inline pid_t startProcess(const std::function<int()>& work) {
    const pid_t child = fork();
    if (child == 0) {
        int code = 99;
        try {
            code = work();
        } catch (const std::exception& failure) {
            fprintf(stderr, "%s\n", failure.what());
        }
        _exit(code);
    }
    return child;
}

/// The exit code, or 1000 and the signal that ended it.
inline int endOf(pid_t child) {
    int status = 0;
    waitpid(child, &status, 0);
    return WIFEXITED(status) ? WEXITSTATUS(status) : 1000 + WTERMSIG(status);
}

/// TINTGATE_ROUNDS requests more rounds than the usual number.
inline int roundsOr(int usual) {
    const char* const wanted = std::getenv("TINTGATE_ROUNDS");
    return wanted == nullptr ? usual : std::atoi(wanted);
}

/// All content of a ticket, in the notation of TicketText.h.
inline std::string contentText(const store::TicketContent& content) {
    std::vector<SETMULTIPAR> table;
    content.walk(support::collect, &table);
    table.emplace_back();
    return support::tableText(table.data());
}

enum class Engine { Sqlite, Postgres };

/// For test suites that apply to both kinds of store.
#define ON_BOTH_ENGINES(Suite)                                                                     \
    INSTANTIATE_TEST_SUITE_P(                                                                      \
        , Suite, testing::Values(Engine::Sqlite, Engine::Postgres), [](const auto& info) {         \
            return std::string(info.param == Engine::Sqlite ? "Sqlite" : "Postgres");              \
        })

class StoreTest : public testing::TestWithParam<Engine> {
  public:
    /// Sends a table like a session. Returns the results of the table and of its records.
    static std::string send(store::StoreEngine& engine, int type, int id,
                            const std::string& records) {
        // The storage must be destroyed before the engine.
        store::CachingStorage keep(std::shared_ptr<store::StoreEngine>(&engine, [](auto*) {}));
        support::RecordTable table(records);
        const bool taken = keep.apply(type, id, table.records());
        return (taken ? "taken " : "refused ") + support::resultText(table.records());
    }

    /// All keys of a ticket, or "none".
    static std::string ticket(store::StoreEngine& engine, int type, int id) {
        const auto content = engine.content(type, id, store::KeyFilter());
        return content == nullptr ? "none" : contentText(*content);
    }

    static void putFile(store::StoreEngine& engine, const std::string& path,
                        const std::string& text) {
        std::istringstream from(text);
        engine.putFile(path, from);
    }

    static std::string file(store::StoreEngine& engine, const std::string& path) {
        std::ostringstream to;
        engine.getFile(path, to);
        return to.str();
    }

    /// Previous contents of a file, oldest first.
    static std::vector<std::string> versions(store::StoreEngine& engine, const std::string& path) {
        std::vector<std::string> texts;
        for (const auto& version : engine.versions(path)) {
            std::ostringstream to;
            engine.getVersion(path, version.number, to);
            EXPECT_EQ(to.str().size(), version.size);
            texts.push_back(to.str());
        }
        return texts;
    }

    /// The fault of a failed `work`; nothing if it succeeds.
    static std::optional<store::Fault> faultOf(const std::function<void()>& work) {
        try {
            work();
        } catch (const store::StoreFailure& failure) {
            return failure.status;
        }
        return std::nullopt;
    }

  protected:
    explicit StoreTest(Engine kind = GetParam())
        : room(kind == Engine::Postgres ? std::make_unique<support::PostgresRoom>() : nullptr),
          address(room ? "room" : folder.path("store")) {
        store::makeStore(address, "Press room");
    }

    std::unique_ptr<store::StoreEngine> open() const { return store::openStore(address); }

    /// Runs SQL directly: the first text if the store is a folder, otherwise the second.
    void sql(const std::string& sqlite, const std::string& postgres) const {
        if (room) {
            support::BarePostgres("room").run(postgres);
            return;
        }
        store::sqlite::Database(address + "/tickets.db", store::sqlite::Opening::Existing)
            .run(sqlite.c_str());
    }

    void setFormat(int format) const {
        const std::string number = std::to_string(format);
        sql("PRAGMA user_version = " + number, "UPDATE tintgate.store SET format = " + number);
    }

    const support::ScratchFolder folder;
    const std::unique_ptr<support::PostgresRoom> room; ///< Null if the store is a folder.
    const std::string address;
};
