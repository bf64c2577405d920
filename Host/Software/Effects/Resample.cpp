// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/Resample.h"

#include <algorithm>
#include <cmath>

namespace Vantrel::Host::Software {
namespace {

double Tent(double t) { return std::max(0.0, 1.0 - std::abs(t)); }

double CatmullRom(double t) {
    t = std::abs(t);
    if (t < 1.0) return (1.5 * t - 2.5) * t * t + 1.0;
    if (t < 2.0) return ((-0.5 * t + 2.5) * t - 4.0) * t + 2.0;
    return 0.0;
}

struct Taps {
    int first = 0;
    std::vector<double> weights;
    std::vector<double> distances;  // in units of the filter

    /// Is it short of the cubic's end, by more than rounding?
    [[nodiscard]] bool IsWithin(std::size_t tap) const { return std::abs(distances[tap]) < 1.99; }
};

Taps MakeTaps(double place, double footprint, bool cubic) {
    const double stretch = std::max(1.0, cubic ? footprint : footprint - 0.5);
    const double radius = (cubic ? 2.0 : 1.0) * stretch;
    Taps taps;
    taps.first = static_cast<int>(std::ceil(place - radius - 0.5));
    const int last = static_cast<int>(std::floor(place + radius - 0.5));
    double sum = 0.0;
    for (int i = taps.first; i <= last; ++i) {
        const double t = (i + 0.5 - place) / stretch;
        taps.weights.push_back(cubic ? CatmullRom(t) : Tent(t));
        taps.distances.push_back(t);
        sum += taps.weights.back();
    }
    for (double& weight : taps.weights) weight /= sum;
    return taps;
}

/// An alpha this small is what rounding leaves where negative and positive weights cancel: there is no colour to divide
/// out.
constexpr double kLeastAlpha = 1e-5;

}  // namespace

Pixel Sample(const Picture& picture, double u, double v, double footprintU, double footprintV,
             Vellum::RenderQuality quality) {
    if (quality < Vellum::RenderQuality::kMedium) {
        return picture.Get(std::clamp(static_cast<int>(std::floor(u)), 0, picture.width - 1),
                           std::clamp(static_cast<int>(std::floor(v)), 0, picture.height - 1));
    }
    const bool cubic = quality >= Vellum::RenderQuality::kHigh;
    const Taps across = MakeTaps(u, footprintU, cubic);
    const Taps down = MakeTaps(v, footprintV, cubic);
    Pixel sum{};
    Pixel least{HUGE_VAL, HUGE_VAL, HUGE_VAL, 0.0};
    Pixel most{-HUGE_VAL, -HUGE_VAL, -HUGE_VAL, 0.0};
    for (std::size_t j = 0; j < down.weights.size(); ++j) {
        const int y = std::clamp(down.first + static_cast<int>(j), 0, picture.height - 1);
        for (std::size_t i = 0; i < across.weights.size(); ++i) {
            const int x = std::clamp(across.first + static_cast<int>(i), 0, picture.width - 1);
            const Pixel pixel = picture.Get(x, y);
            const double weight = across.weights[i] * down.weights[j] * pixel[3];
            for (std::size_t c = 0; c < 3; ++c) {
                sum[c] += weight * pixel[c];
                if (pixel[3] == 0.0 || !across.IsWithin(i) || !down.IsWithin(j)) continue;
                least[c] = std::min(least[c], pixel[c]);
                most[c] = std::max(most[c], pixel[c]);
            }
            sum[3] += weight;
        }
    }
    if (sum[3] < kLeastAlpha) return Pixel{};
    Pixel out{sum[0] / sum[3], sum[1] / sum[3], sum[2] / sum[3], std::min(sum[3], 1.0)};
    const double largest = std::max({std::abs(out[0]), std::abs(out[1]), std::abs(out[2])});
    if (cubic && largest > 2.0 && out[3] < 0.25) {
        for (std::size_t c = 0; c < 3; ++c) out[c] = std::clamp(out[c], least[c], most[c]);
    }
    return out;
}

void Resample(const Picture& source, Picture& target, double scaleX, double scaleY, Vellum::RenderQuality quality) {
    for (int y = 0; y < target.height; ++y) {
        for (int x = 0; x < target.width; ++x) {
            target.Set(x, y,
                       Sample(source, (x + 0.5) / scaleX, (y + 0.5) / scaleY, 1.0 / scaleX, 1.0 / scaleY, quality));
        }
    }
}

}  // namespace Vantrel::Host::Software
