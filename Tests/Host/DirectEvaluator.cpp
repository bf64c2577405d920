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

void ListFrames(const Sight& sight, std::vector<Shown>& frames) {
    if (sight.kind == Sight::Kind::kFrame) frames.push_back(sight.frame);
    for (const Sight& part : sight.parts) ListFrames(part, frames);
}

}  // namespace

std::vector<Shown> DirectEvaluator::At(std::int64_t time) {
    std::vector<Shown> frames;
    ListFrames(SightAt(time), frames);
    return frames;
}

Sight DirectEvaluator::ShowComposition(const Item& composition, std::int64_t time) {
    return composition.kind == ItemKind::kTrack ? ShowTrack(composition, time) : ShowStack(composition, time);
}

Sight DirectEvaluator::ShowStack(const Item& stack, std::int64_t time) {
    Sight sight;
    for (const Item& child : stack.children) {
        if (!child.enabled) continue;
        const std::int64_t length = ItemLength(child);
        const bool carried = child.speed != 1.0 || child.freeze;
        if (child.kind == ItemKind::kTrack && !carried) {
            if (child.sourceRange && (time < 0 || time >= length)) continue;
            sight.parts.push_back(ShowTrack(child, time + (child.sourceRange ? child.sourceRange->start : 0)));
        } else if (time >= 0 && time < length) {
            sight.parts.push_back(ShowItem(child, length, time));
        }
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
        if (!expanded.Shows(join.before) && !expanded.Shows(join.after)) continue;
        taken = to;
        expanded.joins.push_back(join);
        expanded.end = std::max({expanded.end, itemsEnd, to});
    }
    return expanded;
}

bool DirectEvaluator::Expanded::Shows(std::size_t part) const {
    return part < parts.size() && parts[part].item->kind != ItemKind::kGap && parts[part].item->enabled;
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
        sight.kind = Sight::Kind::kMix;
        sight.fraction = static_cast<double>(time - from) / static_cast<double>(to - from);
        for (const std::size_t side : {join.before, join.after}) {
            sight.parts.push_back(expanded.Shows(side) ? show(side) : Sight());
        }
        return sight;
    }
    for (std::size_t i = 0; i < expanded.parts.size(); ++i) {
        const Part& part = expanded.parts[i];
        if (!expanded.Shows(i) || time < part.start || time >= part.start + part.length) continue;
        sight.parts.push_back(show(i));
    }
    return sight;
}

std::int64_t DirectEvaluator::LengthOf(const Item& composition) {
    if (composition.kind == ItemKind::kTrack) return Expand(composition).end;
    std::int64_t longest = 0;
    for (const Item& child : composition.children) {
        if (!child.enabled) continue;
        const bool open = child.kind == ItemKind::kTrack && !child.sourceRange && child.speed == 1.0 && !child.freeze;
        longest = std::max(longest, open ? Expand(child).end : ItemLength(child));
    }
    return longest;
}

Sight DirectEvaluator::ShowItem(const Item& item, std::int64_t length, std::int64_t itemTime) {
    const bool clip = item.kind == ItemKind::kClip;
    const std::int64_t mediaStart = clip && item.media.availableRange ? item.media.availableRange->start : 0;
    const std::int64_t first = item.sourceRange ? item.sourceRange->start : mediaStart;
    long double moved = static_cast<long double>(item.speed) * static_cast<long double>(itemTime);
    if (item.speed < 0)
        moved = -static_cast<long double>(item.speed) * static_cast<long double>(length - mFrame - itemTime);
    if (item.freeze) moved = 0;
    std::int64_t mediaTime = first - mediaStart + Nearest(moved);
    const std::int64_t step = clip ? kMediaFrame : mFrame;
    const bool framesDiffer = item.speed != 1.0 || step != mFrame;
    if (mBetween == Between::kNearest && framesDiffer && !item.freeze) {
        const std::int64_t past = (mediaTime % step + step) % step;
        mediaTime += 2 * past <= step ? -past : step - past;
    }
    if (clip) {
        // Media that say nothing of their length are taken to be as long as asked.
        const auto& available = item.media.availableRange;
        const std::int64_t last = available ? available->duration / kMediaFrame - 1 : INT64_MAX;
        Sight sight;
        sight.kind = Sight::Kind::kFrame;
        sight.frame = {item.media.kind == ReferenceKind::kMissing ? item.name : item.media.file, mediaTime,
                       std::clamp<std::int64_t>(FrameAt(mediaTime, kMediaFrame), 0, last)};
        return sight;
    }
    if (!item.freeze && item.speed > 0) return ShowComposition(item, mediaTime);
    // Not forwards: the host shows whole frames of what lies inside.
    const std::int64_t last = std::max<std::int64_t>((LengthOf(item) + mFrame - 1) / mFrame, 1) - 1;
    return ShowComposition(item, std::clamp<std::int64_t>(FrameAt(mediaTime, mFrame), 0, last) * mFrame);
}

}  // namespace Vantrel::Host::Test
