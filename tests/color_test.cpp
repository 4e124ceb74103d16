#include "pells/material/color.h"

#include <gtest/gtest.h>

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

struct Conversion {
    Color rgb;
    Color hsv;
};

TEST(Colors, ConvertBothWays) {
    const Conversion conversions[] = {
        {{0.5F, 0.5F, 0.5F, 0}, {0, 0, 0.5F, 0}}, {{0, 0, 0, 0}, {0, 0, 0, 0}},
        {{1, 0.5F, 0, 0}, {30, 1, 1, 0}},         {{0.25F, 0.5F, 0, 0}, {90, 1, 0.5F, 0}},
        {{0, 1, 0.5F, 0}, {150, 1, 1, 0}},        {{0.5F, 0.75F, 1, 0}, {210, 0.5F, 1, 0}},
        {{0.25F, 0, 0.5F, 0}, {270, 1, 0.5F, 0}}, {{1, 0, 0.5F, 0}, {330, 1, 1, 0}},
    };
    for (const Conversion& each : conversions) {
        float h = -1;
        float s = -1;
        float v = -1;
        pells::RGBtoHSV(each.rgb.r, each.rgb.g, each.rgb.b, h, s, v);
        EXPECT_FLOAT_EQ(h, each.hsv.r);
        EXPECT_FLOAT_EQ(s, each.hsv.g);
        EXPECT_FLOAT_EQ(v, each.hsv.b);

        float r = -1;
        float g = -1;
        float b = -1;
        pells::HSVtoRGB(h, s, v, r, g, b);
        EXPECT_FLOAT_EQ(r, each.rgb.r);
        EXPECT_FLOAT_EQ(g, each.rgb.g);
        EXPECT_FLOAT_EQ(b, each.rgb.b);
    }
}

TEST(Colors, OfHuesOffTheCircleAreWhite) {
    for (const float hue : {-60.0F, 360.5F, 1e30F, -1e30F}) {
        float r = -1;
        float g = -1;
        float b = -1;
        pells::HSVtoRGB(hue, 0.5F, 0.5F, r, g, b);
        EXPECT_EQ(r + g + b, 3) << hue;
        pells::HSVtoRGB(hue, 0, 0.5F, r, g, b);
        EXPECT_EQ(r + g + b, 1.5F) << hue;
    }
}

struct Blend {
    float from[3];
    float to[3];
    double t;
    Color expected;
};

TEST(Blending, TakesTheShortWayAndFollowsTheStrongerColor) {
    const Blend blends[] = {
        {{0, 1, 1}, {120, 1, 1}, 0.5, {60, 1, 1, 0}},
        {{350, 1, 1}, {10, 1, 1}, 0.5, {360, 1, 1, 0}},
        {{10, 1, 1}, {350, 1, 1}, 0.75, {355, 1, 1, 0}},
        {{0, 1, 1}, {240, 0.5F, 1}, 0.5, {320, 0.75F, 1, 0}},
        {{200, 0, 1}, {60, 1, 1}, 0.25, {60, 0.25F, 1, 0}},
        {{200, 1, 1}, {60, 0, 1}, 0.25, {200, 0.75F, 1, 0}},
        {{200, 0, 1}, {60, 0, 0}, 0.5, {60, 0, 0.5F, 0}},
        {{0, 1, 0}, {0, 1, 0}, 0.5, {0, 0, 0, 0}},
    };
    for (const Blend& each : blends) {
        const Color hsv = HSVInterpolate(each.from[0], each.from[1], each.from[2], each.to[0],
                                         each.to[1], each.to[2], each.t);
        EXPECT_EQ(hsv.r, each.expected.r) << each.from[0] << " to " << each.to[0];
        EXPECT_EQ(hsv.g, each.expected.g) << each.from[0] << " to " << each.to[0];
        EXPECT_EQ(hsv.b, each.expected.b) << each.from[0] << " to " << each.to[0];
        EXPECT_EQ(hsv.a, 0);
    }
}

}  // namespace
