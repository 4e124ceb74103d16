// Any text as a version number. One that is taken is written in a form that reads back equal.

#include "pells/core/version.h"

#include <boost/lexical_cast/bad_lexical_cast.hpp>

#include "fuzz/support/fuzz.h"

void fuzzOne(const std::string& input) {
    try {
        const pells::Version version(input);
        pells_fuzz::require(pells::Version(version.str()) == version, "a version reads back equal");
    } catch (const boost::bad_lexical_cast&) {
    }
}
