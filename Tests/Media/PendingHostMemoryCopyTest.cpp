// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <atomic>
#include <future>
#include <thread>

#include <gtest/gtest.h>

#include <boost/make_shared.hpp>

#include "Src/Filters/PendingHostMemoryCopyManager.h"
#include "Tests/Support/FakeDevice.h"
#include "Tests/Support/FakeFrame.h"

namespace Vantrel::Testing {
namespace {

constexpr Guid kHash{1, 2, 3, {}};
constexpr Guid kOtherHash{4, 5, 6, {}};

/// Keeps jobs until the test runs them.
class ManualExecutor : public Halden::threads::AsyncExecutor {
public:
    void Post(boost::function<void()> work, std::uint32_t) override { mJobs.push_back(std::move(work)); }
    void Drain() override {
        while (!mJobs.empty()) {
            const auto job = std::move(mJobs.front());
            mJobs.erase(mJobs.begin());
            job();
        }
    }

private:
    std::vector<boost::function<void()>> mJobs;
};

class PendingCopies : public ::testing::Test {
protected:
    static RenderResultsRef MakeResults(std::uint32_t outstanding = 1) {
        return boost::make_shared<RenderResults>([] {}, outstanding);
    }
    Kiln::FrameCache& Cache() { return mDevice->GetHostMemory()->GetFrameCache(); }
    bool GetOrClaim(const RenderResultsRef& results, bool blocking, const Guid& hash = kHash) {
        return mManager.GetOrClaim(mDevice, hash, blocking, results, mFrame);
    }
    void Queue(const Guid& hash = kHash) {
        mManager.QueueCopy(mExecutor, hash, [this, hash] {
            ++mCopies;
            mManager.Complete(mDevice, hash, mMade);
        });
    }

