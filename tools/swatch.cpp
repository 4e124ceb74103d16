#include <CLI/CLI.hpp>
#include <boost/intrusive_ptr.hpp>
#include <memory>
#include <string>
#include <vector>

#include "pells/asset/asset_manager.h"
#include "pells/image/image_base.h"
#include "pells/image/image_loaders.h"
#include "pells/material/material.h"
#include "tools/asset_root.h"
#include "tools/atomic_file.h"
#include "tools/commands.h"
#include "tools/error_lines.h"
#include "tools/library_prefs.h"
#include "tools/material_file.h"
#include "tools/pages.h"
#include "tools/picture_check.h"
#include "tools/sphere.h"
#include "tools/swatch_sheet.h"

namespace pells_tool {

namespace {

typedef boost::intrusive_ptr<pells::Image_base> Picture;

struct SwatchOptions {
    std::vector<std::string> files;
    std::vector<std::string> blended;
    std::string output;
    std::string root;
    LibraryOptions library;
};

/// A material, and where its texture's name was read.
struct Swatch {
    std::string file;
    SwatchCard card;
};

std::size_t nameBegin(const std::string& path) {
    return path.find_last_of('/') + 1;
}

Swatch readSwatch(const std::string& file, const char* operation = "") {
    const std::size_t name = nameBegin(file);
    return {file, {file.substr(name), file.substr(0, name), readMaterial(file), {}, operation}};
}

Swatch blend(const Swatch& first, const Swatch& second) {
    Swatch result = first;
    result.card.name = "Blend";
    result.card.origin = first.card.name + " blended with " + second.card.name;
    result.card.operation = "=";
    result.card.material.blendWith(second.card.material);
    return result;
}

/// All that are to be drawn, in order.
std::vector<Swatch> readSwatches(const SwatchOptions& options) {
    std::vector<Swatch> swatches;
    if (!options.blended.empty()) {
        swatches.push_back(readSwatch(options.blended[0]));
        swatches.push_back(readSwatch(options.blended[1], "+"));
        swatches.push_back(blend(swatches[0], swatches[1]));
    }
    for (const std::string& file : options.files)
        swatches.push_back(readSwatch(file));
    return swatches;
}

/// Why a texture could not be read: what was logged, or else what was thrown.
std::string reasonOf(ErrorLines& errors, const std::string& thrown) {
    const std::vector<std::string> reasons = errors.take();
    if (!reasons.empty())
        return inWords(reasons.front());
    return thrown.empty() ? "failed without a reason in the log" : inWords(thrown);
}

Picture readPicture(const std::string& name, const std::string& where, ErrorLines& errors) {
    Picture picture(new pells::Image_base(std::string()));
    pells::TGAFileLoader loader(name.c_str());
    std::string thrown;
    bool loaded = false;
    try {
        loaded = loader.uploadImage(picture.get());
    } catch (const std::exception& error) {
        thrown = error.what();
    }
    if (!loaded)
        throw pells::FileError(where, reasonOf(errors, thrown));
    if (picture->getWidth() == 0 || picture->getHeight() == 0)
        throw pells::FileError(where, std::string("The picture has no pixels"));
    const std::string doubts = complaint(loader);
    if (!doubts.empty())
        warn(where + ": " + doubts);
    return picture;
}

/// The picture that a material names; null where it names none.
Picture textureOf(const Swatch& swatch, const SwatchOptions& options, ErrorLines& errors) {
    const pells::Material& material = swatch.card.material;
    if (!material.hasTexture())
        return nullptr;
    const std::string where = swatch.file + ": texture '" + material.textureName() + "'";
    if (options.root.empty())
        throw pells::FileError(where, std::string("--root is needed to find it"));
    return readPicture(material.textureName(), where, errors);
}

void openLibrary(const SwatchOptions& options, ErrorLines& errors) {
    if (!options.root.empty())
        openAssetRoot(options.root, errors);
}

/// Checks that an output file is no material or texture.
void protectInputs(const std::string& output, const SwatchOptions& options,
                   const std::vector<Swatch>& swatches) {
    for (const Swatch& each : swatches) {
        protectInput(output, each.file);
        const std::string& texture = each.card.material.textureName();
        if (!options.root.empty() && !texture.empty())
            protectInput(output, pells::AssetManager::instance().resolve(texture).path);
    }
}

void drawPage(const SwatchOptions& options, const Page& page, std::vector<Swatch>& swatches,
              ErrorLines& errors) {
    SwatchSheet sheet(page.path(options.output), page.end - page.begin);
    for (std::size_t i = page.begin; i < page.end; ++i) {
        SwatchCard& card = swatches[i].card;
        const Picture texture = textureOf(swatches[i], options, errors);
        card.sphere = renderSphere(card.material, texture.get(), SwatchSheet::sphereSize);
        sheet.add(card);
        card.sphere = {};
    }
    sheet.finish();
}

void swatch(const SwatchOptions& options) {
    if (options.files.empty() && options.blended.empty())
        throw CLI::RequiredError("MATERIAL.xml or --blend");
    setUpLibrary(options.root, options.library);
    ErrorLines errors;
    openLibrary(options, errors);
    std::vector<Swatch> swatches = readSwatches(options);
    errors.take();
    const std::vector<Page> pages = paginate(swatches.size(), SwatchSheet::mostCards());
    for (const Page& page : pages)
        protectInputs(page.path(options.output), options, swatches);
    for (const Page& page : pages)
        drawPage(options, page, swatches, errors);
}

}  // namespace

void addSwatch(CLI::App& app) {
    const auto options = std::make_shared<SwatchOptions>();
    CLI::App* const command =
        app.add_subcommand("swatch", "Draw materials as lit spheres, with their values");
    command->add_option("MATERIAL.xml", options->files, "Files of one material each")
        ->type_name("");
    command
        ->add_option(
            "-o,--output", options->output,
            "The PNG file to make or replace; OUT-1.png and so on where there are several pages")
        ->required()
        ->type_name("FILE");
    command->add_option("--blend", options->blended, "Two materials, and the blend of both")
        ->type_size(2)
        ->expected(1)
        ->allow_extra_args(false)
        ->type_name("A.xml B.xml");
    command->add_option("--root", options->root, "The asset root that holds the textures")
        ->type_name("ROOT");
    addLogOptions(*command, options->library);
    addLimitOptions(*command, options->library);
    command->footer("The blend keeps the texture of the first of the two.");
    command->callback([options] { swatch(*options); });
}

}  // namespace pells_tool
