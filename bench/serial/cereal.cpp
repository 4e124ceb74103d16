#include <cereal/archives/xml.hpp>
#include <cereal/types/memory.hpp>
#include <cereal/types/polymorphic.hpp>
#include <cereal/types/string.hpp>
#include <cereal/types/vector.hpp>

#include "bench/serial/contestants.h"

namespace bench {

template <class Archive>
void serialize(Archive& archive, PlainFileLoader& loader) {
    archive(cereal::make_nvp("text", loader.file));
}

template <class Archive>
void serialize(Archive& archive, PlainArchiveLoader& loader) {
    archive(cereal::make_nvp("text", loader.file));
}

template <class Archive>
void serialize(Archive& archive, PlainEntry& entry) {
    archive(cereal::make_nvp("name", entry.name), cereal::make_nvp("getters", entry.getters));
}

void saveByCereal(PlainTable& table, std::ostream& out) {
    cereal::XMLOutputArchive archive(out);
    archive(cereal::make_nvp("imageEntries", table.imageEntries));
}

void loadByCereal(PlainTable& table, std::istream& in) {
    cereal::XMLInputArchive archive(in);
    archive(cereal::make_nvp("imageEntries", table.imageEntries));
}

}  // namespace bench

CEREAL_REGISTER_TYPE_WITH_NAME(bench::PlainFileLoader, "FileLoader")
CEREAL_REGISTER_TYPE_WITH_NAME(bench::PlainArchiveLoader, "ArchiveLoader")
CEREAL_REGISTER_POLYMORPHIC_RELATION(bench::PlainLoader, bench::PlainFileLoader)
CEREAL_REGISTER_POLYMORPHIC_RELATION(bench::PlainLoader, bench::PlainArchiveLoader)
