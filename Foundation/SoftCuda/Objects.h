// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// What the API's handles stand for, and the state that its entries share.

#include <atomic>
#include <chrono>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include "SoftCuda/DriverApi.h"
#include "SoftCuda/Launch.h"
#include "SoftCuda/Memory.h"
#include "SoftCuda/Settings.h"
#include "SoftCuda/Stream.h"

struct CUstream_st {
    CUcontext context = nullptr;
    bool blocking = true;  ///< keeps its order with the default stream
    std::shared_ptr<SoftCuda::Stream> stream = std::make_shared<SoftCuda::Stream>();
};

struct CUevent_st {
    using Clock = SoftCuda::Stream::Clock;
    /// One recording; the stream writes the time before it reaches the point. The time is held apart because queued
    /// work must not hold on to its own stream.
    struct Record {
        SoftCuda::StreamPoint point;
        SoftCuda::Stream::Stamp time = std::make_shared<Clock::time_point>();

        [[nodiscard]] bool IsReached() const { return point.stream->IsReached(point.ticket); }
    };
    CUcontext context = nullptr;
    std::mutex mutex;  ///< of the pointer
    std::shared_ptr<Record> record;

    [[nodiscard]] std::shared_ptr<Record> Get() {
        const std::lock_guard<std::mutex> lock(mutex);
        return record;
    }
};

struct CUfunc_st {
    const SoftCuda::KernelRecord* kernel = nullptr;
    int level = 0;
    SoftCuda::AddressRange module;
    // Set by the older entries and kept until set again, as the API has it.
    int block[3] = {1, 1, 1};
    unsigned parameterBytes = 0;
    alignas(16) std::array<unsigned char, SoftCuda::kMaxParameterBytes> parameters{};
};

struct CUmod_st {
    CUcontext context = nullptr;
    int level = 0;
    int file = -1;                 ///< stays open: the loader tells objects apart by its name
    void* object = nullptr;        ///< of the dynamic loader
    SoftCuda::AddressRange range;  ///< where it lies
    std::mutex mutex;              ///< of the functions
    std::map<std::string, std::unique_ptr<CUfunc_st>> functions;

    CUmod_st() = default;
    CUmod_st(const CUmod_st&) = delete;
    CUmod_st& operator=(const CUmod_st&) = delete;
    ~CUmod_st();
};

struct CUctx_st {
    int device = 0;
    std::atomic<int> references{1};
    std::mutex mutex;  ///< of the sets
    CUstream_st defaultStream;
    std::set<std::unique_ptr<CUstream_st>> streams;
    std::set<std::unique_ptr<CUmod_st>> modules;

    /// Waits for all streams.
    void Synchronize();
};

namespace SoftCuda {

/// The process's driver. Its lock is held while none of the others is taken, but for a context's.
struct Driver {
    std::mutex mutex;
    bool initialized = false;
    Settings settings;
    std::set<std::unique_ptr<CUctx_st>> contexts;
};
[[nodiscard]] Driver& GetDriver();

/// The thread's current context, or null.
[[nodiscard]] CUcontext GetCurrent();
/// Fails when the driver isn't initialised or the thread has no context.
CUresult NeedContext(CUcontext& context);
CUresult NeedDevice(CUdevice device);

/// Finds the member of a set of owners; for handles that the caller gives back.
template <class T>
[[nodiscard]] auto FindOwned(std::set<std::unique_ptr<T>>& set, const T* object) {
    auto found = set.begin();
    while (found != set.end() && found->get() != object) ++found;
    return found;
}

/// The stream behind a handle; null and the API's numbers for it are the context's default stream.
CUresult FindStream(CUstream handle, CUstream_st*& stream);
/// What has to be reached before new work on a stream may begin: the default stream keeps its order with all that
/// block.
[[nodiscard]] std::vector<StreamPoint> GetDependencies(CUstream_st& stream);

/// Queues work on a stream; with `wait`, returns when it is done.
CUresult Enqueue(CUstream handle, bool wait, std::function<void()> work);

/// Copies in parallel from a certain size on.
void CopyBytes(void* target, const void* source, std::size_t bytes);

}  // namespace SoftCuda

// Gives an entry its versioned name as well.
#define SOFTCUDA_V2(name) extern "C" decltype(name) name##_v2 __attribute__((alias(#name)))
