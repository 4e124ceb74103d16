// Memory in proportion to what is there, not to what it claims.

#include <gtest/gtest.h>

#include <sstream>

#include "pells/asset/asset_manager.h"
#include "pells/asset/pell_archive.h"
#include "pells/image/image_base.h"
#include "pells/image/image_loaders.h"
#include "pells/log/log.h"
#include "pells/serial/serializable.h"
#include "support/allocations.h"
#include "support/archive_bytes.h"
#include "support/chunked_buffer.h"
#include "support/everything.h"
#include "support/test_prefs.h"
#include "support/tga_file.h"

namespace {

using pells_test::AllocationMeter;
typedef pells::XMLTokenizer::Token Token;

const std::int64_t KiB = 1024;
const std::int64_t MiB = 1024 * KiB;

/// The head, then a piece so many times, then the tail, without ever holding them.
class RepeatedText : public std::streambuf {
public:
    RepeatedText(std::string head, const std::string& piece, std::int64_t times, std::string tail)
        : first(std::move(head)), last(std::move(tail)), repeats(times) {
        const std::int64_t most = std::max<std::int64_t>(1, 64 * KiB / std::int64_t(piece.size()));
        piecesInBlock = std::min(most, repeats);
        for (std::int64_t i = 0; i < piecesInBlock; ++i)
            block += piece;
        show(first, first.size());
    }

protected:
    int_type underflow() override {
        if (repeats > 0) {
            const std::int64_t pieces = std::min(repeats, piecesInBlock);
            repeats -= pieces;
            show(block, block.size() / std::size_t(piecesInBlock) * std::size_t(pieces));
        } else if (!last.empty()) {
            shown.swap(last);
            last.clear();
            show(shown, shown.size());
        } else {
            return traits_type::eof();
        }
        return traits_type::to_int_type(*gptr());
    }

private:
    void show(std::string& text, std::size_t count) { setg(&text[0], &text[0], &text[0] + count); }

