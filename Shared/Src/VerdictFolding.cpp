// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Shared/Src/VerdictFolding.h"

#include <algorithm>

namespace Vantrel {
namespace {

using Counter = std::int32_t SegmentInfo::*;

/// A counter of this level and its sum over nested sequences.
struct CounterPair {
    Counter level;
    Counter nested;
};

/// Layers count by rules of their own, so they are apart.
constexpr CounterPair kWorkCounters[] = {
    {&SegmentInfo::effectCount, &SegmentInfo::nestedEffectCount},
    {&SegmentInfo::intrinsicCount, &SegmentInfo::nestedIntrinsicCount},
    {&SegmentInfo::transitionCount, &SegmentInfo::nestedTransitionCount},
};
constexpr CounterPair kLayerCounters{&SegmentInfo::layerCount, &SegmentInfo::nestedLayerCount};

/// A single layer isn't composited: only a stack counts, or the first count at all.
void AddLayers(SegmentInfo& parent, const SegmentInfo& child, Counter layers) {
    if (child.*layers > 1 || parent.*layers == 0) parent.*layers += child.*layers;
}

void FoldFlags(SegmentInfo& parent, const SegmentInfo& child) {
    parent.hostWhole = parent.hostWhole || child.hostWhole;
    parent.hostPart = parent.hostPart || child.hostPart;
    parent.realTime = parent.realTime && child.realTime;
    parent.isPreview = child.isPreview;
    parent.nested = parent.nested || child.nested;
}

bool IsDeviceOnly(const SegmentInfo& info) { return info.accelerated && !info.hostWhole && !info.hostPart; }

template <class To, class From>
void CopyCounters(To& to, const From& from) {
    to.layerCount = from.layerCount;
    to.effectCount = from.effectCount;
    to.intrinsicCount = from.intrinsicCount;
    to.transitionCount = from.transitionCount;
    to.nestedLayerCount = from.nestedLayerCount;
    to.nestedEffectCount = from.nestedEffectCount;
    to.nestedIntrinsicCount = from.nestedIntrinsicCount;
    to.nestedTransitionCount = from.nestedTransitionCount;
}

}  // namespace

void ResetCounters(SegmentInfo& info) {
    for (const CounterPair& pair : kWorkCounters) info.*pair.level = info.*pair.nested = 0;
    info.layerCount = info.nestedLayerCount = 1;
}

void FoldIntoCompositor(SegmentInfo& parent, const SegmentInfo& child) {
    FoldFlags(parent, child);
    parent.accelerated = parent.accelerated && IsDeviceOnly(child);
    AddLayers(parent, child, kLayerCounters.level);
    AddLayers(parent, child, kLayerCounters.nested);
    for (const CounterPair& pair : kWorkCounters) {
        parent.*pair.level += child.*pair.level;
        parent.*pair.nested += child.*pair.nested;
    }
}

void FoldIntoMulticam(SegmentInfo& parent, const SegmentInfo& child) {
    FoldFlags(parent, child);
    AddLayers(parent, child, kLayerCounters.level);
    parent.nestedLayerCount = child.nestedLayerCount + parent.layerCount;
    for (const CounterPair& pair : kWorkCounters) {
        parent.*pair.level += child.*pair.level;
        parent.*pair.nested = child.*pair.nested + parent.*pair.level;
    }
}

void FoldNestedSequence(SegmentInfo& media, const SegmentInfo& nested) {
    if (media.nestedLayerCount == 0) media.nestedLayerCount = 1;
    if (nested.nestedLayerCount > 1) media.nestedLayerCount += nested.nestedLayerCount;
    if (nested.layerCount > 1) media.nestedLayerCount += nested.layerCount;
    for (const CounterPair& pair : kWorkCounters) media.*pair.nested += nested.*pair.level + nested.*pair.nested;
}

void FoldSegmentIntoNested(SegmentInfo& nested, const SegmentVerdict& segment) {
    nested.accelerated = nested.accelerated && segment.ok && !segment.host && segment.realTime;
    nested.realTime = nested.realTime && segment.realTime;
    SegmentInfo counters;
    CopyCounters(counters, segment);
    FoldNestedSequence(nested, counters);
    nested.nested = true;
}

void MergeStatistics(SegmentInfo& entry, const SegmentInfo& segment) {
    // Of what stands there, only that much can show through the stretch as its own nested content accounts for.
    for (const CounterPair& pair : kWorkCounters) {
        entry.*pair.level = segment.*pair.level + std::min(entry.*pair.level, segment.*pair.nested);
    }
    const std::int32_t below = std::min(entry.layerCount, segment.nestedLayerCount);
    const std::int32_t layers = segment.layerCount;
    entry.layerCount = layers < 2 || below < 2 ? std::max(layers, below) : layers + below - 1;
    entry.hostPart = entry.hostPart || segment.hostPart;
    entry.hostWhole = entry.hostWhole || segment.hostWhole;
    entry.accelerated = entry.accelerated && IsDeviceOnly(segment);
    entry.realTime = entry.realTime && segment.realTime;
}

SegmentVerdict VerdictOf(const SegmentInfo& info) {
    SegmentVerdict verdict;
    CopyCounters(verdict, info);
    verdict.ok = !info.hostWhole;
    verdict.host = info.hostPart;
    verdict.isPreview = info.isPreview;
    verdict.realTime = info.realTime;
    verdict.tree = info.tree;
    verdict.nested = info.nested;
    return verdict;
}

void ApplyVerdict(SegmentInfo& info, const SegmentVerdict& verdict) {
    info.hostWhole = !verdict.ok;
    info.hostPart = verdict.host;
    info.isPreview = verdict.isPreview;
    info.realTime = info.realTime && verdict.realTime;
    CopyCounters(info, verdict);
}

}  // namespace Vantrel
