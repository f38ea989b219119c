// SPDX-License-Identifier: Apache-2.0
#include "report/label/CertificateLayout.h"

#include <algorithm>
#include <cmath>
#include <utility>

#include "report/label/ColourCharts.h"
#include "report/label/HistogramChart.h"
#include "report/label/Parts.h"
#include "report/label/Texts.h"
#include "report/label/ToneCharts.h"

namespace label {
namespace {

constexpr double margin = 15;    ///< Of the sheet, in millimetres.
constexpr double footHeight = 7; ///< Below the content of each sheet, within the margin's frame.
constexpr double blockGap = 5;
constexpr double columnGap = 4;
constexpr double rowGap = 0.8;
constexpr double chartHeight = 52;
constexpr std::size_t mostPatches = 15;
constexpr std::size_t fewestPatches = 5; ///< Fewer only if there is no room for them.
constexpr std::size_t sheets = 2;

constexpr Colour green = {0.0, 0.36, 0.16};
constexpr Colour red = {0.66, 0.05, 0.09};
constexpr Colour grey = {0.33, 0.33, 0.33};
constexpr Colour bar = {0.42, 0.42, 0.42};

constexpr Style plain = {.points = 8.5, .lines = 2};
constexpr Style bold = {.points = 8.5, .bold = true, .lines = 2};
constexpr Style small = {.points = 7.5, .lines = 2, .colour = grey};
constexpr Style heading = {.points = 10.5, .bold = true, .lines = 1};

Style right(Style style) {
    style.align = Align::Right;
    return style;
}

Style lines(Style style, int count) {
    style.lines = count;
    return style;
}

Colour colourOf(report::Verdict verdict) {
    return verdict == report::Verdict::Passed   ? green
           : verdict == report::Verdict::Failed ? red
                                                : black;
}

Colour colourOf(report::Outcome outcome) {
    return outcome == report::Outcome::Pass   ? green
           : outcome == report::Outcome::Fail ? red
                                              : black;
}

Colour colourOf(const report::Swatch& swatch) {
    return {swatch.red / 255.0, swatch.green / 255.0, swatch.blue / 255.0};
}

std::string labText(const colour::Lab& lab) {
    return numberText(lab.L, 2) + "  " + numberText(lab.a, 2) + "  " + numberText(lab.b, 2);
}

std::string signedText(double value) {
    return (value > 0 ? "+" : "") + numberText(value, 2);
}

/// A cell of a table. The columns of a table are given as widths.
struct Cell {
    std::string words;
    Style style;
};
using Cells = std::vector<Cell>;

/// Content from the top of the first sheet to the bottom of the second.
class Certificate {
  public:
    Certificate(const Content& content, const report::Result& result, const Size& sheet,
                const Typesetter& typesetter)
        : m_content(content), m_result(result), m_sheet(sheet), m_typesetter(typesetter),
          m_width(sheet.width - 2 * margin) {}

    CertificateLayout layOut() {
        beginSheet();
        placeHead();
        placeFacts();
        placeCriteria();
        placeHistogram();
        placeWorstPatches();
        placeWarnings();
        placeToneCharts();
        placeColourCharts();
        placeEnd();
        placeFeet();
        return std::move(m_layout);
    }

  private:
    Page& page() { return m_layout.pages.back(); }
    double bottom() const { return m_sheet.height - margin - footHeight; }
    double room() const { return bottom() - m_y; }
    bool isLastSheet() const { return m_layout.pages.size() == sheets; }

    void beginSheet() {
        m_layout.pages.emplace_back().size = m_sheet;
        m_y = margin;
    }

    /// Begins the next sheet if the height has no room on this one. On the last one nothing
    /// changes.
    void need(double height) {
        if (height > room() && !isLastSheet()) {
            beginSheet();
        }
    }

    double heightOf(const std::string& words, const Style& style, double width) const {
        return m_typesetter.measure(words, style, width).height;
    }

    void addParagraph(const std::string& words, const Style& style, double width) {
        m_y = addText(page(), m_typesetter, {margin, m_y}, width, words, style).bottom();
    }

