#pragma once

#include <stdexcept>
#include <string>
#include <typeinfo>
#include <utility>

#include "pells/core/class_name.h"
#include "pells/core/export.h"

namespace pells {

/// Thrown for a name that no object has.
class PELLS_API BadEnum : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
    BadEnum(const BadEnum&) = default;
    BadEnum& operator=(const BadEnum&) = default;
    ~BadEnum() override;
};

/// Names one object of a family of named objects.
///
///     Enum<PerformanceCategory>("parser")->total()
///
/// \tparam T derived from NamedObject or DemandNamedObject.
template <class T>
class PELLS_TEMPLATE_API Enum {
public:
    /// Looks the object up, once. It is not owned.
    ///
    /// \throws BadEnum when no object has the name, nor is made on demand.
    explicit Enum(const std::string& name) : object(T::findp(name)) {
        if (!object)
            throw BadEnum("No Enum value '" + name + "' for " + className(typeid(*this)));
    }

    /// The object; never null.
    T* get() const { return &*object; }
    T& operator*() const { return *object; }
    T* operator->() const { return &*object; }

private:
    decltype(T::findp(std::string())) object;
};

}  // namespace pells
