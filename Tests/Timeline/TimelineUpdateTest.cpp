// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gmock/gmock.h>

#include <atomic>
#include <thread>

#include "Halden/Trace.h"
#include "Tests/Timeline/TimelineTester.h"

namespace Vantrel::Testing {
namespace {

using ::testing::Contains;
using ::testing::Not;

class TimelineUpdate : public TimelineTester {
protected:
    /// Another hash, and an update, which shall succeed; what it creates is counted anew.
    void ChangeAndUpdate() {
        Change();
        created.clear();
        EXPECT_EQ(timeline->UpdateTimeline(), Ostrand::kStatus_OK);
    }
};

constexpr std::int64_t kEnd = Vellum::kTime_Max;

TEST_F(TimelineUpdate, GapsAreBlackAndReachToTheEndOfTime) {
    Read();
    EXPECT_EQ(InfoAt(0).out, kEnd) << "an empty sequence is one gap";
    AddPlainClip(10);
    AddSegment(kTop, 100, 200, 10, 7);
    Read();
    for (const std::int64_t ticks : {std::int64_t{0}, std::int64_t{99}, std::int64_t{200}, kEnd - 1}) {
        const SegmentInfo gap = InfoAt(ticks);
        EXPECT_EQ(gap.in, ticks < 100 ? 0 : 200);
        EXPECT_EQ(gap.out, ticks < 100 ? 100 : kEnd);
        EXPECT_EQ(Describe(gap.tree), "BlackVideoSource");
        EXPECT_TRUE(gap.guid.IsNil() && gap.accelerated && gap.realTime);
    }
    const SegmentInfo clip = InfoAt(199);
    EXPECT_EQ(clip.in, 100);
    EXPECT_EQ(clip.out, 200);
    EXPECT_EQ(clip.offset, 7);
    EXPECT_EQ(clip.guid, NumberedGuid(10));
    SegmentInfo info;
    EXPECT_EQ(timeline->GetSegmentInfo(kEnd, info, false), 11);
    EXPECT_EQ(timeline->GetSegmentInfo(-1, info, true), 11);
}

TEST_F(TimelineUpdate, AnUnchangedSequenceCostsOneHashCall) {
    AddPlainClip(10);
    AddSegment(kTop, 0, 100, 10);
    Timeline& read = Read();
    const Guid hash = read.GetTimelineHash();
    EXPECT_EQ(hash, host.sequences[kTop].hash);
    host.ResetCounts();
    created.clear();
    EXPECT_EQ(read.UpdateTimeline(), Ostrand::kStatus_OK);
    EXPECT_EQ(host.Count("GetSegmentsHash"), 1);
    EXPECT_EQ(host.Count("GetSegmentCount") + host.Count("GetSequenceInfo"), 0);
    EXPECT_TRUE(created.empty());
    EXPECT_EQ(read.GetTimelineHash(), hash);

    host.sequences[kTop].hashFails = true;
    EXPECT_EQ(read.UpdateTimeline(), Ostrand::kStatus_OK);
    EXPECT_EQ(host.Count("GetSegmentCount"), 1) << "without a hash there is no short cut";
}

TEST_F(TimelineUpdate, MovingOneClipAmongManyBuildsNothingAndAsksForEachSegmentOnce) {
    constexpr int kSegments = 500;
    for (std::uint32_t i = 0; i < kSegments; ++i) {
        AddPlainClip(1000 + i);
        AddSegment(kTop, 100 * i, 100 * i + 80, 1000 + i);
    }
    Timeline& read = Read();
    const RenderNodeRef moved = InfoAt(25000).tree, neighbour = InfoAt(25100).tree;
    host.sequences[kTop].segments[250].start += 10;
    host.sequences[kTop].segments[250].end += 10;
    Change();
    host.ResetCounts();
    created.clear();
    EXPECT_EQ(read.UpdateTimeline(), Ostrand::kStatus_OK);
    EXPECT_TRUE(created.empty());
    EXPECT_EQ(host.Count("GetSegmentInfo"), kSegments);
    // Besides: the list acquired, its hash, its length, the sequence's format, the list released.
    EXPECT_EQ(host.CountAll(), kSegments + 5);
    EXPECT_EQ(InfoAt(25010).tree, moved);
    EXPECT_TRUE(InfoAt(25009).guid.IsNil());
    EXPECT_EQ(InfoAt(25100).tree, neighbour);
}

TEST_F(TimelineUpdate, TheSameContentTwiceIsBuiltOnceAndTraced) {
    std::vector<std::string> lines;
    Halden::debug::SetTraceSink([&lines](const std::string& line) { lines.push_back(line); });
    Halden::debug::SetTraceLevel("Timeline.AddSegments", 10);
    AddEffect(20, "Some Effect");
    AddPlainClip(10, {20});
    needHost.insert("Some Effect");
    AddSegment(kTop, 0, 100, 10);
    AddSegment(kTop, 300, 400, 10, 50);
    Read();
    Halden::debug::SetTraceLevel("Timeline.AddSegments", -1);
    Halden::debug::SetTraceSink({});

    EXPECT_EQ(std::count(created.begin(), created.end(), "HostRenderClip"), 1);
    const SegmentInfo first = InfoAt(0), second = InfoAt(300);
    EXPECT_EQ(first.tree, second.tree);
    EXPECT_EQ(second.offset, 50);
    EXPECT_EQ(second.layerCount, first.layerCount);
    EXPECT_TRUE(second.hostPart && !second.accelerated && !second.realTime);

    const std::string guid = NumberedGuid(10).ToString();
    ASSERT_EQ(lines.size(), 2U);
    EXPECT_THAT(lines[0], ::testing::EndsWith("> <Timeline.AddSegments> <10> Add segment......, GUID: " + guid));
    EXPECT_THAT(lines[1], ::testing::EndsWith("Add segment, reusing tree (new seg)..., GUID: " + guid +
                                              ", in: 300, out: 400, offset: 50"));
}

TEST_F(TimelineUpdate, AChildStartsWithTheParentsTrees) {
    AddPlainClip(10);
    AddSegment(kTop, 0, 100, 10);
    const std::unique_ptr<Timeline> parent = MakeTimeline(kTop, false, 0, nullptr);
    SegmentInfo ofParent;
    ASSERT_EQ(parent->GetSegmentInfo(0, ofParent, false), Ostrand::kStatus_OK);
    host.sequences[kTop].segments[0].start = 40;
    created.clear();
    Read(false, 0, parent.get());
    EXPECT_TRUE(created.empty()) << "neither the clip nor black is built again";
    EXPECT_EQ(InfoAt(40).tree, ofParent.tree);
    EXPECT_EQ(Describe(InfoAt(0).tree), "BlackVideoSource");
    ASSERT_EQ(parent->GetSegmentInfo(0, ofParent, false), Ostrand::kStatus_OK);
    EXPECT_EQ(ofParent.in, 0) << "the parent's own segments stay";
}

TEST_F(TimelineUpdate, FailuresLeaveTheMapsAloneAndTheNextUpdateReadsAnew) {
    AddPlainClip(10);
    AddSegment(kTop, 0, 100, 10);
    Timeline& read = Read();
    host.sequences[kTop].infoFails = true;
    Change();
    EXPECT_EQ(read.UpdateTimeline(), Ostrand::kStatus_Failure);
    EXPECT_TRUE(read.GetTimelineHash().IsNil());
    EXPECT_EQ(InfoAt(0).guid, NumberedGuid(10));
    host.sequences[kTop].infoFails = false;
    EXPECT_EQ(read.UpdateTimeline(), Ostrand::kStatus_OK);
    EXPECT_EQ(read.GetTimelineHash(), host.sequences[kTop].hash);

    host.sequences[kTop].acquireFails = true;
    Change();
    EXPECT_EQ(read.UpdateTimeline(), Ostrand::kStatus_OK) << "no list is no failure";
    EXPECT_EQ(InfoAt(0).guid, NumberedGuid(10));
}

TEST_F(TimelineUpdate, WithoutASequenceThereIsNothing) {
    timeline = MakeTimeline(0, false, 0, nullptr);
    EXPECT_EQ(timeline->UpdateTimeline(), Ostrand::kStatus_Failure);
    SegmentInfo info;
    EXPECT_EQ(timeline->GetSegmentInfo(0, info, false), 11);
    Vellum::Rect rect;
    Vellum::PixelAspectRatio aspect;
    Vellum::FrameRate rate;
    std::uint32_t field = 0;
    EXPECT_EQ(timeline->GetSequenceFormat(rect, aspect, rate, field), 99);

    Read();
    EXPECT_EQ(timeline->GetSequenceFormat(rect, aspect, rate, field), 0);
    EXPECT_EQ(rect, (Vellum::Rect{0, 0, 64, 36}));
    EXPECT_EQ(rate.GetTicksPerFrame(), 10160640000);
}

TEST_F(TimelineUpdate, ReadersSeeOneUpdateOrTheNext) {
    AddPlainClip(10);
    AddPlainClip(11);
    AddSegment(kTop, 0, 100, 10);
    AddSegment(kTop, 100, 200, 11);
    Timeline& read = Read();
    std::atomic<bool> done{false};
    std::thread reader([&] {
        while (!done) {
            SegmentInfo first, second;
            Vellum::Rect rect;
            Vellum::PixelAspectRatio aspect;
            Vellum::FrameRate rate;
            std::uint32_t field = 0;
            EXPECT_EQ(read.GetSequenceFormat(rect, aspect, rate, field), 0);
            ASSERT_EQ(read.GetSegmentInfo(50, first, false), Ostrand::kStatus_OK);
            EXPECT_TRUE(first.tree);
            EXPECT_EQ(read.GetSegmentInfo(50, second, true), Ostrand::kStatus_OK);
        }
    });
    for (int round = 0; round < 50; ++round) {
        auto& segments = host.sequences[kTop].segments;
        std::swap(segments[0].hash, segments[1].hash);
        std::swap(segments[0].node, segments[1].node);
        ChangeAndUpdate();
    }
    done = true;
    reader.join();
}

TEST_F(TimelineUpdate, TreesWithANestedSequenceAreNeverTakenOver) {
    AddNestedClip(10);
    AddPlainClip(11);
    AddSegment(kInner, 0, 1000, 11);
    AddSegment(kTop, 0, 100, 10);
    AddSegment(kTop, 100, 200, 10, 100);
    Read();
    const auto count = [this](const char* key) { return std::count(created.begin(), created.end(), key); };
    EXPECT_EQ(count("NestedTimelineNode"), 2) << "once for each range";
    EXPECT_EQ(count("HostRenderClip"), 1) << "what lies within is built once";
    ChangeAndUpdate();
    EXPECT_EQ(count("NestedTimelineNode"), 2);
    EXPECT_EQ(count("HostRenderClip"), 0);
}

}  // namespace
}  // namespace Vantrel::Testing
