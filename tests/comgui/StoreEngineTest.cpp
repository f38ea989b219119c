#include "comgui/StoreEngine.h"

#include <algorithm>
#include <csignal>
#include <cstring>
#include <fstream>

#include <sys/resource.h>
#include <sys/stat.h>

#include "StoreTest.h"
#include "comgui/Users.h"

using store::Fault;

namespace {

class StoreEngine : public StoreTest {};
class FolderStore : public FolderStoreTest {};

constexpr std::chrono::milliseconds now{0};

ON_BOTH_ENGINES(StoreEngine);

} // namespace

TEST_P(StoreEngine, TicketsComeAndGoAndIdsAreNotUsedTwice) {
    const auto engine = open();
    EXPECT_EQ(ticket(*engine, 0, 0),
              "System/Product/MajorVersion[0]=5 System/ServerName[0]='Press room");
    EXPECT_EQ(engine->createNext(3), 1);
    EXPECT_TRUE(engine->create(3, 40));
    EXPECT_FALSE(engine->create(3, 40));
    EXPECT_EQ(engine->createNext(3), 41);
    EXPECT_TRUE(engine->remove(3, 41));
    EXPECT_FALSE(engine->remove(3, 41));
    EXPECT_EQ(engine->createNext(3), 42);
    EXPECT_TRUE(engine->create(3, 0xFFFFFF));
    EXPECT_EQ(engine->createNext(3), 2) << "the lowest free one, when the highest is used up";
    EXPECT_EQ(engine->ids(3), (std::vector<int>{1, 2, 40, 42, 0xFFFFFF}));
    EXPECT_EQ(engine->ids(4), std::vector<int>());

    // A ticket made anew does not inherit keys.
    EXPECT_EQ(send(*engine, 3, 40, "a=1"), "taken 1");
    engine->remove(3, 40);
    engine->create(3, 40);
    EXPECT_EQ(ticket(*engine, 3, 40), "");
    EXPECT_EQ(send(*engine, 3, 39, "a=1"), "refused 0");
}

TEST_P(StoreEngine, TablesFollowTheTicketRulesAndSurviveReopening) {
    const auto first = open();
    first->createNext(3);
    EXPECT_EQ(send(*first, 3, 1, "b=1,2.5,'x é=7 b2=U9 A=#00 b[5]=l-1 zz*=1 =1 b[-3]=4"),
              "taken 1111111000");
    const std::string expected =
        "A[0]=#00 b[0]=1 b[1]=2.5 b[2]='x b[5]=l-1 b2[0]=U9 é[0]=7"; // As bytes, not as letters.
    EXPECT_EQ(ticket(*first, 3, 1), expected);
    const auto second = open();
    EXPECT_EQ(ticket(*second, 3, 1), expected);
    // Changes of keys that the table replaces, changes, deletes, and deletes in vain.
    EXPECT_EQ(send(*second, 3, 1, "b[5]=- b[-2]=9 A=- gone=- b2=1 b2[-2]=2 é[3]=-"),
              "taken 1111110");
    EXPECT_EQ(ticket(*first, 3, 1), "b[0]=1 b[1]=2.5 b[2]='x b[3]=9 b2[0]=1 b2[1]=2 é[0]=7");
    EXPECT_EQ(send(*second, 3, 1, "b[-1]='new b[1]=-"), "taken 10");
    EXPECT_EQ(ticket(*first, 3, 1), "b[0]='new b2[0]=1 b2[1]=2 é[0]=7");

    const char* filter[] = {"b", "é*", nullptr};
    const auto some = first->content(3, 1, store::KeyFilter(filter));
    EXPECT_EQ(some->keys().size(), 2u);

    // A change that fails on its way leaves nothing.
    store::Scope scope;
    scope.keys = {{"b", true}};
    EXPECT_THROW(first->change(3, 1, scope,
                               [&](store::TicketContent& content) {
                                   RecordTable table("b=1,2,3");
                                   content.apply(table.records());
                                   throw std::runtime_error("on the way");
                               }),
                 std::runtime_error);
    EXPECT_EQ(ticket(*second, 3, 1), "b[0]='new b2[0]=1 b2[1]=2 é[0]=7");
}

