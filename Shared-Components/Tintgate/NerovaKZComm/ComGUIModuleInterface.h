// SPDX-License-Identifier: Apache-2.0
// The operation table of the comm plug-in "ComGUI.Bundle": 44 slots of one machine word each. Their
// numbers and arguments are a contract with plug-ins that were built without this header (C95).
#pragma once

#include <cstddef>
#include <cstdint>

#include "Shared-Components/Tintgate/NerovaKZComm/ComSessionRecord.h"
#include "platform/CFUUIDBytes.h"
#include "ticket/TicketRecords.h"

/// Type of the plug-in. Its bundle lists the factory under this type.
inline constexpr char comGUIPlugInType[] = "5CDEF0B8-6CFC-11D8-A365-003065B1346E";
/// The interface requested from its objects. An object's first word points to this table.
inline constexpr char comGUIInterfaceID[] = "33FC3B14-6CFF-11D8-AB09-003065B1346E";

/// Describes a job to send to the server. Opaque here.
struct TJobIdentification;

/// Results are 32-bit codes, 0 for success, unless documented otherwise. `instance` is what
/// CreateInstance stored, `session` the record's handle. Free slots may contain anything.
struct ComGUIModuleInterface {
    std::uint64_t reserved = 0;

    // The header of every plug-in object. The interface returned by QueryInterface stays valid
    // after the object's Release.
    std::int32_t (*QueryInterface)(void* object, CFUUIDBytes id, void** interface) = nullptr;
    std::uint32_t (*AddRef)(void* object) = nullptr;
    std::uint32_t (*Release)(void* object) = nullptr;

    std::int32_t (*CreateInstance)(void** instance) = nullptr; // 4
    std::uint64_t free5 = 0;
    /// Reads user, password, address, ports and level from the record.
    std::int32_t (*Initialize)(void* instance, ComSessionRecord* record) = nullptr; // 6
    std::uint64_t free7[2] = {};
    /// Opens the session. The record contains its handle after this call at the latest.
    std::int32_t (*Login)(void* instance, ComSessionRecord* record) = nullptr;        // 9
    std::int32_t (*Logout)(void* instance, std::uint64_t session) = nullptr;          // 10
    std::int32_t (*Uninitialize)(void* instance, ComSessionRecord* record) = nullptr; // 11
    /// The session's tickets, or null.
    const MTICKET_ACCESS* (*GetContainer)(void* instance, std::uint64_t session) = nullptr; // 12
    /// Whole-ticket data in blocks. Kind 0: the number of tickets of the type, an int, size 4. Kind
    /// 1: their ids, as many ints as fit into size, which then becomes the bytes written.
    std::int32_t (*GetTicketData)(void* instance, std::uint64_t session, int type, int kind,
                                  int index, int* size, void* buffer) = nullptr; // 13
    std::int32_t (*SetTicketData)(void* instance, std::uint64_t session, int type, int kind,
                                  int index, int* size, void* buffer) = nullptr; // 14
    std::uint64_t free15 = 0;
    /// Data is a ticket (STICKET_ACCESS) or a text, depending on the command.
    std::int32_t (*SendCommand)(void* instance, std::uint64_t session, const char* command,
                                int size, void* data) = nullptr; // 16
    /// To the server.
    std::int32_t (*PutFile)(void* instance, std::uint64_t session, const char* first,
                            const char* second) = nullptr; // 17
    /// From the server. The file may arrive after the call has returned.
    std::int32_t (*GetFile)(void* instance, std::uint64_t session, const char* first,
                            const char* second) = nullptr; // 18
    std::int32_t (*SendJob)(void* instance, std::uint64_t session, TJobIdentification* job,
                            const char* first, const char* second) = nullptr; // 19
    std::int32_t (*PutFileRaw)(void* instance, std::uint64_t session, const char* first,
                               const char* second) = nullptr; // 20
    /// Not a function: the factory of tickets that belong to no container.
    const ticket::Factory* hSTicketInstance = nullptr; // 21
    std::uint64_t free22[2] = {};
    std::int32_t (*GetFileRaw)(void* instance, std::uint64_t session, const char* first,
                               const char* second) = nullptr; // 24
    std::uint64_t free25 = 0;
    /// Probes a server without a session. 0 or 1 if it answers.
    std::int32_t (*IsAlive)(void* instance, const char* host, int port) = nullptr; // 26
    std::uint64_t free27[17] = {};
};

static_assert(sizeof(ComGUIModuleInterface) / 8 == 44);
static_assert(offsetof(ComGUIModuleInterface, QueryInterface) / 8 == 1);
static_assert(offsetof(ComGUIModuleInterface, AddRef) / 8 == 2);
static_assert(offsetof(ComGUIModuleInterface, Release) / 8 == 3);
static_assert(offsetof(ComGUIModuleInterface, CreateInstance) / 8 == 4);
static_assert(offsetof(ComGUIModuleInterface, Initialize) / 8 == 6);
static_assert(offsetof(ComGUIModuleInterface, Login) / 8 == 9);
static_assert(offsetof(ComGUIModuleInterface, Logout) / 8 == 10);
static_assert(offsetof(ComGUIModuleInterface, Uninitialize) / 8 == 11);
static_assert(offsetof(ComGUIModuleInterface, GetContainer) / 8 == 12);
static_assert(offsetof(ComGUIModuleInterface, GetTicketData) / 8 == 13);
static_assert(offsetof(ComGUIModuleInterface, SetTicketData) / 8 == 14);
static_assert(offsetof(ComGUIModuleInterface, SendCommand) / 8 == 16);
static_assert(offsetof(ComGUIModuleInterface, PutFile) / 8 == 17);
static_assert(offsetof(ComGUIModuleInterface, GetFile) / 8 == 18);
static_assert(offsetof(ComGUIModuleInterface, SendJob) / 8 == 19);
static_assert(offsetof(ComGUIModuleInterface, PutFileRaw) / 8 == 20);
static_assert(offsetof(ComGUIModuleInterface, hSTicketInstance) / 8 == 21);
static_assert(offsetof(ComGUIModuleInterface, GetFileRaw) / 8 == 24);
static_assert(offsetof(ComGUIModuleInterface, IsAlive) / 8 == 26);
