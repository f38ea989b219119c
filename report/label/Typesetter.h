// SPDX-License-Identifier: Apache-2.0
// Texts on a page: how much room they take, and putting them there. Fonts are "Sans" of the
// machine; characters that it lacks come from any other installed font.
#pragma once

#include <cstddef>
#include <memory>
#include <string>

#include <cairo.h>
#include <pango/pango.h>

#include "report/label/Page.h"

namespace label {

inline constexpr double pointsPerMillimetre = 72 / 25.4;

/// Lets unique_ptr release objects of GLib.
struct Unreference {
    void operator()(void* object) const;
};
template<class Object>
using Referenced = std::unique_ptr<Object, Unreference>;

/// What a text takes, in millimetres.
struct Extent {
    double width = 0;         ///< Of its widest line.
    double height = 0;        ///< Of all lines, with whatever of a glyph goes beyond a line.
    bool isShortened = false; ///< It ends in an ellipsis.
    std::size_t unknown = 0;  ///< Characters that no font has.
};

/// For one thread. Texts are measured without regard to the resolution of an output, so that a
/// layout is the same in every format.
class Typesetter {
  public:
    /// Throws CannotDraw if no font with Latin letters is installed.
    Typesetter();

    /// In lines of this width at most.
    Extent measure(const std::string& words, const Style& style, double width,
                   std::size_t lead = 0) const;

    /// Width of the text in one line of any length.
    double widthOf(const std::string& words, const Style& style) const;

    /// The scale of `cairo` must be points.
    void show(cairo_t* cairo, const Text& text) const;

  private:
    Referenced<PangoLayout> layoutOf(const std::string& words, const Style& style, double width,
                                     std::size_t lead) const;

    Referenced<PangoContext> m_context;
};

} // namespace label
