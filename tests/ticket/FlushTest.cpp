#include "ticket/TicketDifference.h"
#include "ticket/TicketUpdateList.h"

#include <gtest/gtest.h>

#include "RealTickets.h"
#include "TicketText.h"
#include "UpdateLog.h"

namespace {

using support::RecordTable;
using support::tableText;
using support::ticketText;

constexpr int jobs = 3;

/// A server of the real engine that remembers each table that is sent to it.
class Server {
  public:
    Server() : m_engine(std::make_shared<store::MemoryKeep>()), m_record(*m_engine.access()) {
        hSTicketInstance = store::ticketFactory();
        s_server = this;
        ticket::container::SetMultiParameter::put(m_record, take);
    }

    void create(int id, const std::string& content) {
        m_engine.createWithKeys(jobs, id, nullptr);
        RecordTable table(content);
        m_engine.apply(jobs, id, table.records());
    }
    std::string content(int id) { return ticketText(m_engine.open(jobs, id)); }

    MTICKET_ACCESS* record() { return &m_record; }

    enum Refusal { None, Table, AllRecords, AllButFirst };
    Refusal refuses = None;
    std::string sent; ///< Tables as "type/id records", parted by line ends.

  private:
    static int take(void*, int type, int id, SETMULTIPAR* table) {
        Server& server = *s_server;
        server.sent += (server.sent.empty() ? "" : "\n") + std::to_string(type) + "/" +
                       std::to_string(id) + " " + tableText(table);
        switch (server.refuses) {
        case Table:
            return 2; // Bit 0 alone is the result.
        case AllRecords:
            return 1;
        case AllButFirst:
            table->result = 3;
            return 1;
        case None:
            break;
        }
        return server.m_engine.apply(type, id, table) ? 1 : 0;
    }

