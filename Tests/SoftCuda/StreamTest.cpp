// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0

// Streams keep their order and don't hold up their callers; events mark and time them.

#include <chrono>
#include <thread>

#include "Tests/SoftCuda/DriverFixture.h"

namespace SoftCudaTest {

class StreamTest : public DriverTest {
protected:
    using Clock = std::chrono::steady_clock;

    /// Queues work that takes a while: rounds of a costly kernel over a large frame.
    void QueueLongWork(const DeviceFrame& frame, CUstream stream, int rounds) const {
        for (int i = 0; i < rounds; ++i)
            Run("GradeKernel", frame.width, frame.height,
                Arguments(frame.data, frame.pitch, frame.format, frame.width, frame.height, 0.01F, 0.9F, 1.0F, 1.1F),
                stream);
    }
};

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

TEST_F(StreamTest, StreamsWaitForEachOthersEventsAndForTheDefaultStream) {
    DeviceFrame big(1280, 720, 1280, 1), frame(640, 100, 640, 1);
    CUstream slow = nullptr, other = nullptr;
    CUevent ready = nullptr;
    CHECK_CUDA(cuStreamCreate(&slow, CU_STREAM_NON_BLOCKING));
    CHECK_CUDA(cuStreamCreate(&other, 0));
    CHECK_CUDA(cuEventCreate(&ready, 0));
    const Arguments ramp(frame.data, 640, 1, 640, 100, Pixel{{0, 0, 5, 1}});
    const Arguments gain(frame.data, 640, 1, 640, 100, 3.0F, 0.0F);
    QueueLongWork(big, slow, 10);
    Run("RampKernel", 640, 100, ramp, slow);
    CHECK_CUDA(cuEventRecord(ready, slow));
    CHECK_CUDA(cuStreamWaitEvent(other, ready, 0));
    Run("GainKernel", 640, 100, gain, other);
    Run("GainKernel", 640, 100, gain);
    Run("GainKernel", 640, 100, gain, other);
    EXPECT_EQ(frame.Read()[999].value[2], 5.0F * 27.0F);
    CHECK_CUDA(cuEventDestroy_v2(ready));
    CHECK_CUDA(cuStreamDestroy_v2(slow));
    CHECK_CUDA(cuStreamDestroy_v2(other));
}

}  // namespace SoftCudaTest
