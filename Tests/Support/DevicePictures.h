// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <iosfwd>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "Kiln/Device.h"
#include "Kiln/Frames.h"
#include "Tests/Support/Pictures.h"

/// Pictures on devices.
namespace Vantrel::Testing {

/// What device tests are run over.
struct DeviceCase {
    Kiln::DeviceFramework framework;
    Vellum::PixelFormat format;
};
[[nodiscard]] std::string ToText(const DeviceCase& deviceCase);
void PrintTo(const DeviceCase& deviceCase, std::ostream* stream);
/// Both frameworks in both pixel formats; the tests' names tell which.
[[nodiscard]] std::vector<DeviceCase> AllDeviceCases();
[[nodiscard]] std::string NameOfCase(const testing::TestParamInfo<DeviceCase>& info);

/// A device of the case's framework, held for the test under exclusive access. A framework without a device fails the
/// test and tells the reason.
class DeviceTest : public testing::TestWithParam<DeviceCase> {
protected:
    DeviceTest();
    ~DeviceTest() override;
    void SetUp() override;

    [[nodiscard]] const Kiln::DeviceRef& GetDevice() const { return mDevice; }
    [[nodiscard]] Vellum::PixelFormat GetFormat() const { return GetParam().format; }
    [[nodiscard]] bool IsHalf() const { return GetFormat() == Kiln::kPixelFormat_GPU_BGRA_4444_16f; }

private:
    Kiln::DeviceRef mDevice;
};

/// A picture in a device buffer of its own, with spare pixels at the end of each row and a spare line below, all of a
/// known pattern: what writes beside the picture is found out.
class DevicePicture {
public:
    DevicePicture(Kiln::DeviceRef device, Vellum::PixelFormat format, const Picture& picture, int sparePixels);
    ~DevicePicture();
    DevicePicture(const DevicePicture&) = delete;
    DevicePicture& operator=(const DevicePicture&) = delete;

    [[nodiscard]] std::uint64_t GetData() const { return mData; }
    [[nodiscard]] std::int32_t GetRowBytes() const { return mRowBytes; }
    [[nodiscard]] std::int32_t GetWidth() const { return mWidth; }
    [[nodiscard]] std::int32_t GetHeight() const { return mHeight; }

    /// Waits for the device. A failure of the device, or a changed spare pixel, fails the test.
    [[nodiscard]] Picture Download() const;

private:
    Kiln::DeviceRef mDevice;
    Vellum::PixelFormat mFormat;
    std::int32_t mWidth;
    std::int32_t mHeight;
    std::int32_t mRowBytes;
    std::uint64_t mData = 0;
};

/// A device frame with these pixels; null, and the test fails, when there is no memory.
[[nodiscard]] Kiln::VideoFrameRef UploadFrame(const Kiln::DeviceRef& device, Vellum::PixelFormat format,
                                              const Picture& picture);
/// The pixels of a device frame in a format that devices render in. Waits for the device; failures fail the test.
[[nodiscard]] Picture DownloadFrame(const Kiln::DeviceRef& device, const Kiln::VideoFrameRef& frame);
/// The same as the frame holds it, row after row: what large pictures are compared by.
void DownloadFrameWords(const Kiln::DeviceRef& device, const Kiln::VideoFrameRef& frame,
                        std::vector<std::uint32_t>& words);

}  // namespace Vantrel::Testing
