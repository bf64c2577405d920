// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <cmath>

#include "Host/Software/Effects/ColorMath.h"
#include "Tests/Support/Pictures.h"

namespace Vantrel::Testing {

/// Something in front of a screen, and the truth that made it: a solid disc, hairs thinner than a pixel, a moving bar
/// and a veil. Light adds up in linear values, as in a camera.
struct ScreenShot {
    Picture shot;   ///< what the camera saw
    Picture truth;  ///< what stood before the screen, with its coverage

    struct Making {
        Pixel screen;
        double unevenness = 0.0;  ///< the screen's light falls by this share from left to right
        double noise = 0.0;       ///< largest, of display values
        bool colorful = true;     ///< else all in greys
    };

    static double Coverage(double x, double y) {
        const double disc = std::hypot(x - 0.25, y - 0.5) < 0.18 ? 1.0 : 0.0;
        double hair = 0.0;
        for (int i = 0; i < 9; ++i) {
            const double across = std::abs((x - 0.25) * std::sin(0.35 * i) - (y - 0.5) * std::cos(0.35 * i));
            if (across < 0.0012 + 0.0003 * i && std::hypot(x - 0.25, y - 0.5) < 0.3) hair = 1.0;
        }
        const bool inBar = y > 0.15 && y < 0.45;
        const double bar = inBar ? std::clamp(std::min((x - 0.58) / 0.09, (0.84 - x) / 0.09), 0.0, 1.0) : 0.0;
        const double veil = y > 0.6 && y < 0.85 && x > 0.6 && x < 0.9 ? (x - 0.6) / 0.3 : 0.0;
        return std::max({disc, hair, bar, veil});
    }

    static ScreenShot Make(Random& random, int width, int height, const Making& making) {
        constexpr int kFine = 8;
        ScreenShot made{Picture(width, height), Picture(width, height)};
        for (int y = 0; y < height; ++y) {
            for (int x = 0; x < width; ++x) {
                double alpha = 0.0;
                for (int i = 0; i < kFine * kFine; ++i) {
                    alpha +=
                        Coverage((x + (i % kFine + 0.5) / kFine) / width, (y + (0.5 + i / kFine) / kFine) / height);
                }
                alpha /= kFine * kFine;
                const Pixel front =
                    Front(making.colorful, static_cast<double>(x) / width, static_cast<double>(y) / height);
                const double light = 1.0 - making.unevenness * x / width;
                Pixel shot{0, 0, 0, 1};
                for (std::size_t c = 0; c < 3; ++c) {
                    using Host::Software::LinearLevel;
                    const double mixed =
                        alpha * LinearLevel(front[c]) + (1.0 - alpha) * light * LinearLevel(making.screen[c]);
                    const float noise = static_cast<float>(making.noise);
                    shot[c] = Host::Software::DisplayLevel(mixed) + static_cast<double>(random.Uniform(-noise, noise));
                }
                made.shot.Set(x, y, shot);
                made.truth.Set(x, y, {front[0], front[1], front[2], alpha});
            }
        }
        return made;
    }

private:
    static Pixel Front(bool colorful, double x, double y) {
        if (std::hypot(x - 0.25, y - 0.5) < 0.18) return colorful ? Pixel{0.5, 0.6, 0.85, 1} : Pixel{0.7, 0.7, 0.7, 1};
        if (x < 0.57) return colorful ? Pixel{0.05, 0.1, 0.15, 1} : Pixel{0.1, 0.1, 0.1, 1};
        if (y < 0.5) return colorful ? Pixel{0.15, 0.15, 0.7, 1} : Pixel{0.5, 0.5, 0.5, 1};
        return {0.9, 0.9, 0.9, 1};
    }
};

}  // namespace Vantrel::Testing
