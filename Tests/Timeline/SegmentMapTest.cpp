// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Shared/Src/SegmentMap.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <optional>
#include <vector>

#include "Tests/Support/Pictures.h"

namespace Vantrel {
namespace {

constexpr std::int64_t kEnd = 48;

/// A map of statistics as one cell a tick, worked out cell by cell. Cells of one stretch share its number.
class TickModel {
public:
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
        for (std::int64_t t = 0; t < kEnd; ++t) {
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

    void ExpectEqual(const SegmentMap& map) const {
        for (std::int64_t t = 0; t < kEnd; ++t) {
            const SegmentInfo* const found = FindSegment(map, t);
            const std::optional<Cell>& cell = mCells[Index(t)];
            ASSERT_EQ(found != nullptr, cell.has_value()) << "tick " << t;
            if (!found) continue;
            const SegmentInfo& expected = cell->info;
            EXPECT_EQ(found->in, Bound(t, -1)) << "tick " << t;
            EXPECT_EQ(found->out, Bound(t, 1) + 1) << "tick " << t;
            EXPECT_EQ(found->guid, expected.guid);
            EXPECT_EQ(found->offset, expected.offset);
            EXPECT_EQ(found->effectCount, expected.effectCount) << "tick " << t;
            EXPECT_EQ(found->intrinsicCount, expected.intrinsicCount) << "tick " << t;
            EXPECT_EQ(found->transitionCount, expected.transitionCount) << "tick " << t;
            EXPECT_EQ(found->layerCount, expected.layerCount) << "tick " << t;
            EXPECT_EQ(found->hostPart, expected.hostPart);
            EXPECT_EQ(found->hostWhole, expected.hostWhole);
            EXPECT_EQ(found->accelerated, expected.accelerated);
            EXPECT_EQ(found->realTime, expected.realTime);
        }
    }

private:
    static std::size_t Index(std::int64_t t) { return static_cast<std::size_t>(t); }

    std::int64_t Bound(std::int64_t t, std::int64_t step) const {
        const int stretch = mCells[Index(t)]->stretch;
        while (t + step >= 0 && t + step < kEnd && mCells[Index(t + step)] &&
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

    std::vector<std::optional<Cell>> mCells = std::vector<std::optional<Cell>>(kEnd);
    int mNext = 1;
};

SegmentInfo RandomSegment(Testing::Random& random, std::uint32_t number) {
    SegmentInfo info;
    info.in = random.Int(0, kEnd - 1);
    info.out = random.Int(static_cast<int>(info.in) + 1, kEnd);
    info.offset = random.Int(0, 1000);
    info.guid = Guid(number, 0, 0, {});
    for (std::int32_t* counter :
         {&info.effectCount, &info.intrinsicCount, &info.transitionCount, &info.layerCount, &info.nestedEffectCount,
          &info.nestedIntrinsicCount, &info.nestedTransitionCount, &info.nestedLayerCount}) {
        *counter = random.Int(0, 4);
    }
    info.hostPart = random.Chance(0.1F);
    info.hostWhole = random.Chance(0.1F);
    info.accelerated = random.Chance(0.8F);
    info.realTime = random.Chance(0.8F);
    return info;
}

TEST(SegmentMap, MergingAgreesWithACountTickByTick) {
    Testing::Random random;
    SCOPED_TRACE(random.GetSeed());
    for (int round = 0; round < 200 && !HasFailure(); ++round) {
        SegmentMap map;
        TickModel model;
        for (std::uint32_t number = 1; number <= 12; ++number) {
            const SegmentInfo segment = RandomSegment(random, number);
            MergeSegment(map, segment);
            model.Merge(segment);
            model.ExpectEqual(map);
        }
    }
}

TEST(SegmentMap, AnOverlappedStretchIsErasedWholeAndNeighboursStay) {
    SegmentMap map;
    for (const std::int64_t in : {0, 10, 20, 30}) {
        SegmentInfo info;
        info.in = in;
        info.out = in + 10;
        ReplaceSegment(map, info);
    }
    ASSERT_EQ(map.size(), 4U) << "stretches that only touch don't overlap";
    EraseOverlap(map, 15, 25);
    EXPECT_EQ(FindSegment(map, 10), nullptr) << "it began before the range";
    EXPECT_EQ(FindSegment(map, 29), nullptr);
    EXPECT_NE(FindSegment(map, 9), nullptr);
    EXPECT_NE(FindSegment(map, 30), nullptr);

    SegmentInfo within;
    within.in = 3;
    within.out = 4;
    ReplaceSegment(map, within);
    EXPECT_EQ(FindSegment(map, 2), nullptr) << "the stretch around it is gone";
    EXPECT_EQ(FindSegment(map, 3)->out, 4);
    EXPECT_EQ(FindSegment(map, -1), nullptr);
}

}  // namespace
}  // namespace Vantrel
