// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Media/NumberPicture.h"

namespace Vantrel::Host {

namespace {

constexpr int kSide = 4;

}  // namespace

void DrawNumber(HostPicture& picture, std::uint32_t number) {
    for (std::int32_t y = 0; y < picture.height; ++y) {
        auto* row = reinterpret_cast<std::uint32_t*>(picture.GetRow(y));
        const std::int32_t line = y * kSide / picture.height;
        for (std::int32_t x = 0; x < picture.width; ++x) {
            const std::int32_t square = line * kSide + x * kSide / picture.width;
            row[x] = (number >> (kNumberBits - 1 - square) & 1U) != 0 ? 0xFFFFFFFFU : 0xFF000000U;
        }
    }
}

std::array<double, kNumberBits> ReadSquares(const HostPicture& picture) {
    std::array<double, kNumberBits> levels{};
    for (int square = 0; square < kNumberBits; ++square) {
        // The middle half of a square: its border may be blurred by scaling or compression.
        const std::int32_t left = picture.width * (4 * (square % kSide) + 1) / (4 * kSide);
        const std::int32_t right = picture.width * (4 * (square % kSide) + 3) / (4 * kSide);
        const std::int32_t top = picture.height * (4 * (square / kSide) + 1) / (4 * kSide);
        const std::int32_t bottom = picture.height * (4 * (square / kSide) + 3) / (4 * kSide);
        double sum = 0;
        for (std::int32_t y = top; y < bottom; ++y) {
            const auto* row = reinterpret_cast<const std::uint8_t*>(picture.GetRow(y));
            for (std::int32_t x = left; x < right; ++x) sum += row[4 * x + 1] / 255.0;
        }
        const std::int32_t count = (right - left) * (bottom - top);
        levels[static_cast<std::size_t>(square)] = count > 0 ? sum / count : 0.0;
    }
    return levels;
}

std::int64_t ReadNumber(const HostPicture& picture) {
    std::int64_t number = 0;
    for (const double level : ReadSquares(picture)) {
        if (level > 0.25 && level < 0.75) return -1;
        number = 2 * number + (level >= 0.75 ? 1 : 0);
    }
    return number;
}

}  // namespace Vantrel::Host
