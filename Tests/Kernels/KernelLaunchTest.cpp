// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Kernels/KernelLaunch.h"

#include <gtest/gtest.h>

#include <cstring>
#include <vector>

#include "Kiln/Frames.h"
#include "Src/Kernels/CudaDriver.h"
#include "Src/Kernels/KernelTable.h"
#include "Src/Kernels/OpenCLLibrary.h"
#include "Tests/Support/FakeDevice.h"

namespace Vantrel {
namespace {

using Kiln::DeviceFramework;
using Ostrand::kStatus_Failure;
using Ostrand::kStatus_OK;
using Ostrand::kStatus_OutOfMemory;
using Testing::FakeDevice;

constexpr DeviceFramework kFrameworks[] = {DeviceFramework::kCuda, DeviceFramework::kOpenCL};
constexpr const char* kKey = "..\\..\\Src\\Filters\\Effects\\SomeNode";

/// What the frameworks were told, and what they shall answer.
struct Frameworks {
    struct Argument {
        std::int32_t place;  ///< an offset in bytes, or an index
        std::vector<unsigned char> bytes;
    };
    std::vector<Argument> arguments;
    std::vector<unsigned> sizes;
    std::size_t failAt = ~std::size_t{0};
    std::int32_t status = 0;
    std::int32_t sizeStatus = 0;
    std::uint64_t kernel = 0;
    std::vector<std::string> lookups;
};
Frameworks* gFrameworks = nullptr;

std::int32_t Note(std::int32_t place, const void* value, std::size_t bytes) {
    const auto* first = static_cast<const unsigned char*>(value);
    gFrameworks->arguments.push_back({place, {first, first + bytes}});
    return gFrameworks->arguments.size() > gFrameworks->failAt ? gFrameworks->status : 0;
}
CUresult NoteCudaArgument(CUfunction, int offset, void* value, unsigned bytes) {
    return static_cast<CUresult>(Note(offset, value, bytes));
}
CUresult NoteSize(CUfunction, unsigned bytes) {
    gFrameworks->sizes.push_back(bytes);
    return static_cast<CUresult>(gFrameworks->sizeStatus);
}
cl_int NoteOpenCLArgument(cl_kernel, cl_uint index, std::size_t bytes, const void* value) {
    return Note(static_cast<std::int32_t>(index), value, bytes);
}
CUresult FindFunction(CUfunction* function, CUmodule, const char* name) {
    gFrameworks->lookups.emplace_back(name);
    if (gFrameworks->kernel == 0) return CUDA_ERROR_NOT_FOUND;
    *function = reinterpret_cast<CUfunction>(gFrameworks->kernel);
    return CUDA_SUCCESS;
}
cl_kernel CreateKernel(cl_program, const char* name, cl_int*) {
    gFrameworks->lookups.emplace_back(name);
    return reinterpret_cast<cl_kernel>(gFrameworks->kernel);
}

class Kernels : public ::testing::Test {
protected:
    void SetUp() override {
        gFrameworks = &frameworks;
        GetCudaDriver().cuParamSetv = &NoteCudaArgument;
        GetCudaDriver().cuParamSetSize = &NoteSize;
        GetCudaDriver().cuModuleGetFunction = &FindFunction;
        GetOpenCL() = {&CreateKernel, &NoteOpenCLArgument, mOpenCL.clFinish};
    }
    void TearDown() override {
        GetCudaDriver() = CudaDriverTable();
        GetOpenCL() = mOpenCL;
        gFrameworks = nullptr;
    }

