// SPDX-License-Identifier: Apache-2.0
// What the job logic holds of the server: a login from construction to destruction, and the
// server's tickets and files in the job's own terms.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include <wx/string.h>

#include "Shared-Components/Tintgate/NerovaKZComm/EncodeUsingMD5.h"
#include "ticket/ParameterRecords.h"

class ComGUIManager;

/// Where there is no login, reads find nothing and all else fails. Nothing is tried twice.
///
/// Positions: POSITION_WHOLE or an element.
class CKZConnector {
  public:
    /// The whole login: Initialize, IsAlive, Login, and a server of major version 5 at least. How
    /// it went is told by IsLoggedIn and getLastRetCode: -2005 when the server does not answer, the
    /// plug-in's code for what it refused, and 0 with no login for an older server (C117). An empty
    /// address gives an object that does nothing.
    ///
    /// Names and passwords reach the plug-in as the low 8 bits of each character, up to a first
    /// zero and 127 of them at most (C97). A private manager is not destroyed with the connector.
    CKZConnector(std::wstring serverAddress, std::wstring userName, std::wstring password,
                 int applicationID, bool unused, bool privateManager);
    /// Logs out.
    ~CKZConnector();
    CKZConnector(const CKZConnector&) = delete;
    CKZConnector& operator=(const CKZConnector&) = delete;

    bool IsLoggedIn() const { return m_loggedIn; }
    /// Result of the step of the login that failed, or 0.
    int getLastRetCode() const { return m_lastReturnCode; }
    /// Null without a server address.
    ComGUIManager* getComGUIMngrInstance() const { return m_manager; }

    bool IsAlive();
    void Clear() {}
    std::wstring GetServerIP() const { return m_serverAddress; }
    /// 0, or -1 without a manager, where *ip is the address as given.
    int GetServerInfo(std::wstring* ip, std::wstring* name);

    /// Always 0. What the ticket does not hold stays as it was; then *verifyActive becomes 1 where
    /// it is 3, else 0.
    int GetJobStatus(int jobID, int* displayStatus, int* subType, int* fileType,
                     int* showInVerifier, int* verifyActive);

    /// 0 and *out, or -1, in which case *out takes the default: for PARAM_INT the pointer's own
    /// value, cut to 32 bits; for PARAM_DOUBLE what it points to, nothing for null; for other types
    /// nothing.
    int GetJobTicketKeyValue(int type, int id, const char* key, PARAM_TYPE ptype, void* out,
                             void* fallback, int position);

    /// Always 0 (C113): *count is what came. At most `maximum` elements are stored in values, as
    /// ints for PARAM_INT and doubles for PARAM_DOUBLE; other types touch nothing.
    int GetJobTicketKeyArrayValues(int type, int id, const char* key, PARAM_TYPE ptype, int maximum,
                                   int* count, void* values);

    /// Appends a key's texts. 0, or -1 where there are none or one can't be read; those before it
    /// stay appended.
    int GetJobTicketStringArray(int type, int id, const char* key,
                                std::vector<std::string>* values);

    /// The jobs to verify, or to remeasure. 0 with *ids from malloc, which the caller frees, null
    /// where no job is to be verified. -1 where there are no jobs; *ids may be allocated all the
    /// same, with *count 0.
    int GetVerifierJobTicketIDs(int** ids, int* count, bool remeasure);

    /// Fetches a file, waiting for it up to the limit, which it must not reach (C116). An old file
    /// of that name is removed first. False where that is not possible, too.
    bool DownloadFile(wxString localPath, wxString serverPath, int limitInMilliseconds);
    bool UploadFile(wxString first, wxString second);

    /// The reference profile of the control strip 1 or 2, else the job's. Without a server that
    /// answers 0 and an empty path (C118); -1 where there is none.
    int GetReferenceProfilePath(int jobID, int strip, std::wstring* path);

    /// As ComGUIManager::SetTicketParameter; -1 without a manager.
    int SetJobTicketKeyValue(int type, int id, const char* key, PARAM_TYPE ptype, void* value,
                             int position);
    /// As the array form of ComGUIManager::SetMultiParameter.
    bool SetJobArrayParameter(int type, int id, const char* key, PARAM_TYPE ptype, int count,
                              void* values);

  private:
    int LogIn(int applicationID);
    bool HasLiveServer();
    int Read(int type, int id, const char* key, PARAM_TYPE ptype, void* out, int position);

    ComGUIManager* m_manager = nullptr;
    std::wstring m_serverAddress;
    std::wstring m_userName;
    std::wstring m_password;
    bool m_loggedIn = false;
    std::int32_t m_serverMajorVersion = 0;
    std::int32_t m_lastReturnCode = 0;
};
