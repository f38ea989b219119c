// SPDX-License-Identifier: Apache-2.0
// The real bundle, loaded by the real loader and used through the connector.
#include <algorithm>
#include <chrono>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <filesystem>
#include <memory>
#include <vector>

#include <dlfcn.h>

#include <gmock/gmock.h>

#include "Shared-Components/Tintgate/NerovaKZComm/CKZConnector.h"
#include "Shared-Components/Tintgate/NerovaKZComm/ComGUIModuleInterface.h"
#include "StoreTest.h"
#include "SuiteRoot.h"
#include "base/WideBytes.h"
#include "store/Users.h"
#include "store/WriteFailures.h"

namespace {

class ComGUIPlugIn : public StoreTest {
  protected:
    explicit ComGUIPlugIn(Engine kind = GetParam()) : StoreTest(kind) {
        open()->putUser({"press", hash, false});
        root.installPlistReader(PLIST_READER);
        root.installCommBundle(COMGUI_BUNDLE);
    }

    static std::unique_ptr<CKZConnector> connect(const std::wstring& server,
                                                 const std::wstring& user = L"press",
                                                 const std::wstring& password = L"room") {
        return std::make_unique<CKZConnector>(server, user, password, 0x5071103, false, false);
    }

    /// Computed once, because hashing is slow by design.
    inline static const std::string hash = store::passwordHash("room");
    const support::SuiteRoot root;
    const std::wstring here = base::wideFromBytes(address);
};
ON_BOTH_ENGINES(ComGUIPlugIn);

/// Calls the bundle's table directly, with one session open. Any kind of store is suitable.
class ComGUISlots : public ComGUIPlugIn {
  protected:
    ComGUISlots() : ComGUIPlugIn(Engine::Sqlite) {
        std::strcpy(record.user, "press");
        std::strcpy(record.password, "room");
        std::strncpy(record.server, address.c_str(), sizeof record.server - 1);
        EXPECT_EQ(slots.CreateInstance(&instance), 0);
        EXPECT_EQ(slots.CreateInstance(&other), 0);
        EXPECT_EQ(slots.Login(instance, &record), 0);
    }

    static const ComGUIModuleInterface& table() {
        void* const bundle = dlopen(COMGUI_BUNDLE "/Contents/MacOS/ComGUI", RTLD_NOW | RTLD_LOCAL);
        using Factory = ComGUIModuleInterface** (*)(const void*, const void*);
        return **reinterpret_cast<Factory>(dlsym(bundle, "makeComGUI"))(nullptr, nullptr);
    }

    const ComGUIModuleInterface& slots = table();
    void* instance = nullptr;
    void* other = nullptr;
    ComSessionRecord record;
};

} // namespace

TEST_P(ComGUIPlugIn, MovesFilesWholeAndLeavesNoParts) {
    const auto connector = connect(here);
    const auto chart = wxString::FromUTF8("/srv/ControlCharts/ä.it8");
    const std::string local = folder.write("local", "chart");
    EXPECT_TRUE(connector->UploadFile(local, chart));
    EXPECT_EQ(file(*open(), "srv/ControlCharts/ä.it8"), "chart");
    std::filesystem::remove(local);
    EXPECT_TRUE(connector->DownloadFile(local, chart, 200));
    EXPECT_EQ(support::contentsOf(local), "chart");
    EXPECT_FALSE(connector->DownloadFile(local, "/srv/ControlCharts/none.it8", 40));
    EXPECT_FALSE(connector->DownloadFile(folder.path("no/copy"), chart, 40));
    EXPECT_FALSE(connector->UploadFile(folder.path("no file"), "/srv/x"));
    EXPECT_EQ(std::distance(std::filesystem::directory_iterator(folder.path()), {}), room ? 0 : 1)
        << "something was left beside the store";
}