    Frameworks frameworks;

private:
    OpenCLTable mOpenCL = GetOpenCL();
};

void MixedKernel(Vellum::PixelFormat, DeviceValue, std::int32_t, bool, Kiln::float4, float, std::uint32_t,
                 DeviceValue) {}

Status SetMixed(DeviceFramework framework, Vellum::PixelFormat format = Kiln::kPixelFormat_GPU_BGRA_4444_32f) {
    return SetKernelArgs(framework, 5, MixedKernel, format, 0x1122334455667788U, -2, true, Kiln::float4{1, 2, 3, 4},
                         0.5F, 7U, 9U);
}

template <class T>
T ValueAt(const Frameworks& frameworks, std::size_t index) {
    T value{};
    EXPECT_EQ(frameworks.arguments.at(index).bytes.size(), sizeof value) << index;
    std::memcpy(&value, frameworks.arguments[index].bytes.data(), sizeof value);
    return value;
}

TEST_F(Kernels, ArgumentsAreAlignedToTheirOwnSizeOnCudaAndCountedOnOpenCL) {
    for (const DeviceFramework framework : kFrameworks) {
        frameworks = Frameworks();
        ASSERT_EQ(SetMixed(framework), kStatus_OK);
        const bool isCuda = framework == DeviceFramework::kCuda;
        const std::vector<std::int32_t> offsets = {0, 8, 16, 20, 32, 48, 52, 56};
        ASSERT_EQ(frameworks.arguments.size(), offsets.size());
        for (std::size_t i = 0; i < offsets.size(); ++i) {
            EXPECT_EQ(frameworks.arguments[i].place, isCuda ? offsets[i] : static_cast<std::int32_t>(i));
        }
        EXPECT_EQ(ValueAt<std::int32_t>(frameworks, 0), 1) << "32-bit float pixels";
        EXPECT_EQ(ValueAt<std::uint64_t>(frameworks, 1), 0x1122334455667788U);
        EXPECT_EQ(ValueAt<std::int32_t>(frameworks, 2), -2);
        EXPECT_EQ(ValueAt<std::int32_t>(frameworks, 3), 1) << "a bool takes 32 bits";
        EXPECT_EQ(ValueAt<Kiln::float4>(frameworks, 4), (Kiln::float4{1, 2, 3, 4}));
        EXPECT_EQ(ValueAt<float>(frameworks, 5), 0.5F);
        EXPECT_EQ(frameworks.sizes, isCuda ? std::vector<unsigned>{64} : std::vector<unsigned>{});
    }
}

void FlagAndValueKernel(Vellum::PixelFormat, DeviceValue, std::int32_t) {}

TEST_F(Kernels, TheFirstFailureStopsThePackingAndIsMapped) {
    struct Row {
        DeviceFramework framework;
        std::int32_t code;
        Status status;
    };
    const Row rows[] = {
        {DeviceFramework::kCuda, 2, kStatus_OutOfMemory},    {DeviceFramework::kCuda, 1, kStatus_Failure},
        {DeviceFramework::kCuda, 700, kStatus_Failure},      {DeviceFramework::kOpenCL, -4, kStatus_OutOfMemory},
        {DeviceFramework::kOpenCL, -5, kStatus_OutOfMemory}, {DeviceFramework::kOpenCL, -6, kStatus_OutOfMemory},
        {DeviceFramework::kOpenCL, -3, kStatus_Failure},     {DeviceFramework::kOpenCL, -51, kStatus_Failure}};
    for (const Row& row : rows) {
        frameworks = Frameworks();
        frameworks.failAt = 2;
        frameworks.status = row.code;
        EXPECT_EQ(SetMixed(row.framework), row.status) << row.code;
        EXPECT_EQ(frameworks.arguments.size(), 3U);
        EXPECT_TRUE(frameworks.sizes.empty());
    }
    frameworks = Frameworks();
    frameworks.sizeStatus = 2;
    EXPECT_EQ(SetMixed(DeviceFramework::kCuda), kStatus_OutOfMemory);
}

TEST_F(Kernels, LaunchRunsAfterSoundArgumentsOnlyAndPassesItsStatusOn) {
    for (const DeviceFramework framework : kFrameworks) {
        frameworks = Frameworks();
        const auto device = boost::make_shared<FakeDevice>(framework, 0);
        device->Commands().status = 12345;
        EXPECT_EQ(
            Launch2D(device, 5, GridFor(17, 16), {}, FlagAndValueKernel, Kiln::kPixelFormat_GPU_BGRA_4444_16f, 3U, 4),
            12345);
        ASSERT_EQ(device->Commands().calls.size(), 1U);
        const auto& call = device->Commands().calls[0];
        EXPECT_EQ(call.kernel, 5U);
        EXPECT_EQ(call.gridX, 2);
        EXPECT_EQ(call.gridY, 1);
        EXPECT_EQ(call.blockX, 16);
        EXPECT_EQ(call.blockY, 16);
        EXPECT_EQ(call.reserved, 0U);

        frameworks.failAt = 0;
        frameworks.status = framework == DeviceFramework::kCuda ? 2 : -4;
        EXPECT_EQ(Launch2D(device, 5, {1, 1}, {8, 4}, FlagAndValueKernel, Kiln::kPixelFormat_GPU_BGRA_4444_16f, 3U, 4),
                  kStatus_OutOfMemory);
        EXPECT_EQ(device->Commands().calls.size(), 1U);
    }
}

TEST_F(Kernels, AKernelIsLookedUpOncePerContextAndSoIsItsAbsence) {
    for (const DeviceFramework framework : kFrameworks) {
        frameworks = Frameworks();
        KernelTable table;
        const auto device = boost::make_shared<FakeDevice>(framework, 2);
        device->module = 0;
        EXPECT_EQ(GetKernel(table, device, kKey, "SomeKernel"), 0U);
        EXPECT_EQ(GetKernel(table, device, kKey, "SomeKernel"), 0U);
        EXPECT_EQ(device->asked, std::vector<std::string>{kKey}) << "a missing module isn't asked for again";
        EXPECT_TRUE(frameworks.lookups.empty());

        device->identity = 2;
        device->module = 100;
        frameworks.kernel = 77;
        EXPECT_EQ(GetKernel(table, device, kKey, "SomeKernel"), 77U);
        frameworks.kernel = 78;
        EXPECT_EQ(GetKernel(table, device, kKey, "SomeKernel"), 77U);
        EXPECT_EQ(frameworks.lookups, std::vector<std::string>{"SomeKernel"});

        device->identity = 3;
        frameworks.kernel = 0;
        EXPECT_EQ(GetKernel(table, device, kKey, "SomeKernel"), 0U) << "the old context's kernel must be gone";
        EXPECT_EQ(device->asked.size(), 3U);
    }
}

TEST_F(Kernels, EachDeviceOfEachFrameworkHasItsOwnSlot) {
    KernelTable table;
    std::uint64_t expected = 10;
    std::vector<boost::shared_ptr<FakeDevice>> devices;
    for (const DeviceFramework framework : kFrameworks) {
        for (std::uint32_t index = 0; index < 4; ++index) {
            devices.push_back(boost::make_shared<FakeDevice>(framework, index));
            frameworks.kernel = expected++;
            EXPECT_EQ(GetKernel(table, devices.back(), kKey, "SomeKernel"), frameworks.kernel);
        }
    }
    frameworks.kernel = 0;
    expected = 10;
    for (const auto& device : devices) EXPECT_EQ(GetKernel(table, device, kKey, "SomeKernel"), expected++);
}

TEST(PixelPitch, FollowsTheFormatsLayoutAndElementWidth) {
    struct Row {
        Vellum::PixelFormat format;
        std::int32_t bytes;
    };
    const auto device = [](std::uint32_t layout, bool narrow) {
        return Vellum::PixelFormat(1U << 18 | layout << 1 | (narrow ? 1U << 11 : 0), 0);
    };
    const Row rows[] = {{Kiln::kPixelFormat_GPU_BGRA_4444_32f, 16},
                        {Kiln::kPixelFormat_GPU_BGRA_4444_16f, 8},
                        {Kiln::kPixelFormat_GPU_BGRX_4444_16f, 8},
                        {device(0, false), 4},
                        {device(2, false), 8},
                        {device(1, false), 0},
                        {Vellum::PixelFormat(2U << 18, 0), 0},
                        {Vellum::PixelFormat(), 0}};
    for (const Row& row : rows) EXPECT_EQ(Vantrel::BytesPerPixel(row.format), row.bytes) << row.format.GetValue();
    EXPECT_EQ(PitchInPixels(1024, Kiln::kPixelFormat_GPU_BGRA_4444_16f), 128);
    EXPECT_EQ(PitchInPixels(1024, Kiln::kPixelFormat_GPU_BGRA_4444_32f), 64);
    EXPECT_EQ(PitchInPixels(1024, Vellum::PixelFormat()), 0);
}

}  // namespace
}  // namespace Vantrel
