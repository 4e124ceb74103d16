// Finds a picture by name below an asset root and prints what it is.
//
//     first_picture ROOT NAME
//
// ROOT holds archives (*.asset), plain files and Data/images.xml, the table of picture names.

#include <pells/pells.h>

#include <exception>
#include <iostream>
#include <string>

namespace {

std::string assetRoot;

/// Where an application keeps its settings is its own affair; this one has three.
class Settings : public pells::Prefs {
public:
    std::string getString(const std::string& key) override {
        if (key == "assetLocation")
            return assetRoot;
        if (key == "logdefault")
            return "error time.summary";  // tags that go to pells.log
        return "";
    }
};

// One static object makes the class known; the library asks for it by this name.
const pells::Factory<pells::Prefs, Settings> settingsFactory("Prefs");

int showPicture(const std::string& name) {
    const boost::intrusive_ptr<pells::Image_base> image(new pells::Image_base(1, 1));
    const int result = pells::ImageFallbackManager::instance().setupNewImage(image.get(), name);
    if (result != 0) {
        std::cerr << name << (result == 3 ? ": not in the table\n" : ": no loader could read it\n");
        return 1;
    }
    const unsigned char* const topLeft = image->getData();
    std::cout << name << ": " << image->getWidth() << " x " << image->getHeight() << ", "
              << image->getNumComponents() * 8 << " bits, top left pixel " << int{topLeft[0]} << ' '
              << int{topLeft[1]} << ' ' << int{topLeft[2]} << '\n';
    return 0;
}

}  // namespace

int main(int argc, char** argv) {
    if (argc != 3) {
        std::cerr << "usage: first_picture ROOT NAME\n";
        return 2;
    }
    assetRoot = argv[1];
    int status = 1;
    try {
        status = showPicture(argv[2]);
    } catch (const std::exception& failure) {
        std::cerr << "first_picture: " << failure.what() << '\n';
    }
    // The log stays, so that the library adds the time summary to it at the end.
    return status;
}
