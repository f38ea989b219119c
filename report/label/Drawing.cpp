// SPDX-License-Identifier: Apache-2.0
#include "report/label/Drawing.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdint>
#include <memory>

#include <cairo-pdf.h>
#include <cairo-svg.h>
#include <zlib.h>

namespace label {
namespace {

// What tells our files apart from others, at a place where every reader of the format ignores it.
constexpr std::string_view pdfMark = "%Tintgate label\n";
constexpr std::string_view svgMark = "<!-- Tintgate label -->\n";
constexpr std::string_view pngMark{"tEXtSource\0Tintgate label", 25};

using Surface = std::unique_ptr<cairo_surface_t, void (*)(cairo_surface_t*)>;
using Context = std::unique_ptr<cairo_t, void (*)(cairo_t*)>;

Surface owned(cairo_surface_t* surface) {
    return {surface, cairo_surface_destroy};
}

Context contextOf(const Surface& surface) {
    return {cairo_create(surface.get()), cairo_destroy};
}

cairo_status_t append(void* text, const unsigned char* data, unsigned int length) {
    static_cast<std::string*>(text)->append(reinterpret_cast<const char*>(data), length);
    return CAIRO_STATUS_SUCCESS;
}

void expect(cairo_status_t status) {
    if (status != CAIRO_STATUS_SUCCESS) {
        throw CannotDraw(cairo_status_to_string(status));
    }
}

double points(double millimetres) {
    return millimetres * pointsPerMillimetre;
}

void pathOf(cairo_t* cairo, const Rect& place) {
    cairo_rectangle(cairo, points(place.x), points(place.y), points(place.width),
                    points(place.height));
}

void lineOf(cairo_t* cairo, double x1, double y1, double x2, double y2) {
    cairo_move_to(cairo, points(x1), points(y1));
    cairo_line_to(cairo, points(x2), points(y2));
}

/// An outline as wide as the place, its stroke inside.
Rect inner(const Rect& place, double stroke) {
    return {place.x + stroke / 2, place.y + stroke / 2, place.width - stroke,
            place.height - stroke};
}

void hatch(cairo_t* cairo, const Rect& place, double stroke) {
    constexpr double step = 1; // millimetres
    cairo_save(cairo);
    pathOf(cairo, place);
    cairo_clip(cairo);
    for (double x = place.x - place.height; x < place.right(); x += step) {
        lineOf(cairo, x, place.bottom(), x + place.height, place.y);
    }
    cairo_set_line_width(cairo, points(stroke));
    cairo_stroke(cairo);
    cairo_restore(cairo);
}

void drawShape(cairo_t* cairo, const Shape& shape) {
    const Rect& place = shape.place;
    cairo_set_source_rgb(cairo, shape.colour.red, shape.colour.green, shape.colour.blue);
    cairo_set_line_width(cairo, points(shape.stroke));
    cairo_set_line_cap(cairo, CAIRO_LINE_CAP_ROUND);
    cairo_set_line_join(cairo, CAIRO_LINE_JOIN_ROUND);
    switch (shape.mark) {
    case Mark::Fill:
        pathOf(cairo, place);
        cairo_fill(cairo);
        return;
    case Mark::Dashed: {
        const std::array<double, 2> dashes = {points(1.2), points(0.8)};
        cairo_set_line_cap(cairo, CAIRO_LINE_CAP_BUTT);
        cairo_set_dash(cairo, dashes.data(), 2, 0);
        pathOf(cairo, inner(place, shape.stroke));
        cairo_stroke(cairo);
        cairo_set_dash(cairo, nullptr, 0, 0);
        return;
    }
    case Mark::Hatched:
        hatch(cairo, place, shape.stroke);
        [[fallthrough]];
    case Mark::Outline:
        cairo_set_line_join(cairo, CAIRO_LINE_JOIN_MITER);
        cairo_set_line_width(cairo, points(shape.stroke));
        pathOf(cairo, inner(place, shape.stroke));
        break;
    case Mark::Line:
        lineOf(cairo, place.x, place.y, place.right(), place.bottom());
        break;
    case Mark::Tick:
        lineOf(cairo, place.x + 0.08 * place.width, place.y + 0.55 * place.height,
               place.x + 0.38 * place.width, place.y + 0.85 * place.height);
        cairo_line_to(cairo, points(place.x + 0.92 * place.width),
                      points(place.y + 0.15 * place.height));
        break;
    case Mark::Cross:
        lineOf(cairo, place.x + 0.12 * place.width, place.y + 0.12 * place.height,
               place.x + 0.88 * place.width, place.y + 0.88 * place.height);
        lineOf(cairo, place.x + 0.12 * place.width, place.y + 0.88 * place.height,
               place.x + 0.88 * place.width, place.y + 0.12 * place.height);
        break;
    case Mark::Question: {
        // A hook over a dot.
        const double middle = place.x + place.width / 2;
        const double radius = 0.26 * place.height;
        cairo_new_sub_path(cairo);
        cairo_arc(cairo, points(middle), points(place.y + 0.08 * place.height + radius),
                  points(radius), M_PI, 0.4 * M_PI);
        cairo_line_to(cairo, points(middle), points(place.y + 0.72 * place.height));
        cairo_stroke(cairo);
        lineOf(cairo, middle, place.y + 0.93 * place.height, middle,
               place.y + 0.93 * place.height + 0.001);
        break;
    }
    }
    cairo_stroke(cairo);
}

/// All modules are one path: separate ones would show seams between their edges.
void drawModules(cairo_t* cairo, const Symbol& symbol, double x, double y, double module) {
    for (std::size_t row = 0; row < symbol.side; ++row) {
        for (std::size_t column = 0; column < symbol.side; ++column) {
            std::size_t run = 0;
            while (column + run < symbol.side && symbol.isDark(row, column + run)) {
                ++run;
            }
            if (run > 0) {
                cairo_rectangle(cairo, x + static_cast<double>(column) * module,
                                y + static_cast<double>(row) * module,
                                static_cast<double>(run) * module, module);
                column += run;
            }
        }
    }
    cairo_set_source_rgb(cairo, 0, 0, 0);
    cairo_fill(cairo);
}

void drawSymbol(cairo_t* cairo, const Page& page) {
    const double module =
        points(page.symbolPlace.width) / static_cast<double>(page.symbol.sideWithQuietZone());
    drawModules(cairo, page.symbol, points(page.symbolPlace.x) + Symbol::quietZone * module,
                points(page.symbolPlace.y) + Symbol::quietZone * module, module);
}

/// In pixels, each module as many whole ones as fit.
void drawSymbolInPixels(cairo_t* cairo, const Page& page, double pixelsPerMillimetre) {
    constexpr double slack = 0.02; // 0.375 mm at 203 dpi are 2.997 pixels: take 3.
    const double side = page.symbolPlace.width * pixelsPerMillimetre;
    const double modules = static_cast<double>(page.symbol.sideWithQuietZone());
    const double module = std::max(1.0, std::floor(side / modules + slack));
    const double indent = (side - module * static_cast<double>(page.symbol.side)) / 2;
    cairo_set_antialias(cairo, CAIRO_ANTIALIAS_NONE);
    drawModules(cairo, page.symbol, std::round(page.symbolPlace.x * pixelsPerMillimetre + indent),
                std::round(page.symbolPlace.y * pixelsPerMillimetre + indent), module);
}

void drawBesidesSymbol(cairo_t* cairo, const Page& page, const Typesetter& typesetter) {
    cairo_set_source_rgb(cairo, 1, 1, 1);
    cairo_paint(cairo);
    for (const Shape& shape : page.shapes) {
        drawShape(cairo, shape);
    }
    for (const Text& text : page.texts) {
        typesetter.show(cairo, text);
    }
}

void drawVector(cairo_t* cairo, const Page& page, const Typesetter& typesetter) {
    drawBesidesSymbol(cairo, page, typesetter);
    if (!page.symbol.empty()) {
        drawSymbol(cairo, page);
    }
}

void finish(const Context& context, const Surface& surface) {
    expect(cairo_status(context.get()));
    cairo_surface_finish(surface.get());
    expect(cairo_surface_status(surface.get()));
}

std::string drawPdf(const std::vector<Page>& pages, const Properties& properties,
                    const Typesetter& typesetter) {
    std::string bytes;
    const Size& first = pages.front().size;
    const Surface surface = owned(cairo_pdf_surface_create_for_stream(
        append, &bytes, points(first.width), points(first.height)));
    const auto state = [&](cairo_pdf_metadata_t what, const std::string& text) {
        cairo_pdf_surface_set_metadata(surface.get(), what, text.c_str());
    };
    state(CAIRO_PDF_METADATA_TITLE, properties.title);
    state(CAIRO_PDF_METADATA_CREATOR, properties.creator);
    // Otherwise cairo states the time of this run, and no two files are equal.
    constexpr const char* unknownTime = "1970-01-01T00:00:00Z";
    state(CAIRO_PDF_METADATA_CREATE_DATE,
          properties.stamp.empty() ? unknownTime : properties.stamp);
    const Context context = contextOf(surface);
    for (const Page& page : pages) {
        cairo_pdf_surface_set_size(surface.get(), points(page.size.width),
                                   points(page.size.height));
        drawVector(context.get(), page, typesetter);
        cairo_show_page(context.get());
    }
    finish(context, surface);
    return bytes.append(pdfMark);
}

std::string drawSvg(const Page& page, const Typesetter& typesetter) {
    std::string bytes;
    const Surface surface = owned(cairo_svg_surface_create_for_stream(
        append, &bytes, points(page.size.width), points(page.size.height)));
    const Context context = contextOf(surface);
    drawVector(context.get(), page, typesetter);
    cairo_show_page(context.get());
    finish(context, surface);
    return bytes.append(svgMark);
}

std::string bigEndian(std::uint32_t value) {
    std::string bytes;
    for (int shift = 24; shift >= 0; shift -= 8) {
        bytes += static_cast<char>(value >> shift & 0xFF);
    }
    return bytes;
}

/// `content` begins with the four letters of the chunk's type.
std::string chunkOf(std::string_view content) {
    const auto check =
        crc32(0, reinterpret_cast<const Bytef*>(content.data()), static_cast<uInt>(content.size()));
    return bigEndian(static_cast<std::uint32_t>(content.size() - 4))
        .append(content)
        .append(bigEndian(static_cast<std::uint32_t>(check)));
}

/// A printer takes the size from the resolution, which cairo does not write. The chunks go after
/// the header, which is always the first.
void addChunks(std::string& png, double dpi) {
    constexpr std::size_t afterHeader = 8 + 25;
    constexpr double inchesPerMetre = 1 / 0.0254;
    const std::string perMetre =
        bigEndian(static_cast<std::uint32_t>(std::lround(dpi * inchesPerMetre)));
    constexpr char metres = 1;
    png.insert(afterHeader, chunkOf("pHYs" + perMetre + perMetre + metres) + chunkOf(pngMark));
}

std::string drawPng(const Page& page, double dpi, const Typesetter& typesetter) {
    const double pixelsPerMillimetre = dpi / 25.4;
    // Recorded in points, then scaled: so texts break their lines as in the other formats.
    const cairo_rectangle_t all = {0, 0, points(page.size.width), points(page.size.height)};
    const Surface recording = owned(cairo_recording_surface_create(CAIRO_CONTENT_COLOR, &all));
    const Context recorder = contextOf(recording);
    drawBesidesSymbol(recorder.get(), page, typesetter);
    expect(cairo_status(recorder.get()));

    const auto pixels = [&](double length) {
        return static_cast<int>(std::lround(length * pixelsPerMillimetre));
    };
    const Surface image = owned(cairo_image_surface_create(
        CAIRO_FORMAT_RGB24, pixels(page.size.width), pixels(page.size.height)));
    const Context context = contextOf(image);
    cairo_set_source_rgb(context.get(), 1, 1, 1);
    cairo_paint(context.get());
    const double scale = pixelsPerMillimetre / pointsPerMillimetre;
    cairo_save(context.get());
    cairo_scale(context.get(), scale, scale);
    cairo_set_source_surface(context.get(), recording.get(), 0, 0);
    cairo_paint(context.get());
    cairo_restore(context.get());
    if (!page.symbol.empty()) {
        drawSymbolInPixels(context.get(), page, pixelsPerMillimetre);
    }
    expect(cairo_status(context.get()));
    std::string bytes;
    expect(cairo_surface_write_to_png_stream(image.get(), append, &bytes));
    addChunks(bytes, dpi);
    return bytes;
}

} // namespace

std::string draw(const std::vector<Page>& pages, const Properties& properties, Format format,
                 double dpi, const Typesetter& typesetter) {
    switch (format) {
    case Format::Pdf:
        return drawPdf(pages, properties, typesetter);
    case Format::Svg:
        return drawSvg(pages.front(), typesetter);
    case Format::Png:
        break;
    }
    return drawPng(pages.front(), dpi, typesetter);
}

bool isOurs(std::string_view bytes) {
    constexpr std::size_t pngStart = 256;
    return (bytes.starts_with("%PDF-") && bytes.ends_with(pdfMark)) ||
           (bytes.starts_with("<?xml") && bytes.ends_with(svgMark)) ||
           (bytes.starts_with("\x89PNG") && bytes.substr(0, pngStart).find(pngMark) != bytes.npos);
}

} // namespace label
