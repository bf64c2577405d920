// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/SegmentInfo.h"

namespace Vantrel {

/// What a finished tree is remembered by, so that the same content needs no second build wherever it appears.
struct SegmentVerdict {
    std::int32_t layerCount = 0;
    std::int32_t effectCount = 0;
    std::int32_t intrinsicCount = 0;
    std::int32_t transitionCount = 0;
    std::int32_t nestedLayerCount = 0;
    std::int32_t nestedEffectCount = 0;
    std::int32_t nestedIntrinsicCount = 0;
    std::int32_t nestedTransitionCount = 0;
    bool ok = true;     ///< the device renders it, or part of it; the inverse of SegmentInfo::hostWhole
    bool host = false;  ///< some of the tree renders through the host; SegmentInfo::hostPart
    bool isPreview = false;
    bool realTime = true;
    RenderNodeRef tree;
    /// The tree holds a nested sequence. What it shows depends on the range of its parent: it is never taken over.
    bool nested = false;
};

}  // namespace Vantrel
