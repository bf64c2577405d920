// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <unistd.h>

#include <cstdlib>
#include <cstring>
#include <filesystem>

#include "Halden/Trace.h"
#include "Kiln/KernelLaunch.h"
#include "Kiln/Scratch.h"
#include "Tests/Kiln/OnEachFramework.h"

namespace Kiln {
namespace {

constexpr const char* kProbe = "..\\..\\Tests\\Kiln\\Probe";

struct Color {
    float blue, green, red, alpha;
};
constexpr Kernel<std::uint64_t, std::int32_t, std::int32_t, std::int32_t, std::uint64_t, float, Color,
                 Vellum::PixelFormat, bool>
    kTell{kProbe, "TellKernel"};
constexpr Kernel<std::uint64_t, std::int32_t, float, float> kStep{kProbe, "StepKernel"};

class ModuleOnEachFramework : public OnEachFramework {
protected:
    std::vector<float> ReadFloats(std::uint64_t block, std::size_t count) {
        const auto bytes = ReadBytes(block, count * sizeof(float));
        std::vector<float> floats(count);
        std::memcpy(floats.data(), bytes.data(), bytes.size());
        return floats;
    }
};
KILN_ON_EACH_FRAMEWORK(ModuleOnEachFramework);

TEST_P(ModuleOnEachFramework, ArgumentsAndThreadsArrive) {
    constexpr std::int32_t kWidth = 37;
    constexpr std::int32_t kHeight = 18;
    const DeviceScratchBuffer places(mDevice, kWidth * kHeight * sizeof(float));
    const DeviceScratchBuffer told(mDevice, 6 * sizeof(float));
    const ScopedDeviceAccess access(mDevice);
    ASSERT_EQ(
        kTell.Launch(mDevice, ShapeFor(kWidth, kHeight), places.GetHandle(), kWidth, kHeight, -7, told.GetHandle(),
                     2.5F, Color{0.25F, 0.0F, 0.0F, 0.75F}, kPixelFormat_GPU_BGRA_4444_32f, true),
        0)
        << mDevice->GetModuleMessage(kProbe);
    EXPECT_EQ(ReadFloats(told.GetHandle(), 6), (std::vector<float>{-7.0F, 2.5F, 0.25F, 0.75F, 1.0F, 1.0F}));
    const auto seen = ReadFloats(places.GetHandle(), kWidth * kHeight);
    for (std::int32_t i = 0; i < kWidth * kHeight; ++i) {
        ASSERT_EQ(seen[static_cast<std::size_t>(i)], static_cast<float>(1000 * (i / kWidth) + i % kWidth));
    }
    ASSERT_EQ(kTell.Launch(mDevice, ShapeFor(1, 1), places.GetHandle(), 1, 1, 3, told.GetHandle(), 0.0F, Color{},
                           kPixelFormat_GPU_BGRX_4444_16f, false),
              0);
    EXPECT_EQ(ReadFloats(told.GetHandle(), 6), (std::vector<float>{3.0F, 0.0F, 0.0F, 0.0F, 0.0F, 0.0F}));
}

TEST_P(ModuleOnEachFramework, QueuedWorkRunsInOrderAndBlocksPassOnInIt) {
    constexpr std::int32_t kCount = 4096;
    const ScopedDeviceAccess access(mDevice);
    std::vector<float> zeros(kCount, 0.0F);
    const DeviceScratchBuffer kept(mDevice, kCount * sizeof(float));
    ASSERT_EQ(mDevice->GetCommands()->CopyHostToDevice(zeros.data(), kept.GetHandle(), kCount * 4, nullptr), 0);
    for (int round = 0; round < 20; ++round) {
        // Each round gets the block that the round before gave back while its work was still queued.
        const DeviceScratchBuffer scratch(mDevice, 1U << 20);
        const std::vector<float> start(kCount, static_cast<float>(round));
        ASSERT_EQ(mDevice->GetCommands()->CopyHostToDevice(start.data(), scratch.GetHandle(), kCount * 4, nullptr), 0);
        ASSERT_EQ(kStep.Launch(mDevice, ShapeFor(kCount, 1), scratch.GetHandle(), kCount, 2.0F, 1.0F), 0);
        if (round != 9) continue;
        ASSERT_EQ(mDevice->GetBackend().CopyRows(kept.GetHandle(), {0, kCount * 4}, scratch.GetHandle(),
                                                 {0, kCount * 4}, kCount * 4, 1),
                  0);
    }
    ASSERT_EQ(kStep.Launch(mDevice, ShapeFor(kCount, 1), kept.GetHandle(), kCount, 10.0F, 0.5F), 0);
    EXPECT_EQ(ReadFloats(kept.GetHandle(), kCount), std::vector<float>(kCount, 190.5F));
}

TEST_P(ModuleOnEachFramework, MissesAreTracedAndTold) {
    std::string traced;
    Halden::debug::SetTraceSink([&traced](const std::string& line) { traced += line + "\n"; });
    Halden::debug::SetTraceLevel("Kiln.Module", 10);
    const ScopedDeviceAccess access(mDevice);
    EXPECT_EQ(mDevice->FindModule("..\\..\\Src\\Nowhere"), 0U);
    EXPECT_NE(mDevice->GetModuleMessage("..\\..\\Src\\Nowhere"), "");
    EXPECT_NE(traced.find("Nowhere"), std::string::npos);
    EXPECT_NE(mDevice->FindModule(kProbe), 0U);
    EXPECT_EQ(mDevice->FindModule(kProbe), mDevice->FindModule(kProbe));
    EXPECT_EQ(mDevice->GetModuleMessage(kProbe), "");
    EXPECT_EQ(mDevice->FindKernel(kProbe, "NoSuchKernel"), 0U);
    EXPECT_NE(traced.find("NoSuchKernel"), std::string::npos);

    // Neither form is sound. Adding the key once more makes it looked for again.
    static const char kSource[] = "__kernel void Broken(__global float* out) { out[0] = undeclaredThing; }";
    static const char kNoImage[64] = "not an image";
    static const ModuleImage kBroken = {"Broken",        kSource,  sizeof kSource - 1, kNoImage,
                                        sizeof kNoImage, kNoImage, sizeof kNoImage};
    EXPECT_EQ(mDevice->FindModule("Broken"), 0U);
    AddModules(&kBroken, 1);
    EXPECT_EQ(mDevice->FindModule("Broken"), 0U);
    const std::string message = mDevice->GetModuleMessage("Broken");
    const bool isOpenCL = GetParam() == DeviceFramework::kOpenCL;
    EXPECT_NE(message.find(isOpenCL ? "undeclaredThing" : "driver"), std::string::npos) << message;
    EXPECT_NE(traced.find("\"Broken\""), std::string::npos);
    Halden::debug::SetTraceLevel("Kiln.Module", -1);
    Halden::debug::SetTraceSink({});
}

TEST(OpenCLBinaryCache, ServesAgainAndSurvivesDamage) {
    const auto folder = std::filesystem::temp_directory_path() / ("kiln-cache-" + std::to_string(::getpid()));
    const char* inherited = std::getenv("KILN_CACHE_DIR");
    const std::string previous = inherited ? inherited : "";
    ::setenv("KILN_CACHE_DIR", folder.c_str(), 1);
    const auto build = [] {
        Initialize(true);
        const DeviceRef device = GetPrimaryDevice(DeviceFramework::kOpenCL);
        std::uint64_t module = 0;
        if (device) {
            const ScopedDeviceAccess access(device);
            module = device->FindModule(kProbe);
        }
        Terminate();
        return module != 0;
    };
    const auto listSizes = [&folder] {
        std::vector<std::uintmax_t> sizes;
        std::error_code error;
        for (const auto& file : std::filesystem::directory_iterator(folder, error)) sizes.push_back(file.file_size());
        return sizes;
    };
    EXPECT_TRUE(build());
    const auto sizes = listSizes();
    ASSERT_EQ(sizes.size(), 1U) << "one program, and no draft of it";
    EXPECT_TRUE(build());
    const auto file = std::filesystem::directory_iterator(folder)->path();
    std::filesystem::resize_file(file, sizes[0] / 2);
    EXPECT_TRUE(build());
    EXPECT_EQ(listSizes(), sizes) << "the damaged file was replaced";
    ::setenv("KILN_CACHE_DIR", "/dev/null/nowhere", 1);
    EXPECT_TRUE(build()) << "a cache that can't be written is no obstacle";
    std::filesystem::remove_all(folder);
    inherited ? ::setenv("KILN_CACHE_DIR", previous.c_str(), 1) : ::unsetenv("KILN_CACHE_DIR");
}

}  // namespace
}  // namespace Kiln
