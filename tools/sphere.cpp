#include "tools/sphere.h"

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <cstdint>

#include "pells/image/image_base.h"
#include "pells/material/material.h"

namespace pells_tool {

namespace {

const double pi = 3.14159265358979323846;

/// Samples a pixel has in each direction.
const int samples = 4;

/// Within 0 and 1; 0 for what is no number.
double unit(double value) {
    return value > 0 ? std::min(value, 1.0) : 0.0;
}

/// A direction: x to the right, y up, z to the viewer.
struct Vector {
    double x, y, z;
};

double dot(const Vector& a, const Vector& b) {
    return a.x * b.x + a.y * b.y + a.z * b.z;
}

Vector normalised(const Vector& v) {
    const double length = std::sqrt(dot(v, v));
    return {v.x / length, v.y / length, v.z / length};
}

/// Light of three colours, and how much it hides of what is behind.
struct Shade {
    double red, green, blue, alpha;

    Shade& operator+=(const Shade& other) {
        red += other.red;
        green += other.green;
        blue += other.blue;
        alpha += other.alpha;
        return *this;
    }
};

Shade operator*(const Shade& a, const Shade& b) {
    return {a.red * b.red, a.green * b.green, a.blue * b.blue, a.alpha * b.alpha};
}

Shade operator*(const Shade& shade, double factor) {
    return {shade.red * factor, shade.green * factor, shade.blue * factor, shade.alpha * factor};
}

Shade shadeOf(const pells::Color& color) {
    return {unit(color.r), unit(color.g), unit(color.b), unit(color.a)};
}

std::uint32_t packed(const Shade& shade) {
    const auto byte = [](double value) {
        return static_cast<std::uint32_t>(std::lround(unit(value) * 255));
    };
    return byte(shade.alpha) << 24 | byte(shade.red) << 16 | byte(shade.green) << 8 |
           byte(shade.blue);
}

/// A picture around the front of the sphere.
class Wrapping {
public:
    Wrapping(const pells::Image_base& image, const pells::Material& material, int sphereSize)
        : scale(usable(material.textureScale())),
          radians(unturned(material.textureAngle()) * pi / 180),
          cosine(std::cos(radians)),
          sine(std::sin(radians)) {
        // As wide as the picture gets in the middle of the sphere: finer details would flicker.
        const double wanted = pi / 2 * sphereSize * std::abs(scale);
        const int box = static_cast<int>(std::min(1024.0, std::max(1.0, wanted)));
        picture = makeThumbnail(image, box, box);
    }

    /// The colour where the surface has a normal, multiplied by alpha.
    Shade at(const Vector& normal) const {
        // Angles are kept as lengths, so that the picture bends around without being torn.
        const double fromCentre = std::hypot(normal.x, normal.y);
        const double angle = std::atan2(fromCentre, normal.z);
        const double length = fromCentre > 0 ? angle / (fromCentre * pi * scale) : 0;
        const double x = normal.x * length;
        const double y = normal.y * length;
        return texel(0.5 + x * cosine + y * sine, 0.5 + x * sine - y * cosine);
    }

private:
    /// Within 1/64 and 64, where a picture is more than one colour.
    static double usable(double scale) {
        const double size = std::abs(scale);
        const double clamped = size > 1.0 / 64 ? std::min(size, 64.0) : 1.0 / 64;
        return std::signbit(scale) ? -clamped : clamped;
    }

    static double unturned(double degrees) {
        return std::isfinite(degrees) ? std::fmod(degrees, 360) : 0;
    }

    /// The mean of the four pixels around a place; 0 to 1 is the picture once.
    Shade texel(double u, double v) const {
        const double x = (u - std::floor(u)) * picture.width - 0.5;
        const double y = (v - std::floor(v)) * picture.height - 0.5;
        const int left = static_cast<int>(std::floor(x));
        const int top = static_cast<int>(std::floor(y));
        const double right = x - left;
        const double lower = y - top;
        Shade sum = pixel(left, top) * ((1 - right) * (1 - lower));
        sum += pixel(left + 1, top) * (right * (1 - lower));
        sum += pixel(left, top + 1) * ((1 - right) * lower);
        sum += pixel(left + 1, top + 1) * (right * lower);
        return sum;
    }

