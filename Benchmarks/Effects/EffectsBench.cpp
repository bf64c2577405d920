// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0

// Kernels of nodes, launched as their nodes do.

#include "Benchmarks/Support/FrameBench.h"
#include "Src/Kernels/CudaDriver.h"
#include "Src/Kernels/KernelLaunch.h"
#include "Src/Kernels/KernelTable.h"

namespace Vantrel::Benchmarks {
namespace {

/// A kernel that reads two frames, the first of which it writes.
void AdditiveDissolveKernel(DeviceValue, std::int32_t, DeviceValue, std::int32_t, DeviceValue, std::int32_t,
                            Vellum::PixelFormat, std::int32_t, std::int32_t, float) {}

void AdditiveDissolve(benchmark::State& state, FrameBench& bench) {
    KernelTable table{};
    const std::uint64_t kernel = GetKernel(
        table, bench.device, "..\\..\\Src\\Filters\\Transitions\\AdditiveDissolveNode", "AdditiveDissolveKernel");
    if (kernel == 0) return state.SkipWithError("the kernel isn't there");
    bench.Measure(state, [&](const VideoFrameRef& target, const VideoFrameRef& source) {
        const auto pitch = [&](const VideoFrameRef& frame) { return PitchInPixels(RowBytesOf(frame), bench.format); };
        return Launch2D(bench.device, kernel, GridFor(kWidth, kHeight), {}, AdditiveDissolveKernel, DataOf(target),
                        pitch(target), DataOf(source), pitch(source), DataOf(target), pitch(target), bench.format,
                        kWidth, kHeight, 0.3F);
    });
}

constexpr Entry kKernels[] = {
    {"additive dissolve, in place", &AdditiveDissolve},
};

}  // namespace
}  // namespace Vantrel::Benchmarks

int main(int argc, char** argv) {
    benchmark::Initialize(&argc, argv);
    Kiln::Initialize(true);
    // As the engine binds it; without a driver the CUDA entries say so.
    constexpr std::int32_t kRequiredCudaVersion = 4000;
    static_cast<void>(Vantrel::LoadCudaDriver(0, kRequiredCudaVersion));
    Vantrel::Benchmarks::RegisterOnEachDevice(Vantrel::Benchmarks::kKernels);
    benchmark::RunSpecifiedBenchmarks();
    Kiln::Terminate();
    return 0;
}
