// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Tests/Host/EngineWalk.h"

#include <gtest/gtest.h>

#include <algorithm>

#include "Host/Snapshot/Fingerprint.h"
#include "Host/Suites/HostServices.h"
#include "Tests/Host/TimelineText.h"

namespace Vantrel::Host::Test {
namespace {

const CorvaneVideoSegmentSuite& Suite() {
    static const auto& kSuite = Segments();
    return kSuite;
}

const LarkspurMemoryManagerSuite& Memory() {
    static const auto& kSuite =
        Acquire<LarkspurMemoryManagerSuite>(kMemoryManagerSuiteName, kMemoryManagerSuiteVersion);
    return kSuite;
}

std::optional<std::string> Property(std::uint32_t node, const char* key) {
    char* text = nullptr;
    if (Suite().GetProperty(node, key, &text) != 0) return std::nullopt;
    const std::string copy = text;
    Memory().FreeText(text);
    return copy;
}

std::int64_t Number(std::uint32_t node, const char* key, std::int64_t fallback) {
    const auto text = Property(node, key);
    return text ? std::stoll(*text) : fallback;
}

/// An acquired node id, released at the end of the scope.
class HeldNode {
public:
    explicit HeldNode(std::uint32_t id) : mID(id) {}
    ~HeldNode() {
        if (mID == 0) return;
        EXPECT_EQ(Suite().ReleaseNode(mID), 0);
    }
    HeldNode(const HeldNode&) = delete;
    HeldNode& operator=(const HeldNode&) = delete;
    [[nodiscard]] std::uint32_t Get() const { return mID; }

private:
    std::uint32_t mID;
};

}  // namespace

struct ListedSegment {
    std::int64_t start = 0;
    std::int64_t end = 0;
    std::int64_t offset = 0;
    char hash[40] = {};
};

class EngineWalk::HeldList {
public:
    explicit HeldList(std::uint32_t timeline) {
        EXPECT_EQ(Suite().AcquireVideoSegments(timeline, "", &mID), 0);
        std::int32_t count = 0;
        EXPECT_EQ(Suite().GetSegmentCount(mID, &count), 0);
        for (std::int32_t i = 0; i < count; ++i) {
            ListedSegment s;
            EXPECT_EQ(Suite().GetSegmentInfo(mID, i, &s.start, &s.end, &s.offset, s.hash), 0);
            segments.push_back(s);
        }
    }
    ~HeldList() { EXPECT_EQ(Suite().ReleaseVideoSegments(mID), 0); }
    HeldList(const HeldList&) = delete;
    HeldList& operator=(const HeldList&) = delete;

    [[nodiscard]] std::uint32_t Root(const ListedSegment& segment) const {
        std::uint32_t root = 0;
        EXPECT_EQ(Suite().AcquireSegmentNode(mID, segment.hash, &root), 0);
        return root;
    }

