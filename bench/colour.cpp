// HSV both ways, against the colour class of a user interface library.

#include <QColor>
#include <random>
#include <vector>

#include "bench/support/bench.h"
#include "pells/material/color.h"

namespace {

std::vector<pells::Color> randomColors(std::int64_t count) {
    std::minstd_rand random(1);
    std::uniform_real_distribution<float> component(0.f, 1.f);
    std::vector<pells::Color> colors(static_cast<std::size_t>(count));
    for (pells::Color& color : colors)
        color = {component(random), component(random), component(random), 1.f};
    return colors;
}

void addToHsv(std::int64_t count) {
    const std::string work = "hsv/from rgb";
    bench::add(work, count, "pells", [colors = randomColors(count)](benchmark::State& state) {
        float h = 0, s = 0, v = 0;
        for (auto _ : state)
            for (const pells::Color& color : colors) {
                pells::RGBtoHSV(color.r, color.g, color.b, h, s, v);
                benchmark::DoNotOptimize(h);
            }
    });
    bench::add(work, count, "QColor", [colors = randomColors(count)](benchmark::State& state) {
        std::vector<QColor> peers;
        for (const pells::Color& color : colors)
            peers.push_back(QColor::fromRgbF(color.r, color.g, color.b));
        qreal h = 0, s = 0, v = 0;
        for (auto _ : state)
            for (const QColor& color : peers) {
                color.getHsvF(&h, &s, &v);
                benchmark::DoNotOptimize(h);
            }
    });
}

void addFromHsv(std::int64_t count) {
    const std::string work = "hsv/to rgb";
    bench::add(work, count, "pells", [colors = randomColors(count)](benchmark::State& state) {
        float r = 0, g = 0, b = 0;
        for (auto _ : state)
            for (const pells::Color& color : colors) {
                pells::HSVtoRGB(color.r * 360, color.g, color.b, r, g, b);
                benchmark::DoNotOptimize(r);
            }
    });
    bench::add(work, count, "QColor", [colors = randomColors(count)](benchmark::State& state) {
        qreal r = 0, g = 0, b = 0;
        for (auto _ : state)
            for (const pells::Color& color : colors) {
                QColor::fromHsvF(color.r, color.g, color.b).getRgbF(&r, &g, &b);
                benchmark::DoNotOptimize(r);
            }
    });
}

}  // namespace

void addBenchmarks() {
    for (const std::int64_t count : bench::sizes({1000, 100000})) {
        addToHsv(count);
        addFromHsv(count);
    }
}
