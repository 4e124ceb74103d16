#include "pells/asset/detail/pell_directory.h"

#include <algorithm>
#include <cstddef>
#include <cstring>
#include <iterator>
#include <utility>
#include <vector>

namespace pells::detail {

namespace {

typedef basic_pellbuf<std::istream>::Directory Directory;
typedef basic_pellbuf<std::istream>::Entry Entry;

const int endOfFile = -1;
const int endMark = 0x1A;

/// The white space of the classic locale.
bool isWordEnd(char c) {
    return c == ' ' || (c >= '\t' && c <= '\r');
}

/// Digits only: what stream extraction would take beside them (a sign, "0x") is no number here.
bool parseHexadecimal(const std::string& text, std::uint32_t& value) {
    value = 0;
    for (const char c : text) {
        std::uint32_t digit = 0;
        if (c >= '0' && c <= '9')
            digit = static_cast<std::uint32_t>(c - '0');
        else if (c >= 'a' && c <= 'f')
            digit = static_cast<std::uint32_t>(c - 'a') + 10;
        else if (c >= 'A' && c <= 'F')
            digit = static_cast<std::uint32_t>(c - 'A') + 10;
        else
            return false;
        if (value >> 28 != 0)
            return false;
        value = value << 4 | digit;
    }
    return true;
}

/// Entries whose names come too late to be in order. Sorted first, they go into a large directory
/// several times faster than one by one, when each looks for its place all over the memory.
class Stragglers {
public:
    void add(std::string&& name, const Entry& entry) {
        entries.emplace_back(std::move(name), entry);
    }

    /// Of entries with one name the one that was added last counts, also before the directory's.
    void moveInto(Directory& directory) {
        order.reserve(entries.size());
        for (std::size_t i = 0; i < entries.size(); ++i)
            order.push_back(Ranked{0, i});
        sort(order.begin(), order.end(), 0);
        Directory::iterator place = directory.begin();
        for (const Ranked& each : order) {
            auto& entry = entries[each.index];
            place =
                std::next(directory.insert_or_assign(place, std::move(entry.first), entry.second));
        }
        entries.clear();
        order.clear();
    }

    std::size_t size() const { return entries.size(); }

private:
    /// A place among the entries, with a piece of the name there.
    struct Ranked {
        std::uint64_t piece;
        std::size_t index;
    };
    typedef std::vector<Ranked>::iterator Place;

    /// Sorts by what follows so many characters, which are the same in all the names: by a piece of
    /// the names at a time, so that most of the work is on numbers that lie side by side.
    void sort(Place first, Place last, std::size_t depth) {
        const std::ptrdiff_t fewNames = 8;
        const std::size_t longName = 256;
        if (last - first < fewNames || depth >= longName) {
            std::sort(first, last, [this](const Ranked& a, const Ranked& b) {
                const int relation = entries[a.index].first.compare(entries[b.index].first);
                return relation < 0 || (relation == 0 && a.index < b.index);
            });
            return;
        }
        for (Place each = first; each != last; ++each)
            each->piece = pieceOf(entries[each->index].first, depth);
        const auto byPiece = [](const Ranked& a, const Ranked& b) { return a.piece < b.piece; };
        std::sort(first, last, byPiece);
        while (first != last) {
            const Place end = std::upper_bound(first, last, *first, byPiece);
            sort(first, end, depth + sizeof first->piece);
            first = end;
        }
    }

    /// Eight characters as a number that compares as they do; zeros behind the end of the name.
    static std::uint64_t pieceOf(const std::string& name, std::size_t start) {
        std::uint64_t piece = 0;
        for (std::size_t i = start; i < start + sizeof piece; ++i)
            piece = piece << 8 | (i < name.size() ? static_cast<unsigned char>(name[i]) : 0U);
        return piece;
    }

