// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gmock/gmock.h>

#include "Src/VideoNodes/VideoClipNode.h"
#include "Src/VideoNodes/VideoStructureNodes.h"
#include "Src/VideoNodes/VideoTransitionNode.h"
#include "Tests/Support/HostedTest.h"

namespace Vantrel::Testing {
namespace {

constexpr std::uint32_t kTimeline = 7;

class VideoNodeTest : public HostedTest {
protected:
    /// A view as the engine gets it: of a node that the host has counted.
    VideoNodeRef View(const FakeNode& node) {
        host.nodes[2] = node;
        host.nodes[1].kind = "Compositor";
        host.nodes[1].inputs = {{2, 40}};
        return AcquireInput(kTimeline, Parent()->GetNodeID(), 0, 100);
    }
    const VideoNodeRef& Parent() {
        if (!mParent) mParent = AcquireRoot(host, kTimeline);
        return mParent;
    }

private:
    VideoNodeRef mParent;
};

template <class View>
bool Is(const VideoNodeRef& node) {
    return dynamic_cast<const View*>(node.get()) != nullptr;
}

TEST_F(VideoNodeTest, KindTextsSelectTheView) {
    EXPECT_TRUE(Is<VideoClipNode>(View({"Clip"})));
    EXPECT_TRUE(Is<VideoCompositorNode>(View({"Compositor"})));
    EXPECT_TRUE(Is<VideoTransitionNode>(View({"Transition"})));
    EXPECT_TRUE(Is<VideoEffectNode>(View({"Effect"})));
    EXPECT_TRUE(Is<VideoDisabledNode>(View({"Disabled"})));
    EXPECT_TRUE(Is<VideoMultiCamNode>(View({"Multicam"})));
    EXPECT_TRUE(Is<VideoAdjustmentNode>(View({"Adjustment"})));
    EXPECT_EQ(View({"Media"})->GetNodeType(), NodeType::kMedia);
    EXPECT_EQ(View({"Preview"})->GetNodeType(), NodeType::kPreview);
    EXPECT_TRUE(Is<VideoMediaNode>(View({"Preview"})));
    for (const char* kind : {"SolidColor", "RenderableNodeClipImp", "RenderableNodeClipImpl ", ""}) {
        EXPECT_EQ(View({kind})->GetNodeType(), NodeType::kUnknown) << kind;
    }
    FakeNode silent{"Clip"};
    silent.infoFails = true;
    EXPECT_EQ(View(silent)->GetNodeType(), NodeType::kUnknown);
}

TEST_F(VideoNodeTest, AViewHoldsItsNodeAndKnowsItsPlace) {
    FakeNode node{"Media"};
    node.hash = {9, 8, 7, {6}};
    node.flags = kNodeFlag_Still;
    VideoNodeRef view = View(node);
    VideoNodeRef shared = view;
    EXPECT_EQ(view->GetTimeOffset(), 140);
    EXPECT_EQ(view->GetTimelineID(), kTimeline);
    EXPECT_EQ(view->GetHash(), node.hash);
    EXPECT_TRUE(view->IsStill());
    view.reset();
    EXPECT_EQ(host.GetReferences(2), 1);
    shared.reset();
    EXPECT_EQ(host.GetReferences(2), 0);
    EXPECT_FALSE(MakeVideoNode(kTimeline, 0, 0));
    EXPECT_FALSE(AcquireInput(kTimeline, Parent()->GetNodeID(), 5, 0)) << "an input that isn't there";
}

TEST_F(VideoNodeTest, NumbersAreParsedFromTextAndMissingOnesKeepTheirPresets) {
    FakeNode node{"Media"};
    node.properties = {{"text", "abc"},         {"two", "2"},        {"zero", "0"},           {"negative", " -12x"},
                       {"large", "5000000000"}, {"double", "2.5e1"}, {"color", "4294967295"}, {"binary", "AQID"},
                       {"broken", "A"}};
    const VideoNodeRef view = View(node);
    std::int32_t number = 5;
    EXPECT_EQ(view->GetIntProperty("text", number), 0);
    EXPECT_EQ(number, 0);
    EXPECT_EQ(view->GetIntProperty("negative", number), 0);
    EXPECT_EQ(number, -12);
    EXPECT_EQ(view->GetIntProperty("large", number), 0);
    EXPECT_EQ(number, 0) << "beyond 32 bits isn't a number";
    number = 5;
    EXPECT_EQ(view->GetIntProperty("none", number), Ostrand::kStatus_Failure);
    EXPECT_EQ(number, 5);
    bool flag = false;
    EXPECT_EQ(view->GetBoolProperty("two", flag), 0);
    EXPECT_TRUE(flag);
    EXPECT_EQ(view->GetBoolProperty("none", flag), Ostrand::kStatus_Failure);
    EXPECT_FALSE(flag) << "a missing flag becomes false";
    std::int64_t large = 0;
    EXPECT_EQ(view->GetInt64Property("large", large), 0);
    EXPECT_EQ(large, 5000000000);
    double real = 0.0;
    EXPECT_EQ(view->GetDoubleProperty("double", real), 0);
    EXPECT_EQ(real, 25.0);
    std::uint32_t color = 0;
    EXPECT_EQ(view->GetColorProperty("color", color), 0);
    EXPECT_EQ(color, 0x00FFFFFFU);
    Marl::BinaryData data;
    EXPECT_EQ(view->GetBinaryProperty("binary", data), 0);
    EXPECT_THAT(data, ::testing::ElementsAre(1, 2, 3));
    EXPECT_LT(view->GetBinaryProperty("broken", data), 0);
}

TEST_F(VideoNodeTest, NamedAccessorsReadTheirKeysAndDefaults) {
    const auto bare = boost::dynamic_pointer_cast<VideoMediaNode>(View({"Media"}));
    EXPECT_EQ(bare->GetStreamPixelAspectRatio(), Vellum::kPixelAspectRatio_Square);
    EXPECT_EQ(bare->GetClipSpeed(), 1.0);
    EXPECT_EQ(bare->GetStreamAlphaType(), Vellum::kAlphaType_Straight);
    EXPECT_EQ(bare->GetClipScaleToFramePolicy(), 0);
    EXPECT_FALSE(bare->HasFieldOptions());
    std::int32_t track = 3;
    EXPECT_LT(bare->GetSelectedMulticamTrack(track), 0);
    EXPECT_EQ(track, 0);

    FakeNode node{"Media"};
    node.properties = {{"MediaNode::StreamPixelAspectRatioNum", "4"},   {"MediaNode::StreamPixelAspectRatioDen", "3"},
                       {"MediaNode::StreamFrameWidth", "720"},          {"MediaNode::StreamFrameHeight", "576"},
                       {"MediaNode::ClipScaleToFrameSize", "1"},        {"MediaNode::RemoveFlicker", "1"},
                       {"MediaNode::MediaInstanceString", "1129270354"}};
    const auto media = boost::dynamic_pointer_cast<VideoMediaNode>(View(node));
    EXPECT_EQ(media->GetStreamPixelAspectRatio(), (Vellum::PixelAspectRatio{4, 3}));
    EXPECT_EQ(media->GetStreamFrameRect(), (Vellum::Rect{0, 0, 720, 576}));
    EXPECT_EQ(media->GetClipScaleToFramePolicy(), 1) << "the older key serves where the newer is missing";
    EXPECT_EQ(media->GetMediaInstanceString(), u"1129270354");
    host.ResetCounts();
    EXPECT_TRUE(media->HasFieldOptions());
    EXPECT_EQ(host.Count("GetProperty"), 3) << "the first option that is set ends the search";
}

TEST_F(VideoNodeTest, ParametersComeInTheirTypes) {
    FakeNode node{"Effect"};
    node.params[0] = FakeParam(std::uint8_t{2});
    node.params[1] = FakeParam(std::uint16_t{60000});
    node.params[2] = FakeParam(std::int32_t{-7}).At(50, std::int32_t{9});
    node.params[3] = FakeParam(std::int64_t{1} << 40);
    node.params[4] = FakeParam(0.25F);
    node.params[5] = FakeParam(0.125);
    node.params[6] = FakeParam(std::uint64_t{0xFFFF000080000000U | 0xFF00U});
    node.params[7] = FakeParam(FakePoint{0.5, -0.25});
    const VideoNodeRef view = View(node);
    EXPECT_TRUE(view->GetBoolParam(0, 0));
    EXPECT_EQ(view->GetByteParam(0, 0), 2);
    EXPECT_EQ(view->GetShortParam(1, 0), 60000);
    EXPECT_EQ(view->GetIntParam(2, 49), -7);
    EXPECT_EQ(view->GetIntParam(2, 50), 9);
    EXPECT_EQ(view->GetInt64Param(3, 0), std::int64_t{1} << 40);
    EXPECT_EQ(view->GetFloatParam(4, 0), 0.25F);
    EXPECT_EQ(view->GetDoubleParam(5, 0), 0.125);
    float a = 0, b = 0, c = 0, d = 0;
    view->GetColorParam(6, 0, a, b, c, d);
    EXPECT_EQ(a, 1.0F) << "0xFF00 is exactly one";
    EXPECT_EQ(b, 32768.0F / 65280.0F);
    EXPECT_EQ(c, 0.0F);
    EXPECT_GT(d, 1.0F) << "0xFFFF isn't clamped";
    double x = 0, y = 0;
    view->GetPointParam(7, 0, x, y);
    EXPECT_EQ(x, 0.5);
    EXPECT_EQ(y, -0.25);
    EXPECT_EQ(view->GetFloatParam(99, 0), 0.0F) << "a parameter that isn't there is what an empty record holds";
    std::int64_t ticks = 0;
    std::int32_t keyframe = 0;
    EXPECT_EQ(view->GetNextKeyframeTime(2, 0, ticks, keyframe), 0);
    EXPECT_EQ(ticks, 50);
    EXPECT_EQ(view->GetNextKeyframeTime(2, 50, ticks, keyframe), Ostrand::kStatus_Failure);
}

/// A clip at offset 140 with media (3) and an effect (4); its own time runs at double speed.
class ClipTimeTest : public VideoNodeTest {
protected:
    VideoNodeRef Clip(const std::map<std::string, std::string>& properties) {
        host.nodes[3].kind = "Media";
        host.nodes[4].kind = "Effect";
        FakeNode clip{"Clip"};
        clip.inputs = {{3, 5}};
        clip.operators = {4};
        clip.properties = properties;
        clip.transformTime = [](std::int64_t ticks) { return ticks * 2; };
        return View(clip);
    }
};

TEST_F(ClipTimeTest, TimesAreMappedUnderTheClip) {
    const VideoNodeRef clip = Clip({});
    const VideoMediaNodeRef media = GetClipMedia(clip);
    const VideoEffectNodeRef effect = GetEffect(clip, 0);
    EXPECT_EQ(media->GetTimeOffset(), 145);
    EXPECT_EQ(effect->GetOperatorIndex(), 0);
    EXPECT_EQ(effect->GetParent(), clip);
    EXPECT_EQ(media->ToNodeTime(200, true), (200 - 145) * 2);
    EXPECT_EQ(effect->ToNodeTime(200, true), (200 - 140) * 2);
    EXPECT_EQ(effect->ToNodeTime(200, false), 60);
    EXPECT_FALSE(GetEffect(clip, 1));
    EXPECT_FALSE(GetClipMedia({}));
}

TEST_F(ClipTimeTest, AHeldClipStopsItsMediaAndItsEffectsOnlyIfItSaysSo) {
    const VideoNodeRef held = Clip({{"ClipNode::FrameHoldAtTime", "77"}});
    host.ResetCounts();
    EXPECT_EQ(GetClipMedia(held)->ToNodeTime(200, true), 77);
    EXPECT_EQ(GetEffect(held, 0)->ToNodeTime(200, true), 120);
    EXPECT_EQ(host.Count("TransformTime"), 1) << "for the hold the host isn't asked";
    const VideoNodeRef all = Clip({{"ClipNode::FrameHoldAtTime", "77"}, {"ClipNode::FrameHoldFilters", "1"}});
    EXPECT_EQ(GetEffect(all, 0)->ToNodeTime(200, true), 77);
}

TEST_F(VideoNodeTest, SegmentListsAreReadByModeAndReleasedOnce) {
    FakeSequence& sequence = host.sequences[kTimeline];
    sequence.hash = {1, 1, 1, {1}};
    sequence.segments = {{0, 10, 2, {5, 5, 5, {}}, 1}};
    sequence.aspect = {16, 15};
    sequence.fieldType = 9;
    host.nodes[1].kind = "Clip";
    {
        VideoSegmentsHandle handle(kTimeline, SegmentsMode::kPlain, "");
        VideoSegmentsHandle previews(kTimeline, SegmentsMode::kNestedPreviews, "");
        ASSERT_TRUE(handle.IsValid());
        EXPECT_EQ(previews.GetSegmentCount(), 0);
        Guid hash;
        EXPECT_EQ(handle.GetSegmentsHash(hash), 0);
        EXPECT_EQ(hash, sequence.hash);
        VideoSegment segment;
        EXPECT_EQ(handle.GetSegmentInfo(0, segment), 0);
        EXPECT_EQ(segment.offset, 2);
        EXPECT_TRUE(Is<VideoClipNode>(AcquireRootNode(handle, 0)));
        EXPECT_LT(handle.GetSegmentInfo(1, segment), 0);
        handle.Release();
        EXPECT_FALSE(handle.IsValid());
    }
    EXPECT_EQ(host.Count("ReleaseVideoSegments"), 2);
    EXPECT_FALSE(VideoSegmentsHandle(99, SegmentsMode::kPreviews, "").IsValid());
    SequenceInfo info;
    EXPECT_EQ(GetSequenceInfo(kTimeline, info), 0);
    EXPECT_EQ(info.aspect, (Vellum::PixelAspectRatio{16, 15}));
    EXPECT_EQ(info.fieldType, Vellum::kFieldType_Unknown) << "converted from the host's";
    EXPECT_EQ(GetSequenceInfo(99, info), Ostrand::kStatus_Failure);
}

}  // namespace
}  // namespace Vantrel::Testing
