// SPDX-License-Identifier: Apache-2.0
// The function records through which a plug-in exposes its tickets. Each is an array of 64-bit
// words with fixed numbers (C95). Words not named here belong to the plug-in.
#pragma once

#include <cstddef>
#include <cstdint>

#include "ticket/ParameterRecords.h"

/// One ticket, owned by the plug-in. The actual record may be longer.
struct STICKET_ACCESS {
    std::uint64_t words[30];
};

/// The container of a session: tickets by type and id, owned by the plug-in. The actual record may
/// be longer.
struct MTICKET_ACCESS {
    std::uint64_t words[58];
};

/// Called with one value of a ticket. Pointers are valid until it changes. True continues the walk.
using SCollect = bool (*)(void* context, const char* key, PARAM_TYPE type, const void* value,
                          int position);

/// Called with one ticket of a container. True continues the walk.
using TicketWalk = bool (*)(void* context, int type, int id, const STICKET_ACCESS* ticket);

/// Operations on one ticket.
enum STICKET_OP : std::int32_t {
    STICKET_OP_PARTIAL = 3, ///< Argument: a null-terminated table of keys.
};

/// Operations of a container.
enum MTICKET_OP : std::int32_t {
    MTICKET_OP_EXISTS = 101,      ///< Argument: null.
    MTICKET_OP_OPEN = 102,        ///< Argument: const STICKET_ACCESS**, receives the ticket.
    MTICKET_OP_CREATE_NEXT = 104, ///< Id TICKET_ID_NEW or TICKET_ID_NEW_PLAIN. Argument: int*,
                                  ///< receives the new id.
    MTICKET_OP_DELETE = 106,      ///< Argument: bool*, a flag for the plug-in, or null.
};

/// An operation of either kind, by its number.
class TICKET_OP {
  public:
    TICKET_OP(STICKET_OP op) : code(op) {}
    TICKET_OP(MTICKET_OP op) : code(op) {}

    std::int32_t code;
};

/// Codes of a ticket's Option.
enum STICKET_OPTION_CODE : std::int32_t {
    STICKET_OPTION_CODE_WHOAMI = 11, ///< Fills a STICKET_OPTION_WHOAMI.
};

/// Filled by the plug-in at its discretion. Null, -1, -1 if it refuses.
struct STICKET_OPTION_WHOAMI {
    void* pointer = nullptr;
    std::int32_t number1 = -1;
    std::int32_t number2 = -1;
};

/// Special ids that the plug-in accepts.
inline constexpr int TICKET_ID_ALL = -3;       ///< All tickets of the type.
inline constexpr int TICKET_ID_NEW = -4;       ///< The next new ticket.
inline constexpr int TICKET_ID_NEW_PLAIN = -5; ///< The next new ticket, the plain way.

/// Valid types are 0 to 49.
constexpr bool TICKET_TYPE_Valid(int type) {
    return type >= 0 && type <= 49;
}

/// Valid ids are 0 to 16,777,215.
constexpr bool TICKET_ID_Valid(int id) {
    return id >= 0 && id < 0x1000000;
}

constexpr bool TICKET_Valid(int type, int id) {
    return TICKET_TYPE_Valid(type) && TICKET_ID_Valid(id);
}

namespace ticket {

/// Creates tickets that belong to no container.
struct Factory {
    std::uint64_t words[4];
};

/// The word that contains the handle which a record passes to its functions. The factory has none.
inline constexpr int handleWord = 2;

/// Converts a slot's result to bool. Only bit 0 of a bool from a slot is defined (C120), so slots
/// return integers. With a C++ bool the compiler could rely on the other bits.
constexpr bool bit0(int result) {
    return (result & 1) != 0;
}

/// A function word of a record: its number and signature in one place, for both sides.
template<class Record, int Number, class Signature>
struct Slot {
    static constexpr int number = Number;
    static_assert(Number < sizeof(Record::words) / sizeof(std::uint64_t));