    void addHeading(const std::string& words) {
        addParagraph(words, heading, m_width);
        m_y += 0.8;
    }

    double headingHeight(const std::string& words) const {
        return heightOf(words, heading, m_width) + 0.8;
    }

    // ---- Rows of tables

    double rowHeight(const Cells& cells, const std::vector<double>& widths) const {
        double height = 0;
        for (std::size_t i = 0; i < cells.size(); ++i) {
            height = std::max(height, heightOf(cells[i].words, cells[i].style, widths[i]));
        }
        return height + rowGap;
    }

    void placeRow(const Cells& cells, const std::vector<double>& widths) {
        const double height = rowHeight(cells, widths);
        double x = margin;
        for (std::size_t i = 0; i < cells.size(); ++i) {
            if (!cells[i].words.empty()) {
                addText(page(), m_typesetter, {x, m_y}, widths[i], cells[i].words, cells[i].style);
            }
            x += widths[i] + tableGap;
        }
        m_y += height;
    }

    /// Widths of columns that share what fixed ones (above 0) leave by their weights (below 0).
    std::vector<double> widthsOf(std::vector<double> columns) const {
        double left = m_width - tableGap * static_cast<double>(columns.size() - 1);
        double weights = 0;
        for (const double column : columns) {
            (column > 0 ? left : weights) -= column;
        }
        for (double& column : columns) {
            column = column > 0 ? column : -column * left / weights;
        }
        return columns;
    }

    // ---- Blocks

    void placeHead() {
        constexpr double wanted = 28;
        constexpr double verdictPoints = 26;
        Page& first = page();
        if (auto symbol = symbolOf(writeCodeText(m_content.code), Correction::Medium)) {
            first.symbol = std::move(*symbol);
            first.symbolPlace = {m_sheet.width - margin - wanted, margin, wanted, wanted};
        }
        const double width = m_width - wanted - columnGap;
        addParagraph(texts().certificate, small, width);
        m_y += 1;
        const report::Verdict verdict = m_content.model.verdict;
        m_y = addVerdict(first, m_typesetter, verdict, {margin, m_y}, width, verdictPoints,
                         colourOf(verdict))
                  .bottom() +
              1.5;
        addParagraph(m_content.title, {.points = 14, .bold = true, .lines = 2}, width);
        addParagraph(printable(m_content.model.sentence), lines(plain, 3), width);
        m_y = std::max(m_y, margin + wanted) + 2;
        for (const std::string& doubt : m_content.model.doubts) {
            const std::string words = printable(doubt);
            if (m_y + heightOf(words, lines(plain, 3), m_width) > margin + m_sheet.height / 3) {
                break; // All of them are among the warnings as well.
            }
            addParagraph(words, lines(plain, 3), m_width);
        }
        m_y += blockGap / 2;
    }

    /// Two columns of fields, read down the first and then the second.
    void placeFacts() {
        constexpr double labelWidth = 24;
        addHeading(texts().conditions);
        const double width = (m_width - columnGap) / 2;
        std::vector<const Entry*> entries;
        for (const Entry& entry : m_content.entries) {
            if (entry.field != Field::NotStated) {
                entries.push_back(&entry);
            }
        }
        const double top = m_y;
        double deepest = top;
        const std::size_t inFirst = (entries.size() + 1) / 2;
        for (std::size_t i = 0; i < entries.size(); ++i) {
            const Entry& entry = *entries[i];
            const double x = margin + (i < inFirst ? 0 : width + columnGap);
            if (i == inFirst) {
                m_y = top;
            }
            Style style = lines(plain, 3);
            style.colour = entry.isKnown ? black : grey;
            const Rect label =
                addText(page(), m_typesetter, {x, m_y}, labelWidth, entry.label, lines(bold, 1));
            const Rect text =
                addText(page(), m_typesetter, {x + labelWidth + 1, m_y}, width - labelWidth - 1,
                        entry.isKnown ? entry.text : texts().notStated, style);
            m_y = std::max(label.bottom(), text.bottom()) + rowGap;
            deepest = std::max(deepest, m_y);
        }
        m_y = deepest;
        if (!m_content.model.condition.empty()) {
            addParagraph(printable(m_content.model.condition), small, m_width);
        }
        m_y += blockGap;
    }

