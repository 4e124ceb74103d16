#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>

#include "pells/core/export.h"
#include "pells/core/smart_base.h"

namespace pells {

/// Layout of a pixel.
enum ImageFormat : int {
    FMT_RGB = 0,   ///< three bytes: red, green, blue; opaque
    FMT_RGBA = 1,  ///< four bytes: red, green, blue, alpha
};

/// A picture in memory: rows of 8-bit channels, top row first, nothing between rows.
///
/// A picture that came from an 8-bit grey file keeps its grey levels beside the pixels and can be
/// recoloured with colorize() any number of times. After a failed load through loadTarga() or
/// loadPellFileImage() the image is a 2x2 substitute, red beside green: see isBogusImage().
///
/// An image is empty while getData() is null. The pixel getters check nothing: they need an image
/// with data and a position inside it, 0 <= x < getWidth() and 0 <= y < getHeight().
///
/// Not copyable. One thread only.
class PELLS_API Image_base : public smart_base {
public:
    /// An RGBA image whose pixels are not initialised.
    ///
    /// \throws std::bad_alloc when a size is negative or there is no memory for it.
    Image_base(int pixelsWide, int pixelsHigh);

    /// An image from a file. A name that ends in ".pell" is that of an archive in the file system,
    /// whose picture is loaded as loadPellFileImage() does. For any other name nothing is loaded
    /// and the image is empty: derived classes load other files.
    explicit Image_base(const std::string& name);

    Image_base(const Image_base&) = delete;
    Image_base& operator=(const Image_base&) = delete;
    ~Image_base() override;

    /// Lets go of the pixels and the file name; the size becomes 0. A kept grey picture stays, so
    /// that colorize() goes on with it when the image is filled again.
    void clearImage();

    /// In pixels; 0 for an image without a picture.
    int getWidth() const { return width; }
    int getHeight() const { return height; }

    /// Bytes per pixel: 3 or 4, and 0 for an image without a picture.
    int getNumComponents() const { return numComponents; }

    /// The layout of the pixels; means nothing for an image without a picture.
    ImageFormat getFormat() { return format; }

    /// The pixels, getWidth() x getHeight() x getNumComponents() bytes, or null. They stay the
    /// image's, and valid until it is cleared, filled anew or destroyed.
    const unsigned char* getData() const { return data.get(); }

    /// The name the image was made with; reading a picture empties it.
    std::string getFileName() const { return fileName; }

    /// Whether there are pixels, including those of the substitute.
    bool isValid() const { return data != nullptr; }

    /// Whether loadTarga() or loadPellFileImage() has failed on this image. The pixels were those
    /// of the substitute then; a good load that follows replaces them, and this stays true.
    bool isBogusImage() const { return bogus; }

    /// Whether the picture came from an 8-bit grey file, so that colorize() works.
    bool isGrayscale() const { return grayscale; }

    /// Whether both sizes are powers of two or 0.
    bool dimensionsArePowerOfTwo() const;

    /// Copies the channels of a pixel, each 0 to 255.
    ///
    /// \param x, y 0 <= x < getWidth() from the left, 0 <= y < getHeight() from the top.
    /// \param r, g, b where red, green and blue go; not null.
    /// \param a null, or where the alpha goes; only for images of four bytes per pixel.
    void getColorComponents(int x, int y, unsigned char* r, unsigned char* g, unsigned char* b,
                            unsigned char* a) const;

    /// The pixel in packed form, its first letter in the highest bits: A1R5G5B5 has one bit of
    /// alpha, set above 127, over five each of red, green and blue. Narrow channels keep the high
    /// bits; a channel of 10 bits is four times the 8-bit one, at most 1020. Pixels without alpha
    /// are opaque. In a derived class' own format, neither RGB nor RGBA, the 32-bit forms are 0 and
    /// the 16-bit forms take the fourth byte for alpha.
    ///
    /// \param x, y 0 <= x < getWidth() from the left, 0 <= y < getHeight() from the top.
    std::uint32_t getColorAsABGR(int x, int y) const;
    std::uint32_t getColorAsARGB(int x, int y) const;
    std::uint16_t getColorAsA1R5G5B5(int x, int y) const;
    std::uint16_t getColorAsA4R4G4B4(int x, int y) const;
    std::uint16_t getColorAsA8R3G3B2(int x, int y) const;
    std::uint32_t getColorAsA2B10G10R10(int x, int y) const;

