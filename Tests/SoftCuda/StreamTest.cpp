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
            ASSERT_EQ(Launch("GradeKernel", frame.width, frame.height,
                             Arguments(frame.data, frame.pitch, frame.format, frame.width, frame.height, 0.01F, 0.9F,
                                       1.0F, 1.1F),
                             stream),
                      CUDA_SUCCESS);
    }
};

TEST_F(StreamTest, LaunchesReturnBeforeTheirWorkIsDone) {
    DeviceFrame frame(1920, 1080, 1920, 1);
    CUstream stream = nullptr;
    ASSERT_EQ(Api().cuStreamCreate(&stream, 0), CUDA_SUCCESS);
    const auto begin = Clock::now();
    QueueLongWork(frame, stream, 40);
    const auto queued = Clock::now();
    EXPECT_EQ(Api().cuStreamQuery(stream), CUDA_ERROR_NOT_READY);
    EXPECT_EQ(Api().cuStreamSynchronize(stream), CUDA_SUCCESS);
    const auto done = Clock::now();
    EXPECT_EQ(Api().cuStreamQuery(stream), CUDA_SUCCESS);
    EXPECT_LT(queued - begin, done - queued);
    EXPECT_EQ(Api().cuStreamDestroy_v2(stream), CUDA_SUCCESS);
}

TEST_F(StreamTest, EventsMarkTheirPlaceAndGiveTheTimeBetween) {
    DeviceFrame frame(1280, 720, 1280, 1);
    CUstream stream = nullptr;
    CUevent first = nullptr, second = nullptr, unused = nullptr;
    ASSERT_EQ(Api().cuStreamCreate(&stream, 0), CUDA_SUCCESS);
    for (CUevent* event : {&first, &second, &unused}) ASSERT_EQ(Api().cuEventCreate(event, 0), CUDA_SUCCESS);
    float milliseconds = 0;
    const auto begin = Clock::now();
    ASSERT_EQ(Api().cuEventRecord(first, stream), CUDA_SUCCESS);
    QueueLongWork(frame, stream, 40);
    ASSERT_EQ(Api().cuEventRecord(second, stream), CUDA_SUCCESS);
    EXPECT_EQ(Api().cuEventQuery(second), CUDA_ERROR_NOT_READY);
    EXPECT_EQ(Api().cuEventElapsedTime(&milliseconds, first, second), CUDA_ERROR_NOT_READY);
    EXPECT_EQ(Api().cuEventSynchronize(second), CUDA_SUCCESS);
    const std::chrono::duration<double, std::milli> whole = Clock::now() - begin;
    EXPECT_EQ(Api().cuEventQuery(first), CUDA_SUCCESS);
    EXPECT_EQ(Api().cuEventElapsedTime(&milliseconds, first, second), CUDA_SUCCESS);
    EXPECT_GT(milliseconds, 0.2 * whole.count());
    EXPECT_LE(milliseconds, whole.count());
    EXPECT_EQ(Api().cuEventElapsedTime(&milliseconds, first, unused), CUDA_ERROR_INVALID_HANDLE);
    EXPECT_EQ(Api().cuEventQuery(unused), CUDA_SUCCESS);
    for (CUevent event : {first, second, unused}) EXPECT_EQ(Api().cuEventDestroy_v2(event), CUDA_SUCCESS);
    EXPECT_EQ(Api().cuStreamDestroy_v2(stream), CUDA_SUCCESS);
}

TEST_F(StreamTest, EverythingOnAStreamHappensInOrder) {
    constexpr int kWidth = 333, kHeight = 41;
    constexpr std::size_t kBytes = std::size_t{kWidth} * kHeight * 16;
    DeviceFrame frame(kWidth, kHeight, kWidth, 1), copy(kWidth, kHeight, kWidth, 1);
    void* host = nullptr;
    CUstream stream = nullptr;
    ASSERT_EQ(Api().cuMemHostAlloc(&host, kBytes, 0), CUDA_SUCCESS);
    ASSERT_EQ(Api().cuStreamCreate(&stream, 1), CUDA_SUCCESS);
    auto* values = static_cast<float*>(host);
    for (int round = 0; round < 50; ++round) {
        std::fill_n(values, kBytes / 4, static_cast<float>(round));
        const Arguments gain(frame.data, kWidth, 1, kWidth, kHeight, 2.0F, 1.0F);
        ASSERT_EQ(Api().cuMemcpyHtoDAsync_v2(frame.data, host, kBytes, stream), CUDA_SUCCESS);
        ASSERT_EQ(Launch("GainKernel", kWidth, kHeight, gain, stream), CUDA_SUCCESS);
        ASSERT_EQ(Launch("ShiftKernel", kWidth, kHeight,
                         Arguments(1, frame.data, kWidth, copy.data, kWidth, kWidth, kHeight, 0.0F), stream),
                  CUDA_SUCCESS);
        ASSERT_EQ(Launch("GainKernel", kWidth, kHeight, gain, stream), CUDA_SUCCESS);
        ASSERT_EQ(Api().cuMemcpyDtoDAsync_v2(frame.data, copy.data, 16, stream), CUDA_SUCCESS);
        ASSERT_EQ(Api().cuMemcpyDtoHAsync_v2(host, frame.data, kBytes, stream), CUDA_SUCCESS);
        ASSERT_EQ(Api().cuStreamSynchronize(stream), CUDA_SUCCESS);
        ASSERT_EQ(values[0], static_cast<float>(2 * round + 1));
        ASSERT_EQ(values[kBytes / 4 - 4], static_cast<float>(4 * round + 3));
    }
    EXPECT_EQ(Api().cuStreamDestroy_v2(stream), CUDA_SUCCESS);
    EXPECT_EQ(Api().cuMemFreeHost(host), CUDA_SUCCESS);
}

