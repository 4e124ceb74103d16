#pragma once

#include <boost/smart_ptr/intrusive_ptr.hpp>
#include <string>
#include <type_traits>

#include "pells/core/export.h"
#include "pells/serial/object_handlers.h"
#include "pells/serial/text_handler.h"
#include "pells/serial/type_handler.h"

namespace pells {
namespace detail {

/// Chooses how values of a type are handled.
template <class T, class = void>
struct HandlerOf {
    static_assert(!std::is_same_v<T, T>,
                  "no form in XML is known for this type: specialise pells::SimpleTypeHandler");
};
template <class T>
struct HandlerOf<T, std::enable_if_t<hasTextForm<T>>> {
    typedef TextTypeHandler<T> type;
};
template <class T>
struct HandlerOf<T, std::enable_if_t<std::is_base_of_v<Serializable, T>>> {
    typedef ObjectTypeHandler<T> type;
};
template <class B>
struct HandlerOf<B*> {
    typedef PolymorphicTypeHandler<B*, B> type;
};
template <class B>
struct HandlerOf<boost::intrusive_ptr<B>> {
    typedef PolymorphicTypeHandler<boost::intrusive_ptr<B>, B> type;
};

}  // namespace detail

/// The handler of every type that is no vector.
///
/// Known are strings, bool, the arithmetic types but characters and long double, Color, persistent
/// classes by value and pointers to them (B* and boost::intrusive_ptr<B>). An application adds a
/// type of its own by specialising this template. Where the type has operators << and >>, deriving
/// from TextTypeHandler does it:
///
///     template <>
///     class pells::SimpleTypeHandler<Angle> : public pells::TextTypeHandler<Angle> {};
///
/// Otherwise save() writes the element and load() reads it to its end, as in
///
///     template <>
///     class pells::SimpleTypeHandler<Size> : public pells::TypeHandler<Size> {
///     public:
///         void save(const Size& size, pells::OutTag& tag) override {
///             tag.setAttr("width", std::to_string(size.width));
///             tag.writeSingleTag();
///         }
///         void load(Size& size, pells::InTag& tag) override {
///             size.width = std::atoi(tag.getAttr("width").c_str());
///             tag.parseContents(nullptr, pells::ClassDesc());
///         }
///     };
template <class T>
class PELLS_TEMPLATE_API SimpleTypeHandler : public detail::HandlerOf<T>::type {};

extern template class PELLS_API SimpleTypeHandler<std::string>;
extern template class PELLS_API SimpleTypeHandler<float>;
extern template class PELLS_API SimpleTypeHandler<bool>;

}  // namespace pells
