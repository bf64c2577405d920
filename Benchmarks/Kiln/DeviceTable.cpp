// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
// The table of Docs/performance.md for single operations on 1080p frames. Everything is measured in turn, many rounds
// over, next to what the processor's two threads can move at best in the same round; medians are printed, so that a
// machine that does other things besides tells nearly the same story.
#include <algorithm>
#include <array>
#include <atomic>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <functional>
#include <string>
#include <thread>
#include <vector>

#include "Kiln/FrameOperations.h"
#include "Kiln/Frames.h"
#include "Kiln/KernelLaunch.h"
#include "Kiln/Pages.h"

namespace {

using Kiln::VideoFrameRef;
using Vellum::PixelFormat;
using Vellum::RenderQuality;

constexpr std::int32_t kWidth = 1920;
constexpr std::int32_t kHeight = 1080;
constexpr std::size_t kPixels = std::size_t{kWidth} * kHeight;
constexpr int kLaunches = 200;

double Milliseconds() {
    return std::chrono::duration<double, std::milli>(std::chrono::steady_clock::now().time_since_epoch()).count();
}

double Median(std::vector<double> values) {
    std::sort(values.begin(), values.end());
    return values.empty() ? 0.0 : values[values.size() / 2];
}

/// Two threads, of which the caller is one, that each do half of a job.
class TwoThreads {
public:
    TwoThreads() : mOther([this] { Work(); }) {}
    ~TwoThreads() {
        mJob = nullptr;
        ++mTurn;
        mOther.join();
    }
    TwoThreads(const TwoThreads&) = delete;
    TwoThreads& operator=(const TwoThreads&) = delete;

    /// Milliseconds of `job(half)` for both halves.
    double Time(const std::function<void(int half)>& job) {
        const double start = Milliseconds();
        mJob = &job;
        const int turn = ++mTurn;
        job(0);
        while (mDone != turn) std::this_thread::yield();
        return Milliseconds() - start;
    }

private:
    void Work() {
        for (int seen = 0;;) {
            while (mTurn == seen) std::this_thread::yield();
            seen = mTurn;
            if (!mJob) return;
            (*mJob)(1);
            mDone = seen;
        }
    }

    std::atomic<int> mTurn{0};
    std::atomic<int> mDone{0};
    const std::function<void(int)>* mJob = nullptr;
    std::thread mOther;
};

/// What the processor moves at best: bytes a millisecond, read and written, and the time of one core's copy.
class Limits {
public:
    Limits() : mFrom(Kiln::AllocatePages(kBytes)), mTo(Kiln::AllocatePages(kBytes)) {
        std::memset(mFrom.get(), 0, kBytes);
        std::memset(mTo.get(), 0, kBytes);
    }

    /// Threads that wait would take part of a processor from what is measured, so they live for this moment only.
    void Measure() {
        auto* from = static_cast<float*>(mFrom.get());
        auto* to = static_cast<float*>(mTo.get());
        constexpr std::size_t kHalf = kPixels * 2;
        TwoThreads threads;
        copies = 2.0 * kBytes / threads.Time([&](int half) {
            std::memcpy(to + static_cast<std::size_t>(half) * kHalf, from + static_cast<std::size_t>(half) * kHalf,
                        kBytes / 2);
        });
        passes = 2.0 * kBytes / threads.Time([&](int half) {
            float* values = to + static_cast<std::size_t>(half) * kHalf;
            for (std::size_t i = 0; i < kHalf; ++i) values[i] = 1.0F - values[i];
        });
        const double start = Milliseconds();
        std::memcpy(from, to, kBytes);
        copyPerByte = (Milliseconds() - start) / kBytes;
    }

