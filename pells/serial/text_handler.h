#pragma once

#include <boost/smart_ptr/intrusive_ptr.hpp>
#include <string>
#include <string_view>

#include "pells/core/export.h"
#include "pells/serial/class_desc.h"
#include "pells/serial/detail/nesting.h"
#include "pells/serial/detail/text_form.h"
#include "pells/serial/field.h"
#include "pells/serial/type_handler.h"
#include "pells/xml/tag.h"

namespace pells {

/// Handles values whose form is the text of an element, as in <shininess>0.5</shininess>.
///
/// Strings are written as they are. An empty string is written as <s></s>, which leaves the member
/// unchanged when it is loaded; <s/> empties it. White space at the start of a string is lost.
///
/// Numbers are written and read in the classic locale, whatever the global locale and that of the
/// stream; floats with the flags and the precision of the document's stream: six digits unless the
/// caller sets more, 9 for exact floats and 17 for exact doubles. A bool is 1 or 0. Text that does
/// not start with a number, such as <x>abc</x> or <b>true</b>, or with one that the type cannot
/// hold, leaves the value unchanged and is no error; anything but white space after a number
/// throws Serializable::LoadFail "Failed to scan text value", with the number stored.
///
/// Other types need operators << and >>, which are given streams in the classic locale; a type
/// whose value cannot be scanned keeps the value it had. See SimpleTypeHandler for an example.
template <class T>
class PELLS_TEMPLATE_API TextTypeHandler : public TypeHandler<T> {
public:
    void save(const T& value, OutTag& tag) override;

    /// Reads every piece of the element's text, so that the last one wins; elements inside it are
    /// skipped as unrecognised.
    void load(T& value, InTag& tag) override;

    /// Scans a value out of the current text of an element; writes nothing.
    class PELLS_TEMPLATE_API TextReader : public TypeHandler<T> {
    public:
        void save(const T& value, OutTag& tag) override;
        void load(T& value, InTag& tag) override;
    };

private:
    class TextField;
};

/// Lets a TextReader read each piece of text into a variable. A SimpleField would need an accessor
/// for that, and most elements are texts.
template <class T>
class PELLS_TEMPLATE_API TextTypeHandler<T>::TextField : public Field {
public:
    /// \param place not owned; outlives the field.
    explicit TextField(T* place) : Field(std::string_view()), variable(place) {}

    void load(Serializable* /*obj*/, InTag& tag) override { TextReader().load(*variable, tag); }

private:
    T* variable;
};

template <class T>
void TextTypeHandler<T>::save(const T& value, OutTag& tag) {
    detail::checkNesting(tag);
    tag.writeOpenTag(false);
    detail::writeText(value, tag);
    tag.writeCloseTag(false);
}

template <class T>
void TextTypeHandler<T>::load(T& value, InTag& tag) {
    const ClassDesc text(new TextField(&value));
    tag.parseContents(nullptr, text);
}

template <class T>
void TextTypeHandler<T>::TextReader::save(const T& /*value*/, OutTag& /*tag*/) {}

template <class T>
void TextTypeHandler<T>::TextReader::load(T& value, InTag& tag) {
    detail::readText(value, tag);
}

extern template class PELLS_API TextTypeHandler<std::string>;
extern template class PELLS_API TextTypeHandler<float>;
extern template class PELLS_API TextTypeHandler<bool>;

}  // namespace pells
