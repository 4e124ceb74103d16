// What the tokenizer does to its stream and takes of the memory.

#include <gtest/gtest.h>

#include <cstdlib>
#include <new>
#include <sstream>
#include <stdexcept>

#include "pells/xml/tokenizer.h"
#include "support/chunked_buffer.h"

namespace {

using pells::XMLTokenizer;
typedef XMLTokenizer::Token Token;

std::size_t allocations = 0;
std::size_t allocatedBytes = 0;

void* allocate(std::size_t size) {
    ++allocations;
    allocatedBytes += size;
    if (void* const block = std::malloc(size))
        return block;
    throw std::bad_alloc();
}

}  // namespace

void* operator new(std::size_t size) {
    return allocate(size);
}
void operator delete(void* block) noexcept {
    std::free(block);
}
void operator delete(void* block, std::size_t) noexcept {
    std::free(block);
}

namespace {

const std::size_t pieceSizes[] = {0, 1, 2, 3, 7, 16, 1000};

std::string written(const Token& token) {
    std::ostringstream out;
    out << token;
    return out.str();
}

TEST(TokenizerStream, StandsRightBehindEachToken) {
    // Each line is taken by one call; character data comes with the tag that ends it.
    const std::string lines[] = {"<?xml version='1.0'?><root a='1'>",
                                 " <b/>",
                                 "text &amp;<!---->x</b>",
                                 "",
                                 "<c\n>",
                                 "\n</root >"};
    for (const std::size_t size : pieceSizes) {
        std::string text;
        for (const std::string& line : lines)
            text += line;
        text += "trailer";
        pells_test::ChunkedBuffer buffer(text, size);
        std::istream in(&buffer);
        XMLTokenizer tokenizer(in);
        EXPECT_EQ(buffer.taken(), 0U);
        std::size_t position = 0;
        for (const std::string& line : lines) {
            const Token token = tokenizer.getToken();
            position += line.size();
            EXPECT_EQ(buffer.taken(), position) << token << " in pieces of " << size;
        }
        EXPECT_TRUE(in.good());
        std::string rest;
        EXPECT_TRUE(in >> rest);
        EXPECT_EQ(rest, "trailer");
    }
}

TEST(TokenizerStream, IsSharedWithOtherReaders) {
    std::istringstream in("  <data size='4'>\n <<&\n</data>");
    XMLTokenizer tokenizer(in);
    EXPECT_FALSE(in.flags() & std::ios_base::skipws);
    EXPECT_EQ(tokenizer.getToken().attrs.size(), 1U);
    char bytes[5] = {};
    in.read(bytes, 5);
    EXPECT_EQ(std::string(bytes, 5), "\n <<&");
    EXPECT_EQ(tokenizer.getToken().value, "data");
    EXPECT_TRUE(in.good()) << "the end is not met before it is asked for";
    EXPECT_EQ(tokenizer.getToken().type, Token::T_EOF);
    EXPECT_EQ(in.rdstate(), std::ios_base::eofbit | std::ios_base::failbit);
}

TEST(TokenizerStream, EndOfTokensIsFinal) {
    std::istringstream in("<a b='1' !><c/>");
    XMLTokenizer tokenizer(in);
    for (int call = 0; call < 3; ++call) {
        const Token token = tokenizer.getToken();
        EXPECT_EQ(token.type, Token::T_EOF);
        EXPECT_EQ(token.value, "");
        EXPECT_TRUE(token.attrs.empty());
        in.clear();
        in.str("<c/>");
    }
}

TEST(TokenizerStream, StreamThatIsNotGoodEndsTheTokens) {
    std::istringstream failed("<a/>");
    failed.setstate(std::ios_base::failbit);
    XMLTokenizer fromTheStart(failed);
    failed.clear();
    EXPECT_EQ(fromTheStart.getToken().type, Token::T_EOF);

    std::istringstream ended("<a/><b/>");
    XMLTokenizer between(ended);
    between.getToken();
    ended.setstate(std::ios_base::eofbit);
    EXPECT_EQ(between.getToken().type, Token::T_EOF);
    EXPECT_TRUE(ended.fail());

    std::istringstream empty;
    const XMLTokenizer none(empty);
    EXPECT_TRUE(empty.eof()) << "the first character is asked for at once";

    std::istream without(nullptr);
    EXPECT_EQ(XMLTokenizer(without).getToken().type, Token::T_EOF);
}

TEST(TokenizerStream, EndIsThrownToThoseWhoAskForIt) {
    std::istringstream in("<a/>x");
    in.exceptions(std::ios_base::failbit);
    XMLTokenizer tokenizer(in);
    EXPECT_EQ(tokenizer.getToken().value, "a");
    EXPECT_THROW(tokenizer.getToken(), std::ios_base::failure);
    EXPECT_EQ(tokenizer.getToken().type, Token::T_EOF);
}

/// Throws where the text ends.
class BreakingBuffer : public pells_test::ChunkedBuffer {
public:
    using ChunkedBuffer::ChunkedBuffer;

protected:
    int_type underflow() override {
        const int_type next = ChunkedBuffer::underflow();
        return traits_type::eq_int_type(next, traits_type::eof())
                   ? throw std::runtime_error("damaged member")
                   : next;
    }
};

class TokenizerBreak : public ::testing::TestWithParam<std::string> {};

TEST_P(TokenizerBreak, GoesToTheCallerOrEndsTheTokens) {
    const std::string text = "<first/>" + GetParam();
    for (const std::size_t size : pieceSizes) {
        BreakingBuffer throwing(text, size);
        std::istream loud(&throwing);
        loud.exceptions(std::ios_base::badbit);
        XMLTokenizer tokenizer(loud);
        EXPECT_EQ(tokenizer.getToken().value, "first");
        try {
            tokenizer.getToken();
            ADD_FAILURE() << "nothing was thrown";
        } catch (const std::runtime_error& failure) {
            EXPECT_STREQ(failure.what(), "damaged member");
        }
        EXPECT_TRUE(loud.bad());
        loud.clear();
        EXPECT_EQ(tokenizer.getToken().type, Token::T_EOF);

        BreakingBuffer quiet(text, size);
        std::istream in(&quiet);
        XMLTokenizer ending(in);
        ending.getToken();
        while (ending.getToken().type == Token::T_TEXT) {
        }
        EXPECT_TRUE(in.bad());
        EXPECT_EQ(ending.getToken().type, Token::T_EOF);
    }
}

INSTANTIATE_TEST_SUITE_P(Xml, TokenizerBreak,
                         ::testing::Values("", " ", "<", "<a", "<a ", "<a b", "<a b='c", "<a b='c'",
                                           "</a", "<a/", "text", "text<!-- ", "text &am", "&#6",
                                           "<!-", "<!-- -", "<?xml", "<?xml version='1.0"),
                         [](const auto& each) { return "At" + std::to_string(each.index); });

TEST(TokenizerStream, BreakAtTheFirstCharacterLeaksNothing) {
    const std::string nothing;
    BreakingBuffer buffer(nothing, 1);
    std::istream in(&buffer);
    in.exceptions(std::ios_base::badbit);
    EXPECT_THROW(XMLTokenizer tokenizer(in), std::runtime_error);
}

/// Gives a filling of any length between two texts, 4096 characters at a time.
class LongBuffer : public std::streambuf {
public:
    LongBuffer(const std::string& before, char filling, std::size_t count, const std::string& after)
        : head(before), tail(after), remaining(count) {
        std::fill(std::begin(block), std::end(block), filling);
    }

protected:
    int_type underflow() override {
        if (!headGiven) {
            headGiven = true;
            show(&head[0], head.size());
        } else if (remaining > 0) {
            const std::size_t size = std::min(remaining, sizeof block);
            remaining -= size;
            show(block, size);
        } else if (!tailGiven) {
            tailGiven = true;
            show(&tail[0], tail.size());
        }
        return gptr() == egptr() ? traits_type::eof() : traits_type::to_int_type(*gptr());
    }

private:
    void show(char* text, std::size_t size) { setg(text, text, text + size); }