    double copies = 0.0;
    double passes = 0.0;
    double copyPerByte = 0.0;  ///< of one core

private:
    static constexpr std::size_t kBytes = kPixels * 16;
    Kiln::Pages mFrom;
    Kiln::Pages mTo;
};

std::uint64_t DataOf(const VideoFrameRef& frame) { return Ostrand::Demand<Marl::IFrameData>(frame)->GetData(); }
std::int32_t RowBytesOf(const VideoFrameRef& frame) { return Ostrand::Demand<Marl::IFrameRows>(frame)->GetRowBytes(); }

/// A device with frames of one format, enough that none is in a cache when its turn comes.
struct Stage {
    Stage(Kiln::DeviceFramework framework, PixelFormat pixelFormat, const char* stageName)
        : name(stageName), device(Kiln::GetPrimaryDevice(framework)), format(pixelFormat) {
        if (!device) return;
        const Kiln::ScopedDeviceAccess access(device);
        for (VideoFrameRef& frame : frames) frame = MakeFrame(kWidth, kHeight);
        large = MakeFrame(2 * kWidth, 2 * kHeight);
        const VideoFrameRef host = Kiln::CreateHostVideoFrame(Vellum::kPixelFormat_BGRA_4444_8u, kWidth, kHeight,
                                                              Vellum::kPixelAspectRatio_Square, 0, {});
        upload = Kiln::AllocateHostFrameForUpload(device, host, RenderQuality::kHigh, {});
        (void)Kiln::CopyToHostFrame(upload, host, RenderQuality::kHigh);
        bytes = Kiln::CopyToDevice(upload);
        picture = host;
    }

    [[nodiscard]] VideoFrameRef MakeFrame(std::int32_t width, std::int32_t height) const {
        VideoFrameRef frame;
        if (Ostrand::Failed(Kiln::CreateGPUVideoFrame(frame, device, format, width, height, {}, 0, {}))) return {};
        Kiln::FillWithColor(device, DataOf(frame), RowBytesOf(frame), format, 0, 0, width, height,
                            {0.2F, 0.4F, 0.6F, 1.0F});
        return frame;
    }

