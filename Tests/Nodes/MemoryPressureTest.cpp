// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gmock/gmock.h>

#include "Src/Nodes/FinishedInputs.h"
#include "Tests/Nodes/ProbeNodes.h"

namespace Vantrel::Testing {
namespace {

using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::Not;

constexpr std::uint64_t kNeed = 2 * 64 * 36 * 16;

/// A node over two leaves, one of them below a filter.
class MemoryPressureTest : public ::testing::Test {
protected:
    MemoryPressureTest() {
        node->hash = HashOf(1);
        below->hash = HashOf(2);
        node->SetInput(0, leaf);
        node->SetInput(1, below);
        below->SetInput(0, deep);
        leaf->frame = deep->frame = FakeFrame::Make();
    }
    ~MemoryPressureTest() override { FinishedInputs::Clear(); }

    /// Memory in use, which each end of a leaf's frame lowers by `step`.
    void Use(std::uint64_t bytes, std::uint64_t step) {
        memory.figures.bytesInUse = bytes;
        leaf->onEnd = deep->onEnd = [this, step](std::uint32_t) { memory.figures.bytesInUse -= step; };
    }

    ProbeStage stage;
    ProbeLeafRef leaf = stage.Leaf("leaf");
    ProbeLeafRef deep = stage.Leaf("deep");
    ProbeFilterRef below = stage.Filter("below");
    ProbeFilterRef node = stage.Filter("node");
    FakeMemoryManager& memory = stage.device->DeviceMemory();
    VideoFrameRef frame;
};

TEST_F(MemoryPressureTest, ARefusalIsPurgedForAndTriedOnceMore) {
    int attempts = 0;
    node->work = [&attempts](VideoFrameRef&) { return ++attempts == 1 ? Ostrand::kStatus_OutOfMemory : 0; };
    const ProbeLeafRef finished = stage.Leaf("finished");
    FinishedInputs::Append(finished, {}, stage.params, stage.results);
    EXPECT_EQ(stage.Render(*node, frame), 0);
    EXPECT_EQ(attempts, 2);
    EXPECT_THAT(stage.TakeLog(), ElementsAre("leaf RenderFrame", "deep RenderFrame", "below Render", "node Render",
                                             "finished EndFrame 2", "deep EndFrame 2", "node Render"))
        << "the inputs of inputs end, the node's own inputs don't";
    EXPECT_THAT(memory.releases, ElementsAre(~0ULL));
    EXPECT_THAT(stage.device->HostMemory().releases, ElementsAre(~0ULL));
    EXPECT_FALSE(FinishedInputs::Release(9)) << "the list is empty after a purge";
}

TEST_F(MemoryPressureTest, TwoRefusalsInARowGoUp) {
    int attempts = 0;
    node->work = [&attempts](VideoFrameRef&) {
        ++attempts;
        return Ostrand::kStatus_OutOfMemory;
    };
    EXPECT_EQ(stage.Render(*node, frame), Ostrand::kStatus_OutOfMemory);
    EXPECT_EQ(attempts, 2);
    EXPECT_EQ(memory.releases.size(), 1U);
    EXPECT_FALSE(node->mFrameSlot);
    EXPECT_FALSE(frame);

    const ProbeFilterRef self = stage.Filter("self", true);
    self->hash = HashOf(3);
    self->work = node->work;
    attempts = 0;
    EXPECT_EQ(stage.Render(*self, frame), Ostrand::kStatus_OutOfMemory);
    EXPECT_EQ(attempts, 1) << "a self-rendering node purges where it allocates";
}

TEST_F(MemoryPressureTest, RunningInputsAreLeftAloneAndFinishedOnesAreReleasedByLevel) {
    const ProbeFilterRef self = stage.Filter("self", true);
    self->hash = HashOf(4);
    leaf->status = Ostrand::kStatus_OutOfMemory;
    FinishedInputs::Append(leaf, {}, stage.params, stage.results);
    FinishedInputs::Append(deep, {}, stage.params, stage.results);
    EXPECT_EQ(self->RenderInput(leaf, {}, stage.params, stage.results, frame), Ostrand::kStatus_OutOfMemory);
    EXPECT_THAT(stage.TakeLog(), ElementsAre("leaf RenderFrame", "deep EndFrame 2", "leaf RenderFrame"))
        << "the busy one is skipped and the next taken";

    leaf->status = 0;
    EXPECT_EQ(self->RenderInput(leaf, self, stage.params, stage.results, frame), 0);
    stage.TakeLog();
    EXPECT_FALSE(FinishedInputs::Release(0));
    EXPECT_TRUE(FinishedInputs::Release(2));
    EXPECT_FALSE(FinishedInputs::Release(2)) << "ended at this level already";
    EXPECT_TRUE(FinishedInputs::Release(3));
    EXPECT_THAT(stage.log, ElementsAre("leaf EndFrame 2", "leaf EndFrame 3"));
}

TEST_F(MemoryPressureTest, RoomIsMadeFromFinishedInputsFirst) {
    const ProbeLeafRef other = stage.Leaf("other");
    for (const ProbeLeafRef& finished : {deep, other})
        FinishedInputs::Append(finished, {}, stage.params, stage.results);
    memory.figures.gentleLimit = memory.figures.hardLimit = kNeed + 500;
    Use(700, 100);
    other->onEnd = deep->onEnd;
    EXPECT_EQ(stage.Render(*node, frame), 0);
    EXPECT_THAT(stage.log, testing::AllOf(Contains("deep EndFrame 3"), Contains("other EndFrame 3")));
    EXPECT_THAT(stage.log, Not(Contains("leaf EndFrame 3"))) << "it fits again";
    EXPECT_TRUE(memory.cache.purges.empty());
}

TEST_F(MemoryPressureTest, RoomIsMadeInStepsThatGoFurtherAtTheHardLimit) {
    below->work = MakesFrame(FakeFrame::Make());
    stage.Render(*below, frame);
    stage.TakeLog();
    memory.figures.gentleLimit = kNeed + 100;
    memory.figures.hardLimit = kNeed + 300;
    Use(900, 100);
    EXPECT_EQ(stage.Render(*node, frame), 0);
    const CallLog expected = {"leaf RenderFrame", "node Render",     "leaf EndFrame 3",  "below EndFrame 3",
                              "deep EndFrame 3",  "leaf EndFrame 2", "below EndFrame 2", "deep EndFrame 2"};
    EXPECT_EQ(stage.log, expected);
    EXPECT_THAT(memory.cache.purges, ElementsAre(400U)) << "what is still above the hard limit";

    stage.TakeLog();
    Use(100, 0);
    node->EndFrame({}, stage.params, stage.results, 0);
    stage.TakeLog();
    EXPECT_EQ(stage.Render(*node, frame), 0);
    EXPECT_THAT(stage.log, Not(Contains("leaf EndFrame 3"))) << "exactly at the gentle limit there is room";
}

}  // namespace
}  // namespace Vantrel::Testing
