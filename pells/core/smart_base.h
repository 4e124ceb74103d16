#pragma once

#include <cstdint>

#include "pells/core/export.h"

namespace pells {

/// Polymorphic base of the objects that the library holds through boost::intrusive_ptr.
///
/// An object starts with no references and deletes itself when the last intrusive pointer lets go;
/// one that is never held by an intrusive pointer belongs to its creator. The count is a plain
/// integer: references to one object are taken and dropped on one thread.
class PELLS_API smart_base {
public:
    virtual ~smart_base();

    /// Takes one reference.
    virtual void addRef();

    /// Drops one reference and calls dispose() when none remains.
    virtual void release();

    /// Ends the object; here by deleting it through its virtual destructor.
    virtual void dispose();

protected:
    smart_base() = default;

    /// A copy is an object of its own: its count starts at 0, and assignment leaves both counts.
    smart_base(const smart_base& /*other*/) {}
    smart_base& operator=(const smart_base& /*other*/) { return *this; }

private:
    friend class KeptAlive;

    std::int32_t count = 0;
};

/// What boost::intrusive_ptr calls to take and to drop a reference.
inline void intrusive_ptr_add_ref(smart_base* object) {
    object->addRef();
}
inline void intrusive_ptr_release(smart_base* object) {
    object->release();
}

/// Keeps an object alive during a call in which it may lose all its references.
///
/// It does what an intrusive pointer does without its two virtual calls, unless the class keeps a
/// count of its own.
class KeptAlive {
public:
    /// \param object outlives this one, if it is not deleted by it.
    explicit KeptAlive(smart_base& object) : kept(object), isCounted(object.count > 0) {
        if (isCounted)
            ++kept.count;
        else
            kept.addRef();
    }
    KeptAlive(const KeptAlive&) = delete;
    KeptAlive& operator=(const KeptAlive&) = delete;
    ~KeptAlive() {
        if (isCounted && kept.count > 1)
            --kept.count;
        else
            kept.release();
    }

private:
    smart_base& kept;
    const bool isCounted;
};

}  // namespace pells
