#include "pells/material/color.h"

#include <gtest/gtest.h>

#include <cmath>
#include <utility>

namespace {

using pells::Color;

TEST(PackedColors, ConvertBothWaysWithTruncation) {
    const struct {
        std::uint32_t rgb, hsv, back;
    } colors[] = {{0xFF8000, 0x1EFFFF, 0xFF7F00},
                  {0x40C020, 0x6CD4C0, 0x40C020},
                  {0x00FF80, 0x96FFFF, 0x00FF7F},
                  {0x123456, 0xD2C956, 0x123456},
                  {0x8000FF, 0x10EFFFF, 0x7F00FF},
                  {0xC02040, 0x15CD4C0, 0xC02040},
                  {0xAB0000FF, 0xF0FFFF, 0x0000FF},
                  {0xFFFFFF, 0xFF, 0xFFFFFF},
                  {0, 0, 0}};
    for (const auto& each : colors) {
        EXPECT_EQ(pells::rgb2hsv(each.rgb), each.hsv);
        EXPECT_EQ(pells::hsv2rgb(each.hsv), each.back);
    }
    EXPECT_EQ(pells::hsv2rgb(0xF168FFFF), 0xFF0000U) << "a hue of 360 degrees, in twelve bits";
    EXPECT_EQ(pells::hsv2rgb(0x169FFFF), 0xFFFFFFU) << "a hue of 361 degrees";
}

void expectNear(const Color& color, const Color& expected) {
    EXPECT_FLOAT_EQ(color.r, expected.r);
    EXPECT_FLOAT_EQ(color.g, expected.g);
    EXPECT_FLOAT_EQ(color.b, expected.b);
}

TEST(Colors, OfNoHueAreWhite) {
    for (const float hue : {-60.0F, 1e30F, -1e30F, std::nanf("")}) {
        Color rgb;
        pells::HSVtoRGB(hue, 0.5F, 0.5F, rgb.r, rgb.g, rgb.b);
        expectNear(rgb, {1, 1, 1, 0});
    }
}

TEST(Blending, TakesTheShortWayAndFollowsTheStrongerColor) {
    const struct {
        Color from, to;
        double t;
        Color expected;
    } blends[] = {
        {{350, 1, 1, 0}, {10, 1, 1, 0}, 0.5, {360, 1, 1, 0}},
        {{10, 1, 1, 0}, {350, 1, 1, 0}, 0.25, {5, 1, 1, 0}},
        {{0, 1, 1, 0}, {240, 0.5F, 1, 0}, 0.5, {320, 0.75F, 1, 0}},
        {{200, 0, 1, 0}, {60, 1, 1, 0}, 0.25, {60, 0.25F, 1, 0}},
        {{200, 1, 1, 0}, {60, 0, 1, 0}, 0.25, {200, 0.75F, 1, 0}},
        {{200, 0, 1, 0}, {60, 0, 0, 0}, 0.5, {60, 0, 0.5F, 0}},
        {{0, 1, 0, 0}, {0, 1, 0, 0}, 0.5, {0, 0, 0, 0}},
    };
    for (const auto& each : blends)
        expectNear(pells::HSVInterpolate(each.from.r, each.from.g, each.from.b, each.to.r,
                                         each.to.g, each.to.b, each.t),
                   each.expected);
}

}  // namespace
