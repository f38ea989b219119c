// SPDX-License-Identifier: Apache-2.0
#include "report/label/HistogramChart.h"

#include <algorithm>
#include <cmath>
#include <limits>

#include "report/label/Parts.h"
#include "report/label/Texts.h"

namespace label {
namespace {

constexpr Style axisStyle = {.points = 7, .lines = 1};
constexpr Colour barColour = {0.42, 0.42, 0.42};
constexpr Colour gridColour = {0.75, 0.75, 0.75};

/// Decimals that a bin's edge needs: widths are 1, 2 or 5 times a power of ten.
int decimalsOf(double width) {
    return std::clamp(static_cast<int>(std::ceil(-std::log10(width) - 1e-9)), 0, 4);
}

class Histogram {
  public:
    Histogram(Page& page, const Typesetter& typesetter, const Rect& area,
              const report::Model& model)
        : m_page(page), m_typesetter(typesetter), m_area(area), m_model(model) {
        for (const report::Bin& bin : model.histogram) {
            m_most = std::max(m_most, bin.count);
        }
        for (const report::Mark& mark : model.marks) {
            if (mark.limit) {
                m_limit = std::min(m_limit, mark.value);
            }
        }
        const double line = typesetter.measure("0", axisStyle, area.width).height;
        const double labels = line * static_cast<double>(model.marks.size());
        m_plot = {area.x + 10, area.y + labels + 1, area.width - 12,
                  area.height - labels - 2 * line - 3};
        // A limit beyond the largest difference is shown too, if it is not far away.
        m_end = model.histogram.back().to;
        for (const report::Mark& mark : model.marks) {
            if (mark.value <= 2 * model.histogram.back().to) {
                m_end = std::max(m_end, mark.value * 1.02);
            }
        }
        m_line = line;
    }

    void place() {
        placeAxes();
        for (const report::Bin& bin : m_model.histogram) {
            placeBin(bin);
        }
        for (std::size_t i = 0; i < m_model.marks.size(); ++i) {
            placeMark(m_model.marks[i], m_area.y + m_line * static_cast<double>(i));
        }
    }

  private:
    double xOf(double value) const { return m_plot.x + m_plot.width * value / m_end; }
    double heightOf(double count) const {
        return m_most == 0 ? 0 : m_plot.height * count / static_cast<double>(m_most);
    }

    void addLabel(double x, double y, double width, const std::string& words, Align align) {
        Style style = axisStyle;
        style.align = align;
        addText(m_page, m_typesetter, {x, y}, width, words, style);
    }

    /// On white, since the lines of the marks above go through its row.
    void addMarkLabel(double x, double y, double width, const std::string& words, Align align) {
        const double wide = std::min(width, m_typesetter.widthOf(words, axisStyle) + 0.6);
        m_page.shapes.push_back(
            {Mark::Fill, {align == Align::Right ? x + width - wide : x, y, wide, m_line}, white});
        addLabel(x, y, width, words, align);
    }

    void placeAxes() {
        addLine(m_page, m_plot.x, m_plot.bottom(), m_plot.width);
        m_page.shapes.push_back(
            {Mark::Line, {m_plot.x, m_plot.y, m_plot.width, 0}, gridColour, 0.15});
        addLabel(m_area.x, m_plot.y - m_line / 2, 9, std::to_string(m_most), Align::Right);
        addLabel(m_area.x, m_plot.bottom() - m_line, 9, "0", Align::Right);
        const double width = m_model.histogram.front().to - m_model.histogram.front().from;
        constexpr double mostLabels = 12;
        const double step =
            width * std::max(1.0, std::ceil(std::floor(m_end / width) / mostLabels));
        constexpr double labelWidth = 12;
        for (double value = 0; value <= m_end * (1 + 1e-9); value += step) {
            const double x = xOf(value);
            m_page.shapes.push_back({Mark::Line, {x, m_plot.bottom(), 0, 0.8}, black, 0.15});
            const double left =
                std::clamp(x - labelWidth / 2, m_area.x, m_area.right() - labelWidth);
            addLabel(left, m_plot.bottom() + 1, labelWidth, numberText(value, decimalsOf(width)),
                     Align::Centre);
        }
        addLabel(m_plot.x, m_plot.bottom() + 1 + m_line, m_plot.width,
                 filled(texts().differencesAxis, {{"unit", m_model.unit}}), Align::Centre);
    }

    void placeBin(const report::Bin& bin) {
        if (bin.count == 0) {
            return;
        }
        constexpr double between = 0.15;
        constexpr double least = 0.3; // A single patch among many is still seen.
        const double height = std::max(least, heightOf(static_cast<double>(bin.count)));
        const double left = xOf(bin.from);
        const Rect place = {left + between, m_plot.bottom() - height,
                            std::max(between, xOf(bin.to) - left - 2 * between), height};
        const bool isAbove = bin.from >= m_limit;
        m_page.shapes.push_back({isAbove ? Mark::Hatched : Mark::Fill, place, barColour, 0.2});
    }

    /// A line down to the axis, with its label beside its top.
    void placeMark(const report::Mark& mark, double y) {
        if (mark.value > m_end || mark.value < 0) {
            addMarkLabel(m_plot.x, y, m_plot.width, mark.label + " →", Align::Right);
            return;
        }
        const double x = xOf(mark.value);
        m_page.shapes.push_back(
            {Mark::Line, {x, y, 0, m_plot.bottom() - y}, black, mark.limit ? 0.5 : 0.2});
        const bool isLeft = x > m_plot.x + m_plot.width / 2;
        if (isLeft) {
            addMarkLabel(m_plot.x, y, x - m_plot.x - 1, mark.label, Align::Right);
        } else {
            addMarkLabel(x + 1, y, m_plot.right() - x - 1, mark.label, Align::Left);
        }
    }

    Page& m_page;
    const Typesetter& m_typesetter;
    const Rect m_area;
    const report::Model& m_model;
    std::size_t m_most = 0;
    double m_limit = std::numeric_limits<double>::infinity();
    double m_end = 1;
    double m_line = 0;
    Rect m_plot;
};

} // namespace

void addHistogram(Page& page, const Typesetter& typesetter, const Rect& area,
                  const report::Model& model) {
    Histogram(page, typesetter, area, model).place();
}

} // namespace label
