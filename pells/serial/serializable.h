#pragma once

#include <boost/smart_ptr/intrusive_ptr.hpp>
#include <stdexcept>
#include <string>

#include "pells/core/export.h"
#include "pells/serial/field.h"

namespace pells {

class InTag;
class OutTag;

/// Base of the objects that are saved to XML and loaded back.
///
/// A class describes its persistent members by overriding getField():
///
///     boost::intrusive_ptr<Field> Part::getField(const std::string& name) {
///         return makeComposite(name, ClassDesc(Base::getField("super"),
///                                              makeField("title", &Part::title),
///                                              makeField("weight", &Part::weight)));
///     }
///
/// The fields of the base class, if it has any, so become an element "super" before its own ones.
/// Saving and loading:
///
///     OutTag out(stream, "part");
///     part.save(out);
///
///     XMLTokenizer tokenizer(stream);
///     OpenTag in(tokenizer, tokenizer.getToken());  // a SingleTag if that is an empty element
///     part.load(in, nullptr);
class PELLS_API Serializable {
public:
    /// Thrown when an object is nested too deeply to be loaded again, and by classes of the
    /// application that cannot save an object. Making one logs "SaveFail: " and the message under
    /// "error".
    class PELLS_API SaveFail : public std::runtime_error {
    public:
        /// \param message what() says, and the log.
        explicit SaveFail(const std::string& message);
        SaveFail(const SaveFail&) = default;
        SaveFail& operator=(const SaveFail&) = default;
        ~SaveFail() override;
    };

    /// Thrown when a document cannot be loaded. Making one logs "LoadFail: " and the message under
    /// "error".
    class PELLS_API LoadFail : public std::runtime_error {
    public:
        /// \param message what() says, and the log.
        explicit LoadFail(const std::string& message);
        LoadFail(const LoadFail&) = default;
        LoadFail& operator=(const LoadFail&) = default;
        ~LoadFail() override;
    };

    /// Writes the object as the element that the tag names.
    ///
    /// \throws SaveFail "Nested too deeply to be loaded: " and the path of an element deeper than
    ///         InTag::maximumDepth(), as where an object holds itself; what lies before it has been
    ///         written by then.
    /// \throws LoadFail "No save() method" when the class overrides neither this nor getField().
    virtual void save(OutTag& tag);

    /// Reads the object from an element. Members that the document leaves out keep their values.
    ///
    /// \param tag   the object's start tag, or its empty-element tag.
    /// \param field describes the object; null: what getField() returns for the tag's name.
    /// \throws LoadFail for a document that cannot be read, see InTag::parseContents(), or "No
    ///         load() method" when there is no description. The object keeps what was read.
    virtual void load(InTag& tag, boost::intrusive_ptr<Field> field);

    /// The description of the class, made anew, as a field of the given name; null when the class
    /// has none.
    virtual boost::intrusive_ptr<Field> getField(const std::string& name);

    virtual ~Serializable();

protected:
    Serializable() = default;
    Serializable(const Serializable&) = default;
    Serializable& operator=(const Serializable&) = default;

private:
    boost::intrusive_ptr<Field> mustGetField(const std::string& name, const char* method);
};

}  // namespace pells
