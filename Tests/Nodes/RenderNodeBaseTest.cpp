// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Nodes/RenderNodeBase.h"

#include <gmock/gmock.h>

#include "Tests/Nodes/ProbeNodes.h"
#include "Tests/Support/HostedTest.h"

namespace Vantrel::Testing {
namespace {

using ::testing::ElementsAre;

/// RenderNodeBase as it is, or as a host's picture of a subtree.
class BareNode final : public RenderNodeBase, public Ostrand::Allocated<BareNode> {
public:
    explicit BareNode(bool isSubtree = false) : mIsSubtree(isSubtree) {}
    Status QueryInterface(const Guid& iid, void** out) override {
        const bool asSubtree = mIsSubtree && iid == kHostRenderSubtreeID;
        return RenderNodeBase::QueryInterface(asSubtree ? kInterfaceID : iid, out);
    }

protected:
    std::atomic<std::int32_t>& GetRef() override { return mRefCount; }

private:
    bool mIsSubtree;
};
using BareNodeRef = InterfaceRef<BareNode>;

TEST(RenderNodeBase, InputsGrowWithEmptyEntriesThatWalksSkip) {
    ProbeStage stage;
    const BareNodeRef node(new BareNode);
    VideoFrameRef frame;
    EXPECT_EQ(stage.Render(*node, frame), 0);
    EXPECT_FALSE(frame) << "without inputs nothing is touched";
    node->SetInput(5, stage.Leaf("five"));
    EXPECT_EQ(node->GetInputCount(), 6U);
    EXPECT_FALSE(node->GetInput(4));
    EXPECT_FALSE(node->GetInput(77));
    EXPECT_EQ(node->RequestHostFrames(stage.params, stage.results), 0);
    EXPECT_THAT(stage.log, ElementsAre("five RequestHostFrames"));
}

TEST(RenderNodeBase, AFailingInputStopsEveryWalkButCancelAndEnd) {
    ProbeStage stage;
    const BareNodeRef node(new BareNode);
    const ProbeLeafRef failing = stage.Leaf("a");
    failing->status = Ostrand::kStatus_OutOfMemory;
    node->SetInput(0, failing);
    node->SetInput(1, stage.Leaf("b"));
    VideoFrameRef frame;
    const RenderParams& params = stage.params;
    EXPECT_EQ(node->RequestHostFrames(params, stage.results), Ostrand::kStatus_OutOfMemory);
    EXPECT_EQ(node->CollectHostFrames(params, stage.results, {}), Ostrand::kStatus_OutOfMemory);
    EXPECT_EQ(node->BeginUpload({}, params, stage.results, true, frame), Ostrand::kStatus_OutOfMemory);
    EXPECT_EQ(node->FetchHostFrame({}, params, stage.results, false, frame), Ostrand::kStatus_OutOfMemory);
    EXPECT_EQ(node->RenderFrame({}, params, stage.results, frame), Ostrand::kStatus_OutOfMemory);
    EXPECT_THAT(stage.TakeLog(), ElementsAre("a RequestHostFrames", "a CollectHostFrames", "a BeginUpload",
                                             "a FetchHostFrame", "a RenderFrame"));
    EXPECT_EQ(node->CancelHostFrames(params, stage.results), 0);
    EXPECT_EQ(node->EndFrame({}, params, stage.results, 3), 0);
    EXPECT_THAT(stage.log, ElementsAre("a CancelHostFrames", "b CancelHostFrames", "a EndFrame 3", "b EndFrame 3"));
}

TEST(RenderResults, StoresAreKeptAndTheLogGrowsAtItsHeadOncePerFrame) {
    RenderResults results;
    const VideoFrameRef first = FakeFrame::Make();
    results.StoreFrame(HashOf(1), first);
    results.StoreFrame(HashOf(1), FakeFrame::Make());
    EXPECT_EQ(results.FindFrame(HashOf(1)), first) << "an entry stays as it was";
    results.RemoveFrame(HashOf(1));
    EXPECT_FALSE(results.FindFrame(HashOf(1)));
    std::uint32_t id = 0;
    results.AddPendingRequest(HashOf(2), 0);
    EXPECT_EQ(results.FindPendingRequest(HashOf(2), id), RenderResults::kStatus_NoRequest);
    results.AppendLog(HashOf(1), "one\n");
    results.AppendLog(HashOf(2), "two\n");
    results.AppendLog(HashOf(1), "again\n");
    EXPECT_EQ(results.GetLog(), "two\none\n");
}

TEST(RenderResults, TheCompletionRunsOnceWhenTheLastPieceEnds) {
    RenderResults without;
    without.BeginAsyncPiece();
    without.EndAsyncPiece();
    EXPECT_EQ(without.GetOutstanding(), 0U) << "without a completion nothing is counted";
    int completions = 0;
    RenderResults results([&completions] { ++completions; });
    results.BeginAsyncPiece();
    results.EndAsyncPiece();
    EXPECT_EQ(completions, 0);
    results.EndAsyncPiece();
    results.EndAsyncPiece();
    EXPECT_EQ(completions, 1);
}

/// A clip (2) with media (3) and an effect (4) in a compositor (1), and a bare node for one of them.
class FingerprintTest : public HostedTest {
protected:
    FingerprintTest() {
        host.nodes[1].kind = "Compositor";
        host.nodes[1].inputs = {{2, 100}};
        host.nodes[2].kind = "Clip";
        host.nodes[2].inputs = {{3, 20}};
        host.nodes[2].operators = {5, 4};
        host.nodes[3].kind = "Media";
        host.nodes[4].kind = "Effect";
        host.nodes[5].kind = "Effect";
        host.nodes[2].transformTime = [](std::int64_t ticks) { return ticks * 2; };
        root = AcquireRoot(host);
        clip = AcquireInput(9, 1, 0, 0);
        stage.params.sequenceID = 9;
        stage.params.time = 500;
        stage.params.clipTime = 400;
        stage.params.pixelFormat = Vellum::FourCC("VUYA");
    }
    Guid HashOfNode(const VideoNodeRef& description, bool isSubtree = false) {
        return stage.Configured(BareNodeRef(new BareNode(isSubtree)), description)
            ->GetFrameHash(stage.params, boost::make_shared<RenderResults>());
    }

