// SPDX-License-Identifier: Apache-2.0
#include "report/label/LabelLayout.h"

#include <algorithm>
#include <cmath>
#include <memory>
#include <optional>

#include "report/label/Parts.h"
#include "report/label/Texts.h"

namespace label {
namespace {

constexpr double gap = 1.5;         ///< Between neighbours, in millimetres.
constexpr double pointStep = 0.5;   ///< Between the font sizes that are tried.
constexpr int linesOfField = 3;     ///< A longer text ends in an ellipsis.
constexpr double wideRatio = 1.3;   ///< Of width to height, from which the code is at the right.
constexpr double leastColumns = 50; ///< Width from which fields and criteria are side by side.
constexpr double smallestModule = 0.338; ///< Three dots at 203 dpi, four at 300 dpi.

/// What gives way if the smallest font is too large: fields one by one, and between them how many
/// criteria are listed at least.
struct Concession {
    std::optional<Field> field;
    std::size_t criteria;
};
constexpr Concession concessions[] = {
    {std::nullopt, 3},   {Field::NotStated, 3},  {Field::Workflow, 3}, {Field::Job, 3},
    {Field::Intent, 3},  {Field::Calibrated, 3}, {Field::Software, 3}, {Field::Colourants, 3},
    {Field::Profile, 3}, {std::nullopt, 2},      {Field::Operator, 2}, {Field::Instrument, 2},
    {Field::Printer, 2}, {Field::Paper, 2},      {std::nullopt, 1},    {Field::Preset, 1},
    {std::nullopt, 0},   {Field::Condition, 0},  {Field::Date, 0}};

/// Where fields and criteria go. With one column, criteria follow the fields.
struct Columns {
    double fields = 0; ///< Widths.
    double criteria = 0;
    bool sideBySide = false;
};

std::vector<Columns> columnsOf(double width) {
    std::vector<Columns> all;
    if (width >= leastColumns) {
        for (const double share : {0.5, 0.44, 0.56}) {
            const double fields = share * (width - gap);
            all.push_back({fields, width - gap - fields, true});
        }
    }
    all.push_back({width, width, false});
    return all;
}

/// One row per criterion: sign, title, value with tolerance and unit. The value goes below a title
/// that does not fit in one line beside it.
class CriteriaColumn {
  public:
    CriteriaColumn(const report::Model& model, double points, double width,
                   const Typesetter& typesetter)
        : m_judged(model.judged), m_unit(model.unit), m_points(points), m_width(width),
          m_typesetter(typesetter) {
        m_line = typesetter.measure("0", titleStyle(), width).height;
        m_headWidth = std::min(width, typesetter.widthOf(texts().criteria, headStyle()) + slack);
        m_statesUnit =
            typesetter.widthOf(headOfValues(), headOfValuesStyle()) <= width - m_headWidth - gap;
        m_titleWidth = m_width - indent();
        m_headHeight = typesetter.measure(texts().criteria, headStyle(), width).height + rowGap();
        double height = m_headHeight;
        m_heights.push_back(height);
        for (const report::Figure& figure : m_judged) {
            m_wrapsValues = m_wrapsValues || valueWidth(figure) == m_titleWidth;
            height += rowHeight(figure) + rowGap();
            m_heights.push_back(height);
        }
    }

    /// Of the first `count` criteria and the line that counts the rest.
    double height(std::size_t count) const {
        return (count == 0 ? 0 : m_heights[count]) + restHeight(count);
    }

    /// Whether a value takes more than a line: the column is too narrow if there is a wider one.
    bool wrapsValues() const { return m_wrapsValues; }

    void place(Page& page, double x, double y, std::size_t count) const {
        if (count == 0) {
            addText(page, m_typesetter, {x, y}, m_width, restLine(count), restStyle());
            return;
        }
        placeHead(page, x, y);
        for (std::size_t i = 0; i < count; ++i) {
            placeRow(page, x, y + m_heights[i], m_judged[i]);
        }
        if (const std::string rest = restLine(count); !rest.empty()) {
            addText(page, m_typesetter, {x, y + m_heights[count]}, m_width, rest, restStyle());
        }
    }

