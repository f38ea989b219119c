// SPDX-License-Identifier: Apache-2.0
#include "store/KeyBytes.h"

#include <gtest/gtest.h>

#include "TicketText.h"
#include "store/tickets/TicketContent.h"

TEST(KeyBytes, AreTheDocumentedOnes) {
    store::TicketContent content;
    content.apply(support::RecordTable("k=1,258,-1 k[5]='hi").records());
    EXPECT_EQ(store::keyBytes(*content.find("k")),
              support::bytesOf("01 02 03000000 01000000 02010000 ffffffff 00 02000000"
                               "04 01000000 0200000000000000 6869"));
}

TEST(KeyBytes, RefusesWhatItWouldNotHaveWritten) {
    for (const std::string hexadecimal : {
             "", "01",
             "02 02 01000000 01000000",                      // another version
             "01 06 01000000 0100000000000000",              // a count
             "01 0a 01000000 01000000",                      // an unknown type
             "01 02 01000000 010000",                        // an int cut short
             "01 02 ffffffff 01000000",                      // more than there is
             "01 02 00000000",                               // an empty run
             "01 00 05000000",                               // a gap at the end
             "01 00 ffffff00 02 02000000 01000000 01000000", // beyond the last position
             "01 04 01000000 ffffffffffffffff 61",           // a text longer than the rest
             "01 04 01000000 0200000000000000 61",           // longer by one byte
             "01 04 01000000 0300000000000000 610062",       // a text with a zero byte
             "01 02 01000000 01000000 ff",                   // extra bytes at the end
         }) {
        EXPECT_EQ(store::elementsFromBytes(support::bytesOf(hexadecimal)), nullptr) << hexadecimal;
    }
}
