// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <future>
#include <string>

#include "Host/Render/PictureCache.h"
#include "Host/Render/WorkerPool.h"

namespace Vantrel::Testing {
namespace {

using Host::PictureCache;
using Host::WorkerPool;

/// Keeps the only thread of a pool busy until it is let go.
class Blocker {
public:
    explicit Blocker(WorkerPool& pool) {
        pool.Submit(-1000, [this](bool) {
            mStarted.set_value();
            mLetGo.get_future().wait();
        });
        mStarted.get_future().wait();
    }
    void LetGo() { mLetGo.set_value(); }

private:
    std::promise<void> mStarted;
    std::promise<void> mLetGo;
};

TEST(WorkerPool, RunsTheEarliestTimeFirstAndEqualTimesInOrder) {
    std::string order;
    WorkerPool pool(1);
    Blocker blocker(pool);
    const auto add = [&](std::int64_t time, char name) {
        pool.Submit(time, [&order, name](bool cancelled) { order += cancelled ? '-' : name; });
    };
    add(30, 'd');
    add(10, 'a');
    add(20, 'b');
    add(20, 'c');
    add(-5, '0');
    blocker.LetGo();
    pool.Drain();
    EXPECT_EQ(order, "0abcd");
}

TEST(WorkerPool, CancelMarksWhatHasntBegun) {
    std::string order;
    WorkerPool pool(1);
    Blocker blocker(pool);
    const auto add = [&](char name) {
        return pool.Submit(1, [&order, name](bool cancelled) { order += std::string(cancelled ? "-" : "+") + name; });
    };
    const std::uint32_t first = add('a');
    const std::uint32_t second = add('b');
    EXPECT_NE(first, 0U);
    EXPECT_NE(first, second);
    pool.Cancel(second);
    pool.Cancel(second);
    pool.Cancel(987654);
    blocker.LetGo();
    pool.Drain();
    pool.Cancel(first);
    EXPECT_EQ(order, "+a-b");
}

TEST(PictureCache, DropsTheLeastRecentlyUsedByBytes) {
    const auto pool = Host::PixelBufferPool::Create();
    const auto picture = [&pool] { return Host::MakeHostPicture(*pool, Vellum::kPixelFormat_BGRA_4444_8u, 16, 10); };
    const std::size_t bytes = picture()->GetBytes();
    PictureCache<int> cache(3 * bytes);
    for (int i = 0; i < 3; ++i) cache.Store(i, picture());
    EXPECT_EQ(cache.GetBytes(), 3 * bytes);
    EXPECT_NE(cache.Find(0), nullptr);
    const Host::HostPictureRef kept = cache.Find(2);
    cache.Store(3, picture());
    EXPECT_EQ(cache.Find(1), nullptr) << "the one used longest ago";
    EXPECT_NE(cache.Find(0), nullptr);
    EXPECT_EQ(cache.Find(2), kept);
    EXPECT_EQ(cache.GetBytes(), 3 * bytes);
    cache.Store(2, picture());
    EXPECT_EQ(cache.Find(2), kept) << "the first one stays";
    cache.Store(9, Host::MakeHostPicture(*pool, Vellum::kPixelFormat_BGRA_4444_8u, 16, 1000));
    EXPECT_EQ(cache.Find(9), nullptr);
    EXPECT_NE(cache.Find(0), nullptr) << "what is too large drives nothing out";
    cache.Clear();
    EXPECT_EQ(cache.GetBytes(), 0U);
    EXPECT_EQ(cache.Find(0), nullptr);
}

}  // namespace
}  // namespace Vantrel::Testing
