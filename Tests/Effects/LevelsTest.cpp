// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <cmath>

#include "Tests/Effects/EffectTester.h"

namespace Vantrel::Testing {
namespace {

using LevelsOnEachDevice = EffectTest;

TEST_P(LevelsOnEachDevice, ExtremeLevelsGiveNumbers) {
    constexpr std::int32_t kNeutral[] = {0, 255, 0, 255, 100};
    const std::int32_t extremes[][5] = {{128, 128, 0, 255, 100}, {0, 255, 77, 77, 100},   {255, 0, 0, 255, 0},
                                        {0, 255, 255, 0, -5},    {-9, 999, -300, 300, 1}, {0, 255, 0, 255, 0}};
    Picture in(6, 1);
    const float values[] = {-60000.0F, -INFINITY, 0.0F, 0.5F, 60000.0F, INFINITY};
    for (int x = 0; x < in.width; ++x) in.Set(x, 0, {values[x], values[x], values[x], 0.25});
    for (const auto& extreme : extremes) {
        for (std::int32_t group = 0; group < 4; ++group) {
            std::map<std::int32_t, FakeParam> params;
            for (std::int32_t i = 0; i < 20; ++i) params[i] = i / 5 == group ? extreme[i % 5] : kNeutral[i % 5];
            const Picture out = Apply("KL.XQVE Levels", params, in);
            for (const float value : out.pixels) EXPECT_FALSE(std::isnan(value)) << extreme[0] << ", group " << group;
            const bool changesBlue = group == 0 || group == 3;
            EXPECT_EQ(out.Get(3, 0)[0] != in.Get(3, 0)[0], changesBlue) << "group " << group;
            EXPECT_EQ(out.Get(4, 0)[3], 0.25);
        }
    }
}

INSTANTIATE_TEST_SUITE_P(Devices, LevelsOnEachDevice, ::testing::ValuesIn(AllDeviceCases()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
