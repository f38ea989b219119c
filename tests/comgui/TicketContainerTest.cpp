#include "comgui/TicketContainer.h"

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

#include "TicketText.h"
#include "comgui/MemoryKeep.h"

using namespace ticket;
using support::RecordTable;
using support::resultText;
using support::ticketText;

namespace {

/// Counts what is asked of the place that the tickets are kept in.
class CountingKeep : public store::MemoryKeep {
  public:
    int keyReads = 0;

    std::shared_ptr<const store::Elements> key(int type, int id, std::string_view key) override {
        ++keyReads;
        return MemoryKeep::key(type, id, key);
    }
};

class TicketContainer : public testing::Test {
  protected:
    bool operate(int type, int id, TICKET_OP op, void* argument = nullptr) {
        return bit0(container::TicketOperation::call(access, type, id, op, argument));
    }
    bool exists(int type, int id) { return operate(type, id, MTICKET_OP_EXISTS); }
    const STICKET_ACCESS* open(int type, int id) {
        const STICKET_ACCESS* ticket = nullptr;
        return operate(type, id, MTICKET_OP_OPEN, &ticket) ? ticket : nullptr;
    }
    int create(int type, int id = TICKET_ID_NEW) {
        int created = -1;
        return operate(type, id, MTICKET_OP_CREATE_NEXT, &created) ? created : -1;
    }
    const STICKET_ACCESS* createWithKeys(int type, int id, const char* const* keys = nullptr) {
        return container::CreateWithKeys::call(access, type, id, keys);
    }
    std::string send(int type, int id, const std::string& records) {
        RecordTable table(records);
        table.records()->result = 1;
        const bool taken =
            bit0(container::SetMultiParameter::call(access, type, id, table.records()));
        return (taken ? "taken " : "refused ") + resultText(table.records());
    }
    int readInt(const MTICKET_ACCESS& from, int type, int id, const char* key, int position) {
        int value = -1;
        container::GetParameter::call(from, type, id, key, PARAM_INT, static_cast<void*>(&value),
                                      position);
        return value;
    }
    std::vector<int> walked(int type, bool deleteNext = false) {
        struct Context {
            TicketContainer* test;
            bool deleteNext;
            std::vector<int> ids;
        } context{this, deleteNext, {}};
        const TicketWalk show = [](void* to, int type, int id, const STICKET_ACCESS* ticket) {
            auto& context = *static_cast<Context*>(to);
            context.ids.push_back(ticket == context.test->open(type, id) ? id : -1);
            if (context.deleteNext) {
                context.test->operate(type, id + 1, MTICKET_OP_DELETE);
            }
            return context.ids.size() < 3;
        };
        container::WalkTickets::call(access, show, static_cast<void*>(&context), type);
        return context.ids;
    }

    std::shared_ptr<CountingKeep> keep = std::make_shared<CountingKeep>();
    store::TicketContainer session{keep};
    const MTICKET_ACCESS& access = *session.access();
};

} // namespace

TEST_F(TicketContainer, TicketsComeAndGo) {
    EXPECT_EQ(open(3, 1), nullptr);
    EXPECT_EQ(create(3), 1);
    EXPECT_EQ(create(3, TICKET_ID_NEW_PLAIN), 2);
    EXPECT_NE(createWithKeys(3, 40), nullptr);
    EXPECT_EQ(create(3), 41);
    EXPECT_TRUE(operate(3, 41, MTICKET_OP_DELETE));
    EXPECT_FALSE(operate(3, 41, MTICKET_OP_DELETE));
    EXPECT_EQ(create(3), 42) << "an id that was there once comes back";
    EXPECT_EQ(create(4), 1) << "types count by themselves";
    EXPECT_EQ(walked(3), (std::vector<int>{1, 2, 40}));
    EXPECT_EQ(walked(3, true), (std::vector<int>{1, 40, 42}));

    const auto* ticket = open(3, 42);
    EXPECT_EQ(send(3, 42, "a=1"), "taken 1");
    EXPECT_EQ(ticketText(ticket), "a[0]=1");
    EXPECT_EQ(open(3, 42), ticket);
    STICKET_OPTION_WHOAMI who;
    EXPECT_TRUE(bit0(single::Option::call(*ticket, 11, static_cast<void*>(&who))));
    EXPECT_EQ(who.number1, 3);
    EXPECT_EQ(who.number2, 42);
    bool flag = true;
    EXPECT_TRUE(operate(3, 42, MTICKET_OP_DELETE, &flag));
    EXPECT_EQ(ticketText(ticket), "");

    // The numbers run out: gaps are filled.
    EXPECT_NE(createWithKeys(5, 0xFFFFFF), nullptr);
    EXPECT_EQ(create(5), 1);
}

