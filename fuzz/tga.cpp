// Any bytes as a TGA picture. What loads is read pixel by pixel, flipped and recoloured.

#include <sstream>

#include "fuzz/support/fuzz.h"
#include "pells/image/image_base.h"
#include "pells/image/image_loaders.h"

namespace {

/// Reads every byte, so that the sanitizers see what lies beyond or was never written.
unsigned sumOfPixels(const pells::Image_base& image) {
    unsigned sum = 0;
    for (int y = 0; y < image.getHeight(); ++y) {
        for (int x = 0; x < image.getWidth(); ++x)
            sum += image.getColorAsABGR(x, y);
    }
    return sum;
}

void use(pells::Image_base& image) {
    const unsigned sum = sumOfPixels(image);
    image.flipVertically();
    pells_fuzz::require(sumOfPixels(image) == sum, "flipping keeps the pixels");
    image.colorize(10, 20, 30, 200, 100, 50);
    sumOfPixels(image);
}

}  // namespace

void fuzzOne(const std::string& input) {
    pells::Image_base image(3, 2);
    // A second picture must not be harmed by what the first one left behind.
    for (const std::size_t start : {std::size_t(0), input.size() / 2}) {
        std::istringstream in(input.substr(start));
        if (pells::TGAFileLoader::loadTarga(&image, in))
            use(image);
        else
            pells_fuzz::require(!image.isValid(), "a failure leaves no pixels");
    }
}
