#include "pells/asset/zlib_wrapper.h"

#include "support/test_prefs.h"
#include "support/thrown.h"

namespace {

using namespace pells;
using namespace pells_test;

class ZlibWrapperTest : public LibraryTest {};

voidpf refuse(voidpf /*data*/, uInt /*items*/, uInt /*size*/) {
    return nullptr;
}

/// Hands out memory of its own, so that a stream that zlib can no longer end leaks nothing.
voidpf takeFromArena(voidpf arena, uInt items, uInt size) {
    std::string& bytes = *static_cast<std::string*>(arena);
    return std::size_t{items} * size <= bytes.size() ? &bytes[0] : nullptr;
}

void leaveInArena(voidpf /*arena*/, voidpf /*memory*/) {}

struct UnendableInflater {
    UnendableInflater()
        : arena(65536, '\0'), inflater(nullptr, 0, 15, takeFromArena, leaveInArena, &arena) {
        inflater.state = nullptr;
    }
    std::string arena;
    ZlibInflater inflater;
};

TEST_F(ZlibWrapperTest, NamesClassOperationCodeAndReason) {
    const ZlibInflater inflater(nullptr, 0, 15, nullptr, nullptr, nullptr);
    ZlibWrapper wrapper;
    EXPECT_EQ(inflater.getMessage("op", Z_BUF_ERROR), "ZlibInflater::op: Z_BUF_ERROR (-5)");
    EXPECT_EQ(inflater.getMessage("", Z_NEED_DICT), "ZlibInflater::: Z_NEED_DICT (2)");
    EXPECT_EQ(wrapper.getMessage("op", 7), "ZlibWrapper::op: unknown (7)");
    char reason[] = "why";
    wrapper.msg = reason;
    EXPECT_EQ(wrapper.getMessage("op", Z_OK), "ZlibWrapper::op: Z_OK (0): why");
    EXPECT_EQ(ZlibWrapper(wrapper).msg, wrapper.msg);
}

TEST_F(ZlibWrapperTest, LogsAndThrowsOnlyWhatIsNotAccepted) {
    const ZlibWrapper wrapper;
    EXPECT_NO_THROW(wrapper.check("op", 1, 1, 0));
    EXPECT_NO_THROW(wrapper.check("op", 0, 1, 0));
    EXPECT_THROW(wrapper.check("op", -6, 1, 0), ZlibWrapper::ZlibError);
    const std::string starved = "ZlibInflater::ZlibInflater(15): Z_MEM_ERROR (-4)";
    EXPECT_EQ(thrown<ZlibWrapper::ZlibError>(
                  [] { ZlibInflater(nullptr, 0, 15, refuse, nullptr, nullptr); }),
              starved);
    EXPECT_EQ(logLines("error: "), (Lines{"ZlibWrapper::op: Z_VERSION_ERROR (-6)", starved}));
}

TEST_F(ZlibWrapperTest, EndingABrokenStreamThrowsUnlessAnotherExceptionIsOnItsWay) {
    EXPECT_THROW(UnendableInflater(), ZlibWrapper::ZlibError);
    try {
        const UnendableInflater unwound;
        throw 1;
    } catch (int) {
    }
    EXPECT_EQ(logLines("error: "), Lines(2, "ZlibInflater::~ZlibInflater(): Z_STREAM_ERROR (-2)"));
}

}  // namespace
