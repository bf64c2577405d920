// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/CompositorNode.h"
#include "Src/Filters/DisabledNode.h"
#include "Src/Filters/IntrinsicNode.h"
#include "Tests/Media/MediaDeviceTester.h"

namespace Vantrel::Testing {
namespace {

const Pixel kRed{0.0, 0.0, 1.0, 1.0};
const Pixel kBlue{1.0, 0.0, 0.0, 1.0};
const Pixel kHalfGreen{0.0, 1.0, 0.0, 0.5};

class CompositorDevice : public MediaDeviceTest {
protected:
    using Params = std::map<std::int32_t, FakeParam>;

    FrameLeafRef Leaf(const Pixel& color, int width = 64, int height = 36) {
        return FrameLeafRef(new FrameLeaf(Frame(Plain(width, height, color))));
    }
    /// A picture with the clip's opacity below its motion.
    RenderNodeRef Layer(const RenderNodeRef& picture, bool withOpacity = true, bool withMotion = true) {
        RenderNodeRef top = picture;
        for (const auto& [wanted, view] :
             {std::pair(withOpacity, MediaScript::Opacity()), std::pair(withMotion, MediaScript::Motion())}) {
            if (!wanted) continue;
            const RenderNodeRef node = script.Make<IntrinsicNode>(view, GetDevice());
            node->SetInput(0, top);
            top = node;
        }
        return top;
    }
    void SetMotion(const Params& params) { Merge(MediaScript::kMotion, params); }
    void SetOpacity(const Params& params) { Merge(MediaScript::kOpacity, params); }
    InterfaceRef<CompositorNode> Composite(const std::vector<RenderNodeRef>& layers) {
        const auto node = script.Make<CompositorNode>({}, GetDevice());
        for (std::size_t i = 0; i < layers.size(); ++i) node->SetInput(i, layers[i]);
        return node;
    }
    /// Leaves frames of the output's size in the pool that aren't empty: what isn't cleared shows.
    void PoisonPool() {
        const VideoFrameRef first = Frame(Plain(64, 36, {0.7, 0.7, 0.7, 0.7}));
        const VideoFrameRef second = Frame(Plain(64, 36, {0.7, 0.7, 0.7, 0.7}));
    }

private:
    void Merge(std::uint32_t node, const Params& params) {
        for (const auto& [index, value] : params) host.nodes[node].params[index] = value;
    }
};

TEST_P(CompositorDevice, ASingleLayerThatFillsTheFrameIsHandedOn) {
    const FrameLeafRef leaf = Leaf(kRed);
    const auto compositor = Composite({{}, Layer(leaf)});
    EXPECT_EQ(Render(*compositor), leaf->frame);
    EXPECT_EQ(leaf->lastToken, compositor.Get()) << "a layer can find its compositor";
    compositor->EndFrame({}, script.params, results, 0);

    EXPECT_NE(Render(*Composite({leaf, leaf})), leaf->frame) << "with a layer above it's drawn";

    const struct {
        Params motion;
        Params opacity;
    } changes[] = {{{{0, FakePoint{0.25, 0.5}}}, {}}, {{{1, 101.0F}}, {}}, {{{4, 0.01F}}, {}}, {{}, {{0, 99.999F}}}};
    for (const auto& change : changes) {
        script.ResetEffects();
        SetMotion(change.motion);
        SetOpacity(change.opacity);
        EXPECT_NE(Render(*Composite({Layer(leaf)})), leaf->frame);
    }
    script.ResetEffects();
    SetOpacity({{0, 99.9995F}});
    EXPECT_EQ(Render(*Composite({Layer(leaf)})), leaf->frame) << "almost full is full";
    script.params.pixelAspectRatio = {2, 1};
    EXPECT_NE(Render(*Composite({leaf})), leaf->frame);
}

TEST_P(CompositorDevice, TheBottomLayerHasNoBlendModeAndThenNoOpacity) {
    const FrameLeafRef leaf = Leaf(kRed);
    SetOpacity({{0, 30.0F}, {1, std::int32_t{Kiln::kBlend_Multiply}}});
    EXPECT_EQ(Render(*Composite({Layer(leaf)})), leaf->frame);
    SetOpacity({{1, std::int32_t{Kiln::kBlend_Normal}}});
    ExpectPixel(PixelOf(Render(*Composite({Layer(leaf)})), 5, 5), {0.0, 0.0, 1.0, 0.3});
}

TEST_P(CompositorDevice, WhatNoLayerCoversIsTransparent) {
    const auto corner = [this](const Params& motion, int width = 64, int height = 36) {
        script.ResetEffects();
        SetMotion(motion);
        PoisonPool();
        const FrameLeafRef leaf = Leaf(kRed, width, height);
        leaf->frame->SetOrigin({(width - 64) / 2, (height - 36) / 2});
        return PixelOf(Render(*Composite({Layer(leaf)})), 0, 0);
    };
    const Pixel clear{0.0, 0.0, 0.0, 0.0};
    ExpectPixel(corner({{4, 90.0F}}), clear);
    ExpectPixel(corner({{1, 50.0F}}), clear);
    ExpectPixel(corner({{0, FakePoint{0.75, 0.5}}}), clear);
    ExpectPixel(corner({}, 32, 18), clear);
    ExpectPixel(corner({{1, 120.0F}}), kRed);
    ExpectPixel(corner({{1, 100.0F}, {2, 150.0F}, {3, std::uint8_t{0}}}), kRed);
}

TEST_P(CompositorDevice, DisabledLayersDontCount) {
    host.nodes[MediaScript::kClip].inputs = {{MediaScript::kMedia}, {6}};
    host.nodes[6].kind = "Disabled";
    const VideoNodeRef view = AcquireInput(MediaScript::kSequence, MediaScript::Clip()->GetNodeID(), 1, 0);
    const RenderNodeRef disabled = script.Make<DisabledNode>(view, GetDevice());
    disabled->SetInput(0, Leaf(kBlue));
    const FrameLeafRef leaf = Leaf(kRed);
    EXPECT_EQ(Render(*Composite({leaf, disabled})), leaf->frame);
    VideoFrameRef frame;
    EXPECT_EQ(Render(*Composite({disabled}), frame), Ostrand::kStatus_Failure);
    EXPECT_EQ(Render(*Composite({}), frame), Ostrand::kStatus_Failure);
}

TEST_P(CompositorDevice, ALayerThatRunsOutOfMemoryGetsASecondTry) {
    const FrameLeafRef below = Leaf(kRed);
    const FrameLeafRef above = Leaf(kHalfGreen);
    above->answer = [&] { return above->renders == 1 ? Ostrand::kStatus_OutOfMemory : Ostrand::kStatus_OK; };
    ExpectPixel(PixelOf(Render(*Composite({below, above})), 9, 9), {0.0, 0.5, 0.5, 1.0});
    EXPECT_EQ(above->renders, 2);

    above->answer = [] { return Ostrand::kStatus_OutOfMemory; };
    VideoFrameRef frame;
    EXPECT_EQ(Render(*Composite({below, above}), frame), Ostrand::kStatus_OutOfMemory);
    EXPECT_FALSE(frame);

    above->answer = [] { return -5; };
    EXPECT_EQ(Render(*Composite({below, above}), frame), -5);

    // The output's own frame.
    above->answer = {};
    CountAllocations([](int number) { return number == 1; });
    ExpectPixel(PixelOf(Render(*Composite({below, above})), 9, 9), {0.0, 0.5, 0.5, 1.0});
}

class IntrinsicDevice : public CompositorDevice {};

TEST_P(IntrinsicDevice, WhatChangesNothingHandsThePictureOn) {
    const FrameLeafRef leaf = Leaf(kRed);
    EXPECT_EQ(Render(*Layer(leaf)), leaf->frame);
    NewRequest();
    SetOpacity({{0, 20.0F}, {1, std::int32_t{Kiln::kBlend_Screen}}});
    EXPECT_EQ(Render(*Layer(leaf)), leaf->frame) << "a blend mode takes the opacity with it";
}

TEST_P(IntrinsicDevice, TheUpperEffectDoesTheWorkOfBoth) {
    SetOpacity({{0, 50.0F}});
    SetMotion({{1, 50.0F}});
    PoisonPool();
    CountAllocations();
    const Picture picture = Download(Render(*Layer(Leaf(kRed))));
    EXPECT_EQ(allocations, 2) << "the leaf's frame, and one for both effects";
    ExpectPixel(picture.Get(32, 18), {0.0, 0.0, 1.0, 0.5});
    ExpectPixel(picture.Get(4, 4), {0.0, 0.0, 0.0, 0.0});

    // By itself each does its own.
    NewRequest();
    ExpectPixel(PixelOf(Render(*Layer(Leaf(kRed), true, false)), 4, 4), {0.0, 0.0, 1.0, 0.5});
    NewRequest();
    ExpectPixel(PixelOf(Render(*Layer(Leaf(kRed), false, true)), 32, 18), kRed);
}

TEST_P(IntrinsicDevice, TheFingerprintFollowsTheMotion) {
    host.nodes[MediaScript::kClip].frameHashText = Guid(1, 2, 3, {}).ToString();
    std::set<Guid> hashes;
    const auto isNew = [&] {
        NewRequest();
        const RenderNodeRef layer = Layer(Leaf(kRed));
        const Guid hash = layer->GetFrameHash(script.params, results);
        EXPECT_EQ(layer->GetFrameHash(script.params, results), hash) << "the memo holds the whole fingerprint";
        return hashes.insert(hash).second;
    };
    EXPECT_TRUE(isNew());
    EXPECT_FALSE(isNew());
    const Params motions[] = {{{0, FakePoint{0.1, 0.5}}}, {{1, 50.0F}}, {{4, 5.0F}}, {{5, FakePoint{0.5, 0.2}}}};
    for (const Params& motion : motions) {
        SetMotion(motion);
        EXPECT_TRUE(isNew());
    }
    SetOpacity({{0, 50.0F}});
    EXPECT_TRUE(isNew());
    host.nodes[MediaScript::kClip].frameHashStatus = -1;
    NewRequest();
    EXPECT_TRUE(Layer(Leaf(kRed))->GetFrameHash(script.params, results).IsNil());
}

INSTANTIATE_TEST_SUITE_P(OnEachDevice, CompositorDevice, testing::ValuesIn(AllDeviceCases()), NameOfCase);
INSTANTIATE_TEST_SUITE_P(OnEachDevice, IntrinsicDevice, testing::ValuesIn(AllDeviceCases()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
