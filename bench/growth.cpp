// What strangers may hand in to take more time than their bytes deserve. There are no peers: the
// report compares the cost of a unit at two sizes.

#include <malloc.h>

#include <boost/filesystem.hpp>
#include <boost/lexical_cast/bad_lexical_cast.hpp>
#include <chrono>
#include <climits>
#include <fstream>
#include <functional>
#include <sstream>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include "bench/support/bench.h"
#include "pells/asset/asset_manager.h"
#include "pells/asset/pell_archive.h"
#include "pells/core/version.h"
#include "pells/image/image_base.h"
#include "pells/image/image_loaders.h"
#include "pells/log/log.h"
#include "support/archive_bytes.h"
#include "support/documents.h"
#include "support/everything.h"
#include "support/tga_file.h"

namespace fs = boost::filesystem;

namespace {

typedef std::vector<std::pair<std::string, std::string>> Members;

/// Registers a work at some size and at sixteen times that size.
///
/// \param least   such that the larger size still fits the caches, where memory is what it fills.
/// \param prepare makes the input of a size and returns the function that is timed, which returns
///                whether the input came to the expected end.
template <class Prepare>
void addWork(const std::string& work, std::int64_t least, Prepare prepare) {
    for (const std::int64_t size : bench::sizes({least, 16 * least})) {
        bench::add(work, size, "pells", [work, size, prepare](benchmark::State& state) {
            auto read = prepare(size);
            for (auto _ : state) {
                if (!read())
                    state.SkipWithError((work + " ended in another way").c_str());
            }
        });
    }
}

/// A pattern so many times, with 0, 1, … in place of a "*".
std::string repeated(const std::string& pattern, std::int64_t times) {
    const std::size_t star = pattern.find('*');
    std::string all;
    for (std::int64_t i = 0; i < times; ++i) {
        all.append(pattern, 0, star);
        if (star != std::string::npos)
            all.append(std::to_string(i)).append(pattern, star + 1, std::string::npos);
    }
    return all;
}

/// A token that begins like this and goes on with its last character to the end of the input.
void addEndlessToken(const std::string& work, const std::string& head) {
    addWork("endless " + work, 100000, [head](std::int64_t size) {
        const std::string text = head + std::string(static_cast<std::size_t>(size), head.back());
        return [text] {
            std::istringstream in(text);
            pells::XMLTokenizer tokenizer(in);
            while (tokenizer.getToken().type != pells::XMLTokenizer::Token::T_EOF) {
            }
            return in.eof();
        };
    });
}

/// A document that repeats a pattern, loaded into an object with members of every kind.
void addDocument(const std::string& work, std::int64_t least, const std::string& head,
                 const std::string& pattern, const std::string& tail,
                 const std::string& failure = "") {
    addWork(work, least, [=](std::int64_t size) {
        const std::string text = head + repeated(pattern, size) + tail;
        return [text, failure] {
            pells_test::Everything object;
            return pells_test::failure(object, text) == failure;
        };
    });
}

void addDocuments() {
    addEndlessToken("text", "x");
    addEndlessToken("comment", "<!--x");
    addEndlessToken("white space", "<a ");
    addEndlessToken("entity", "&n");
    addEndlessToken("reference", "&#x0");
    addEndlessToken("attribute value", "<a b='x");
    addEndlessToken("element name", "<n");

    addDocument("attributes of one name", 500, "<root", " a='1'", "/>");
    addDocument("attributes of many names", 5000, "<root", " a*='1'", "/>");
    addDocument("nested unknown elements", 10000, "<root>", "<u>", "",
                "Malformed XML: premature EOF");
    addDocument("nested known elements", 10000, "<root>", "<child class='Everything'>", "",
                "Malformed XML: nested too deeply");
    addDocument("unknown names", 10000, "<root>", "<u*/>", "</root>");
    addWork("children of an unknown element with a long name", 10000, [](std::int64_t size) {
        const std::string name(static_cast<std::size_t>(size), 'n');
        const std::string text =
            "<root><" + name + '>' + repeated("<u></u>", size) + "</" + name + "><i>1</i></root>";
        return [text] {
            pells_test::Everything object;
            return pells_test::failure(object, text).empty() && object.i == 1;
        };
    });
    addDocument("one member again and again", 1000, "<root>", "<child class='Everything'/>",
                "</root>");
    addDocument("entries", 10000, "<root><words>", "<word>text *</word>", "</words></root>");
    addDocument("invalid steps", 1000, "<root><history><stack>",
                "<stackItem class='CountingStep'><label>*</label></stackItem>"
                "<stackItem class='CountingStep'><label>invalid</label></stackItem>",
                "</stack></history></root>");
    addDocument("steps", 1000, "<root><history><stack>",
                "<stackItem class='CountingStep'><label>*</label></stackItem>",
                "</stack></history></root>");
}

/// A history of so many steps, of which every second one is done and every fourth one is invalid.
pells::UndoRedoSequence historyOf(std::int64_t size) {
    pells::UndoRedoSequence history;
    for (std::int64_t i = 0; i < size; ++i) {
        const boost::intrusive_ptr<pells_test::CountingStep> step(new pells_test::CountingStep);
        step->label = i % 4 == 1 ? "invalid" : "";
        if (i < size / 2)
            history.addUndoable(step);
        else
            history.addRedoable(step);
    }
    return history;
}

/// Selects a step, or goes on until it does, by its place.
class CountDown : public pells::UndoRedoSequence::BatchMethod {
public:
    explicit CountDown(std::int64_t steps) : left(steps) {}
    bool operator()(boost::intrusive_ptr<pells::UndoableStep> /*step*/) const override {
        return --left == 0;
    }

private:
    mutable std::int64_t left;
};

void addHistories() {
    typedef pells::UndoRedoSequence History;
    const std::pair<const char*, bool (*)(History&, std::int64_t)> works[] = {
        {"saving a history",
         [](History& history, std::int64_t /*size*/) {
             return pells_test::saved(history).find("invalid") == std::string::npos;
         }},
        {"removing the last step",
         [](History& history, std::int64_t size) { return history.removeIf(CountDown(size)); }},
        {"visiting the last step",
         [](History& history, std::int64_t size) {
             return !history.applyToAll(CountDown(size), false);
         }},
        {"merging histories",
         [](History& history, std::int64_t size) {
             History taken = history;
             history.merge(&taken, pells::IdHandler());
             return history.getUndoStackSize() == size / 2 * 2;
         }},
        {"discarding undone steps", [](History& history, std::int64_t size) {
             history.addUndoable(history.getLast());
             return history.getUndoStackSize() == size / 2 + 1;
         }}};
    for (const auto& work : works) {
        addWork(work.first, 2000, [run = work.second](std::int64_t size) {
            return [run, size, original = historyOf(size)] {
                History history = original;
                return run(history, size);
            };
        });
    }
}

void addPictures() {
    for (const int depth : {8, 32}) {
        addWork("claimed picture/" + std::to_string(depth) + " bits", 4000,
                [depth](std::int64_t size) {
                    const std::string file = pells_test::tgaHeader(16384, 16384, depth) +
                                             std::string(static_cast<std::size_t>(size), 'x');
                    return [file] {
                        std::istringstream in(file);
                        pells::Image_base image(1, 1);
                        return !pells::TGAFileLoader::loadTarga(&image, in);
                    };
                });
    }
}

void writeFile(const std::string& path, const std::string& bytes) {
    fs::create_directories(fs::path(path).parent_path());
    std::ofstream(path, std::ios_base::binary) << bytes;
}

/// Loads a picture from an archive as often as that has members.
void addPicturesOfOneArchive() {
    addWork("pictures of one archive", 200, [](std::int64_t size) {
        const std::string path = bench::scratch() + "/pictures.pell";
        Members members = {{"tga", pells_test::tgaFile(1, 1, 24)}};
        for (std::int64_t i = 0; i < size; ++i)
            members.emplace_back("member " + std::to_string(i), "");
        writeFile(path, pells_test::archiveOf(members));
        // Files that were just written are not remembered.
        std::this_thread::sleep_for(std::chrono::seconds(4));
        return [path, size] {
            pells::Image_base image(1, 1);
            bool loaded = true;
            for (std::int64_t i = 0; i < size; ++i)
                loaded = pells::PellTGAFileLoader(path.c_str()).uploadImage(&image) && loaded;
            return loaded;
        };
    });
}

/// An archive that repeats an entry in its directory; all of its members are opened.
void addDirectory(const std::string& work, std::int64_t least, const std::string& entry) {
    addWork(work, least, [entry](std::int64_t size) {
        const std::string path = bench::scratch() + "/directory.pell";
        writeFile(path, pells_test::archiveWithDirectory(repeated(entry, size)));
        return [path] {
            pells::pellistream archive(path);
            for (const std::string& name : archive) {
                if (!archive.open(name))
                    return false;
            }
            return true;
        };
    });
}

void addArchives() {
    addDirectory("directory of empty names", 10000, "O15 L0 |\r\n");
    addDirectory("directory of large claims", 10000, "Offffffff Lffffffff |*\r\n");
    addWork("directory of one name", 100000, [](std::int64_t size) {
        const std::string path = bench::scratch() + "/name.pell";
        const std::string name(static_cast<std::size_t>(size), 'n');
        writeFile(path, pells_test::archiveWithDirectory("O15 L0 |" + name + "\r\n"));
        return [path, name] { return pells::pellistream(path).open(name); };
    });
    addWork("member that inflates a thousandfold", 1000000, [](std::int64_t size) {
        const std::string path = bench::scratch() + "/bomb.pell";
        const std::string content(static_cast<std::size_t>(size), '\0');
        writeFile(path, pells_test::archiveOf({{"bomb", content}}));
        return [path, size] {
            pells::pellistream archive(path);
            archive.open("bomb");
            return archive.ignore(size + 1).gcount() == size;
        };
    });
}

/// Makes the asset manager on a root that holds one archive.
void addAliases(const std::string& work, std::int64_t least,
                const std::function<Members(std::int64_t)>& membersOf) {
    addWork(work, least, [membersOf](std::int64_t size) {
        const std::string root = bench::scratch() + "/aliases";
        writeFile(root + "/a.asset", pells_test::archiveOf(membersOf(size)));
        return [root, size] {
            bench::setPreference("assetLocation", root);
            pells::AssetManager::setAliasLimit(static_cast<std::size_t>(size));
            const bool found = pells::AssetManager::instance().isFile("f");
            pells::SingletonList::freeSingletons();
            return found;
        };
    });
}

void addTrees() {
    addAliases("aliases of one file", 1000, [](std::int64_t size) {
        return Members{{"f", ""}, {".symlinks", repeated("a*>f\n", size)}};
    });
    addAliases("aliases of aliases", 1000, [](std::int64_t size) {
        std::string lines = "a0>f\n";
        for (std::int64_t i = 1; i < size; ++i)
            lines += "a" + std::to_string(i) + ">a" + std::to_string(i - 1) + "\n";
        return Members{{"f", ""}, {".symlinks", lines}};
    });
    // The limit of aliases is the size here: without it the names would double with each level.
    addAliases("aliases that double with every level", 1000, [](std::int64_t) {
        Members members{{"f", ""}};
        std::string folder;
        for (int depth = 0; depth < 60; ++depth) {
            members.emplace_back(folder + ".symlinks", "link>d\n");
            folder += "d/";
        }
        members.emplace_back(folder + "x", "");
        return members;
    });
    addAliases("folders of one long name", 1000, [](std::int64_t size) {
        const std::string folder(250, 'd');
        return Members{{"f", ""}, {repeated(folder + "*/", size / 20) + "x", ""}};
    });
    // Links of the file system from each folder to the root and to its parent.
    addWork("links in circles", 100, [](std::int64_t size) {
        const std::string root = bench::scratch() + "/circles";
        fs::remove_all(root);
        writeFile(root + "/f", "");
        for (std::int64_t i = 0; i < size; ++i) {
            const std::string folder = root + '/' + std::to_string(i);
            writeFile(folder + "/f", "");
            fs::create_directory_symlink("..", folder + "/parent");
            fs::create_directory_symlink(root, folder + "/root");
        }
        return [root] {
            bench::setPreference("assetLocation", root);
            const bool found = pells::AssetManager::instance().isFile("0/f");
            pells::SingletonList::freeSingletons();
            return found;
        };
    });
}

void addText() {
    addWork("rules of the log", 10000, [](std::int64_t size) {
        const std::string rules = repeated("+tag*. ", size);
        return [rules] {
            bench::setPreference("log", rules);
            const bool right = pells::Log::instance().isEnabled("tag7.y", true) &&
                               !pells::Log::instance().isEnabled("tag.y", true);
            pells::SingletonList::freeSingletons();
            bench::setPreference("log", "");
            return right;
        };
    });
    addWork("digits of a version", 10000, [](std::int64_t size) {
        const std::string digits(static_cast<std::size_t>(size), '1');
        return [digits] {
            try {
                pells::Version version(digits + "." + digits);
            } catch (const boost::bad_lexical_cast&) {
                return true;
            }
            return false;
        };
    });
}

}  // namespace

void addBenchmarks() {
    // Freed memory stays with the process: the page faults of the large sizes would look like
    // growth.
    mallopt(M_MMAP_MAX, 0);
    mallopt(M_TRIM_THRESHOLD, INT_MAX);
    addDocuments();
    addHistories();
    addPictures();
    addPicturesOfOneArchive();
    addArchives();
    addTrees();
    addText();
}
