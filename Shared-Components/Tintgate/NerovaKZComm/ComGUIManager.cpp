// SPDX-License-Identifier: Apache-2.0
#include "Shared-Components/Tintgate/NerovaKZComm/ComGUIManager.h"

#include <cstdio>

#include <wx/filename.h>

#include "Shared-Components/Tintgate/NerovaKZComm/RefusingPlugIn.h"
#include "base/WideBytes.h"
#include "jobkeys/Tickets.h"
#include "measure/Helper.h"
#include "platform/PlugIn.h"
#include "platform/SystemRoot.h"
#include "text/CharSets.h"
#include "text/CharSetsWx.h"
#include "text/StringUtilsComGUI.h"
#include "ticket/TicketFactory.h"
#include "ticket/TicketViews.h"

namespace {

const wchar_t* const pszLibName = L"ComGUI.Bundle";

constexpr int defaultPort = 50005;
constexpr int firstLocalPort = 50006;
constexpr int lastLocalPort = 50026;
constexpr int systemTicketID = 0;

using OwnedString = platform::Owned<CFStringRef>;
using OwnedUuid = platform::Owned<CFUUIDRef>;

void complain(const char* message) {
    std::fputs(message, stderr);
}

OwnedUuid uuid(const char* text) {
    const OwnedString string(
        CFStringCreateWithCString(kCFAllocatorDefault, text, kCFStringEncodingUTF8));
    return OwnedUuid(CFUUIDCreateFromString(kCFAllocatorDefault, string.get()));
}

template<std::size_t Size>
void setField(char (&field)[Size], const char* text) {
    CharSets::stracpy(field, text, Size);
}

const MTICKET_ADMIN* adminOf(const MTICKET_ACCESS* container) {
    return container == nullptr ? nullptr : &ticket::as<MTICKET_ADMIN>(*container);
}

} // namespace

ComGUIManager* ComGUIManager::m_pInstance = nullptr;
bool ComGUIManager::m_bAcceptNotification = false;
ComGUIModuleInterface** ComGUIManager::m_givenInterface = nullptr;

ComGUIManager* ComGUIManager::GetInstance(bool privateManager) {
    if (privateManager) {
        return new ComGUIManager;
    }
    if (m_pInstance == nullptr) {
        m_pInstance = new ComGUIManager;
    }
    return m_pInstance;
}

void ComGUIManager::UseInterface(ComGUIModuleInterface** interface) {
    m_givenInterface = interface;
}

ComGUIManager::ComGUIManager() : m_record(std::make_unique<ComSessionRecord>()) {
    bool usable = false;
    if (FindInterface()) {
        m_table = **m_interface;
        usable = (*m_interface)->CreateInstance(&m_instance) == 0;
        if (usable) {
            hSTicketInstance = m_table.hSTicketInstance;
        } else {
            complain("@TODO: Bundle should be released here\n");
        }
    }
    if (!usable) {
        complain("Could not get Interface pointer and Intialize the bundle\n");
        RefuseFromNowOn();
    }
}

ComGUIManager::~ComGUIManager() = default;

bool ComGUIManager::FindInterface() {
    if (m_givenInterface != nullptr) {
        m_interface = m_givenInterface;
        return true;
    }
    __CFBundle* plugIn = nullptr;
    RegisterPlugIn(&plugIn); // It has reported its own failure.
    return CreateComGUIModuleInterface(plugIn, &m_interface) == 0;
}

void ComGUIManager::RefuseFromNowOn() {
    static ComGUIModuleInterface* interface = &refusingPlugIn;
    m_interface = &interface;
    m_table = refusingPlugIn;
    m_instance = nullptr;
}

std::wstring ComGUIManager::PlugInPath() {
    std::wstring suite = Helper::GetHWBInstallationPath().ToStdWstring();
    if (suite.empty()) {
        suite = base::wideFromBytes(platform::systemRoot()); // The path below is then fixed.
    }
    return suite + static_cast<wchar_t>(wxFileName::GetPathSeparator()) + L"lib/" + pszLibName;
}

int ComGUIManager::RegisterPlugIn(__CFBundle** plugIn) {
    const OwnedString string(CFStringCreateWithCString(
        kCFAllocatorDefault, StringUtilsComGUI::stringFromwstring(PlugInPath()).c_str(),
        kCFStringEncodingMacRoman));
    if (string == nullptr) {
        complain("CFStringCreateWithCString failed\n");
        return -1;
    }
    const platform::Owned<CFURLRef> url(
        CFURLCreateWithFileSystemPath(kCFAllocatorDefault, string.get(), kCFURLPOSIXPathStyle, 1));
    if (url == nullptr) {
        complain("RegisterPlugIn: CFURLCreateWithFileSystemPath() failed\n");
        return -1;
    }
    *plugIn = CFPlugInCreate(kCFAllocatorDefault, url.get());
    if (*plugIn == nullptr) {
        complain("RegisterPlugIn: CFPlugInCreate() failed\n");
        return -1;
    }
    return 0;
}

