#pragma once

#include <cstddef>
#include <memory>
#include <string>

namespace pells_tool {

/// A PNG picture of 8-bit RGB, written row by row; appears under its name complete or not at all.
class PngFile {
public:
    /// \throws pells::FileError when the folder cannot be written.
    PngFile(const std::string& path, unsigned width, unsigned height);
    ~PngFile();
    PngFile(const PngFile&) = delete;
    PngFile& operator=(const PngFile&) = delete;

    /// Writes the next row, 3 bytes per pixel. \throws pells::FileError
    void writeRow(const unsigned char* row);

    /// Completes the picture, of which every row was written, and gives it its name.
    ///
    /// \throws pells::FileError
    void finish();

private:
    class Encoder;

    void store();

    std::unique_ptr<Encoder> encoder;
};

}  // namespace pells_tool