TEST_F(StreamTest, StreamsWaitForEachOthersEventsAndForTheDefaultStream) {
    DeviceFrame big(1280, 720, 1280, 1), frame(640, 100, 640, 1);
    CUstream slow = nullptr, other = nullptr;
    CUevent ready = nullptr;
    ASSERT_EQ(Api().cuStreamCreate(&slow, CU_STREAM_NON_BLOCKING), CUDA_SUCCESS);
    ASSERT_EQ(Api().cuStreamCreate(&other, 0), CUDA_SUCCESS);
    ASSERT_EQ(Api().cuEventCreate(&ready, 0), CUDA_SUCCESS);
    const Arguments ramp(frame.data, 640, 1, 640, 100, Pixel{{0, 0, 5, 1}});
    const Arguments gain(frame.data, 640, 1, 640, 100, 3.0F, 0.0F);
    QueueLongWork(big, slow, 10);
    ASSERT_EQ(Launch("RampKernel", 640, 100, ramp, slow), CUDA_SUCCESS);
    ASSERT_EQ(Api().cuEventRecord(ready, slow), CUDA_SUCCESS);
    ASSERT_EQ(Api().cuStreamWaitEvent(other, ready, 0), CUDA_SUCCESS);
    ASSERT_EQ(Launch("GainKernel", 640, 100, gain, other), CUDA_SUCCESS);
    ASSERT_EQ(Launch("GainKernel", 640, 100, gain), CUDA_SUCCESS);
    ASSERT_EQ(Launch("GainKernel", 640, 100, gain, other), CUDA_SUCCESS);
    EXPECT_EQ(frame.Read()[999].value[2], 5.0F * 27.0F);
    EXPECT_EQ(Api().cuEventDestroy_v2(ready), CUDA_SUCCESS);
    EXPECT_EQ(Api().cuStreamDestroy_v2(slow), CUDA_SUCCESS);
    EXPECT_EQ(Api().cuStreamDestroy_v2(other), CUDA_SUCCESS);
}

TEST_F(StreamTest, ManyThreadsUseOneContextAtOnce) {
    constexpr int kThreads = 8;
    std::vector<std::thread> threads;
    for (int t = 0; t < kThreads; ++t)
        threads.emplace_back([this, t] {
            ASSERT_EQ(Api().cuCtxPushCurrent_v2(mContext), CUDA_SUCCESS);
            CUstream stream = nullptr;
            ASSERT_EQ(Api().cuStreamCreate(&stream, CU_STREAM_NON_BLOCKING), CUDA_SUCCESS);
            // Functions hold the arguments set last: each thread has its own by loading the module itself.
            CUmodule module = nullptr;
            ASSERT_EQ(Api().cuModuleLoadData(&module, FindImage("TestKernels")), CUDA_SUCCESS);
            CUfunction function = nullptr;
            ASSERT_EQ(Api().cuModuleGetFunction(&function, module, "GainKernel"), CUDA_SUCCESS);
            for (int round = 0; round < 20; ++round) {
                DeviceFrame frame(200 + t, 30, 200 + t, round % 2);
                frame.Write(std::vector<Pixel>(static_cast<std::size_t>((200 + t) * 30), Pixel{{1, 1, 1, 1}}));
                int pitch = frame.pitch, format = frame.format, width = frame.width, height = frame.height;
                float gain = 2.0F, lift = 0.0F;
                CUdeviceptr data = frame.data;
                void* parameters[] = {&data, &pitch, &format, &width, &height, &gain, &lift};
                for (int i = 0; i < 4; ++i)
                    ASSERT_EQ(Api().cuLaunchKernel(function, 16, 2, 1, 16, 16, 1, 0, stream, parameters, nullptr),
                              CUDA_SUCCESS);
                ASSERT_EQ(Api().cuStreamSynchronize(stream), CUDA_SUCCESS);
                const std::vector<Pixel> result = frame.Read();
                for (const Pixel& pixel : {result.front(), result.back()}) ASSERT_EQ(pixel.value[1], 16.0F);
            }
            EXPECT_EQ(Api().cuStreamDestroy_v2(stream), CUDA_SUCCESS);
        });
    for (std::thread& thread : threads) thread.join();
}

}  // namespace SoftCudaTest
