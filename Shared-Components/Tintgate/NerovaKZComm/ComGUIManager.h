// SPDX-License-Identifier: Apache-2.0
// The client side of the comm plug-in: loads it, keeps the session, and passes ticket and file
// traffic on. Much of it serves other programs only (C169).
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

/// The order of a session is GetInstance, Initialize, IsAlive, Login, ..., Logout, Uninitialize.
///
/// Without a usable bundle there is a manager all the same (C94): it says on standard error what is
/// missing, and its operations fail as those of a server that does not answer.
///
/// Tickets are named by type and id; (0, 0) is the system ticket, and type 3 a job's ticket whose
/// id is the job's. The tickets are the plug-in's: the manager holds none. Each operation has a
/// result convention of its own, which callers rely on (C101). Operations marked raw use the
/// container that is held since the login and must not be called without one (C111); the others go
/// through GetClientContainer and tell what they give without a container.
///
/// One thread at a time. Only the string cache is locked.
class ComGUIManager {
  public:
    /// The shared manager, made at the first call and never destroyed; or a private one, made anew
    /// by each call, which belongs to the caller.
    static ComGUIManager* GetInstance(bool privateManager);

    /// Managers made after this call use this interface and load no bundle. It must outlive them.
    /// For a program that is its own server, such as one that examines a store.
    static void UseInterface(ComGUIModuleInterface** interface);
    /// Path of the bundle that a manager loads.
    static std::wstring PlugInPath();

    ComGUIManager();
    /// Neither logs out nor releases the plug-in.
    ~ComGUIManager();
    ComGUIManager(const ComGUIManager&) = delete;
    ComGUIManager& operator=(const ComGUIManager&) = delete;

    // Loading, as the constructor does it. 0 or -1.

    /// Opens "lib/ComGUI.Bundle" in the suite's folder.
    int RegisterPlugIn(__CFBundle** plugIn);
    /// Stores the bundle's table, or null.
    int CreateComGUIModuleInterface(__CFBundle* plugIn, ComGUIModuleInterface*** interface);

    // The session.

    /// Fills the record. Result of the plug-in.
    int Initialize(const char* user, const char* password, const char* server, int port,
                   int applicationID);
    /// Changes the record by what is not null (a port of -1 stays) and logs in. 0, or the plug-in's
    /// code.
    int Login(const char* user, const char* password, const char* server, int port);
    /// Logs in with the record as it is. 0, or the plug-in's code, which leaves the container as it
    /// was.
    int MacLogin();
    void Logout();
    /// Result of the plug-in.
    int Uninitialize();
    /// 0 if the server answers (C98), otherwise COMERR_NOT_ALIVE. Needs no login. A null host means
    /// the record's server, port 0 means 50005.
    int IsAlive(const char* host, int port);

    /// The session's tickets, or null. Where none are held the plug-in is asked again, and what it
    /// gives is kept if it has a system ticket; if it has none, the session is logged out (C99).
    const MTICKET_ADMIN* GetClientContainer();

    /// Registers for the notifications of jobs, after a login. 0, or the plug-in's code.
    int SetCallback(void* user);

    std::wstring GetServerName() const { return m_serverName; } ///< Empty before a first login.
    std::wstring GetServerIP() const { return m_serverIP; }     ///< Empty before a first login.
    void FreeDll() {}
    int IsServerOnline() { return 1; } ///< With or without a server (C110).

    // Reading parameters. Positions: POSITION_WHOLE or an element.

    /// 1 and *out, or 0, also without a container. A text that had to be converted is the manager's
    /// and stays good as long as it lives; one that did not is the plug-in's.
    int GetParameter(int type, int id, const char* key, PARAM_TYPE ptype, void* out, int position);
    /// The same of the system ticket, with texts as they are. Raw.
    int GetSystemTicketParamForKey(const char* key, PARAM_TYPE ptype, void* out, int position);

    int GetIntParameter(int type, int id, const char* key); ///< -1 where it is missing.
    int GetIntParameter(int type, int id, const char* key, int position, int fallback);
    /// Reads an int (C102); -1.0 where it is missing. Doubles are read by GetParameter.
    double GetDoubleParameter(int type, int id, const char* key);
    /// Empty where the text is missing or not UTF-8.
    std::wstring GetStringParameter(int type, int id, const char* key);

    // As GetParameter. Elements that can't be read repeat the one before them (C104; 0, 0.0, "" at
    // the start); a key that can't be read is an empty array. Texts are taken one byte a character.
    wxArrayInt GetIntArray(int type, int id, const char* key);
    wxArrayDouble GetDoubleArray(int type, int id, const char* key);
    wxArrayString GetStringArray(int type, int id, const char* key);