    ProbeStage stage;
    VideoNodeRef root;
    VideoNodeRef clip;
};

TEST_F(FingerprintTest, TheHostIsAskedOncePerNodeTimeAndResults) {
    const BareNodeRef node = stage.Configured(BareNodeRef(new BareNode), clip);
    const Guid hash = node->GetFrameHash(stage.params, stage.results);
    EXPECT_FALSE(hash.IsNil());
    EXPECT_EQ(node->GetFrameHash(stage.params, stage.results), hash);
    EXPECT_EQ(host.Count("GetNodeFrameHash"), 1);
    ++stage.params.time;
    EXPECT_NE(node->GetFrameHash(stage.params, stage.results), hash);
    node->GetFrameHash(stage.params, boost::make_shared<RenderResults>());
    EXPECT_EQ(host.Count("GetNodeFrameHash"), 3);
    host.nodes[2].frameHashStatus = -1;
    ++stage.params.time;
    EXPECT_TRUE(node->GetFrameHash(stage.params, stage.results).IsNil());
    EXPECT_TRUE(node->GetFrameHash(stage.params, stage.results).IsNil());
    EXPECT_EQ(host.Count("GetNodeFrameHash"), 5) << "a refusal isn't remembered";
    EXPECT_TRUE(HashOfNode({}).IsNil());
}

TEST_F(FingerprintTest, TheQuestionCarriesTheRequest) {
    stage.params.pixelAspectRatio = {4, 3};
    HashOfNode(clip);
    FakeRequest asked = host.GetHashQuestions().back();
    EXPECT_EQ(asked.sequenceID, 9U);
    EXPECT_EQ(asked.id, 2U);
    EXPECT_EQ(asked.time, 500);
    EXPECT_EQ(asked.nodeTime, (400 - 100) * 2);
    EXPECT_EQ(asked.frameTicks, 1000);
    EXPECT_EQ(asked.sequenceSize, (Vellum::Point{1920, 1080}));
    EXPECT_EQ(asked.aspect, (Vellum::PixelAspectRatio{4, 3}));
    EXPECT_EQ(asked.description.width, 64);
    EXPECT_EQ(asked.description.deinterlaceQuality, 2U);
    EXPECT_THAT(asked.pixelFormats, ElementsAre(Vellum::FourCC("VUYA"), 0U));

    stage.params.anyPixelFormat = 1;
    HashOfNode(clip);
    EXPECT_EQ(host.GetHashQuestions().back().pixelFormats.size(), 9U);
    EXPECT_EQ(host.GetHashQuestions().back().pixelFormats[1], Vellum::FourCC("vux7"));
    stage.params.pixelFormat = Vellum::FourCC("bgra");
    HashOfNode(clip);
    EXPECT_EQ(host.GetHashQuestions().back().pixelFormats[1], Vellum::FourCC("vuyx"));
}

TEST_F(FingerprintTest, AnEffectIsAskedForAsTheOperatorsUpToIt) {
    HashOfNode(GetEffect(clip, 1));
    const FakeRequest asked = host.GetHashQuestions().back();
    EXPECT_EQ(asked.kind, FakeRequest::Kind::kOperators);
    EXPECT_EQ(asked.id, 2U);
    EXPECT_EQ(asked.firstOperator, 0);
    EXPECT_EQ(asked.endOperator, 2);
    EXPECT_EQ(asked.nodeTime, 300) << "in the clip's time, which the host maps by itself";
}

TEST_F(FingerprintTest, ASubtreesPictureHasAnotherFingerprintThanTheNodesOwn) {
    host.nodes[2].frameHashText = "01234567-89AB-CDEF-0123-456789ABCDEF";
    const Guid own = HashOfNode(clip);
    const Guid subtree = HashOfNode(clip, true);
    EXPECT_EQ(own, Guid(host.nodes[2].frameHashText));
    EXPECT_NE(subtree, own);
    EXPECT_FALSE(subtree.IsNil());
    EXPECT_EQ(subtree, HashOfNode(clip, true));
}

TEST_F(FingerprintTest, EffectsAreReadInTheTimeOfTheirMediaUnlessThatIsHeld) {
    const auto node = stage.Configured(BareNodeRef(new BareNode), GetEffect(clip, 0));
    host.ResetCounts();
    EXPECT_EQ(node->GetNodeTime(400, false), (400 - 120) * 2);
    EXPECT_EQ(node->GetNodeTime(400, true), 300);
    EXPECT_EQ(node->GetNodeTime(500, false), (500 - 120) * 2);
    EXPECT_EQ(host.Count("AcquireInputNode"), 1) << "the media is looked up once";
    EXPECT_EQ(BareNodeRef(new BareNode)->GetNodeTime(123, false), 123);

    host.nodes[2].properties["ClipNode::FrameHoldAtTime"] = "77";
    const VideoNodeRef held = AcquireInput(9, 1, 0, 0);
    const auto onHeld = stage.Configured(BareNodeRef(new BareNode), GetEffect(held, 0));
    EXPECT_EQ(onHeld->GetNodeTime(400, false), (400 - 100) * 2) << "in its own time, which goes on";
}

}  // namespace
}  // namespace Vantrel::Testing
