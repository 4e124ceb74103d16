#include "pells/material/color.h"

#include <gtest/gtest.h>

#include <cmath>
#include <tuple>
#include <utility>

namespace {

using pells::Color;
using pells::hsv2rgb;
using pells::HSVInterpolate;
using pells::rgb2hsv;

TEST(PackedColors, ConvertWithTruncation) {
    EXPECT_EQ(rgb2hsv(0xFF0000), 0x0000FFFFU);
    EXPECT_EQ(rgb2hsv(0x00FF00), 0x0078FFFFU);
    EXPECT_EQ(rgb2hsv(0xAB0000FF), 0x00F0FFFFU);
    EXPECT_EQ(rgb2hsv(0xFFFFFF), 0x000000FFU);
    EXPECT_EQ(rgb2hsv(0), 0U);
    EXPECT_EQ(rgb2hsv(0x123456), 0x00D2C956U);
    EXPECT_EQ(hsv2rgb(rgb2hsv(0xFF8000)), 0xFF7F00U);
    EXPECT_EQ(hsv2rgb(0x0168FFFF), 0xFF0000U);
    EXPECT_EQ(hsv2rgb(0x0167FFFF), 0xFF0004U);
    EXPECT_EQ(hsv2rgb(0xFFFFFFFF), 0xFFFFFFU) << "a hue of 4095 degrees";
}

/// A colour in the first three members, as HSVInterpolate() returns it.
Color toHsv(const Color& rgb) {
    Color hsv;
    pells::RGBtoHSV(rgb.r, rgb.g, rgb.b, hsv.r, hsv.g, hsv.b);
    return hsv;
}

Color toRgb(const Color& hsv) {
    Color rgb;
    pells::HSVtoRGB(hsv.r, hsv.g, hsv.b, rgb.r, rgb.g, rgb.b);
    return rgb;
}

void expectNear(const Color& color, const Color& expected) {
    EXPECT_FLOAT_EQ(color.r, expected.r);
    EXPECT_FLOAT_EQ(color.g, expected.g);
    EXPECT_FLOAT_EQ(color.b, expected.b);
}

TEST(Colors, ConvertBothWays) {
    const std::pair<Color, Color> conversions[] = {
        {{0.5F, 0.5F, 0.5F, 0}, {0, 0, 0.5F, 0}}, {{0, 0, 0, 0}, {0, 0, 0, 0}},
        {{1, 0.5F, 0, 0}, {30, 1, 1, 0}},         {{0.25F, 0.5F, 0, 0}, {90, 1, 0.5F, 0}},
        {{0, 1, 0.5F, 0}, {150, 1, 1, 0}},        {{0.5F, 0.75F, 1, 0}, {210, 0.5F, 1, 0}},
        {{0.25F, 0, 0.5F, 0}, {270, 1, 0.5F, 0}}, {{1, 0, 0.5F, 0}, {330, 1, 1, 0}},
    };
    for (const auto& each : conversions) {
        expectNear(toHsv(each.first), each.second);
        expectNear(toRgb(each.second), each.first);
    }
    for (const float hue : {-60.0F, 360.5F, 1e30F, -1e30F, std::nanf("")}) {
        expectNear(toRgb({hue, 0.5F, 0.5F, 0}), {1, 1, 1, 0});
        expectNear(toRgb({hue, 0, 0.5F, 0}), {0.5F, 0.5F, 0.5F, 0});
    }
}

struct Blend {
    Color from;
    Color to;
    double t;
    Color expected;
};

TEST(Blending, TakesTheShortWayAndFollowsTheStrongerColor) {
    const Blend blends[] = {
        {{0, 1, 1, 0}, {120, 1, 1, 0}, 0.5, {60, 1, 1, 0}},
        {{350, 1, 1, 0}, {10, 1, 1, 0}, 0.5, {360, 1, 1, 0}},
        {{10, 1, 1, 0}, {350, 1, 1, 0}, 0.75, {355, 1, 1, 0}},
        {{0, 1, 1, 0}, {240, 0.5F, 1, 0}, 0.5, {320, 0.75F, 1, 0}},
        {{200, 0, 1, 0}, {60, 1, 1, 0}, 0.25, {60, 0.25F, 1, 0}},
        {{200, 1, 1, 0}, {60, 0, 1, 0}, 0.25, {200, 0.75F, 1, 0}},
        {{200, 0, 1, 0}, {60, 0, 0, 0}, 0.5, {60, 0, 0.5F, 0}},
        {{0, 1, 0, 0}, {0, 1, 0, 0}, 0.5, {0, 0, 0, 0}},
    };
    for (const Blend& each : blends) {
        const Color hsv = HSVInterpolate(each.from.r, each.from.g, each.from.b, each.to.r,
                                         each.to.g, each.to.b, each.t);
        const Color& want = each.expected;
        EXPECT_EQ(std::tie(hsv.r, hsv.g, hsv.b, hsv.a), std::tie(want.r, want.g, want.b, want.a));
    }
}

}  // namespace
