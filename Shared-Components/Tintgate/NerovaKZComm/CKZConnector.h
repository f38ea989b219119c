// SPDX-License-Identifier: Apache-2.0
// The job logic's view of the server: a login that lasts from construction to destruction, and the
// server's tickets and files in the job's terms.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include <wx/string.h>

#include "Shared-Components/Tintgate/NerovaKZComm/EncodeUsingMD5.h"
#include "ticket/ParameterRecords.h"

class ComGUIManager;

/// Without a login, reads find nothing and everything else fails. Nothing is retried.
///
/// Positions are POSITION_WHOLE or an element.
class CKZConnector {
  public:
    /// Performs the whole login: Initialize, IsAlive, Login, and a check for server version 5 or
    /// later. IsLoggedIn and getLastRetCode give the result: -2005 if the server does not answer,
    /// the plug-in's code if it refuses, and 0 without a login for an older server (C117). With an
    /// empty address the object does nothing.
    ///
    /// Names and passwords are passed as the low 8 bits of each character, up to the first zero and
    /// at most 127 of them (C97). The connector does not destroy a private manager.
    CKZConnector(std::wstring serverAddress, std::wstring userName, std::wstring password,
                 int applicationID, bool unused, bool privateManager);
    /// Logs out.
    ~CKZConnector();
    CKZConnector(const CKZConnector&) = delete;
    CKZConnector& operator=(const CKZConnector&) = delete;

    bool IsLoggedIn() const { return m_loggedIn; }
    /// Result of the login step that failed, or 0.
    int getLastRetCode() const { return m_lastReturnCode; }
    /// Null if the server address is empty.
    ComGUIManager* getComGUIMngrInstance() const { return m_manager; }

    bool IsAlive();
    void Clear() {}
    std::wstring GetServerIP() const { return m_serverAddress; }
    /// 0. Without a manager returns -1 and sets *ip to the address as given.
    int GetServerInfo(std::wstring* ip, std::wstring* name);

    /// Always 0. Missing values leave their variables unchanged. Afterwards *verifyActive becomes 1
    /// if it is 3, otherwise 0.
    int GetJobStatus(int jobID, int* displayStatus, int* subType, int* fileType,
                     int* showInVerifier, int* verifyActive);

    /// Returns 0 and sets *out. On failure returns -1 and sets *out to the default: for PARAM_INT
    /// the pointer's own value, truncated to 32 bits; for PARAM_DOUBLE the value it points to, if
    /// not null. Other types have no default.
    int GetJobTicketKeyValue(int type, int id, const char* key, PARAM_TYPE ptype, void* out,
                             void* fallback, int position);

    /// Always 0 (C113); check *count, the number of elements received. Stores at most `maximum`
    /// elements in values, as ints for PARAM_INT and doubles for PARAM_DOUBLE, and nothing else.
    int GetJobTicketKeyArrayValues(int type, int id, const char* key, PARAM_TYPE ptype, int maximum,
                                   int* count, void* values);

    /// Appends a key's texts and returns 0. Returns -1 if there are none or if one can't be read;
    /// the texts before it stay appended.
    int GetJobTicketStringArray(int type, int id, const char* key,
                                std::vector<std::string>* values);

    /// The jobs to verify, or to remeasure. Returns 0 with *ids from malloc, which the caller
    /// frees; *ids is null if no job qualifies. Returns -1 if there are no jobs or their ids can't
    /// be read. *ids may be allocated even then, with *count 0.
    int GetVerifierJobTicketIDs(int** ids, int* count, bool remeasure);

    /// Downloads a file and waits for it. The wait must stay below the limit (C116). Removes an old
    /// file of that name first. False also if the removal fails.
    bool DownloadFile(wxString localPath, wxString serverPath, int limitInMilliseconds);
    bool UploadFile(wxString first, wxString second);

    /// The reference profile of control strip 1 or 2, or else the job's. Returns -1 if there is
    /// none. Returns 0 and an empty path if the server does not answer (C118).
    int GetReferenceProfilePath(int jobID, int strip, std::wstring* path);

    /// Like ComGUIManager::SetTicketParameter. Returns -1 without a manager.
    int SetJobTicketKeyValue(int type, int id, const char* key, PARAM_TYPE ptype, void* value,
                             int position);
    /// Like the array form of ComGUIManager::SetMultiParameter.
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
