// Archives of any members, which read back equal.

#include <fuzzer/FuzzedDataProvider.h>

#include <iterator>
#include <map>

#include "fuzz/support/fuzz.h"
#include "pells/asset/pell_archive.h"
#include "tools/archive_writer.h"

namespace {

typedef std::map<std::string, std::string> Members;

/// Writes members until one is refused; returns those that were taken.
Members writeMembers(FuzzedDataProvider& source, const std::string& path) {
    Members members;
    pells::ArchiveWriter writer(path);
    while (source.remaining_bytes() > 0) {
        const std::string name = source.ConsumeRandomLengthString(30);
        std::string content = source.ConsumeRandomLengthString(3000);
        if (source.ConsumeBool())
            content.append(source.ConsumeIntegralInRange<std::size_t>(0, 20000), 'a');
        try {
            writer.add(name, content);
        } catch (const pells::ArchiveWriter::Refused&) {
            continue;
        }
        pells_fuzz::require(members.emplace(name, content).second, "a name is taken once");
    }
    writer.finish();
    return members;
}

}  // namespace

void fuzzOne(const std::string& input) {
    FuzzedDataProvider source(reinterpret_cast<const std::uint8_t*>(input.data()), input.size());
    const std::string path = pells_fuzz::scratch().path("written.pell");
    const Members members = writeMembers(source, path);
    pells::pellistream archive(path);
    pells_fuzz::require(archive.getDirectory().size() == members.size(), "no member is lost");
    for (const auto& member : members) {
        pells_fuzz::require(archive.open(member.first), "a written member opens");
        pells_fuzz::require(
            std::string(std::istreambuf_iterator<char>(archive), {}) == member.second,
            "a member reads back equal");
    }
}
