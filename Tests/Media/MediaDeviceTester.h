// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>

#include "Src/Nodes/FinishedInputs.h"
#include "Tests/Media/MediaScript.h"
#include "Tests/Support/DevicePictures.h"
#include "Vantrel/RenderSystem.h"

namespace Vantrel::Testing {

/// A leaf that renders nothing: it hands out a frame, or what a function answers.
class FrameLeaf final : public RenderNodeBase, public Ostrand::Allocated<FrameLeaf> {
public:
    explicit FrameLeaf(VideoFrameRef leafFrame) : frame(std::move(leafFrame)) {}
    Status RenderFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef&,
                       VideoFrameRef& out) override {
        ++renders;
        lastToken = token.Get();
        lastParams = params;
        const Status status = answer ? answer() : Ostrand::kStatus_OK;
        if (!Ostrand::Failed(status)) out = frame;
        return status;
    }

    VideoFrameRef frame;
    std::function<Status()> answer;
    int renders = 0;
    const IRenderNode* lastToken = nullptr;  ///< not held: it holds this leaf
    RenderParams lastParams;

protected:
    std::atomic<std::int32_t>& GetRef() override { return mRefCount; }
};
using FrameLeafRef = InterfaceRef<FrameLeaf>;

/// A started engine over a scripted clip, on each device. Quality 1 and 2 make the pixel format that the case names,
/// but that OpenCL always works in 32 bits.
class MediaDeviceTest : public DeviceTest {
protected:
    MediaDeviceTest() { Initialize(host.GetBasicSuite()); }
    ~MediaDeviceTest() override { Terminate(); }
    void SetUp() override {
        DeviceTest::SetUp();
        if (!GetDevice()) return;
        script.params.quality = IsHalf() ? 1 : 2;
        Forget();
    }
    void TearDown() override {
        // The end of a render does this.
        FinishedInputs::Clear();
        if (!GetDevice()) return;
        Forget();
        GetDevice()->GetDeviceMemory()->SetAllocationFilter({});
    }

    /// What devices really work in at the case's quality.
    [[nodiscard]] Vellum::PixelFormat WorkingFormat() const {
        const bool half = IsHalf() && GetParam().framework == Kiln::DeviceFramework::kCuda;
        return half ? Kiln::kPixelFormat_GPU_BGRA_4444_16f : Kiln::kPixelFormat_GPU_BGRA_4444_32f;
    }
    /// Empties the caches, which outlive a test.
    void Forget() {
        GetDevice()->GetDeviceMemory()->GetFrameCache().Purge(~std::uint64_t{0});
        GetDevice()->GetHostMemory()->GetFrameCache().Purge(~std::uint64_t{0});
    }
    void NewRequest() { results = MediaScript::MakeResults(); }

    Status Render(IRenderNode& node, VideoFrameRef& frame) {
        return node.RenderFrame({}, script.params, results, frame);
    }
    /// The finished frame; failures fail the test.
    VideoFrameRef Render(IRenderNode& node) {
        VideoFrameRef frame;
        EXPECT_EQ(Render(node, frame), Ostrand::kStatus_OK);
        return frame;
    }
    Picture Download(const VideoFrameRef& frame) { return DownloadFrame(GetDevice(), frame); }
    VideoFrameRef Frame(const Picture& picture) { return UploadFrame(GetDevice(), WorkingFormat(), picture); }
    Pixel PixelOf(const VideoFrameRef& frame, int x = 0, int y = 0) { return Download(frame).Get(x, y); }
    static void ExpectPixel(const Pixel& actual, const Pixel& expected) {
        for (std::size_t c = 0; c < 4; ++c) EXPECT_NEAR(actual[c], expected[c], 2e-3) << "channel " << c;
    }
    void ExpectPixel(const VideoFrameRef& frame, const Pixel& expected, int x = 0, int y = 0) {
        ExpectPixel(PixelOf(frame, x, y), expected);
    }
    /// Counts the device's allocations from here on; those for which `refuse`, given the number so far, says so fail.
    void CountAllocations(std::function<bool(int)> refuse = {}) {
        allocations = 0;
        GetDevice()->GetDeviceMemory()->SetAllocationFilter(
            [this, refuse](std::uint64_t) { return ++allocations, refuse && refuse(allocations); });
    }

    FakeHost host;
    MediaScript script{host};
    RenderResultsRef results = MediaScript::MakeResults();
    int allocations = 0;
};

}  // namespace Vantrel::Testing
