// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0

// Kiln's frame operations on 1080p frames. After each run of an operation the processor copies a frame of the same
// format with memcpy on one core; `of_copy` is the operation's time over the copy's, which stays put when the machine's
// speed doesn't.

#include <benchmark/benchmark.h>

#include <algorithm>
#include <array>
#include <chrono>
#include <cstring>
#include <ctime>
#include <memory>
#include <string>
#include <vector>

#include "Kiln/Device.h"
#include "Kiln/FrameOperations.h"
#include "Kiln/Frames.h"

namespace {

using Kiln::VideoFrameRef;
using Vellum::PixelFormat;
using Vellum::RenderQuality;

constexpr std::int32_t kWidth = 1920;
constexpr std::int32_t kHeight = 1080;

double Seconds() { return std::chrono::duration<double>(std::chrono::steady_clock::now().time_since_epoch()).count(); }

/// Of all threads.
double WorkSeconds() {
    timespec time{};
    clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &time);
    return static_cast<double>(time.tv_sec) + static_cast<double>(time.tv_nsec) * 1e-9;
}

std::uint64_t DataOf(const VideoFrameRef& frame) { return Ostrand::Demand<Marl::IFrameData>(frame)->GetData(); }
std::int32_t RowBytesOf(const VideoFrameRef& frame) { return Ostrand::Demand<Marl::IFrameRows>(frame)->GetRowBytes(); }

