// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
// Random scripts of nested, failing and plain content: what a timeline says of each moment must be what a count of the
// script itself says.
#include <algorithm>

#include "Tests/Support/Pictures.h"
#include "Tests/Timeline/TimelineTester.h"

namespace Vantrel::Testing {
namespace {

/// Nothing that is written reaches further, even three nested sequences deep at double speed each.
constexpr std::int64_t kEnd = 800;
constexpr int kLength = 40;
constexpr std::uint32_t kNative = 0x76323130;

class RandomVerdicts : public TimelineTester {
protected:
    using Random = Testing::Random;

    /// @param cudaOnly  whether the device's framework has the effects that only one of them has
    void Write(unsigned seed, bool cudaOnly) {
        mRandom = std::make_unique<Random>(seed);
        host.nodes.clear();
        host.sequences.clear();
        static_cast<CreatorScript&>(*this) = {{"Unknown"}, {"Failing"}, {}, {"Slow"}};
        if (!cudaOnly) unregistered.insert("CudaOnly");
        if (Chance(10)) unregistered.insert("LayerBlendNode");
        if (Chance(5)) unregistered.insert("HostRenderClip");
        if (Chance(5)) refused.insert("HostRenderClip");
        if (Chance(10)) failing.insert("AdjustmentNode");
        mFlattens = Chance(15);
        if (mFlattens) {
            unregistered.insert("NestedTimelineNode");
            refused.insert("NestedTimelineNode");
        }
        mNextNode = mNextContent = 100;
        for (std::uint32_t sequence = 4; sequence >= kTop; --sequence) WriteSequence(sequence);
        Change();
    }

    /// Moves the top sequence's content about.
    void Edit() {
        std::vector<FakeSegment>& segments = host.sequences[kTop].segments;
        const auto at = static_cast<std::size_t>(mRandom->Int(0, static_cast<int>(segments.size()) - 1));
        if (segments.size() > 1 && Chance(40)) {
            segments.erase(segments.begin() + static_cast<std::ptrdiff_t>(at));
        } else if (Chance(50)) {
            for (std::size_t i = at; i < segments.size(); ++i) segments[i].start += 3, segments[i].end += 3;
        } else {
            const FakeSegment& last = segments.back();
            segments.push_back({last.end, last.end + 5, 2, segments[at].hash, segments[at].node});
        }
        host.sequences[kTop].previewSegments = segments;
        Change();
    }

private:
    bool Chance(int percent) { return mRandom->Int(1, 100) <= percent; }
    template <std::size_t n>
    const char* OneOf(const char* const (&texts)[n]) {
        return texts[mRandom->Int(0, n - 1)];
    }

    void WriteSequence(std::uint32_t id) {
        host.sequences[id] = FakeSequence();
        std::int64_t time = mRandom->Int(0, 4);
        const std::int64_t end = id == kTop ? kLength : mRandom->Int(10, kLength);
        std::vector<FakeSegment>& segments = host.sequences[id].segments;
        while (time < end || segments.empty()) {
            const std::int64_t length = mRandom->Int(2, 12);
            FakeSegment segment{time, time + length, mRandom->Int(0, 9), NumberedGuid(++mNextContent), 0};
            if (!segments.empty() && Chance(20)) {
                segment.hash = segments.back().hash;
                segment.node = segments.back().node;
            } else {
                segment.node = Root(id);
            }
            segments.push_back(segment);
            time += length + (Chance(30) ? mRandom->Int(1, 5) : 0);
        }
        host.sequences[id].previewSegments = segments;
    }

    std::uint32_t Root(std::uint32_t sequence) {
        mNestable = sequence < 4 ? sequence + 1 : 0;
        if (mNestable != 0 && Chance(25)) return Clip(Media(true), !mFlattens);
        if (Chance(8)) {
            const std::uint32_t preview = Media(false);
            host.nodes[preview].kind = "Preview";
            return preview;
        }
        if (mFlattens) mNestable = 0;  // what is flattened stands alone
        if (Chance(10)) return New("Multicam", {Chance(20) ? 0 : Branch(1), Branch(1)});
        return New("Compositor", Layers(0));
    }

    std::vector<std::uint32_t> Layers(int depth) {
        std::vector<std::uint32_t> layers;
        for (int i = mRandom->Int(1, 3); i > 0; --i) layers.push_back(Chance(3) ? 0 : Branch(depth));
        return layers;
    }

    std::uint32_t New(const std::string& kind, const std::vector<std::uint32_t>& inputs) {
        AddNode(++mNextNode, kind, inputs);
        return mNextNode;
    }

