// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Tests/SoftCuda/DriverFixture.h"

#include <dlfcn.h>

#include <cmath>
#include <cstdlib>
#include <map>

#include "Kiln/Modules.h"
#include "SoftCuda/Half.h"

namespace {

std::map<std::string, Kiln::ModuleImage>& GetImages() {
    static std::map<std::string, Kiln::ModuleImage> images;
    return images;
}

}  // namespace

// The tests stand in for the library that keeps modules: the driver's layer knows none.
void Kiln::AddModules(const ModuleImage* images, std::size_t count) {
    for (std::size_t i = 0; i < count; ++i) GetImages()[images[i].key] = images[i];
}

namespace SoftCudaTest {

void* GetLibrary() {
    static void* library = dlopen(SOFTCUDA_LIBRARY, RTLD_NOW | RTLD_LOCAL);
    return library;
}

void* FindEntry(const std::string& name) { return dlsym(GetLibrary(), name.c_str()); }

Driver::Driver() {
#define TEST_BIND(name) name = reinterpret_cast<decltype(name)>(FindEntry(#name));
    TEST_ENTRIES(TEST_BIND)
#undef TEST_BIND
}

const Driver& Api() {
    static const Driver driver;
    return driver;
}

const void* FindImage(const std::string& key) { return GetImages().at(key).cpuImage; }

ScopedVariable::ScopedVariable(const char* name, const std::string& value) : mName(name) {
    if (const char* old = std::getenv(name)) mOld = old;
    setenv(name, value.c_str(), 1);
}

ScopedVariable::~ScopedVariable() {
    if (mOld)
        setenv(mName.c_str(), mOld->c_str(), 1);
    else
        unsetenv(mName.c_str());
}

DeviceFrame::DeviceFrame(int frameWidth, int frameHeight, int framePitch, int frameFormat)
    : width(frameWidth), height(frameHeight), pitch(framePitch), format(frameFormat) {
    EXPECT_EQ(Api().cuMemAlloc_v2(&data, GetByteCount()), CUDA_SUCCESS);
    // Padding of a known value shows whether a kernel writes beyond a line's end.
    EXPECT_EQ(Api().cuMemsetD8_v2(data, 0x5A, GetByteCount()), CUDA_SUCCESS);
    // The fill is queued on the default stream, for which not every stream waits.
    EXPECT_EQ(Api().cuCtxSynchronize(), CUDA_SUCCESS);
}

DeviceFrame::~DeviceFrame() { EXPECT_EQ(Api().cuMemFree_v2(data), CUDA_SUCCESS); }

std::size_t DeviceFrame::GetByteCount() const {
    return static_cast<std::size_t>(pitch) * static_cast<std::size_t>(height) * (format == 0 ? 8 : 16);
}

std::vector<unsigned char> DeviceFrame::ReadBytes() const {
    std::vector<unsigned char> bytes(GetByteCount());
    EXPECT_EQ(Api().cuMemcpyDtoH_v2(bytes.data(), data, bytes.size()), CUDA_SUCCESS);
    return bytes;
}

void DeviceFrame::WriteBytes(const std::vector<unsigned char>& bytes) {
    EXPECT_EQ(Api().cuMemcpyHtoD_v2(data, bytes.data(), bytes.size()), CUDA_SUCCESS);
}

void DeviceFrame::Write(const std::vector<Pixel>& pixels) {
    std::vector<unsigned char> bytes = ReadBytes();
    const std::size_t size = format == 0 ? 8 : 16;
    for (int y = 0; y < height; ++y)
        for (int x = 0; x < width; ++x) {
            const Pixel& pixel = pixels[static_cast<std::size_t>(y * width + x)];
            unsigned char* at = &bytes[static_cast<std::size_t>(y * pitch + x) * size];
            std::uint16_t halves[4];
            for (int i = 0; i < 4; ++i) halves[i] = SoftCuda::FloatToHalf(pixel.value[i]);
            std::memcpy(at, format == 0 ? static_cast<const void*>(halves) : pixel.value, size);
        }
    WriteBytes(bytes);
}

std::vector<Pixel> DeviceFrame::Read() const {
    const std::vector<unsigned char> bytes = ReadBytes();
    const std::size_t size = format == 0 ? 8 : 16;
    std::vector<Pixel> pixels(static_cast<std::size_t>(width * height));
    for (int y = 0; y < height; ++y)
        for (int x = 0; x < width; ++x) {
            Pixel& pixel = pixels[static_cast<std::size_t>(y * width + x)];
            const unsigned char* at = &bytes[static_cast<std::size_t>(y * pitch + x) * size];
            std::uint16_t halves[4];
            std::memcpy(format == 0 ? static_cast<void*>(halves) : pixel.value, at, size);
            for (int i = 0; format == 0 && i < 4; ++i) pixel.value[i] = SoftCuda::HalfToFloat(halves[i]);
        }
    return pixels;
}

void DriverTest::Open(const std::string& level) {
    ASSERT_NE(GetLibrary(), nullptr) << dlerror();
    ASSERT_EQ(Api().cuInit(0), CUDA_SUCCESS);
    ASSERT_EQ(Api().cuCtxCreate_v2(&mContext, 0, 0), CUDA_SUCCESS);
    const ScopedVariable variable("SOFTCUDA_LEVEL", level);
    ASSERT_EQ(Api().cuModuleLoadData(&mModule, FindImage("TestKernels")), CUDA_SUCCESS);
}

void DriverTest::Close() {
    if (mContext != nullptr) {
        EXPECT_EQ(Api().cuCtxDestroy_v2(mContext), CUDA_SUCCESS);
    }
    mContext = nullptr;
}

CUfunction DriverTest::Find(const char* kernel) const {
    CUfunction function = nullptr;
    EXPECT_EQ(Api().cuModuleGetFunction(&function, mModule, kernel), CUDA_SUCCESS) << kernel;
    return function;
}

CUresult DriverTest::Launch(const char* kernel, int width, int height, const Arguments& arguments,
                            CUstream stream) const {
    CUfunction function = Find(kernel);
    std::vector<unsigned char> bytes = arguments.GetBytes();
    EXPECT_EQ(Api().cuFuncSetBlockShape(function, 16, 16, 1), CUDA_SUCCESS);
    EXPECT_EQ(Api().cuParamSetv(function, 0, bytes.data(), static_cast<unsigned>(bytes.size())), CUDA_SUCCESS);
    EXPECT_EQ(Api().cuParamSetSize(function, static_cast<unsigned>(bytes.size())), CUDA_SUCCESS);
    return Api().cuLaunchGridAsync(function, (width + 15) / 16, (height + 15) / 16, stream);
}

std::vector<Pixel> RandomPixels(std::size_t count, std::mt19937& random, float low, float high) {
    std::uniform_real_distribution<float> distribution(low, high);
    std::vector<Pixel> pixels(count);
    for (Pixel& pixel : pixels)
        for (float& value : pixel.value) value = distribution(random);
    return pixels;
}

void ExpectNear(const std::vector<Pixel>& actual, const std::vector<Pixel>& expected, double relative, double absolute,
                int width) {
    ASSERT_EQ(actual.size(), expected.size());
    double worst = 0;
    std::string report;
    for (std::size_t i = 0; i < actual.size(); ++i)
        for (int c = 0; c < 4; ++c) {
            const double want = expected[i].value[c], got = actual[i].value[c];
            const double excess = std::abs(got - want) - (relative * std::abs(want) + absolute);
            if (!(excess <= worst)) {
                worst = excess;
                report = "at " + std::to_string(i % static_cast<std::size_t>(width)) + ", " +
                         std::to_string(i / static_cast<std::size_t>(width)) + " channel " + std::to_string(c) +
                         ": got " + std::to_string(got) + ", expected " + std::to_string(want);
            }
        }
    EXPECT_EQ(report, "");
}

}  // namespace SoftCudaTest
