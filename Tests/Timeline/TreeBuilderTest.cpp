// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gmock/gmock.h>

#include "Tests/Timeline/TimelineTester.h"

namespace Vantrel::Testing {
namespace {

void ExpectCounts(const SegmentInfo& info, std::int32_t effects, std::int32_t intrinsics, std::int32_t transitions,
                  std::int32_t layers) {
    EXPECT_EQ(info.effectCount, effects);
    EXPECT_EQ(info.intrinsicCount, intrinsics);
    EXPECT_EQ(info.transitionCount, transitions);
    EXPECT_EQ(info.layerCount, layers);
}

class TreeBuilding : public TimelineTester {
protected:
    /// The whole segment shall come from the host.
    static void ExpectHostWhole(const SegmentInfo& info) {
        EXPECT_EQ(Describe(info.tree), "HostRenderSource");
        EXPECT_TRUE(info.hostWhole && info.hostPart && !info.accelerated && !info.realTime);
    }
};

TEST_F(TreeBuilding, AClipsEffectsStackOnItsMediaAndAreCounted) {
    AddEffect(20, "TQ.XQVE Motion");
    AddEffect(21, "Blur");
    AddEffect(22, "TQ.XQVE Opacity");
    AddEffect(23, "Levels");
    AddPlainClip(10, {20, 21, 22, 23});
    const SegmentInfo info = Build(10);
    EXPECT_EQ(Describe(info.tree), "Levels(TQ.XQVE Opacity(Blur(TQ.XQVE Motion(HostRenderClip))))");
    ExpectCounts(info, 2, 2, 0, 0);
    EXPECT_TRUE(info.accelerated && info.realTime && !info.hostPart && !info.hostWhole && !info.nested);

    const RenderRequirements& requirements = Probe(info.tree).requirements;
    EXPECT_EQ(requirements.frameRect, (Vellum::Rect{0, 0, 64, 36}));
    EXPECT_EQ(requirements.frameTicks, 10160640000);
}

TEST_F(TreeBuilding, SpeedSizeAndRateCountAsIntrinsicWork) {
    AddPlainClip(10);
    host.nodes[10].properties["ClipNode::ClipSpeed"] = "2";
    EXPECT_EQ(Build(10).intrinsicCount, 1) << "the clip's own";
    host.nodes[510].properties["MediaNode::ClipSpeed"] = "2";
    EXPECT_EQ(Build(10).intrinsicCount, 2) << "and the media's";
    host.nodes[510].properties["MediaNode::StreamFrameWidth"] = "32";
    EXPECT_EQ(Build(10).intrinsicCount, 2) << "size and rate count once";
    host.nodes[10].properties = {{"ClipNode::TimeRemapping", ""}};
    host.nodes[510].properties["MediaNode::StreamFrameWidth"] = "64";
    host.nodes[510].properties.erase("MediaNode::ClipSpeed");
    EXPECT_EQ(Build(10).intrinsicCount, 2) << "a remapping changes speed and rate, whatever it holds";
    EXPECT_EQ(Build(510).intrinsicCount, 0) << "media without a clip has nothing to differ from";
}

TEST_F(TreeBuilding, AnEffectOfTheHostResetsTheCountersOfItsClip) {
    AddEffect(20, "TQ.XQVE Motion");
    AddEffect(21, "Unknown");
    AddEffect(22, "Levels");
    AddPlainClip(10, {20, 21});
    unregistered.insert("Unknown");
    const SegmentInfo info = Build(10);
    EXPECT_EQ(Describe(info.tree), "HostRenderSubtree(TQ.XQVE Motion(HostRenderClip))");
    ExpectCounts(info, 0, 0, 0, 1);
    EXPECT_EQ(info.nestedLayerCount, 1);
    EXPECT_TRUE(info.hostPart && !info.hostWhole && !info.accelerated && !info.realTime);
}

TEST_F(TreeBuilding, WhatCannotBeBuiltGoesWholeToTheHost) {
    AddPlainClip(10);
    AddMedia(900);
    AddNode(11, "Clip", {900, 900});
    AddNode(12, "SolidColor");
    AddNode(13, "SomethingNew");
    AddNode(14, "Compositor", {10, 13});
    for (const std::uint32_t node : {11U, 12U, 13U, 14U}) {
        const SegmentInfo info = Build(node);
        ExpectHostWhole(info);
        EXPECT_EQ(Probe(info.tree).description->GetNodeID(), node);
    }
    refused.insert("HostRenderClip");
    ExpectHostWhole(Build(10));
    refused.insert("HostRenderSource");
    const SegmentInfo info = Build(10);
    EXPECT_FALSE(info.tree) << "the stretch is there, but nothing renders it";
    EXPECT_TRUE(info.hostWhole);
}

TEST_F(TreeBuilding, CompositorsStackTheirTracks) {
    AddEffect(20, "Blur");
    AddPlainClip(10, {20});
    AddPlainClip(11);
    AddPlainClip(12);
    AddNode(30, "Compositor", {10, 11, 12});
    SegmentInfo info = Build(30);
    EXPECT_EQ(Describe(info.tree), "LayerBlendNode(Blur(HostRenderClip), HostRenderClip, HostRenderClip)");
    ExpectCounts(info, 1, 0, 0, 3);

    AddNode(31, "Compositor", {10});
    ExpectCounts(Build(31), 1, 0, 0, 1);
    AddNode(32, "Compositor", {30});
    ExpectCounts(Build(32), 1, 0, 0, 3);
    AddNode(33, "Compositor", {0, 11});
    EXPECT_EQ(Describe(Build(33).tree), "LayerBlendNode(BlackVideoSource, HostRenderClip)");

    host.nodes[512].properties["MediaNode::MediaIsOffline"] = "1";
    info = Build(30);
    EXPECT_FALSE(info.realTime) << "real time is the and of all tracks";
    EXPECT_TRUE(info.accelerated);
}

TEST_F(TreeBuilding, WithoutACompositorOnlyABareClipIsBuilt) {
    unregistered.insert("LayerBlendNode");
    AddEffect(20, "Blur");
    AddPlainClip(10);
    AddPlainClip(11, {20});
    AddNode(30, "Compositor", {10});
    AddNode(31, "Compositor", {10, 10});
    AddNode(32, "Compositor", {11});
    AddNode(33, "Compositor", {510});
    EXPECT_EQ(Describe(Build(30).tree), "HostRenderClip");
    for (const std::uint32_t node : {31U, 32U, 33U}) ExpectHostWhole(Build(node));
}

TEST_F(TreeBuilding, TransitionsTakeTwoInputsAndResetWhenTheyNeedTheHost) {
    AddEffect(20, "Blur");
    AddPlainClip(10, {20});
    AddPlainClip(11);
    AddNode(30, "Transition", {10, 11});
    host.nodes[30].properties["TransitionNode::TransitionMatchName"] = "Wipe";
    SegmentInfo info = Build(30);
    EXPECT_EQ(Describe(info.tree), "Wipe(Blur(HostRenderClip), HostRenderClip)");
    ExpectCounts(info, 1, 0, 1, 0);

    needHost.insert("Blur");
    info = Build(30);
    ExpectCounts(info, 0, 0, 1, 1);
    EXPECT_TRUE(info.hostPart);

    needHost = {"Wipe"};
    info = Build(30);
    ExpectCounts(info, 0, 0, 0, 1);
    EXPECT_TRUE(info.hostPart);
    refused.insert("Wipe");
    ExpectHostWhole(Build(30));
}

TEST_F(TreeBuilding, EffectsOverSubtreesAndDisabledNodesPassTheirInputThrough) {
    AddPlainClip(10);
    AddEffect(30, "Blur");
    host.nodes[30].inputs = {{10}};
    AddNode(31, "Disabled", {30});
    const SegmentInfo info = Build(31);
    EXPECT_EQ(Describe(info.tree), "DisabledNode(Blur(HostRenderClip))");
    ExpectCounts(info, 1, 0, 0, 0);
    refused.insert("Blur");
    ExpectHostWhole(Build(31));
}

TEST_F(TreeBuilding, InputsInheritTheTimeOffsetOfTheirNode) {
    AddPlainClip(10);
    AddNode(31, "Compositor");
    host.nodes[31].inputs = {{10, 5}};
    AddNode(30, "Compositor");
    host.nodes[30].inputs = {{31, 70}};
    AddNode(32, "Disabled");
    host.nodes[32].inputs = {{30, 100}};
    const SegmentInfo info = Build(32);
    const ProbeNode& clip = Probe(Probe(Probe(Probe(info.tree).inputs[0]).inputs[0]).inputs[0]);
    EXPECT_EQ(clip.description->GetTimeOffset(), 175);
}

TEST_F(TreeBuilding, MediaIsJudgedByStateAndSubType) {
    AddPlainClip(10);
    auto& properties = host.nodes[510].properties;
    const auto infoFor = [this](const std::string& subType) {
        host.nodes[510].properties["MediaNode::StreamFrameVidSubType"] = subType;
        host.sequences[kTop].segments.clear();
        AddSegment(kTop, 0, 1000, 10);
        Read(false, 0x32767579);
        return InfoAt(0);
    };
    EXPECT_TRUE(infoFor(std::to_string(0x59565955)).realTime) << "native in such a sequence";
    EXPECT_FALSE(infoFor(std::to_string(0x55595659)).realTime) << "the byte-swapped code is not";
    SegmentInfo info = infoFor(std::to_string(0x444C594D));
    EXPECT_TRUE(info.hostPart && !info.accelerated && !info.realTime && !info.hostWhole);
    EXPECT_EQ(Describe(info.tree), "HostRenderClip");

    for (const char* state : {"MediaNode::MediaIsOffline", "MediaNode::MediaIsPending"}) {
        properties[state] = "1";
        info = infoFor(std::to_string(0x444C594D));
        EXPECT_TRUE(!info.realTime && !info.hostPart && info.accelerated) << state;
        EXPECT_EQ(Describe(info.tree), "HostRenderClip");
        properties.erase(state);
    }
}

TEST_F(TreeBuilding, PreviewsAlwaysNeedTheHost) {
    AddMedia(10);
    host.nodes[10].kind = "Preview";
    const SegmentInfo info = Build(10);
    EXPECT_EQ(Describe(info.tree), "HostRenderClip");
    EXPECT_TRUE(info.isPreview && info.hostPart && !info.hostWhole && !info.realTime);
}

TEST_F(TreeBuilding, ATrackThatAMulticamSourceLacksIsBlack) {
    AddPlainClip(10);
    AddMedia(11);
    host.nodes[510].inputs = {{11}};
    host.nodes[510].properties["MediaNode::SelectedMulticamTrack"] = "1";
    EXPECT_EQ(Describe(Build(10).tree), "BlackVideoSource");
    host.nodes[510].properties["MediaNode::SelectedMulticamTrack"] = "0";
    EXPECT_EQ(Describe(Build(10).tree), "HostRenderClip");
}

TEST_F(TreeBuilding, MulticamAnglesAreTilesAndFallBackOneByOne) {
    AddEffect(20, "Blur");
    AddPlainClip(10, {20});
    AddPlainClip(11, {20});
    AddNode(30, "Multicam");
    host.nodes[30].inputs = {{10, 40}, {0, 0}, {11, 0}};
    host.sequences[kTop].aspect = {5, 3};
    SegmentInfo info = Build(30);
    EXPECT_EQ(Describe(info.tree), "MulticamRenderNode(Blur(HostRenderClip), -, Blur(HostRenderClip))");
    ExpectCounts(info, 2, 0, 0, 0);
    EXPECT_EQ(info.nestedEffectCount, 2) << "the last angle's running total";
    const ProbeNode& angle = Probe(Probe(info.tree).inputs[0]);
    EXPECT_EQ(angle.requirements.pixelAspectRatio, (Vellum::PixelAspectRatio{2, 3}));
    EXPECT_EQ(angle.requirements.fieldType, 3U);
    EXPECT_EQ(angle.description->GetTimeOffset(), 40);

    unregistered.insert("NestedTimelineNode");
    info = Build(30);
    EXPECT_EQ(Describe(info.tree), "MulticamRenderNode(HostRenderSubtree, -, HostRenderSubtree)");
    EXPECT_EQ(Probe(Probe(info.tree).inputs[0]).description->GetTimeOffset(), 40) << "its own offset alone";
    EXPECT_TRUE(info.hostPart);
    refused.insert("HostRenderSubtree");
    ExpectHostWhole(Build(30));
}

TEST_F(TreeBuilding, AdjustmentLayersApplyTheirEffectsOrGoToTheHost) {
    AddPlainClip(10);
    AddNode(30, "Compositor", {10});
    AddEffect(20, "Blur");
    AddEffect(21, "Levels");
    AddPlainClip(11, {20, 21});
    AddMedia(40);
    AddNode(50, "Adjustment", {30, 11, 40});
    SegmentInfo info = Build(50);
    EXPECT_EQ(Describe(info.tree),
              "AdjustmentNode(LayerBlendNode(HostRenderClip), Levels(Blur(HostRenderClip)), HostRenderClip)");
    ExpectCounts(info, 2, 0, 0, 1);

    host.nodes[50].properties["AdjustmentNode::AdjustmentMediaIsOpaque"] = "1";
    EXPECT_EQ(Probe(Build(50).tree).inputs.size(), 2U);

    needHost.insert("Blur");
    created.clear();
    info = Build(50);
    EXPECT_EQ(Describe(info.tree), "HostRenderSubtree");
    EXPECT_THAT(created, ::testing::Not(::testing::Contains("Levels"))) << "the first effect settles it";
    EXPECT_TRUE(info.hostPart && !info.hostWhole);
    ExpectCounts(info, 0, 0, 0, 1);
    host.nodes[50].inputs.pop_back();
    host.nodes[50].inputs.pop_back();
    ExpectHostWhole(Build(50));
}

TEST_F(TreeBuilding, EveryNodeIsReleasedWithItsTree) {
    AddPlainClip(10);
    AddNode(30, "Compositor", {10});
    Build(30);
    EXPECT_EQ(host.GetReferences(30), 1);
    EXPECT_EQ(host.GetReferences(510), 1);
    AddPlainClip(11);
    host.sequences[kTop].segments.clear();
    AddSegment(kTop, 0, 1000, 11);
    Change();
    EXPECT_EQ(timeline->UpdateTimeline(), Ostrand::kStatus_OK);
    for (const std::uint32_t node : {30U, 10U, 510U}) EXPECT_EQ(host.GetReferences(node), 0) << node;
}

}  // namespace
}  // namespace Vantrel::Testing
