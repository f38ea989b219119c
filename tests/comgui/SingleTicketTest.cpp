#include "comgui/SingleTicket.h"

#include <gtest/gtest.h>

#include <memory>
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
    explicit WorkTicket(const std::string& content) {
        m_access = factory::Create::of(*store::ticketFactory())("name");
        EXPECT_EQ(send(content).find('0'), std::string::npos) << content;
    }
    ~WorkTicket() { destroy(); }
    void destroy() { factory::Destroy::of (*store::ticketFactory())(&m_access); }

    /// Sends a table; its records' results.
    std::string send(const std::string& records) const {
        RecordTable table(records);
        single::SetMultiParameter::call(*m_access, table.records());
        return resultText(table.records());
    }

    const STICKET_ACCESS* access() const { return m_access; }
    const STICKET_ACCESS& operator*() const { return *m_access; }

  private:
    const STICKET_ACCESS* m_access = nullptr;
};

} // namespace

TEST(SingleTicket, TablesChangeKeysByPosition) {
    const struct {
        const char *before, *table, *results, *after;
    } rows[] = {
        {"", "b=1,2,3 B=4 a=2.5", "11111", "B[0]=4 a[0]=2.5 b[0]=1 b[1]=2 b[2]=3"},
        {"a=1,2,3", "a[-1]=9", "1", "a[0]=9"},
        {"a=1", "a[-2]='x b[-2]=#00ff", "11", "a[0]=1 a[1]='x b[0]=#00ff"},
        {"a=1 a[3]=4", "a[1]=- a[0]=-", "11", "a[1]=4"},
        {"a=1 a[3]=4", "a[3]=-", "1", "a[0]=1"},
        {"a=1,2,3", "a[3]=- a[-2]=- a[-3]=- z[0]=- z[-1]=-", "00001", "a[0]=1 a[1]=2 a[2]=3"},
        {"a=1,2,3", "a[-1]=- a[-2]=7", "11", "a[0]=7"},
        {"", "a[-3]=1 a[16777216]=1 a*[-1]=1 *[0]=1 [0]=1 a*[-1]=- [-1]=-", "0000000", ""},
        {"a=1", "a[16777215]=2 a[-2]=3", "10", "a[0]=1 a[16777215]=2"},
        {"", "u=u4294967295 l=l-9223372036854775808 U=U18446744073709551615 p=p0 e=#", "11111",
         "U[0]=U18446744073709551615 e[0]=# l[0]=l-9223372036854775808 p[0]=p0 u[0]=u4294967295"},
    };
    for (const auto& row : rows) {
        const WorkTicket ticket(row.before);
        EXPECT_EQ(ticket.send(row.table), row.results) << row.before << " <- " << row.table;
        EXPECT_EQ(ticketText(ticket.access()), row.after) << row.before << " <- " << row.table;
    }
}

TEST(SingleTicket, ReadsOnlyWhatIsThereUnderItsType) {
    const WorkTicket ticket("a=5 v[2]='x v[4]=u7 d=2.5 b=#0102 p=p16");
    const struct {
        const char* key;
        int type, position;
        const char* read;
    } rows[] = {
        {"a", PARAM_INT, 0, "5"},        {"a", PARAM_INT, 1, "none"},
        {"a", PARAM_UINT, 0, "none"},    {"a", PARAM_DOUBLE, 0, "none"},
        {"a", PARAM_STRING, -1, "none"}, {"a", 10, -1, "none"},
        {"v", PARAM_STRING, -1, "'x"},   {"v", PARAM_STRING, 0, "none"},
        {"v", PARAM_UINT, -1, "none"},   {"v", PARAM_UINT, 4, "u7"},
        {"v", PARAM_COUNT, -1, "5"},     {"z", PARAM_COUNT, -1, "none"},
        {"v", PARAM_DELETE, 4, "8"},     {"v", PARAM_DELETE, 3, "none"},
        {"d", PARAM_DOUBLE, -1, "2.5"},  {"b", PARAM_BINARY, 0, "#0102"},
    };
    for (const auto& [key, type, position, expected] : rows) {
        std::uint64_t place[2] = {};
        const auto ptype = static_cast<PARAM_TYPE>(type);
        GETMULTIPAR table[2] = {
            {.key = key, .type = ptype, .value = place, .position = position, .result = 1}, {}};
        single::GetMultiParameter::call(*ticket, table);
        const void* value = place;
        if (ptype == PARAM_STRING) {
            value = reinterpret_cast<const char*>(place[0]);
        }
        const bool isNumber = ptype == PARAM_COUNT || ptype == PARAM_DELETE;
        EXPECT_EQ(!table[0].ok() ? "none"
                  : isNumber     ? std::to_string(place[0])
                                 : support::valueText(ptype, value),
                  expected)
            << key << " as " << type << " at " << position;
    }
    EXPECT_TRUE(bit0(single::GetParameter::call(*ticket, "v", PARAM_DELETE, nullptr, 2)));
    EXPECT_FALSE(bit0(single::GetParameter::call(*ticket, "a", PARAM_INT, nullptr, 0)));
}

