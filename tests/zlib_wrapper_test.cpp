#include "pells/asset/zlib_wrapper.h"

#include "support/test_prefs.h"
#include "support/thrown.h"

namespace {

using namespace pells;
using namespace pells_test;

class ZlibWrapperTest : public LibraryTest {};

TEST_F(ZlibWrapperTest, LogsAndThrowsClassOperationCodeAndReasonOfWhatIsNotAccepted) {
    ZlibWrapper wrapper;
    EXPECT_EQ(wrapper.getMessage("", 7), "ZlibWrapper::: unknown (7)");
    EXPECT_NO_THROW(wrapper.check("op", 1, 1, 0));
    EXPECT_NO_THROW(wrapper.check("op", 0, 1, 0));
    char reason[] = "why";
    wrapper.msg = reason;
    const std::string refused = "ZlibWrapper::op: Z_VERSION_ERROR (-6): why";
    EXPECT_EQ(thrown<ZlibWrapper::ZlibError>([&] { wrapper.check("op", -6, 1, 0); }), refused);

    const auto refuse = [](voidpf, uInt, uInt) -> voidpf { return nullptr; };
    const std::string starved = "ZlibInflater::ZlibInflater(15): Z_MEM_ERROR (-4)";
    EXPECT_EQ(thrown<ZlibWrapper::ZlibError>(
                  [&] { ZlibInflater(nullptr, 0, 15, refuse, nullptr, nullptr); }),
              starved);
    EXPECT_EQ(logLines("error: "), (Lines{refused, starved}));
}

TEST_F(ZlibWrapperTest, EndingAStreamTwiceThrowsUnlessAnotherExceptionIsOnItsWay) {
    const auto endTwice = [](bool unwind) {
        ZlibInflater inflater(nullptr, 0, 15, nullptr, nullptr, nullptr);
        inflateEnd(&inflater);
        if (unwind)
            throw 1;
    };
    EXPECT_THROW(endTwice(false), ZlibWrapper::ZlibError);
    EXPECT_THROW(endTwice(true), int);
    EXPECT_EQ(logLines("error: "), Lines(2, "ZlibInflater::~ZlibInflater(): Z_STREAM_ERROR (-2)"));
}

}  // namespace
