#include "comgui/KeyBytes.h"

#include "StoreTest.h"
#include "comgui/TicketContent.h"

namespace {

/// The elements of key "k" after a table.
std::shared_ptr<const store::Elements> made(const std::string& records) {
    store::TicketContent content;
    content.apply(support::RecordTable(records).records());
    return content.find("k");
}

/// What each type and position reads, and behind that all elements.
std::string shown(const store::Elements& elements) {
    store::HandedOut handedOut;
    std::string all;
    for (int type = 0; type <= 10; ++type) {
        for (int position = -3; position < 9; ++position) {
            std::uint64_t place[2] = {};
            const auto ptype = static_cast<PARAM_TYPE>(type);
            const bool found = store::readElement(&elements, ptype, place, position, handedOut);
            const bool isNumber = ptype != PARAM_STRING && ptype != PARAM_BINARY;
            all += !found ? "x" : isNumber ? std::to_string(place[0]) : "text";
        }
    }
    store::TicketContent content;
    content.put("k", std::make_shared<store::Elements>(elements));
    return all + contentText(content);
}

} // namespace

TEST(KeyBytes, BringsBackEveryTypeAndHole) {
    for (const char* records :
         {"k=1,-2,3", "k=u7", "k=l-5,l6", "k=U18446744073709551615", "k=1.5",
          "k=0.1,nan,-inf k[7]=-0.0", "k[3]='text k[4]=' k[5]=#00ff k[6]=#",
          "k[0]=u4294967295 k[1]=l-9223372036854775808 k[2]=U18446744073709551615 k[3]=p77",
          "k[0]=1 k[1]=2.5 k[2]=3 k[100]='x k[16777215]=5", "k[16777215]=1"}) {
        const auto elements = made(records);
        const auto back = store::elementsFromBytes(store::keyBytes(*elements));
        ASSERT_NE(back, nullptr) << records;
        EXPECT_EQ(shown(*back), shown(*elements)) << records;
    }
}

TEST(KeyBytes, AreTheDocumentedOnes) {
    EXPECT_EQ(store::keyBytes(*made("k=1,258,-1 k[5]='hi")),
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
             "01 00 05000000",                               // a hole at the end
             "01 00 ffffff00 02 02000000 01000000 01000000", // beyond the last position
             "01 04 01000000 ffffffffffffffff 61",           // a text longer than the rest
             "01 04 01000000 0200000000000000 61",           // ... by one byte
             "01 04 01000000 0300000000000000 610062",       // a text with a zero byte
             "01 02 01000000 01000000 ff",                   // something behind
         }) {
        EXPECT_EQ(store::elementsFromBytes(support::bytesOf(hexadecimal)), nullptr) << hexadecimal;
    }
}
