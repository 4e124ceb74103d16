// The reader takes directories in blocks. Here they are read once more, the plain way, by formatted
// extraction, and the two must agree on every entry and every refusal.

#include <algorithm>
#include <random>
#include <sstream>

#include "pells/asset/pell_archive.h"
#include "support/archive_bytes.h"
#include "support/mutated.h"
#include "support/test_prefs.h"

namespace {

using pells::pellibuf;

std::uint32_t hexField(const std::string& name, std::map<char, std::string>& fields, char code) {
    const std::string entry = "Pell file directory entry '" + name + "': ";
    if (fields.count(code) == 0)
        throw pellibuf::BadPellFile(entry + "missing field '" + code + "'");
    const std::string& text = fields[code];
    std::string digits = text.substr(std::min(text.find_first_not_of('0'), text.size() - 1));
    std::istringstream number(digits);
    std::uint32_t value = 0;
    const bool onlyDigits = text.find_first_not_of("0123456789abcdefABCDEF") == std::string::npos;
    if (!onlyDigits || !(number >> std::hex >> value))
        throw pellibuf::BadPellFile(entry + "bad field '" + code + "': '" + text + "'");
    return value;
}

pellibuf::Directory readPlainly(const std::string& text) {
    pellibuf::Directory directory;
    std::istringstream in(text);
    int c = in.get();
    while (c != EOF && c != 0x1A) {
        std::map<char, std::string> fields;
        std::string name;
        while (c != EOF && c != 0x1A && c != '|') {
            std::string word;
            if (!(in >> word))
                throw pellibuf::BadPellFile("Cannot read pell file directory entry");
            fields[static_cast<char>(c)] = word;
            c = in.get();
            if (c == ' ')
                c = in.get();
        }
        if (c == '|') {
            if (!std::getline(in, name))
                throw pellibuf::BadPellFile("Cannot read pell file member name");
            if (name.empty() || name.back() != '\r')
                throw pellibuf::BadPellFile("Bad pell file member name");
            name.pop_back();
            c = in.get();
        }
        const std::uint32_t offset = hexField(name, fields, 'O');
        directory[name] = {static_cast<std::streamoff>(offset), hexField(name, fields, 'L')};
    }
    return directory;
}

/// The entries of a directory as text, or the message that refuses it.
template <class Read>
std::string outcome(Read read) {
    try {
        std::ostringstream text;
        for (const auto& entry : read())
            text << entry.first << ' ' << entry.second.offset << ' ' << entry.second.length << '\n';
        return text.str();
    } catch (const pellibuf::BadPellFile& refusal) {
        return refusal.what();
    }
}

/// Entries, most of them damaged in a few places.
std::string someDirectory(std::mt19937& random) {
    const auto word = [&random] {
        return random() % 20 == 0 ? std::string(8 + random() % 3, '0') + "12345678"
                                  : pells_test::hexadecimal(random() >> random() % 32);
    };
    std::string text;
    for (auto entries = random() % 6; entries > 0; --entries) {
        // One after the other, so that every compiler draws the same numbers.
        text += "O" + word();
        text += " L" + word();
        if (random() % 4 == 0)
            text += " X" + word();
        text += " |";
        text += "abcd"[random() % 4];
        text += word() + "\r\n";
    }
    if (random() % 4 != 0)
        text = pells_test::mutated(
            text, std::string("  \t\r\n\v\f||OOLLXxgG019aF+-.\x1a\xff\xa0\0", 29), random);
    if (random() % 16 == 0)
        text.resize(random() % (text.size() + 1));
    // The reader's blocks end somewhere in the changed text, too.
    if (random() % 8 == 0)
        text.insert(0,
                    "O1 L1 |" + std::string(16384 - random() % (text.size() + 20), 'n') + "\r\n");
    return text;
}

class PellDirectory : public pells_test::LibraryTest {};

TEST_F(PellDirectory, MeansWhatFormattedExtractionMakesOfIt) {
    std::mt19937 random(20240229);
    std::map<std::string, int> kinds;
    for (int i = 0; i < 10000; ++i) {
        const std::string text = someDirectory(random);
        const std::string path =
            pells_test::writeArchiveFile(scratch, pells_test::archiveWithDirectory(text));
        const std::string expected = outcome([&] { return readPlainly(text); });
        const std::string actual = outcome([&] { return pells::pellistream(path).getDirectory(); });
        ASSERT_EQ(actual, expected) << testing::PrintToString(text);
        ++kinds[expected.substr(0, expected.find('\''))];
    }
    // The cases reach every way to be refused.
    for (const char* const kind :
         {"Pell file directory entry ", "Cannot read pell file directory entry",
          "Cannot read pell file member name", "Bad pell file member name"})
        EXPECT_GT(kinds[kind], 50) << kind;
}

/// Names that are told apart by their last character only, by their length or by a zero byte, some
/// of them twice.
std::string similarName(std::mt19937& random) {
    const std::size_t lengths[] = {0, 1, 7, 8, 9, 16, 255, 256, 300};
    std::string name(lengths[random() % 9], random() % 4 == 0 ? '\xFF' : 'n');
    for (std::size_t letters = random() % 4; letters != 0; --letters)
        name += "\0a\xFF"[random() % 3];
    return name;
}

TEST_F(PellDirectory, SortsNamesInAnyOrderAndKeepsTheLastOfEach) {
    std::mt19937 random(11);
    std::string text;
    for (int i = 0; i < 3000; ++i)
        text += "O" + pells_test::hexadecimal(random()) + " L1 |" + similarName(random) + "\r\n";
    const std::string path =
        pells_test::writeArchiveFile(scratch, pells_test::archiveWithDirectory(text));
    EXPECT_EQ(outcome([&] { return pells::pellistream(path).getDirectory(); }),
              outcome([&] { return readPlainly(text); }));
}

}  // namespace
