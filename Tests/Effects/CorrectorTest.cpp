// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
// What the correctors share, and what each hands its kernels.
#include <cmath>

#include "Src/Effects/ColorCorrector_Secondary.h"
#include "Tests/Effects/EffectTester.h"
#include "Vantrel/EffectTable.h"

namespace Vantrel::Testing {
namespace {

using Overrides = std::map<std::int32_t, double>;

/// A corrector's own places, and how many arguments its kernels take.
struct Family {
    const char* matchName;
    std::int32_t showMask, selection, splitView, showTonalRange;
    std::size_t compositeCount, lumaCount;
};
constexpr Family kFamily[] = {{"TQ.XQVE Luma Corrector", 39, 44, 1, -1, 35, 35},
                              {"TQ.XQVE RGB Color Corrector", 65, 70, 1, -1, 59, 59},
                              {"TQ.XQVE Three-Way Color Corrector", 32, 37, 2, 18, 50, 31}};
constexpr std::size_t kCommonCount = 7;

class CorrectorOnEachDevice : public EffectTest {
protected:
    using Outcome = Recorded;
    Outcome Run(const char* matchName, const Overrides& overrides, const Picture& picture) {
        return Record(matchName, MakeParams(*FindEffect(matchName), overrides), picture);
    }

    [[nodiscard]] Picture MakePicture(int width, int height) {
        return RoundTo(RandomPicture(random, width, height), GetFormat());
    }

