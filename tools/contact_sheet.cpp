#include "tools/contact_sheet.h"

#include <cmath>
#include <limits>
#include <utility>

namespace pells_tool {

namespace {

// Distances in pixels.
const int margin = SheetRows::margin;
const int gap = 14;
const int padding = 12;
const int cellWidth = ContactSheet::boxWidth + 2 * padding;
const int cellHeight = ContactSheet::boxHeight + 2 * padding + 112;
const int headerHeight = 64;
const int footerHeight = 48;
const double noteLeading = 13;

const Paint cardPaint = 0xFFFFFF;
const Paint boxPaint = 0xF4F6F8;
const TextStyle titleStyle = {19, 0x1F2933, true};
const TextStyle summaryStyle = {13, 0x52606D, false};
const TextStyle nameStyle = {13, 0x1F2933, true};
const TextStyle sizeStyle = {11, 0x616E7C, false};
const TextStyle loaderStyle = {11, 0x2B6CB0, false};
const TextStyle fileStyle = {11, 0x3E4C59, false};

/// The colours in which a cell says how it fared.
struct MoodPaints {
    Paint border;
    Paint text;
    Paint box;
};

MoodPaints paintsOf(SheetCell::Mood mood) {
    switch (mood) {
        case SheetCell::fallback:
            return {0x4C8DD6, 0x616E7C, boxPaint};
        case SheetCell::doubtful:
            return {0xE0A030, 0x9A6700, boxPaint};
        case SheetCell::bad:
            return {0xD64545, 0xA61B1B, 0xFDECEC};
        default:
            return {0xD5DAE0, 0x616E7C, boxPaint};
    }
}

/// Wider than high, as screens are.
SheetLayout layoutFor(std::size_t cells) {
    return {
        sheetColumns(cells, 1.8, 2, 10), cellWidth, cellHeight, gap, headerHeight, footerHeight};
}

void drawPicture(Canvas& canvas, const Box& box, const Thumbnail& picture) {
    const double x = box.x + std::floor((box.width - picture.width) / 2);
    const double y = box.y + std::floor((box.height - picture.height) / 2);
    canvas.checkerboard(
        {x, y, static_cast<double>(picture.width), static_cast<double>(picture.height)});
    canvas.picture(x, y, picture);
}

/// Writes notes below one another until the box is full.
void drawNotes(Canvas& canvas, const Box& box, const std::vector<std::string>& notes,
               const TextStyle& style) {
    int free = static_cast<int>(box.height / noteLeading);
    double baseline = box.y + style.size;
    for (const std::string& note : notes) {
        if (free <= 0)
            return;
        const int lines =
            canvas.paragraph(note, {box.x, baseline, box.width, 0}, noteLeading, free, style);
        free -= lines;
        baseline += lines * noteLeading;
    }
}

/// Writes what is to be known of a picture below its box. \return the last baseline.
double drawCaption(Canvas& canvas, const Box& box, const SheetCell& cell) {
    double baseline = box.y + box.height + 19;
    const double room = box.width - canvas.textWidth(cell.size, sizeStyle) - 8;
    canvas.text(cell.name, box.x, baseline, room, nameStyle);
    canvas.text(cell.size, box.x + room + 8, baseline, box.width, sizeStyle);
    canvas.text(cell.loader, box.x, baseline += 17, box.width, loaderStyle);
    canvas.text(cell.file, box.x, baseline += 15, box.width, fileStyle, true);
    for (const std::string& line : cell.origin)
        canvas.text(line, box.x, baseline += 15, box.width, sizeStyle, true);
    return baseline;
}

void drawCell(Canvas& canvas, double left, const SheetCell& cell) {
    const MoodPaints paints = paintsOf(cell.mood);
    const TextStyle noteStyle = {10, paints.text, false};
    const Box card = {left, 0, cellWidth, cellHeight};
    const Box box = {left + padding, padding, ContactSheet::boxWidth, ContactSheet::boxHeight};
    canvas.fill(card, cardPaint, 8);
    canvas.outline(card, paints.border, 8);
    canvas.fill(box, paints.box, 4);
    const double notesTop = drawCaption(canvas, box, cell) + 6;
    if (cell.picture.pixels.empty()) {
        drawNotes(canvas, {box.x + 8, box.y + 8, box.width - 16, box.height - 12}, cell.notes,
                  noteStyle);
    } else {
        drawPicture(canvas, box, cell.picture);
        drawNotes(canvas, {box.x, notesTop, box.width, cellHeight - 6 - notesTop}, cell.notes,
                  noteStyle);
    }
}

/// Says what the colours of the cells mean, from right to left.
void drawLegend(Canvas& canvas, double right, double baseline) {
    const std::pair<SheetCell::Mood, const char*> entries[] = {
        {SheetCell::bad, "not found"},
        {SheetCell::doubtful, "read, but doubtful"},
        {SheetCell::fallback, "by a fallback"},
    };
    for (const auto& entry : entries) {
        right -= canvas.textWidth(entry.second, summaryStyle);
        canvas.text(entry.second, right, baseline, 1000, summaryStyle);
        canvas.fill({right - 18, baseline - 10, 11, 11}, paintsOf(entry.first).border, 3);
        right -= 42;
    }
}

}  // namespace

std::size_t ContactSheet::mostCells() {
    return sheetCapacity(layoutFor(std::numeric_limits<int>::max()));
}

ContactSheet::ContactSheet(const std::string& path, const std::string& title, std::size_t cells)
    : layout(layoutFor(cells)), rows(path, layout, cells, "Too many pictures for one sheet") {
    Canvas header = rows.strip(layout.header);
    header.text(title, margin, 40, header.width() - 2 * margin, titleStyle);
    rows.write(header);
}

void ContactSheet::add(const SheetCell& cell) {
    rows.add([&cell](Canvas& canvas, double left) { drawCell(canvas, left, cell); });
}

void ContactSheet::finish(const std::string& summary) {
    Canvas footer = rows.strip(layout.footer);
    footer.text(summary, margin, 20, footer.width() - 2 * margin, summaryStyle);
    if (layout.columns > 2)
        drawLegend(footer, footer.width() - margin, 20);
    rows.finish(footer);
}

}  // namespace pells_tool
