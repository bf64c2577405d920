// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/RenderPipeline.h"

#include <array>

#include <gmock/gmock.h>

#include "Src/Nodes/FinishedInputs.h"
#include "Src/Stopwatch.h"
#include "Tests/Nodes/ProbeNodes.h"

namespace Vantrel::Testing {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::StartsWith;

/// A root that makes a new frame for each pass and notes the passes' params.
class PassRoot final : public ProbeOf<IdleFilter>, public Ostrand::Allocated<PassRoot> {
public:
    PassRoot(CallLog& callLog, bool asMulticam) : ProbeOf("root", callLog), mAsMulticam(asMulticam) { hash = Guid(); }
    Status QueryInterface(const Guid& iid, void** out) override {
        return ProbeOf::QueryInterface(mAsMulticam && iid == kMulticamNodeID ? FilterNode::kInterfaceID : iid, out);
    }
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override {
        passes.push_back(params);
        mFrameSlot = FakeFrame::Make();
        frames.push_back(mFrameSlot);
        static_cast<void>(ProbeOf::Render(token, params, results));
        return passes.size() == failingPass ? Ostrand::kStatus_Failure : Ostrand::kStatus_OK;
    }

    std::vector<RenderParams> passes;
    std::vector<VideoFrameRef> frames;
    std::size_t failingPass = 0;

protected:
    std::atomic<std::int32_t>& GetRef() override { return mRefCount; }

private:
    bool mAsMulticam;
};

class RenderPipelineTest : public ::testing::Test {
protected:
    using RootRef = InterfaceRef<PassRoot>;
    RootRef MakeRoot(bool asMulticam = false) { return stage.Configured(RootRef(new PassRoot(stage.log, asMulticam))); }
    Status Run(const RenderNodeRef& root, std::string* text = nullptr) {
        first.Reset();
        second.Reset();
        return RenderTree(stage.device, root, stage.params, stage.results, first, second, text, {0, 0, 200, 100});
    }
    void Ask(std::uint32_t fieldType, std::uint32_t selection, std::uint32_t quality, std::int64_t time) {
        stage.params.fieldType = fieldType;
        stage.params.fieldSelection = selection;
        stage.params.quality = quality;
        stage.params.time = time;
        stage.params.clipTime = time + 7;
        stage.TakeLog();
    }

