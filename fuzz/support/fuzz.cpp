#include "fuzz/support/fuzz.h"

#include <cstdint>
#include <cstdio>
#include <cstdlib>

#include "pells/core/singleton.h"
#include "support/test_prefs.h"

namespace pells_fuzz {

void require(bool condition, const std::string& what) {
    if (condition)
        return;
    std::fprintf(stderr, "Broken promise: %s\n", what.c_str());
    std::abort();
}

const pells_test::ScratchDirectory& scratch() {
    static pells_test::ScratchDirectory folder;
    static const bool entered = (folder.enter(), true);
    static_cast<void>(entered);
    return folder;
}

}  // namespace pells_fuzz

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* bytes, std::size_t size) {
    pells_fuzz::scratch();
    pells_test::prefs() = {{"log", "-*"}};
    fuzzOne(std::string(reinterpret_cast<const char*>(bytes), size));
    pells::SingletonList::freeSingletons();
    return 0;
}
