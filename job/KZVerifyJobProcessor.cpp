// SPDX-License-Identifier: Apache-2.0
#include "job/KZVerifyJobProcessor.h"

#include <memory>
#include <utility>

#include "Shared-Components/Tintgate/NerovaKZComm/CKZConnector.h"
#include "cli/CLogger.h"
#include "platform/TemporaryFolder.h"

namespace {

/// Used if the program has no folder of its own. Nothing can be created below it, so log and files
/// fail to open. With an empty name they would be written to the root folder.
constexpr const char* nowhere = "/dev/null/Tintgate";

/// The program's folder in the temporary folder, or `nowhere` if this user does not own that
/// folder. Paths are handled as bytes: a folder's name need not be valid text.
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
    // The second processor of a process has no folder (C13).
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
