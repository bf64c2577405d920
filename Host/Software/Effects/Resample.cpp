// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/Resample.h"

#include <algorithm>
#include <cmath>
#include <vector>

#include <boost/container/small_vector.hpp>

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
    /// As many as a pixel needs where the picture isn't reduced to less than a third.
    using Values = boost::container::small_vector<double, 12>;

    int first = 0;
    Values weights;
    Values distances;  // in units of the filter

    void Aim(double place, double footprint, Vellum::RenderQuality quality) {
        const bool cubic = quality >= Vellum::RenderQuality::kHigh;
        const double stretch = std::max(1.0, cubic ? footprint : footprint - 0.5);
        const double radius = (cubic ? 2.0 : 1.0) * stretch;
        first = static_cast<int>(std::ceil(place - radius - 0.5));
        const int last = static_cast<int>(std::floor(place + radius - 0.5));
        weights.clear();
        distances.clear();
        double sum = 0.0;
        for (int i = first; i <= last; ++i) {
            const double t = (i + 0.5 - place) / stretch;
            weights.push_back(cubic ? CatmullRom(t) : Tent(t));
            distances.push_back(t);
            sum += weights.back();
        }
        for (double& weight : weights) weight /= sum;
    }

    /// Is it short of the cubic's end, by more than rounding?
    [[nodiscard]] bool IsWithin(std::size_t tap) const { return std::abs(distances[tap]) < 1.99; }
};

/// An alpha this small is what rounding leaves where negative and positive weights cancel: there is no colour to divide
/// out.
constexpr double kLeastAlpha = 1e-5;

Pixel Nearest(const Picture& picture, double u, double v) {
    return picture.Get(std::clamp(static_cast<int>(std::floor(u)), 0, picture.width - 1),
                       std::clamp(static_cast<int>(std::floor(v)), 0, picture.height - 1));
}

Pixel SumTaps(const Picture& picture, const Taps& across, const Taps& down, bool cubic) {
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

}  // namespace

Pixel Sample(const Picture& picture, double u, double v, double footprintU, double footprintV,
             Vellum::RenderQuality quality) {
    if (quality < Vellum::RenderQuality::kMedium) return Nearest(picture, u, v);
    Taps across, down;
    across.Aim(u, footprintU, quality);
    down.Aim(v, footprintV, quality);
    return SumTaps(picture, across, down, quality >= Vellum::RenderQuality::kHigh);
}

void Resample(const Picture& source, Picture& target, double scaleX, double scaleY, Vellum::RenderQuality quality) {
    if (quality < Vellum::RenderQuality::kMedium) {
        for (int y = 0; y < target.height; ++y) {
            for (int x = 0; x < target.width; ++x) {
                target.Set(x, y, Nearest(source, (x + 0.5) / scaleX, (y + 0.5) / scaleY));
            }
        }
        return;
    }
    std::vector<Taps> across(static_cast<std::size_t>(target.width));
    for (int x = 0; x < target.width; ++x) {
        across[static_cast<std::size_t>(x)].Aim((x + 0.5) / scaleX, 1.0 / scaleX, quality);
    }
    Taps down;
    for (int y = 0; y < target.height; ++y) {
        down.Aim((y + 0.5) / scaleY, 1.0 / scaleY, quality);
        for (int x = 0; x < target.width; ++x) {
            target.Set(
                x, y,
                SumTaps(source, across[static_cast<std::size_t>(x)], down, quality >= Vellum::RenderQuality::kHigh));
        }
    }
}

}  // namespace Vantrel::Host::Software
