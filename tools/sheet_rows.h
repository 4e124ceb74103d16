#pragma once

#include <cstddef>
#include <memory>
#include <string>

#include "tools/canvas.h"
#include "tools/png_file.h"

namespace pells_tool {

/// Distances in pixels. The header lies above the rows of cells, the footer below.
struct SheetLayout {
    int columns;
    int cellWidth;
    int cellHeight;
    int gap;
    int header;
    int footer;
};

/// As many columns as make a sheet of cells about so many times wider than high, within bounds.
int sheetColumns(std::size_t cells, double wider, int least, int most);

/// How many cells of a layout a picture of at most 16,384 pixels height has.
std::size_t sheetCapacity(const SheetLayout& layout);

/// A PNG picture of cells in rows and columns, written row after row: memory does not depend on the
/// number of cells.
class SheetRows {
public:
    /// The distance between the cells and the edges, in pixels.
    static constexpr int margin = 24;

    /// \param cells   the number of cells that will be added.
    /// \param tooMany what to say of more than the PNG format can hold.
    /// \throws pells::FileError here and below when the file cannot be written.
    SheetRows(const std::string& path, const SheetLayout& distances, std::size_t cells,
              const char* tooMany);
    ~SheetRows();

    /// An empty piece of the full width.
    Canvas strip(int height) const;

    /// Writes a piece below what is there.
    void write(const Canvas& piece);

    /// Adds the next cell; `draw` is called with the canvas and the cell's left edge. The file is
    /// written up to the last full row.
    template <class Draw>
    void add(Draw draw) {
        draw(openRow(), margin + filled * (layout.cellWidth + layout.gap));
        if (++filled == layout.columns)
            closeRow();
    }

    /// Ends the sheet with a footer and gives the file its name.
    void finish(const Canvas& footer);

private:
    Canvas& openRow();
    void closeRow();

    SheetLayout layout;
    PngFile png;
    std::unique_ptr<Canvas> row;
    int filled;
};

}  // namespace pells_tool
