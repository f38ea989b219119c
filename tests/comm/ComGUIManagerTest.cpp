// SPDX-License-Identifier: Apache-2.0
#include "Shared-Components/Tintgate/NerovaKZComm/ComGUIManager.h"

#include <clocale>
#include <filesystem>
#include <sstream>

#include <wx/debug.h>

#include "Shared-Components/Tintgate/NerovaKZComm/CKZConnector.h"
#include "tests/comm/CommTest.h"
#include "ticket/TicketViews.h"

namespace {

using testing::ElementsAre;

class ManagerTest : public CommTest {
  protected:
    ManagerTest() : manager(ComGUIManager::GetInstance(true)) {
        wxDisableAsserts();
        setlocale(LC_CTYPE, "C.UTF-8");
        manager->Initialize("user", "secret", "host", 50005, 1);
        manager->Login(nullptr, nullptr, nullptr, -1);
        takeCalls();
    }

    const std::unique_ptr<ComGUIManager> manager;
};

TEST_F(CommTest, AFailedLoadIsToldAndEndsTheLoginOnly) {
    const std::string noTable = "Could not get Interface pointer and Intialize the bundle\n";
    const std::string noBundle = "RegisterPlugIn: CFPlugInCreate() failed\n" + noTable;
    const struct {
        std::function<void()> harm;
        std::string messages;
    } cases[] = {
        {[&] { plugIn->results[4] = 1; }, "@TODO: Bundle should be released here\n" + noTable},
        {[&] { plugIn->hasInterface = false; }, noTable},
        {[&] { std::filesystem::remove_all(m_root.path("suite/lib")); }, noBundle},
        {[&] { std::filesystem::remove_all(m_root.path("Library")); }, noBundle},
    };
    for (const auto& [harm, messages] : cases) {
        SCOPED_TRACE(messages);
        harm();
        testing::internal::CaptureStderr();
        const CKZConnector connector(L"host", L"user", L"secret", 0x5071103, false, true);
        EXPECT_EQ(testing::internal::GetCapturedStderr(), messages);
        EXPECT_FALSE(connector.IsLoggedIn());
        EXPECT_EQ(connector.getLastRetCode(), -2005);
        const std::unique_ptr<ComGUIManager> manager(connector.getComGUIMngrInstance());
        EXPECT_EQ(manager->Login(nullptr, nullptr, nullptr, -1), -2005);
        EXPECT_EQ(manager->GetIntParameter(3, job, "Input/SubType"), -1);
        EXPECT_NE(manager->PutFile("a", "b", true), 0);
    }
}

TEST_F(ManagerTest, FillsTheSessionRecord) {
    const std::string name(130, 'u');
    const ComSessionRecord& record = plugIn->record;
    int lastPort = record.localPort;
    for (int i = 0; i < 22; ++i) {
        manager->Initialize(name.c_str(), nullptr, "10.0.0.1", 1234, i == 0 ? 0x5071103 : i);
        EXPECT_EQ(record.clientLevel, i == 0 ? 7 : 5);
        EXPECT_EQ(record.localPort, lastPort == 50026 ? 50006 : lastPort + 1);
        lastPort = record.localPort;
    }
    EXPECT_STREQ(record.user, name.substr(0, 127).c_str());
    EXPECT_STREQ(record.password, "");
    EXPECT_STREQ(record.server, "10.0.0.1");
    EXPECT_THAT((std::vector{record.serverPort, record.applicationID, record.clientLevelCompanion}),
                ElementsAre(1234, 21, 1));
}

TEST_F(ManagerTest, LogsInWithWhatIsGiven) {
    plugIn->set(0, 0, "System/ServerName='N\xe4me");
    plugIn->results[26] = 1;
    EXPECT_EQ(manager->IsAlive("other", 9), 0);
    // In MacRoman, 0x80 is a capital A with diaeresis. Only the user's name is converted.
    EXPECT_EQ(manager->Login("\x80", "\x80", "other", 7), 0);
    EXPECT_STREQ(plugIn->record.user, "\xc3\x84");
    EXPECT_STREQ(plugIn->record.password, "\x80");
    EXPECT_EQ(plugIn->record.serverPort, 7);
    EXPECT_EQ(manager->GetServerName(), (std::wstring{L'N', wchar_t(0xFFFFFFE4), L'm', L'e'}));
    EXPECT_EQ(takeCalls(), (Calls{"26 other 9", "9", "12"}));

    plugIn->results[9] = -2004; // Keeps the previous state.
    EXPECT_EQ(manager->Login(nullptr, nullptr, "third", -1), -2004);
    EXPECT_EQ(manager->GetServerIP(), L"other");
    plugIn->results.clear();
    plugIn->hasContainer = false;
    EXPECT_EQ(manager->Login(nullptr, nullptr, nullptr, -1), 0);
    EXPECT_EQ(manager->GetServerName(), L"third");
    EXPECT_EQ(manager->GetIntParameter(3, job, "k", 0, 9), 9);
}

TEST_F(ManagerTest, KeepsAContainerOnlyIfItHasASystemTicket) {
    manager->Logout();
    plugIn->tickets().DeleteTicket(0, 0, false);
    EXPECT_EQ(manager->GetClientContainer(), nullptr);
    EXPECT_EQ(takeCalls(), (Calls{"10", "12", "10"}));
    plugIn->set(0, 0, "");
    EXPECT_EQ(manager->GetClientContainer(), manager->GetClientContainer());
    EXPECT_EQ(takeCalls(), Calls{"12"});
}

TEST_F(ManagerTest, RegistersForNotificationsThoughItIsRefused) {
    static std::ostringstream told;
    ticket::container::Notification::put(
        plugIn->access,
        +[](void*, int type, int id, int notification, int enable, const char* const* keys) {
            told << type << ' ' << id << ' ' << notification << ' ' << enable;
            for (; keys != nullptr && *keys != nullptr; ++keys) {
                told << ' ' << *keys;
            }
            told << '\n';
            return 1;
        });
    plugIn->results[16] = 8;
    EXPECT_EQ(manager->SetCallback(this), 8);
    EXPECT_EQ(told.str(), "3 -3 -1 0\n"
                          "3 -4 -1 1 Job/Identification/RemoteEndpoint Job/Identification/Status "
                          "Process/Progress/Percent Print/Progress/Percent\n"
                          "2 -3 -1 0\n0 -3 -1 0\n6 -3 -1 0\n");
    EXPECT_THAT(takeCalls(), ElementsAre("16 local.set.callback 0"));
}

TEST_F(ManagerTest, HandsTextsOut) {
    const std::pair<const char*, std::wstring> texts[] = {{"plain", L"plain"},
                                                          {"\xc3\xb6", L"\u00f6"},
                                                          {"\xf6", L""},
                                                          {"\xed\xa0\x80", L""},
                                                          {"\xf4\x90\x80\x80", L""}};
    for (const auto& [stored, wide] : texts) {
        plugIn->set(3, job, std::string("text='") + stored);
        EXPECT_EQ(manager->GetStringParameter(3, job, "text"), wide) << stored;
    }
    plugIn->set(3, job, "double=0.5"); // Required: a double is read as an int.
    EXPECT_EQ(manager->GetDoubleParameter(3, job, "double"), -1.0);
}

TEST_F(ManagerTest, ReadsAndWritesArrays) {
    plugIn->set(3, job, "holes[1]=5 holes[2]='\xf6 holes[3]=6");
    const wxString umlaut = L"\u00f6"; // One character per byte.
    EXPECT_THAT(manager->GetIntArray(3, job, "holes"), ElementsAre(0, 5, 5, 6));
    EXPECT_THAT(manager->GetStringArray(3, job, "holes"), ElementsAre("", "", umlaut, umlaut));

    EXPECT_TRUE(manager->SetMultiParameter(job, 3, PARAM_INT, "holes", 0, nullptr));
    EXPECT_TRUE(manager->GetIntArray(3, job, "holes").empty());
    EXPECT_FALSE(manager->SetMultiParameter(13, 3, PARAM_STRING, "key", 0, nullptr));
}

TEST_F(ManagerTest, SearchesAndDeletesTickets) {
    int value = 5;
    char text[] = "x";
    plugIn->set(3, 13, "n=5 t='x");
    plugIn->set(3, 14, "n[1]=5 t='x");
    plugIn->set(3, 15, "n=5 t='x");
    EXPECT_THAT(manager->SearchTickets(3, "n", PARAM_INT, &value, false), ElementsAre(13, 14, 15));
    EXPECT_EQ(manager->SearchTicket(3, "t", text), 13);
    EXPECT_EQ(manager->SearchTicket(3, "t", "y"), -1);
    // For texts, only the first ticket, 12, is examined.
    EXPECT_THAT(manager->SearchTickets(3, "t", PARAM_STRING, text, false), ElementsAre());
    plugIn->set(3, job, "t='x");
    EXPECT_THAT(manager->SearchTickets(3, "t", PARAM_STRING, text, true), ElementsAre(job));

    EXPECT_TRUE(manager->DeleteTicketOfType(3, TICKET_ID_ALL));
    EXPECT_FALSE(plugIn->tickets().TicketExists(3, job) || plugIn->tickets().TicketExists(3, 15));
}

TEST_F(ManagerTest, PassesDataCommandsAndFilesOn) {
    std::string data(12041, 'd');
    std::string seen;
    plugIn->onCall = [&](int) {
        seen.assign(static_cast<const char*>(plugIn->data),
                    static_cast<std::size_t>(*plugIn->size));
    };
    for (const auto& [kind, size, first] :
         {std::tuple{11, 12040, 'd'}, {10, 12041, '\0'}, {2, 12041, 'd'}, {11, 90000, '\0'}}) {
        int count = size;
        EXPECT_EQ(manager->SetTicketData(3, kind, 0, &count, data.data()), 0);
        EXPECT_EQ(seen, std::string(static_cast<std::size_t>(size), first)) << size;
    }
    plugIn->onCall = nullptr;
    EXPECT_EQ(manager->SetTicketData(3, 10, 0, nullptr, nullptr), 0);
    takeCalls();
    char path[] = "/pre/view";
    manager->SendCommand("local.set.previewfolder", 99, path);
    manager->SendCommand("local.set.thumbnailfolder", 99, nullptr);
    manager->SendCommand("local.set.Previewfolder", 99, path);
    manager->PutFile("\x80", "\xc3\x84", false);
    manager->PutFile("\x80", "p", true);
    manager->GetFile("\x80", "g", false);
    manager->GetFile("g", "\x80", true);
    manager->SendJob(nullptr, "\x80", nullptr);
    EXPECT_THAT(takeCalls(),
                ElementsAre("16 local.set.previewfolder 9", "16 local.set.thumbnailfolder 0",
                            "16 local.set.Previewfolder 99", "17 \xc3\x84 \xc3\x84", "20 \x80 p",
                            "18 \xc3\x84 g", "24 g \xc3\x84", "19 \xc3\x84 (null)"));
}

} // namespace
