// SPDX-License-Identifier: Apache-2.0
// The client side of the comm plug-in: loads it, keeps the session, and forwards ticket and file
// traffic. Much of it serves other programs only (C169).
#pragma once

#include <memory>
#include <string>
#include <vector>

#include <wx/arrstr.h>
#include <wx/dynarray.h>
#include <wx/thread.h>

#include "Shared-Components/Tintgate/NerovaKZComm/ComGUIModuleInterface.h"
#include "ticket/ParameterCaches.h"
#include "ticket/ParameterList.h"
#include "ticket/TicketContainer.h"

class __CFBundle;
class TICKET_UPDATE_LIST;

enum COMERR : int {
    COMERR_NONE = 0,
    COMERR_NOT_ALIVE = -2005, ///< The server does not answer.
};

/// Order of calls: GetInstance, Initialize, IsAlive, Login, ..., Logout, Uninitialize.
///
/// The manager exists even if no usable bundle is found (C94). It then reports the problem on
/// standard error, and its operations fail as if the server did not answer.
///
/// Tickets are addressed by type and id: (0, 0) is the system ticket, type 3 is the ticket of the
/// job with that id. The plug-in owns the tickets. Each operation has its own result convention, on
/// which callers rely (C101). Operations marked raw use the container obtained at login and must
/// not be called without one (C111). The others use GetClientContainer and document their result
/// without a container.
///
/// Use from one thread at a time. Only the string cache is locked.
class ComGUIManager {
  public:
    /// Returns the shared manager, created by the first call and never destroyed. With
    /// privateManager, each call creates a new one, which belongs to the caller.
    static ComGUIManager* GetInstance(bool privateManager);

    /// Managers created after this call use this interface and load no bundle. It must outlive
    /// them. For programs that act as their own server, such as one that examines a store.
    static void UseInterface(ComGUIModuleInterface** interface);
    /// Path of the bundle to load.
    static std::wstring PlugInPath();

    ComGUIManager();
    /// Neither logs out nor releases the plug-in.
    ~ComGUIManager();
    ComGUIManager(const ComGUIManager&) = delete;
    ComGUIManager& operator=(const ComGUIManager&) = delete;

    // Loading steps of the constructor. Each returns 0 or -1.

    /// Opens "lib/ComGUI.Bundle" in the suite's folder.
    int RegisterPlugIn(__CFBundle** plugIn);
    /// Stores the bundle's table. On failure, stores null.
    int CreateComGUIModuleInterface(__CFBundle* plugIn, ComGUIModuleInterface*** interface);

    // The session.

    /// Fills the record. Returns the plug-in's result.
    int Initialize(const char* user, const char* password, const char* server, int port,
                   int applicationID);
    /// Updates the record (null and a port of -1 keep the old value) and logs in. Returns 0 or the
    /// plug-in's code.
    int Login(const char* user, const char* password, const char* server, int port);
    /// Logs in with the current record. Returns 0 or the plug-in's code. On failure, the container
    /// is unchanged.
    int MacLogin();
    void Logout();
    /// Returns the plug-in's result.
    int Uninitialize();
    /// 0 if the server answers (C98), otherwise COMERR_NOT_ALIVE. Needs no login. A null host means
    /// the record's server; port 0 means 50005.
    int IsAlive(const char* host, int port);

    /// The session's tickets, or null. If the manager has no container, it asks the plug-in again.
    /// It keeps the result if that has a system ticket, and otherwise logs the session out (C99).
    const MTICKET_ADMIN* GetClientContainer();

    /// Registers for job notifications after a login. Returns 0 or the plug-in's code.
    int SetCallback(void* user);

    std::wstring GetServerName() const { return m_serverName; } ///< Empty before the first login.
    std::wstring GetServerIP() const { return m_serverIP; }     ///< Empty before the first login.
    void FreeDll() {}
    int IsServerOnline() { return 1; } ///< Even without a server (C110).

    // Reads parameters. Positions are POSITION_WHOLE or an element.

    /// Returns 1 and sets *out. On failure or without a container, returns 0. A converted text
    /// lives as long as the manager; any other text belongs to the plug-in.
    int GetParameter(int type, int id, const char* key, PARAM_TYPE ptype, void* out, int position);
    /// Same for the system ticket, without conversion of texts. Raw.
    int GetSystemTicketParamForKey(const char* key, PARAM_TYPE ptype, void* out, int position);

    int GetIntParameter(int type, int id, const char* key); ///< -1 if missing.
    int GetIntParameter(int type, int id, const char* key, int position, int fallback);
    /// Reads an int (C102). Returns -1.0 if missing. Use GetParameter to read doubles.
    double GetDoubleParameter(int type, int id, const char* key);
    /// Empty if the text is missing or is not UTF-8.
    std::wstring GetStringParameter(int type, int id, const char* key);

