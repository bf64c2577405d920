// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "Tests/Host/TimelineText.h"

/// Timelines small enough to be worked out by hand. Times are in frames at 24 a second.
namespace Vantrel::Host::Test {
namespace {

struct Expected {
    std::int64_t start;
    std::int64_t end;
    std::int64_t offset;
};

void ExpectSegments(const Described& described, const std::vector<Expected>& expected) {
    const std::vector<Segment>& segments = described.Segments();
    ASSERT_EQ(segments.size(), expected.size());
    for (std::size_t i = 0; i < expected.size(); ++i) {
        EXPECT_EQ(segments[i].start, expected[i].start * kFrame) << "segment " << i;
        EXPECT_EQ(segments[i].end, expected[i].end * kFrame) << "segment " << i;
        EXPECT_EQ(segments[i].offset, expected[i].offset * kFrame) << "segment " << i;
    }
}

/// The clip of a segment with a single layer.
const Node& OnlyClip(const Segment& segment) {
    EXPECT_EQ(segment.root->kind, NodeKind::kCompositor);
    EXPECT_EQ(segment.root->inputs.size(), 1U);
    return *segment.root->inputs.front().node;
}

std::string Property(const Node& node, const char* key) {
    const std::string* value = node.FindProperty(key);
    return value != nullptr ? *value : "(fails)";
}

TEST(WorkedExamples, TwoClipsAndAGap) {
    const Described described(
        Timeline({Track({Clip("A", 10, 48), Gap(24), Clip("B", Range(86424, 72), File("B.mov", 86400, 1000))})}));
    ExpectSegments(described, {{0, 48, 0}, {72, 144, 0}});
    EXPECT_EQ(described.Segments()[1].start, 762048000000);
    EXPECT_EQ(described.Segments()[1].end, 1524096000000);
    const Node& a = OnlyClip(described.Segments()[0]);
    const Node& b = OnlyClip(described.Segments()[1]);
    EXPECT_EQ(a.inputs.front().offset, -10 * kFrame);
    EXPECT_EQ(b.inputs.front().offset, -24 * kFrame);
    EXPECT_EQ(a.TransformTime(30 * kFrame), 30 * kFrame);
    EXPECT_EQ(Property(*b.inputs.front().node, "MediaNode::StartTimecodeOffset"), "914457600000000");
}

TEST(WorkedExamples, CrossDissolve) {
    const Described described(Timeline({Track({Clip("A", Range(0, 96), File("A.mov", 0, 200)), Dissolve(12, 12),
                                               Clip("B", Range(50, 96), File("B.mov", 0, 200))})}));
    ExpectSegments(described, {{0, 84, 0}, {84, 108, -12}, {108, 192, 12}});
    const NodeInput& transition = described.Segments()[1].root->inputs.front();
    EXPECT_EQ(transition.offset, -12 * kFrame);
    EXPECT_EQ(Property(*transition.node, "TransitionNode::TransitionMatchName"), "XQVE Cross Dissolve");
    EXPECT_EQ(Property(*transition.node, "TransitionNode::TransitionDuration"), "254016000000");
    ASSERT_EQ(transition.node->inputs.size(), 2U);
    EXPECT_EQ(transition.node->inputs[0].offset, -84 * kFrame);
    EXPECT_EQ(transition.node->inputs[1].offset, 12 * kFrame);
    const Node& a = *transition.node->inputs[0].node;
    const Node& b = *transition.node->inputs[1].node;
    EXPECT_EQ(Property(a, "ClipNode::TrackItemEndAsTicks"), std::to_string(96 * kFrame));
    EXPECT_EQ(Property(a, "ClipNode::EffectiveTrackItemEndAsTicks"), std::to_string(108 * kFrame));
    EXPECT_EQ(Property(b, "ClipNode::TrackItemStartAsTicks"), std::to_string(96 * kFrame));
    EXPECT_EQ(Property(b, "ClipNode::EffectiveTrackItemStartAsTicks"), std::to_string(84 * kFrame));
}

Json BlurKeys() {
    return {{"blurriness",
             {{"keyframes",
               {{{"t", Time(30)}, {"value", 0.0}, {"interp", "linear"}}, {{"t", Time(78)}, {"value", 48.0}}}}}}};
}

TEST(WorkedExamples, FreezeFrameAndAnEffect) {
    for (const bool hold : {true, false}) {
        Json more = Effects({Effect("TQ.XQVE Gaussian Blur 2", BlurKeys())});
        if (hold) more["effects"].push_back(Freeze());
        const Described described(Timeline({Track({Clip("C", 30, 48, more)})}));
        const Node& clip = OnlyClip(described.Segments()[0]);
        EXPECT_EQ(Property(clip, "ClipNode::FrameHoldAtTime"), hold ? "317520000000" : "(fails)");
        EXPECT_EQ(Property(clip, "ClipNode::ClipSpeed"), "1");
        EXPECT_EQ(clip.inputs.front().offset, hold ? 0 : -30 * kFrame);
        // Keyframes mean the same with and without the hold.
        const std::int64_t parameterTime = clip.TransformTime(24 * kFrame - clip.inputs.front().offset);
        EXPECT_EQ(parameterTime, 54 * kFrame);
        const Parameter& blurriness = *clip.operators.at(0)->FindParameter(0);
        EXPECT_DOUBLE_EQ(blurriness.At(parameterTime)[0], 24.0);
        EXPECT_EQ(blurriness.KeyAfter(0), 0);
        EXPECT_EQ(blurriness.KeyAfter(30 * kFrame), 1);
        EXPECT_EQ(blurriness.KeyAfter(78 * kFrame), std::nullopt);
    }
}

TEST(WorkedExamples, FiltersOfAHeldClipMayStandStillToo) {
    Json more = Effects({Effect("TQ.XQVE Gaussian Blur 2", BlurKeys()), Freeze()});
    more.update(Own({{"hold_filters", true}}));
    const Described described(Timeline({Track({Clip("C", 30, 48, more)})}));
    const ItemDetail& item = *OnlyClip(described.Segments()[0]).AsItem();
    EXPECT_EQ(item.time.AtItemTime(24 * kFrame).parameters, 30 * kFrame);
    EXPECT_EQ(item.time.AtItemTime(24 * kFrame).media, 30 * kFrame);
}

}  // namespace
}  // namespace Vantrel::Host::Test
