// SPDX-License-Identifier: Apache-2.0
// The handles of the desktop platform's core library that this program needs.
#pragma once

#include <cstddef>
#include <memory>
#include <type_traits>
#include <vector>

namespace platform {

/// The target of every handle. A handle returned by a function with Create or Copy in its name
/// belongs to the caller, who passes it to CFRelease. A handle from a function with Get belongs to
/// its source.
class Object {
  public:
    virtual ~Object() = default;
};

/// The target of a CFArrayRef. Owns its elements.
class Array : public Object {
  public:
    std::vector<std::unique_ptr<const Object>> elements;
};

} // namespace platform

using CFIndex = long;
using CFTypeRef = const platform::Object*;
using CFArrayRef = const platform::Array*;

/// The default allocator is the only one.
using CFAllocatorRef = std::nullptr_t;
inline constexpr CFAllocatorRef kCFAllocatorDefault = nullptr;

/// Releases a handle. Null is allowed.
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

/// Null if the index is out of range.
CFTypeRef CFArrayGetValueAtIndex(CFArrayRef array, CFIndex index);
