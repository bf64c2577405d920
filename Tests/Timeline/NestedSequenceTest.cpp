// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "Tests/Timeline/TimelineTester.h"

namespace Vantrel::Testing {
namespace {

/// A clip at 0..1000 of an inner sequence that holds a clip with two effects at 0..300 and a plain one at 300..800.
class NestedSequence : public TimelineTester {
protected:
    NestedSequence() {
        AddNestedClip(10);
        AddEffect(20, "Blur");
        AddEffect(21, "TQ.XQVE Motion");
        AddPlainClip(11, {20, 20, 21});
        AddPlainClip(12);
        AddSegment(kInner, 0, 300, 11);
        AddSegment(kInner, 300, 800, 12, 60);
    }
};

TEST_F(NestedSequence, ItsTreesGoToItsNodeAndItsWorkIsCounted) {
    const SegmentInfo info = Build(10);
    EXPECT_EQ(info.out, 1000);
    EXPECT_TRUE(info.nested && info.accelerated && !info.flattened);
    EXPECT_EQ(info.effectCount, 0);
    EXPECT_EQ(info.nestedEffectCount, 2);
    EXPECT_EQ(info.nestedIntrinsicCount, 1);
    EXPECT_EQ(info.nestedLayerCount, 1) << "no stack anywhere";

    const ProbeNode& node = Probe(info.tree);
    EXPECT_EQ(node.key, "NestedTimelineNode");
    EXPECT_EQ(Describe(node.defaultTree), "BlackVideoSource");
    ASSERT_EQ(node.segmentTrees.size(), 2U);
    EXPECT_EQ(Describe(node.segmentTrees[0].tree), "TQ.XQVE Motion(Blur(Blur(HostRenderClip)))");
    EXPECT_EQ(node.segmentTrees[1].start, 300);
    EXPECT_EQ(node.segmentTrees[1].sourceStart, 60);
    EXPECT_EQ(node.segmentTrees[1].end, 800);
}

TEST_F(NestedSequence, ItsRangeFollowsOffsetAndSpeed) {
    host.sequences[kTop].segments.clear();
    AddSegment(kTop, 100, 300, 10, 50);
    host.nodes[510].properties["MediaNode::ClipSpeed"] = "2.0";
    Read();
    const SegmentInfo info = InfoAt(100);
    EXPECT_TRUE(info.hostPart) << "a nested sequence at another speed needs the host";
    const auto& trees = Probe(info.tree).segmentTrees;
    ASSERT_EQ(trees.size(), 2U) << "200..600 is the inner 100..500";
    EXPECT_EQ(trees[0].start, 0) << "in the inner sequence's own time, in which it is rendered";
    EXPECT_EQ(trees[0].end, 300);
    EXPECT_EQ(trees[1].start, 300);
    EXPECT_EQ(trees[1].end, 800);
}

TEST_F(NestedSequence, WithoutANodeForItThePiecesGoIntoTheMaps) {
    unregistered.insert("NestedTimelineNode");
    const std::string tree = "TQ.XQVE Motion(Blur(Blur(HostRenderClip)))";
    EXPECT_EQ(Describe(Build(10).tree), tree) << "a host render in its place is no node for it";
    refused.insert("NestedTimelineNode");
    const SegmentInfo first = Build(10);
    EXPECT_EQ(Describe(first.tree), tree);
    EXPECT_EQ(first.out, 300);
    EXPECT_EQ(InfoAt(300).guid, NumberedGuid(12));
    EXPECT_EQ(InfoAt(300).offset, 60);
    EXPECT_EQ(Describe(InfoAt(900).tree), "BlackVideoSource");
    EXPECT_EQ(InfoAt(900).out, 1000);
}

TEST_F(NestedSequence, WhenItCannotBeReadItsSegmentHasNoEntry) {
    host.sequences[kInner].infoFails = true;
    AddPlainClip(13);
    AddSegment(kTop, 0, 1000, 10);
    AddSegment(kTop, 1000, 2000, 13);
    Read();
    SegmentInfo info;
    EXPECT_EQ(timeline->GetSegmentInfo(500, info, false), 11);
    EXPECT_EQ(timeline->GetSegmentInfo(500, info, true), 11);
    EXPECT_EQ(InfoAt(1500).guid, NumberedGuid(13)) << "the walk over the others goes on";
}

TEST_F(NestedSequence, OneThatContainsItselfIsBlackThere) {
    // The inner sequence's second clip is the outer one, then the inner one itself.
    for (const std::uint32_t contained : {kTop, kInner}) {
        AddNestedClip(12);
        host.nodes[512].properties["MediaNode::NestedSequenceTimelineID"] = std::to_string(contained);
        const auto trees = Probe(Build(10).tree).segmentTrees;
        ASSERT_EQ(trees.size(), 2U);
        const ProbeNode& endless = Probe(trees[1].tree);
        EXPECT_EQ(endless.key, "NestedTimelineNode");
        EXPECT_TRUE(endless.segmentTrees.empty());
        EXPECT_EQ(Describe(endless.defaultTree), "BlackVideoSource");
    }
}

}  // namespace
}  // namespace Vantrel::Testing
