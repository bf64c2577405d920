// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/Basic3D.h"

#include <cmath>
#include <limits>

#include "Src/Filters/Effects/Basic3DNode.h"
#include "Src/Kernels/KernelLaunch.h"
#include "Src/Nodes/NodeRegistry.h"
#include "Tests/Effects/EffectTester.h"
#include "Tests/Effects/KernelArguments.h"
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
        RenderRequirements requirements;
        requirements.device = GetDevice();
        bool needsHost = false;
        EXPECT_EQ(node->Configure(description, requirements, needsHost), Ostrand::kStatus_OK);
        return node;
    }
    [[nodiscard]] Picture Render(const Overrides& values, const Picture& picture) {
        return DownloadFrame(GetDevice(),
                             RenderOver(MakeNode(values), MakePaddedFrame(GetDevice(), GetFormat(), picture, 3)));
    }
    [[nodiscard]] static Host::Software::LayerPicture OnHost(const Overrides& values, const Picture& picture) {
        Host::Software::LayerPicture layer;
        layer.picture = picture;
        Host::Software::EffectContext context;
        context.value = [&](std::int32_t index) -> std::array<double, 4> {
            const auto found = values.find(index);
            return {found == values.end() ? 0.0 : found->second};
        };
        context.view.width = picture.width;
        context.view.height = picture.height;
        Host::Software::RunBasic3D(context, layer);
        return layer;
    }
};

TEST_P(Basic3D, AgreesWithItsScalarVersion) {
    EXPECT_EQ(isRegistered(u"TQ.XQVE Basic 3D", GetDevice()), GetParam().framework == Kiln::DeviceFramework::kCuda);
    Random random;
    SCOPED_TRACE(random.GetSeed());
    for (int i = 0; i < 40; ++i) {
        const Picture in = RoundTo(RandomPicture(random, random.Int(1, 70), random.Int(1, 40)), GetFormat());
        const auto angle = [&](double range) {
            return random.Chance(0.2F) ? 0.0 : random.Uniform(static_cast<float>(-range), static_cast<float>(range));
        };
        const Overrides values = {{kBasic3D_Swivel, angle(i % 2 == 0 ? 60 : 360)},
                                  {kBasic3D_Tilt, angle(i % 2 == 0 ? 60 : 360)},
                                  {kBasic3D_Distance, random.Uniform(-20.0F, 300.0F)},
                                  {kBasic3D_SpecularHighlight, random.Chance(0.5F)}};
        const Host::Software::LayerPicture expected = OnHost(values, in);
        const VideoFrameRef output = RenderOver(MakeNode(values), MakePaddedFrame(GetDevice(), GetFormat(), in, 2));
        EXPECT_EQ(output->GetOrigin(), expected.origin);
        // A plane seen nearly edge-on magnifies the rounding of where its pixels lie.
        EXPECT_TRUE(PicturesAgree(DownloadFrame(GetDevice(), output), expected.picture,
                                  {IsHalf() ? 3e-3 : 2e-4, IsHalf() ? 2e-3 : 0.0, true, 0.01}))
            << in.width << " by " << in.height << ", swivel " << values.at(0) << ", tilt " << values.at(1)
            << ", distance " << values.at(2) << ", specular " << values.at(3);
    }
}

