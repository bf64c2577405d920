// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Halden/Executor.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <future>
#include <iterator>
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

std::ptrdiff_t ThreadsOfThisProcess() {
    return std::distance(std::filesystem::directory_iterator("/proc/self/task"), {});
}

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

TEST_P(EveryExecutor, MayLoseItsLastReferenceToItsOwnWork) {
    Door door;
    auto released = std::make_shared<std::promise<void>>();
    const std::future<void> end = released->get_future();
    {
        ExecutorRef executor = GetParam()();
        const std::shared_ptr<void> atEnd(nullptr, [released](void*) { released->set_value(); });
        executor->Post(
            [executor, atEnd, &door]() mutable {
                door.Wait();
                executor.reset();
            },
            0);
    }
    door.Open();
    EXPECT_EQ(end.wait_for(std::chrono::seconds(60)), std::future_status::ready);
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

TEST(SharedPool, RunsManyExecutorsAtOnceEachInItsOrder) {
    const std::ptrdiff_t threadsBefore = ThreadsOfThisProcess();
    const ExecutorRef waiting = Halden::threads::CreateCPUBoundExecutor();
    Door door;
    waiting->Post([&door] { door.Wait(); }, 0);

    std::vector<ExecutorRef> executors;
    std::vector<int> lengths(100, 0);
    for (std::size_t i = 0; i < lengths.size(); ++i) executors.push_back(Halden::threads::CreateCPUBoundExecutor());
    for (int round = 0; round < 20; ++round) {
        for (std::size_t i = 0; i < lengths.size(); ++i) {
            executors[i]->Post([&length = lengths[i], round] { length = length == round ? round + 1 : -1000; }, 0);
        }
    }
    EXPECT_LE(ThreadsOfThisProcess() - threadsBefore, std::max(2U, std::thread::hardware_concurrency()));
    // The waiting executor occupies one thread of the pool all the while.
    for (const ExecutorRef& executor : executors) executor->Drain();
    for (const int length : lengths) EXPECT_EQ(length, 20);
    door.Open();
    waiting->Drain();
}
