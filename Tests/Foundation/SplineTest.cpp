// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <cmath>
#include <random>
#include <vector>

#include "Ostrand/Geometry.h"

namespace {

using Ostrand::Geometry::SolveNaturalCubicSpline2D;

struct Spline {
    std::vector<float> x, y, bends;
    bool all = false;

    Spline(std::vector<float> xs, std::vector<float> ys) : x(std::move(xs)), y(std::move(ys)), bends(x.size() + 1, 7) {
        all = SolveNaturalCubicSpline2D(x.data(), y.data(), x.size(), bends.data());
    }
    /// Of the cubic between i and j, at its left or right end.
    [[nodiscard]] double Slope(std::size_t i, std::size_t j, bool right) const {
        const double h = static_cast<double>(x[j]) - x[i];
        const double bend = right ? bends[i] + 2.0 * bends[j] : -(2.0 * bends[i] + bends[j]);
        return (static_cast<double>(y[j]) - y[i]) / h + h * bend / 6.0;
    }
};

TEST(NaturalSpline, SlopesMeetAtEveryPointAndEndsDoNotBend) {
    std::mt19937 engine(5);
    std::uniform_real_distribution<float> uniform(0.01F, 1.0F);
    for (std::size_t count = 2; count <= 16; ++count) {
        std::vector<float> x(count), y(count);
        for (std::size_t i = 0; i < count; ++i)
            x[i] = (i > 0 ? x[i - 1] : 0.0F) + uniform(engine), y[i] = uniform(engine);
        const Spline spline(x, y);
        EXPECT_TRUE(spline.all);
        EXPECT_EQ(spline.bends[0], 0.0F);
        EXPECT_EQ(spline.bends[count - 1], 0.0F);
        EXPECT_EQ(spline.bends[count], 7.0F) << "beyond the points";
        for (std::size_t i = 1; i + 1 < count; ++i) {
            const double left = spline.Slope(i - 1, i, true);
            EXPECT_NEAR(left, spline.Slope(i, i + 1, false), 1e-4 * (1.0 + std::abs(left)))
                << count << " points, " << i;
        }
    }
}

TEST(NaturalSpline, PointsThatDoNotRiseTakeNoPart) {
    const Spline sorted({0.0F, 0.5F, 1.0F}, {0.0F, 1.0F, 0.0F});
    EXPECT_EQ(sorted.bends[1], -12.0F);
    const Spline mixed({0.0F, 0.0F, 0.5F, NAN, 0.25F, 0.5F, 1.0F}, {0.0F, 9.0F, 1.0F, 1.0F, 5.0F, INFINITY, 0.0F});
    EXPECT_FALSE(mixed.all);
    EXPECT_EQ(mixed.bends, (std::vector<float>{0, 0, -12.0F, 0, 0, 0, 0, 7}));
    EXPECT_FALSE(Spline({}, {}).all);
    EXPECT_EQ(Spline({0.0F, 0.3F, 0.9F}, {0.0F, 0.3F, 0.9F}).bends[1], 0.0F) << "a straight line";
}

}  // namespace
