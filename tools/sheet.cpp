#include <CLI/CLI.hpp>
#include <memory>
#include <string>
#include <vector>

#include "tools/asset_root.h"
#include "tools/commands.h"
#include "tools/contact_sheet.h"
#include "tools/error_lines.h"
#include "tools/library_prefs.h"
#include "tools/pages.h"
#include "tools/picture_check.h"
#include "tools/standard_output.h"
#include "tools/text.h"

namespace pells_tool {

namespace {

struct SheetOptions {
    std::string root;
    std::string output;
    LibraryOptions library;
};

std::string formatName(const pells::Image_base& image) {
    if (image.isGrayscale())
        return "grey";
    return image.getNumComponents() == 4 ? "RGBA" : "RGB";
}

std::string sizeText(const pells::Image_base& image) {
    return std::to_string(image.getWidth()) + " x " + std::to_string(image.getHeight()) + " " +
           formatName(image);
}

std::string source(const Attempt& attempt) {
    return attempt.loader + (attempt.file.empty() ? "" : " " + attempt.file);
}

/// A loader's file, or its class and file.
std::string source(const Attempt& attempt, bool withClass) {
    return withClass || attempt.file.empty() ? source(attempt) : attempt.file;
}

/// Why a loader failed. The archive loader's messages begin with the file, which is named already.
std::string reason(const Attempt& attempt) {
    const std::string prefix = "Image(" + attempt.file + "): ";
    std::string text;
    for (const std::string& line : attempt.reasons) {
        const bool repeats = line.compare(0, prefix.size(), prefix) == 0;
        text += (text.empty() ? "" : "; ") +
                inWords(line.substr(repeats ? prefix.size() : 0), attempt.file);
    }
    return text;
}

/// Why the loaders failed that were asked in vain, one text each.
std::vector<std::string> failures(const PictureCheck& check, bool withClasses) {
    std::vector<std::string> texts;
    const std::size_t failed = check.attempts.size() - (check.served() ? 1 : 0);
    for (std::size_t i = 0; i < failed; ++i) {
        const Attempt& attempt = check.attempts[i];
        texts.push_back(source(attempt, withClasses) + ": " + reason(attempt));
    }
    return texts;
}

/// Counts pictures and tells about those that did not come from their first loader.
class Report {
public:
    void add(const PictureCheck& check) {
        ++pictures;
        found += check.served() ? 1 : 0;
        fallbacks += check.fellBack() ? 1 : 0;
        if (!check.warning.empty())
            warn(check.name + ": " + source(check.attempts.back()) + ": " + check.warning);
        if (!check.served())
            print(check.name + ": not found");
        else if (check.fellBack())
            print(check.name + ": fell back to " + source(check.attempts.back()));
        for (const std::string& failure : failures(check, true))
            print("  " + failure);
    }
    std::string summary() const {
        return std::to_string(found) + " of " + counted(pictures, "picture") + " found, " +
               std::to_string(fallbacks) + " of them by a fallback";
    }

private:
    static void print(const std::string& line) { writeOut(printable(line) + "\n"); }

    std::size_t pictures = 0;
    std::size_t found = 0;
    std::size_t fallbacks = 0;
};

SheetCell makeCell(const PictureCheck& check) {
    SheetCell cell;
    cell.name = check.name;
    cell.notes = failures(check, false);
    if (!check.served()) {
        cell.mood = SheetCell::bad;
        cell.size = "not found";
        cell.loader = counted(check.loaders, "loader") + " failed";
        return cell;
    }
    cell.picture = makeThumbnail(*check.image, ContactSheet::boxWidth, ContactSheet::boxHeight);
    cell.size = sizeText(*check.image);
    cell.loader = check.attempts.back().loader;
    cell.file = check.attempts.back().file;
    cell.origin = check.origin;
    if (cell.picture.pixels.empty())
        cell.notes.insert(cell.notes.begin(), "The picture has no pixels.");
    if (check.fellBack()) {
        cell.mood = SheetCell::fallback;
        cell.loader +=
            ", " + std::to_string(check.attempts.size()) + " of " + std::to_string(check.loaders);
    }
    if (!check.warning.empty()) {
        cell.mood = SheetCell::doubtful;
        cell.notes.insert(cell.notes.begin(), check.warning);
    }
    return cell;
}

/// Draws the pictures of one page. The report goes on from page to page.
void drawPage(const SheetOptions& options, const Page& page, const std::vector<std::string>& names,
              Report& report, ErrorLines& errors) {
    ContactSheet contactSheet(page.path(options.output), options.root + page.title(),
                              page.end - page.begin);
    for (std::size_t i = page.begin; i < page.end; ++i) {
        const PictureCheck check = checkPicture(names[i], errors);
        report.add(check);
        contactSheet.add(makeCell(check));
    }
    std::string summary = report.summary();
    if (page.number < page.count)
        summary = "Pictures " + std::to_string(page.begin + 1) + " to " + std::to_string(page.end) +
                  " of " + std::to_string(names.size());
    writeOut((page.count > 1 ? printable(page.path(options.output)) + ": " : "") + summary + "\n");
    flushOut();
    contactSheet.finish(summary);
}

void sheet(const SheetOptions& options) {
    setUpLibrary(options.root, options.library);
    ErrorLines errors;
    openAssetRoot(options.root, errors);
    const std::vector<std::string> names = definedPictures(errors);
    const std::vector<Page> pages = paginate(names.size(), ContactSheet::mostCells());
    for (const Page& page : pages)
        protectPictures(page.path(options.output), names);
    Report report;
    for (const Page& page : pages)
        drawPage(options, page, names, report, errors);
}

}  // namespace

void addSheet(CLI::App& app) {
    const auto options = std::make_shared<SheetOptions>();
    CLI::App* const command =
        app.add_subcommand("sheet", "Draw every picture that Data/images.xml defines on one sheet");
    command->add_option("ROOT", options->root, "The asset root")->required()->type_name("");
    command
        ->add_option(
            "-o,--output", options->output,
            "The PNG file to make or replace; OUT-1.png and so on where there are several pages")
        ->required()
        ->type_name("FILE");
    addLogOptions(*command, options->library);
    addLimitOptions(*command, options->library);
    command->footer(
        "Each picture has its name, size, format and the loader that served it, or the reasons "
        "why\n"
        "none did; standard output tells which pictures fell back or were not found. A\n"
        "PellTGAFileLoader's archive is looked for from the current directory.\n"
        "--log time.summary ends with a table of where the time went.");
    command->callback([options] { sheet(*options); });
}

}  // namespace pells_tool
