// SPDX-License-Identifier: Apache-2.0
#include "tests/job/JobOnStore.h"

namespace {

class JobStatus : public JobOnStore {};

TEST_F(JobStatus, IsClosedOnceAllStripsHaveAResult) {
    const std::string two = "Workflow/Verify/Active=3 ";
    const std::string first = "Remote/Measurement/Approval=0 ";
    const std::string second = "Remote/Measurement2/Approval=0 ";
    const std::string single = "Job With Two Strips = 0\n";
    const std::string twoLine = "Job With Two Strips = 1\n";
    const std::string firstLines = "Read Approvals1, err=0, iTmp==0\nFirst Strip verified YES\n";
    const struct {
        std::string ticket;
        bool approved;
        int code;
        int status; ///< 0 if the job is unchanged.
        std::string log;
    } cases[] = {
        {"Workflow/Verify/Active=1", true, 0, 211, single},
        {"other=1", true, -1, 211, single},
        {"Workflow/Verify/Active=3.0", false, -1, 212, single}, // Another type counts as missing.
        {two + second, true, 0, 0, twoLine + "Read Approvals1, err=-1, iTmp==-1\n"},
        {two + first, true, 0, 0, twoLine + firstLines + "Read Approvals2, err=-1, iTmp==-1\n"},
        {two + first + second, true, 0, 211,
         twoLine + firstLines + "Read Approvals2, err=0, iTmp==0\nSecond Strip verified YES\n"},
        {two + first + "Remote/Measurement2/Approval=1", false, 0, 212,
         twoLine + firstLines + "Read Approvals2, err=0, iTmp==1\nSecond Strip verified YES\n"},
    };
    int id = 100;
    for (const auto& [ticket, approved, code, status, log] : cases) {
        SCOPED_TRACE(ticket);
        engine->create(3, ++id);
        set(ticket, id);
        auto expected = keys(id);
        if (status != 0) {
            expected["Remote/ShowInVerifier"] = "0";
            expected["Process/InfoMessage"] = approved ? "'Verified" : "'Verification Failed";
            expected["Job/Display/Status"] = std::to_string(status);
            expected["Job/Identification/Status"] = std::to_string(status);
        }
        EXPECT_EQ(processor->SetJobStatus(id, approved), code);
        EXPECT_EQ(keys(id), expected);
        EXPECT_EQ(takeLog(),
                  log + (status == 0 ? "" : "Set Job Status = " + std::to_string(status) + "\n"));
    }
}

} // namespace
