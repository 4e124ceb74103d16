#include "pells/core/smart_base.h"

namespace pells {

smart_base::~smart_base() = default;

void smart_base::addRef() {
    ++count;
}

void smart_base::release() {
    if (--count <= 0)
        dispose();
}

void smart_base::dispose() {
    delete this;
}

}  // namespace pells