TEST_P(ComGUIPlugIn, LetsInWhoKnowsThePassword) {
    open()->putUser({"left", hash, true});
    // Only a correct password reveals that a user is disabled.
    const std::tuple<const wchar_t*, const wchar_t*, int> logins[] = {{L"press", L"room", 0},
                                                                      {L"press", L"Room", -2004},
                                                                      {L"Press", L"room", -2004},
                                                                      {L"left", L"room", -2030},
                                                                      {L"left", L"wrong", -2004}};
    for (const auto& [user, password, code] : logins) {
        EXPECT_EQ(connect(here, user, password)->getLastRetCode(), code) << wxString(user);
    }
    // The log has what happened, and neither passwords nor what may be one.
    std::string log;
    for (const auto& entry : open()->logEntries()) {
        EXPECT_LT(std::time(nullptr) - entry.time, 60);
        EXPECT_EQ(entry.origin, store::thisOrigin());
        log += std::string(eventName(entry.event)) + " " + entry.who + ": " + entry.what + "\n";
    }
    EXPECT_EQ(log, "login press: \n"
                   "refusal press: wrong user or password\n"
                   "refusal : wrong user or password\n"
                   "refusal left: the user is disabled\n"
                   "refusal left: wrong user or password\n");

    // Who tries again and again waits, two seconds at most; who knows the password does not.
    const auto timed = [&](const wchar_t* password) {
        const auto start = std::chrono::steady_clock::now();
        connect(here, L"press", password);
        return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
    };
    timed(L"5");
    const double refused = timed(L"6");
    EXPECT_GT(refused, 2.0);
    EXPECT_LT(refused, 2.0 + 1.5) << "a hash, and the wait";
    EXPECT_LT(timed(L"room"), 2.0);
    EXPECT_TRUE(open()->removeUser("left"));
    EXPECT_FALSE(open()->removeUser("left"));
}

TEST_P(ComGUIPlugIn, NotesEachWriteThatTheStoreDoesNotTake) {
    setenv("TMPDIR", folder.path().c_str(), 1);
    const store::WriteFailures failures(folder.path());
    open()->create(3, 7);
    sql("INSERT INTO keys SELECT number, CAST('a\n' AS BLOB), x'010299' FROM tickets WHERE type = "
        "3",
        "INSERT INTO tintgate.keys (ticket, name, value, change)"
        " SELECT number, '\\x610a', '\\x010299', 0 FROM tintgate.tickets WHERE type = 3");
    const auto connector = connect(here);
    int value = 1;
    const auto set = [&](int id, const char* key, int position) {
        return connector->SetJobTicketKeyValue(3, id, key, PARAM_INT, &value, position);
    };
    EXPECT_EQ(set(7, "fine", -1), 0);
    EXPECT_FALSE(support::exists(failures.path()));
    EXPECT_NE(set(7, "a\n", 1), 0);
    EXPECT_NE(set(7, "fine", -1), 0);
    EXPECT_NE(set(8, "b", -1), 0);
    double values[] = {1, 2};
    connector->SetJobArrayParameter(3, 8, "c", PARAM_DOUBLE, 2, values);
    EXPECT_FALSE(connector->UploadFile(folder.write("local", "x"), "/x/../y"));
    std::string noted;
    for (const auto& [time, server, target, key, reason] : failures.all()) {
        EXPECT_NEAR(static_cast<double>(time), static_cast<double>(std::time(nullptr)), 5);
        EXPECT_EQ(server, address);
        noted += target + " " + key + ": " + reason + "\n";
    }
    EXPECT_EQ(noted, "job/7 a\\x0A: a key of the store can't be read\n"
                     "job/7 fine: an earlier write to this ticket was lost\n"
                     "job/8 b: there is no such ticket\n"
                     "job/8 c: there is no such ticket\n"
                     "file /x/../y: server path \"/x/../y\" names no file of the store\n");
    EXPECT_EQ(support::modeOf(failures.path()), 0600U);
    const auto logged = open()->logEntries();
    EXPECT_EQ(std::count_if(logged.begin(), logged.end(),
                            [](const auto& entry) {
                                return entry.event == store::Event::LostWrite &&
                                       entry.who == "press";
                            }),
              5);

    // A large file is renamed, and another user's file is left alone.
    std::filesystem::resize_file(failures.path(), 1 << 20);
    set(8, "d", -1);
    EXPECT_EQ(failures.all().size(), 1U);
    EXPECT_TRUE(support::exists(failures.path() + ".old"));
    std::filesystem::rename(failures.path(), folder.path("elsewhere"));
    std::filesystem::create_symlink(folder.path("elsewhere"), failures.path());
    set(8, "e", -1);
    EXPECT_EQ(failures.all().size(), 1U);
    unsetenv("TMPDIR");
}

TEST_F(ComGUISlots, AddressesArriveOneByteACharacterAndAreLimited) {
    std::string longest = folder.path() + "/";
    longest.resize(127, 'x');
    const std::tuple<std::string, std::wstring, bool> addresses[] = {
        // Passed in UTF-8, like the tool's arguments; reaches the plug-in as Latin-1.
        {folder.path("Größe"), base::wideFromBytes(folder.path()) + L"/Gr\u00F6\u00DFe", true},
        {longest, base::wideFromBytes(longest), true},
        {longest + "x", base::wideFromBytes(longest + "x"), false},
    };
    std::string last = address;
    for (const auto& [path, given, isReached] : addresses) {
        std::filesystem::rename(std::exchange(last, path), path);
        EXPECT_EQ(connect(given)->IsLoggedIn(), isReached) << path;
    }
}

