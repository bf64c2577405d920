// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
// Whatever the registry can make, at the sizes that pictures have: it renders, twice the same, makes no NaN and leaves
// nothing behind.
#include <set>
#include <sstream>
#include <thread>

#include <boost/make_shared.hpp>

#include "Kiln/FrameCopies.h"
#include "Src/Filters/CompositorNode.h"
#include "Src/Filters/INestedTimelineNode.h"
#include "Src/Nodes/NodeRegistry.h"
#include "Src/RenderPipeline.h"
#include "Src/VideoNodes/VideoNodeFactory.h"
#include "Tests/Effects/EffectTester.h"
#include "Vantrel/EffectTable.h"
#include "Vantrel/Effects/TrackMatte.h"
#include "Vantrel/TransitionTable.h"

namespace Vantrel::Testing {
namespace {

constexpr std::int64_t kTicks = 10160640000;  // of a frame
constexpr std::int32_t kInstance = 7, kTrack = 4, kNestedSequence = 5, kClipID = 77;

/// Hands out a new copy of its frame each time, so that effects may work in place.
class CopySource final : public RenderNodeBase, public Ostrand::Allocated<CopySource> {
public:
    explicit CopySource(VideoFrameRef frame) : mFrame(std::move(frame)) { ++alive; }
    ~CopySource() override { --alive; }
    Status RenderFrame(const RenderToken&, const RenderParams&, const RenderResultsRef&,
                       VideoFrameRef& frame) override {
        frame = Kiln::CreateSimilarFrame(mFrame);
        return Kiln::CopyEqualFrame(mFrame, frame);
    }
    static inline int alive = 0;

protected:
    std::atomic<std::int32_t>& GetRef() override { return mRefCount; }

private:
    VideoFrameRef mFrame;
};

struct Size {
    int width, height;
    std::uint32_t fieldType;
    int rounds;
};
constexpr Size kSizes[] = {
    {17, 9, Vellum::kFieldType_Progressive, 6},
    {720, 576, Vellum::kFieldType_UpperFirst, 1},
    {1920, 1080, Vellum::kFieldType_Progressive, 1},
    {VANTREL_LARGE_HEIGHT * 4096 / 2160, VANTREL_LARGE_HEIGHT, Vellum::kFieldType_Progressive, 1}};

std::vector<std::string> KeysOf(const Kiln::DeviceRef& device) {
    std::set<std::string> keys;
    for (const Halden::WideString& name : Kiln::GetRegisteredMatchNames()) {
        if (isRegistered(name, device)) keys.insert(Halden::ToUTF8(name));
    }
    return {keys.begin(), keys.end()};
}

std::size_t CountInputs(const std::string& key) {
    if (FindEffect(key.c_str()) || key == "DisabledNode") return 1;
    if (FindTransition(key.c_str())) return 2;
    return key == "LayerBlendNode" || key == "MulticamRenderNode" || key == "AdjustmentNode" ? 3 : 0;
}

class Sweep : public EffectTest {
protected:
    /// A picture, or both of its fields, bit for bit.
    using Outcome = std::array<std::vector<std::uint32_t>, 2>;
    struct Figures {
        std::uint64_t device, host;
        int sources, glazes;
        bool operator==(const Figures& other) const {
            return device == other.device && host == other.host && sources == other.sources && glazes == other.glazes;
        }
    };

    void SetSize(const Size& size) {
        mSize = size;
        mRect = {0, 0, size.width, size.height};
        mFrames.clear();
        for (int i = 0; i < 2; ++i) {
            mFrames.push_back(UploadFrame(GetDevice(), GetFormat(), RandomPicture(mRandom, mSize.width, mSize.height)));
        }
        std::ostringstream track;
        track << "motion-track 1\nframe " << size.width << ' ' << size.height
              << "\nfirst 0\nsmooth 0\ncell 20\nmotion\n0 0 0 1\n3 -2 1 1\n-3 2 -1 1\n";
        mTrackText = track.str();
        host.opaqueData[kInstance] = mTrackText.data();
    }