  private:
    void placeHead(Page& page, double x, double y) const {
        addText(page, m_typesetter, {x, y}, m_headWidth, texts().criteria, headStyle());
        if (m_statesUnit) {
            addText(page, m_typesetter, {x + m_headWidth + gap, y}, m_width - m_headWidth - gap,
                    headOfValues(), headOfValuesStyle());
        }
    }

    static constexpr double slack = 0.1; ///< So that rounding never wraps a measured width.

    double indent() const { return m_line * 0.9; } ///< Room of the sign.
    double rowGap() const { return m_line * 0.1; }
    Style titleStyle() const { return {.points = m_points, .lines = 3}; }
    Style valueStyle() const {
        return {.points = m_points, .bold = true, .align = Align::Right, .lines = 3};
    }
    Style headStyle() const { return {.points = m_points, .bold = true}; }
    Style headOfValuesStyle() const {
        return {.points = m_points, .align = Align::Right, .lines = 1};
    }
    Style restStyle() const { return {.points = m_points, .lines = 2}; }

    std::string headOfValues() const { return filled(texts().headOfValues, {{"unit", m_unit}}); }

    /// Without the unit if the head states it.
    std::string valueText(const report::Figure& figure) const {
        return filled(texts().valueOfTolerance,
                      {{"value", figure.value}, {"tolerance", figure.tolerance}}) +
               (m_statesUnit && figure.unit == m_unit ? "" : "\u00a0" + figure.unit);
    }

    double valueWidth(const report::Figure& figure) const {
        return std::min(m_typesetter.widthOf(valueText(figure), valueStyle()) + slack,
                        m_titleWidth);
    }

    std::string restLine(std::size_t count) const {
        return m_judged.empty()           ? texts().noCriterion
               : count == m_judged.size() ? std::string()
                                          : restText(m_judged, count);
    }

    double restHeight(std::size_t count) const {
        const std::string rest = restLine(count);
        return rest.empty() ? 0 : m_typesetter.measure(rest, restStyle(), m_width).height;
    }

    bool isBeside(const report::Figure& figure) const {
        return m_typesetter.widthOf(printable(figure.title), titleStyle()) + gap +
                   valueWidth(figure) <=
               m_titleWidth;
    }

    double rowHeight(const report::Figure& figure) const {
        const double title =
            m_typesetter.measure(printable(figure.title), titleStyle(), m_titleWidth).height;
        const double value =
            m_typesetter.measure(valueText(figure), valueStyle(), valueWidth(figure)).height;
        return isBeside(figure) ? std::max(title, value) : title + value;
    }

    void placeRow(Page& page, double x, double y, const report::Figure& figure) const {
        const double side = m_line * 0.7;
        addSign(page, signOf(figure.outcome), {x, y + 0.15 * m_line, side, side}, black);
        const bool beside = isBeside(figure);
        const double width = valueWidth(figure);
        const Rect title = addText(page, m_typesetter, {x + indent(), y},
                                   m_titleWidth - (beside ? width + gap - slack : 0),
                                   printable(figure.title), titleStyle());
        addText(page, m_typesetter, {x + m_width - width, beside ? y : title.bottom()}, width,
                valueText(figure), valueStyle());
    }

    const std::vector<report::Figure>& m_judged;
    const std::string& m_unit;
    const double m_points;
    const double m_width;
    const Typesetter& m_typesetter;
    double m_line = 0;
    double m_headWidth = 0;
    bool m_wrapsValues = false;
    bool m_statesUnit = false; ///< The head has room for the unit of most values.
    double m_titleWidth = 0;
    double m_headHeight = 0;
    std::vector<double> m_heights; ///< Of the head and the first so many rows.
};

Style fieldStyle(double points) {
    return {.points = points, .lines = linesOfField};
}

/// The fields of a label in one font size and width.
class FieldColumn {
  public:
    FieldColumn(const std::vector<Entry>& entries, double points, double width,
                const Typesetter& typesetter)
        : m_points(points), m_width(width), m_typesetter(typesetter) {
        for (const Entry& entry : entries) {
            const std::string lead = leadOf(entry);
            m_texts.push_back(lead + entry.text);
            m_leads.push_back(lead.size());
            m_heights.push_back(
                typesetter.measure(m_texts.back(), fieldStyle(points), width, lead.size()).height);
        }
    }

