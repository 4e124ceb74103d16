#pragma once

#include <cstddef>
#include <cstdint>
#include <iosfwd>
#include <memory>
#include <string>

#include "pells/core/export.h"
#include "pells/core/version.h"
#include "pells/xml/attr_map.h"
#include "pells/xml/tokenizer.h"

namespace pells {

class ClassDesc;
class Serializable;

/// An XML element while it is read or written: a name and attributes.
class PELLS_API Tag {
public:
    /// Visit attributes, as AttrMap's do.
    typedef AttrMap::iterator attr_iterator;
    typedef AttrMap::const_iterator const_attr_iterator;

    Tag() = default;
    Tag(const Tag&) = default;
    Tag& operator=(const Tag&) = default;
    virtual ~Tag();

    /// The element's name; "" for a tag that holds a text token.
    const std::string& getName() const { return name; }

    /// The value of an attribute; "" when the element has none of that name. Valid until the
    /// attributes change.
    const std::string& getAttr(const std::string& attrName) const;

    /// Adds an attribute or replaces its value; both are held unescaped.
    void setAttr(const std::string& attrName, std::string value);

    /// Visit the attributes, as pairs of a name and a value, in the order of AttrMap, which is also
    /// the order in which they are written.
    attr_iterator beginAttrs() { return attrs.begin(); }
    attr_iterator endAttrs() { return attrs.end(); }
    const_attr_iterator beginAttrs() const { return attrs.begin(); }
    const_attr_iterator endAttrs() const { return attrs.end(); }

protected:
    std::string name;  ///< see getName()
    AttrMap attrs;     ///< unescaped
};

/// An element that is read. It lives while its content is read and shares its parent's tokenizer.
class PELLS_API InTag : public Tag {
public:
    /// \param source not owned; outlives the tag.
    explicit InTag(XMLTokenizer& source);

    /// Copies all but the position in the text: the copy's text is scanned from its start.
    InTag(const InTag& other);
    InTag& operator=(const InTag&) = delete;
    ~InTag() override;

    /// Reads the element's content, through its end tag, into the fields of a description.
    ///
    /// \param obj is handed to the fields as it is; may be null where they need none.
    /// \throws Serializable::LoadFail for an end tag that does not match, for input that ends
    ///         inside the element, for elements nested deeper than maximumDepth(), for a document
    ///         larger than maximumDocumentSize() or a token larger than
    ///         XMLTokenizer::maximumTokenSize(), and as the fields do. What was read until then
    ///         stays in the object.
    virtual void parseContents(Serializable* obj, const ClassDesc& desc) = 0;

    /// The whole current text, however much of it was scanned. Valid until the next text is read.
    const std::string& getText() const { return text; }

    /// The current text as a stream in the classic locale with default flags, for type handlers to
    /// scan; made when first asked for. Valid until the next text is read.
    std::istringstream& textStream();

    /// 0.0, or what the parent has.
    const Version& getVersion() const { return version; }

    /// Checks that only white space is left where a value was scanned. A stream on which scanning
    /// has failed passes.
    ///
    /// \throws Serializable::LoadFail "Failed to scan text value"
    void checkEndText(std::istream& in) const;

    /// How deep elements that are read into objects may nest; the root element is at depth 1.
    /// Reading recurses, so the limit protects the stack: the default is safe where it has 1 MiB.
    /// Unrecognised elements do not count: they are skipped without recursion at any depth.
    static unsigned maximumDepth();

    /// Takes effect at once. \param levels at least 1.
    static void setMaximumDepth(unsigned levels);

    /// How much text a document may have that is read into objects, in bytes from the start tag of
    /// its root element on: 256 MiB unless it was set. Objects take several times as much memory.
    static std::uint64_t maximumDocumentSize();

    /// Takes effect for root elements that are made later.
    static void setMaximumDocumentSize(std::uint64_t bytes);

protected:
    typedef XMLTokenizer::Token Token;  ///< for short

    /// Makes a child without data: one level deeper, with the parent's tokenizer and version.
    struct ChildOf {
        InTag& parent;
    };
    explicit InTag(const ChildOf& family);

    /// Takes name and attributes of a start tag or empty-element tag, or the text of a text token.
    void setData(const Token& token);
    void setData(Token&& token);

