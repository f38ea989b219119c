#include "ticket/ParameterList.h"

#include <cmath>
#include <limits>
#include <sstream>

#include <gtest/gtest.h>

#include "RealTickets.h"
#include "text/MathLib.h"

namespace {

template<class T>
const T& valueOf(const SETMULTIPAR& record) {
    return *static_cast<const T*>(record.value);
}

/// A table in words: key, type, position, value. "null" where there is none.
std::string wordsOf(const SETMULTIPAR* record) {
    std::ostringstream words;
    words << (record == nullptr ? "null" : "");
    for (; record != nullptr && record->key != nullptr; ++record) {
        words << record->key << ':' << record->type << '@' << record->position << '=';
        const auto show = [&](PARAM_TYPE type, auto get) {
            if (record->type == type) {
                words << get(*record);
            }
        };
        show(PARAM_INT, valueOf<int>);
        show(PARAM_DOUBLE, valueOf<double>);
        show(PARAM_STRING, [](auto& r) { return static_cast<const char*>(r.value); });
        show(PARAM_BINARY, [](auto& r) { return valueOf<BIN_STRING>(r).length; });
        show(PARAM_INT64, valueOf<long long>);
        show(PARAM_UINT, valueOf<unsigned int>);
        show(PARAM_UINT64, valueOf<unsigned long long>);
        words << ' ';
    }
    return words.str();
}

/// Adds one value of each type that has one, from variables that are gone afterwards.
template<class Set>
void addEach(Set set) {
    char key[] = "k";
    char text[] = "text";
    const int number = -5;
    const double real = 0.25;
    const std::string bytes("a\0b", 3);
    const BIN_STRING binary = bytes;
    const long long wide = -1LL << 40;
    const unsigned int natural = 4'000'000'000U;
    const unsigned long long widest = ~0ULL;
    const void* values[] = {key, &number, &real, text, &binary, nullptr, &wide, &natural, &widest};
    for (int type = PARAM_POINTER; type <= PARAM_UINT64; ++type) {
        set(key, static_cast<PARAM_TYPE>(type), values[type - 1], type - 1);
    }
    key[0] = text[0] = 'X';
}

TEST(ParameterList, OwnsEveryKeyAndValue) {
    SETMULTIPAR_LIST list(false);
    EXPECT_EQ(wordsOf(list.Table(false)) + wordsOf(list.Table(true)), "nullnull");
    addEach([&](auto... record) { EXPECT_TRUE(list.xSetParameter(record...)); });
    EXPECT_EQ(wordsOf(list.Table(false)),
              "k:1@0= k:2@1=-5 k:3@2=0.25 k:4@3=text k:5@4=3 k:6@5= k:7@6=-1099511627776 "
              "k:8@7=4000000000 k:9@8=18446744073709551615 ");
    const auto& binary = valueOf<BIN_STRING>(list.Table(false)[4]);
    EXPECT_EQ(std::string(binary.begin(), binary.end()), std::string("a\0b", 3));
    // The real engine takes them as they stand, an empty binary too.
    const BIN_STRING empty;
    list.xSetParameter("empty", PARAM_BINARY, &empty, POSITION_WHOLE);
    const WorkTicket work;
    EXPECT_TRUE(work.view().SetMultiParameter(list.Table(false)));
    for (unsigned long i = 0; i < list.Size(); ++i) {
        EXPECT_EQ(list.Table(false)[i].ok(), list.Table(false)[i].type != PARAM_COUNT) << i;
    }
}

TEST(ParameterList, AWalksValuesAreCopiedAsDeepAsTheListIs) {
    SETMULTIPAR_LIST deep(true);
    addEach([&](auto... record) { EXPECT_TRUE(deep.ySetParameter(record...)); });
    EXPECT_EQ(wordsOf(deep.Table(false)).substr(0, 32), "k:1@-1= k:2@1=-5 k:3@2=0.25 k:4@");
    deep.Clear();
    EXPECT_TRUE(deep.m_deep);
    EXPECT_EQ(wordsOf(deep.Table(false)), "null");
    EXPECT_FALSE(deep.ParameterExists("k"));

    SETMULTIPAR_LIST shallow(false);
    std::vector<const void*> given;
    addEach([&](const char* key, PARAM_TYPE type, const void* value, int position) {
        shallow.ySetParameter(key, type, value, position);
        given.push_back(value);
    });
    const SETMULTIPAR* table = shallow.Table(false);
    for (int i = 0; i < 9; ++i) {
        const bool copied = table[i].type == PARAM_INT || table[i].type == PARAM_BINARY;
        EXPECT_EQ(table[i].value != given[static_cast<std::size_t>(i)], copied) << table[i].type;
    }
    EXPECT_EQ(valueOf<int>(table[1]), -5);
}

TEST(ParameterList, EqualOnesAreStoredOnceAndNoNumbersAreOneConstant) {
    SETMULTIPAR_LIST list(true);
    for (const std::string key : {"one", "two", "one"}) {
        list.xSetParameter(key.c_str(), PARAM_STRING, std::string("value").c_str(), -1);
    }
    for (const double value : {std::nan("1"), HUGE_VAL, -HUGE_VAL, 1e308}) {
        list.xSetParameter("one", PARAM_DOUBLE, &value, POSITION_APPEND);
    }
    const SETMULTIPAR* table = list.Table(false);
    EXPECT_EQ(table[0].key, table[2].key);
    EXPECT_NE(table[0].key, table[1].key);
    EXPECT_EQ(table[0].value, table[1].value);
    for (int i = 3; i < 6; ++i) {
        EXPECT_EQ(table[i].value, &MathLib::NOT_A_DOUBLE_NUMBER) << i;
    }
    EXPECT_EQ(valueOf<double>(table[6]), 1e308);
}

TEST(ParameterList, TableSortsByKeyAndKeepsTheOrderWithinAKey) {
    SETMULTIPAR_LIST list(false);
    const auto add = [&](const char* key, int value, int position) {
        list.xSetParameter(key, PARAM_INT, &value, position);
    };
    add("b", 1, -1);
    add("b", 2, 1);
    add("a", 3, -1);
    add("b", 4, 0);
    EXPECT_EQ(wordsOf(list.Table(false)), "b:2@-1=1 b:2@1=2 a:2@-1=3 b:2@0=4 ");
    EXPECT_EQ(list.Table(false), list.Table(false));
    EXPECT_EQ(wordsOf(list.Table(true)), "a:2@-1=3 b:2@-1=1 b:2@1=2 b:2@0=4 ");
    EXPECT_EQ(list.Table(false), list.Table(true));
    // A newcomer goes behind what is sorted, and the next sort finds it.
    list.DelParameter("a", -1);
    EXPECT_EQ(wordsOf(list.Table(false)), "a:2@-1=3 b:2@-1=1 b:2@1=2 b:2@0=4 a:0@-1= ");
    EXPECT_EQ(wordsOf(list.Table(true)), "a:2@-1=3 a:0@-1= b:2@-1=1 b:2@1=2 b:2@0=4 ");
    // A missing key ends a table; sorted, it takes nothing with it.
    list.Clear();
    add(nullptr, 1, -1);
    add("\xC3\xA4", 2, -1);
    add("z", 3, -1);
    EXPECT_EQ(wordsOf(list.Table(false)), "");
    EXPECT_EQ(wordsOf(list.Table(true)), "z:2@-1=3 \xC3\xA4:2@-1=2 ");
    EXPECT_EQ(list.Size(), 3u);
    list.DelParameter("deleted", -1);
    EXPECT_TRUE(list.ParameterExists("deleted") && !list.ParameterExists(nullptr));
}

TEST(ParameterList, ReplacesAKeyByTexts) {
    SETMULTIPAR_LIST list(false);
    EXPECT_TRUE(list.SetVectorParameter("v", std::vector<std::string>{"x", "y"}));
    EXPECT_TRUE(list.SetFilenameVectorParameter("f", {"a\\b"}));
    EXPECT_EQ(wordsOf(list.Table(false)), "v:0@-1= v:4@-2=x v:4@-2=y f:0@-1= f:4@-2=a/b ");
}

TEST(ParameterList, CollectsFromATicket) {
    const WorkTicket work;
    work.view().SetVectorParameter("ab", std::vector<int>{1, 2});
    work.view().SetVectorParameter("abc", std::vector<int>{3});
    work.view().SetVectorParameter("B", std::vector<int>{4});
    const std::string all = "B:2@-1=4 ab:2@-1=1 ab:2@1=2 abc:2@-1=3 ";
    const char* const prefix[] = {"ab*", nullptr};
    const char* const exact[] = {"ab", nullptr};
    const char* const nothing[] = {nullptr};
    const char* const subtraction[] = {"", "ab", nullptr};
    const std::tuple<const char* const*, std::string, std::string> cases[] = {
        {nullptr, all, all},
        {nothing, all, all},
        {prefix, all.substr(9), all.substr(9)},
        {exact, all.substr(9, 19), all.substr(9, 19)},
        {subtraction, "null", all}, // the table filters, the mode it makes does not
    };
    for (const auto& [keys, byTable, byMode] : cases) {
        SETMULTIPAR_LIST list(true);
        list.Merge(work.real(), keys);
        EXPECT_EQ(wordsOf(list.Table(false)), byTable);
        list.Clear();
        list.Merge(work.real(), PARTIAL_MODE(keys));
        EXPECT_EQ(wordsOf(list.Table(false)), byMode);
    }
    SETMULTIPAR_LIST list(true);
    list.Merge(nullptr, prefix);
    list.Merge(nullptr, PARTIAL_MODE());
    list.MergeIf(nullptr, [](const char*) { return true; });
    list.MergeIf(work.real(), nullptr);
    EXPECT_EQ(list.Size(), 0u);
    // Each call finds the predicate as it was given: a count that it keeps never grows.
    list.MergeIf(work.real(), [calls = 0](const char* key) mutable {
        return ++calls == 1 && std::string_view(key) != "B";
    });
    EXPECT_EQ(wordsOf(list.Table(false)), all.substr(9));
}

// A walk that shows types which carry no value, as the engine never does.
TEST(ParameterList, OnlyMergeIfTakesTypesWithoutValues) {
    STICKET_ACCESS odd{};
    ticket::single::Walk::put(
        odd, +[](void*, SCollect show, void* context, const char* text, int number) {
            EXPECT_TRUE(std::string_view(text).empty() && number == 8000);
            addEach([&](auto... record) { EXPECT_TRUE(show(context, record...)); });
            EXPECT_TRUE(show(context, "k", PARAM_DELETE, nullptr, 0));
            EXPECT_TRUE(show(context, "k", static_cast<PARAM_TYPE>(10), nullptr, 0));
            return 0;
        });
    const char* const keys[] = {"k*", nullptr};
    SETMULTIPAR_LIST all(true);
    SETMULTIPAR_LIST filtered(true);
    SETMULTIPAR_LIST chosen(true);
    all.Merge(&odd, nullptr);
    filtered.Merge(&odd, keys);
    chosen.MergeIf(&odd, [](const char*) { return true; });
    EXPECT_EQ(all.Size(), 8u);
    EXPECT_EQ(wordsOf(all.Table(false)), wordsOf(filtered.Table(false)));
    EXPECT_EQ(chosen.Size(), 11u);
}

TEST(ParameterList, WorksBehindAnOpaquePointer) {
    void* list = MultiParListCreate();
    EXPECT_TRUE(MultiParListSetParameter(list, "b", PARAM_DELETE, nullptr, 0));
    EXPECT_TRUE(MultiParListSetParameter(list, "a", PARAM_DELETE, nullptr, 0));
    EXPECT_STREQ(MultiParListTable(list, 2)[0].key, "b"); // bit 0 asks for sorting
    EXPECT_STREQ(MultiParListTable(list, 3)[0].key, "a");
    MultiParListDestroy(&list);
    MultiParListDestroy(&list); // is null by now
    MultiParListDestroy(nullptr);
    EXPECT_TRUE(MultiParListSize(list) == 0 && MultiParListTable(list, 1) == nullptr);
    EXPECT_FALSE(MultiParListSetParameter(list, "a", PARAM_DELETE, nullptr, 0));
}

TEST(BinStringBuffer, ACopyViewsItsOwnBytes) {
    const BIN_STRING_BUFFER buffer(BIN_STRING(std::string("bytes")));
    const BIN_STRING_BUFFER copy(buffer);
    EXPECT_NE(copy.BinString()->begin(), buffer.BinString()->begin());
    EXPECT_EQ(std::string(copy.BinString()->begin(), copy.BinString()->end()), "bytes");
    EXPECT_FALSE(buffer < copy || copy < buffer);
}

TEST(ParameterCaches, KeepManyNumbersOnceAndInTheirPlaces) {
    constexpr int count = 10'000;
    VALCACHE<double> cache;
    std::vector<const double*> places;
    const auto stored = [&](double value) {
        const double* place = &value;
        return cache(place);
    };
    // Numbers that differ in their first bits only, in their last only, and in sign.
    const auto number = [](int i) { return std::ldexp(i % 2 == 0 ? 1 + i * 1e-15 : -1, i % 997); };
    for (int i = 0; i < count; ++i) {
        places.push_back(stored(number(i)));
    }
    for (int i = 0; i < count; ++i) {
        ASSERT_EQ(*places[static_cast<std::size_t>(i)], number(i));
        ASSERT_EQ(stored(number(i)), places[static_cast<std::size_t>(i)]) << i;
    }
    const double* zero = stored(0.0);
    EXPECT_EQ(stored(-0.0), zero);
    EXPECT_FALSE(std::signbit(*zero));
    cache.clear();
    EXPECT_TRUE(std::signbit(*stored(-0.0)));
}

} // namespace
