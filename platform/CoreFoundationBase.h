// What the desktop platform's objects have in common. Those that a function with Create or Copy in
// its name gives out belong to the caller, who gives them back with CFRelease.
#pragma once

#include <cstddef>

using CFTypeRef = const void*; ///< Any object that derives from platform::CFObject.
using CFIndex = std::ptrdiff_t;
using Boolean = unsigned char;

/// There is one allocator, the default; functions take it and don't look at it.
using CFAllocatorRef = const struct __CFAllocator*;
inline constexpr CFAllocatorRef kCFAllocatorDefault = nullptr;

/// Gives an owned object back. Null is harmless.
void CFRelease(CFTypeRef object);

namespace platform {

/// Base of what stands behind a reference. It has to be the first and only base of its children,
/// since a CFTypeRef is the child's own address.
class CFObject {
  public:
    CFObject() = default;
    CFObject(const CFObject&) = delete;
    CFObject& operator=(const CFObject&) = delete;
    virtual ~CFObject() = default;
};

} // namespace platform
