// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
// What effects cost on 1080p frames as whole nodes, with their frames, passes and parameters, as a multiple of the
// plainest pass over the same frame in place. Both are run in turn, and the least of each counts. Milliseconds are
// those that all threads worked, which other load hardly touches; they say nothing where the device isn't the
// processor.
#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <map>
#include <string>

#include <boost/make_shared.hpp>

#include "Benchmarks/Support/FrameBench.h"
#include "Src/Filters/Effects/OneKernelEffect.h"
#include "Src/Nodes/NodeRegistry.h"
#include "Src/VideoNodes/VideoNodeFactory.h"
#include "Tests/Effects/EffectTester.h"
#include "Vantrel/EffectTable.h"
#include "Vantrel/RenderSystem.h"

namespace {

using namespace Vantrel;

using Benchmarks::kHeight;
using Benchmarks::kWidth;
constexpr int kRounds = 15;

const struct {
    const char* name;
    const char* matchName;
    std::map<std::int32_t, double> settings;
} kCases[] = {
    {"Gaussian blur, sigma 10", "TQ.XQVE Gaussian Blur 2", {{0, 35.0}}},
    {"Gaussian blur, sigma 100", "TQ.XQVE Gaussian Blur 2", {{0, 350.0}}},
    {"Gaussian blur, sigma 100, size kept", "TQ.XQVE Gaussian Blur 2", {{0, 350.0}, {2, 1.0}}},
    {"fast blur, sigma 10, size kept", "TQ.XQVE Fast Blur", {{0, 24.1}, {2, 1.0}}},
    {"levels", "KL.XQVE Levels", {{0, 16.0}, {3, 235.0}}},
    {"levels, gammas", "KL.XQVE Levels", {{4, 130.0}, {9, 90.0}, {14, 80.0}, {19, 110.0}}},
    {"luma curve", "TQ.XQVE Luma Curve", {{9, 128.0}, {10, 150.0}}},
    {"RGB curves", "TQ.XQVE RGB Curves", {{9, 128.0}, {10, 150.0}, {41, 128.0}, {42, 100.0}}},
    {"video limiter", "TQ.XQVE Video Limiter", {}},
    {"sharpen", "TQ.XQVE Sharpen", {{0, 40.0}}},
    {"basic 3D", "TQ.XQVE Basic 3D", {{0, 30.0}, {1, 20.0}}},
    {"stabilizer, cropped and scaled", "TQ.XQVE SubspaceStabilizer", {}},
    {"stabilizer, whole", "TQ.XQVE SubspaceStabilizer", {{8, 0.0}}},
    {"basic 3D, highlight", "TQ.XQVE Basic 3D", {{0, 30.0}, {1, -20.0}, {2, 20.0}, {3, 1.0}}},
    {"garbage matte, 16 corners", "TQ.XQVE Garbage Matte 16", {{8, 0.5}, {10, 0.3}}},
    {"timecode", "TQ.XQVE Lspr Timecode", {}},
    {"crop", "TQ.XQVE TQCrop", {{0, 10.0}, {1, 20.0}, {2, 5.0}, {3, 15.0}}},
    {"crop, zoom", "TQ.XQVE TQCrop", {{0, 10.0}, {1, 20.0}, {2, 5.0}, {3, 15.0}, {4, 1.0}}},
    {"directional blur, upright", "TQ.XQVE Motion Blur", {{0, 0.0}, {1, 30.0}}},
    {"directional blur, 30 degrees", "TQ.XQVE Motion Blur", {{0, 30.0}, {1, 30.0}}},
    {"directional blur, 45 degrees", "TQ.XQVE Motion Blur", {{0, 45.0}, {1, 30.0}}},
    {"directional blur, 50 degrees", "TQ.XQVE Motion Blur", {{0, 50.0}, {1, 30.0}}},
    {"directional blur, level", "TQ.XQVE Motion Blur", {{0, 90.0}, {1, 30.0}}},
    {"drop shadow, soft", "TQ.XQVE Drop Shadow", {{1, 128.0}, {3, 20.0}, {4, 30.0}}},
    {"drop shadow, hard", "TQ.XQVE Drop Shadow", {{1, 128.0}, {3, 20.0}}},
    {"ultra key", "TQ.XQVE Ultra Key", {}},
    {"ultra key, choked and softened", "TQ.XQVE Ultra Key", {{11, 30.0}, {12, 30.0}}},
    {"ultra key, choked and softened fully", "TQ.XQVE Ultra Key", {{11, 100.0}, {12, 100.0}}},
};

void Check(bool good) {
    if (good) return;
    std::fprintf(stderr, "vantrel_node_bench: a node failed\n");
    std::exit(1);
}

/// A scripted clip with one effect, and a device to render it.
class Bench {
public:
    Bench(Testing::FakeHost& host, Kiln::DeviceRef device, Vellum::PixelFormat format)
        : mHost(host), mDevice(std::move(device)), mFormat(format) {
        mHost.nodes[kMedia] = {"Media"};
        mHost.nodes[kClip] = {"Clip"};
        mHost.nodes[kClip].inputs = {{kMedia}};
        mHost.nodes[kClip].operators = {kEffect};
        mHost.nodes[kEffect] = {"Effect"};
        // What the stabilizer wants: a track of a frame that is moved and turned, and frames to count.
        mHost.opaqueData[kInstance] = mTrack.data();
        mHost.nodes[kEffect].properties["EffectNode::RuntimeInstanceID"] = std::to_string(kInstance);
        mHost.nodes[kMedia].properties["MediaNode::StreamFrameRate"] = std::to_string(kFrameTicks);
        mHost.sequences[kSequence].segments = {{0, Vellum::kTime_Max, 0, Testing::Guid(1, 0, 0, {}), kClip}};
        Check(!Ostrand::Failed(Kiln::CreateGPUVideoFrame(mFrame, mDevice, mFormat, kWidth, kHeight, {1, 1}, 0, {})));
    }

