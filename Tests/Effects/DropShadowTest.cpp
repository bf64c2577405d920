// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <cmath>

#include <boost/make_shared.hpp>

#include "Tests/Effects/EffectTester.h"
#include "Vantrel/Effects/DropShadow.h"

namespace Vantrel::Testing {
namespace {

class DropShadow : public EffectTest {
protected:
    /// Opacity, direction, distance, softness, shadow only.
    using Settings = std::array<double, 5>;

    VideoFrameRef Render(const Settings& settings, const VideoFrameRef& input,
                         Pixel redFirst = {0.75, 0.5, 0.25, 0.0}) {
        std::map<std::int32_t, double> numbers;
        for (std::size_t i = 0; i < settings.size(); ++i) numbers[static_cast<std::int32_t>(i) + 1] = settings.at(i);
        Params params = MakeParams(kDropShadowEffect, numbers);
        params[kDropShadow_Color] = ToParam(kDropShadowParameters[0], redFirst);
        return RenderOver(MakeEffect("TQ.XQVE Drop Shadow", params), input);
    }
    [[nodiscard]] VideoFrameRef Upload(const Picture& picture) const {
        return MakePaddedFrame(GetDevice(), GetFormat(), picture, 2);
    }
};

TEST_P(DropShadow, AgreesWithItsScalarVersion) {
    Random random;
    for (int i = 0; i < 24; ++i) {
        const double softness = random.Chance(0.5F) ? 0.0 : double{random.Uniform(-2.0F, 60.0F)};
        const Settings settings = {double{random.Uniform(1.0F, 255.0F)}, double{random.Uniform(-400.0F, 400.0F)},
                                   double{random.Uniform(-20.0F, 40.0F)}, softness, random.Chance(0.3F) ? 1.0 : 0.0};
        const Picture in = RoundTo(RandomPicture(random, random.Int(1, 150), random.Int(1, 60)), GetFormat());
        ParameterValues values = {{kDropShadow_Color, {0.75, 0.5, 0.25, 0.0}}};
        for (std::size_t k = 0; k < settings.size(); ++k) values[static_cast<std::int32_t>(k) + 1] = {settings.at(k)};
        // The weights of a wide recursion nearly cancel: their rounding shows as gain.
        const double limit = softness > 0.0 ? 5e-3 : IsHalf() ? 1e-3 : 2e-6;
        ExpectAgreement(MakeEffect("TQ.XQVE Drop Shadow", ToParams(kDropShadowEffect, values)), kDropShadowEffect,
                        values, in, {limit, limit, true});
    }
}

TEST_P(DropShadow, GrowsByItsReachAndLeavesWhatHidesIt) {
    Picture in(40, 20);
    for (int x = 10; x < 30; ++x) in.Set(x, 10, {-0.5, 2.0, 60000.0, 1.0});
    const struct {
        double direction, softness;
        Vellum::Point size, origin;
        Vellum::Point shadow, beside;  // a pixel of the shadow's end that shows, and the next one, where none is
    } cases[] = {{90.0, 0.0, {51, 21}, {0, 0}, {39, 10}, {40, 10}},
                 {0.0, 0.0, {41, 31}, {0, 10}, {10, 10}, {9, 10}},
                 {270.0, 0.0, {51, 21}, {10, 0}, {10, 10}, {9, 10}},
                 {180.0, 5.0, {51, 41}, {5, 5}, {25, 25}, {0, 0}}};
    for (const auto& each : cases) {
        const VideoFrameRef output = Render({255.0, each.direction, 10.0, each.softness, 0.0}, Upload(in));
        SCOPED_TRACE(each.direction);
        EXPECT_EQ(output->GetOrigin(), each.origin);
        EXPECT_EQ(output->GetBounds(), (Vellum::Rect{0, 0, each.size.x, each.size.y}));
        const Picture out = DownloadFrame(GetDevice(), output);
        for (int x = 10; x < 30; ++x) {
            EXPECT_EQ(out.Get(x + each.origin.x, 10 + each.origin.y), RoundTo(in, GetFormat()).Get(x, 10));
        }
        const Pixel shadow = out.Get(each.shadow.x, each.shadow.y);
        for (std::size_t c = 0; c < 3; ++c) EXPECT_EQ(shadow[c], 0.25 * static_cast<double>(c + 1));
        // A line a pixel high, of a Gaussian of one pixel.
        EXPECT_NEAR(shadow[3], each.softness > 0.0 ? 0.4 : 1.0, each.softness > 0.0 ? 0.02 : 0.0);
        EXPECT_NEAR(out.Get(each.beside.x, each.beside.y)[3], 0.0, 1e-3);
    }
}

TEST_P(DropShadow, WithoutOpacityKeepsOrClearsItsFrame) {
    const Picture in = Plain(70, 4, {-0.5, 2.0, NAN, 0.5});
    for (const double only : {0.0, 1.0}) {
        const VideoFrameRef input = Upload(in), output = Render({0.0, 135.0, 10.0, 5.0, only}, input);
        EXPECT_EQ(output, input);
        EXPECT_TRUE(PicturesAgree(DownloadFrame(GetDevice(), output), only != 0.0 ? Picture(70, 4) : in, kExactly));
    }
}

TEST_P(DropShadow, KeepsItsPlaceAtReducedResolution) {
    const RenderNodeRef node =
        MakeEffect("TQ.XQVE Drop Shadow", MakeParams(kDropShadowEffect, {{1, 255.0}, {2, 270.0}, {3, 40.0}, {4, 8.0}}));
    node->SetInput(0, RenderNodeRef(new FrameSource(Upload(Plain(20, 10, {1, 1, 1, 1})))));
    RenderParams params;
    params.outputRect = {0, 0, 20, 10};
    params.sequenceRect = {0, 0, 40, 40};
    params.scaleX = 2.0F;
    params.scaleY = 4.0F;
    VideoFrameRef output;
    ASSERT_EQ(node->RenderFrame({}, params, boost::make_shared<RenderResults>(), output), Ostrand::kStatus_OK);
    EXPECT_EQ(output->GetOrigin(), (Vellum::Point{24, 2}));
    EXPECT_EQ(output->GetBounds(), (Vellum::Rect{0, 0, 20 + 20 + 1 + 8, 10 + 1 + 4}));
}

INSTANTIATE_TEST_SUITE_P(Devices, DropShadow, ::testing::ValuesIn(AllDeviceCases()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
