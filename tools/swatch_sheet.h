#pragma once

#include <cstddef>
#include <string>

#include "pells/material/material.h"
#include "tools/sheet_rows.h"
#include "tools/thumbnail.h"

namespace pells_tool {

/// What a card shows of one material. The texts may hold any bytes.
struct SwatchCard {
    std::string name;
    std::string origin;  ///< a line below the name
    pells::Material material;
    Thumbnail sphere;       ///< as large as SwatchSheet::sphereSize
    std::string operation;  ///< how it came from the cards before: "+", "=" or none
};

/// Draws materials in rows and columns on one PNG picture, row after row: memory does not depend on
/// the number of materials.
class SwatchSheet {
public:
    /// \param cards the number of cards that will be added, at least 1.
    /// \throws pells::FileError here and below when the file cannot be written.
    SwatchSheet(const std::string& path, std::size_t cards);

    /// Adds the next card. The file is written up to the last full row.
    void add(const SwatchCard& card);

    /// Gives the file its name.
    void finish();

    /// How many cards a sheet should have at the most, see ContactSheet::mostCells().
    static std::size_t mostCards();

    static constexpr int sphereSize = 196;

private:
    SheetRows rows;
};

}  // namespace pells_tool
