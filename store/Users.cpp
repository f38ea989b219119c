// SPDX-License-Identifier: Apache-2.0
#include "store/Users.h"

#include <algorithm>
#include <new>

#include <sodium.h>

namespace store {

std::string passwordHash(std::string_view password) {
    char hash[crypto_pwhash_STRBYTES] = {};
    if (sodium_init() < 0 || crypto_pwhash_str(hash, password.data(), password.size(),
                                               crypto_pwhash_OPSLIMIT_INTERACTIVE,
                                               crypto_pwhash_MEMLIMIT_INTERACTIVE) != 0) {
        throw std::bad_alloc();
    }
    return hash;
}

LoginAnswer checkLogin(StoreEngine& store, std::string_view name, std::string_view password) {
    const auto user = store.user(name);
    if (!user) {
        passwordHash(password);
        return LoginAnswer::WrongUserOrPassword;
    }
    if (sodium_init() < 0 || crypto_pwhash_str_verify(user->passwordHash.c_str(), password.data(),
                                                      password.size()) != 0) {
        return LoginAnswer::WrongUserOrPassword;
    }
    return user->disabled ? LoginAnswer::Disabled : LoginAnswer::Welcome;
}

std::chrono::milliseconds refusalDelay(int refusals) {
    constexpr std::chrono::milliseconds first{125};
    constexpr std::chrono::milliseconds longest{2'000};
    auto delay = refusals > 1 ? first : std::chrono::milliseconds{};
    for (int each = 2; each < refusals && delay < longest; ++each) {
        delay *= 2;
    }
    return std::min(delay, longest);
}

} // namespace store
