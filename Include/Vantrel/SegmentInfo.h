// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

#include "Vantrel/IRenderNode.h"

namespace Vantrel {

/// One stretch of a sequence: where it lies, what renders it, and what it costs.
struct SegmentInfo {
    std::int64_t in = 0;      ///< ticks, inclusive
    std::int64_t out = 0;     ///< ticks, exclusive: the next stretch's in
    std::int64_t offset = 0;  ///< the time within the segment's content at `in`
    bool isPreview = false;   ///< plays a rendered preview file
    bool accelerated = true;  ///< the whole stretch renders on the device
    std::uint32_t reservedWord = 0;
    bool realTime = true;  ///< expected to play in real time

    // Counters of this level, then the same summed over nested sequences.
    std::int32_t effectCount = 0;     ///< motion and opacity excepted
    std::int32_t intrinsicCount = 0;  ///< motion, opacity, and media whose speed, rate or size isn't the sequence's
    std::int32_t transitionCount = 0;
    std::int32_t layerCount = 0;  ///< tracks being composited
    std::int32_t nestedEffectCount = 0;
    std::int32_t nestedIntrinsicCount = 0;
    std::int32_t nestedTransitionCount = 0;
    std::int32_t nestedLayerCount = 0;

    bool nested = false;     ///< the tree holds a nested sequence's node
    bool flattened = false;  ///< stands for a nested sequence whose content went into the maps directly
    bool hostWhole = false;  ///< the tree is one host render
    bool hostPart = false;   ///< some of the tree renders through the host
    Guid guid;               ///< content hash from the host; nil for a gap
    RenderNodeRef tree;
};

}  // namespace Vantrel
