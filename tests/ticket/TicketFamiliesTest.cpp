// SPDX-License-Identifier: Apache-2.0
// Common behaviour of single tickets and tickets in a container, tested on both.
#include "ticket/TicketFamilies.h"

#include <climits>
#include <cmath>

#include "RealTickets.h"

namespace {

using Texts = std::vector<std::string>;

// Calls NAME on the view, preceded by the ticket's type and id if it is inside a container.
#define ON(place, NAME, ...)                                                                       \
    (place).with([&](const auto& view, auto... address) {                                          \
        return view.NAME(address... __VA_OPT__(, ) __VA_ARGS__);                                   \
    })

template<class Place>
struct TicketFamilies : testing::Test {
    Place place;
};
using Places = testing::Types<WorkTicket, TicketInside>;
TYPED_TEST_SUITE(TicketFamilies, Places);

/// Writes as a vector and as an array, checks the ticket's content, and reads it back.
template<class T, class Place>
void roundTrip(Place& place, const std::vector<T>& values, const std::string& text) {
    std::vector<T> read;
    EXPECT_TRUE(ON(place, SetVectorParameter, "k", values));
    EXPECT_EQ(place.content(), text);
    EXPECT_TRUE(ON(place, GetVectorParameter, "k", read));
    EXPECT_EQ(read, values);
    if constexpr (!std::is_same_v<T, std::string>) {
        T array[3] = {};
        EXPECT_TRUE(ON(place, GetArrayParameter, "k", array, values.size()));
        EXPECT_TRUE(std::equal(values.begin(), values.end(), array));
        EXPECT_TRUE(ON(place, DelParameter, "k", POSITION_WHOLE));
        EXPECT_TRUE(ON(place, SetArrayParameter, "k", array, values.size()));
        EXPECT_EQ(place.content(), text);
    }
}

TYPED_TEST(TicketFamilies, EveryTypeComesBackAsItWent) {
    TypeParam& place = this->place;
    roundTrip<int>(place, {INT_MIN, 0, INT_MAX}, "k[0]=-2147483648 k[1]=0 k[2]=2147483647");
    roundTrip<unsigned int>(place, {0, UINT_MAX}, "k[0]=u0 k[1]=u4294967295");
    roundTrip<long long>(place, {LLONG_MIN}, "k[0]=l-9223372036854775808");
    roundTrip<unsigned long long>(place, {ULLONG_MAX, 1}, "k[0]=U18446744073709551615 k[1]=U1");
    roundTrip<double>(place, {0.25, -HUGE_VAL}, "k[0]=0.25 k[1]=-inf");
    roundTrip<bool>(place, {true, false, true}, "k[0]=1 k[1]=0 k[2]=1");
    roundTrip<std::string>(place, {"a", "", "\xC3\xA4"}, "k[0]='a k[1]=' k[2]='\xC3\xA4");
    roundTrip<void*>(place, {nullptr, reinterpret_cast<void*>(7)}, "k[0]=p0 k[1]=p7");

    // Only the null text is refused.
    EXPECT_FALSE(ON(place, SetVectorParameter, "k", std::vector<const char*>{"c", nullptr, "k"}));
    EXPECT_EQ(place.content(), "k[0]='c k[2]='k");
    // A bool is sent as its bit 0. Any integer but 0 is true.
    const unsigned char bytes[] = {3, 2};
    EXPECT_TRUE(ON(place, SetArrayParameter, "k", reinterpret_cast<const bool*>(bytes), 2UL));
    EXPECT_EQ(place.content(), "k[0]=1 k[1]=0");
    place.send("k=2,0,-1");
    std::vector<bool> flags;
    EXPECT_TRUE(ON(place, GetVectorParameter, "k", flags));
    EXPECT_EQ(flags, (std::vector<bool>{true, false, true}));
}

TYPED_TEST(TicketFamilies, HolesCloseUpInAVectorAndFailAnArray) {
    TypeParam& place = this->place;
    place.send("key=10,0.5,12");
    std::vector<int> vector;
    EXPECT_TRUE(ON(place, GetVectorParameter, "key", vector));
    EXPECT_EQ(vector, (std::vector<int>{10, 12}));
    int array[] = {-1, -2, -3};
    bool flags[] = {false, false, false};
    EXPECT_FALSE(ON(place, GetArrayParameter, "key", array, 3UL));
    EXPECT_TRUE(array[0] == 10 && array[1] == -2 && array[2] == 12);
    EXPECT_FALSE(ON(place, GetArrayParameter, "key", flags, 3UL));
    EXPECT_FALSE(flags[0]); // all or nothing
    // Elements of another type only: the vector is emptied, but texts are unchanged.
    std::vector<long long> none{7};
    Texts texts{"kept"};
    EXPECT_FALSE(ON(place, GetVectorParameter, "key", none));
    EXPECT_FALSE(ON(place, GetVectorParameter, "key", texts));
    EXPECT_TRUE(none.empty() && texts == Texts{"kept"});
}

TYPED_TEST(TicketFamilies, AMissingKeyLeavesNumbersAndEmptiesTexts) {
    TypeParam& place = this->place;
    std::vector<bool> flags{true};
    Texts names{"old"};
    std::string text = "old";
    std::string name = "old";
    EXPECT_FALSE(ON(place, GetVectorParameter, "none", flags));
    EXPECT_FALSE(ON(place, GetFilenameVectorParameter_C, "none", names));
    EXPECT_FALSE(ON(place, GetParameter, "none", text, POSITION_WHOLE));
    EXPECT_FALSE(ON(place, GetFilenameParameterChk_C, "none", name, 0));
    EXPECT_TRUE(flags.size() == 1 && names.empty() && text.empty() && name.empty());
    EXPECT_EQ(ON(place, GetIntParameter, "none", 42), 42);
    EXPECT_EQ(ON(place, GetStringParameter, "none", "fallback"), "fallback");
}

TYPED_TEST(TicketFamilies, NoElementsDeleteTheKeyButForBooleanArrays) {
    TypeParam& place = this->place;
    place.send("a[-1]=1 b[-1]=2 c[-1]=3");
    EXPECT_TRUE(ON(place, SetVectorParameter, "a", Texts()));
    EXPECT_TRUE(ON(place, SetArrayParameter, "b", static_cast<const int*>(nullptr), 0UL));
    EXPECT_TRUE(ON(place, SetArrayParameter, "c", static_cast<const bool*>(nullptr), 0UL));
    EXPECT_EQ(place.content(), "c[0]=3");
    // The result of a deletion is ignored. The engine refuses keys that end with *.
    EXPECT_TRUE(ON(place, SetVectorParameter, "refused*", Texts()));
    EXPECT_FALSE(ON(place, SetVectorParameter, "refused*", std::vector<int>{1}));
}

TYPED_TEST(TicketFamilies, FileNamesHaveForwardSlashesOnBothWays) {
    TypeParam& place = this->place;
    EXPECT_TRUE(ON(place, SetFilenameVectorParameter, "sent", Texts{"C:\\a.tif", "/b.tif"}));
    EXPECT_EQ(place.content(), "sent[0]='C:/a.tif sent[1]='/b.tif");
    place.send("raw[-1]='C:\\a.tif raw[1]='/b.tif");
    Texts read;
    std::string name;
    EXPECT_TRUE(ON(place, GetFilenameVectorParameter_C, "raw", read));
    EXPECT_EQ(read, (Texts{"C:/a.tif", "/b.tif"}));
    EXPECT_TRUE(ON(place, GetFilenameParameterChk_C, "raw", name, POSITION_WHOLE));
    EXPECT_EQ(name, "C:/a.tif");
}

} // namespace
