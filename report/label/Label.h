// SPDX-License-Identifier: Apache-2.0
// Labels and certificates of verified prints: one result as a small label for the print's margin
// (PDF, SVG or PNG), or as a certificate of one or two sheets (PDF).
//
//     label::Subject subject{result, hash};
//     subject.details[label::Field::Operator] = "Anna";
//     const label::Drawn drawn = label::drawLabel(subject, label::standardSize, Format::Pdf);
//     base::writeWholeFile(path, drawn.bytes);
//
// The same subject gives the same bytes with the same fonts. Any number of threads may draw at the
// same time.
#pragma once

#include <cstddef>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "report/Meta.h"
#include "report/Result.h"
#include "report/label/CodeText.h"
#include "report/label/Details.h"
#include "report/label/Page.h"
#include "report/languages/Language.h"

namespace label {

/// Chooses the language of what is drawn next; it is English at first. Labels of different
/// languages can't be drawn at the same time.
void useLanguage(languages::Language language);

enum class Format { Pdf, Svg, Png };

/// By the extension of a path, in any case of letters. Nothing for any other extension.
std::optional<Format> formatOf(std::string_view path);

/// Limits of a label's sides in millimetres. Smaller labels have no room for verdict and code.
inline constexpr double shortestSide = 25;
inline constexpr double leastLongerSide = 50;
inline constexpr double longestSide = 300;
inline constexpr Size standardSize = {100, 50};

/// "100x50mm", "100x50" or "3.5x1.4in": width, then height as the label is read. Nothing for any
/// other text or for a size out of range.
std::optional<Size> sizeOf(std::string_view text);
inline constexpr const char* sizeRule =
    "takes a size such as 100x50mm or 4x2in: the shorter side at least 25 mm, the longer one 50 to "
    "300 mm";

/// Of certificates.
inline constexpr Size a4 = {210, 297};
inline constexpr Size letter = {215.9, 279.4};

/// "A4" or "Letter" in any case of letters; nothing for any other text.
std::optional<Size> sheetOf(std::string_view text);

/// The sheet that is usual in the user's country: LC_PAPER of the environment.
Size usualSheet();

inline constexpr double standardDpi = 300;
inline constexpr double leastDpi = 150;
inline constexpr double mostDpi = 1200;

/// What a label is about. The result and the job must live as long as the subject.
struct Subject {
    const report::Result& result;
    std::string hash;                   ///< hashOf() the bytes of the result's JSON.
    const report::Meta* meta = nullptr; ///< Of a job; its time is the date then.
    std::string date = {}; ///< 2024-05-01T12:34:56+02:00 or a beginning of it; empty if unknown.
    DateKind kindOfDate = DateKind::Verified;
    Details details = {};

    std::string stamp() const;
    DateKind dateKind() const;
};

struct Drawn {
    std::string bytes;
    std::vector<std::string> leftOut;  ///< Labels of fields that had no room.
    std::size_t criteriaCounted = 0;   ///< Criteria that are only counted.
    std::size_t unknownCharacters = 0; ///< Characters that no installed font has.
};

/// Thrown if a label can't be drawn: no font is installed, or out of memory in the libraries.
class CannotDraw : public std::runtime_error {
  public:
    using std::runtime_error::runtime_error;
};

/// One page of exactly this size. `dpi` counts for PNG only. Throws CannotDraw.
Drawn drawLabel(const Subject& subject, const Size& size, Format format, double dpi = standardDpi);

/// One or two pages of PDF. Throws CannotDraw.
Drawn drawCertificate(const Subject& subject, const Size& sheet);

/// True if a file with these bytes was made by one of the functions above: it may be replaced
/// without a question. Takes the whole file.
bool isOurs(std::string_view bytes);

} // namespace label
