// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <cmath>
#include <limits>
#include <random>

#include "Host/Time/ExactTime.h"
#include "Host/Time/TimeMap.h"

namespace Vantrel::Host::Test {
namespace {

constexpr std::int64_t kFrame = 10584000000;

TEST(ExactTime, EveryUsualRateHasWholeTicks) {
    struct Case {
        double rate;
        std::int64_t ticks;
    };
    constexpr Case kCases[] = {
        {24, 10584000000}, {23.976, 10594584000}, {23.98, 10594584000}, {24000.0 / 1001, 10594584000},
        {25, 10160640000}, {29.97, 8475667200},   {30, 8467200000},     {48, 5292000000},
        {50, 5080320000},  {59.94, 4237833600},   {60, 4233600000},     {12.5, 20321280000},
        {1, 254016000000}, {48000, 5292000},      {0.5, 508032000000}};
    for (const Case& c : kCases) {
        const auto rate = SnapRate(c.rate);
        ASSERT_TRUE(rate) << c.rate;
        EXPECT_EQ(TicksPerFrame(*rate), c.ticks) << c.rate;
    }
    for (const double bad : {0.0, -24.0, std::nan(""), std::numeric_limits<double>::infinity()}) {
        EXPECT_FALSE(SnapRate(bad)) << bad;
    }
}

TEST(ExactTime, TimesAreExactWhereADoubleOfSecondsIsNot) {
    const Rate ntsc = *SnapRate(29.97);
    for (const std::int64_t frames : {1, 1001, 107892, 10789200}) {
        EXPECT_EQ(ToTicks(static_cast<double>(frames), ntsc), frames * 8475667200) << frames;
        EXPECT_EQ(ToTicks(-static_cast<double>(frames), ntsc), -frames * 8475667200) << frames;
    }
    EXPECT_EQ(ToTicks(0.5, Rate{24, 1}), 5292000000);
    // Half a tick goes up, on either side of 0.
    EXPECT_EQ(ToTicks(0.5, Rate{254016000000, 1}), 1);
    EXPECT_EQ(ToTicks(-0.5, Rate{254016000000, 1}), 0);
    EXPECT_EQ(ToTicks(1e300, Rate{24, 1}), Vellum::kTime_Max);
    EXPECT_EQ(ToTicks(5e-324, Rate{24, 1}), 0);
}

TEST(ExactTime, ScalingAgreesWithWideFloatingPoint) {
    std::mt19937_64 random(4711);
    std::uniform_int_distribution<std::int64_t> ticks(-Vellum::kTime_Max / 64, Vellum::kTime_Max / 64);
    std::uniform_real_distribution<double> factors(0.02, 50);
    for (int i = 0; i < 20000; ++i) {
        const std::int64_t t = ticks(random);
        const double f = i % 2 == 0 ? factors(random) : -factors(random);
        const long double product = static_cast<long double>(f) * static_cast<long double>(t);
        EXPECT_LE(std::fabs(static_cast<long double>(ScaleTicks(t, f)) - product), 0.75L) << t << " * " << f;
        const long double quotient = static_cast<long double>(t) / static_cast<long double>(f);
        if (std::fabs(quotient) > static_cast<long double>(Vellum::kTime_Max)) continue;
        EXPECT_LE(std::fabs(static_cast<long double>(UnscaleTicks(t, f)) - quotient), 0.75L) << t << " / " << f;
    }
    EXPECT_EQ(ScaleTicks(Vellum::kTime_Max, 1e5), Vellum::kTime_Max);
    EXPECT_EQ(UnscaleTicks(-Vellum::kTime_Max, 1e-5), -Vellum::kTime_Max);
    EXPECT_EQ(MultiplyTicks(Vellum::kTime_Max, 3, 6), Vellum::kTime_Max / 2);
}

TEST(ExactTime, AFrameBeginsAMicrosecondEarly) {
    EXPECT_EQ(FrameNumberAt(3 * kFrame - kFrameTolerance, kFrame), 3);
    EXPECT_EQ(FrameNumberAt(3 * kFrame - kFrameTolerance - 1, kFrame), 2);
    EXPECT_EQ(FrameNumberAt(-kFrameTolerance - 1, kFrame), -1);
}

}  // namespace
}  // namespace Vantrel::Host::Test
