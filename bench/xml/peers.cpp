#include "bench/xml/peers.h"

#include <expat.h>
#include <tinyxml2.h>

#include <algorithm>
#include <pugixml.hpp>
#include <rapidxml/rapidxml.hpp>
#include <rapidxml/rapidxml_utils.hpp>
#include <stdexcept>
#include <string>
#include <string_view>
#include <utility>

#include "tests/support/reference_tokenizer.h"

namespace bench {

namespace {

const std::size_t blockSize = 65536;

std::string contents(std::istream& in) {
    std::string all;
    std::size_t size = 0;
    do {
        all.resize(std::max(2 * size, std::size_t(8192)));
        in.read(&all[size], static_cast<std::streamsize>(all.size() - size));
        size += static_cast<std::size_t>(in.gcount());
    } while (in);
    all.resize(size);
    return all;
}

/// Makes tokens of expat's events. An event may add to the token before it, which is held back.
class ExpatTokens {
public:
    explicit ExpatTokens(Receiver& r) : parser(XML_ParserCreate(nullptr)), receiver(r) {
        XML_SetUserData(parser, this);
        XML_SetElementHandler(parser, open, close);
        XML_SetCharacterDataHandler(parser, addText);
    }
    ExpatTokens(const ExpatTokens&) = delete;
    ExpatTokens& operator=(const ExpatTokens&) = delete;
    ~ExpatTokens() { XML_ParserFree(parser); }

    void read(std::istream& in) {
        bool last = false;
        while (!last) {
            void* const block = XML_GetBuffer(parser, static_cast<int>(blockSize));
            in.read(static_cast<char*>(block), static_cast<std::streamsize>(blockSize));
            last = !in;
            if (XML_ParseBuffer(parser, static_cast<int>(in.gcount()), last) != XML_STATUS_OK)
                throw std::runtime_error("expat refuses the document");
        }
        handOut();
    }

private:
    static void open(void* self, const char* name, const char** attributes) {
        ExpatTokens& tokens = *static_cast<ExpatTokens*>(self);
        tokens.begin(Token::T_OPEN);
        tokens.held.value = name;
        for (; *attributes; attributes += 2)
            tokens.held.attrs.emplace_back(attributes[0], attributes[1]);
    }

    static void close(void* self, const char* name) {
        ExpatTokens& tokens = *static_cast<ExpatTokens*>(self);
        // No element of the documents has separate tags and nothing between them.
        if (tokens.held.type == Token::T_OPEN) {
            tokens.held.type = Token::T_SINGLE;
            return;
        }
        tokens.begin(Token::T_CLOSE);
        tokens.held.value = name;
    }

    static void addText(void* self, const char* text, int size) {
        ExpatTokens& tokens = *static_cast<ExpatTokens*>(self);
        std::string_view piece(text, static_cast<std::size_t>(size));
        if (tokens.held.type != Token::T_TEXT) {
            piece.remove_prefix(std::min(piece.find_first_not_of("\t\n\r "), piece.size()));
            if (piece.empty())
                return;
            tokens.begin(Token::T_TEXT);
        }
        tokens.held.value += piece;
    }

    void begin(Token::TokenType type) {
        handOut();
        held.type = type;
    }

    void handOut() {
        if (held.type != Token::T_IGNORE)
            receiver.take(std::exchange(held, Token()));
    }

    XML_Parser parser;
    Receiver& receiver;
    Token held;
};

/// Walks through the nodes of a parsed document. `Tree` tells how.
template <class Tree, class Node>
void walk(Node node, Receiver& receiver) {
    if (Tree::isText(node)) {
        receiver.take(Token{Token::T_TEXT, Tree::text(node), {}});
        return;
    }
    const bool empty = Tree::isEmpty(node);
    Token tag{empty ? Token::T_SINGLE : Token::T_OPEN, Tree::name(node), {}};
    Tree::copyAttributes(node, tag.attrs);
    receiver.take(std::move(tag));
    if (empty)
        return;
    Tree::forEachChild(node, [&receiver](auto child) { walk<Tree>(child, receiver); });
    receiver.take(Token{Token::T_CLOSE, Tree::name(node), {}});
}

struct PugixmlTree {
    typedef pugi::xml_node Node;

