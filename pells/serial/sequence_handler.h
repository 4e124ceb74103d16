#pragma once

#include <boost/smart_ptr/intrusive_ptr.hpp>
#include <string>
#include <string_view>
#include <type_traits>
#include <vector>

#include "pells/core/export.h"
#include "pells/core/strings.h"
#include "pells/serial/accessor.h"
#include "pells/serial/class_desc.h"
#include "pells/serial/detail/nesting.h"
#include "pells/serial/simple_field.h"
#include "pells/serial/simple_type_handler.h"
#include "pells/serial/type_handler.h"
#include "pells/xml/tag.h"

namespace pells {

/// Handles vectors: an element with one child element an item, named by the singular of the name
/// (see getSingularName()): "getters" holds elements "getter".
///
/// Loading appends: items that the vector already holds stay. An item whose loading throws stays in
/// the state it reached. Null pointers are not written, so they are missing after the next load.
template <class Seq>
class PELLS_TEMPLATE_API SequenceTypeHandler : public TypeHandler<Seq> {
public:
    /// What the vector holds.
    typedef typename Seq::value_type Item;

    static_assert(!std::is_same_v<Seq, std::vector<bool>>,
                  "a std::vector<bool> holds no bool that could be loaded in place: use another "
                  "item type, such as int");

    /// \param name the name of the sequence's element.
    explicit SequenceTypeHandler(const std::string& name);

    /// An empty vector is written as an empty element.
    void save(const Seq& sequence, OutTag& tag) override;
    void load(Seq& sequence, InTag& tag) override;

    /// Goes through the items that are saved.
    ///
    /// \tparam P pointer to a constant item.
    template <class P>
    class PELLS_TEMPLATE_API SequenceSaver : public Accessor<Item> {
    public:
        /// \param first, last of items that stay while they are saved.
        SequenceSaver(P first, P last) : current(first), end(last) {}

        Item* target(Serializable* /*obj*/) override { return detail::unusedValue<Item>(); }
        bool hasMore(const Serializable* /*obj*/) override { return current != end; }
        const Item* next(const Serializable* /*obj*/) override { return current++; }

    private:
        P current;
        P end;
    };

private:
    std::string itemName;
    boost::intrusive_ptr<TypeHandler<Item>> itemHandler;
};

namespace detail {

template <class T>
struct IsVector : std::false_type {};
template <class Item, class Allocator>
struct IsVector<std::vector<Item, Allocator>> : std::true_type {};

/// The handler of a type for the elements of that name.
template <class T>
boost::intrusive_ptr<TypeHandler<T>> handlerFor(std::string_view name) {
    if constexpr (IsVector<T>::value)
        return new SequenceTypeHandler<T>(std::string(name));
    else
        return sharedHandler<SimpleTypeHandler<T>>();
}

}  // namespace detail

template <class Seq>
SequenceTypeHandler<Seq>::SequenceTypeHandler(const std::string& name)
    : itemName(getSingularName(name)), itemHandler(detail::handlerFor<Item>(itemName)) {}

template <class Seq>
void SequenceTypeHandler<Seq>::save(const Seq& sequence, OutTag& tag) {
    if (sequence.empty()) {
        tag.writeSingleTag();
        return;
    }
    detail::checkNesting(tag);
    tag.writeOpenTag(true);
    const Item* const first = sequence.data();
    const boost::intrusive_ptr<Accessor<Item>> items(
        new SequenceSaver<const Item*>(first, first + sequence.size()));
    SimpleField<Item> field(itemName, items, itemHandler);
    while (items->hasMore(nullptr)) {
        OutTag child(tag, itemName);
        field.save(nullptr, child);
    }
    tag.writeCloseTag(true);
}

template <class Seq>
void SequenceTypeHandler<Seq>::load(Seq& sequence, InTag& tag) {
    const ClassDesc items(
        new SimpleField<Item>(itemName, new InPlaceSequenceLoader<Seq>(&sequence), itemHandler));
    tag.parseContents(nullptr, items);
}

}  // namespace pells
