// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Snapshot/LayerNodes.h"

#include <algorithm>

#include "Host/Snapshot/SequenceBuilder.h"

namespace Vantrel::Host {
namespace {

bool IsComposition(const Item& item) { return item.kind == ItemKind::kStack || item.kind == ItemKind::kTrack; }

bool IsAdjustment(const ActiveLayer& layer) {
    const PlacedItem* placed = layer.placement->item;
    return placed != nullptr && placed->item->enabled && placed->item->media.generator == "adjustment";
}

bool IsGrid(const ActiveLayer& layer) {
    const PlacedItem* placed = layer.placement->item;
    return placed != nullptr && placed->item->enabled && placed->item->multicam && placed->item->multicam->grid;
}

bool IsDisabled(const ActiveLayer& layer) {
    return layer.placement->item != nullptr && !layer.placement->item->item->enabled;
}

/// The engine maps a nested sequence's range forwards only: what runs otherwise the host renders.
bool NeedsHostFrames(const TimeMap& time) { return time.motion != Motion::kForward; }

/// The latest start of anything that the segment shows. A tree then doesn't know where it stands, has the same shape
/// before and after a layer that covers a part of it, and no clip's offset is positive.
std::int64_t OriginOf(const std::vector<ActiveLayer>& layers) {
    std::int64_t origin = layers.front().placement->anchor;
    for (const ActiveLayer& layer : layers) {
        origin = std::max(origin, layer.placement->anchor);
        for (const PlacedItem* joined : {layer.placement->outgoing, layer.placement->incoming}) {
            if (joined != nullptr) origin = std::max(origin, joined->start);
        }
    }
    return origin;
}

}  // namespace

LayerNodes::LayerNodes(SequenceBuilder& sequences, const SequenceFormat& format)
    : mSequences(sequences), mFormat(format), mFactory(format, sequences.GetIdentities()) {}

NodePtr LayerNodes::ClipNode(const PlacedItem& placed, std::int32_t trackID, const MatteLookup& mattes) {
    // What takes its matte from another layer depends on the segment.
    if (UsesTrackMatte(*placed.item) && mattes) return MakeClipNode(placed, trackID, mattes);
    NodePtr& known = mClips[&placed];
    if (!known) known = MakeClipNode(placed, trackID, {});
    return known;
}

NodePtr LayerNodes::MakeClipNode(const PlacedItem& placed, std::int32_t trackID, const MatteLookup& mattes) {
    const Item& item = *placed.item;
    ClipRequest request{&placed, {}, 0, trackID};
    if (!IsComposition(item)) {
        const ResolvedMedia media = mSequences.GetMedia().Resolve(item, mFormat);
        request.mediaStart = media.start;
        request.time = MakeTimeMap(item, media.start, placed.duration, mFormat.frameTicks);
        return mFactory.Clip(request, mFactory.Media(request, media), mattes);
    }
    request.time = MakeTimeMap(item, 0, placed.duration, mFormat.frameTicks);
    if (item.multicam) return MulticamClip(request, mattes);
    return mFactory.Clip(request, SequenceMedia(request, mSequences.BuildNested(item, mFormat)), mattes);
}

NodePtr LayerNodes::SequenceMedia(const ClipRequest& request, const SequencePtr& sequence) {
    if (!NeedsHostFrames(request.time)) return mFactory.NestedMedia(request, sequence);
    return mFactory.VirtualMedia(request, mSequences.GetMedia().VirtualClip(sequence));
}

std::vector<NodeInput> LayerNodes::AngleClips(const ClipRequest& request) {
    std::vector<NodeInput> clips;
    for (const Item& angle : request.placed->item->children) {
        const SequencePtr sequence = mSequences.BuildAngle(angle, mFormat);
        clips.push_back({0, mFactory.Clip(request, SequenceMedia(request, sequence), {})});
    }
    return clips;
}

NodePtr LayerNodes::MulticamClip(const ClipRequest& request, const MatteLookup& mattes) {
    const Item& item = *request.placed->item;
    const auto selected = static_cast<std::size_t>(item.multicam->selected);
    if (selected >= item.children.size()) {
        mSequences.Warn(item, "angle " + std::to_string(selected) + " is selected, but there are " +
                                  std::to_string(item.children.size()));
        return mFactory.Clip(request, mFactory.MulticamMedia(request, nullptr, AngleClips(request)), mattes);
    }
    const SequencePtr sequence = mSequences.BuildAngle(item.children[selected], mFormat);
    if (NeedsHostFrames(request.time)) return mFactory.Clip(request, SequenceMedia(request, sequence), mattes);
    return mFactory.Clip(request, mFactory.MulticamMedia(request, sequence, AngleClips(request)), mattes);
}

NodePtr LayerNodes::GridNode(const PlacedItem& placed, std::int32_t trackID) {
    const Item& item = *placed.item;
    const ClipRequest request{&placed, MakeTimeMap(item, 0, placed.duration, mFormat.frameTicks), 0, trackID};
    return mFactory.Multicam(*item.multicam, AngleClips(request));
}

NodePtr LayerNodes::LayerNode(const ActiveLayer& layer, const MatteLookup& mattes) {
    const Placement& placement = *layer.placement;
    if (placement.item != nullptr) {
        if (IsGrid(layer)) return GridNode(*placement.item, layer.trackID);
        const Item& item = *placement.item->item;
        if (item.options.forceHost && item.enabled && item.media.kind == ReferenceKind::kGenerator) {
            return mFactory.HostSolid(mSequences.GetMedia().Resolve(item, mFormat).clip);
        }
        const NodePtr clip = ClipNode(*placement.item, layer.trackID, mattes);
        return placement.item->item->enabled ? clip : mFactory.Disabled(clip);
    }
    const auto side = [&](const PlacedItem* placed) {
        if (placed == nullptr) return NodeInput{};
        return NodeInput{placed->start - placement.anchor, ClipNode(*placed, layer.trackID, mattes)};
    };
    return mFactory.Transition(*placement.transition, side(placement.outgoing), side(placement.incoming));
}

NodePtr LayerNodes::CompositorOf(const std::vector<Stacked>& layers, std::int64_t origin) const {
    std::vector<NodeInput> inputs;
    inputs.reserve(layers.size());
    for (const Stacked& layer : layers) inputs.push_back({layer.anchor - origin, layer.node});
    return mFactory.Compositor(std::move(inputs));
}

NodePtr LayerNodes::AdjustmentOver(const std::vector<Stacked>& below, const ActiveLayer& layer,
                                   const MatteLookup& mattes) {
    const PlacedItem& placed = *layer.placement->item;
    const Item& item = *placed.item;
    const NodePtr picture = CompositorOf(below, placed.start);
    const std::int64_t start = item.media.availableRange ? item.media.availableRange->start : 0;
    const ClipRequest request{&placed, MakeTimeMap(item, start, placed.duration, mFormat.frameTicks), start,
                              layer.trackID};
    return mFactory.Adjustment(picture, mFactory.Clip(request, picture, mattes));
}

Segment LayerNodes::MakeSegment(std::int64_t start, std::int64_t end, const std::vector<ActiveLayer>& layers) {
    const std::int64_t origin = OriginOf(layers);
    Segment segment{start, end, start - origin, nullptr};
    std::vector<std::int32_t> above;
    const MatteLookup mattes = [&](std::int32_t trackID) -> std::optional<LayerAt> {
        for (const ActiveLayer& layer : layers) {
            // The engine knows tracks by their clips, and a transition is none.
            const bool isClip = layer.placement->item != nullptr && !IsAdjustment(layer);
            if (layer.trackID != trackID || !isClip) continue;
            // A matte may have one itself, but what comes back to a track above is none.
            if (std::find(above.begin(), above.end(), trackID) != above.end()) return std::nullopt;
            above.push_back(trackID);
            const NodePtr node = LayerNode(layer, mattes);
            above.pop_back();
            return LayerAt{layer.placement->anchor, node};
        }
        return std::nullopt;
    };
    std::vector<Stacked> stacked;
    const auto anyShows = [&] {
        return std::any_of(stacked.begin(), stacked.end(), [](const Stacked& layer) { return layer.shows; });
    };
    for (const ActiveLayer& layer : layers) {
        above = {layer.trackID};
        if (!IsAdjustment(layer)) {
            stacked.push_back({layer.placement->anchor, LayerNode(layer, mattes), !IsDisabled(layer)});
        } else if (anyShows()) {
            const NodePtr node = AdjustmentOver(stacked, layer, mattes);
            stacked.assign(1, {layer.placement->anchor, node, true});
        }
    }
    // A compositor with nothing but disabled layers would fail.
    if (!anyShows()) return segment;
    const bool gridAlone = layers.size() == 1 && IsGrid(layers.front());
    segment.root = gridAlone ? stacked.front().node : CompositorOf(stacked, origin);
    return segment;
}

}  // namespace Vantrel::Host
