#pragma once

#include <iosfwd>
#include <memory>

#include "pells/core/export.h"

namespace pells {

class Image_base;

/// Fills images with TGA pictures.
class PELLS_API TGAFileLoader {
public:
    /// Reads one TGA picture: uncompressed, of 24 or 32 bits per pixel, or 8-bit grey.
    ///
    /// The image type is not looked at: a run-length encoded file is read as if its packets were
    /// pixels, which gives noise, or a failure when they end early. Rows may be stored in either
    /// order, pixels from left to right only. The stream is left after the last pixel or wherever
    /// reading stopped.
    ///
    /// \param image is cleared first. After a failure it is empty, but for its size where the
    ///        pixels were incomplete or too many. It keeps the grey levels of an earlier grey
    ///        picture unless the new one has grey levels of its own.
    /// \return false, after one line under "error", for null, for other depths, for colour maps and
    ///         when the stream ends early or memory for the picture cannot be had. Memory is taken
    ///         as the bytes arrive, not as the header claims.
    /// \throws what the stream throws; the image then has no data.
    /// Format: Truevision TGA 2.0.
    static bool loadTarga(Image_base* image, std::istream& in);

private:
    struct Header;

    static bool loadGray(Image_base& image, std::istream& in, const Header& header);
    static bool loadColor(Image_base& image, std::istream& in, const Header& header);
    static std::unique_ptr<unsigned char[]> _loadData(std::istream& in, int width, int height,
                                                      int components, bool topFirst);
};

}  // namespace pells
