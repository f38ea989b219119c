// SPDX-License-Identifier: Apache-2.0
#include "ticket/ParameterList.h"

#include <array>
#include <cmath>

#include "AnyPlace.h"
#include "text/MathLib.h"

namespace {

using support::RecordTable;
using support::tableText;

const std::string each = "k[0]=p16 k[1]=-5 k[2]=0.25 k[3]='text k[4]=#610062 k[5]=l-1099511627776 "
                         "k[6]=u4000000000 k[7]=U18446744073709551615";

using Set = bool (SETMULTIPAR_LIST::*)(const char*, PARAM_TYPE, const void*, int);

/// Adds records. Returns 1 for each value that the list then owns, 0 for each that it shares.
std::string add(SETMULTIPAR_LIST& list, Set set, const SETMULTIPAR* records) {
    std::string owned;
    for (; records->key != nullptr; ++records) {
        EXPECT_TRUE((list.*set)(records->key, records->type, records->value, records->position));
        const SETMULTIPAR& added = list.m_list.back();
        EXPECT_NE(added.key, records->key);
        owned += added.value != records->value ? '1' : '0';
    }
    return owned;
}

TEST(ParameterList, OwnsKeysAndValuesAsDeepAsItIs) {
    SETMULTIPAR_LIST list(false);
    SETMULTIPAR_LIST deep(true);
    SETMULTIPAR_LIST shallow(false);
    RecordTable given(each); // Must outlive the shared values.
    EXPECT_EQ(add(list, &SETMULTIPAR_LIST::xSetParameter, given.records()), "01111111");
    EXPECT_EQ(add(deep, &SETMULTIPAR_LIST::ySetParameter, given.records()), "01111111");
    EXPECT_EQ(add(shallow, &SETMULTIPAR_LIST::ySetParameter, given.records()), "01001000");
    EXPECT_EQ(tableText(list.Table(false)), each);
    const std::string walked = "k[-1]" + each.substr(4);
    EXPECT_EQ(tableText(deep.Table(false)), walked);
    EXPECT_EQ(tableText(shallow.Table(false)), walked);
    deep.Clear();
    EXPECT_TRUE(deep.m_deep && deep.Table(false) == nullptr && !deep.ParameterExists("k"));
}

TEST(ParameterList, EqualOnesAreStoredOnceAndNoNumbersAreOneConstant) {
    // Numbers that differ only in their first bits, their last bits, or their sign.
    std::vector<double> numbers = {0.0, -0.0, NAN, HUGE_VAL, -HUGE_VAL};
    for (int i = 0; i < 10'000; ++i) {
        numbers.push_back(std::ldexp(i % 2 == 0 ? 1 + i * 1e-15 : -1, i % 997));
    }
    const int count = static_cast<int>(numbers.size());
    SETMULTIPAR_LIST list(true);
    EXPECT_TRUE(list.xSetNumbers("once", PARAM_DOUBLE, numbers.data(), count));
    EXPECT_FALSE(list.xSetNumbers("never", PARAM_UINT, numbers.data(), count));
    for (int i = 0; i < count; ++i) {
        list.xSetParameter("again", PARAM_DOUBLE, &numbers[std::size_t(i)], i);
    }
    RecordTable given("one[-1]='value two[-1]='value");
    EXPECT_EQ(add(list, &SETMULTIPAR_LIST::xSetParameter, given.records()), "11");

    const SETMULTIPAR* table = list.Table(false);
    EXPECT_EQ(table[0].value, table[1].value);
    for (int i = 0; i < count; ++i) {
        const auto* value = static_cast<const double*>(table[i].value);
        ASSERT_TRUE(std::isfinite(numbers[std::size_t(i)]) ? *value == numbers[std::size_t(i)]
                                                           : value == &MathLib::NOT_A_DOUBLE_NUMBER)
            << i;
        ASSERT_EQ(value, table[count + i].value) << i;
        ASSERT_EQ(table[i].position, i);
        ASSERT_EQ(table[i].key, table[0].key);
    }
    EXPECT_EQ(table[2 * count].value, table[2 * count + 1].value);
    EXPECT_EQ(list.Size(), 2 * numbers.size() + 2);
}

TEST(ParameterList, NoNumbersLeaveTheKeyUnset) {
    void* opaque = MultiParListCreate();
    const auto& list = *static_cast<SETMULTIPAR_LIST*>(opaque);
    const double value = 2.5;
    const int number = 7;
    for (const int count : {0, -1}) {
        EXPECT_TRUE(MultiParListSetNumbers(opaque, "a", PARAM_DOUBLE, &value, count));
        EXPECT_TRUE(MultiParListSetNumbers(opaque, "a", PARAM_INT, &number, count));
        EXPECT_TRUE(list.Size() == 0 && !list.ParameterExists("a"));
    }
    MultiParListSetParameter(opaque, "d", PARAM_DOUBLE, &value, -1);
    MultiParListSetParameter(opaque, "i", PARAM_INT, &number, -1);
    EXPECT_EQ(tableText(MultiParListTable(opaque, 0)), "d[-1]=2.5 i[-1]=7");
    MultiParListDestroy(&opaque);
}

TEST(ParameterList, TableSortsByKeyAndKeepsTheOrderWithinAKey) {
    void* opaque = MultiParListCreate();
    auto& list = *static_cast<SETMULTIPAR_LIST*>(opaque);
    for (int i = 0; i < 100; ++i) {
        MultiParListSetParameter(opaque, i % 2 == 0 ? "b" : "a", PARAM_DELETE, nullptr, i);
    }
    EXPECT_EQ(MultiParListTable(opaque, 2)[1].position, 1); // Bit 0 requests sorting.
    MultiParListTable(opaque, 3);
    for (int i = 0; i < 100; ++i) { // The list itself is sorted now.
        EXPECT_EQ(list.Table(false)[i].position, i < 50 ? 2 * i + 1 : 2 * (i - 50));
    }
    list.DelParameter("a", 100); // Stays after the sorted records until the next sort.
    EXPECT_EQ(list.Table(false)[100].position, 100);
    EXPECT_EQ(list.Table(true)[50].position, 100);
    // A missing key ends a table. Sorting does not lose any other record.
    list.Clear();
    for (const char* key : {static_cast<const char*>(nullptr), "\xC3\xA4", "z"}) {
        list.DelParameter(key, -1);
    }
    EXPECT_EQ(tableText(list.Table(false)), "");
    EXPECT_EQ(tableText(list.Table(true)), "z[-1]=- \xC3\xA4[-1]=-");
    EXPECT_TRUE(list.Size() == 3 && list.ParameterExists("z") && !list.ParameterExists(nullptr));
    MultiParListDestroy(&opaque);
    EXPECT_EQ(opaque, nullptr);
}

TEST(ParameterList, CollectsFromATicket) {
    const WorkTicket work("ab=1,2 abc[-1]=3 B[-1]=4");
    const std::string all = "B[-1]=4 ab[-1]=1 ab[1]=2 abc[-1]=3";
    const char* const prefix[] = {"ab*", nullptr};
    const char* const subtraction[] = {"", "ab", nullptr};
    const std::tuple<const char* const*, std::string, std::string> cases[] = {
        {nullptr, all, all},
        {prefix, all.substr(8), all.substr(8)},
        {subtraction, "", all}, // the table is a filter, but its mode is empty
    };
    for (const auto& [keys, byTable, byMode] : cases) {
        SETMULTIPAR_LIST list(true);
        list.Merge(work.real(), keys);
        list.Merge(nullptr, keys);
        EXPECT_EQ(tableText(list.Table(false)), byTable);
        list.Clear();
        list.Merge(work.real(), PARTIAL_MODE(keys));
        EXPECT_EQ(tableText(list.Table(false)), byMode);
    }
    SETMULTIPAR_LIST list(true);
    list.MergeIf(nullptr, [](const char*) { return true; });
    list.MergeIf(work.real(), nullptr);
    // A walk that shows a type without values, as the engine never does.
    STICKET_ACCESS odd{};
    ticket::single::Walk::put(
        odd, +[](void*, SCollect show, void* context, const char*, int) {
            return show(context, "ab", PARAM_DELETE, nullptr, 0) ? 1 : 0;
        });
    list.Merge(&odd, nullptr);
    list.Merge(&odd, PARTIAL_MODE(prefix));
    EXPECT_EQ(list.Size(), 0u);
    list.MergeIf(&odd, [](const char*) { return true; });
    EXPECT_EQ(tableText(list.Table(false)), "ab[-1]=-");
    list.Clear();
    // Each call gets the predicate in its original state: its counter never grows.
    list.MergeIf(work.real(), [calls = 0](const char* key) mutable {
        return ++calls == 1 && std::string_view(key) != "B";
    });
    EXPECT_EQ(tableText(list.Table(false)), all.substr(8));
}

class ShallowList : public AnyPlace {};
IN_ANY_PLACE(ShallowList);

// Texts and doubles of a shallow list belong to the ticket.
TEST_P(ShallowList, HoldsWhatAnyWalkShowedUntilTheTicketChanges) {
    const std::string content = "d[-1]=0.5 l[-1]=l7 n[-1]=1.5 n[1]=2.5 t[-1]='text t[1]='more";
    const std::string texts = content.substr(content.find('t'));
    Server server;
    server.create(12, content);
    server.create(13, "d[-1]=9");
    const auto& ticket = ticket::as<STICKET_MODIFY>(*server.engine.open(jobs, 12));
    SETMULTIPAR_LIST list(false);
    list.Merge(&ticket, PARTIAL_MODE(std::array<const char*, 2>{"t", nullptr}.data()));
    const auto unchanged = [&] { // Repeated walks would expose values freed too early.
        list.Merge(&ticket, PARTIAL_MODE(std::array<const char*, 2>{"none", nullptr}.data()));
        support::ticketText(&ticket);
        const WorkTicket work;
        EXPECT_TRUE(work.view().Merge(&ticket, nullptr));
        EXPECT_EQ(tableText(list.Table(false)).substr(0, texts.size()), texts);
    };
    unchanged();
    server.send(13, "d[-1]=10");
    EXPECT_EQ(server.send(12, "d[-3]=10 *[0]=1"), "taken 00");
    unchanged();
    // Changed by another session: old values stay valid, and new walks show new ones.
    store::TicketContainer other(server.keep);
    other.apply(jobs, 12, RecordTable("t[1]='changed").records());
    unchanged();
    list.Merge(&ticket, nullptr);
    EXPECT_EQ(tableText(list.Table(false)),
              texts + " " + content.substr(0, content.find('t')) + "t[-1]='text t[1]='changed");
}

} // namespace
