// Any document as the file of image definitions.

#include "fuzz/support/fuzz.h"
#include "pells/image/image_base.h"
#include "pells/image/image_fallback_manager.h"
#include "pells/serial/serializable.h"
#include "support/test_prefs.h"

void fuzzOne(const std::string& input) {
    pells_fuzz::scratch().write("root/Data/images.xml", input);
    pells_test::prefs()["assetLocation"] = pells_fuzz::scratch().path("root");
    try {
        auto& manager = pells::ImageFallbackManager::instance();
        pells::Image_base image(1, 1);
        for (const std::string& name : manager.getImageNames()) {
            pells_fuzz::require(!manager.getLoaders(name).empty(), "a name has loaders");
            pells_fuzz::require(
                manager.setupNewImage(&image, name) != pells::ImageFallbackManager::NO_SUCH_NAME,
                "a listed name is known");
        }
    } catch (const pells::Serializable::LoadFail&) {
    }
}
