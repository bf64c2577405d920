// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <cmath>

#include "Src/Filters/Effects/Basic3DNode.h"
#include "Src/Nodes/NodeRegistry.h"
#include "Tests/Effects/EffectTester.h"
#include "Vantrel/Effects/Basic3D.h"

namespace Vantrel::Testing {
namespace {

using Overrides = std::map<std::int32_t, double>;

class Basic3D : public EffectTest {
protected:
    /// The node, also on the framework whose hosts never get it.
    [[nodiscard]] RenderNodeRef MakeNode(const Overrides& values) {
        const VideoNodeRef description = DescribeEffect(kBasic3DEffect.matchName, MakeParams(kBasic3DEffect, values));
        RenderNodeRef node(new Basic3DNode);
        EXPECT_TRUE(Configure(node, description));
        return node;
    }
    [[nodiscard]] Picture Render(const Overrides& values, const Picture& picture) {
        return DownloadFrame(GetDevice(),
                             RenderOver(MakeNode(values), MakePaddedFrame(GetDevice(), GetFormat(), picture, 3)));
    }
};

TEST_P(Basic3D, AgreesWithItsScalarVersion) {
    EXPECT_EQ(isRegistered(u"TQ.XQVE Basic 3D", GetDevice()), GetParam().framework == Kiln::DeviceFramework::kCuda);
    Random random;
    for (int i = 0; i < 40; ++i) {
        const Picture in = RoundTo(RandomPicture(random, random.Int(1, 70), random.Int(1, 40)), GetFormat());
        const auto angle = [&](double range) {
            return random.Chance(0.2F) ? 0.0 : random.Uniform(static_cast<float>(-range), static_cast<float>(range));
        };
        const Overrides settings = {{kBasic3D_Swivel, angle(i % 2 == 0 ? 60 : 360)},
                                    {kBasic3D_Tilt, angle(i % 2 == 0 ? 60 : 360)},
                                    {kBasic3D_Distance, random.Uniform(-20.0F, 300.0F)},
                                    {kBasic3D_SpecularHighlight, random.Chance(0.5F)}};
        ParameterValues values;
        for (const auto& [index, value] : settings) values[index] = {value};
        // A plane seen nearly edge-on magnifies the rounding of where its pixels lie.
        ExpectAgreement(MakeNode(settings), kBasic3DEffect, values, in,
                        {IsHalf() ? 3e-3 : 2e-4, IsHalf() ? 2e-3 : 0.0, true, 0.01});
    }
}

TEST_P(Basic3D, ShowsBothFacesAndKeepsStraightLinesInPerspective) {
    // Left half red, right half blue; the border between them is the axis and stays in the middle.
    Picture in(80, 40);
    for (int y = 0; y < 40; ++y) {
        for (int x = 0; x < 80; ++x) in.Set(x, y, x < 40 ? Pixel{0, 0, 1, 1} : Pixel{1, 0, 0, 1});
    }
    const auto mean = [](const Picture& picture, int channel) {  // its place across
        double place = 0.0, sum = 0.0;
        for (int y = 0; y < picture.height; ++y) {
            for (int x = 0; x < picture.width; ++x) {
                const Pixel p = picture.Get(x, y);
                const double value = p[static_cast<std::size_t>(channel)] * p[3];
                place += value * (x + 0.5 - picture.width / 2.0);
                sum += value;
            }
        }
        return place / sum;
    };
    const Picture front = Render({{kBasic3D_Swivel, 40.0}}, in), back = Render({{kBasic3D_Swivel, 180.0}}, in);
    EXPECT_LT(mean(front, 2), 0.0);
    EXPECT_GT(mean(back, 2), 0.0);
    // The edges lie 40 sin 40 before and behind the middle, which is 48 behind the screen, seen from 80.
    const Picture away = Render({{kBasic3D_Swivel, 40.0}, {kBasic3D_Distance, 60.0}}, in);
    double covered = 0.0;
    for (std::size_t p = 3; p < away.pixels.size(); p += 4) covered += away.pixels[p];
    const double angle = std::acos(-1.0) * 40.0 / 180.0;
    const double depth = 40.0 * std::sin(angle), across = 40.0 * std::cos(angle);
    const double near = 1.6 - depth / 80.0, far = 1.6 + depth / 80.0;
    EXPECT_NEAR(covered, 0.5 * (across / near + across / far) * (40.0 / near + 40.0 / far), 0.2);
}

TEST_P(Basic3D, WithoutAMoveTheFrameGoesOnAsItIs) {
    const VideoFrameRef input = MakePaddedFrame(GetDevice(), GetFormat(), Plain(9, 5, {1, 0, 2, 1}), 1);
    EXPECT_EQ(RenderOver(MakeNode({{kBasic3D_SpecularHighlight, 1.0}}), input), input);
}

INSTANTIATE_TEST_SUITE_P(Devices, Basic3D, ::testing::ValuesIn(AllDeviceCases()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
