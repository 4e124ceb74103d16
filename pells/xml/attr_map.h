#pragma once

#include <boost/iterator/transform_iterator.hpp>
#include <cstddef>
#include <cstdint>
#include <map>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "pells/core/export.h"

namespace pells {

/// The attributes of an element: a map from name to value with an order of its own.
///
/// Attributes are visited as a chained hash table would visit them, and so documents are written
/// alike everywhere: a name belongs to the bucket h mod n, where h starts at 0 and becomes 5h + c
/// for each character c (a signed byte, in 32-bit arithmetic) and n is the first prime of 53, 97,
/// 193, 389, ... that is neither below 100 nor below the number of attributes. Buckets come in
/// ascending order, and within a bucket the attribute added last comes first.
///
/// Elements have few attributes, so they lie in a flat list that is ordered when it is visited;
/// a longer list gets an index and stays fast however many names there are. Adding attributes
/// invalidates iterators.
class PELLS_API AttrMap {
public:
    /// A name and its value, unescaped.
    typedef std::pair<std::string, std::string> Attribute;

    AttrMap() = default;
    AttrMap(const AttrMap& other);
    AttrMap& operator=(const AttrMap& other);
    ~AttrMap() = default;

    /// The number of attributes.
    std::size_t size() const { return attributes.size(); }
    bool empty() const { return attributes.empty(); }

    /// Removes all attributes.
    void clear();

    /// The value of a name, or null.
    const std::string* find(const std::string& name) const;

    /// Adds an attribute, or replaces the value of the one that has this name.
    void set(const std::string& name, std::string value);

    /// Replaces all attributes; a name that occurs twice keeps its first place and last value.
    void assign(std::vector<Attribute>&& list);

private:
    typedef std::vector<std::uint32_t> Order;

    template <class Map, class Value>
    struct Visit {
        Map* map;
        std::pair<const std::string&, Value&> operator()(std::uint32_t at) const {
            return {map->attributes[at].first, map->attributes[at].second};
        }
    };

public:
    /// Yield pairs of references to a name and its value; names cannot be changed.
    typedef boost::transform_iterator<Visit<AttrMap, std::string>, Order::const_iterator> iterator;
    typedef boost::transform_iterator<Visit<const AttrMap, const std::string>,
                                      Order::const_iterator>
        const_iterator;

    /// Visit the attributes in the order above, which is found by the first visit after a change.
    iterator begin() { return {visitingOrder().begin(), {this}}; }
    iterator end() { return {visitingOrder().end(), {this}}; }
    const_iterator begin() const { return {visitingOrder().begin(), {this}}; }
    const_iterator end() const { return {visitingOrder().end(), {this}}; }

private:
    static const std::size_t notFound = static_cast<std::size_t>(-1);

    std::size_t positionOf(const std::string& name, std::size_t count) const;
    void indexLast(std::size_t count);
    const Order& visitingOrder() const;

    struct Extras {
        std::map<std::string, std::uint32_t> index;  // empty while the list is short
        Order order;                                 // empty until the attributes are visited
    };

    std::vector<Attribute> attributes;       // in the order in which they were added
    mutable std::unique_ptr<Extras> extras;  // most elements need none
};

}  // namespace pells
