// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <limits>
#include <set>
#include <string>

#include "Marl/PixelAspect.h"
#include "Tarn/Glaze.h"
#include "Vellum/PixelFormat.h"
#include "Vellum/Time.h"

using Marl::AdjustPixelAspectRatioForNonUniformDownsample;
using Vellum::FrameRate;
using Vellum::PixelAspectRatio;
using Vellum::PixelFormat;
using Vellum::TickTime;

namespace {

constexpr std::int64_t Ticks(std::int64_t numerator, std::int64_t denominator) {
    return FrameRate::FromFraction(numerator, denominator).GetTicksPerFrame();
}
static_assert(Vellum::kTime_Max == 100 * 3600 * Vellum::kTicksPerSecond);

constexpr std::int64_t Aligned(std::int64_t ticks, FrameRate rate) {
    TickTime time(ticks);
    time.AlignToFrame(rate);
    return time.GetTicks();
}

}  // namespace

TEST(FrameRates, RoundHalfUpAndSurviveLargeTerms) {
    EXPECT_EQ(Ticks(Vellum::kTicksPerSecond * 2, 3), 2);  // 1.5
    EXPECT_EQ(Ticks(Vellum::kTicksPerSecond * 3, 4), 1);  // 1.33
    const std::int64_t large = std::numeric_limits<std::int64_t>::max() / 25 * 25;
    EXPECT_EQ(Ticks(large, large / 25), 10160640000);
    EXPECT_EQ(Ticks(large, large), Vellum::kTicksPerSecond);
    for (const auto& [numerator, denominator] :
         {std::pair<std::int64_t, std::int64_t>{0, 1}, {1, 0}, {-24, 1}, {24, -1}, {1, large}}) {
        EXPECT_EQ(FrameRate::FromFraction(numerator, denominator), Vellum::kFrameRate_Zero);
    }
}

TEST(Times, AlignDownwardsOnBothSidesOfZero) {
    constexpr FrameRate kRate = FrameRate::Create(10);
    const std::pair<std::int64_t, std::int64_t> cases[] = {{0, 0},    {9, 0},     {10, 10},   {19, 10},
                                                           {-1, -10}, {-10, -10}, {-11, -20}, {-20, -20}};
    for (const auto& [ticks, aligned] : cases) EXPECT_EQ(Aligned(ticks, kRate), aligned) << ticks;
    EXPECT_EQ(Aligned(-7, Vellum::kFrameRate_Zero), -7);
    EXPECT_EQ(Vellum::HalfFrameTicks(10), 5);
    EXPECT_EQ(Vellum::HalfFrameTicks(11), 6);
    EXPECT_EQ(TickTime(-3, FrameRate::FromFraction(25, 1)).GetTicks(), -3 * 10160640000);
}

TEST(PixelFormats, AreFoundByTheHostsCode) {
    const std::string codes = "bgrabgrxbgrpargbxrgbprgbvuyavuyxvuypVUYAvux7vup7bgrf";
    std::set<std::uint64_t> values;
    std::set<std::string> names;
    for (std::size_t i = 0; i < codes.size(); i += 4) {
        const std::string code = codes.substr(i, 4);
        const char literal[5] = {code[0], code[1], code[2], code[3], 0};
        const PixelFormat format = Tarn::SDKToBEPixelFormat(Vellum::FourCC(literal));
        EXPECT_EQ(format.GetCode(), Vellum::FourCC(literal)) << code;
        EXPECT_EQ(Vellum::BytesPerPixel(format), code == "bgrf" ? 16U : 4U) << code;
        const bool luma = code.find_first_of("vV") == 0;
        EXPECT_EQ((format.GetUpper() & 0xC0000U) == 0x80000U, luma) << code;
        const bool rec709 = code == "VUYA" || code.back() == '7';
        EXPECT_EQ((format.GetUpper() & 0x20U) != 0, rec709) << code;
        values.insert(format.GetValue());
        names.insert(Vellum::ToText(format));
    }
    EXPECT_EQ(values.size(), 13U);
    EXPECT_EQ(names.size(), 13U);
    EXPECT_EQ(Vellum::FourCC("VUYA"), 0x41595556U);
    for (const std::uint32_t unknown : {0U, Vellum::FourCC("BGRA"), Vellum::FourCC("@CDA")}) {
        EXPECT_EQ(Vellum::PixelFormatFromCode(unknown), Vellum::kPixelFormat_Invalid);
    }
}

TEST(PixelAspects, FollowAReductionThatDiffersByDirection) {
    const Vellum::Rect stream{0, 0, 1440, 1080};
    const PixelAspectRatio wide{4, 3};
    const auto adjust = [&](PixelAspectRatio aspect, std::int32_t width, std::int32_t height) {
        return AdjustPixelAspectRatioForNonUniformDownsample(aspect, stream, {10, 20, 10 + width, 20 + height});
    };
    EXPECT_EQ(adjust(wide, 720, 1080), (PixelAspectRatio{8, 3}));
    EXPECT_EQ(adjust(wide, 1440, 540), (PixelAspectRatio{2, 3}));
    EXPECT_EQ(adjust({1, 1}, 1080, 1080), (PixelAspectRatio{4, 3}));
    EXPECT_EQ(adjust({8, 6}, 720, 540), (PixelAspectRatio{8, 6})) << "factors that agree leave even the terms alone";
    EXPECT_EQ(adjust(wide, 0, 540), wide);
    EXPECT_EQ(AdjustPixelAspectRatioForNonUniformDownsample(wide, {}, stream), wide);
    EXPECT_EQ(adjust(Vellum::kPixelAspectRatio_Unknown, 720, 1080), Vellum::kPixelAspectRatio_Unknown);
    EXPECT_EQ(adjust(Vellum::kPixelAspectRatio_Any, 720, 1080), Vellum::kPixelAspectRatio_Any);
}