    /// The script as it is for that key, with parameters at random. @return what tells of them
    std::string Script(const std::string& key) {
        host.nodes[kClip] = FakeNode("Clip");
        host.nodes[kClip].inputs = {{kMedia}};
        host.nodes[kClip].operators = {kEffect};
        host.nodes[kClip].properties["ClipNode::TrackID"] = std::to_string(kTrack);
        host.nodes[kMedia].properties = {{"MediaNode::MediaInstanceString", key},
                                         {"MediaNode::ClipID", std::to_string(kClipID)},
                                         {"MediaNode::StreamFrameWidth", std::to_string(mSize.width)},
                                         {"MediaNode::StreamFrameHeight", std::to_string(mSize.height)},
                                         {"MediaNode::StreamFrameRate", std::to_string(kTicks)},
                                         {"MediaNode::InPointMediaTimeAsTicks", "0"},
                                         {"MediaNode::OutPointMediaTimeAsTicks", std::to_string(3 * kTicks)},
                                         {"MediaNode::NestedSequenceTimelineID", std::to_string(kNestedSequence)}};
        host.clips[kClipID] = {};
        host.nodes[kEffect] = FakeNode("Effect");
        host.nodes[kEffect].properties = {{"EffectNode::FilterMatchName", key},
                                          {"EffectNode::RuntimeInstanceID", std::to_string(kInstance)}};
        if (FindTransition(key.c_str())) {
            host.nodes[kClip] = FakeNode("Transition");
            host.nodes[kClip].properties = {
                {"TransitionNode::TransitionMatchName", key},
                {"TransitionNode::TransitionDuration", std::to_string(mRandom.Int(1, 5) * kTicks)},
                {"TransitionNode::TransitionDirection", std::to_string(mRandom.Int(0, 5))},
                {"TransitionNode::TransitionBorderWidth", std::to_string(mRandom.Int(0, 9))}};
            return key + ", direction " + host.nodes[kClip].properties["TransitionNode::TransitionDirection"];
        }
        const EffectRow* effect = FindEffect(key.c_str());
        if (!effect) return key;
        ParameterValues values = RandomValues(mRandom, *effect);
        if (effect == &kTrackMatteEffect) values[kTrackMatte_Track] = {kTrack};
        host.nodes[kEffect].params = ToParams(*effect, values);
        return Describe(*effect, values);
    }

    [[nodiscard]] RenderNodeRef MakeTree(const std::string& key) {
        const VideoSegmentsHandle handle(kSequence, SegmentsMode::kPlain, "");
        const VideoNodeRef root = AcquireRootNode(handle, 0);
        const auto source = [this](std::size_t i) { return RenderNodeRef(new CopySource(mFrames[i % 2])); };
        const bool isTransition = FindTransition(key.c_str()) != nullptr;
        const VideoNodeRef media = isTransition ? VideoNodeRef() : GetClipMedia(root);
        const RenderNodeRef node = MakeNode(key,
                                            isTransition              ? root
                                            : FindEffect(key.c_str()) ? GetEffect(root, 0)
                                                                      : media,
                                            mRect);
        const auto filter = Ostrand::Query<FilterNode>(node);
        EXPECT_TRUE(key == "HostRenderSubtree" || !filter || filter->GetName() != u"Upload Node")
            << key << " was left to the host";
        if (!node) return node;
        for (std::size_t i = 0; i < CountInputs(key); ++i) node->SetInput(i, source(i));
        if (const auto nested = Ostrand::Query<INestedTimelineNode>(node)) nested->SetDefaultTree(source(0));
        // A matte is another layer of the compositor above; black is never rendered by itself.
        if (key != kTrackMatteEffect.matchName && key != "BlackVideoSource") return node;
        const RenderNodeRef matte = source(1);
        bool needsHost = false;
        static_cast<void>(matte->Configure(media, {}, needsHost));
        const RenderNodeRef stack = MakeNode("LayerBlendNode", {}, mRect);
        stack->SetInput(0, matte);
        stack->SetInput(1, node);
        return stack;
    }

    /// All of a frame's phases. Failures fail the test.
    void Render(const RenderNodeRef& tree, Outcome& outcome) {
        RenderParams params;
        params.time = params.clipTime = kTicks;
        params.outputRect = params.sequenceRect = mRect;
        params.pixelAspectRatio = Vellum::kPixelAspectRatio_Square;
        params.pixelFormat = Vellum::FourCC("bgra");
        params.quality = IsHalf() ? 1 : 3;
        params.sequenceID = kSequence;
        params.frameTicks = params.sequenceFrameTicks = kTicks;
        params.fieldType = params.sequenceFieldType = mSize.fieldType;
        const auto results = boost::make_shared<RenderResults>([] {}, 1);
        if (Ostrand::Failed(tree->CollectHostFrames(params, results, {}))) {
            EXPECT_EQ(tree->RequestHostFrames(params, results), Ostrand::kStatus_OK);
        }
        VideoFrameRef dropped, frames[2];
        EXPECT_EQ(tree->FetchHostFrame({}, params, results, false, dropped), Ostrand::kStatus_OK);
        EXPECT_EQ(RenderTree(GetDevice(), tree, params, results, frames[0], frames[1], nullptr, mRect),
                  Ostrand::kStatus_OK);
        EXPECT_TRUE(frames[0]);
        for (std::size_t i = 0; i < 2; ++i) {
            // A host render by itself stays in the host's memory.
            if (!frames[i] || !Kiln::IsDeviceFrame(frames[i])) {
                outcome[i].clear();
                continue;
            }
            DownloadFrameWords(GetDevice(), frames[i], outcome[i]);
            EXPECT_FALSE(HasNaN(outcome[i], frames[i]->GetPixelFormat()));
        }
    }

