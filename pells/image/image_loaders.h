#pragma once

#include <boost/smart_ptr/intrusive_ptr.hpp>
#include <cstdint>
#include <iosfwd>
#include <memory>
#include <string>

#include "pells/core/export.h"
#include "pells/core/smart_base.h"
#include "pells/serial/serializable.h"

namespace pells {

class Image_base;

/// Knows where one picture lies and fills images with it.
///
/// Loaders are persistent objects: the image definitions file, see ImageFallbackManager, names the
/// class of each one, which therefore needs a SerializableFactory.
class PELLS_API ImageLoaderBase : public smart_base, public Serializable {
public:
    ~ImageLoaderBase() override;

    /// Tells the loader where the place it knows begins. Does nothing here.
    virtual void appendPathInfo(std::string path);

    /// Fills an image with the picture.
    ///
    /// \return false when that fails; the image may have been cleared. Most failures leave lines in
    ///         the log; a loader without a name and a null image do not.
    virtual bool uploadImage(Image_base* image) = 0;
};

/// A loader that knows a file name; this one loads nothing.
class PELLS_API FileLoader : public ImageLoaderBase {
public:
    FileLoader() = default;

    /// \param name null for none.
    explicit FileLoader(const char* name);
    ~FileLoader() override;

    /// The name, with what appendPathInfo() put before it.
    const std::string& getFileName() const { return fileName; }

    /// Puts the path right before the file name; it ends in its own separator.
    void appendPathInfo(std::string path) override;

    bool uploadImage(Image_base* image) override;

protected:
    std::string fileName;  ///< see getFileName()
};

/// Fills images with TGA files that the AssetManager finds by name.
///
/// Saved as an element "text" that holds the name.
class PELLS_API TGAFileLoader : public FileLoader {
public:
    TGAFileLoader() = default;

    /// \param name of an asset; null and "" make a loader that fails.
    explicit TGAFileLoader(const char* name);
    ~TGAFileLoader() override;

    /// \throws pellibuf::BadPellFile, ZlibWrapper::ZlibError when the asset is a damaged member of
    ///         an archive.
    bool uploadImage(Image_base* image) override;

    boost::intrusive_ptr<Field> getField(const std::string& name) override;

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
    ///         when the stream ends early or memory for the picture cannot be had, or it is
    ///         larger than maximumPixels(). Memory is taken as the bytes arrive, not as the header
    ///         claims.
    /// \throws what the stream throws; the image then has no data.
    /// Format: Truevision TGA 2.0.
    static bool loadTarga(Image_base* image, std::istream& in);

    /// The largest picture that is read, in pixels: 2^28, or 16384 x 16384, unless it was set. A
    /// larger one counts as one that memory cannot be had for.
    static std::uint64_t maximumPixels();

    /// Takes effect with the next picture.
    static void setMaximumPixels(std::uint64_t pixels);

private:
    struct Header;

    static bool loadGray(Image_base& image, std::istream& in, const Header& header);
    static bool loadColor(Image_base& image, std::istream& in, const Header& header);
    static std::unique_ptr<unsigned char[]> _loadData(std::istream& in, int width, int height,
                                                      int components, bool topFirst);
};

/// Fills images with the TGA pictures that pell archives hold as the member "tga".
///
/// The file name is that of the archive in the file system, not the name of an asset.
class PELLS_API PellTGAFileLoader : public TGAFileLoader {
public:
    PellTGAFileLoader() = default;

    /// \param name path of an archive in the file system; null and "" make a loader that fails.
    explicit PellTGAFileLoader(const char* name);
    ~PellTGAFileLoader() override;

    /// Throws nothing: a line under "error" tells why the archive could not be read.
    bool uploadImage(Image_base* image) override;
};

}  // namespace pells
