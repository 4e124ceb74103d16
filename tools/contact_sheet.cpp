#include "tools/contact_sheet.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <utility>

#include "tools/atomic_file.h"
#include "tools/canvas.h"

namespace pells_tool {

namespace {

// Distances in pixels.
const int margin = 24;
const int gap = 14;
const int padding = 12;
const int cellWidth = ContactSheet::boxWidth + 2 * padding;
const int cellHeight = ContactSheet::boxHeight + 2 * padding + 112;
const int headerHeight = 64;
const int footerHeight = 48;
const double noteLeading = 13;

const Paint background = 0xECEFF3;
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
int columnsFor(std::size_t cells) {
    const double wanted = std::ceil(std::sqrt(1.8 * static_cast<double>(cells)));
    return static_cast<int>(std::min(10.0, std::max(2.0, wanted)));
}

int sheetWidth(int columns) {
    return 2 * margin + columns * cellWidth + (columns - 1) * gap;
}

/// \throws pells::FileError for more than the PNG format can hold.
unsigned sheetHeight(const std::string& path, std::size_t cells, int columns) {
    const std::uint64_t rows =
        (cells + static_cast<std::size_t>(columns) - 1) / static_cast<std::size_t>(columns);
    const std::uint64_t height =
        headerHeight + footerHeight + rows * static_cast<std::uint64_t>(cellHeight + gap);
    if (height > 0x7FFFFFFF)
        throw pells::FileError(path, "Too many pictures for one sheet");
    return static_cast<unsigned>(height);
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

void drawCell(Canvas& canvas, double left, double top, const SheetCell& cell) {
    const MoodPaints paints = paintsOf(cell.mood);
    const TextStyle noteStyle = {10, paints.text, false};
    const Box card = {left, top, cellWidth, cellHeight};
    const Box box = {left + padding, top + padding, ContactSheet::boxWidth,
                     ContactSheet::boxHeight};
    canvas.fill(card, cardPaint, 8);
    canvas.outline(card, paints.border, 8);
    canvas.fill(box, paints.box, 4);
    const double notesTop = drawCaption(canvas, box, cell) + 6;
    if (cell.picture.pixels.empty()) {
        drawNotes(canvas, {box.x + 8, box.y + 8, box.width - 16, box.height - 12}, cell.notes,
                  noteStyle);
    } else {
        drawPicture(canvas, box, cell.picture);
        drawNotes(canvas, {box.x, notesTop, box.width, top + cellHeight - 6 - notesTop}, cell.notes,
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

/// A full-width piece of the sheet.
class ContactSheet::Strip : public Canvas {
public:
    Strip(int columns, int height) : Canvas(sheetWidth(columns), height) {
        fill({0, 0, static_cast<double>(width()), static_cast<double>(height)}, background);
    }
};

ContactSheet::ContactSheet(const std::string& path, const std::string& title, std::size_t cells)
    : columns(columnsFor(cells)),
      png(path, static_cast<unsigned>(sheetWidth(columns)), sheetHeight(path, cells, columns)),
      filled(0) {
    Strip header(columns, headerHeight);
    header.text(title, margin, 40, header.width() - 2 * margin, titleStyle);
    writeStrip(header);
}

ContactSheet::~ContactSheet() = default;

void ContactSheet::add(const SheetCell& cell) {
    if (!row)
        row.reset(new Strip(columns, cellHeight + gap));
    drawCell(*row, margin + filled * (cellWidth + gap), 0, cell);
    if (++filled == columns) {
        writeStrip(*row);
        row.reset();
        filled = 0;
    }
}

void ContactSheet::finish(const std::string& summary) {
    if (row)
        writeStrip(*row);
    Strip footer(columns, footerHeight);
    footer.text(summary, margin, 20, footer.width() - 2 * margin, summaryStyle);
    if (columns > 2)
        drawLegend(footer, footer.width() - margin, 20);
    writeStrip(footer);
    png.finish();
}

void ContactSheet::writeStrip(const Strip& strip) {
    for (int y = 0; y < strip.height(); ++y)
        png.writeRow(reinterpret_cast<const unsigned char*>(strip.row(y).data()));
}

}  // namespace pells_tool
