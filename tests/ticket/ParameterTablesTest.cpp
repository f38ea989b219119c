// SPDX-License-Identifier: Apache-2.0
#include "ticket/ParameterTables.h"
#include "base/Malloc.h"

#include "RealTickets.h"

namespace {

TEST(ParameterTables, ResultsAreCopiedUpToTheShorterEnd) {
    support::RecordTable table("k=1,2,3");
    SETMULTIPAR* longer = table.records();
    longer[2].result = longer[3].result = 0xFF;
    const base::Malloced<SETMULTIPAR[]> shorter(MultiParameterDup(longer + 1));
    shorter[0].result = 0xFF;
    shorter[1].result = 0xFE;
    EXPECT_FALSE(AllMultiParameterOk(shorter.get()));
    MultiParameterResultCpy(longer, shorter.get());
    EXPECT_TRUE(longer[0].result == 1 && longer[1].result == 0 && longer[2].result == 0xFF);
    MultiParameterResultCpy(shorter.get(), longer + 2);
    EXPECT_TRUE(shorter[0].result == 1 && shorter[1].result == 0xFE && shorter[2].key == nullptr);
    // The terminator does not count.
    EXPECT_TRUE(AllMultiParameterOk(longer + 3) && !AnyMultiParameterOk(longer + 3));
    EXPECT_FALSE(AllMultiParameterOk(static_cast<SETMULTIPAR*>(nullptr)));
    EXPECT_FALSE(AnyMultiParameterOk(static_cast<GETMULTIPAR*>(nullptr)));
}

} // namespace
