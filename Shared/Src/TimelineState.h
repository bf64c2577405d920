// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <deque>
#include <map>
#include <set>
#include <unordered_map>

#include <boost/function.hpp>
#include <boost/shared_ptr.hpp>

#include "Ostrand/CriticalSection.h"
#include "Shared/Src/SegmentVerdict.h"
#include "Src/VideoNodes/VideoSegmentsHandle.h"

namespace Vantrel {

/// Makes a configured node for a key, or nothing; sets `host` when the node renders through the host.
using CreateNodeFunction = boost::function<RenderNodeRef(const Halden::WideString& key, const VideoNodeRef& description,
                                                         const RenderRequirements& requirements, bool& host)>;
/// Is there a node of its own for that key on the timeline's device?
using IsRegisteredFunction = boost::function<bool(const Halden::WideString& key)>;

/// Stretches by their in: none overlaps another.
using SegmentMap = std::map<std::int64_t, SegmentInfo>;
using TreeCache = std::unordered_map<Guid, SegmentVerdict>;

/// What a Timeline holds, and what reading and building work on. Everything here is used under `lock`, except
/// topFormat.
struct TimelineState {
    mutable Ostrand::CriticalSection lock{"Timeline"};
    SegmentMap renderMap;  ///< the trees to render
    SegmentMap mergedMap;  ///< statistics across nesting levels; its trees are never rendered
    TreeCache treeCache;   ///< the trees of the last update
    /// The trees of the update that is running; a local of that update, null outside of one.
    TreeCache* buildingCache = nullptr;
    std::set<std::uint32_t> nativeSubTypes;
    std::set<std::uint32_t> hostSubTypes;

    // The formats of the sequences being read, the top one first. They move together.
    std::deque<Vellum::Rect> rectStack;
    std::deque<Vellum::FrameRate> mRealTimeFileFPS;
    std::deque<Vellum::PixelAspectRatio> aspectStack;
    std::deque<std::uint32_t> fieldStack;

    /// The sequences being read, the top one first.
    std::deque<std::uint32_t> sequenceStack;

    /// The front of the four stacks for readers without the lock: through boost::atomic_load and atomic_store only.
    boost::shared_ptr<const SequenceInfo> topFormat;

    RenderNodeRef blackTree;  ///< what renders where nothing lies
    std::uint32_t timelineID = 0;
    Guid lastHash;  ///< of the segment list last read; nil after a failed update
    bool usePreviews = false;
    const char* previewSpec = nullptr;
    Kiln::DeviceRef device;
    CreateNodeFunction createNode;
    IsRegisteredFunction isRegistered;
};

}  // namespace Vantrel
