// The real bundle, loaded by the real loader and used through the manager and the connector.
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <memory>
#include <vector>

#include <dlfcn.h>

#include "Shared-Components/Tintgate/NerovaKZComm/ComGUIManager.h"
#include "StoreTest.h"
#include "Suite.h"
#include "comgui/Users.h"
#include "platform/WideBytes.h"
#include "ticket/TicketFactory.h"

namespace {

constexpr int application = 0x5071103;

class ComGUIPlugIn : public StoreTest {
  protected:
    explicit ComGUIPlugIn(Engine kind = GetParam()) : StoreTest(kind) {
        const auto engine = open();
        engine->putUser({"press", hash, false});
        engine->putUser({"gone", hash, true});
    }

    static std::unique_ptr<CKZConnector> connect(const std::wstring& server,
                                                 const std::wstring& user = L"press",
                                                 const std::wstring& password = L"room") {
        return Suite::connect(server, user, password);
    }
    std::unique_ptr<CKZConnector> connect() const {
        return connect(platform::wideFromBytes(address));
    }

    /// The bundle's table.
    static const ComGUIModuleInterface& table() {
        void* const object = reinterpret_cast<void* (*)(const void*, const void*)>(
            dlsym(dlopen(COMGUI_BUNDLE "/Contents/MacOS/ComGUI", RTLD_NOW | RTLD_LOCAL),
                  "makeComGUI"))(nullptr, nullptr);
        return **static_cast<ComGUIModuleInterface**>(object);
    }

    static void* makeInstance() {
        void* instance = nullptr;
        EXPECT_EQ(table().CreateInstance(&instance), 0);
        return instance;
    }

    std::int32_t logIn(void* instance, ComSessionRecord& record) const {
        std::strncpy(record.user, "press", sizeof record.user);
        std::strncpy(record.password, "room", sizeof record.password);
        std::strncpy(record.server, address.c_str(), sizeof record.server - 1);
        return table().Login(instance, &record);
    }

    /// Hashing is slow by intent.
    inline static const std::string hash = store::passwordHash("room");
    const Suite suite;
};
ON_BOTH_ENGINES(ComGUIPlugIn);

/// What has nothing to do with where the store is.
class ComGUISlots : public ComGUIPlugIn {
  protected:
    ComGUISlots() : ComGUIPlugIn(Engine::Sqlite) {}
};

} // namespace

TEST_P(ComGUIPlugIn, CarriesAJobThroughTheConnector) {
    open()->create(3, 7);
    const auto connector = connect();
    ASSERT_TRUE(connector->IsLoggedIn()) << connector->getLastRetCode();
    EXPECT_TRUE(connector->IsAlive());
    std::wstring ip;
    std::wstring name;
    EXPECT_EQ(connector->GetServerInfo(&ip, &name), 0);
    EXPECT_EQ(name, L"Press room");
    EXPECT_EQ(ip, platform::wideFromBytes(address));

    int status = 208;
    EXPECT_EQ(connector->SetJobTicketKeyValue(3, 7, "Job/Display/Status", PARAM_INT, &status, -1),
              0);
    EXPECT_EQ(connector->SetJobTicketKeyValue(3, 8, "Job/Display/Status", PARAM_INT, &status, -1),
              -1)
        << "there is no such job";
    double values[] = {1.5, -2, 0};
    EXPECT_TRUE(connector->SetJobArrayParameter(3, 7, "Values", PARAM_DOUBLE, 3, values));
    double read[3] = {};
    int count = 0;
    connector->GetJobTicketKeyArrayValues(3, 7, "Values", PARAM_DOUBLE, 3, &count, read);
    EXPECT_EQ(count, 3);
    EXPECT_TRUE(std::equal(read, read + 3, values));
    EXPECT_EQ(ticket(*open(), 3, 7),
              "Job/Display/Status[0]=208 Values[0]=1.5 Values[1]=-2.0 Values[2]=0.0");

    int* ids = nullptr;
    EXPECT_EQ(connector->GetVerifierJobTicketIDs(&ids, &count, false), 0);
    ASSERT_EQ(count, 1);
    EXPECT_EQ(ids[0], 7);
    std::free(ids);

    const auto chart = wxString::FromUTF8("/srv/ControlCharts/ä.it8");
    const std::string local = folder.write("local", "chart");
    EXPECT_TRUE(connector->UploadFile(local, chart));
    EXPECT_EQ(file(*open(), "srv/ControlCharts/ä.it8"), "chart");
    const std::string copy = folder.path("copy");
    EXPECT_TRUE(connector->DownloadFile(copy, chart, 200));
    EXPECT_EQ(support::contentsOf(copy), "chart");
    EXPECT_FALSE(connector->DownloadFile(copy, "/srv/ControlCharts/none.it8", 40));
    EXPECT_FALSE(support::exists(copy));
    EXPECT_FALSE(connector->DownloadFile(folder.path("no/copy"), "/srv/../secret", 40));
    EXPECT_FALSE(connector->UploadFile(folder.path("no file"), "/srv/x"));
    std::filesystem::remove(local);
    EXPECT_EQ(std::distance(std::filesystem::directory_iterator(folder.path()), {}), room ? 0 : 1)
        << "parts of copies were left beside the store";
}

