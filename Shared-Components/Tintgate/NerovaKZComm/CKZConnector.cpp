// SPDX-License-Identifier: Apache-2.0
#include "Shared-Components/Tintgate/NerovaKZComm/CKZConnector.h"

#include <algorithm>
#include <chrono>
#include <climits>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <thread>
#include <utility>

#include "Shared-Components/Tintgate/NerovaKZComm/ComGUIManager.h"
#include "base/Malloc.h"
#include "base/WideBytes.h"
#include "jobkeys/JobState.h"
#include "jobkeys/Lookups.h"
#include "jobkeys/Tickets.h"
#include "text/StringUtilsComGUI.h"
#include "ticket/ParameterTables.h"

namespace {

constexpr int serverPort = 50005;
constexpr int oldestServer = 5;

// UTF-8. A path that is not valid text keeps its bytes.
std::string pathBytes(const wxString& path) {
    return base::bytesFromWide(path.ToStdWstring());
}

bool isRegularFile(const std::string& path) {
    std::error_code ignored;
    return std::filesystem::is_regular_file(path, ignored);
}

bool isRemovedOrMissing(const std::string& path) {
    std::error_code failure;
    return !isRegularFile(path) || std::filesystem::remove(path, failure);
}

template<class Array, class Value>
void copyElements(const Array& array, int maximum, int* count, Value* values) {
    *count = static_cast<int>(array.GetCount());
    if (*count > 0) {
        *count = std::min(*count, maximum);
        for (int i = 0; i < *count; ++i) {
            values[i] = array[static_cast<std::size_t>(i)];
        }
    }
}

struct JobStatus {
    int displayStatus = 0;
    int subType = 0;
    int fileType = 0;
    int showInVerifier = 0;
    int verifyActive = 0;
};

bool isToBeVerified(const JobStatus& job, bool remeasure) {
    const bool suitable = job.fileType != jobkeys::unsuitableFileType;
    const bool isWaiting = job.displayStatus == jobkeys::waitingStatus;
    const bool isMeasured =
        job.displayStatus > jobkeys::waitingStatus && job.displayStatus <= jobkeys::failedStatus;
    return remeasure ? (isMeasured && suitable) || (isWaiting && job.verifyActive == 1)
                     : (isWaiting || job.showInVerifier == 1) && suitable;
}

// Null if the number exceeds what a type can have or if memory runs out.
base::Malloced<int[]> roomForIds(int number) {
    const std::size_t bytes = static_cast<std::size_t>(number) * sizeof(int);
    const bool possible = static_cast<unsigned long>(number) <= ticket::maxElements;
    return base::Malloced<int[]>(possible ? static_cast<int*>(std::malloc(bytes)) : nullptr);
}

} // namespace

CKZConnector::CKZConnector(std::wstring serverAddress, std::wstring userName, std::wstring password,
                           int applicationID, bool, bool privateManager)
    : m_serverAddress(std::move(serverAddress)), m_userName(std::move(userName)),
      m_password(std::move(password)) {
    if (!m_serverAddress.empty()) {
        m_manager = ComGUIManager::GetInstance(privateManager);
        m_lastReturnCode = LogIn(applicationID);
    }
}

CKZConnector::~CKZConnector() {
    if (!m_loggedIn) {
        return;
    }
    try {
        m_manager->Logout();
        m_manager->Uninitialize();
    } catch (...) {
        // A plug-in's exception during logout has no further consequence.
    }
    m_loggedIn = false;
}

