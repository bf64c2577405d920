// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// The CPU driver as a program meets it: opened by name, its entries bound by theirs.

#include <gtest/gtest.h>

#include <cstdint>
#include <cstring>
#include <optional>
#include <random>
#include <string>
#include <vector>

#include "SoftCuda/Controls.h"
#include "SoftCuda/DriverApi.h"

namespace SoftCudaTest {

/// The library's handle; opened once.
[[nodiscard]] void* GetLibrary();
[[nodiscard]] void* FindEntry(const std::string& name);

// clang-format off
#define TEST_ENTRIES(X) \
    X(cuInit) X(cuDeviceTotalMem_v2) X(cuCtxCreate_v2) X(cuCtxDestroy_v2) X(cuCtxSynchronize) \
    X(cuModuleLoadData) X(cuModuleUnload) X(cuModuleGetFunction) X(cuModuleGetGlobal_v2) \
    X(cuMemGetInfo_v2) X(cuMemAlloc_v2) X(cuMemFree_v2) X(cuMemHostAlloc) X(cuMemFreeHost) \
    X(cuMemcpyHtoD_v2) X(cuMemcpyDtoH_v2) X(cuMemcpyHtoDAsync_v2) X(cuMemcpyDtoHAsync_v2) \
    X(cuMemcpyDtoDAsync_v2) X(cuMemsetD8_v2) X(cuMemsetD16_v2) X(cuMemsetD32_v2) \
    X(cuMemsetD2D32_v2) X(cuFuncSetBlockShape) X(cuParamSetSize) X(cuParamSetv) X(cuParamSeti) \
    X(cuParamSetf) X(cuLaunchGrid) X(cuLaunchGridAsync) X(cuLaunchKernel) X(cuStreamCreate) \
    X(cuStreamDestroy_v2) X(cuStreamQuery) X(cuStreamSynchronize) X(SoftCudaSetFailEvery) \
    X(SoftCudaSetFusing) X(SoftCudaGetCounters) X(SoftCudaGetMessage)
// clang-format on

struct Driver {
#define TEST_DECLARE(name) decltype(&::name) name = nullptr;
    TEST_ENTRIES(TEST_DECLARE)
#undef TEST_DECLARE
    Driver();
};
[[nodiscard]] const Driver& Api();
/// A call of the driver that must succeed.
#define CHECK_CUDA(...) EXPECT_EQ(Api().__VA_ARGS__, CUDA_SUCCESS)

/// The CPU image of the module under this key.
[[nodiscard]] const void* FindImage(const std::string& key);

/// Sets an environment variable for a scope.
class ScopedVariable {
public:
    ScopedVariable(const char* name, const std::string& value);
    ~ScopedVariable();
    ScopedVariable(const ScopedVariable&) = delete;
    ScopedVariable& operator=(const ScopedVariable&) = delete;

private:
    std::string mName;
    std::optional<std::string> mOld;
};

/// Arguments packed as the API lays them out: each aligned to its own size.
class Arguments {
public:
    template <class... Values>
    explicit Arguments(const Values&... values) {
        (Add(values), ...);
    }
    template <class T>
    void Add(const T& value) {
        const std::size_t offset = (mBytes.size() + sizeof(T) - 1) / sizeof(T) * sizeof(T);
        mBytes.resize(offset + sizeof(T));
        std::memcpy(&mBytes[offset], &value, sizeof(T));
    }
    [[nodiscard]] const std::vector<unsigned char>& GetBytes() const { return mBytes; }

private:
    std::vector<unsigned char> mBytes;
};

struct Pixel {
    float value[4];
};

/// A frame in device memory. `format` 0 holds 16-bit floats; pixels go in and out as 32-bit ones.
class DeviceFrame {
public:
    DeviceFrame(int width, int height, int pitch, int format);
    ~DeviceFrame();
    DeviceFrame(const DeviceFrame&) = delete;
    DeviceFrame& operator=(const DeviceFrame&) = delete;

    void Write(const std::vector<Pixel>& pixels);
    [[nodiscard]] std::vector<Pixel> Read() const;
    /// All bytes, the pitch's padding included.
    [[nodiscard]] std::vector<unsigned char> ReadBytes() const;
    void WriteBytes(const std::vector<unsigned char>& bytes);

    CUdeviceptr data = 0;
    const int width, height, pitch, format;

private:
    [[nodiscard]] std::size_t GetByteCount() const;
};

/// A context with the test module loaded at a level.
class DriverTest : public ::testing::Test {
protected:
    void SetUp() override { Open("v4"); }
    void TearDown() override { Close(); }
    /// Opens a context, with the settings of the environment, and loads the module for at most `level`.
    void Open(const std::string& level);
    void Close();

    [[nodiscard]] CUfunction Find(const char* kernel) const;
    /// Launches over width by height threads in blocks of 16 by 16.
    CUresult Launch(const char* kernel, int width, int height, const Arguments& arguments,
                    CUstream stream = nullptr) const;
    /// A launch that must succeed.
    void Run(const char* kernel, int width, int height, const Arguments& arguments, CUstream stream = nullptr) const {
        EXPECT_EQ(Launch(kernel, width, height, arguments, stream), CUDA_SUCCESS)
            << kernel << ": " << Api().SoftCudaGetMessage();
    }
    void Synchronize() const { EXPECT_EQ(Api().cuCtxSynchronize(), CUDA_SUCCESS); }

    CUcontext mContext = nullptr;
    CUmodule mModule = nullptr;
};

[[nodiscard]] std::vector<Pixel> RandomPixels(std::size_t count, std::mt19937& random, float low = -0.5F,
                                              float high = 1.5F);

/// Fails with place and values when a value is off by more than relative * |expected| + absolute.
void ExpectNear(const std::vector<Pixel>& actual, const std::vector<Pixel>& expected, double relative, double absolute,
                int width);

}  // namespace SoftCudaTest