    std::vector<ListedSegment> segments;

private:
    std::uint32_t mID = 0;
};

namespace {

/// How tree construction rounds.
std::int64_t Scaled(double speed, std::int64_t ticks) {
    return static_cast<std::int64_t>(speed * static_cast<double>(ticks) + 0.5);
}

}  // namespace

EngineWalk::EngineWalk() = default;
EngineWalk::~EngineWalk() = default;

const EngineWalk::HeldList& EngineWalk::ListOf(std::uint32_t timeline) {
    std::unique_ptr<HeldList>& list = mLists[timeline];
    if (!list) list = std::make_unique<HeldList>(timeline);
    return *list;
}

std::optional<std::int64_t> EngineWalk::ClipTimeAt(std::int64_t time) {
    const HeldList& list = ListOf(1);
    for (const ListedSegment& s : list.segments) {
        if (s.start <= time && time < s.end) return time - s.start + s.offset;
    }
    return std::nullopt;
}

std::vector<Shown> EngineWalk::At(std::int64_t time) {
    mShown.clear();
    const HeldList& list = ListOf(1);
    for (const ListedSegment& s : list.segments) {
        if (time < s.start || time >= s.end) continue;
        const HeldNode root(list.Root(s));
        Visit(root.Get(), 0, time - s.start + s.offset, {s.start, s.end, s.offset});
    }
    return mShown;
}

void EngineWalk::Visit(std::uint32_t node, std::int64_t timeOffset, std::int64_t clipTime, const Stretch& stretch) {
    char kind[272] = {};
    char hash[40] = {};
    std::uint32_t flags = 0;
    ASSERT_EQ(Suite().GetNodeInfo(node, kind, hash, &flags), 0);
    if (std::string(kind) == "RenderableNodeClipImpl") return VisitClip(node, timeOffset, clipTime, stretch);
    std::int32_t count = 0;
    ASSERT_EQ(Suite().GetInputCount(node, &count), 0);
    for (std::int32_t i = 0; i < count; ++i) {
        std::int64_t offset = 0;
        std::uint32_t id = 0;
        ASSERT_EQ(Suite().AcquireInputNode(node, i, &offset, &id), 0);
        const HeldNode input(id);
        if (id != 0) Visit(id, timeOffset + offset, clipTime, stretch);
    }
}

void EngineWalk::VisitClip(std::uint32_t clip, std::int64_t timeOffset, std::int64_t clipTime, const Stretch& stretch) {
    std::int64_t offset = 0;
    std::uint32_t id = 0;
    ASSERT_EQ(Suite().AcquireInputNode(clip, 0, &offset, &id), 0);
    const HeldNode media(id);
    const std::int64_t mediaOffset = timeOffset + offset;
    std::int64_t mediaTime = Number(clip, "ClipNode::FrameHoldAtTime", Vellum::kTime_Max);
    if (mediaTime == Vellum::kTime_Max) {
        ASSERT_EQ(Suite().TransformTime(clip, clipTime - mediaOffset, &mediaTime), 0);
    }
    const auto nested = static_cast<std::uint32_t>(Number(id, "MediaNode::NestedSequenceTimelineID", 0));
    const auto clipID = static_cast<std::uint32_t>(Number(id, "MediaNode::ClipID", 0));
    if (nested != 0) {
        const double speed = std::stod(Property(id, "MediaNode::ClipSpeed").value_or("1"));
        return VisitNested(nested, speed, mediaOffset, mediaTime, stretch);
    }
    const MediaClipPtr made = HostServices::Instance().FindClip(clipID);
    ASSERT_TRUE(made) << "media without a sequence or a clip";
    if (std::holds_alternative<NestedSource>(made->source)) return VisitVirtual(clipID, mediaTime);
    mShown.push_back({made->info.identity.path, mediaTime, MediaFrameAt(made->info, mediaTime)});
}

/// The inner segments that tree construction finds in the range, and of these the one that the nested source picks.
void EngineWalk::VisitNested(std::uint32_t timeline, double speed, std::int64_t mediaOffset, std::int64_t mediaTime,
                             const Stretch& stretch) {
    const std::int64_t from = Scaled(speed, stretch.in);
    const std::int64_t to = Scaled(speed, stretch.out);
    VisitSequenceAt(timeline, mediaTime, from, to, from - Scaled(speed, stretch.offset - mediaOffset));
}

void EngineWalk::VisitSequenceAt(std::uint32_t timeline, std::int64_t time, std::int64_t from, std::int64_t to,
                                 std::int64_t shift) {
    const HeldList& list = ListOf(timeline);
    for (const ListedSegment& s : list.segments) {
        const std::int64_t clippedIn = std::max(from, s.start + shift);
        const std::int64_t clippedOut = std::min(to, s.end + shift);
        if (clippedIn >= clippedOut || time < s.start || time >= s.end) continue;
        const HeldNode root(list.Root(s));
        Visit(root.Get(), 0, time - s.start + s.offset,
              {clippedIn, clippedOut, s.offset + clippedIn - s.start - shift});
    }
}

/// The host's renderer makes whole frames of the inner sequence.
void EngineWalk::VisitVirtual(std::uint32_t clipID, std::int64_t mediaTime) {
    const MediaClipPtr clip = HostServices::Instance().FindClip(clipID);
    const std::int64_t time = MediaFrameAt(clip->info, mediaTime) * clip->info.ticksPerFrame;
    const SequencePtr inner = std::get<NestedSource>(clip->source).sequence;
    VisitSequenceAt(inner->timelineID, time, 0, Vellum::kTime_Max, 0);
}

}  // namespace Vantrel::Host::Test
