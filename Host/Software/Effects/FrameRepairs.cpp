// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/FrameRepairs.h"

#include <algorithm>

namespace Vantrel::Host::Software {

void Unpremultiply(Picture& picture, std::uint32_t matteColor) {
    for (int y = 0; y < picture.height; ++y) {
        for (int x = 0; x < picture.width; ++x) {
            Pixel pixel = picture.Get(x, y);
            for (std::size_t c = 0; c < 3; ++c) {
                const double matte = (matteColor >> (8 * c) & 0xFFU) / 255.0;
                pixel[c] = pixel[3] == 0.0 ? matte : matte + (pixel[c] - matte) / pixel[3];
            }
            picture.Set(x, y, pixel);
        }
    }
}

void Deinterlace(Picture& picture, int keep) {
    if (picture.height < 2) return;
    for (int y = keep == 0 ? 1 : 0; y < picture.height; y += 2) {
        const int above = y > 0 ? y - 1 : y + 1;
        const int below = y + 1 < picture.height ? y + 1 : y - 1;
        for (int x = 0; x < picture.width; ++x) {
            const Pixel a = picture.Get(x, above);
            const Pixel b = picture.Get(x, below);
            const double weight = a[3] + b[3];
            Pixel mean{};
            for (std::size_t c = 0; c < 3 && weight > 0.0; ++c) mean[c] = (a[c] * a[3] + b[c] * b[3]) / weight;
            mean[3] = weight / 2.0;
            picture.Set(x, y, mean);
        }
    }
}

void ReverseFields(Picture& picture) {
    for (int y = 0; y + 1 < picture.height; y += 2) {
        std::swap_ranges(picture.At(0, y), picture.At(0, y) + std::size_t{4} * picture.width, picture.At(0, y + 1));
    }
}

void WeaveField(Picture& picture, const Picture& other, bool oddLines) {
    for (int y = oddLines ? 1 : 0; y < picture.height; y += 2) {
        std::copy_n(other.At(0, y), std::size_t{4} * picture.width, picture.At(0, y));
    }
}

Picture SoftenLines(const Picture& picture) {
    Picture soft(picture.width, picture.height);
    for (int y = 0; y < picture.height; ++y) {
        for (int x = 0; x < picture.width; ++x) {
            Pixel sum{};
            for (int tap = -1; tap <= 1; ++tap) {
                const Pixel p = picture.Get(x, std::clamp(y + tap, 0, picture.height - 1));
                const double covered = p[3] * (tap == 0 ? 0.5 : 0.25);
                for (std::size_t c = 0; c < 3; ++c) sum[c] += p[c] * covered;
                sum[3] += covered;
            }
            for (std::size_t c = 0; c < 3; ++c) sum[c] = sum[3] > 0.0 ? sum[c] / sum[3] : 0.0;
            soft.Set(x, y, sum);
        }
    }
    return soft;
}

void Fill(Picture& picture, int left, int top, int width, int height, const Pixel& color) {
    for (int y = std::max(top, 0); y < std::min(top + height, picture.height); ++y) {
        for (int x = std::max(left, 0); x < std::min(left + width, picture.width); ++x) picture.Set(x, y, color);
    }
}

}  // namespace Vantrel::Host::Software
