// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Tests/Support/DevicePictures.h"

#include <algorithm>
#include <cstring>
#include <memory>
#include <ostream>
#include <utility>

#include "Kiln/Backend.h"
#include "Marl/IVideoFrame.h"

namespace Vantrel::Testing {
namespace {

constexpr unsigned char kSpareByte = 0xA5;

bool HasHalves(Vellum::PixelFormat format) { return (format.GetUpper() & Vellum::PixelFormatBits::kWidthMask) != 0; }

std::size_t PixelBytes(Vellum::PixelFormat format) { return HasHalves(format) ? 8 : 16; }

void PackRow(const Picture& picture, int y, Vellum::PixelFormat format, unsigned char* row) {
    const float* source = picture.At(0, y);
    const std::size_t count = static_cast<std::size_t>(picture.width) * 4;
    if (!HasHalves(format)) {
        std::memcpy(row, source, count * sizeof(float));
        return;
    }
    for (std::size_t i = 0; i < count; ++i) {
        const std::uint16_t half = HalfFromFloat(source[i]);
        std::memcpy(row + i * sizeof half, &half, sizeof half);
    }
}

void UnpackRow(Picture& picture, int y, Vellum::PixelFormat format, const unsigned char* row) {
    float* target = picture.At(0, y);
    const std::size_t count = static_cast<std::size_t>(picture.width) * 4;
    if (!HasHalves(format)) {
        std::memcpy(target, row, count * sizeof(float));
        return;
    }
    for (std::size_t i = 0; i < count; ++i) {
        std::uint16_t half = 0;
        std::memcpy(&half, row + i * sizeof half, sizeof half);
        target[i] = FloatFromHalf(half);
    }
}

/// Writes `rows` rows, those beyond the picture as spare ones, and waits.
void UploadRows(const Kiln::DeviceRef& device, std::uint64_t data, std::size_t rowBytes, std::size_t rows,
                Vellum::PixelFormat format, const Picture& picture) {
    Kiln::Backend& backend = device->GetBackend();
    const auto release = [&backend](void* block) { backend.FreeHost(block); };
    const std::unique_ptr<void, decltype(release)> staging(backend.AllocateHost(rowBytes * rows), release);
    ASSERT_NE(staging, nullptr);
    auto* bytes = static_cast<unsigned char*>(staging.get());
    std::memset(bytes, kSpareByte, rowBytes * rows);
    for (int y = 0; y < picture.height; ++y)
        PackRow(picture, y, format, bytes + static_cast<std::size_t>(y) * rowBytes);
    EXPECT_EQ(backend.CopyToDevice(data, 0, bytes, rowBytes * rows), Ostrand::kStatus_OK);
    EXPECT_EQ(device->Synchronize(), Ostrand::kStatus_OK);
}

std::vector<unsigned char> DownloadRows(const Kiln::DeviceRef& device, std::uint64_t data, std::size_t rowBytes,
                                        std::size_t rows) {
    std::vector<unsigned char> bytes(rowBytes * rows);
    EXPECT_EQ(device->GetBackend().CopyRowsToHost(bytes.data(), rowBytes, data, {0, rowBytes}, rowBytes, rows),
              Ostrand::kStatus_OK);
    return bytes;
}

/// Holds Kiln up until the last test has run: tests come and go too fast to find the devices anew each time. After that
/// it goes while the CPU driver's own statics are still there.
class KilnForAllTests final : public ::testing::Environment {
public:
    void InitializeOnce() {
        if (!mIsUp) Kiln::Initialize(true);
        mIsUp = true;
    }
    void TearDown() override {
        if (mIsUp) Kiln::Terminate();
        mIsUp = false;
    }

private:
    bool mIsUp = false;
};

// Owned by the test framework from here on.
auto* const gKiln = new KilnForAllTests;
const ::testing::Environment* const kRegistered = ::testing::AddGlobalTestEnvironment(gKiln);

}  // namespace

std::string ToText(const DeviceCase& deviceCase) {
    return std::string(deviceCase.framework == Kiln::DeviceFramework::kCuda ? "Cuda" : "OpenCL") +
           (HasHalves(deviceCase.format) ? "16f" : "32f");
}

void PrintTo(const DeviceCase& deviceCase, std::ostream* stream) { *stream << ToText(deviceCase); }

std::vector<DeviceCase> AllDeviceCases() {
    return {{Kiln::DeviceFramework::kCuda, Kiln::kPixelFormat_GPU_BGRA_4444_32f},
            {Kiln::DeviceFramework::kCuda, Kiln::kPixelFormat_GPU_BGRA_4444_16f},
            {Kiln::DeviceFramework::kOpenCL, Kiln::kPixelFormat_GPU_BGRA_4444_32f},
            {Kiln::DeviceFramework::kOpenCL, Kiln::kPixelFormat_GPU_BGRA_4444_16f}};
}

std::string NameOfCase(const testing::TestParamInfo<DeviceCase>& info) { return ToText(info.param); }

DeviceTest::DeviceTest() { gKiln->InitializeOnce(); }

DeviceTest::~DeviceTest() {
    if (mDevice) mDevice->ReleaseExclusiveAccess();
}

void DeviceTest::SetUp() {
    mDevice = Kiln::GetPrimaryDevice(GetParam().framework);
    ASSERT_TRUE(mDevice) << Kiln::GetFrameworkMessage(GetParam().framework);
    mDevice->AcquireExclusiveAccess();
}

DevicePicture::DevicePicture(Kiln::DeviceRef device, Vellum::PixelFormat format, const Picture& picture,
                             int sparePixels)
    : mDevice(std::move(device)),
      mFormat(format),
      mWidth(picture.width),
      mHeight(picture.height),
      mRowBytes((picture.width + sparePixels) * static_cast<std::int32_t>(PixelBytes(format))) {
    const auto rows = static_cast<std::size_t>(mHeight) + 1;
    mData = mDevice->GetDeviceMemory()->Allocate(static_cast<std::uint64_t>(mRowBytes) * rows);
    EXPECT_NE(mData, 0U);
    if (mData != 0) UploadRows(mDevice, mData, static_cast<std::size_t>(mRowBytes), rows, format, picture);
}

DevicePicture::~DevicePicture() {
    if (mData != 0) mDevice->GetDeviceMemory()->Free(mData);
}

Picture DevicePicture::Download() const {
    const auto rowBytes = static_cast<std::size_t>(mRowBytes);
    const auto rows = static_cast<std::size_t>(mHeight) + 1;
    const std::vector<unsigned char> bytes = DownloadRows(mDevice, mData, rowBytes, rows);
    Picture picture(mWidth, mHeight);
    for (int y = 0; y < mHeight; ++y) {
        const unsigned char* row = bytes.data() + static_cast<std::size_t>(y) * rowBytes;
        UnpackRow(picture, y, mFormat, row);
        const bool spareKept = std::all_of(row + static_cast<std::size_t>(mWidth) * PixelBytes(mFormat), row + rowBytes,
                                           [](unsigned char byte) { return byte == kSpareByte; });
        EXPECT_TRUE(spareKept) << "row " << y << " was written beyond its end";
    }
    EXPECT_TRUE(std::all_of(bytes.end() - mRowBytes, bytes.end(), [](unsigned char byte) {
        return byte == kSpareByte;
    })) << "the line below the picture was written";
    return picture;
}

Kiln::VideoFrameRef UploadFrame(const Kiln::DeviceRef& device, Vellum::PixelFormat format, const Picture& picture) {
    Kiln::VideoFrameRef frame;
    EXPECT_EQ(Kiln::CreateGPUVideoFrame(frame, device, format, picture.width, picture.height,
                                        Vellum::kPixelAspectRatio_Square, Vellum::kFieldType_Progressive, {}),
              Ostrand::kStatus_OK);
    if (frame) {
        UploadRows(device, Ostrand::Demand<Marl::IFrameData>(frame)->GetData(),
                   static_cast<std::size_t>(Ostrand::Demand<Marl::IFrameRows>(frame)->GetRowBytes()),
                   static_cast<std::size_t>(picture.height), format, picture);
    }
    return frame;
}

Picture DownloadFrame(const Kiln::DeviceRef& device, const Kiln::VideoFrameRef& frame) {
    const Vellum::Rect bounds = frame->GetBounds();
    const auto rowBytes = static_cast<std::size_t>(Ostrand::Demand<Marl::IFrameRows>(frame)->GetRowBytes());
    const std::vector<unsigned char> bytes = DownloadRows(device, Ostrand::Demand<Marl::IFrameData>(frame)->GetData(),
                                                          rowBytes, static_cast<std::size_t>(bounds.Height()));
    Picture picture(bounds.Width(), bounds.Height());
    for (int y = 0; y < picture.height; ++y) {
        UnpackRow(picture, y, frame->GetPixelFormat(), bytes.data() + static_cast<std::size_t>(y) * rowBytes);
    }
    return picture;
}

void DownloadFrameWords(const Kiln::DeviceRef& device, const Kiln::VideoFrameRef& frame,
                        std::vector<std::uint32_t>& words) {
    const Vellum::Rect bounds = frame->GetBounds();
    const auto rowBytes = static_cast<std::size_t>(Ostrand::Demand<Marl::IFrameRows>(frame)->GetRowBytes());
    const std::size_t width = static_cast<std::size_t>(bounds.Width()) * PixelBytes(frame->GetPixelFormat());
    const auto rows = static_cast<std::size_t>(bounds.Height());
    words.resize(width * rows / sizeof(std::uint32_t));
    EXPECT_EQ(device->GetBackend().CopyRowsToHost(
                  words.data(), width, Ostrand::Demand<Marl::IFrameData>(frame)->GetData(), {0, rowBytes}, width, rows),
              Ostrand::kStatus_OK);
}

}  // namespace Vantrel::Testing
