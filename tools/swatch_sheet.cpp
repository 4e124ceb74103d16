#include "tools/swatch_sheet.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <limits>
#include <vector>

namespace pells_tool {

namespace {

// Distances in pixels.
const int sheetMargin = SheetRows::margin;
const int cardGap = 18;
const int cardPadding = 12;
const int sphereBoxWidth = 236;
const int sphereBoxHeight = 220;
const int cardWidth = sphereBoxWidth + 2 * cardPadding;
const int cardHeight = sphereBoxHeight + 2 * cardPadding + 192;
const int chipWidth = 30;
const int chipHeight = 14;
const double columnWidth = 37;

const Paint swatchPaint = 0xFFFFFF;
const Paint cardBorder = 0xD5DAE0;
const Paint sphereBoxPaint = 0x39424E;
const Paint badgePaint = 0x2B6CB0;
const TextStyle materialStyle = {14, 0x1F2933, true};
const TextStyle originStyle = {11, 0x7B8794, false};
const TextStyle headingStyle = {10, 0x9AA5B1, false};
const TextStyle labelStyle = {11, 0x52606D, false};
const TextStyle valueStyle = {11, 0x1F2933, false};
const TextStyle badgeStyle = {17, 0xFFFFFF, true};

/// Few in one row, more in a sheet that is a little wider than high.
SheetLayout swatchLayout(std::size_t cards) {
    const int columns = cards <= 4 ? static_cast<int>(cards) : sheetColumns(cards, 1.3, 3, 6);
    return {columns, cardWidth, cardHeight, cardGap, sheetMargin, sheetMargin - cardGap};
}

std::string number(float value) {
    char text[32];
    std::snprintf(text, sizeof text, "%.6g", static_cast<double>(value));
    return text;
}

/// A channel to three digits after the point.
std::string channelText(float value) {
    if (!(std::abs(value) < 1000))
        return number(value);
    const std::string text = number(std::round(value * 1000) / 1000);
    return text == "-0" ? "0" : text;
}

double fraction(float channel) {
    return channel > 0 ? std::min(static_cast<double>(channel), 1.0) : 0.0;
}

/// A plain piece of a colour, its channels cut to what can be shown.
Thumbnail chipOf(const pells::Color& color) {
    const double alpha = fraction(color.a);
    const auto byte = [](double value) {
        return static_cast<std::uint32_t>(std::lround(value * 255));
    };
    const std::uint32_t pixel = byte(alpha) << 24 | byte(fraction(color.r) * alpha) << 16 |
                                byte(fraction(color.g) * alpha) << 8 |
                                byte(fraction(color.b) * alpha);
    return {chipWidth, chipHeight,
            std::vector<std::uint32_t>(std::size_t{chipWidth} * chipHeight, pixel)};
}

void drawRight(Canvas& canvas, const std::string& text, double right, double baseline,
               const TextStyle& style) {
    canvas.text(text, right - canvas.textWidth(text, style), baseline, sphereBoxWidth, style);
}

void drawColor(Canvas& canvas, const Box& line, const char* label, const pells::Color& color) {
    const double top = line.y - chipHeight + 3;
    canvas.checkerboard({line.x, top, chipWidth, chipHeight});
    canvas.picture(line.x, top, chipOf(color));
    canvas.outline({line.x - 1, top - 1, chipWidth + 2, chipHeight + 2}, cardBorder, 2);
    canvas.text(label, line.x + chipWidth + 8, line.y, 70, labelStyle);
    double right = line.x + line.width;
    for (const float channel : {color.a, color.b, color.g, color.r}) {
        const std::string text = channelText(channel);
        const bool fits = canvas.textWidth(text, valueStyle) < columnWidth;
        drawRight(canvas, fits ? text : "large", right, line.y, valueStyle);
        right -= columnWidth;
    }
}

void drawHeadings(Canvas& canvas, const Box& line) {
    double right = line.x + line.width;
    for (const char* heading : {"alpha", "blue", "green", "red"}) {
        drawRight(canvas, heading, right, line.y, headingStyle);
        right -= columnWidth;
    }
}

std::string textureText(const pells::Material& material) {
    return "Scale " + number(material.textureScale()) + ", angle " +
           number(material.textureAngle()) + "\xC2\xB0";
}

void drawValues(Canvas& canvas, const Box& box, const pells::Material& material) {
    Box line = {box.x, box.y, box.width, 0};
    drawHeadings(canvas, line);
    line.y += 17;
    drawColor(canvas, line, "Ambient", material.ambient());
    line.y += 19;
    drawColor(canvas, line, "Diffuse", material.diffuse());
    line.y += 19;
    drawColor(canvas, line, "Specular", material.specular());
    line.y += 19;
    drawColor(canvas, line, "Emissive", material.emissive());
    line.y += 21;
    canvas.text("Shininess " + number(material.shininess()), line.x, line.y, line.width,
                valueStyle);
    if (material.ambientAndDiffuse())
        drawRight(canvas, "ambient is diffuse", line.x + line.width, line.y, labelStyle);
    line.y += 17;
    if (!material.hasTexture()) {
        canvas.text("No texture", line.x, line.y, line.width, originStyle);
        return;
    }
    canvas.text(material.textureName(), line.x, line.y, line.width, valueStyle, true);
    canvas.text(textureText(material), line.x, line.y + 16, line.width, labelStyle);
}

/// Whether nothing shows through the large square inside the outline.
bool isOpaque(const Thumbnail& sphere) {
    for (int y = sphere.height / 6; y < sphere.height * 5 / 6; ++y) {
        const auto row = sphere.pixels.begin() + std::ptrdiff_t{y} * sphere.width;
        const auto opaque = [](std::uint32_t pixel) { return pixel >> 24 == 255; };
        if (!std::all_of(row + sphere.width / 6, row + sphere.width * 5 / 6, opaque))
            return false;
    }
    return true;
}

void drawSphere(Canvas& canvas, const Box& box, const Thumbnail& sphere) {
    if (isOpaque(sphere))
        canvas.fill(box, sphereBoxPaint, 4);
    else
        canvas.checkerboard(box);
    canvas.picture(box.x + std::floor((box.width - sphere.width) / 2),
                   box.y + std::floor((box.height - sphere.height) / 2), sphere);
}

/// The operation between this card and the one to its left.
void drawBadge(Canvas& canvas, double x, double y, const std::string& operation) {
    const double radius = 13;
    canvas.fill({x - radius, y - radius, 2 * radius, 2 * radius}, badgePaint, radius);
    canvas.text(operation, x - canvas.textWidth(operation, badgeStyle) / 2, y + 6, 100, badgeStyle);
}

void drawCard(Canvas& canvas, double left, const SwatchCard& card) {
    const Box frame = {left, 0, cardWidth, cardHeight};
    const Box box = {left + cardPadding, cardPadding, sphereBoxWidth, sphereBoxHeight};
    canvas.fill(frame, swatchPaint, 8);
    canvas.outline(frame, cardBorder, 8);
    drawSphere(canvas, box, card.sphere);
    const double below = box.y + box.height;
    canvas.text(card.name, box.x, below + 22, box.width, materialStyle);
    canvas.text(card.origin, box.x, below + 38, box.width, originStyle, true);
    drawValues(canvas, {box.x, below + 60, box.width, 0}, card.material);
    if (!card.operation.empty())
        drawBadge(canvas, left - cardGap / 2.0, box.y + box.height / 2, card.operation);
}

}  // namespace

std::size_t SwatchSheet::mostCards() {
    return sheetCapacity(swatchLayout(std::numeric_limits<int>::max()));
}

SwatchSheet::SwatchSheet(const std::string& path, std::size_t cards)
    : rows(path, swatchLayout(cards), cards, "Too many materials for one picture") {
    rows.write(rows.strip(sheetMargin));
}

void SwatchSheet::add(const SwatchCard& card) {
    rows.add([&card](Canvas& canvas, double left) { drawCard(canvas, left, card); });
}

void SwatchSheet::finish() {
    rows.finish(rows.strip(sheetMargin - cardGap));
}

}  // namespace pells_tool