TEST_F(TicketContainer, BadAddressesAreRefused) {
    create(3);
    for (const auto& [type, id] : {std::pair(-1, 1),
                                   {50, 1},
                                   {1000, 1},
                                   {3, -1},
                                   {3, 16777216},
                                   {3, TICKET_ID_NEW},
                                   {3, 2}}) {
        EXPECT_FALSE(exists(type, id)) << type << "," << id;
        EXPECT_EQ(open(type, id), nullptr);
        EXPECT_EQ(send(type, id, "a=1 b=2"), "refused 00") << type << "," << id;
        EXPECT_FALSE(operate(type, id, MTICKET_OP_DELETE));
        EXPECT_FALSE(operate(type, id, STICKET_OP_PARTIAL));
        EXPECT_EQ(readInt(access, type, id, "a", -1), -1);
    }
    EXPECT_EQ(create(50), -1);
    EXPECT_EQ(create(3, 5), -1);
    EXPECT_EQ(createWithKeys(3, -4), nullptr);
    EXPECT_FALSE(operate(3, 1, MTICKET_OP_OPEN));
    EXPECT_FALSE(operate(3, TICKET_ID_NEW, MTICKET_OP_CREATE_NEXT));
    EXPECT_FALSE(operate(3, 1, static_cast<MTICKET_OP>(99)));
    EXPECT_FALSE(bit0(container::WalkTickets::call(access, nullptr, nullptr, 3)));
    EXPECT_TRUE(walked(50).empty());
    EXPECT_EQ(keep->ids(3), (std::vector<int>{1}));

    const MTICKET_ACCESS stranger = access; // The words with a handle that is nobody's.
    MTICKET_ACCESS lost = stranger;
    lost.words[handleWord] = reinterpret_cast<std::uint64_t>(&stranger);
    EXPECT_EQ(readInt(lost, 3, 1, "a", -1), -1);
    EXPECT_EQ(container::CreateWithKeys::call(lost, 3, 7, nullptr), nullptr);
}

TEST_F(TicketContainer, ReadsSeeOthersAndArraysAreWhole) {
    create(3);
    send(3, 1, "v=1,2,3 w=4,5");
    store::TicketContainer other(keep);
    const auto otherSends = [&](const std::string& records) {
        RecordTable table(records);
        container::SetMultiParameter::call(*other.access(), 3, 1, table.records());
    };
    EXPECT_EQ(readInt(access, 3, 1, "v", 0), 1);
    otherSends("v=10,20,30");
    EXPECT_EQ(readInt(access, 3, 1, "v", 1), 2) << "of the array that element 0 began";
    EXPECT_EQ(readInt(access, 3, 1, "v", 0), 10);
    EXPECT_EQ(readInt(access, 3, 1, "v", 2), 30);
    otherSends("v[2]=31");
    EXPECT_EQ(readInt(access, 3, 1, "w", 1), 5);
    EXPECT_EQ(readInt(access, 3, 1, "v", 2), 31) << "the first read of another key";
    send(3, 1, "v[1]=21");
    EXPECT_EQ(readInt(access, 3, 1, "v", 1), 21) << "what this session wrote";

    keep->keyReads = 0;
    std::vector<int> values(3);
    GETMULTIPAR table[4];
    for (int i = 0; i < 3; ++i) {
        table[i] = {.key = "v",
                    .type = PARAM_INT,
                    .value = &values[static_cast<std::size_t>(i)],
                    .position = i};
    }
    container::GetMultiParameter::call(access, 3, 1, table);
    EXPECT_EQ(values, (std::vector<int>{10, 21, 31}));
    EXPECT_EQ(keep->keyReads, 1);
}

TEST_F(TicketContainer, PointersOfAWalkStayGoodUntilTheTicketChanges) {
    create(3);
    send(3, 1, "a='x,2.5 b=7");
    struct Seen {
        std::vector<SETMULTIPAR> records;
    } seen;
    const SCollect collect = [](void* context, const char* key, PARAM_TYPE type, const void* value,
                                int position) {
        static_cast<Seen*>(context)->records.push_back(
            {.key = key, .type = type, .value = value, .position = position});
        return true;
    };
    const auto* ticket = open(3, 1);
    single::Walk::call(*ticket, collect, static_cast<void*>(&seen), "", 8000);
    store::TicketContainer other(keep);
    RecordTable change("a=1");
    container::SetMultiParameter::call(*other.access(), 3, 1, change.records());
    seen.records.emplace_back();
    EXPECT_EQ(support::tableText(seen.records.data()), "a[0]='x a[1]=2.5 b[0]=7");
    // Sent back to the ticket that they point into.
    EXPECT_TRUE(bit0(single::SetMultiParameter::call(*ticket, seen.records.data())));
    EXPECT_EQ(ticketText(ticket), "a[0]='x a[1]=2.5 b[0]=7");
}

TEST_F(TicketContainer, RemembersNotificationsAndPartialKeys) {
    const char* keys[] = {"Job/Status", "Print/*", nullptr};
    const auto notify = [&](int type, int id, int number, int enable) {
        return bit0(container::Notification::call(
            access, type, id, number, enable,
            static_cast<const char* const*>(enable == 1 ? keys : nullptr)));
    };
    EXPECT_TRUE(notify(3, TICKET_ID_ALL, 5, 0));
    EXPECT_TRUE(notify(3, TICKET_ID_NEW, 5, 1));
    EXPECT_TRUE(notify(3, 17, 5, 1));
    EXPECT_TRUE(notify(3, 17, 6, 1));
    EXPECT_FALSE(notify(50, 17, 6, 1));
    EXPECT_FALSE(notify(3, -6, 6, 1));
    EXPECT_EQ(session.notifications().size(), 3u);
    EXPECT_TRUE(notify(3, TICKET_ID_ALL, 5, 0));
    const std::vector<std::string> listed = {"Job/Status", "Print/*"};
    EXPECT_EQ(session.notifications(),
              (std::vector<store::TicketContainer::Notification>{{3, 17, 6, listed}}));

    createWithKeys(3, 9, keys);
    EXPECT_EQ(session.partial(3, 9), listed);
    EXPECT_TRUE(operate(3, 9, STICKET_OP_PARTIAL));
    EXPECT_TRUE(session.partial(3, 9).empty());
}
