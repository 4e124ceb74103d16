#pragma once

#include <gtest/gtest.h>

#include <map>
#include <string>

#include "pells/core/prefs.h"
#include "support/scratch_directory.h"

namespace pells_test {

/// The values that the preferences of the test program give; set them before the log is made.
std::map<std::string, std::string>& prefs();

/// The preferences that the test program registers under "Prefs".
class TestPrefs : public pells::Prefs {
public:
    std::string getString(const std::string& key) override;
};

/// Runs a test in a scratch folder of its own with every log tag on but the noisy "time." and
/// "load", and frees the singletons at its end.
class LibraryTest : public ::testing::Test {
protected:
    LibraryTest();
    ~LibraryTest() override;

    ScratchDirectory scratch;
};

}  // namespace pells_test
