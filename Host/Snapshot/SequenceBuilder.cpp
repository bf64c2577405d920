// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Snapshot/SequenceBuilder.h"

#include <algorithm>
#include <filesystem>
#include <map>

#include "Host/Snapshot/LayerNodes.h"
#include "Host/Snapshot/NodeHash.h"
#include "Host/Snapshot/TrackLayout.h"

namespace Vantrel::Host {
namespace {

constexpr std::int64_t kDefaultFrameTicks = Vellum::kTicksPerSecond / 24;

void Apply(const SequenceSettings& settings, SequenceFormat& format) {
    if (settings.width) format.width = *settings.width;
    if (settings.height) format.height = *settings.height;
    if (settings.frameTicks) format.frameTicks = *settings.frameTicks;
    if (settings.aspect) format.aspectNumerator = (*settings.aspect)[0];
    if (settings.aspect) format.aspectDenominator = (*settings.aspect)[1];
    if (settings.fieldType) format.fieldType = *settings.fieldType;
}

/// The first item below that something can be said of, depth first.
template <class Result, class Function>
std::optional<Result> FindFirst(const Item& item, const Function& function) {
    if (std::optional<Result> found = function(item)) return found;
    for (const Item& child : item.children) {
        if (std::optional<Result> found = FindFirst<Result>(child, function)) return found;
    }
    return std::nullopt;
}

/// The boundaries between which the set of active layers is constant.
std::vector<std::int64_t> BoundariesOf(const std::vector<TrackLayout>& tracks) {
    std::vector<std::int64_t> boundaries;
    for (const TrackLayout& track : tracks) {
        for (const Placement& placement : track.placements) {
            boundaries.push_back(placement.start);
            boundaries.push_back(placement.end);
        }
    }
    std::sort(boundaries.begin(), boundaries.end());
    boundaries.erase(std::unique(boundaries.begin(), boundaries.end()), boundaries.end());
    return boundaries;
}

std::vector<Segment> CutIntoSegments(const std::vector<TrackLayout>& tracks, const std::vector<std::int32_t>& trackIDs,
                                     LayerNodes& nodes) {
    std::vector<Segment> segments;
    std::vector<std::size_t> next(tracks.size(), 0);
    const std::vector<std::int64_t> boundaries = BoundariesOf(tracks);
    for (std::size_t i = 0; i + 1 < boundaries.size(); ++i) {
        std::vector<ActiveLayer> active;
        for (std::size_t track = 0; track < tracks.size(); ++track) {
            const std::vector<Placement>& placements = tracks[track].placements;
            while (next[track] < placements.size() && placements[next[track]].end <= boundaries[i]) ++next[track];
            if (next[track] == placements.size() || placements[next[track]].start > boundaries[i]) continue;
            active.push_back({&placements[next[track]], trackIDs[track]});
        }
        if (active.empty()) continue;
        Segment segment = nodes.MakeSegment(boundaries[i], boundaries[i + 1], active);
        if (segment.root) segments.push_back(std::move(segment));
    }
    return segments;
}

/// Of a list whose segments are all there.
void Finish(SegmentList& list, const SequenceFormat& format) {
    list.hash = HashSegments(list.segments, format);
    list.roots.clear();
    list.roots.reserve(list.segments.size());
    for (const Segment& segment : list.segments) list.roots.emplace(segment.root->hash, segment.root);
}

}  // namespace

SequenceBuilder::SequenceBuilder(const Document& document, const SnapshotOptions& options, IMediaProbe& probe,
                                 IdentityBook& identities, Snapshot& snapshot)
    : mDocument(document),
      mOptions(options),
      mIdentities(identities),
      mSnapshot(snapshot),
      mMedia(options, probe, identities) {}

void SequenceBuilder::Warn(const Item& item, const std::string& message) {
    mSnapshot.warnings.push_back(mDocument.file + ": " + item.path + ": " + message);
}

SequenceFormat SequenceBuilder::TopFormat() {
    SequenceFormat format;
    SequenceSettings settings = mDocument.settings;
    const SequenceSettings& own = mDocument.tracks.settings;
    const bool sized = settings.width || settings.height || own.width || own.height;
    const bool timed = settings.frameTicks || own.frameTicks;
    const auto rateOf = [](const Item& item) -> std::optional<std::int64_t> {
        const bool composition = item.kind == ItemKind::kStack || item.kind == ItemKind::kTrack;
        if (composition || item.kind == ItemKind::kTransition) return std::nullopt;
        if (item.sourceRange) return item.sourceFrameTicks;
        return item.media.availableFrameTicks;
    };
    format.frameTicks =
        timed ? kDefaultFrameTicks : FindFirst<std::int64_t>(mDocument.tracks, rateOf).value_or(kDefaultFrameTicks);
    if (!sized) {
        const auto info = FindFirst<MediaInfo>(mDocument.tracks, [&](const Item& item) {
            return item.kind == ItemKind::kClip ? mMedia.FindInfo(item) : std::nullopt;
        });
        if (info) {
            format.width = info->width;
            format.height = info->height;
            format.aspectNumerator = info->pixelAspectNumerator;
            format.aspectDenominator = info->pixelAspectDenominator;
        }
    }
    Apply(settings, format);
    Apply(own, format);
    return format;
}

SegmentList SequenceBuilder::AddPreviews(const SegmentList& plain, const SequenceFormat& format) {
    SegmentList list = plain;
    // A file holds the content from its earliest use in the sequence on.
    std::map<Guid, std::int64_t> firstOffset;
    for (const Segment& segment : plain.segments) {
        const auto entry = firstOffset.try_emplace(segment.root->hash, segment.offset).first;
        entry->second = std::min(entry->second, segment.offset);
    }
    const NodeFactory factory(format, mIdentities);
    for (Segment& segment : list.segments) {
        const std::filesystem::path file =
            std::filesystem::absolute(mOptions.previews) / (segment.root->hash.ToString() + ".mov");
        if (!std::filesystem::exists(file)) continue;
        const MediaProbeResult result = mMedia.ProbeFile(file.string());
        if (!result.info) {
            mSnapshot.warnings.push_back(result.error);
            continue;
        }
        segment.offset -= firstOffset.at(segment.root->hash);
        segment.root = factory.Preview(mMedia.Register(*result.info, FileSource{file.string()}));
    }
    Finish(list, format);
    return list;
}

SequencePtr SequenceBuilder::Build(const std::string& key, const Item& named, const std::vector<const Item*>& layers,
                                   bool applyRanges, const SequenceFormat& format) {
    const auto known = mBuilt.find(key);
    if (known != mBuilt.end()) return known->second;
    auto sequence = std::make_shared<Sequence>();
    sequence->timelineID = mIdentities.TimelineID(key);
    sequence->path = key;
    sequence->name = named.name;
    sequence->format = format;
    std::vector<TrackLayout> tracks;
    std::vector<std::int32_t> trackIDs;
    for (std::size_t i = 0; i < layers.size(); ++i) {
        const Item& layer = *layers[i];
        if (!layer.enabled && !(layer.kind != ItemKind::kTrack && layer.options.keepDisabled)) continue;
        // Effects and warps of a track need a clip that carries them: the track then is a nested sequence.
        const bool plainTrack = layer.kind == ItemKind::kTrack && (!applyRanges || !CarriesEffects(layer));
        tracks.push_back(plainTrack ? LayOutTrack(layer, applyRanges, mDocument.file, mSnapshot.warnings)
                                    : LayOutSingle(layer));
        trackIDs.push_back(static_cast<std::int32_t>(i + 1));
        sequence->length = std::max(sequence->length, tracks.back().end);
    }
    LayerNodes nodes(*this, format);
    sequence->plain.segments = CutIntoSegments(tracks, trackIDs, nodes);
    Finish(sequence->plain, format);
    sequence->withPreviews = mOptions.previews.empty() ? sequence->plain : AddPreviews(sequence->plain, format);
    mSnapshot.sequences[sequence->timelineID] = sequence;
    mBuilt[key] = sequence;
    return sequence;
}

SequencePtr SequenceBuilder::BuildTop() {
    const Item& top = mDocument.tracks;
    const SequenceFormat format = TopFormat();
    if (top.sourceRange || CarriesEffects(top)) return Build("", top, {&top}, false, format);
    std::vector<const Item*> layers;
    for (const Item& child : top.children) layers.push_back(&child);
    return Build("", top, layers, true, format);
}

SequencePtr SequenceBuilder::BuildNested(const Item& composition, const SequenceFormat& parent) {
    SequenceFormat format = parent;
    Apply(composition.settings, format);
    // A composition that is the whole file has no path of its own beside the top sequence's.
    const std::string key = composition.path.empty() ? "/" : composition.path;
    if (composition.kind == ItemKind::kTrack) return Build(key, composition, {&composition}, false, format);
    std::vector<const Item*> layers;
    for (const Item& child : composition.children) layers.push_back(&child);
    return Build(key, composition, layers, true, format);
}

SequencePtr SequenceBuilder::BuildAngle(const Item& angle, const SequenceFormat& parent) {
    SequenceFormat format = parent;
    Apply(angle.settings, format);
    return Build(angle.path + "#angle", angle, {&angle}, true, format);
}

SnapshotPtr BuildSnapshot(const Document& document, const SnapshotOptions& options, IMediaProbe& probe,
                          IdentityBook& identities) {
    auto snapshot = std::make_shared<Snapshot>();
    snapshot->globalStart = document.globalStart;
    snapshot->warnings = document.warnings;
    SequenceBuilder builder(document, options, probe, identities, *snapshot);
    snapshot->top = builder.BuildTop();
    snapshot->nativeSubType = builder.GetMedia().GetFirstSubType();
    snapshot->offline = builder.GetMedia().GetOffline();
    return snapshot;
}

SequencePtr Snapshot::Find(std::uint32_t timelineID) const {
    const auto found = sequences.find(timelineID);
    return found != sequences.end() ? found->second : nullptr;
}

}  // namespace Vantrel::Host