TEST_P(ComGUIPlugIn, EndsEachLoginInItsCode) {
    const auto code = [](const std::wstring& server, const std::wstring& user,
                         const std::wstring& password) {
        const auto connector = connect(server, user, password);
        return connector->IsLoggedIn() ? 0 : connector->getLastRetCode();
    };
    const std::wstring here = platform::wideFromBytes(address);
    EXPECT_EQ(code(here, L"press", L"room"), 0);
    EXPECT_EQ(code(here, L"press", L"Room"), -2004);
    EXPECT_EQ(code(here, L"Press", L"room"), -2004);
    EXPECT_EQ(code(here, L"", L""), -2004);
    EXPECT_EQ(code(here, L"gone", L"room"), -2030);
    EXPECT_EQ(code(here, L"gone", L"wrong"), -2004);
    EXPECT_EQ(code(here + L"x", L"press", L"room"), -2005);
    EXPECT_EQ(code(L"localhost", L"press", L"room"), -2005);
    for (const auto& [format, expected] : {std::pair(9, -2031), std::pair(0, -2033)}) {
        setFormat(format);
        EXPECT_EQ(code(here, L"press", L"room"), expected);
    }
}

TEST_F(ComGUISlots, AddressesArriveOneByteACharacterAndAreLimited) {
    // Given in UTF-8, as the tool's arguments are; it reaches the plug-in as Latin-1.
    const std::string umlaut = folder.path("Größe");
    std::filesystem::rename(address, umlaut);
    const std::wstring wide = platform::wideFromBytes(folder.path()) + L"/Gr\u00F6\u00DFe";
    EXPECT_TRUE(connect(wide)->IsLoggedIn());

    std::string longest = folder.path() + "/";
    longest.resize(127, 'x');
    std::filesystem::rename(umlaut, longest);
    EXPECT_TRUE(connect(platform::wideFromBytes(longest))->IsLoggedIn());
    std::filesystem::rename(longest, longest + "x");
    EXPECT_EQ(connect(platform::wideFromBytes(longest + "x"))->getLastRetCode(), -2005);
}

