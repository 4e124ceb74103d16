#pragma once

#include <cstddef>
#include <string>
#include <vector>

namespace pells_tool {

/// One of the pictures that many cells are spread over.
struct Page {
    std::size_t begin;   ///< the first cell
    std::size_t end;     ///< the one behind the last
    std::size_t number;  ///< from 1 on
    std::size_t count;   ///< of all pages

    /// Where the page goes: the path itself, or "OUT-01.png" and so on for several pages.
    std::string path(const std::string& output) const;

    /// " (page 1 of 2)", or nothing.
    std::string title() const;
};

/// Pages of at most so many cells; one page where there are none.
std::vector<Page> paginate(std::size_t cells, std::size_t mostCells);

/// Checks that an output file is none of the files that are read, under any name.
///
/// \throws pells::FileError
void protectInput(const std::string& output, const std::string& input);

}  // namespace pells_tool
