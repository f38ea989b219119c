#include "comgui/SingleTicket.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "TicketText.h"
#include "comgui/WorkTickets.h"

using namespace ticket;
using support::RecordTable;
using support::resultText;
using support::ticketText;

namespace {

class WorkTicket {
  public:
    explicit WorkTicket(const std::string& content = "") {
        m_access = factory::Create::of(*store::ticketFactory())("name");
        RecordTable table(content);
        single::SetMultiParameter::call(*m_access, table.records());
    }
    ~WorkTicket() { destroy(); }
    void destroy() { factory::Destroy::of (*store::ticketFactory())(&m_access); }

    const STICKET_ACCESS* access() const { return m_access; }
    const STICKET_ACCESS& operator*() const { return *m_access; }

  private:
    const STICKET_ACCESS* m_access = nullptr;
};

bool get(const WorkTicket& ticket, const char* key, PARAM_TYPE type, void* out, int position) {
    return bit0(single::GetParameter::call(*ticket, key, type, out, position));
}

bool set(const WorkTicket& ticket, const char* key, PARAM_TYPE type, const void* value,
         int position) {
    return bit0(single::SetParameter::call(*ticket, key, type, value, position));
}

unsigned long countOf(const WorkTicket& ticket, const char* key) {
    unsigned long count = 99;
    return get(ticket, key, PARAM_COUNT, &count, POSITION_WHOLE) ? count : 0;
}

} // namespace

// Each row: what the ticket holds, a table that it is sent, the records' results, and what a walk
// then shows.
TEST(SingleTicket, TablesChangeKeysByPosition) {
    const struct {
        const char *before, *table, *results, *after;
    } rows[] = {
        {"", "b=1,2,3 B=4 a=2.5", "11111", "B[0]=4 a[0]=2.5 b[0]=1 b[1]=2 b[2]=3"},
        {"a=1,2,3", "a[-1]=9", "1", "a[0]=9"},
        {"a=1,2,3", "a[0]=9", "1", "a[0]=9 a[1]=2 a[2]=3"},
        {"a=1", "a[-2]='x b[-2]=#00ff", "11", "a[0]=1 a[1]='x b[0]=#00ff"},
        {"a=1", "a[3]=4", "1", "a[0]=1 a[3]=4"},
        {"a=1 a[3]=4", "a[1]=- a[0]=-", "11", "a[1]=4"},
        {"a=1 a[3]=4", "a[3]=-", "1", "a[0]=1"},
        {"a=1,2,3", "a[3]=- a[-2]=- a[-3]=- z[0]=- z[-1]=-", "00001", "a[0]=1 a[1]=2 a[2]=3"},
        {"a=1,2,3", "a[2]=- a[1]=- a[0]=-", "111", ""},
        {"a=1,2,3", "a[-1]=- a[-2]=7", "11", "a[0]=7"},
        {"", "a[-3]=1 a[16777216]=1 a*[-1]=1 *[0]=1 [0]=1 a*[-1]=- [-1]=-", "0000000", ""},
        {"a=1", "a[16777215]=2 a[-2]=3", "10", "a[0]=1 a[16777215]=2"},
        {"", "u=u4294967295 l=l-9223372036854775808 U=U18446744073709551615 p=p0 e=#", "11111",
         "U[0]=U18446744073709551615 e[0]=# l[0]=l-9223372036854775808 p[0]=p0 u[0]=u4294967295"},
    };
    for (const auto& row : rows) {
        WorkTicket ticket(row.before);
        RecordTable table(row.table);
        EXPECT_TRUE(bit0(single::SetMultiParameter::call(*ticket, table.records())));
        EXPECT_EQ(resultText(table.records()), row.results) << row.before << " <- " << row.table;
        EXPECT_EQ(ticketText(ticket.access()), row.after) << row.before << " <- " << row.table;
    }
}

