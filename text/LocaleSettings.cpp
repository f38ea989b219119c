// SPDX-License-Identifier: Apache-2.0
#include "text/LocaleSettings.h"

#include <string_view>

#include "platform/CoreFoundationStrings.h"
#include "platform/Locale.h"

namespace LocaleSettings {
namespace {

constexpr int english = 59;

enum class Against {
    Language, ///< The language part of an entry.
    Entry,    ///< The entry in full.
};

/// In the order of the tests.
constexpr struct {
    Against against;
    std::string_view name;
    int number;
} languages[] = {
    {Against::Language, "en", english}, {Against::Language, "eng", english},
    {Against::Language, "de", 88},      {Against::Language, "ger", 88},
    {Against::Language, "fr", 79},      {Against::Language, "fre", 79},
    {Against::Language, "it", 109},     {Against::Language, "ita", 109},
    {Against::Language, "es", 179},     {Against::Language, "spa", 179},
    {Against::Language, "ja", 111},     {Against::Language, "jap", 111},
    {Against::Entry, "zh_CN", 45},      {Against::Entry, "zh-Hans", 45},
    {Against::Entry, "zh_TW", 46},      {Against::Entry, "zh-Hant", 46},
    {Against::Language, "ko", 124},     {Against::Language, "bs", 5146},
    {Against::Language, "bos", 5146},   {Against::Language, "pt", 153},
    {Against::Language, "por", 153},    {Against::Entry, "br", 154},
    {Against::Language, "da", 54},      {Against::Language, "dan", 54},
    {Against::Language, "fi", 78},      {Against::Language, "fin", 78},
    {Against::Language, "gr", 94},      {Against::Language, "gre", 94},
    {Against::Language, "ca", 43},      {Against::Language, "cat", 43},
    {Against::Language, "nb", 146},     {Against::Language, "nn", 146},
    {Against::Language, "sv", 202},     {Against::Language, "swe", 202},
    {Against::Language, "cs", 53},      {Against::Language, "ru", 159},
    {Against::Language, "hu", 101},     {Against::Language, "pl", 152},
    {Against::Language, "sl", 177},     {Against::Language, "hr", 52},
    {Against::Language, "tr", 214},     {Against::Language, "ro", 158},
    {Against::Language, "bg", 41},      {Against::Entry, "nl", 55},
    {Against::Language, "nl", 56},
};

struct Range {
    int first;
    int last;
    int value;
};

constexpr Range languageIdentifiers[] = {
    {7, 7, 1025},     {19, 19, 1025},   {41, 41, 1026},     {43, 43, 1027},   {44, 44, 1028},
    {45, 45, 2052},   {46, 50, 1028},   {52, 52, 1050},     {53, 53, 1029},   {54, 54, 1030},
    {55, 55, 1043},   {56, 56, 2067},   {57, 72, 1033},     {78, 78, 1035},   {79, 79, 1036},
    {80, 80, 2060},   {81, 84, 1036},   {88, 93, 1031},     {94, 94, 1032},   {99, 99, 1037},
    {101, 101, 1038}, {102, 102, 1039}, {109, 110, 1040},   {111, 111, 1041}, {124, 124, 1042},
    {131, 131, 1071}, {146, 147, 1044}, {152, 152, 1045},   {153, 153, 2070}, {154, 154, 1046},
    {158, 158, 1048}, {159, 160, 1049}, {166, 168, 2074},   {177, 177, 1060}, {179, 199, 3082},
    {202, 203, 1053}, {214, 214, 1055}, {5146, 5146, 5146},
};
constexpr int englishIdentifier = 1033;

/// Dutch, 55 and 56, has the Central European encoding (C155). Chinese, Japanese and Korean
/// encodings are plain numbers, since nothing here converts them.
constexpr Range macEncodings[] = {
    {41, 41, kCFStringEncodingMacCyrillic},
    {44, 44, 2},
    {45, 45, 25},
    {46, 50, 2},
    {52, 52, kCFStringEncodingMacCroatian},
    {53, 53, kCFStringEncodingMacCentralEurRoman},
    {55, 56, kCFStringEncodingMacCentralEurRoman},
    {94, 94, kCFStringEncodingMacGreek},
    {101, 101, kCFStringEncodingMacCentralEurRoman},
    {111, 111, 1},
    {124, 124, 3},
    {152, 152, kCFStringEncodingMacCentralEurRoman},
    {158, 158, kCFStringEncodingMacRomanian},
    {159, 159, kCFStringEncodingMacCyrillic},
    {177, 177, kCFStringEncodingMacCentralEurRoman},
    {214, 214, kCFStringEncodingMacTurkish},
};

template<std::size_t N>
int find(const Range (&ranges)[N], int number, int fallback) {
    for (const Range& range : ranges) {
        if (range.first <= number && number <= range.last) {
            return range.value;
        }
    }
    return fallback;
}

/// Number of an entry of the preference list. Negative if the table does not contain it.
int languageNumber(CFStringRef entry) {
    char text[256];
    LocaleRef locale;
    char language[6];
    if (entry == nullptr ||
        !CFStringGetCString(entry, text, sizeof text, kCFStringEncodingMacRoman) ||
        text[0] == '\0' || LocaleRefFromLocaleString(text, &locale) != 0 ||
        LocaleRefGetPartString(locale, kLocaleLanguageMask, sizeof language, language) != 0) {
        return -1;
    }
    for (const auto& row : languages) {
        const std::string_view sought = row.against == Against::Entry ? text : language;
        if (sought == row.name) {
            return row.number;
        }
    }
    return -1;
}

} // namespace

int MacGetUserLocale() {
    const platform::Owned<CFArrayRef> list(CFPreferencesCopyValue("AppleLanguages"));
    const CFIndex count = list == nullptr ? 0 : CFArrayGetCount(list.get());
    for (CFIndex i = 0; i < count; ++i) {
        const auto entry = static_cast<CFStringRef>(CFArrayGetValueAtIndex(list.get(), i));
        if (const int number = languageNumber(entry); number >= 0) {
            return number;
        }
    }
    return english;
}

int GetSystemLanguagewX() {
    return MacGetUserLocale();
}

int GetSystemCodePage() {
    return GetSystemCodePage(-1);
}

int GetSystemCodePage(int language) {
    return find(languageIdentifiers, language < 0 ? MacGetUserLocale() : language,
                englishIdentifier);
}

wxString GetSystemLanguageString() {
    return wxString::Format("%d", GetSystemCodePage());
}

int GetMacSystemEncoding() {
    return find(macEncodings, MacGetUserLocale(), kCFStringEncodingMacRoman);
}

} // namespace LocaleSettings
