// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/Basic3D.h"

#include <algorithm>

#include "Vantrel/Effects/Basic3D.h"

namespace Vantrel::Host::Software {
namespace {

struct Vector {
    double x, y, z;
};
double Dot(const Vector& a, const Vector& b) { return a.x * b.x + a.y * b.y + a.z * b.z; }
Vector Scaled(const Vector& v, double factor) { return {v.x * factor, v.y * factor, v.z * factor}; }
Vector Unit(const Vector& v) { return Scaled(v, 1.0 / std::sqrt(Dot(v, v))); }

/// The turned picture: a frame of three vectors, its middle `distance` behind the screen.
struct Plane {
    Vector across, down, normal;
    double distance, eye, width, height;

    Plane(double swivel, double tilt, double shift, const Picture& picture)
        : eye(std::max(picture.width, picture.height)), width(picture.width), height(picture.height) {
        across = {std::cos(swivel), 0.0, -std::sin(swivel)};
        down = {std::sin(tilt) * std::sin(swivel), std::cos(tilt), std::sin(tilt) * std::cos(swivel)};
        normal = {across.y * down.z - across.z * down.y, across.z * down.x - across.x * down.z,
                  across.x * down.y - across.y * down.x};
        distance = shift * eye;
    }

    [[nodiscard]] Vector At(double u, double v) const {
        const double x = u - width / 2.0, y = v - height / 2.0;
        return {across.x * x + down.x * y, across.y * x + down.y * y, across.z * x + down.z * y + distance};
    }
    /// Where the ray from the eye through a point of the screen meets the plane, in pixels of the picture. False when
    /// it does so nowhere before the eye.
    [[nodiscard]] bool Meet(double x, double y, double& u, double& v) const {
        const Vector ray{x, y, eye};
        const double steepness = Dot(normal, ray), eyeHeight = -(distance + eye) * normal.z;
        const double along = -eyeHeight / steepness;
        if (!(along > 0.0) || std::isinf(along)) return false;
        const Vector hit{x * along, y * along, (along - 1.0) * eye - distance};
        u = Dot(hit, across) + width / 2.0;
        v = Dot(hit, down) + height / 2.0;
        return true;
    }
    /// The distance of a point on the screen from the line through two points of the picture, in pixels; positive on
    /// the side of the picture's middle.
    [[nodiscard]] double FromEdge(double x, double y, double u0, double v0, double u1, double v1) const {
        // The plane through the eye and the edge, cut by the screen.
        Vector a = At(u0, v0), b = At(u1, v1), middle = At(width / 2.0, height / 2.0);
        a.z += eye;
        b.z += eye;
        middle.z += eye;
        const Vector side{a.y * b.z - a.z * b.y, a.z * b.x - a.x * b.z, a.x * b.y - a.y * b.x};
        const double inside = Dot(side, middle) < 0.0 ? -1.0 : 1.0;
        return inside * Dot(side, {x, y, eye}) / std::hypot(side.x, side.y);
    }
    [[nodiscard]] double Coverage(double x, double y) const {
        const auto share = [](double a, double b) { return std::clamp(std::min(a, 0.5) + std::min(b, 0.5), 0.0, 1.0); };
        return share(FromEdge(x, y, 0, 0, width, 0), FromEdge(x, y, 0, height, width, height)) *
               share(FromEdge(x, y, 0, 0, 0, height), FromEdge(x, y, width, 0, width, height));
    }
    [[nodiscard]] double Highlight(double x, double y) const {
        constexpr Vector kLight{-1.0 / 3.0, -2.0 / 3.0, -2.0 / 3.0};
        constexpr double kStrength = 0.6, kRamp = 4.0, kShininess = 64.0;
        const Vector toEye = Unit({-x, -y, -eye});
        const Vector facing = Scaled(normal, Dot(normal, toEye) < 0.0 ? -1.0 : 1.0);
        const Vector half = Unit({kLight.x + toEye.x, kLight.y + toEye.y, kLight.z + toEye.z});
        return kStrength * std::clamp(kRamp * Dot(facing, kLight), 0.0, 1.0) *
               std::pow(std::clamp(Dot(facing, half), 0.0, 1.0), kShininess);
    }
};

/// The mean of what lies under a tent, premultiplied. Beyond the border the border's pixels go on.
Pixel SampleTent(const Picture& picture, double u, double v, double tentU, double tentV) {
    Pixel sum{};
    double total = 0.0;
    for (int row = static_cast<int>(std::ceil(v - tentV - 0.5)); row + 0.5 - v < tentV; ++row) {
        const double rowWeight = std::max(1.0 - std::abs(row + 0.5 - v) / tentV, 0.0);
        for (int column = static_cast<int>(std::ceil(u - tentU - 0.5)); column + 0.5 - u < tentU; ++column) {
            const double weight = rowWeight * std::max(1.0 - std::abs(column + 0.5 - u) / tentU, 0.0);
            const Pixel p =
                picture.Get(std::clamp(column, 0, picture.width - 1), std::clamp(row, 0, picture.height - 1));
            const double alpha = std::clamp(p[3], 0.0, 1.0);
            for (std::size_t c = 0; c < 3; ++c) sum[c] += weight * alpha * p[c];
            sum[3] += weight * alpha;
            total += weight;
        }
    }
    for (double& value : sum) value /= total;
    return sum;
}

Pixel Shade(const Picture& picture, const Plane& plane, double x, double y, bool specular) {
    const double coverage = plane.Coverage(x, y);
    double u = 0.0, v = 0.0;
    if (!(coverage > 0.0) || !plane.Meet(x, y, u, v)) return {};
    // The places of a pixel a little to the right and a little lower tell how far pixels lie apart in the picture.
    constexpr double kStep = 1e-6;
    double rightU = u, rightV = v, lowerU = u, lowerV = v;
    static_cast<void>(plane.Meet(x + kStep, y, rightU, rightV));
    static_cast<void>(plane.Meet(x, y + kStep, lowerU, lowerV));
    const auto tent = [](double right, double lower) {
        return std::clamp(std::hypot(right, lower) / kStep - 0.5, 1.0, static_cast<double>(kBasic3D_WidestTent));
    };
    const Pixel sum = SampleTent(picture, std::clamp(u, 0.0, plane.width), std::clamp(v, 0.0, plane.height),
                                 tent(rightU - u, lowerU - u), tent(rightV - v, lowerV - v));
    constexpr double kLeastAlpha = 1e-5;
    if (sum[3] < kLeastAlpha) return {};
    const double light = specular ? plane.Highlight(x, y) : 0.0;
    return {sum[0] / sum[3] + light, sum[1] / sum[3] + light, sum[2] / sum[3] + light, sum[3] * coverage};
}

/// What a side of `size` pixels becomes where the plane reaches that far from the middle. Counted in single precision,
/// as the engine does: whole pixels are at stake.
int Enclose(int size, double place, double divisor) {
    const float reach = std::abs(static_cast<float>(place) / static_cast<float>(divisor));
    if (std::isnan(reach)) return size;
    return std::max(size, 2 * static_cast<int>(std::min(reach, static_cast<float>(kBasic3D_LargestFrame))));
}

}  // namespace

void RunBasic3D(const EffectContext& context, LayerPicture& layer) {
    const double swivel = context.Number(kBasic3D_Swivel), tilt = context.Number(kBasic3D_Tilt);
    const double distance = context.Number(kBasic3D_Distance) / 100.0;
    if (swivel == 0.0 && tilt == 0.0 && distance == 0.0) return;
    constexpr double kDegree = 3.14159265358979323846 / 180.0;
    const Plane plane(swivel * kDegree, tilt * kDegree, distance, layer.picture);
    int width = context.view.width, height = context.view.height;
    for (const double u : {0.0, plane.width}) {
        for (const double v : {0.0, plane.height}) {
            const Vector corner = plane.At(u, v);
            width = Enclose(width, corner.x, corner.z / plane.eye + 1.0);
            height = Enclose(height, corner.y, corner.z / plane.eye + 1.0);
        }
    }
    Picture result(std::min(width, kBasic3D_LargestFrame), std::min(height, kBasic3D_LargestFrame));
    const bool specular = context.Flag(kBasic3D_SpecularHighlight);
    for (int y = 0; y < result.height; ++y) {
        for (int x = 0; x < result.width; ++x) {
            result.Set(
                x, y,
                Shade(layer.picture, plane, x + 0.5 - result.width / 2.0, y + 0.5 - result.height / 2.0, specular));
        }
    }
    layer.origin = {(result.width - context.view.width) / 2, (result.height - context.view.height) / 2};
    layer.picture = std::move(result);
}

}  // namespace Vantrel::Host::Software