    static inline Server* s_server = nullptr;
    store::TicketContainer m_engine;
    MTICKET_ACCESS m_record;
};

/// Sets and deletions as RecordTable reads them.
void edit(TICKET_UPDATE_LIST& list, int type, int id, const std::string& edits) {
    RecordTable table(edits);
    for (const SETMULTIPAR* r = table.records(); r->key != nullptr; ++r) {
        list.xSetParameter(type, id, r->key, r->type, r->value, r->position, false);
    }
}

/// The part of the log that a flush wrote.
std::string flushLog() {
    const std::string log = takeUpdateLog();
    const auto start = log.find("FlushToContainer");
    return start == std::string::npos ? log : log.substr(start);
}

TEST(Flush, SendsTheDifferenceAlone) {
    struct Case {
        const char* present;
        const char* edits;
        const char* sent;
    };
    const Case cases[] = {
        // Scalars.
        {"a[-1]=5", "a[-1]=5", ""},
        {"a[-1]=5", "a[-1]=6", "a[-1]=6"},
        {"a[-1]=5 b[-1]=1", "b[-1]=1 a[-1]='5", "a[-1]='5"},
        {"a[-1]=u1 b[-1]=l-2 c[-1]=U3 d[-1]=p4 e[-1]=0.5",
         "a[-1]=u1 b[-1]=l-2 c[-1]=U3 d[-1]=p4 e[-1]=0.5", ""},
        {"a[-1]=u1 b[-1]=l-2 c[-1]=U3 d[-1]=p4 e[-1]=0.5",
         "e[-1]=0.25 d[-1]=p5 c[-1]=U4 b[-1]=l-4294967298 a[-1]=u4294967295",
         "a[-1]=u4294967295 b[-1]=l-4294967298 c[-1]=U4 d[-1]=p5 e[-1]=0.25"},
        {"", "b[-1]='text a[0]=1", "a[-1]=1 b[-1]='text"},
        // Single elements.
        {"a=1,2,3,4,5", "a[3]=9", "a[3]=9"},
        {"a=1,2,3,4,5", "a[0]=9", "a[0]=9"},
        {"a=1,2,3,4,5", "a[0]=9 a[4]='x", "a[0]=9 a[4]='x"},
        {"a=1,2,3,4,5", "a[3]=9 a[3]=4", ""},
        // Longer, shorter, other.
        {"a=1,2,3", "a[3]=4 a[4]=5", "a[3]=4 a[4]=5"},
        {"a=1,2,3", "a[-2]=4", "a[3]=4"},
        {"a=1,2,3,4,5", "a[4]=- a[3]=-", "a[4]=- a[3]=-"},
        {"a=1,2,3,4,5", "a[0]=-", "a[-1]=2 a[1]=3 a[2]=4 a[3]=5"},
        {"a=1,2,3,4,5", "a[1]=-", "a[-1]=1 a[1]=3 a[2]=4 a[3]=5"},
        {"a=1,2,3,4,5", "a[2]=-", "a[2]=4 a[3]=5 a[4]=-"},
        {"a=1,2,3,4,5", "a[3]=-", "a[3]=5 a[4]=-"},
        {"a=1,2,3", "a[0]=7 a[1]=8 a[2]=9", "a[-1]=7 a[1]=8 a[2]=9"},
        {"a=1,2,3", "a[0]=7 a[2]=9", "a[0]=7 a[2]=9"},
        {"a=1,2,3", "a[-1]=1 a[2]=2", "a[2]=2"}, // The same value at another position.
        // A scalar, or a vector of one, is always sent whole.
        {"a[-1]=1", "a[1]=2", "a[-1]=1 a[1]=2"},
        {"a=1,2,3", "a[-1]=1", "a[-1]=1"},
        // Far positions are counted, not walked.
        {"a[-1]=1 a[1]=2 a[16777215]=3", "a[-1]=1 a[1]=9", "a[-1]=1 a[1]=9"},
        // Deleted keys.
        {"a[-1]=1 b=1,2 c[-1]=3", "b[-1]=-", "b[-1]=-"},
        {"a[-1]=1 c[-1]=3", "c[-1]=- a[-1]=-", "a[-1]=- c[-1]=-"},
        {"a[-1]=1", "b[-1]=-", ""},
        {"a[-1]=1 b=1,2", "a[-1]=1 b[-1]=-", "b[-1]=-"},
        {"a[-1]=1", "a[-1]=- a[-1]=1", ""},
        {"a=1,2,3", "a[-1]=- a[-2]=1 a[-2]=2", "a[2]=-"},
        {"a=1,2", "a[1]=- a[0]=-", "a[-1]=-"},
        // What never equals itself is sent with the whole ticket, but not beside a deleted key.
        {"b[-1]=#00ff c[-1]=1", "c[-1]=2", "b[-1]=#00ff c[-1]=2"},
        {"b[-1]=#00ff c[-1]=1", "b[-1]=#00ff", "b[-1]=#00ff"},
        {"b[-1]=#00ff c[-1]=1", "c[-1]=-", "c[-1]=-"},
        {"c[-1]=1 d[-1]=nan", "c[-1]=2", "c[-1]=2 d[-1]=nan"},
        {"c[-1]=1 d[-1]=inf", "c[-1]=2", "c[-1]=2 d[-1]=nan"},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(std::string(c.present) + " | " + c.edits);
        Server server;
        server.create(12, c.present);
        TICKET_UPDATE_LIST list(server.record());
        edit(list, jobs, 12, c.edits);
        takeUpdateLog();

        unsigned long count = 99;
        const bool ok = list.FlushToContainer(server.record(), &count, {});

        const std::string records = c.sent;
        const bool changed = !records.empty();
        EXPECT_EQ(server.sent, changed ? "3/12 " + records : "");
        EXPECT_EQ(ok, changed);
        EXPECT_EQ(count,
                  static_cast<unsigned long>(std::count(records.begin(), records.end(), '=')));
        EXPECT_EQ(flushLog(), std::string("FlushToContainer() (3, 12)") +
                                  (changed ? " OK\n" : " UNCHANGED\n") + "Clear()\n");
        EXPECT_TRUE(list.FlushToContainer(server.record(), &count, {})); // Nothing is left.
        EXPECT_EQ(count, 0u);
    }
}

TEST(Flush, BearsAPlugInThatShowsAnElementTwice) {
    RecordTable table("a=1,2 a[1]=2");
    SETMULTIPAR* present = table.records();
    present[1].key = present[2].key = present[0].key;
    const SETMULTIPAR wanted[] = {present[0], present[1], {}};
    EXPECT_TRUE(ticket::difference(present, wanted).empty());
}

/// Substitutions as "type -1>3" and "id -9999>1".
struct Substitutions {
    std::string text;
    TICKET_UPDATE_CALLBACK callback() {
        return {[](void* context, bool isId, int from, int to) {
                    static_cast<Substitutions*>(context)->text +=
                        std::string(isId ? "id " : "type ") + std::to_string(from) + ">" +
                        std::to_string(to) + ";";
                },
                this};
    }
};

TEST(Flush, CreatesVirtualTicketsFirst) {
    Server server;
    server.create(12, "a[-1]=1");
    TICKET_UPDATE_LIST list(server.record());
    edit(list, jobs, 12, "a[-1]=2");
    edit(list, jobs, -9998, "a=1,2");
    edit(list, 50, -9997, "a[-1]=1"); // Filed under type -1, for which there is no fallback.
    edit(list, TICKET_TYPE_LOCAL, 7, "a[-1]=1");
    takeUpdateLog();

    Substitutions substitutions;
    unsigned long count = 0;
    EXPECT_TRUE(list.FlushToContainer(server.record(), &count, substitutions.callback()));
    EXPECT_EQ(server.sent, "3/13 a[-1]=1 a[1]=2\n3/12 a[-1]=2");
    EXPECT_EQ(count, 3u);
    EXPECT_EQ(substitutions.text, "type -1>-1;id -9998>13;");
    EXPECT_EQ(takeUpdateLog(), "FlushToContainer() (-1, -9997) ticketType=-1 INVALID\n"
                               "FlushToContainer() (3, -9998) ticketID=13 OK\n"
                               "FlushToContainer() (3, 12) OK\n"
                               "Clear()\n");
    int real = 0;
    EXPECT_TRUE(list.GetActualTicketID(real, -9998));
    EXPECT_EQ(real, 13);
    EXPECT_FALSE(list.GetActualTicketID(real, -9997));
    EXPECT_EQ(real, -1);
    EXPECT_TRUE(list.IsEmpty(TICKET_TYPE_LOCAL, 7));
    EXPECT_TRUE(list.FlushToContainer(server.record(), nullptr, {}));
    EXPECT_FALSE(list.GetActualTicketID(real, -9998));
}

TEST(Flush, OfOneTicketLeavesTheOthers) {
    Server server;
    server.create(12, "a[-1]=1");
    TICKET_UPDATE_LIST list(server.record());
    edit(list, jobs, 12, "a[-1]=2");
    edit(list, jobs, -9998, "a[-1]=3");
    edit(list, TICKET_TYPE_LOCAL, 7, "a[-1]=1");

    int type = TICKET_TYPE_LOCAL;
    int id = 7;
    EXPECT_TRUE(list.FlushToContainer(server.record(), type, id, nullptr, {}));
    EXPECT_FALSE(list.IsEmpty(TICKET_TYPE_LOCAL, 7));

    type = jobs;
    id = -9998;
    EXPECT_FALSE(list.FlushToContainer(nullptr, type, id, nullptr, {}));
    unsigned long count = 0;
    EXPECT_TRUE(list.FlushToContainer(server.record(), type, id, &count, {}));
    EXPECT_EQ(id, 13);
    EXPECT_EQ(count, 1u);
    EXPECT_EQ(server.sent, "3/13 a[-1]=3");
    int real = 0;
    EXPECT_TRUE(list.GetActualTicketID(real, -9998));
    id = -9998; // Again, and nothing is pending there now.
    EXPECT_FALSE(list.FlushToContainer(server.record(), type, id, nullptr, {}));
    EXPECT_FALSE(list.GetActualTicketID(real, -9998));

    EXPECT_TRUE(list.FlushToContainer(server.record(), &count, {}));
    EXPECT_EQ(server.sent, "3/13 a[-1]=3\n3/12 a[-1]=2");

    edit(list, jobs, 12, "a[-1]=4");
    type = 51;
    id = 12;
    EXPECT_FALSE(list.FlushToContainer(server.record(), type, id, nullptr, {}));
    type = 50;
    id = -9990; // Nothing is pending there.
    EXPECT_FALSE(list.FlushToContainer(server.record(), type, id, nullptr, {}));
    EXPECT_EQ(type, -1);
    EXPECT_FALSE(list.IsEmpty(jobs, 12));
}

TEST(Flush, TellsRefusalsApart) {
    struct Case {
        Server::Refusal refuses;
        int id;
        const char* log;
        bool ok;
    };
    const Case cases[] = {
        {Server::None, 12, " OK\n", true},
        {Server::Table, 12, " FAILED\n", false},
        {Server::AllRecords, 12, " FAILED PARAMETERS\n", false},
        {Server::AllButFirst, 12, " OK\n", true},
        {Server::None, 14, " FAILED\n", false}, // No such ticket.
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.log);
        Server server;
        server.create(12, "a[-1]=1");
        server.refuses = c.refuses;
        TICKET_UPDATE_LIST list(server.record());
        edit(list, jobs, c.id, "a[-1]=2 b[-1]=3");
        takeUpdateLog();
        EXPECT_EQ(list.FlushToContainer(server.record(), nullptr, {}), c.ok);
        EXPECT_EQ(takeUpdateLog(),
                  "FlushToContainer() (3, " + std::to_string(c.id) + ")" + c.log + "Clear()\n");
        EXPECT_TRUE(list.IsEmpty(jobs, c.id)); // Nothing is tried again.
        EXPECT_EQ(server.sent, "3/" + std::to_string(c.id) + " a[-1]=2 b[-1]=3");
    }
}

