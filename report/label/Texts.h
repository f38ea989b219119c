// SPDX-License-Identifier: Apache-2.0
// Every word that labels and certificates print, and how they write numbers and dates. The texts
// are those of report/languages, in the language that was chosen last.
#pragma once

#include <cstddef>
#include <initializer_list>
#include <string>
#include <string_view>
#include <utility>

#include "report/Result.h"
#include "report/label/Details.h"
#include "report/languages/Texts.h"

namespace label {

/// The texts of one language. Names in braces are filled in.
struct Texts {
    std::string passed;
    std::string failed;
    std::string incomplete;

    std::string untitled;
    std::string fields[fieldCount]; ///< In the order of Field.
    std::string dates[3];           ///< In the order of DateKind: in place of the field's own.
    std::string target;             ///< In place of Field::Profile if the target is no profile.
    std::string notStated;          ///< What a certificate prints for a field that it must have.
    std::string job;
    std::string jobOfSheet;
    std::string labelled; ///< A field with its label.

    std::string criteria;
    std::string criterion;
    std::string value;
    std::string tolerance;
    std::string valueOfTolerance;
    std::string headOfValues;
    std::string more;       ///< Criteria that are not listed, by their outcomes:
    std::string countedAll; ///< The same if none is listed.
    std::string countFailed;
    std::string countOpen;
    std::string countPassed;
    std::string noCriterion;

    std::string hash;
    std::string madeBy;
    std::string signature;

    std::string certificate;
    std::string conditions;
    std::string differences;
    std::string differencesAxis;
    std::string worstPatches;
    std::string patch;
    std::string targetColour;
    std::string measuredColour;
    std::string swatches;
    std::string colours;
    std::string tones;
    std::string warnings;
    std::string moreWarnings;
    std::string viewing;
    std::string page;
};

/// The texts of pages in the chosen language (useLanguage), for criteria, warnings and patches.
const languages::Texts& say();

const Texts& texts();

/// "PASSED", "FAILED", "INCOMPLETE".
const std::string& verdictText(report::Verdict verdict);

/// A text with "{name}" replaced by the value of that name.
std::string filled(std::string_view text,
                   std::initializer_list<std::pair<std::string_view, std::string>> values);

/// Fixed decimals; a dash if the number is not finite.
std::string numberText(double value, int decimals);

/// 2024-05-01T12:34:56+02:00, or a beginning of it, as "1 May 2024, 12:34 (UTC+02:00)". Any other
/// text is returned unchanged.
std::string dateText(const std::string& stamp);

/// What a layout can take: invalid UTF-8 becomes U+FFFD, control characters and line ends become
/// blanks, characters that turn the direction of writing are removed, runs of blanks become one,
/// and text after `longestText` characters is replaced by an ellipsis.
std::string printable(std::string_view text);

inline constexpr std::size_t longestText = 400;

} // namespace label
