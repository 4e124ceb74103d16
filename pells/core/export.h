#pragma once

/// \file
/// Symbol visibility of the library.
///
/// PELLS_API marks what the library exports. PELLS_TEMPLATE_API marks class templates that users
/// instantiate: their instances stay visible across shared objects, so that exceptions and dynamic
/// casts find one type and static members are one object in the process.

#if defined(_MSVC_LANG)
#define PELLS_LANGUAGE _MSVC_LANG
#else
#define PELLS_LANGUAGE __cplusplus
#endif
#if PELLS_LANGUAGE < 201703L
#error "pells needs C++17: compile with -std=c++17 or newer"
// Ends the compilation here; what would follow are only consequences.
#include <pells needs C++17>
#endif
#undef PELLS_LANGUAGE

#if defined(_WIN32)
#if defined(PELLS_STATIC)
#define PELLS_API
#elif defined(pells_EXPORTS)
#define PELLS_API __declspec(dllexport)
#else
#define PELLS_API __declspec(dllimport)
#endif
#define PELLS_TEMPLATE_API
#else
#define PELLS_API __attribute__((visibility("default")))
#define PELLS_TEMPLATE_API __attribute__((visibility("default")))
#endif

#if !defined(_WIN32)
namespace pells {
namespace detail {

// Debug containers of libstdc++ have another layout, so a program with them and a library without,
// or the reverse, do not fit together: they fail to link for want of one of these.
#if defined(_GLIBCXX_DEBUG)
extern PELLS_API const char builtWithDebugContainers;
__attribute__((used, visibility("hidden"))) inline const char* const needsDebugContainers =
    &builtWithDebugContainers;
#else
extern PELLS_API const char builtWithoutDebugContainers;
__attribute__((used, visibility("hidden"))) inline const char* const needsPlainContainers =
    &builtWithoutDebugContainers;
#endif

}  // namespace detail
}  // namespace pells
#endif
