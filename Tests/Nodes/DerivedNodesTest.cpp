// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gmock/gmock.h>

#include "Src/Nodes/MultipleTimeInputBaseNode.h"
#include "Src/Nodes/SelectInputBaseNode.h"
#include "Src/Nodes/TransformRenderParamsBaseNode.h"
#include "Tests/Nodes/ProbeNodes.h"

namespace Vantrel::Testing {
namespace {

using ::testing::ElementsAre;

/// A concrete node of a derived base: its counter, and a Render with nothing to do.
template <class Base>
class Concrete : public Base, public Ostrand::Allocated<Concrete<Base>> {
public:
    Concrete() : Base(false, false) {}
    Status Render(const RenderToken&, const RenderParams&, const RenderResultsRef&) override { return 0; }

protected:
    std::atomic<std::int32_t>& GetRef() override { return this->mRefCount; }
};

class Aligned final : public Concrete<TransformRenderParamsBaseNode> {
public:
    void TransformParams(RenderParams& out, const RenderParams& params) override {
        out.time = params.time / 100 * 100;
        out.clipTime = params.clipTime / 100 * 100;
    }
};

TEST(TransformRenderParams, EveryPhaseAndTheFingerprintSeeTheTransformedParams) {
    ProbeStage stage;
    const auto node = stage.Configured(InterfaceRef<Aligned>(new Aligned));
    const ProbeLeafRef leaf = stage.Leaf("leaf");
    leaf->frame = FakeFrame::Make();
    node->SetInput(0, leaf);
    stage.params.time = stage.params.clipTime = 250;
    stage.results->StoreHash(node.Get(), 200, HashOf(1));
    EXPECT_EQ(node->GetFrameHash(stage.params, stage.results), HashOf(1));
    VideoFrameRef frame;
    EXPECT_EQ(stage.Render(*node, frame), 0);
    EXPECT_EQ(leaf->lastParams.time, 200);
    EXPECT_EQ(stage.results->FindFrame(HashOf(1)), leaf->frame);
    node->RequestHostFrames(stage.params, stage.results);
    node->CancelHostFrames(stage.params, stage.results);
    node->BeginUpload({}, stage.params, stage.results, true, frame);
    node->FetchHostFrame({}, stage.params, stage.results, true, frame);
    node->CollectHostFrames(stage.params, stage.results, {});
    node->EndFrame({}, stage.params, stage.results, 0);
    EXPECT_EQ(stage.log.size(), 7U);
    EXPECT_EQ(leaf->lastParams.clipTime, 200);
    EXPECT_FALSE(stage.results->FindFrame(HashOf(1)));
}

class Chooser final : public SelectInputBaseNode, public Ostrand::Allocated<Chooser> {
public:
    Chooser() : SelectInputBaseNode(true, false) {}
    void SelectInput(RenderParams& out, const RenderParams& params, RenderNodeRef& input) override {
        out.time = params.time + 5;
        input = chosen;
    }
    RenderNodeRef chosen;
    using SelectInputBaseNode::mFrameSlot;

protected:
    std::atomic<std::int32_t>& GetRef() override { return mRefCount; }
};

TEST(SelectInput, ThePictureComesFromTheChoice) {
    ProbeStage stage;
    const auto node = stage.Configured(InterfaceRef<Chooser>(new Chooser));
    const ProbeLeafRef leaf = stage.Leaf("leaf");
    leaf->frame = FakeFrame::Make();
    node->chosen = leaf;
    VideoFrameRef frame;
    EXPECT_EQ(stage.Render(*node, frame), 0);
    EXPECT_EQ(frame, leaf->frame);
    EXPECT_EQ(leaf->lastParams.time, 5);
    leaf->status = Ostrand::kStatus_OutOfMemory;
    EXPECT_EQ(stage.Render(*node, frame), Ostrand::kStatus_OutOfMemory);
    EXPECT_EQ(stage.device->DeviceMemory().releases.size(), 1U);
    EXPECT_FALSE(node->mFrameSlot);
    EXPECT_THAT(stage.log, ElementsAre("leaf RenderFrame", "leaf RenderFrame", "leaf RenderFrame"));

    node->chosen.Reset();
    EXPECT_EQ(node->Render({}, stage.params, stage.results), 0);
    EXPECT_THROW(node->RequestHostFrames(stage.params, stage.results), Ostrand::NullInterfaceException);
}

TEST(SelectInput, AChoiceThatIsInputZeroEndsTwiceHoweverDeepItLies) {
    ProbeStage stage;
    RenderNodeRef top = stage.Leaf("leaf");
    for (int depth = 0; depth < 20; ++depth) {
        const auto chooser = stage.Configured(InterfaceRef<Chooser>(new Chooser));
        chooser->SetInput(0, top);
        chooser->chosen = top;
        top = chooser;
    }
    for (const std::uint32_t level : {3U, 0U}) {
        stage.TakeLog();
        top->EndFrame({}, stage.params, stage.results, level);
        EXPECT_EQ(stage.log.size(), 2U) << "level " << level;
    }
}

class Sampler final : public Concrete<MultipleTimeInputBaseNode> {
public:
    void GetInputTimes(const RenderParams&, SampleSet& times, bool) override { times = samples; }
    SampleSet samples;
};

TEST(MultipleTimeInput, EveryPhaseGoesThroughAllSamplesAsFieldsOrFrames) {
    ProbeStage stage;
    const auto node = stage.Configured(InterfaceRef<Sampler>(new Sampler));
    const ProbeLeafRef leaf = stage.Leaf("leaf");
    node->SetInput(0, leaf);
    stage.params.time = 5100;
    stage.params.clipTime = 100;
    const auto ask = [&](const SampleSet& samples) {
        node->samples = samples;
        node->RequestHostFrames(stage.params, stage.results);
        return leaf->lastParams;
    };
    EXPECT_EQ(ask({{2000, {{2000}}}}).fieldSelection, Vellum::kFieldSelection_First);
    EXPECT_EQ(ask({{2000, {{2500}}}}).fieldSelection, Vellum::kFieldSelection_Second);
    EXPECT_EQ(ask({{2000, {{2000}, {2500}}}}).fieldSelection, Vellum::kFieldSelection_Frame);
    EXPECT_EQ(ask({{2000, {{2500}}}}).clipTime, 2000);
    EXPECT_EQ(leaf->lastParams.time, 7000);

    node->samples = {{1000, {{1000}}}, {2000, {{2000}}}};
    leaf->status = Ostrand::kStatus_Failure;
    stage.TakeLog();
    EXPECT_EQ(node->CollectHostFrames(stage.params, stage.results, {}), Ostrand::kStatus_Failure);
    EXPECT_EQ(node->EndFrame({}, stage.params, stage.results, 2), 0);
    EXPECT_THAT(stage.log, ElementsAre("leaf CollectHostFrames", "leaf EndFrame 2", "leaf EndFrame 2"));
}

}  // namespace
}  // namespace Vantrel::Testing
