#pragma once

#include <cairo.h>

#include <cstdint>
#include <memory>
#include <string>

#include "tools/thumbnail.h"

namespace pells_tool {

/// An opaque colour, 0xRRGGBB.
typedef std::uint32_t Paint;

/// How a line of text looks.
struct TextStyle {
    double size;
    Paint paint;
    bool bold;
};

/// A rectangle in pixels.
struct Box {
    double x, y, width, height;
};

/// A drawing of rectangles, texts and pictures. \throws std::bad_alloc where cairo has no memory.
class Canvas {
public:
    Canvas(int pixelsWide, int pixelsHigh);

    void fill(const Box& box, Paint paint, double radius = 0);
    void outline(const Box& box, Paint paint, double radius);

    /// Light and dark squares, as behind a picture with alpha.
    void checkerboard(const Box& box);
    void picture(double x, double y, const Thumbnail& thumbnail);

    /// Writes one line, cut with an ellipsis where it is wider than the room.
    ///
    /// \param baseline the line that the letters stand on.
    /// \param keepEnd  cuts in front, as fits paths.
    void text(const std::string& text, double x, double baseline, double room,
              const TextStyle& style, bool keepEnd = false);

    /// Writes lines broken between words, each `leading` below the one before; the last one of
    /// `maximumLines` is cut. \return the number of lines.
    int paragraph(const std::string& text, const Box& box, double leading, int maximumLines,
                  const TextStyle& style);

    double textWidth(const std::string& text, const TextStyle& style);

    int width() const { return pixelWidth; }
    int height() const { return pixelHeight; }

    /// One row of pixels, 3 bytes each: red, green, blue.
    std::string row(int y) const;

private:
    void setStyle(const TextStyle& style);
    void setPaint(Paint paint);
    void roundedPath(const Box& box, double radius);
    double extent(const std::string& text);
    std::string cut(const std::string& text, double room, bool keepEnd);
    std::size_t lineEnd(const std::string& text, std::size_t begin, double room);

    int pixelWidth;
    int pixelHeight;
    std::unique_ptr<cairo_surface_t, void (*)(cairo_surface_t*)> surface;
    std::unique_ptr<cairo_t, void (*)(cairo_t*)> cairo;
};

}  // namespace pells_tool