TEST_P(StoreEngine, ShowsSomeKeysOfAllTicketsAsFarAsTheyAreNotTooLarge) {
    const auto engine = open();
    for (const int id : {4, 2, 9}) {
        engine->create(3, id);
        send(*engine, 3, id, "b=" + std::to_string(id) + " a='same c=1");
    }
    send(*engine, 3, 4, "a=1,2,3,4,5,6,7,8,9");
    const auto shown = [&](std::size_t largest) {
        std::string text;
        engine->keysOfAll(3, {"b", "a"}, largest, [&](int id, std::size_t name, auto elements) {
            text += std::to_string(id) + (name == 0 ? "b" : "a") +
                    (elements ? std::to_string(elements->count()) : "-") + " ";
        });
        return text;
    };
    const auto sorted = [](std::string text) {
        for (const auto& [wrong, right] :
             {std::pair("2a1 2b1 ", "2b1 2a1 "), std::pair("4a- 4b1 ", "4b1 4a- "),
              std::pair("4a9 4b1 ", "4b1 4a9 "), std::pair("9a1 9b1 ", "9b1 9a1 ")}) {
            if (const auto at = text.find(wrong); at != std::string::npos) {
                text.replace(at, std::strlen(wrong), right);
            }
        }
        return text; // The keys of one ticket come in any order.
    };
    EXPECT_EQ(sorted(shown(40)), "2b1 2a1 4b1 4a- 9b1 9a1 ");
    EXPECT_EQ(sorted(shown(std::size_t{1} << 40)), "2b1 2a1 4b1 4a9 9b1 9a1 ");
}

TEST_P(StoreEngine, CommitsAreNoticedWhoeverMakesThem) {
    const auto engine = open();
    const auto other = open();
    other->createNext(3);
    // The number while something that was fetched is as it was.
    const auto fetched = [&] {
        engine->commits(now);
        engine->keysOfAll(3, {"k"}, 64, [](int, std::size_t, auto) {});
        return engine->commits(std::chrono::hours(1));
    };
    // A server counts what is committed to other databases, too, as by other tests just now.
    bool same = false;
    for (int i = 0; i < 100 && !same; ++i) {
        const auto before = fetched();
        engine->key(3, 1, "k");
        same = engine->commits(now) == before;
    }
    EXPECT_TRUE(same) << "reading commits nothing";
    auto last = fetched();
    EXPECT_EQ(send(*other, 3, 1, "k=1"), "taken 1");
    EXPECT_NE(engine->commits(now), last);
    last = fetched();
    EXPECT_EQ(endOf(startProcess([&] { return send(*open(), 3, 1, "k=2") == "taken 1" ? 0 : 1; })),
              0);
    EXPECT_NE(engine->commits(now), last);
    last = fetched();
    EXPECT_EQ(send(*engine, 3, 1, "k=3"), "taken 1");
    EXPECT_NE(engine->commits(std::chrono::hours(1)), last) << "its own, at any age";
    last = fetched();
    sql("PRAGMA wal_checkpoint(TRUNCATE); UPDATE keys SET value = value",
        "UPDATE tintgate.keys SET value = value");
    EXPECT_NE(engine->commits(now), last) << "whatever became of the log";
}

