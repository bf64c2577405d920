// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Snapshot/TrackLayout.h"

#include <algorithm>

namespace Vantrel::Host {
namespace {

/// A transition with the items at its sides, which may be missing at the track's ends.
struct Cut {
    const Item* transition = nullptr;
    std::int64_t time = 0;
    PlacedItem* before = nullptr;
    PlacedItem* after = nullptr;
};

bool ShowsPicture(const PlacedItem* placed) {
    return placed != nullptr && placed->item->kind != ItemKind::kGap && placed->item->enabled;
}

/// An adjustment layer has no picture of its own that a transition could take.
bool CanTakePartInTransition(const PlacedItem* placed) {
    return ShowsPicture(placed) && placed->item->media.generator != "adjustment";
}

class Layouter {
public:
    Layouter(const Item& track, const std::string& file, std::vector<std::string>& warnings)
        : mTrack(track), mFile(file), mWarnings(warnings) {}

    [[nodiscard]] TrackLayout Run(bool applyRange) {
        PlaceItems();
        AcceptTransitions();
        Emit();
        if (applyRange && mTrack.sourceRange) ApplyRange(*mTrack.sourceRange);
        return std::move(mLayout);
    }

private:
    void Warn(const Item& item, const std::string& message) {
        mWarnings.push_back(mFile + ": " + item.path + ": " + message);
    }

    void PlaceItems() {
        std::int64_t time = 0;
        PlacedItem* last = nullptr;
        std::vector<Cut> open;
        for (const Item& child : mTrack.children) {
            if (child.kind == ItemKind::kTransition) {
                open.push_back({&child, time, last, nullptr});
                continue;
            }
            const std::int64_t duration = TrimmedRange(child).duration;
            if (duration == 0) continue;
            mLayout.items.push_back({&child, time, duration, 0, 0});
            last = &mLayout.items.back();
            for (Cut& cut : open) cut.after = last;
            std::move(open.begin(), open.end(), std::back_inserter(mCuts));
            open.clear();
            time += duration;
        }
        std::move(open.begin(), open.end(), std::back_inserter(mCuts));
        mLayout.end = time;
    }

    /// Keeps the transitions that fit, in order, and lets their neighbours know what they lose.
    void AcceptTransitions() {
        std::vector<Cut> accepted;
        for (const Cut& cut : mCuts) {
            const Item& transition = *cut.transition;
            if (!transition.enabled) continue;
            const bool crowded = !accepted.empty() && accepted.back().time == cut.time;
            const bool tooLong =
                (cut.before != nullptr && transition.inOffset > cut.before->duration - cut.before->head) ||
                (cut.after != nullptr && transition.outOffset > cut.after->duration);
            if (crowded || tooLong) {
                Warn(transition, crowded ? "a second transition at the same cut is left out"
                                         : "the transition is longer than what it joins and is left out");
            } else if (transition.inOffset + transition.outOffset == 0) {
                Warn(transition, "the transition has no length and is left out");
            } else if (!CanTakePartInTransition(cut.before) && !CanTakePartInTransition(cut.after)) {
                Warn(transition, "the transition joins nothing and is left out");
            } else {
                // An item gives its head and its tail to different transitions: what the first took the second can't
                // have.
                if (cut.before != nullptr) cut.before->tail = transition.outOffset;
                if (cut.after != nullptr) cut.after->head = transition.outOffset;
                accepted.push_back(cut);
            }
        }
        mCuts = std::move(accepted);
    }

    void Emit() {
        auto cut = mCuts.begin();
        const auto emitCutsUpTo = [&](std::int64_t time) {
            for (; cut != mCuts.end() && cut->time <= time; ++cut) EmitTransition(*cut);
        };
        for (PlacedItem& placed : mLayout.items) {
            emitCutsUpTo(placed.start);
            const auto next = cut != mCuts.end() && cut->time == placed.End() ? cut : mCuts.end();
            const std::int64_t start = placed.start + placed.head;
            const std::int64_t end = placed.End() - (next != mCuts.end() ? next->transition->inOffset : 0);
            // From here on head and tail say what the item shows beyond its edges.
            const bool joined = cut != mCuts.begin() && std::prev(cut)->after == &placed;
            placed.head = joined ? std::prev(cut)->transition->inOffset : 0;
            if (ShowsPicture(&placed) || KeptDisabled(placed)) {
                if (start < end)
                    mLayout.placements.push_back({start, end, placed.start, &placed, nullptr, nullptr, nullptr});
            }
        }
        emitCutsUpTo(Vellum::kTime_Max);
    }

    [[nodiscard]] static bool KeptDisabled(const PlacedItem& placed) {
        return placed.item->kind != ItemKind::kGap && !placed.item->enabled && placed.item->options.keepDisabled;
    }

    void EmitTransition(const Cut& cut) {
        Placement placement;
        placement.anchor = cut.time - cut.transition->inOffset;
        placement.start = std::max<std::int64_t>(placement.anchor, 0);
        placement.end = cut.time + cut.transition->outOffset;
        placement.transition = cut.transition;
        placement.outgoing = CanTakePartInTransition(cut.before) ? cut.before : nullptr;
        placement.incoming = CanTakePartInTransition(cut.after) ? cut.after : nullptr;
        mLayout.end = std::max(mLayout.end, placement.end);
        if (placement.start < placement.end) mLayout.placements.push_back(placement);
    }

    void ApplyRange(const TimeRange& range) {
        for (PlacedItem& placed : mLayout.items) placed.start -= range.start;
        std::vector<Placement> kept;
        for (Placement placement : mLayout.placements) {
            placement.anchor -= range.start;
            placement.start = std::max<std::int64_t>(placement.start - range.start, 0);
            placement.end = std::min(placement.end - range.start, range.duration);
            if (placement.start < placement.end) kept.push_back(placement);
        }
        if (kept.empty() && !mLayout.placements.empty()) {
            Warn(mTrack, "the source_range lies outside the track's content; the track is empty");
        }
        mLayout.placements = std::move(kept);
        mLayout.end = range.duration;
    }

    const Item& mTrack;
    const std::string& mFile;
    std::vector<std::string>& mWarnings;
    TrackLayout mLayout;
    std::vector<Cut> mCuts;
};

}  // namespace

TimeRange TrimmedRange(const Item& item) {
    if (item.sourceRange) return *item.sourceRange;
    TimeRange range;
    if (item.kind == ItemKind::kClip && item.media.availableRange) return *item.media.availableRange;
    for (const Item& child : item.children) {
        if (child.kind == ItemKind::kTransition) continue;
        const std::int64_t duration = TrimmedRange(child).duration;
        range.duration = item.kind == ItemKind::kTrack ? range.duration + duration : std::max(range.duration, duration);
    }
    return range;
}

bool CarriesEffects(const Item& item) {
    return !item.effects.empty() || item.speed != 1.0 || item.freeze || !item.options.remap.empty();
}

TrackLayout LayOutTrack(const Item& track, bool applyRange, const std::string& file,
                        std::vector<std::string>& warnings) {
    return Layouter(track, file, warnings).Run(applyRange);
}

TrackLayout LayOutSingle(const Item& item) {
    TrackLayout layout;
    layout.end = TrimmedRange(item).duration;
    if (layout.end == 0) return layout;
    layout.items.push_back({&item, 0, layout.end, 0, 0});
    const bool shown = item.enabled || item.options.keepDisabled;
    if (shown && item.kind != ItemKind::kGap) {
        layout.placements.push_back({0, layout.end, 0, &layout.items.back(), nullptr, nullptr, nullptr});
    }
    return layout;
}

}  // namespace Vantrel::Host
