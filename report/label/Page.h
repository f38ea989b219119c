// SPDX-License-Identifier: Apache-2.0
// A page as data: what is drawn where. Layouts make pages, and Drawing turns them into files, so
// that a test can check every place without a picture. All lengths are millimetres from the top
// left corner, except for font sizes, which are points.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "report/label/Symbol.h"

namespace label {

struct Size {
    double width = 0;
    double height = 0;
};

struct Rect {
    double x = 0;
    double y = 0;
    double width = 0;
    double height = 0;

    double right() const { return x + width; }
    double bottom() const { return y + height; }
};

/// sRGB, 0 to 1.
struct Colour {
    double red = 0;
    double green = 0;
    double blue = 0;
};

inline constexpr Colour black = {0, 0, 0};
inline constexpr Colour white = {1, 1, 1};

enum class Align { Left, Centre, Right };

struct Style {
    double points = 8;
    bool bold = false;
    Align align = Align::Left;
    int lines = 1; ///< At most; what does not fit ends in an ellipsis.
    Colour colour = black;
};

struct Text {
    Rect place; ///< As high as the text needs.
    std::string words;
    Style style;
    std::size_t lead = 0; ///< Bytes at the start of `words` that are bold in any case.
};

enum class Mark {
    Fill,
    Outline,
    Dashed,   ///< A dashed outline.
    Hatched,  ///< An outline with diagonal lines in it.
    Line,     ///< From the top left to the bottom right corner of its place.
    Tick,     ///< The sign of "passed".
    Cross,    ///< The sign of "failed".
    Question, ///< The sign of what has no answer.
};

struct Shape {
    Mark mark = Mark::Fill;
    Rect place;
    Colour colour = black;
    double stroke = 0.2; ///< Width of lines.
};

/// Drawn in the order of the members.
struct Page {
    Size size;
    std::vector<Shape> shapes;
    Rect symbolPlace; ///< With the quiet zone of four modules.
    Symbol symbol;    ///< Empty if the page has none.
    std::vector<Text> texts;
};

} // namespace label
