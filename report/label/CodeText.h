// SPDX-License-Identifier: Apache-2.0
// The text of a label's QR code: it ties a print to the result of its verification.
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "report/Meta.h"
#include "report/Result.h"

namespace label {

/// What the text states. All of it is ASCII.
struct CodeText {
    report::Verdict verdict = report::Verdict::Incomplete;
    std::string stamp;   ///< 2024-05-01T12:34:56+02:00 or a beginning of it; empty if unknown.
    std::string hash;    ///< SHA-256 of the result's bytes: 64 hexadecimal digits, upper case.
    std::string subject; ///< "JOB:4711/2" (job and strip) or "FILE:proof.txt".
};

/// SHA-256 of a result's bytes, in the form that CodeText has.
std::string hashOf(std::string_view result);

/// The job and its strip if there is a job, otherwise the name of the measured file: bytes that are
/// not printable ASCII as %XX, cut to 60 characters, the last two of which are then "..".
std::string subjectOf(const report::Result& result, const report::Meta* meta);

std::string writeCodeText(const CodeText& code);

/// Reads a text as a scanner returns it: blanks and line ends around it and the scanner's own
/// prefix "QR-Code:" are ignored. Nothing if it is not the text of a label.
std::optional<CodeText> readCodeText(std::string_view text);

enum class Match {
    Same,
    OtherResult, ///< The text belongs to another result, or the result was altered.
    Altered,     ///< The hash is the result's, but verdict, subject or date are not.
};

/// Compares a label's text with a result. `hash` is that of the result's bytes. Without `meta` the
/// job is not known, so that a text's job is not compared; the date is compared only with a job's.
Match compareCodeText(const CodeText& text, const report::Result& result, const report::Meta* meta,
                      const std::string& hash);

} // namespace label
