#include "pells/serial/nesting.h"

#include "pells/serial/serializable.h"
#include "pells/xml/tag.h"

namespace pells {
namespace detail {

void checkNesting(const OutTag& tag) {
    if (tag.getDepth() > InTag::maximumDepth())
        throw Serializable::SaveFail("Nested too deeply to be loaded: " + tag.getPath());
}

}  // namespace detail
}  // namespace pells