TEST_P(StoreEngine, ReadersSeeWhatIsThereNow) {
    const std::shared_ptr<store::StoreEngine> engine = open();
    const auto other = open();
    store::StoreKeep keep(engine);
    const auto read = [&](int id, const char* key) {
        const auto elements = keep.key(3, id, key);
        return elements == nullptr ? -1 : std::get<int>(*elements->first());
    };
    const std::string key = "Job/Display/Status";
    for (const int id : {1, 2, 3}) {
        other->create(3, id);
        send(*other, 3, id, key + "=" + std::to_string(200 + id));
    }
    // From here on the keep holds the status of all jobs; no read may show what is no longer there.
    EXPECT_EQ(keep.ids(3), (std::vector<int>{1, 2, 3}));
    EXPECT_EQ(read(1, key.c_str()), 201);
    EXPECT_EQ(read(2, key.c_str()), 202);
    EXPECT_EQ(read(1, "Input/FileType"), -1);
    send(*other, 3, 2, key + "=209 Input/FileType=4096");
    EXPECT_EQ(read(2, key.c_str()), 209);
    EXPECT_EQ(read(2, "Input/FileType"), 4096);
    keep.ids(3);
    std::string large = key + "=7";
    for (int i = 1; i < 100; ++i) {
        large += " " + key + "[" + std::to_string(i) + "]=1";
    }
    send(*other, 3, 3, large); // No longer in an overview.
    EXPECT_EQ(read(3, key.c_str()), 7);
    EXPECT_EQ(read(1, key.c_str()), 201);
    other->remove(3, 1);
    EXPECT_EQ(read(1, key.c_str()), -1);
    keep.ids(3);
    EXPECT_EQ(read(2, key.c_str()), 209);
    send(*other, 3, 3, key + "=8");
    keep.ids(3);
    EXPECT_EQ(read(3, key.c_str()), 8) << "a listing is no older than its ids";
    send(*other, 3, 3, key + "=7");
    for (int i = 0; i < 200; ++i) { // Across overviews that fall due.
        send(*other, 3, 2, key + "=" + std::to_string(i));
        EXPECT_EQ(read(2, key.c_str()), i);
        EXPECT_EQ(read(3, key.c_str()), 7);
    }
}

TEST_F(FolderStore, OpensOnlyFoldersWithAStore) {
    const std::pair<std::string, Fault> cases[] = {
        {folder.path("nowhere"), Fault::Missing},
        {folder.makeFolder("empty"), Fault::Missing},
        {folder.write("file", "x"), Fault::Missing},
        {"", Fault::Missing},
        {address + std::string("\0", 1), Fault::Missing},
        {"file:" + address + "?mode=memory", Fault::Missing},
    };
    for (const auto& [place, fault] : cases) {
        EXPECT_EQ(faultOf([&, at = place] { store::openStore(at); }), fault) << place;
    }
    folder.makeFolder("other/files");
    folder.write("other/tickets.db", "");
    EXPECT_EQ(faultOf([&] { store::openStore(folder.path("other")); }), Fault::Missing);
    folder.write("other/tickets.db", std::string(5000, 'x'));
    EXPECT_EQ(faultOf([&] { store::openStore(folder.path("other")); }), Fault::Damaged);
    folder.makeFolder("begun/files"); // By a making that was killed as it turned the log on.
    folder.write("begun/tickets.db-journal", "");
    EXPECT_NO_THROW(store::makeStore(folder.path("begun"), "press"));
}

TEST_P(StoreEngine, OpensOnlyStoresOfItsFormat) {
    EXPECT_EQ(faultOf([&] { store::makeStore(address, "x"); }), Fault::Exists);
    EXPECT_EQ(faultOf([&] { store::openCopy(address); }), Fault::Exists);
    EXPECT_FALSE(store::bringStoreUpToDate(address));
    const int format = room ? 2 : 1;
    setFormat(format + 1);
    EXPECT_EQ(faultOf([&] { open(); }), Fault::Newer);
    EXPECT_EQ(faultOf([&] { store::bringStoreUpToDate(address); }), Fault::Newer);
    setFormat(0);
    EXPECT_EQ(faultOf([&] { open(); }), Fault::Older);
    setFormat(format);
    sql("INSERT INTO keys SELECT number, x'61', x'010299' FROM tickets",
        "INSERT INTO tintgate.keys (ticket, name, value, change)"
        " SELECT number, '\\x61', '\\x010299', 0"
        " FROM tintgate.tickets");
    const auto engine = open();
    EXPECT_EQ(faultOf([&] { engine->key(0, 0, "a"); }), Fault::Damaged);
    EXPECT_EQ(send(*engine, 0, 0, "a[1]=1"), "refused 0");
    EXPECT_EQ(send(*engine, 0, 0, "a=1"), "taken 1") << "replacing it mends it";
}

