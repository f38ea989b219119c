// SPDX-License-Identifier: Apache-2.0
// Logins to a store.
#pragma once

#include <chrono>
#include <string>
#include <string_view>

#include "store/StoreEngine.h"

namespace store {

enum class LoginAnswer { Welcome, WrongUserOrPassword, Disabled };

/// Names and passwords are compared as the bytes received.
///
/// The answer takes the time of one hash, even if there is no such user: Argon2id at libsodium's
/// limits for interactive use, two passes over 64 MiB. A login costs somewhat less than 0.1 s of
/// one core, and that much memory meanwhile.
LoginAnswer checkLogin(StoreEngine& store, std::string_view name, std::string_view password);

/// How long a login that is refused is kept waiting, after so many refusals within refusalsCount,
/// this one with them: the first not at all, the sixth and each further one two seconds.
std::chrono::milliseconds refusalDelay(int refusals);
inline constexpr std::chrono::seconds refusalsCount{60};

/// The salted hash of a password, as a user's record holds it. Throws std::bad_alloc where there is
/// no memory for it.
std::string passwordHash(std::string_view password);

} // namespace store
