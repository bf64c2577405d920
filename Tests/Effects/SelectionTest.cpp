// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
// The selection's record, and the blur of its mask.
#include <cmath>
#include <cstring>

#include "Src/Effects/ColorCorrector_Secondary.h"
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

INSTANTIATE_TEST_SUITE_P(Devices, SelectionOnEachDevice, ::testing::ValuesIn(AllDeviceCases()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
