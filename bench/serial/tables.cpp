#include "bench/serial/tables.h"

#include "pells/core/factory.h"
#include "pells/serial/member_field.h"
#include "pells/serial/object_handlers.h"

namespace bench {

namespace {

const pells::SerializableFactory<FileLoader> fileLoaders("FileLoader");
const pells::SerializableFactory<ArchiveLoader> archiveLoaders("ArchiveLoader");

template <class EntryOf, class FileLoaderOf, class ArchiveLoaderOf, class TableOf>
void fillTable(TableOf& table, std::int64_t entries) {
    table.imageEntries.resize(static_cast<std::size_t>(entries));
    std::int64_t number = 1000000;
    for (EntryOf& entry : table.imageEntries) {
        entry.name = "picture " + std::to_string(number++);
        entry.getters.emplace_back(new FileLoaderOf);
        entry.getters.back()->file = "Textures/" + entry.name + ".tga";
        entry.getters.emplace_back(new ArchiveLoaderOf);
        entry.getters.back()->file = "Data/" + entry.name + ".pell";
    }
}

template <class TableOf>
std::string contentsOf(const TableOf& table) {
    std::string all;
    for (const auto& entry : table.imageEntries) {
        all += entry.name + '\n';
        for (const auto& loader : entry.getters)
            all += (loader->loaderClass() == LoaderClass::FILE ? "file " : "archive ") +
                   loader->file + '\n';
    }
    return all;
}

}  // namespace

boost::intrusive_ptr<pells::Field> Loader::getField(const std::string& element) {
    return pells::makeComposite(element, pells::ClassDesc(Serializable::getField("super"),
                                                          pells::makeField("text", &Loader::file)));
}

boost::intrusive_ptr<pells::Field> Entry::getField(const std::string& element) {
    return pells::makeComposite(
        element,
        pells::ClassDesc(Serializable::getField("super"), pells::makeField("name", &Entry::name),
                         pells::makeField("getters", &Entry::getters)));
}

boost::intrusive_ptr<pells::Field> Table::getField(const std::string& element) {
    return pells::makeComposite(
        element, pells::ClassDesc(Serializable::getField("super"),
                                  pells::makeField("imageEntries", &Table::imageEntries)));
}

void fill(Table& table, std::int64_t entries) {
    fillTable<Entry, FileLoader, ArchiveLoader>(table, entries);
}

void fill(PlainTable& table, std::int64_t entries) {
    fillTable<PlainEntry, PlainFileLoader, PlainArchiveLoader>(table, entries);
}

std::string contents(const Table& table) {
    return contentsOf(table);
}

std::string contents(const PlainTable& table) {
    return contentsOf(table);
}

}  // namespace bench