TEST(SingleTicket, TransfersTakeWholeKeys) {
    const struct {
        const char *before, *source;
        std::vector<const char*> keys;
        int replace;
        const char* after;
    } rows[] = {
        {"a=1,2,3 c=1", "a=9 b=8", {nullptr}, 0, "a[0]=9 b[0]=8 c[0]=1"},
        {"a=1,2,3 c=1", "a=9 b=8", {nullptr}, 1, "a[0]=9 b[0]=8"},
        {"c=1", "ab=1 b=3 bb=4", {"a*", "b", "no", nullptr}, 0, "ab[0]=1 b[0]=3 c[0]=1"},
        {"c=1", "ab=1 b=3", {"x", nullptr}, 1, ""},
        {"c=1", "ab=1 b=3", {"", "b", nullptr}, 1, "b[0]=3"},
    };
    for (const auto& row : rows) {
        const WorkTicket ticket(row.before);
        const auto transfer = [&](const STICKET_ACCESS* from, int replace) {
            return bit0(single::Transfer::call(*ticket, from, row.keys.data(), replace));
        };
        const WorkTicket source(row.source);
        EXPECT_TRUE(transfer(source.access(), row.replace));
        source.send("a[0]=77 ab[0]=77 b=-"); // The two have nothing in common.
        EXPECT_FALSE(transfer(nullptr, 0));
        EXPECT_EQ(ticketText(ticket.access()), row.after) << row.source;
        EXPECT_FALSE(transfer(nullptr, 1));
        EXPECT_EQ(ticketText(ticket.access()), "");
    }
}

TEST(SingleTicket, TextsStayGoodWhenTheirTicketIsGone) {
    auto ticket = std::make_unique<WorkTicket>("a='first b=#6162");
    const char* text = nullptr;
    BIN_STRING bytes;
    single::GetParameter::call(**ticket, "a", PARAM_STRING, static_cast<void*>(&text), 0);
    single::GetParameter::call(**ticket, "b", PARAM_BINARY, static_cast<void*>(&bytes), 0);
    ticket->send("a='second b=#63");
    ticket.reset();
    EXPECT_STREQ(text, "first");
    EXPECT_EQ(std::string(bytes.begin(), bytes.end()), "ab");
}

TEST(SingleTicket, ATableMayPointIntoTheTicketThatItChanges) {
    const WorkTicket ticket("a='x,'y b='z,1,2.5");
    std::vector<SETMULTIPAR> table;
    const SCollect collect = [](void* context, const char* key, PARAM_TYPE type, const void* value,
                                int position) {
        static_cast<std::vector<SETMULTIPAR>*>(context)->push_back(
            {.key = key, .type = type, .value = value, .position = position});
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
        int seen = 0;
    };
    using Callback = bool (*)(Context&);
    const std::pair<Callback, int> callbacks[] = {
        {[](Context& context) { return context.ticket->send("a=- c='y") == "11"; }, 4},
        {[](Context& context) { return context.ticket->destroy(), true; }, 4},
        {[](Context& context) { return context.seen < 2; }, 2},
    };
    for (const auto& [callback, seen] : callbacks) {
        static Callback current;
        current = callback;
        WorkTicket ticket("a=1,2 b=3 c='x");
        Context context{&ticket};
        const SCollect collect = [](void* to, const char*, PARAM_TYPE, const void*, int) {
            ++static_cast<Context*>(to)->seen;
            return current(*static_cast<Context*>(to));
        };
        single::Walk::call(*ticket, collect, static_cast<void*>(&context), "", 8000);
        EXPECT_EQ(context.seen, seen);
    }
}

TEST(SingleTicket, NonsenseIsRefused) {
    WorkTicket ticket("a=1");
    BIN_STRING nowhere;
    nowhere.length = 5;
    const auto set = [&](const char* key, int type, const void* value) {
        return bit0(
            single::SetParameter::call(*ticket, key, static_cast<PARAM_TYPE>(type), value, -1));
    };
    for (int type = -2; type <= 12; ++type) {
        if (type != PARAM_DELETE && type != PARAM_POINTER) {
            EXPECT_FALSE(set("n", type, nullptr)) << type;
        }
    }
    EXPECT_FALSE(set("n", PARAM_COUNT, &nowhere) || set("n", 10, &nowhere));
    EXPECT_FALSE(set("n", PARAM_BINARY, &nowhere) || set(nullptr, PARAM_INT, &nowhere));
    EXPECT_FALSE(bit0(single::SetMultiParameter::call(*ticket, nullptr)));
    EXPECT_FALSE(bit0(single::GetMultiParameter::call(*ticket, nullptr)));
    EXPECT_FALSE(bit0(single::Walk::call(*ticket, nullptr, nullptr, nullptr, 0)));
    EXPECT_EQ(ticketText(ticket.access()), "a[0]=1");

    const STICKET_ACCESS stale = *ticket; // Its words, and a handle that will be nobody's.
    ticket.destroy();
    RecordTable table("a=1");
    table.records()->result = 1;
    EXPECT_FALSE(bit0(single::SetMultiParameter::call(stale, table.records())));
    EXPECT_EQ(resultText(table.records()), "0");
    EXPECT_EQ(ticketText(&stale), "");
    const STICKET_ACCESS* stranger = &stale;
    factory::Destroy::of (*store::ticketFactory())(&stranger);
    EXPECT_EQ(stranger, &stale);
}
