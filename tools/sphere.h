#pragma once

#include "tools/thumbnail.h"

namespace pells {
class Image_base;
class Material;
}  // namespace pells

namespace pells_tool {

/// A ball of a material, transparent around it: key light from the upper left, a faint one from the
/// lower right, seen from the front without perspective.
///
/// The diffuse alpha is how opaque the body is; highlight and emissive light stay whatever it is.
/// The texture covers the front once at scale 1, larger at larger scales, and repeats; its angle
/// turns it counterclockwise, in degrees. It is multiplied into ambient, diffuse and alpha. Any
/// values do: colours are clamped to 0 to 1, and what is no number counts as 0.
///
/// \param texture null, or a picture that has pixels.
/// \param size    width and height in pixels, at least 1.
Thumbnail renderSphere(const pells::Material& material, const pells::Image_base* texture, int size);

}  // namespace pells_tool
