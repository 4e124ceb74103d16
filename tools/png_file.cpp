#include "tools/png_file.h"

#include <png.h>

#include <csetjmp>
#include <stdexcept>
#include <vector>

#include "tools/atomic_file.h"

namespace pells_tool {

/// libpng leaves its functions by longjmp when something fails: each call to it stands in a
/// function of its own without objects to destroy, and what it writes is only gathered here.
class PngFile::Encoder {
public:
    explicit Encoder(const std::string& path) : file(path), png(nullptr), info(nullptr) {
        png = png_create_write_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, &ignoreWarning);
        info = png ? png_create_info_struct(png) : nullptr;
        if (!info) {
            png_destroy_write_struct(&png, nullptr);
            throw std::bad_alloc();
        }
        png_set_write_fn(png, &pending, &gather, nullptr);
    }
    ~Encoder() { png_destroy_write_struct(&png, &info); }
    Encoder(const Encoder&) = delete;
    Encoder& operator=(const Encoder&) = delete;

    bool begin(unsigned width, unsigned height) {
        if (setjmp(png_jmpbuf(png)))
            return false;
        // Libpng's own limit guards readers; nothing but memory limits a picture that is written.
        png_set_user_limits(png, PNG_UINT_31_MAX, PNG_UINT_31_MAX);
        png_set_IHDR(png, info, width, height, 8, PNG_COLOR_TYPE_RGB, PNG_INTERLACE_NONE,
                     PNG_COMPRESSION_TYPE_DEFAULT, PNG_FILTER_TYPE_DEFAULT);
        png_write_info(png, info);
        return true;
    }
    bool row(const unsigned char* bytes) {
        if (setjmp(png_jmpbuf(png)))
            return false;
        png_write_row(png, bytes);
        return true;
    }
    bool end() {
        if (setjmp(png_jmpbuf(png)))
            return false;
        png_write_end(png, info);
        return true;
    }

    pells::AtomicFile file;
    std::vector<unsigned char> pending;

private:
    static void ignoreWarning(png_structp, png_const_charp) {}
    static void gather(png_structp png, png_bytep bytes, std::size_t count) {
        bool gathered = true;
        try {
            auto& pending = *static_cast<std::vector<unsigned char>*>(png_get_io_ptr(png));
            pending.insert(pending.end(), bytes, bytes + count);
        } catch (...) {
            gathered = false;
        }
        if (!gathered)
            png_error(png, "out of memory");
    }

    png_structp png;
    png_infop info;
};

namespace {

void check(bool encoded, const pells::AtomicFile& file) {
    if (!encoded)
        throw pells::FileError(file.path(), "The picture cannot be encoded");
}

}  // namespace

PngFile::PngFile(const std::string& path, unsigned width, unsigned height)
    : encoder(new Encoder(path)) {
    check(encoder->begin(width, height), encoder->file);
    store();
}

PngFile::~PngFile() = default;

void PngFile::writeRow(const unsigned char* row) {
    check(encoder->row(row), encoder->file);
    store();
}

void PngFile::finish() {
    check(encoder->end(), encoder->file);
    store();
    encoder->file.commit();
}

void PngFile::store() {
    encoder->file.write(encoder->pending.data(), encoder->pending.size());
    encoder->pending.clear();
}

}  // namespace pells_tool