    std::string name;
    Kiln::DeviceRef device;
    PixelFormat format;
    std::array<VideoFrameRef, 4> frames;
    VideoFrameRef large;
    VideoFrameRef upload;
    VideoFrameRef bytes;
    VideoFrameRef picture;
};

using Operation = std::function<void(const Stage& stage, const VideoFrameRef& target, const VideoFrameRef& source)>;

void Check(Ostrand::Status status) {
    if (!Ostrand::Failed(status)) return;
    std::fprintf(stderr, "vantrel_device_table: an operation failed\n");
    std::exit(1);
}

void Invert(const Stage& stage, const VideoFrameRef& target, const VideoFrameRef& source) {
    constexpr Kiln::Kernel<PixelFormat, std::uint64_t, std::int32_t, std::int32_t, std::int32_t, std::uint64_t,
                           std::int32_t, float>
        kInvert{"TestKernels", "InvertKernel"};
    const auto pixelBytes = static_cast<std::int32_t>(Vellum::BytesPerPixel(stage.format));
    Check(kInvert.Launch(stage.device, Kiln::ShapeFor(kWidth, kHeight), stage.format, DataOf(target), kWidth, kHeight,
                         RowBytesOf(target) / pixelBytes, DataOf(source), RowBytesOf(source) / pixelBytes, 0.25F));
}

void Draw(const Stage& stage, const VideoFrameRef& target, const VideoFrameRef& source, float scale, float rotation,
          float opacity, RenderQuality quality) {
    Check(Kiln::Motion(stage.device, DataOf(source), RowBytesOf(source), 0, 0, kWidth, kHeight, 1, 1, DataOf(target),
                       RowBytesOf(target), 0, 0, kWidth, kHeight, 1, 1, stage.format, 0.5F, 0.5F, 0.5F, 0.5F, scale,
                       scale, rotation, opacity, Kiln::kBlend_Normal, true, quality));
}

Operation Drawing(float scale, float rotation, float opacity, RenderQuality quality) {
    return [=](const Stage& stage, const VideoFrameRef& target, const VideoFrameRef& source) {
        Draw(stage, target, source, scale, rotation, opacity, quality);
    };
}

struct Row {
    const char* name;
    /// Of working pixels and of bytes besides that have to move, a pixel; 0: no share is printed, but times a copy.
    double movedPixels;
    double movedBytes;
    Operation operation;
};

const std::vector<Row>& GetRows() {
    static const std::vector<Row> rows = {
        {"invert in place", 2, 0,
         [](const Stage& stage, const VideoFrameRef& target, const VideoFrameRef&) { Invert(stage, target, target); }},
        {"invert to another frame", 2, 0, Invert},
        {"plain copy", 2, 0,
         [](const Stage&, const VideoFrameRef& target, const VideoFrameRef& source) {
             Check(Kiln::CopyFrame(source, target, RenderQuality::kHigh));
         }},
        {"fill", 1, 0,
         [](const Stage& stage, const VideoFrameRef& target, const VideoFrameRef&) {
             Check(Kiln::FillWithOpaqueBlack(stage.device, DataOf(target), RowBytesOf(target), stage.format, 0, 0,
                                             kWidth, kHeight));
         }},
        {"convert from 8-bit BGRA", 1, 4,
         [](const Stage& stage, const VideoFrameRef& target, const VideoFrameRef&) {
             Check(Kiln::ConvertFrame(stage.bytes, target));
         }},
        {"upload of 8-bit BGRA", 0, 8,
         [](const Stage& stage, const VideoFrameRef&, const VideoFrameRef&) {
             if (!Kiln::CopyToDevice(stage.upload)) Check(Ostrand::kStatus_OutOfMemory);
         }},
        {"read-back to 8-bit BGRA", 1, 12,
         [](const Stage& stage, const VideoFrameRef& target, const VideoFrameRef&) {
             Check(Kiln::CopyFromDevice(stage.picture, target));
         }},
        {"motion, bilinear, scaled", 0, 0, Drawing(1.2F, 0.0F, 1.0F, RenderQuality::kMedium)},
        {"motion, bilinear, turned", 0, 0, Drawing(1.2F, 5.0F, 1.0F, RenderQuality::kMedium)},
        {"motion, bilinear, turned, opacity 0.8", 0, 0, Drawing(1.2F, 5.0F, 0.8F, RenderQuality::kMedium)},
        {"motion, bicubic, scaled", 0, 0, Drawing(1.2F, 0.0F, 1.0F, RenderQuality::kHigh)},
        {"motion, bicubic, turned", 0, 0, Drawing(1.2F, 5.0F, 1.0F, RenderQuality::kHigh)},
        {"two layers, bilinear, turned", 0, 0,
         [](const Stage& stage, const VideoFrameRef& target, const VideoFrameRef& source) {
             Draw(stage, target, source, 1.1F, 5.0F, 1.0F, RenderQuality::kMedium);
             Draw(stage, target, source, 0.9F, -10.0F, 0.7F, RenderQuality::kMedium);
         }},
        {"4K to 1080p, bicubic", 0, 0,
         [](const Stage& stage, const VideoFrameRef& target, const VideoFrameRef&) {
             Check(Kiln::CopyFrame(stage.large, target, RenderQuality::kHigh));
         }},
    };
    return rows;
}

/// What the rounds gave for one operation on one stage.
struct Figures {
    std::vector<double> times, ofCopies, ofPasses, plainCopies;

    void Add(const Row& row, double pixelBytes, double time, const Limits& limits) {
        times.push_back(time);
        plainCopies.push_back(time / (limits.copyPerByte * pixelBytes * static_cast<double>(kPixels)));
        const double moved = (row.movedPixels * pixelBytes + row.movedBytes) * static_cast<double>(kPixels) / time;
        ofCopies.push_back(moved / limits.copies);
        ofPasses.push_back(moved / limits.passes);
    }

