// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdio>
#include <cstdlib>
#include <ctime>

#include "Kiln/FrameOperations.h"
#include "Kiln/Frames.h"
#include "Src/Filters/Effects/OneKernelEffect.h"
#include "Src/Kernels/CudaDriver.h"

/// What benchmarks of kernels on a 1080p frame share.
namespace Vantrel::Benchmarks {

constexpr std::int32_t kWidth = 1920, kHeight = 1080;

inline void Check(bool good) {
    if (good) return;
    std::fprintf(stderr, "benchmark: a kernel failed\n");
    std::exit(1);
}

/// The milliseconds that all threads worked, which other load hardly touches.
inline double WorkMilliseconds() {
    timespec time{};
    clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &time);
    return static_cast<double>(time.tv_sec) * 1e3 + static_cast<double>(time.tv_nsec) * 1e-6;
}

/// Fills the frame with one colour: effects over and over would run out of range.
inline void Refresh(const Kiln::DeviceRef& device, const KernelFrame& frame) {
    Kiln::FillWithColor(device, frame.Data(), frame.Pitch() * Vantrel::BytesPerPixel(frame.Format()), frame.Format(), 0,
                        0, kWidth, kHeight, {0.2F, 0.4F, 0.6F, 1.0F});
    Check(!Ostrand::Failed(device->Synchronize()));
}

/// Launches over the whole frame.
inline void Start(const Kiln::DeviceRef& device, const KernelFrame& frame, std::uint64_t kernel, KernelArgs& args) {
    Check(kernel != 0 && !Ostrand::Failed(args.Finish()));
    const GridSize grid = frame.Grid();
    Check(!Ostrand::Failed(device->GetCommands()->Launch(kernel, grid.x, grid.y, 16, 16, 0)));
}

/// Calls `measure(device, frame, name)` for each framework and pixel format that there is.
template <class Measure>
void ForEachDevice(const Measure& measure) {
    using Kiln::DeviceFramework;
    const struct {
        DeviceFramework framework;
        Vellum::PixelFormat format;
        const char* name;
    } kinds[] = {{DeviceFramework::kCuda, Kiln::kPixelFormat_GPU_BGRA_4444_32f, "CUDA, float"},
                 {DeviceFramework::kCuda, Kiln::kPixelFormat_GPU_BGRA_4444_16f, "CUDA, half"},
                 {DeviceFramework::kOpenCL, Kiln::kPixelFormat_GPU_BGRA_4444_32f, "OpenCL, float"},
                 {DeviceFramework::kOpenCL, Kiln::kPixelFormat_GPU_BGRA_4444_16f, "OpenCL, half"}};
    constexpr std::int32_t kCudaVersion = 4000;
    Kiln::Initialize(true);
    static_cast<void>(LoadCudaDriver(0, kCudaVersion));
    for (const auto& kind : kinds) {
        const Kiln::DeviceRef device = Kiln::GetPrimaryDevice(kind.framework);
        if (!device) continue;
        const Kiln::ScopedDeviceAccess access(device);
        VideoFrameRef frame;
        Check(!Ostrand::Failed(Kiln::CreateGPUVideoFrame(frame, device, kind.format, kWidth, kHeight, {}, 0, {})));
        measure(device, KernelFrame(frame), kind.name);
    }
    Kiln::Terminate();
}

}  // namespace Vantrel::Benchmarks
