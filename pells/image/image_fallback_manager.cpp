#include "pells/image/image_fallback_manager.h"

#include <istream>
#include <typeinfo>

#include "pells/asset/asset_manager.h"
#include "pells/core/class_name.h"
#include "pells/image/image_loaders.h"
#include "pells/log/log.h"
#include "pells/serial/member_field.h"
#include "pells/serial/object_handlers.h"
#include "pells/xml/tag.h"
#include "pells/xml/tokenizer.h"

namespace pells {

template class RogueSingleton<ImageFallbackManager, SingletonFactory<ImageFallbackManager>>;
template class Singleton<ImageFallbackManager, SingletonFactory<ImageFallbackManager>>;

FallbackEntry::~FallbackEntry() = default;

boost::intrusive_ptr<Field> FallbackEntry::getField(const std::string& entryName) {
    return makeComposite(entryName, ClassDesc(Serializable::getField("super"),
                                              makeField("name", &FallbackEntry::name),
                                              makeField("getters", &FallbackEntry::getters)));
}

ImageFallbackManager::ImageFallbackManager() {
    const boost::intrusive_ptr<baseiStreamContainer> file =
        AssetManager::instance().getFileStream("Data/images.xml", true);
    if (!file) {
        PELLS_LOG("error", className(typeid(*this)) << ":"
                                                    << "Constructor for ImageFallbackManager could "
                                                       "not find the XML file 'images.xml'.");
        return;
    }
    try {
        readDefinitions(file->getStream());
        for (const FallbackEntry& entry : imageEntries) {
            if (!entry.getters.empty())
                loadersByName[entry.name] = entry.getters;
        }
    } catch (...) {
        adoptLoaders();
        releaseLoaders();
        throw;
    }
    adoptLoaders();
}

ImageFallbackManager::~ImageFallbackManager() {
    releaseLoaders();
}

void ImageFallbackManager::readDefinitions(std::istream& in) {
    XMLTokenizer tokenizer(in);
    const XMLTokenizer::Token root = tokenizer.getToken();
    const bool isElement =
        root.type == XMLTokenizer::Token::T_OPEN || root.type == XMLTokenizer::Token::T_SINGLE;
    if (!isElement || root.value != "imagedefs") {
        PELLS_LOG("error", className(typeid(*this))
                               << ":"
                               << "Constructor for ImageFallbackManager opened an XML file that "
                                  "did not have the correct 'imagedefs' format.");
        return;
    }
    OpenTag tag(tokenizer, root);
    load(tag, nullptr);
}

/// Takes hold of all loaders that were read, those of half-read and replaced entries included.
void ImageFallbackManager::adoptLoaders() noexcept {
    definitions.swap(imageEntries);
    for (const FallbackEntry& entry : definitions) {
        for (ImageLoaderBase* const loader : entry.getters) {
            if (loader)
                intrusive_ptr_add_ref(loader);
        }
    }
}

void ImageFallbackManager::releaseLoaders() noexcept {
    for (const FallbackEntry& entry : definitions) {
        for (ImageLoaderBase* const loader : entry.getters) {
            if (loader)
                intrusive_ptr_release(loader);
        }
    }
}

int ImageFallbackManager::getFallbackImage(Image_base* image, const std::string& name,
                                           unsigned int index) {
    const auto found = loadersByName.find(name);
    if (found == loadersByName.end())
        return NO_SUCH_NAME;
    if (index >= found->second.size())
        return NO_MORE_LOADERS;
    return found->second[index]->uploadImage(image) ? FILLED : LOADER_FAILED;
}

int ImageFallbackManager::setupNewImage(Image_base* image, const std::string& name) {
    int result = LOADER_FAILED;
    for (unsigned int index = 0; result == LOADER_FAILED; ++index)
        result = getFallbackImage(image, name, index);
    return result;
}

std::vector<std::string> ImageFallbackManager::getImageNames() const {
    std::vector<std::string> names;
    names.reserve(loadersByName.size());
    for (const auto& entry : loadersByName)
        names.push_back(entry.first);
    return names;
}

std::vector<const ImageLoaderBase*> ImageFallbackManager::getLoaders(
    const std::string& name) const {
    const auto found = loadersByName.find(name);
    if (found == loadersByName.end())
        return {};
    return {found->second.begin(), found->second.end()};
}

boost::intrusive_ptr<Field> ImageFallbackManager::getField(const std::string& elementName) {
    return makeComposite(elementName,
                         ClassDesc(Serializable::getField("super"),
                                   makeField("imageEntries", &ImageFallbackManager::imageEntries)));
}

}  // namespace pells
