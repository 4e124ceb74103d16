#include "pells/log/stream_buffers.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <sstream>
#include <stdexcept>

#include "support/debugger_text.h"

namespace {

/// Records what it is given; refuses while told to.
class RecordingBuffer : public pells::simple_ostreambuf<char> {
public:
    using simple_ostreambuf::simple_ostreambuf;

    std::vector<std::string> blocks;
    int syncs = 0;
    bool refuse = false;

protected:
    bool write(char* text, long count) override {
        if (!refuse)
            blocks.emplace_back(text, static_cast<std::size_t>(count));
        return !refuse;
    }
    bool xsync() override { return ++syncs > 0; }
};

TEST(OutputBuffer, WritesABlockWhenItsLastCharacterArrives) {
    RecordingBuffer buffer;
    std::ostream out(&buffer);
    out << std::string(1023, 'a');
    EXPECT_TRUE(buffer.blocks.empty());
    out << 'b';
    EXPECT_EQ(buffer.blocks, std::vector<std::string>{std::string(1023, 'a') + 'b'});
    out << 'c';
    EXPECT_EQ(buffer.sputn("d", -1), 0) << "as standard buffers do";
    EXPECT_EQ(buffer.close(), 0);
    EXPECT_EQ(buffer.blocks.back(), "c");
    EXPECT_EQ(buffer.syncs, 2);
}

TEST(OutputBuffer, OffersRefusedTextAgain) {
    for (const long size : {1L, 2L, 8L}) {
        RecordingBuffer buffer(size);
        std::ostream out(&buffer);
        buffer.refuse = true;
        // More attempts than there is room, in single characters and in runs.
        for (char c = 'a'; c < 'a' + 12; ++c) {
            out.clear();
            EXPECT_FALSE(out << std::string(c % 2 == 0 ? 1 : 20, c) << std::flush);
        }
        buffer.refuse = false;
        out.clear();
        EXPECT_TRUE(out.flush());
        ASSERT_EQ(buffer.blocks.size(), 1u);
        EXPECT_EQ(buffer.blocks[0].size(), static_cast<std::size_t>(size));
    }
    EXPECT_THROW(RecordingBuffer(0), std::length_error);
}

/// Serves a text in pieces of at most three characters, then ends with a given result.
class PieceBuffer : public pells::simple_istreambuf<char> {
public:
    PieceBuffer(long size, long endResult) : simple_istreambuf(size), result(endResult) {}

    long read(char* into, long room) override {
        const auto count = text.copy(into, static_cast<std::size_t>(std::min(room, 3L)));
        text.erase(0, count);
        return count != 0 ? static_cast<long>(count) : result;
    }

private:
    std::string text = "abcdefgh";
    long result;
};

TEST(InputBuffer, PutsOneCharacterBackAcrossRefillsAndEnds) {
    for (const long size : {1L, 2L, 4L, 100L}) {
        for (const long endResult : {0L, -1L}) {
            PieceBuffer buffer(size, endResult);
            std::istream in(&buffer);
            std::string text;
            for (char c; in.get(c); text += c) {
                // A block of one character has no room for another.
                if (size == 1)
                    continue;
                in.peek();
                EXPECT_EQ(in.putback(c).get(), c);
            }
            EXPECT_EQ(text, "abcdefgh");
            EXPECT_TRUE(in.eof());
        }
    }
}

TEST(Tee, HidesTheFailureOfOneTarget) {
    std::ostringstream good;
    std::ostringstream bad;
    bad.setstate(std::ios_base::failbit);
    EXPECT_TRUE(pells::tee_ostream<>(bad, good) << "one" << std::flush << "two");
    EXPECT_EQ(good.str(), "onetwo");
    EXPECT_FALSE(pells::tee_ostream<>(bad, bad) << "three" << std::flush);
}

/// Takes no text.
struct ThrowingSink : pells::platform::DebuggerSink {
    ThrowingSink() { pells::platform::setDebuggerSink(this); }
    void write(const char* /*text*/) override { throw std::runtime_error("no debugger"); }
};

TEST(StreamsThatDie, LoseWhatNobodyTakesAndThrowNothing) {
    const ThrowingSink sink;
    std::ostream closed(nullptr);
    EXPECT_THROW(closed.exceptions(std::ios_base::badbit), std::ios_base::failure);
    pells::debugostream() << "lost";
    pells::tee_ostream<>(closed, closed) << "lost, too";
}

TEST(DebuggerStream, PassesOnWhatIsLeftWhenItDies) {
    const pells_test::DebuggerText debugger;
    pells::debugostream() << std::string(1500, 'x') << 7;
    EXPECT_EQ(debugger.received, std::string(1500, 'x') + '7');
}

}  // namespace
