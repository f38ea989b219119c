// SPDX-License-Identifier: Apache-2.0
// Closing a job's verification on the server.
#include "cli/CLogger.h"
#include "job/JobTicket.h"
#include "job/KZVerifyJobProcessor.h"
#include "jobkeys/JobState.h"
#include "jobkeys/StripKeys.h"

using namespace jobkeys;

namespace {

/// Whether a strip has a result. An approval of 0 is one too (C91). Logs the read (C92).
bool hasResult(const JobTicket& ticket, Strip strip) {
    int approval = -1;
    const int code = ticket.read(measurementKey(strip, "Approval"), -1, &approval);
    CLogger::GetLogger()->Log("Read Approvals%d, err=%d, iTmp==%d", numberOf(strip), code,
                              approval);
    if (code != 0 || approval < 0) {
        return false;
    }
    CLogger::GetLogger()->Log("%s Strip verified YES", strip == Strip::First ? "First" : "Second");
    return true;
}

} // namespace

// Only the ticket shows what other runs have done. Each strip is verified by its own process, which
// writes its result before it reads the other strip's. So the process that comes second sees both.
int KZVerifyJobProcessor::SetJobStatus(int jobID, bool approved) {
    const JobTicket ticket(m_connector, jobID);
    int active = 0;
    int result = ticket.read(verifyActiveKey, 0, &active);
    const bool hasTwoStrips = result == 0 && active == activeForTwoStrips;
    CLogger::GetLogger()->Log("Job With Two Strips = %d", hasTwoStrips ? 1 : 0);
    if (hasTwoStrips) {
        result = 0;
        if (!hasResult(ticket, Strip::First) || !hasResult(ticket, Strip::Second)) {
            return result;
        }
    }
    ticket.write(showInVerifierKey, 0);
    const int status = approved ? verifiedStatus : failedStatus;
    ticket.write("Process/InfoMessage", approved ? "Verified" : "Verification Failed");
    CLogger::GetLogger()->Log("Set Job Status = %d", status);
    ticket.write(displayStatusKey, status);
    ticket.write("Job/Identification/Status", status);
    return result;
}
