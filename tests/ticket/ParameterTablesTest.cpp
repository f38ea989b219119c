#include "ticket/ParameterTables.h"

#include <climits>
#include <vector>

#include <gtest/gtest.h>

namespace {

using ticket::Block;

/// A table with one record for each result byte, and a terminator.
template<class Record>
std::vector<Record> tableOf(const std::vector<int>& results) {
    std::vector<Record> table(results.size() + 1);
    for (std::size_t i = 0; i < results.size(); ++i) {
        table[i].key = "key";
        table[i].result = static_cast<std::uint8_t>(results[i]);
    }
    table.back().result = 1; // behind the end: must not count
    return table;
}

template<class Record>
void expectOk(const std::vector<int>& results, bool all, bool any) {
    const std::vector<Record> table = tableOf<Record>(results);
    EXPECT_EQ(AllMultiParameterOk(table.data()), all);
    EXPECT_EQ(AnyMultiParameterOk(table.data()), any);
}

TEST(ParameterTables, ResultsAreReadFromBit0) {
    struct Case {
        std::vector<int> results;
        bool all;
        bool any;
    };
    const Case cases[] = {
        {{}, true, false},      {{1, 1}, true, true},      {{0, 1}, false, true},
        {{0, 0}, false, false}, {{0xFE, 2}, false, false}, {{0xFF, 3}, true, true},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(testing::PrintToString(c.results));
        expectOk<SETMULTIPAR>(c.results, c.all, c.any);
        expectOk<GETMULTIPAR>(c.results, c.all, c.any);
    }
    EXPECT_FALSE(AllMultiParameterOk(static_cast<SETMULTIPAR*>(nullptr)));
    EXPECT_FALSE(AllMultiParameterOk(static_cast<GETMULTIPAR*>(nullptr)));
    EXPECT_FALSE(AnyMultiParameterOk(static_cast<SETMULTIPAR*>(nullptr)));
    EXPECT_FALSE(AnyMultiParameterOk(static_cast<GETMULTIPAR*>(nullptr)));
}

TEST(ParameterTables, ResultsAreCopiedUpToTheShorterEnd) {
    std::vector<SETMULTIPAR> longer = tableOf<SETMULTIPAR>({0, 1, 0});
    std::vector<SETMULTIPAR> shorter = tableOf<SETMULTIPAR>({0xFF, 0xFE});
    MultiParameterResultCpy(longer.data(), shorter.data());
    EXPECT_TRUE(longer[0].ok());
    EXPECT_FALSE(longer[1].ok());
    EXPECT_FALSE(longer[2].ok());

    longer[0].result = 0;
    MultiParameterResultCpy(shorter.data(), longer.data());
    EXPECT_FALSE(shorter[0].ok());
    EXPECT_EQ(shorter[2].result, 1); // the terminator's is left alone
    MultiParameterResultCpy(nullptr, longer.data());
    MultiParameterResultCpy(longer.data(), nullptr);
}

TEST(ParameterTables, ACopySharesKeysAndValues) {
    const int value = 5;
    const std::vector<SETMULTIPAR> table{
        {.key = "a", .type = PARAM_INT, .value = &value, .position = 3, .result = 1}, {}};
    const Block<SETMULTIPAR> copy(MultiParameterDup(table.data()));
    EXPECT_EQ(std::memcmp(copy.get(), table.data(), 2 * sizeof(SETMULTIPAR)), 0);
    EXPECT_EQ(MultiParameterDup(nullptr), nullptr);
}

TEST(ParameterTables, AWriteTableBeginsByReplacingTheKey) {
    const Block<GETMULTIPAR> get(NewGetMultipar(3, "key", PARAM_DOUBLE));
    const Block<SETMULTIPAR> set(NewSetMultipar(3, "key", PARAM_DOUBLE));
    const int getPositions[] = {0, 1, 2};
    const int setPositions[] = {-1, 1, 2};
    for (int i = 0; i < 3; ++i) {
        EXPECT_STREQ(get[i].key, "key");
        EXPECT_STREQ(set[i].key, "key");
        EXPECT_EQ(get[i].type, PARAM_DOUBLE);
        EXPECT_EQ(set[i].type, PARAM_DOUBLE);
        EXPECT_EQ(get[i].position, getPositions[i]);
        EXPECT_EQ(set[i].position, setPositions[i]);
        EXPECT_EQ(get[i].value, nullptr);
    }
    EXPECT_EQ(get[3].key, nullptr);
    EXPECT_EQ(set[3].key, nullptr);
    EXPECT_EQ(Block<SETMULTIPAR>(NewSetMultipar(0, "key", PARAM_INT))[0].key, nullptr);
}

TEST(ParameterTables, ACountBeyondAllPositionsAllocatesNothing) {
    for (const unsigned long count : {ticket::maxElements + 1, ULONG_MAX / 32, ULONG_MAX}) {
        EXPECT_EQ(NewGetMultipar(count, "key", PARAM_INT), nullptr) << count;
        EXPECT_EQ(NewSetMultipar(count, "key", PARAM_INT), nullptr) << count;
    }
}

TEST(ParameterTables, RecordsOrderByKeyAloneAndTheEndComesLast) {
    const SETMULTIPAR a{.key = "a", .type = PARAM_INT, .position = 9};
    const SETMULTIPAR b{.key = "a", .type = PARAM_DELETE, .position = -1};
    const SETMULTIPAR high{.key = "\xC3\xA4"};
    const SETMULTIPAR end;
    EXPECT_FALSE(a < b || b < a);
    EXPECT_TRUE(a < high && !(high < a)); // bytes compare unsigned
    EXPECT_TRUE(high < end && !(end < high) && !(end < end));
}

} // namespace
