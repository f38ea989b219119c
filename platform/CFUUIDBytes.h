// SPDX-License-Identifier: Apache-2.0
// A UUID as passed to a plug-in: by value, with its bytes in the order of its text form.
#pragma once

struct CFUUIDBytes {
    unsigned char bytes[16];
};

static_assert(sizeof(CFUUIDBytes) == 16 && alignof(CFUUIDBytes) == 1);
