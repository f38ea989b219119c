#include "ticket/SingleTicket.h"

#include <gtest/gtest.h>

#include "RealTickets.h"

namespace {

TEST(TicketFactory, WithoutAPlugInThereAreNoTickets) {
    hSTicketInstance = nullptr;
    EXPECT_EQ(CreateTicket(nullptr), nullptr);
    STICKET_ACCESS record{};
    const STICKET_ACCESS* pointer = &record;
    DestroyTicket(pointer);
    EXPECT_EQ(pointer, &record);
}

TEST(SingleTicket, FindsTheFirstEqualElement) {
    const WorkTicket work;
    const STICKET_MODIFY& view = work.view();
    const int scalar = 9;
    const double gap = 0;
    view.SetVectorParameter("numbers", std::vector<int>{4, 5, 5, 6});
    view.xSetParameter("numbers", PARAM_DOUBLE, &gap, 2); // ends the search
    view.xSetParameter("scalar", PARAM_INT, &scalar, POSITION_WHOLE);
    view.SetVectorParameter("texts", std::vector<std::string>{"a", "ab", "b"});
    EXPECT_EQ(view.FindParameterPosition<int>("numbers", 5), 1);
    EXPECT_EQ(view.FindParameterPosition<int>("numbers", 6), -1);
    EXPECT_EQ(view.FindParameterPosition<int>("scalar", 9), 0);
    EXPECT_EQ(view.FindParameterPosition<std::string>("texts", "ab"), 1);
    EXPECT_EQ(view.FindParameterPosition<std::string>("texts", ""), -1);
    EXPECT_EQ(view.FindParameterPosition<int>("none", 0), -1);
}

TEST(SingleTicket, TransfersReplaceOrOverlay) {
    const WorkTicket source;
    const WorkTicket target;
    source.view().SetVectorParameter("a/1", std::vector<int>{1});
    source.view().SetVectorParameter("b", std::vector<int>{2});
    target.view().SetVectorParameter("old", std::vector<int>{0});
    const char* const keys[] = {"a*", nullptr};
    const auto has = [&](const char* key) { return target.view().ParameterExists(key, 0); };
    EXPECT_TRUE(target.view().Merge(source.real(), keys));
    EXPECT_TRUE(has("old") && has("a/1") && !has("b"));
    EXPECT_TRUE(target.view().Assign(source.real(), nullptr));
    EXPECT_TRUE(!has("old") && has("a/1") && has("b"));
    EXPECT_TRUE(target.view().Assign(source.real(), keys));
    EXPECT_TRUE(has("a/1") && !has("b"));
}

TEST(SingleTicket, SaysWhereItComesFromOrNothing) {
    STICKET_OPTION_WHOAMI record{&record, 5, 6};
    const WorkTicket work;
    EXPECT_FALSE(work.view().WhoAmI(record));
    EXPECT_TRUE(record.pointer == nullptr && record.number1 == -1 && record.number2 == -1);
    const TicketInside inside;
    const STICKET_ACCESS* opened = inside.view().OpenTicket(TicketInside::type, TicketInside::id);
    EXPECT_TRUE(ticket::as<STICKET_READ>(*opened).WhoAmI(record));
    EXPECT_EQ(record.number2, TicketInside::id);
}

} // namespace
