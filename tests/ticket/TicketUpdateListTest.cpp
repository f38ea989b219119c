// SPDX-License-Identifier: Apache-2.0
#include "AnyPlace.h"

namespace {

constexpr int id = 12;

using Entries = std::map<TICKET_TYPE_ID, TICKET_UPDATE_LIST::ENTRY>;

/// A list's values for a ticket, in walk order.
std::string entryText(const Entries& entries, int type, int ticket) {
    const auto found = entries.find(TICKET_TYPE_ID(type, ticket));
    return found == entries.end() ? "none" : support::ticketText(found->second.ticket);
}

class UpdateList : public AnyPlace {
  protected:
    UpdateList() : list(&server.record) {
        server.create(id, "a=1,2,3,4 s[-1]='old s[1]='older d[-1]=0.5 u[-1]=u9");
    }

    Server server;
    TICKET_UPDATE_LIST list;
};

IN_ANY_PLACE(UpdateList);

TEST(UpdateListAddress, IsRealVirtualOrLocal) {
    const struct {
        int type, id;
        bool valid;
        int filedUnder;
    } cases[] = {
        {49, 16777215, true, 49}, {50, 0, false, 50},      {1000, 0, true, 1000},
        {-1, 0, false, -1},       {3, 16777216, false, 3}, {3, -1, false, 3},
        {3, -4, true, 3},         {3, -2000, true, 3},     {50, -9999, true, -1},
        {1000, -2000, true, -1},  {3, -1999, false, 3},    {3, -10000, false, 3},
    };
    for (auto [type, ticket, valid, filedUnder] : cases) {
        EXPECT_EQ(TICKET_UPDATE_LIST::TicketValid(type, ticket), valid) << type << ", " << ticket;
        EXPECT_EQ(type, filedUnder) << ticket;
    }
    TICKET_UPDATE_LIST::nextID = -2001;
    for (const int next : {-2001, -2000, -9999}) {
        EXPECT_EQ(TICKET_UPDATE_LIST::NextTicketID(), next);
    }
}

TEST_P(UpdateList, OverlaysTheServersValues) {
    const struct {
        const char* edits;
        int position;
        int found, value;
    } cases[] = {
        {"", -1, 0, 7},
        {"a[-1]=9", -1, 1, 9},
        {"a[-1]=9", 1, 0, 7},
        {"a[-1]=-", -1, 2, 7},
        {"a[-1]=- a[-1]=3", -1, 1, 3},
        {"a[-1]=- a[-1]=3", 1, 0, 7}, // No longer deleted.
    };
    for (const auto& [edits, position, found, expected] : cases) {
        SCOPED_TRACE(std::string(edits) + " " + std::to_string(position));
        list.Clear();
        edit(list, jobs, id, edits);
        int value = 7;
        EXPECT_EQ(list.xGetParameter(jobs, id, "a", PARAM_INT, &value, position), found);
        EXPECT_EQ(value, expected);
        // Without a place for the value, reads find nothing but still report a deletion.
        EXPECT_EQ(list.xGetParameter(jobs, id, "a", PARAM_INT, nullptr, position),
                  found == 2 ? 2 : 0);
        std::set<std::string> keys;
        EXPECT_EQ(list.GetChangedKeysList(jobs, id, keys), edits[0] != '\0');
        EXPECT_EQ(list.ParameterChanged(jobs, id, "a"), keys.contains("a"));
        EXPECT_EQ(list.ParameterExists(jobs, id, "a"), keys.contains("a") && found != 2);
    }
    edit(list, jobs, id, "a[-1]=-");
    std::vector<int> values{5};
    EXPECT_EQ(list.xGetVectorParameter(jobs, id, "a", values), 1); // Nothing was read.
    EXPECT_EQ(values, std::vector<int>{5});
}

TEST_P(UpdateList, KeepsWhatDeletionsTakeAway) {
    const std::pair<const char*, const char*> cases[] = {
        {"a[2]=- a[1]=-", "a[0]=3 a[1]=2"},
        {"a[2]=- a[-1]=-", "a[0]=1"}, // Replaces the kept values.
        {"s[-1]=- d[-1]=- u[-1]=-", "d[0]=0.5 s[0]='old"},
        {"a[0]=9", "none"},
    };
    for (const auto& [edits, kept] : cases) {
        list.Clear();
        EXPECT_TRUE(edit(list, jobs, id, edits));
        EXPECT_EQ(entryText(list.m_toDelete, jobs, id), kept) << edits;
    }
    edit(list, jobs, id, "a[0]=-");
    std::vector<int> values;
    EXPECT_EQ(list.xGetDeletedVectorParameter(jobs, id, "a", values), 1);
    EXPECT_EQ(values, std::vector<int>{1}); // The server's values.
    EXPECT_EQ(list.xGetDeletedVectorParameter(jobs, id, "other", values), 1);
    EXPECT_EQ(list.xGetDeletedVectorParameter(jobs, 13, "a", values), 0);

    TICKET_UPDATE_LIST lone(nullptr); // There are no originals.
    EXPECT_TRUE(edit(lone, jobs, id, "a[0]=9 s[-1]=-"));
    EXPECT_EQ(entryText(lone.m_changed, jobs, id), "a[0]=9");
}

TEST_P(UpdateList, CountsAsEmptyByKeptValuesAlone) {
    edit(list, jobs, id, "a[-1]=-");
    edit(list, jobs, 13, "k[-1]=1");
    EXPECT_TRUE(list.Clear(jobs, id));
    EXPECT_TRUE(list.m_empty && !list.IsEmpty(jobs, 13));
    edit(list, jobs, 14, "k[-1]=1");
    for (const int last : {13, 14}) { // No deleted values kept for these, so changes count.
        EXPECT_FALSE(list.Clear(jobs, last));
        EXPECT_EQ(list.m_empty, last == 14);
    }
}

TEST_P(UpdateList, TellsOfEachChange) {
    std::string told;
    list.RegisterSetParamCallback(
        [&](int type, int ticket, const char* key, PARAM_TYPE ptype, const void* value) {
            told += std::to_string(type) + "/" + std::to_string(ticket) + " " + key + " " +
                    std::to_string(ptype) + " " + support::valueText(ptype, value) + ";";
        });
    list.AddParameter(jobs, id, "m", "\x80", true);          // MacRoman; reported as UTF-8.
    EXPECT_FALSE(list.DelParameter(jobs, id, "a", 7, true)); // Refused, but reported.
    list.SetFilenameVectorParameter(jobs, id, "n", {"a\\b", "\x80"}); // Reported once.
    EXPECT_EQ(told, "3/12 m 4 '\xC3\x84;3/12 a 0 -;3/12 n 6 null;");
    EXPECT_EQ(entryText(list.m_changed, jobs, id).substr(28),
              "m[0]='\xC3\x84 n[0]='a/b n[1]='\xC3\x84");

    // A returned text belongs to the list and lives as long.
    const char* text = nullptr;
    EXPECT_EQ(list.xGetParameter(jobs, id, "n", PARAM_STRING, &text, 0), 1);
    EXPECT_STREQ(text, "a/b");
    EXPECT_EQ(text, list.m_stringCache["a/b"]);
}

TEST_P(UpdateList, RefusesWithoutATrace) {
    list.m_translate = [](void*, std::string&, const char*) { return 2; };
    EXPECT_FALSE(edit(list, jobs, id, "s[-1]='x"));
    EXPECT_FALSE(edit(list, 51, id, "a[-1]=1"));
    EXPECT_FALSE(list.xSetParameter(1000, id, nullptr, PARAM_DELETE, nullptr, 0, false));
    const auto* factory = std::exchange(hSTicketInstance, nullptr);
    EXPECT_FALSE(edit(list, jobs, 14, "a[-1]=1"));
    hSTicketInstance = factory;
    EXPECT_TRUE(list.IsEmpty(1000, id));
    EXPECT_EQ(list.m_changed.size(), 1u); // The null key's entry, which is empty.
    // A numeric type without a value is a deletion, which the work ticket refuses.
    EXPECT_FALSE(list.xSetParameter(jobs, id, "a", PARAM_INT, nullptr, -1, false));
    EXPECT_EQ(list.xGetParameter(jobs, id, "a", PARAM_INT, nullptr, -1), 2);
}

TEST_P(UpdateList, MergesATicketAsItIsWalked) {
    const WorkTicket source("ab[-1]=1 abc[-1]=2 b[-1]=3");
    int told = 0;
    list.RegisterSetParamCallback([&](int, int, const char*, PARAM_TYPE, const void*) { ++told; });
    const char* const keys[] = {"ab*", nullptr};
    list.Merge(jobs, 13, source.real(), keys);
    EXPECT_EQ(entryText(list.m_changed, jobs, 13), "ab[0]=1 abc[0]=2");
    STICKET_ACCESS odd{}; // A plug-in's walk that shows a value with a null key.
    ticket::single::Walk::put(
        odd, +[](void*, SCollect show, void* context, const char*, int) {
            static const int value = 1;
            return show(context, nullptr, PARAM_INT, &value, 0) ? 1 : 0;
        });
    list.Merge(jobs, 13, &odd, keys);
    EXPECT_EQ(entryText(list.m_changed, jobs, 13), "ab[0]=1 abc[0]=2");
    list.Merge(jobs, 13, source.real(), PARTIAL_MODE());
    list.Merge(jobs, 13, nullptr, PARTIAL_MODE());
    EXPECT_EQ(entryText(list.m_changed, jobs, 13), "ab[0]=1 abc[0]=2 b[0]=3");
    EXPECT_EQ(told, 5);
}

} // namespace
