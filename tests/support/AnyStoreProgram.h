// SPDX-License-Identifier: Apache-2.0
// The administration tool, run on a store of a test's own on either engine.
#pragma once

#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <nlohmann/json.hpp>

#include "StoreTest.h"

class AnyStoreProgram : public StoreTest {
  protected:
    explicit AnyStoreProgram(Engine kind = GetParam()) : StoreTest(kind) {}

    support::Outcome run(std::vector<std::string> arguments,
                         support::RunOptions options = {}) const {
        options.environment.insert({"TINTGATE_STORE", address});
        arguments.insert(arguments.begin(), TINTGATE_STORE_PROGRAM);
        return support::run(arguments, options);
    }
    /// Standard output of a run that must succeed.
    std::string answer(const std::vector<std::string>& arguments) const {
        const support::Outcome outcome = run(arguments);
        EXPECT_EQ(outcome.exitCode, 0) << testing::PrintToString(arguments) << outcome.error;
        return outcome.output;
    }
    nlohmann::json jsonOf(std::vector<std::string> arguments) const {
        arguments.insert(arguments.begin(), "--json");
        return nlohmann::json::parse(answer(arguments));
    }
    void expectRefusal(const std::vector<std::string>& arguments, int exitCode,
                       const std::string& words = "") const {
        const support::Outcome outcome = run(arguments);
        EXPECT_EQ(outcome.exitCode, exitCode) << testing::PrintToString(arguments);
        EXPECT_THAT(outcome.error, testing::HasSubstr(words)) << testing::PrintToString(arguments);
    }

    static void makeJob(store::StoreEngine& engine, int id, const std::string& keys) {
        engine.change(3, id, store::Scope{.everything = true, .make = true},
                      [&](store::TicketContent& content) {
                          content.apply(support::RecordTable(keys).records());
                      });
    }

    /// All that a store holds but its users: tickets, files and versions with their numbers.
    static std::string allOf(store::StoreEngine& engine) {
        std::ostringstream text;
        for (int type = 0; type < 50; ++type) {
            for (const int id : engine.ids(type)) {
                text << type << '/' << id << ' ' << ticket(engine, type, id) << '\n';
            }
        }
        for (const auto& entry : engine.files()) {
            text << entry.path << ' ' << entry.time << ' ' << file(engine, entry.path) << '\n';
            for (const auto& version : engine.versions(entry.path)) {
                text << version.number << ' ' << version.time << ' ';
                engine.getVersion(entry.path, version.number, text);
                text << '\n';
            }
        }
        return text.str();
    }
};
