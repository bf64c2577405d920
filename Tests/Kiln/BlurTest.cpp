// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0

#include "Host/Software/Effects/GaussianBlur.h"
#include "Kiln/FrameOperations.h"
#include "Tests/Support/DevicePictures.h"

namespace Vantrel::Testing {
namespace {

class GaussianBlurOnEachDevice : public DeviceTest {
protected:
    Picture Blur(const Picture& picture, float sigmaX, float sigmaY, int padX, int padY, bool keepSize,
                 std::int32_t direction = Kiln::kBlur_Both) {
        const DevicePicture in(GetDevice(), GetFormat(), picture, 3);
        const DevicePicture out(GetDevice(), GetFormat(), Picture(picture.width + 2 * padX, picture.height + 2 * padY),
                                5);
        EXPECT_EQ(Kiln::GaussianBlur(GetDevice(), in.GetData(), in.GetRowBytes(), in.GetWidth(), in.GetHeight(),
                                     out.GetData(), out.GetRowBytes(), out.GetWidth(), out.GetHeight(), GetFormat(),
                                     sigmaX, sigmaY, keepSize, direction),
                  Ostrand::kStatus_OK);
        return out.Download();
    }
};

TEST_P(GaussianBlurOnEachDevice, IsTheGaussianAtAnyWidth) {
    Random random;
    for (const float sigma : {0.3F, 1.0F, 3.9F, 4.0F, 5.9F, 10.0F, 37.0F, 100.0F, 500.0F}) {
        const bool keepSize = random.Chance(0.5F);
        const Picture in = RoundTo(RandomPicture(random, random.Int(1, 90), random.Int(1, 60)), GetFormat());
        const float sigmaY = sigma * random.Uniform(0.5F, 1.0F);
        const int padX = keepSize ? 0 : random.Int(0, 40), padY = keepSize ? 0 : random.Int(0, 20);
        const Picture expected =
            RoundTo(Host::Software::GaussianBlur(in, sigma, sigmaY, padX, padY, keepSize), GetFormat());
        // Half of a step of 8 bits, of colours that go beyond 0..1; a half's rounding comes on top.
        EXPECT_TRUE(
            PicturesAgree(Blur(in, sigma, sigmaY, padX, padY, keepSize), expected, {IsHalf() ? 4e-3 : 2e-3, 0.0, true}))
            << "sigma " << sigma << ", " << in.width << " by " << in.height << ", keeps size " << keepSize;
    }
}

TEST_P(GaussianBlurOnEachDevice, BlursOnlyTheDirectionsAskedForAndKeepsFlatFields) {
    Random random;
    const Picture in = RoundTo(RandomPicture(random, 65, 33), GetFormat());
    for (const float sigma : {2.0F, 12.0F}) {
        for (const std::int32_t direction : {Kiln::kBlur_Horizontal, Kiln::kBlur_Vertical}) {
            const bool across = direction == Kiln::kBlur_Horizontal;
            const int padX = across ? 9 : 0, padY = across ? 0 : 9;
            const Picture expected =
                Host::Software::GaussianBlur(in, across ? sigma : 0.0, across ? 0.0 : sigma, padX, padY, false);
            EXPECT_TRUE(PicturesAgree(Blur(in, sigma, sigma, padX, padY, false, direction), expected,
                                      {IsHalf() ? 4e-3 : 2e-3, 0.0, true}))
                << "direction " << direction << ", sigma " << sigma;
        }
        const Picture flat = RoundTo(Plain(40, 30, {1.5, -0.25, 0.5, 1.0}), GetFormat());
        EXPECT_TRUE(PicturesAgree(Blur(flat, sigma, sigma, 0, 0, true), flat, {IsHalf() ? 1e-3 : 1e-5}));
    }
}

INSTANTIATE_TEST_SUITE_P(Devices, GaussianBlurOnEachDevice, ::testing::ValuesIn(AllDeviceCases()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
