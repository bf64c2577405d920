// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gmock/gmock.h>

#include "Brae/Conversions.h"
#include "Ostrand/MixHash.h"
#include "Src/Filters/HostRenderSubtreeNode.h"
#include "Src/Filters/SWHostRenderClipPrefetch.h"
#include "Tests/Media/MediaScript.h"
#include "Tests/Support/FakeDevice.h"
#include "Tests/Support/HostedTest.h"

namespace Vantrel::Testing {
namespace {

using Delivery = FakeRenderer::Delivery;
using ClipNodeRef = InterfaceRef<SWHostRenderClipPrefetch>;

class HostRender : public HostedTest {
protected:
    ClipNodeRef MakeClip() { return script.Make<SWHostRenderClipPrefetch>(MediaScript::Media(), device); }
    Status Request(IRenderNode& node) { return node.RequestHostFrames(script.params, results); }
    Status Collect(IRenderNode& node, const RenderResultsRef& previous = {}) {
        return node.CollectHostFrames(script.params, results, previous);
    }
    VideoFrameRef Fetch(IRenderNode& node) {
        VideoFrameRef frame;
        const Status status = node.FetchHostFrame({}, script.params, results, true, frame);
        EXPECT_EQ(status, frame ? Ostrand::kStatus_OK : Ostrand::kStatus_Failure);
        return frame;
    }

