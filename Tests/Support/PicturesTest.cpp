// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
// Tests of the tests' own tools: a comparison that is too kind would pass everything that leans on it.
#include "Tests/Support/Pictures.h"

#include <cmath>

#include <gmock/gmock.h>

namespace Vantrel::Testing {
namespace {

TEST(PicturesAgree, FindsOneValueThatIsOff) {
    Random random(1);
    const Picture expected = RandomOpaquePicture(random, 31, 17);
    Picture actual = expected;
    EXPECT_TRUE(PicturesAgree(actual, expected, kExactly));
    actual.At(30, 16)[2] += 0.01F;
    const testing::AssertionResult result = PicturesAgree(actual, expected, {0.005});
    EXPECT_FALSE(result);
    EXPECT_THAT(result.message(), testing::HasSubstr("1 of 527 pixels differ; worst at (30, 16), channel R"));
    EXPECT_TRUE(PicturesAgree(actual, expected, {0.02}));
    EXPECT_TRUE(PicturesAgree(actual, expected, {0.005, 0.0, false, 0.5 / 527.0})) << "one pixel at least";
    actual.At(0, 0)[1] += 0.01F;
    EXPECT_FALSE(PicturesAgree(actual, expected, {0.005, 0.0, false, 1.5 / 527.0}));
    EXPECT_TRUE(PicturesAgree(actual, expected, {0.005, 0.0, false, 2.5 / 527.0}));
    EXPECT_FALSE(PicturesAgree(Picture(31, 16), Picture(31, 17), {100.0}));
}

TEST(PicturesAgree, TakesNanAndInfinityForNothingElse) {
    Picture expected(1, 1);
    Picture actual(1, 1);
    for (const float special : {NAN, INFINITY, -INFINITY}) {
        expected.At(0, 0)[1] = 0.5F;
        actual.At(0, 0)[1] = special;
        EXPECT_FALSE(PicturesAgree(actual, expected, {1000.0, 1000.0}));
        EXPECT_FALSE(PicturesAgree(expected, actual, {1000.0, 1000.0}));
        expected.At(0, 0)[1] = special;
        EXPECT_TRUE(PicturesAgree(actual, expected, kExactly));
    }
}

TEST(PicturesAgree, WeighsColourByAlphaOnDemandOnly) {
    Picture expected(1, 1);
    expected.Set(0, 0, {0.2, 0.2, 0.2, 0.001});
    Picture actual = expected;
    actual.At(0, 0)[0] = 1.0F;
    EXPECT_FALSE(PicturesAgree(actual, expected, {0.01}));
    EXPECT_TRUE(PicturesAgree(actual, expected, {0.01, 0.0, true}));
    actual.At(0, 0)[3] = 1.0F;
    EXPECT_FALSE(PicturesAgree(actual, expected, {0.01, 0.0, true}));
}

TEST(Halves, RoundLikeTheStandardAndBack) {
    // Values and bits from IEEE 754: 1, the largest, one beyond it, the least normal and subnormal, halfway cases to
    // even.
    constexpr struct {
        float value;
        std::uint16_t bits;
    } kKnown[] = {{0.0F, 0x0000},       {-0.0F, 0x8000},        {1.0F, 0x3C00},         {-2.0F, 0xC000},
                  {65504.0F, 0x7BFF},   {65520.0F, 0x7C00},     {65519.0F, 0x7BFF},     {0x1p-14F, 0x0400},
                  {0x1p-24F, 0x0001},   {0x1p-25F, 0x0000},     {0x1.8p-24F, 0x0002},   {0x1.002p0F, 0x3C00},
                  {0x1.006p0F, 0x3C02}, {0x1.ff8p-15F, 0x03FF}, {0x1.ffcp-15F, 0x0400}, {0.1F, 0x2E66}};
    for (const auto& known : kKnown) EXPECT_EQ(HalfFromFloat(known.value), known.bits) << known.value;
    for (std::uint32_t bits = 0; bits < 0x7C00U; ++bits) {
        ASSERT_EQ(HalfFromFloat(FloatFromHalf(static_cast<std::uint16_t>(bits))), bits);
    }
    EXPECT_TRUE(std::isnan(FloatFromHalf(HalfFromFloat(NAN))));
    EXPECT_EQ(FloatFromHalf(HalfFromFloat(-INFINITY)), -INFINITY);
}

}  // namespace
}  // namespace Vantrel::Testing
