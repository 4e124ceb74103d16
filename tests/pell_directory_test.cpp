// The reader takes directories in blocks. Here they are read once more, the plain way, by formatted
// extraction, and the two must agree on every entry and every refusal.

#include <gtest/gtest.h>

#include <algorithm>
#include <random>
#include <sstream>

#include "pells/asset/pell_archive.h"
#include "support/archive_bytes.h"
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

class DirectoryMutator {
public:
    std::string next() {
        std::string text;
        for (std::size_t entries = pick(6); entries > 0; --entries) {
            text += "O" + word() + " L" + word() + (pick(4) == 0 ? " X" + word() : "") + " |";
            text += std::string(1, static_cast<char>('a' + pick(4))) + word() + "\r\n";
        }
        for (std::size_t changes = pick(4); changes > 0; --changes)
            change(text);
        // The reader's blocks end somewhere in the changed text, too.
        if (pick(8) == 0)
            text.insert(0, "O1 L1 |" + std::string(16384 - pick(text.size() + 20), 'n') + "\r\n");
        return text;
    }

private:
    std::size_t pick(std::size_t choices) { return random() % choices; }

    std::string word() {
        return pick(20) == 0 ? std::string(8 + pick(3), '0') + "12345678"
                             : pells_test::hexadecimal(random() >> pick(32));
    }

    void change(std::string& text) {
        static const char choices[] = "  \t\r\n\v\f||OOLLXxgG019aF+-.\x1a\xff\xa0\0";
        const char byte = choices[pick(sizeof choices - 1)];
        const std::size_t at = pick(text.size() + 1);
        switch (pick(5)) {
            case 0:
                text.insert(at, 1 + pick(3), byte);
                break;
            case 1:
                text.erase(at, 1 + pick(4));
                break;
            case 2:
                text.resize(at);
                break;
            case 3:
                text.insert(at, text, pick(text.size() + 1), pick(20));
                break;
            default:
                if (at < text.size())
                    text[at] = byte;
        }
    }

    std::mt19937 random{20240229};
};

class PellDirectory : public pells_test::LibraryTest {};

TEST_F(PellDirectory, MeansWhatFormattedExtractionMakesOfIt) {
    DirectoryMutator mutator;
    std::map<std::string, int> kinds;
    for (int i = 0; i < 10000; ++i) {
        const std::string text = mutator.next();
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

}  // namespace