    std::string head;
    std::string tail;
    std::size_t remaining;
    bool headGiven = false;
    bool tailGiven = false;
    char block[4096];
};

struct LongInput {
    const char* name;
    std::string before;
    char filling;
    std::string after;
    std::string token;
    bool kept;  ///< whether the filling is part of the token
};

class TokenizerMemory : public ::testing::TestWithParam<LongInput> {};

TEST_P(TokenizerMemory, DoesNotDependOnWhatIsSkipped) {
    const std::size_t length = 20000000;
    LongBuffer buffer(GetParam().before, GetParam().filling, length, GetParam().after);
    std::istream in(&buffer);
    const std::size_t before = allocatedBytes;
    XMLTokenizer tokenizer(in);
    const Token token = tokenizer.getToken();
    // A string that grows with the text doubles, and so do the blocks it leaves behind.
    EXPECT_LT(allocatedBytes - before, GetParam().kept ? 4 * length : 4096);
    if (GetParam().kept)
        EXPECT_GE(written(token).size(), length);
    else
        EXPECT_EQ(written(token), GetParam().token);
    EXPECT_EQ(tokenizer.getToken().type, Token::T_EOF);
}

const char single[] = "Token: 1 (T_SINGLE) <a/>";

INSTANTIATE_TEST_SUITE_P(
    Xml, TokenizerMemory,
    ::testing::Values(LongInput{"Comment", "<!--", 'x', "--><a/>", single, false},
                      LongInput{"Space", " ", '\n', "<a/>", single, false},
                      LongInput{"SpaceInTag", "<a ", ' ', "/>", single, false},
                      LongInput{"Declaration", "<?xml version='", '1', "'?><a/>", single, false},
                      LongInput{"EntityName", "&", 'n', ";", "Token: 4 (T_TEXT) \"?\"", false},
                      LongInput{"Number", "&#x", '0', "41;", "Token: 4 (T_TEXT) \"A\"", false},
                      LongInput{"Text", "x", '>', "", "", true},
                      LongInput{"Value", "<a b='", '\t', "'/>", "", true},
                      LongInput{"Name", "<", 'n', "/>", "", true}),
    [](const auto& each) { return std::string(each.param.name); });

TEST(TokenizerStream, MakesOneAllocationAString) {
    const std::string longText(100, 'x');
    const std::string tag = "<a b='" + longText + "' c='short' d='" + longText + "'>";
    std::istringstream in(tag + tag + "  " + longText +
                          " <a-name-that-is-too-long-to-be-stored-inside/>");
    XMLTokenizer tokenizer(in);
    tokenizer.getToken();
    const std::size_t start = allocations;
    const Token open = tokenizer.getToken();
    EXPECT_EQ(open.attrs.size(), 3U);
    EXPECT_EQ(allocations - start, 3U) << "two values and the list";
    const Token text = tokenizer.getToken();
    const Token name = tokenizer.getToken();
    EXPECT_EQ(name.type, Token::T_SINGLE);
    EXPECT_EQ(allocations - start, 5U) << "a text and a name";
}

TEST(TokenizerStream, LogsTokens) {
    std::ostringstream out;
    out << std::hex << std::showbase;
    Token token;
    token.value = "v";
    token.attrs = {{"a", "1"}, {"b", "\"<"}};
    for (const int type : {0, 1, 2, 3, 4, 5, 6, 16, -1}) {
        token.type = static_cast<Token::TokenType>(type);
        out << token << '\n';
    }
    EXPECT_EQ(out.str(),
              "Token: 0 (T_IGNORE) v\n"
              "Token: 1 (T_SINGLE) <v a=\"1\" b=\"\"<\"/>\n"
              "Token: 2 (T_OPEN) <v a=\"1\" b=\"\"<\">\n"
              "Token: 3 (T_CLOSE) </v>\n"
              "Token: 4 (T_TEXT) \"v\"\n"
              "Token: 5 (T_EOF) v\n"
              "Token: 6 (**bad**) v\n"
              "Token: 16 (**bad**) v\n"
              "Token: -1 (**bad**) v\n");
}

}  // namespace
