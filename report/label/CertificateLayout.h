// SPDX-License-Identifier: Apache-2.0
// Where everything goes on a certificate: verdict, conditions, criteria, the histogram of the
// differences, the patches that differ most, warnings, and a line to sign on. All of it takes one
// or two sheets, however much a result contains: what does not fit is counted.
#pragma once

#include <cstddef>
#include <vector>

#include "report/label/Content.h"
#include "report/label/Page.h"
#include "report/label/Typesetter.h"

namespace label {

struct CertificateLayout {
    std::vector<Page> pages;         ///< One or two.
    std::size_t criteriaCounted = 0; ///< Criteria that are only counted.
};

/// `content` is that of `result`.
CertificateLayout layOutCertificate(const Content& content, const report::Result& result,
                                    const Size& sheet, const Typesetter& typesetter);

} // namespace label
