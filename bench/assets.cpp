// The asset manager: scanning a root of archives, and finding, opening and listing assets.

#include "pells/asset/asset_manager.h"

#include <physfs.h>

#include <algorithm>
#include <boost/filesystem.hpp>
#include <map>
#include <memory>
#include <random>

#include "bench/archive_files.h"
#include "bench/archive_sources.h"
#include "bench/support/bench.h"

namespace {

using bench::ArchiveReader;
using bench::ArchiveSource;
using bench::Content;
using bench::Member;

/// A folder of archives, the asset root for the library, whose members all hold the same.
class Root {
public:
    Root(std::int64_t archiveCount, std::int64_t membersEach, std::size_t memberSize)
        : archives(static_cast<std::size_t>(archiveCount)),
          members(static_cast<std::size_t>(membersEach)),
          content(bench::textBytes(memberSize)) {}

    /// The paths of the archives for a reader; written when the first one asks.
    const std::vector<std::string>& pathsFor(const ArchiveReader& reader) {
        std::vector<std::string>& paths = reader.readsZip ? zips : pells;
        for (std::size_t i = paths.size(); i < archives; ++i) {
            const std::string name = folder() + '/' + topFolder(i);
            paths.push_back(name + (reader.readsZip ? ".zip" : ".asset"));
            (reader.readsZip ? bench::writeZip : bench::writePell)(paths.back(), membersOf(i));
        }
        return paths;
    }

    /// Makes the asset manager anew on the archives.
    void scan() {
        pathsFor(bench::archiveReaders().front());
        bench::setPreference("assetLocation", folder());
        closeManager();
        pells::AssetManager::instance();
    }

    /// The names of all members, but those that declare aliases, in an order that is no archive's.
    std::vector<std::string> shuffledNames() const {
        std::vector<std::string> all;
        for (std::size_t i = 0; i < archives; ++i) {
            const std::vector<std::string> names = bench::memberNames(members, topFolder(i));
            all.insert(all.end(), names.begin(), names.end());
        }
        std::shuffle(all.begin(), all.end(), std::minstd_rand(6));
        return all;
    }

    static void closeManager() {
        if (pells::AssetManager::singleton)
            pells::AssetManager::singleton->deleteSelf();
    }

private:
    /// The names go on from archive to archive, three levels deep.
    static std::string topFolder(std::size_t archive) { return "pack" + std::to_string(archive); }

    std::string folder() const {
        const std::string path =
            bench::scratch() + "/root" + std::to_string(archives) + 'x' + std::to_string(members);
        boost::filesystem::create_directory(path);
        return path;
    }

    /// A second name for a folder of the archive and for one file in it.
    std::vector<Member> membersOf(std::size_t archive) const {
        const std::string top = topFolder(archive);
        std::vector<Member> all = {{top + "/.symlinks", &folderLink},
                                   {top + "/set00000/.symlinks", &fileLink}};
        const auto rest = bench::membersOf(bench::memberNames(members, top), content);
        all.insert(all.end(), rest.begin(), rest.end());
        return all;
    }

    std::size_t archives;
    std::size_t members;
    Content content;
    Content folderLink{"walls>set00000\n"};
    Content fileLink{"oak.tga>wall00.tga\n"};
    std::vector<std::string> pells;
    std::vector<std::string> zips;
};

void addOpening(std::int64_t archives, std::int64_t members) {
    const std::string work = "open root/archives of " + std::to_string(members) + " members";
    const auto root = std::make_shared<Root>(archives, members, 0);
    bench::add(work, archives, "pells", [=](benchmark::State& state) {
        root->scan();
        if (!pells::AssetManager::instance().getFileStream("pack0/walls/oak.tga", true))
            state.SkipWithError("an alias is missing");
        for (auto _ : state) {
            state.PauseTiming();
            Root::closeManager();
            state.ResumeTiming();
            pells::AssetManager::instance();
        }
        Root::closeManager();
    });
    for (const ArchiveReader& reader : bench::archiveReaders()) {
        if (reader.contestant != "libzip" &&
            (reader.contestant != "PhysicsFS" || archives * members > 20000))
            continue;
        bench::add(work, archives, reader.contestant, [=, &reader](benchmark::State& state) {
            std::vector<std::unique_ptr<ArchiveSource>> sources;
            for (auto _ : state) {
                state.PauseTiming();
                sources.clear();
                state.ResumeTiming();
                for (const std::string& path : root->pathsFor(reader))
                    sources.push_back(reader.open(path));
            }
        });
    }
}

const ArchiveReader& readerNamed(const std::string& contestant) {
    const auto& readers = bench::archiveReaders();
    return *std::find_if(readers.begin(), readers.end(), [&](const ArchiveReader& reader) {
        return reader.contestant == contestant;
    });
}

/// A hundred thousand names in ten archives, opened once for each contestant that asks.
class LargeRoot {
public:
    LargeRoot() : root(10, 10000, 1024), names(root.shuffledNames()) {}

