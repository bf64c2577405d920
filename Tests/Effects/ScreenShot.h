// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <algorithm>
#include <array>
#include <cmath>

#include "Host/Software/Effects/ColorMath.h"
#include "Tests/Support/Pictures.h"

namespace Vantrel::Testing {

/// Something in front of a screen, and the truth that made it. Light adds up in linear values, as in a camera.
struct ScreenShot {
    enum class Subject {
        kDisc,    ///< with an edge of six pixels
        kHair,    ///< lines of 0.4 to 1.2 pixels
        kMotion,  ///< a disc that moves by two thirds of its width while the shutter is open
        kGlass,   ///< panes of 30, 50 and 70 percent, which cut hard
    };
    struct Making {
        Pixel screen;
        Subject subject = Subject::kDisc;
        Pixel front{0.5, 0.5, 0.5, 1};
        double left = 1.0, right = 1.0;  ///< the screen's light, of its colour
        double noise = 0.0;              ///< standard deviation, of display values
    };

    Picture shot;   ///< what the camera saw
    Picture truth;  ///< what stood before the screen, with its coverage

    static ScreenShot Make(Random& random, int width, int height, const Making& making) {
        ScreenShot made{Picture(width, height), Picture(width, height)};
        const double noise = making.noise * std::sqrt(3.0);
        for (int y = 0; y < height; ++y) {
            for (int x = 0; x < width; ++x) {
                const double alpha = PixelCoverage(making.subject, x, y, width, height);
                const double light = making.left + (making.right - making.left) * x / (width - 1);
                Pixel shot{0, 0, 0, 1};
                for (std::size_t c = 0; c < 3; ++c) {
                    using namespace Host::Software;
                    const double mixed =
                        Mix(light * LinearLevel(making.screen[c]), LinearLevel(making.front[c]), alpha);
                    shot[c] = DisplayLevel(mixed);
                    if (noise > 0.0) {
                        const float most = static_cast<float>(noise);
                        shot[c] += static_cast<double>(random.Uniform(-most, most));
                    }
                }
                made.shot.Set(x, y, shot);
                made.truth.Set(x, y, {making.front[0], making.front[1], making.front[2], alpha});
            }
        }
        return made;
    }

    /// Mean errors of a matte: where nothing, where all and where a part is covered.
    [[nodiscard]] std::array<double, 3> Judge(const Picture& keyed) const {
        std::array<double, 3> sums{}, counts{1e-9, 1e-9, 1e-9};
        for (std::size_t i = 3; i < truth.pixels.size(); i += 4) {
            const std::size_t where = truth.pixels[i] == 0.0F ? 0 : (truth.pixels[i] == 1.0F ? 1 : 2);
            sums[where] += std::abs(static_cast<double>(keyed.pixels[i] - truth.pixels[i]));
            counts[where] += 1.0;
        }
        return {sums[0] / counts[0], sums[1] / counts[1], sums[2] / counts[2]};
    }

private:
    static double Mix(double a, double b, double share) { return a + share * (b - a); }
    static double PixelCoverage(Subject subject, int x, int y, int width, int height) {
        constexpr int kFine = 6;
        double sum = 0.0;
        for (int i = 0; i < kFine * kFine; ++i) {
            sum += Coverage(subject, x + (i % kFine + 0.5) / kFine, y + (0.5 + i / kFine) / kFine, width, height);
        }
        return sum / (kFine * kFine);
    }
    /// At a place, in pixels.
    static double Coverage(Subject subject, double x, double y, int width, int height) {
        const double radius = 0.3 * height, u = x - 0.5 * width, v = y - 0.5 * height;
        switch (subject) {
            case Subject::kDisc:
                return std::clamp((radius - std::hypot(u, v)) / 6.0 + 0.5, 0.0, 1.0);
            case Subject::kHair: {
                double covered = 0.0;
                for (int i = 0; i < 24; ++i) {
                    const double from = (i - 11.5) * width / 24.0, across = u - from - 0.02 * (i - 12) * v;
                    if (std::abs(across) < 0.2 + 0.2 * (i % 3)) covered = 1.0;
                }
                return std::abs(v) < 0.4 * height ? covered : 0.0;
            }
            case Subject::kMotion: {
                if (std::abs(v) >= radius) return 0.0;
                const double half = std::sqrt(radius * radius - v * v), way = 4.0 / 3.0 * radius;
                const double from = std::max(u - way / 2, -half), to = std::min(u + way / 2, half);
                return std::max(to - from, 0.0) / way;
            }
            case Subject::kGlass: {
                const double pane = (u / width + 0.4) / 0.8 * 3.0;
                if (std::abs(v) > radius || pane < 0.0 || pane >= 3.0 || pane - std::floor(pane) > 0.9) return 0.0;
                return 0.3 + 0.2 * std::floor(pane);
            }
        }
        return 0.0;
    }
};

}  // namespace Vantrel::Testing
