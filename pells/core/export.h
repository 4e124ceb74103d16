#pragma once

/// \file
/// Symbol visibility of the library.
///
/// PELLS_API marks what the library exports. PELLS_TEMPLATE_API marks class templates that users
/// instantiate: their instances stay visible across shared objects, so that exceptions and dynamic
/// casts find one type and static members are one object in the process.

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