    /// Makes a text the current one, to be scanned from its start.
    void setText(std::string&& newText);

    XMLTokenizer& tokenizer;  ///< shared with all tags of the document
    unsigned depth = 1;       ///< 1 for the root element
    /// How far the document may reach in the tokenizer's stream.
    std::uint64_t documentEnd;

private:
    std::string text;
    std::unique_ptr<std::istringstream> scanner;
    Version version;
};

/// An element with content, which is read up to its end tag.
class PELLS_API OpenTag : public InTag {
public:
    /// The root element.
    ///
    /// \param source not owned; outlives the tag.
    /// \param token  the start tag that was just read.
    OpenTag(XMLTokenizer& source, const Token& token);

    /// A child element, with the start tag that was just read; the parent outlives it.
    OpenTag(InTag& parent, const Token& token);
    OpenTag(InTag& parent, Token&& token);

    OpenTag(const OpenTag&) = default;
    ~OpenTag() override;

    void parseContents(Serializable* obj, const ClassDesc& desc) override;

private:
    class SkippedElements;

    bool _parseToken(Token& token, Serializable* obj, const ClassDesc& desc,
                     SkippedElements& skipped);
    bool _closeElement(const Token& token, SkippedElements& skipped);
    void _showValidTags(const std::string& tagText, const ClassDesc& desc);

    bool warned = false;  // of the innermost open element, while unrecognised ones are skipped
};

/// An empty element.
class PELLS_API SingleTag : public InTag {
public:
    /// The root element.
    ///
    /// \param source not owned; outlives the tag.
    /// \param token  the empty-element tag that was just read.
    SingleTag(XMLTokenizer& source, const Token& token);

    /// A child element, with the empty-element tag that was just read; the parent outlives it.
    SingleTag(InTag& parent, const Token& token);
    SingleTag(InTag& parent, Token&& token);

    SingleTag(const SingleTag&) = default;
    ~SingleTag() override;

    void parseContents(Serializable* obj, const ClassDesc& desc) override;
};

/// An element that is written. Nothing is written until one of its write operations is called, and
/// nothing is flushed.
///
///     OutTag shininess(parent, "shininess");
///     shininess.writeOpenTag(false);
///     shininess.writeText("0.5");
///     shininess.writeCloseTag(false);
///
/// An element with children is written as writeOpenTag(true), the children as OutTags made from
/// this one, writeCloseTag(true). Each level is indented by four spaces more.
class PELLS_API OutTag : public Tag {
public:
    /// The root element. The stream is not owned and outlives the document's tags.
    OutTag(std::ostream& stream, const std::string& tagName);

    /// A child of the outer element's name and attributes: a copy is one level deeper. The outer
    /// one outlives its children.
    OutTag(OutTag& outer);  // NOLINT(google-explicit-constructor): a copy constructor

    /// A child without attributes.
    OutTag(OutTag& outer, const std::string& tagName);

    OutTag& operator=(const OutTag&) = delete;
    ~OutTag() override;

    /// The stream that the whole document is written to.
    std::ostream& getStream() { return out; }

    /// How deep the element is nested; the root element is at depth 1.
    unsigned getDepth() const { return depth; }

    /// The names of the elements from the root to this one, as in "root/history/stack".
    std::string getPath() const;

    /// Changes the name that is written, which is not checked.
    void setTag(const std::string& tagName);

    /// Removes all attributes.
    void clearAttrs();

    /// Writes the indentation, the start tag and, on demand, a line feed.
    void writeOpenTag(bool newline);

    /// Writes the end tag and a line feed, with the indentation before it on demand.
    void writeCloseTag(bool indented);

    /// Writes the indentation, an empty-element tag and a line feed.
    void writeSingleTag();

    /// Writes text with "<", "&" and the double quote as entities.
    void writeText(const std::string& text);

protected:
    /// Writes the name and the attributes, whose values are escaped as in writeText().
    void writeTagAndAttrs();

private:
    class Line;

    void appendTagAndAttrs(Line& line) const;

    /// In spaces.
    std::size_t indent() const { return std::size_t{4} * (depth - 1); }

    std::ostream& out;
    const OutTag* const parent = nullptr;
    const unsigned depth = 1;
};

}  // namespace pells
