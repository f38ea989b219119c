// SPDX-License-Identifier: Apache-2.0
// Tests of lists and flushes that run in all places for tickets: in memory and in each kind of
// store.
#pragma once

#include <memory>
#include <string>

#include <gtest/gtest.h>

#include "Postgres.h"
#include "RealTickets.h"
#include "ScratchFolder.h"
#include "store/CachingStorage.h"
#include "store/StoreEngine.h"

enum class Place { Memory, Sqlite, Postgres };

/// During its lifetime, each Server created without a place gets an empty one of this kind. They
/// share a store, so only the latest one may be used.
class AnyPlace : public testing::TestWithParam<Place> {
  protected:
    AnyPlace() {
        if (GetParam() != Place::Memory) {
            store::makeStore(m_address, "Press room");
            newKeep = [this] { return emptied(); };
        }
    }
    ~AnyPlace() override { newKeep = memoryKeep; }

    bool inStore() const { return GetParam() != Place::Memory; }

  private:
    std::shared_ptr<store::TicketStorage> emptied() const {
        auto keep = std::make_shared<store::CachingStorage>(store::openStore(m_address));
        for (const int id : keep->ids(jobs)) {
            EXPECT_TRUE(keep->remove(jobs, id));
        }
        return keep;
    }

    const support::ScratchFolder m_folder;
    const std::unique_ptr<support::PostgresRoom> m_room =
        GetParam() == Place::Postgres ? std::make_unique<support::PostgresRoom>() : nullptr;
    const std::string m_address = m_room ? "room" : m_folder.path("store");
};

#define IN_ANY_PLACE(Suite)                                                                        \
    INSTANTIATE_TEST_SUITE_P(, Suite,                                                              \
                             testing::Values(Place::Memory, Place::Sqlite, Place::Postgres),       \
                             [](const auto& info) {                                                \
                                 return std::string(info.param == Place::Memory   ? "Memory"       \
                                                    : info.param == Place::Sqlite ? "Sqlite"       \
                                                                                  : "Postgres");   \
                             })
