#include "pells/material/color.h"

#include <gtest/gtest.h>

#include <cmath>
#include <utility>

namespace {

using pells::Color;
using pells::hsv2rgb;
using pells::rgb2hsv;

TEST(PackedColors, ConvertWithTruncation) {
    const std::pair<unsigned, unsigned> hsvOf[] = {{0xFF0000, 0x0000FFFF},
                                                   {0x00FF00, 0x0078FFFF},
                                                   {0xAB0000FF, 0x00F0FFFF},
                                                   {0xFFFFFF, 0x000000FF},
                                                   {0, 0},
                                                   {0x123456, 0x00D2C956}};
    for (const auto& each : hsvOf)
        EXPECT_EQ(rgb2hsv(each.first), each.second);
    EXPECT_EQ(hsv2rgb(rgb2hsv(0xFF8000)), 0xFF7F00U);
    EXPECT_EQ(hsv2rgb(0x0168FFFF), 0xFF0000U);
    EXPECT_EQ(hsv2rgb(0x0167FFFF), 0xFF0004U);
    EXPECT_EQ(hsv2rgb(0xFFFFFFFF), 0xFFFFFFU) << "a hue of 4095 degrees";
}

void expectNear(const Color& color, const Color& expected) {
    EXPECT_FLOAT_EQ(color.r, expected.r);
    EXPECT_FLOAT_EQ(color.g, expected.g);
    EXPECT_FLOAT_EQ(color.b, expected.b);
}

void expectRgb(const Color& hsv, const Color& expected) {
    Color rgb;
    pells::HSVtoRGB(hsv.r, hsv.g, hsv.b, rgb.r, rgb.g, rgb.b);
    expectNear(rgb, expected);
}

TEST(Colors, ConvertBothWays) {
    const std::pair<Color, Color> conversions[] = {
        {{0.5F, 0.5F, 0.5F, 0}, {0, 0, 0.5F, 0}}, {{0, 0, 0, 0}, {0, 0, 0, 0}},
        {{1, 0.5F, 0, 0}, {30, 1, 1, 0}},         {{0.25F, 0.5F, 0, 0}, {90, 1, 0.5F, 0}},
        {{0, 1, 0.5F, 0}, {150, 1, 1, 0}},        {{0.5F, 0.75F, 1, 0}, {210, 0.5F, 1, 0}},
        {{0.25F, 0, 0.5F, 0}, {270, 1, 0.5F, 0}}, {{1, 0, 0.5F, 0}, {330, 1, 1, 0}},
    };
    for (const auto& each : conversions) {
        Color hsv;
        pells::RGBtoHSV(each.first.r, each.first.g, each.first.b, hsv.r, hsv.g, hsv.b);
        expectNear(hsv, each.second);
        expectRgb(each.second, each.first);
    }
    for (const float hue : {-60.0F, 360.5F, 1e30F, -1e30F, std::nanf("")}) {
        expectRgb({hue, 0.5F, 0.5F, 0}, {1, 1, 1, 0});
        expectRgb({hue, 0, 0.5F, 0}, {0.5F, 0.5F, 0.5F, 0});
    }
}

TEST(Blending, TakesTheShortWayAndFollowsTheStrongerColor) {
    const struct {
        Color from, to;
        double t;
        Color expected;
    } blends[] = {
        {{0, 1, 1, 0}, {120, 1, 1, 0}, 0.5, {60, 1, 1, 0}},
        {{350, 1, 1, 0}, {10, 1, 1, 0}, 0.5, {360, 1, 1, 0}},
        {{10, 1, 1, 0}, {350, 1, 1, 0}, 0.75, {355, 1, 1, 0}},
        {{0, 1, 1, 0}, {240, 0.5F, 1, 0}, 0.5, {320, 0.75F, 1, 0}},
        {{200, 0, 1, 0}, {60, 1, 1, 0}, 0.25, {60, 0.25F, 1, 0}},
        {{200, 1, 1, 0}, {60, 0, 1, 0}, 0.25, {200, 0.75F, 1, 0}},
        {{200, 0, 1, 0}, {60, 0, 0, 0}, 0.5, {60, 0, 0.5F, 0}},
        {{0, 1, 0, 0}, {0, 1, 0, 0}, 0.5, {0, 0, 0, 0}},
    };
    for (const auto& each : blends) {
        const Color hsv = pells::HSVInterpolate(each.from.r, each.from.g, each.from.b, each.to.r,
                                                each.to.g, each.to.b, each.t);
        expectNear(hsv, each.expected);
        EXPECT_EQ(hsv.a, 0);
    }
}

}  // namespace
