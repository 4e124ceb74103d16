#pragma once

#include <boost/smart_ptr/intrusive_ptr.hpp>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "pells/core/smart_base.h"
#include "pells/serial/serializable.h"

/// \file
/// The same data as objects of the library and as plain ones for its peers: a table of pictures,
/// each with a name and loaders of two classes.

namespace bench {

/// What an object must come to whoever loads it: its class, which is enough to be told apart.
enum class LoaderClass { FILE, ARCHIVE };

// Objects of the library.

class Loader : public pells::smart_base, public pells::Serializable {
public:
    virtual LoaderClass loaderClass() const = 0;
    boost::intrusive_ptr<pells::Field> getField(const std::string& element) override;

    std::string file;
};

class FileLoader : public Loader {
public:
    LoaderClass loaderClass() const override { return LoaderClass::FILE; }
};

class ArchiveLoader : public Loader {
public:
    LoaderClass loaderClass() const override { return LoaderClass::ARCHIVE; }
};

class Entry : public pells::Serializable {
public:
    boost::intrusive_ptr<pells::Field> getField(const std::string& element) override;

    std::string name;
    std::vector<boost::intrusive_ptr<Loader>> getters;
};

class Table : public pells::Serializable {
public:
    boost::intrusive_ptr<pells::Field> getField(const std::string& element) override;

    std::vector<Entry> imageEntries;
};

// Plain objects.

struct PlainLoader {
    PlainLoader() = default;
    PlainLoader(const PlainLoader&) = delete;
    PlainLoader& operator=(const PlainLoader&) = delete;
    virtual ~PlainLoader() = default;
    virtual LoaderClass loaderClass() const = 0;

    std::string file;
};

struct PlainFileLoader : PlainLoader {
    LoaderClass loaderClass() const override { return LoaderClass::FILE; }
};

struct PlainArchiveLoader : PlainLoader {
    LoaderClass loaderClass() const override { return LoaderClass::ARCHIVE; }
};

struct PlainEntry {
    std::string name;
    std::vector<std::unique_ptr<PlainLoader>> getters;
};

struct PlainTable {
    std::vector<PlainEntry> imageEntries;
};

/// Fills an empty table of either kind with entries that are always the same.
void fill(Table& table, std::int64_t entries);
void fill(PlainTable& table, std::int64_t entries);

/// All that a table holds, as a text to compare tables by.
std::string contents(const Table& table);
std::string contents(const PlainTable& table);

}  // namespace bench
