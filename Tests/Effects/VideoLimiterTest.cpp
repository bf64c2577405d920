// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <cmath>

#include "Tests/Effects/EffectTester.h"

namespace Vantrel::Testing {
namespace {

using VideoLimiterOnEachDevice = EffectTest;

TEST_P(VideoLimiterOnEachDevice, WhatComesOutLiesWithinTheLimitsAndWhatDidKeepsItsBits) {
    Random random;
    Picture in = RandomPicture(random, 61, 7);
    const float extremes[] = {60000.0F, -60000.0F, INFINITY, -INFINITY};
    for (int i = 0; i < 24; ++i) in.At(i, 0)[i % 3] = extremes[i / 6];
    in = RoundTo(in, GetFormat());
    for (std::int32_t axis = 0; axis < 4; ++axis) {
        const std::map<std::int32_t, FakeParam> params = {{3, axis}, {4, 10.0},  {5, 80.0}, {6, 0.0},
                                                          {7, 30.0}, {8, -10.0}, {9, 90.0}, {10, std::int32_t{3}}};
        const Picture out = Apply("TQ.XQVE Video Limiter", params, in);
        for (int i = 0; i < in.width * in.height; ++i) {
            const auto before = in.Get(i % in.width, i / in.width), after = out.Get(i % in.width, i / in.width);
            const auto within = [axis](const auto& p, double slack) {
                const double luma = 0.2126 * p[2] + 0.7152 * p[1] + 0.0722 * p[0];
                const double chroma = std::hypot(0.492111 * (p[0] - luma), 0.877283 * (p[2] - luma));
                if (axis == 3) return luma - chroma >= -0.1 - slack && luma + chroma <= 0.9 + slack;
                const bool hasLuma = luma >= 0.1 - slack && luma <= 0.8 + slack, hasChroma = chroma <= 0.3 + slack;
                return (axis == 1 || hasLuma) && (axis == 0 || hasChroma);
            };
            const std::string place = "axis " + std::to_string(axis) + ", pixel " + std::to_string(i);
            if (within(before, -1e-5)) {
                EXPECT_EQ(after, before) << place;
            }
            // Beyond the picture's own levels the sums that make luma have fewer digits.
            const double largest = std::max({std::abs(before[0]), std::abs(before[1]), std::abs(before[2])});
            if (largest < 2.0) {
                EXPECT_TRUE(within(after, IsHalf() ? 2e-3 : 1e-5)) << place;
            }
            for (const double value : after) EXPECT_FALSE(std::isnan(value)) << place;
            EXPECT_EQ(after[3], before[3]) << place;
        }
    }
}

INSTANTIATE_TEST_SUITE_P(Devices, VideoLimiterOnEachDevice, ::testing::ValuesIn(AllDeviceCases()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
