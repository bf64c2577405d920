// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0

// The driver's names, its devices, its modules and how arguments reach kernels.

#include "Tests/SoftCuda/DriverFixture.h"

namespace SoftCudaTest {

using ModuleTest = DriverTest;

TEST_F(ModuleTest, ArgumentsLieAtMultiplesOfTheirOwnSize) {
    CUdeviceptr out = 0, in = 0;
    CHECK_CUDA(cuMemAlloc_v2(&out, 64));
    CHECK_CUDA(cuMemAlloc_v2(&in, 64));
    float single = 6.5F;
    CHECK_CUDA(cuMemcpyHtoD_v2(in, &single, 4));
    CUfunction function = Find("EchoKernel");
    CHECK_CUDA(cuFuncSetBlockShape(function, 16, 16, 1));
    const auto expect = [&](int a, float b, int e) {
        int words[6] = {};
        CHECK_CUDA(cuMemcpyDtoH_v2(words, out, sizeof words));
        float floats[6];
        std::memcpy(floats, words, sizeof floats);
        EXPECT_EQ(words[0], a);
        EXPECT_EQ(floats[1], b);
        EXPECT_EQ(floats[2], 10.0F);
        EXPECT_EQ(floats[3], 13.0F);
        EXPECT_EQ(floats[4], 6.5F);
        EXPECT_EQ(words[5], e);
    };

    // int at 0, pointer at 8, float at 16, four floats at 32, pointer at 48, int at 56; the total is 60, not 64.
    Pixel color{{10, 11, 12, 13}};
    CHECK_CUDA(cuParamSeti(function, 0, 41));
    CHECK_CUDA(cuParamSetv(function, 8, &out, 8));
    CHECK_CUDA(cuParamSetf(function, 16, 2.5F));
    CHECK_CUDA(cuParamSetv(function, 32, &color, 16));
    CHECK_CUDA(cuParamSetv(function, 48, &in, 8));
    CHECK_CUDA(cuParamSeti(function, 56, 43));
    CHECK_CUDA(cuParamSetSize(function, 64));
    EXPECT_EQ(Api().cuLaunchGrid(function, 1, 1), CUDA_ERROR_INVALID_VALUE);
    EXPECT_NE(std::string(Api().SoftCudaGetMessage()).find("60 bytes"), std::string::npos);
    CHECK_CUDA(cuParamSetSize(function, 60));
    CHECK_CUDA(cuLaunchGrid(function, 1, 1));
    // Taken at the launch: what is set afterwards is for the next one.
    CHECK_CUDA(cuParamSeti(function, 0, 99));
    expect(41, 2.5F, 43);

    int a = -7, e = 8;
    float b = 0.25F;
    void* parameters[] = {&a, &out, &b, &color, &in, &e};
    CHECK_CUDA(cuLaunchKernel(function, 1, 1, 1, 8, 8, 1, 0, nullptr, parameters, nullptr));
    expect(-7, 0.25F, 8);

    std::vector<unsigned char> packed = Arguments(5, out, 1.5F, color, in, 6).GetBytes();
    std::size_t size = packed.size();
    void* extra[] = {reinterpret_cast<void*>(1), packed.data(), reinterpret_cast<void*>(2), &size, nullptr};
    CHECK_CUDA(cuLaunchKernel(function, 1, 1, 1, 8, 8, 1, 0, nullptr, nullptr, extra));
    expect(5, 1.5F, 6);
}

TEST_F(ModuleTest, GlobalsBelongToTheirModuleAndChangeInOrder) {
    CUmodule other = nullptr;
    CHECK_CUDA(cuModuleLoadData(&other, FindImage("TestKernels")));
    CUdeviceptr mine = 0, theirs = 0;
    std::size_t bytes = 0;
    CHECK_CUDA(cuModuleGetGlobal_v2(&mine, &bytes, mModule, "offsets"));
    EXPECT_EQ(bytes, 5 * sizeof(float));
    CHECK_CUDA(cuModuleGetGlobal_v2(&theirs, &bytes, other, "offsets"));
    EXPECT_NE(mine, theirs);
    EXPECT_EQ(Api().cuModuleGetGlobal_v2(&theirs, &bytes, other, "absent"), CUDA_ERROR_NOT_FOUND);

    DeviceFrame frame(300, 20, 300, 1);
    frame.Write(std::vector<Pixel>(6000, Pixel{}));
    float values[5] = {0, 0, 0, 0, 1};
    const auto write = [&](float value) {
        values[4] = value;
        CHECK_CUDA(cuMemcpyHtoDAsync_v2(mine, values, sizeof values, nullptr));
    };
    const auto launch = [&] {
        Run("OffsetKernel", 300, 20, Arguments(frame.data, 300, 1, 300, 20, 4, CUdeviceptr{0}));
    };
    write(1);
    launch();
    launch();
    write(10);
    launch();
    EXPECT_EQ(frame.Read()[4567].value[2], 12.0F);

    CHECK_CUDA(cuModuleGetGlobal_v2(&mine, &bytes, mModule, "gainRecord"));
    EXPECT_EQ(bytes, 32U);
    const struct {
        float gain[4];
        int channels, padding[3];
    } record = {{2, 3, 4, 5}, 1, {}};
    CHECK_CUDA(cuMemcpyHtoD_v2(mine, &record, sizeof record));
    Run("RecordKernel", 300, 20, Arguments(frame.data, 300, 1, 300, 20, CUdeviceptr{0}));
    const Pixel pixel = frame.Read()[4567];
    EXPECT_EQ(pixel.value[2], 48.0F);
    EXPECT_EQ(pixel.value[3], 12.0F);
    CHECK_CUDA(cuModuleUnload(other));
}

}  // namespace SoftCudaTest
