// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <cmath>

#include "Host/Software/Effects/Curves.h"
#include "Tests/Effects/EffectTester.h"
#include "Vantrel/EffectTable.h"

namespace Vantrel::Testing {
namespace {

using Host::Software::Curve;
using Points = std::vector<Curve::Point>;

constexpr const char* kRgbCurves = "TQ.XQVE RGB Curves";
constexpr const char* kLumaCurve = "TQ.XQVE Luma Curve";

class CurvesOnEachDevice : public EffectTest {
protected:
    /// The whole picture, and straight diagonals but for one curve of 8-bit points.
    static Params WithCurve(std::int32_t first, const Points& points, const EffectRow& effect) {
        Params params;
        for (std::size_t i = 0; i < effect.parameterCount; ++i) {
            const ParameterRow& row = effect.parameters[i];
            if (row.type == ParameterType::kDouble) params[row.index] = row.value[0];
        }
        for (std::int32_t i = 0; i < 16; ++i) {
            const auto at = static_cast<std::size_t>(i);
            params[first + 2 * i] = at < points.size() ? points[at].x : 0.0;
            params[first + 2 * i + 1] = at < points.size() ? points[at].y : 0.0;
        }
        return params;
    }

    static Picture Levels(const std::vector<float>& levels) {
        Picture picture(static_cast<int>(levels.size()), 1);
        for (int x = 0; x < picture.width; ++x) picture.Set(x, 0, {levels[x], levels[x], levels[x], 0.5});
        return picture;
    }
};

TEST_P(CurvesOnEachDevice, PointsInAnyDisorderGiveNumbers) {
    const float huge = IsHalf() ? 60000.0F : 1e30F;
    const Picture in = Levels({-huge, -INFINITY, -0.5F, 0.0F, 0.25F, 0.5F, 1.0F, 2.0F, INFINITY, huge});
    const Points disorders[] = {{},
                                {{0, 0}, {255, 255}},
                                {{0, 0}, {0, 0}, {128, 128}, {128, 9}, {100, 200}, {255, 255}},
                                {{256, 256}, {255, 511}},
                                {{NAN, INFINITY}, {1e300, -1e300}, {255, 255}}};
    for (const Points& points : disorders) {  // what is left of each is a straight diagonal
        EXPECT_TRUE(PicturesAgree(Apply(kRgbCurves, WithCurve(5, points, kRGBCurvesEffect), in), in, kExactly));
    }
    const Picture lifted =
        Apply(kRgbCurves, WithCurve(5, {{51, 102}, {51, 0}, {20, 90}, {204, 153}}, kRGBCurvesEffect), in);
    EXPECT_NEAR(lifted.Get(2, 0)[0], -0.3, 1e-3) << "below the first point the offset stays";
    EXPECT_NEAR(lifted.Get(5, 0)[1], 0.5, 1e-3) << "halfway along a straight line";
    EXPECT_NEAR(lifted.Get(7, 0)[2], 1.8, 2e-3) << "above the last point too";
    for (const float value : lifted.pixels) EXPECT_FALSE(std::isnan(value));
}

INSTANTIATE_TEST_SUITE_P(Devices, CurvesOnEachDevice, ::testing::ValuesIn(AllDeviceCases()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