/// A device with frames enough that none is in a cache when its turn comes, and memory to copy.
class Bench {
public:
    Bench(Kiln::DeviceFramework framework, PixelFormat pixelFormat)
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

using Body = void (*)(benchmark::State& state, Bench& bench);

Ostrand::Status Draw(const Bench& bench, const VideoFrameRef& target, const VideoFrameRef& source, float scale,
                     float rotation, float opacity, std::int32_t mode, RenderQuality quality) {
    return Kiln::Motion(bench.device, DataOf(source), RowBytesOf(source), 0, 0, kWidth, kHeight, 1, 1, DataOf(target),
                        RowBytesOf(target), 0, 0, kWidth, kHeight, 1, 1, bench.format, 0.5F, 0.5F, 0.5F, 0.5F, scale,
                        scale, rotation, opacity, mode, true, quality);
}

/// A drawing as a benchmark's body.
template <int kScalePercent, int kDegrees, std::int32_t kMode, RenderQuality kQuality>
void DrawLayer(benchmark::State& state, Bench& bench) {
    bench.Measure(state, [&](const VideoFrameRef& target, const VideoFrameRef& source) {
        return Draw(bench, target, source, kScalePercent / 100.0F, kDegrees, 0.8F, kMode, kQuality);
    });
}

void DrawTwoLayers(benchmark::State& state, Bench& bench) {
    bench.Measure(state, [&](const VideoFrameRef& target, const VideoFrameRef& source) {
        const auto status = Draw(bench, target, source, 1.1F, 5.0F, 1.0F, Kiln::kBlend_Normal, RenderQuality::kMedium);
        if (Ostrand::Failed(status)) return status;
        return Draw(bench, target, source, 0.9F, -10.0F, 0.7F, Kiln::kBlend_Normal, RenderQuality::kMedium);
    });
}

void Fill(benchmark::State& state, Bench& bench) {
    bench.Measure(state, [&](const VideoFrameRef& target, const VideoFrameRef&) {
        return Kiln::FillWithOpaqueBlack(bench.device, DataOf(target), RowBytesOf(target), bench.format, 0, 0, kWidth,
                                         kHeight);
    });
}

void FillOnePixel(benchmark::State& state, Bench& bench) {
    bench.Measure(state, [&](const VideoFrameRef& target, const VideoFrameRef&) {
        return Kiln::FillWithOpaqueBlack(bench.device, DataOf(target), RowBytesOf(target), bench.format, 0, 0, 1, 1);
    });
}

void CopySameFormat(benchmark::State& state, Bench& bench) {
    bench.Measure(state, [](const VideoFrameRef& target, const VideoFrameRef& source) {
        return Kiln::CopyFrame(source, target, RenderQuality::kHigh);
    });
}

void ConvertFrom(benchmark::State& state, Bench& bench, PixelFormat layout, std::uint32_t alphaType) {
    const VideoFrameRef host =
        Kiln::CreateHostVideoFrame(layout, kWidth, kHeight, Vellum::kPixelAspectRatio_Square, 0, {});
    const VideoFrameRef upload = Kiln::AllocateHostFrameForUpload(bench.device, host, RenderQuality::kHigh, {});
    if (Ostrand::Failed(Kiln::CopyToHostFrame(upload, host, RenderQuality::kHigh))) return;
    upload->SetAlphaType(alphaType);
    const VideoFrameRef unconverted = Kiln::CopyToDevice(upload);
    bench.Measure(state, [&](const VideoFrameRef& target, const VideoFrameRef&) {
        return Kiln::ConvertFrame(unconverted, target);
    });
}
void ConvertBytes(benchmark::State& state, Bench& bench) {
    ConvertFrom(state, bench, Vellum::kPixelFormat_BGRA_4444_8u, Vellum::kAlphaType_Straight);
}
void ConvertVideoLevels(benchmark::State& state, Bench& bench) {
    ConvertFrom(state, bench, Vellum::kPixelFormat_VUYA_4444_8u_709, Vellum::kAlphaType_Straight);
}
void ConvertPremultiplied(benchmark::State& state, Bench& bench) {
    ConvertFrom(state, bench, Vellum::kPixelFormat_BGRA_4444_8u, Vellum::kAlphaType_Premultiplied);
}

void Deinterlace(benchmark::State& state, Bench& bench) {
    bench.Measure(state,
                  [](const VideoFrameRef& target, const VideoFrameRef&) { return Kiln::DeinterlaceFrame(target, 0); });
}

void ReduceFrom4K(benchmark::State& state, Bench& bench) {
    const VideoFrameRef large = bench.MakeFrame(bench.format, 2 * kWidth, 2 * kHeight);
    bench.Measure(state, [&](const VideoFrameRef& target, const VideoFrameRef&) {
        return Kiln::CopyFrame(large, target, RenderQuality::kHigh);
    });
}

constexpr struct {
    const char* name;
    Body body;
} kBodies[] = {
    {"launch overhead (fill of one pixel)", &FillOnePixel},
    {"fill", &Fill},
    {"copy", &CopySameFormat},
    {"convert from 8-bit BGRA", &ConvertBytes},
    {"convert from 8-bit BGRA, premultiplied", &ConvertPremultiplied},
    {"convert from video levels", &ConvertVideoLevels},
    {"deinterlace", &Deinterlace},
    {"motion, in place", &DrawLayer<100, 0, Kiln::kBlend_Normal, RenderQuality::kHigh>},
    {"motion, in place, soft light", &DrawLayer<100, 0, Kiln::kBlend_SoftLight, RenderQuality::kHigh>},
    {"motion, bilinear, scaled", &DrawLayer<120, 0, Kiln::kBlend_Normal, RenderQuality::kMedium>},
    {"motion, bilinear, turned", &DrawLayer<120, 5, Kiln::kBlend_Normal, RenderQuality::kMedium>},
    {"motion, bicubic, scaled", &DrawLayer<120, 0, Kiln::kBlend_Normal, RenderQuality::kHigh>},
    {"motion, bicubic, turned", &DrawLayer<120, 5, Kiln::kBlend_Normal, RenderQuality::kHigh>},
    {"motion, bicubic, reduced and turned", &DrawLayer<70, 5, Kiln::kBlend_Normal, RenderQuality::kHigh>},
    {"two layers, bilinear, turned", &DrawTwoLayers},
    {"4K to 1080p, bicubic", &ReduceFrom4K},
};

void RegisterAll() {
    const struct {
        Kiln::DeviceFramework framework;
        PixelFormat format;
        const char* name;
    } kCases[] = {{Kiln::DeviceFramework::kCuda, Kiln::kPixelFormat_GPU_BGRA_4444_32f, "Cuda 32f"},
                  {Kiln::DeviceFramework::kCuda, Kiln::kPixelFormat_GPU_BGRA_4444_16f, "Cuda 16f"},
                  {Kiln::DeviceFramework::kOpenCL, Kiln::kPixelFormat_GPU_BGRA_4444_32f, "OpenCL 32f"}};
    for (const auto& each : kCases) {
        for (const auto& body : kBodies) {
            const auto run = [each, &body](benchmark::State& state) {
                Bench bench(each.framework, each.format);
                if (!bench.device) {
                    state.SkipWithError(Kiln::GetFrameworkMessage(each.framework).c_str());
                    return;
                }
                body.body(state, bench);
            };
            benchmark::RegisterBenchmark((std::string(each.name) + ", " + body.name).c_str(), run)
                ->UseManualTime()
                ->Unit(benchmark::kMillisecond);
        }
    }
}

}  // namespace

int main(int argc, char** argv) {
    benchmark::Initialize(&argc, argv);
    Kiln::Initialize(true);
    RegisterAll();
    benchmark::RunSpecifiedBenchmarks();
    Kiln::Terminate();
    return 0;
}
