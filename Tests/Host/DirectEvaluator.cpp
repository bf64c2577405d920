// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Tests/Host/DirectEvaluator.h"

#include <algorithm>
#include <cmath>

namespace Vantrel::Host::Test {
namespace {

constexpr std::size_t kNone = static_cast<std::size_t>(-1);

std::int64_t ItemLength(const Item& item) {
    if (item.sourceRange) return item.sourceRange->duration;
    if (item.kind == ItemKind::kClip) return item.media.availableRange->duration;
    std::int64_t sum = 0;
    std::int64_t longest = 0;
    for (const Item& child : item.children) {
        if (child.kind == ItemKind::kTransition) continue;
        sum += ItemLength(child);
        longest = std::max(longest, ItemLength(child));
    }
    return item.kind == ItemKind::kTrack ? sum : longest;
}

std::int64_t Nearest(long double value) { return static_cast<std::int64_t>(std::floor(value + 0.5L)); }

/// All media of these timelines run at 24 frames a second.
constexpr std::int64_t kMediaFrame = 10584000000;

/// A microsecond before a frame counts as in it.
std::int64_t FrameAt(std::int64_t time, std::int64_t frame) {
    return static_cast<std::int64_t>(
        std::floor((static_cast<long double>(time) + 254016.0L) / static_cast<long double>(frame)));
}

bool IsAdjustment(const Item& item) { return item.kind == ItemKind::kClip && item.media.generator == "adjustment"; }

bool IsRemapped(const Item& item) { return !item.freeze && !item.options.remap.empty(); }

bool IsSlowedOrTurned(const Item& item) { return !item.freeze && (item.speed != 1.0 || IsRemapped(item)); }

/// Something that only a clip of its own can carry.
bool IsCarried(const Item& item) {
    return item.speed != 1.0 || item.freeze || !item.options.remap.empty() || !item.effects.empty();
}

/// Times of the curve are the item's own, as is the answer.
std::int64_t Remap(const std::vector<RemapKey>& keys, std::int64_t time) {
    std::size_t next = 0;
    while (next < keys.size() && keys[next].time <= time) ++next;
    if (next == 0) return keys.front().mediaTime;
    const RemapKey& from = keys[next - 1];
    if (next == keys.size() || from.interpolation == Interpolation::kHold) return from.mediaTime;
    const RemapKey& to = keys[next];
    long double share = static_cast<long double>(time - from.time) / static_cast<long double>(to.time - from.time);
    if (from.interpolation == Interpolation::kBezier) share = share * share * (3 - 2 * share);
    return from.mediaTime + Nearest(share * static_cast<long double>(to.mediaTime - from.mediaTime));
}

Sight Wrap(Sight::Kind kind, Sight part) {
    Sight sight;
    sight.kind = kind;
    sight.parts.push_back(std::move(part));
    return sight;
}

/// The inversions and the opacity of an item.
Sight ApplyEffects(const Item& item, Sight sight, double& opacity) {
    opacity = 1;
    for (const Effect& effect : item.effects) {
        if (effect.matchName == "TQ.XQVE Invert") sight = Wrap(Sight::Kind::kInverted, std::move(sight));
        if (effect.matchName == "TQ.XQVE Opacity") opacity = effect.parameters[0].value[0] / 100;
    }
    return sight;
}

Sight Sum(std::vector<Sight> parts, std::vector<double> weights) {
    Sight sum;
    sum.kind = Sight::Kind::kSum;
    sum.parts = std::move(parts);
    sum.weights = std::move(weights);
    return sum;
}

}  // namespace

Sight DirectEvaluator::SightAt(std::int64_t time) {
    mDoubtful = false;
    return ShowComposition(mDocument.tracks, time);
}

Sight DirectEvaluator::ShowComposition(const Item& composition, std::int64_t time) {
    std::vector<const Item*> layers;
    for (const Item& child : composition.children) layers.push_back(&child);
    if (composition.multicam) {
        const auto angle = static_cast<std::size_t>(composition.multicam->selected);
        layers = angle < layers.size() ? std::vector<const Item*>{layers[angle]} : std::vector<const Item*>{};
    }
    if (composition.kind != ItemKind::kTrack) return ShowLayers(layers, time);
    Sight sight = ShowTrack(composition, time);
    return sight.kind == Sight::Kind::kAdjustment ? Sight() : sight;
}

Sight DirectEvaluator::ShowLayers(const std::vector<const Item*>& layers, std::int64_t time) {
    Sight sight;
    for (const Item* const child : layers) {
        if (!child->enabled) continue;
        const std::int64_t length = ItemLength(*child);
        const bool openTrack = child->kind == ItemKind::kTrack && !IsCarried(*child);
        if (openTrack ? child->sourceRange && (time < 0 || time >= length) : time < 0 || time >= length) continue;
        Sight layer = openTrack ? ShowTrack(*child, time + (child->sourceRange ? child->sourceRange->start : 0))
                                : ShowItem(*child, length, time);
        if (layer.kind != Sight::Kind::kAdjustment) {
            sight.parts.push_back(std::move(layer));
            continue;
        }
        // All that lies below, and over it the same with the layer's effects.
        double opacity = 1;
        Sight adjusted = ApplyEffects(*layer.item, sight, opacity);
        sight = Wrap(Sight::Kind::kLayers, Sum({sight, std::move(adjusted)}, {1 - opacity, opacity}));
    }
    return sight;
}

DirectEvaluator::Expanded DirectEvaluator::Expand(const Item& track) {
    Expanded expanded;
    std::vector<Join> candidates;
    for (const Item& child : track.children) {
        if (child.kind == ItemKind::kTransition) {
            const std::size_t next = expanded.parts.size();
            if (child.enabled) candidates.push_back({expanded.end, &child, next == 0 ? kNone : next - 1, next});
            continue;
        }
        expanded.parts.push_back({&child, expanded.end, ItemLength(child)});
        expanded.end += expanded.parts.back().length;
    }
    std::int64_t taken = INT64_MIN;  // up to where an accepted transition reaches
    const std::int64_t itemsEnd = expanded.end;
    for (const Join& join : candidates) {
        const std::int64_t from = join.cut - join.transition->inOffset;
        const std::int64_t to = join.cut + join.transition->outOffset;
        const bool roomBefore = join.before == kNone || from >= std::max(expanded.parts[join.before].start, taken);
        const bool roomAfter =
            join.after >= expanded.parts.size() || to <= join.cut + expanded.parts[join.after].length;
        if (!roomBefore || !roomAfter || from == to) continue;
        if (!expanded.Joins(join.before) && !expanded.Joins(join.after)) continue;
        taken = to;
        expanded.joins.push_back(join);
        expanded.end = std::max({expanded.end, itemsEnd, to});
    }
    return expanded;
}

bool DirectEvaluator::Expanded::Shows(std::size_t part) const {
    return part < parts.size() && parts[part].item->kind != ItemKind::kGap && parts[part].item->enabled;
}

/// An adjustment has no picture of its own that a transition could take.
bool DirectEvaluator::Expanded::Joins(std::size_t part) const {
    return Shows(part) && !IsAdjustment(*parts[part].item);
}

Sight DirectEvaluator::ShowTrack(const Item& track, std::int64_t time) {
    Sight sight;
    if (time < 0) return sight;  // of a leading transition nothing is seen before the track begins
    const Expanded expanded = Expand(track);
    const auto show = [&](std::size_t index) {
        const Part& part = expanded.parts[index];
        return ShowItem(*part.item, part.length, time - part.start);
    };
    for (const Join& join : expanded.joins) {
        const std::int64_t from = join.cut - join.transition->inOffset;
        const std::int64_t to = join.cut + join.transition->outOffset;
        if (time < from || time >= to) continue;
        sight.kind = Sight::Kind::kTransition;
        sight.item = join.transition;
        sight.fraction = static_cast<double>(time - from) / static_cast<double>(to - from);
        for (const std::size_t side : {join.before, join.after}) {
            sight.parts.push_back(expanded.Joins(side) ? show(side) : Sight());
        }
        return sight;
    }
    for (std::size_t i = 0; i < expanded.parts.size(); ++i) {
        const Part& part = expanded.parts[i];
        if (!expanded.Shows(i) || time < part.start || time >= part.start + part.length) continue;
        return show(i);
    }
    return sight;
}

std::int64_t DirectEvaluator::LayerLength(const Item& layer) {
    if (!layer.enabled) return 0;
    const bool open = layer.kind == ItemKind::kTrack && !layer.sourceRange && !IsCarried(layer);
    return open ? Expand(layer).end : ItemLength(layer);
}

std::int64_t DirectEvaluator::LengthOf(const Item& composition) {
    if (composition.kind == ItemKind::kTrack) return Expand(composition).end;
    if (composition.multicam) {
        const auto angle = static_cast<std::size_t>(composition.multicam->selected);
        return angle < composition.children.size() ? LayerLength(composition.children[angle]) : 0;
    }
    std::int64_t longest = 0;
    for (const Item& child : composition.children) longest = std::max(longest, LayerLength(child));
    return longest;
}

Sight DirectEvaluator::ShowItem(const Item& item, std::int64_t length, std::int64_t itemTime) {
    if (IsAdjustment(item)) {
        Sight sight;
        sight.kind = Sight::Kind::kAdjustment;
        sight.item = &item;
        return sight;
    }
    double opacity = 1;
    Sight sight = ApplyEffects(item, ShowContent(item, length, itemTime), opacity);
    return opacity == 1 ? sight : Sum({std::move(sight)}, {opacity});
}

/// The nearer of the two frames that a time lies between, the earlier of two as near.
std::int64_t DirectEvaluator::NearestFrame(std::int64_t mediaTime, std::int64_t step) {
    constexpr std::int64_t kRounding = 8;
    const std::int64_t past = (mediaTime % step + step) % step;
    const std::int64_t lead = 2 * past - step;
    if (lead != 0 && std::abs(lead) <= kRounding) mDoubtful = true;
    return mediaTime + (lead <= 0 ? -past : step - past);
}

Sight DirectEvaluator::ShowContent(const Item& item, std::int64_t length, std::int64_t itemTime) {
    const bool clip = item.kind == ItemKind::kClip;
    const std::int64_t mediaStart = clip && item.media.availableRange ? item.media.availableRange->start : 0;
    const std::int64_t first = item.sourceRange ? item.sourceRange->start : mediaStart;
    const bool running = !item.freeze && !IsRemapped(item);
    double speed = running ? std::abs(item.speed) : 1.0;
    long double moved = static_cast<long double>(item.speed) * static_cast<long double>(itemTime);
    if (item.speed < 0)
        moved = -static_cast<long double>(item.speed) * static_cast<long double>(length - mFrame - itemTime);
    std::int64_t time = first + (running ? Nearest(moved) : 0);
    if (item.freeze && item.options.hold) time = *item.options.hold;
    if (IsRemapped(item)) {
        time = Remap(item.options.remap, first + itemTime);
        const std::int64_t rise = Remap(item.options.remap, first + length) - Remap(item.options.remap, first);
        if (rise != 0) speed = std::abs(static_cast<double>(rise) / static_cast<double>(length));
    }
    const std::int64_t mediaTime = time - mediaStart;
    if (clip) return ShowMedia(item, mediaTime, speed);
    const std::int64_t shown = IsSlowedOrTurned(item) ? NearestFrame(mediaTime, mFrame) : mediaTime;
    if (running && item.speed > 0) return ShowComposition(item, shown);
    // Not forwards: the host shows whole frames of what lies inside.
    const std::int64_t last = std::max<std::int64_t>((LengthOf(item) + mFrame - 1) / mFrame, 1) - 1;
    return ShowComposition(item, std::clamp<std::int64_t>(FrameAt(shown, mFrame), 0, last) * mFrame);
}

Sight DirectEvaluator::ShowMedia(const Item& item, std::int64_t mediaTime, double speed) {
    Sight sight;
    const std::string& generator = item.media.generator;
    if (generator == "black" || generator == "color" || generator == "transparent") {
        sight.kind = generator == "transparent" ? Sight::Kind::kLayers : Sight::Kind::kPlain;
        if (generator == "color") sight.level = item.media.color[1] / 255.0;
        return sight;
    }
    // Media that say nothing of their length are taken to be as long as asked.
    const auto& available = item.media.availableRange;
    const std::int64_t last = available ? available->duration / kMediaFrame - 1 : INT64_MAX;
    const auto frameAt = [&](std::int64_t time) {
        Sight frame;
        frame.kind = Sight::Kind::kFrame;
        frame.frame = {item.media.kind == ReferenceKind::kMissing ? item.name : item.media.file, time,
                       std::clamp<std::int64_t>(FrameAt(time, kMediaFrame), 0, last)};
        return frame;
    };
    const bool isStill = last == 0;
    const bool framesDiffer = !isStill && (IsSlowedOrTurned(item) || kMediaFrame != mFrame);
    if (!framesDiffer) return frameAt(mediaTime);
    if (!item.options.frameBlend) return frameAt(NearestFrame(mediaTime, kMediaFrame));

    // What a frame of the sequence covers, by shares; less than a frame of the media: between the two around it.
    const auto covered = static_cast<double>(Nearest(static_cast<long double>(mFrame) * std::abs(speed)));
    const double span = std::max(covered, static_cast<double>(kMediaFrame));
    const auto start = static_cast<double>(mediaTime);
    sight.kind = Sight::Kind::kSum;
    for (double frame = std::floor(start / kMediaFrame); frame * kMediaFrame < start + span; ++frame) {
        const double from = std::max(frame * kMediaFrame, start);
        const double to = std::min((frame + 1) * kMediaFrame, start + span);
        sight.parts.push_back(frameAt(static_cast<std::int64_t>(frame) * kMediaFrame));
        sight.weights.push_back((to - from) / span);
    }
    return sight;
}

}  // namespace Vantrel::Host::Test
