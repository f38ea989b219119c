#include "ticket/ParameterTables.h"

#include <vector>

#include <gtest/gtest.h>

namespace {

/// A table with one record for each result byte; the terminator's result must not count.
std::vector<SETMULTIPAR> tableOf(const std::vector<std::uint8_t>& results) {
    std::vector<SETMULTIPAR> table;
    for (const std::uint8_t result : results) {
        table.push_back({.key = "key", .result = result});
    }
    table.push_back({.result = 1});
    return table;
}

TEST(ParameterTables, EmptyOnesAreAllRightAndNullOnesAreNot) {
    EXPECT_TRUE(AllMultiParameterOk(tableOf({}).data()));
    EXPECT_FALSE(AnyMultiParameterOk(tableOf({}).data()));
    EXPECT_FALSE(AllMultiParameterOk(static_cast<SETMULTIPAR*>(nullptr)));
    EXPECT_FALSE(AnyMultiParameterOk(static_cast<GETMULTIPAR*>(nullptr)));
}

TEST(ParameterTables, ResultsAreCopiedUpToTheShorterEnd) {
    std::vector<SETMULTIPAR> longer = tableOf({0, 1, 0xFF});
    const ticket::Block<SETMULTIPAR> shorter(MultiParameterDup(tableOf({0xFF, 0xFE}).data()));
    MultiParameterResultCpy(longer.data(), shorter.get());
    EXPECT_TRUE(longer[0].result == 1 && longer[1].result == 0 && longer[2].result == 0xFF);
    MultiParameterResultCpy(shorter.get(), longer.data());
    EXPECT_TRUE(shorter[0].result == 1 && shorter[2].key == nullptr);
}

} // namespace
