// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
// The selection's record, and the blur of its mask.
#include "Host/Software/Effects/Selection.h"

#include <cmath>
#include <cstring>

#include "Kiln/Backend.h"
#include "Kiln/Scratch.h"
#include "Src/Effects/ColorCorrector_Secondary.h"
#include "Src/Effects/SingleChannelBlur.h"
#include "Tests/Effects/EffectTester.h"
#include "Vantrel/EffectTable.h"

namespace Vantrel::Testing {
namespace {

class SelectionOnEachDevice : public EffectTest {
protected:
    /// The record of a selection of the luma corrector, whose parameters begin at 44.
    SecondaryParameters Read(const std::map<std::int32_t, double>& overrides, float aspect = 1.0F, float scaleX = 1.0F,
                             float scaleY = 1.0F) {
        std::map<std::int32_t, double> moved;
        for (const auto& [index, value] : overrides) moved[index + 44] = value;
        const VideoNodeRef effect = DescribeEffect("TQ.XQVE Luma Corrector", MakeParams(kLumaCorrectorEffect, moved));
        RenderParams params;
        params.scaleX = scaleX;
        params.scaleY = scaleY;
        return ReadSecondaryParameters(ParameterReader(*effect, kLumaCorrectorEffect, 0), 44, aspect, params);
    }
};

TEST_P(SelectionOnEachDevice, HueEdgesAreTurnedAndWrappedOnce) {
    struct Row {
        double center, start, end;
        float low, high;
        int fullCircle;
    };
    const Row rows[] = {{0.5, 30, 80, 0.8F, 0.3F, 0}, {0, 10, 110, 0.1F, 1.1F, 0}, {0, 50, 50, 0.5F, 0.5F, 0},
                        {0.5, 0, 100, 0.5F, 0.5F, 1}, {0, 20, 20, 0.2F, 0.2F, 0},  {0, 100, 0, 1.0F, 0.0F, 0}};
    for (const Row& row : rows) {
        const SecondaryParameters record = Read({{0, row.center}, {1, row.start}, {3, row.end}});
        EXPECT_NEAR(record.range0Low, row.low, 1e-6F);
        EXPECT_NEAR(record.range0High, row.high, 1e-6F);
        EXPECT_EQ(record.fullCircle, row.fullCircle) << row.start << " to " << row.end << " about " << row.center;
    }
}

TEST_P(SelectionOnEachDevice, FieldsArriveByIndexAndTheBlurIsRoundInTheSequence) {
    const std::int32_t order[] = {2, 1, 4, 3, 10, 9, 12, 11, 18, 17, 20, 19};
    std::map<std::int32_t, double> overrides = {{23, 4}, {24, -30}, {25, 1}};
    for (const std::int32_t index : order) overrides[index] = index;
    const SecondaryParameters record = Read(overrides);
    float fields[std::size(order)];
    std::memcpy(fields, &record, sizeof fields);
    for (std::size_t i = 0; i < std::size(order); ++i) EXPECT_EQ(fields[i], static_cast<float>(order[i]) / 100.0F) << i;
    EXPECT_EQ(record.maskAdjust, -0.3F);
    EXPECT_EQ(record.invertSelection, 1);
    struct Row {
        float aspect, scaleX, scaleY;
        double x, y;
    };
    for (const Row& row : {Row{1, 1, 1, 2, 2}, Row{1, 2, 2, 0.5, 0.5}, Row{2, 1, 1, 4, 2}, Row{1, 4, 1, 0.125, 2}}) {
        const SecondaryParameters scaled = Read(overrides, row.aspect, row.scaleX, row.scaleY);
        EXPECT_NEAR(scaled.blurRadiusX, 4 * std::sqrt(row.x), 1e-6);
        EXPECT_NEAR(scaled.blurRadiusY, 4 * std::sqrt(row.y), 1e-6);
    }
}

TEST_P(SelectionOnEachDevice, DefaultsSelectNothingAndEachFieldButTwoDoes) {
    const SecondaryParameters defaults = Read({});
    EXPECT_FALSE(HasSecondarySelection(defaults));
    for (std::size_t field = 0; field < 15; ++field) {
        float fields[sizeof(SecondaryParameters) / sizeof(float)];
        std::memcpy(fields, &defaults, sizeof fields);
        fields[field] += 0.25F;
        SecondaryParameters record{};
        std::memcpy(&record, fields, sizeof record);
        EXPECT_EQ(HasSecondarySelection(record), field != 14) << "field " << field << "; 14 is the thinning";
    }
    SecondaryParameters record = defaults;
    record.fullCircle = 1;
    EXPECT_FALSE(HasSecondarySelection(record));
    record.invertSelection = 1;
    EXPECT_TRUE(HasSecondarySelection(record));
}

TEST_P(SelectionOnEachDevice, TheBlurMatchesTheScalarRecursion) {
    constexpr std::pair<int, int> kSizes[] = {{1, 1},  {1, 9},   {9, 1},    {2, 2},    {1, 64},   {64, 1},
                                              {8, 12}, {16, 10}, {1001, 7}, {6, 1001}, {129, 65}, {256, 128}};
    Random random;
    SCOPED_TRACE(random.GetSeed());
    for (const auto& [width, height] : kSizes) {
        for (const int spare : {0, 8}) {  // rows of device memory come in fours, on which squares rely
            const float sigmaX = random.Uniform(0.4F, 6.0F), sigmaY = random.Uniform(0.4F, 6.0F);
            Host::Software::Mask expected{width, height, {}};
            const auto pitch = static_cast<std::size_t>(width + spare), rows = static_cast<std::size_t>(height);
            std::vector<float> values(pitch * rows, NAN);
            for (std::size_t y = 0; y < rows; ++y) {
                for (std::size_t x = 0; x + static_cast<std::size_t>(spare) < pitch; ++x) {
                    values[y * pitch + x] = random.Uniform(0.0F, 1.0F);
                    expected.shares.push_back(values[y * pitch + x]);
                }
            }
            Host::Software::BlurMask(expected, sigmaX, sigmaY);

            const std::size_t rowBytes = pitch * sizeof(float);
            const Kiln::DeviceScratchBuffer buffer(GetDevice(), rowBytes * rows);
            Kiln::Backend& backend = GetDevice()->GetBackend();
            ASSERT_EQ(backend.CopyToDevice(buffer.GetHandle(), 0, values.data(), rowBytes * rows), 0);
            ASSERT_EQ(SingleChannelBlur(GetDevice(), buffer.GetHandle(), static_cast<std::int32_t>(rowBytes), width,
                                        height, sigmaX, sigmaY),
                      Ostrand::kStatus_OK);
            ASSERT_EQ(GetDevice()->Synchronize(), Ostrand::kStatus_OK);
            ASSERT_EQ(
                backend.CopyRowsToHost(values.data(), rowBytes, buffer.GetHandle(), {0, rowBytes}, rowBytes, rows),
                Ostrand::kStatus_OK);
            double worst = 0.0;
            for (int y = 0; y < height; ++y) {
                for (int x = 0; x < width; ++x) {
                    const double difference =
                        values[static_cast<std::size_t>(y) * pitch + static_cast<std::size_t>(x)] - expected.At(x, y);
                    worst = difference == difference ? std::max(worst, std::abs(difference)) : INFINITY;
                }
            }
            EXPECT_LT(worst, 1e-4) << width << " by " << height << ", " << spare << " spare, " << sigmaX << ", "
                                   << sigmaY;
        }
    }
}

INSTANTIATE_TEST_SUITE_P(Devices, SelectionOnEachDevice, ::testing::ValuesIn(AllDeviceCases()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