TEST_F(ComGUISlots, RefusesHandlesThatAreNone) {
    const auto& slots = table();
    void* const instance = makeInstance();
    void* const other = makeInstance();
    ComSessionRecord record;
    EXPECT_EQ(slots.Initialize(instance, &record), 0);
    EXPECT_NE(slots.Initialize(nullptr, &record), 0);
    EXPECT_NE(slots.Initialize(&record, &record), 0);
    EXPECT_NE(slots.Initialize(instance, nullptr), 0);
    EXPECT_NE(slots.Login(instance, nullptr), 0);
    EXPECT_NE(slots.CreateInstance(nullptr), 0);
    ComSessionRecord wrongSize;
    wrongSize.size = 4;
    EXPECT_NE(slots.Login(instance, &wrongSize), 0);
    ComSessionRecord unending; // Not one text of it ends.
    std::memset(unending.user, 'x', sizeof unending.user);
    std::memset(unending.password, 'x', sizeof unending.password);
    std::memset(unending.server, '/', sizeof unending.server);
    EXPECT_EQ(slots.Login(instance, &unending), -2005);

    ASSERT_EQ(logIn(instance, record), 0);
    const std::uint64_t session = record.session;
    const MTICKET_ACCESS* const container = slots.GetContainer(instance, session);
    ASSERT_NE(container, nullptr);
    int size = 400;
    int buffer[100] = {};
    const auto callAll = [&](void* at, std::uint64_t handle) {
        EXPECT_EQ(slots.GetContainer(at, handle), nullptr);
        EXPECT_NE(slots.GetTicketData(at, handle, 3, 0, 0, &size, buffer), 0);
        EXPECT_NE(slots.SetTicketData(at, handle, 3, 0, 0, &size, buffer), 0);
        EXPECT_NE(slots.SendCommand(at, handle, "local.set.callback", 0, nullptr), 0);
        EXPECT_NE(slots.PutFile(at, handle, "/etc/hostname", "x"), 0);
        EXPECT_NE(slots.GetFile(at, handle, "/nowhere/x", "x"), 0);
        EXPECT_NE(slots.PutFileRaw(at, handle, nullptr, nullptr), 0);
        EXPECT_NE(slots.GetFileRaw(at, handle, nullptr, nullptr), 0);
        EXPECT_NE(slots.SendJob(at, handle, nullptr, nullptr, nullptr), 0);
        EXPECT_NE(slots.Logout(at, handle), 0);
    };
    callAll(instance, 0);
    callAll(instance, session + 1);
    callAll(instance, ~std::uint64_t{0});
    callAll(other, session);
    callAll(nullptr, session);
    callAll(&record, session);

    // In a session: arguments that mean nothing.
    EXPECT_NE(slots.GetTicketData(instance, session, 50, 0, 0, &size, buffer), 0);
    EXPECT_NE(slots.GetTicketData(instance, session, 3, 2, 0, &size, buffer), 0);
    EXPECT_NE(slots.GetTicketData(instance, session, 3, 0, 0, nullptr, buffer), 0);
    EXPECT_NE(slots.GetTicketData(instance, session, 3, 1, 0, &size, nullptr), 0);
    for (const int bad : {-4, 0, 3}) {
        size = bad;
        EXPECT_NE(slots.GetTicketData(instance, session, 3, 0, 0, &size, buffer), 0);
    }
    EXPECT_NE(slots.SendCommand(instance, session, nullptr, 0, nullptr), 0);
    EXPECT_NE(slots.SendCommand(instance, session, "local.set.callback", 0, buffer), 0)
        << "that is no ticket";
    EXPECT_NE(slots.SendCommand(instance, session, "local.set.previewfolder", -1, buffer), 0);
    EXPECT_NE(slots.SendCommand(instance, session, "format.disk", 0, nullptr), 0);
    EXPECT_EQ(slots.IsAlive(instance, nullptr, 0), 2);
    EXPECT_EQ(slots.IsAlive(nullptr, address.c_str(), 0), 2);
    void* found = buffer;
    EXPECT_NE(slots.QueryInterface(nullptr, CFUUIDBytes{}, &found), 0);
    EXPECT_EQ(found, nullptr);

    EXPECT_EQ(slots.Logout(instance, session), 0);
    callAll(instance, session);
    EXPECT_EQ(slots.Uninitialize(instance, &record), 0);
}

TEST_F(ComGUISlots, IsAliveAsLongAsASessionIs) {
    const auto& slots = table();
    void* const instance = makeInstance();
    EXPECT_EQ(slots.IsAlive(instance, address.c_str(), 50005), 0);
    ComSessionRecord record;
    ASSERT_EQ(logIn(instance, record), 0);
    open()->create(3, 1);
    std::filesystem::rename(address, address + "2");
    EXPECT_EQ(slots.IsAlive(instance, address.c_str(), 50005), 0);
    EXPECT_EQ(slots.IsAlive(makeInstance(), address.c_str(), 50005), 2);
    slots.Logout(instance, record.session);
    EXPECT_EQ(slots.IsAlive(instance, address.c_str(), 50005), 2);
}

