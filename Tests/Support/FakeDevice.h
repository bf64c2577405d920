// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>
#include <map>
#include <mutex>
#include <stdexcept>
#include <string>
#include <vector>

#include <boost/make_shared.hpp>

#include "Kiln/Device.h"

/// A device of either framework for what must work before a device is touched: it keeps frames, notes what is asked of
/// it and answers as it was told. Figures and answers are public fields; tests change them while nothing renders.
namespace Vantrel::Testing {

/// Marks lie a fixed time apart.
class FakeMark final : public Kiln::TimingMark {
public:
    explicit FakeMark(float ms) : mMs(ms) {}
    float ElapsedMs(const Kiln::TimingMark& later) const override {
        return static_cast<const FakeMark&>(later).mMs - mMs;
    }
    bool IsReached() const override { return true; }
    void Wait() const override {}

private:
    float mMs;
};

class FakeCommands final : public Kiln::DeviceCommands {
public:
    struct Call {
        std::uint64_t kernel;
        std::int32_t gridX, gridY, blockX, blockY;
        std::uint64_t reserved;
    };
    Kiln::TimingMarkRef CreateMark() override {
        return boost::make_shared<FakeMark>(markDistanceMs * static_cast<float>(marks++));
    }
    Ostrand::Status Launch(std::uint64_t kernel, std::int32_t gridX, std::int32_t gridY, std::int32_t blockX,
                           std::int32_t blockY, std::uint64_t reserved) override {
        calls.push_back({kernel, gridX, gridY, blockX, blockY, reserved});
        return status;
    }
    Ostrand::Status CopyHostToDevice(const void*, std::uint64_t, std::size_t, Kiln::TimingMarkRef*) override {
        return Ostrand::kStatus_Failure;
    }

    std::vector<Call> calls;
    Ostrand::Status status = Ostrand::kStatus_OK;
    float markDistanceMs = 1.0F;
    int marks = 0;
};

/// Keeps every frame, whatever its size.
class FakeFrameCache final : public Kiln::FrameCache {
public:
    void CacheFrame(const Halden::utility::Guid& hash, const Marl::VideoFrameRef& frame) override {
        const std::lock_guard<std::mutex> lock(mMutex);
        mFrames[hash] = frame;
    }
    Marl::VideoFrameRef FindFrame(const Halden::utility::Guid& hash) override {
        const std::lock_guard<std::mutex> lock(mMutex);
        const auto found = mFrames.find(hash);
        return found == mFrames.end() ? Marl::VideoFrameRef() : found->second;
    }
    std::uint64_t Purge(std::uint64_t bytes) override {
        purges.push_back(bytes);
        return bytes;
    }
    std::uint64_t GetBytes() const override { return 0; }

    std::vector<std::uint64_t> purges;

private:
    std::mutex mMutex;
    std::map<Halden::utility::Guid, Marl::VideoFrameRef> mFrames;
};

/// Has no memory, only figures of it.
class FakeMemoryManager final : public Kiln::MemoryManager {
public:
    std::uint64_t Allocate(std::uint64_t) override { return 0; }
    void Free(std::uint64_t) override {}
    void Free(std::uint64_t, const Kiln::TimingMarkRef&) override {}
    bool Owns(std::uint64_t) const override { return false; }
    Kiln::MemoryFigures GetFigures() const override { return figures; }
    Kiln::MemoryStatistics GetStatistics() const override { return statistics; }
    void ResetStatistics() override { ++resets; }
    std::uint64_t ReleaseUnused(std::uint64_t bytes) override {
        releases.push_back(bytes);
        return 0;
    }
    Kiln::FrameCache& GetFrameCache() override { return cache; }
    void SetAllocationFilter(boost::function<bool(std::uint64_t)>) override {}

    Kiln::MemoryFigures figures{0, 0, 1ULL << 40, 1ULL << 40};
    Kiln::MemoryStatistics statistics;
    int resets = 0;
    std::vector<std::uint64_t> releases;
    FakeFrameCache cache;
};

class FakeDevice final : public Kiln::Device {
public:
    explicit FakeDevice(Kiln::DeviceFramework framework = Kiln::DeviceFramework::kCuda, std::uint32_t index = 0)
        : mFramework(framework), mIndex(index) {}

    Kiln::DeviceFramework GetFramework() const override { return mFramework; }
    std::uint32_t GetIndex() const override { return mIndex; }
    std::uint64_t GetContextIdentity() const override { return identity; }
    const std::string& GetName() const override { return mName; }
    const std::string& GetDescription() const override { return mName; }
    std::uint64_t GetMemoryLimit() const override { return memoryLimit; }
    void SetMemoryLimit(std::uint64_t bytes) override { memoryLimit = bytes; }
    bool IsTimingEnabled() const override { return mTiming; }
    void SetTimingEnabled(bool enabled) override { mTiming = enabled; }
    const boost::shared_ptr<Kiln::DeviceCommands>& GetCommands() const override { return mCommandsBase; }
    const boost::shared_ptr<Kiln::MemoryManager>& GetDeviceMemory() const override { return mDeviceMemoryBase; }
    const boost::shared_ptr<Kiln::MemoryManager>& GetHostMemory() const override { return mHostMemoryBase; }
    std::uint64_t FindModule(const char* key) override {
        asked.emplace_back(key);
        return module;
    }
    std::string GetModuleMessage(const char*) override { return {}; }
    std::uint64_t FindKernel(const char*, const char*) override { return 0; }
    const boost::shared_ptr<Halden::threads::AsyncExecutor>& GetExecutor() const override { return mExecutor; }
    void AcquireExclusiveAccess() override { ++exclusive; }
    void ReleaseExclusiveAccess() override { --exclusive; }
    std::uint64_t GetCommandQueueHandle() const override { return 0; }
    Ostrand::Status Synchronize() override { return Ostrand::kStatus_OK; }
    Kiln::Backend& GetBackend() override { throw std::logic_error("a fake device has no backend"); }

    FakeCommands& Commands() { return *mCommands; }
    FakeMemoryManager& DeviceMemory() { return *mDeviceMemory; }
    FakeMemoryManager& HostMemory() { return *mHostMemory; }

    std::uint64_t identity = 1;
    std::uint64_t module = 100;
    std::vector<std::string> asked;
    std::uint64_t memoryLimit = 1ULL << 30;
    std::atomic<int> exclusive{0};

private:
    Kiln::DeviceFramework mFramework;
    std::uint32_t mIndex;
    std::string mName = "fake";
    bool mTiming = false;
    boost::shared_ptr<FakeCommands> mCommands = boost::make_shared<FakeCommands>();
    boost::shared_ptr<Kiln::DeviceCommands> mCommandsBase = mCommands;
    boost::shared_ptr<FakeMemoryManager> mDeviceMemory = boost::make_shared<FakeMemoryManager>();
    boost::shared_ptr<FakeMemoryManager> mHostMemory = boost::make_shared<FakeMemoryManager>();
    boost::shared_ptr<Kiln::MemoryManager> mDeviceMemoryBase = mDeviceMemory;
    boost::shared_ptr<Kiln::MemoryManager> mHostMemoryBase = mHostMemory;
    boost::shared_ptr<Halden::threads::AsyncExecutor> mExecutor = Halden::threads::CreateThreadExecutor("fake device");
};

}  // namespace Vantrel::Testing
