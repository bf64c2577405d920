// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <cmath>
#include <cstring>
#include <limits>

#include "Kiln/FrameCopies.h"
#include "Kiln/Scratch.h"
#include "Tests/Kiln/OnEachFramework.h"
#include "Tests/Support/Pictures.h"

namespace Kiln {
namespace {

constexpr Vellum::PixelAspectRatio kAspect{16, 15};
constexpr std::uint64_t kAll = ~std::uint64_t{0};

class FrameOnEachFramework : public OnEachFramework {
protected:
    /// Writes tightly packed rows into a frame.
    void WritePixels(const VideoFrameRef& frame, const void* pixels) {
        const DeviceFrameView view = ViewDeviceFrame(frame);
        const std::size_t widthBytes = view.width * Vellum::BytesPerPixel(view.format);
        std::vector<std::uint8_t> padded(static_cast<std::size_t>(view.rowBytes) * view.height, 0xEE);
        for (std::int32_t y = 0; y < view.height; ++y) {
            std::memcpy(&padded[static_cast<std::size_t>(y) * view.rowBytes],
                        static_cast<const std::uint8_t*>(pixels) + y * widthBytes, widthBytes);
        }
        const ScopedDeviceAccess access(mDevice);
        ASSERT_EQ(mDevice->GetCommands()->CopyHostToDevice(padded.data(), view.data, padded.size(), nullptr), 0);
    }
    static const std::uint8_t* RowOf(const VideoFrameRef& hostFrame, std::int32_t row) {
        return reinterpret_cast<const std::uint8_t*>(Ostrand::Demand<Marl::IFrameData>(hostFrame)->GetData()) +
               static_cast<std::ptrdiff_t>(row) * Ostrand::Demand<Marl::IFrameRows>(hostFrame)->GetRowBytes();
    }
    VideoFrameRef MakeHostFrame(Vellum::PixelFormat format, std::int32_t width, std::int32_t height) {
        return CreateHostVideoFrame(format, width, height, kAspect, Vellum::kFieldType_UpperFirst, {3, -4});
    }
};
KILN_ON_EACH_FRAMEWORK(FrameOnEachFramework);

TEST_P(FrameOnEachFramework, AnswersItsInterfacesAndAttributes) {
    VideoFrameRef frame;
    ASSERT_EQ(CreateGPUVideoFrame(frame, mDevice, kPixelFormat_GPU_BGRX_4444_16f, 511, 37, kAspect,
                                  Vellum::kFieldType_LowerFirst, {5, 6}),
              0);
    for (const VideoFrameRef& each : {frame, CreateSimilarFrame(frame)}) {
        ASSERT_TRUE(each);
        EXPECT_EQ(each->GetBounds(), (Vellum::Rect{0, 0, 511, 37}));
        EXPECT_EQ(each->GetOrigin(), (Vellum::Point{5, 6}));
        EXPECT_EQ(each->GetPixelFormat(), kPixelFormat_GPU_BGRX_4444_16f);
        EXPECT_EQ(each->GetPixelAspectRatio(), kAspect);
        EXPECT_EQ(each->GetFieldType(), Vellum::kFieldType_LowerFirst);
        EXPECT_EQ(each->GetAlphaType(), Vellum::kAlphaType_None);
        EXPECT_NE(Ostrand::Demand<Marl::IFrameData>(each)->GetData(), 0U);
        EXPECT_EQ(Ostrand::Demand<IDeviceFrame>(each)->GetDevice(), mDevice);
        EXPECT_TRUE(IsDeviceFrame(each));
        const auto identity = Ostrand::Demand<Marl::IFrameIdentity>(each);
        EXPECT_TRUE(identity->GetHash().IsNil());
        identity->SetHash(Halden::utility::Guid(9, 8, 7, {}));
        EXPECT_EQ(Ostrand::Demand<Marl::IFrameIdentity>(each)->GetHash(), Halden::utility::Guid(9, 8, 7, {}));
        void* out = &frame;
        EXPECT_EQ(each->QueryInterface(Halden::utility::Guid(1, 1, 1, {}), &out), Ostrand::kStatus_NoInterface);
        EXPECT_EQ(out, nullptr);
    }
    EXPECT_NE(ViewDeviceFrame(frame).data, ViewDeviceFrame(CreateSimilarFrame(frame)).data);
    EXPECT_FALSE(IsDeviceFrame(MakeHostFrame(Vellum::kPixelFormat_BGRA_4444_8u, 4, 4)));
    EXPECT_FALSE(IsDeviceFrame({}));
}

TEST_P(FrameOnEachFramework, RowsAreAlignedAndNeverWholePages) {
    for (const std::int32_t width : {1, 16, 17, 255, 256, 511, 512, 1024, 1920, 2048}) {
        for (const auto format : {kPixelFormat_GPU_BGRA_4444_32f, kPixelFormat_GPU_BGRA_4444_16f}) {
            const std::int32_t rowBytes = ViewDeviceFrame(MakeFrame(width, 2, format)).rowBytes;
            EXPECT_GE(rowBytes, width * static_cast<std::int32_t>(Vellum::BytesPerPixel(format)));
            EXPECT_EQ(rowBytes % 256, 0) << width;
            EXPECT_NE(rowBytes % 4096, 0) << width;
        }
    }
}

TEST_P(FrameOnEachFramework, RefusesWhatItCannotMake) {
    VideoFrameRef frame = MakeFrame(8, 8);
    const auto make = [&](Vellum::PixelFormat format, std::int32_t width, std::int32_t height) {
        return CreateGPUVideoFrame(frame, mDevice, format, width, height, {1, 1}, 0, {});
    };
    EXPECT_EQ(make(kPixelFormat_GPU_BGRA_4444_32f, 0, 8), Ostrand::kStatus_Failure);
    EXPECT_FALSE(frame);
    EXPECT_EQ(make(kPixelFormat_GPU_BGRA_4444_32f, 8, -1), Ostrand::kStatus_Failure);
    EXPECT_EQ(make(Vellum::kPixelFormat_VUYA_4444_8u, 8, 8), Ostrand::kStatus_Failure);
    EXPECT_EQ(make(Vellum::kPixelFormat_BGRA_4444_8u, 8, 8), Ostrand::kStatus_OK) << "room for a mask";
    EXPECT_EQ(make(Vellum::kPixelFormat_Invalid, 8, 8), Ostrand::kStatus_Failure);
    EXPECT_EQ(make(kPixelFormat_GPU_BGRA_4444_32f, 0x7FFFFFFF, 8), Ostrand::kStatus_Failure);
    EXPECT_EQ(make(kPixelFormat_GPU_BGRA_4444_32f, 1 << 20, 0x7FFFFFFF), Ostrand::kStatus_OutOfMemory);
    mDevice->GetDeviceMemory()->SetAllocationFilter([](std::uint64_t) { return true; });
    EXPECT_EQ(make(kPixelFormat_GPU_BGRA_4444_32f, 8, 8), Ostrand::kStatus_OutOfMemory);
    EXPECT_FALSE(frame);
    EXPECT_FALSE(MakeHostFrame(Vellum::kPixelFormat_BGRA_4444_8u, -1, 4));
    EXPECT_FALSE(CreateSimilarFrame(MakeHostFrame(Vellum::kPixelFormat_BGRA_4444_8u, 4, 4)));
}

// Every half there is, and floats around each rounding boundary.
TEST_P(FrameOnEachFramework, ReadsBackWithExactRounding) {
    std::vector<std::uint16_t> halves(65536);
    for (std::size_t i = 0; i < halves.size(); ++i) halves[i] = static_cast<std::uint16_t>(i);
    for (const auto format : {kPixelFormat_GPU_BGRA_4444_16f, kPixelFormat_GPU_BGRX_4444_16f}) {
        const VideoFrameRef frame = MakeFrame(127, 129, format);
        WritePixels(frame, halves.data());
        const VideoFrameRef floats = MakeHostFrame(Vellum::kPixelFormat_BGRA_4444_32f, 127, 129);
        ASSERT_EQ(CopyFromDevice(floats, frame), 0);
        for (std::size_t i = 0; i < 127U * 129 * 4; ++i) {
            float value = 0;
            std::memcpy(&value, RowOf(floats, static_cast<int>(i / 508)) + i % 508 * 4, 4);
            const bool isOpaque = format == kPixelFormat_GPU_BGRX_4444_16f && i % 4 == 3;
            const float expected = isOpaque ? 1.0F : Vantrel::Testing::FloatFromHalf(halves[i]);
            ASSERT_TRUE(std::isnan(expected) ? std::isnan(value) : value == expected) << "half " << i;
        }
    }
    std::vector<float> values;
    for (int i = -3; i <= 258; ++i) {
        const auto boundary = static_cast<float>((i + 0.5) / 255.0);
        for (const float to : {-1.0F, 2.0F}) values.push_back(std::nextafter(boundary, to));
        values.push_back(boundary);
        values.push_back(static_cast<float>(i / 255.0));
    }
    for (const float special : {std::numeric_limits<float>::infinity(), -std::numeric_limits<float>::infinity(),
                                std::numeric_limits<float>::quiet_NaN(), 1e-42F}) {
        values.push_back(special);
    }
    const auto width = static_cast<std::int32_t>(values.size() / 4);
    const VideoFrameRef frame = MakeFrame(width, 1);
    WritePixels(frame, values.data());
    const VideoFrameRef bytes = MakeHostFrame(Vellum::kPixelFormat_BGRA_4444_8u, width, 1);
    ASSERT_EQ(CopyFromDevice(bytes, frame), 0);
    for (std::size_t i = 0; i < values.size(); ++i) {
        const double clamped = values[i] > 0 ? std::min<double>(values[i], 1.0) : 0.0;
        ASSERT_EQ(RowOf(bytes, 0)[i], std::floor(clamped * 255.0 + 0.5)) << values[i];
    }
    EXPECT_LT(CopyFromDevice(MakeHostFrame(Vellum::kPixelFormat_BGRA_4444_8u, width - 1, 1), frame), 0);
    EXPECT_LT(CopyFromDevice(MakeHostFrame(Vellum::kPixelFormat_ARGB_4444_8u, width, 1), frame), 0);
    EXPECT_LT(CopyFromDevice(bytes, bytes), 0);
    EXPECT_LT(CopyFromDevice({}, frame), 0);
    EXPECT_FALSE(CopyToDevice(bytes)) << "not an upload frame";
}

TEST_P(FrameOnEachFramework, FillsOpaqueAndCopiesEqualFrames) {
    for (const auto format :
         {kPixelFormat_GPU_BGRA_4444_32f, kPixelFormat_GPU_BGRA_4444_16f, kPixelFormat_GPU_BGRX_4444_16f}) {
        const VideoFrameRef matte = MakeFrame(29, 13, format);
        ASSERT_EQ(Ostrand::Demand<IOpaqueFill>(matte)->FillOpaque(), 0);
        const VideoFrameRef copy = CreateSimilarFrame(matte);
        ASSERT_EQ(CopyEqualFrame(matte, copy), 0);
        const VideoFrameRef floats = MakeHostFrame(Vellum::kPixelFormat_BGRA_4444_32f, 29, 13);
        ASSERT_EQ(CopyFromDevice(floats, copy), 0);
        const std::vector<float> ones(29 * 4, 1.0F);
        for (int y = 0; y < 13; ++y) EXPECT_EQ(std::memcmp(RowOf(floats, y), ones.data(), 29 * 16), 0);
    }
    EXPECT_LT(CopyEqualFrame(MakeFrame(4, 4), MakeFrame(4, 5)), 0);
    EXPECT_LT(CopyEqualFrame(MakeFrame(4, 4), MakeFrame(4, 4, kPixelFormat_GPU_BGRA_4444_16f)), 0);
}

TEST_P(FrameOnEachFramework, CopiesRowsBetweenUnequalLayouts) {
    constexpr std::size_t kBytes = 40000;
    const DeviceScratchBuffer source(mDevice, kBytes);
    const DeviceScratchBuffer target(mDevice, kBytes);
    const auto pixels = MakeBytes(kBytes, 5);
    const ScopedDeviceAccess access(mDevice);
    ASSERT_EQ(mDevice->GetCommands()->CopyHostToDevice(pixels.data(), source.GetHandle(), kBytes, nullptr), 0);
    ASSERT_EQ(mDevice->GetBackend().Fill(target.GetHandle(), 0, 0, kBytes), 0);
    ASSERT_EQ(mDevice->GetBackend().CopyRows(target.GetHandle(), {64, 700}, source.GetHandle(), {256, 512}, 100, 50),
              0);
    std::vector<std::uint8_t> expected(kBytes, 0);
    for (std::size_t row = 0; row < 50; ++row) std::memcpy(&expected[64 + row * 700], &pixels[256 + row * 512], 100);
    EXPECT_EQ(ReadBytes(target.GetHandle(), kBytes), expected);
}

}  // namespace
}  // namespace Kiln
