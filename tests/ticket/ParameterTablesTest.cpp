#include "ticket/ParameterTables.h"

#include <climits>
#include <vector>

#include <gtest/gtest.h>

namespace {

using ticket::Block;

/// A table with one record for each result byte; the terminator's result must not count.
template<class Record>
std::vector<Record> tableOf(const std::vector<std::uint8_t>& results) {
    std::vector<Record> table(results.size() + 1);
    for (std::size_t i = 0; i < results.size(); ++i) {
        table[i].key = "key";
        table[i].result = results[i];
    }
    table.back().result = 1;
    return table;
}

TEST(ParameterTables, ResultsAreReadFromBit0) {
    struct Case {
        std::vector<std::uint8_t> results;
        bool all;
        bool any;
    };
    const Case cases[] = {{{}, true, false},         {{1, 1}, true, true},
                          {{0, 1}, false, true},     {{0, 0}, false, false},
                          {{0xFE, 2}, false, false}, {{0xFF, 3}, true, true}};
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
    EXPECT_TRUE(longer[0].ok() && !longer[1].ok() && !longer[2].ok());
    longer[0].result = 0;
    shorter[2].result = 0;
    longer[2].result = 1;
    MultiParameterResultCpy(shorter.data(), longer.data());
    EXPECT_FALSE(shorter[0].ok() || shorter[2].ok());
    MultiParameterResultCpy(nullptr, longer.data());
    MultiParameterResultCpy(longer.data(), nullptr);
}

TEST(ParameterTables, ACopyHasTheSameBytes) {
    const int value = 5;
    const SETMULTIPAR table[] = {
        {.key = "a", .type = PARAM_INT, .value = &value, .position = 3, .result = 1}, {}};
    EXPECT_EQ(std::memcmp(Block<SETMULTIPAR>(MultiParameterDup(table)).get(), table, 64), 0);
    EXPECT_EQ(MultiParameterDup(nullptr), nullptr);
}

TEST(ParameterTables, AWriteTableBeginsByReplacingTheKey) {
    const Block<GETMULTIPAR> get(NewGetMultipar(3, "key", PARAM_DOUBLE));
    const Block<SETMULTIPAR> set(NewSetMultipar(3, "key", PARAM_DOUBLE));
    const int setPositions[] = {-1, 1, 2};
    for (int i = 0; i < 3; ++i) {
        EXPECT_TRUE(get[i].type == PARAM_DOUBLE && set[i].type == PARAM_DOUBLE);
        EXPECT_EQ(get[i].position, i);
        EXPECT_EQ(set[i].position, setPositions[i]);
    }
    EXPECT_TRUE(get[3].key == nullptr && set[3].key == nullptr);
    EXPECT_EQ(Block<SETMULTIPAR>(NewSetMultipar(0, "key", PARAM_INT))[0].key, nullptr);
    for (const unsigned long damaged : {ticket::maxElements + 1, ULONG_MAX / 32, ULONG_MAX}) {
        EXPECT_EQ(NewGetMultipar(damaged, "key", PARAM_INT), nullptr) << damaged;
        EXPECT_EQ(NewSetMultipar(damaged, "key", PARAM_INT), nullptr) << damaged;
    }
}

} // namespace