    // Like GetParameter. An unreadable element repeats the previous one (C104); the first counts as
    // 0, 0.0 or "". An unreadable key gives an empty array. Texts are read bytewise.
    wxArrayInt GetIntArray(int type, int id, const char* key);
    wxArrayDouble GetDoubleArray(int type, int id, const char* key);
    wxArrayString GetStringArray(int type, int id, const char* key);

    // Changes parameters.

    /// Returns 0 if done or if there is no container (C101), -1 if refused.
    int SetTicketParameter(int type, int id, const char* key, PARAM_TYPE ptype, const void* value,
                           int position);
    /// True if the ticket accepted the list's table. False if it refused, if the list is empty, or
    /// if there is no ticket or container.
    bool SetMultiParameter(int type, int id, SETMULTIPAR_LIST& list);
    /// Replaces a key by an array of `count` values: int, double or const char*, as ptype
    /// specifies. An empty array deletes the key. Note that the id precedes the type (C105). False
    /// without a container.
    bool SetMultiParameter(int id, int type, PARAM_TYPE ptype, const char* key, int count,
                           void* values);
    /// Flushes the list into the current container. True if a ticket was changed or if there was
    /// nothing to flush.
    bool SetMultiParameter(TICKET_UPDATE_LIST& list);
    bool DeleteParameter(int type, int id, const char* key, int position);
    bool SetPartial(int type, int id, const char* const* prefixes); ///< Raw.

    // Tickets.

    bool CreateOrOpenTicket(int type, int id, const char* const* keys); ///< Raw.
    int CreateTkt(int type); ///< Returns the new ticket's id, or -1. Raw.
    /// For TICKET_ID_ALL, deletes all tickets of the type and always returns true (C107).
    bool DeleteTicketOfType(int type, int id);
    int Delete_all_Tickets(const MTICKET_ADMIN* container, int type); ///< Always 0.
    /// The first ticket whose key has this text, or -1. Raw.
    int SearchTicket(int type, const char* key, std::string value);
    /// The tickets whose key has this value (an int or a NUL-terminated text, as ptype specifies)
    /// or, with inArray, has it as an element. For a text, only the type's first ticket is examined
    /// (C106). Raw.
    std::vector<int> SearchTickets(int type, const char* key, PARAM_TYPE ptype, void* value,
                                   bool inArray);

    // Passed to the plug-in; its result is returned.

    int GetTicketData(int type, int kind, int index, int* size, void* buffer);
    /// For kinds 10 and 11 the plug-in gets a zero-filled buffer of at least 12040 bytes. Data
    /// larger than that is not copied into it (C108).
    int SetTicketData(int type, int kind, int index, int* size, void* buffer);
    /// For the two commands that set a folder, `size` is the length of the text in data (C109).
    int SendCommand(const char* command, int size, void* data);
    /// With raw, paths are not converted and another plug-in operation is used.
    int PutFile(const char* first, const char* second, bool raw);
    /// Paths are always converted (C109). With raw, another plug-in operation is used.
    int GetFile(const char* first, const char* second, bool raw);
    int SendJob(TJobIdentification* job, const char* first, const char* second);

  private:
    /// Sets m_interface to the given interface or to the bundle's. False if there is neither.
    bool FindInterface();
    void RefuseFromNowOn();
    template<class Array, class Value>
    Array ReadArray(int type, int id, const char* key, PARAM_TYPE ptype,
                    void (*append)(Array&, Value));

    static ComGUIManager* m_pInstance;
    static bool m_bAcceptNotification;               ///< Never read (C110).
    static ComGUIModuleInterface** m_givenInterface; ///< Set by UseInterface, or null.

    std::unique_ptr<ComSessionRecord> m_record;
    ComGUIModuleInterface m_table; ///< A copy, so that an operation costs one indirect call.
    ComGUIModuleInterface** m_interface = nullptr; ///< The plug-in's own table.
    void* m_instance = nullptr;                    ///< The plug-in's working instance.
    wxCriticalSection m_cacheLock;
    STRINGCACHE m_stringCache; ///< Texts converted by GetParameter; only grows.
    int m_notificationID = -1;
    const MTICKET_ADMIN* m_container = nullptr; ///< Owned by the plug-in.
    std::wstring m_serverName;
    std::wstring m_serverIP;
    std::wstring m_reservedText;
};

/// A notification receiver by its signature (C110). -1 if the fourth integer is 0, otherwise 0.
int notificationTypeCallback(void* user, int number1, int number2, int number3, int number4,
                             int number5, int number6, char* text);

/// Hook for converting whole-ticket data to and from this machine's format. Does nothing: always 0.
int localTicketTranslate(int type, void* data, int* size, bool writing);