    pells::AssetManager& manager() {
        if (!pells::AssetManager::singleton)
            root.scan();
        return pells::AssetManager::instance();
    }

    /// Sources that find the members of all the archives.
    std::vector<std::unique_ptr<ArchiveSource>>& sourcesOf(const std::string& contestant) {
        auto& opened = sources[contestant];
        if (opened.empty()) {
            const ArchiveReader& reader = readerNamed(contestant);
            for (const std::string& path : root.pathsFor(reader))
                opened.push_back(reader.open(path));
        }
        return opened;
    }

    const std::vector<std::string>& shuffledNames() const { return names; }

private:
    Root root;
    std::vector<std::string> names;
    std::map<std::string, std::vector<std::unique_ptr<ArchiveSource>>> sources;
};

/// Registers a contestant that does something with so many names and says whether it worked.
template <class Prepare>
void addForNames(const std::string& work, std::int64_t asked, const std::string& contestant,
                 const std::shared_ptr<LargeRoot>& root, Prepare prepare) {
    bench::add(work, asked, contestant, [=](benchmark::State& state) {
        const auto visit = prepare();
        const auto first = root->shuffledNames().begin();
        const std::vector<std::string> names(first, first + asked);
        for (auto _ : state) {
            for (const std::string& name : names) {
                if (!visit(name))
                    state.SkipWithError("a name is not found");
            }
        }
    });
}

void addIsFile(const std::shared_ptr<LargeRoot>& root) {
    const std::string work = "is file/among 100000";
    addForNames(work, 10000, "pells", root, [=] {
        return
            [&manager = root->manager()](const std::string& name) { return manager.isFile(name); };
    });
    addForNames(work, 10000, "std::map", root, [=] {
        std::map<std::string, std::shared_ptr<int>> all;
        for (const std::string& name : root->shuffledNames())
            all.emplace(name, nullptr);
        return
            [all = std::move(all)](const std::string& name) { return all.find(name) != all.end(); };
    });
    addForNames(work, 10000, "PhysicsFS", root, [=] {
        root->sourcesOf("PhysicsFS");
        return [](const std::string& name) { return PHYSFS_exists(name.c_str()) != 0; };
    });
}

void addReading(const std::shared_ptr<LargeRoot>& root) {
    const std::string work = "open and read 100 bytes/among 100000";
    const std::size_t wanted = 100;
    addForNames(work, 10000, "pells", root, [=] {
        return [=, &manager = root->manager()](const std::string& name) {
            char bytes[wanted];
            const auto container = manager.getFileStream(name, true);
            return container && container->getStream().read(bytes, sizeof bytes);
        };
    });
    for (const std::string contestant : {"libzip", "PhysicsFS"}) {
        addForNames(work, 10000, contestant, root, [=] {
            return [=, &sources = root->sourcesOf(contestant)](const std::string& name) {
                char bytes[wanted];
                // PhysicsFS looks into all of them; for libzip the name tells which one it is.
                const std::size_t archive = contestant == "libzip" ? std::stoul(name.substr(4)) : 0;
                return sources[archive]->select(name) &&
                       sources[archive]->read(bytes, sizeof bytes) == sizeof bytes;
            };
        });
    }
}

void addListing(const std::shared_ptr<LargeRoot>& root) {
    const auto folderOf = [](const std::string& name) { return name.substr(0, name.rfind('/')); };
    addForNames("list folder/of 100", 100, "pells", root, [=] {
        return [=, &manager = root->manager()](const std::string& name) {
            return manager.listfiles(folderOf(name), false).size() >= 100;
        };
    });
    addForNames("list folder/of 100", 100, "PhysicsFS", root, [=] {
        root->sourcesOf("PhysicsFS");
        return [=](const std::string& name) {
            char** const files = PHYSFS_enumerateFiles(folderOf(name).c_str());
            const std::vector<std::string> names(files, std::find(files, files + 100, nullptr));
            PHYSFS_freeList(files);
            return names.size() == 100;
        };
    });
}

}  // namespace

void addBenchmarks() {
    for (const std::int64_t members : bench::sizes({1000, 10000})) {
        for (const std::int64_t archives : bench::sizes({1, 10, 100}))
            addOpening(archives, members);
    }
    const auto root = std::make_shared<LargeRoot>();
    addIsFile(root);
    addReading(root);
    addListing(root);
}
