#pragma once

#include <boost/intrusive_ptr.hpp>
#include <string>
#include <vector>

#include "pells/image/image_base.h"

namespace pells {
class ImageLoaderBase;
}

namespace pells_tool {

class ErrorLines;

/// One loader that was asked for a picture.
struct Attempt {
    std::string loader;                ///< its class
    std::string file;                  ///< the asset or archive that it reads
    std::vector<std::string> reasons;  ///< why it failed, as logged
};

/// How a picture of the definitions fared.
struct PictureCheck {
    std::string name;
    std::vector<Attempt> attempts;  ///< in order; the last one served if `image` is there
    std::size_t loaders = 0;        ///< as many as could have been asked
    boost::intrusive_ptr<pells::Image_base> image;  ///< null when none served
    std::vector<std::string> origin;  ///< what the asset manager took the file from, if it did
    std::string warning;              ///< why the pixels are not what the file means; may be empty

    bool served() const { return image != nullptr; }
    bool fellBack() const { return served() && attempts.size() > 1; }
};

/// The names of all pictures that the definitions hold, in order.
///
/// \throws pells::FileError when they cannot be read or hold none.
std::vector<std::string> definedPictures(ErrorLines& errors);

/// Why the pixels of a file that was read may not be what it means; empty where they are.
std::string complaint(const pells::ImageLoaderBase& loader);

/// Checks that an output file is none of those that the pictures, or their definitions, are read
/// from. \throws pells::FileError
void protectPictures(const std::string& output, const std::vector<std::string>& names);

/// Asks the loaders of a picture one after the other.
PictureCheck checkPicture(const std::string& name, ErrorLines& errors);

}  // namespace pells_tool
