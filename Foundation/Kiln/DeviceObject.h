// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>
#include <map>
#include <memory>
#include <string_view>

#include "Kiln/Backend.h"
#include "Kiln/Device.h"
#include "Kiln/MemoryPool.h"
#include "Ostrand/CriticalSection.h"

namespace Kiln {

/// The one kind of Device: what the frameworks differ in lies in its backend.
class DeviceObject final : public Device {
public:
    DeviceObject(DeviceFramework framework, std::uint32_t index, std::shared_ptr<Backend> backend);
    ~DeviceObject() override;
    DeviceObject(const DeviceObject&) = delete;
    DeviceObject& operator=(const DeviceObject&) = delete;

    DeviceFramework GetFramework() const override { return mFramework; }
    std::uint32_t GetIndex() const override { return mIndex; }
    std::uint64_t GetContextIdentity() const override { return mIdentity; }
    const std::string& GetName() const override { return mBackend->GetFacts().name; }
    const std::string& GetDescription() const override { return mBackend->GetFacts().description; }
    std::uint64_t GetMemoryLimit() const override { return mMemoryLimit; }
    void SetMemoryLimit(std::uint64_t bytes) override;
    bool IsTimingEnabled() const override { return mTimingEnabled; }
    void SetTimingEnabled(bool enabled) override { mTimingEnabled = enabled; }
    const boost::shared_ptr<DeviceCommands>& GetCommands() const override { return mCommands; }
    const boost::shared_ptr<MemoryManager>& GetDeviceMemory() const override { return mDeviceMemory; }
    const boost::shared_ptr<MemoryManager>& GetHostMemory() const override { return mHostMemory; }
    std::uint64_t FindModule(const char* key) override;
    std::string GetModuleMessage(const char* key) override;
    std::uint64_t FindKernel(const char* moduleKey, const char* kernelName) override;
    const boost::shared_ptr<Halden::threads::AsyncExecutor>& GetExecutor() const override { return mExecutor; }
    void AcquireExclusiveAccess() override;
    void ReleaseExclusiveAccess() override;
    std::uint64_t GetCommandQueueHandle() const override { return mBackend->GetQueueHandle(); }
    Ostrand::Status Synchronize() override { return mBackend->Synchronize(); }
    Backend& GetBackend() override { return *mBackend; }

    /// Empties the caches for good: their frames hold this device.
    void CloseCaches();

private:
    struct Module {
        std::uint64_t handle = 0;
        std::uint64_t generation = 0;  ///< of the registry, when it was looked for
        std::string message;
        std::map<std::string, std::uint64_t, std::less<>> kernels;
    };

    Module& DemandModule(std::string_view key);
    void BuildModule(std::string_view key, Module& module);

    const DeviceFramework mFramework;
    const std::uint32_t mIndex;
    const std::uint64_t mIdentity;
    const std::shared_ptr<Backend> mBackend;
    std::atomic<std::uint64_t> mMemoryLimit;
    std::atomic<bool> mTimingEnabled{false};
    boost::shared_ptr<MemoryPool> mDevicePool;
    boost::shared_ptr<MemoryPool> mHostPool;
    boost::shared_ptr<MemoryManager> mDeviceMemory;
    boost::shared_ptr<MemoryManager> mHostMemory;
    boost::shared_ptr<DeviceCommands> mCommands;
    boost::shared_ptr<Halden::threads::AsyncExecutor> mExecutor;
    Ostrand::CriticalSection mExclusive{"Kiln::Device"};
    std::map<std::string, Module, std::less<>> mModules;  ///< under the exclusive access
};

}  // namespace Kiln
