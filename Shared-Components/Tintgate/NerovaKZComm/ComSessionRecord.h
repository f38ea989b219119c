// SPDX-License-Identifier: Apache-2.0
// The record shared by a session's client and its comm plug-in. Size and offsets are a contract
// with plug-ins that were built without this header (C95).
#pragma once

#include <cstddef>
#include <cstdint>

/// Created zero-filled by the client. Members without a name belong to the plug-in.
struct ComSessionRecord {
    std::uint32_t size = sizeof(ComSessionRecord);
    char user[128] = {};     ///< At most 127 bytes and a NUL, like all texts here.
    char password[128] = {}; ///< Not hashed.
    std::uint8_t unnamed1[128] = {};
    std::int32_t localPort = 0;
    std::uint8_t unnamed2[128] = {};
    char server[128] = {}; ///< Host name or address.
    std::int32_t serverPort = 0;
    std::uint8_t unnamed3[132] = {};
    std::uint64_t session = 0; ///< Handle; only the plug-in writes it.
    std::int32_t applicationID = 0;
    std::uint8_t unnamed4[32] = {};
    std::int32_t clientLevel = 0;
    std::int32_t clientLevelCompanion = 0;
    std::int32_t reservedFlag = 0;
    std::uint8_t unnamed5[1792] = {};
};

static_assert(sizeof(ComSessionRecord) == 2632);
static_assert(offsetof(ComSessionRecord, size) == 0);
static_assert(offsetof(ComSessionRecord, user) == 4);
static_assert(offsetof(ComSessionRecord, password) == 132);
static_assert(offsetof(ComSessionRecord, localPort) == 388);
static_assert(offsetof(ComSessionRecord, server) == 520);
static_assert(offsetof(ComSessionRecord, serverPort) == 648);
static_assert(offsetof(ComSessionRecord, session) == 784);
static_assert(offsetof(ComSessionRecord, applicationID) == 792);
static_assert(offsetof(ComSessionRecord, clientLevel) == 828);
static_assert(offsetof(ComSessionRecord, clientLevelCompanion) == 832);
static_assert(offsetof(ComSessionRecord, reservedFlag) == 836);