// Returns the code of the last step of the login.
int CKZConnector::LogIn(int applicationID) {
    const std::string user = StringUtilsComGUI::stringFromwstring(m_userName);
    const std::string password = StringUtilsComGUI::stringFromwstring(m_password);
    const std::string server = StringUtilsComGUI::stringFromwstring(m_serverAddress);
    int code = m_manager->Initialize(user.c_str(), password.c_str(), server.c_str(), serverPort,
                                     applicationID);
    if (code == 0) {
        code = m_manager->IsAlive(nullptr, 0);
    }
    if (code == 0) {
        code = m_manager->Login(nullptr, nullptr, nullptr, -1);
    }
    if (code != 0) {
        return code;
    }
    m_serverMajorVersion = m_manager->GetIntParameter(0, 0, "System/Product/MajorVersion");
    if (m_serverMajorVersion < oldestServer) {
        m_manager->Logout();
        m_manager->Uninitialize();
    } else {
        m_loggedIn = true;
    }
    return 0;
}

bool CKZConnector::HasLiveServer() {
    return m_manager != nullptr && m_manager->IsAlive(nullptr, 0) == 0;
}

bool CKZConnector::IsAlive() {
    return HasLiveServer();
}

int CKZConnector::GetServerInfo(std::wstring* ip, std::wstring* name) {
    *ip = m_serverAddress;
    if (m_manager == nullptr) {
        return -1;
    }
    *name = m_manager->GetServerName();
    *ip = m_manager->GetServerIP();
    return 0;
}

int CKZConnector::Read(int type, int id, const char* key, PARAM_TYPE ptype, void* out,
                       int position) {
    return m_manager == nullptr ? 0 : m_manager->GetParameter(type, id, key, ptype, out, position);
}

int CKZConnector::GetJobStatus(int jobID, int* displayStatus, int* subType, int* fileType,
                               int* showInVerifier, int* verifyActive) {
    const auto read = [&](const char* key, int* out) {
        Read(jobkeys::jobType, jobID, key, PARAM_INT, out, POSITION_WHOLE);
    };
    read(jobkeys::subTypeKey, subType);
    read(jobkeys::displayStatusKey, displayStatus);
    read(jobkeys::showInVerifierKey, showInVerifier);
    read(jobkeys::fileTypeKey, fileType);
    read(jobkeys::verifyActiveKey, verifyActive);
    *verifyActive = *verifyActive == jobkeys::activeForTwoStrips ? 1 : 0;
    return 0;
}

int CKZConnector::GetJobTicketKeyValue(int type, int id, const char* key, PARAM_TYPE ptype,
                                       void* out, void* fallback, int position) {
    if (Read(type, id, key, ptype, out, position) == 1) {
        return 0;
    }
    // An int's default is the pointer's own value; a double's is the value it points to (C112).
    if (ptype == PARAM_INT) {
        *static_cast<int*>(out) = static_cast<int>(reinterpret_cast<std::intptr_t>(fallback));
    } else if (ptype == PARAM_DOUBLE && fallback != nullptr) {
        *static_cast<double*>(out) = *static_cast<const double*>(fallback);
    }
    return -1;
}

int CKZConnector::GetJobTicketKeyArrayValues(int type, int id, const char* key, PARAM_TYPE ptype,
                                             int maximum, int* count, void* values) {
    if (ptype == PARAM_INT) {
        copyElements(m_manager == nullptr ? wxArrayInt() : m_manager->GetIntArray(type, id, key),
                     maximum, count, static_cast<int*>(values));
    } else if (ptype == PARAM_DOUBLE) {
        copyElements(m_manager == nullptr ? wxArrayDouble()
                                          : m_manager->GetDoubleArray(type, id, key),
                     maximum, count, static_cast<double*>(values));
    }
    return 0;
}

int CKZConnector::GetJobTicketStringArray(int type, int id, const char* key,
                                          std::vector<std::string>* values) {
    unsigned long count = 0;
    if (Read(type, id, key, PARAM_COUNT, &count, POSITION_WHOLE) != 1 || count < 1 ||
        count > ticket::maxElements) {
        return -1;
    }
    for (int position = 0; position < static_cast<int>(count); ++position) {
        const char* text = nullptr;
        if (Read(type, id, key, PARAM_STRING, &text, position) != 1 || text == nullptr) {
            return -1;
        }
        values->push_back(text);
    }
    return 0;
}