    void Print(const Row& row) const {
        if (row.movedPixels == 0 && row.movedBytes == 0)
            std::printf(" %.1f ms, %.1f copies |", Median(times), Median(plainCopies));
        else
            std::printf(" %.2f ms, %.0f %% / %.0f %% |", Median(times), 100 * Median(ofCopies), 100 * Median(ofPasses));
    }
};

void MeasureRound(const std::vector<Stage>& stages, std::vector<std::vector<Figures>>& figures, std::size_t round) {
    static Limits limits;
    for (std::size_t r = 0; r < GetRows().size(); ++r) {
        const Row& row = GetRows()[r];
        limits.Measure();
        for (std::size_t s = 0; s < stages.size(); ++s) {
            const Stage& stage = stages[s];
            if (!stage.device) continue;
            const Kiln::ScopedDeviceAccess access(stage.device);
            const auto run = [&](std::size_t turn) {
                row.operation(stage, stage.frames[turn % 4], stage.frames[(turn + 2) % 4]);
                Check(stage.device->Synchronize());
            };
            if (round == 0) run(0);  // the first run builds what the platform builds late
            const double start = Milliseconds();
            run(round);
            figures[r][s].Add(row, static_cast<double>(Vellum::BytesPerPixel(stage.format)), Milliseconds() - start,
                              limits);
        }
    }
}

/// Microseconds from a launch to the end of its wait, and of a launch in a row of many.
std::string MeasureLaunch(const Stage& stage) {
    const Kiln::ScopedDeviceAccess access(stage.device);
    const auto launch = [&] {
        Check(Kiln::FillWithOpaqueBlack(stage.device, DataOf(stage.frames[0]), RowBytesOf(stage.frames[0]),
                                        stage.format, 0, 0, 1, 1));
    };
    std::vector<double> single;
    std::vector<double> queued;
    for (int i = 0; i < kLaunches; ++i) {
        const double start = Milliseconds();
        launch();
        Check(stage.device->Synchronize());
        single.push_back(1e3 * (Milliseconds() - start));
    }
    for (int round = 0; round < 5; ++round) {
        const double start = Milliseconds();
        for (int i = 0; i < kLaunches; ++i) launch();
        Check(stage.device->Synchronize());
        queued.push_back(1e3 * (Milliseconds() - start) / kLaunches);
    }
    char text[64];
    std::snprintf(text, sizeof text, " %.0f us, %.1f us in a row |", Median(single), Median(queued));
    return text;
}

void PrintTable(std::size_t rounds) {
    const std::vector<Stage> stages = {
        {Kiln::DeviceFramework::kCuda, Kiln::kPixelFormat_GPU_BGRA_4444_32f, "CUDA, float"},
        {Kiln::DeviceFramework::kCuda, Kiln::kPixelFormat_GPU_BGRA_4444_16f, "CUDA, half"},
        {Kiln::DeviceFramework::kOpenCL, Kiln::kPixelFormat_GPU_BGRA_4444_32f, "OpenCL, float"},
        {Kiln::DeviceFramework::kOpenCL, Kiln::kPixelFormat_GPU_BGRA_4444_16f, "OpenCL, half"}};
    std::vector<std::vector<Figures>> figures(GetRows().size(), std::vector<Figures>(stages.size()));
    for (std::size_t round = 0; round < rounds; ++round) MeasureRound(stages, figures, round);
    std::printf("| 1080p |");
    for (const Stage& stage : stages) std::printf(" %s |", stage.name.c_str());
    std::printf("\n|---|---|---|---|---|\n");
    for (std::size_t r = 0; r < GetRows().size(); ++r) {
        std::printf("| %s |", GetRows()[r].name);
        for (std::size_t s = 0; s < stages.size(); ++s) {
            if (stages[s].device)
                figures[r][s].Print(GetRows()[r]);
            else
                std::printf(" no device |");
        }
        std::printf("\n");
    }
    std::printf("| launch and wait |");
    for (const Stage& stage : stages) std::printf("%s", stage.device ? MeasureLaunch(stage).c_str() : " no device |");
    std::printf("\n");
}

}  // namespace

int main(int argc, char** argv) {
    const bool quick = argc > 1 && std::string(argv[1]) == "--quick";
    Kiln::Initialize(true);
    PrintTable(quick ? 5 : 31);
    Kiln::Terminate();
    return 0;
}
