#include "support/test_prefs.h"

#include "pells/core/factory.h"

namespace pells_test {

namespace {

const pells::Factory<pells::Prefs, TestPrefs> prefsFactory("Prefs");

}  // namespace

std::map<std::string, std::string>& prefs() {
    static std::map<std::string, std::string> values;
    return values;
}

std::string TestPrefs::getString(const std::string& key) {
    return prefs()[key];
}

LibraryTest::LibraryTest() {
    scratch.enter();
    prefs() = {{"log", "* -time. -load"}};
}

LibraryTest::~LibraryTest() {
    pells::SingletonList::freeSingletons();
}

}  // namespace pells_test