int ComGUIManager::CreateComGUIModuleInterface(__CFBundle* plugIn,
                                               ComGUIModuleInterface*** interface) {
    *interface = nullptr;
    const OwnedUuid type = uuid(comGUIPlugInType);
    const platform::Owned<CFArrayRef> factories(
        CFPlugInFindFactoriesForPlugInTypeInPlugIn(type.get(), plugIn));
    if (factories == nullptr || CFArrayGetCount(factories.get()) < 1) {
        return -1;
    }
    const auto* const factory = static_cast<CFUUIDRef>(CFArrayGetValueAtIndex(factories.get(), 0));
    auto* const object =
        static_cast<ComGUIModuleInterface**>(CFPlugInInstanceCreate(nullptr, factory, type.get()));
    if (object == nullptr) {
        return -1;
    }
    const OwnedUuid id = uuid(comGUIInterfaceID);
    void* found = nullptr;
    (*object)->QueryInterface(object, CFUUIDGetUUIDBytes(id.get()), &found);
    (*object)->Release(object);
    *interface = static_cast<ComGUIModuleInterface**>(found);
    return found == nullptr ? -1 : 0;
}

int ComGUIManager::Initialize(const char* user, const char* password, const char* server, int port,
                              int applicationID) {
    static std::int32_t localPort = firstLocalPort; // Per process (C96).
    m_record->clientLevelCompanion = 1;
    m_record->clientLevel = applicationID == jobkeys::verifierApplication ? 7 : 5;
    m_record->reservedFlag = 0;
    setField(m_record->user, user);
    setField(m_record->password, password);
    setField(m_record->server, server);
    m_record->serverPort = port;
    m_record->localPort = localPort;
    localPort = localPort < lastLocalPort ? localPort + 1 : firstLocalPort;
    m_record->applicationID = applicationID;
    return m_table.Initialize(m_instance, m_record.get());
}

int ComGUIManager::Login(const char* user, const char* password, const char* server, int port) {
    m_bAcceptNotification = false;
    if (user != nullptr) {
        const CharSetsWx::Controls2IoBuffered converted(user);
        setField(m_record->user, user);
    }
    if (password != nullptr) {
        setField(m_record->password, password);
    }
    if (server != nullptr) {
        setField(m_record->server, server);
    }
    if (port != -1) {
        m_record->serverPort = port;
    }
    const int code = MacLogin();
    if (code == 0) {
        const char* const address = m_record->server;
        const char* const name =
            m_container == nullptr
                ? address
                : m_container->GetPszParameter(jobkeys::systemType, systemTicketID,
                                               "System/ServerName", address);
        m_serverName = StringUtilsComGUI::wstringFromstring(name == nullptr ? address : name);
        m_serverIP = StringUtilsComGUI::wstringFromstring(address);
    }
    return code;
}

int ComGUIManager::MacLogin() {
    const int code = (*m_interface)->Login(m_instance, m_record.get());
    if (code == 0) {
        m_container = adminOf((*m_interface)->GetContainer(m_instance, m_record->session));
    }
    return code;
}

void ComGUIManager::Logout() {
    m_container = nullptr;
    m_table.Logout(m_instance, m_record->session);
}

int ComGUIManager::Uninitialize() {
    return m_table.Uninitialize(m_instance, m_record.get());
}

int ComGUIManager::IsAlive(const char* host, int port) {
    const int answer = m_table.IsAlive(m_instance, host == nullptr ? m_record->server : host,
                                       port == 0 ? defaultPort : port);
    return answer == 0 || answer == 1 ? COMERR_NONE : COMERR_NOT_ALIVE;
}

const MTICKET_ADMIN* ComGUIManager::GetClientContainer() {
    if (m_container != nullptr) {
        return m_container;
    }
    const MTICKET_ADMIN* const container =
        adminOf(m_table.GetContainer(m_instance, m_record->session));
    if (container == nullptr) {
        return nullptr;
    }
    if (container->TicketExists(jobkeys::systemType, systemTicketID)) {
        m_container = container;
    } else {
        m_table.Logout(m_instance, m_record->session);
    }
    return m_container;
}

int ComGUIManager::SetCallback(void* user) {
    const char* const jobKeys[] = {"Job/Identification/RemoteEndpoint", "Job/Identification/Status",
                                   "Process/Progress/Percent", "Print/Progress/Percent", nullptr};
    constexpr int jobs = 3;

    const STICKET_ACCESS* work = CreateTicket(nullptr);
    if (work != nullptr) {
        ticket::as<STICKET_MODIFY>(*work).SetParameter("pUser", user, POSITION_WHOLE);
    }
    const int code = m_table.SendCommand(m_instance, m_record->session, "local.set.callback", 0,
                                         const_cast<STICKET_ACCESS*>(work));
    if (code == 0 && work != nullptr) {
        m_notificationID =
            ticket::as<STICKET_READ>(*work).GetIntParameter("iGUINotificationID", -1);
    }
    // Done even if the command failed (C100), with the previous id or -1.
    if (m_container != nullptr) {
        m_container->DisableNotification(jobs, TICKET_ID_ALL, m_notificationID);
        m_container->EnableNotification(jobs, TICKET_ID_NEW, m_notificationID, jobKeys);
        for (const int type : {2, 0, 6}) {
            m_container->DisableNotification(type, TICKET_ID_ALL, m_notificationID);
        }
    }
    m_bAcceptNotification = true;
    DestroyTicket(work);
    return code;
}

int notificationTypeCallback(void*, int, int, int, int number4, int, int, char*) {
    return number4 == 0 ? -1 : 0;
}
