// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Host/Inspect/DeviceAbilities.h"
#include "Host/Inspect/Inspection.h"
#include "Host/Snapshot/Snapshot.h"

namespace Vantrel::Host {

struct TimeSpan {
    std::int64_t start = 0;  ///< half open
    std::int64_t end = 0;

    [[nodiscard]] TimeSpan Minus(std::int64_t offset) const { return {start - offset, end - offset}; }
};

/// Walks a segment's description as the engine does, and tells of each node who renders it and why it isn't the device.
/// Used for one stretch.
class StretchExplainer {
public:
    StretchExplainer(const Snapshot& snapshot, const DeviceAbilities& device) : mSnapshot(snapshot), mDevice(device) {}

    /// @param span in the sequence's time; lies in the segment
    [[nodiscard]] TreeNode Explain(const Segment& segment, TimeSpan span, const SequenceFormat& format);
    /// What Explain found, each once, in the tree's order.
    [[nodiscard]] const std::vector<Reason>& GetReasons() const { return mReasons; }

private:
    [[nodiscard]] TreeNode Visit(const Node* node, TimeSpan span, const Node* clip);
    [[nodiscard]] TreeNode VisitClip(const Node& clip, TimeSpan span);
    [[nodiscard]] TreeNode VisitAdjustment(const Node& adjustment, TimeSpan span);
    [[nodiscard]] TreeNode VisitTransition(const Node& transition, TimeSpan span);
    [[nodiscard]] TreeNode VisitInputs(const Node& node, TimeSpan span, const char* kind, const char* key);
    [[nodiscard]] TreeNode VisitMedia(const Node& media, TimeSpan span, const Node* clip);
    [[nodiscard]] TreeNode VisitPreview(const Node& preview);
    [[nodiscard]] TreeNode AddEffect(const Node& effect, TreeNode below);
    void VisitSequence(TreeNode& media, const Sequence& sequence, TimeSpan span, const ItemDetail* item);
    void CheckMedia(TreeNode& tree, const Node& media);
    /// Nothing of the device's can take its place: the host makes the whole segment.
    void RefuseSegment(TreeNode& tree, Reason reason);
    /// The host makes this node's picture, with all that lies below.
    void GiveToHost(TreeNode& tree, Reason reason);
    void Note(Reason reason);

    const Snapshot& mSnapshot;
    const DeviceAbilities& mDevice;
    std::vector<Reason> mReasons;
    bool mSegmentRefused = false;
};

}  // namespace Vantrel::Host