    Random random;
};

TEST_P(CorrectorOnEachDevice, OneKernelRunsWithTheArgumentsOfTheOutput) {
    for (const Family& family : kFamily) {
        const std::size_t counts[] = {family.compositeCount, family.lumaCount, kCommonCount + 4, kCommonCount};
        std::vector<std::pair<Overrides, std::size_t>> rows;
        for (std::int32_t i = 0; i < 4; ++i) rows.push_back({{{0, i}}, counts[i]});
        rows.push_back({{{0, 1}, {family.showMask, 1}}, counts[3]});
        if (family.showTonalRange >= 0) {
            rows.push_back({{{0, 1}, {family.showTonalRange, 1}}, counts[2]});
            rows.push_back({{{0, 1}, {family.showTonalRange, 1}, {family.showMask, 1}}, counts[3]});
        }
        for (const auto& [overrides, count] : rows) {
            const Outcome outcome = Run(family.matchName, overrides, MakePicture(5, 3));
            EXPECT_EQ(outcome.status, Ostrand::kStatus_OK);
            ASSERT_EQ(outcome.kernels.size(), 1U) << family.matchName;
            EXPECT_EQ(outcome.kernels[0].Count(), count) << family.matchName;
            EXPECT_EQ(outcome.kernels[0].Get<std::uint64_t>(2), 0U) << "no selection, no mask";
            EXPECT_EQ(outcome.kernels[0].Get<std::int32_t>(3), 0);
        }
        const Picture picture = MakePicture(5, 3);
        const Outcome unknown = Run(family.matchName, {{0, 4}, {family.selection + 25, 1}}, picture);
        EXPECT_EQ(unknown.status, Ostrand::kStatus_Failure) << family.matchName;
        EXPECT_EQ(unknown.kernels.size(), 1U) << "the mask was made, nothing was corrected";
        EXPECT_TRUE(PicturesAgree(unknown.picture, picture, kExactly));
    }
}

TEST_P(CorrectorOnEachDevice, ASplitViewCutsTheWorkAndTheMask) {
    struct Row {
        std::int32_t layout;
        double percent;
        int width, height, workedWidth, workedHeight;
    };
    const Row rows[] = {{1, 50, 1921, 2, 960, 2}, {0, 50, 4, 1001, 4, 500}, {7, 25, 5, 8, 5, 2}, {1, 100, 9, 3, 9, 3},
                        {1, 0, 9, 3, 0, 0},       {0, 0, 9, 3, 0, 0},       {1, 10, 9, 3, 0, 0}};
    for (const Family& family : kFamily) {
        for (const Row& row : rows) {
            const Picture picture = MakePicture(row.width, row.height);
            Picture expected = picture;
            for (int y = 0; y < row.workedHeight; ++y) {
                for (int x = 0; x < row.workedWidth; ++x) expected.Set(x, y, {0, 0, 0, picture.Get(x, y)[3]});
            }
            // The view of an inverted selection: black.
            const Outcome outcome = Run(family.matchName,
                                        {{family.showMask, 1},
                                         {family.selection + 25, 1},
                                         {family.splitView, 1},
                                         {family.splitView + 1, row.layout},
                                         {family.splitView + 2, row.percent}},
                                        picture);
            SCOPED_TRACE(std::string(family.matchName) + ", " + std::to_string(row.percent) + " %");
            EXPECT_EQ(outcome.status, Ostrand::kStatus_OK);
            EXPECT_TRUE(PicturesAgree(outcome.picture, expected, kExactly));
            EXPECT_EQ(outcome.kernels.size(), row.workedWidth > 0 ? 2U : 0U);
            for (const KernelArguments::List& kernel : outcome.kernels) {
                EXPECT_EQ(kernel.Get<std::int32_t>(5), row.workedWidth);
                EXPECT_EQ(kernel.Get<std::int32_t>(6), row.workedHeight);
            }
        }
    }
}

/// Each number has its index for a value, so that the arguments tell where they come from.
double ValueAt(std::int32_t index) { return index + 0.25; }

TEST_P(CorrectorOnEachDevice, LumaAndRGBValuesArriveByIndex) {
    struct Run {
        std::int32_t first, count;
        float divisor;
    };
    const std::vector<Run> luma = {{6, 4, 255},  {13, 1, 255}, {14, 1, 100}, {15, 4, 1},   {19, 1, 255},
                                   {20, 1, 100}, {21, 4, 1},   {25, 1, 255}, {26, 1, 100}, {27, 4, 1},
                                   {31, 1, 255}, {32, 1, 100}, {33, 4, 1}};
    const std::vector<Run> rgb = {{6, 4, 255}, {13, 3, 1}, {26, 9, 1}, {16, 3, 1}, {35, 9, 1},
                                  {19, 3, 1},  {44, 9, 1}, {22, 3, 1}, {53, 9, 1}};
    const std::vector<Run>* const expected[] = {&luma, &rgb};
    for (std::size_t i = 0; i < std::size(expected); ++i) {
        Overrides overrides;
        for (std::int32_t index = 6; index <= 61; ++index) {
            if (i == 1 || index < 39) overrides[index] = ValueAt(index);
        }
        const Outcome outcome = this->Run(kFamily[i].matchName, overrides, MakePicture(2, 2));
        ASSERT_EQ(outcome.kernels.size(), 1U);
        std::size_t at = kCommonCount;
        for (const Run& run : *expected[i]) {
            for (std::int32_t index = run.first; index < run.first + run.count; ++index) {
                EXPECT_EQ(outcome.kernels[0].Get<float>(at++), static_cast<float>(ValueAt(index)) / run.divisor);
            }
        }
        EXPECT_EQ(at, outcome.kernels[0].Count());
    }
}

TEST_P(CorrectorOnEachDevice, ThreeWayValuesArriveByIndexAndWheelsAsDirectionAndStrength) {
    constexpr double kRoot = 0.70710677;
    Overrides overrides = {{76, 90},  {82, -30}, {88, 0},  {94, 45},                          // hue angles
                           {95, 50},  {96, 40},  {97, 90}, {77, 0},   {78, 30},  {79, 200},   // wheels 0, 1
                           {83, -50}, {84, 40},  {85, 0},  {89, 100}, {90, 100}, {91, -60}};  // wheels 2, 3
    for (const std::int32_t index : {19, 20, 21, 22, 25, 26, 27, 100, 102, 103, 104}) overrides[index] = ValueAt(index);
    overrides[101] = 2;
    const double degree = std::acos(-1.0) / 180;
    std::vector<double> values;
    for (const int index : {19, 20, 21, 22}) values.push_back((index + 0.25) / 255);
    for (const int index : {25, 26, 27, 25}) values.push_back((index + 0.25) / 100);
    for (const int angle : {-135, -15, -45, 0}) values.push_back(angle * degree);
    const double wheels[] = {-kRoot, 0.2, kRoot, 0, 0, -kRoot, 0, -0.2, kRoot / 2, kRoot * std::sqrt(0.75), 1};
    values.insert(values.end(), std::begin(wheels), std::end(wheels));
    const double levels[] = {
        100.25 / 255, 102.25 / 255, 0.5, 103.25 / 255, 104.25 / 255, 0, 1, 1, 0, 1, 0, 1, 1, 0, 1, 0, 1, 1, 0, 1};
    for (const std::int32_t output : {0, 1}) {
        overrides[0] = output;
        const Outcome outcome = Run(kFamily[2].matchName, overrides, MakePicture(2, 2));
        ASSERT_EQ(outcome.kernels.size(), 1U);
        std::size_t at = kCommonCount;
        for (std::size_t i = 0; i < (output == 0 ? values.size() : 4); ++i) {
            EXPECT_NEAR(outcome.kernels[0].Get<float>(at++), values[i], 2e-7 * (1 + std::abs(values[i]))) << i;
        }
        for (const double level : levels)
            EXPECT_FLOAT_EQ(outcome.kernels[0].Get<float>(at++), static_cast<float>(level));
        EXPECT_EQ(at, outcome.kernels[0].Count());
    }
}

INSTANTIATE_TEST_SUITE_P(Devices, CorrectorOnEachDevice, ::testing::ValuesIn(AllDeviceCases()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