    static constexpr double signWidth = 4;
    static constexpr double barWidth = 26;

    std::vector<double> criteriaWidths() const {
        return widthsOf({signWidth, -1.6, barWidth, 15, 17, 18, -1});
    }

    Cells criterionCells(const report::Figure& figure) const {
        return {{"", plain},
                {printable(figure.title), plain},
                {"", plain},
                {figure.value, right(bold)},
                {figure.tolerance, right(plain)},
                {figure.unit, lines(plain, 1)},
                {printable(figure.missing.empty() ? figure.worstLabel : figure.missing), small}};
    }

    void placeCriteriaHead(const std::vector<double>& widths) {
        addHeading(texts().criteria);
        placeRow({{"", small},
                  {texts().criterion, small},
                  {"", small},
                  {texts().value, right(small)},
                  {texts().tolerance, right(small)},
                  {"", small},
                  {texts().patch, small}},
                 widths);
    }

    /// Value against tolerance: the line in the middle is the limit, the end twice of it.
    void placeBar(const report::Figure& figure, double x, double y) {
        constexpr double height = 2.2;
        if (figure.outcome != report::Outcome::Pass && figure.outcome != report::Outcome::Fail) {
            return;
        }
        const double top = y + 0.7;
        const double length = std::max(0.2, barWidth * figure.fill);
        page().shapes.push_back(
            {figure.outcome == report::Outcome::Fail ? Mark::Hatched : Mark::Fill,
             {x, top, length, height},
             figure.outcome == report::Outcome::Fail ? red : bar,
             0.25});
        page().shapes.push_back({Mark::Outline, {x, top, barWidth, height}, grey, 0.15});
        page().shapes.push_back(
            {Mark::Line, {x + barWidth / 2, top - 0.5, 0, height + 1}, black, 0.35});
    }

    void placeCriterion(const report::Figure& figure, const std::vector<double>& widths) {
        const double y = m_y;
        constexpr double side = 2.6;
        addSign(page(), signOf(figure.outcome), {margin, y + 0.5, side, side},
                colourOf(figure.outcome));
        placeBar(figure, margin + signWidth + tableGap + widths[1] + tableGap, y);
        placeRow(criterionCells(figure), widths);
    }

    /// Criteria go on on the second sheet, if they must, but leave room there for what follows.
    void placeCriteria() {
        const std::vector<report::Figure>& judged = m_content.model.judged;
        const std::vector<double> widths = criteriaWidths();
        placeCriteriaHead(widths);
        if (judged.empty()) {
            addParagraph(texts().noCriterion, plain, m_width);
        }
        const double reserved = headingHeight(texts().differences) + chartHeight + 2 * blockGap +
                                patchesHeight(fewestPatches) + endHeight() + warningsReserve();
        for (std::size_t i = 0; i < judged.size(); ++i) {
            const double height = rowHeight(criterionCells(judged[i]), widths);
            const std::string rest = restText(judged, i);
            const double restHeight = heightOf(rest, plain, m_width) + rowGap;
            const bool isLast = i + 1 == judged.size();
            if (m_layout.pages.size() == 1 && height > room()) {
                beginSheet();
                placeCriteriaHead(widths);
            } else if (isLastSheet() &&
                       m_y + height + (isLast ? 0 : restHeight) > bottom() - reserved) {
                m_layout.criteriaCounted = judged.size() - i;
                addParagraph(rest, plain, m_width);
                break;
            }
            placeCriterion(judged[i], widths);
        }
        m_y += blockGap;
    }

    void placeHistogram() {
        need(chartHeight + headingHeight(texts().differences));
        const std::size_t cells = m_content.model.statistics.size();
        addHeading(texts().differences);
        // The figures of all patches, side by side.
        Cells labels;
        Cells values;
        for (const auto& [label, value] : m_content.model.statistics) {
            labels.push_back({label, small});
            values.push_back({value, bold});
        }
        const std::vector<double> widths = widthsOf(std::vector<double>(cells, -1));
        placeRow(labels, widths);
        placeRow(values, widths);
        const double used = rowHeight(labels, widths) + rowHeight(values, widths);
        const Rect area = {margin, m_y, m_width, chartHeight - used};
        addHistogram(page(), m_typesetter, area, m_content.model);
        m_y = area.bottom() + blockGap;
    }

