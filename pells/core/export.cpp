#include "pells/core/export.h"

#if !defined(_WIN32)
namespace pells {
namespace detail {

#if defined(_GLIBCXX_DEBUG)
const char builtWithDebugContainers = 0;
#else
const char builtWithoutDebugContainers = 0;
#endif

}  // namespace detail
}  // namespace pells
#endif
