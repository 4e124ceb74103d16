#pragma once

#include <boost/filesystem/operations.hpp>
#include <ctime>
#include <string>

#include "pells/asset/asset_manager.h"
#include "support/archive_bytes.h"
#include "support/test_prefs.h"

namespace pells_test {

/// Runs a test with an asset root of its own, the folder "root" in the current directory.
class AssetRootTest : public LibraryTest {
protected:
    AssetRootTest() {
        boost::filesystem::create_directory("root");
        prefs()["assetLocation"] = "root";
    }

    /// Writes a file below the root, with a write time of its own if one is given.
    void write(const std::string& name, const std::string& bytes, std::time_t written = 0) const {
        const std::string path = scratch.write("root/" + name, bytes);
        if (written != 0)
            boost::filesystem::last_write_time(path, written);
    }

    void writeArchive(const std::string& name, const Members& members,
                      std::time_t written = 0) const {
        write(name, archiveOf(members), written);
    }

    static pells::AssetManager& manager() { return pells::AssetManager::instance(); }

    /// The bytes of an asset, or "(null)".
    static std::string read(const std::string& name) {
        const auto container = manager().getFileStream(name, true);
        return container ? readAll(container->getStream()) : "(null)";
    }
};

}  // namespace pells_test
