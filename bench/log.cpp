// Log lines that are off, on, and on disk one by one, against a logging library and plain
// fprintf().

#include <fcntl.h>
#include <spdlog/sinks/basic_file_sink.h>
#include <spdlog/spdlog.h>
#include <unistd.h>

#include <cstdio>
#include <fstream>
#include <iterator>
#include <memory>
#include <string>
#include <vector>

#include "bench/support/bench.h"
#include "pells/log/log.h"

namespace {

const char peerFile[] = "peer.log";
const std::string part = "wheel";

double seconds(std::int64_t triangles) {
    return static_cast<double>(triangles) * 0.25;
}

/// Makes the library's log anew, with other rules.
void makeLog(const std::string& rules) {
    pells::SingletonList::freeSingletons();
    bench::setPreference("log", rules);
}

spdlog::logger makeLogger() {
    spdlog::logger logger("bench.on",
                          std::make_shared<spdlog::sinks::basic_file_sink_st>(peerFile, true));
    logger.set_pattern("%n: %v");
    return logger;
}

std::string line(std::int64_t triangles) {
    return fmt::format("bench.on: read {} with {} triangles in {} s\n", part, triangles,
                       seconds(triangles));
}

void checkLastLine(benchmark::State& state, const std::string& path, std::int64_t count) {
    const std::string expected = '\n' + line(count - 1);
    std::ifstream file(path);
    file.seekg(-static_cast<std::streamoff>(expected.size()), std::ios_base::end);
    const std::string last{std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
    if (last != expected)
        state.SkipWithError(("the file ends with" + last).c_str());
}

void addOff(std::int64_t count) {
    bench::add("log/off", count, "pells", [count](benchmark::State& state) {
        makeLog("bench.on");
        for (auto _ : state)
            for (std::int64_t i = 0; i < count; ++i) {
                PELLS_LOG("bench.off", "read " << part << " with " << i << " triangles in "
                                               << seconds(i) << " s");
                benchmark::ClobberMemory();
            }
    });
    bench::add("log/off", count, "spdlog", [count](benchmark::State& state) {
        spdlog::logger logger = makeLogger();
        logger.set_level(spdlog::level::off);
        for (auto _ : state)
            for (std::int64_t i = 0; i < count; ++i) {
                logger.info("read {} with {} triangles in {} s", part, i, seconds(i));
                benchmark::ClobberMemory();
            }
    });
}

void addLibrary(const std::string& work, std::int64_t count, const std::string& rules) {
    bench::add(work, count, "pells", [count, rules](benchmark::State& state) {
        makeLog(rules);
        for (auto _ : state)
            for (std::int64_t i = 0; i < count; ++i)
                PELLS_LOG("bench.on", "read " << part << " with " << i << " triangles in "
                                              << seconds(i) << " s");
        pells::Log::instance().close();
        checkLastLine(state, "pells.log", count);
    });
}

void addPeers(const std::string& work, std::int64_t count, bool flushed) {
    bench::add(work, count, "spdlog", [count, flushed](benchmark::State& state) {
        spdlog::logger logger = makeLogger();
        logger.flush_on(flushed ? spdlog::level::info : spdlog::level::off);
        for (auto _ : state)
            for (std::int64_t i = 0; i < count; ++i)
                logger.info("read {} with {} triangles in {} s", part, i, seconds(i));
        logger.flush();
        checkLastLine(state, peerFile, count);
    });
    bench::add(work, count, "fprintf", [count, flushed](benchmark::State& state) {
        std::FILE* const file = std::fopen(peerFile, "w");
        for (auto _ : state)
            for (std::int64_t i = 0; i < count; ++i) {
                std::fprintf(file, "%s: read %s with %lld triangles in %g s\n", "bench.on",
                             part.c_str(), static_cast<long long>(i), seconds(i));
                if (flushed)
                    std::fflush(file);
            }
        std::fclose(file);
        checkLastLine(state, peerFile, count);
    });
}

/// What closing the file after each line costs at least: three calls of the system for ready lines.
void addLimit(const std::string& work, std::int64_t count) {
    bench::add(work, count, "limit", [count](benchmark::State& state) {
        std::vector<std::string> lines;
        for (std::int64_t i = 0; i < count; ++i)
            lines.push_back(line(i));
        std::remove(peerFile);
        for (auto _ : state)
            for (const std::string& each : lines) {
                const int file = open(peerFile, O_WRONLY | O_CREAT | O_APPEND, 0666);
                if (write(file, each.data(), each.size()) < 0)
                    state.SkipWithError("a line could not be written");
                close(file);
            }
        checkLastLine(state, peerFile, count);
    });
}

}  // namespace

void addBenchmarks() {
    for (const std::int64_t count : bench::sizes({1000})) {
        addOff(count);
        addLibrary("log/on", count, "bench.on");
        addPeers("log/on", count, false);
        addLibrary("log/flushed", count, "bench.on log.flush");
        addPeers("log/flushed", count, true);
        addLimit("log/flushed", count);
    }
}
