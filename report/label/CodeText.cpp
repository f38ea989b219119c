// SPDX-License-Identifier: Apache-2.0
// Five words with one blank between them:
//
//     TINTGATE/1 FAILED 2024-05-01T12:34:56+02:00 SHA256:9F86...0A08 JOB:4711/2
//     TINTGATE/1 PASSED 2024-05-01T12:34 SHA256:60303AE2...8B9C FILE:proof.txt
//     TINTGATE/1 INCOMPLETE - SHA256:FD61A03A...C3A1 FILE:gr%C3%BCn.txt
//
// Everything but a file's name is in the alphanumeric set of QR codes, which takes 5.5 bits a
// character in place of 8. Escapes keep the text ASCII: scanners guess the encoding of other bytes.
#include "report/label/CodeText.h"

#include <algorithm>
#include <array>
#include <cctype>

#include <sha256.h>
#include <sys/types.h>

namespace label {
namespace {

constexpr std::string_view format = "TINTGATE/1";
constexpr std::string_view hashPrefix = "SHA256:";
constexpr std::string_view jobPrefix = "JOB:";
constexpr std::string_view filePrefix = "FILE:";
constexpr std::string_view noStamp = "-";
constexpr std::string_view digits = "0123456789ABCDEF";
constexpr std::size_t longestSubject = 60;
constexpr std::size_t longestStamp = 25;
constexpr std::size_t hashDigits = 64;

constexpr std::pair<report::Verdict, std::string_view> verdicts[] = {
    {report::Verdict::Passed, "PASSED"},
    {report::Verdict::Failed, "FAILED"},
    {report::Verdict::Incomplete, "INCOMPLETE"}};

std::string escaped(unsigned char byte) {
    if (byte > ' ' && byte < 0x7F && byte != '%') {
        return std::string(1, static_cast<char>(byte));
    }
    return {'%', digits[byte >> 4], digits[byte & 15]};
}

/// Cut between two escapes, never within one.
std::string escapedName(std::string_view name, std::size_t longest) {
    constexpr std::string_view cut = "..";
    std::string whole;
    std::string beginning;
    for (const char byte : name) {
        const std::string next = escaped(static_cast<unsigned char>(byte));
        if (beginning.size() == whole.size() &&
            whole.size() + next.size() + cut.size() <= longest) {
            beginning += next;
        }
        whole += next;
        if (whole.size() > longest) {
            return beginning.append(cut);
        }
    }
    return whole;
}

std::string upperCase(std::string_view text) {
    std::string result(text);
    for (char& c : result) {
        c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
    }
    return result;
}

std::string_view trimmed(std::string_view text) {
    constexpr const char* blanks = " \t\r\n";
    const std::size_t first = text.find_first_not_of(blanks);
    return first == text.npos ? std::string_view()
                              : text.substr(first, text.find_last_not_of(blanks) - first + 1);
}

/// Whether the text is a stamp or one of its beginnings that a clock without zone or seconds gives.
bool isStamp(std::string_view text) {
    constexpr std::string_view form = "0000-00-00T00:00:00+00:00";
    if (text.size() != 10 && text.size() != 16 && text.size() != 19 && text.size() != form.size()) {
        return false;
    }
    for (std::size_t i = 0; i < text.size(); ++i) {
        const bool fits = form[i] == '0'   ? text[i] >= '0' && text[i] <= '9'
                          : form[i] == '+' ? text[i] == '+' || text[i] == '-'
                                           : text[i] == form[i];
        if (!fits) {
            return false;
        }
    }
    return true;
}

} // namespace

std::string hashOf(std::string_view result) {
    SHA2_CTX context;
    SHA256Init(&context);
    SHA256Update(&context, reinterpret_cast<const std::uint8_t*>(result.data()), result.size());
    std::array<std::uint8_t, SHA256_DIGEST_LENGTH> bytes{};
    SHA256Final(bytes.data(), &context);
    std::string text;
    for (const std::uint8_t byte : bytes) {
        text += {digits[byte >> 4], digits[byte & 15]};
    }
    return text;
}

std::string subjectOf(const report::Result& result, const report::Meta* meta) {
    if (meta != nullptr) {
        return std::string(jobPrefix) + std::to_string(meta->jobId) + '/' +
               std::to_string(meta->strip);
    }
    const std::string& path = result.measurement.path;
    return std::string(filePrefix) +
           escapedName(path.substr(path.rfind('/') + 1), longestSubject - filePrefix.size());
}

std::string writeCodeText(const CodeText& code) {
    std::string text(format);
    for (const auto& [verdict, word] : verdicts) {
        if (verdict == code.verdict) {
            text.append(" ").append(word);
        }
    }
    return text.append(" ")
        .append(code.stamp.empty() ? noStamp : code.stamp)
        .append(" ")
        .append(hashPrefix)
        .append(code.hash)
        .append(" ")
        .append(code.subject);
}

std::optional<CodeText> readCodeText(std::string_view text) {
    constexpr std::string_view scannersPrefix = "QR-Code:";
    text = trimmed(text);
    if (text.starts_with(scannersPrefix)) {
        text = trimmed(text.substr(scannersPrefix.size()));
    }
    std::array<std::string_view, 5> words;
    for (std::size_t i = 0; i < words.size(); ++i) {
        const std::size_t blank = i + 1 < words.size() ? text.find(' ') : text.npos;
        words[i] = text.substr(0, blank);
        text.remove_prefix(blank == text.npos ? text.size() : blank + 1);
    }
    const auto verdict = std::find_if(std::begin(verdicts), std::end(verdicts),
                                      [&](const auto& row) { return row.second == words[1]; });
    const bool hasSubject = (words[4].starts_with(jobPrefix) || words[4].starts_with(filePrefix)) &&
                            words[4].find(' ') == words[4].npos;
    if (words[0] != format || verdict == std::end(verdicts) ||
        (words[2] != noStamp && !isStamp(words[2])) || !words[3].starts_with(hashPrefix) ||
        !hasSubject) {
        return std::nullopt;
    }
    CodeText code;
    code.verdict = verdict->first;
    code.stamp = words[2] == noStamp ? "" : words[2];
    code.hash = upperCase(words[3].substr(hashPrefix.size()));
    code.subject = words[4];
    if (code.hash.size() != hashDigits ||
        code.hash.find_first_not_of(digits) != std::string::npos) {
        return std::nullopt;
    }
    return code;
}

Match compareCodeText(const CodeText& text, const report::Result& result, const report::Meta* meta,
                      const std::string& hash) {
    if (text.hash != hash) {
        return Match::OtherResult;
    }
    const bool isJob = text.subject.starts_with(jobPrefix);
    const bool isSubjectKnown = !isJob || meta != nullptr;
    const bool isStampKnown = meta != nullptr && isJob;
    const bool agrees =
        text.verdict == result.verdict &&
        (!isSubjectKnown || text.subject == subjectOf(result, isJob ? meta : nullptr)) &&
        (!isStampKnown || text.stamp == meta->created.substr(0, longestStamp));
    return agrees ? Match::Same : Match::Altered;
}

} // namespace label
