// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Kiln/ParallelRows.h"

#include <algorithm>
#include <atomic>
#include <condition_variable>
#include <memory>
#include <mutex>
#include <thread>
#include <vector>

#include "Halden/Executor.h"

namespace Kiln {
namespace {

// Small enough to stay in a core's own cache, large enough that claiming one costs nothing beside it.
constexpr std::uint64_t kBandBytes = 256U << 10;
// Less than this is done before a helper has woken up.
constexpr std::uint64_t kWorthHelp = 1U << 20;

// Bands are claimed one by one. A helper that comes late finds none left and touches nothing but this record.
struct Job {
    const std::function<void(std::int32_t, std::int32_t)>* work;
    std::int32_t rows;
    std::int32_t rowsPerBand;
    std::int32_t bands;
    std::atomic<std::int32_t> next{0};
    std::mutex mutex;
    std::condition_variable finished;
    std::int32_t done = 0;

    void Help() {
        for (std::int32_t band = next++; band < bands; band = next++) {
            const std::int32_t first = band * rowsPerBand;
            (*work)(first, std::min(first + rowsPerBand, rows));
            const std::lock_guard<std::mutex> lock(mutex);
            if (++done == bands) finished.notify_all();
        }
    }

    void Await() {
        std::unique_lock<std::mutex> lock(mutex);
        finished.wait(lock, [this] { return done == bands; });
    }
};

using Helpers = std::vector<boost::shared_ptr<Halden::threads::AsyncExecutor>>;

const Helpers& GetHelpers() {
    static const Helpers helpers = [] {
        Helpers made(std::clamp(std::thread::hardware_concurrency(), 1U, 16U) - 1);
        for (auto& helper : made) helper = Halden::threads::CreateCPUBoundExecutor();
        return made;
    }();
    return helpers;
}

}  // namespace

void ForEachBand(std::int32_t rows, std::uint64_t rowCost, std::int32_t fewestRows,
                 const std::function<void(std::int32_t first, std::int32_t last)>& work) {
    if (rows <= 0) return;
    rowCost = std::max<std::uint64_t>(rowCost, 1);
    const auto fullBand = static_cast<std::int32_t>(std::min<std::uint64_t>(kBandBytes / rowCost, 1U << 20));
    const std::int32_t rowsPerBand = std::max({fullBand, fewestRows, 1});
    const std::int32_t bands = (rows + rowsPerBand - 1) / rowsPerBand;
    if (bands < 2 || rowCost * static_cast<std::uint64_t>(rows) < kWorthHelp || GetHelpers().empty()) {
        work(0, rows);
        return;
    }
    const auto job = std::make_shared<Job>();
    job->work = &work;
    job->rows = rows;
    job->rowsPerBand = rowsPerBand;
    job->bands = bands;
    const auto count = std::min(GetHelpers().size(), static_cast<std::size_t>(bands) - 1);
    for (std::size_t i = 0; i < count; ++i) GetHelpers()[i]->Post([job] { job->Help(); }, 0);
    job->Help();
    job->Await();
}

}  // namespace Kiln
