// SPDX-License-Identifier: Apache-2.0
#include "text/CharSetsWx.h"

#include "platform/CoreFoundationStrings.h"
#include "text/CharSets.h"

namespace CharSetsWx {
namespace {

enum Outcome { Unchanged = 0, Converted = 1, Failed = 2 };

using Conversion = int (*)(void* context, std::string& target, const char* source);

/// Translate, with a string as target. Text that does not fit in the buffer gives Failed.
Outcome translate(std::string& target, const char* source, CFStringEncoding targetEncoding,
                  CFStringEncoding sourceEncoding) {
    char buffer[4096] = {};
    if (!Translate(buffer, sizeof buffer - 1, source, targetEncoding, sourceEncoding)) {
        return Failed;
    }
    target = buffer;
    return Converted;
}

wxString convert(const wxString& text, Conversion conversion) {
    const wxCharBuffer source = text.mb_str(wxConvLibc);
    std::string target;
    if (source.length() == 0 || conversion(Context, target, source) != Converted) {
        return text;
    }
    return wxString(target.c_str(), wxConvUTF8);
}

/// Char is char or const char.
template<class Char>
void redirect(Char*& text, std::string& own, Conversion conversion) {
    if (conversion(Context, own, text) == Converted) {
        text = own.data();
    }
}

} // namespace

std::uint32_t ApplicationEncoding = kCFStringEncodingMacRoman;
void* Context = nullptr;

bool IsUtf8Coded(const char* text) {
    return CharSets::IsUtf8Coded(text);
}

bool IsUtf8Coded(const std::string& text) {
    return CharSets::IsUtf8Coded(text);
}

bool NeedsTranslation(const char* text) {
    return text != nullptr && !IsUtf8Coded(text);
}

bool Translate(char* target, long size, const char* source, unsigned int targetEncoding,
               unsigned int sourceEncoding) {
    const platform::Owned<CFStringRef> string(
        CFStringCreateWithCString(kCFAllocatorDefault, source, sourceEncoding));
    return string != nullptr && CFStringGetCString(string.get(), target, size, targetEncoding);
}

int Controls2Io(void*, std::string& target, const char* source) {
    return NeedsTranslation(source)
               ? translate(target, source, kCFStringEncodingUTF8, ApplicationEncoding)
               : Unchanged;
}

int Io2Controls(void*, std::string& target, const char* source) {
    return NeedsTranslation(source)
               ? translate(target, source, ApplicationEncoding, kCFStringEncodingUTF8)
               : Unchanged;
}

int Io2Controls(std::string& target, const char* source, unsigned int sourceEncoding,
                unsigned int targetEncoding) {
    if (source == nullptr) {
        return Unchanged;
    }
    if (sourceEncoding == targetEncoding) {
        target = source;
        return Unchanged;
    }
    return translate(target, source, targetEncoding, sourceEncoding);
}

int TulControls2IO(void* context, std::string& target, const char* source) {
    switch (Controls2Io(context, target, source)) {
    case Unchanged:
        return 0;
    case Converted:
        return 1;
    default:
        return 2;
    }
}

wxString Controls2Io(const wxString& text) {
    return convert(text, Controls2Io);
}

wxString Io2Controls(const wxString& text) {
    return convert(text, Io2Controls);
}

Controls2IoBuffered::Controls2IoBuffered(const char*& text) {
    redirect(text, m_text, Controls2Io);
}

Controls2IoBuffered::Controls2IoBuffered(char*& text) {
    redirect(text, m_text, Controls2Io);
}

Io2ControlsBuffered::Io2ControlsBuffered(const char*& text) {
    redirect(text, m_text, Io2Controls);
}

Io2ControlsBuffered::Io2ControlsBuffered(char*& text) {
    redirect(text, m_text, Io2Controls);
}

} // namespace CharSetsWx
