#include "ticket/TicketUpdateList.h"

#include <gtest/gtest.h>

#include "Server.h"

namespace {

constexpr int id = 12;

class UpdateList : public testing::Test {
  protected:
    UpdateList()
        : m_engine(std::make_shared<store::MemoryKeep>()), record(*m_engine.access()),
          list(&record) {
        hSTicketInstance = store::ticketFactory();
        m_engine.createWithKeys(jobs, id, nullptr);
        support::RecordTable table("a=1,2,3,4 s[-1]='old s[1]='older d[-1]=0.5 u[-1]=u9");
        m_engine.apply(jobs, id, table.records());
        TICKET_UPDATE_LIST::nextID = -9999;
        takeUpdateLog();
    }
    ~UpdateList() override { TICKET_UPDATE_LIST::nextID = -9999; }

    bool set(const char* key, int value, int position = POSITION_WHOLE) {
        return list.xSetParameter(jobs, id, key, PARAM_INT, &value, position, true);
    }
    template<class T>
    std::vector<T> deleted(const char* key) {
        std::vector<T> values;
        list.xGetDeletedVectorParameter(jobs, id, key, values);
        return values;
    }

    store::TicketContainer m_engine;
    MTICKET_ACCESS record;
    TICKET_UPDATE_LIST list;
};

TEST_F(UpdateList, TakesRealVirtualAndLocalAddresses) {
    struct Case {
        int type, id;
        bool valid;
        int filedUnder;
    };
    const Case cases[] = {
        {49, 16777215, true, 49}, {50, 0, false, 50},      {1000, 0, true, 1000},
        {51, 0, false, 51},       {3, 16777216, false, 3}, {3, -1, false, 3},
        {3, -4, true, 3},         {3, -2000, true, 3},     {50, -9999, true, -1},
        {1000, -2000, true, -1},  {3, -1999, false, 3},    {3, -10000, false, 3},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(std::to_string(c.type) + ", " + std::to_string(c.id));
        int type = c.type;
        EXPECT_EQ(TICKET_UPDATE_LIST::TicketValid(type, c.id), c.valid);
        EXPECT_EQ(type, c.filedUnder);
    }

    EXPECT_EQ(TICKET_UPDATE_LIST::NextTicketID(), -9999);
    TICKET_UPDATE_LIST::nextID = -2001;
    EXPECT_EQ(TICKET_UPDATE_LIST::NextTicketID(), -2001);
    EXPECT_EQ(TICKET_UPDATE_LIST::NextTicketID(), -2000);
    EXPECT_EQ(TICKET_UPDATE_LIST::NextTicketID(), -9999);

    list.DelParameter(50, -9000, "k", -1, false);
    set("a", 1);
    std::vector<TICKET_TYPE_ID> tickets(1, TICKET_TYPE_ID(0, 0));
    list.GetChangedTickets(tickets);
    ASSERT_EQ(tickets.size(), 3u);
    EXPECT_EQ(tickets[1].type, -1);
    EXPECT_EQ(tickets[2].id, id);
}

TEST_F(UpdateList, OverlaysTheServersValues) {
    int value = 7;
    EXPECT_EQ(list.xGetParameter(jobs, id, "a", PARAM_INT, &value, -1), 0);
    EXPECT_TRUE(list.IsEmpty(jobs, id));

    EXPECT_TRUE(set("a", 9));
    EXPECT_EQ(list.xGetParameter(jobs, id, "a", PARAM_INT, &value, -1), 1);
    EXPECT_EQ(value, 9);
    EXPECT_EQ(list.xGetParameter(jobs, id, "a", PARAM_INT, nullptr, -1), 0);
    EXPECT_EQ(list.xGetParameter(jobs, id, "a", PARAM_INT, &value, 1), 0);
    EXPECT_TRUE(list.ParameterExists(jobs, id, "a"));
    EXPECT_FALSE(list.ParameterExists(jobs, id, nullptr));

    EXPECT_TRUE(list.DelParameter(jobs, id, "a", -1, false));
    std::vector<int> values(1, 5);
    EXPECT_EQ(list.xGetParameter(jobs, id, "a", PARAM_INT, &value, -1), 2);
    EXPECT_EQ(list.xGetParameter(jobs, id, "a", PARAM_INT, nullptr, -1), 2);
    EXPECT_EQ(list.xGetVectorParameter(jobs, id, "a", values), 1); // And nothing was read.
    EXPECT_EQ(values, std::vector<int>(1, 5));
    EXPECT_TRUE(list.ParameterChanged(jobs, id, "a"));

    EXPECT_TRUE(set("a", 3));
    EXPECT_EQ(list.xGetParameter(jobs, id, "a", PARAM_INT, &value, -1), 1);
    EXPECT_EQ(list.xGetParameter(jobs, id, "a", PARAM_INT, &value, 1), 0); // No longer deleted.
    std::set<std::string> keys;
    EXPECT_TRUE(list.GetChangedKeysList(jobs, id, keys));
    EXPECT_EQ(keys, std::set<std::string>{"a"});
    EXPECT_FALSE(list.GetChangedKeysList(jobs, 13, keys));
    EXPECT_EQ(keys.size(), 1u);
}

TEST_F(UpdateList, FetchesTheOriginalVectorOnce) {
    set("d", 1); // The key as a whole needs no original.
    EXPECT_EQ(takeUpdateLog(), "(3, 12) d[-1] <1>\n");
    set("a", 9, 3);
    EXPECT_EQ(takeUpdateLog(), "(3, 12) a[3] <9> (got original vector)\n");
    set("a", 8, 4);
    EXPECT_EQ(takeUpdateLog(), "(3, 12) a[4] <8>\n");
    std::vector<int> values;
    EXPECT_EQ(list.xGetVectorParameter(jobs, id, "a", values), 1);
    EXPECT_EQ(values, (std::vector<int>{1, 2, 3, 9, 8}));
    // Virtual ids and local tickets have no original.
    const int value = 1;
    EXPECT_TRUE(list.xSetParameter(jobs, -9000, "a", PARAM_INT, &value, 0, false));
    EXPECT_TRUE(list.xSetParameter(1000, id, "a", PARAM_INT, &value, 0, false));
    EXPECT_EQ(takeUpdateLog(), "(3, -9000) a[0] <1>\n(1000, 12) a[0] <1>\n");
}

TEST_F(UpdateList, KeepsWhatDeletionsTakeAway) {
    list.DelParameter(jobs, id, "a", 2, false);
    list.DelParameter(jobs, id, "a", 1, false);
    list.DelParameter(jobs, id, "s", -1, false);
    list.DelParameter(jobs, id, "d", -1, false);
    list.DelParameter(jobs, id, "u", -1, false);
    EXPECT_EQ(deleted<int>("a"), (std::vector<int>{3, 2}));
    EXPECT_EQ(deleted<std::string>("s"), std::vector<std::string>{"old"});
    EXPECT_EQ(deleted<double>("d"), std::vector<double>{0.5});

    std::vector<int> none;
    EXPECT_EQ(list.xGetDeletedVectorParameter(jobs, id, "u", none), 1); // Of another type.
    EXPECT_TRUE(none.empty());
    EXPECT_EQ(list.xGetDeletedVectorParameter(jobs, 13, "a", none), 0);
    list.DelParameter(jobs, id, "a", -1, false); // As a whole, in place of what was kept.
    EXPECT_EQ(deleted<int>("a"), std::vector<int>{1});

    // Both maps had the ticket, so the flag follows the kept values alone.
    const int value = 1;
    list.xSetParameter(jobs, 13, "k", PARAM_INT, &value, -1, false);
    EXPECT_TRUE(list.Clear(jobs, id));
    EXPECT_TRUE(list.m_empty);
    EXPECT_FALSE(list.IsEmpty(jobs, 13));
    list.xSetParameter(jobs, 14, "k", PARAM_INT, &value, -1, false);
    EXPECT_FALSE(list.Clear(jobs, 13));
    EXPECT_FALSE(list.m_empty);
    EXPECT_FALSE(list.Clear(jobs, 14));
    EXPECT_TRUE(list.m_empty);
    list.DelParameter(jobs, id, "a", -1, false);
    list.Clear();
    EXPECT_EQ(list.xGetDeletedVectorParameter(jobs, id, "a", none), 0);
}

TEST_F(UpdateList, ToleratesAMissingContainer) {
    TICKET_UPDATE_LIST lone(nullptr);
    EXPECT_TRUE(lone.DelParameter(jobs, id, "a", -1, false));
    const int value = 1;
    EXPECT_TRUE(lone.xSetParameter(jobs, id, "a", PARAM_INT, &value, 0, false));
    std::vector<int> values;
    EXPECT_EQ(lone.xGetDeletedVectorParameter(jobs, id, "a", values), 1);
    EXPECT_TRUE(values.empty());
}

TEST_F(UpdateList, TellsOfEachChange) {
    list.AddParameter(jobs, id, "n", "replaced", false);
    std::string told;
    list.RegisterSetParamCallback(
        [&](int type, int ticket, const char* key, PARAM_TYPE ptype, const void* value) {
            told += std::to_string(type) + "/" + std::to_string(ticket) + " " + key + " " +
                    std::to_string(ptype) + " " + support::valueText(ptype, value) + ";";
        });
    set("a", 1);
    list.AddParameter(jobs, id, "s", "\x80", true);          // MacRoman: told as UTF-8.
    EXPECT_FALSE(list.DelParameter(jobs, id, "a", 7, true)); // Refused, and told of.
    const std::string log = takeUpdateLog();
    EXPECT_NE(log.find("a[7] <DEL> FAILED\n"), std::string::npos) << log;
    list.SetFilenameVectorParameter(jobs, id, "n", {"a\\b", "c"}); // Once, not for its parts.
    list.SetVectorParameter(jobs, id, "s", std::vector<std::string>());
    EXPECT_EQ(told, "3/12 a 2 1;3/12 s 4 '\xC3\x84;3/12 a 0 -;3/12 n 6 null;3/12 s 6 null;");
    std::vector<std::string> names;
    EXPECT_EQ(list.xGetVectorParameter(jobs, id, "n", names), 1);
    EXPECT_EQ(names, (std::vector<std::string>{"a/b", "c"}));

    // A converted text that was handed out stays at its place.
    const char* first = nullptr;
    const char* again = nullptr;
    list.xGetParameter(jobs, id, "n", PARAM_STRING, &first, 1);
    list.AddParameter(jobs, id, "m", "c", false);
    list.xGetParameter(jobs, id, "m", PARAM_STRING, &again, -1);
    EXPECT_EQ(first, again);
    EXPECT_TRUE(list.m_stringCache.find("c"));
}

TEST_F(UpdateList, RefusesWithoutATrace) {
    const auto untranslatable = [](void*, std::string&, const char*) { return 2; };
    list.m_translate = untranslatable;
    EXPECT_FALSE(list.xSetParameter(jobs, id, "s", PARAM_STRING, "x", -1, false));
    EXPECT_EQ(takeUpdateLog(), "(3, 12) s[-1] <x> UNTRANSLATEABLE\n");
    EXPECT_TRUE(list.m_changed.empty());
    list.m_translate = nullptr;
    EXPECT_TRUE(list.xSetParameter(jobs, id, "s", PARAM_STRING, "x", -1, false));
    takeUpdateLog();

    const int value = 1;
    EXPECT_FALSE(list.xSetParameter(51, id, "a", PARAM_INT, &value, -1, false));
    EXPECT_FALSE(list.xSetParameter(jobs, 13, nullptr, PARAM_INT, &value, 0, false));
    EXPECT_EQ(takeUpdateLog(), "(51, 12) a[-1] <1> INVALID\n(3, 13) (NULL)[0] <1> INVALID\n");
    EXPECT_EQ(list.m_changed.count(TICKET_TYPE_ID(jobs, 13)), 1u); // The entry is there, and empty.
    EXPECT_TRUE(list.IsEmpty(jobs, 13));

    const auto* factory = std::exchange(hSTicketInstance, nullptr);
    EXPECT_FALSE(list.xSetParameter(jobs, 14, "a", PARAM_INT, &value, -1, false));
    hSTicketInstance = factory;
    EXPECT_EQ(list.m_changed.count(TICKET_TYPE_ID(jobs, 14)), 0u);
    // A numeric type without a value is a deletion, which the work ticket refuses as such.
    EXPECT_FALSE(list.xSetParameter(jobs, id, "a", PARAM_INT, nullptr, -1, false));
    EXPECT_EQ(list.xGetParameter(jobs, id, "a", PARAM_INT, nullptr, -1), 2);
}

TEST_F(UpdateList, MergesATicketAsItIsWalked) {
    const WorkTicket source;
    for (const char* key : {"ab", "abc", "b"}) {
        const int value = 1;
        source.view().xSetParameter(key, PARAM_INT, &value, -1);
    }
    struct Case {
        std::vector<const char*> keys;
        std::set<std::string> taken;
    };
    const Case cases[] = {
        {{nullptr}, {"ab", "abc", "b"}},
        {{"ab*", nullptr}, {"ab", "abc"}},
        {{"b", nullptr}, {"b"}},
        {{"", nullptr}, {}},
    };
    for (const Case& c : cases) {
        list.Clear();
        list.Merge(jobs, 13, source.real(), c.keys.data());
        std::set<std::string> taken;
        list.GetChangedKeysList(jobs, 13, taken);
        EXPECT_EQ(taken, c.taken) << c.keys[0];
    }
    list.Clear();
    int told = 0;
    list.RegisterSetParamCallback([&](int, int, const char*, PARAM_TYPE, const void*) { ++told; });
    list.Merge(jobs, 13, source.real(), PARTIAL_MODE());
    EXPECT_EQ(told, 3);
    list.Merge(jobs, 13, nullptr, PARTIAL_MODE());
    std::set<std::string> taken;
    list.GetChangedKeysList(jobs, 13, taken);
    EXPECT_EQ(taken.size(), 3u);
}

} // namespace
