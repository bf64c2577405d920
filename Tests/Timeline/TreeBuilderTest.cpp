// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "Tests/Timeline/TimelineTester.h"

// Which trees are built; what they count as is for the random verdicts.
namespace Vantrel::Testing {
namespace {

class TreeBuilding : public TimelineTester {
protected:
    TreeBuilding() {
        AddEffect(20, "TQ.XQVE Motion");
        AddEffect(21, "Blur");
        AddEffect(22, "TQ.XQVE Opacity");
        AddEffect(23, "Levels");
        AddPlainClip(10);
        AddPlainClip(11, {20, 21, 22, 23});
        AddPlainClip(12, {21});
        AddMedia(40);
    }
};

TEST_F(TreeBuilding, EachNodeBecomesItsTreeOrGoesWholeToTheHost) {
    AddPlainClip(13, {21, 23});
    for (const std::uint32_t clip : {14U, 15U}) {
        AddPlainClip(clip);
        host.nodes[clip + 500].inputs = {{40}};
        host.nodes[clip + 500].properties["MediaNode::SelectedMulticamTrack"] = std::to_string(clip - 14);
    }
    AddMedia(41);
    host.nodes[41].kind = "Preview";
    AddNode(50, "Clip", {40, 40});
    AddNode(51, "SolidColor");
    AddNode(52, "SomethingNew");
    AddNode(60, "Compositor", {12, 10});
    AddNode(61, "Compositor", {10});
    AddNode(62, "Compositor", {60});
    AddNode(63, "Compositor", {0, 10});
    AddNode(64, "Compositor", {10, 52});
    AddNode(65, "Compositor", {12});
    AddNode(66, "Compositor", {40});
    AddNode(70, "Transition", {12, 10});
    host.nodes[70].properties["TransitionNode::TransitionMatchName"] = "Wipe";
    AddEffect(71, "Blur");
    host.nodes[71].inputs = {{10}};
    AddNode(72, "Disabled", {71});
    AddNode(80, "Multicam", {12, 0, 10});
    AddNode(90, "Adjustment", {61, 13, 40});
    AddNode(91, "Adjustment", {61, 13});
    host.nodes[91].properties["AdjustmentNode::AdjustmentMediaIsOpaque"] = "1";
    AddNode(92, "Adjustment", {61});
    const CreatorScript noBlend{{"LayerBlendNode"}}, noNested{{"NestedTimelineNode"}};
    const std::string whole = "HostRenderSource";
    const struct {
        std::uint32_t node;
        std::string tree;
        CreatorScript creator = {};
    } kRows[] = {
        {10, "HostRenderClip"},
        {10, whole, {{}, {}, {"HostRenderClip"}}},
        {10, "-", {{}, {}, {"HostRenderClip", "HostRenderSource"}}},
        {11, "Levels(TQ.XQVE Opacity(Blur(TQ.XQVE Motion(HostRenderClip))))"},
        {12, "HostRenderSubtree(HostRenderClip)", {{"Blur"}}},
        {14, "HostRenderClip"},
        {15, "BlackVideoSource"},
        {41, "HostRenderClip"},
        {50, whole},
        {51, whole},
        {52, whole},
        {60, "LayerBlendNode(Blur(HostRenderClip), HostRenderClip)"},
        {60, whole, noBlend},
        {61, "HostRenderClip", noBlend},
        {62, "LayerBlendNode(LayerBlendNode(Blur(HostRenderClip), HostRenderClip))"},
        {63, "LayerBlendNode(BlackVideoSource, HostRenderClip)"},
        {64, whole},
        {65, whole, noBlend},
        {66, whole, noBlend},
        {70, "Wipe(Blur(HostRenderClip), HostRenderClip)"},
        {70, whole, {{}, {}, {"Wipe"}}},
        {72, "DisabledNode(Blur(HostRenderClip))"},
        {72, whole, {{}, {}, {"Blur"}}},
        {80, "MulticamRenderNode(Blur(HostRenderClip), -, HostRenderClip)"},
        {80, "MulticamRenderNode(HostRenderSubtree, -, HostRenderSubtree)", noNested},
        {80, whole, {{"NestedTimelineNode"}, {}, {"HostRenderSubtree"}}},
        {90, "AdjustmentNode(LayerBlendNode(HostRenderClip), Levels(Blur(HostRenderClip)), HostRenderClip)"},
        {90, "HostRenderSubtree", {{}, {}, {}, {"Blur"}}},
        {91, "AdjustmentNode(LayerBlendNode(HostRenderClip), Levels(Blur(HostRenderClip)))"},
        {92, whole},
    };
    for (const auto& row : kRows) {
        static_cast<CreatorScript&>(*this) = row.creator;
        created.clear();
        const SegmentInfo info = Build(row.node);
        EXPECT_EQ(Describe(info.tree), row.tree) << row.node;
        EXPECT_EQ(info.hostWhole, row.tree == whole || row.tree == "-") << row.node;
        if (row.tree == whole) {
            EXPECT_EQ(Probe(info.tree).description->GetNodeID(), row.node);
        }
        if (row.tree != "HostRenderSubtree") continue;
        EXPECT_THAT(created, ::testing::Not(::testing::Contains("Levels"))) << "the first effect settles it";
    }
}

TEST_F(TreeBuilding, NodesGetTheSequencesFormatAndTheirPlaceInTime) {
    const RenderRequirements& requirements = Probe(Build(11).tree).requirements;
    EXPECT_EQ(requirements.frameRect, (Vellum::Rect{0, 0, 64, 36}));
    EXPECT_EQ(requirements.frameTicks, 10160640000);
    AddNode(31, "Compositor");
    host.nodes[31].inputs = {{10, 5}};
    AddNode(30, "Compositor");
    host.nodes[30].inputs = {{31, 70}};
    AddNode(32, "Disabled");
    host.nodes[32].inputs = {{30, 100}};
    const SegmentInfo info = Build(32);
    EXPECT_EQ(Probe(Probe(Probe(Probe(info.tree).inputs[0]).inputs[0]).inputs[0]).description->GetTimeOffset(), 175);
    // Of angles, whose pictures are tiles.
    AddNode(33, "Multicam");
    host.nodes[33].inputs = {{10, 40}, {0, 0}, {11, 0}};
    host.sequences[kTop].aspect = {5, 3};
    const auto angle = [this] { return Probe(Build(33).tree).inputs[0]; };
    EXPECT_EQ(Probe(angle()).requirements.pixelAspectRatio, (Vellum::PixelAspectRatio{2, 3}));
    EXPECT_EQ(Probe(angle()).requirements.fieldType, 3U);
    EXPECT_EQ(Probe(angle()).description->GetTimeOffset(), 40);
    unregistered.insert("NestedTimelineNode");
    EXPECT_EQ(Probe(angle()).description->GetTimeOffset(), 40) << "its own offset alone";
}

TEST_F(TreeBuilding, NativeSubTypesAreThoseOfTheSequence) {
    const auto infoFor = [this](std::uint32_t subType) {
        host.nodes[510].properties["MediaNode::StreamFrameVidSubType"] = std::to_string(subType);
        host.sequences[kTop].segments.clear();
        AddSegment(kTop, 0, 1000, 10);
        Read(false, 0x32767579);
        return InfoAt(0);
    };
    EXPECT_TRUE(infoFor(0x59565955).realTime) << "native in such a sequence";
    EXPECT_FALSE(infoFor(0x55595659).realTime) << "the byte-swapped code is not";
    const SegmentInfo info = infoFor(0x444C594D);
    EXPECT_TRUE(info.hostPart && !info.accelerated && !info.realTime && !info.hostWhole);
}

TEST_F(TreeBuilding, EveryNodeIsReleasedWithItsTree) {
    AddNode(30, "Compositor", {10});
    Build(30);
    EXPECT_EQ(host.GetReferences(30), 1);
    EXPECT_EQ(host.GetReferences(510), 1);
    host.sequences[kTop].segments.clear();
    AddSegment(kTop, 0, 1000, 11);
    Change();
    EXPECT_EQ(timeline->UpdateTimeline(), Ostrand::kStatus_OK);
    for (const std::uint32_t node : {30U, 10U, 510U}) EXPECT_EQ(host.GetReferences(node), 0) << node;
}

}  // namespace
}  // namespace Vantrel::Testing
