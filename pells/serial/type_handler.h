#pragma once

#include "pells/core/export.h"
#include "pells/core/no_destructor.h"
#include "pells/core/smart_base.h"
#include "pells/serial/detail/pooled.h"

namespace pells {

class InTag;
class OutTag;

/// Writes values of one type as elements and reads them back. Handlers have no state of a run: all
/// fields of a type share one, but for sequences.
template <class T>
class PELLS_TEMPLATE_API TypeHandler : public smart_base, public detail::Pooled {
public:
    /// Writes the whole element, whose name the caller has chosen, or nothing.
    virtual void save(const T& value, OutTag& tag) = 0;

    /// Reads the whole element through its end tag.
    ///
    /// \throws Serializable::LoadFail
    virtual void load(T& value, InTag& tag) = 0;
};

/// The handler of every type that is no vector, see simple_type_handler.h.
template <class T>
class SimpleTypeHandler;

namespace detail {

/// The one object of a handler class without data, as a field may hold it.
template <class Handler>
Handler* sharedHandler() {
    static Handler* const handler = [] {
        static NoDestructor<Handler> object;
        object->addRef();  // which keeps it, whoever comes and goes
        return &*object;
    }();
    return handler;
}

}  // namespace detail
}  // namespace pells