    double height(const std::vector<bool>& isKept) const {
        double height = 0;
        for (std::size_t i = 0; i < m_heights.size(); ++i) {
            height += isKept[i] ? m_heights[i] : 0;
        }
        return height;
    }

    void place(Page& page, double x, double y, const std::vector<bool>& isKept) const {
        for (std::size_t i = 0; i < m_texts.size(); ++i) {
            if (isKept[i]) {
                y = addText(page, m_typesetter, {x, y}, m_width, m_texts[i], fieldStyle(m_points),
                            m_leads[i])
                        .bottom();
            }
        }
    }

  private:
    static std::string leadOf(const Entry& entry) {
        return filled(texts().labelled, {{"label", entry.label}});
    }

    const double m_points;
    const double m_width;
    const Typesetter& m_typesetter;
    std::vector<std::string> m_texts;
    std::vector<std::size_t> m_leads;
    std::vector<double> m_heights;
};

/// Fields and criteria in one font size and arrangement.
class Arrangement {
  public:
    Arrangement(const report::Model& model, const std::vector<Entry>& entries, double points,
                const Columns& columns, const Typesetter& typesetter)
        : m_columns(columns), m_fields(entries, points, columns.fields, typesetter),
          m_criteria(model, points, columns.criteria, typesetter), m_judged(model.judged.size()) {}

    /// The largest number of criteria that fit; nothing if not even the line that counts them does.
    std::optional<std::size_t> most(const std::vector<bool>& isKept, double height) const {
        if (m_columns.sideBySide && m_criteria.wrapsValues()) {
            return std::nullopt;
        }
        const double fields = fieldsHeight(isKept);
        const double room = m_columns.sideBySide ? height : height - fields;
        for (std::size_t count = m_judged + 1; fields <= height && count-- > 0;) {
            if (m_criteria.height(count) <= room) {
                return count;
            }
        }
        return std::nullopt;
    }

    void place(Page& page, double x, double y, const std::vector<bool>& isKept,
               std::size_t criteria) const {
        m_fields.place(page, x, y, isKept);
        m_criteria.place(page, m_columns.sideBySide ? x + m_columns.fields + gap : x,
                         m_columns.sideBySide ? y : y + fieldsHeight(isKept), criteria);
    }

  private:
    double fieldsHeight(const std::vector<bool>& isKept) const {
        const double height = m_fields.height(isKept);
        return height > 0 ? height + gap / 2 : 0;
    }

    const Columns m_columns;
    const FieldColumn m_fields;
    const CriteriaColumn m_criteria;
    const std::size_t m_judged;
};

/// What of fields and criteria goes into an area, and how.
struct Choice {
    std::shared_ptr<const Arrangement> arrangement; ///< Null if not even a count has room.
    std::vector<bool> isKept;
    std::size_t criteria = 0;
};

class Chooser {
  public:
    Chooser(const report::Model& model, const std::vector<Entry>& entries, double width,
            double height, const Typesetter& typesetter)
        : m_model(model), m_entries(entries), m_columns(columnsOf(width)), m_height(height),
          m_typesetter(typesetter) {}

    /// In the largest font in which everything fits, or else with what the smallest one has room
    /// for.
    Choice choose() const {
        constexpr int steps = static_cast<int>((largestPoints - smallestPoints) / pointStep);
        Choice choice = withEverything(smallestPoints);
        if (choice.arrangement == nullptr) {
            return concede();
        }
        int fits = 0;
        int tooLarge = steps + 1;
        while (tooLarge - fits > 1) {
            const int middle = (fits + tooLarge) / 2;
            Choice larger = withEverything(smallestPoints + middle * pointStep);
            if (larger.arrangement != nullptr) {
                choice = std::move(larger);
                fits = middle;
            } else {
                tooLarge = middle;
            }
        }
        return choice;
    }

  private:
    std::shared_ptr<const Arrangement> arrange(double points, const Columns& columns) const {
        return std::make_shared<Arrangement>(m_model, m_entries, points, columns, m_typesetter);
    }