    Shade pixel(int x, int y) const {
        const int column = (x + picture.width) % picture.width;
        const int row = (y + picture.height) % picture.height;
        const std::uint32_t argb =
            picture.pixels[static_cast<std::size_t>(row) * static_cast<std::size_t>(picture.width) +
                           static_cast<std::size_t>(column)];
        return {(argb >> 16 & 255) / 255.0, (argb >> 8 & 255) / 255.0, (argb & 255) / 255.0,
                (argb >> 24) / 255.0};
    }

    double scale;
    double radians;
    double cosine;
    double sine;
    Thumbnail picture;
};

/// The lighting model of Blinn and Phong, on colours as they are stored.
class Surface {
public:
    explicit Surface(const pells::Material& material)
        : ambient(shadeOf(material.ambient())),
          diffuse(shadeOf(material.diffuse())),
          specular(shadeOf(material.specular())),
          emissive(shadeOf(material.emissive())),
          shininess(material.shininess() > 0 ? material.shininess() : 0),
          towardKey(normalised({-0.52, 0.62, 0.70})),
          towardFill(normalised({0.75, -0.55, 0.25})),
          highlight(normalised({towardKey.x, towardKey.y, towardKey.z + 1})) {}

    /// What the eye gets from where the surface has a normal.
    ///
    /// \param texture multiplied by its alpha.
    Shade at(const Vector& normal, const Shade& texture) const {
        const double key = std::max(0.0, dot(normal, towardKey));
        const double fill = std::max(0.0, dot(normal, towardFill)) * fillStrength;
        Shade light = diffuse * (key + fill);
        light += ambient;
        // The texture's alpha is in its colours, the material's is not in its own.
        Shade result = light * texture * diffuse.alpha;
        result += specular * gloss(normal, key);
        result += emissive;
        result = {unit(result.red), unit(result.green), unit(result.blue), 0};
        result.alpha =
            std::max({diffuse.alpha * texture.alpha, result.red, result.green, result.blue});
        return result;
    }

private:
    static constexpr double fillStrength = 0.16;

    double gloss(const Vector& normal, double key) const {
        // Fades out where the key light no longer reaches, which low shininess would show.
        const double reached = unit(key * 8);
        return reached * std::pow(unit(dot(normal, highlight)), shininess);
    }

    Shade ambient;
    Shade diffuse;
    Shade specular;
    Shade emissive;
    double shininess;
    Vector towardKey;
    Vector towardFill;
    Vector highlight;
};

/// One pixel, which the sphere may cover in part.
template <class TextureAt>
std::uint32_t pixelOf(int column, int row, int size, const Surface& surface,
                      const TextureAt& textureAt) {
    Shade sum = {0, 0, 0, 0};
    for (int i = 0; i < samples * samples; ++i) {
        const int across = i % samples;
        const int down = i / samples;
        const double x = (column + (across + 0.5) / samples) * 2 / size - 1;
        const double y = 1 - (row + (down + 0.5) / samples) * 2 / size;
        const double square = 1 - x * x - y * y;
        if (square < 0)
            continue;
        const Vector normal = {x, y, std::sqrt(square)};
        sum += surface.at(normal, textureAt(normal));
    }
    return packed(sum * (1.0 / (samples * samples)));
}

template <class TextureAt>
Thumbnail render(const pells::Material& material, int size, const TextureAt& textureAt) {
    const Surface surface(material);
    Thumbnail sphere;
    sphere.width = size;
    sphere.height = size;
    sphere.pixels.reserve(static_cast<std::size_t>(size) * static_cast<std::size_t>(size));
    for (int row = 0; row < size; ++row) {
        for (int column = 0; column < size; ++column)
            sphere.pixels.push_back(pixelOf(column, row, size, surface, textureAt));
    }
    return sphere;
}

}  // namespace

Thumbnail renderSphere(const pells::Material& material, const pells::Image_base* texture,
                       int size) {
    if (!texture)
        return render(material, size, [](const Vector&) { return Shade{1, 1, 1, 1}; });
    const Wrapping wrapping(*texture, material, size);
    return render(material, size, [&](const Vector& normal) { return wrapping.at(normal); });
}

}  // namespace pells_tool
