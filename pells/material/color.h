#pragma once

#include <cstdint>

#include "pells/core/export.h"

namespace pells {

/// A colour of four channels, 0 to 1 by convention; nothing clamps them.
struct Color {
    float r = 0;  ///< red
    float g = 0;  ///< green
    float b = 0;  ///< blue
    float a = 0;  ///< alpha
};

}  // namespace pells
