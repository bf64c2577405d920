// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <cstddef>
#include <vector>

namespace Vantrel::Host::Software {

/// Blue, green, red, alpha, in that order, straight.
using Pixel = std::array<double, 4>;

/// A picture in ordinary memory: blue, green, red, alpha as 32-bit floats, straight alpha, rows without gaps.
struct Picture {
    Picture() = default;
    /// Transparent black.
    Picture(int pictureWidth, int pictureHeight)
        : width(pictureWidth),
          height(pictureHeight),
          pixels(static_cast<std::size_t>(pictureWidth) * static_cast<std::size_t>(pictureHeight) * 4) {}

    [[nodiscard]] float* At(int x, int y) { return pixels.data() + Index(x, y); }
    [[nodiscard]] const float* At(int x, int y) const { return pixels.data() + Index(x, y); }

    [[nodiscard]] Pixel Get(int x, int y) const {
        const float* p = At(x, y);
        return {p[0], p[1], p[2], p[3]};
    }
    void Set(int x, int y, const Pixel& value) {
        float* p = At(x, y);
        for (std::size_t c = 0; c < 4; ++c) p[c] = static_cast<float>(value[c]);
    }

    int width = 0;
    int height = 0;
    std::vector<float> pixels;

private:
    [[nodiscard]] std::size_t Index(int x, int y) const {
        return (static_cast<std::size_t>(y) * static_cast<std::size_t>(width) + static_cast<std::size_t>(x)) * 4;
    }
};

}  // namespace Vantrel::Host::Software
