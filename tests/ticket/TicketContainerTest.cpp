#include "ticket/TicketContainer.h"

#include <gtest/gtest.h>

#include "RealTickets.h"
#include "TicketText.h"

namespace {

constexpr int type = TicketInside::type;
constexpr int id = TicketInside::id;

TEST(TicketContainer, FindsMakesAndDeletesTickets) {
    TicketInside inside;
    const MTICKET_ADMIN& view = inside.view();
    const int made = view.CreateNextTicket(type, true);
    const int plain = view.CreateNextTicket(type, false);
    std::vector<int> ids{99};
    EXPECT_TRUE(view.GetTickets(type, ids));
    EXPECT_EQ(ids, (std::vector<int>{id, made, plain}));
    EXPECT_FALSE(view.GetTickets(type + 1, ids));
    EXPECT_TRUE(ids.empty());
    EXPECT_TRUE(view.TicketExists(type, made) && view.DeleteTicket(type, made, true));
    EXPECT_FALSE(view.TicketExists(type, made) || view.DeleteTicket(type, made, true));
    EXPECT_EQ(view.OpenTicket(type, made), nullptr);

    // Word 57 may be missing, and is not needed for a ticket that is there.
    const STICKET_ACCESS* opened = view.CreateOrOpenTicket(type, made, nullptr);
    EXPECT_TRUE(opened != nullptr && view.TicketExists(type, made));
    ticket::container::CreateWithKeys::put(inside.record, nullptr);
    EXPECT_EQ(view.CreateOrOpenTicket(type, made, nullptr), opened);
    EXPECT_EQ(view.CreateOrOpenTicket(type, 99, nullptr), nullptr);
}

TEST(TicketContainer, ReadsATicketsValues) {
    TicketInside inside;
    const MTICKET_ADMIN& view = inside.view();
    EXPECT_TRUE(view.SetMultiParameter(
        type, id, support::RecordTable("numbers=6,7 text[-1]='cyan").records()));
    EXPECT_EQ(view.GetIntParameter(type, id, 1, "numbers", -1), 7);
    EXPECT_EQ(view.GetIntParameter(type, id, 2, "numbers", -1), -1);
    EXPECT_STREQ(view.GetPszParameter(type, id, "text", "fallback"), "cyan");
    EXPECT_STREQ(view.GetPszParameter(type, id, "none", "fallback"), "fallback");
    ticket::container::GetParameter::put(
        inside.record, +[](void*, int, int, const char*, PARAM_TYPE, void* out, int) {
            *static_cast<int*>(out) = 7;
            return 2; // Of an answer bit 0 counts.
        });
    EXPECT_EQ(view.GetIntParameter(type, id, "numbers", -1), -1);
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
            seen += std::to_string(id) + " " + std::to_string(op.code);
            if (op.code == MTICKET_OP_CREATE_NEXT) {
                *static_cast<int*>(argument) = 77;
            } else if (op.code == MTICKET_OP_DELETE) {
                seen += *static_cast<bool*>(argument) ? " true" : " false";
            }
            seen += "; ";
            return answer;
        });
    const MTICKET_ADMIN& view = inside.view();
    answer = 1;
    EXPECT_EQ(view.CreateNextTicket(type, true), 77);
    EXPECT_TRUE(view.DeleteTicket(type, 5, true));
    answer = 2; // Bit 0 is clear.
    EXPECT_EQ(view.CreateNextTicket(type, false), -1);
    EXPECT_FALSE(view.DeleteTicket(type, 5, false));
    EXPECT_FALSE(view.TicketExists(type, 6));
    EXPECT_EQ(seen, "-4 104; 5 106 true; -5 104; 5 106 false; 6 101; ");
}

} // namespace