TEST_F(ComGUISlots, GivesTicketDataInWholeIds) {
    for (const int id : {4, 9, 2}) {
        open()->create(3, id);
    }
    const auto& slots = table();
    void* const instance = makeInstance();
    ComSessionRecord record;
    ASSERT_EQ(logIn(instance, record), 0);
    int number = 0;
    int size = 4;
    EXPECT_EQ(slots.GetTicketData(instance, record.session, 3, 0, 0, &size, &number), 0);
    EXPECT_EQ(number, 3);
    const std::pair<int, std::vector<int>> cases[] = {
        {0, {}}, {3, {}}, {4, {2}}, {11, {2, 4}}, {12, {2, 4, 9}}, {400, {2, 4, 9}}};
    for (const auto& [given, expected] : cases) {
        std::vector<int> ids(100, -1);
        size = given;
        EXPECT_EQ(slots.GetTicketData(instance, record.session, 3, 1, 0, &size, ids.data()), 0);
        EXPECT_EQ(size, static_cast<int>(expected.size() * 4));
        EXPECT_EQ(ids[expected.size()], -1);
        ids.resize(expected.size());
        EXPECT_EQ(ids, expected);
    }
    slots.Logout(instance, record.session);
}

TEST_F(ComGUISlots, TakesCommandsAndNotifications) {
    const std::unique_ptr<ComGUIManager> manager(ComGUIManager::GetInstance(true));
    int user = 0;
    manager->Initialize("press", "room", address.c_str(), 50005, application);
    ASSERT_EQ(manager->Login(nullptr, nullptr, nullptr, -1), 0);
    EXPECT_EQ(manager->SetCallback(&user), 0);
    EXPECT_EQ(manager->SendCommand("local.set.previewfolder", 0, const_cast<char*>("/tmp")), 0);
    EXPECT_EQ(manager->SendCommand("local.set.thumbnailfolder", 0, const_cast<char*>("")), 0);
    const STICKET_ACCESS* work = CreateTicket(nullptr);
    EXPECT_EQ(manager->SendCommand("local.set.callback", 0, const_cast<STICKET_ACCESS*>(work)), 0);
    EXPECT_EQ(support::ticketText(work).substr(0, 22), "iGUINotificationID[0]=");
    DestroyTicket(work);
    manager->Logout();
    EXPECT_NE(manager->SendCommand("local.set.previewfolder", 0, const_cast<char*>("/tmp")), 0);
    EXPECT_EQ(manager->Uninitialize(), 0);
}

TEST_P(ComGUIPlugIn, ServesSeveralProcessesAtOnce) {
    constexpr int processes = 3;
    open()->create(3, 1);
    std::vector<pid_t> children;
    for (int process = 0; process < processes; ++process) {
        children.push_back(startProcess([&] {
            const auto connector = connect();
            if (!connector->IsLoggedIn()) {
                return 1;
            }
            const std::string key = "Process/" + std::to_string(process);
            for (int i = 0; i < 20; ++i) {
                int value = -1;
                if (connector->SetJobTicketKeyValue(3, 1, key.c_str(), PARAM_INT, &i, -1) != 0 ||
                    connector->GetJobTicketKeyValue(3, 1, key.c_str(), PARAM_INT, &value, nullptr,
                                                    -1) != 0 ||
                    value != i ||
                    connector->SetJobTicketKeyValue(3, 1, "All", PARAM_INT, &process, -2) != 0) {
                    return 2;
                }
            }
            return 0;
        }));
    }
    for (const pid_t child : children) {
        EXPECT_EQ(endOf(child), 0);
    }
    EXPECT_EQ(open()->key(3, 1, "All")->count(), processes * 20);
}