int CKZConnector::GetVerifierJobTicketIDs(int** ids, int* count, bool remeasure) {
    constexpr int numberKind = 0;
    constexpr int idsKind = 1;
    *ids = nullptr;
    *count = 0;
    if (m_manager == nullptr) {
        return -1;
    }
    int number = 0;
    int size = sizeof number;
    if (m_manager->GetTicketData(jobkeys::jobType, numberKind, 0, &size, &number) != 0 ||
        number < 1) {
        return -1;
    }
    const base::Malloced<int[]> all = roomForIds(number);
    base::Malloced<int[]> selected = roomForIds(number);
    if (all == nullptr || selected == nullptr) {
        return -1;
    }
    *ids = selected.release();
    size = number * static_cast<int>(sizeof(int));
    if (m_manager->GetTicketData(jobkeys::jobType, idsKind, 0, &size, all.get()) != 0) {
        return -1; // The caller keeps *ids (C115).
    }
    // Jobs may have been deleted since they were counted.
    number = std::clamp(size / static_cast<int>(sizeof(int)), 0, number);

    JobStatus status; // A missing value keeps that of the previous job (C114).
    for (int i = 0; i < number; ++i) {
        GetJobStatus(all[i], &status.displayStatus, &status.subType, &status.fileType,
                     &status.showInVerifier, &status.verifyActive);
        if (isToBeVerified(status, remeasure)) {
            (*ids)[(*count)++] = all[i];
        }
    }
    if (*count == 0) {
        std::free(*ids);
        *ids = nullptr;
    }
    return 0;
}

bool CKZConnector::DownloadFile(wxString localPath, wxString serverPath, int limit) {
    constexpr int step = 20;
    if (localPath.empty() || serverPath.empty() || !HasLiveServer()) {
        return false;
    }
    const std::string local = pathBytes(localPath);
    if (!isRemovedOrMissing(local)) {
        return false; // The old file must not be mistaken for the new one.
    }
    const int code = m_manager->GetFile(local.c_str(), pathBytes(serverPath).c_str(), false);
    int waited = 0;
    while (!isRegularFile(local) && waited < limit) {
        std::this_thread::sleep_for(std::chrono::milliseconds(step));
        waited += step;
    }
    return code == 0 && waited < limit;
}

bool CKZConnector::UploadFile(wxString first, wxString second) {
    if (first.empty() || second.empty() || !HasLiveServer()) {
        return false;
    }
    return m_manager->PutFile(pathBytes(first).c_str(), pathBytes(second).c_str(), true) == 0;
}

int CKZConnector::GetReferenceProfilePath(int jobID, int strip, std::wstring* path) {
    path->clear();
    if (!HasLiveServer()) {
        return 0;
    }
    const char* text = nullptr;
    const auto read = [&](const char* key) {
        return GetJobTicketKeyValue(jobkeys::jobType, jobID, key, PARAM_STRING, &text, nullptr,
                                    POSITION_WHOLE);
    };
    int result = -1;
    for (const jobkeys::Strip known : jobkeys::strips) {
        if (strip == numberOf(known)) {
            result = read(stripKey(known, jobkeys::stripProfileKey).c_str());
        }
    }
    if (result != 0 || text == nullptr || *text == '\0') {
        result = read(jobkeys::usedProfileKey);
    }
    if (result == 0 && text != nullptr) {
        *path = StringUtilsComGUI::wstringFromstring(text);
    }
    return result;
}

int CKZConnector::SetJobTicketKeyValue(int type, int id, const char* key, PARAM_TYPE ptype,
                                       void* value, int position) {
    return m_manager == nullptr
               ? -1
               : m_manager->SetTicketParameter(type, id, key, ptype, value, position);
}

bool CKZConnector::SetJobArrayParameter(int type, int id, const char* key, PARAM_TYPE ptype,
                                        int count, void* values) {
    return m_manager != nullptr &&
           m_manager->SetMultiParameter(id, type, ptype, key, count, values);
}
