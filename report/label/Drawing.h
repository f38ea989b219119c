// SPDX-License-Identifier: Apache-2.0
// Pages as files.
#pragma once

#include <string>
#include <vector>

#include "report/label/Label.h"
#include "report/label/Page.h"
#include "report/label/Typesetter.h"

namespace label {

/// What a file states of itself to those who list its properties.
struct Properties {
    std::string title;
    std::string creator; ///< "Tintgate 1.6.20"
    std::string stamp;   ///< 2024-05-01T12:34:56+02:00 or a beginning of it, or empty.
};

/// All pages as PDF, or the first one as SVG or PNG. Modules of a code are whole pixels in PNG, so
/// that their edges stay sharp. Throws CannotDraw.
std::string draw(const std::vector<Page>& pages, const Properties& properties, Format format,
                 double dpi, const Typesetter& typesetter);

} // namespace label
