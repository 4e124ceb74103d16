#include "pells/log/stream_buffers.h"

#include <gtest/gtest.h>

#include <sstream>
#include <stdexcept>

#include "pells/platform/debugger.h"

namespace {

/// Records what it is given; refuses while told to.
class RecordingBuffer : public pells::simple_ostreambuf<char> {
public:
    using simple_ostreambuf::simple_ostreambuf;
    ~RecordingBuffer() override { sync(); }

    std::vector<std::string> blocks;
    int syncs = 0;
    bool refuse = false;

protected:
    bool write(char* text, long count) override {
        if (!refuse)
            blocks.emplace_back(text, static_cast<std::size_t>(count));
        return !refuse;
    }
    bool xsync() override {
        ++syncs;
        return true;
    }
};

TEST(OutputBuffer, WritesABlockWhenItsLastCharacterArrives) {
    RecordingBuffer buffer;
    std::ostream out(&buffer);
    out << std::string(1023, 'a');
    EXPECT_TRUE(buffer.blocks.empty());
    out << 'b';
    EXPECT_EQ(buffer.blocks, std::vector<std::string>{std::string(1023, 'a') + 'b'});
    const int syncsSoFar = buffer.syncs;
    out.flush();
    EXPECT_EQ(buffer.blocks.size(), 1u);
    EXPECT_EQ(buffer.syncs, syncsSoFar + 1);
    out << 'c';
    EXPECT_EQ(buffer.close(), 0);
    EXPECT_EQ(buffer.blocks.back(), "c");
}

TEST(OutputBuffer, OffersRefusedTextAgain) {
    for (const long size : {1L, 2L, 8L}) {
        RecordingBuffer buffer(size);
        std::ostream out(&buffer);
        buffer.refuse = true;
        // More attempts than there is room, in single characters and in runs.
        for (char c = 'a'; c < 'a' + 12; ++c) {
            out.clear();
            if (c % 2 == 0)
                out.put(c);
            else
                out.write(std::string(20, c).data(), 20);
            EXPECT_EQ(out.rdbuf()->pubsync(), -1);
        }
        buffer.refuse = false;
        out.clear();
        EXPECT_TRUE(out.flush());
        ASSERT_EQ(buffer.blocks.size(), 1u);
        EXPECT_EQ(buffer.blocks[0].size(), static_cast<std::size_t>(size));
        out << "xyz" << std::flush;
        std::string later;
        for (std::size_t i = 1; i < buffer.blocks.size(); ++i)
            later += buffer.blocks[i];
        EXPECT_EQ(later, "xyz");
    }
}

/// Serves a text in pieces, then ends with a given result.
class PieceBuffer : public pells::simple_istreambuf<char> {
public:
    PieceBuffer(long size, std::vector<std::string> allPieces, long endResult)
        : simple_istreambuf(size), pieces(std::move(allPieces)), result(endResult) {}

    long read(char* into, long room) override {
        if (next == pieces.size())
            return result;
        const std::string& piece = pieces[next++];
        EXPECT_LE(piece.size(), static_cast<std::size_t>(room));
        piece.copy(into, piece.size());
        return static_cast<long>(piece.size());
    }

private:
    std::vector<std::string> pieces;
    std::size_t next = 0;
    long result;
};

TEST(InputBuffer, PutsOneCharacterBackAcrossRefillsAndEnds) {
    for (const long endResult : {0L, -1L}) {
        PieceBuffer buffer(4, {"abc", "d", "ef"}, endResult);
        std::istream in(&buffer);
        std::string text;
        for (char c; in.get(c);) {
            text += c;
            in.putback(c);
            EXPECT_EQ(in.get(), c);
        }
        EXPECT_EQ(text, "abcdef");
        EXPECT_TRUE(in.eof());
    }
    PieceBuffer single(1, {"a", "b"}, 0);
    std::istream in(&single);
    std::string text;
    in >> text;
    EXPECT_EQ(text, "ab");
    EXPECT_THROW(RecordingBuffer(0), std::length_error);
    EXPECT_THROW(RecordingBuffer(-5), std::length_error);
}

TEST(Tee, HidesTheFailureOfOneTarget) {
    std::ostringstream good;
    std::ostringstream bad;
    bad.setstate(std::ios_base::failbit);
    {
        pells::tee_ostream<> tee(bad, good);
        tee << "one" << std::flush;
        EXPECT_TRUE(tee.good());
        tee << "two";
    }
    EXPECT_EQ(good.str(), "onetwo");
    EXPECT_EQ(bad.str(), "");
    pells::tee_ostream<> neither(bad, bad);
    neither << "three" << std::flush;
    EXPECT_TRUE(neither.bad());
}

TEST(DebuggerStream, PassesOnWhatIsLeftWhenItDies) {
    struct Sink : pells::platform::DebuggerSink {
        void write(const char* text) override { pieces.emplace_back(text); }
        std::vector<std::string> pieces;
    } sink;
    pells::platform::setDebuggerSink(&sink);
    pells::debugostream() << std::string(1500, 'x') << 7;
    EXPECT_EQ(sink.pieces,
              (std::vector<std::string>{std::string(1024, 'x'), std::string(476, 'x') + "7"}));
}

}  // namespace