    Choice withEverything(double points) const {
        const std::vector<bool> all(m_entries.size(), true);
        for (const Columns& columns : m_columns) {
            auto arrangement = arrange(points, columns);
            if (arrangement->most(all, m_height) == m_model.judged.size()) {
                return {std::move(arrangement), all, m_model.judged.size()};
            }
        }
        return {};
    }

    Choice concede() const {
        std::vector<std::shared_ptr<const Arrangement>> arrangements;
        for (const Columns& columns : m_columns) {
            arrangements.push_back(arrange(smallestPoints, columns));
        }
        std::vector<bool> isKept(m_entries.size(), true);
        for (const Concession& concession : concessions) {
            if (concession.field) {
                drop(isKept, *concession.field);
            }
            Choice best;
            for (const auto& arrangement : arrangements) {
                const auto count = arrangement->most(isKept, m_height);
                if (count && (best.arrangement == nullptr || *count > best.criteria)) {
                    best = {arrangement, isKept, *count};
                }
            }
            if (best.arrangement != nullptr &&
                best.criteria >= std::min(concession.criteria, m_model.judged.size())) {
                return best;
            }
        }
        return {nullptr, isKept, 0};
    }

    void drop(std::vector<bool>& isKept, Field field) const {
        for (std::size_t i = 0; i < m_entries.size(); ++i) {
            if (m_entries[i].field == field) {
                isKept[i] = false;
            }
        }
    }

    const report::Model& m_model;
    const std::vector<Entry>& m_entries;
    const std::vector<Columns> m_columns;
    const double m_height;
    const Typesetter& m_typesetter;
};

/// The code in the largest modules that make it about as wide as wanted, with the better
/// correction if there is room for it.
struct Code {
    Symbol symbol;
    double side = 0;
};

Code codeOf(const CodeText& text, double wanted, double most, double dot) {
    constexpr double slack = 0.02; // Of a dot: rounding must not cost a whole one.
    const double smallest = std::ceil(smallestModule / dot - slack) * dot;
    Code code;
    for (const Correction correction : {Correction::Medium, Correction::Low}) {
        const auto symbol = symbolOf(writeCodeText(text), correction);
        if (!symbol) {
            continue;
        }
        const double modules = static_cast<double>(symbol->sideWithQuietZone());
        const double module = std::max(smallest, std::floor(wanted / modules / dot + slack) * dot);
        code = {*symbol, module * modules};
        if (code.side <= most) {
            return code;
        }
    }
    if (!code.symbol.empty()) {
        code.side = most; // smaller modules: the smallest labels only
    }
    return code;
}

/// The parts of one label, placed from the top.
class Label {
  public:
    Label(const Content& content, const Size& size, double dot, const Typesetter& typesetter)
        : m_content(content), m_typesetter(typesetter), m_dot(dot),
          m_margin(std::clamp(0.04 * std::min(size.width, size.height), 1.2, 4.0)) {
        m_layout.page.size = size;
        m_isWide = size.width >= wideRatio * size.height;
    }

    LabelLayout layOut() {
        placeCode();
        double y = placeHead(m_margin);
        addLine(m_layout.page, m_margin, y + gap / 2, m_contentWidth);
        y += gap;
        std::vector<Entry> entries = m_content.entries;
        std::erase_if(entries, [](const Entry& entry) { return !entry.isKnown; });
        const Choice choice =
            Chooser(m_content.model, entries, m_contentWidth, m_contentBottom - y, m_typesetter)
                .choose();
        if (choice.arrangement != nullptr) {
            choice.arrangement->place(m_layout.page, m_margin, y, choice.isKept, choice.criteria);
        }
        for (std::size_t i = 0; i < entries.size(); ++i) {
            if (!choice.isKept[i]) {
                m_layout.leftOut.push_back(entries[i].label);
            }
        }
        m_layout.criteriaCounted = m_content.model.judged.size() - choice.criteria;
        return std::move(m_layout);
    }

