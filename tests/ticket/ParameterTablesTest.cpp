#include "ticket/ParameterTables.h"

#include <tuple>
#include <vector>

#include <gtest/gtest.h>

namespace {

using ticket::Block;

/// A table with one record for each result byte; the terminator's result must not count.
template<class Record>
std::vector<Record> tableOf(const std::vector<std::uint8_t>& results) {
    std::vector<Record> table;
    for (const std::uint8_t result : results) {
        table.push_back({.key = "key", .result = result});
    }
    table.push_back({.result = 1});
    return table;
}

TEST(ParameterTables, ResultsAreReadFromBit0) {
    const std::tuple<std::vector<std::uint8_t>, bool, bool> cases[] = {
        {{}, true, false},      {{1, 1}, true, true},      {{0, 1}, false, true},
        {{0, 0}, false, false}, {{0xFE, 2}, false, false}, {{0xFF, 3}, true, true}};
    for (const auto& [results, all, any] : cases) {
        SCOPED_TRACE(testing::PrintToString(results));
        EXPECT_EQ(AllMultiParameterOk(tableOf<SETMULTIPAR>(results).data()), all);
        EXPECT_EQ(AnyMultiParameterOk(tableOf<SETMULTIPAR>(results).data()), any);
        EXPECT_EQ(AllMultiParameterOk(tableOf<GETMULTIPAR>(results).data()), all);
        EXPECT_EQ(AnyMultiParameterOk(tableOf<GETMULTIPAR>(results).data()), any);
    }
    EXPECT_FALSE(AllMultiParameterOk(static_cast<SETMULTIPAR*>(nullptr)));
    EXPECT_FALSE(AnyMultiParameterOk(static_cast<GETMULTIPAR*>(nullptr)));
}

TEST(ParameterTables, ResultsAreCopiedUpToTheShorterEnd) {
    std::vector<SETMULTIPAR> longer = tableOf<SETMULTIPAR>({0, 1, 0});
    std::vector<SETMULTIPAR> shorter = tableOf<SETMULTIPAR>({0xFF, 0xFE});
    MultiParameterResultCpy(longer.data(), shorter.data());
    EXPECT_TRUE(longer[0].result == 1 && longer[1].result == 0 && longer[2].result == 0);
    longer[2].result = 0xFF;
    MultiParameterResultCpy(shorter.data(), longer.data());
    EXPECT_TRUE(shorter[0].result == 1 && shorter[2].result == 1);
    MultiParameterResultCpy(nullptr, longer.data());
    MultiParameterResultCpy(longer.data(), nullptr);
}

TEST(ParameterTables, ACopyHasTheSameBytes) {
    const SETMULTIPAR table[] = {{.key = "a", .type = PARAM_INT, .value = "b", .result = 1}, {}};
    EXPECT_EQ(std::memcmp(Block<SETMULTIPAR>(MultiParameterDup(table)).get(), table, 64), 0);
    EXPECT_EQ(MultiParameterDup(nullptr), nullptr);
}

TEST(ParameterTables, AWriteTableBeginsByReplacingTheKey) {
    const Block<GETMULTIPAR> get(NewGetMultipar(3, "key", PARAM_DOUBLE));
    const Block<SETMULTIPAR> set(NewSetMultipar(3, "key", PARAM_DOUBLE));
    EXPECT_TRUE(get[0].position == 0 && get[1].position == 1 && get[2].position == 2);
    EXPECT_TRUE(set[0].position == -1 && set[1].position == 1 && set[2].position == 2);
    EXPECT_TRUE(get[3].key == nullptr && set[3].key == nullptr);
    EXPECT_EQ(Block<SETMULTIPAR>(NewSetMultipar(0, "key", PARAM_INT))[0].key, nullptr);
    EXPECT_EQ(NewSetMultipar(ticket::maxElements + 1, "key", PARAM_INT), nullptr);
}

} // namespace
