#pragma once

#include <cstdint>

#include "pells/core/export.h"
#include "pells/serial/type_handler.h"

namespace pells {

/// A colour of four channels, 0 to 1 by convention; nothing clamps them.
struct Color {
    float r = 0;  ///< red
    float g = 0;  ///< green
    float b = 0;  ///< blue
    float a = 0;  ///< alpha
};

/// Converts red, green and blue to hue, saturation and value.
///
/// Hue is in degrees, 0 to 360, where 360 is the red of 0; all else is 0 to 1, and nothing is
/// clamped. A grey has hue 0 and saturation 0. The results of the conversions in this file are the
/// same to the last bit on every platform.
PELLS_API void RGBtoHSV(float r, float g, float b, float& h, float& s, float& v);

/// Converts hue, saturation and value, as above, to red, green and blue.
///
/// A hue above 360, or of -60 and below, gives white unless the saturation is 0.
PELLS_API void HSVtoRGB(float h, float s, float v, float& r, float& g, float& b);

/// RGBtoHSV() on packed colours.
///
/// \param rgb red in bits 16 to 23, green in 8 to 15, blue in 0 to 7; the rest is ignored.
/// \return whole degrees of hue from bit 16 on, saturation in bits 8 to 15 and value in 0 to 7,
///         both of 255, all truncated: hsv2rgb() does not always give the same colour back.
PELLS_API std::uint32_t rgb2hsv(std::uint32_t rgb);

/// HSVtoRGB() on packed colours; the forms are those of rgb2hsv().
///
/// \param hsv the hue is read from bits 16 to 27; the rest above is ignored.
PELLS_API std::uint32_t hsv2rgb(std::uint32_t hsv);

/// Blends two colours in HSV, chroma and lightness evenly and the hue along the shorter arc, where
/// the colour of more chroma has more pull.
///
/// \param hue1, sat1, val1 the first colour, in the units of RGBtoHSV(); the rest the second.
/// \param t 0 for the first colour to 1 for the second. Values outside extrapolate as far as
///          chroma and lightness allow; what they give is of no use.
/// \return hue, saturation and value in r, g and b, and 0 in a. The hue may be exactly 360. A grey
///         takes the hue of the other colour, and two greys give the second one's hue.
PELLS_API Color HSVInterpolate(float hue1, float sat1, float val1, float hue2, float sat2,
                               float val2, double t);

/// Writes a colour as the attributes "r", "g", "b" and "a" of an empty element, with six digits.
///
/// A component whose attribute is missing, or does not start with a number, keeps its value.
template <>
class PELLS_API SimpleTypeHandler<Color> : public TypeHandler<Color> {
public:
    void save(const Color& value, OutTag& tag) override;

    /// \throws Serializable::LoadFail "Failed to scan text value" for an attribute that goes on
    ///         after its number; the colour is unchanged then.
    void load(Color& value, InTag& tag) override;
};

}  // namespace pells
