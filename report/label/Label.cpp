// SPDX-License-Identifier: Apache-2.0
#include "report/label/Label.h"

#include "report/label/CertificateLayout.h"
#include "report/label/Content.h"
#include "report/label/Drawing.h"
#include "report/label/LabelLayout.h"
#include "report/label/Texts.h"
#include "report/label/Typesetter.h"

namespace label {
namespace {

constexpr double millimetresPerInch = 25.4;

Properties propertiesOf(const Content& content) {
    return {verdictText(content.model.verdict) + ": " + content.title,
            filled(texts().madeBy, {{"version", content.toolVersion}}), content.code.stamp};
}

std::size_t unknownIn(const std::vector<Page>& pages, const Typesetter& typesetter) {
    std::size_t unknown = 0;
    for (const Page& page : pages) {
        for (const Text& text : page.texts) {
            unknown +=
                typesetter.measure(text.words, text.style, text.place.width, text.lead).unknown;
        }
    }
    return unknown;
}

} // namespace

Drawn drawLabel(const Subject& subject, const Size& size, Format format, double dpi) {
    const Typesetter typesetter;
    const Content content = contentOf(subject);
    const LabelLayout layout = layOutLabel(
        content, size, format == Format::Png ? millimetresPerInch / dpi : usualDot, typesetter);
    return {draw({layout.page}, propertiesOf(content), format, dpi, typesetter), layout.leftOut,
            layout.criteriaCounted, unknownIn({layout.page}, typesetter)};
}

Drawn drawCertificate(const Subject& subject, const Size& sheet) {
    const Typesetter typesetter;
    const Content content = contentOf(subject);
    const CertificateLayout layout = layOutCertificate(content, subject.result, sheet, typesetter);
    return {draw(layout.pages, propertiesOf(content), Format::Pdf, standardDpi, typesetter),
            {},
            layout.criteriaCounted,
            unknownIn(layout.pages, typesetter)};
}

} // namespace label
