// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/TrackMatte.h"

#include <cmath>

#include <boost/make_shared.hpp>

#include "Src/Filters/CompositorNode.h"
#include "Src/Filters/Effects/TrackMatteNode.h"
#include "Src/Nodes/FinishedInputs.h"
#include "Src/Nodes/NodeRegistry.h"
#include "Src/VideoNodes/VideoNodeFactory.h"
#include "Tests/Effects/EffectTester.h"
#include "Vantrel/Effects/Intrinsics.h"
#include "Vantrel/Effects/TrackMatte.h"

namespace Vantrel::Testing {
namespace {

/// A layer that shows one frame.
class LayerNode final : public FilterNode, public Ostrand::Allocated<LayerNode> {
public:
    explicit LayerNode(VideoFrameRef shown) : FilterNode(false, false), mShown(std::move(shown)) {}
    Status Render(const RenderToken&, const RenderParams&, const RenderResultsRef&) override {
        mFrameSlot = mShown;
        return Ostrand::kStatus_OK;
    }
    Status EndFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                    std::uint32_t level) override {
        ++ends;
        return FilterNode::EndFrame(token, params, results, level);
    }
    int ends = 0;

protected:
    std::atomic<std::int32_t>& GetRef() override { return mRefCount; }

private:
    VideoFrameRef mShown;
};

constexpr std::uint32_t kMatteSequence = 2, kMatteClip = 11, kMatteMedia = 12, kMatteMotion = 13;
constexpr std::int32_t kMatteTrack = 4;

class TrackMatteOnEachDevice : public EffectTest {
protected:
    TrackMatteOnEachDevice() {
        host.nodes[kMatteMedia].kind = "Media";
        host.nodes[kMatteClip].kind = "Clip";
        host.nodes[kMatteClip].inputs = {{kMatteMedia}};
        host.nodes[kMatteClip].properties["ClipNode::TrackID"] = std::to_string(kMatteTrack);
        host.nodes[kMatteMotion].kind = "Effect";
        host.nodes[kMatteMotion].properties["EffectNode::FilterMatchName"] = "TQ.XQVE Motion";
        host.sequences[kMatteSequence].segments = {{0, Vellum::kTime_Max, 0, Guid(2, 0, 0, {}), kMatteClip}};
    }
    ~TrackMatteOnEachDevice() override { FinishedInputs::Clear(); }
    [[nodiscard]] RenderRequirements Requirements() const {
        RenderRequirements requirements;
        requirements.frameRect = {0, 0, 64, 36};
        requirements.pixelAspectRatio = {1, 1};
        requirements.device = GetDevice();
        return requirements;
    }
    /// A layer on the matte's track.
    Ostrand::InterfaceRef<LayerNode> MatteLayer(const Picture& matte) {
        const VideoSegmentsHandle handle(kMatteSequence, SegmentsMode::kPlain, "");
        bool needsHost = false;
        const Ostrand::InterfaceRef<LayerNode> layer(
            new LayerNode(MakePaddedFrame(GetDevice(), GetFormat(), matte, 1)));
        layer->Configure(GetClipMedia(AcquireRootNode(handle, 0)), Requirements(), needsHost);
        return layer;
    }
    RenderNodeRef MakeMatte(std::int32_t track, bool byLuma, bool reverse) {
        return MakeEffect(
            "TQ.XQVE Legacy Key Track Matte",
            {{kTrackMatte_Track, track}, {kTrackMatte_Using, std::int32_t{byLuma}}, {kTrackMatte_Reverse, reverse}});
    }
    /// The effect over a picture, below a compositor with one layer besides.
    Picture Apply(const RenderNodeRef& effect, const Picture& picture, const RenderNodeRef& layer, int width,
                  int height) {
        const RenderNodeRef stack(new CompositorNode);
        stack->SetInput(0, layer);
        const VideoFrameRef input = MakePaddedFrame(GetDevice(), GetFormat(), picture, 2);
        effect->SetInput(0, RenderNodeRef(new FrameSource(input)));
        RenderParams request = MakeRequest(input);
        request.outputRect = request.sequenceRect = {0, 0, width, height};
        const auto results = boost::make_shared<RenderResults>();
        VideoFrameRef output;
        EXPECT_EQ(effect->RenderFrame(stack, request, results, output), Ostrand::kStatus_OK);
        EXPECT_EQ(output, input) << "the work is done in place";
        effect->EndFrame(stack, request, results, 0);
        return output ? DownloadFrame(GetDevice(), output) : Picture();
    }
};

TEST_P(TrackMatteOnEachDevice, AgreesWithTheScalarVersionAlsoAtAnotherSize) {
    Random random;
    for (int i = 0; i < 40; ++i) {
        SCOPED_TRACE(i);
        const bool byLuma = random.Chance(0.5F), reverse = random.Chance(0.5F), sameSize = random.Chance(0.4F);
        const Picture in = RoundTo(RandomPicture(random, random.Int(1, 150), random.Int(1, 30)), GetFormat());
        const Picture matte = RoundTo(
            RandomPicture(random, sameSize ? in.width : random.Int(1, 90), sameSize ? in.height : random.Int(1, 40)),
            GetFormat());
        const auto layer = MatteLayer(matte);
        Picture expected = in;
        Host::Software::ApplyTrackMatte(matte, byLuma, reverse, expected);
        Tolerance tolerance = GetTolerance();
        if (!IsHalf()) tolerance.absolute = 3e-5;  // places between pixels are rounded
        EXPECT_TRUE(PicturesAgree(
            Apply(MakeMatte(kMatteTrack, byLuma, reverse), in, RenderNodeRef(layer), matte.width, matte.height),
            RoundTo(expected, GetFormat()), tolerance));
        EXPECT_GT(layer->ends, 0) << "the matte ends with the node";
    }
}

TEST_P(TrackMatteOnEachDevice, AMatteThatIsNotThereCountsAsBlackOrNotAtAll) {
    Picture in = Plain(5, 3, {-0.5, 2.0, 0.25, 0.75});
    Picture gone = in;
    for (std::size_t i = 3; i < gone.pixels.size(); i += 4) gone.pixels[i] = 0.0F;
    for (const std::int32_t track : {-3, 0, kMatteTrack + 1}) {
        for (const bool byLuma : {false, true}) {
            for (const bool reverse : {false, true}) {
                const auto layer = MatteLayer(Plain(5, 3, {1, 1, 1, 0.5}));
                EXPECT_TRUE(PicturesAgree(Apply(MakeMatte(track, byLuma, reverse), in, RenderNodeRef(layer), 5, 3),
                                          track > 0 && byLuma != reverse ? gone : in, kExactly))
                    << track << ", luma " << byLuma << ", reverse " << reverse;
            }
        }
    }
    const float endless = INFINITY;
    in.At(1, 1)[3] = endless;
    in.At(2, 1)[3] = NAN;
    const Picture masked = Apply(MakeMatte(kMatteTrack, true, false), in,
                                 RenderNodeRef(MatteLayer(Plain(5, 3, {NAN, -1, endless, endless}))), 5, 3);
    EXPECT_EQ(masked.At(1, 1)[3], 0.0F) << "luma that is no number counts as 0";
}

TEST_P(TrackMatteOnEachDevice, TheMatteMovesThoughACompositorHasDrawnItBefore) {
    Picture shape(8, 1);
    shape.Set(1, 0, {1, 1, 1, 1});
    host.nodes[kMatteClip].operators = {kMatteMotion};
    host.nodes[kMatteMotion].params = {{kMotion_Position, FakePoint{0.75, 0.5}},
                                       {kMotion_Scale, 100.0F},
                                       {kMotion_ScaleWidth, 100.0F},
                                       {kMotion_UniformScale, true},
                                       {kMotion_Rotation, 0.0F},
                                       {kMotion_Anchor, FakePoint{0.5, 0.5}}};
    const VideoSegmentsHandle handle(kMatteSequence, SegmentsMode::kPlain, "");
    bool needsHost = false;
    const RenderNodeRef motion =
        createNode(u"TQ.XQVE Motion", GetDevice(), GetEffect(AcquireRootNode(handle, 0), 0), Requirements(), needsHost);
    motion->SetInput(0, RenderNodeRef(MatteLayer(shape)));
    const RenderNodeRef effect = MakeMatte(kMatteTrack, false, false);
    const VideoFrameRef input = MakePaddedFrame(GetDevice(), GetFormat(), Plain(8, 1, {0.5, 0.5, 0.5, 1}), 0);
    effect->SetInput(0, RenderNodeRef(new FrameSource(input)));
    const RenderNodeRef stack(new CompositorNode);
    stack->Configure({}, Requirements(), needsHost);
    stack->SetInput(0, motion);
    stack->SetInput(1, effect);
    VideoFrameRef output;
    const auto results = boost::make_shared<RenderResults>();
    ASSERT_EQ(stack->RenderFrame({}, MakeRequest(input), results, output), Ostrand::kStatus_OK);
    const Picture masked = DownloadFrame(GetDevice(), input);
    for (int x = 0; x < 8; ++x) EXPECT_EQ(masked.At(x, 0)[3], x == 3 ? 1.0F : 0.0F) << x;
    stack->EndFrame({}, MakeRequest(input), results, 0);
}

INSTANTIATE_TEST_SUITE_P(Devices, TrackMatteOnEachDevice, ::testing::ValuesIn(AllDeviceCases()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
