// SPDX-License-Identifier: Apache-2.0
#include "job/KZVerifyJobProcessor.h"

#include <memory>
#include <utility>

#include "Shared-Components/Tintgate/NerovaKZComm/CKZConnector.h"
#include "cli/CLogger.h"
#include "platform/TemporaryFolder.h"

namespace {

/// Where the program has no folder of its own: nothing can be made below it, so that log and files
/// fail to open. An empty name would put them at the top of the machine.
constexpr const char* nowhere = "/dev/null/Tintgate";

/// The program's folder in the temporary folder; nowhere if that is no folder of this user's own.
/// As bytes throughout: a folder's name need not be valid text.
wxString makeWorkingDir() {
    std::string folder = platform::temporaryFolder();
    if (folder.empty()) {
        return nowhere;
    }
    while (folder.size() > 1 && folder.back() == '/') {
        folder.pop_back();
    }
    folder += "/Tintgate";
    return platform::haveOwnFolder(folder, 0777) ? wxString(stringToWstring(folder))
                                                 : wxString(nowhere);
}

} // namespace

KZVerifyJobProcessor::KZVerifyJobProcessor() : m_workingDir(SetWorkingDir()) {
    // A second processor of a process has no folder (C13).
    CLogger::InitLogger((m_workingDir.empty() ? nowhere : GetNerovaKZJobDataDir()) +
                        "/TintgateKZ.log");
}

KZVerifyJobProcessor::~KZVerifyJobProcessor() {
    CLogger::DeleteLogger();
    delete m_connector;
}

wxString KZVerifyJobProcessor::SetWorkingDir() {
    static bool done = false;
    return std::exchange(done, true) ? wxString() : makeWorkingDir();
}

std::string KZVerifyJobProcessor::GetNerovaKZJobDataDir() const {
    return wstringToString(m_workingDir.ToStdWstring());
}

CKZConnector* KZVerifyJobProcessor::ConnectToKZWithLoginCredentials(std::wstring host,
                                                                    std::wstring user,
                                                                    std::wstring password,
                                                                    int applicationID, bool flag) {
    m_lastRetCode = 0;
    auto connector = std::make_unique<CKZConnector>(std::move(host), std::move(user),
                                                    std::move(password), applicationID, flag,
                                                    /*privateManager=*/false);
    m_lastRetCode = connector->getLastRetCode();
    return connector->IsLoggedIn() ? connector.release() : nullptr;
}

wxString myMkTmpDirName() {
    static bool done = false;
    return std::exchange(done, true) ? wxString() : makeWorkingDir();
}
