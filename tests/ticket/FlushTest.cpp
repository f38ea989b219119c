// SPDX-License-Identifier: Apache-2.0
#include <random>

#include "AnyPlace.h"
#include "ticket/TicketDifference.h"

namespace {

class Flush : public AnyPlace {};
IN_ANY_PLACE(Flush);

/// A server that records each table sent to it.
class Recorder : public Server {
  public:
    Recorder() {
        s_recorder = this;
        ticket::container::SetMultiParameter::put(record, take);
        create(12, "a[-1]=1");
    }

    std::string sent; ///< Tables as "type/id records;".

  private:
    static int take(void*, int type, int id, SETMULTIPAR* table) {
        Recorder& self = *s_recorder;
        self.sent +=
            std::to_string(type) + "/" + std::to_string(id) + " " + support::tableText(table) + ";";
        return self.engine.apply(type, id, table) ? 1 : 0;
    }

    static inline Recorder* s_recorder = nullptr;
};

TEST_P(Flush, SendsTheDifferenceAlone) {
    const std::string each = "a[-1]=u1 b[-1]=l-2 c[-1]=U3 d[-1]=p4 e[-1]=0.5";
    const std::string other =
        "a[-1]=u4294967295 b[-1]=l-4294967298 c[-1]=U4 d[-1]=p5 e[-1]=0.25 f[-1]='text";
    const std::string unequal = "b[-1]=#00ff c[-1]=1 d[-1]=nan e[-1]=inf";
    const struct {
        std::string present, edits, sent;
    } cases[] = {
        {each, each, ""},
        {each, other, other},
        // Single elements, if they are fewer than the whole.
        {"a=1,2,3,4,5", "a[0]=9 a[4]='x", "a[0]=9 a[4]='x"},
        {"a=1,2,3", "a[3]=4 a[4]=5", "a[3]=4 a[4]=5"},
        {"a=1,2,3,4,5", "a[4]=- a[3]=-", "a[4]=- a[3]=-"},
        {"a=1,2,3,4,5", "a[1]=-", "a[-1]=1 a[1]=3 a[2]=4 a[3]=5"},
        {"a=1,2,3,4,5", "a[2]=-", "a[2]=4 a[3]=5 a[4]=-"},
        {"a=1,2,3", "a[-1]=1 a[2]=2", "a[2]=2"}, // The same value at another position.
        // A scalar is always sent whole.
        {"a[-1]=1", "a[1]=2", "a[-1]=1 a[1]=2"},
        // Far positions are counted, not walked.
        {"a[-1]=1 a[1]=2 a[16777215]=3", "a[-1]=1 a[1]=9", "a[-1]=1 a[1]=9"},
        // Deleted keys.
        {"a[-1]=1 c[-1]=3", "c[-1]=- b[-1]=- a[-1]=-", "a[-1]=- c[-1]=-"},
        {"a=1,2", "a[1]=- a[0]=-", "a[-1]=-"},
        // Values unequal to themselves are sent with the whole ticket, but not if a key is deleted.
        {unequal, "c[-1]=2", "b[-1]=#00ff c[-1]=2 d[-1]=nan e[-1]=nan"},
        {unequal, "c[-1]=-", "c[-1]=-"},
    };
    for (const auto& [present, edits, sent] : cases) {
        Recorder server;
        server.create(13, present);
        TICKET_UPDATE_LIST list(&server.record);
        edit(list, jobs, 13, edits);
        unsigned long count = 99;
        EXPECT_EQ(list.FlushToContainer(&server.record, &count, {}), !sent.empty());
        EXPECT_EQ(server.sent, sent.empty() ? "" : "3/13 " + sent + ";") << present << " " << edits;
        EXPECT_EQ(count, static_cast<unsigned long>(std::ranges::count(sent, '=')));
        EXPECT_TRUE(list.FlushToContainer(&server.record, &count, {})); // Nothing is left to send.
        EXPECT_EQ(count, 0u);
    }
}

// After a flush, the server's ticket equals a ticket with the same edits made directly. Excluded,
// since a flush can't send them: holes, infinities, the sign of zero.
TEST_P(Flush, EqualsTheEditsMadeDirectly) {
    // Few different values, so that many edits change nothing. Includes deletions.
    const char* const values[] = {"-", "-",  "-",  "1",  "2",   "3",   "1",   "2",  "3",   "'1",
                                  "-", "'2", "u1", "l1", "l-2", "U18", "1.5", "p1", "#01", "nan"};
    const char* const keys[] = {"a", "b", "ab", "c"};
    constexpr int listed = 1; // Changed through a list.
    constexpr int direct = 2;
    std::mt19937 random(1);
    const auto upTo = [&](int last) { return std::uniform_int_distribution(0, last)(random); };
    for (int round = 0; round < (inStore() ? 20 : 500); ++round) {
        Server server;
        server.create(listed, "");
        server.create(direct, "");
        TICKET_UPDATE_LIST list(&server.record);
        std::string edits;
        for (int i = 0; i < 60; ++i) {
            if (upTo(9) == 0) {
                list.FlushToContainer(&server.record, nullptr, {});
                ASSERT_EQ(server.content(listed), server.content(direct)) << edits;
                edits += "\nflush ";
            }
            const std::string key = keys[upTo(3)];
            const std::string value = values[upTo(19)];
            unsigned long count = 0;
            server.engine.get(jobs, direct, key.c_str(), PARAM_COUNT, &count, POSITION_WHOLE);
            const int end = static_cast<int>(count);
            int position = upTo(end + 2) - 2; // At most one after the end, so without holes.
            if (value == "-" && (position == POSITION_APPEND || position == end)) {
                position = POSITION_WHOLE;
            }
            const std::string step = key + "[" + std::to_string(position) + "]=" + value + " ";
            edit(list, jobs, listed, step);
            server.engine.apply(jobs, direct, support::RecordTable(step).records());
            edits += step;
        }
    }
}

TEST_P(Flush, BearsAPlugInThatShowsAnElementTwice) {
    support::RecordTable table("a=1,2 a[1]=2");
    SETMULTIPAR* present = table.records();
    present[1].key = present[2].key = present[0].key;
    const SETMULTIPAR wanted[] = {present[0], present[1], {}};
    EXPECT_TRUE(ticket::difference(present, wanted).empty());
}

/// Appends replacements such as "type -1>3;" and "id -9999>1;" to a text.
TICKET_UPDATE_CALLBACK writeTo(std::string& text) {
    const auto append = [](void* context, bool isId, int from, int to) {
        *static_cast<std::string*>(context) += std::string(isId ? "id " : "type ") +
                                               std::to_string(from) + ">" + std::to_string(to) +
                                               ";";
    };
    return {append, &text};
}

using Ids = std::map<int, int>; ///< Real ids by the virtual ids that a flush replaced.

TEST_P(Flush, CreatesVirtualTicketsFirst) {
    Recorder server;
    TICKET_UPDATE_LIST list(&server.record);
    edit(list, jobs, 12, "a[-1]=2");
    edit(list, jobs, -9998, "a=1,2");
    edit(list, 50, -9997, "a[-1]=1"); // Stored under type -1, which has no default type.
    edit(list, TICKET_TYPE_LOCAL, 7, "a[-1]=1");
    std::string substitutions;
    unsigned long count = 0;
    EXPECT_TRUE(list.FlushToContainer(&server.record, &count, writeTo(substitutions)));
    EXPECT_EQ(server.sent, "3/13 a[-1]=1 a[1]=2;3/12 a[-1]=2;");
    EXPECT_EQ(count, 3u);
    EXPECT_EQ(substitutions, "type -1>-1;id -9998>13;");
    int real = 0;
    EXPECT_TRUE(list.GetActualTicketID(real, -9998) && real == 13);
    EXPECT_FALSE(list.GetActualTicketID(real, -9997) || real != -1);
    EXPECT_TRUE(list.IsEmpty(TICKET_TYPE_LOCAL, 7));
    EXPECT_TRUE(list.FlushToContainer(&server.record, nullptr, {}));
    EXPECT_TRUE(list.m_idMap.empty());
}

TEST_P(Flush, OfOneTicketLeavesTheOthers) {
    const struct {
        int type, id;
        bool ok;
        int sentTo;
        const char* sent;
    } cases[] = {
        {TICKET_TYPE_LOCAL, 7, true, 7, ""},
        {jobs, -9998, true, 13, "3/13 a[-1]=3;"},
        {jobs, -9998, false, -9998, ""}, // No longer pending there.
        {51, 12, false, 12, ""},
        {jobs, 12, true, 12, "3/12 a[-1]=2;"},
    };
    Recorder server;
    TICKET_UPDATE_LIST list(&server.record);
    edit(list, jobs, 12, "a[-1]=2");
    edit(list, jobs, -9998, "a[-1]=3");
    edit(list, jobs, 14, "a[-1]=4");
    edit(list, TICKET_TYPE_LOCAL, 7, "a[-1]=1");
    for (auto [type, id, ok, sentTo, sent] : cases) {
        EXPECT_FALSE(type == jobs && list.FlushToContainer(nullptr, type, id, nullptr, {}));
        EXPECT_EQ(list.FlushToContainer(&server.record, type, id, nullptr, {}), ok) << id;
        EXPECT_EQ(id, sentTo);
        EXPECT_EQ(std::exchange(server.sent, ""), sent) << id;
        EXPECT_EQ(list.m_idMap, sentTo == 13 ? (Ids{{-9998, 13}}) : Ids());
    }
    EXPECT_FALSE(list.IsEmpty(jobs, 14) || list.IsEmpty(TICKET_TYPE_LOCAL, 7));
}

// Only bit 0 of a plug-in's result for a table or a record counts.
TEST_P(Flush, SucceedsWhereAnyRecordDid) {
    static std::pair<int, std::uint8_t> answer;
    for (const auto& each : {std::pair(1, 3), {1, 2}, {2, 1}}) {
        answer = each;
        Server server;
        ticket::container::SetMultiParameter::put(
            server.record, +[](void*, int, int, SETMULTIPAR* table) {
                table->result = answer.second;
                return answer.first;
            });
        TICKET_UPDATE_LIST list(&server.record);
        edit(list, jobs, 12, "a[-1]=2 b[-1]=3");
        EXPECT_EQ(list.FlushToContainer(&server.record, nullptr, {}), answer.second == 3);
        EXPECT_TRUE(list.IsEmpty(jobs, 12)); // Nothing is retried.
    }
}

TEST_P(Flush, FailsWithoutTicketsOfItsOwn) {
    Recorder server;
    TICKET_UPDATE_LIST list(&server.record);
    edit(list, jobs, 12, "a[-1]=2");
    edit(list, jobs, -9998, "a[-1]=2");
    EXPECT_FALSE(list.FlushToContainer(nullptr, nullptr, {}));
    const auto* factory = std::exchange(hSTicketInstance, nullptr);
    EXPECT_FALSE(list.FlushToContainer(&server.record, nullptr, {}));
    hSTicketInstance = factory;
    EXPECT_FALSE(list.IsEmpty(jobs, 12));
    EXPECT_EQ(server.sent, "");

    // A ticket that can't be created does not stop others. One that can't be opened is still sent.
    ticket::container::TicketOperation::put(server.record,
                                            [](void*, int, int, TICKET_OP, void*) { return 0; });
    std::string substitutions;
    EXPECT_TRUE(list.FlushToContainer(&server.record, nullptr, writeTo(substitutions)));
    EXPECT_EQ(substitutions, "id -9998>-1;");
    EXPECT_EQ(server.sent, "3/12 a[-1]=2;");
    EXPECT_EQ(list.m_idMap, (Ids{{-9998, -1}}));
}

} // namespace
