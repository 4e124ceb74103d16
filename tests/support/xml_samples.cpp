#include "support/xml_samples.h"

#include <algorithm>
#include <filesystem>

#include "support/scratch_directory.h"

namespace pells_test {

namespace fs = std::filesystem;

std::string XmlGenerator::name() {
    static const char starts[] = "abcXYZ_-xmlt";
    static const char others[] = "azAZ059_-";
    std::string made(1, starts[below(sizeof starts - 1)]);
    // Now and then longer than what a string holds without an allocation.
    for (unsigned left = chance(10) ? 40 : below(6); left > 0; --left)
        made += others[below(sizeof others - 1)];
    return made;
}

std::string XmlGenerator::space(unsigned least) {
    std::string made;
    for (unsigned left = least + (chance(70) ? 0 : below(chance(5) ? 100 : 4)); left > 0; --left)
        made += "\t\n\r "[below(4)];
    return made;
}

std::string XmlGenerator::reference() {
    static const char* const known[] = {"&amp;", "&lt;", "&gt;", "&apos;", "&quot;"};
    switch (below(4)) {
        case 0:
            return "&#" + std::to_string(random() >> below(32)) + ';';
        case 1:
            return "&#x" + std::to_string(below(1000)) + "aF"[below(2)] + ';';
        case 2:
            return '&' + name() + ';';
        default:
            return known[below(5)];
    }
}

std::string XmlGenerator::text() {
    std::string made;
    for (unsigned left = chance(10) ? 60 : below(12); left > 0; --left) {
        if (chance(8))
            made += reference();
        else if (chance(5))
            made += static_cast<char>(static_cast<unsigned char>(0x80 + below(0x80)));
        else
            made += "etaoin 12.;'\">-]\n\r\t\x01"[below(20)];
    }
    return made;
}

std::string XmlGenerator::quoted() {
    const char quote = "\"'"[below(2)];
    std::string made = text();
    made.erase(std::remove(made.begin(), made.end(), quote), made.end());
    return space(0) + '=' + space(0) + quote + made + quote;
}

std::string XmlGenerator::declaration() {
    return "<?xml" + space(1) + "version" + quoted() +
           (chance(50) ? space(1) + "encoding" + quoted() : "") +
           (chance(30) ? space(1) + "standalone" + quoted() : "") + space(0) + "?>";
}

std::string XmlGenerator::comment() {
    std::string made;
    for (unsigned left = chance(10) ? 100 : below(10); left > 0; --left)
        made += chance(20) ? "- " : std::string(1, "abc <&>\n\xE4"[below(9)]);
    return "<!--" + made + "-->";
}

void XmlGenerator::addElement(std::string& out, unsigned depth) {
    const std::string tag = name();
    out += '<' + tag;
    for (unsigned left = chance(50) ? 0 : below(5); left > 0; --left)
        out += space(1) + name() + quoted();
    out += space(0);
    if (chance(30)) {
        out += "/>";
        return;
    }
    out += '>';
    addContent(out, depth + 1);
    out += "</" + tag + space(0) + '>';
}

void XmlGenerator::addContent(std::string& out, unsigned depth) {
    for (unsigned left = below(4); left > 0; --left) {
        const unsigned kind = below(10);
        if (kind < 5 && depth < 5)
            addElement(out, depth);
        else if (kind < 8)
            out += text();
        else
            out += kind == 8 ? comment() : space(1);
    }
}

std::string XmlGenerator::document() {
    std::string made = chance(30) ? declaration() : "";
    made += space(0) + (chance(20) ? comment() : "");
    addElement(made, 0);
    return made + space(0);
}

std::string XmlGenerator::mutated(std::string text) {
    static const char interesting[] = "<>&;#x-!?/='\" \n[]:.a0\x01\x7F\xFF";
    for (unsigned left = 1 + below(3); left > 0 && !text.empty(); --left) {
        const std::size_t at = below(static_cast<unsigned>(text.size()));
        const std::size_t other = below(static_cast<unsigned>(text.size()));
        const std::size_t length = 1 + below(6);
        switch (below(5)) {
            case 0:
                text.erase(at, length);
                break;
            case 1:
                text.insert(at, text.substr(other, length));
                break;
            case 2:
                text[at] = interesting[below(sizeof interesting)];
                break;
            case 3:
                text.insert(at, 1, interesting[below(sizeof interesting)]);
                break;
            default:
                std::swap(text[at], text[other]);
                break;
        }
    }
    return text;
}

std::string XmlGenerator::fragments() {
    static const char* const pieces[] = {"<",
                                         ">",
                                         "</",
                                         "/>",
                                         "<a",
                                         "</a>",
                                         "<a>",
                                         " ",
                                         "\n",
                                         "a",
                                         "b-1",
                                         "=",
                                         "\"",
                                         "'",
                                         "='v'",
                                         "=\"v\"",
                                         "&",
                                         "&amp;",
                                         "&#",
                                         "&#x",
                                         "41",
                                         "fF",
                                         ";",
                                         "&no;",
                                         "<!--",
                                         "-",
                                         "--",
                                         "-->",
                                         "->",
                                         "x-y",
                                         "<!-- c -->",
                                         "<!",
                                         "<?xml",
                                         "<?",
                                         "?>",
                                         " version",
                                         " encoding",
                                         "xml",
                                         " standalone",
                                         "text",
                                         "<a b='c' ",
                                         "<?xml version='1'",
                                         "<?xml version='1'?>",
                                         "\x01",
                                         "\x80",
                                         "9",
                                         "]]>",
                                         ":"};
    std::string made = chance(50) ? "<t>" : "";
    for (unsigned left = 1 + below(14); left > 0; --left)
        made += pieces[below(sizeof pieces / sizeof *pieces)];
    return made;
}

std::string XmlGenerator::bytes() {
    std::string made = chance(50) ? "<t>" : "";
    for (unsigned left = below(40); left > 0; --left)
        made += static_cast<char>(static_cast<unsigned char>(random() >> 8));
    return made;
}

namespace {

bool isXmlName(const fs::path& path) {
    static const char* const endings[] = {".xml", ".svg",  ".xsd",    ".rng",
                                          ".ui",  ".xslt", ".docbook"};
    const std::string ending = path.extension().string();
    return std::find(std::begin(endings), std::end(endings), ending) != std::end(endings) ||
           (ending == ".conf" && path.string().find("font") != std::string::npos);
}

bool startsWith(const std::string& text, std::size_t at, const char* what) {
    return text.compare(at, std::string(what).size(), what) == 0;
}

/// Where the text goes on behind the next `mark`, or its end.
std::size_t behind(const std::string& text, const std::string& mark, std::size_t from) {
    const std::size_t found = text.find(mark, from);
    return found == std::string::npos ? text.size() : found + mark.size();
}

std::string escaped(const std::string& text) {
    std::string out;
    for (const char c : text)
        out += c == '<' ? "&lt;" : c == '&' ? "&amp;" : std::string(1, c);
    return out;
}

/// Appends a tag with its names changed; returns where the text goes on.
std::size_t addTag(const std::string& text, std::size_t at, std::string& out) {
    char quote = 0;
    for (; at < text.size(); ++at) {
        const char c = text[at];
        out += quote == 0 && (c == ':' || c == '.') ? '_' : c;
        if (quote == 0 && c == '>')
            return at + 1;
        if (quote == 0 && (c == '"' || c == '\''))
            quote = c;
        else if (c == quote)
            quote = 0;
    }
    return at;
}

}  // namespace

std::vector<std::string> xmlFilesOfThisMachine(std::size_t totalBytes) {
    const std::uintmax_t largestFile = 400000;
    const int mostEntries = 100000;
    std::vector<std::string> found;
    for (const char* const root : {"/etc", "/usr/share", "/usr/lib/python3"}) {
        std::error_code ignored;
        const auto options = fs::directory_options::skip_permission_denied;
        int entries = 0;
        for (fs::recursive_directory_iterator at(root, options, ignored), end;
             at != end && ++entries < mostEntries && !ignored; at.increment(ignored)) {
            std::error_code failed;
            if (!isXmlName(at->path()) || !at->is_regular_file(failed))
                continue;
            const std::uintmax_t size = at->file_size(failed);
            if (failed || size > std::min<std::uintmax_t>(largestFile, totalBytes))
                continue;
            totalBytes -= static_cast<std::size_t>(size);
            found.push_back(at->path().string());
        }
    }
    return found;
}

std::string inDialect(const std::string& document) {
    std::string out;
    for (std::size_t at = 0; at < document.size();) {
        if (startsWith(document, at, "<!DOCTYPE")) {
            const std::size_t subset = document.find_first_of("[>", at);
            const bool hasSubset = subset != std::string::npos && document[subset] == '[';
            at = behind(document, ">", hasSubset ? behind(document, "]", subset) : at);
        } else if (startsWith(document, at, "<![CDATA[")) {
            const std::size_t end = behind(document, "]]>", at);
            out += escaped(document.substr(at + 9, std::max(end, at + 12) - at - 12));
            at = end;
        } else if (startsWith(document, at, "<?")) {
            at = behind(document, "?>", at);
        } else if (startsWith(document, at, "<!--")) {
            const std::size_t end = behind(document, "-->", at + 4);
            const std::string comment = document.substr(at, end - at);
            if (comment.find("--", 4) + 3 == comment.size())
                out += comment;
            at = end;
        } else if (document[at] == '<') {
            at = addTag(document, at, out);
        } else {
            out += document[at++];
        }
    }
    return out;
}

}  // namespace pells_test