TEST(SingleTicket, ReadsOnlyWhatIsThereUnderItsType) {
    WorkTicket ticket("a=5 v[2]='x v[4]=u7 d=2.5 b=#0102 p=p16");
    int number = -1;
    EXPECT_TRUE(get(ticket, "a", PARAM_INT, &number, 0) && number == 5);
    for (const PARAM_TYPE other : {PARAM_UINT, PARAM_INT64, PARAM_DOUBLE, PARAM_STRING,
                                   static_cast<PARAM_TYPE>(10), static_cast<PARAM_TYPE>(-1)}) {
        double out = -1;
        EXPECT_FALSE(get(ticket, "a", other, &out, POSITION_WHOLE)) << other;
        EXPECT_EQ(out, -1) << other;
    }
    EXPECT_EQ(countOf(ticket, "v"), 5u);
    EXPECT_EQ(countOf(ticket, "none"), 0u);
    const char* text = nullptr;
    EXPECT_TRUE(get(ticket, "v", PARAM_STRING, &text, POSITION_WHOLE));
    EXPECT_STREQ(text, "x");
    EXPECT_FALSE(get(ticket, "v", PARAM_STRING, &text, 0));
    EXPECT_FALSE(get(ticket, "v", PARAM_UINT, &number, POSITION_WHOLE));
    PARAM_TYPE type = PARAM_DELETE;
    EXPECT_TRUE(get(ticket, "v", PARAM_DELETE, &type, 4) && type == PARAM_UINT);
    EXPECT_TRUE(get(ticket, "v", PARAM_DELETE, nullptr, 2));
    EXPECT_FALSE(get(ticket, "v", PARAM_DELETE, &type, 3));
    BIN_STRING bytes;
    EXPECT_TRUE(get(ticket, "b", PARAM_BINARY, &bytes, 0));
    EXPECT_EQ(std::string(bytes.begin(), bytes.end()), "\x01\x02");

    GETMULTIPAR table[5];
    double value = 0;
    table[0] = {.key = "d", .type = PARAM_DOUBLE, .value = &value, .position = -1};
    table[1] = {.key = "a", .type = PARAM_INT, .value = nullptr, .position = -1};
    table[2] = {.key = "zz", .type = PARAM_INT, .value = &number, .position = -1, .result = 1};
    table[3] = {.key = "a", .type = PARAM_INT, .value = &number, .position = 0};
    single::GetMultiParameter::call(*ticket, table);
    EXPECT_TRUE(table[0].ok() && !table[1].ok() && !table[2].ok() && table[3].ok());
    EXPECT_EQ(value, 2.5);
}

TEST(SingleTicket, TransfersTakeWholeKeys) {
    const struct {
        const char *before, *source;
        std::vector<const char*> keys;
        bool replace;
        const char* after;
    } rows[] = {
        {"a=1,2,3 c=1", "a=9 b=8", {}, false, "a[0]=9 b[0]=8 c[0]=1"},
        {"a=1,2,3 c=1", "a=9 b=8", {}, true, "a[0]=9 b[0]=8"},
        {"c=1",
         "ab=1 ac=2 b=3 bb=4",
         {"a*", "b", "no", nullptr},
         false,
         "ab[0]=1 ac[0]=2 b[0]=3 c[0]=1"},
        {"c=1", "ab=1 b=3", {"x", nullptr}, true, ""},
        {"c=1", "ab=1 b=3", {"", "b", nullptr}, true, "b[0]=3"},
        {"c=1", "ab=1 b=3", {"*", "b", nullptr}, true, "ab[0]=1 b[0]=3"},
    };
    for (const auto& row : rows) {
        WorkTicket ticket(row.before);
        WorkTicket source(row.source);
        EXPECT_TRUE(bit0(single::Transfer::call(*ticket, source.access(),
                                                row.keys.empty() ? nullptr : row.keys.data(),
                                                row.replace ? 1 : 0)));
        EXPECT_EQ(ticketText(ticket.access()), row.after) << row.source;

        // Afterwards the two have nothing in common.
        const int value = 77;
        set(source, "ab", PARAM_INT, &value, 0);
        set(source, "b", PARAM_DELETE, nullptr, POSITION_WHOLE);
        EXPECT_EQ(ticketText(ticket.access()), row.after) << row.source;

        EXPECT_FALSE(bit0(single::Transfer::call(*ticket, nullptr, nullptr, 0)));
        EXPECT_EQ(ticketText(ticket.access()), row.after) << row.source;
        EXPECT_TRUE(bit0(single::Transfer::call(*ticket, ticket.access(), nullptr, 1)));
        EXPECT_EQ(ticketText(ticket.access()), row.after) << row.source;
        single::Transfer::call(*ticket, nullptr, nullptr, 1);
        EXPECT_EQ(ticketText(ticket.access()), "");
    }
}

TEST(SingleTicket, TextsStayGoodWhenTheirTicketIsGone) {
    auto ticket = std::make_unique<WorkTicket>("a='first b=#6162");
    const char* text = nullptr;
    BIN_STRING bytes;
    get(*ticket, "a", PARAM_STRING, &text, 0);
    get(*ticket, "b", PARAM_BINARY, &bytes, 0);
    RecordTable table("a='second b=#63");
    single::SetMultiParameter::call(**ticket, table.records());
    ticket.reset();
    EXPECT_STREQ(text, "first");
    EXPECT_EQ(std::string(bytes.begin(), bytes.end()), "ab");
}

