#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "tools/sheet_rows.h"
#include "tools/thumbnail.h"

namespace pells_tool {

/// What the sheet shows of one picture. The texts may hold any bytes.
struct SheetCell {
    /// How it fared: from its first loader, from a later one, read in a doubtful way, not at all.
    enum Mood { good, fallback, doubtful, bad };

    std::string name;
    Thumbnail picture;                ///< empty: the notes fill its place
    std::string size;                 ///< such as "128 x 128 RGB"
    std::string loader;               ///< the class that served
    std::string file;                 ///< and where from
    std::vector<std::string> origin;  ///< and what holds that file, one text a line
    std::vector<std::string> notes;   ///< what is to be said about it
    Mood mood = good;
};

/// Draws pictures in rows and columns on one PNG picture, row after row: memory does not depend on
/// the number of pictures.
///
/// The texts are in DejaVu Sans, or in whatever stands in for it.
class ContactSheet {
public:
    /// \param cells the number of cells that will be added.
    /// \throws pells::FileError here and below when the file cannot be written.
    ContactSheet(const std::string& path, const std::string& title, std::size_t cells);

    /// Adds the next cell. The file is written up to the last full row.
    void add(const SheetCell& cell);

    /// Ends the sheet with a line of text and gives the file its name.
    void finish(const std::string& summary);

    /// How many cells a sheet should have at the most: one that is higher than 16,384 pixels is
    /// more than many programs show.
    static std::size_t mostCells();

    /// The size of the place for a picture.
    static constexpr int boxWidth = 200;
    static constexpr int boxHeight = 156;

private:
    SheetLayout layout;
    SheetRows rows;
};

}  // namespace pells_tool
