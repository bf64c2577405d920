// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <algorithm>
#include <cstdint>
#include <functional>
#include <optional>
#include <set>
#include <vector>

#include <gtest/gtest.h>

#include "Vantrel/SegmentInfo.h"

namespace Vantrel::Testing {

/// A map of statistics as one cell a tick, worked out cell by cell. Cells of one stretch share its number.
class TickModel {
public:
    explicit TickModel(std::int64_t end) : mEnd(end) {}

    struct Cell {
        int stretch;
        SegmentInfo info;
    };

    void Merge(const SegmentInfo& s) {
        const std::vector<std::optional<Cell>> before = mCells;
        const auto isTouched = [&](int stretch) {
            return std::any_of(before.begin() + s.in, before.begin() + s.out,
                               [&](const auto& cell) { return cell && cell->stretch == stretch; });
        };
        const int tail = mNext++;
        for (std::int64_t t = 0; t < mEnd; ++t) {
            const std::optional<Cell>& old = before[Index(t)];
            std::optional<Cell>& cell = mCells[Index(t)];
            if (old && isTouched(old->stretch)) {
                // The stretch is taken up from its own start on, and cut off where `s` ends.
                if (t < s.out) Combine(cell->info, s);
                if (t >= s.out) cell->stretch = tail;
            } else if (!old && t >= s.in && t < s.out) {
                const bool continues = t > s.in && !before[Index(t - 1)];
                cell = Cell{continues ? mCells[Index(t - 1)]->stretch : mNext++, s};
            }
        }
    }

    /// Every stretch that has a point in common with `in` up to `out` goes, whole.
    void Erase(std::int64_t in, std::int64_t out) {
        std::set<int> gone;
        for (std::int64_t t = in; t < out; ++t) {
            if (mCells[Index(t)]) gone.insert(mCells[Index(t)]->stretch);
        }
        for (auto& cell : mCells) {
            if (cell && gone.count(cell->stretch) != 0) cell.reset();
        }
    }

    void Replace(const SegmentInfo& s) {
        Erase(s.in, s.out);
        Merge(s);
    }

    /// The stretch that covers a tick, with its bounds.
    std::optional<SegmentInfo> At(std::int64_t t) const {
        if (!mCells[Index(t)]) return std::nullopt;
        SegmentInfo info = mCells[Index(t)]->info;
        info.in = Bound(t, -1);
        info.out = Bound(t, 1) + 1;
        return info;
    }

    /// `find` gives the stretch that covers a tick, or null.
    void ExpectEqual(const std::function<const SegmentInfo*(std::int64_t)>& find) const {
        for (std::int64_t t = 0; t < mEnd; ++t) {
            const SegmentInfo* const found = find(t);
            const std::optional<Cell>& cell = mCells[Index(t)];
            ASSERT_EQ(found != nullptr, cell.has_value()) << "tick " << t;
            if (!found) continue;
            const SegmentInfo& expected = cell->info;
            EXPECT_EQ(found->in, Bound(t, -1)) << "tick " << t;
            EXPECT_EQ(std::min(found->out, mEnd), Bound(t, 1) + 1) << "tick " << t;
            ExpectSame(expected, *found, t);
        }
    }

    static void ExpectSame(const SegmentInfo& expected, const SegmentInfo& found, std::int64_t t) {
        const auto fields = [](const SegmentInfo& i) {
            return testing::PrintToString(std::vector<std::int64_t>{
                i.offset, i.layerCount, i.effectCount, i.intrinsicCount, i.transitionCount, i.nestedLayerCount,
                i.nestedEffectCount, i.nestedIntrinsicCount, i.nestedTransitionCount, i.isPreview, i.accelerated,
                i.realTime, i.nested, i.flattened, i.hostWhole, i.hostPart});
        };
        // offset; layers, effects, intrinsics, transitions; the same of nested sequences; then the flags.
        EXPECT_EQ(fields(expected), fields(found)) << "tick " << t;
        EXPECT_EQ(expected.guid, found.guid) << "tick " << t;
    }

private:
    static std::size_t Index(std::int64_t t) { return static_cast<std::size_t>(t); }

    std::int64_t Bound(std::int64_t t, std::int64_t step) const {
        const int stretch = mCells[Index(t)]->stretch;
        while (t + step >= 0 && t + step < mEnd && mCells[Index(t + step)] &&
               mCells[Index(t + step)]->stretch == stretch) {
            t += step;
        }
        return t;
    }

    static void Combine(SegmentInfo& e, const SegmentInfo& s) {
        e.effectCount = s.effectCount + std::min(e.effectCount, s.nestedEffectCount);
        e.intrinsicCount = s.intrinsicCount + std::min(e.intrinsicCount, s.nestedIntrinsicCount);
        e.transitionCount = s.transitionCount + std::min(e.transitionCount, s.nestedTransitionCount);
        const std::int32_t m = std::min(e.layerCount, s.nestedLayerCount), l = s.layerCount;
        e.layerCount = l >= 2 && m >= 2 ? l + m - 1 : std::max(l, m);
        e.hostPart |= s.hostPart;
        e.hostWhole |= s.hostWhole;
        e.accelerated &= s.accelerated && !s.hostWhole && !s.hostPart;
        e.realTime &= s.realTime;
    }

    const std::int64_t mEnd;
    std::vector<std::optional<Cell>> mCells = std::vector<std::optional<Cell>>(Index(mEnd));
    int mNext = 1;
};

}  // namespace Vantrel::Testing
