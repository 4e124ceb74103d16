#pragma once

#include <boost/smart_ptr/intrusive_ptr.hpp>
#include <iosfwd>
#include <map>
#include <string>
#include <vector>

#include "pells/core/export.h"
#include "pells/core/singleton.h"
#include "pells/serial/serializable.h"

namespace pells {

class Image_base;
class ImageFallbackManager;
class ImageLoaderBase;
extern template class PELLS_API
    RogueSingleton<ImageFallbackManager, SingletonFactory<ImageFallbackManager>>;
extern template class PELLS_API
    Singleton<ImageFallbackManager, SingletonFactory<ImageFallbackManager>>;

/// One image of the definitions file: its loaders in the order they are tried, and its name.
///
/// The entry does not own the loaders, and copies share them.
class PELLS_API FallbackEntry : public Serializable {
public:
    FallbackEntry() = default;
    FallbackEntry(const FallbackEntry&) = default;
    FallbackEntry(FallbackEntry&&) = default;
    FallbackEntry& operator=(const FallbackEntry&) = default;
    FallbackEntry& operator=(FallbackEntry&&) = default;
    ~FallbackEntry() override;

    boost::intrusive_ptr<Field> getField(const std::string& entryName) override;

    std::vector<ImageLoaderBase*> getters;  ///< not owned
    std::string name;                       ///< what applications ask for
};

/// Fills images by name, from the first of the name's loaders that can.
///
/// Which names there are is read once, by the first instance(), from the asset "Data/images.xml":
///
///     <imagedefs>
///         <imageEntries>
///             <imageEntry>
///                 <name>wall</name>
///                 <getters>
///                     <getter class="TGAFileLoader"><text>Images/wall.tga</text></getter>
///                     <getter class="PellTGAFileLoader"><text>Data/wall.pell</text></getter>
///                 </getters>
///             </imageEntry>
///         </imageEntries>
///     </imagedefs>
///
/// The classes are those with a SerializableFactory that derive from ImageLoaderBase; loaders of
/// the application count, too. An entry replaces an earlier one of the same name; an entry without
/// loaders counts as none. The manager owns the loaders that the file makes and releases them at
/// its end; loaders that the application brings in by calling load() later are not released.
///
/// Without the file, or with one of another root element, the manager is empty, after a line under
/// "error"; a malformed file, of which `<imagedefs/>` is one, throws. One thread only.
class PELLS_API ImageFallbackManager
    : public Serializable,
      public Singleton<ImageFallbackManager, SingletonFactory<ImageFallbackManager>> {
public:
    /// What became of an image.
    enum Result : int {
        FILLED = 0,           ///< a loader filled it
        LOADER_FAILED = 1,    ///< the loader of that index failed
        NO_MORE_LOADERS = 2,  ///< the name has no loader of that index, or all have failed
        NO_SUCH_NAME = 3,     ///< no entry has that name
    };

    ImageFallbackManager(const ImageFallbackManager&) = delete;
    ImageFallbackManager& operator=(const ImageFallbackManager&) = delete;
    ~ImageFallbackManager() override;

    /// Fills an image from one of the loaders of a name.
    ///
    /// \param image not null.
    /// \param name  compared byte for byte.
    /// \param index 0 for the loader that is tried first.
    /// \return a Result. A loader that fails may leave the image cleared.
    /// \throws what the loader throws, see TGAFileLoader::uploadImage().
    int getFallbackImage(Image_base* image, const std::string& name, unsigned int index);

    /// Fills an image from the first loader of a name that can; returns and throws as
    /// getFallbackImage() does, LOADER_FAILED excepted.
    int setupNewImage(Image_base* image, const std::string& name);

    /// The names that have loaders, in ascending order.
    std::vector<std::string> getImageNames() const;

    /// The loaders of a name in the order they are tried; none for a name without entry. They live
    /// as long as the manager.
    std::vector<const ImageLoaderBase*> getLoaders(const std::string& name) const;

    boost::intrusive_ptr<Field> getField(const std::string& elementName) override;

private:
    friend class SingletonFactory<ImageFallbackManager>;

    /// \throws Serializable::LoadFail, XMLTokenizer::TooLarge for the root element, and what
    ///         reading a damaged archive throws; the next instance() tries again.
    ImageFallbackManager();

    void readDefinitions(std::istream& in);
    void adoptLoaders() noexcept;
    void releaseLoaders() noexcept;

    std::vector<FallbackEntry> imageEntries;  ///< while the definitions are read
    std::vector<FallbackEntry> definitions;   ///< then; keeps every loader
    std::map<std::string, std::vector<ImageLoaderBase*>> loadersByName;
};

}  // namespace pells
