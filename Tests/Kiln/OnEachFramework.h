// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "Kiln/Backend.h"
#include "Kiln/Device.h"
#include "Kiln/Frames.h"

namespace Kiln {

/// Fills of known places, so that a copy that goes astray shows.
inline std::vector<std::uint8_t> MakeBytes(std::size_t count, std::uint32_t seed) {
    std::vector<std::uint8_t> bytes(count);
    std::uint32_t state = seed * 2654435761U + 1;
    for (std::uint8_t& byte : bytes) {
        state = state * 1664525U + 1013904223U;
        byte = static_cast<std::uint8_t>(state >> 24);
    }
    return bytes;
}

/// One device of each framework. A framework without a device fails, with its own words.
class OnEachFramework : public testing::TestWithParam<DeviceFramework> {
protected:
    void SetUp() override {
        Initialize(true);
        mDevice = GetPrimaryDevice(GetParam());
        ASSERT_TRUE(mDevice) << GetFrameworkMessage(GetParam());
    }
    void TearDown() override {
        mDevice.reset();
        Terminate();
    }

    /// Device memory, after all that is queued.
    std::vector<std::uint8_t> ReadBytes(std::uint64_t block, std::size_t bytes) {
        std::vector<std::uint8_t> out(bytes);
        EXPECT_EQ(mDevice->GetBackend().CopyRowsToHost(out.data(), bytes, block, {0, bytes}, bytes, 1), 0);
        return out;
    }
    VideoFrameRef MakeFrame(std::int32_t width, std::int32_t height,
                            Vellum::PixelFormat format = kPixelFormat_GPU_BGRA_4444_32f) {
        VideoFrameRef frame;
        EXPECT_EQ(CreateGPUVideoFrame(frame, mDevice, format, width, height, Vellum::kPixelAspectRatio_Square, 0, {}),
                  0);
        return frame;
    }

    DeviceRef mDevice;
};

inline std::string NameOfFramework(const testing::TestParamInfo<DeviceFramework>& info) {
    return info.param == DeviceFramework::kCuda ? "Cuda" : "OpenCL";
}

#define KILN_ON_EACH_FRAMEWORK(Suite)                                                                    \
    INSTANTIATE_TEST_SUITE_P(, Suite, testing::Values(DeviceFramework::kCuda, DeviceFramework::kOpenCL), \
                             NameOfFramework)

}  // namespace Kiln
