#include "tools/library_prefs.h"

#include <CLI/CLI.hpp>
#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <map>

#include "pells/core/factory.h"
#include "pells/core/no_destructor.h"
#include "pells/core/prefs.h"
#include "pells/image/image_loaders.h"
#include "pells/log/log.h"
#include "pells/platform/debugger.h"
#include "pells/xml/tag.h"

namespace pells_tool {

namespace {

/// Never destroyed: the log may ask while the process exits.
std::map<std::string, std::string>& values() {
    static pells::NoDestructor<std::map<std::string, std::string>> map;
    return *map;
}

class LibraryPrefs : public pells::Prefs {
public:
    LibraryPrefs() { values().emplace("logdefault", "error"); }
    std::string getString(const std::string& key) override {
        const auto value = values().find(key);
        return value != values().end() ? value->second : std::string();
    }
};

const pells::Factory<pells::Prefs, LibraryPrefs> prefsFactory("Prefs");

/// Shows the log's lines, without the three of its header.
class StandardErrorLog : public pells::platform::DebuggerSink {
public:
    void write(const char* text) override {
        for (; headerLines != 0 && *text != '\0'; ++text)
            headerLines -= *text == '\n' ? 1 : 0;
        std::fputs(text, stderr);
    }

private:
    int headerLines = 3;
};

}  // namespace

void addLogOptions(CLI::App& command, LibraryOptions& options) {
    command.add_option("--log", options.logRules, "Rules for log tags, beside errors")
        ->type_name("RULES");
    command
        .add_option("--log-file", options.logFile,
                    "Where the log goes; without it, --log prints to standard error")
        ->type_name("FILE");
}

void addLimitOptions(CLI::App& command, LibraryOptions& options) {
    command
        .add_option("--max-document", options.maximumDocument,
                    "The largest XML document that is read, such as 64M (16M unless it is given)")
        ->transform(CLI::AsSizeValue(false))
        ->type_name("SIZE");
    command
        .add_option("--max-pixels", options.maximumPixels,
                    "The largest picture that is read, such as 256M (64M unless it is given)")
        ->transform(CLI::AsSizeValue(false))
        ->type_name("NUMBER");
}

void setUpLibrary(const std::string& assetRoot, const LibraryOptions& options) {
    values()["assetLocation"] = assetRoot;
    values()["log"] = options.logRules;
    pells::Log::setFileName(options.logFile);
    if (options.logFile.empty() && !options.logRules.empty()) {
        // To the end of the process, where the library writes the last lines.
        static pells::NoDestructor<StandardErrorLog> log;
        pells::platform::setDebuggerSink(&*log);
    }
    pells::InTag::setMaximumDocumentSize(options.maximumDocument);
    pells::XMLTokenizer::setMaximumTokenSize(
        static_cast<std::size_t>(std::min<std::uint64_t>(options.maximumDocument / 16, SIZE_MAX)));
    pells::TGAFileLoader::setMaximumPixels(options.maximumPixels);
}

}  // namespace pells_tool
