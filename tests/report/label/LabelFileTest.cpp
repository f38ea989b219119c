// SPDX-License-Identifier: Apache-2.0
// Labels and certificates as other programs read them.
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cairo.h>
#include <pugixml.hpp>

#include "RunProgram.h"
#include "Samples.h"
#include "ScratchFolder.h"
#include "report/label/Label.h"

namespace {

using label::Format;
using testing::HasSubstr;

constexpr label::Size sizes[] = {{100, 50}, {62, 100}, {89, 36}, {102, 152}, {50, 25}, {70, 70}};

std::string outputOf(const std::vector<std::string>& command) {
    const support::Outcome outcome = support::run(command);
    EXPECT_EQ(outcome.exitCode, 0) << command[0] << outcome.error;
    return outcome.output;
}

std::vector<std::string> linesOf(const std::string& text) {
    std::istringstream stream(text);
    std::vector<std::string> lines;
    for (std::string line; std::getline(stream, line);) {
        lines.push_back(line);
    }
    return lines;
}

/// What the codes in these pictures say.
std::vector<std::string> scanned(std::vector<std::string> pictures) {
    pictures.insert(pictures.begin(), {"zbarimg", "--quiet", "--raw", "--nodbus"});
    return linesOf(outputOf(pictures));
}

std::string textOf(const LabelSample& sample) {
    const label::Subject subject = sample.subject();
    return label::writeCodeText({sample.result.verdict, subject.stamp(), subject.hash,
                                 label::subjectOf(sample.result, subject.meta)});
}

/// Words of a PDF with their boxes in points, as poppler sees them.
struct Word {
    std::string text;
    double left, top, right, bottom;
};
std::vector<Word> wordsOf(const std::string& pdf) {
    pugi::xml_document document;
    const std::string xml = outputOf({"pdftotext", "-bbox", pdf, "-"});
    EXPECT_TRUE(document.load_string(xml.c_str())) << xml;
    std::vector<Word> words;
    for (const auto& found : document.select_nodes("//word")) {
        const pugi::xml_node node = found.node();
        if (std::string(node.text().get()).starts_with("\xCC")) {
            continue; // an accent, which is to be on its letter
        }
        words.push_back({node.text().get(), node.attribute("xMin").as_double(),
                         node.attribute("yMin").as_double(), node.attribute("xMax").as_double(),
                         node.attribute("yMax").as_double()});
    }
    return words;
}

/// No word leaves the page, and none covers another by more than their line spacing does.
void expectApart(const std::vector<Word>& words, const label::Size& size) {
    constexpr double points = 72 / 25.4;
    for (std::size_t i = 0; i < words.size(); ++i) {
        const Word& a = words[i];
        EXPECT_TRUE(a.left >= 0 && a.top >= -1 && a.right <= size.width * points &&
                    a.bottom <= size.height * points + 1)
            << a.text;
        for (std::size_t k = i + 1; k < words.size(); ++k) {
            const Word& b = words[k];
            const double wide = std::min(a.right, b.right) - std::max(a.left, b.left);
            const double high = std::min(a.bottom, b.bottom) - std::max(a.top, b.top);
            EXPECT_FALSE(wide > 0.7 && high > 0.4 * std::min(a.bottom - a.top, b.bottom - b.top))
                << a.text << " and " << b.text;
        }
    }
}

/// Whether the outermost millimetre of a picture is white.
bool hasWhiteEdge(const std::string& png, double dpi) {
    cairo_surface_t* const picture = cairo_image_surface_create_from_png(png.c_str());
    const int width = cairo_image_surface_get_width(picture);
    const int height = cairo_image_surface_get_height(picture);
    const int edge = static_cast<int>(dpi / 25.4);
    const unsigned char* const data = cairo_image_surface_get_data(picture);
    bool isWhite = width > 0;
    for (int y = 0; y < height; ++y) {
        for (int x = 0; x < width; ++x) {
            const bool isEdge = x < edge || y < edge || x >= width - edge || y >= height - edge;
            const unsigned char* const pixel =
                data + y * cairo_image_surface_get_stride(picture) + 4 * x;
            isWhite = isWhite && (!isEdge || (pixel[0] & pixel[1] & pixel[2]) == 255);
        }
    }
    cairo_surface_destroy(picture);
    return isWhite;
}

TEST(LabelFile, IsReadBackAsPictureAndAsPdfAtTheResolutionsOfLabelPrinters) {
    const support::ScratchFolder scratch;
    const char* const kept = std::getenv("TINTGATE_LABEL_SAMPLES"); // to look at
    const std::string folder = kept != nullptr ? kept : scratch.path();
    LabelSamples samples(2027);
    std::vector<std::string> pictures;
    std::vector<std::string> texts;
    for (std::size_t i = 0; i < 40; ++i) {
        SCOPED_TRACE(i);
        const LabelSample sample = samples.next();
        const label::Size& size = sizes[i % std::size(sizes)];
        const double dpi = i % 2 == 0 ? 203 : 300;
        const std::string name = folder + "/label" + std::to_string(100 + i);
        const auto write = [&](const std::string& ending, const std::string& bytes) {
            EXPECT_TRUE(label::isOurs(bytes));
            std::ofstream(name + ending, std::ios::binary) << bytes;
            return name + ending;
        };

        const std::string png =
            write(".png", label::drawLabel(sample.subject(), size, Format::Png, dpi).bytes);
        EXPECT_TRUE(hasWhiteEdge(png, dpi));
        const std::string pdf =
            write(".pdf", label::drawLabel(sample.subject(), size, Format::Pdf).bytes);
        expectApart(wordsOf(pdf), size);
        outputOf({"pdftoppm", "-r", std::to_string(static_cast<int>(dpi)), "-gray", "-png",
                  "-singlefile", pdf, name + "-printed"});
        pictures.insert(pictures.end(), {png, name + "-printed.png"});
        texts.insert(texts.end(), 2, textOf(sample));

        pugi::xml_document svg;
        ASSERT_TRUE(
            svg.load_string(label::drawLabel(sample.subject(), size, Format::Svg).bytes.c_str()));
        EXPECT_NEAR(svg.child("svg").attribute("width").as_double(), size.width * 72 / 25.4, 0.01);
    }
    EXPECT_EQ(scanned(pictures), texts);
}

TEST(LabelFile, StatesVerdictTitleConditionsAndSize) {
    const support::ScratchFolder scratch;
    LabelSample sample = LabelSamples(3).next(0);
    sample.hasMeta = true;
    sample.meta = jobOf("校正刷り Größe \"7\"", "Spectro", "プルーフ用紙", "Workflow", "anna");
    sample.result.verdict = report::Verdict::Incomplete;
    sample.result.presetName = "Contract proof";
    sample.result.target.statements = {{"description", "FOGRA51"}};
    sample.result.measurement.measurementCondition = "M1";
    sample.details = {{label::Field::Operator, "Anna Müller"}, {label::Field::Paper, "用紙235"}};
    const label::Drawn drawn = label::drawLabel(sample.subject(), {100, 50}, Format::Pdf);
    EXPECT_EQ(drawn.unknownCharacters, 0u);
    const std::string pdf = scratch.write("label.pdf", drawn.bytes);
    EXPECT_THAT(outputOf({"pdfinfo", pdf}),
                testing::AllOf(HasSubstr("283.465 x 141.732 pts"), HasSubstr("Pages:           1"),
                               HasSubstr("INCOMPLETE: 校正刷り Größe")));
    const std::string text = outputOf({"pdftotext", "-layout", pdf, "-"});
    for (const char* part :
         {"INCOMPLETE", "校正刷り Größe \"7\"", "Condition: FOGRA51", "Preset: Contract proof",
          "Verified: 1 May 2024, 12:34", "UTC+02:00", "Paper: 用紙235", "Instrument: Spectro, M1",
          "Operator: Anna Müller", "Signature"}) {
        EXPECT_THAT(text, HasSubstr(part));
    }
    EXPECT_EQ(label::drawLabel(sample.subject(), {100, 50}, Format::Pdf).bytes, drawn.bytes);
    // A printer takes the size of a picture from its resolution, in dots per metre.
    const std::string png = label::drawLabel(sample.subject(), {100, 50}, Format::Png, 203).bytes;
    const std::size_t chunk = png.find("pHYs");
    ASSERT_NE(chunk, png.npos);
    EXPECT_EQ(png.substr(chunk + 4, 9), std::string("\0\0\x1F\x38\0\0\x1F\x38\1", 9)); // 7992
}

TEST(CertificateFile, HasWhatPersonsNeedOnA4OrLetter) {
    const support::ScratchFolder scratch;
    LabelSamples samples(11);
    for (const bool isA4 : {true, false}) {
        LabelSample sample = samples.next(30, 500);
        sample.result.verdict = report::Verdict::Failed;
        const label::Size& sheet = isA4 ? label::a4 : label::letter;
        const std::string pdf =
            scratch.write("certificate.pdf", label::drawCertificate(sample.subject(), sheet).bytes);
        EXPECT_THAT(outputOf({"pdfinfo", pdf}),
                    HasSubstr(isA4 ? "595.276 x 841.89 pts (A4)" : "612 x 792 pts (letter)"));
        const std::string text = outputOf({"pdftotext", "-layout", pdf, "-"});
        for (const char* part : {"FAILED", "Conditions", "Criteria", "Colour differences",
                                 "Largest differences:", "Page 1 of 2", "Signature"}) {
            EXPECT_THAT(text, HasSubstr(part));
        }
        EXPECT_THAT(text, HasSubstr(sample.subject().hash));
        outputOf({"pdftoppm", "-r", "203", "-f", "1", "-l", "1", "-gray", "-png", "-singlefile",
                  pdf, scratch.path("sheet")});
        EXPECT_THAT(scanned({scratch.path("sheet.png")}), testing::ElementsAre(textOf(sample)));
    }
}

TEST(LabelSizes, AreReadInMillimetresAndInches) {
    struct {
        const char* text;
        double width, height; ///< 0 if it is refused.
    } const cases[] = {{"100x50mm", 100, 50},
                       {"100x50", 100, 50},
                       {"62.5X100MM", 62.5, 100},
                       {"4x2in", 101.6, 50.8},
                       {"50x25", 50, 25},
                       {"300x300", 300, 300},
                       {"301x50", 0, 0},
                       {"49x49", 0, 0},
                       {"100x24.9", 0, 0},
                       {"100", 0, 0},
                       {"100x", 0, 0},
                       {"x50", 0, 0},
                       {"100x50cm", 0, 0},
                       {"100x50mm ", 0, 0},
                       {"-100x50", 0, 0},
                       {"nanxnan", 0, 0},
                       {"infx50", 0, 0},
                       {"1e2x50", 0, 0},
                       {"", 0, 0}};
    for (const auto& [text, width, height] : cases) {
        const auto size = label::sizeOf(text);
        EXPECT_EQ(size.has_value(), width > 0) << text;
        if (size) {
            EXPECT_NEAR(size->width, width, 1e-9) << text;
            EXPECT_NEAR(size->height, height, 1e-9) << text;
        }
    }
}

} // namespace
