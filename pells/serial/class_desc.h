#pragma once

#include <boost/smart_ptr/intrusive_ptr.hpp>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

#include "pells/core/export.h"
#include "pells/serial/detail/pooled.h"
#include "pells/serial/field.h"

namespace pells {

/// The fields of one class, one per name. Copies share the fields.
class PELLS_API ClassDescBase {
public:
    /// How the fields are held: sorted by name.
    typedef std::vector<boost::intrusive_ptr<Field>,
                        detail::PooledAllocator<boost::intrusive_ptr<Field>>>
        Fields;
    /// Yields pointers to fields.
    typedef Fields::const_iterator const_iterator;

    /// Adds a field, whose order becomes the number of fields held before this call; it replaces
    /// one of the same name. A null pointer is ignored.
    void add(boost::intrusive_ptr<Field> field);

    /// The field of a name, or null.
    boost::intrusive_ptr<Field> get(const std::string& name) const { return find(name); }

    /// The same; the description keeps it.
    Field* find(const std::string& name) const;

    /// All fields, in ascending byte order of their names, as is iteration.
    std::vector<boost::intrusive_ptr<Field>> getFields() const { return {begin(), end()}; }

    /// The number of fields.
    unsigned size() const { return static_cast<unsigned>(fields.size()); }
    bool empty() const { return fields.empty(); }

    /// Visit the fields, sorted by name. Valid until one is added.
    const_iterator begin() const { return fields.begin(); }
    const_iterator end() const { return fields.end(); }

protected:
    ClassDescBase() = default;
    ClassDescBase(const ClassDescBase&) = default;
    ClassDescBase(ClassDescBase&&) = default;
    ClassDescBase& operator=(const ClassDescBase&) = default;
    ClassDescBase& operator=(ClassDescBase&&) = default;
    ~ClassDescBase() = default;

    /// Makes room for so many fields.
    void reserve(unsigned count) { fields.reserve(count); }

private:
    Fields fields;  // sorted by name: descriptions are short and built for each save and load
};

/// The description of a class, as Serializable::getField() builds it.
///
///     const ClassDesc desc(Base::getField("super"), makeField("name", &Part::name),
///                          makeField("weight", &Part::weight));
class PELLS_API ClassDesc : public ClassDescBase {
public:
    ClassDesc() = default;

    /// Adds each field, in the order of the arguments; null pointers are left out.
    template <class... Pointers,
              class = std::enable_if_t<
                  sizeof...(Pointers) != 0 &&
                  (std::is_convertible_v<Pointers, boost::intrusive_ptr<Field>> && ...)>>
    explicit ClassDesc(Pointers&&... each) {
        // Fields that were just made are owned before anything here can throw.
        boost::intrusive_ptr<Field> owned[] = {std::forward<Pointers>(each)...};
        reserve(sizeof...(Pointers));
        for (boost::intrusive_ptr<Field>& field : owned)
            add(std::move(field));
    }
};

}  // namespace pells
