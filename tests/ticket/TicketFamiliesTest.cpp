// What single tickets and tickets in a container have in common, on both of them.
#include "ticket/TicketFamilies.h"

#include <climits>
#include <cmath>

#include <gtest/gtest.h>

#include "RealTickets.h"

namespace {

using Texts = std::vector<std::string>;

// Calls NAME on the view, with the ticket's type and id in front where it is inside a container.
#define ON(place, NAME, ...)                                                                       \
    (place).with([&](const auto& view, auto... address) {                                          \
        return view.NAME(address... __VA_OPT__(, ) __VA_ARGS__);                                   \
    })

template<class Place>
class TicketFamilies : public testing::Test {
  protected:
    Place place;
};
using Places = testing::Types<WorkTicket, TicketInside>;
TYPED_TEST_SUITE(TicketFamilies, Places);

/// The type that stands at a position; 0 where nothing does.
template<class Place>
int typeAt(const Place& place, const char* key, int position) {
    PARAM_TYPE type = PARAM_DELETE;
    place.with([&](const auto& view, auto... address) {
        return Place::Get::call(view, address..., key, PARAM_DELETE, &type, position);
    });
    return type;
}

/// Writes and reads as a vector and as an array, and looks at the type in the ticket.
template<class T, class Place>
void roundTrip(Place& place, PARAM_TYPE type, std::initializer_list<T> values) {
    SCOPED_TRACE(type);
    std::vector<T> read{*values.begin()};
    EXPECT_TRUE(ON(place, SetVectorParameter, "vector", std::vector<T>(values)));
    EXPECT_EQ(typeAt(place, "vector", static_cast<int>(values.size()) - 1), type);
    EXPECT_EQ(typeAt(place, "vector", static_cast<int>(values.size())), 0);
    EXPECT_TRUE(ON(place, GetVectorParameter, "vector", read));
    EXPECT_EQ(read, std::vector<T>(values));
    if constexpr (!std::is_same_v<T, std::string>) {
        T got[3] = {};
        EXPECT_TRUE(ON(place, SetArrayParameter, "array", values.begin(), values.size()));
        EXPECT_EQ(typeAt(place, "array", 0), type);
        EXPECT_TRUE(ON(place, GetArrayParameter, "array", got, values.size()));
        EXPECT_TRUE(std::equal(values.begin(), values.end(), got));
    }
}

TYPED_TEST(TicketFamilies, EveryTypeComesBackAsItWent) {
    TypeParam& place = this->place;
    roundTrip<int>(place, PARAM_INT, {INT_MIN, 0, INT_MAX});
    roundTrip<unsigned int>(place, PARAM_UINT, {0, UINT_MAX});
    roundTrip<long long>(place, PARAM_INT64, {LLONG_MIN, LLONG_MAX});
    roundTrip<unsigned long long>(place, PARAM_UINT64, {ULLONG_MAX, 1});
    roundTrip<double>(place, PARAM_DOUBLE, {0.1, -HUGE_VAL, 5e-324});
    roundTrip<bool>(place, PARAM_INT, {true, false, true});
    roundTrip<std::string>(place, PARAM_STRING, {"a", "", "\xC3\xA4"});
    roundTrip<void*>(place, PARAM_POINTER, {&place, nullptr});

    // A null text is refused alone; a shorter vector replaces the longer one.
    Texts read;
    const std::vector<const char*> texts{"cyan", nullptr, "black"};
    EXPECT_FALSE(ON(place, SetVectorParameter, "texts", texts));
    EXPECT_TRUE(ON(place, GetVectorParameter, "texts", read));
    EXPECT_EQ(read, (Texts{"cyan", "black"}));
    EXPECT_TRUE(ON(place, SetArrayParameter, "texts", texts.data(), 1UL));
    EXPECT_TRUE(ON(place, GetVectorParameter, "texts", read));
    EXPECT_EQ(read, Texts{"cyan"});

    // Any integer but 0 is true, and a bool is sent as its bit 0.
    const std::vector<int> numbers{2, 0, -1};
    std::vector<bool> flags;
    EXPECT_TRUE(ON(place, SetVectorParameter, "flags", numbers));
    EXPECT_TRUE(ON(place, GetVectorParameter, "flags", flags));
    EXPECT_EQ(flags, (std::vector<bool>{true, false, true}));
    const unsigned char bytes[] = {3, 2};
    EXPECT_TRUE(ON(place, SetArrayParameter, "flags", reinterpret_cast<const bool*>(bytes), 2UL));
    EXPECT_TRUE(ON(place, GetVectorParameter, "flags", flags));
    EXPECT_EQ(flags, (std::vector<bool>{true, false}));
}

TYPED_TEST(TicketFamilies, HolesCloseUpInAVectorAndFailAnArray) {
    TypeParam& place = this->place;
    const double other = 0.5;
    SETMULTIPAR table[] = {{.key = "key", .type = PARAM_DOUBLE, .value = &other, .position = 1},
                           {}};
    EXPECT_TRUE(ON(place, SetVectorParameter, "key", std::vector<int>{10, 11, 12}));
    EXPECT_TRUE(ON(place, SetMultiParameter, table));
    std::vector<int> vector;
    EXPECT_TRUE(ON(place, GetVectorParameter, "key", vector));
    EXPECT_EQ(vector, (std::vector<int>{10, 12}));
    int array[] = {-1, -2, -3};
    bool flags[] = {false, false, false};
    EXPECT_FALSE(ON(place, GetArrayParameter, "key", array, 3UL));
    EXPECT_TRUE(array[0] == 10 && array[1] == -2 && array[2] == 12);
    EXPECT_FALSE(ON(place, GetArrayParameter, "key", flags, 3UL));
    EXPECT_FALSE(flags[0]); // all or nothing
    // Elements there, but none of this type: the vector ends up empty, texts stay as they were.
    std::vector<long long> none{7};
    Texts texts{"kept"};
    EXPECT_FALSE(ON(place, GetVectorParameter, "key", none));
    EXPECT_TRUE(none.empty());
    EXPECT_FALSE(ON(place, GetVectorParameter, "key", texts));
    EXPECT_EQ(texts, Texts{"kept"});
}

TYPED_TEST(TicketFamilies, AMissingKeyLeavesNumbersAndEmptiesTexts) {
    TypeParam& place = this->place;
    std::vector<int> vector{1, 2};
    std::vector<bool> flags{true};
    Texts names{"old"};
    std::string text = "old";
    std::string name = "old";
    EXPECT_FALSE(ON(place, GetVectorParameter, "none", vector));
    EXPECT_FALSE(ON(place, GetVectorParameter, "none", flags));
    EXPECT_TRUE(vector.size() == 2 && flags.size() == 1);
    EXPECT_FALSE(ON(place, GetFilenameVectorParameter_C, "none", names));
    EXPECT_FALSE(ON(place, GetParameter, "none", text, POSITION_WHOLE));
    EXPECT_FALSE(ON(place, GetFilenameParameterChk_C, "none", name, 0));
    EXPECT_TRUE(names.empty() && text.empty() && name.empty());
    EXPECT_EQ(ON(place, GetIntParameter, "none", 42), 42);
    EXPECT_EQ(ON(place, GetStringParameter, "none", "fallback"), "fallback");
}

TYPED_TEST(TicketFamilies, NoElementsDeleteTheKeyButForBooleanArrays) {
    TypeParam& place = this->place;
    const std::vector<int> one{1};
    EXPECT_TRUE(ON(place, SetVectorParameter, "key", one));
    EXPECT_TRUE(ON(place, SetArrayParameter, "key", static_cast<const bool*>(nullptr), 0UL));
    EXPECT_EQ(typeAt(place, "key", 0), PARAM_INT);
    EXPECT_TRUE(ON(place, SetVectorParameter, "key", Texts()));
    EXPECT_EQ(typeAt(place, "key", 0), 0);
    EXPECT_TRUE(ON(place, SetVectorParameter, "key", one));
    EXPECT_TRUE(ON(place, SetArrayParameter, "key", one.data(), 0UL));
    EXPECT_EQ(typeAt(place, "key", 0), 0);
    // A refused deletion is not looked at. Keys that end in * are refused by the engine.
    EXPECT_TRUE(ON(place, SetVectorParameter, "refused*", Texts()));
    EXPECT_FALSE(ON(place, SetVectorParameter, "refused*", one));
}

TYPED_TEST(TicketFamilies, FileNamesHaveForwardSlashesOnBothWays) {
    TypeParam& place = this->place;
    const Texts names{"C:\\jobs\\a.tif", "/jobs/b.tif"};
    const Texts slashed{"C:/jobs/a.tif", "/jobs/b.tif"};
    Texts read;
    std::string name;
    EXPECT_TRUE(ON(place, SetFilenameVectorParameter, "sent", names));
    EXPECT_TRUE(ON(place, GetVectorParameter, "sent", read));
    EXPECT_EQ(read, slashed);
    EXPECT_TRUE(ON(place, SetVectorParameter, "raw", names));
    EXPECT_TRUE(ON(place, GetFilenameVectorParameter_C, "raw", read));
    EXPECT_EQ(read, slashed);
    EXPECT_TRUE(ON(place, GetFilenameParameterChk_C, "raw", name, POSITION_WHOLE));
    EXPECT_EQ(name, slashed[0]);
}

/// Words that replace the engine's own, with what they answer. Front: what either record passes in
/// front of the key or the table.
int g_calls;
int g_answer;
unsigned long g_count;
template<class... Front>
struct Faulty {
    static int get(Front..., const char*, PARAM_TYPE type, void* out, int) {
        ++g_calls;
        if (type == PARAM_INT) {
            *static_cast<int*>(out) = 7;
        } else if (type == PARAM_COUNT) {
            *static_cast<unsigned long*>(out) = g_count;
        }
        return g_answer;
    }
    /// Nothing is put there, and each record says that something was.
    static int getTable(Front..., GETMULTIPAR* table) {
        ++g_calls;
        for (; table->key != nullptr; ++table) {
            table->result = 0xFF;
        }
        return 0;
    }
};
template<class Place>
struct FaultyFor : Faulty<void*> {};
template<>
struct FaultyFor<TicketInside> : Faulty<void*, int, int> {};

TYPED_TEST(TicketFamilies, FaultyPlugInsAreBorne) {
    TypeParam& place = this->place;
    TypeParam::Get::put(place.record, FaultyFor<TypeParam>::get);
    TypeParam::GetTable::put(place.record, FaultyFor<TypeParam>::getTable);

    // Of an answer bit 0 counts. A text that is said to be there and is null is missing.
    g_answer = 0xFE;
    EXPECT_EQ(ON(place, GetIntParameter, "key", 1), 1);
    g_answer = 0x101;
    EXPECT_EQ(ON(place, GetIntParameter, "key", 1), 7);
    EXPECT_EQ(ON(place, GetStringParameter, "key", "fallback"), "fallback");

    // A vector costs two calls, and null texts fall out of it.
    Texts texts{"former"};
    g_count = 1000;
    g_calls = 0;
    EXPECT_FALSE(ON(place, GetVectorParameter, "key", texts));
    EXPECT_TRUE(texts.empty());
    EXPECT_EQ(g_calls, 2);
    bool flag = false;
    EXPECT_FALSE(ON(place, GetArrayParameter, "key", &flag, 0UL));
    EXPECT_EQ(g_calls, 2);

    // Counts that can't be allocate nothing.
    for (const unsigned long count : {ULONG_MAX, ULONG_MAX / sizeof(GETMULTIPAR), 1UL << 33}) {
        g_count = count;
        std::vector<double> vector{0.5};
        EXPECT_FALSE(ON(place, GetVectorParameter, "key", vector));
        EXPECT_EQ(vector, std::vector<double>{0.5});
    }
}

} // namespace
