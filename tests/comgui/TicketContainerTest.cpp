#include "comgui/TicketContainer.h"

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

#include "TicketText.h"
#include "comgui/MemoryKeep.h"

using namespace ticket;
using support::RecordTable;
using support::ticketText;

namespace {

class TicketContainer : public testing::Test {
  protected:
    TicketContainer() {
        for (int id = 1; id <= 4; ++id) {
            keep->create(3, id);
        }
    }

    bool operate(int type, int id, TICKET_OP op, void* argument = nullptr) {
        return bit0(container::TicketOperation::call(access, type, id, op, argument));
    }
    static std::string send(const store::TicketContainer& session, int type, int id,
                            const std::string& records) {
        RecordTable table(records);
        table.records()->result = 1;
        const bool taken =
            bit0(container::SetMultiParameter::call(*session.access(), type, id, table.records()));
        return (taken ? "taken " : "refused ") + support::resultText(table.records());
    }
    int readInt(int type, int id, const char* key, int position) {
        int value = -1;
        container::GetParameter::call(access, type, id, key, PARAM_INT, static_cast<void*>(&value),
                                      position);
        return value;
    }

    std::shared_ptr<store::MemoryKeep> keep = std::make_shared<store::MemoryKeep>();
    store::TicketContainer session{keep};
    store::TicketContainer other{keep}; ///< Another session.
    MTICKET_ACCESS access = *session.access();
};

} // namespace

TEST_F(TicketContainer, AnOpenedTicketIsOneRecordForGood) {
    const auto* ticket = session.open(3, 2);
    send(other, 3, 2, "a=1");
    EXPECT_EQ(ticketText(ticket), "a[0]=1");
    EXPECT_EQ(session.open(3, 2), ticket);
    EXPECT_EQ(session.createWithKeys(3, 2, nullptr), ticket);
    EXPECT_TRUE(operate(3, 2, MTICKET_OP_DELETE));
    EXPECT_EQ(ticketText(ticket), "");
    EXPECT_EQ(session.open(3, 2), nullptr);
}

TEST_F(TicketContainer, AWalkPassesOverWhatIsDeletedMeanwhile) {
    struct Context {
        store::TicketContainer& session;
        std::vector<int> ids;
    } context{session, {}};
    const TicketWalk show = [](void* to, int type, int id, const STICKET_ACCESS* ticket) {
        auto& context = *static_cast<Context*>(to);
        context.ids.push_back(ticket == context.session.open(type, id) ? id : -1);
        context.session.remove(type, id + 1);
        return true;
    };
    EXPECT_TRUE(bit0(container::WalkTickets::call(access, show, static_cast<void*>(&context), 3)));
    EXPECT_EQ(context.ids, (std::vector<int>{1, 3}));
}

TEST_F(TicketContainer, BadAddressesAreRefused) {
    for (const auto& [type, id] :
         {std::pair(-1, 1), {50, 1}, {3, -1}, {3, 16777216}, {3, TICKET_ID_NEW}, {3, 5}}) {
        EXPECT_FALSE(operate(type, id, MTICKET_OP_EXISTS)) << type << "," << id;
        EXPECT_EQ(session.open(type, id), nullptr);
        EXPECT_EQ(send(session, type, id, "a=1 b=2"), "refused 00") << type << "," << id;
        EXPECT_FALSE(operate(type, id, MTICKET_OP_DELETE));
        EXPECT_FALSE(operate(type, id, STICKET_OP_PARTIAL));
        EXPECT_EQ(readInt(type, id, "a", -1), -1);
    }
    int made = 0;
    EXPECT_FALSE(operate(50, TICKET_ID_NEW, MTICKET_OP_CREATE_NEXT, &made));
    EXPECT_FALSE(operate(3, 5, MTICKET_OP_CREATE_NEXT, &made));
    EXPECT_FALSE(operate(3, TICKET_ID_NEW, MTICKET_OP_CREATE_NEXT));
    EXPECT_FALSE(operate(3, 1, MTICKET_OP_OPEN));
    EXPECT_FALSE(operate(3, 1, static_cast<MTICKET_OP>(99)));
    EXPECT_FALSE(bit0(container::WalkTickets::call(access, nullptr, nullptr, 3)));
    EXPECT_EQ(session.createWithKeys(3, -4, nullptr), nullptr);
    EXPECT_FALSE(session.notify(3, -6, 6, true, nullptr));
    EXPECT_EQ(keep->ids(3), (std::vector<int>{1, 2, 3, 4}));

    send(session, 3, 1, "a=7");
    access.words[handleWord] = reinterpret_cast<std::uint64_t>(&access); // That is nobody's.
    EXPECT_EQ(readInt(3, 1, "a", -1), -1);
    EXPECT_EQ(container::CreateWithKeys::call(access, 3, 7, nullptr), nullptr);
}

TEST_F(TicketContainer, ReadsSeeOthersAndArraysAreWhole) {
    send(session, 3, 1, "v=1,2,3 w=4,5");
    send(session, 3, 2, "v=8,9");
    EXPECT_EQ(readInt(3, 1, "v", 0), 1);
    send(other, 3, 1, "v=10,20,30");
    EXPECT_EQ(readInt(3, 1, "v", 1), 2) << "of the array that element 0 began";
    EXPECT_EQ(readInt(3, 1, "v", 0), 10);
    EXPECT_EQ(readInt(3, 1, "v", 2), 30);
    EXPECT_EQ(readInt(3, 2, "v", 1), 9) << "of another ticket";
    send(other, 3, 1, "v[2]=31");
    EXPECT_EQ(readInt(3, 1, "w", 1), 5);
    EXPECT_EQ(readInt(3, 1, "v", 2), 31) << "the first read of another key";
    send(session, 3, 1, "v[1]=21");
    EXPECT_EQ(readInt(3, 1, "v", 1), 21) << "what this session wrote";
}

TEST_F(TicketContainer, PointersOfAWalkStayGoodUntilTheTicketChanges) {
    send(session, 3, 1, "a='x,2.5 b=7");
    std::vector<SETMULTIPAR> seen;
    const SCollect collect = [](void* context, const char* key, PARAM_TYPE type, const void* value,
                                int position) {
        static_cast<std::vector<SETMULTIPAR>*>(context)->push_back(
            {.key = key, .type = type, .value = value, .position = position});
        return true;
    };
    const auto* ticket = session.open(3, 1);
    single::Walk::call(*ticket, collect, static_cast<void*>(&seen), "", 8000);
    send(other, 3, 1, "a=1");
    seen.emplace_back();
    // Sent back to the ticket that they point into.
    EXPECT_TRUE(bit0(single::SetMultiParameter::call(*ticket, seen.data())));
    EXPECT_EQ(ticketText(ticket), "a[0]='x a[1]=2.5 b[0]=7");
}
