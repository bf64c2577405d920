// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0

// Pointwise launches run together give what they give alone, to the bit.

#include <array>
#include <chrono>
#include <memory>
#include <thread>

#include "Tests/SoftCuda/DriverFixture.h"

namespace SoftCudaTest {

namespace {

SoftCudaCounters ReadCounters() {
    SoftCudaCounters counters;
    Api().SoftCudaGetCounters(&counters);
    return counters;
}

}  // namespace

class FusionTest : public DriverTest {
protected:
    static constexpr int kFrames = 4;
    using Frames = std::array<std::unique_ptr<DeviceFrame>, kFrames>;

    void TearDown() override {
        Api().SoftCudaSetFusing(1);
        DriverTest::TearDown();
    }

    Frames MakeFrames(int width, int height, int format, unsigned seed) const {
        std::mt19937 random(seed);
        Frames frames;
        for (auto& frame : frames) {
            frame = std::make_unique<DeviceFrame>(width, height, width + static_cast<int>(random() % 7), format);
            frame->Write(RandomPixels(static_cast<std::size_t>(width * height), random));
        }
        return frames;
    }

    /// One launch of a random kernel on random frames, of which some may be the same one.
    void LaunchRandom(const Frames& frames, CUdeviceptr table, std::mt19937& random, CUstream stream) const {
        const std::size_t first = random() % kFrames;
        const DeviceFrame &a = *frames[first], &b = *frames[random() % kFrames], &c = *frames[random() % kFrames];
        // What reads elsewhere than it writes, by a gather or through a pointer, needs two frames.
        const DeviceFrame& other = *frames[(first + 1 + random() % (kFrames - 1)) % kFrames];
        const float t = static_cast<float>(random() % 100) * 0.01F;
        const int w = a.width, h = a.height, f = a.format;
        const auto launch = [&](const char* kernel, const Arguments& arguments) {
            Run(kernel, w, h, arguments, stream);
        };
        switch (random() % 9) {
            case 0:
                return launch("InvertKernel", Arguments(f, a.data, w, h, a.pitch, b.data, b.pitch, t));
            case 1:
            case 2:
                return launch("GainKernel", Arguments(a.data, a.pitch, f, w, h, 0.5F + t, t));
            case 3:
                return launch("BlendKernel", Arguments(a.data, a.pitch, b.data, b.pitch, c.data, c.pitch, f, w, h, t));
            case 4:
                return launch("OverKernel", Arguments(a.data, a.pitch, b.data, b.pitch, c.data, c.pitch, f, w, h));
            case 5:
                return launch("LookupKernel", Arguments(a.data, a.pitch, f, w, h, table, 64));
            case 6:
                return launch("LookupKernel", Arguments(a.data, a.pitch, f, w, h, other.data, 8));
            case 7:
                return launch("RampKernel", Arguments(a.data, a.pitch, f, w, h, Pixel{{0.001F, 0.002F, t, 1.0F}}));
            default:
                return launch("ShiftKernel", Arguments(f, other.data, other.pitch, a.data, a.pitch, w, h, t * 3.0F));
        }
    }

    std::vector<std::vector<unsigned char>> RunChain(bool fusing, int width, int height, int format,
                                                     unsigned seed) const {
        Api().SoftCudaSetFusing(fusing ? 1 : 0);
        const Frames frames = MakeFrames(width, height, format, seed);
        DeviceFrame table(64, 1, 64, 1);
        std::mt19937 random(seed);
        table.Write(RandomPixels(64, random));
        CUstream stream = nullptr;
        CHECK_CUDA(cuStreamCreate(&stream, 0));
        const int links = 2 + static_cast<int>(random() % 12);
        for (int i = 0; i < links; ++i) LaunchRandom(frames, table.data, random, stream);
        CHECK_CUDA(cuStreamDestroy_v2(stream));
        std::vector<std::vector<unsigned char>> bytes;
        for (const auto& frame : frames) bytes.push_back(frame->ReadBytes());
        return bytes;
    }
};

TEST_F(FusionTest, RandomChainsGiveTheSameBytesFusedAndAlone) {
    constexpr std::pair<int, int> kSizes[] = {{1, 1}, {17, 5}, {256, 3}, {257, 9}, {640, 40}, {1000, 33}};
    for (const char* level : {"v2", "v4"}) {
        Close();
        Open(level);
        for (unsigned seed = 1; seed <= 36; ++seed) {
            const auto [width, height] = kSizes[seed % 6];
            const int format = static_cast<int>(seed / 6 % 2);
            SCOPED_TRACE("seed " + std::to_string(seed) + ", level " + level);
            const SoftCudaCounters before = ReadCounters();
            const auto alone = RunChain(false, width, height, format, seed);
            const SoftCudaCounters between = ReadCounters();
            const auto fused = RunChain(true, width, height, format, seed);
            ASSERT_EQ(alone, fused);
            EXPECT_EQ(between.fused, before.fused);
        }
    }
    EXPECT_GT(ReadCounters().fused, 100U);
}

TEST_F(FusionTest, AChainInPlaceTakesOnePassAndAnythingElseEndsIt) {
    DeviceFrame frame(64, 64, 64, 1);
    frame.Write(std::vector<Pixel>(64 * 64, Pixel{{1.0F, 1.0F, 1.0F, 1.0F}}));
    CUstream stream = nullptr;
    CHECK_CUDA(cuStreamCreate(&stream, 0));
    const Arguments twice(frame.data, 64, 1, 64, 64, 2.0F, 0.0F);
    // Work in front keeps the stream busy until all are queued.
    const auto queue = [&](bool fillBetween) {
        Api().cuMemsetD8_v2(frame.data, 0, 0);
        for (int i = 0; i < 6; ++i) {
            Run("GainKernel", 64, 64, twice, stream);
            if (fillBetween && i == 2) {
                const CUdeviceptr row = frame.data + 16 * 64;
                CHECK_CUDA(cuMemcpyDtoDAsync_v2(row, frame.data, 16 * 64, stream));
            }
        }
        CHECK_CUDA(cuStreamSynchronize(stream));
    };
    const SoftCudaCounters before = ReadCounters();
    queue(false);
    const SoftCudaCounters after = ReadCounters();
    EXPECT_EQ(after.pointwise - before.pointwise, 6U);
    EXPECT_EQ((after.passes - before.passes) + (after.fused - before.fused), 6U);
    EXPECT_EQ(frame.Read()[65].value[0], 64.0F);

    queue(true);
    EXPECT_EQ(frame.Read()[65].value[0], 4096.0F);
    CHECK_CUDA(cuStreamDestroy_v2(stream));
}

TEST_F(FusionTest, ALoneLaunchBeginsByItself) {
    DeviceFrame frame(32, 32, 32, 1);
    CUstream stream = nullptr;
    CHECK_CUDA(cuStreamCreate(&stream, 0));
    const SoftCudaCounters before = ReadCounters();
    Run("RampKernel", 32, 32, Arguments(frame.data, 32, 1, 32, 32, Pixel{{1, 1, 1, 1}}), stream);
    // Nobody waits for it: only the driver's own clock can end the wait for a companion.
    for (int i = 0; i < 10000 && Api().cuStreamQuery(stream) == CUDA_ERROR_NOT_READY; ++i)
        std::this_thread::sleep_for(std::chrono::milliseconds(1));
    CHECK_CUDA(cuStreamQuery(stream));
    EXPECT_EQ(ReadCounters().timerFlushes - before.timerFlushes, 1U);
    CHECK_CUDA(cuStreamDestroy_v2(stream));
}

}  // namespace SoftCudaTest