    ProbeStage stage;
    VideoFrameRef first;
    VideoFrameRef second;
};

TEST_F(RenderPipelineTest, AFieldPlanFollowsSelectionFieldTypeAndQuality) {
    const struct {
        const char* what;
        std::uint32_t fieldType, selection, quality;
        std::int64_t time;
        std::vector<std::uint32_t> selections;
        std::int64_t lastTime;
        int taggedFieldType;
    } kCases[] = {
        {"progressive", 0, 2, 2, 2000, {2}, 2000, 0},
        {"interlaced draft stays whole and is tagged", 2, 2, 1, 2000, {2}, 2000, 2},
        {"quality 0 counts as 1", 1, 2, 0, 2000, {2}, 2000, 1},
        {"two passes half a sequence frame apart", 1, 2, 2, 2000, {0, 1}, 2501, 0},
        {"the temporally first field comes first", 2, 2, 2, 2000, {0, 1}, 2501, 0},
        {"the second field alone, from the frame's time", 1, 1, 2, 2000, {1}, 2501, 0},
        {"the second field alone, placed by the caller", 1, 1, 2, 2100, {1}, 2100, 0},
        {"the first field alone", 1, 0, 2, 2000, {0}, 2000, 0},
    };
    stage.params.sequenceFrameTicks = 1001;  // odd: half of it is rounded up
    for (const auto& expected : kCases) {
        Ask(expected.fieldType, expected.selection, expected.quality, expected.time);
        const RootRef root = MakeRoot();
        EXPECT_EQ(Run(root), 0) << expected.what;
        std::vector<std::uint32_t> selections;
        for (const RenderParams& pass : root->passes) selections.push_back(pass.fieldSelection);
        EXPECT_EQ(selections, expected.selections) << expected.what;
        EXPECT_EQ(root->passes.back().time, expected.lastTime) << expected.what;
        EXPECT_EQ(root->passes.back().clipTime, expected.lastTime + 7) << expected.what;
        EXPECT_EQ(first->GetFieldType(), static_cast<std::uint32_t>(expected.taggedFieldType)) << expected.what;
        EXPECT_GE(root->passes.front().quality, 1U);
        const bool swapped = expected.fieldType == Vellum::kFieldType_LowerFirst;
        if (selections.size() == 1) continue;
        EXPECT_EQ(first, root->frames[swapped ? 1 : 0]) << expected.what;
        EXPECT_EQ(second, root->frames[swapped ? 0 : 1]) << expected.what;
        EXPECT_THAT(stage.log, ElementsAre("root Render", "root EndFrame 3", "root Render", "root EndFrame 0"));
    }
}

TEST_F(RenderPipelineTest, AFailedPassLeavesTheOutputsAlone) {
    Ask(1, 2, 2, 2000);
    const RootRef secondFails = MakeRoot();
    secondFails->failingPass = 2;
    EXPECT_EQ(Run(secondFails), Ostrand::kStatus_Failure);
    EXPECT_FALSE(first);
    EXPECT_FALSE(second);
    EXPECT_THAT(stage.TakeLog(), ElementsAre("root Render", "root EndFrame 3", "root Render", "root EndFrame 0"));
    const RootRef firstFails = MakeRoot();
    firstFails->failingPass = 1;
    EXPECT_EQ(Run(firstFails), Ostrand::kStatus_Failure);
    EXPECT_THAT(stage.log, ElementsAre("root Render")) << "a filter node without a frame gets no end";
}

TEST_F(RenderPipelineTest, MulticamRootsRenderIntoTheOutputRectangle) {
    const RootRef root = MakeRoot(true);
    stage.params.pixelAspectRatio = {4, 3};
    EXPECT_EQ(Run(root), 0);
    EXPECT_EQ(root->passes[0].outputRect, (Vellum::Rect{0, 0, 200, 100}));
    EXPECT_EQ(root->passes[0].pixelAspectRatio, Vellum::kPixelAspectRatio_Square);
}

TEST_F(RenderPipelineTest, FinishedInputsAreForgottenAfterTheFrame) {
    FinishedInputs::Append(stage.Leaf("finished"), {}, stage.params, stage.results);
    EXPECT_EQ(Run(MakeRoot()), 0);
    EXPECT_FALSE(FinishedInputs::Release(9));
}

TEST_F(RenderPipelineTest, ABlackTreeRendersNothing) {
    const ProbeFilterRef black = stage.Filter("BlackVideoSource");
    stage.results->AppendLog(HashOf(1), "PF: bgra\n");
    std::string text = "before\n";
    EXPECT_EQ(Run(black, &text), 0);
    EXPECT_FALSE(first);
    EXPECT_THAT(stage.log, IsEmpty());
    EXPECT_EQ(text, "CUDA Render System\n\nbefore\nPF: bgra\n");
}

/// A root that is one host render: it has no device side.
class HostRoot final : public ProbeLeaf {
public:
    using ProbeLeaf::ProbeLeaf;
    Status RenderFrame(const RenderToken&, const RenderParams&, const RenderResultsRef&, VideoFrameRef&) override {
        return 0;
    }
};

TEST_F(RenderPipelineTest, AHostRenderIsFetchedOnceWithTheCallersOwnParams) {
    const InterfaceRef<HostRoot> root(new HostRoot("root", stage.log));
    root->frame = FakeFrame::Make();
    Ask(1, 2, 0, 2000);
    EXPECT_EQ(Run(root), 0);
    EXPECT_EQ(first, root->frame);
    EXPECT_EQ(root->lastParams.quality, 0U);
    EXPECT_THAT(stage.log, ElementsAre("root FetchHostFrame blocking"));
    EXPECT_THROW(Run({}), Ostrand::NullInterfaceException);
}

TEST_F(RenderPipelineTest, TheReportHasTimingsWhenTheyAreWanted) {
    stage.results->AppendLog(HashOf(1), "PF: bgra\n");
    stage.device = boost::make_shared<FakeDevice>(Kiln::DeviceFramework::kOpenCL);
    std::string text = "before\n";
    EXPECT_EQ(Run(MakeRoot(), &text), 0);
    EXPECT_THAT(text, StartsWith("OpenCL Render System\n\nTotal render time: "));
    EXPECT_THAT(text, HasSubstr("ms\nbefore\nPF: bgra\n"));
    EXPECT_EQ(stage.device->DeviceMemory().resets, 1);

    stage.device->SetTimingEnabled(true);
    stage.device->Commands().markDistanceMs = 1.25F;
    stage.device->DeviceMemory().statistics.peakBytesInUse = 5U << 20;
    stage.device->HostMemory().statistics.peakBytesInUse = (3U << 20) - 1;
    text = "before\n";
    EXPECT_EQ(Run(MakeRoot(), &text), 0);
    EXPECT_THAT(text, HasSubstr("ms\nMemory: 5mb, Host: 2mb\n\nroot: 1.25ms\n\nbefore\n"));
    EXPECT_THAT(text, Not(HasSubstr("PF")));
}

TEST_F(RenderPipelineTest, PreparingRunsOnTheExecutorUnderTheDevicesAccess) {
    int accessAtCompletion = 0;
    stage.results = boost::make_shared<RenderResults>([&] { accessAtCompletion = stage.device->exclusive; });
    const ProbeLeafRef leaf = stage.Leaf("leaf");
    leaf->status = Ostrand::kStatus_Failure;
    PostPrepareRender(*stage.device->GetExecutor(), stage.device, leaf, boost::make_shared<RenderParams>(stage.params),
                      stage.results);
    stage.device->GetExecutor()->Drain();
    EXPECT_THAT(stage.log, ElementsAre("leaf FetchHostFrame"));
    EXPECT_EQ(accessAtCompletion, 1) << "the piece ended, whatever the status, before the device was let go";
    EXPECT_EQ(stage.device->exclusive, 0);
}

/// A start and an end of both clocks.
struct ScriptedClock final : PlatformClock {
    ScriptedClock(std::int64_t hertz, std::array<std::int64_t, 2> counts, std::array<std::uint32_t, 2> milliseconds)
        : frequency(hertz), counter(counts), ticks(milliseconds) {}
    std::int64_t QueryPerformanceCounter() const override { return counter.at(counted++); }
    std::int64_t QueryPerformanceFrequency() const override { return frequency; }
    std::uint32_t GetTickCount() const override { return ticks.at(ticked++); }

    std::int64_t frequency;
    std::array<std::int64_t, 2> counter;
    std::array<std::uint32_t, 2> ticks;
    mutable std::size_t counted = 0, ticked = 0;
};

TEST(Stopwatch, BelievesTheCounterUnlessItStraysFromTheTicks) {
    const auto measure = [](std::int64_t frequency, std::int64_t counterStart, std::int64_t counterEnd,
                            std::uint32_t ticksStart, std::uint32_t ticksEnd) {
        return Stopwatch(ScriptedClock(frequency, {counterStart, counterEnd}, {ticksStart, ticksEnd})).ReadSeconds();
    };
    EXPECT_EQ(measure(1000, 0, 1500, 0, 1000), 1.5) << "half a second apart is believed";
    EXPECT_EQ(measure(1000, 0, 1501, 0, 1000), 1.0);
    EXPECT_EQ(measure(1000, 900, 800, 0, 0), 0.0) << "never negative";
    EXPECT_EQ(measure(0, 0, 1500, 0, 250), 0.25) << "without a frequency the ticks serve";
    EXPECT_EQ(measure(1000, 0, 40, 0xFFFFFFF0U, 24), 0.04) << "the ticks wrap around";
}

}  // namespace
}  // namespace Vantrel::Testing