  private:
    /// Also what surrounds the code, and thereby the area of the rest.
    void placeCode() {
        const Size& size = m_layout.page.size;
        const double inside = size.width - 2 * m_margin;
        const double high = size.height - 2 * m_margin;
        const Code code = m_isWide
                              ? codeOf(m_content.code, std::clamp(0.5 * size.height, 20.0, 45.0),
                                       std::min(high, 0.5 * inside), m_dot)
                              : codeOf(m_content.code, std::clamp(0.35 * size.width, 20.0, 45.0),
                                       std::min(inside, 0.4 * high), m_dot);
        Page& page = m_layout.page;
        page.symbol = code.symbol;
        if (m_isWide) {
            page.symbolPlace = {size.width - m_margin - code.side, m_margin, code.side, code.side};
            m_contentWidth = inside - code.side - gap;
            m_contentBottom = size.height - m_margin;
            placeFoot({page.symbolPlace.x, page.symbolPlace.bottom(), code.side,
                       m_contentBottom - page.symbolPlace.bottom()});
            return;
        }
        page.symbolPlace = {m_margin, size.height - m_margin - code.side, code.side, code.side};
        m_contentWidth = inside;
        m_contentBottom = page.symbolPlace.y - gap / 2;
        placeFoot({page.symbolPlace.right() + gap, page.symbolPlace.y, inside - code.side - gap,
                   code.side});
    }

    /// Program, the beginning of the hash and a line to sign on, as far as there is room.
    void placeFoot(const Rect& area) {
        constexpr double leastWidth = 14;
        constexpr double signatureHeight = 8;
        constexpr std::size_t digits = 12;
        if (area.width < leastWidth) {
            return;
        }
        double y = area.y;
        const Style style = {.points = smallestPoints, .lines = 3};
        for (const std::string& words :
             {filled(texts().madeBy, {{"version", m_content.toolVersion}}),
              filled(texts().hash, {{"hash", m_content.code.hash.substr(0, digits) + "…"}})}) {
            const double height = m_typesetter.measure(words, style, area.width).height;
            if (y + height > area.bottom()) {
                return;
            }
            y = addText(m_layout.page, m_typesetter, {area.x, y}, area.width, words, style)
                    .bottom();
        }
        const double height = m_typesetter.measure(texts().signature, style, area.width).height;
        if (y + signatureHeight + height <= area.bottom()) {
            const double line = area.bottom() - height - 0.3;
            addLine(m_layout.page, area.x, line, area.width);
            addText(m_layout.page, m_typesetter, {area.x, line + 0.3}, area.width,
                    texts().signature, style);
        }
    }

    /// Verdict and title; where they end.
    double placeHead(double y) {
        const double points = verdictPoints();
        const Rect box = addVerdict(m_layout.page, m_typesetter, m_content.model.verdict,
                                    {m_margin, y}, m_contentWidth, points, black);
        constexpr double leastTitle = 28;
        Style style = {.points = std::clamp(0.6 * points, 7.0, 18.0), .bold = true, .lines = 2};
        const double beside = m_contentWidth - box.width - gap;
        if (beside >= leastTitle) {
            const double height = m_typesetter.measure(m_content.title, style, beside).height;
            const double top = y + std::max(0.0, (box.height - height) / 2);
            const Rect title = addText(m_layout.page, m_typesetter, {box.right() + gap, top},
                                       beside, m_content.title, style);
            return std::max(box.bottom(), title.bottom());
        }
        return addText(m_layout.page, m_typesetter, {m_margin, box.bottom() + gap / 3},
                       m_contentWidth, m_content.title, style)
            .bottom();
    }

    double verdictPoints() const {
        const Size& size = m_layout.page.size;
        return std::clamp(0.28 * std::min(size.width, size.height), 8.0, 32.0);
    }

    const Content& m_content;
    const Typesetter& m_typesetter;
    const double m_dot;
    const double m_margin;
    bool m_isWide = false;
    double m_contentWidth = 0;
    double m_contentBottom = 0;
    LabelLayout m_layout;
};

} // namespace

LabelLayout layOutLabel(const Content& content, const Size& size, double dot,
                        const Typesetter& typesetter) {
    return Label(content, size, dot, typesetter).layOut();
}

} // namespace label