TEST_P(StoreEngine, KeepsUsersWithSaltedHashes) {
    using store::LoginAnswer;
    const auto engine = open();
    const std::string name = "J\xF6rg"; // One byte a character, and no UTF-8.
    const std::string hash = store::passwordHash("gr\xFCn");
    EXPECT_NE(hash, store::passwordHash("gr\xFCn"));
    EXPECT_EQ(hash.find("gr"), std::string::npos);
    engine->putUser({name, hash, false});
    engine->putUser({"anna", store::passwordHash(""), true});
    EXPECT_EQ(engine->users().size(), 2u);
    EXPECT_EQ(store::checkLogin(*engine, name, "gr\xFCn"), LoginAnswer::Welcome);
    EXPECT_EQ(store::checkLogin(*engine, name, "gr\xFC"), LoginAnswer::WrongUserOrPassword);
    EXPECT_EQ(store::checkLogin(*engine, "JORG", "gr\xFCn"), LoginAnswer::WrongUserOrPassword);
    EXPECT_EQ(store::checkLogin(*engine, "anna", ""), LoginAnswer::Disabled);
    EXPECT_EQ(store::checkLogin(*engine, "anna", "x"), LoginAnswer::WrongUserOrPassword)
        << "whether somebody is disabled is for who knows the password";
    EXPECT_TRUE(engine->removeUser("anna"));
    EXPECT_FALSE(engine->removeUser("anna"));
    EXPECT_EQ(room ? 0u : support::modeOf(address + "/tickets.db") & 0007u, 0u);
}

TEST_F(FolderStore, AReadOnlyStoreIsRefusedAndStaysIntact) {
    chmod(folder.path().c_str(), 0755);
    send(*open(), 0, 0, "a=1");
    for (const std::string place : {"", "/files", "/tickets.db"}) {
        chmod((address + place).c_str(), place == "/tickets.db" ? 0444 : 0555);
    }
    const pid_t child = startProcess([&] {
        if (!support::becomeUser(support::ordinaryUser)) {
            return 98;
        }
        return faultOf([&] { open(); }) == Fault::ReadOnly ? 0 : 1;
    });
    EXPECT_EQ(endOf(child), 0);
    // Where the database may be written and the files may not.
    for (const std::string place : {"", "/tickets.db"}) {
        chmod((address + place).c_str(), 0777);
    }
    const pid_t other = startProcess([&] {
        if (!support::becomeUser(support::ordinaryUser)) {
            return 98;
        }
        const auto engine = open();
        return faultOf([&] { putFile(*engine, "a/b", "x"); }) == Fault::ReadOnly &&
                       send(*engine, 0, 0, "b=2") == "taken 1"
                   ? 0
                   : 1;
    });
    EXPECT_EQ(endOf(other), 0);
    EXPECT_TRUE(open()->files().empty());
    EXPECT_EQ(std::get<int>(*open()->key(0, 0, "a")->first()), 1);
}

TEST_F(FolderStore, AFullDiskLosesNothingThatWasThere) {
    {
        const auto engine = open();
        engine->create(3, 1);
        send(*engine, 3, 1, "kept=1,2,3");
        putFile(*engine, "kept", "old");
    }
    const std::string much(300'000, 'x');
    // A limit on the size of files, which the kernel reports as it reports a full disk.
    const pid_t child = startProcess([&] {
        signal(SIGXFSZ, SIG_IGN);
        const rlimit limit = {200'000, 200'000};
        setrlimit(RLIMIT_FSIZE, &limit);
        const auto engine = open();
        if (send(*engine, 3, 1, "kept='" + much + " other=1") != "refused 00") {
            return 1;
        }
        if (faultOf([&] { putFile(*engine, "kept", much); }) != Fault::Full) {
            return 2;
        }
        return send(*engine, 3, 1, "small=1") == "taken 1" ? 0 : 3;
    });
    EXPECT_EQ(endOf(child), 0);
    const auto engine = open();
    EXPECT_EQ(ticket(*engine, 3, 1), "kept[0]=1 kept[1]=2 kept[2]=3 small[0]=1");
    EXPECT_EQ(file(*engine, "kept"), "old");
    EXPECT_EQ(engine->files().size(), 1u);
    EXPECT_TRUE(engine->versions("kept").empty());
}
