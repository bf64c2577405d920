// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Snapshot/NodeHash.h"

#include <algorithm>
#include <string_view>

namespace Vantrel::Host {
namespace {

void AddFormat(ContentHasher& hasher, const SequenceFormat& format) {
    hasher.Number(format.width).Number(format.height);
    hasher.Number(format.aspectNumerator).Number(format.aspectDenominator);
    hasher.Number(format.frameTicks).Number(static_cast<std::int64_t>(format.fieldType));
}

void AddParameters(ContentHasher& hasher, const std::vector<Parameter>& parameters) {
    for (const Parameter& parameter : parameters) {
        hasher.Number(parameter.index).Text(parameter.name).Number(static_cast<std::int64_t>(parameter.type));
        for (const double component : parameter.value) hasher.Real(component);
        hasher.Number(static_cast<std::int64_t>(parameter.keys.size()));
        for (const Keyframe& key : parameter.keys) {
            hasher.Number(key.time).Number(static_cast<std::int64_t>(key.interpolation));
            for (std::size_t i = 0; i < key.value.size(); ++i) {
                hasher.Real(key.value[i]).Real(key.out[i].along).Real(key.out[i].by);
                hasher.Real(key.in[i].along).Real(key.in[i].by);
            }
        }
    }
}

void AddTimeMap(ContentHasher& hasher, const TimeMap& map) {
    hasher.Number(static_cast<std::int64_t>(map.motion)).Number(map.in).Real(map.speed).Number(map.hold);
    hasher.Number(map.holdFilters).Number(map.duration).Number(static_cast<std::int64_t>(map.curve.size()));
    for (const RemapKey& key : map.curve) {
        hasher.Number(key.time).Number(key.mediaTime).Number(static_cast<std::int64_t>(key.interpolation));
    }
}

struct DetailHasher {
    ContentHasher& hasher;

    void operator()(const std::monostate&) const {}
    void operator()(const ItemDetail& item) const { AddTimeMap(hasher, item.time); }
    void operator()(const MediaDetail& media) const {
        hasher.Identifier(media.clip->identity).Number(media.samplesTime);
        hasher.Number(static_cast<std::int64_t>(media.alpha)).Number(media.clip->info.still);
    }
    void operator()(const EffectDetail& effect) const {
        hasher.Identifier(HashEffect(effect)).Number(effect.matte.node != nullptr);
        if (effect.matte.node) hasher.Number(effect.matte.offset).Identifier(effect.matte.node->hash);
    }
    void operator()(const TransitionDetail& transition) const {
        hasher.Text(transition.matchName).Number(transition.duration);
        AddParameters(hasher, transition.parameters);
    }
    void operator()(const MulticamDetail&) const {}
};

bool NamesOrPlaces(const std::string& key) {
    constexpr std::string_view kKeys[] = {
        "ClipNode::EffectiveTrackItemEndAsTicks", "ClipNode::EffectiveTrackItemStartAsTicks",
        "ClipNode::TrackItemEndAsTicks",          "ClipNode::TrackItemStartAsTicks",
        "EffectNode::RuntimeInstanceID",          "MediaNode::ClipID",
        "MediaNode::NestedSequenceTimelineID",    "MediaNode::SelectedMulticamTrackTimelineID",
    };
    return std::find(std::begin(kKeys), std::end(kKeys), key) != std::end(kKeys);
}

std::int64_t Distance(const Node& node, const char* from, const char* to) {
    const std::string* a = node.FindProperty(from);
    const std::string* b = node.FindProperty(to);
    return a != nullptr && b != nullptr ? std::stoll(*b) - std::stoll(*a) : 0;
}

}  // namespace

Guid HashEffect(const EffectDetail& effect) {
    ContentHasher hasher;
    hasher.Text(effect.matchName).Text(effect.filterGraph).Number(effect.timeDependent);
    hasher.Number(static_cast<std::int64_t>(effect.opaqueData.size()));
    hasher.Bytes(effect.opaqueData.data(), effect.opaqueData.size());
    AddParameters(hasher, effect.parameters);
    return hasher.Finish();
}

Guid HashNode(const Node& node, const SequenceFormat& format) {
    ContentHasher hasher;
    hasher.Text(GetKindText(node.kind)).Number(node.flags);
    hasher.Number(static_cast<std::int64_t>(node.inputs.size()));
    for (const NodeInput& input : node.inputs) {
        hasher.Number(input.offset).Identifier(input.node ? input.node->hash : Guid());
    }
    hasher.Number(static_cast<std::int64_t>(node.operators.size()));
    for (const NodePtr& effect : node.operators) hasher.Identifier(effect->hash);
    std::visit(DetailHasher{hasher}, node.detail);
    hasher.Number(Distance(node, "ClipNode::EffectiveTrackItemStartAsTicks", "ClipNode::TrackItemStartAsTicks"));
    hasher.Number(Distance(node, "ClipNode::TrackItemEndAsTicks", "ClipNode::EffectiveTrackItemEndAsTicks"));
    for (const auto& [key, value] : node.properties) {
        if (!NamesOrPlaces(key)) hasher.Text(key).Text(value);
    }
    AddFormat(hasher, format);
    return hasher.Finish();
}

Guid HashSegments(const std::vector<Segment>& segments, const SequenceFormat& format) {
    ContentHasher hasher;
    AddFormat(hasher, format);
    for (const Segment& segment : segments) {
        hasher.Number(segment.start).Number(segment.end).Number(segment.offset).Identifier(segment.root->hash);
    }
    return hasher.Finish();
}

}  // namespace Vantrel::Host
