// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <cmath>

#include "Src/Filters/Effects/DirectionalBlurNode.h"
#include "Src/Nodes/NodeRegistry.h"
#include "Tests/Effects/EffectTester.h"

namespace Vantrel::Testing {
namespace {

class DirectionalBlur : public EffectTest {
protected:
    void SetUp() override {
        EffectTest::SetUp();
        if (GetParam().framework == Kiln::DeviceFramework::kCuda) return;
        EXPECT_FALSE(isRegistered(u"TQ.XQVE Motion Blur", GetDevice())) << "left to the host there";
    }
    [[nodiscard]] bool IsThere() const { return GetParam().framework == Kiln::DeviceFramework::kCuda; }

    VideoFrameRef Render(float direction, float length, const Picture& picture,
                         Vellum::PixelAspectRatio aspect = {1, 1}) {
        const RenderNodeRef node = MakeEffect(
            "TQ.XQVE Motion Blur", {{kDirectionalBlur_Direction, direction}, {kDirectionalBlur_Length, length}});
        const VideoFrameRef input = MakePaddedFrame(GetDevice(), GetFormat(), picture, 2);
        input->SetPixelAspectRatio(aspect);
        return RenderOver(node, input);
    }
};

TEST_P(DirectionalBlur, AgreesWithItsScalarVersion) {
    if (!IsThere()) return;
    Random random;
    for (int i = 0; i < 32; ++i) {
        const float direction =
            random.Chance(0.5F) ? random.Uniform(-720.0F, 720.0F) : 45.0F * static_cast<float>(random.Int(-4, 9));
        const float length = random.Chance(0.2F) ? 0.0F : random.Uniform(-1.0F, 25.0F);
        const Vellum::PixelAspectRatio aspect{random.Int(1, 3), random.Int(1, 3)};
        const Picture in = RoundTo(RandomPicture(random, random.Int(1, 150), random.Int(1, 90)), GetFormat());
        const ParameterValues values = {{kDirectionalBlur_Direction, {direction}}, {kDirectionalBlur_Length, {length}}};
        ExpectAgreement(MakeEffect("TQ.XQVE Motion Blur", ToParams(kDirectionalBlurEffect, values)),
                        kDirectionalBlurEffect, values, in, {length > 0.0F ? (IsHalf() ? 6e-3 : 2e-3) : 0.0, 0.0, true},
                        aspect);
    }
}

/// How light lies around its centre: variances along a line and across it, in pixels as high as they are.
struct Spread {
    double light = 0.0, x = 0.0, y = 0.0, along = 0.0, across = 0.0;

    Spread(const Picture& picture, double pixelWidth, double degrees) {
        const double turn = std::acos(-1.0) / 180.0 * degrees, sine = std::sin(turn), cosine = std::cos(turn);
        for (int pass = 0; pass < 2; ++pass) {
            for (int row = 0; row < picture.height; ++row) {
                for (int column = 0; column < picture.width; ++column) {
                    const double weight = double{picture.At(column, row)[3]};
                    if (pass == 0) light += weight, x += weight * column, y += weight * row;
                    if (pass == 0) continue;
                    const double right = (column - x) * pixelWidth, down = row - y;
                    const double on = right * sine - down * cosine, off = right * cosine + down * sine;
                    along += weight * on * on / light;
                    across += weight * off * off / light;
                }
            }
            if (pass == 0) x /= light, y /= light;
        }
    }
};

TEST_P(DirectionalBlur, MakesALineOfADotWhateverThePixelsAspect) {
    if (!IsThere()) return;
    constexpr int kWidth = 101, kHeight = 121, kX = 53, kY = 58;
    Picture dot(kWidth, kHeight);
    dot.Set(kX, kY, {0.25, 0.5, 1.0, 1.0});
    for (const Vellum::PixelAspectRatio aspect : {Vellum::PixelAspectRatio{1, 1}, {3, 2}, {1, 2}}) {
        const double pixelWidth = static_cast<double>(aspect.numerator) / aspect.denominator;
        for (int degrees = -30; degrees <= 390; degrees += 15) {
            const float length = aspect.denominator == 2 && aspect.numerator == 1 ? 7.0F : 12.0F;
            const VideoFrameRef output = Render(static_cast<float>(degrees), length, dot, aspect);
            const Spread spread(DownloadFrame(GetDevice(), output), pixelWidth, degrees);
            SCOPED_TRACE(testing::Message() << degrees << " degrees, pixels " << pixelWidth << " wide");
            EXPECT_NEAR(spread.light, 1.0, 5e-3);
            EXPECT_NEAR(spread.x - output->GetOrigin().x, kX, 0.02) << "the dot stays the line's middle";
            EXPECT_NEAR(spread.y - output->GetOrigin().y, kY, 0.02);
            EXPECT_NEAR(std::sqrt(spread.along), double{length}, 0.02 * double{length});
            // Twice interpolated: each time by at most a quarter of a pixel's square.
            EXPECT_LE(spread.across, 0.6 * std::max(1.0, pixelWidth * pixelWidth));
        }
    }
}

TEST_P(DirectionalBlur, IsRefusedWhereItsLengthGrowsBeyondTheDevice) {
    if (!IsThere()) return;
    const auto configure = [this](const FakeParam& length) {
        const Params params = {{kDirectionalBlur_Direction, 30.0F}, {kDirectionalBlur_Length, length}};
        return dynamic_cast<DirectionalBlurNode*>(MakeEffect("TQ.XQVE Motion Blur", params).Get()) != nullptr;
    };
    EXPECT_TRUE(configure(FakeParam(10.0F)));
    EXPECT_FALSE(configure(FakeParam().At(0, 1.0F).At(1000, 10700.0F).At(2000, 1.0F)));
}

INSTANTIATE_TEST_SUITE_P(Devices, DirectionalBlur, ::testing::ValuesIn(AllDeviceCases()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
