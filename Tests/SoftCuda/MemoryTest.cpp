// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0

// Device memory: its size, its refusal, its copies and fills.

#include "Tests/SoftCuda/DriverFixture.h"

namespace SoftCudaTest {

class MemoryTest : public DriverTest {
protected:
    /// Opens the driver anew with a memory of so many megabytes.
    void Reopen(int megabytes) {
        Close();
        const ScopedVariable variable("SOFTCUDA_MEMORY_MB", std::to_string(megabytes));
        Open("v4");
    }
    [[nodiscard]] static std::size_t GetFree() {
        std::size_t free = 0, total = 0;
        CHECK_CUDA(cuMemGetInfo_v2(&free, &total));
        return free;
    }
};

TEST_F(MemoryTest, SizeIsAsSetAndWhatGoesBeyondIsRefused) {
    Reopen(64);
    std::size_t total = 0;
    CHECK_CUDA(cuDeviceTotalMem_v2(&total, 0));
    EXPECT_EQ(total, 64U << 20);
    EXPECT_EQ(GetFree(), total);

    CUdeviceptr first = 0, second = 0;
    CHECK_CUDA(cuMemAlloc_v2(&first, 40U << 20));
    EXPECT_EQ(first % (2U << 20), 0U);
    EXPECT_EQ(GetFree(), 24U << 20);
    EXPECT_EQ(Api().cuMemAlloc_v2(&second, 25U << 20), CUDA_ERROR_OUT_OF_MEMORY);
    EXPECT_NE(std::string(Api().SoftCudaGetMessage()).find("device memory"), std::string::npos);
    CHECK_CUDA(cuMemFree_v2(first));
    EXPECT_EQ(Api().cuMemFree_v2(first), CUDA_ERROR_INVALID_VALUE);
    CHECK_CUDA(cuMemAlloc_v2(&second, 64U << 20));
    EXPECT_EQ(Api().cuMemAlloc_v2(&first, 0), CUDA_ERROR_INVALID_VALUE);

    // What a context leaves behind goes with it.
    Close();
    Open("v4");
    Reopen(64);
    EXPECT_EQ(GetFree(), 64U << 20);
    Reopen(4096);
}

TEST_F(MemoryTest, FailuresComeAsOftenAsAskedFor) {
    Api().SoftCudaSetFailEvery(3);
    std::vector<CUresult> results;
    for (int i = 0; i < 7; ++i) {
        CUdeviceptr block = 0;
        results.push_back(Api().cuMemAlloc_v2(&block, 4096));
        if (block != 0) {
            CHECK_CUDA(cuMemFree_v2(block));
        }
    }
    Api().SoftCudaSetFailEvery(0);
    constexpr CUresult kNo = CUDA_ERROR_OUT_OF_MEMORY, kYes = CUDA_SUCCESS;
    EXPECT_EQ(results, (std::vector<CUresult>{kYes, kYes, kNo, kYes, kYes, kNo, kYes}));
}

TEST_F(MemoryTest, FillsWriteTheirPattern) {
    // Larger than a part of a fill, and no multiple of it.
    constexpr std::size_t kWords = 150'001;
    CUdeviceptr block = 0;
    CHECK_CUDA(cuMemAlloc_v2(&block, kWords * 4));
    std::vector<unsigned> words(kWords);
    const auto read = [&] { CHECK_CUDA(cuMemcpyDtoH_v2(words.data(), block, kWords * 4)); };
    CHECK_CUDA(cuMemsetD32_v2(block, 0x12345678, kWords));
    read();
    EXPECT_EQ(words, std::vector<unsigned>(kWords, 0x12345678));
    CHECK_CUDA(cuMemsetD16_v2(block, 0xABCD, 3));
    CHECK_CUDA(cuMemsetD2D32_v2(block + 40, 32, 7, 2, 2));
    read();
    EXPECT_EQ(words[0], 0xABCDABCDU);
    EXPECT_EQ(words[1], 0x1234ABCDU);
    const std::vector<unsigned> expected{7,          7,          0x12345678, 0x12345678, 0x12345678,
                                         0x12345678, 0x12345678, 0x12345678, 7,          7};
    EXPECT_EQ(std::vector<unsigned>(words.begin() + 10, words.begin() + 20), expected);
    EXPECT_EQ(Api().cuMemsetD32_v2(block + 2, 0, 1), CUDA_ERROR_INVALID_VALUE);
    CHECK_CUDA(cuMemFree_v2(block));
}

TEST_F(MemoryTest, FramesOutsideLiveMemoryDontLaunch) {
    DeviceFrame frame(32, 32, 32, 1);
    const auto launch = [&](CUdeviceptr data, int pitch, int height) {
        return Launch("GainKernel", 32, 32, Arguments(data, pitch, 1, 32, height, 1.0F, 0.0F));
    };
    EXPECT_EQ(launch(frame.data, 32, 32), CUDA_SUCCESS);
    EXPECT_EQ(launch(frame.data + 16, 32, 32), CUDA_ERROR_ILLEGAL_ADDRESS);
    EXPECT_NE(std::string(Api().SoftCudaGetMessage()).find("GainKernel, argument 1"), std::string::npos);
    EXPECT_EQ(launch(frame.data, 33, 32), CUDA_ERROR_ILLEGAL_ADDRESS);
    EXPECT_EQ(launch(frame.data, 16, 32), CUDA_ERROR_ILLEGAL_ADDRESS);
    EXPECT_EQ(launch(0, 32, 32), CUDA_ERROR_ILLEGAL_ADDRESS);
    EXPECT_EQ(launch(0, 32, 0), CUDA_SUCCESS);
    // Only as many lines as the grid has threads for are touched.
    EXPECT_EQ(launch(frame.data, 32, 1000), CUDA_SUCCESS);
    Synchronize();
}

}  // namespace SoftCudaTest
