// SPDX-License-Identifier: Apache-2.0
#include "report/label/Parts.h"

#include <algorithm>

#include "report/label/Texts.h"

namespace label {

Rect addText(Page& page, const Typesetter& typesetter, const Point& at, double width,
             const std::string& words, const Style& style, std::size_t lead) {
    const Rect place = {at.x, at.y, width, typesetter.measure(words, style, width, lead).height};
    if (!words.empty()) {
        page.texts.push_back({place, words, style, lead});
    }
    return place;
}

void addLine(Page& page, double x, double y, double width) {
    constexpr double stroke = 0.2;
    page.shapes.push_back({Mark::Line, {x, y, width, 0}, black, stroke});
}

Mark signOf(report::Outcome outcome) {
    return outcome == report::Outcome::Pass   ? Mark::Tick
           : outcome == report::Outcome::Fail ? Mark::Cross
                                              : Mark::Question;
}

Mark signOf(report::Verdict verdict) {
    return verdict == report::Verdict::Passed   ? Mark::Tick
           : verdict == report::Verdict::Failed ? Mark::Cross
                                                : Mark::Question;
}

void addSign(Page& page, Mark sign, const Rect& place, const Colour& colour) {
    constexpr double strokeOfSide = 0.16;
    page.shapes.push_back({sign, place, colour, strokeOfSide * place.height});
}

Rect addVerdict(Page& page, const Typesetter& typesetter, report::Verdict verdict, const Point& at,
                double width, double points, const Colour& colour) {
    constexpr double smallest = 5;
    constexpr double signOfHeight = 0.62;
    const std::string word = verdictText(verdict);
    Style style = {.points = points, .bold = true};
    double line = 0;
    double wordWidth = 0;
    double padding = 0;
    const auto boxWidth = [&] {
        line = typesetter.measure(word, style, width).height;
        wordWidth = typesetter.widthOf(word, style) + 0.1;
        padding = 0.28 * line;
        return padding + signOfHeight * line + 0.7 * padding + wordWidth + padding;
    };
    double wide = boxWidth();
    while (wide > width && style.points > smallest) {
        style.points -= 0.5;
        wide = boxWidth();
    }
    const Rect box = {at.x, at.y, wide, 1.16 * line};
    const bool isFilled = verdict == report::Verdict::Failed;
    page.shapes.push_back({isFilled                             ? Mark::Fill
                           : verdict == report::Verdict::Passed ? Mark::Outline
                                                                : Mark::Dashed,
                           box, colour, std::clamp(0.09 * line, 0.3, 1.2)});
    const double side = signOfHeight * line;
    style.colour = isFilled ? white : colour;
    addSign(page, signOf(verdict), {box.x + padding, box.y + (box.height - side) / 2, side, side},
            style.colour);
    addText(page, typesetter,
            {box.x + padding + side + 0.7 * padding, box.y + (box.height - line) / 2}, wordWidth,
            word, style);
    return box;
}

} // namespace label
