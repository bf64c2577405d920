// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0

// Streams keep their order and don't hold up their callers; events mark and time them.

#include "Tests/SoftCuda/DriverFixture.h"

namespace SoftCudaTest {

using StreamTest = DriverTest;

TEST_F(StreamTest, EverythingOnAStreamHappensInOrder) {
    constexpr int kWidth = 333, kHeight = 41;
    constexpr std::size_t kBytes = std::size_t{kWidth} * kHeight * 16;
    DeviceFrame frame(kWidth, kHeight, kWidth, 1), copy(kWidth, kHeight, kWidth, 1);
    void* host = nullptr;
    CUstream stream = nullptr;
    CHECK_CUDA(cuMemHostAlloc(&host, kBytes, 0));
    CHECK_CUDA(cuStreamCreate(&stream, 1));
    auto* values = static_cast<float*>(host);
    for (int round = 0; round < 50; ++round) {
        std::fill_n(values, kBytes / 4, static_cast<float>(round));
        const Arguments gain(frame.data, kWidth, 1, kWidth, kHeight, 2.0F, 1.0F);
        CHECK_CUDA(cuMemcpyHtoDAsync_v2(frame.data, host, kBytes, stream));
        Run("GainKernel", kWidth, kHeight, gain, stream);
        Run("ShiftKernel", kWidth, kHeight, Arguments(1, frame.data, kWidth, copy.data, kWidth, kWidth, kHeight, 0.0F),
            stream);
        Run("GainKernel", kWidth, kHeight, gain, stream);
        CHECK_CUDA(cuMemcpyDtoDAsync_v2(frame.data, copy.data, 16, stream));
        CHECK_CUDA(cuMemcpyDtoHAsync_v2(host, frame.data, kBytes, stream));
        CHECK_CUDA(cuStreamSynchronize(stream));
        ASSERT_EQ(values[0], static_cast<float>(2 * round + 1));
        ASSERT_EQ(values[kBytes / 4 - 4], static_cast<float>(4 * round + 3));
    }
    CHECK_CUDA(cuStreamDestroy_v2(stream));
    CHECK_CUDA(cuMemFreeHost(host));
}

}  // namespace SoftCudaTest
