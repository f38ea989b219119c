#include "ticket/TicketContainer.h"

#include <climits>

#include <gtest/gtest.h>

#include "RealTickets.h"

namespace {

constexpr int type = TicketInside::type;
constexpr int id = TicketInside::id;

TEST(TicketAddress, TypesAndIdsHaveLimits) {
    for (const int i : {-1, 50, 1000, INT_MIN, INT_MAX}) {
        EXPECT_FALSE(TICKET_TYPE_Valid(i) || TICKET_Valid(i, 0)) << i;
    }
    for (const int i : {-1, -4, 16'777'216, INT_MIN, INT_MAX}) {
        EXPECT_FALSE(TICKET_ID_Valid(i) || TICKET_Valid(0, i)) << i;
    }
    EXPECT_TRUE(TICKET_Valid(0, 0) && TICKET_Valid(49, 16'777'215));
}

TEST(TicketContainer, FindsMakesAndDeletesTickets) {
    TicketInside inside;
    const MTICKET_ADMIN& view = inside.view();
    EXPECT_TRUE(view.TicketExists(type, id));
    EXPECT_EQ(view.OpenTicket(type, id + 1), nullptr);
    const int made = view.CreateNextTicket(type, true);
    const int plain = view.CreateNextTicket(type, false);
    EXPECT_EQ(view.CreateNextTicket(50, true), -1);
    std::vector<int> ids{99};
    EXPECT_TRUE(view.GetTickets(type, ids));
    EXPECT_EQ(ids, (std::vector<int>{id, made, plain}));
    EXPECT_FALSE(view.GetTickets(type + 1, ids));
    EXPECT_TRUE(view.DeleteTicket(type, made, true));
    EXPECT_FALSE(view.DeleteTicket(type, made, true));
    EXPECT_FALSE(view.TicketExists(type, made));

    // Word 57 may be missing, and is not needed for a ticket that is there.
    const STICKET_ACCESS* opened = view.CreateOrOpenTicket(type, made, nullptr);
    EXPECT_TRUE(opened != nullptr && view.TicketExists(type, made));
    ticket::container::CreateWithKeys::put(inside.record, nullptr);
    EXPECT_EQ(view.CreateOrOpenTicket(type, made, nullptr), opened);
    EXPECT_EQ(view.CreateOrOpenTicket(type, 99, nullptr), nullptr);
}

TEST(TicketContainer, ReadsATicketsValues) {
    const TicketInside inside;
    const MTICKET_ADMIN& view = inside.view();
    view.SetVectorParameter(type, id, "numbers", std::vector<int>{5, 6, 7});
    view.SetVectorParameter(type, id, "text", std::vector<std::string>{"cyan"});
    EXPECT_TRUE(view.DelParameter(type, id, "numbers", 0));
    EXPECT_EQ(view.GetIntParameter(type, id, "numbers", -1), 6);
    EXPECT_EQ(view.GetIntParameter(type, id, 1, "numbers", -1), 7);
    EXPECT_EQ(view.GetIntParameter(type, id, 2, "numbers", -1), -1);
    EXPECT_STREQ(view.GetPszParameter(type, id, "text", "fallback"), "cyan");
    EXPECT_STREQ(view.GetPszParameter(type, id, "none", "fallback"), "fallback");
}

TEST(TicketContainer, PassesFiltersAndNotificationsOn) {
    const TicketInside inside;
    const char* const keys[] = {"Job/*", nullptr};
    EXPECT_TRUE(inside.view().SetPartial(type, id, keys));
    EXPECT_EQ(inside.engine.partial(type, id), std::vector<std::string>{"Job/*"});
    EXPECT_TRUE(inside.view().EnableNotification(type, TICKET_ID_NEW, 8, keys));
    const store::TicketContainer::Notification enabled{type, TICKET_ID_NEW, 8, {"Job/*"}};
    EXPECT_EQ(inside.engine.notifications(), std::vector{enabled});
    EXPECT_TRUE(inside.view().DisableNotification(type, TICKET_ID_ALL, 8));
    EXPECT_TRUE(inside.engine.notifications().empty());
}

// What reaches a plug-in where the engine's answers do not show it.
TEST(TicketContainer, OperationsCarryTheirNumbersAndArguments) {
    static std::string seen;
    static int answer;
    TicketInside inside;
    ticket::container::TicketOperation::put(
        inside.record, +[](void*, int, int id, TICKET_OP op, void* argument) {
            seen = std::to_string(id) + " " + std::to_string(op.code);
            if (op.code == MTICKET_OP_CREATE_NEXT) {
                seen += " " + std::to_string(std::exchange(*static_cast<int*>(argument), 77));
            } else if (op.code == MTICKET_OP_DELETE) {
                seen += *static_cast<bool*>(argument) ? " true" : " false";
            }
            return answer;
        });
    const MTICKET_ADMIN& view = inside.view();
    const auto seenAfter = [](auto) { return seen; };
    for (answer = 1; answer <= 2; ++answer) { // of 2, bit 0 is clear
        EXPECT_EQ(view.CreateNextTicket(type, true), answer == 1 ? 77 : -1);
        EXPECT_EQ(seen, "-4 104 -1");
        EXPECT_EQ(seenAfter(view.CreateNextTicket(type, false)), "-5 104 -1");
        EXPECT_EQ(seenAfter(view.DeleteTicket(type, 5, true)), "5 106 true");
        EXPECT_EQ(seenAfter(view.DeleteTicket(type, 5, false)), "5 106 false");
        EXPECT_EQ(view.TicketExists(type, 5), answer == 1);
        EXPECT_EQ(seen, "5 101");
    }
}

TEST(TicketContainer, AsksForNoTicketsOfAnInvalidType) {
    TicketInside inside;
    ticket::container::WalkTickets::put(
        inside.record, +[](void*, TicketWalk walk, void* context, int type) {
            return walk(context, type, 1, nullptr) ? 1 : 0;
        });
    std::vector<int> ids{99};
    EXPECT_FALSE(inside.view().GetTickets(50, ids));
    EXPECT_TRUE(ids.empty());
    EXPECT_TRUE(inside.view().GetTickets(49, ids));
}

} // namespace