    static bool isText(Node node) { return node.type() == pugi::node_pcdata; }
    static bool isEmpty(Node node) { return !node.first_child(); }
    static std::string name(Node node) { return node.name(); }
    static std::string text(Node node) { return node.value(); }

    static void copyAttributes(Node node, std::vector<Token::Attribute>& into) {
        for (const pugi::xml_attribute each : node.attributes())
            into.emplace_back(each.name(), each.value());
    }

    template <class Function>
    static void forEachChild(Node node, Function function) {
        for (const Node child : node)
            function(child);
    }
};

struct RapidXmlTree {
    typedef rapidxml::xml_node<>* Node;

    static bool isText(Node node) { return node->type() == rapidxml::node_data; }
    static bool isEmpty(Node node) { return !node->first_node(); }
    static std::string name(Node node) { return {node->name(), node->name_size()}; }
    static std::string text(Node node) { return {node->value(), node->value_size()}; }

    static void copyAttributes(Node node, std::vector<Token::Attribute>& into) {
        for (auto* each = node->first_attribute(); each; each = each->next_attribute())
            into.emplace_back(std::string(each->name(), each->name_size()),
                              std::string(each->value(), each->value_size()));
    }

    template <class Function>
    static void forEachChild(Node node, Function function) {
        for (Node child = node->first_node(); child; child = child->next_sibling())
            function(child);
    }
};

struct TinyXml2Tree {
    typedef const tinyxml2::XMLNode* Node;

    static bool isText(Node node) { return node->ToText() != nullptr; }
    static bool isEmpty(Node node) { return node->NoChildren(); }
    static std::string name(Node node) { return node->Value(); }
    static std::string text(Node node) { return node->Value(); }

    static void copyAttributes(Node node, std::vector<Token::Attribute>& into) {
        for (auto* each = node->ToElement()->FirstAttribute(); each; each = each->Next())
            into.emplace_back(each->Name(), each->Value());
    }

    template <class Function>
    static void forEachChild(Node node, Function function) {
        for (Node child = node->FirstChild(); child; child = child->NextSibling())
            function(child);
    }
};

void tokensOfRapidXmlDocument(char* text, Receiver& receiver) {
    rapidxml::xml_document<> document;
    document.parse<rapidxml::parse_no_element_values>(text);
    walk<RapidXmlTree>(document.first_node(), receiver);
}

}  // namespace

void tokensOfPells(std::istream& in, Receiver& receiver) {
    pells::XMLTokenizer tokenizer(in);
    while (receiver.take(tokenizer.getToken())) {
    }
}

void tokensOfExpat(std::istream& in, Receiver& receiver) {
    ExpatTokens(receiver).read(in);
}

void tokensOfPugixml(std::istream& in, Receiver& receiver) {
    pugi::xml_document document;
    if (!document.load(in))
        throw std::runtime_error("pugixml refuses the document");
    walk<PugixmlTree>(document.document_element(), receiver);
}

void tokensOfRapidXml(std::istream& in, Receiver& receiver) {
    rapidxml::file<> text(in);
    tokensOfRapidXmlDocument(text.data(), receiver);
}

void tokensOfRapidXmlInMemory(std::istream& in, Receiver& receiver) {
    std::string text = contents(in);
    tokensOfRapidXmlDocument(&text[0], receiver);
}

void tokensOfTinyXml2(std::istream& in, Receiver& receiver) {
    const std::string text = contents(in);
    tinyxml2::XMLDocument document;
    if (document.Parse(text.data(), text.size()) != tinyxml2::XML_SUCCESS)
        throw std::runtime_error("tinyxml2 refuses the document");
    walk<TinyXml2Tree>(static_cast<const tinyxml2::XMLNode*>(document.RootElement()), receiver);
}

void tokensOfSpirit(std::istream& in, Receiver& receiver) {
    for (Token& token : pells_test::referenceTokens(in))
        receiver.take(std::move(token));
}

void tokensOfSpiritInMemory(std::istream& in, Receiver& receiver) {
    for (Token& token : pells_test::referenceTokens(contents(in)))
        receiver.take(std::move(token));
}

}  // namespace bench
