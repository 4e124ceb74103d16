#pragma once

/// \file
/// Symbol visibility of the kit; see pells/core/export.h.

#include "pells/core/export.h"

#if defined(_WIN32)
#if defined(PELLS_STATIC)
#define PELLS_KIT_API
#elif defined(pells_kit_EXPORTS)
#define PELLS_KIT_API __declspec(dllexport)
#else
#define PELLS_KIT_API __declspec(dllimport)
#endif
#else
#define PELLS_KIT_API __attribute__((visibility("default")))
#endif