TEST(SingleTicket, ATableMayPointIntoTheTicketThatItChanges) {
    WorkTicket ticket("a='x,'y b='z,1,2.5");
    std::vector<SETMULTIPAR> table;
    const SCollect collect = [](void* context, const char* key, PARAM_TYPE type, const void* value,
                                int position) {
        auto& records = *static_cast<std::vector<SETMULTIPAR>*>(context);
        records.push_back({.key = key, .type = type, .value = value, .position = position});
        return true;
    };
    single::Walk::call(*ticket, collect, static_cast<void*>(&table), "", 8000);
    // All is deleted, then set again from behind, out of what was deleted.
    std::vector<SETMULTIPAR> turned = {{.key = table[0].key, .position = -1},
                                       {.key = table[2].key, .position = -1}};
    turned.insert(turned.end(), table.rbegin(), table.rend());
    turned.emplace_back();
    single::SetMultiParameter::call(*ticket, turned.data());
    EXPECT_EQ(resultText(turned.data()), "1111111");
    EXPECT_EQ(ticketText(ticket.access()), "a[0]='x a[1]='y b[0]='z b[1]=1 b[2]=2.5");
}

TEST(SingleTicket, AWalkOutlivesWhatItsCallbackDoes) {
    struct Context {
        WorkTicket* ticket;
        int seen;
    };
    const auto run = [](SCollect callback) {
        WorkTicket ticket("a=1,2 b=3 c='x");
        Context context{&ticket, 0};
        single::Walk::call(*ticket, callback, static_cast<void*>(&context), "", 8000);
        return context.seen;
    };
    EXPECT_EQ(run([](void* context, const char*, PARAM_TYPE, const void*, int) {
                  auto& own = *static_cast<Context*>(context);
                  set(*own.ticket, "a", PARAM_DELETE, nullptr, POSITION_WHOLE);
                  set(*own.ticket, "c", PARAM_STRING, "y", POSITION_WHOLE);
                  return ++own.seen > 0;
              }),
              4);
    EXPECT_EQ(run([](void* context, const char*, PARAM_TYPE, const void*, int) {
                  auto& own = *static_cast<Context*>(context);
                  own.ticket->destroy();
                  return ++own.seen > 0;
              }),
              4);
    EXPECT_EQ(run([](void* context, const char*, PARAM_TYPE, const void*, int) {
                  return ++static_cast<Context*>(context)->seen < 2;
              }),
              2);
}

TEST(SingleTicket, NonsenseIsRefused) {
    WorkTicket ticket("a=1");
    const int value = 1;
    const BIN_STRING nowhere = [] {
        BIN_STRING bytes;
        bytes.length = 5;
        return bytes;
    }();
    for (int type = -2; type <= 12; ++type) {
        if (type != PARAM_DELETE && type != PARAM_POINTER) {
            EXPECT_FALSE(set(ticket, "n", static_cast<PARAM_TYPE>(type), nullptr, -1)) << type;
        }
    }
    EXPECT_FALSE(set(ticket, "n", PARAM_COUNT, &value, -1));
    EXPECT_FALSE(set(ticket, "n", static_cast<PARAM_TYPE>(10), &value, -1));
    EXPECT_FALSE(set(ticket, "n", PARAM_BINARY, &nowhere, -1));
    EXPECT_FALSE(set(ticket, nullptr, PARAM_INT, &value, -1));
    EXPECT_FALSE(get(ticket, nullptr, PARAM_INT, nullptr, -1));
    EXPECT_FALSE(bit0(single::SetMultiParameter::call(*ticket, nullptr)));
    EXPECT_FALSE(bit0(single::GetMultiParameter::call(*ticket, nullptr)));
    EXPECT_FALSE(bit0(single::Walk::call(*ticket, nullptr, nullptr, nullptr, 0)));
    EXPECT_FALSE(bit0(single::Option::call(*ticket, 11, nullptr)));
    STICKET_OPTION_WHOAMI who;
    EXPECT_FALSE(bit0(single::Option::call(*ticket, 11, static_cast<void*>(&who))));
    EXPECT_EQ(ticketText(ticket.access()), "a[0]=1");

    const STICKET_ACCESS record = *ticket; // Its words, and a handle that will be stale.
    ticket.destroy();
    EXPECT_EQ(ticket.access(), nullptr);
    RecordTable table("a=1");
    table.records()->result = 1;
    EXPECT_FALSE(bit0(single::SetMultiParameter::call(record, table.records())));
    EXPECT_EQ(resultText(table.records()), "0");
    GETMULTIPAR reads[2] = {{.key = "a", .type = PARAM_DELETE, .position = 0, .result = 1}, {}};
    single::GetMultiParameter::call(record, reads);
    EXPECT_FALSE(reads[0].ok());
    EXPECT_EQ(ticketText(&record), "");
    const STICKET_ACCESS* stranger = &record;
    factory::Destroy::of (*store::ticketFactory())(&stranger);
    factory::Destroy::of (*store::ticketFactory())(nullptr);
    EXPECT_EQ(stranger, &record);
}
