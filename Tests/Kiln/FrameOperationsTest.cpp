// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <cmath>

#include "Host/Software/Effects/Convert.h"
#include "Host/Software/Effects/FrameRepairs.h"
#include "Host/Software/Effects/Resample.h"
#include "Kiln/FrameOperations.h"
#include "Tests/Support/DevicePictures.h"
#include "Vellum/Field.h"

namespace Vantrel::Testing {
namespace {

using Vellum::RenderQuality;

class FrameOperationsOnEachDevice : public DeviceTest {
protected:
    [[nodiscard]] Picture Rounded(Picture picture) const { return RoundTo(std::move(picture), GetFormat()); }
    /// Half a step of a 16-bit float at 2, or a few of a 32-bit one.
    [[nodiscard]] Tolerance Arithmetic() const { return {IsHalf() ? 1.2e-3 : 2e-6, 0.0, true}; }
};

TEST_P(FrameOperationsOnEachDevice, FillsARectangleAndNothingElse) {
    Random random;
    const Picture before = Rounded(RandomPicture(random, 75, 30));
    const struct {
        int left, top, width, height;
    } kRectangles[] = {{0, 0, 75, 30}, {0, 0, 33, 7}, {5, 3, 64, 9}, {74, 29, 1, 1}, {10, 10, 0, 5}};
    for (const auto& r : kRectangles) {
        const DevicePicture picture(GetDevice(), GetFormat(), before, 4);
        EXPECT_EQ(Kiln::FillWithColor(GetDevice(), picture.GetData(), picture.GetRowBytes(), GetFormat(), r.left, r.top,
                                      r.width, r.height, {-0.5F, 0.25F, 3.0F, 0.75F}),
                  Ostrand::kStatus_OK);
        Picture expected = before;
        Host::Software::Fill(expected, r.left, r.top, r.width, r.height, {-0.5, 0.25, 3.0, 0.75});
        EXPECT_TRUE(PicturesAgree(picture.Download(), expected, kExactly)) << r.left << ", " << r.top;
    }
    const struct {
        decltype(&Kiln::FillWithOpaqueBlack) fill;
        Pixel color;
    } kFills[] = {{&Kiln::FillWithTransparentBlack, {0, 0, 0, 0}},
                  {&Kiln::FillWithOpaqueBlack, {0, 0, 0, 1}},
                  {&Kiln::FillWithOpaqueWhite, {1, 1, 1, 1}}};
    for (const auto& fill : kFills) {
        const DevicePicture picture(GetDevice(), GetFormat(), before, 0);
        EXPECT_EQ(fill.fill(GetDevice(), picture.GetData(), picture.GetRowBytes(), GetFormat(), 0, 0, 75, 30),
                  Ostrand::kStatus_OK);
        Picture expected = before;
        Host::Software::Fill(expected, 0, 0, 75, 30, fill.color);
        EXPECT_TRUE(PicturesAgree(picture.Download(), expected, kExactly));
    }
}

TEST_P(FrameOperationsOnEachDevice, ARectangleIsCopiedOrRefusedWhole) {
    Random random;
    const Picture from = Rounded(RandomPicture(random, 40, 20));
    const Picture before = Rounded(RandomPicture(random, 30, 25));
    const struct {
        int sourceLeft, sourceTop, targetLeft, targetTop, width, height;
        bool valid = true;
    } kCopies[] = {{0, 0, 0, 0, 30, 20},       {7, 3, 2, 5, 11, 9},        {39, 19, 29, 24, 1, 1},
                   {0, 0, 0, 0, 0, 5},         {5, 5, 5, 5, -3, 5},        {5, 5, 5, 5, 5, -1},
                   {-1, 0, 0, 0, 4, 4, false}, {0, -1, 0, 0, 4, 4, false}, {0, 0, -1, 0, 4, 4, false},
                   {0, 0, 0, -1, 4, 4, false}, {40, 0, 0, 0, 4, 4, false}, {0, 0, 30, 0, 4, 4, false}};
    for (const auto& c : kCopies) {
        const DevicePicture source(GetDevice(), GetFormat(), from, 3);
        const DevicePicture target(GetDevice(), GetFormat(), before, 2);
        EXPECT_EQ(Kiln::DeviceCopyRect(GetDevice(), source.GetData(), source.GetRowBytes(), target.GetData(),
                                       target.GetRowBytes(), GetFormat(), c.sourceLeft, c.sourceTop, c.targetLeft,
                                       c.targetTop, c.width, c.height),
                  c.valid ? Ostrand::kStatus_OK : Ostrand::kStatus_Failure);
        Picture expected = before;
        for (int y = 0; y < c.height && c.valid; ++y) {
            for (int x = 0; x < c.width; ++x) {
                expected.Set(c.targetLeft + x, c.targetTop + y, from.Get(c.sourceLeft + x, c.sourceTop + y));
            }
        }
        EXPECT_TRUE(PicturesAgree(target.Download(), expected, kExactly)) << c.sourceLeft << ", " << c.targetLeft;
    }
}

TEST_P(FrameOperationsOnEachDevice, ScaleMatchesTheReference) {
    Random random;
    for (int round = 0; round < 20; ++round) {
        SCOPED_TRACE(round);
        const Picture in = Rounded(RandomPicture(random, random.Int(1, 120), random.Int(1, 60)));
        const float scaleX = random.Uniform(0.1F, 2.5F), scaleY = random.Uniform(0.1F, 2.5F);
        Picture expected(std::max(1, static_cast<int>(static_cast<float>(in.width) * scaleX)),
                         std::max(1, static_cast<int>(static_cast<float>(in.height) * scaleY)));
        const auto quality = static_cast<RenderQuality>(1 + round % 5);
        const DevicePicture source(GetDevice(), GetFormat(), in, 2);
        const DevicePicture target(GetDevice(), GetFormat(), expected, 7);
        EXPECT_EQ(
            Kiln::Scale(GetDevice(), source.GetData(), source.GetRowBytes(), in.width, in.height, target.GetData(),
                        target.GetRowBytes(), expected.width, expected.height, GetFormat(), scaleX, scaleY, quality),
            Ostrand::kStatus_OK);
        Host::Software::Resample(in, expected, scaleX, scaleY, quality);
        Tolerance tolerance{IsHalf() ? 3e-3 : 3e-4, 0.0, true};
        tolerance.exceptionShare = quality < RenderQuality::kMedium ? 0.005 : 0.0005;
        EXPECT_TRUE(PicturesAgree(target.Download(), expected, tolerance));
    }
}

TEST_P(FrameOperationsOnEachDevice, CopyFrameChangesTheFormat) {
    Random random;
    const Picture in = Rounded(RandomPicture(random, 43, 19));
    const auto source = UploadFrame(GetDevice(), GetFormat(), in);
    for (const DeviceCase& other : {AllDeviceCases()[0], AllDeviceCases()[1]}) {
        const auto same = UploadFrame(GetDevice(), other.format, Picture(43, 19));
        EXPECT_EQ(Kiln::CopyFrame(source, same, RenderQuality::kHigh), Ostrand::kStatus_OK);
        EXPECT_TRUE(PicturesAgree(DownloadFrame(GetDevice(), same), RoundTo(in, other.format), kExactly));
    }
    EXPECT_EQ(Kiln::CopyFrame({}, source, RenderQuality::kHigh), Ostrand::kStatus_Failure);
}

/// A host frame of random bytes, uploaded, and what it should become.
TEST_P(FrameOperationsOnEachDevice, ConvertsEveryLayoutOfTheHost) {
    using namespace Vellum;
    constexpr PixelFormat kLayouts[] = {
        kPixelFormat_BGRA_4444_8u,     kPixelFormat_BGRX_4444_8u,     kPixelFormat_BGRP_4444_8u,
        kPixelFormat_ARGB_4444_8u,     kPixelFormat_XRGB_4444_8u,     kPixelFormat_PRGB_4444_8u,
        kPixelFormat_VUYA_4444_8u,     kPixelFormat_VUYX_4444_8u,     kPixelFormat_VUYP_4444_8u,
        kPixelFormat_VUYA_4444_8u_709, kPixelFormat_VUYX_4444_8u_709, kPixelFormat_VUYP_4444_8u_709,
        kPixelFormat_BGRA_4444_32f};
    constexpr PixelAspectRatio kAspect{16, 15};
    Random random;
    for (const PixelFormat layout : kLayouts) {
        for (const std::uint32_t alphaType : {kAlphaType_Straight, kAlphaType_Premultiplied, kAlphaType_None}) {
            SCOPED_TRACE(testing::Message() << Vellum::ToText(layout) << ", alpha type " << alphaType);
            const auto host = Kiln::CreateHostVideoFrame(layout, 41, 13, kAspect, 0, {7, 8});
            ASSERT_TRUE(host);
            host->SetAlphaType(alphaType);
            auto* bytes = reinterpret_cast<unsigned char*>(Ostrand::Demand<Marl::IFrameData>(host)->GetData());
            const std::int32_t rowBytes = Ostrand::Demand<Marl::IFrameRows>(host)->GetRowBytes();
            for (std::ptrdiff_t y = 0; y < 13; ++y) {
                for (std::ptrdiff_t i = 0; i < 41 * 4; ++i) {
                    if (layout == kPixelFormat_BGRA_4444_32f) {
                        // Alpha 0, 1 or enough of it that a 16-bit float holds what was divided.
                        const float color = random.Uniform(-0.5F, 1.5F);
                        const float alpha = std::floor(random.Uniform(0.0F, 8.99F)) / 8.0F;
                        reinterpret_cast<float*>(bytes + y * rowBytes)[i] = i % 4 == 3 ? alpha : color;
                    } else {
                        const int end = random.Int(0, 7);
                        bytes[y * rowBytes + i] = static_cast<unsigned char>(end == 0   ? 0
                                                                             : end == 1 ? 255
                                                                                        : random.Int(0, 255));
                    }
                }
            }
            const auto upload = Kiln::AllocateHostFrameForUpload(GetDevice(), host, RenderQuality::kHigh, {});
            ASSERT_TRUE(upload);
            ASSERT_EQ(Kiln::CopyToHostFrame(upload, host, RenderQuality::kHigh), Ostrand::kStatus_OK);
            const auto unconverted = Kiln::CopyToDevice(upload);
            ASSERT_TRUE(unconverted);
            EXPECT_EQ(unconverted->GetPixelFormat(), layout);
            EXPECT_EQ(unconverted->GetAlphaType(), alphaType);
            EXPECT_EQ(unconverted->GetPixelAspectRatio(), kAspect);
            EXPECT_EQ(unconverted->GetOrigin(), (Point{7, 8}));
            const auto target = UploadFrame(GetDevice(), GetFormat(), Picture(41, 13));
            ASSERT_EQ(Kiln::ConvertFrame(unconverted, target), Ostrand::kStatus_OK);
            const Picture expected = Host::Software::ReadPicture(bytes, rowBytes, 41, 13, layout, alphaType);
            // Not weighed by alpha: straight colour is what this is about. Division by an alpha of 1/255 makes 1e-7
            // large.
            EXPECT_TRUE(PicturesAgree(DownloadFrame(GetDevice(), target), expected, {2e-5, IsHalf() ? 6e-4 : 2e-5}));
        }
    }
    const auto target = UploadFrame(GetDevice(), GetFormat(), Picture(8, 8));
    const auto other = UploadFrame(GetDevice(), GetFormat(), Picture(8, 9));
    EXPECT_EQ(Kiln::ConvertFrame(other, target), Ostrand::kStatus_Failure);
    EXPECT_EQ(Kiln::ConvertFrame({}, target), Ostrand::kStatus_Failure);
}

TEST_P(FrameOperationsOnEachDevice, UnpremultiplyTakesTheMatteOut) {
    Random random;
    Picture picture = Rounded(RandomPicture(random, 57, 23));
    picture.At(20, 10)[2] = NAN;
    picture.At(20, 10)[3] = 0.5F;
    const auto frame = UploadFrame(GetDevice(), GetFormat(), picture);
    EXPECT_EQ(Kiln::UnpremultiplyFrame(frame, 0x20FF80U), Ostrand::kStatus_OK);
    const Picture out = DownloadFrame(GetDevice(), frame);
    Picture expected = picture;
    Host::Software::Unpremultiply(expected, 0x20FF80U);
    EXPECT_TRUE(PicturesAgree(out, expected, Arithmetic()));
}

TEST_P(FrameOperationsOnEachDevice, DeinterlaceKeepsTheKeptLinesToTheBit) {
    Random random;
    for (const int height : {1, 2, 7, 20}) {
        for (const int keep : {0, 1}) {
            const Picture picture = Rounded(RandomPicture(random, 45, height));
            const auto frame = UploadFrame(GetDevice(), GetFormat(), picture);
            EXPECT_EQ(Kiln::DeinterlaceFrame(frame, keep), Ostrand::kStatus_OK);
            const Picture out = DownloadFrame(GetDevice(), frame);
            Picture expected = picture;
            Host::Software::Deinterlace(expected, keep);
            EXPECT_TRUE(PicturesAgree(out, expected, Arithmetic())) << height << " lines, keep " << keep;
            for (int y = keep; y < height; y += 2) {
                for (int x = 0; x < 45; ++x) ASSERT_EQ(out.Get(x, y), picture.Get(x, y));
            }
        }
    }
    EXPECT_EQ(Kiln::DeinterlaceFrame(UploadFrame(GetDevice(), GetFormat(), Picture(4, 4)), 2),
              Ostrand::kStatus_Failure);
}

INSTANTIATE_TEST_SUITE_P(Devices, FrameOperationsOnEachDevice, testing::ValuesIn(AllDeviceCases()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
