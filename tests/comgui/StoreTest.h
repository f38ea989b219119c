// A store of a test's own, and processes that work on it.
#pragma once

#include <cstdio>
#include <functional>
#include <memory>
#include <optional>
#include <sstream>
#include <string>

#include <sys/wait.h>
#include <unistd.h>

#include <gtest/gtest.h>

#include "RunProgram.h"
#include "ScratchFolder.h"
#include "TicketText.h"
#include "comgui/StoreEngine.h"
#include "comgui/StoreKeep.h"

/// Starts work in a process of its own, which ends with what work returns; 99 after an exception.
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

class StoreTest : public testing::Test {
  protected:
    StoreTest() { store::makeStore(address, "Press room"); }

    std::unique_ptr<store::StoreEngine> open() const { return store::openStore(address); }

    /// Sends a table as a session would; what became of it and of its records.
    static std::string send(store::StoreEngine& engine, int type, int id,
                            const std::string& records) {
        // The keep is gone before the engine is.
        store::StoreKeep keep(std::shared_ptr<store::StoreEngine>(&engine, [](auto*) {}));
        RecordTable table(records);
        const bool taken = keep.apply(type, id, table.records());
        return (taken ? "taken " : "refused ") + support::resultText(table.records());
    }

    /// All keys of a ticket, or "none".
    static std::string ticket(store::StoreEngine& engine, int type, int id) {
        const auto content = engine.content(type, id, store::KeyFilter());
        if (content == nullptr) {
            return "none";
        }
        std::string text;
        content->walk(
            [](void* to, const char* key, PARAM_TYPE ptype, const void* value, int position) {
                auto& text = *static_cast<std::string*>(to);
                text +=
                    (text.empty() ? "" : " ") + support::recordText(key, ptype, value, position);
                return true;
            },
            &text);
        return text;
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

    /// The fault that work ends with; nothing where it does not fail.
    static std::optional<store::Fault> faultOf(const std::function<void()>& work) {
        try {
            work();
        } catch (const store::StoreFailure& failure) {
            return failure.fault;
        }
        return std::nullopt;
    }

    using RecordTable = support::RecordTable;

    const support::ScratchFolder folder;
    const std::string address = folder.path("store");
};
