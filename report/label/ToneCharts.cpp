// SPDX-License-Identifier: Apache-2.0
#include "report/label/ToneCharts.h"

#include <algorithm>
#include <cmath>

#include "report/label/Parts.h"
#include "report/label/Texts.h"

namespace label {
namespace {

constexpr Style axisStyle = {.points = 7, .lines = 1};
constexpr Colour aimColour = {0.55, 0.55, 0.55};
constexpr Colour gridColour = {0.8, 0.8, 0.8};
constexpr double step = 5; ///< Percent that the range is rounded to.

class ToneChart {
  public:
    ToneChart(Page& page, const Typesetter& typesetter, const Rect& area,
              const report::ToneChart& chart)
        : m_page(page), m_typesetter(typesetter), m_chart(chart) {
        const double line = typesetter.measure("0", axisStyle, area.width).height;
        m_plot = {area.x + 7, area.y + 1.5 * line + 0.5, area.width - 9,
                  area.height - 3.5 * line - 1};
        for (const report::TonePoint& point : chart.points) {
            for (const double value : {point.measured, point.aim}) {
                if (std::isfinite(value)) {
                    m_from = std::min(m_from, std::floor(value / step) * step);
                    m_to = std::max(m_to, std::ceil(value / step) * step);
                }
            }
        }
        addLabel({area.x, area.y}, area.width, printable(chart.title), Align::Left);
        for (const double value : {m_from, m_to}) {
            addLine(m_page, m_plot.x, yOf(value), m_plot.width);
            addLabel({area.x, yOf(value) - line / 2}, 6, numberText(value, 0), Align::Right);
        }
        for (const double value : {0.0, 50.0, 100.0}) {
            constexpr double width = 8;
            m_page.shapes.push_back(
                {Mark::Line, {xOf(value), m_plot.y, 0, m_plot.height}, gridColour, 0.15});
            addLabel({std::min(xOf(value) - width / 2, area.right() - width),
                      m_plot.bottom() + line / 2 + 0.2},
                     width, numberText(value, 0), Align::Centre);
        }
    }

    void place() {
        placeLine(&report::TonePoint::aim, aimColour, 0.5);
        placeLine(&report::TonePoint::measured, black, 0.2);
        for (const report::TonePoint& point : m_chart.points) {
            const double side = point.above ? 1.8 : 1;
            if (std::isfinite(point.measured)) {
                const Rect dot = {xOf(point.nominal) - side / 2, yOf(point.measured) - side / 2,
                                  side, side};
                m_page.shapes.push_back(
                    {point.above ? Mark::Hatched : Mark::Fill, dot, black, 0.3});
            }
        }
    }

  private:
    double xOf(double nominal) const { return m_plot.x + m_plot.width * nominal / 100; }
    double yOf(double value) const {
        return m_plot.bottom() - m_plot.height * (value - m_from) / (m_to - m_from);
    }

    void addLabel(const Point& at, double width, const std::string& words, Align align) {
        Style style = axisStyle;
        style.align = align;
        addText(m_page, m_typesetter, at, width, words, style);
    }

    void placeLine(double report::TonePoint::*value, const Colour& colour, double stroke) {
        const report::TonePoint* last = nullptr;
        for (const report::TonePoint& point : m_chart.points) {
            if (!std::isfinite(point.*value)) {
                continue;
            }
            if (last != nullptr) {
                const double x = xOf(last->nominal);
                const double y = yOf(last->*value);
                m_page.shapes.push_back({Mark::Line,
                                         {x, y, xOf(point.nominal) - x, yOf(point.*value) - y},
                                         colour,
                                         stroke});
            }
            last = &point;
        }
    }

    Page& m_page;
    const Typesetter& m_typesetter;
    const report::ToneChart& m_chart;
    double m_from = 0;
    double m_to = step;
    Rect m_plot;
};

} // namespace

void addToneCharts(Page& page, const Typesetter& typesetter, const Rect& area,
                   const report::Model& model) {
    constexpr double between = 3;
    const double width = (area.width - (mostToneCharts - 1) * between) / mostToneCharts;
    for (std::size_t i = 0; i < std::min(mostToneCharts, model.tones.size()); ++i) {
        const double x = area.x + static_cast<double>(i) * (width + between);
        ToneChart(page, typesetter, {x, area.y, width, area.height}, model.tones[i]).place();
    }
}

} // namespace label
