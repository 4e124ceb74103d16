#include "tools/canvas.h"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <new>
#include <vector>

#include "tools/text.h"

namespace pells_tool {

namespace {

const char fontFamily[] = "DejaVu Sans";
const char ellipsis[] = "\xE2\x80\xA6";
const double halfTurn = 3.14159265358979323846;

/// Longer texts are shortened before they are measured: no line of a sheet holds as much.
const std::size_t longestText = 600;

bool startsCharacter(const std::string& text, std::size_t at) {
    return at >= text.size() || (static_cast<unsigned char>(text[at]) & 0xC0) != 0x80;
}

/// The places between the characters of a valid UTF-8 text, both ends included.
std::vector<std::size_t> characterBounds(const std::string& text) {
    std::vector<std::size_t> bounds;
    for (std::size_t at = 0; at <= text.size(); ++at) {
        if (startsCharacter(text, at))
            bounds.push_back(at);
    }
    return bounds;
}

std::string drawable(const std::string& text, bool keepEnd) {
    if (text.size() <= longestText)
        return printableUtf8(text);
    const std::string piece =
        keepEnd ? text.substr(text.size() - longestText) : text.substr(0, longestText);
    return keepEnd ? ellipsis + printableUtf8(piece) : printableUtf8(piece) + ellipsis;
}

}  // namespace

Canvas::Canvas(int pixelsWide, int pixelsHigh)
    : pixelWidth(pixelsWide),
      pixelHeight(pixelsHigh),
      surface(cairo_image_surface_create(CAIRO_FORMAT_RGB24, pixelsWide, pixelsHigh),
              &cairo_surface_destroy),
      cairo(cairo_create(surface.get()), &cairo_destroy) {
    if (cairo_status(cairo.get()) != CAIRO_STATUS_SUCCESS)
        throw std::bad_alloc();
}

void Canvas::setPaint(Paint paint) {
    cairo_set_source_rgb(cairo.get(), (paint >> 16 & 255) / 255.0, (paint >> 8 & 255) / 255.0,
                         (paint & 255) / 255.0);
}

void Canvas::setStyle(const TextStyle& style) {
    cairo_select_font_face(cairo.get(), fontFamily, CAIRO_FONT_SLANT_NORMAL,
                           style.bold ? CAIRO_FONT_WEIGHT_BOLD : CAIRO_FONT_WEIGHT_NORMAL);
    cairo_set_font_size(cairo.get(), style.size);
    setPaint(style.paint);
}

void Canvas::roundedPath(const Box& box, double radius) {
    const double right = box.x + box.width - radius;
    const double bottom = box.y + box.height - radius;
    cairo_new_sub_path(cairo.get());
    cairo_arc(cairo.get(), right, box.y + radius, radius, -halfTurn / 2, 0);
    cairo_arc(cairo.get(), right, bottom, radius, 0, halfTurn / 2);
    cairo_arc(cairo.get(), box.x + radius, bottom, radius, halfTurn / 2, halfTurn);
    cairo_arc(cairo.get(), box.x + radius, box.y + radius, radius, halfTurn, 3 * halfTurn / 2);
    cairo_close_path(cairo.get());
}

void Canvas::fill(const Box& box, Paint paint, double radius) {
    setPaint(paint);
    roundedPath(box, radius);
    cairo_fill(cairo.get());
}

void Canvas::outline(const Box& box, Paint paint, double radius) {
    setPaint(paint);
    cairo_set_line_width(cairo.get(), 1);
    // Half a pixel in, so that the line covers whole pixels.
    roundedPath({box.x + 0.5, box.y + 0.5, box.width - 1, box.height - 1}, radius);
    cairo_stroke(cairo.get());
}

void Canvas::checkerboard(const Box& box) {
    const double square = 8;
    fill(box, 0xFFFFFF);
    const int rows = static_cast<int>(std::ceil(box.height / square));
    const int columns = static_cast<int>(std::ceil(box.width / square));
    for (int row = 0; row < rows; ++row) {
        for (int column = row % 2; column < columns; column += 2) {
            const double x = column * square;
            const double y = row * square;
            fill({box.x + x, box.y + y, std::min(square, box.width - x),
                  std::min(square, box.height - y)},
                 0xD9DDE3);
        }
    }
}

void Canvas::picture(double x, double y, const Thumbnail& thumbnail) {
    const std::unique_ptr<cairo_surface_t, void (*)(cairo_surface_t*)> source(
        cairo_image_surface_create(CAIRO_FORMAT_ARGB32, thumbnail.width, thumbnail.height),
        &cairo_surface_destroy);
    unsigned char* const bytes = cairo_image_surface_get_data(source.get());
    if (!bytes)
        throw std::bad_alloc();
    const std::size_t stride =
        static_cast<std::size_t>(cairo_image_surface_get_stride(source.get()));
    const std::size_t width = static_cast<std::size_t>(thumbnail.width);
    for (std::size_t line = 0; line < static_cast<std::size_t>(thumbnail.height); ++line)
        std::memcpy(bytes + line * stride, thumbnail.pixels.data() + line * width, width * 4);
    cairo_surface_mark_dirty(source.get());
    cairo_set_source_surface(cairo.get(), source.get(), x, y);
    cairo_paint(cairo.get());
}

void Canvas::text(const std::string& text, double x, double baseline, double room,
                  const TextStyle& style, bool keepEnd) {
    setStyle(style);
    cairo_move_to(cairo.get(), x, baseline);
    cairo_show_text(cairo.get(), cut(drawable(text, keepEnd), room, keepEnd).c_str());
}

int Canvas::paragraph(const std::string& text, const Box& box, double leading, int maximumLines,
                      const TextStyle& style) {
    setStyle(style);
    const std::string whole = drawable(text, false);
    int lines = 0;
    for (std::size_t begin = 0; begin < whole.size() && lines < maximumLines; ++lines) {
        const bool last = lines + 1 == maximumLines;
        const std::size_t end = last ? whole.size() : lineEnd(whole, begin, box.width);
        const std::string line = cut(whole.substr(begin, end - begin), box.width, false);
        cairo_move_to(cairo.get(), box.x, box.y + lines * leading);
        cairo_show_text(cairo.get(), line.c_str());
        begin = std::min(whole.find_first_not_of(' ', end), whole.size());
    }
    return lines;
}

double Canvas::textWidth(const std::string& text, const TextStyle& style) {
    setStyle(style);
    return extent(drawable(text, false));
}

double Canvas::extent(const std::string& text) {
    cairo_text_extents_t extents;
    cairo_text_extents(cairo.get(), text.c_str(), &extents);
    return extents.x_advance;
}

std::string Canvas::cut(const std::string& text, double room, bool keepEnd) {
    if (extent(text) <= room)
        return text;
    const std::vector<std::size_t> bounds = characterBounds(text);
    const auto shortened = [&](std::size_t characters) {
        return keepEnd ? ellipsis + text.substr(bounds[bounds.size() - 1 - characters])
                       : text.substr(0, bounds[characters]) + ellipsis;
    };
    std::size_t fits = 0;
    std::size_t tooMany = bounds.size() - 1;
    while (tooMany - fits > 1) {
        const std::size_t middle = fits + (tooMany - fits) / 2;
        (extent(shortened(middle)) <= room ? fits : tooMany) = middle;
    }
    return shortened(fits);
}

/// Where the line that begins somewhere ends: at a space, or within a word that is too long.
std::size_t Canvas::lineEnd(const std::string& text, std::size_t begin, double room) {
    std::size_t end = begin;
    while (end < text.size()) {
        const std::size_t next = std::min(text.find(' ', end + 1), text.size());
        if (extent(text.substr(begin, next - begin)) > room)
            break;
        end = next;
    }
    if (end != begin)
        return end;
    do {
        end = end + 1;
        while (!startsCharacter(text, end))
            ++end;
    } while (end < text.size() && extent(text.substr(begin, end + 1 - begin)) <= room);
    return end;
}

std::string Canvas::row(int y) const {
    cairo_surface_flush(surface.get());
    const unsigned char* const bytes =
        cairo_image_surface_get_data(surface.get()) +
        static_cast<std::ptrdiff_t>(y) * cairo_image_surface_get_stride(surface.get());
    std::string row;
    for (int x = 0; x < pixelWidth; ++x) {
        std::uint32_t pixel;
        std::memcpy(&pixel, bytes + static_cast<std::ptrdiff_t>(x) * 4, 4);
        row += static_cast<char>(pixel >> 16 & 255);
        row += static_cast<char>(pixel >> 8 & 255);
        row += static_cast<char>(pixel & 255);
    }
    return row;
}

}  // namespace pells_tool
