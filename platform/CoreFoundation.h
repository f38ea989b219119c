// SPDX-License-Identifier: Apache-2.0
// Handles of the desktop platform's core library, as far as this program needs them.
#pragma once

#include <cstddef>
#include <memory>
#include <type_traits>
#include <vector>

namespace platform {

/// What every handle points to. A handle from a function with Create or Copy in its name belongs to
/// the caller, who gives it to CFRelease; one from a function with Get belongs to what it came
/// from.
class Object {
  public:
    virtual ~Object() = default;
};

/// What a CFArrayRef stands for. It owns its elements.
class Array : public Object {
  public:
    std::vector<std::unique_ptr<const Object>> elements;
};

} // namespace platform

using CFIndex = long;
using CFTypeRef = const platform::Object*;
using CFArrayRef = const platform::Array*;

/// There is one allocator here, the default one.
using CFAllocatorRef = std::nullptr_t;
inline constexpr CFAllocatorRef kCFAllocatorDefault = nullptr;

/// Ends a handle. Null is harmless.
void CFRelease(CFTypeRef object);

namespace platform {

struct Release {
    void operator()(CFTypeRef object) const { CFRelease(object); }
};

/// Owns a handle: Owned<CFStringRef>.
template<class Ref>
using Owned = std::unique_ptr<std::remove_pointer_t<Ref>, Release>;

} // namespace platform

CFIndex CFArrayGetCount(CFArrayRef array);

/// Null for an index outside of the array.
CFTypeRef CFArrayGetValueAtIndex(CFArrayRef array, CFIndex index);
