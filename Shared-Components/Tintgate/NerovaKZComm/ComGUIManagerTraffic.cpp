// SPDX-License-Identifier: Apache-2.0
// Ticket, command and file operations of the manager.
#include "Shared-Components/Tintgate/NerovaKZComm/ComGUIManager.h"

#include <algorithm>
#include <cstring>

#include <wx/debug.h>

#include "Shared-Components/Tintgate/NerovaKZComm/TicketSearch.h"
#include "base/Malloc.h"
#include "base/Utf8.h"
#include "jobkeys/Tickets.h"
#include "text/CharSetsWx.h"
#include "ticket/ParameterTables.h"
#include "ticket/TicketUpdateCallback.h"
#include "ticket/TicketUpdateList.h"
#include "ticket/TicketViews.h"

namespace {

constexpr int systemTicketID = 0;

int codeOf(bool found) {
    return found ? 1 : 0;
}

// Empty if the text is not UTF-8 (C103). wx alone would also accept surrogates.
wxString fromUtf8(const std::string& text) {
    return base::isUtf8(text.c_str()) ? wxString(text.c_str(), wxConvUTF8) : wxString();
}

// Adds a deletion of the key, then its new elements. False if a record was refused.
bool enterArray(void* list, const char* key, PARAM_TYPE ptype, int count, void* values) {
    bool done = MultiParListSetParameter(list, key, PARAM_DELETE, nullptr, POSITION_WHOLE);
    if (ptype == PARAM_INT || ptype == PARAM_DOUBLE) {
        return MultiParListSetNumbers(list, key, ptype, values, count) && done;
    }
    for (int i = 0; ptype == PARAM_STRING && i < count; ++i) {
        const char* const text = static_cast<const char* const*>(values)[i];
        done = MultiParListSetParameter(list, key, ptype, text, i) && done;
    }
    return done;
}

} // namespace

int ComGUIManager::GetParameter(int type, int id, const char* key, PARAM_TYPE ptype, void* out,
                                int position) {
    const bool found = m_container != nullptr &&
                       ticket::Contained(*m_container, type, id).get(key, ptype, out, position);
    if (!found || ptype != PARAM_STRING || out == nullptr) {
        return codeOf(found);
    }
    const char*& text = *static_cast<const char**>(out);
    std::string converted;
    if (CharSetsWx::Io2Controls(CharSetsWx::Context, converted, text) == 1) {
        const wxCriticalSectionLocker locker(m_cacheLock);
        text = m_stringCache[converted.c_str()];
    }
    return 1;
}

int ComGUIManager::GetSystemTicketParamForKey(const char* key, PARAM_TYPE ptype, void* out,
                                              int position) {
    return codeOf(ticket::Contained(*m_container, jobkeys::systemType, systemTicketID)
                      .get(key, ptype, out, position));
}

int ComGUIManager::GetIntParameter(int type, int id, const char* key) {
    const MTICKET_READ* const container = GetClientContainer();
    return container == nullptr ? -1 : container->GetIntParameter(type, id, key, -1);
}

int ComGUIManager::GetIntParameter(int type, int id, const char* key, int position, int fallback) {
    const MTICKET_READ* const container = GetClientContainer();
    return container == nullptr ? fallback
                                : container->GetIntParameter(type, id, position, key, fallback);
}

double ComGUIManager::GetDoubleParameter(int type, int id, const char* key) {
    return GetIntParameter(type, id, key);
}

std::wstring ComGUIManager::GetStringParameter(int type, int id, const char* key) {
    const MTICKET_READ* const container = GetClientContainer();
    const std::string text =
        container == nullptr ? "" : container->GetStringParameter(type, id, key, "");
    return fromUtf8(text).ToStdWstring();
}

