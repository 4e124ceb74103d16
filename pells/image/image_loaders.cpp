#include "pells/image/image_loaders.h"

#include <exception>
#include <istream>
#include <utility>

#include "pells/asset/asset_manager.h"
#include "pells/asset/detail/known_archive.h"
#include "pells/asset/pell_archive.h"
#include "pells/core/factory.h"
#include "pells/image/detail/loader_factories.h"
#include "pells/log/log.h"
#include "pells/serial/member_field.h"

namespace pells {

namespace {

const SerializableFactory<TGAFileLoader> tgaFileLoaderFactory("TGAFileLoader");
const SerializableFactory<PellTGAFileLoader> pellTgaFileLoaderFactory("PellTGAFileLoader");

}  // namespace

void detail::keepLoaderFactories() {}

ImageLoaderBase::~ImageLoaderBase() = default;

// NOLINTNEXTLINE(performance-unnecessary-value-param): overriders keep the text
void ImageLoaderBase::appendPathInfo(std::string /*path*/) {}

FileLoader::FileLoader(const char* name) : fileName(name ? name : "") {}

FileLoader::~FileLoader() = default;

void FileLoader::appendPathInfo(std::string path) {
    path += fileName;
    fileName = std::move(path);
}

bool FileLoader::uploadImage(Image_base* /*image*/) {
    return false;
}

TGAFileLoader::TGAFileLoader(const char* name) : FileLoader(name) {}

TGAFileLoader::~TGAFileLoader() = default;

bool TGAFileLoader::uploadImage(Image_base* image) {
    if (fileName.empty() || !image)
        return false;
    const boost::intrusive_ptr<baseiStreamContainer> file =
        AssetManager::instance().getFileStream(fileName, true);
    return file && loadTarga(image, file->getStream());
}

boost::intrusive_ptr<Field> TGAFileLoader::getField(const std::string& name) {
    return makeComposite(name, ClassDesc(FileLoader::getField("super"),
                                         makeField("text", &TGAFileLoader::fileName)));
}

PellTGAFileLoader::PellTGAFileLoader(const char* name) : TGAFileLoader(name) {}

PellTGAFileLoader::~PellTGAFileLoader() = default;

bool PellTGAFileLoader::uploadImage(Image_base* image) {
    const std::string prefix = "Image(" + fileName + "): ";
    if (fileName.empty() || !image)
        return false;
    try {
        // Without such a member the stream is empty, which the reader reports.
        return loadTarga(image, *detail::openKnownMember(fileName, "tga"));
    } catch (const pellibuf::BadPellFile& failure) {
        PELLS_LOG("error", prefix << "Can't read pell file: " << failure.what());
    } catch (const std::exception& failure) {
        PELLS_LOG("error", prefix << "Can't read pell file: std::exception error was thrown!!"
                                  << failure.what());
    } catch (...) {
        PELLS_LOG("error", prefix << "Can't read pell file: unknown error was thrown!!");
    }
    return false;
}

}  // namespace pells
