#include "comgui/KeyBytes.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <string>

#include "TicketText.h"
#include "comgui/TicketContent.h"

using support::RecordTable;

namespace {

/// The elements of key "k" after a table, and as they come back from their bytes.
std::shared_ptr<const store::Elements> made(const std::string& records) {
    store::TicketContent content;
    RecordTable table(records);
    content.apply(table.records());
    return content.find("k");
}

std::string textOf(const store::Elements& elements) {
    std::string text = std::to_string(elements.count()) + ":";
    elements.visit([&](int position, const store::Value& value) {
        text += " " + support::recordText("k", store::typeOf(value), store::valuePointer(value),
                                          position);
        return true;
    });
    return text;
}

/// What each type and position reads: 'x' for nothing, and the first bytes otherwise.
std::string readings(const store::Elements& elements) {
    store::HandedOut handedOut;
    std::string all;
    for (int type = 0; type <= 10; ++type) {
        for (int position = -3; position < 9; ++position) {
            std::uint64_t place[2] = {};
            const auto ptype = static_cast<PARAM_TYPE>(type);
            if (!store::readElement(&elements, ptype, place, position, handedOut)) {
                all += 'x';
            } else if (ptype == PARAM_STRING) {
                all += reinterpret_cast<const char*>(place[0]);
            } else if (ptype == PARAM_BINARY) {
                all += std::to_string(place[1]);
            } else {
                all += std::to_string(place[0]);
            }
            all += store::readElement(&elements, ptype, nullptr, position, handedOut) ? '!' : ' ';
        }
    }
    return all;
}

std::string bytes(const std::string& hexadecimal) {
    std::string result;
    for (std::size_t i = 0; i + 1 < hexadecimal.size();) {
        if (hexadecimal[i] == ' ') {
            ++i;
            continue;
        }
        result += static_cast<char>(std::stoi(hexadecimal.substr(i, 2), nullptr, 16));
        i += 2;
    }
    return result;
}

} // namespace

TEST(KeyBytes, BringsBackEveryTypeAndHole) {
    for (const std::string records :
         {"k=1,-2,3", "k=u7", "k=l-5,l6", "k=U18446744073709551615", "k=1.5",
          "k=0.1,nan,-inf k[7]=-0.0", "k[3]='text k[4]=' k[5]=#00ff k[6]=#",
          "k[0]=u4294967295 k[1]=l-9223372036854775808 k[2]=U18446744073709551615 k[3]=p77",
          "k[0]=1 k[1]=2.5 k[2]=3 k[100]='x k[16777215]=5", "k[16777215]=1"}) {
        const auto elements = made(records);
        const auto back = store::elementsFromBytes(store::keyBytes(*elements));
        ASSERT_NE(back, nullptr) << records;
        // Numbers of one type are read as they came, until somebody walks them.
        EXPECT_EQ(readings(*back), readings(*elements)) << records;
        EXPECT_EQ(textOf(*back), textOf(*elements));
        EXPECT_EQ(readings(*back), readings(*elements)) << records;
    }
}

TEST(KeyBytes, AreTheDocumentedOnes) {
    EXPECT_EQ(store::keyBytes(*made("k=1,258,-1 k[5]='hi")),
              bytes("01 02 03000000 01000000 02010000 ffffffff 00 02000000"
                    "04 01000000 0200000000000000 6869"));
}

TEST(KeyBytes, RefusesWhatItWouldNotHaveWritten) {
    for (const std::string hexadecimal : {
             "", "01",
             "02 02 01000000 01000000",                      // another version
             "01 06 01000000 0100000000000000",              // a count
             "01 0a 01000000 01000000",                      // an unknown type
             "01 02 01000000 010000",                        // an int cut short
             "01 02 02000000 01000000",                      // a run cut short
             "01 02 ffffffff 01000000",                      // more than there is
             "01 02 00000000",                               // an empty run
             "01 00 05000000",                               // a hole at the end
             "01 00 ffffff00 02 02000000 01000000 01000000", // beyond the last position
             "01 04 01000000 ffffffffffffffff 61",           // a text longer than the rest
             "01 04 01000000 0300000000000000 610062",       // a text with a zero byte
             "01 02 01000000 01000000 ff",                   // something behind
         }) {
        EXPECT_EQ(store::elementsFromBytes(bytes(hexadecimal)), nullptr) << hexadecimal;
    }
}
