// The host knows nothing of the library: it comes and goes with the plug-ins that use it.

#include <dlfcn.h>
#include <gtest/gtest.h>
#include <link.h>
#include <malloc.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdlib>
#include <cstring>
#include <fstream>
#include <utility>
#include <vector>

#include "unload/plugin.h"

namespace {

class Plugin {
public:
    explicit Plugin(const char* path) : handle(dlopen(path, RTLD_NOW | RTLD_LOCAL)) {
        if (!handle) {
            ADD_FAILURE() << dlerror();
            std::abort();
        }
        interface = reinterpret_cast<PluginEntry*>(dlsym(handle, "pluginEntry"))();
    }
    Plugin(const Plugin&) = delete;
    Plugin& operator=(const Plugin&) = delete;
    ~Plugin() { dlclose(handle); }

    const PluginInterface* operator->() const { return interface; }

private:
    void* handle;
    const PluginInterface* interface;
};

bool libraryIsLoaded() {
    const auto isLibrary = [](dl_phdr_info* info, std::size_t, void*) {
        return std::strstr(info->dlpi_name, "libpells") ? 1 : 0;
    };
    return dl_iterate_phdr(isLibrary, nullptr) != 0;
}

class UnloadTest : public ::testing::Test {
protected:
    UnloadTest() {
        char name[] = "/tmp/pells-unload-XXXXXX";
        folder = mkdtemp(name);
        EXPECT_EQ(chdir(folder.c_str()), 0);
    }
    ~UnloadTest() override {
        unlink("pells.log");
        EXPECT_EQ(chdir("/"), 0);
        EXPECT_EQ(rmdir(folder.c_str()), 0);
    }

    static std::vector<std::string> logLines() {
        std::vector<std::string> lines;
        std::ifstream in("pells.log");
        for (std::string line; std::getline(in, line);)
            lines.push_back(line);
        lines.erase(lines.begin(), lines.begin() + (lines.size() < 3 ? 0 : 3));
        return lines;
    }

    /// The log of work() when the library ends with the log still alive.
    static void expectFarewell() {
        const std::vector<std::string> lines = logLines();
        ASSERT_GE(lines.size(), 9u);
        const std::vector<std::string> begin(lines.begin(), lines.begin() + 6);
        EXPECT_EQ(begin, (std::vector<std::string>{
                             "app: at work", "time.summary: Category      uS    (%)",
                             "time.summary:   draw    1000 ( 25%)",
                             "time.summary: parser    3000 ( 75%)", "time.summary:  Total    4000",
                             "log.dumptags: available log message tags:"}));
        EXPECT_EQ(lines.back(), "log.dumptags: -- end of log tags --");
    }

    static void work(const Plugin& plugin) {
        plugin->setRules("app time.summary log.dumptags");
        plugin->log("at work");
        plugin->charge("parser", 3000);
        plugin->charge("draw", 1000);
    }

    std::string folder;
};

TEST_F(UnloadTest, WritesTheSummaryThenTheTagsAndIsGone) {
    for (int round = 0; round < 3; ++round) {
        {
            const Plugin plugin(PLUGIN_A);
            work(plugin);
            EXPECT_TRUE(libraryIsLoaded());
        }
        EXPECT_FALSE(libraryIsLoaded());
        expectFarewell();
    }
}

TEST_F(UnloadTest, SaysNothingWithoutALog) {
    { const Plugin plugin(PLUGIN_A); }
    EXPECT_NE(access("pells.log", F_OK), 0);
    {
        const Plugin plugin(PLUGIN_A);
        work(plugin);
        plugin->freeSingletons();
    }
    EXPECT_FALSE(libraryIsLoaded());
    EXPECT_EQ(logLines(), std::vector<std::string>{"app: at work"});
}

TEST_F(UnloadTest, SaysTheSameWhenTheProcessExits) {
    const pid_t child = fork();
    if (child == 0) {
        static const Plugin* const plugin = new Plugin(PLUGIN_A);
        work(*plugin);
        std::exit(0);
    }
    int status = -1;
    waitpid(child, &status, 0);
    EXPECT_EQ(status, 0);
    expectFarewell();
}

TEST_F(UnloadTest, KeepsNoMemoryOnceTheSingletonsAreFreed) {
    const auto bytesAfter = [](int rounds) {
        for (int round = 0; round < rounds; ++round) {
            const Plugin plugin(PLUGIN_A);
            plugin->setRules("app");
            plugin->log("at work");
            plugin->freeSingletons();
        }
        return static_cast<long>(mallinfo2().uordblks);
    };
    // The dynamic linker and the heap itself take some memory at first.
    const long before = bytesAfter(50);
    EXPECT_LT(bytesAfter(50) - before, 1000);
}

TEST_F(UnloadTest, LeavesTwoPluginsOneOfEverything) {
    for (const bool reversed : {false, true}) {
        const Plugin first(reversed ? PLUGIN_B : PLUGIN_A);
        first->setRules("app");
        first->log("first");
        const Plugin second(reversed ? PLUGIN_A : PLUGIN_B);
        second->log("second");
        for (int i = 0; first->sharedObjects()[i]; ++i)
            EXPECT_EQ(first->sharedObjects()[i], second->sharedObjects()[i]) << i;
        EXPECT_TRUE(second->catchesNotFound(first->throwNotFound));
        EXPECT_TRUE(first->catchesNotFound(second->throwNotFound));
        second->freeSingletons();
        EXPECT_EQ(logLines(), (std::vector<std::string>{"app: first", "app: second"}));
    }
}

}  // namespace
