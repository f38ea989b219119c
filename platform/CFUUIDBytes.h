// SPDX-License-Identifier: Apache-2.0
// A UUID as it crosses to a plug-in: by value, its bytes in the order in which its text names them.
#pragma once

struct CFUUIDBytes {
    unsigned char bytes[16];
};

static_assert(sizeof(CFUUIDBytes) == 16 && alignof(CFUUIDBytes) == 1);
