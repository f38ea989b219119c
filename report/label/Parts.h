// SPDX-License-Identifier: Apache-2.0
// Parts that labels and certificates have in common.
#pragma once

#include <string>

#include "report/Result.h"
#include "report/label/Page.h"
#include "report/label/Typesetter.h"

namespace label {

struct Point {
    double x = 0;
    double y = 0;
};

/// Adds a text as high as it needs to be, and returns its place. An empty text takes a line, and
/// nothing is added.
Rect addText(Page& page, const Typesetter& typesetter, const Point& at, double width,
             const std::string& words, const Style& style, std::size_t lead = 0);

/// A thin horizontal line.
void addLine(Page& page, double x, double y, double width);

Mark signOf(report::Outcome outcome);
Mark signOf(report::Verdict verdict);

/// A sign with a stroke in proportion to its place.
void addSign(Page& page, Mark sign, const Rect& place, const Colour& colour);

/// Sign and word of a verdict in a box, which differs by more than colour: passed has an outline,
/// failed is filled, incomplete has a dashed outline. The font shrinks until the box is at most
/// `width` wide. Returns the place of the box.
Rect addVerdict(Page& page, const Typesetter& typesetter, report::Verdict verdict, const Point& at,
                double width, double points, const Colour& colour);

} // namespace label
