// SPDX-License-Identifier: Apache-2.0
#include "store/tickets/TicketContainer.h"

#include "RealTickets.h"

using namespace ticket;

namespace {

class TicketContainer : public testing::Test {
  protected:
    TicketContainer() {
        for (int id = 1; id <= 4; ++id) {
            keep->create(jobs, id);
        }
    }

    bool operate(int type, int id, TICKET_OP op, void* argument = nullptr) {
        return bit0(container::TicketOperation::call(session.record, type, id, op, argument));
    }
    int read(int id, const char* key, int position, int type = jobs) const {
        return session.view().GetIntParameter(type, id, position, key, -1);
    }

    std::shared_ptr<store::MemoryStorage> keep = std::make_shared<store::MemoryStorage>();
    Server session{keep};
    Server other{keep}; ///< Another session.
};

} // namespace

TEST_F(TicketContainer, AnOpenedTicketIsOneRecordForGood) {
    const auto* ticket = session.engine.open(jobs, 2);
    other.send(2, "a='x,2.5 b=7");
    // Values from a walk stay valid until this session changes the ticket.
    auto shown = support::walked(*ticket);
    other.send(2, "a=1");
    EXPECT_TRUE(bit0(single::SetMultiParameter::call(*ticket, shown.data())));
    EXPECT_EQ(session.content(2), "a[0]='x a[1]=2.5 b[0]=7");
    EXPECT_EQ(session.engine.createWithKeys(jobs, 2, nullptr), ticket);
    EXPECT_TRUE(operate(jobs, 2, MTICKET_OP_DELETE));
    EXPECT_EQ(support::ticketText(ticket), "");
    EXPECT_EQ(session.engine.open(jobs, 2), nullptr);
}

TEST_F(TicketContainer, AWalkPassesOverWhatIsDeletedMeanwhile) {
    struct Context {
        store::TicketContainer& session;
        std::vector<int> ids;
    } context{session.engine, {}};
    const TicketWalk show = [](void* to, int type, int id, const STICKET_ACCESS* ticket) {
        auto& context = *static_cast<Context*>(to);
        context.ids.push_back(ticket == context.session.open(type, id) ? id : -1);
        context.session.remove(type, id + 1);
        return true;
    };
    EXPECT_TRUE(session.view().WalkTickets(show, static_cast<void*>(&context), jobs));
    EXPECT_EQ(context.ids, (std::vector<int>{1, 3}));
}

TEST_F(TicketContainer, BadAddressesAreRefused) {
    for (const auto& [type, id] :
         {std::pair(-1, 1), {50, 1}, {3, -1}, {3, 16777216}, {3, TICKET_ID_NEW}, {3, 5}}) {
        EXPECT_FALSE(operate(type, id, MTICKET_OP_EXISTS)) << type << "," << id;
        EXPECT_EQ(session.engine.open(type, id), nullptr);
        EXPECT_EQ(session.send(id, "a=1 b=2", type), "refused 00") << type << "," << id;
        EXPECT_FALSE(operate(type, id, MTICKET_OP_DELETE));
        EXPECT_FALSE(operate(type, id, STICKET_OP_PARTIAL));
        EXPECT_EQ(read(id, "a", -1, type), -1);
    }
    int made = 0;
    EXPECT_FALSE(operate(50, TICKET_ID_NEW, MTICKET_OP_CREATE_NEXT, &made));
    EXPECT_FALSE(operate(3, 5, MTICKET_OP_CREATE_NEXT, &made));
    EXPECT_FALSE(operate(3, TICKET_ID_NEW, MTICKET_OP_CREATE_NEXT));
    EXPECT_FALSE(operate(3, 1, MTICKET_OP_OPEN));
    EXPECT_FALSE(operate(3, 1, static_cast<MTICKET_OP>(99)));
    EXPECT_FALSE(session.view().WalkTickets(nullptr, nullptr, 3));
    EXPECT_EQ(session.engine.createWithKeys(3, -4, nullptr), nullptr);
    EXPECT_FALSE(session.engine.notify(3, -6, 6, true, nullptr));
    EXPECT_EQ(keep->ids(3), (std::vector<int>{1, 2, 3, 4}));

    session.send(1, "a=7");
    session.record.words[handleWord] = 1; // A handle that does not exist.
    EXPECT_EQ(read(1, "a", -1), -1);
    EXPECT_EQ(container::CreateWithKeys::call(session.record, 3, 7, nullptr), nullptr);
}

TEST_F(TicketContainer, ReadsSeeOthersAndArraysAreWhole) {
    session.send(1, "v=1,2,3 w=4,5");
    session.send(2, "v=8,9");
    EXPECT_EQ(read(1, "v", 0), 1);
    other.send(1, "v=10,20,30");
    EXPECT_EQ(read(1, "v", 1), 2) << "of the array that element 0 began";
    EXPECT_EQ(read(1, "v", 0), 10);
    EXPECT_EQ(read(1, "v", 2), 30);
    EXPECT_EQ(read(2, "v", 1), 9) << "of another ticket";
    other.send(1, "v[2]=31");
    EXPECT_EQ(read(1, "w", 1), 5);
    EXPECT_EQ(read(1, "v", 2), 31) << "the first read of another key";
    session.send(1, "v[1]=21");
    EXPECT_EQ(read(1, "v", 1), 21) << "what this session wrote";
}