TEST_F(ComGUISlots, RefusesHandlesThatAreNone) {
    int size = 400;
    int buffer[100] = {};
    const auto expectNone = [&](void* at, std::uint64_t handle) {
        EXPECT_EQ(slots.GetContainer(at, handle), nullptr);
        const int codes[] = {slots.GetTicketData(at, handle, 3, 0, 0, &size, buffer),
                             slots.SetTicketData(at, handle, 3, 0, 0, &size, buffer),
                             slots.SendCommand(at, handle, "local.set.callback", 0, nullptr),
                             slots.PutFile(at, handle, "/etc/hostname", "x"),
                             slots.GetFile(at, handle, "/nowhere/x", "x"),
                             slots.PutFileRaw(at, handle, nullptr, nullptr),
                             slots.GetFileRaw(at, handle, nullptr, nullptr),
                             slots.SendJob(at, handle, nullptr, nullptr, nullptr),
                             slots.Logout(at, handle)};
        EXPECT_THAT(codes, testing::Each(testing::Ne(0)));
    };
    const std::uint64_t session = record.session;
    const std::pair<void*, std::uint64_t> strange[] = {
        {instance, 0}, {instance, session + 1}, {other, session}, {nullptr, session}, {&size, 1}};
    for (const auto& [at, handle] : strange) {
        expectNone(at, handle);
    }
    EXPECT_EQ(slots.Logout(instance, session), 0);
    EXPECT_EQ(slots.Login(instance, &record), 0);
    expectNone(instance, session);
}

TEST_F(ComGUISlots, RefusesArgumentsThatMeanNothing) {
    int size = 4;
    int negative = -4;
    int buffer[100] = {};
    void* found = buffer;
    ComSessionRecord wrongSize = record;
    wrongSize.size = 4;
    ComSessionRecord unending; // None of its texts is terminated.
    for (auto* const text : {&unending.user, &unending.password, &unending.server}) {
        std::memset(text, '/', sizeof *text);
    }
    const std::uint64_t session = record.session;
    const auto command = [&](const char* name, int length, void* data) {
        return slots.SendCommand(instance, session, name, length, data);
    };
    const int codes[] = {slots.CreateInstance(nullptr),
                         slots.Initialize(nullptr, &record),
                         slots.Initialize(&size, &record),
                         slots.Login(instance, nullptr),
                         slots.Login(instance, &wrongSize),
                         slots.Login(instance, &unending),
                         slots.IsAlive(nullptr, address.c_str(), 0),
                         slots.IsAlive(instance, nullptr, 0),
                         slots.GetTicketData(instance, session, 50, 0, 0, &size, buffer),
                         slots.GetTicketData(instance, session, 3, 2, 0, &size, buffer),
                         slots.GetTicketData(instance, session, 3, 0, 0, nullptr, buffer),
                         slots.GetTicketData(instance, session, 3, 1, 0, &size, nullptr),
                         slots.GetTicketData(instance, session, 3, 1, 0, &negative, buffer),
                         command(nullptr, 0, nullptr),
                         command("local.set.callback", 0, buffer), // Not a ticket.
                         command("local.set.previewfolder", -1, buffer),
                         command("format.disk", 0, nullptr),
                         slots.QueryInterface(nullptr, CFUUIDBytes{}, &found)};
    EXPECT_THAT(codes, testing::Each(testing::Ne(0)));
    EXPECT_EQ(found, nullptr);
}

TEST_F(ComGUISlots, IsAliveAsLongAsASessionIs) {
    std::filesystem::rename(address, address + "2");
    EXPECT_EQ(slots.IsAlive(instance, address.c_str(), 50005), 0);
    EXPECT_EQ(slots.IsAlive(other, address.c_str(), 50005), 2);
    slots.Logout(instance, record.session);
    EXPECT_EQ(slots.IsAlive(instance, address.c_str(), 50005), 2);
    EXPECT_EQ(slots.IsAlive(other, (address + "2").c_str(), 50005), 0);
}

TEST_F(ComGUISlots, GivesTicketDataInWholeIds) {
    for (const int id : {4, 9, 2}) {
        open()->create(3, id);
    }
    const std::pair<int, std::vector<int>> cases[] = {
        {3, {-1, -1, -1}}, {4, {2, -1, -1}}, {11, {2, 4, -1}}, {400, {2, 4, 9}}};
    for (const auto& [given, expected] : cases) {
        std::vector<int> ids(3, -1);
        int size = given;
        EXPECT_EQ(slots.GetTicketData(instance, record.session, 3, 1, 0, &size, ids.data()), 0);
        EXPECT_EQ(size, std::min(given / 4, 3) * 4);
        EXPECT_EQ(ids, expected);
    }
}
