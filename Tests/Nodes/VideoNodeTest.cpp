// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

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
    const std::pair<const char*, NodeType> kKinds[] = {{"Clip", NodeType::kClip},
                                                       {"Compositor", NodeType::kCompositor},
                                                       {"Transition", NodeType::kTransition},
                                                       {"Effect", NodeType::kEffect},
                                                       {"Disabled", NodeType::kDisabled},
                                                       {"Multicam", NodeType::kMulticam},
                                                       {"Media", NodeType::kMedia},
                                                       {"Preview", NodeType::kPreview},
                                                       {"Adjustment", NodeType::kAdjustment},
                                                       {"SolidColor", NodeType::kUnknown},
                                                       {"RenderableNodeClipImp", NodeType::kUnknown},
                                                       {"RenderableNodeClipImpl ", NodeType::kUnknown},
                                                       {"", NodeType::kUnknown}};
    for (const auto& [kind, type] : kKinds) EXPECT_EQ(View({kind})->GetNodeType(), type) << kind;
    EXPECT_TRUE(Is<VideoMediaNode>(View({"Preview"})));
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

TEST_F(VideoNodeTest, PropertiesAreParsedFromTextAndMissingOnesKeepTheirPresets) {
    FakeNode node{"Media"};
    node.properties = {{"color", "4294967295"}, {"broken", "A"}, {"two", "2"}, {"MediaNode::RemoveFlicker", "1"}};
    const VideoNodeRef view = View(node);
    const std::pair<const char*, std::int32_t> kTexts[] = {{"abc", 0}, {" -12x", -12}, {"5000000000", 0}, {"7", 7}};
    for (const auto& [text, expected] : kTexts) {  // beyond 32 bits isn't a number
        host.nodes[2].properties["number"] = text;
        std::int32_t number = 5;
        EXPECT_EQ(view->GetIntProperty("number", number), 0);
        EXPECT_EQ(number, expected) << text;
        EXPECT_EQ(view->GetIntProperty("none", number), Ostrand::kStatus_Failure);
        EXPECT_EQ(number, expected) << "left as it was";
    }
    bool flag = false;
    EXPECT_EQ(view->GetBoolProperty("two", flag), 0);
    EXPECT_TRUE(flag);
    EXPECT_EQ(view->GetBoolProperty("none", flag), Ostrand::kStatus_Failure);
    EXPECT_FALSE(flag) << "a missing flag becomes false";
    std::uint32_t color = 0;
    EXPECT_EQ(view->GetColorProperty("color", color), 0);
    EXPECT_EQ(color, 0x00FFFFFFU);
    Marl::BinaryData data;
    EXPECT_LT(view->GetBinaryProperty("broken", data), 0);
    const auto media = boost::dynamic_pointer_cast<VideoMediaNode>(view);
    EXPECT_EQ(media->GetStreamPixelAspectRatio(), Vellum::kPixelAspectRatio_Square);
    host.nodes[2].properties["MediaNode::ClipScaleToFrameSize"] = "1";
    EXPECT_EQ(media->GetClipScaleToFramePolicy(), 1) << "the older key serves where the newer is missing";
    host.ResetCounts();
    EXPECT_TRUE(media->HasFieldOptions());
    EXPECT_EQ(host.Count("GetProperty"), 3) << "the first option that is set ends the search";
    host.sequences[kTimeline].fieldType = 9;
    SequenceInfo info;
    EXPECT_EQ(GetSequenceInfo(kTimeline, info), 0);
    EXPECT_EQ(info.fieldType, Vellum::kFieldType_Unknown) << "converted from the host's";
    EXPECT_EQ(GetSequenceInfo(99, info), Ostrand::kStatus_Failure);
}

TEST_F(VideoNodeTest, ParametersComeInTheirTypes) {
    FakeNode node{"Effect"};
    node.params[0] = FakeParam(std::uint8_t{2});
    node.params[1] = FakeParam(std::uint16_t{60000});
    node.params[2] = FakeParam(std::int32_t{-7}).At(50, std::int32_t{9});
    node.params[3] = FakeParam(std::int64_t{1} << 40);
    node.params[6] = FakeParam(std::uint64_t{0xFFFF000080000000U | 0xFF00U});
    const VideoNodeRef view = View(node);
    EXPECT_EQ(view->GetByteParam(0, 0), 2);
    EXPECT_EQ(view->GetShortParam(1, 0), 60000);
    EXPECT_EQ(view->GetIntParam(2, 49), -7);
    EXPECT_EQ(view->GetIntParam(2, 50), 9);
    EXPECT_EQ(view->GetInt64Param(3, 0), std::int64_t{1} << 40);
    float a = 0, b = 0, c = 0, d = 0;
    view->GetColorParam(6, 0, a, b, c, d);
    EXPECT_EQ(a, 1.0F) << "0xFF00 is exactly one";
    EXPECT_EQ(b, 32768.0F / 65280.0F);
    EXPECT_GT(d, 1.0F) << "0xFFFF isn't clamped";
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

}  // namespace
}  // namespace Vantrel::Testing
