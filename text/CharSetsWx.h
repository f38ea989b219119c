// SPDX-License-Identifier: Apache-2.0
// Between the strings of the user side ("Controls", in the application encoding) and those of the
// comm plug-in and its server ("Io", UTF-8). Some serve other programs only (C165).
#pragma once

#include <cstdint>
#include <string>

#include <wx/string.h>

namespace CharSetsWx {

/// Encoding of the user side, a CFStringEncoding: 0 is MacRoman. Nothing sets it.
extern std::uint32_t ApplicationEncoding;

/// First argument of the conversions, which don't look at it.
extern void* Context;

/// As CharSets::IsUtf8Coded: true from the first well-formed multi-byte sequence on.
bool IsUtf8Coded(const char* text);
bool IsUtf8Coded(const std::string& text);

/// The opposite of IsUtf8Coded, and false for null. So ASCII needs translation, and a text with a
/// multi-byte sequence does not.
bool NeedsTranslation(const char* text);

/// Converts to a buffer of size bytes, the terminator among them. False, with the buffer untouched,
/// if the source is null or not valid in its encoding, or can't be expressed in the target's, or
/// does not fit.
bool Translate(char* target, long size, const char* source, unsigned int targetEncoding,
               unsigned int sourceEncoding);

// Each of these returns
//   0  no conversion was needed, the target is unchanged;
//   1  the target holds the converted text, of at most 4094 bytes (C152);
//   2  the conversion failed, the target is unchanged.

/// To UTF-8. A text that holds a multi-byte sequence is taken as UTF-8 already.
int Controls2Io(void* context, std::string& target, const char* source);

/// From UTF-8, with the same test (C151): the only text that would change is left alone with 0,
/// ASCII comes back equal with 1, stray high bytes give 2.
int Io2Controls(void* context, std::string& target, const char* source);

/// From one encoding to another. The same encoding assigns the source and gives 0; a null source
/// gives 0 and leaves the target.
int Io2Controls(std::string& target, const char* source, unsigned int sourceEncoding,
                unsigned int targetEncoding);

/// Controls2Io, in the shape of the callback that ticket lists convert their texts with.
int TulControls2IO(void* context, std::string& target, const char* source);

/// Through the C library's 8 bits. A text that did not convert, or that has no 8 bits, is returned
/// as it is.
wxString Controls2Io(const wxString& text);
wxString Io2Controls(const wxString& text);

/// Converts an argument for the length of a call:
///
///     Controls2IoBuffered converted(name);
///     send(name);
///
/// Where a conversion took place, the caller's pointer is redirected to a text that lives as long
/// as this object; else it stays.
class Controls2IoBuffered {
  public:
    explicit Controls2IoBuffered(const char*& text);
    explicit Controls2IoBuffered(char*& text);
    Controls2IoBuffered(const Controls2IoBuffered&) = delete;
    Controls2IoBuffered& operator=(const Controls2IoBuffered&) = delete;

  private:
    std::string m_text;
};

/// The same for Io2Controls.
class Io2ControlsBuffered {
  public:
    explicit Io2ControlsBuffered(const char*& text);
    explicit Io2ControlsBuffered(char*& text);
    Io2ControlsBuffered(const Io2ControlsBuffered&) = delete;
    Io2ControlsBuffered& operator=(const Io2ControlsBuffered&) = delete;

  private:
    std::string m_text;
};

} // namespace CharSetsWx
