// SPDX-License-Identifier: Apache-2.0
#include "report/label/ColourCharts.h"

#include <algorithm>
#include <cmath>
#include <optional>

#include "report/label/Parts.h"
#include "report/label/Texts.h"

namespace label {
namespace {

constexpr Style axisStyle = {.points = 7, .lines = 1};
constexpr Colour lineColour = {0.45, 0.45, 0.45};
constexpr Colour gridColour = {0.8, 0.8, 0.8};
constexpr double step = 20; ///< Between lines of the grid, in CIELAB.

/// A part of CIELAB in whole steps.
struct Range {
    double from = 0;
    double to = step;

    void include(double value) {
        from = std::min(from, std::floor(value / step) * step);
        to = std::max(to, std::ceil(value / step) * step);
    }
};

using Place = Point; ///< In the plane of a chart.
using Projection = Place (*)(const colour::Lab&);

Place inPlane(const colour::Lab& lab) {
    return {lab.a, lab.b};
}

Place byChroma(const colour::Lab& lab) {
    return {std::hypot(lab.a, lab.b), lab.L};
}

/// Colours that no print has would make a chart of nothing but empty paper.
bool isDrawable(const colour::Lab& lab) {
    constexpr double most = 200;
    return std::abs(lab.L) <= most && std::abs(lab.a) <= most && std::abs(lab.b) <= most;
}

class Chart {
  public:
    Chart(Page& page, const Typesetter& typesetter, const Rect& area, Projection projection)
        : m_page(page), m_typesetter(typesetter), m_area(area), m_projection(projection) {}

    void include(const colour::Lab& lab) {
        const Place place = m_projection(lab);
        m_across.include(place.x);
        m_up.include(place.y);
    }

    /// The same scale in both directions, as large as the area allows.
    void placeGrid(const std::string& across, const std::string& up) {
        constexpr double labelWidth = 9;
        const double line = m_typesetter.measure("0", axisStyle, m_area.width).height;
        const double width = m_area.width - labelWidth - 5;
        const double height = m_area.height - 3.5 * line - 2;
        m_scale = std::min(width / (m_across.to - m_across.from), height / (m_up.to - m_up.from));
        m_left = m_area.x + labelWidth + 1;
        m_bottom = m_area.y + line + 0.5 + m_scale * (m_up.to - m_up.from);
        addLabel({m_left, m_area.y}, m_area.width - labelWidth - 1, up, Align::Left);
        // Numbers at every line of the grid, or at every second or third if these are close.
        constexpr double leastDistance = 7.5;
        const double labelStep = step * std::ceil(leastDistance / (step * m_scale));
        const auto isLabelled = [&](double value) { return std::fmod(value, labelStep) == 0; };
        const double numbers = m_bottom + line / 2 + 0.2; // Below those of the other axis.
        for (double value = m_across.from; value <= m_across.to; value += step) {
            addGridLine({xOf(value), yOf(m_up.to), 0, yOf(m_up.from) - yOf(m_up.to)}, value);
            if (isLabelled(value)) {
                addLabel({xOf(value) - leastDistance / 2, numbers}, leastDistance,
                         numberText(value, 0), Align::Centre);
            }
        }
        for (double value = m_up.from; value <= m_up.to; value += step) {
            addGridLine({m_left, yOf(value), xOf(m_across.to) - m_left, 0}, value);
            if (isLabelled(value)) {
                addLabel({m_area.x, yOf(value) - line / 2}, labelWidth, numberText(value, 0),
                         Align::Right);
            }
        }
        addLabel({m_left, numbers + line}, m_area.width - labelWidth - 1, across, Align::Left);
    }

    void placePatch(const colour::Lab& target, const colour::Lab& measured) {
        constexpr double dot = 0.7;
        const Place from = m_projection(target);
        const Place to = m_projection(measured);
        m_page.shapes.push_back(
            {Mark::Line,
             {xOf(from.x), yOf(from.y), xOf(to.x) - xOf(from.x), yOf(to.y) - yOf(from.y)},
             lineColour,
             0.2});
        m_page.shapes.push_back(
            {Mark::Fill, {xOf(to.x) - dot / 2, yOf(to.y) - dot / 2, dot, dot}, black});
    }

  private:
    double xOf(double value) const { return m_left + m_scale * (value - m_across.from); }
    double yOf(double value) const { return m_bottom - m_scale * (value - m_up.from); }

    void addGridLine(const Rect& place, double value) {
        m_page.shapes.push_back({Mark::Line, place, value == 0 ? black : gridColour, 0.15});
    }

    void addLabel(const Point& at, double width, const std::string& words, Align align) {
        Style style = axisStyle;
        style.align = align;
        addText(m_page, m_typesetter, at, width, words, style);
    }

    Page& m_page;
    const Typesetter& m_typesetter;
    const Rect m_area;
    const Projection m_projection;
    Range m_across;
    Range m_up;
    double m_scale = 1;
    double m_left = 0;
    double m_bottom = 0;
};

} // namespace

void addColourCharts(Page& page, const Typesetter& typesetter, const Rect& area,
                     const report::Model& model, const report::Result& result) {
    constexpr double between = 4;
    const double width = (area.width - between) / 2;
    Chart plane(page, typesetter, {area.x, area.y, width, area.height}, inPlane);
    Chart chroma(page, typesetter, {area.x + width + between, area.y, width, area.height},
                 byChroma);
    std::vector<const report::Patch*> drawn;
    for (const std::size_t row : model.drawn) {
        const report::Patch& patch = result.patches[model.rows[row].patch];
        if (isDrawable(patch.target) && isDrawable(patch.measured)) {
            drawn.push_back(&patch);
        }
    }
    for (Chart* const chart : {&plane, &chroma}) {
        for (const report::Patch* const patch : drawn) {
            chart->include(patch->target);
            chart->include(patch->measured);
        }
    }
    plane.placeGrid("a*", "b*");
    chroma.placeGrid("C*", "L*");
    for (const report::Patch* const patch : drawn) {
        plane.placePatch(patch->target, patch->measured);
        chroma.placePatch(patch->target, patch->measured);
    }
}

} // namespace label