    PendingHostMemoryCopyManager mManager;
    Kiln::DeviceRef mDevice = boost::make_shared<FakeDevice>();
    boost::shared_ptr<ManualExecutor> mExecutor = boost::make_shared<ManualExecutor>();
    VideoFrameRef mMade = FakeFrame::Make();
    VideoFrameRef mFrame;
    std::atomic<int> mCopies{0};
};

TEST_F(PendingCopies, TwoRequestsShareOneCopy) {
    const RenderResultsRef first = MakeResults();
    const RenderResultsRef second = MakeResults();
    EXPECT_FALSE(GetOrClaim(first, false));
    Queue();
    EXPECT_TRUE(GetOrClaim(second, false));
    EXPECT_FALSE(mFrame);
    EXPECT_EQ(first->GetOutstanding(), 2u);
    EXPECT_EQ(second->GetOutstanding(), 2u);

    mExecutor->Drain();
    EXPECT_EQ(mCopies, 1);
    EXPECT_EQ(first->FindFrame(kHash), mMade);
    EXPECT_EQ(second->FindFrame(kHash), mMade);
    EXPECT_EQ(first->GetOutstanding(), 1u);
    EXPECT_EQ(second->GetOutstanding(), 1u);

    // Done: a later request takes it from the cache and counts nothing.
    const RenderResultsRef third = MakeResults();
    EXPECT_TRUE(GetOrClaim(third, true));
    EXPECT_EQ(mFrame, mMade);
    EXPECT_EQ(third->FindFrame(kHash), mMade);
    EXPECT_EQ(third->GetOutstanding(), 1u);
}

TEST_F(PendingCopies, ABlockingCallerDoesAQueuedCopyItself) {
    const RenderResultsRef results = MakeResults();
    EXPECT_FALSE(GetOrClaim(results, false));
    Queue();
    const RenderResultsRef other = MakeResults();
    EXPECT_TRUE(GetOrClaim(other, true));
    EXPECT_EQ(mFrame, mMade);
    EXPECT_EQ(results->FindFrame(kHash), mMade);
    EXPECT_EQ(other->GetOutstanding(), 1u);

    // The job that was posted for it serves whatever else is queued, and then finds nothing.
    EXPECT_FALSE(GetOrClaim(results, false, kOtherHash));
    Queue(kOtherHash);
    mExecutor->Drain();
    EXPECT_EQ(mCopies, 2);
    EXPECT_TRUE(results->FindFrame(kOtherHash));
}

TEST_F(PendingCopies, ABlockingCallerWaitsForARunningCopy) {
    const RenderResultsRef results = MakeResults();
    EXPECT_FALSE(GetOrClaim(results, false));
    std::promise<void> started;
    std::promise<void> mayEnd;
    mManager.QueueCopy(mExecutor, kHash, [&] {
        started.set_value();
        mayEnd.get_future().wait();
        mManager.Complete(mDevice, kHash, mMade);
    });
    std::thread copier([this] { mExecutor->Drain(); });
    started.get_future().wait();

    // Two render threads, of two devices, wait at once.
    std::vector<std::thread> renders;
    std::vector<VideoFrameRef> frames(2);
    for (VideoFrameRef& frame : frames) {
        renders.emplace_back([&] { EXPECT_TRUE(mManager.GetOrClaim(mDevice, kHash, true, MakeResults(), frame)); });
    }
    mayEnd.set_value();
    for (std::thread& render : renders) render.join();
    copier.join();
    for (const VideoFrameRef& frame : frames) EXPECT_EQ(frame, mMade);
}

TEST_F(PendingCopies, AFailedRequestStagesNothing) {
    const RenderResultsRef results = MakeResults();
    results->SetFailed();
    EXPECT_TRUE(GetOrClaim(results, false));
    EXPECT_FALSE(mFrame);
    EXPECT_EQ(results->GetOutstanding(), 1u);
}

TEST_F(PendingCopies, ACopyThatNobodyWantsAnyMoreIsDropped) {
    const RenderResultsRef failed = MakeResults();
    const RenderResultsRef alive = MakeResults();
    EXPECT_FALSE(GetOrClaim(failed, false));
    Queue();
    EXPECT_FALSE(GetOrClaim(alive, false, kOtherHash));
    Queue(kOtherHash);
    failed->SetFailed();

    // One job: it passes over the dropped copy and makes the other.
    mManager.ExecuteThreadCopy();
    EXPECT_EQ(mCopies, 1);
    EXPECT_FALSE(failed->FindFrame(kHash));
    EXPECT_EQ(failed->GetOutstanding(), 1u);
    EXPECT_EQ(alive->FindFrame(kOtherHash), mMade);
    // Nobody is left to finish it: the next request has to.
    EXPECT_FALSE(GetOrClaim(alive, false));
}

TEST_F(PendingCopies, AFailedCopyReleasesItsWaitersAndCachesNothing) {
    const RenderResultsRef first = MakeResults();
    const RenderResultsRef second = MakeResults();
    EXPECT_FALSE(GetOrClaim(first, true));
    EXPECT_TRUE(GetOrClaim(second, false));
    mManager.Complete(mDevice, kHash, {});
    EXPECT_EQ(first->GetOutstanding(), 1u);
    EXPECT_EQ(second->GetOutstanding(), 1u);
    EXPECT_FALSE(second->FindFrame(kHash));
    EXPECT_FALSE(Cache().FindFrame(kHash));
}

TEST_F(PendingCopies, ARequestWhoseOwnCopyFailedStillGetsThatOfAnother) {
    const RenderResultsRef early = MakeResults();
    EXPECT_FALSE(GetOrClaim(early, false));
    mManager.Complete(mDevice, kHash, {});  // its host frame hadn't come yet

    const RenderResultsRef late = MakeResults();
    EXPECT_FALSE(GetOrClaim(late, false));
    Queue();
    EXPECT_TRUE(GetOrClaim(early, true));
    EXPECT_EQ(mFrame, mMade);
    EXPECT_EQ(early->FindFrame(kHash), mMade);
}

TEST_F(PendingCopies, AnEntryWithoutAFunctionRaises) {
    const RenderResultsRef results = MakeResults();
    EXPECT_FALSE(GetOrClaim(results, false));
    mManager.QueueCopy(mExecutor, kHash, {});
    EXPECT_THROW(mManager.ExecuteCopyImmediateIfNotStarted(kHash, results), boost::bad_function_call);
}

TEST_F(PendingCopies, ManyRequestsAndThreadsLoseNothing) {
    constexpr int kFrames = 64;
    const auto executors = {Halden::threads::CreateCPUBoundExecutor(), Halden::threads::CreateCPUBoundExecutor()};
    std::atomic<int> completions{0};
    std::vector<std::thread> requests;
    for (std::uint32_t request = 0; request < 4; ++request) {
        requests.emplace_back([&, request] {
            const auto results = boost::make_shared<RenderResults>([&] { ++completions; }, 1);
            const auto& executor = executors.begin()[request % 2];
            for (std::uint32_t i = 0; i < kFrames; ++i) {
                const Guid hash{i + 1, 0, 0, {}};
                VideoFrameRef frame;
                if (!mManager.GetOrClaim(mDevice, hash, false, results, frame)) {
                    mManager.QueueCopy(executor, hash, [this, hash] {
                        ++mCopies;
                        mManager.Complete(mDevice, hash, mMade);
                    });
                }
            }
            results->EndAsyncPiece();
            for (std::uint32_t i = 0; i < kFrames; ++i) {
                VideoFrameRef frame;
                EXPECT_TRUE(mManager.GetOrClaim(mDevice, {i + 1, 0, 0, {}}, true, results, frame));
                EXPECT_EQ(frame, mMade);
            }
        });
    }
    for (std::thread& request : requests) request.join();
    for (const auto& executor : executors) executor->Drain();
    EXPECT_EQ(mCopies, kFrames);
    EXPECT_EQ(completions, 4);
}

}  // namespace
}  // namespace Vantrel::Testing
