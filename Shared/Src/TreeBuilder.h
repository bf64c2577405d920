// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Shared/Src/TimelineState.h"
#include "Src/VideoNodes/VideoEffectNode.h"
#include "Src/VideoNodes/VideoMediaNode.h"

namespace Vantrel {

class SegmentReader;
class VideoClipNode;

// The node creator's keys of what isn't named by the host.
constexpr const char16_t* kKey_Black = u"BlackVideoSource";
constexpr const char16_t* kKey_HostClip = u"HostRenderClip";
constexpr const char16_t* kKey_HostSource = u"HostRenderSource";
constexpr const char16_t* kKey_HostSubtree = u"HostRenderSubtree";
constexpr const char16_t* kKey_Compositor = u"LayerBlendNode";
constexpr const char16_t* kKey_NestedTimeline = u"NestedTimelineNode";
constexpr const char16_t* kKey_Multicam = u"MulticamRenderNode";
constexpr const char16_t* kKey_Adjustment = u"AdjustmentNode";
constexpr const char16_t* kKey_Disabled = u"DisabledNode";

/// A branch being built: the tree so far, and what is known of it.
struct Branch {
    explicit Branch(SegmentInfo& record, bool needsHost = false) : info(record), host(needsHost) {}

    SegmentInfo& info;  ///< the record of the segment, or of one layer of it
    bool ok = true;     ///< false: this can't be built here at all, and whoever asked for it gives up as well
    bool host;          ///< the tree holds a node that renders through the host
    RenderNodeRef tree;
};

/// Turns a segment's description into a tree of render nodes, and notes in its record how much of it the device can do.
/// What it can't do becomes a host render: of a branch, or of the whole segment.
///
/// Every builder leaves the branch's ok true or false and stops at the first false. A negative status comes from
/// reading a nested sequence only, and goes straight up.
class TreeBuilder {
public:
    /// For the sequence whose format is on top of the state's stacks. `reader` reads nested sequences.
    TreeBuilder(TimelineState& state, SegmentReader& reader) : mState(state), mReader(reader) {}

    /// The tree of a whole segment, as a last resort one host render. Demands that a sequence is being read.
    /// @return 0, or kStatus_NotBuilt.
    Status BuildSegmentTree(const VideoNodeRef& root, Branch& branch);
    static constexpr Status kStatus_NotBuilt = static_cast<Status>(0x80000000);

    /// What renders where nothing lies.
    [[nodiscard]] RenderNodeRef BuildBlackTree();

private:
    using Requirements = const RenderRequirements&;

    Status BuildWithFallback(const VideoNodeRef& root, Branch& branch, Requirements requirements);
    Status BuildNode(const VideoNodeRef& node, Branch& branch, Requirements requirements);
    Status BuildBlack(Branch& branch, Requirements requirements);
    Status BuildClip(const VideoNodeRef& clip, Branch& branch, Requirements requirements);
    Status BuildEffect(const VideoNodeRef& effect, Branch& branch, Requirements requirements);
    Status BuildCompositor(const VideoNodeRef& compositor, Branch& branch, Requirements requirements);
    Status BuildSingleLayer(const VideoNodeRef& compositor, Branch& branch, Requirements requirements);
    Status BuildTransition(const VideoNodeRef& transition, Branch& branch, Requirements requirements);
    Status BuildDisabled(const VideoNodeRef& disabled, Branch& branch, Requirements requirements);
    Status BuildMulticam(const VideoNodeRef& multicam, Branch& branch, Requirements requirements);
    Status BuildAdjustment(const VideoNodeRef& adjustment, Branch& branch, Requirements requirements);
    Status BuildAdjustmentChain(const VideoNodeRef& layer, Branch& chain, bool& needsHost, Requirements requirements);
    Status BuildHostSubtree(const VideoNodeRef& node, Branch& branch, Requirements requirements);

    // Media: MediaBuilder.cpp.
    Status BuildPreview(const VideoMediaNodeRef& media, Branch& branch, Requirements requirements);
    Status BuildMedia(const VideoMediaNodeRef& media, Branch& branch, Requirements requirements);
    Status BuildStream(const VideoMediaNodeRef& media, Branch& branch, Requirements requirements);
    Status BuildNested(const VideoMediaNodeRef& media, std::uint32_t sequenceID, bool matches, Branch& branch,
                       Requirements requirements);
    Status ReadNested(const VideoMediaNodeRef& media, std::uint32_t sequenceID, Branch& branch);

    void AddEffect(const VideoEffectNodeRef& effect, Branch& branch, Requirements requirements);
    Status BuildInput(const VideoNodeRef& node, std::int32_t index, Branch& branch, Requirements requirements);
    /// What nodes need to know of the sequence that is being read.
    [[nodiscard]] RenderRequirements MakeRequirements() const;

    TimelineState& mState;
    SegmentReader& mReader;
};

}  // namespace Vantrel
