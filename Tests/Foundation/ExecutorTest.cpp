// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Halden/Executor.h"

#include <gtest/gtest.h>

#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <future>
#include <memory>
#include <stdexcept>
#include <thread>
#include <vector>

using Halden::threads::AsyncExecutor;
using ExecutorRef = boost::shared_ptr<AsyncExecutor>;

namespace {

/// A door that work waits behind.
class Door {
public:
    void Open() { mOpen.set_value(); }
    void Wait() const { mPassage.wait(); }

private:
    std::promise<void> mOpen;
    std::shared_future<void> mPassage = mOpen.get_future().share();
};

ExecutorRef ThreadKind() { return Halden::threads::CreateThreadExecutor("executor under test"); }

class EveryExecutor : public testing::TestWithParam<ExecutorRef (*)()> {};

}  // namespace

// The numbers and the counter have no lock: work of one executor never overlaps, and a sanitizer would tell.
TEST_P(EveryExecutor, RunsWorkInOrderFromSeveralPosters) {
    const ExecutorRef executor = GetParam()();
    std::vector<std::vector<int>> numbers(4);
    int total = 0;
    std::vector<std::thread> posters;
    for (std::vector<int>& mine : numbers) {
        posters.emplace_back([&, executor] {
            for (int i = 0; i < 500; ++i) {
                executor->Post([&mine, &total, i] { mine.push_back(i), ++total; }, 0);
            }
        });
    }
    for (std::thread& poster : posters) poster.join();
    executor->Drain();
    EXPECT_EQ(total, 2000);
    for (const std::vector<int>& mine : numbers) {
        for (std::size_t i = 0; i < mine.size(); ++i) ASSERT_EQ(mine[i], static_cast<int>(i));
    }
}

TEST_P(EveryExecutor, RunsWhatWasPostedAfterItsLastReferenceIsGone) {
    Door door;
    auto result = std::make_shared<std::promise<int>>();
    std::future<int> answer = result->get_future();
    int steps = 0;
    ExecutorRef executor = GetParam()();
    executor->Post([&door] { door.Wait(); }, 0);
    for (int i = 0; i < 10; ++i) executor->Post([&steps] { ++steps; }, 0);
    executor->Post([&steps, result = std::move(result)] { result->set_value(steps); }, 0);
    executor.reset();
    door.Open();
    EXPECT_EQ(answer.get(), 10);
}

TEST_P(EveryExecutor, LeavesNoWorkBehindWhenTheProcessEnds) {
    testing::FLAGS_gtest_death_test_style = "threadsafe";
    const auto endWithWorkPosted = [] {
        ExecutorRef executor = GetParam()();
        executor->Post([] { std::this_thread::sleep_for(std::chrono::milliseconds(50)); }, 0);
        executor->Post([] { std::fputs("the last work ran", stderr); }, 0);
        executor.reset();
        std::exit(3);
    };
    EXPECT_EXIT(endWithWorkPosted(), testing::ExitedWithCode(3), "the last work ran");
}

TEST_P(EveryExecutor, EndsTheProcessWhenWorkThrows) {
    testing::FLAGS_gtest_death_test_style = "threadsafe";
    const auto throwInWork = [] {
        const ExecutorRef executor = GetParam()();
        executor->Post([] { throw std::runtime_error("thrown by work"); }, 0);
        executor->Drain();
    };
    EXPECT_DEATH(throwInWork(), "thrown by work");
}

INSTANTIATE_TEST_SUITE_P(, EveryExecutor, testing::Values(&ThreadKind, &Halden::threads::CreateCPUBoundExecutor),
                         [](const auto& kind) { return kind.index == 0 ? "OwnThread" : "SharedPool"; });

TEST(CPUBoundExecutors, AreDrainedTogetherWithWhatTheirWorkHolds) {
    Door door;
    int ended = 0;  // without a lock: a sanitizer would tell
    const auto end = [&ended](int* number) {
        std::this_thread::sleep_for(std::chrono::milliseconds(20));
        ended += *number;
        delete number;
    };
    ExecutorRef first = Halden::threads::CreateCPUBoundExecutor();
    const ExecutorRef second = Halden::threads::CreateCPUBoundExecutor();
    first->Post(
        [&door, second, held = std::shared_ptr<int>(new int(1), end)]() mutable {
            door.Wait();
            second->Post([held = std::move(held)] {}, 0);
        },
        0);
    first.reset();
    door.Open();
    Halden::threads::DrainCPUBoundExecutors();
    EXPECT_EQ(ended, 1);
}
