#include "bench/archive_sources.h"

#include <minizip/unzip.h>
#include <physfs.h>
#include <zip.h>

#include <algorithm>
#include <stdexcept>
#include <unordered_map>

#include "pells/asset/pell_archive.h"

namespace bench {

namespace {

void require(bool good, const std::string& path) {
    if (!good)
        throw std::runtime_error("cannot open " + path);
}

class PellSource : public ArchiveSource {
public:
    explicit PellSource(const std::string& path) : archive(path) {}

    bool select(const std::string& name) override { return archive.open(name); }

    std::size_t read(char* into, std::size_t room) override {
        archive.read(into, static_cast<std::streamsize>(room));
        return static_cast<std::size_t>(archive.gcount());
    }

private:
    pells::pellistream archive;
};

class LibzipSource : public ArchiveSource {
public:
    explicit LibzipSource(const std::string& path)
        : archive(zip_open(path.c_str(), ZIP_RDONLY, nullptr), &zip_discard),
          member(nullptr, &zip_fclose) {
        require(archive != nullptr, path);
    }

    bool select(const std::string& name) override {
        member.reset(zip_fopen(archive.get(), name.c_str(), 0));
        return member != nullptr;
    }

    std::size_t read(char* into, std::size_t room) override {
        return static_cast<std::size_t>(
            std::max<zip_int64_t>(0, zip_fread(member.get(), into, room)));
    }

private:
    std::unique_ptr<zip_t, void (*)(zip_t*)> archive;
    std::unique_ptr<zip_file_t, int (*)(zip_file_t*)> member;
};

/// With a map of the members' positions, since the library itself looks for a name from the start.
class MinizipSource : public ArchiveSource {
public:
    explicit MinizipSource(const std::string& path) : archive(unzOpen64(path.c_str()), &unzClose) {
        require(archive != nullptr, path);
        char name[256];
        for (int result = unzGoToFirstFile(archive.get()); result == UNZ_OK;
             result = unzGoToNextFile(archive.get())) {
            unzGetCurrentFileInfo64(archive.get(), nullptr, name, sizeof name, nullptr, 0, nullptr,
                                    0);
            unzGetFilePos64(archive.get(), &positions[name]);
        }
    }

    bool select(const std::string& name) override {
        const auto found = positions.find(name);
        if (found == positions.end())
            return false;
        unzCloseCurrentFile(archive.get());
        return unzGoToFilePos64(archive.get(), &found->second) == UNZ_OK &&
               unzOpenCurrentFile(archive.get()) == UNZ_OK;
    }

    std::size_t read(char* into, std::size_t room) override {
        const int got = unzReadCurrentFile(archive.get(), into, static_cast<unsigned>(room));
        return static_cast<std::size_t>(std::max(0, got));
    }

private:
    std::unique_ptr<void, int (*)(unzFile)> archive;
    std::unordered_map<std::string, unz64_file_pos> positions;
};

class PhysicsFsSource : public ArchiveSource {
public:
    explicit PhysicsFsSource(const std::string& path)
        : mounted(path), member(nullptr, &PHYSFS_close) {
        if (!PHYSFS_isInit())
            PHYSFS_init(nullptr);
        require(PHYSFS_mount(path.c_str(), nullptr, 1) != 0, path);
    }
    PhysicsFsSource(const PhysicsFsSource&) = delete;
    PhysicsFsSource& operator=(const PhysicsFsSource&) = delete;
    ~PhysicsFsSource() override {
        member.reset();
        PHYSFS_unmount(mounted.c_str());
    }

    bool select(const std::string& name) override {
        member.reset(PHYSFS_openRead(name.c_str()));
        return member != nullptr;
    }

    std::size_t read(char* into, std::size_t room) override {
        const PHYSFS_sint64 got = PHYSFS_readBytes(member.get(), into, room);
        return static_cast<std::size_t>(std::max<PHYSFS_sint64>(0, got));
    }

private:
    std::string mounted;
    std::unique_ptr<PHYSFS_File, int (*)(PHYSFS_File*)> member;
};

template <class Source>
std::unique_ptr<ArchiveSource> openAs(const std::string& path) {
    return std::make_unique<Source>(path);
}

}  // namespace

const std::vector<ArchiveReader>& archiveReaders() {
    static const std::vector<ArchiveReader> readers = {
        {"pells", false, &openAs<PellSource>},
        {"libzip", true, &openAs<LibzipSource>},
        {"minizip", true, &openAs<MinizipSource>},
        {"PhysicsFS", true, &openAs<PhysicsFsSource>},
    };
    return readers;
}

std::size_t readMember(ArchiveSource& source, const std::string& name, std::size_t piece,
                       std::vector<char>& into) {
    if (!source.select(name))
        return 0;
    std::size_t done = 0;
    while (const std::size_t got =
               source.read(into.data() + done, std::min(piece, into.size() - done)))
        done += got;
    return done;
}

}  // namespace bench
