// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

// What runs on 1080p frames of a device, measured against a plain copy. After each run the processor copies a frame of
// the same format with memcpy on one core; `of_copy` is the run's time over the copy's, which stays put when the
// machine's speed doesn't.

#include <benchmark/benchmark.h>

#include <algorithm>
#include <array>
#include <chrono>
#include <cstring>
#include <ctime>
#include <string>
#include <vector>

#include "Kiln/Device.h"
#include "Kiln/FrameOperations.h"
#include "Kiln/Frames.h"

namespace Vantrel::Benchmarks {

using Kiln::VideoFrameRef;
using Vellum::PixelFormat;

constexpr std::int32_t kWidth = 1920;
constexpr std::int32_t kHeight = 1080;

inline double Seconds() {
    return std::chrono::duration<double>(std::chrono::steady_clock::now().time_since_epoch()).count();
}

/// Of all threads.
inline double WorkSeconds() {
    timespec time{};
    clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &time);
    return static_cast<double>(time.tv_sec) + static_cast<double>(time.tv_nsec) * 1e-9;
}

inline std::uint64_t DataOf(const VideoFrameRef& frame) { return Ostrand::Demand<Marl::IFrameData>(frame)->GetData(); }
inline std::int32_t RowBytesOf(const VideoFrameRef& frame) {
    return Ostrand::Demand<Marl::IFrameRows>(frame)->GetRowBytes();
}

/// A device with frames enough that none is in a cache when its turn comes, and memory to copy.
class FrameBench {
public:
    FrameBench(Kiln::DeviceFramework framework, PixelFormat pixelFormat)
        : device(Kiln::GetPrimaryDevice(framework)), access(device), format(pixelFormat) {
        if (!device) return;
        for (VideoFrameRef& frame : frames) frame = MakeFrame(format, kWidth, kHeight);
        const std::size_t bytes = static_cast<std::size_t>(kWidth) * kHeight * Vellum::BytesPerPixel(format);
        mFrom.assign(bytes, 1);
        mTo.assign(bytes, 2);
    }

    [[nodiscard]] VideoFrameRef MakeFrame(PixelFormat frameFormat, std::int32_t width, std::int32_t height) const {
        VideoFrameRef frame;
        if (Ostrand::Failed(Kiln::CreateGPUVideoFrame(frame, device, frameFormat, width, height, {}, 0, {}))) return {};
        Kiln::FillWithColor(device, DataOf(frame), RowBytesOf(frame), frameFormat, 0, 0, width, height,
                            {0.2F, 0.4F, 0.6F, 1.0F});
        return frame;
    }

    /// Runs `operation(target, source)` once an iteration and waits for it.
    template <class Operation>
    void Measure(benchmark::State& state, const Operation& operation) {
        const auto run = [&](std::size_t turn) {
            const Ostrand::Status status = operation(frames[turn % kFrames], frames[(turn + kFrames / 2) % kFrames]);
            return !Ostrand::Failed(status) && !Ostrand::Failed(device->Synchronize());
        };
        // Not measured: the first run builds what the platform builds late.
        if (!run(0)) return state.SkipWithError("the operation failed");
        double best = 1e9;
        double bestCopy = 1e9;
        double worked = 0.0;
        std::size_t turn = 0;
        for (auto _ : state) {
            const double workStart = WorkSeconds();
            const double start = Seconds();
            if (!run(turn++)) return state.SkipWithError("the operation failed");
            const double elapsed = Seconds() - start;
            worked += WorkSeconds() - workStart;
            state.SetIterationTime(elapsed);
            best = std::min(best, elapsed);
            const double copyStart = Seconds();
            std::memcpy(mTo.data(), mFrom.data(), mTo.size());
            benchmark::ClobberMemory();
            bestCopy = std::min(bestCopy, Seconds() - copyStart);
        }
        state.counters["of_copy"] = best / bestCopy;
        state.counters["core_ms"] = worked * 1e3 / static_cast<double>(turn);
    }

    static constexpr std::size_t kFrames = 4;
    Kiln::DeviceRef device;
    Kiln::ScopedDeviceAccess access;
    PixelFormat format;
    std::array<VideoFrameRef, kFrames> frames;

private:
    std::vector<unsigned char> mFrom;
    std::vector<unsigned char> mTo;
};

/// One measurement of a list.
struct Entry {
    const char* name;
    void (*body)(benchmark::State& state, FrameBench& bench);
};

/// Registers each entry on each device, in the formats that it works in.
template <std::size_t N>
void RegisterOnEachDevice(const Entry (&entries)[N]) {
    const struct {
        Kiln::DeviceFramework framework;
        PixelFormat format;
        const char* name;
    } kCases[] = {{Kiln::DeviceFramework::kCuda, Kiln::kPixelFormat_GPU_BGRA_4444_32f, "Cuda 32f"},
                  {Kiln::DeviceFramework::kCuda, Kiln::kPixelFormat_GPU_BGRA_4444_16f, "Cuda 16f"},
                  {Kiln::DeviceFramework::kOpenCL, Kiln::kPixelFormat_GPU_BGRA_4444_32f, "OpenCL 32f"}};
    for (const auto& each : kCases) {
        for (const Entry& entry : entries) {
            const auto run = [each, &entry](benchmark::State& state) {
                FrameBench bench(each.framework, each.format);
                if (!bench.device) {
                    state.SkipWithError(Kiln::GetFrameworkMessage(each.framework).c_str());
                    return;
                }
                entry.body(state, bench);
            };
            benchmark::RegisterBenchmark((std::string(each.name) + ", " + entry.name).c_str(), run)
                ->UseManualTime()
                ->Unit(benchmark::kMillisecond);
        }
    }
}

}  // namespace Vantrel::Benchmarks
