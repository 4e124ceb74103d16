#include "bench/support/bench.h"

#include <boost/filesystem.hpp>
#include <cstring>
#include <map>
#include <memory>
#include <utility>

#include "pells/core/factory.h"
#include "pells/core/prefs.h"

namespace fs = boost::filesystem;

namespace {

bool once = false;

/// Preferences that a benchmark may set before the log is made; without them everything is off.
class BenchPrefs : public pells::Prefs {
public:
    std::string getString(const std::string& key) override { return values()[key]; }

    static std::map<std::string, std::string>& values() {
        static std::map<std::string, std::string> all;
        return all;
    }
};

/// The folder that the program runs in, so that its log lies there, too.
class ScratchFolder {
public:
    ScratchFolder() : folder(fs::temp_directory_path() / fs::unique_path("pells-bench-%%%%%%%%")) {
        fs::create_directory(folder);
        fs::current_path(folder);
    }
    ScratchFolder(const ScratchFolder&) = delete;
    ScratchFolder& operator=(const ScratchFolder&) = delete;
    ~ScratchFolder() {
        boost::system::error_code ignored;
        fs::current_path("/", ignored);
        fs::remove_all(folder, ignored);
    }

    std::string path() const { return folder.string(); }

private:
    fs::path folder;
};

std::unique_ptr<ScratchFolder> scratchFolder;

/// Takes the flag --once out of the arguments.
void readOnceFlag(int& argc, char** argv) {
    int kept = 0;
    for (int i = 0; i < argc; ++i) {
        if (std::strcmp(argv[i], "--once") == 0)
            once = true;
        else
            argv[kept++] = argv[i];
    }
    argc = kept;
}

}  // namespace

namespace bench {

void add(const std::string& work, std::int64_t size, const std::string& contestant, Job job) {
    const std::string name = work + '/' + std::to_string(size) + '/' + contestant;
    auto* const benchmark = benchmark::RegisterBenchmark(name.c_str(), std::move(job));
    if (once)
        benchmark->Iterations(1);
}

std::vector<std::int64_t> sizes(const std::vector<std::int64_t>& all) {
    return once ? std::vector<std::int64_t>(all.begin(), all.begin() + 1) : all;
}

std::string scratch() {
    return scratchFolder->path();
}

void setPreference(const std::string& key, const std::string& value) {
    BenchPrefs::values()[key] = value;
}

}  // namespace bench

int main(int argc, char** argv) {
    static pells::Factory<pells::Prefs, BenchPrefs> prefsFactory("Prefs");
    readOnceFlag(argc, argv);
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv))
        return 2;
    scratchFolder = std::make_unique<ScratchFolder>();
    addBenchmarks();
    benchmark::RunSpecifiedBenchmarks();
    benchmark::Shutdown();
    scratchFolder.reset();
    return 0;
}
