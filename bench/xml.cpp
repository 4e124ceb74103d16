// Reading documents as tokens, each owned by whoever receives it, against other parsers whose
// results are copied into the same tokens.

#include <fstream>
#include <limits>
#include <memory>
#include <optional>
#include <sstream>
#include <stdexcept>

#include "bench/support/bench.h"
#include "bench/xml/documents.h"
#include "bench/xml/peers.h"
#include "pells/asset/pell_archive.h"
#include "tests/support/allocations.h"
#include "tools/archive_writer.h"

namespace {

using bench::Receiver;
typedef void (*Tokenize)(std::istream& in, Receiver& receiver);

/// Somewhere a document is read from, again and again.
class Source {
public:
    virtual ~Source() = default;

    /// The stream, at the document's first character.
    virtual std::istream& start() = 0;

    /// The digest of the tokens that the library finds in it.
    std::size_t expectedDigest() {
        if (!expected)
            expected = digestOf(bench::tokensOfPells);
        return *expected;
    }

    std::size_t digestOf(Tokenize tokenize) {
        Receiver receiver(true);
        tokenize(start(), receiver);
        return receiver.digest();
    }

private:
    std::optional<std::size_t> expected;
};

class StringSource : public Source {
public:
    explicit StringSource(const std::string& document) : in(document) {}

    std::istream& start() override {
        in.clear();
        in.seekg(0);
        return in;
    }

private:
    std::istringstream in;
};

/// A name for a file that no other has.
std::string newFile() {
    static int files = 0;
    return bench::scratch() + "/document" + std::to_string(files++);
}

class FileSource : public Source {
public:
    explicit FileSource(const std::string& document)
        : in(fileOf(document), std::ios_base::binary) {}

    std::istream& start() override {
        in.clear();
        in.seekg(0);
        return in;
    }

private:
    static std::string fileOf(const std::string& document) {
        const std::string path = newFile();
        std::ofstream(path, std::ios_base::binary) << document;
        return path;
    }

    std::ifstream in;
};

class MemberSource : public Source {
public:
    explicit MemberSource(const std::string& document) : in(archiveOf(document)) {}

    std::istream& start() override {
        if (!in.open("document"))
            throw std::runtime_error("the archive has no document");
        return in;
    }

private:
    static std::string archiveOf(const std::string& document) {
        const std::string path = newFile();
        pells::ArchiveWriter archive(path);
        archive.add("document", document);
        archive.finish();
        return path;
    }

    pells::pellistream in;
};

typedef std::string (*Document)(std::int64_t bytes);

/// Makes the source when it is first asked for, so that set-up costs only the works that run.
template <class Kind>
std::function<Source&()> lazySource(Document document, std::int64_t bytes) {
    auto source = std::make_shared<std::unique_ptr<Source>>();
    return [=]() -> Source& {
        if (!*source)
            *source = std::make_unique<Kind>(document(bytes));
        return **source;
    };
}

void measure(benchmark::State& state, Source& source, Tokenize tokenize, std::int64_t bytes) {
    if (source.digestOf(tokenize) != source.expectedDigest()) {
        state.SkipWithError("the tokens differ");
        return;
    }
    for (auto _ : state) {
        Receiver receiver;
        tokenize(source.start(), receiver);
    }
    state.SetBytesProcessed(state.iterations() * bytes);
}

/// The most memory that reading takes at a time, the longest token's included.
double peakBytes(Source& source) {
    const pells_test::AllocationMeter meter;
    Receiver receiver;
    bench::tokensOfPells(source.start(), receiver);
    return static_cast<double>(meter.peakBytes());
}

void addContestants(const std::string& work, std::int64_t bytes,
                    const std::function<Source&()>& source) {
    bench::add(work, bytes, "pells", [=](benchmark::State& state) {
        measure(state, source(), bench::tokensOfPells, bytes);
        state.counters["peak_bytes"] = peakBytes(source());
    });
    struct Peer {
        const char* name;
        Tokenize tokenize;
        std::int64_t largest;  // document, so that one run takes half a minute
    };
    const std::int64_t any = std::numeric_limits<std::int64_t>::max();
    const Peer peers[] = {{"expat", bench::tokensOfExpat, any},
                          {"pugixml", bench::tokensOfPugixml, any},
                          {"RapidXML", bench::tokensOfRapidXml, any},
                          {"RapidXML in memory", bench::tokensOfRapidXmlInMemory, 1000000},
                          {"tinyxml2", bench::tokensOfTinyXml2, 1000000},
                          {"Spirit", bench::tokensOfSpirit, 10000},
                          {"Spirit in memory", bench::tokensOfSpiritInMemory, 10000}};
    for (const Peer& peer : peers) {
        if (bytes <= peer.largest)
            bench::add(work, bytes, peer.name, [=](benchmark::State& state) {
                measure(state, source(), peer.tokenize, bytes);
            });
    }
}

template <class Kind>
void addSource(const std::string& name) {
    const std::pair<const char*, Document> documents[] = {{"image table", bench::imageTable},
                                                          {"colours", bench::colourTable}};
    for (const auto& [kind, document] : documents)
        for (const std::int64_t bytes : bench::sizes({10000, 1000000, 50000000}))
            addContestants(std::string("tokens/") + kind + '/' + name, bytes,
                           lazySource<Kind>(document, bytes));
}

}  // namespace

void addBenchmarks() {
    addSource<StringSource>("string stream");
    addSource<FileSource>("file stream");
    addSource<MemberSource>("archive member");
}
