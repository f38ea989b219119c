// SPDX-License-Identifier: Apache-2.0
// Closing a job's verification on the server.
#include "cli/CLogger.h"
#include "job/JobTicket.h"
#include "job/KZVerifyJobProcessor.h"
#include "jobkeys/JobState.h"
#include "jobkeys/StripKeys.h"

using namespace jobkeys;

namespace {

/// A strip's result, and so its number; an approval of 0 is one, too (C91). It is logged (C92).
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

// Nothing but the ticket tells what other runs have done. The strips are verified by processes of
// their own, each of which writes its result before it asks for the other's: so whichever comes
// second sees both.
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
