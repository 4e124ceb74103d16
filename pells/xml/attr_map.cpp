#include "pells/xml/attr_map.h"

#include <algorithm>

#include "pells/core/no_destructor.h"

namespace pells {

namespace {

// Up to this many attributes a linear search is the fastest.
const std::size_t shortList = 16;

std::uint32_t hashOf(const std::string& name) {
    std::uint32_t hash = 0;
    for (const char c : name)
        hash = 5 * hash + static_cast<std::uint32_t>(static_cast<signed char>(c));
    return hash;
}

std::uint32_t bucketCount(std::size_t attributes) {
    static const std::uint32_t primes[] = {193,       389,       769,       1543,       3079,
                                           6151,      12289,     24593,     49157,      98317,
                                           196613,    393241,    786433,    1572869,    3145739,
                                           6291469,   12582917,  25165843,  50331653,   100663319,
                                           201326611, 402653189, 805306457, 1610612741, 3221225473};
    const std::uint32_t* const last = std::end(primes) - 1;
    return *std::lower_bound(std::begin(primes), last, attributes);
}

}  // namespace

AttrMap::AttrMap(const AttrMap& other) : attributes(other.attributes) {
    if (other.extras)
        extras = std::make_unique<Extras>(*other.extras);
}

AttrMap& AttrMap::operator=(const AttrMap& other) {
    AttrMap copy(other);
    attributes.swap(copy.attributes);
    extras.swap(copy.extras);
    return *this;
}

void AttrMap::clear() {
    attributes.clear();
    extras.reset();
}

const std::string* AttrMap::find(const std::string& name) const {
    const std::size_t at = positionOf(name, attributes.size());
    return at == notFound ? nullptr : &attributes[at].second;
}

void AttrMap::set(const std::string& name, std::string value) {
    const std::size_t at = positionOf(name, attributes.size());
    if (at != notFound) {
        attributes[at].second = std::move(value);
        return;
    }
    attributes.emplace_back(name, std::move(value));
    indexLast(attributes.size());
    if (extras)
        extras->order.clear();
}

void AttrMap::assign(std::vector<Attribute>&& list) {
    clear();
    attributes.swap(list);
    std::size_t kept = 0;
    for (Attribute& each : attributes) {
        const std::size_t earlier = positionOf(each.first, kept);
        if (earlier != notFound) {
            attributes[earlier].second = std::move(each.second);
            continue;
        }
        if (&attributes[kept] != &each)
            attributes[kept] = std::move(each);
        indexLast(++kept);
    }
    attributes.resize(kept);
}

/// Looks among the first attributes, which are the ones that the index knows.
std::size_t AttrMap::positionOf(const std::string& name, std::size_t count) const {
    if (count > shortList) {
        const auto known = extras->index.find(name);
        return known == extras->index.end() ? notFound : known->second;
    }
    for (std::size_t at = 0; at < count; ++at) {
        if (attributes[at].first == name)
            return at;
    }
    return notFound;
}

/// Enters the last of the first attributes in the index, which is made when the list gets long.
void AttrMap::indexLast(std::size_t count) {
    if (count <= shortList)
        return;
    if (!extras)
        extras = std::make_unique<Extras>();
    std::map<std::string, std::uint32_t>& index = extras->index;
    for (std::size_t at = index.empty() ? 0 : count - 1; at < count; ++at)
        index.emplace(attributes[at].first, static_cast<std::uint32_t>(at));
}

const AttrMap::Order& AttrMap::visitingOrder() const {
    static const NoDestructor<Order> none;
    static const NoDestructor<Order> single(1u);
    if (attributes.size() <= 1)
        return attributes.empty() ? *none : *single;
    if (!extras)
        extras = std::make_unique<Extras>();
    Order& order = extras->order;
    if (order.size() == attributes.size())
        return order;
    const std::uint32_t buckets = bucketCount(attributes.size());
    std::vector<std::pair<std::uint32_t, std::uint32_t>> sorted;  // bucket, position from the end
    sorted.reserve(attributes.size());
    const std::uint32_t last = static_cast<std::uint32_t>(attributes.size() - 1);
    for (std::uint32_t at = 0; at <= last; ++at)
        sorted.emplace_back(hashOf(attributes[at].first) % buckets, last - at);
    std::sort(sorted.begin(), sorted.end());
    order.reserve(sorted.size());
    for (const auto& each : sorted)
        order.push_back(last - each.second);
    return order;
}

}  // namespace pells
