// SPDX-License-Identifier: Apache-2.0
#include "ticket/TicketViews.h"

#include <climits>

#include "RealTickets.h"

TEST(TicketViews, FindsTheFirstEqualElement) {
    const WorkTicket work("numbers=4,5,5,0.5,6 scalar[-1]=9 texts='a,'ab,'b");
    const STICKET_MODIFY& view = work.view();
    EXPECT_EQ(view.FindParameterPosition<int>("numbers", 5), 1);
    EXPECT_EQ(view.FindParameterPosition<int>("numbers", 6), -1); // After a non-integer.
    EXPECT_EQ(view.FindParameterPosition<int>("scalar", 9), 0);
    EXPECT_EQ(view.FindParameterPosition<std::string>("texts", "ab"), 1);
    EXPECT_EQ(view.FindParameterPosition<std::string>("texts", ""), -1);
    EXPECT_EQ(view.FindParameterPosition<int>("none", 0), -1);
}

TEST(TicketViews, SaysWhereItComesFromOrNothing) {
    STICKET_OPTION_WHOAMI record{&record, 5, 6};
    EXPECT_FALSE(WorkTicket().view().WhoAmI(record));
    EXPECT_TRUE(record.pointer == nullptr && record.number1 == -1 && record.number2 == -1);
    const TicketInside inside;
    const STICKET_ACCESS* opened = inside.view().OpenTicket(jobs, TicketInside::id);
    EXPECT_TRUE(ticket::as<STICKET_READ>(*opened).WhoAmI(record));
    EXPECT_TRUE(record.number1 == jobs && record.number2 == TicketInside::id);
}

TEST(TicketViews, BearsAFaultyPlugIn) {
    static int answer;
    static unsigned long count;
    WorkTicket work;
    ticket::single::GetParameter::put(
        work.record, +[](void*, const char*, PARAM_TYPE type, void* out, int) {
            if (type == PARAM_INT) {
                *static_cast<int*>(out) = 7;
            } else if (type == PARAM_COUNT) {
                *static_cast<unsigned long*>(out) = count;
            }
            return answer;
        });
    // Stores nothing, but marks each record as done.
    ticket::single::GetMultiParameter::put(
        work.record, +[](void*, GETMULTIPAR* table) {
            for (; table->key != nullptr; ++table) {
                table->result = 0xFF;
            }
            return 0;
        });
    const STICKET_MODIFY& view = work.view();

    // Only bit 0 of an answer counts. A null text counts as missing even if reported as present.
    answer = 0xFE;
    EXPECT_EQ(view.GetIntParameter("key", 1), 1);
    answer = 0x101;
    EXPECT_EQ(view.GetIntParameter("key", 1), 7);
    EXPECT_EQ(view.GetStringParameter("key", "fallback"), "fallback");

    // Null texts are left out of a vector. Counts that are too large allocate nothing.
    std::vector<std::string> texts{"former"};
    count = 1000;
    EXPECT_FALSE(view.GetVectorParameter("key", texts));
    EXPECT_TRUE(texts.empty());
    for (const unsigned long damage : {ULONG_MAX, ULONG_MAX / sizeof(GETMULTIPAR), 1UL << 33}) {
        count = damage;
        std::vector<double> vector{0.5};
        EXPECT_FALSE(view.GetVectorParameter("key", vector));
        EXPECT_EQ(vector, std::vector<double>{0.5});
    }
}
