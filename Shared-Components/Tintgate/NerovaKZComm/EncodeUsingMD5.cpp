// SPDX-License-Identifier: Apache-2.0
#include "Shared-Components/Tintgate/NerovaKZComm/EncodeUsingMD5.h"

#include <cstdint>

#include <md5.h>

std::string EncodeUsingMD5(std::string text) {
    MD5_CTX state;
    MD5Init(&state);
    MD5Update(&state, reinterpret_cast<const std::uint8_t*>(text.data()), text.size());
    std::uint8_t digest[MD5_DIGEST_LENGTH];
    MD5Final(digest, &state);

    constexpr char digits[] = "0123456789ABCDEF";
    std::string result;
    for (const std::uint8_t byte : digest) {
        result += digits[byte >> 4];
        result += digits[byte & 15];
    }
    return result;
}
