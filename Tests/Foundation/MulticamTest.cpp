// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Tarn/Multicam.h"

#include <gtest/gtest.h>

#include <vector>

namespace {

TEST(MulticamTiles, TheGridIsTheSmallestSquareThatHoldsThem) {
    for (int count = 0; count <= 70; ++count) {
        const int side = Tarn::GetMulticamDownsampleFactor(count);
        EXPECT_TRUE(side * side >= count && (side == 1 || (side - 1) * (side - 1) < count)) << count;
    }
}

TEST(MulticamTiles, EachPixelBelongsToOneTileAndTilesGoRowByRow) {
    for (const auto& [width, height] : std::vector<std::pair<int, int>>{{64, 36}, {37, 23}, {1, 1}, {2, 7}, {101, 5}}) {
        for (int factor = 1; factor <= 6; ++factor) {
            std::vector<int> owner(static_cast<std::size_t>(width * height), -1);
            for (int index = 0; index < factor * factor; ++index) {
                const Vellum::Rect tile = Tarn::GetMulticamBoundsBoundsForTrackIndex(index, width, height, factor);
                EXPECT_LE(std::abs(tile.Width() * factor - width), factor);
                for (int place = 0; place < tile.Width() * tile.Height(); ++place) {
                    const int x = tile.left + place % tile.Width(), y = tile.top + place / tile.Width();
                    int& pixel = owner.at(static_cast<std::size_t>(y * width + x));
                    EXPECT_EQ(pixel, -1) << "tiles " << pixel << " and " << index << " overlap";
                    EXPECT_TRUE(x == 0 || owner[static_cast<std::size_t>(y * width + x - 1)] >= 0) << "a gap";
                    EXPECT_TRUE(y == 0 || owner[static_cast<std::size_t>((y - 1) * width + x)] >= 0) << "a gap";
                    pixel = index;
                }
            }
            EXPECT_GE(owner.back(), 0);
        }
    }
    EXPECT_EQ(Tarn::GetMulticamBoundsBoundsForTrackIndex(9, 64, 36, 3), Vellum::Rect());
}

}  // namespace