    std::vector<std::pair<std::string, Entry>> entries;
    std::vector<Ranked> order;
};

class DirectoryScanner {
public:
    explicit DirectoryScanner(std::istream& archiveStream)
        : stream(archiveStream), next(block), end(block) {}

    void readInto(Directory& directory) {
        int c = get();
        while (c != endOfFile && c != endMark) {
            c = readEntry(c);
            const Entry entry = {number('O', offsetText), number('L', lengthText)};
            // Writers mostly list names in order; then each entry goes right behind the last one.
            if (directory.empty() || directory.rbegin()->first < name)
                directory.emplace_hint(directory.end(), std::move(name), entry);
            else
                addStraggler(directory, entry);
        }
        stragglers.moveInto(directory);
    }

private:
    void addStraggler(Directory& directory, const Entry& entry) {
        const std::size_t fewEntries = 1024;
        stragglers.add(std::move(name), entry);
        // They may be a few names over and over again.
        if (stragglers.size() > std::max(directory.size(), fewEntries))
            stragglers.moveInto(directory);
    }

    /// Reads the entry that begins with c, and one character more, which it returns.
    int readEntry(int c) {
        offsetText.clear();
        lengthText.clear();
        name.clear();
        while (c != endOfFile && c != endMark && c != '|') {
            std::string& text = c == 'O' ? offsetText : c == 'L' ? lengthText : ignoredText;
            if (!readWord(text))
                throw pellibuf::BadPellFile("Cannot read pell file directory entry");
            c = get();
            if (c == ' ')
                c = get();
        }
        if (c == '|') {
            readName();
            c = get();
        }
        return c;
    }

    void readName() {
        if (!readLine(name))
            throw pellibuf::BadPellFile("Cannot read pell file member name");
        if (name.empty() || name.back() != '\r')
            throw pellibuf::BadPellFile("Bad pell file member name");
        name.pop_back();
    }

    std::uint32_t number(char code, const std::string& text) const {
        // A word that was read is never empty.
        if (text.empty())
            throw pellibuf::BadPellFile(inEntry() + "missing field '" + code + "'");
        std::uint32_t value = 0;
        if (!parseHexadecimal(text, value))
            throw pellibuf::BadPellFile(inEntry() + "bad field '" + code + "': '" + text + "'");
        return value;
    }

    std::string inEntry() const { return "Pell file directory entry '" + name + "': "; }

    int get() {
        if (next == end && !refill())
            return endOfFile;
        return static_cast<unsigned char>(*next++);
    }

    /// The run of characters up to the next white space, after skipping white space; false when the
    /// file ends before it.
    bool readWord(std::string& word) {
        do {
            while (next != end && isWordEnd(*next))
                ++next;
        } while (next == end && refill());
        word.clear();
        while (next != end) {
            const char* const start = next;
            while (next != end && !isWordEnd(*next))
                ++next;
            word.append(start, next);
            if (next != end || !refill())
                break;
        }
        return !word.empty();
    }

    /// The characters up to the next line feed, which is taken, too; false when the file ends
    /// before the first.
    bool readLine(std::string& line) {
        if (next == end && !refill())
            return false;
        do {
            const void* const found = std::memchr(next, '\n', static_cast<std::size_t>(end - next));
            const char* const stop = found ? static_cast<const char*>(found) : end;
            line.append(next, stop);
            next = found ? stop + 1 : stop;
            if (found)
                break;
        } while (refill());
        return true;
    }

    bool refill() {
        stream.read(block, sizeof block);
        next = block;
        end = block + stream.gcount();
        return next != end;
    }

    std::istream& stream;
    Stragglers stragglers;
    const char* next;
    const char* end;
    std::string offsetText;
    std::string lengthText;
    std::string ignoredText;
    std::string name;
    char block[16384];
};

}  // namespace

void readPellDirectory(std::istream& stream, Directory& directory) {
    DirectoryScanner(stream).readInto(directory);
}

}  // namespace pells::detail
