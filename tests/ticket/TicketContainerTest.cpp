// SPDX-License-Identifier: Apache-2.0
#include "ticket/TicketContainer.h"

#include "RealTickets.h"

namespace {

constexpr int id = TicketInside::id;

} // namespace

TEST(TicketContainer, FindsTicketsAndTheirValues) {
    TicketInside inside;
    const MTICKET_ADMIN& view = inside.view();
    const int made = view.CreateNextTicket(jobs, true);
    std::vector<int> ids{99};
    EXPECT_TRUE(view.GetTickets(jobs, ids));
    EXPECT_EQ(ids, (std::vector<int>{id, made}));
    EXPECT_FALSE(view.GetTickets(jobs + 1, ids));
    EXPECT_TRUE(ids.empty());
    inside.send("numbers=6,7 text[-1]='cyan");
    EXPECT_EQ(view.GetIntParameter(jobs, id, 1, "numbers", -1), 7);
    EXPECT_STREQ(view.GetPszParameter(jobs, id, "text", "fallback"), "cyan");
    EXPECT_STREQ(view.GetPszParameter(jobs, id, "none", "fallback"), "fallback");

    // Word 57 may be missing; an existing ticket does not need it.
    EXPECT_NE(view.CreateOrOpenTicket(jobs, 98, nullptr), nullptr);
    ticket::container::CreateWithKeys::put(inside.record, nullptr);
    EXPECT_EQ(view.CreateOrOpenTicket(jobs, id, nullptr), view.OpenTicket(jobs, id));
    EXPECT_EQ(view.CreateOrOpenTicket(jobs, 99, nullptr), nullptr);
}

TEST(TicketContainer, PassesFiltersAndNotificationsOn) {
    const TicketInside inside;
    const char* const keys[] = {"Job/*", nullptr};
    EXPECT_TRUE(inside.view().SetPartial(jobs, id, keys));
    EXPECT_EQ(inside.engine.partial(jobs, id), std::vector<std::string>{"Job/*"});
    EXPECT_TRUE(inside.view().EnableNotification(jobs, TICKET_ID_NEW, 8, keys));
    const store::TicketContainer::Notification enabled{jobs, TICKET_ID_NEW, 8, {"Job/*"}};
    EXPECT_EQ(inside.engine.notifications(), std::vector{enabled});
    EXPECT_TRUE(inside.view().DisableNotification(jobs, TICKET_ID_ALL, 8));
    EXPECT_TRUE(inside.engine.notifications().empty());
}

// Arguments that the engine's answers do not reveal. Only bit 0 of a plug-in's answer counts.
TEST(TicketContainer, OperationsCarryTheirNumbersAndArguments) {
    static std::string seen;
    static int answer;
    TicketInside inside;
    ticket::container::TicketOperation::put(
        inside.record, +[](void*, int, int id, TICKET_OP op, void* argument) {
            seen += std::to_string(id) + " " + std::to_string(op.code) +
                    (id == 5 && *static_cast<bool*>(argument) ? " true; " : "; ");
            return answer;
        });
    for (const bool flag : {true, false}) {
        answer = flag ? 1 : 2;
        inside.view().CreateNextTicket(jobs, flag);
        EXPECT_EQ(inside.view().DeleteTicket(jobs, 5, flag), flag);
        EXPECT_EQ(inside.view().TicketExists(jobs, 6), flag);
    }
    EXPECT_EQ(seen, "-4 104; 5 106 true; 6 101; -5 104; 5 106; 6 101; ");
}
