// SPDX-License-Identifier: Apache-2.0
#include "report/label/Typesetter.h"

#include <algorithm>

#include <pango/pangocairo.h>

#include "report/label/Label.h"

namespace label {
namespace {

constexpr const char* family = "Sans";
constexpr double wide = 100'000; ///< Millimetres; no line of a text is wider.

double millimetres(int pangoUnits) {
    return pangoUnits / (PANGO_SCALE * pointsPerMillimetre);
}

int pangoUnits(double millimetres) {
    return static_cast<int>(millimetres * pointsPerMillimetre * PANGO_SCALE);
}

PangoAlignment alignmentOf(Align align) {
    return align == Align::Left     ? PANGO_ALIGN_LEFT
           : align == Align::Centre ? PANGO_ALIGN_CENTER
                                    : PANGO_ALIGN_RIGHT;
}

/// Of what the layout draws and of its lines, whichever goes further.
PangoRectangle extentOf(PangoLayout* layout) {
    PangoRectangle ink;
    PangoRectangle logical;
    pango_layout_get_extents(layout, &ink, &logical);
    PangoRectangle both;
    both.x = std::min(ink.x, logical.x);
    both.y = std::min(ink.y, logical.y);
    both.width = std::max(ink.x + ink.width, logical.x + logical.width) - both.x;
    both.height = std::max(ink.y + ink.height, logical.y + logical.height) - both.y;
    return both;
}

} // namespace

void Unreference::operator()(void* object) const {
    g_object_unref(object);
}

Typesetter::Typesetter() {
    m_context.reset(pango_font_map_create_context(pango_cairo_font_map_get_default()));
    constexpr double unitsPerInch = 72;
    pango_cairo_context_set_resolution(m_context.get(), unitsPerInch);
    pango_context_set_round_glyph_positions(m_context.get(), FALSE);
    cairo_font_options_t* const options = cairo_font_options_create();
    cairo_font_options_set_hint_style(options, CAIRO_HINT_STYLE_NONE);
    cairo_font_options_set_hint_metrics(options, CAIRO_HINT_METRICS_OFF);
    cairo_font_options_set_antialias(options, CAIRO_ANTIALIAS_GRAY);
    pango_cairo_context_set_font_options(m_context.get(), options);
    cairo_font_options_destroy(options);
    // Without any font pango draws boxes.
    if (measure("A", {}, wide).unknown > 0) {
        throw CannotDraw("no font with Latin letters is installed");
    }
}

Referenced<PangoLayout> Typesetter::layoutOf(const std::string& words, const Style& style,
                                             double width, std::size_t lead) const {
    Referenced<PangoLayout> layout(pango_layout_new(m_context.get()));
    PangoFontDescription* const font = pango_font_description_new();
    pango_font_description_set_family_static(font, family);
    pango_font_description_set_size(font, static_cast<int>(style.points * PANGO_SCALE));
    pango_font_description_set_weight(font, style.bold ? PANGO_WEIGHT_BOLD : PANGO_WEIGHT_NORMAL);
    pango_layout_set_font_description(layout.get(), font);
    pango_font_description_free(font);
    if (lead > 0) {
        PangoAttrList* const list = pango_attr_list_new();
        PangoAttribute* const bold = pango_attr_weight_new(PANGO_WEIGHT_BOLD);
        bold->start_index = 0;
        bold->end_index = static_cast<guint>(lead);
        pango_attr_list_insert(list, bold);
        pango_layout_set_attributes(layout.get(), list);
        pango_attr_list_unref(list);
    }
    pango_layout_set_text(layout.get(), words.data(), static_cast<int>(words.size()));
    pango_layout_set_width(layout.get(), pangoUnits(width));
    pango_layout_set_wrap(layout.get(), PANGO_WRAP_WORD_CHAR);
    pango_layout_set_height(layout.get(), -style.lines);
    pango_layout_set_ellipsize(layout.get(), PANGO_ELLIPSIZE_END);
    pango_layout_set_alignment(layout.get(), alignmentOf(style.align));
    return layout;
}

Extent Typesetter::measure(const std::string& words, const Style& style, double width,
                           std::size_t lead) const {
    const Referenced<PangoLayout> layout = layoutOf(words, style, width, lead);
    const PangoRectangle extent = extentOf(layout.get());
    return {millimetres(extent.width), millimetres(extent.height),
            pango_layout_is_ellipsized(layout.get()) != FALSE,
            static_cast<std::size_t>(pango_layout_get_unknown_glyphs_count(layout.get()))};
}

double Typesetter::widthOf(const std::string& words, const Style& style) const {
    return measure(words, {style.points, style.bold, Align::Left, 1, style.colour}, wide).width;
}

void Typesetter::show(cairo_t* cairo, const Text& text) const {
    const Referenced<PangoLayout> layout =
        layoutOf(text.words, text.style, text.place.width, text.lead);
    const double above = std::min(0.0, millimetres(extentOf(layout.get()).y));
    cairo_set_source_rgb(cairo, text.style.colour.red, text.style.colour.green,
                         text.style.colour.blue);
    cairo_move_to(cairo, text.place.x * pointsPerMillimetre,
                  (text.place.y - above) * pointsPerMillimetre);
    pango_cairo_show_layout(cairo, layout.get());
}

} // namespace label
