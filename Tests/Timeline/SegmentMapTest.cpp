// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Shared/Src/SegmentMap.h"

#include <gtest/gtest.h>

#include "Tests/Support/Pictures.h"
#include "Tests/Timeline/TickModel.h"

namespace Vantrel {
namespace {

constexpr std::int64_t kEnd = 48;

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
        SegmentCursor cursor(map);
        Testing::TickModel model(kEnd);
        for (std::uint32_t number = 1; number <= 12; ++number) {
            const SegmentInfo segment = RandomSegment(random, number);
            cursor.Merge(segment);
            model.Merge(segment);
            model.ExpectEqual([&map](std::int64_t t) { return FindSegment(map, t); });
        }
    }
}

}  // namespace
}  // namespace Vantrel