    std::uint32_t Branch(int depth) {
        const int choice = mRandom->Int(0, 99);
        if (choice < 2) return New(OneOf({"SolidColor", "SomethingNew"}), {});
        if (depth < 2 && choice < 15) {
            const std::uint32_t transition = New("Transition", {Branch(2), Chance(20) ? 0 : Branch(2)});
            host.nodes[transition].properties["TransitionNode::TransitionMatchName"] =
                OneOf({"Dissolve", "Dissolve", "Unknown", "Slow"});
            return transition;
        }
        if (depth < 2 && choice < 20) return New("Disabled", {Branch(depth + 1)});
        if (depth < 2 && choice < 25) return New("Compositor", Layers(depth + 1));
        if (depth < 2 && choice < 30) {
            const std::uint32_t effect = Effect();
            host.nodes[effect].inputs = {{Branch(depth + 1)}};
            return effect;
        }
        if (depth < 2 && choice < 40) {
            const std::uint32_t below = New("Compositor", Layers(depth + 1));
            const std::uint32_t layer = New("Clip", {below});
            for (int i = mRandom->Int(0, 2); i > 0; --i) host.nodes[layer].operators.push_back(Effect());
            const std::uint32_t adjustment = New("Adjustment", {below, layer, Media(false)});
            if (Chance(60)) host.nodes[adjustment].properties["AdjustmentNode::AdjustmentMediaIsOpaque"] = "1";
            return adjustment;
        }
        return Clip(Media(mNestable != 0 && Chance(25)), true);
    }

    std::uint32_t Effect() {
        AddEffect(++mNextNode, OneOf({"TQ.XQVE Motion", "TQ.XQVE Opacity", "Blur", "Levels", "Curves", "CudaOnly",
                                      "Unknown", "Failing", "Slow"}));
        return mNextNode;
    }

    std::uint32_t Clip(std::uint32_t media, bool mayCarryEffects) {
        const std::uint32_t clip = New("Clip", {media});
        for (int i = mRandom->Int(0, 5) - 2; mayCarryEffects && i > 0; --i) {
            const std::uint32_t effect = Effect();
            host.nodes[clip].operators.push_back(effect);
        }
        auto& properties = host.nodes[clip].properties;
        auto& ofMedia = host.nodes[media].properties;
        if (Chance(15)) properties["ClipNode::ClipSpeed"] = ofMedia["MediaNode::ClipSpeed"] = "2.0";
        if (Chance(5)) properties["ClipNode::TimeRemapping"] = "1";
        if (Chance(5)) properties["ClipNode::FrameHoldAtTime"] = "4";
        return clip;
    }

    std::uint32_t Media(bool nested) {
        AddMedia(++mNextNode);
        auto& properties = host.nodes[mNextNode].properties;
        if (Chance(15)) properties["MediaNode::StreamFrameWidth"] = "32";
        if (Chance(10)) properties["MediaNode::StreamFrameRate"] = "8467200000";
        const std::uint32_t subTypes[] = {kNative, kNative, kNative, 0x30313276, 0x61766331, 0x444C594D};
        properties["MediaNode::StreamFrameVidSubType"] = std::to_string(subTypes[mRandom->Int(0, 5)]);
        if (Chance(10)) properties[OneOf({"MediaNode::MediaIsOffline", "MediaNode::MediaIsPending"})] = "1";
        if (nested) {
            properties[OneOf({"MediaNode::NestedSequenceTimelineID", "MediaNode::SelectedMulticamTrackTimelineID"})] =
                std::to_string(mNestable);
        }
        if (Chance(5)) properties["MediaNode::SelectedMulticamTrack"] = "0";
        return mNextNode;
    }

    std::unique_ptr<Random> mRandom;
    std::uint32_t mNextNode = 0;
    std::uint32_t mNextContent = 0;
    std::uint32_t mNestable = 0;
    bool mFlattens = false;
};

TEST_F(RandomVerdicts, AgreeWithACountOfTheScriptAfterEachEdit) {
    constexpr unsigned kScripts = 250;
    constexpr int kEdits = 3;
    for (unsigned seed = 1; seed <= kScripts && !HasFailure(); ++seed) {
        Write(seed, seed % 2 == 0);
        VerdictCount count(host, *this, {std::to_string(kNative), std::to_string(0x30313276)}, kEnd);
        for (int edit = 0; edit <= kEdits && !HasFailure(); ++edit) {
            SCOPED_TRACE("seed " + std::to_string(seed) + ", edit " + std::to_string(edit));
            if (edit == 0) {
                Read(true, kNative);
            } else {
                Edit();
                EXPECT_EQ(timeline->UpdateTimeline(), 0);
            }
            count.ReadTop(kTop);
            SegmentInfo found;
            const auto find = [&](bool merged) {
                return [&, merged](std::int64_t t) {
                    return timeline->GetSegmentInfo(t, found, merged) == 0 ? &found : nullptr;
                };
            };
            count.rendered.ExpectEqual(find(false));
            count.merged.ExpectEqual(find(true));

            // Trees that were kept and taken over are those of a timeline that is read afresh.
            const std::unique_ptr<Timeline> fresh = MakeTimeline(kTop, true, kNative, nullptr);
            for (std::int64_t t = 0; t < kEnd && !HasFailure(); ++t) {
                SegmentInfo kept, afresh;
                ASSERT_EQ(timeline->GetSegmentInfo(t, kept, false), fresh->GetSegmentInfo(t, afresh, false));
                EXPECT_EQ(Describe(afresh.tree), Describe(kept.tree)) << "tick " << t;
            }
        }
    }
    timeline.reset();
}

}  // namespace
}  // namespace Vantrel::Testing
