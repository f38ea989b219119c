// SPDX-License-Identifier: Apache-2.0
// Loading of plug-ins. A plug-in is a bundle, that is a folder:
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
// linkage and the shape of platform::PlugInFactory.
#pragma once

#include <string>

#include "platform/CFUUIDBytes.h"
#include "platform/CoreFoundation.h"
#include "platform/CoreFoundationStrings.h"

namespace platform {

/// What a CFURLRef stands for: the path of a file or folder, as bytes.
class Url : public Object {
  public:
    explicit Url(std::string path) : path(std::move(path)) {}

    const std::string path;
};

/// What a CFUUIDRef stands for.
class Uuid : public Object {
  public:
    explicit Uuid(const CFUUIDBytes& bytes) : bytes(bytes) {}

    const CFUUIDBytes bytes;
};

/// Makes an object whose first word points to a table of functions, or null. The first argument is
/// always null; the type is nothing that a plug-in could look into.
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

/// Null for an empty path, one that is no Unicode, and any other style than POSIX.
CFURLRef CFURLCreateWithFileSystemPath(CFAllocatorRef, CFStringRef path, CFURLPathStyle style,
                                       Boolean isDirectory);

/// Null if the text is not 32 hexadecimal digits in the groups 8-4-4-4-12.
CFUUIDRef CFUUIDCreateFromString(CFAllocatorRef, CFStringRef text);

CFUUIDBytes CFUUIDGetUUIDBytes(CFUUIDRef uuid);

/// The bundle in a folder, or null if there is no folder with a readable Contents/Info.plist. Its
/// shared object is loaded when a first instance is made.
///
/// A bundle stays for the rest of the process: asked again for the same folder, this gives out the
/// same bundle, and nobody releases it.
CFPlugInRef CFPlugInCreate(CFAllocatorRef, CFURLRef folder);

/// The factories (UUIDs, each bound to its bundle) that the bundle lists for a type, in its order.
/// Null if it does not list the type; an array without elements if it lists the type with no
/// factory.
CFArrayRef CFPlugInFindFactoriesForPlugInTypeInPlugIn(CFUUIDRef type, CFPlugInRef plugIn);

/// What the factory's function makes; it belongs to the caller, by the plug-in's own reference
/// count. Null if the function gives null, if there is no such function or no loadable shared
/// object, and for a UUID that is not an element of an array of factories.
void* CFPlugInInstanceCreate(CFAllocatorRef, CFUUIDRef factory, CFUUIDRef type);