    // ---- The patches that differ most

    std::vector<double> patchWidths() const { return widthsOf({16, -1, 35, 35, 13, 12, 12, 12}); }

    Cells patchCells(std::size_t row) const {
        const std::size_t index = m_content.model.rows[row].patch;
        const report::Patch& patch = m_result.patches[index];
        const Style number = right(lines(plain, 1));
        return {{"", plain},
                {printable(report::labelOf(m_result, index, say())), plain},
                {labText(patch.target), number},
                {labText(patch.measured), number},
                {numberText(patch.difference, 2), right(bold)},
                {signedText(patch.measured.L - patch.target.L), number},
                {signedText(patch.measured.a - patch.target.a), number},
                {signedText(patch.measured.b - patch.target.b), number}};
    }

    Cells patchHead() const {
        const Style number = right(lines(small, 1));
        return {{texts().swatches, lines(small, 2)},
                {texts().patch, small},
                {texts().targetColour, number},
                {texts().measuredColour, number},
                {m_content.model.unit, number},
                {"ΔL*", number},
                {"Δa*", number},
                {"Δb*", number}};
    }

    std::string patchesHeading(std::size_t count) const {
        return filled(texts().worstPatches, {{"worst", std::to_string(count)},
                                             {"all", std::to_string(m_result.patches.size())}});
    }

    double patchRowHeight(std::size_t row) const {
        constexpr double swatchRow = 5.2;
        return std::max(rowHeight(patchCells(row), patchWidths()), swatchRow);
    }

    /// Of the block with so many patches.
    double patchesHeight(std::size_t count) const {
        double height =
            headingHeight(patchesHeading(count)) + rowHeight(patchHead(), patchWidths());
        for (std::size_t i = 0; i < std::min(count, m_content.model.shown); ++i) {
            height += patchRowHeight(i);
        }
        return height + blockGap;
    }

    void placeWorstPatches() {
        const std::size_t all = std::min(mostPatches, m_content.model.shown);
        need(patchesHeight(std::min(all, fewestPatches)) + endHeight() + warningsReserve());
        const double left = room() - (isLastSheet() ? endHeight() + warningsReserve() : 0);
        std::size_t count = all;
        while (count > 0 && patchesHeight(count) > left) {
            --count;
        }
        if (count == 0) {
            return;
        }
        addHeading(patchesHeading(count));
        placeRow(patchHead(), patchWidths());
        for (std::size_t i = 0; i < count; ++i) {
            placePatch(i);
        }
        m_y += blockGap;
    }

    void placePatch(std::size_t row) {
        constexpr double side = 7;
        constexpr double height = 4.4;
        const report::Row& patch = m_content.model.rows[row];
        const double top = m_y;
        page().shapes.push_back({Mark::Fill, {margin, top, side, height}, colourOf(patch.target)});
        page().shapes.push_back(
            {Mark::Fill, {margin + side, top, side, height}, colourOf(patch.measured)});
        page().shapes.push_back({Mark::Outline, {margin, top, 2 * side, height}, grey, 0.12});
        placeRow(patchCells(row), patchWidths());
        m_y = top + patchRowHeight(row);
    }

    // ---- The end

    std::vector<std::string> warnings() const {
        std::vector<std::string> all = m_content.model.doubts;
        all.insert(all.end(), m_content.model.warnings.begin(), m_content.model.warnings.end());
        return all;
    }

    double warningsReserve() const {
        constexpr double ofSome = 22;
        return warnings().empty() ? 0 : ofSome;
    }

