// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <set>
#include <string>

#include "Tests/Support/FakeHost.h"
#include "Tests/Timeline/TickModel.h"

namespace Vantrel::Testing {

/// What becomes of the keys that a timeline asks its creator for. A key in no set gives a device's node.
struct CreatorScript {
    std::set<std::string> unregistered{};  ///< come back as a host subtree
    std::set<std::string> failing{};       ///< registered, but can't be configured: a host subtree as well
    std::set<std::string> refused{};       ///< nothing comes back
    std::set<std::string> needHost{};      ///< nodes that say of themselves that they render through the host
};

/// Counts by itself what a script costs: which segments are seen, what each holds, who renders it. It walks the host's
/// nodes where the timeline builds trees, and keeps both maps tick by tick.
class VerdictCount {
public:
    /// @param native  media subtypes that play natively
    VerdictCount(const FakeHost& host, const CreatorScript& creator, std::set<std::string> native, std::int64_t end)
        : rendered(end), merged(end), mHost(host), mCreator(creator), mNative(std::move(native)), mEnd(end) {}

    /// Counts one more update: what stands unchanged, and content that the update before built, isn't counted again.
    void ReadTop(std::uint32_t sequence);

    TickModel rendered;
    TickModel merged;

private:
    struct Range {
        std::int64_t in, out, offset;
    };
    /// A node whose record is being filled, and whether something in it is the host's.
    struct Account {
        SegmentInfo& record;
        bool& host;
    };

    void Read(const FakeSequence& sequence, const Range& range, SegmentInfo* outer, bool top);
    SegmentInfo Place(const FakeSegment& segment, const Range& range, bool top);
    void Enter(SegmentInfo info, bool host, bool top);

    bool Make(const std::string& key, const std::string& kind, bool& host) const;
    bool Node(std::uint32_t id, Account account);
    bool Clip(const FakeNode& clip, Account account);
    bool Operator(const std::string& matchName, Account account) const;
    bool Compositor(const FakeNode& node, Account account);
    bool Transition(const FakeNode& node, Account account);
    bool EffectOver(const FakeNode& node, Account account);
    bool Multicam(const FakeNode& node, Account account);
    bool Adjustment(const FakeNode& node, Account account);
    bool Media(const FakeNode& media, const FakeNode* clip, Account account);
    bool Stream(const FakeNode& media, Account account);
    bool Nested(const FakeNode& media, const FakeNode* clip, bool plain, Account account);

    [[nodiscard]] const FakeNode& At(std::uint32_t id) const { return mHost.nodes.at(id); }

    const FakeHost& mHost;
    const CreatorScript& mCreator;
    const std::set<std::string> mNative;
    const std::int64_t mEnd;
    std::map<Guid, SegmentInfo> mKnown;   ///< content that this update built or took over
    std::map<Guid, SegmentInfo> mBefore;  ///< that of the update before
};

}  // namespace Vantrel::Testing