TEST(Flush, FailsWithoutTicketsOfItsOwn) {
    Server server;
    server.create(12, "a[-1]=1");
    TICKET_UPDATE_LIST list(server.record());
    edit(list, jobs, 12, "a[-1]=2");
    edit(list, jobs, -9998, "a[-1]=2");

    EXPECT_FALSE(list.FlushToContainer(nullptr, nullptr, {}));
    const auto* factory = std::exchange(hSTicketInstance, nullptr);
    EXPECT_FALSE(list.FlushToContainer(server.record(), nullptr, {}));
    hSTicketInstance = factory;
    EXPECT_FALSE(list.IsEmpty(jobs, 12));
    EXPECT_EQ(server.sent, "");

    // A ticket that can't be made does not stop the others.
    ticket::container::TicketOperation::put(
        *server.record(), [](void*, int, int id, TICKET_OP op, void*) {
            EXPECT_EQ(id, op.code == MTICKET_OP_CREATE_NEXT ? TICKET_ID_NEW : 12);
            return 0;
        });
    takeUpdateLog();
    Substitutions substitutions;
    EXPECT_TRUE(list.FlushToContainer(server.record(), nullptr, substitutions.callback()));
    EXPECT_EQ(substitutions.text, "id -9998>-1;");
    EXPECT_EQ(takeUpdateLog(), "FlushToContainer() (3, -9998) ticketID=-1 INVALID\n"
                               "FlushToContainer() (3, 12) OK\n"
                               "Clear()\n");
    int real = 0;
    EXPECT_TRUE(list.GetActualTicketID(real, -9998));
    EXPECT_EQ(real, -1);
}

} // namespace
