#include <boost/archive/xml_iarchive.hpp>
#include <boost/archive/xml_oarchive.hpp>
#include <boost/serialization/base_object.hpp>
#include <boost/serialization/export.hpp>
#include <boost/serialization/nvp.hpp>
#include <boost/serialization/string.hpp>
#include <boost/serialization/unique_ptr.hpp>
#include <boost/serialization/vector.hpp>

#include "bench/serial/contestants.h"

BOOST_SERIALIZATION_ASSUME_ABSTRACT(bench::PlainLoader)
BOOST_CLASS_EXPORT_GUID(bench::PlainFileLoader, "FileLoader")
BOOST_CLASS_EXPORT_GUID(bench::PlainArchiveLoader, "ArchiveLoader")

using boost::serialization::make_nvp;

namespace boost {
namespace serialization {

template <class Archive>
void serialize(Archive& /*archive*/, bench::PlainLoader& /*loader*/, unsigned /*version*/) {}

template <class Archive>
void serializeLoader(Archive& archive, bench::PlainLoader& loader) {
    archive& make_nvp("text", loader.file);
}

template <class Archive>
void serialize(Archive& archive, bench::PlainFileLoader& loader, unsigned /*version*/) {
    void_cast_register<bench::PlainFileLoader, bench::PlainLoader>();
    serializeLoader(archive, loader);
}

template <class Archive>
void serialize(Archive& archive, bench::PlainArchiveLoader& loader, unsigned /*version*/) {
    void_cast_register<bench::PlainArchiveLoader, bench::PlainLoader>();
    serializeLoader(archive, loader);
}

template <class Archive>
void serialize(Archive& archive, bench::PlainEntry& entry, unsigned /*version*/) {
    archive& make_nvp("name", entry.name);
    archive& make_nvp("getters", entry.getters);
}

}  // namespace serialization
}  // namespace boost

namespace bench {

void saveByBoost(PlainTable& table, std::ostream& out) {
    boost::archive::xml_oarchive archive(out);
    archive << make_nvp("imageEntries", table.imageEntries);
}

void loadByBoost(PlainTable& table, std::istream& in) {
    boost::archive::xml_iarchive archive(in);
    archive >> make_nvp("imageEntries", table.imageEntries);
}

}  // namespace bench