    std::string first;
    std::string last;
    std::string shown;
    std::string block;
    std::int64_t repeats;
    std::int64_t piecesInBlock = 0;
};

class Proportion : public pells_test::LibraryTest {
protected:
    /// Opens an archive and reads a member in blocks; returns the most memory it took.
    std::int64_t peakOfArchive(const std::string& bytes, const std::string& member,
                               std::int64_t expected) const {
        const std::string path = pells_test::writeArchiveFile(scratch, bytes);
        std::int64_t total = 0;
        char into[8192];
        const AllocationMeter meter;
        pells::pellistream archive(path);
        EXPECT_TRUE(archive.open(member));
        try {
            do {
                archive.read(into, sizeof into);
                total += archive.gcount();
            } while (archive);
        } catch (const pells::pellibuf::BadPellFile&) {
            total = -1;
        }
        EXPECT_EQ(total, expected);
        return meter.peakBytes();
    }
};

TEST_F(Proportion, OfAPictureThatIsClaimedButNotThere) {
    pells::Image_base image(1, 1);
    for (const int depth : {8, 24, 32}) {
        for (const std::size_t delivered : {0u, 100000u, 1000000u}) {
            const std::string file =
                pells_test::tgaHeader(16384, 16384, depth) + std::string(delivered, 'x');
            pells_test::ChunkedBuffer withoutEnd(file, 1000);
            std::istream in(&withoutEnd);
            const AllocationMeter meter;
            EXPECT_FALSE(pells::TGAFileLoader::loadTarga(&image, in));
            EXPECT_LT(meter.peakBytes(), 5 * std::int64_t(delivered) + 64 * KiB);
        }
    }
}

TEST_F(Proportion, OfDirectories) {
    const std::string entry = "O15 Lffffffff |" + std::string(100 * MiB, 'n') + "\r\n";
    const std::string longName = scratch.write("n.pell", pells_test::archiveWithDirectory(entry));
    {
        const AllocationMeter meter;
        EXPECT_EQ(pells::pellistream(longName).getDirectory().size(), 1u);
        EXPECT_LT(meter.peakBytes(), 400 * MiB);
    }

    std::string emptyNames;
    for (int i = 0; i < 1000000; ++i)
        emptyNames += "O15 L0 |\r\n";
    const std::int64_t size = static_cast<std::int64_t>(emptyNames.size());
    EXPECT_LT(peakOfArchive(pells_test::archiveWithDirectory(emptyNames), "", 0), 2 * size + MiB);
}

TEST_F(Proportion, OfMembersThatInflateAThousandfold) {
    const std::int64_t size = 100 * MiB;
    const std::string bytes = pells_test::archiveOf({{"bomb", std::string(size, '\0')}});
    EXPECT_LT(bytes.size(), std::size_t(size / 900));
    EXPECT_LT(peakOfArchive(bytes, "bomb", size), 512 * KiB);
}

TEST_F(Proportion, OfAliasesThatDoubleWithEveryLevel) {
    std::vector<std::pair<std::string, std::string>> members;
    std::string folder;
    for (int depth = 0; depth < 60; ++depth) {
        members.emplace_back(folder + ".symlinks", "link>d\n");
        folder += "d/";
    }
    members.emplace_back(folder + "x", "");
    scratch.write("root/a.asset", pells_test::archiveOf(members));
    pells_test::prefs() = {{"log", "error"}, {"assetLocation", "root"}};
    for (const std::int64_t limit : {100, 10000}) {
        pells::AssetManager::setAliasLimit(std::size_t(limit));
        const AllocationMeter meter;
        EXPECT_TRUE(pells::AssetManager::instance().isFile(folder + "x"));
        EXPECT_LT(meter.peakBytes(), MiB + 700 * limit);
        pells::SingletonList::freeSingletons();
    }
}

TEST_F(Proportion, OfFoldersThatOnlyLongNamesGoThrough) {
    const std::string component(250, 'c');
    std::vector<std::pair<std::string, std::string>> members = {{".symlinks", "link>0\n"}};
    std::size_t nameBytes = 0;
    for (int chain = 0; chain < 30; ++chain) {
        std::string name = std::to_string(chain / 15) + '/' + std::to_string(chain);
        for (int depth = 0; depth < 260; ++depth)
            name += '/' + component;
        nameBytes += name.size();
        members.emplace_back(name, "");
    }
    scratch.write("root/a.asset", pells_test::archiveOf(members));
    pells_test::prefs() = {{"log", "error"}, {"assetLocation", "root"}};
    const AllocationMeter meter;
    EXPECT_TRUE(pells::AssetManager::instance().isFile(members.back().first));
    EXPECT_LT(meter.peakBytes(), std::int64_t(30 * nameBytes));
    pells::SingletonList::freeSingletons();
    EXPECT_LT(pells_test::readFile("pells.log").size(), 10 * nameBytes);
}

TEST_F(Proportion, OfTokensWhateverIsSkipped) {
    const char single[] = "Token: 1 (T_SINGLE) <a/>";
    const struct {
        const char* text;  // with a "*" for 20 million of the filling
        char filling;
        const char* token;  // "" when the filling is part of it
    } cases[] = {{"<!--*--><a/>", 'x', single},
                 {" *<a/>", '\n', single},
                 {"<a */>", ' ', single},
                 {"<?xml version='*'?><a/>", '1', single},
                 {"&*;", 'n', "Token: 4 (T_TEXT) \"?\""},
                 {"&#x*41;", '0', "Token: 4 (T_TEXT) \"A\""},
                 {"x*", '>', ""},
                 {"<a b='*'/>", '\t', ""},
                 {"<*/>", 'n', ""}};
    for (const auto& each : cases) {
        SCOPED_TRACE(each.text);
        const std::int64_t length = 20000000;
        std::string text = each.text;
        text.replace(text.find('*'), 1, std::size_t(length), each.filling);
        std::istringstream in(text);
        const AllocationMeter meter;
        pells::XMLTokenizer tokenizer(in);
        const Token token = tokenizer.getToken();
        // A string that grows with the text doubles, and is in two blocks while it does.
        EXPECT_LT(meter.peakBytes(), *each.token == '\0' ? 4 * length : 4096);
        std::ostringstream written;
        written << token;
        if (*each.token == '\0')
            EXPECT_GE(written.str().size(), std::size_t(length));
        else
            EXPECT_EQ(written.str(), each.token);
        EXPECT_EQ(tokenizer.getToken().type, Token::T_EOF);
    }
}

TEST_F(Proportion, OfRulesOfTheLog) {
    pells_test::prefs().clear();
    std::string rules;
    for (int i = 0; i < 10000000; ++i)
        rules += "x ";
    scratch.write("pells.log.prefs", rules + "late");
    const AllocationMeter meter;
    EXPECT_FALSE(pells::Log::instance().isEnabled("late", false));
    EXPECT_LT(meter.peakBytes(), 64 * MiB);
}

TEST_F(Proportion, OfAttributes) {
    const std::int64_t count = 1000000;
    RepeatedText text("<a", " a='1'", count, "/>");
    std::istream in(&text);
    const AllocationMeter meter;
    EXPECT_EQ(pells::XMLTokenizer(in).getToken().attrs.size(), std::size_t(count));
    EXPECT_LT(meter.peakBytes(), 4 * std::int64_t(sizeof(Token::Attribute)) * count);
}

TEST_F(Proportion, OfElementsInsideElements) {
    pells_test::Everything object;
    const auto peakOfLoading = [&object](std::streambuf& text, const std::string& message) {
        std::istream in(&text);
        const AllocationMeter meter;
        try {
            pells::XMLTokenizer tokenizer(in);
            pells::OpenTag root(tokenizer, tokenizer.getToken());
            object.load(root, nullptr);
            ADD_FAILURE() << "expected " << message;
        } catch (const pells::Serializable::LoadFail& failure) {
            EXPECT_EQ(failure.what(), message);
        }
        return meter.peakBytes();
    };
    // The names of the elements that are open have to be known, and nothing else.
    RepeatedText unknown("<root>", "<u>", 10000000, "");
    EXPECT_LT(peakOfLoading(unknown, "Malformed XML: premature EOF"), 60 * MiB);

    RepeatedText known("<root>", "<child class='Everything'>", 10000000, "");
    EXPECT_LT(peakOfLoading(known, "Malformed XML: nested too deeply"), 4 * MiB);

    RepeatedText text("<root><s>", "0123456789", 100000000, "</s></root>");
    EXPECT_LT(peakOfLoading(text, "XML token larger than 67108864 bytes"), 256 * MiB);

    pells::InTag::setMaximumDocumentSize(16 * MiB);
    RepeatedText materials("<root><materials>", "<material/>", 100000000, "</materials></root>");
    EXPECT_LT(peakOfLoading(materials, "XML document goes on beyond byte 16777222"), 1024 * MiB);
}

}  // namespace
