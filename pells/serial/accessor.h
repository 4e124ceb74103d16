#pragma once

#include <type_traits>
#include <typeinfo>
#include <utility>

#include "pells/core/export.h"
#include "pells/core/no_destructor.h"
#include "pells/core/smart_base.h"
#include "pells/serial/detail/pooled.h"
#include "pells/serial/serializable.h"

namespace pells {

/// Finds the values of a field inside an object.
///
/// Accessors hold the state of one save or load, and are made anew for each.
template <class T>
class PELLS_TEMPLATE_API Accessor : public smart_base, public detail::Pooled {
public:
    /// The place that a loaded value goes to.
    virtual T* target(Serializable* obj) = 0;

    /// Called after each loaded value.
    virtual void finish() {}

    /// Whether a value remains to be saved.
    virtual bool hasMore(const Serializable* obj) = 0;

    /// The next value to be saved; moves past it.
    virtual const T* next(const Serializable* obj) = 0;
};

/// Gives one value, once.
template <class T>
class PELLS_TEMPLATE_API ScalarAccessor : public Accessor<T> {
public:
    /// True the first time it is asked.
    bool hasMore(const Serializable* /*obj*/) override { return std::exchange(pending, false); }

private:
    bool pending = true;
};

/// A data member of an object.
///
/// \tparam Owner the class that declares the member.
template <class Owner, class T>
class PELLS_TEMPLATE_API MemberAccessor : public ScalarAccessor<T> {
public:
    /// \param position of the member in its class.
    explicit MemberAccessor(T Owner::*position) : member(position) {}

    /// \throws std::bad_cast when the object is no Owner.
    T* target(Serializable* obj) override { return &(ownerOf<Owner>(obj)->*member); }
    const T* next(const Serializable* obj) override {
        return &(ownerOf<const Owner>(obj)->*member);
    }

private:
    static void* wholeOf(Serializable* obj) { return dynamic_cast<void*>(obj); }
    static const void* wholeOf(const Serializable* obj) { return dynamic_cast<const void*>(obj); }

    template <class To, class From>
    static To* ownerOf(From* obj) {
        if (!obj)
            throw std::bad_cast();
        // A dynamic cast searches the bases; most objects are just of the class. One whose class
        // has its type information in another library, too, may go the long way.
        if (&typeid(*obj) == &typeid(To))
            return static_cast<To*>(wholeOf(obj));
        return &dynamic_cast<To&>(*obj);
    }

    T Owner::*member;
};

/// A variable, whatever the object.
template <class T>
class PELLS_TEMPLATE_API VariableAccessor : public ScalarAccessor<T> {
public:
    /// \param place not owned; outlives the accessor.
    explicit VariableAccessor(T* place) : variable(place) {}

    T* target(Serializable* /*obj*/) override { return variable; }
    const T* next(const Serializable* /*obj*/) override { return variable; }

private:
    T* variable;
};

namespace detail {

/// What accessors of one direction answer when they are used in the other one.
template <class T>
T* unusedValue() {
    if constexpr (std::is_trivially_destructible_v<T>) {
        static T value{};
        return &value;
    } else {
        static NoDestructor<T> value;
        return &*value;
    }
}

}  // namespace detail

/// An accessor that is only loaded through.
template <class T>
class PELLS_TEMPLATE_API LoaderAccessor : public Accessor<T> {
public:
    bool hasMore(const Serializable* /*obj*/) override { return false; }
    const T* next(const Serializable* /*obj*/) override { return detail::unusedValue<T>(); }
};

/// Loads the items of a sequence.
template <class Seq>
class PELLS_TEMPLATE_API SequenceLoader : public LoaderAccessor<typename Seq::value_type> {
public:
    /// \param filled not owned; outlives the accessor.
    explicit SequenceLoader(Seq* filled) : sequence(filled) {}

protected:
    Seq* sequence;  ///< what is filled
};

/// Appends each item to the sequence before it is loaded.
template <class Seq>
class PELLS_TEMPLATE_API InPlaceSequenceLoader : public SequenceLoader<Seq> {
public:
    using SequenceLoader<Seq>::SequenceLoader;

    typename Seq::value_type* target(Serializable* /*obj*/) override {
        this->sequence->emplace_back();
        return &this->sequence->back();
    }
};

}  // namespace pells