template<class Array, class Value>
Array ComGUIManager::ReadArray(int type, int id, const char* key, PARAM_TYPE ptype,
                               void (*append)(Array&, Value)) {
    Array array;
    long count = -1;
    int bResult = GetParameter(type, id, key, PARAM_COUNT, &count, POSITION_WHOLE);
    wxASSERT(bResult >= COMERR_NONE);
    if (count < 0 || static_cast<unsigned long>(count) > ticket::maxElements) {
        return array;
    }
    array.Alloc(static_cast<std::size_t>(count));
    Value value{};
    for (int position = 0; position < count; ++position) {
        bResult = GetParameter(type, id, key, ptype, &value, position);
        wxASSERT(bResult >= COMERR_NONE);
        append(array, value);
    }
    return array;
}

wxArrayInt ComGUIManager::GetIntArray(int type, int id, const char* key) {
    return ReadArray<wxArrayInt, int>(type, id, key, PARAM_INT,
                                      [](wxArrayInt& array, int value) { array.Add(value); });
}

wxArrayDouble ComGUIManager::GetDoubleArray(int type, int id, const char* key) {
    return ReadArray<wxArrayDouble, double>(
        type, id, key, PARAM_DOUBLE, [](wxArrayDouble& array, double value) { array.Add(value); });
}

wxArrayString ComGUIManager::GetStringArray(int type, int id, const char* key) {
    return ReadArray<wxArrayString, const char*>(
        type, id, key, PARAM_STRING,
        [](wxArrayString& array, const char* value) { array.Add(wxString::FromAscii(value)); });
}

int ComGUIManager::SetTicketParameter(int type, int id, const char* key, PARAM_TYPE ptype,
                                      const void* value, int position) {
    const MTICKET_ADMIN* const container = GetClientContainer();
    if (container == nullptr) {
        return 0;
    }
    return ticket::Contained(*container, type, id).set(key, ptype, value, position) ? 0 : -1;
}

bool ComGUIManager::SetMultiParameter(int type, int id, SETMULTIPAR_LIST& list) {
    const MTICKET_READ* const container = GetClientContainer();
    const STICKET_ACCESS* const opened =
        container == nullptr ? nullptr : container->OpenTicket(type, id);
    if (opened == nullptr || list.Size() == 0) {
        return false;
    }
    return ticket::as<STICKET_MODIFY>(*opened).SetMultiParameter(list.Table(false));
}

bool ComGUIManager::SetMultiParameter(int id, int type, PARAM_TYPE ptype, const char* key,
                                      int count, void* values) {
    void* list = MultiParListCreate();
    const MTICKET_MODIFY* const container = GetClientContainer();
    bool done = enterArray(list, key, ptype, count, values);
    if (MultiParListSize(list) != 0) {
        done = container != nullptr &&
               container->SetMultiParameter(type, id, MultiParListTable(list, 0)) && done;
    }
    MultiParListDestroy(&list);
    return done;
}

bool ComGUIManager::SetMultiParameter(TICKET_UPDATE_LIST& list) {
    const TICKET_UPDATE_CALLBACK nobody;
    return list.FlushToContainer(m_container, nullptr, nobody);
}

bool ComGUIManager::DeleteParameter(int type, int id, const char* key, int position) {
    const MTICKET_MODIFY* const container = GetClientContainer();
    return container != nullptr && container->DelParameter(type, id, key, position);
}

bool ComGUIManager::SetPartial(int type, int id, const char* const* prefixes) {
    return m_container->SetPartial(type, id, prefixes);
}

bool ComGUIManager::CreateOrOpenTicket(int type, int id, const char* const* keys) {
    return m_container->CreateOrOpenTicket(type, id, keys) != nullptr;
}

int ComGUIManager::CreateTkt(int type) {
    return m_container->CreateNextTicket(type, true);
}

bool ComGUIManager::DeleteTicketOfType(int type, int id) {
    const MTICKET_ADMIN* const container = GetClientContainer();
    if (id == TICKET_ID_ALL) {
        Delete_all_Tickets(container, type);
        return true;
    }
    return container != nullptr &&
           ticket::bit0(ticket::container::TicketOperation::call(
               *container, type, id, TICKET_OP(MTICKET_OP_DELETE), nullptr));
}

