#include "pells/asset/zlib_wrapper.h"

#include <gtest/gtest.h>

#include "support/archive_bytes.h"
#include "support/test_prefs.h"

namespace {

class ZlibWrapperTest : public pells_test::LibraryTest {};

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
    pells::ZlibInflater inflater;
};

TEST_F(ZlibWrapperTest, NamesClassOperationCodeAndReason) {
    const pells::ZlibInflater inflater(nullptr, 0, 15, nullptr, nullptr, nullptr);
    pells::ZlibWrapper wrapper;
    EXPECT_EQ(inflater.getMessage("op", Z_BUF_ERROR), "ZlibInflater::op: Z_BUF_ERROR (-5)");
    EXPECT_EQ(inflater.getMessage("", Z_NEED_DICT), "ZlibInflater::: Z_NEED_DICT (2)");
    EXPECT_EQ(wrapper.getMessage("op", 7), "ZlibWrapper::op: unknown (7)");
    char reason[] = "why";
    wrapper.msg = reason;
    EXPECT_EQ(wrapper.getMessage("op", Z_OK), "ZlibWrapper::op: Z_OK (0): why");
    EXPECT_EQ(pells::ZlibWrapper(wrapper).msg, wrapper.msg);
}

TEST_F(ZlibWrapperTest, LogsAndThrowsOnlyWhatIsNotAccepted) {
    const pells::ZlibWrapper wrapper;
    EXPECT_NO_THROW(wrapper.check("op", 1, 1, 0));
    EXPECT_NO_THROW(wrapper.check("op", 0, 1, 0));
    EXPECT_THROW(wrapper.check("op", -6, 1, 0), pells::ZlibWrapper::ZlibError);
    try {
        const pells::ZlibInflater starved(nullptr, 0, 15, refuse, nullptr, nullptr);
        ADD_FAILURE() << "initialised without memory";
    } catch (const pells::ZlibWrapper::ZlibError& error) {
        EXPECT_STREQ(error.what(), "ZlibInflater::ZlibInflater(15): Z_MEM_ERROR (-4)");
    }
    EXPECT_EQ(
        pells_test::logLines(),
        (std::vector<std::string>{"error: ZlibWrapper::op: Z_VERSION_ERROR (-6)",
                                  "error: ZlibInflater::ZlibInflater(15): Z_MEM_ERROR (-4)"}));
}

TEST_F(ZlibWrapperTest, EndingABrokenStreamThrowsUnlessAnotherExceptionIsOnItsWay) {
    EXPECT_THROW(UnendableInflater(), pells::ZlibWrapper::ZlibError);
    try {
        const UnendableInflater unwound;
        throw 1;
    } catch (int) {
    }
    EXPECT_EQ(
        pells_test::logLines(),
        std::vector<std::string>(2, "error: ZlibInflater::~ZlibInflater(): Z_STREAM_ERROR (-2)"));
}

TEST_F(ZlibWrapperTest, RefusesGzipAndBareDeflate) {
    const std::string zlibStream = pells_test::deflated("text");
    for (std::string input : {std::string("\x1f\x8b\x08\0\0\0\0\0", 8), zlibStream.substr(2)}) {
        char output[16];
        pells::ZlibInflater inflater(reinterpret_cast<Bytef*>(&input[0]),
                                     static_cast<uInt>(input.size()), 15, nullptr, nullptr,
                                     nullptr);
        inflater.next_out = reinterpret_cast<Bytef*>(output);
        inflater.avail_out = sizeof output;
        EXPECT_EQ(inflate(&inflater, Z_NO_FLUSH), Z_DATA_ERROR);
    }
}

}  // namespace
