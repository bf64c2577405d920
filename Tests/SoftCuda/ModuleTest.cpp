// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0

// The driver's names, its devices, its modules and how arguments reach kernels.

#include <sstream>
#include <thread>

#include "Tests/SoftCuda/DriverFixture.h"

namespace SoftCudaTest {

using ModuleTest = DriverTest;

TEST(DriverEntries, EveryNameThatALoaderBindsIsExported) {
    const char* plain =
        "cuInit cuDriverGetVersion cuDeviceGet cuDeviceGetCount cuDeviceGetName cuDeviceComputeCapability "
        "cuDeviceGetProperties cuDeviceGetAttribute cuCtxAttach cuCtxDetach cuCtxGetDevice cuCtxSynchronize "
        "cuModuleLoad "
        "cuModuleLoadData cuModuleUnload cuModuleGetFunction cuModuleGetTexRef cuMemFreeHost cuMemHostAlloc "
        "cuFuncSetBlockShape cuFuncSetSharedSize cuFuncGetAttribute cuArrayDestroy cuTexRefCreate cuTexRefDestroy "
        "cuTexRefSetArray cuTexRefSetFormat cuTexRefSetAddressMode cuTexRefSetFilterMode cuTexRefSetFlags "
        "cuTexRefGetArray cuTexRefGetAddressMode cuTexRefGetFilterMode cuTexRefGetFormat cuTexRefGetFlags "
        "cuParamSetSize "
        "cuParamSeti cuParamSetf cuParamSetv cuParamSetTexRef cuLaunch cuLaunchGrid cuLaunchGridAsync cuEventCreate "
        "cuEventRecord cuEventQuery cuEventSynchronize cuEventElapsedTime cuStreamCreate cuStreamQuery "
        "cuStreamSynchronize cuModuleLoadDataEx cuModuleLoadFatBinary cuGraphicsGLRegisterBuffer "
        "cuGraphicsGLRegisterImage cuMemHostGetFlags cuMemcpyDtoDAsync cuFuncSetCacheConfig "
        "cuGraphicsUnregisterResource "
        "cuGraphicsSubResourceGetMappedArray cuGraphicsResourceSetMapFlags cuGraphicsMapResources "
        "cuGraphicsUnmapResources cuGetExportTable cuModuleGetSurfRef cuSurfRefSetArray cuSurfRefGetArray "
        "cuCtxSetLimit "
        "cuCtxGetLimit cuCtxSetCurrent cuCtxGetCurrent cuMemHostRegister cuMemHostUnregister cuMemcpy cuMemcpyPeer "
        "cuLaunchKernel";
    const char* versioned =
        "cuCtxDestroy cuCtxPopCurrent cuCtxPushCurrent cuStreamDestroy cuEventDestroy cuDeviceTotalMem cuCtxCreate "
        "cuModuleGetGlobal cuMemGetInfo cuMemAlloc cuMemAllocPitch cuMemFree cuMemGetAddressRange cuMemAllocHost "
        "cuMemHostGetDevicePointer cuMemcpyHtoD cuMemcpyDtoH cuMemcpyDtoD cuMemcpyDtoA cuMemcpyAtoD cuMemcpyHtoA "
        "cuMemcpyAtoH cuMemcpyAtoA cuMemcpy2D cuMemcpy2DUnaligned cuMemcpy3D cuMemcpyHtoDAsync cuMemcpyDtoHAsync "
        "cuMemcpyHtoAAsync cuMemcpyAtoHAsync cuMemcpy2DAsync cuMemcpy3DAsync cuMemsetD8 cuMemsetD16 cuMemsetD32 "
        "cuMemsetD2D8 cuMemsetD2D16 cuMemsetD2D32 cuArrayCreate cuArrayGetDescriptor cuArray3DCreate "
        "cuArray3DGetDescriptor cuTexRefSetAddress cuTexRefSetAddress2D cuTexRefGetAddress cuGLCtxCreate "
        "cuGraphicsResourceGetMappedPointer";
    std::istringstream names(std::string(plain) + " " + versioned);
    for (std::string name; names >> name;) EXPECT_NE(FindEntry(name), nullptr) << name;
    std::istringstream both(versioned);
    for (std::string name; both >> name;) EXPECT_NE(FindEntry(name + "_v2"), nullptr) << name;

    const auto create = reinterpret_cast<decltype(&cuTexRefCreate)>(FindEntry("cuTexRefCreate"));
    EXPECT_EQ(create(nullptr), CUDA_ERROR_NOT_SUPPORTED);
    const char* name = nullptr;
    EXPECT_EQ(Api().cuGetErrorName(CUDA_ERROR_NOT_SUPPORTED, &name), CUDA_SUCCESS);
    EXPECT_STREQ(name, "CUDA_ERROR_NOT_SUPPORTED");
}

TEST(DriverDevices, ThereAreAsManyAsAskedForEachWithItsContexts) {
    const ScopedVariable devices("SOFTCUDA_DEVICES", "3");
    ASSERT_EQ(Api().cuInit(0), CUDA_SUCCESS);
    int count = 0, version = 0, major = 0;
    EXPECT_EQ(Api().cuDeviceGetCount(&count), CUDA_SUCCESS);
    EXPECT_EQ(count, 3);
    EXPECT_EQ(Api().cuDriverGetVersion(&version), CUDA_SUCCESS);
    EXPECT_GE(version, 4000);
    EXPECT_EQ(Api().cuDeviceGetAttribute(&major, CU_DEVICE_ATTRIBUTE_COMPUTE_CAPABILITY_MAJOR, 2), CUDA_SUCCESS);
    EXPECT_EQ(major, 7);
    CUdevice device = -1;
    EXPECT_EQ(Api().cuDeviceGet(&device, 3), CUDA_ERROR_INVALID_DEVICE);
    char name[64] = "";
    EXPECT_EQ(Api().cuDeviceGetName(name, sizeof name, 2), CUDA_SUCCESS);
    EXPECT_NE(std::string(name).find('2'), std::string::npos);

    CUcontext first = nullptr, second = nullptr, current = nullptr;
    std::size_t unused = 0;
    EXPECT_EQ(Api().cuMemGetInfo_v2(&unused, &unused), CUDA_ERROR_INVALID_CONTEXT);
    ASSERT_EQ(Api().cuCtxCreate_v2(&first, 0, 0), CUDA_SUCCESS);
    ASSERT_EQ(Api().cuCtxCreate_v2(&second, 0, 2), CUDA_SUCCESS);
    EXPECT_EQ(Api().cuCtxPopCurrent_v2(&current), CUDA_SUCCESS);
    EXPECT_EQ(current, second);
    EXPECT_EQ(Api().cuCtxGetCurrent(&current), CUDA_SUCCESS);
    EXPECT_EQ(current, first);
    // Memory counts by device, and a context isn't another thread's until that thread takes it.
    CUdeviceptr block = 0;
    std::size_t freeFirst = 0, freeSecond = 0, total = 0;
    EXPECT_EQ(Api().cuMemAlloc_v2(&block, 1 << 20), CUDA_SUCCESS);
    EXPECT_EQ(Api().cuMemGetInfo_v2(&freeFirst, &total), CUDA_SUCCESS);
    std::thread([&] {
        EXPECT_EQ(Api().cuCtxSynchronize(), CUDA_ERROR_INVALID_CONTEXT);
        EXPECT_EQ(Api().cuCtxSetCurrent(second), CUDA_SUCCESS);
        EXPECT_EQ(Api().cuMemGetInfo_v2(&freeSecond, &total), CUDA_SUCCESS);
    }).join();
    EXPECT_EQ(freeFirst + (1 << 20), freeSecond);
    EXPECT_EQ(Api().cuCtxDestroy_v2(first), CUDA_SUCCESS);
    EXPECT_EQ(Api().cuCtxPushCurrent_v2(first), CUDA_ERROR_INVALID_CONTEXT);
    EXPECT_EQ(Api().cuCtxDestroy_v2(second), CUDA_SUCCESS);
}

TEST_F(ModuleTest, ArgumentsLieAtMultiplesOfTheirOwnSize) {
    CUdeviceptr out = 0, in = 0;
    ASSERT_EQ(Api().cuMemAlloc_v2(&out, 64), CUDA_SUCCESS);
    ASSERT_EQ(Api().cuMemAlloc_v2(&in, 64), CUDA_SUCCESS);
    float single = 6.5F;
    ASSERT_EQ(Api().cuMemcpyHtoD_v2(in, &single, 4), CUDA_SUCCESS);
    CUfunction function = Find("EchoKernel");
    ASSERT_EQ(Api().cuFuncSetBlockShape(function, 16, 16, 1), CUDA_SUCCESS);
    const auto expect = [&](int a, float b, int e) {
        int words[6] = {};
        ASSERT_EQ(Api().cuMemcpyDtoH_v2(words, out, sizeof words), CUDA_SUCCESS);
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
    EXPECT_EQ(Api().cuParamSeti(function, 0, 41), CUDA_SUCCESS);
    EXPECT_EQ(Api().cuParamSetv(function, 8, &out, 8), CUDA_SUCCESS);
    EXPECT_EQ(Api().cuParamSetf(function, 16, 2.5F), CUDA_SUCCESS);
    EXPECT_EQ(Api().cuParamSetv(function, 32, &color, 16), CUDA_SUCCESS);
    EXPECT_EQ(Api().cuParamSetv(function, 48, &in, 8), CUDA_SUCCESS);
    EXPECT_EQ(Api().cuParamSeti(function, 56, 43), CUDA_SUCCESS);
    EXPECT_EQ(Api().cuParamSetSize(function, 64), CUDA_SUCCESS);
    EXPECT_EQ(Api().cuLaunchGrid(function, 1, 1), CUDA_ERROR_INVALID_VALUE);
    EXPECT_NE(std::string(Api().SoftCudaGetMessage()).find("60 bytes"), std::string::npos);
    EXPECT_EQ(Api().cuParamSetSize(function, 60), CUDA_SUCCESS);
    ASSERT_EQ(Api().cuLaunchGrid(function, 1, 1), CUDA_SUCCESS);
    // Taken at the launch: what is set afterwards is for the next one.
    EXPECT_EQ(Api().cuParamSeti(function, 0, 99), CUDA_SUCCESS);
    expect(41, 2.5F, 43);

    int a = -7, e = 8;
    float b = 0.25F;
    void* parameters[] = {&a, &out, &b, &color, &in, &e};
    ASSERT_EQ(Api().cuLaunchKernel(function, 1, 1, 1, 8, 8, 1, 0, nullptr, parameters, nullptr), CUDA_SUCCESS);
    expect(-7, 0.25F, 8);

    std::vector<unsigned char> packed = Arguments(5, out, 1.5F, color, in, 6).GetBytes();
    std::size_t size = packed.size();
    void* extra[] = {reinterpret_cast<void*>(1), packed.data(), reinterpret_cast<void*>(2), &size, nullptr};
    ASSERT_EQ(Api().cuLaunchKernel(function, 1, 1, 1, 8, 8, 1, 0, nullptr, nullptr, extra), CUDA_SUCCESS);
    expect(5, 1.5F, 6);
}

TEST_F(ModuleTest, GlobalsBelongToTheirModuleAndChangeInOrder) {
    CUmodule other = nullptr;
    ASSERT_EQ(Api().cuModuleLoadData(&other, FindImage("TestKernels")), CUDA_SUCCESS);
    CUdeviceptr mine = 0, theirs = 0;
    std::size_t bytes = 0;
    ASSERT_EQ(Api().cuModuleGetGlobal_v2(&mine, &bytes, mModule, "offsets"), CUDA_SUCCESS);
    EXPECT_EQ(bytes, 5 * sizeof(float));
    ASSERT_EQ(Api().cuModuleGetGlobal_v2(&theirs, &bytes, other, "offsets"), CUDA_SUCCESS);
    EXPECT_NE(mine, theirs);
    EXPECT_EQ(Api().cuModuleGetGlobal_v2(&theirs, &bytes, other, "absent"), CUDA_ERROR_NOT_FOUND);

    DeviceFrame frame(300, 20, 300, 1);
    frame.Write(std::vector<Pixel>(6000, Pixel{}));
    float values[5] = {0, 0, 0, 0, 1};
    const auto write = [&](float value) {
        values[4] = value;
        ASSERT_EQ(Api().cuMemcpyHtoDAsync_v2(mine, values, sizeof values, nullptr), CUDA_SUCCESS);
    };
    const auto launch = [&] {
        ASSERT_EQ(Launch("OffsetKernel", 300, 20, Arguments(frame.data, 300, 1, 300, 20, 4, CUdeviceptr{0})),
                  CUDA_SUCCESS);
    };
    write(1);
    launch();
    launch();
    write(10);
    launch();
    EXPECT_EQ(frame.Read()[4567].value[2], 12.0F);

    ASSERT_EQ(Api().cuModuleGetGlobal_v2(&mine, &bytes, mModule, "gainRecord"), CUDA_SUCCESS);
    EXPECT_EQ(bytes, 32U);
    const struct {
        float gain[4];
        int channels, padding[3];
    } record = {{2, 3, 4, 5}, 1, {}};
    ASSERT_EQ(Api().cuMemcpyHtoD_v2(mine, &record, sizeof record), CUDA_SUCCESS);
    ASSERT_EQ(Launch("RecordKernel", 300, 20, Arguments(frame.data, 300, 1, 300, 20, CUdeviceptr{0})), CUDA_SUCCESS);
    const Pixel pixel = frame.Read()[4567];
    EXPECT_EQ(pixel.value[2], 48.0F);
    EXPECT_EQ(pixel.value[3], 12.0F);
    EXPECT_EQ(Api().cuModuleUnload(other), CUDA_SUCCESS);
}

TEST_F(ModuleTest, WhatIsNoImageForThisDeviceIsToldApart) {
    CUmodule module = nullptr;
    alignas(8) unsigned char image[128] = {};
    EXPECT_EQ(Api().cuModuleLoadData(&module, image), CUDA_ERROR_INVALID_IMAGE);
    const unsigned magic = 0xBA55ED50;
    std::memcpy(image, &magic, sizeof magic);
    EXPECT_EQ(Api().cuModuleLoadData(&module, image), CUDA_ERROR_NO_BINARY_FOR_GPU);
    EXPECT_EQ(Api().cuModuleLoadData(&module, nullptr), CUDA_ERROR_INVALID_VALUE);
    CUfunction function = nullptr;
    EXPECT_EQ(Api().cuModuleGetFunction(&function, mModule, "NoSuchKernel"), CUDA_ERROR_NOT_FOUND);
    EXPECT_EQ(Api().cuModuleGetFunction(&function, nullptr, "CopyKernel"), CUDA_ERROR_INVALID_HANDLE);
}

}  // namespace SoftCudaTest
