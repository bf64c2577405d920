// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/GarbageMatte.h"

#include "Tests/Effects/EffectTester.h"

namespace Vantrel::Testing {
namespace {

using Host::Software::Corner;

class GarbageMatteOnEachDevice : public EffectTest {
protected:
    /// Corners in pixels of the picture; the last one is repeated until there are enough.
    Picture Masked(const std::vector<Corner>& corners, const Picture& picture) {
        const std::size_t count = corners.size() <= 4 ? 4 : corners.size() <= 8 ? 8 : 16;
        Params params;
        for (std::size_t i = 0; i < count; ++i) {
            const Corner& corner = corners[std::min(i, corners.size() - 1)];
            params[static_cast<std::int32_t>(i)] = FakePoint{corner.x / picture.width, corner.y / picture.height};
        }
        const std::string name = "TQ.XQVE Garbage Matte";
        return Apply(count == 4 ? name : name + (count == 8 ? " 8" : " 16"), params, picture);
    }
};

/// The even-odd rule at one place, by a ray to the left.
bool IsInside(const std::vector<Corner>& corners, double x, double y) {
    bool inside = false;
    for (std::size_t i = 0; i < corners.size(); ++i) {
        const Corner &a = corners[i], &b = corners[(i + 1) % corners.size()];
        if ((a.y <= y) != (b.y <= y) && a.x + (b.x - a.x) * (y - a.y) / (b.y - a.y) <= x) inside = !inside;
    }
    return inside;
}

TEST_P(GarbageMatteOnEachDevice, CoverageIsTheAreaInsideByTheEvenOddRule) {
    std::vector<std::vector<Corner>> outlines = {
        {{3.5, 2.25}, {40.75, 6.5}, {30, 21}, {8, 15.3}},                              // convex
        {{2, 2}, {45, 20}, {45, 2}, {2, 20}},                                          // a bow tie
        {{2, 10}, {90, 10.4}, {2, 10.4}, {90, 10}},                                    // crossing at a small angle
        {{5, 5}, {5, 5}, {35, 5}, {35, 18}, {20, 18}, {20, 9}, {5, 9}, {5, 9}},        // level, upright, repeated
        {{24, 1}, {31, 22}, {8, 9}, {40, 9}, {17, 22}},                                // a star with a hole
        {{10, 4}, {30, 4}, {30, 18}, {10, 18}, {10, 4}, {26, 8}, {26, 14}, {14, 14}},  // around twice: a hole
        {{-50, -20}, {200, 11}, {-50, 40}, {60, 12}},                                  // beyond the frame
        {{10.2, 3.1}, {10.3, 20}, {10.5, 20}, {10.4, 3.1}},                            // a hair
        {{33, 0}, {64, 0}, {64, 24}, {33, 24}},                                        // on pixels
    };
    outlines.emplace_back();  // teeth, of sixteen corners
    for (int i = 0; i < 15; ++i)
        outlines.back().push_back({1.0 + 6.2 * i, i % 2 == 0 ? 1.0 + 0.2 * i : 22.0 - 0.1 * i});
    outlines.back().push_back({50, 12});
    constexpr int kFine = 32;
    const Picture in = Plain(96, 24, {-0.5, 2.0, 0.25, 1.0});
    for (std::size_t k = 0; k < outlines.size(); ++k) {
        const Picture out = Masked(outlines[k], in);
        for (int y = 0; y < in.height; ++y) {
            for (int x = 0; x < in.width; ++x) {
                int inside = 0;
                for (int i = 0; i < kFine * kFine; ++i) {
                    inside += IsInside(outlines[k], x + (i % kFine + 0.5) / kFine, y + (0.5 + i / kFine) / kFine);
                }
                const double area = inside / static_cast<double>(kFine * kFine);
                const Pixel p = out.Get(x, y);
                // The samples themselves miss by about the edge's length in the pixel times half their distance.
                const double tolerance = area == 0.0 || area == 1.0 ? 0.02 : 0.04;
                ASSERT_NEAR(p[3], area, tolerance) << "outline " << k << " at " << x << ", " << y;
                ASSERT_EQ(p[1], 2.0);
            }
        }
    }
}

INSTANTIATE_TEST_SUITE_P(Devices, GarbageMatteOnEachDevice, ::testing::ValuesIn(AllDeviceCases()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
