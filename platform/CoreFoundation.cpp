// SPDX-License-Identifier: Apache-2.0
#include "platform/CoreFoundation.h"

void CFRelease(CFTypeRef object) {
    delete object;
}

CFIndex CFArrayGetCount(CFArrayRef array) {
    return static_cast<CFIndex>(array->elements.size());
}

CFTypeRef CFArrayGetValueAtIndex(CFArrayRef array, CFIndex index) {
    const bool inside = index >= 0 && index < CFArrayGetCount(array);
    return inside ? array->elements[static_cast<std::size_t>(index)].get() : nullptr;
}
