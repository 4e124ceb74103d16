#include "pells/material/color.h"

#include <algorithm>

namespace pells {

namespace {

// Which intermediate results are rounded to single precision decides the last bit of a colour, and
// truncation to bytes makes that bit visible: variables are float where a result is rounded, and
// everything between is computed in double.

const double channelToUnit = 1.0 / 255.0;

float rounded(double value) {
    return static_cast<float>(value);
}

float unitChannel(std::uint32_t packed, int shift) {
    return rounded(((packed >> shift) & 0xFF) * channelToUnit);
}

std::uint32_t byteOf(float unit) {
    return static_cast<std::uint32_t>(static_cast<double>(unit) * 255.0);
}

double hueInSextants(double r, double g, double b, double max, double delta) {
    const double k = 1.0 / delta;
    const float rc = rounded((max - r) * k);
    const float gc = rounded((max - g) * k);
    const float bc = rounded((max - b) * k);
    if (r == max)
        return static_cast<double>(bc) - gc;
    if (g == max)
        return 2.0 + rc - bc;
    return 4.0 + gc - rc;
}

double blend(double from, double to, double weight) {
    return from + (to - from) * weight;
}

struct Hue {
    double degrees;
    float chroma;
};

double blendHues(Hue first, Hue second, double t) {
    if (first.chroma == 0 || second.chroma == 0)
        return first.chroma != 0 ? first.degrees : second.degrees;

    if (first.degrees - second.degrees > 180)
        second.degrees += 360;
    else if (second.degrees - first.degrees > 180)
        first.degrees += 360;

    const float difference = rounded(static_cast<double>(second.chroma) - first.chroma);
    double weight = t;
    if (difference != 0) {
        const double k = -1.0 / difference;
        const double start = k / first.chroma;
        const double here = k / (first.chroma + difference * t);
        weight = (here - start) / (k / second.chroma - start);
    }
    const double hue = blend(first.degrees, second.degrees, weight);
    return hue > 360 ? hue - 360 : hue;
}

}  // namespace

void RGBtoHSV(float r, float g, float b, float& h, float& s, float& v) {
    const float max = std::max({r, g, b});
    const float min = std::min({r, g, b});
    const float delta = rounded(static_cast<double>(max) - min);
    v = max;
    s = max == 0 ? 0.0F : rounded(static_cast<double>(delta) / max);
    h = 0;
    if (s == 0)
        return;

    double hue = hueInSextants(r, g, b, max, delta) * 60.0;
    if (hue < 0)
        hue += 360.0;
    h = rounded(hue);
}

void HSVtoRGB(float h, float s, float v, float& r, float& g, float& b) {
    const auto set = [&](float red, float green, float blue) {
        r = red;
        g = green;
        b = blue;
    };
    if (s == 0)
        return set(v, v, v);

    const double sextants = h == 360 ? 0.0 : h * (1.0 / 60.0);
    // Asked this way round, so that a hue that is no number is white, too.
    if (!(sextants > -1 && sextants < 6))
        return set(1, 1, 1);

    const int sextant = static_cast<int>(sextants);
    const double fraction = sextants - sextant;
    const double saturation = s;
    const float p = rounded((1.0 - saturation) * v);
    const float q = rounded((1.0 - saturation * fraction) * v);
    const float t = rounded((1.0 - (1.0 - fraction) * saturation) * v);
    switch (sextant) {
        case 0:
            return set(v, t, p);
        case 1:
            return set(q, v, p);
        case 2:
            return set(p, v, t);
        case 3:
            return set(p, q, v);
        case 4:
            return set(t, p, v);
        default:
            return set(v, p, q);
    }
}

std::uint32_t rgb2hsv(std::uint32_t rgb) {
    float h = 0;
    float s = 0;
    float v = 0;
    RGBtoHSV(unitChannel(rgb, 16), unitChannel(rgb, 8), unitChannel(rgb, 0), h, s, v);
    return (static_cast<std::uint32_t>(h) << 16) + (byteOf(s) << 8) + byteOf(v);
}

std::uint32_t hsv2rgb(std::uint32_t hsv) {
    const float hue = static_cast<float>((hsv >> 16) & 0xFFF);
    float r = 0;
    float g = 0;
    float b = 0;
    HSVtoRGB(hue, unitChannel(hsv, 8), unitChannel(hsv, 0), r, g, b);
    return (byteOf(r) << 16) + (byteOf(g) << 8) + byteOf(b);
}

Color HSVInterpolate(float hue1, float sat1, float val1, float hue2, float sat2, float val2,
                     double t) {
    const float chroma1 = rounded(static_cast<double>(sat1) * val1);
    const float chroma2 = rounded(static_cast<double>(sat2) * val2);
    const double lightness1 = (1.0 - 0.5 * sat1) * val1;
    const double lightness2 = (1.0 - 0.5 * sat2) * val2;

    const float chromaDifference = rounded(static_cast<double>(chroma2) - chroma1);
    const float chroma = rounded(chroma1 + chromaDifference * t);
    const float lightness = rounded(blend(lightness1, lightness2, t));

    const double value = lightness + 0.5 * chroma;
    const double saturation = value > 0 ? chroma / value : 0.0;
    const double hue = blendHues({hue1, chroma1}, {hue2, chroma2}, t);
    return {rounded(hue), rounded(saturation), rounded(value), 0.0F};
}

}  // namespace pells
