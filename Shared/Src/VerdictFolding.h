// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Shared/Src/SegmentVerdict.h"

namespace Vantrel {

// How the verdict on a part becomes the verdict on the whole. Each rule differs in what it counts, so each stands by
// itself; what they share is the four pairs of counters.

/// Something goes to the host: what was counted below it isn't the device's work any more.
void ResetCounters(SegmentInfo& info);

/// One track into the stack of tracks that holds it. The last track decides whether the stretch is a preview.
void FoldIntoCompositor(SegmentInfo& parent, const SegmentInfo& child);

/// One angle into the view of all angles.
void FoldIntoMulticam(SegmentInfo& parent, const SegmentInfo& child);

/// A nested sequence, as its reading left it in `nested`, into the media that shows it: the counters only.
void FoldNestedSequence(SegmentInfo& media, const SegmentInfo& nested);

/// One segment of a nested sequence into the record of that sequence.
void FoldSegmentIntoNested(SegmentInfo& nested, const SegmentVerdict& segment);

/// A stretch of one nesting level over a stretch of statistics, whose place, hash and tree stay.
void MergeStatistics(SegmentInfo& entry, const SegmentInfo& segment);

/// What is remembered of a finished stretch, and what a stretch takes over from it.
[[nodiscard]] SegmentVerdict VerdictOf(const SegmentInfo& info);
void ApplyVerdict(SegmentInfo& info, const SegmentVerdict& verdict);

}  // namespace Vantrel
