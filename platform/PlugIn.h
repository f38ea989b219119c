// SPDX-License-Identifier: Apache-2.0
// Loads plug-ins. A plug-in is a bundle, i.e. a folder:
//
//   ComGUI.Bundle/
//     Contents/
//       Info.plist           what the bundle offers
//       MacOS/ComGUI         a shared object
//
// Info.plist is a property list with these entries:
//
//   CFBundleExecutable     ComGUI                        name of the file under MacOS
//   CFPlugInTypes          { TYPE-UUID: [FACTORY-UUID] } factories of each plug-in type
//   CFPlugInFactories      { FACTORY-UUID: function }    function in the shared object
//
// UUIDs are written 5CDEF0B8-6CFC-11D8-A365-003065B1346E, in either case. The function has C
// linkage and the type platform::PlugInFactory.
#pragma once

#include <string>

#include "platform/CFUUIDBytes.h"
#include "platform/CoreFoundation.h"
#include "platform/CoreFoundationStrings.h"

namespace platform {

/// The target of a CFURLRef: the path of a file or folder, as bytes.
class Url : public Object {
  public:
    explicit Url(std::string path) : path(std::move(path)) {}

    const std::string path;
};

/// The target of a CFUUIDRef.
class Uuid : public Object {
  public:
    explicit Uuid(const CFUUIDBytes& bytes) : bytes(bytes) {}

    const CFUUIDBytes bytes;
};

/// Creates an object whose first word points to a table of functions, or returns null. The first
/// argument is always null; the type is opaque to the plug-in.
using PlugInFactory = void* (*)(const void* allocator, const void* type);

} // namespace platform

/// A bundle.
class __CFBundle;

using Boolean = unsigned char;
using CFURLPathStyle = CFIndex;
inline constexpr CFURLPathStyle kCFURLPOSIXPathStyle = 0;

using CFURLRef = const platform::Url*;
using CFUUIDRef = const platform::Uuid*;
using CFPlugInRef = __CFBundle*;

/// Null for an empty path, a path that is not Unicode, and any style other than POSIX.
CFURLRef CFURLCreateWithFileSystemPath(CFAllocatorRef, CFStringRef path, CFURLPathStyle style,
                                       Boolean isDirectory);

/// Null unless the text is 32 hexadecimal digits in the groups 8-4-4-4-12.
CFUUIDRef CFUUIDCreateFromString(CFAllocatorRef, CFStringRef text);

CFUUIDBytes CFUUIDGetUUIDBytes(CFUUIDRef uuid);

/// The bundle in a folder, or null if the folder has no readable Contents/Info.plist. Its shared
/// object is loaded when the first instance is created.
///
/// A bundle exists until the process ends: the same folder always gives the same bundle, and nobody
/// releases it.
CFPlugInRef CFPlugInCreate(CFAllocatorRef, CFURLRef folder);

/// The factories (UUIDs, each bound to its bundle) that the bundle lists for a type, in its order.
/// Null if it does not list the type. Empty if it lists the type without factories.
CFArrayRef CFPlugInFindFactoriesForPlugInTypeInPlugIn(CFUUIDRef type, CFPlugInRef plugIn);

/// Returns the object that the factory function creates. The caller owns one of its references.
/// Null if the function returns null, if the function or a loadable shared object is missing, and
/// for a UUID that is not an element of an array of factories.
void* CFPlugInInstanceCreate(CFAllocatorRef, CFUUIDRef factory, CFUUIDRef type);
