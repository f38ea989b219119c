#include "Shared-Components/Tintgate/NerovaKZComm/CKZConnector.h"

#include <algorithm>
#include <chrono>
#include <filesystem>
#include <fstream>
#include <thread>

#include "RunProgram.h"
#include "Shared-Components/Tintgate/NerovaKZComm/ComGUIManager.h"
#include "tests/comm/CommTest.h"

namespace {

using testing::ElementsAre;

class ConnectorTest : public CommTest {
  protected:
    ~ConnectorTest() override { delete m_manager; }

    std::unique_ptr<CKZConnector> connect(const std::wstring& host = L"host") {
        auto connector =
            std::make_unique<CKZConnector>(host, L"\u0141us", L"p\u00e4ss", 0x5071103, false, true);
        delete std::exchange(m_manager, connector->getComGUIMngrInstance());
        return connector;
    }

    const std::string m_local = m_root.path("local.txt");

  private:
    ComGUIManager* m_manager = nullptr;
};

TEST_F(ConnectorTest, LogsInStepByStep) {
    auto connector = connect();
    EXPECT_TRUE(connector->IsLoggedIn());
    EXPECT_THAT(takeCalls(), ElementsAre("3", "4", "6", "26 host 50005", "9", "12"));
    EXPECT_STREQ(plugIn->record.user, "Aus");
    EXPECT_STREQ(plugIn->record.password, "p\xe4ss");
    connector.reset();
    EXPECT_THAT(takeCalls(), ElementsAre("10", "11"));

    plugIn->set(0, 0, "System/Product/MajorVersion", 4);
    const struct {
        int slot;
        int answer;
        int code;
        const char* lastCall;
    } cases[] = {
        {6, 4, 4, "6"},
        {26, 2, -2005, "26 host 50005"},
        {9, -2030, -2030, "9"},
        {0, 0, 0, "11"}, // The server is too old.
    };
    for (const auto& [slot, answer, code, lastCall] : cases) {
        plugIn->results = {{slot, answer}};
        connector = connect();
        EXPECT_FALSE(connector->IsLoggedIn()) << slot;
        EXPECT_EQ(connector->getLastRetCode(), code) << slot;
        connector.reset();
        EXPECT_EQ(takeCalls().back(), lastCall) << slot;
    }
}

TEST_F(ConnectorTest, WithoutAnAddressDoesNothing) {
    const auto connector = connect(L"");
    std::wstring text;
    int count = 7;
    int* ids = nullptr;
    EXPECT_EQ(connector->GetServerInfo(&text, &text), -1);
    EXPECT_FALSE(connector->IsAlive() || connector->DownloadFile("a", "b", 1000));
    EXPECT_EQ(connector->GetVerifierJobTicketIDs(&ids, &count, true), -1);
    connector->GetJobTicketKeyArrayValues(3, job, "k", PARAM_INT, 9, &count, nullptr);
    EXPECT_EQ(count, 0);
    EXPECT_EQ(connector->GetReferenceProfilePath(job, 1, &text), 0);
}

TEST_F(ConnectorTest, ReadsValuesWithDefaults) {
    const auto connector = connect();
    int number = 0;
    double real = 1.5;
    double half = 0.5;
    const char* text = "stays";
    const auto read = [&](const char* key, PARAM_TYPE type, void* out, void* fallback) {
        return connector->GetJobTicketKeyValue(3, job, key, type, out, fallback, POSITION_WHOLE);
    };
    plugIn->set(3, job, "int", 7);
    EXPECT_EQ(read("int", PARAM_INT, &number, nullptr), 0);
    EXPECT_EQ(number, 7);
    EXPECT_EQ(read("none", PARAM_INT, &number, reinterpret_cast<void*>(0x1FFFFFFFEL)), -1);
    EXPECT_EQ(number, -2);
    EXPECT_EQ(read("int", PARAM_DOUBLE, &real, nullptr), -1);
    EXPECT_EQ(real, 1.5);
    EXPECT_EQ(read("int", PARAM_DOUBLE, &real, &half), -1);
    EXPECT_EQ(real, 0.5);
    EXPECT_EQ(read("int", PARAM_STRING, &text, &half), -1);
    EXPECT_STREQ(text, "stays");
}

TEST_F(ConnectorTest, ReadsAndWritesArrays) {
    const auto connector = connect();
    double doubles[] = {1, 2, 3, 4, 5};
    const char* texts[] = {"a", "b"};
    EXPECT_TRUE(connector->SetJobArrayParameter(3, job, "d", PARAM_DOUBLE, 5, doubles));
    EXPECT_TRUE(connector->SetJobArrayParameter(3, job, "t", PARAM_STRING, 2, texts));
    double values[6] = {};
    int count = 9;
    const auto read = [&](const char* key, PARAM_TYPE type, int maximum) {
        connector->GetJobTicketKeyArrayValues(3, job, key, type, maximum, &count, values);
        return count;
    };
    EXPECT_EQ(read("d", PARAM_STRING, 3), 9);
    EXPECT_EQ(read("d", PARAM_DOUBLE, 3), 3);
    EXPECT_THAT(values, ElementsAre(1, 2, 3, 0, 0, 0));
    EXPECT_LT(read("d", PARAM_DOUBLE, -1), 1);
    EXPECT_EQ(read("none", PARAM_DOUBLE, 3), 0);

    std::vector<std::string> strings = {"before"};
    EXPECT_EQ(connector->GetJobTicketStringArray(3, job, "t", &strings), 0);
    EXPECT_EQ(connector->GetJobTicketStringArray(3, job, "none", &strings), -1);
    EXPECT_EQ(connector->SetJobTicketKeyValue(3, job, "t", PARAM_INT, &count, 1), 0);
    EXPECT_EQ(connector->GetJobTicketStringArray(3, job, "t", &strings), -1);
    EXPECT_THAT(strings, ElementsAre("before", "a", "b", "a"));
}

TEST_F(ConnectorTest, FindsTheJobsToVerify) {
    const auto connector = connect();
    const struct {
        int id, displayStatus, fileType, showInVerifier, verifyActive;
    } jobs[] = {{20, 208, 1, 0, 3}, {21, 208, 4096, 0, 3}, {22, 208, 1, 0, 1},
                {23, 209, 1, 0, 0}, {24, 212, 4096, 0, 0}, {25, 213, 1, 1, 0},
                {26, 207, 1, 0, 3}, {27, 212, 1, 1, 0}};
    // Job 12 holds nothing: it is judged by the one before it, but for verify active.
    std::vector<int> ids = {20, job, 21, 22, 23, 24, 25, 26, 27};
    for (const auto& [id, displayStatus, fileType, showInVerifier, verifyActive] : jobs) {
        plugIn->tickets().CreateOrOpenTicket(3, id, nullptr);
        plugIn->set(3, id, "Job/Display/Status", displayStatus);
        plugIn->set(3, id, "Input/FileType", fileType);
        plugIn->set(3, id, "Remote/ShowInVerifier", showInVerifier);
        plugIn->set(3, id, "Workflow/Verify/Active", verifyActive);
    }
    int number = 9; // As the plug-in counts them, and then how many it writes, with which result.
    int written = 9;
    int code = 0;
    plugIn->onCall = [&](int slot) {
        if (slot == 13 && *plugIn->size == 4) {
            *static_cast<int*>(plugIn->data) = number;
        } else if (slot == 13) {
            std::copy_n(ids.begin(), std::min(written, 9), static_cast<int*>(plugIn->data));
            *plugIn->size = written * static_cast<int>(sizeof(int));
            plugIn->results[13] = code;
        }
    };
    const auto find = [&](bool remeasure, int result) {
        int* found = &code;
        int count = 9;
        EXPECT_EQ(connector->GetVerifierJobTicketIDs(&found, &count, remeasure), result);
        EXPECT_TRUE(count > 0 || found == nullptr || code != 0);
        const std::vector<int> list(found, found + count);
        std::free(found);
        plugIn->results.clear();
        return list;
    };
    takeCalls();
    EXPECT_THAT(find(false, 0), ElementsAre(20, job, 22, 25, 27));
    EXPECT_THAT(takeCalls(), testing::IsSupersetOf({"13 3 0 0 4", "13 3 1 0 36"}));
    EXPECT_THAT(find(true, 0), ElementsAre(20, 21, 23, 27));
    written = 1000;
    EXPECT_THAT(find(true, 0), ElementsAre(20, 21, 23, 27));
    written = 1;
    EXPECT_THAT(find(true, 0), ElementsAre(20));
    written = 0;
    EXPECT_THAT(find(true, 0), ElementsAre());
    code = 1;
    EXPECT_THAT(find(true, -1), ElementsAre());
    for (const int none : {0, -1, 0x7FFFFFFF}) {
        number = none;
        EXPECT_THAT(find(true, -1), ElementsAre()) << none;
    }
}

TEST_F(ConnectorTest, MovesFiles) {
    const auto connector = connect();
    const wxString local = wxString::FromUTF8(m_local);
    std::thread delivery;
    int delay = 0;
    plugIn->onCall = [&](int slot) {
        if (slot == 18) {
            EXPECT_FALSE(support::exists(m_local)); // The old one is not taken for the new one.
            delivery = std::thread([this, wait = delay] {
                std::this_thread::sleep_for(std::chrono::milliseconds(wait));
                std::ofstream(m_local) << "new";
            });
        }
    };
    const auto download = [&](int limit, int milliseconds) {
        std::ofstream(m_local) << "old";
        delay = milliseconds;
        const bool result = connector->DownloadFile(local, "server.txt", limit);
        delivery.join();
        return result;
    };
    EXPECT_TRUE(download(5000, 50));
    EXPECT_EQ(takeCalls().back(), "18 " + m_local + " server.txt");
    EXPECT_FALSE(download(60, 300));
    EXPECT_FALSE(download(0, 0));
    plugIn->results[18] = 3;
    EXPECT_FALSE(download(5000, 50));
    EXPECT_EQ(support::contentsOf(m_local), "new"); // It was waited for all the same.
    plugIn->results.clear();
    plugIn->onCall = nullptr;
    std::filesystem::remove(m_local);
    std::filesystem::create_directory(m_local);
    EXPECT_FALSE(connector->DownloadFile(local, "server.txt", 40));
    EXPECT_TRUE(support::exists(m_local));

    EXPECT_TRUE(connector->UploadFile(L"J\u00f6\xdcff", "to"));
    EXPECT_EQ(takeCalls().back(), "20 J\xc3\xb6\xff to");
    plugIn->results[26] = 2;
    EXPECT_FALSE(connector->UploadFile(local, "x") || connector->DownloadFile(local, "x", 40));
}

TEST_F(ConnectorTest, DownloadsNothingOverAFileThatStays) {
    const auto connector = connect();
    std::ofstream(m_local) << "old";
    const std::filesystem::path folder = m_root.path();
    std::filesystem::permissions(folder.parent_path(), std::filesystem::perms(0711));
    std::filesystem::permissions(folder, std::filesystem::perms(0555));
    const auto downloadAsOrdinaryUser = [&] {
        constexpr unsigned nobody = 65534;
        const bool became = support::becomeUser(nobody);
        std::exit(connector->DownloadFile(wxString::FromUTF8(m_local), "x", 100) || !became);
    };
    EXPECT_EXIT(downloadAsOrdinaryUser(), testing::ExitedWithCode(0), "");
    EXPECT_EQ(support::contentsOf(m_local), "old");
}

TEST_F(ConnectorTest, FindsTheReferenceProfile) {
    const auto connector = connect();
    std::wstring path = L"x";
    EXPECT_EQ(connector->GetReferenceProfilePath(job, 1, &path), -1);
    EXPECT_EQ(path, L"");
    plugIn->set(3, job, "Remote/UsedICCProfile", "used");
    plugIn->set(3, job, "Footer/ControlstripInputProfile", "");
    plugIn->set(3, job, "Footer/ControlstripInputProfile2", "second\xe4");
    EXPECT_EQ(connector->GetReferenceProfilePath(job, 1, &path), 0);
    EXPECT_EQ(path, L"used");
    EXPECT_EQ(connector->GetReferenceProfilePath(job, 2, &path), 0);
    EXPECT_EQ(path, std::wstring(L"second") + wchar_t(0xFFFFFFE4));
}

TEST(EncodeUsingMD5, AgreesWithItsSource) {
    // From the test suite of RFC 1321, and by md5sum(1).
    EXPECT_EQ(EncodeUsingMD5(""), "D41D8CD98F00B204E9800998ECF8427E");
    EXPECT_EQ(EncodeUsingMD5("message digest"), "F96B697D7CB7938D525A2F31AAF161D0");
    EXPECT_EQ(EncodeUsingMD5(std::string("a\0b", 3)), "70350F6027BCE3713F6B76473084309B");
}

} // namespace