    /// The pixel that a texture coordinate lies in, 0 <= u < 1 and 0 <= v < 1, v downwards; neither
    /// filtered nor wrapped.
    std::uint32_t getColorAsABGR(double u, double v) const;
    std::uint32_t getColorAsARGB(double u, double v) const;

    /// A whole row of pixels, each the same as the getter above gives for it, but several times
    /// faster than asking for each.
    ///
    /// \param y   0 <= y < getHeight(), from the top.
    /// \param row where the getWidth() values go, from the left; not null.
    void getRowAsABGR(int y, std::uint32_t* row) const;
    void getRowAsARGB(int y, std::uint32_t* row) const;
    void getRowAsA1R5G5B5(int y, std::uint16_t* row) const;
    void getRowAsA4R4G4B4(int y, std::uint16_t* row) const;
    void getRowAsA8R3G3B2(int y, std::uint16_t* row) const;
    void getRowAsA2B10G10R10(int y, std::uint32_t* row) const;

    /// Sets a pixel, at a position as above, to red, green, blue and, in an image that has it,
    /// alpha: in this order, the one the bytes have in memory.
    ///
    /// \return false when there is no such pixel.
    bool setColorAsARGB(int x, int y, unsigned char c0, unsigned char c1, unsigned char c2,
                        unsigned char c3);

    /// Turns the picture upside down. Kept grey levels stay as they are.
    void flipVertically();

    /// Paints a grey picture in the blend between two colours, the first for black and the second
    /// for white; see HSVInterpolate(). Alpha becomes opaque. Does nothing to other pictures.
    ///
    /// Where the image has been filled with another picture since, the kept grey levels colour as
    /// many pixels as both have.
    void colorize(unsigned char r1, unsigned char g1, unsigned char b1, unsigned char r2,
                  unsigned char g2, unsigned char b2);

    /// Little-endian numbers of one, two and four bytes, as file headers have them. Setters drop
    /// the bits that do not fit. The bytes need no alignment.
    static int getCharValue(const unsigned char* p) { return p[0]; }
    static void setCharValue(unsigned char* p, int v);
    static int getInt(const unsigned char* p) { return p[0] + 256 * p[1]; }  ///< 0 to 65535
    static void setInt(unsigned char* p, int v);
    static int getLong(const unsigned char* p);
    static void setLong(unsigned char* p, int v);

protected:
    /// Makes the image empty but for format, fileName and extension.
    void init();

    /// Makes the image the substitute.
    void makeBogusImage();

    /// Fills the image from a TGA file that the AssetManager finds, or makes it the substitute.
    /// Throws nothing: lines under "error" tell why the file could not be read.
    void loadTarga(const std::string& name);

    /// Fills the image from the TGA picture that a pell archive, a file of that name, holds as its
    /// member "tga", or makes it the substitute. Throws nothing, as loadTarga().
    void loadPellFileImage(const std::string& name);

    int width = 0;                              ///< see getWidth()
    int height = 0;                             ///< see getHeight()
    int numComponents = 0;                      ///< see getNumComponents()
    bool grayscale = false;                     ///< see isGrayscale()
    ImageFormat format = FMT_RGB;               ///< see getFormat()
    std::unique_ptr<unsigned char[]> data;      ///< see getData()
    std::unique_ptr<unsigned char[]> grayData;  ///< one level per pixel, rows as in data
    std::string fileName;                       ///< see getFileName()
    bool loadedFromPell = false;                ///< the image was made with the name of an archive
    bool bogus = false;                         ///< see isBogusImage()
    std::string extension;  ///< of the name the image was made with, from its last "." on

    /// Levels in grayData; both are set together.
    std::size_t graySize = 0;

private:
    friend class TGAFileLoader;

    std::size_t offsetOf(int x, int y) const {
        const std::size_t row = static_cast<std::size_t>(y) * static_cast<std::size_t>(width);
        return (row + static_cast<std::size_t>(x)) * static_cast<std::size_t>(numComponents);
    }

    template <class Packed, class Pack>
    Packed packPixel(int x, int y, Pack pack) const;
    template <class Packed, class Pack>
    void packRow(int y, Packed* row, Pack pack) const;
};

}  // namespace pells
