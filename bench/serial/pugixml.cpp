#include <pugixml.hpp>
#include <stdexcept>
#include <string_view>

#include "bench/serial/contestants.h"

namespace bench {

namespace {

std::unique_ptr<PlainLoader> makeLoader(std::string_view name) {
    if (name == "FileLoader")
        return std::make_unique<PlainFileLoader>();
    if (name == "ArchiveLoader")
        return std::make_unique<PlainArchiveLoader>();
    throw std::runtime_error("an unknown loader");
}

}  // namespace

void loadByPugixml(PlainTable& table, std::istream& in) {
    pugi::xml_document document;
    if (!document.load(in))
        throw std::runtime_error("pugixml refuses the document");
    for (const pugi::xml_node element : document.child("imagedefs").child("imageEntries")) {
        PlainEntry& entry = table.imageEntries.emplace_back();
        entry.name = element.child_value("name");
        for (const pugi::xml_node getter : element.child("getters")) {
            entry.getters.push_back(makeLoader(getter.attribute("class").value()));
            entry.getters.back()->file = getter.child_value("text");
        }
    }
}

}  // namespace bench
