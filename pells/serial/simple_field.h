#pragma once

#include <boost/smart_ptr/intrusive_ptr.hpp>
#include <string_view>
#include <utility>

#include "pells/core/export.h"
#include "pells/serial/accessor.h"
#include "pells/serial/field.h"
#include "pells/serial/type_handler.h"

namespace pells {

/// A field that has an accessor and a handler.
template <class T, class U>
class PELLS_TEMPLATE_API DelegatorField : public Field {
public:
    /// \param valueAccessor finds the values.
    /// \param valueHandler  writes and reads them.
    DelegatorField(std::string_view fieldName, boost::intrusive_ptr<Accessor<T>> valueAccessor,
                   boost::intrusive_ptr<TypeHandler<U>> valueHandler)
        : Field(fieldName), accessor(std::move(valueAccessor)), handler(std::move(valueHandler)) {}

protected:
    boost::intrusive_ptr<Accessor<T>> accessor;    ///< finds the values
    boost::intrusive_ptr<TypeHandler<U>> handler;  ///< writes and reads them
};

/// A field whose accessor finds the values and whose handler writes and reads them.
template <class T>
class PELLS_TEMPLATE_API SimpleField : public DelegatorField<T, T> {
public:
    /// Neither pointer is null.
    using DelegatorField<T, T>::DelegatorField;

    /// Writes the accessor's next value, if it has more.
    void save(const Serializable* obj, OutTag& tag) override {
        if (this->accessor->hasMore(obj))
            this->handler->save(*this->accessor->next(obj), tag);
    }

    /// Reads into the place that the accessor names.
    void load(Serializable* obj, InTag& tag) override {
        this->handler->load(*this->accessor->target(obj), tag);
        this->accessor->finish();
    }
};

}  // namespace pells