    void placeWarnings() {
        const std::vector<std::string> all = warnings();
        if (all.empty()) {
            return;
        }
        const Style style = lines(plain, 3);
        const double first = heightOf(printable(all.front()), style, m_width);
        need(headingHeight(texts().warnings) + first + 3 * blockGap + endHeight());
        addHeading(texts().warnings);
        for (std::size_t i = 0; i < all.size(); ++i) {
            const std::string words = printable(all[i]);
            const std::string rest =
                filled(texts().moreWarnings, {{"count", std::to_string(all.size() - i)}});
            const bool isLast = i + 1 == all.size();
            const double height = heightOf(words, style, m_width) + rowGap +
                                  (isLast ? 0 : heightOf(rest, style, m_width));
            if (height > room() - endHeight()) {
                addParagraph(rest, style, m_width);
                break;
            }
            addParagraph(words, style, m_width);
            m_y += rowGap;
        }
        m_y += blockGap;
    }

    void placeToneCharts() {
        constexpr double height = 38;
        const std::size_t count = m_content.model.tones.size();
        if (count == 0 || headingHeight(texts().tones) + height > room() - endHeight() - blockGap) {
            return;
        }
        addHeading(
            filled(texts().tones, {{"count", std::to_string(std::min(count, mostToneCharts))},
                                   {"all", std::to_string(count)}}));
        const Rect area = {margin, m_y, m_width, height};
        addToneCharts(page(), m_typesetter, area, m_content.model);
        m_y = area.bottom() + blockGap;
    }

    /// As large as there is room left, on the last sheet.
    void placeColourCharts() {
        constexpr double least = 45;
        constexpr double most = 95;
        const double left = room() - endHeight() - headingHeight(texts().colours) - 2 * blockGap -
                            heightOf(m_content.model.drawnText, small, m_width);
        if (left < least) {
            return;
        }
        addHeading(texts().colours);
        if (!m_content.model.drawnText.empty()) {
            addParagraph(printable(m_content.model.drawnText), small, m_width);
        }
        const Rect area = {margin, m_y, m_width, std::min(left, most)};
        addColourCharts(page(), m_typesetter, area, m_content.model, m_result);
        m_y = area.bottom() + blockGap;
    }

    double endHeight() const {
        constexpr double signature = 14;
        return heightOf(texts().viewing, lines(small, 3), m_width) + signature;
    }

    /// At the bottom of the last sheet.
    void placeEnd() {
        constexpr double lineWidth = 70;
        need(endHeight());
        m_y = bottom() - endHeight();
        addParagraph(texts().viewing, lines(small, 3), m_width);
        const double line = bottom() - 4;
        addLine(page(), m_sheet.width - margin - lineWidth, line, lineWidth);
        addText(page(), m_typesetter, {m_sheet.width - margin - lineWidth, line + 0.3}, lineWidth,
                texts().signature, lines(small, 1));
    }

    void placeFeet() {
        constexpr double pageWidth = 30;
        const std::size_t count = m_layout.pages.size();
        const std::string made = filled(texts().madeBy, {{"version", m_content.toolVersion}}) +
                                 " · " + filled(texts().hash, {{"hash", m_content.code.hash}});
        for (std::size_t i = 0; i < count; ++i) {
            Page& sheet = m_layout.pages[i];
            const double y = m_sheet.height - margin - footHeight + 2;
            addLine(sheet, margin, y - 0.8, m_width);
            addText(sheet, m_typesetter, {margin, y}, m_width - pageWidth - columnGap, made,
                    {.points = 6, .lines = 2, .colour = grey});
            addText(sheet, m_typesetter, {m_sheet.width - margin - pageWidth, y}, pageWidth,
                    filled(texts().page,
                           {{"page", std::to_string(i + 1)}, {"pages", std::to_string(count)}}),
                    {.points = 6, .align = Align::Right, .lines = 1, .colour = grey});
        }
    }

    static constexpr double tableGap = 2;

    const Content& m_content;
    const report::Result& m_result;
    const Size m_sheet;
    const Typesetter& m_typesetter;
    const double m_width;
    double m_y = margin;
    CertificateLayout m_layout;
};

} // namespace

CertificateLayout layOutCertificate(const Content& content, const report::Result& result,
                                    const Size& sheet, const Typesetter& typesetter) {
    return Certificate(content, result, sheet, typesetter).layOut();
}

} // namespace label
