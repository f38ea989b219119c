// SPDX-License-Identifier: Apache-2.0
// A job on the test's own store, and a processor that accesses it through the real comm bundle.
#pragma once

#include <charconv>
#include <map>
#include <memory>
#include <optional>
#include <regex>
#include <string>
#include <utility>

#include <gtest/gtest.h>

#include "Shared-Components/Tintgate/NerovaKZComm/CKZConnector.h"
#include "SuiteRoot.h"
#include "TicketText.h"
#include "cli/CLogger.h"
#include "job/KZVerifyJobProcessor.h"
#include "store/CachingStorage.h"
#include "store/StoreEngine.h"
#include "store/Users.h"

class JobOnStore : public testing::Test {
  protected:
    static constexpr int job = 7;

    JobOnStore() {
        root.installPlistReader(PLIST_READER);
        root.installCommBundle(COMGUI_BUNDLE);
        store::makeStore(address, "Press room");
        engine = store::openStore(address);
        engine->putUser({"press", hash, false});
        engine->create(3, job);
        CLogger::InitLogger(logPath()); // The processor then opens no log of its own.
        processor.emplace();
        processor->m_connector = new CKZConnector(std::wstring(address.begin(), address.end()),
                                                  L"press", L"room", 0x5071103, false, false);
        EXPECT_TRUE(processor->m_connector->IsLoggedIn());
    }

    /// Sends a table in the notation of TicketText.h.
    void set(const std::string& records, int id = job) const {
        store::CachingStorage keep(engine);
        support::RecordTable table(records);
        ASSERT_TRUE(keep.apply(3, id, table.records())) << records;
    }

    /// A ticket's keys, each with its elements: 5,6 are ints, 5.0 is a double, 'a a text.
    std::map<std::string, std::string> keys(int id = job) const {
        std::map<std::string, std::string> all;
        const auto content = engine->content(3, id, store::KeyFilter());
        for (const auto& [key, elements] : content->keys()) {
            std::string& text = all[key];
            elements->visit([&](int, const store::Value& value) {
                text += (text.empty() ? "" : ",") + shown(value);
                return true;
            });
        }
        return all;
    }

    /// The log's messages since the previous takeLog.
    std::string takeLog() const {
        CLogger::DeleteLogger();
        const std::string text = std::regex_replace(support::contentsOf(logPath()),
                                                    std::regex("(^|\n)[^\n]*?:\t"), "$1");
        CLogger::InitLogger(logPath());
        return text;
    }

    const support::SuiteRoot root;
    const std::string address = root.path("store");
    std::shared_ptr<store::StoreEngine> engine;
    std::optional<KZVerifyJobProcessor> processor;

  private:
    std::string logPath() const { return root.path("log"); }

    static std::string shown(const store::Value& value) {
        if (const auto* number = std::get_if<double>(&value)) {
            char digits[40];
            const std::string text(digits, std::to_chars(digits, std::end(digits), *number).ptr);
            return text.find_first_of(".en") == std::string::npos ? text + ".0" : text;
        }
        if (const auto* text = std::get_if<store::Text>(&value)) {
            return "'" + text->bytes->text;
        }
        return std::to_string(std::get<int>(value));
    }

    /// Computed once, because hashing is slow by design.
    inline static const std::string hash = store::passwordHash("room");
};
