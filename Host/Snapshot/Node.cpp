// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Snapshot/Node.h"

#include <algorithm>

#include "Host/Time/ExactTime.h"

namespace Vantrel::Host {

const char* GetKindText(NodeKind kind) {
    switch (kind) {
        case NodeKind::kClip:
            return "RenderableNodeClipImpl";
        case NodeKind::kCompositor:
            return "RenderableNodeCompositorImpl";
        case NodeKind::kTransition:
            return "RenderableNodeTransitionImpl";
        case NodeKind::kEffect:
            return "RenderableNodeEffectImpl";
        case NodeKind::kMedia:
            return "RenderableNodeMediaImpl";
        case NodeKind::kPreview:
            return "RenderableNodePreviewImpl";
        case NodeKind::kSolidColor:
            return "RenderableNodeSolidColorImpl";
        case NodeKind::kDisabled:
            return "RenderableNodeDisabledImpl";
        case NodeKind::kMulticam:
            return "RenderableNodeMulticamImpl";
        case NodeKind::kAdjustment:
            return "RenderableNode_AdjustmentImpl";
    }
    return "";
}

const std::string* Node::FindProperty(const char* key) const {
    const auto found = std::lower_bound(properties.begin(), properties.end(), key,
                                        [](const auto& property, const char* k) { return property.first < k; });
    return found != properties.end() && found->first == key ? &found->second : nullptr;
}

const Parameter* Node::FindParameter(std::int32_t index) const {
    const std::vector<Parameter>* parameters = nullptr;
    if (const EffectDetail* effect = AsEffect()) parameters = &effect->parameters;
    if (const TransitionDetail* transition = AsTransition()) parameters = &transition->parameters;
    if (parameters == nullptr) return nullptr;
    const auto found = std::lower_bound(parameters->begin(), parameters->end(), index,
                                        [](const Parameter& p, std::int32_t i) { return p.index < i; });
    return found != parameters->end() && found->index == index ? &*found : nullptr;
}

std::int64_t Node::LaterTime(std::int64_t nodeTime, std::int64_t ticks) const {
    if (const MediaDetail* media = AsMedia()) {
        if (media->held || media->clip->info.still) return nodeTime;
        const std::int64_t step = ScaleTicks(ticks, media->speed);
        return media->backwards ? nodeTime - step : nodeTime + step;
    }
    const ItemDetail* item = AsItem();
    return item ? item->time.LaterTransformed(nodeTime, ticks) : nodeTime + ticks;
}

std::int64_t Node::TransformTime(std::int64_t argument) const {
    const ItemDetail* item = AsItem();
    return item != nullptr ? item->time.Transform(argument) : argument;
}

const Segment* SegmentList::Find(std::int64_t time) const {
    const auto after = std::upper_bound(segments.begin(), segments.end(), time,
                                        [](std::int64_t t, const Segment& segment) { return t < segment.start; });
    if (after == segments.begin()) return nullptr;
    const Segment& before = *std::prev(after);
    return time < before.end ? &before : nullptr;
}

}  // namespace Vantrel::Host