    /// Returns the function in this slot, or null.
    static Signature* of(const Record& record) {
        return reinterpret_cast<Signature*>(record.words[Number]);
    }

    /// Stores a function in this slot.
    static void put(Record& record, Signature* function) {
        record.words[Number] = reinterpret_cast<std::uint64_t>(function);
    }

    /// Calls the record's function with the record's handle as the first argument.
    template<class... Arguments>
    static auto call(const Record& record, Arguments... arguments) {
        return of(record)(reinterpret_cast<void*>(record.words[handleWord]), arguments...);
    }
};

/// Slots of STICKET_ACCESS.
namespace single {
template<int Number, class Signature>
using Word = Slot<STICKET_ACCESS, Number, Signature>;

using GetParameter =
    Word<3, int(void* handle, const char* key, PARAM_TYPE type, void* out, int position)>;
/// The result is ignored; the result of each record counts.
using GetMultiParameter = Word<4, int(void* handle, GETMULTIPAR* table)>;
/// Calls back once for each value: keys in ascending strcmp order, positions ascending within a
/// key. The result is ignored.
using Walk =
    Word<5, int(void* handle, SCollect callback, void* context, const char* text, int number)>;
using SetParameter =
    Word<26, int(void* handle, const char* key, PARAM_TYPE type, const void* value, int position)>;
using SetMultiParameter = Word<27, int(void* handle, SETMULTIPAR* table)>;
/// `keys` is a null-terminated table in which a trailing * marks a prefix; null means all keys. If
/// replace is 1, the ticket's content is replaced. If it is 0, the source's values overlay it.
using Transfer =
    Word<28, int(void* handle, const STICKET_ACCESS* source, const char* const* keys, int replace)>;
using Option = Word<29, int(void* handle, int code, void* record)>;
} // namespace single

/// Slots of MTICKET_ACCESS.
namespace container {
template<int Number, class Signature>
using Word = Slot<MTICKET_ACCESS, Number, Signature>;

using GetParameter = Word<4, int(void* handle, int type, int id, const char* key, PARAM_TYPE ptype,
                                 void* out, int position)>;
/// The result is ignored; the result of each record counts.
using GetMultiParameter = Word<5, int(void* handle, int type, int id, GETMULTIPAR* table)>;
using WalkTickets = Word<7, int(void* handle, TicketWalk callback, void* context, int type)>;
using SetParameter = Word<28, int(void* handle, int type, int id, const char* key, PARAM_TYPE ptype,
                                  const void* value, int position)>;
using SetMultiParameter = Word<29, int(void* handle, int type, int id, SETMULTIPAR* table)>;
using TicketOperation = Word<31, int(void* handle, int type, int id, TICKET_OP op, void* argument)>;
using Notification = Word<54, int(void* handle, int type, int id, int notificationId, int enable,
                                  const char* const* keys)>;
/// May be null.
using CreateWithKeys =
    Word<57, const STICKET_ACCESS*(void* handle, int type, int id, const char* const* keys)>;
} // namespace container

/// Slots of Factory. They take no handle.
namespace factory {
template<int Number, class Signature>
using Word = Slot<Factory, Number, Signature>;

using Create = Word<2, const STICKET_ACCESS*(const char* name)>;
using Destroy = Word<3, void(const STICKET_ACCESS** ticket)>;
} // namespace factory

} // namespace ticket

static_assert(sizeof(TICKET_OP) == 4);
static_assert(sizeof(STICKET_OPTION_WHOAMI) == 16);
static_assert(offsetof(STICKET_OPTION_WHOAMI, number1) == 8);
static_assert(offsetof(STICKET_OPTION_WHOAMI, number2) == 12);
static_assert(sizeof(STICKET_ACCESS) == 240 && sizeof(MTICKET_ACCESS) == 464);
static_assert(sizeof(void*) == 8);
