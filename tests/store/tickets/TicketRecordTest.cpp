// SPDX-License-Identifier: Apache-2.0
#include "store/tickets/TicketRecord.h"

#include "RealTickets.h"

using namespace ticket;
using support::RecordTable;
using support::resultText;

TEST(TicketRecord, ReadsOnlyWhatIsThereUnderItsType) {
    const WorkTicket ticket("a=5 v[2]='x v[4]=u7 d=2.5 b=#0102 n=4,5,6");
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
        {"v", PARAM_COUNT, -1, "U5"},    {"z", PARAM_COUNT, -1, "none"},
        {"v", PARAM_DELETE, 4, "U8"},    {"v", PARAM_DELETE, 3, "none"},
        {"d", PARAM_DOUBLE, -1, "2.5"},  {"b", PARAM_BINARY, 0, "#0102"},
        {"n", PARAM_INT, 2, "6"},        {"n", PARAM_INT, -1, "4"},
        {"n", PARAM_UINT, 2, "none"},    {"n", PARAM_INT, 3, "none"},
        {"n", PARAM_DELETE, 2, "U2"},    {"n", PARAM_COUNT, -1, "U3"},
    };
    for (const auto& [key, type, position, expected] : rows) {
        std::uint64_t place[2] = {};
        const auto ptype = static_cast<PARAM_TYPE>(type);
        GETMULTIPAR table[2] = {
            {.key = key, .type = ptype, .value = place, .position = position, .result = 1}, {}};
        single::GetMultiParameter::call(*ticket.real(), table);
        const bool isNumber = ptype == PARAM_COUNT || ptype == PARAM_DELETE;
        const void* text = reinterpret_cast<const char*>(place[0]);
        EXPECT_EQ(!table[0].ok() ? "none"
                                 : support::valueText(isNumber ? PARAM_UINT64 : ptype,
                                                      ptype == PARAM_STRING ? text : place),
                  expected)
            << key << " as " << type << " at " << position;
    }
    EXPECT_TRUE(bit0(single::GetParameter::call(*ticket.real(), "v", PARAM_DELETE, nullptr, 2)));
    EXPECT_FALSE(bit0(single::GetParameter::call(*ticket.real(), "a", PARAM_INT, nullptr, 0)));
}

TEST(TicketRecord, TransfersTakeWholeKeys) {
    const struct {
        const char* source;
        std::vector<const char*> keys;
        bool replace;
        const char* after;
    } rows[] = {
        {"a=9 b=8", {nullptr}, false, "a[0]=9 b[0]=8 c[0]=1"},
        {"a=9 b=8", {nullptr}, true, "a[0]=9 b[0]=8"},
        {"ab=1 b=3 bb=4", {"ab*", "b", nullptr}, false, "a[0]=1 a[1]=2 ab[0]=1 b[0]=3 c[0]=1"},
        {"ab=1 b=3", {"x", nullptr}, true, ""},
        {"ab=1 b=3", {"", "b", nullptr}, true, "b[0]=3"},
    };
    for (const auto& [content, keys, replace, after] : rows) {
        const WorkTicket ticket("a=1,2 c=1");
        const WorkTicket source(content);
        EXPECT_TRUE(replace ? ticket.view().Assign(source.real(), keys.data())
                            : ticket.view().Merge(source.real(), keys.data()));
        source.send("a[0]=77 ab[0]=77 b=-"); // The two have nothing in common.
        EXPECT_FALSE(ticket.view().Merge(nullptr, keys.data()));
        EXPECT_EQ(ticket.content(), after) << content;
        EXPECT_FALSE(ticket.view().Assign(nullptr, keys.data()));
        EXPECT_EQ(ticket.content(), "");
    }
}

TEST(TicketRecord, TextsStayGoodWhenTheirTicketIsGone) {
    WorkTicket ticket("a='first b=#6162");
    const char* text = nullptr;
    BIN_STRING bytes;
    single::GetParameter::call(*ticket.real(), "a", PARAM_STRING, static_cast<void*>(&text), 0);
    single::GetParameter::call(*ticket.real(), "b", PARAM_BINARY, static_cast<void*>(&bytes), 0);
    ticket.send("a='second b=#63");
    ticket.destroy();
    EXPECT_STREQ(text, "first");
    EXPECT_EQ(std::string(bytes.begin(), bytes.end()), "ab");
}

TEST(TicketRecord, ATableMayPointIntoTheTicketThatItChanges) {
    const WorkTicket ticket("a='x,'y b='z,1,2.5");
    const std::vector<SETMULTIPAR> table = support::walked(*ticket.real());
    // Deletes everything, then sets it again in reverse order from the deleted values.
    std::vector<SETMULTIPAR> turned = {{.key = table[0].key, .position = -1},
                                       {.key = table[2].key, .position = -1}};
    turned.insert(turned.end(), table.rbegin() + 1, table.rend());
    turned.emplace_back();
    ticket.view().SetMultiParameter(turned.data());
    EXPECT_EQ(resultText(turned.data()), "1111111");
    EXPECT_EQ(ticket.content(), "a[0]='x a[1]='y b[0]='z b[1]=1 b[2]=2.5");
}

TEST(TicketRecord, AWalkOutlivesWhatItsCallbackDoes) {
    struct Context {
        WorkTicket ticket{"a=1,2 b=3 c='x"};
        std::string seen;
    } context;
    const SCollect callback = [](void* to, const char* key, PARAM_TYPE, const void*, int) {
        auto& [ticket, seen] = *static_cast<Context*>(to);
        seen += key;
        seen.size() == 1 ? void(ticket.send("a=- c='y")) : ticket.destroy();
        return seen.size() < 3;
    };
    single::Walk::call(*context.ticket.real(), callback, static_cast<void*>(&context), "", 8000);
    EXPECT_EQ(context.seen, "aab");
}

TEST(TicketRecord, NonsenseIsRefused) {
    WorkTicket ticket("a=1");
    BIN_STRING nowhere;
    nowhere.length = 5;
    const auto set = [&](const char* key, int type, const void* value) {
        return ticket.view().xSetParameter(key, static_cast<PARAM_TYPE>(type), value, -1);
    };
    for (int type = -2; type <= 12; ++type) {
        EXPECT_EQ(set("n", type, nullptr), type == PARAM_DELETE || type == PARAM_POINTER) << type;
    }
    EXPECT_FALSE(set("n", PARAM_COUNT, &nowhere) || set("n", 10, &nowhere));
    EXPECT_FALSE(set("n", PARAM_BINARY, &nowhere) || set(nullptr, PARAM_INT, &nowhere));
    EXPECT_FALSE(ticket.view().SetMultiParameter(nullptr));
    EXPECT_FALSE(bit0(single::GetMultiParameter::call(*ticket.real(), nullptr)));
    EXPECT_FALSE(bit0(single::Walk::call(*ticket.real(), nullptr, nullptr, nullptr, 0)));
    EXPECT_EQ(ticket.content(), "a[0]=1 n[0]=p0");

    const STICKET_ACCESS stale = *ticket.real(); // Its words, and a handle that will be invalid.
    ticket.destroy();
    EXPECT_EQ(ticket.send("a=1"), "0");
    EXPECT_EQ(support::ticketText(&stale), "");
    const STICKET_ACCESS* stranger = &stale;
    DestroyTicket(stranger);
    EXPECT_EQ(stranger, &stale);
}
