// SPDX-License-Identifier: Apache-2.0
// Converts between strings of the user side ("Controls", application encoding) and of the comm
// plug-in and its server ("Io", UTF-8). Some functions serve other programs only (C165).
#pragma once

#include <cstdint>
#include <string>

#include <wx/string.h>

namespace CharSetsWx {

/// Encoding of the user side, a CFStringEncoding. 0 is MacRoman. Nothing sets it.
extern std::uint32_t ApplicationEncoding;

/// Passed as the first argument of the conversions, which ignore it.
extern void* Context;

/// Same rule as CharSets::IsUtf8Coded.
bool IsUtf8Coded(const char* text);
bool IsUtf8Coded(const std::string& text);

/// The opposite of IsUtf8Coded, but false for null. So ASCII text needs translation, and text with
/// a multi-byte sequence does not.
bool NeedsTranslation(const char* text);

/// Converts to a buffer of `size` bytes, including the terminator. Returns false and leaves the
/// buffer unchanged if the source is null, is invalid in its encoding, can't be expressed in the
/// target encoding, or does not fit.
bool Translate(char* target, long size, const char* source, unsigned int targetEncoding,
               unsigned int sourceEncoding);

// Each of these returns
//   0  no conversion was needed; the target is unchanged;
//   1  the target contains the converted text, of at most 4094 bytes (C152);
//   2  the conversion failed; the target is unchanged.

/// To UTF-8. Text that contains a multi-byte sequence is assumed to be UTF-8 already.
int Controls2Io(void* context, std::string& target, const char* source);

/// From UTF-8, with the same test (C151): text that the conversion would change is left alone and
/// gives 0, ASCII text is copied and gives 1, stray high bytes give 2.
int Io2Controls(void* context, std::string& target, const char* source);

/// From one encoding to another. If both encodings are the same, assigns the source and returns 0.
/// A null source returns 0 and leaves the target unchanged.
int Io2Controls(std::string& target, const char* source, unsigned int sourceEncoding,
                unsigned int targetEncoding);

/// Controls2Io with the signature of the callback that converts the texts of ticket lists.
int TulControls2IO(void* context, std::string& target, const char* source);

/// Converts via the C library's 8-bit encoding. Text that can't be represented there or was not
/// converted is returned unchanged.
wxString Controls2Io(const wxString& text);
wxString Io2Controls(const wxString& text);

/// Converts an argument for the duration of a call:
///
///     Controls2IoBuffered converted(name);
///     send(name);
///
/// If the text is converted, the caller's pointer is redirected to a copy that lives as long as
/// this object. Otherwise the pointer is unchanged.
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