TEST_P(Basic3D, PutsWhatItWorksOutIntoItsKernelsLists) {
    const Picture in = Plain(60, 40, {0.5, 0.5, 0.5, 1.0});
    KernelArguments heard;
    static_cast<void>(
        Render({{kBasic3D_Tilt, 180.0}, {kBasic3D_Distance, 100.0}, {kBasic3D_SpecularHighlight, 1.0}}, in));
    ASSERT_GE(heard.kernels.size(), 2U);
    const auto& prepare = heard.kernels[heard.kernels.size() - 2];
    ASSERT_EQ(prepare.Count(), 7U);
    EXPECT_EQ(prepare.Get<std::int32_t>(2), 60);
    EXPECT_EQ(prepare.Get<std::int32_t>(3), 40);
    EXPECT_EQ(prepare.Get<std::int32_t>(4), prepare.Get<std::int32_t>(5));
    const auto& render = heard.kernels.back();
    ASSERT_EQ(render.Count(), 22U);
    EXPECT_EQ(render.Get<std::int32_t>(1), 60);
    EXPECT_EQ(render.Get<float>(4), 40.0F);
    EXPECT_EQ(render.Get<std::int32_t>(7), IsHalf() ? 0 : 1);
    // Upside down, and twice as far: the first corner lies at the lower left, behind the screen.
    const auto near = [&](std::size_t index, const Kiln::float4& expected) {
        const auto value = render.Get<Kiln::float4>(index);
        EXPECT_NEAR(value.x, expected.x, 1e-4) << index;
        EXPECT_NEAR(value.y, expected.y, 1e-4) << index;
        EXPECT_NEAR(value.z, expected.z, 1e-4) << index;
    };
    near(8, {0, 40, 60, 0});
    near(9, {60, 0, 0, 0});
    near(10, {0, -40, 0, 0});
    near(11, {30, 20, -60, 0});
    // Seen from behind, the corners go round the other way: from the picture's lower left, which is the upper one now.
    constexpr float2 kSeen[] = {{15, 10}, {45, 10}, {45, 30}, {15, 30}}, kAlong[] = {{1, 0}, {0, 1}, {-1, 0}, {0, -1}};
    for (std::size_t i = 0; i < 4; ++i) {
        EXPECT_NEAR(render.Get<float2>(12 + i).x, kSeen[i].x, 1e-4) << i;
        EXPECT_NEAR(render.Get<float2>(12 + i).y, kSeen[i].y, 1e-4) << i;
        EXPECT_NEAR(render.Get<float2>(16 + i).x, kAlong[i].x, 1e-4) << i;
        EXPECT_NEAR(render.Get<float2>(16 + i).y, kAlong[i].y, 1e-4) << i;
    }
    EXPECT_EQ(render.Get<std::int32_t>(20), 1);
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

TEST_P(Basic3D, DegeneratePlanesAndBadNumbersHaveAnOutcome) {
    const float bad[] = {std::numeric_limits<float>::quiet_NaN(), std::numeric_limits<float>::infinity(), -60000.0F};
    const struct {
        const char* what;
        int rows;  // of a picture 41 pixels wide
        double swivel, tilt, distance;
        int width, height;
        bool seen;
    } kPlanes[] = {
        {"edge-on", 23, 90, 0, 0, 41, 46, false},
        {"behind the eye", 23, 0, 0, -150, 82, 46, false},
        {"far away", 23, 20, 30, 1e9, 41, 23, false},
        {"through the eye", 23, 0, 60, -90, 286, 80, true},
        {"a hair before it", 1, 0, 0, -99.5, 4096, 200, true},
    };
    for (const auto& plane : kPlanes) {
        SCOPED_TRACE(plane.what);
        Picture in = Plain(41, plane.rows, {0.25, 0.5, 0.75, 1.0});
        for (int i = 0; i < 12; ++i) in.At(3 * i, plane.rows / 2)[i % 4] = bad[i % 3];
        const Picture out = Render({{kBasic3D_Swivel, plane.swivel},
                                    {kBasic3D_Tilt, plane.tilt},
                                    {kBasic3D_Distance, plane.distance},
                                    {kBasic3D_SpecularHighlight, 1.0}},
                                   in);
        EXPECT_EQ(out.width, plane.width);
        EXPECT_EQ(out.height, plane.height);
        bool seen = false, finite = true;
        for (std::size_t p = 0; p < out.pixels.size(); ++p) {
            finite &= std::isfinite(out.pixels[p]);
            seen |= p % 4 == 3 && out.pixels[p] > 0.01F;
        }
        EXPECT_TRUE(finite);
        EXPECT_EQ(seen, plane.seen);
    }
    Picture in = Plain(3, 2, {1, 1, 1, 1});
    const double huge = std::numeric_limits<double>::infinity();
    static_cast<void>(Render({{kBasic3D_Swivel, huge}, {kBasic3D_Distance, huge}}, in));
}

TEST_P(Basic3D, WithoutAMoveTheFrameGoesOnAsItIs) {
    const VideoFrameRef input = MakePaddedFrame(GetDevice(), GetFormat(), Plain(9, 5, {1, 0, 2, 1}), 1);
    EXPECT_EQ(RenderOver(MakeNode({{kBasic3D_SpecularHighlight, 1.0}}), input), input);
}

INSTANTIATE_TEST_SUITE_P(Devices, Basic3D, ::testing::ValuesIn(AllDeviceCases()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
