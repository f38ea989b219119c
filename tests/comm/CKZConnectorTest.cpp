// SPDX-License-Identifier: Apache-2.0
#include "Shared-Components/Tintgate/NerovaKZComm/CKZConnector.h"

#include <algorithm>
#include <chrono>
#include <fstream>
#include <sstream>
#include <thread>

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

    plugIn->set(0, 0, "System/Product/MajorVersion=4"); // Too old: logs out at once.
    connector = connect();
    EXPECT_FALSE(connector->IsLoggedIn());
    EXPECT_EQ(connector->getLastRetCode(), 0);
    EXPECT_THAT(takeCalls(), ElementsAre("3", "4", "6", "26 host 50005", "9", "12", "10", "11"));
    connector.reset();
    plugIn->results[6] = 4;
    EXPECT_EQ(connect()->getLastRetCode(), 4);
    EXPECT_THAT(takeCalls(), ElementsAre("3", "4", "6")) << "no more than the step that failed";
}

TEST_F(ConnectorTest, ReadsValuesWithDefaultsAndArraysUpToAMaximum) {
    const auto connector = connect();
    double values[6] = {9};
    double half = 0.5;
    for (double* const fallback : {static_cast<double*>(nullptr), &half}) {
        EXPECT_EQ(
            connector->GetJobTicketKeyValue(3, job, "none", PARAM_DOUBLE, values, fallback, 0), -1);
        EXPECT_EQ(values[0], fallback == nullptr ? 9 : half);
    }
    int number = 0; // The pointer value itself is the default.
    connector->GetJobTicketKeyValue(3, job, "none", PARAM_INT, &number,
                                    reinterpret_cast<void*>(0x1FFFFFFFEL), 0);
    EXPECT_EQ(number, -2);

    plugIn->set(3, job, "d=1.0,2.0,3.0,4.0,5.0");
    const auto read = [&](PARAM_TYPE type, int maximum) {
        connector->GetJobTicketKeyArrayValues(3, job, "d", type, maximum, &number, values);
        return number;
    };
    EXPECT_EQ(read(PARAM_STRING, 3), -2) << "a type that is none for arrays changes nothing";
    EXPECT_EQ(read(PARAM_DOUBLE, 3), 3);
    EXPECT_THAT(values, ElementsAre(1, 2, 3, 0, 0, 0));
    EXPECT_LT(read(PARAM_DOUBLE, -1), 1);
}

TEST_F(ConnectorTest, FindsTheJobsToVerify) {
    const auto connector = connect();
    const struct {
        int id, displayStatus, fileType, showInVerifier, verifyActive;
    } tickets[] = {{20, 208, 1, 0, 3}, {21, 208, 4096, 0, 3}, {22, 208, 1, 0, 1},
                   {23, 209, 1, 0, 0}, {24, 212, 4096, 0, 0}, {25, 213, 1, 1, 0},
                   {26, 207, 1, 0, 3}, {27, 212, 1, 1, 0}};
    // Job 12 has no values: those of the previous job count, except for verify active.
    const int ids[] = {20, job, 21, 22, 23, 24, 25, 26, 27};
    for (const auto& [id, displayStatus, fileType, showInVerifier, verifyActive] : tickets) {
        std::ostringstream records;
        records << "Job/Display/Status=" << displayStatus << " Input/FileType=" << fileType
                << " Remote/ShowInVerifier=" << showInVerifier
                << " Workflow/Verify/Active=" << verifyActive;
        plugIn->set(3, id, records.str());
    }
    const struct {
        bool remeasure;
        int counted, written, code; // What the plug-in reports, writes and returns.
        int result;
        std::vector<int> found;
    } cases[] = {
        {false, 9, 9, 0, 0, {20, job, 22, 25, 27}},
        {true, 9, 1000, 0, 0, {20, 21, 23, 27}},
        {true, 9, 1, 0, 0, {20}},
        {true, 9, 0, 0, 0, {}},
        {true, 9, 9, 1, -1, {}},
        {true, 0, 9, 0, -1, {}},
        {true, 0x7FFFFFFF, 9, 0, -1, {}},
    };
    for (const auto& [remeasure, counted, written, code, result, expected] : cases) {
        plugIn->onCall = [&, counted = counted, written = written, code = code](int slot) {
            if (slot == 13 && *plugIn->size == 4) {
                *static_cast<int*>(plugIn->data) = counted;
            } else if (slot == 13) {
                std::copy_n(ids, std::min(written, 9), static_cast<int*>(plugIn->data));
                *plugIn->size = written * static_cast<int>(sizeof(int));
                plugIn->results[13] = code;
            }
        };
        int* found = nullptr;
        int count = 9;
        EXPECT_EQ(connector->GetVerifierJobTicketIDs(&found, &count, remeasure), result);
        EXPECT_EQ(std::vector<int>(found, found + count), expected) << counted << ", " << written;
        EXPECT_TRUE(count > 0 || found == nullptr || code != 0);
        std::free(found);
        plugIn->results.clear();
    }
    EXPECT_THAT(takeCalls(), testing::IsSupersetOf({"13 3 0 0 4", "13 3 1 0 36"}));
}

TEST_F(ConnectorTest, WaitsForAFileAndTakesNoOldOne) {
    const auto connector = connect();
    const std::string local = m_root.path("local.txt");
    std::thread delivery;
    plugIn->onCall = [&](int slot) {
        if (slot == 18) {
            EXPECT_FALSE(support::exists(local)); // The old one is not mistaken for the new one.
            delivery = std::thread([&] {
                std::this_thread::sleep_for(std::chrono::milliseconds(50));
                std::ofstream(local) << "new";
            });
        }
    };
    const struct {
        int limit, code;
        bool result;
    } cases[] = {{5000, 0, true}, {20, 0, false}, {0, 0, false}, {5000, 3, false}};
    for (const auto& [limit, code, result] : cases) {
        std::ofstream(local) << "old";
        plugIn->results[18] = code;
        EXPECT_EQ(connector->DownloadFile(local, "server.txt", limit), result) << limit;
        // Waits for the file even if the plug-in refuses.
        EXPECT_TRUE(limit < 5000 || support::exists(local)) << code;
        delivery.join();
    }
    EXPECT_EQ(takeCalls().back(), "18 " + local + " server.txt");
    plugIn->onCall = nullptr;
    plugIn->results.clear();
    EXPECT_FALSE(connector->DownloadFile("/proc/self/status", "x", 40)) << "it can't be removed";

    EXPECT_TRUE(connector->UploadFile(L"J\u00f6\xdcff", "to"));
    EXPECT_EQ(takeCalls().back(), "20 J\xc3\xb6\xff to");
    plugIn->results[26] = 2;
    EXPECT_FALSE(connector->UploadFile(local, "x") || connector->DownloadFile(local, "x", 40));
}

TEST(EncodeUsingMD5, AgreesWithMd5sum) {
    EXPECT_EQ(EncodeUsingMD5(std::string("a\0b", 3)), "70350F6027BCE3713F6B76473084309B");
}

} // namespace