    MediaScript script{host};
    boost::shared_ptr<FakeDevice> device = boost::make_shared<FakeDevice>();
    RenderResultsRef results = MediaScript::MakeResults();
};

TEST_F(HostRender, AFrameIsRequestedOnceAndArrivesLater) {
    host.renderer.delivery = Delivery::kWhenTold;
    const ClipNodeRef clip = MakeClip();
    EXPECT_EQ(Request(*clip), 0);
    EXPECT_EQ(Request(*clip), 0);
    EXPECT_EQ(host.Count("RenderClip"), 1);
    EXPECT_EQ(results->GetOutstanding(), 2U);
    EXPECT_FALSE(Fetch(*clip)) << "never a wait";

    EXPECT_EQ(host.DeliverPending(), 1);
    EXPECT_EQ(results->GetOutstanding(), 1U);
    EXPECT_EQ(Fetch(*clip)->GetBounds(), Vellum::Rect({0, 0, 64, 36}));
    EXPECT_EQ(Request(*clip), 0);
    EXPECT_EQ(host.Count("RenderClip"), 1);
    EXPECT_FALSE(results->HasFailed());
}

TEST_F(HostRender, ARenderThatDeliversNothingFailsTheRequest) {
    host.renderer.callbackStatus = -1;
    const ClipNodeRef clip = MakeClip();
    EXPECT_EQ(Request(*clip), 0);
    EXPECT_TRUE(results->HasFailed()) << "a picture with a bad status doesn't count";
    EXPECT_EQ(results->GetOutstanding(), 1U);
    EXPECT_FALSE(Fetch(*clip));

    host.renderer.callbackStatus = 0;
    host.renderer.deliversNothing = true;
    results = MediaScript::MakeResults();
    EXPECT_EQ(Request(*clip), 0);
    EXPECT_TRUE(results->HasFailed());

    // A picture that can't be wrapped is lost without a failure.
    host.renderer.deliversNothing = false;
    host.renderer.paint = [](const FakeRequest&) { return FakePicture{Vellum::FourCC("oddf"), 4, 4, {0}}; };
    results = MediaScript::MakeResults();
    EXPECT_EQ(Request(*clip), 0);
    EXPECT_FALSE(results->HasFailed());
    EXPECT_FALSE(Fetch(*clip));
}

TEST_F(HostRender, ARefusedRequestKeepsItsPieceAndItsStatusIsOurs) {
    host.renderer.requestStatus = -7;
    const ClipNodeRef clip = MakeClip();
    EXPECT_EQ(Request(*clip), Ostrand::kStatus_Failure);
    EXPECT_EQ(results->GetOutstanding(), 2U);
    host.renderer.requestStatus = 0;
    EXPECT_EQ(Request(*clip), 0);
    EXPECT_TRUE(Fetch(*clip));
}

TEST_F(HostRender, TheHostsCacheSavesTheRender) {
    const ClipNodeRef clip = MakeClip();
    host.glazeCache[Brae::GuidToPluginID(clip->GetFrameHash(script.params, results)).text] =
        FakePicture{Vellum::FourCC("bgra"), 64, 36, {}};
    script.params.collectInformation = 1;
    EXPECT_EQ(Request(*clip), 0);
    EXPECT_EQ(host.Count("RenderClip"), 0);
    EXPECT_EQ(results->GetOutstanding(), 1U);
    EXPECT_TRUE(Fetch(*clip));
    EXPECT_EQ(Request(*clip), 0);
    EXPECT_EQ(results->GetLog(), "PF: BGRA_4444_8u\n") << "a line for each frame, not for each look";
}

TEST_F(HostRender, CollectingTellsWhetherAnythingIsMissing) {
    const ClipNodeRef clip = MakeClip();
    EXPECT_EQ(Collect(*clip), Ostrand::kStatus_Failure);
    EXPECT_EQ(Request(*clip), 0);
    const VideoFrameRef frame = Fetch(*clip);

    const RenderResultsRef previous = std::exchange(results, MediaScript::MakeResults());
    EXPECT_EQ(Collect(*clip, previous), 0);
    EXPECT_EQ(Fetch(*clip), frame);

    results = MediaScript::MakeResults();
    host.glazeCache[Brae::GuidToPluginID(clip->GetFrameHash(script.params, results)).text] =
        FakePicture{Vellum::FourCC("bgra"), 8, 8, {}};
    EXPECT_EQ(Collect(*clip), 0);
    EXPECT_EQ(Fetch(*clip)->GetBounds().Width(), 8);
    EXPECT_EQ(host.Count("RenderClip"), 1);
}

TEST_F(HostRender, OnlyWhatWasRequestedIsCancelled) {
    host.renderer.delivery = Delivery::kWhenTold;
    const ClipNodeRef clip = MakeClip();
    EXPECT_EQ(clip->CancelHostFrames(script.params, results), 0);
    EXPECT_EQ(host.Count("CancelRequest"), 0);
    EXPECT_EQ(Request(*clip), 0);
    EXPECT_EQ(clip->CancelHostFrames(script.params, results), 0);
    EXPECT_TRUE(results->HasFailed());
    EXPECT_EQ(results->GetOutstanding(), 1U);
    EXPECT_EQ(clip->CancelHostFrames(script.params, results), Ostrand::kStatus_Failure)
        << "the entry stays, and the host doesn't know the request any more";
}

TEST_F(HostRender, AClipsFrameDependsOnItsOwnTimeOnly) {
    const ClipNodeRef clip = MakeClip();
    script.params.clipTime = 3000;
    const Guid hash = clip->GetFrameHash(script.params, results);
    script.params.time = 90000;
    EXPECT_EQ(clip->GetFrameHash(script.params, results), hash);
    EXPECT_EQ(host.Count("GetClipFrameHash"), 1);
    script.params.clipTime = 4000;
    EXPECT_NE(clip->GetFrameHash(script.params, results), hash);

    host.clips[MediaScript::kClipID].frameHashStatus = -1;
    results = MediaScript::MakeResults();
    EXPECT_TRUE(clip->GetFrameHash(script.params, results).IsNil());
}

TEST_F(HostRender, AClipIsAskedForWhatItCanDeliver) {
    host.clips[MediaScript::kClipID].deliver = [](VantrelClipRecord wanted) {
        wanted.width /= 2;
        wanted.pixelFormat = Vellum::FourCC("vuya");
        return wanted;
    };
    const ClipNodeRef clip = MakeClip();
    script.params.fieldType = 1;
    EXPECT_EQ(Request(*clip), 0);
    const VantrelClipRecord record = host.GetRenders().front().clip;
    EXPECT_EQ(record.width, 32);
    EXPECT_EQ(record.height, 36);
    EXPECT_EQ(record.pixelFormat, Vellum::FourCC("vuya"));
    EXPECT_EQ(record.fieldType, 1U);
    EXPECT_EQ(record.quality, 2U);
}

TEST_F(HostRender, ClipsThatCantBeReadNowAreRefused) {
    EXPECT_TRUE(MakeClip());
    host.clips[MediaScript::kClipID].ready = 0;
    EXPECT_FALSE(MakeClip());
    host.clips[MediaScript::kClipID].ready = 1;
    for (const char* state : {"MediaNode::MediaIsOffline", "MediaNode::MediaIsPending"}) {
        script.Set({{state, "1"}});
        EXPECT_FALSE(MakeClip()) << state;
        script.Set({{state, "0"}});
    }
    EXPECT_FALSE(script.Make<SWHostRenderClipPrefetch>(MediaScript::Clip(), device)) << "not media";
}

TEST_F(HostRender, SubtreesAreRenderedAsNodesAndEffectsAsOperators) {
    host.nodes[MediaScript::kClip].transformTime = [](std::int64_t time) { return time + 500; };
    script.params.time = 7000;
    script.params.clipTime = 2000;
    const auto media = script.Make<HostRenderSourceNode>(MediaScript::Media(), device);
    const auto effect = script.Make<HostRenderSubtreeNode>(MediaScript::Opacity(), device);
    EXPECT_EQ(Request(*media), 0);
    EXPECT_EQ(Request(*effect), 0);

    const std::vector<FakeRequest> renders = host.GetRenders();
    ASSERT_EQ(renders.size(), 2U);
    EXPECT_EQ(renders[0].kind, FakeRequest::Kind::kNode);
    EXPECT_EQ(renders[0].id, MediaScript::kMedia);
    EXPECT_EQ(renders[0].time, 7000);
    EXPECT_EQ(renders[0].nodeTime, 2500) << "in the media's time";
    EXPECT_EQ(renders[1].kind, FakeRequest::Kind::kOperators);
    EXPECT_EQ(renders[1].id, MediaScript::kClip);
    EXPECT_EQ(renders[1].endOperator, 2) << "up to this effect, which is included";
    EXPECT_EQ(renders[1].nodeTime, 2000) << "the host maps it itself";
    EXPECT_TRUE(Fetch(*media));
    EXPECT_TRUE(Fetch(*effect));
}

TEST_F(HostRender, TheSubtreeNodeTellsWhatComesFromTheHost) {
    using Node = HostRenderSubtreeNode;
    EXPECT_TRUE(script.Make<Node>({}, device));
    EXPECT_TRUE(script.Make<Node>(MediaScript::Media(), device));
    EXPECT_FALSE(script.isHost) << "media is no fallback";
    EXPECT_TRUE(script.Make<Node>(MediaScript::Motion(), device));
    EXPECT_TRUE(script.isHost);

    device->memoryLimit = 64 * 36 * 16 * 4 - 1;
    EXPECT_FALSE(script.Make<Node>(MediaScript::Media(), device)) << "four frames of the stream don't fit";
    EXPECT_TRUE(script.Make<Node>(MediaScript::Clip(), device));
    script.Set({{"MediaNode::ClipScaleToFramePolicy", "1"}});
    EXPECT_TRUE(script.Make<Node>(MediaScript::Media(), device)) << "the host scales it";
}

}  // namespace
}  // namespace Vantrel::Testing
