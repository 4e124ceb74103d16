#include "tools/picture_check.h"

#include <boost/filesystem/operations.hpp>
#include <istream>
#include <map>
#include <typeinfo>

#include "pells/asset/asset_manager.h"
#include "pells/asset/pell_archive.h"
#include "pells/core/class_name.h"
#include "pells/image/image_fallback_manager.h"
#include "pells/image/image_loaders.h"
#include "tools/asset_root.h"
#include "tools/atomic_file.h"
#include "tools/error_lines.h"
#include "tools/pages.h"

namespace pells_tool {

namespace {

typedef pells::AssetManager::Resolution Resolution;

const char definitionsName[] = "Data/images.xml";

/// The image type of a TGA header, or -1 without one.
int imageType(std::istream& in) {
    char header[3];
    return in.read(header, sizeof header) ? static_cast<unsigned char>(header[2]) : -1;
}

int imageType(const pells::TGAFileLoader& loader) {
    if (dynamic_cast<const pells::PellTGAFileLoader*>(&loader)) {
        // Many pictures may come from one archive, whose directory may be large.
        static std::map<std::string, int> known;
        const auto place = known.find(loader.getFileName());
        if (place != known.end())
            return place->second;
        pells::pellistream archive(loader.getFileName());
        return known[loader.getFileName()] = archive.open("tga") ? imageType(archive) : -1;
    }
    const auto asset = pells::AssetManager::instance().getFileStream(loader.getFileName(), true);
    return asset ? imageType(asset->getStream()) : -1;
}

/// Why the pixels are noise although the library read them: it does not look at the image type
/// (Truevision TGA 2.0).
std::string complaint(int type) {
    const std::string number = "image type " + std::to_string(type);
    switch (type) {
        case 2:
        case 3:
            return "";
        case 0:
            return number + " says that there is no picture";
        case 1:
            return number + " is colour-mapped: indexes are read as pixels";
        case 9:
        case 10:
        case 11:
            return number + " is run-length encoded: packets are read as pixels";
        default:
            return number + " is unknown: the data may be no pixels";
    }
}

/// Which of its stores the asset manager took a loader's file from.
std::vector<std::string> originOf(const pells::ImageLoaderBase& loader) {
    const auto* const tga = dynamic_cast<const pells::TGAFileLoader*>(&loader);
    if (!tga || dynamic_cast<const pells::PellTGAFileLoader*>(&loader))
        return {};
    const Resolution found = pells::AssetManager::instance().resolve(tga->getFileName());
    std::vector<std::string> lines;
    if (!found.alias.empty())
        lines.push_back("alias of " + found.alias);
    if (found.source == Resolution::ARCHIVE_MEMBER)
        lines.push_back("in " + found.path);
    else
        lines.emplace_back(found.source == Resolution::NEWER_FILE
                               ? "plain file, newer than archived"
                               : "plain file");
    return lines;
}

std::string fileOf(const pells::ImageLoaderBase& loader) {
    const auto* const file = dynamic_cast<const pells::FileLoader*>(&loader);
    return file ? file->getFileName() : "";
}

/// Asks one loader; null when it fails.
boost::intrusive_ptr<pells::Image_base> load(const std::string& name, unsigned index,
                                             Attempt& attempt, ErrorLines& errors) {
    // A new image each time: a failed loader may have left something in it.
    boost::intrusive_ptr<pells::Image_base> image(new pells::Image_base(std::string()));
    bool filled = false;
    try {
        filled =
            pells::ImageFallbackManager::instance().getFallbackImage(image.get(), name, index) == 0;
        attempt.reasons = errors.take();
    } catch (const std::exception& error) {
        // The zlib error that is thrown here was logged, too.
        attempt.reasons = errors.take();
        if (attempt.reasons.empty())
            attempt.reasons.emplace_back(error.what());
    }
    if (!filled && attempt.reasons.empty())
        attempt.reasons.emplace_back("failed without a reason in the log");
    return filled ? image : nullptr;
}

}  // namespace

std::vector<std::string> definedPictures(ErrorLines& errors) {
    const std::string asset = std::string("asset ") + definitionsName;
    std::vector<std::string> names;
    try {
        names = pells::ImageFallbackManager::instance().getImageNames();
    } catch (const std::exception& error) {
        throw pells::FileError(asset, inWords(error.what()));
    }
    const std::vector<std::string> reasons = errors.take();
    if (names.empty())
        throw pells::FileError(
            asset, reasons.empty() ? "It defines no picture" : inWords(reasons.front()));
    return names;
}

std::string complaint(const pells::ImageLoaderBase& loader) {
    const auto* const tga = dynamic_cast<const pells::TGAFileLoader*>(&loader);
    const int type = tga ? imageType(*tga) : -1;
    return type < 0 ? "" : complaint(type);
}

void protectPictures(const std::string& output, const std::vector<std::string>& names) {
    if (!boost::filesystem::exists(output))
        return;
    const pells::AssetManager& assets = pells::AssetManager::instance();
    protectInput(output, assets.resolve(definitionsName).path);
    for (const std::string& name : names) {
        for (const pells::ImageLoaderBase* const loader :
             pells::ImageFallbackManager::instance().getLoaders(name)) {
            const std::string file = fileOf(*loader);
            const bool isArchive = dynamic_cast<const pells::PellTGAFileLoader*>(loader) != nullptr;
            protectInput(output, isArchive ? file : assets.resolve(file).path);
        }
    }
}

PictureCheck checkPicture(const std::string& name, ErrorLines& errors) {
    PictureCheck check;
    check.name = name;
    const auto loaders = pells::ImageFallbackManager::instance().getLoaders(name);
    check.loaders = loaders.size();
    for (unsigned index = 0; index < loaders.size() && !check.image; ++index) {
        const pells::ImageLoaderBase& loader = *loaders[index];
        Attempt attempt{pells::className(typeid(loader)), fileOf(loader), {}};
        check.image = load(name, index, attempt, errors);
        check.attempts.push_back(attempt);
        if (check.image) {
            check.origin = originOf(loader);
            check.warning = complaint(loader);
        }
    }
    errors.take();
    return check;
}

}  // namespace pells_tool
