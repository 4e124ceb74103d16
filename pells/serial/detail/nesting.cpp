#include "pells/serial/detail/nesting.h"

#include "pells/serial/serializable.h"
#include "pells/xml/tag.h"

namespace pells::detail {

void checkNesting(const OutTag& tag) {
    if (tag.getDepth() > InTag::maximumDepth())
        throw Serializable::SaveFail("Nested too deeply to be loaded: " + tag.getPath());
}

}  // namespace pells::detail