int ComGUIManager::Delete_all_Tickets(const MTICKET_ADMIN* container, int type) {
    if (container == nullptr) {
        return 0;
    }
    // Collect ids first: a container must not change during a walk.
    std::vector<int> ids;
    container->WalkTickets(WalkGetTicketIds, &ids, type);
    for (const int id : ids) {
        container->DeleteTicket(type, id, true);
    }
    return 0;
}

int ComGUIManager::SearchTicket(int type, const char* key, std::string value) {
    stSearchKey search{key, std::move(value)};
    m_container->WalkTickets(WalkSearchTicket, &search, type);
    return search.ticketID;
}

std::vector<int> ComGUIManager::SearchTickets(int type, const char* key, PARAM_TYPE ptype,
                                              void* value, bool inArray) {
    stSearchTickets search{{}, key, value, ptype, inArray};
    m_container->WalkTickets(WalkSearchTickets, &search, type);
    return search.ids;
}

int localTicketTranslate(int, void*, int*, bool) {
    return 0;
}

int ComGUIManager::GetTicketData(int type, int kind, int index, int* size, void* buffer) {
    const int code =
        m_table.GetTicketData(m_instance, m_record->session, type, kind, index, size, buffer);
    return code == 0 && kind == 3 ? localTicketTranslate(type, buffer, size, false) : code;
}

int ComGUIManager::SetTicketData(int type, int kind, int index, int* size, void* buffer) {
    base::Malloced<char[]> scratch;
    if (kind == 10 || kind == 11) {
        constexpr int scratchSize = 12040;
        const int given = size == nullptr ? 0 : *size;
        const int length = std::max(given, scratchSize); // The plug-in may read `given` bytes.
        scratch.reset(static_cast<char*>(std::calloc(static_cast<std::size_t>(length), 1)));
        if (scratch == nullptr) {
            return -1;
        }
        if (given >= 1 && given <= scratchSize && buffer != nullptr) {
            std::memcpy(scratch.get(), buffer, static_cast<std::size_t>(given));
        }
        buffer = scratch.get();
        localTicketTranslate(type, buffer, size, true);
    }
    return m_table.SetTicketData(m_instance, m_record->session, type, kind, index, size, buffer);
}

int ComGUIManager::SendCommand(const char* command, int size, void* data) {
    for (const char* folderCommand : {"local.set.previewfolder", "local.set.thumbnailfolder"}) {
        if (command != nullptr && std::strcmp(command, folderCommand) == 0) {
            size =
                data == nullptr ? 0 : static_cast<int>(std::strlen(static_cast<const char*>(data)));
        }
    }
    return m_table.SendCommand(m_instance, m_record->session, command, size, data);
}

int ComGUIManager::PutFile(const char* first, const char* second, bool raw) {
    if (raw) {
        return m_table.PutFileRaw(m_instance, m_record->session, first, second);
    }
    const CharSetsWx::Controls2IoBuffered convertedFirst(first);
    const CharSetsWx::Controls2IoBuffered convertedSecond(second);
    return m_table.PutFile(m_instance, m_record->session, first, second);
}

int ComGUIManager::GetFile(const char* first, const char* second, bool raw) {
    const CharSetsWx::Controls2IoBuffered convertedFirst(first);
    const CharSetsWx::Controls2IoBuffered convertedSecond(second);
    const auto get = raw ? m_table.GetFileRaw : m_table.GetFile;
    return get(m_instance, m_record->session, first, second);
}

int ComGUIManager::SendJob(TJobIdentification* job, const char* first, const char* second) {
    const CharSetsWx::Controls2IoBuffered convertedFirst(first);
    const CharSetsWx::Controls2IoBuffered convertedSecond(second);
    return m_table.SendJob(m_instance, m_record->session, job, first, second);
}