    [[nodiscard]] RenderNodeRef MakeNode(const char* matchName, const std::map<std::int32_t, double>& settings) {
        mHost.nodes[kEffect].properties["EffectNode::FilterMatchName"] = matchName;
        mHost.nodes[kEffect].params = Testing::MakeParams(*FindEffect(matchName), settings);
        const VideoSegmentsHandle handle(kSequence, SegmentsMode::kPlain, "");
        RenderRequirements requirements;
        requirements.frameRect = {0, 0, kWidth, kHeight};
        requirements.device = mDevice;
        bool needsHost = false;
        RenderNodeRef node = createNode(Halden::ToWide(matchName), mDevice, GetEffect(AcquireRootNode(handle, 0), 0),
                                        requirements, needsHost);
        Check(node && !needsHost);
        node->SetInput(0, RenderNodeRef(new Testing::FrameSource(mFrame)));
        return node;
    }
    void Render(const RenderNodeRef& node) const {
        RenderParams params;
        params.outputRect = params.sequenceRect = {0, 0, kWidth, kHeight};
        params.pixelAspectRatio = {1, 1};
        params.sequenceID = kSequence;
        params.sequenceFrameTicks = kFrameTicks;
        const auto results = boost::make_shared<RenderResults>();
        VideoFrameRef output;
        Check(!Ostrand::Failed(node->RenderFrame({}, params, results, output)));
        node->EndFrame({}, params, results, 0);
    }
    void Pass() {
        const KernelFrame frame(mFrame);
        const std::uint64_t kernel = mPass.Find(mDevice);
        KernelArgs args(mDevice->GetFramework(), kernel);
        args.AddAll(frame.Data(), frame.Pitch(), DeviceValue{0}, std::int32_t{0}, frame.Format(), kWidth, kHeight);
        Check(kernel != 0 && !Ostrand::Failed(args.Finish()));
        const GridSize grid = frame.Grid();
        Check(!Ostrand::Failed(mDevice->GetCommands()->Launch(kernel, grid.x, grid.y, 16, 16, 0)));
    }
    /// Milliseconds that `work` takes on a fresh frame, a part of which is transparent.
    template <class Work>
    double Time(const Work& work) {
        const KernelFrame frame(mFrame);
        Kiln::FillWithColor(mDevice, frame.Data(), frame.RowBytes(), mFormat, 0, 0, kWidth, kHeight, {});
        Kiln::FillWithColor(mDevice, frame.Data(), frame.RowBytes(), mFormat, kWidth / 4, kHeight / 4, kWidth / 2,
                            kHeight / 2, {0.2F, 0.4F, 0.6F, 1.0F});
        Check(!Ostrand::Failed(mDevice->Synchronize()));
        const double start = 1e3 * Benchmarks::WorkSeconds();
        work();
        Check(!Ostrand::Failed(mDevice->Synchronize()));
        return 1e3 * Benchmarks::WorkSeconds() - start;
    }

private:
    static constexpr std::uint32_t kSequence = 1, kClip = 1, kMedia = 2, kEffect = 3;
    static constexpr std::int32_t kInstance = 1;
    static constexpr std::int64_t kFrameTicks = 10160640000;
    std::string mTrack = "motion-track 1 frame 1920 1080 first 0 smooth 0 cell 56 motion  24 -16 1.5 1  -24 16 -1.5 1";
    Testing::FakeHost& mHost;
    Kiln::DeviceRef mDevice;
    Vellum::PixelFormat mFormat;
    VideoFrameRef mFrame;
    EffectKernel mPass{R"(..\..\Src\Filters\Effects\LumaCorrectorNode)", "LumaCorrector_MaskKernel", {}};
};

void Measure(Testing::FakeHost& host, Kiln::DeviceFramework framework, Vellum::PixelFormat format, const char* name) {
    const Kiln::DeviceRef device = Kiln::GetPrimaryDevice(framework);
    if (!device) return;
    const Kiln::ScopedDeviceAccess access(device);
    Bench bench(host, device, format);
    for (const auto& each : kCases) {
        if (!isRegistered(Halden::ToWide(each.matchName), device)) continue;
        const RenderNodeRef node = bench.MakeNode(each.matchName, each.settings);
        double pass = 1e9, best = 1e9;
        for (int round = 0; round < kRounds; ++round) {
            pass = std::min(pass, bench.Time([&] { bench.Pass(); }));
            best = std::min(best, bench.Time([&] { bench.Render(node); }));
        }
        std::printf("| %s | %s | %.2f ms | %.1f passes |\n", name, each.name, best, best / pass);
    }
}

}  // namespace

int main() {
    Testing::FakeHost host;
    Initialize(host.GetBasicSuite());
    using Kiln::DeviceFramework;
    Measure(host, DeviceFramework::kCuda, Kiln::kPixelFormat_GPU_BGRA_4444_32f, "CUDA, float");
    Measure(host, DeviceFramework::kCuda, Kiln::kPixelFormat_GPU_BGRA_4444_16f, "CUDA, half");
    Measure(host, DeviceFramework::kOpenCL, Kiln::kPixelFormat_GPU_BGRA_4444_32f, "OpenCL, float");
    Terminate();
    return 0;
}