    // Changing parameters.

    /// 0 done, -1 refused; 0 too without a container (C101).
    int SetTicketParameter(int type, int id, const char* key, PARAM_TYPE ptype, const void* value,
                           int position);
    /// True if the ticket took the list's table; false too for an empty list, and for a ticket or
    /// container that is not there.
    bool SetMultiParameter(int type, int id, SETMULTIPAR_LIST& list);
    /// Replaces a key by `count` values: an array of int, double or const char*, as ptype says. An
    /// empty one deletes the key. Note that the id comes before the type (C105). False
    /// without a container.
    bool SetMultiParameter(int id, int type, PARAM_TYPE ptype, const char* key, int count,
                           void* values);
    /// Flushes the list into the container that is held: true if a ticket was changed, or there was
    /// nothing to flush.
    bool SetMultiParameter(TICKET_UPDATE_LIST& list);
    bool DeleteParameter(int type, int id, const char* key, int position);
    bool SetPartial(int type, int id, const char* const* prefixes); ///< Raw.

    // Tickets.

    bool CreateOrOpenTicket(int type, int id, const char* const* keys); ///< Raw.
    int CreateTkt(int type); ///< The new ticket's id, or -1. Raw.
    /// For TICKET_ID_ALL deletes all tickets of the type, and is true always (C107).
    bool DeleteTicketOfType(int type, int id);
    int Delete_all_Tickets(const MTICKET_ADMIN* container, int type); ///< Always 0.
    /// The first ticket in which the text stands under the key, or -1. Raw.
    int SearchTicket(int type, const char* key, std::string value);
    /// The tickets in which a value (an int, or a NUL-terminated text, as ptype says) stands under
    /// the key, or, inArray, as one of its elements. Of texts only the type's first ticket is
    /// examined (C106). Raw.
    std::vector<int> SearchTickets(int type, const char* key, PARAM_TYPE ptype, void* value,
                                   bool inArray);

    // Straight to the plug-in, and its result.

    int GetTicketData(int type, int kind, int index, int* size, void* buffer);
    /// For kinds 10 and 11 the plug-in gets a buffer of 12040 bytes or more, zero where nothing was
    /// copied: data of a larger size than that is not copied at all (C108).
    int SetTicketData(int type, int kind, int index, int* size, void* buffer);
    /// For the two commands that set a folder, size is taken from the text in data (C109).
    int SendCommand(const char* command, int size, void* data);
    /// Raw paths go unconverted through another operation of the plug-in.
    int PutFile(const char* first, const char* second, bool raw);
    /// Paths are converted in both cases (C109); raw chooses another operation of the plug-in.
    int GetFile(const char* first, const char* second, bool raw);
    int SendJob(TJobIdentification* job, const char* first, const char* second);

  private:
    /// Sets m_interface to the given interface, or to the bundle's. False if there is neither.
    bool FindInterface();
    void RefuseFromNowOn();
    template<class Array, class Value>
    Array ReadArray(int type, int id, const char* key, PARAM_TYPE ptype,
                    void (*append)(Array&, Value));

    static ComGUIManager* m_pInstance;
    static bool m_bAcceptNotification;               ///< Written only (C110).
    static ComGUIModuleInterface** m_givenInterface; ///< Of UseInterface, or null.

    std::unique_ptr<ComSessionRecord> m_record;
    ComGUIModuleInterface m_table; ///< A copy: an operation costs one indirect call.
    ComGUIModuleInterface** m_interface = nullptr; ///< What the plug-in gave out.
    void* m_instance = nullptr;                    ///< The plug-in's working instance.
    wxCriticalSection m_cacheLock;
    STRINGCACHE m_stringCache; ///< Texts that GetParameter converted; grows.
    int m_notificationID = -1;
    const MTICKET_ADMIN* m_container = nullptr; ///< The plug-in's.
    std::wstring m_serverName;
    std::wstring m_serverIP;
    std::wstring m_reservedText;
};

/// The shape of a receiver of notifications (C110). -1 if the fourth integer is 0, else 0.
int notificationTypeCallback(void* user, int number1, int number2, int number3, int number4,
                             int number5, int number6, char* text);

/// Where whole-ticket data would be brought to and from this machine's form. Nothing has to be
/// done: always 0.
int localTicketTranslate(int type, void* data, int* size, bool writing);