    static bool HasNaN(const std::vector<std::uint32_t>& words, Vellum::PixelFormat format) {
        const auto any = [&words](auto isNaN) {
            bool found = false;
            for (const std::uint32_t word : words) found |= isNaN(word);
            return found;
        };
        if (format == Kiln::kPixelFormat_GPU_BGRA_4444_32f) {
            return any([](std::uint32_t word) { return (word & 0x7FFFFFFFU) > 0x7F800000U; });
        }
        return any(
            [](std::uint32_t word) { return ((word & 0x7FFFU) > 0x7C00U) | (((word >> 16U) & 0x7FFFU) > 0x7C00U); });
    }

    /// With the caches, which outlive renders, empty and the device at rest.
    [[nodiscard]] Figures Rest() {
        const auto bytes = [](Kiln::MemoryManager& memory) {
            memory.GetFrameCache().Purge(~std::uint64_t{0});
            return memory.GetFigures().bytesInUse;
        };
        EXPECT_EQ(GetDevice()->Synchronize(), Ostrand::kStatus_OK);
        const std::uint64_t device = bytes(*GetDevice()->GetDeviceMemory());
        return {device, bytes(*GetDevice()->GetHostMemory()), CopySource::alive,
                CountLiveGlazes() + CountLiveGlazeStorages()};
    }

    void RenderTwice(const std::string& key) {
        const Figures before = Rest();
        SCOPED_TRACE(testing::Message() << Script(key) << "; " << mSize.width << " by " << mSize.height);
        for (Outcome& outcome : mOutcomes) {
            if (const RenderNodeRef tree = MakeTree(key)) Render(tree, outcome);
            Figures after = Rest();
            // Who has staged a picture lets go of it a little after it is there.
            for (int i = 0; i < 500 && !(before == after); ++i, after = Rest()) {
                std::this_thread::sleep_for(std::chrono::milliseconds(10));
            }
            EXPECT_TRUE(before == after) << "device bytes " << before.device << " to " << after.device
                                         << ", host bytes " << before.host << " to " << after.host << ", sources "
                                         << after.sources << ", host pictures " << after.glazes;
        }
        EXPECT_TRUE(mOutcomes[0] == mOutcomes[1]) << "not the same picture again";
        for (const std::uint32_t id : {kClip, kMedia, kEffect}) EXPECT_EQ(host.GetReferences(id), 0) << "node " << id;
    }

    Random mRandom;
    Size mSize{};
    Vellum::Rect mRect;
    std::vector<VideoFrameRef> mFrames;
    std::string mTrackText;
    Outcome mOutcomes[2];  ///< kept, as they are large
};

TEST_P(Sweep, EveryKeyRendersAtEverySizeTwiceTheSameWithoutNaNOrLeak) {
    const std::vector<std::string> keys = KeysOf(GetDevice());
    ASSERT_EQ(keys.size(), GetParam().framework == Kiln::DeviceFramework::kCuda ? 58U : 54U);
    for (const Size& size : kSizes) {
        // Floats and halves differ in nothing that hangs on the size.
        const bool isLarge = &size >= kSizes + 2;
        if (isLarge && GetParam().framework == Kiln::DeviceFramework::kCuda && !IsHalf()) continue;
        SetSize(size);
        for (int round = 0; round < size.rounds; ++round) {
            for (const std::string& key : keys) RenderTwice(key);
        }
    }
}

// What devices work in.
INSTANTIATE_TEST_SUITE_P(
    Devices, Sweep,
    ::testing::Values(DeviceCase{Kiln::DeviceFramework::kCuda, Kiln::kPixelFormat_GPU_BGRA_4444_32f},
                      DeviceCase{Kiln::DeviceFramework::kCuda, Kiln::kPixelFormat_GPU_BGRA_4444_16f},
                      DeviceCase{Kiln::DeviceFramework::kOpenCL, Kiln::kPixelFormat_GPU_BGRA_4444_32f}),
    NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
