#include "tools/sheet_rows.h"

#include <algorithm>
#include <cmath>
#include <cstdint>

#include "tools/atomic_file.h"

namespace pells_tool {

namespace {

const Paint background = 0xECEFF3;

int sheetWidth(const SheetLayout& layout) {
    return 2 * SheetRows::margin + layout.columns * layout.cellWidth +
           (layout.columns - 1) * layout.gap;
}

unsigned sheetHeight(const std::string& path, const SheetLayout& layout, std::size_t cells,
                     const char* tooMany) {
    const std::size_t columns = static_cast<std::size_t>(layout.columns);
    const std::uint64_t rows = (cells + columns - 1) / columns;
    const std::uint64_t height = static_cast<std::uint64_t>(layout.header + layout.footer) +
                                 rows * static_cast<std::uint64_t>(layout.cellHeight + layout.gap);
    if (height > 0x7FFFFFFF)
        throw pells::FileError(path, std::string(tooMany));
    return static_cast<unsigned>(height);
}

}  // namespace

int sheetColumns(std::size_t cells, double wider, int least, int most) {
    const double wanted = std::ceil(std::sqrt(wider * static_cast<double>(cells)));
    return static_cast<int>(std::min<double>(most, std::max<double>(least, wanted)));
}

std::size_t sheetCapacity(const SheetLayout& layout) {
    const int mostHigh = 16384;
    const int rows = (mostHigh - layout.header - layout.footer) / (layout.cellHeight + layout.gap);
    return static_cast<std::size_t>(rows) * static_cast<std::size_t>(layout.columns);
}

SheetRows::SheetRows(const std::string& path, const SheetLayout& distances, std::size_t cells,
                     const char* tooMany)
    : layout(distances),
      png(path, static_cast<unsigned>(sheetWidth(layout)),
          sheetHeight(path, layout, cells, tooMany)),
      filled(0) {}

SheetRows::~SheetRows() = default;

Canvas SheetRows::strip(int height) const {
    Canvas piece(sheetWidth(layout), height);
    piece.fill({0, 0, static_cast<double>(piece.width()), static_cast<double>(height)}, background);
    return piece;
}

void SheetRows::write(const Canvas& piece) {
    for (int y = 0; y < piece.height(); ++y)
        png.writeRow(reinterpret_cast<const unsigned char*>(piece.row(y).data()));
}

Canvas& SheetRows::openRow() {
    if (!row)
        row.reset(new Canvas(strip(layout.cellHeight + layout.gap)));
    return *row;
}

void SheetRows::closeRow() {
    write(*row);
    row.reset();
    filled = 0;
}

void SheetRows::finish(const Canvas& footer) {
    if (row)
        closeRow();
    write(footer);
    png.finish();
}

}  // namespace pells_tool
