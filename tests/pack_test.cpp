// What happens to files while they are packed and written: swapped for links and pipes, changed in
// length, taken away; and what signals leave behind.

#include <fcntl.h>
#include <signal.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <boost/filesystem/operations.hpp>
#include <functional>
#include <set>

#include "pells/asset/pell_archive.h"
#include "pells/kit/file/atomic_file.h"
#include "support/test_prefs.h"
#include "support/thrown.h"
#include "tools/archive_writer.h"
#include "tools/folder_files.h"

namespace {

namespace fs = boost::filesystem;
using namespace pells_test;
using pells::ArchiveWriter;
using pells::kit::AtomicFile;
using pells::kit::FileError;

class Packing : public LibraryTest {
protected:
    /// A process that does something again and again until this dies.
    class Meanwhile {
    public:
        explicit Meanwhile(const std::function<void()>& work) : child(fork()) {
            while (child == 0)
                work();
        }
        ~Meanwhile() {
            kill(child, SIGKILL);
            waitpid(child, nullptr, 0);
        }

    private:
        const pid_t child;
    };

    /// Packs the folder "in"; returns the bytes of all members, or why it failed.
    static std::string pack() {
        std::string failure = thrown<std::runtime_error>([] {
            ArchiveWriter writer("out.pell");
            writer.addFolder("in");
            writer.finish();
        });
        if (!failure.empty())
            return failure;
        std::string bytes;
        pells::pellistream archive("out.pell");
        for (const std::string& name : archive) {
            archive.open(name);
            bytes += readAll(archive);
        }
        return bytes;
    }
};

TEST_F(Packing, NeverReadsWhatIsSwappedInFromOutside) {
    scratch.write("outside/file", "secret");
    scratch.write("in/sub/file", "inside");
    for (const char* const victim : {"in/sub/file", "in/sub"}) {
        const std::string aside = std::string(victim) + ".aside";
        const Meanwhile swapping([&] {
            rename(victim, aside.c_str());
            const bool isFolder = std::string(victim) == "in/sub";
            if (isFolder || mkfifo(victim, 0600) == 0)
                unlink(victim);
            static_cast<void>(symlink(isFolder ? "../outside" : "../../outside/file", victim));
            unlink(victim);
            rename(aside.c_str(), victim);
        });
        std::set<std::string> outcomes;
        for (int round = 0; round < 300; ++round) {
            const std::string outcome = pack();
            EXPECT_EQ(outcome.find("secret"), std::string::npos);
            outcomes.insert(outcome);
        }
        EXPECT_GT(outcomes.size(), 1u) << "nothing was swapped";
    }
}

TEST_F(Packing, RefusesAFileThatChangesItsLength) {
    const std::string path = scratch.write("log", std::string(100, 'x'));
    for (const off_t length : {101, 99, 0}) {
        ASSERT_EQ(truncate(path.c_str(), 100), 0);
        pells::SourceFile file(path);
        ASSERT_EQ(truncate(path.c_str(), length), 0);
        char piece[1000];
        EXPECT_EQ(thrown<FileError>([&] {
                      while (file.read(piece, sizeof piece) != 0) {
                      }
                  }),
                  path + ": It changed while it was read");
    }
    ASSERT_EQ(mkfifo("pipe", 0600), 0);
    EXPECT_EQ(thrown<FileError>([] { pells::SourceFile("pipe"); }), "pipe: Not a regular file");
    EXPECT_EQ(thrown<FileError>([] { pells::SourceFile("."); }), ".: Is a directory");
}

TEST_F(Packing, LeavesOutTemporaryFilesAndNamesWhatItCannotRead) {
    scratch.write("in/a/b/unreadable", "x");
    scratch.write("in/a/.pells-0123-89ab-cdef.tmp", "of another process");
    for (const char* const honest : {".pells-0123-89ab-cdeg.tmp", ".pells-0123-89ab-cdef.tmp2",
                                     ".pells-0123-89AB-cdef.tmp", ".pells-012-389ab-cdef.tmp"}) {
        EXPECT_FALSE(AtomicFile::isTemporaryName(honest)) << honest;
        scratch.write(std::string("in/") + honest, "y");
    }
    EXPECT_EQ(pack(), "yyyyx");
    ASSERT_EQ(chmod("in/a/b/unreadable", 0), 0);
    ASSERT_EQ(chmod(".", 0777), 0);
    // No file can be closed to root.
    ASSERT_TRUE(geteuid() != 0 || seteuid(65534) == 0);
    EXPECT_EQ(pack(), "in/a/b/unreadable: Permission denied");
    ASSERT_EQ(seteuid(getuid()), 0);
    ASSERT_EQ(chmod("in/a/b", 0), 0);
    ASSERT_TRUE(geteuid() != 0 || seteuid(65534) == 0);
    EXPECT_EQ(pack(), "in/a/b: Permission denied");
    ASSERT_EQ(seteuid(getuid()), 0);
    chmod("in/a/b", 0700);
}

unsigned modeOf(const std::string& path) {
    struct stat status;
    EXPECT_EQ(stat(path.c_str(), &status), 0) << path;
    return status.st_mode & 07777;
}

TEST_F(Packing, ReplacesAFileWithoutShowingItToAnybodyElse) {
    umask(022);
    scratch.write("old", "old");
    for (const unsigned mode : {0600U, 0640U, 0444U, 0755U}) {
        ASSERT_EQ(chmod("old", mode), 0);
        AtomicFile file("old");
        file.write("new", 3);
        for (const std::string& name : files()) {
            if (AtomicFile::isTemporaryName(name)) {
                EXPECT_EQ(modeOf(name), 0600U);
            }
        }
        file.commit();
        EXPECT_EQ(modeOf("old"), mode);
    }
    AtomicFile("fresh").commit();
    EXPECT_EQ(modeOf("fresh"), 0644U);
    EXPECT_EQ(files(), (Lines{"fresh", "old"}));
}

TEST_F(Packing, PutsAFileWhereItWasToGoOrNowhere) {
    fs::create_directory("here");
    fs::create_directory("elsewhere");
    fs::current_path("here");
    {
        AtomicFile file("name");
        fs::current_path("../elsewhere");
        file.write("x", 1);
        file.commit();
    }
    fs::current_path("..");
    EXPECT_EQ(readFile("here/name"), "x");
    EXPECT_TRUE(fs::is_empty("elsewhere"));

    AtomicFile blocked("taken");
    fs::create_directory("taken");
    EXPECT_EQ(thrown<FileError>([&] { blocked.commit(); }), "taken: Not a regular file");
    EXPECT_EQ(files(), (Lines{"elsewhere", "here", "taken"}));
}

TEST_F(Packing, LeavesNothingBehindWhateverSignalEndsTheProcess) {
    scratch.write("in/file", noise(200000));
    for (int round = 0; round < 160; ++round) {
        const int signals[] = {SIGTERM, SIGINT,  SIGHUP,  SIGQUIT,
                               SIGALRM, SIGUSR1, SIGXCPU, SIGRTMIN};
        const int number = signals[round % 8];
        const pid_t child = fork();
        if (child == 0) {
            execl(PELLS_TOOL, "pells", "pack", "-o", "out.pell", "in", nullptr);
            _exit(99);
        }
        usleep(static_cast<useconds_t>(round * 100));
        kill(child, number);
        int status = 0;
        waitpid(child, &status, 0);
        EXPECT_TRUE(WIFEXITED(status) ? WEXITSTATUS(status) == 0 : WTERMSIG(status) == number);
        fs::remove("out.pell");
        ASSERT_EQ(files(), Lines{"in"}) << "signal " << number << " in round " << round;
    }
}

}  // namespace
