// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0

// Kiln's frame operations.

#include "Benchmarks/Support/FrameBench.h"

namespace Vantrel::Benchmarks {
namespace {

using Vellum::RenderQuality;

Ostrand::Status Draw(const FrameBench& bench, const VideoFrameRef& target, const VideoFrameRef& source, float scale,
                     float rotation, float opacity, std::int32_t mode, RenderQuality quality) {
    return Kiln::Motion(bench.device, DataOf(source), RowBytesOf(source), 0, 0, kWidth, kHeight, 1, 1, DataOf(target),
                        RowBytesOf(target), 0, 0, kWidth, kHeight, 1, 1, bench.format, 0.5F, 0.5F, 0.5F, 0.5F, scale,
                        scale, rotation, opacity, mode, true, quality);
}

/// A drawing as a benchmark's body.
template <int kScalePercent, int kDegrees, std::int32_t kMode, RenderQuality kQuality>
void DrawLayer(benchmark::State& state, FrameBench& bench) {
    bench.Measure(state, [&](const VideoFrameRef& target, const VideoFrameRef& source) {
        return Draw(bench, target, source, kScalePercent / 100.0F, kDegrees, 0.8F, kMode, kQuality);
    });
}

void DrawTwoLayers(benchmark::State& state, FrameBench& bench) {
    bench.Measure(state, [&](const VideoFrameRef& target, const VideoFrameRef& source) {
        const auto status = Draw(bench, target, source, 1.1F, 5.0F, 1.0F, Kiln::kBlend_Normal, RenderQuality::kMedium);
        if (Ostrand::Failed(status)) return status;
        return Draw(bench, target, source, 0.9F, -10.0F, 0.7F, Kiln::kBlend_Normal, RenderQuality::kMedium);
    });
}

void Fill(benchmark::State& state, FrameBench& bench) {
    bench.Measure(state, [&](const VideoFrameRef& target, const VideoFrameRef&) {
        return Kiln::FillWithOpaqueBlack(bench.device, DataOf(target), RowBytesOf(target), bench.format, 0, 0, kWidth,
                                         kHeight);
    });
}

void FillOnePixel(benchmark::State& state, FrameBench& bench) {
    bench.Measure(state, [&](const VideoFrameRef& target, const VideoFrameRef&) {
        return Kiln::FillWithOpaqueBlack(bench.device, DataOf(target), RowBytesOf(target), bench.format, 0, 0, 1, 1);
    });
}

void CopySameFormat(benchmark::State& state, FrameBench& bench) {
    bench.Measure(state, [](const VideoFrameRef& target, const VideoFrameRef& source) {
        return Kiln::CopyFrame(source, target, RenderQuality::kHigh);
    });
}

void ConvertFrom(benchmark::State& state, FrameBench& bench, PixelFormat layout, std::uint32_t alphaType) {
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
void ConvertBytes(benchmark::State& state, FrameBench& bench) {
    ConvertFrom(state, bench, Vellum::kPixelFormat_BGRA_4444_8u, Vellum::kAlphaType_Straight);
}
void ConvertVideoLevels(benchmark::State& state, FrameBench& bench) {
    ConvertFrom(state, bench, Vellum::kPixelFormat_VUYA_4444_8u_709, Vellum::kAlphaType_Straight);
}
void ConvertPremultiplied(benchmark::State& state, FrameBench& bench) {
    ConvertFrom(state, bench, Vellum::kPixelFormat_BGRA_4444_8u, Vellum::kAlphaType_Premultiplied);
}

Ostrand::Status Mix(const FrameBench& bench, const VideoFrameRef& target, const VideoFrameRef& source, bool film) {
    return Kiln::CrossDissolve(bench.device, DataOf(source), RowBytesOf(source), DataOf(target), RowBytesOf(target),
                               DataOf(target), RowBytesOf(target), bench.format, kWidth, kHeight, 0.3F, film);
}
template <bool kFilm>
void Dissolve(benchmark::State& state, FrameBench& bench) {
    bench.Measure(state, [&](const VideoFrameRef& target, const VideoFrameRef& source) {
        return Mix(bench, target, source, kFilm);
    });
}

/// Two rectangles that make a frame, as a push lays them.
void CopyTwoHalves(benchmark::State& state, FrameBench& bench) {
    bench.Measure(state, [&](const VideoFrameRef& target, const VideoFrameRef& source) {
        const auto copy = [&](std::int32_t from, std::int32_t to) {
            return Kiln::DeviceCopyRect(bench.device, DataOf(source), RowBytesOf(source), DataOf(target),
                                        RowBytesOf(target), bench.format, from, 0, to, 0, kWidth / 2, kHeight);
        };
        const Ostrand::Status status = copy(0, kWidth / 2);
        return Ostrand::Failed(status) ? status : copy(kWidth / 2, 0);
    });
}

void Deinterlace(benchmark::State& state, FrameBench& bench) {
    bench.Measure(state,
                  [](const VideoFrameRef& target, const VideoFrameRef&) { return Kiln::DeinterlaceFrame(target, 0); });
}

void ReduceFrom4K(benchmark::State& state, FrameBench& bench) {
    const VideoFrameRef large = bench.MakeFrame(bench.format, 2 * kWidth, 2 * kHeight);
    bench.Measure(state, [&](const VideoFrameRef& target, const VideoFrameRef&) {
        return Kiln::CopyFrame(large, target, RenderQuality::kHigh);
    });
}

constexpr Entry kOperations[] = {
    {"launch overhead (fill of one pixel)", &FillOnePixel},
    {"fill", &Fill},
    {"copy", &CopySameFormat},
    {"convert from 8-bit BGRA", &ConvertBytes},
    {"convert from 8-bit BGRA, premultiplied", &ConvertPremultiplied},
    {"convert from video levels", &ConvertVideoLevels},
    {"deinterlace", &Deinterlace},
    {"cross dissolve, in place", &Dissolve<false>},
    {"film dissolve, in place", &Dissolve<true>},
    {"two rectangles, as a push copies them", &CopyTwoHalves},
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

}  // namespace
}  // namespace Vantrel::Benchmarks

int main(int argc, char** argv) {
    benchmark::Initialize(&argc, argv);
    Kiln::Initialize(true);
    Vantrel::Benchmarks::RegisterOnEachDevice(Vantrel::Benchmarks::kOperations);
    benchmark::RunSpecifiedBenchmarks();
    Kiln::Terminate();
    return 0;
}
