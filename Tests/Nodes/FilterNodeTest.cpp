// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Nodes/FilterNode.h"

#include <sstream>

#include <gmock/gmock.h>

#include "Src/Nodes/FinishedInputs.h"
#include "Tests/Nodes/ProbeNodes.h"
#include "Tests/Support/HostedTest.h"

namespace Vantrel::Testing {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

class FilterNodeTest : public HostedTest {
protected:
    FilterNodeTest() {
        leaf->frame = FakeFrame::Make();
        node->SetInput(0, leaf);
        node->hash = HashOf(1);
    }
    /// The description of a segment's root, scripted as node 1.
    VideoNodeRef Describe(const FakeNode& root) {
        host.nodes[1] = root;
        return AcquireRoot(host);
    }
    FakeFrameCache& DeviceCache() { return stage.device->DeviceMemory().cache; }

    ProbeStage stage;
    ProbeLeafRef leaf = stage.Leaf("leaf");
    ProbeFilterRef node = stage.Filter("node");
    VideoFrameRef frame;
};

TEST_F(FilterNodeTest, AFrameIsRenderedInPlaceThenFoundUntilItEnds) {
    EXPECT_EQ(stage.Render(*node, frame), 0);
    EXPECT_EQ(frame, leaf->frame) << "the input's frame goes through the slot";
    EXPECT_EQ(Ostrand::Demand<Marl::IFrameIdentity>(frame)->GetHash(), HashOf(1));
    EXPECT_FALSE(node->mFrameSlot);
    EXPECT_THAT(stage.TakeLog(), ElementsAre("leaf RenderFrame", "node Render"));

    VideoFrameRef again;
    EXPECT_EQ(stage.Render(*node, again), 0);
    EXPECT_EQ(again, frame);
    EXPECT_THAT(stage.TakeLog(), IsEmpty()) << "neither the input nor Render runs";

    node->EndFrame({}, stage.params, stage.results, 0);
    stage.TakeLog();
    stage.Render(*node, again);
    EXPECT_THAT(stage.TakeLog(), ElementsAre("leaf RenderFrame", "node Render"));
}

TEST_F(FilterNodeTest, AStoredFrameThatWasRenderedOnIsDropped) {
    const VideoFrameRef other = FakeFrame::Make();
    Ostrand::Demand<Marl::IFrameIdentity>(other)->SetHash(HashOf(2));
    stage.results->StoreFrame(HashOf(1), other);
    const VideoFrameRef cached = FakeFrame::Make();
    Ostrand::Demand<Marl::IFrameIdentity>(cached)->SetHash(HashOf(1));
    DeviceCache().CacheFrame(HashOf(1), cached);
    EXPECT_EQ(stage.Render(*node, frame), 0);
    EXPECT_EQ(frame, cached) << "the lookup goes on in the device's cache";
    EXPECT_THAT(stage.log, IsEmpty());

    // A node without a fingerprint has changed the cached frame.
    stage.results = boost::make_shared<RenderResults>();
    Ostrand::Demand<Marl::IFrameIdentity>(cached)->SetHash({});
    EXPECT_EQ(stage.Render(*node, frame), 0);
    EXPECT_NE(frame, cached);
}

TEST_F(FilterNodeTest, WithoutCachingTheInputPassesThrough) {
    node->SuppressCaching();
    EXPECT_EQ(stage.Render(*node, frame), 0);
    EXPECT_EQ(frame, leaf->frame);
    EXPECT_EQ(node->hashCalls, 0);
    EXPECT_THAT(stage.TakeLog(), ElementsAre("leaf RenderFrame"));

    leaf->frame.Reset();
    node->work = MakesFrame(FakeFrame::Make());
    EXPECT_EQ(stage.Render(*node, frame), 0);
    EXPECT_TRUE(frame);
    EXPECT_THAT(stage.TakeLog(), ElementsAre("leaf RenderFrame", "node Render"));
    EXPECT_FALSE(stage.results->FindFrame(HashOf(1)));

    stage.results->StoreFrame(HashOf(1), frame);
    node->EndFrame({}, stage.params, stage.results, 0);
    EXPECT_TRUE(stage.results->FindFrame(HashOf(1))) << "nothing of its own was stored, so nothing is removed";
    EXPECT_TRUE(node->IsCaching());
}

TEST_F(FilterNodeTest, ADisabledDescriptionPassesThrough) {
    const ProbeFilterRef disabled = stage.Filter("disabled", false, false, Describe({"Disabled"}));
    disabled->hash = HashOf(3);
    disabled->SetInput(0, leaf);
    EXPECT_EQ(stage.Render(*disabled, frame), 0);
    EXPECT_EQ(frame, leaf->frame);
    disabled->EndFrame({}, stage.params, stage.results, 0);
    EXPECT_EQ(disabled->hashCalls, 0);
}

TEST_F(FilterNodeTest, ANilFingerprintIsSetButNothingIsKept) {
    node->hash = Guid();
    Ostrand::Demand<Marl::IFrameIdentity>(leaf->frame)->SetHash(HashOf(5));
    EXPECT_EQ(stage.Render(*node, frame), 0);
    EXPECT_TRUE(Ostrand::Demand<Marl::IFrameIdentity>(frame)->GetHash().IsNil());
    EXPECT_FALSE(stage.results->FindFrame(Guid()));
    stage.Render(*node, frame);
    EXPECT_THAT(stage.log, ElementsAre("leaf RenderFrame", "node Render", "leaf RenderFrame", "node Render"));
}

TEST_F(FilterNodeTest, OnlyStillsOfStillMediaOutliveTheRequest) {
    FakeNode clip{"Clip"};
    clip.inputs = {{3}};
    clip.operators = {4};
    host.nodes[3].kind = "Media";
    host.nodes[4].kind = "Effect";
    host.nodes[4].flags = kNodeFlag_Still;
    const VideoNodeRef clipView = Describe(clip);
    for (const bool mediaIsStill : {false, true}) {
        host.nodes[3].flags = mediaIsStill ? kNodeFlag_Still : 0;
        const ProbeFilterRef still = stage.Filter("still", false, false, GetEffect(clipView, 0));
        still->hash = HashOf(mediaIsStill ? 11 : 10);
        still->work = MakesFrame(FakeFrame::Make());
        stage.Render(*still, frame);
        EXPECT_TRUE(stage.results->FindFrame(*still->hash));
        EXPECT_EQ(static_cast<bool>(DeviceCache().FindFrame(*still->hash)), mediaIsStill);
    }
}

TEST_F(FilterNodeTest, FailuresGoUpAndLeaveNothingBehind) {
    leaf->status = Ostrand::kStatus_Failure;
    frame = FakeFrame::Make();
    EXPECT_EQ(stage.Render(*node, frame), Ostrand::kStatus_Failure);
    EXPECT_FALSE(frame) << "the out frame is emptied";
    EXPECT_THAT(stage.TakeLog(), ElementsAre("leaf RenderFrame"));
    leaf->status = 0;
    leaf->frame.Reset();
    EXPECT_THROW(stage.Render(*node, frame), Ostrand::NullInterfaceException) << "success without a frame";
    node->work = [](VideoFrameRef& slot) -> Status {
        slot = FakeFrame::Make();
        throw std::bad_alloc();
    };
    EXPECT_THROW(stage.Render(*node, frame), std::bad_alloc);
    EXPECT_FALSE(node->mFrameSlot);
}

TEST_F(FilterNodeTest, ASelfRenderingNodeAsksForItsInputsItself) {
    const ProbeFilterRef self = stage.Filter("self", true);
    self->hash = HashOf(6);
    self->SetInput(0, leaf);
    self->work = MakesFrame(FakeFrame::Make());
    stage.device->SetTimingEnabled(true);
    EXPECT_EQ(stage.Render(*self, frame), 0);
    EXPECT_THAT(stage.TakeLog(), ElementsAre("self Render"));
    EXPECT_EQ(stage.device->Commands().marks, 0) << "it times itself";
    self->SuppressCaching();
    EXPECT_EQ(stage.Render(*self, frame), 0);
    EXPECT_EQ(frame, leaf->frame) << "out of the cache it passes its input through like any other";
}

TEST_F(FilterNodeTest, TimingsAreWrittenForNamedNodesAboveAHundredthOfAMillisecond) {
    stage.device->SetTimingEnabled(true);
    stage.device->Commands().markDistanceMs = 2.5F;
    const ProbeFilterRef unnamed = stage.Filter("");
    const ProbeFilterRef quick = stage.Filter("quick");
    quick->work = MakesFrame(FakeFrame::Make());
    unnamed->SetInput(0, node);
    node->SetInput(1, quick);
    stage.Render(*node, frame);
    unnamed->mRenderTime = 7.0F;
    quick->mRenderTime = 0.01F;
    std::ostringstream stream;
    unnamed->WriteTimings(stream);
    EXPECT_EQ(stream.str(), "node: 2.5ms\n") << "an unnamed node still visits its inputs";
}

}  // namespace
}  // namespace Vantrel::Testing
