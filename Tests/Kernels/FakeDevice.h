// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <stdexcept>
#include <string>
#include <vector>

#include <boost/make_shared.hpp>

#include "Kiln/Device.h"

namespace Vantrel::Testing {

/// Notes launches and answers with a scripted status.
class FakeCommands final : public Kiln::DeviceCommands {
public:
    struct Call {
        std::uint64_t kernel;
        std::int32_t gridX, gridY, blockX, blockY;
        std::uint64_t reserved;
    };
    Kiln::TimingMarkRef CreateMark() override { return {}; }
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
};

/// A device of either framework that has modules by name only.
class FakeDevice final : public Kiln::Device {
public:
    FakeDevice(Kiln::DeviceFramework framework, std::uint32_t index) : mFramework(framework), mIndex(index) {}

    Kiln::DeviceFramework GetFramework() const override { return mFramework; }
    std::uint32_t GetIndex() const override { return mIndex; }
    std::uint64_t GetContextIdentity() const override { return identity; }
    const std::string& GetName() const override { return mName; }
    const std::string& GetDescription() const override { return mName; }
    std::uint64_t GetMemoryLimit() const override { return 0; }
    void SetMemoryLimit(std::uint64_t) override {}
    bool IsTimingEnabled() const override { return false; }
    void SetTimingEnabled(bool) override {}
    const boost::shared_ptr<Kiln::DeviceCommands>& GetCommands() const override { return mCommandsBase; }
    const boost::shared_ptr<Kiln::MemoryManager>& GetDeviceMemory() const override { return mMemory; }
    const boost::shared_ptr<Kiln::MemoryManager>& GetHostMemory() const override { return mMemory; }
    std::uint64_t FindModule(const char* key) override {
        asked.emplace_back(key);
        return module;
    }
    std::string GetModuleMessage(const char*) override { return {}; }
    std::uint64_t FindKernel(const char*, const char*) override { return 0; }
    const boost::shared_ptr<Halden::threads::AsyncExecutor>& GetExecutor() const override { return mExecutor; }
    void AcquireExclusiveAccess() override {}
    void ReleaseExclusiveAccess() override {}
    std::uint64_t GetCommandQueueHandle() const override { return 0; }
    Ostrand::Status Synchronize() override { return Ostrand::kStatus_OK; }
    Kiln::Backend& GetBackend() override { throw std::logic_error("this device has no backend"); }

    FakeCommands& Commands() { return *mCommands; }

    std::uint64_t identity = 1;
    std::uint64_t module = 100;
    std::vector<std::string> asked;

private:
    Kiln::DeviceFramework mFramework;
    std::uint32_t mIndex;
    std::string mName = "fake";
    boost::shared_ptr<FakeCommands> mCommands = boost::make_shared<FakeCommands>();
    boost::shared_ptr<Kiln::DeviceCommands> mCommandsBase = mCommands;
    boost::shared_ptr<Kiln::MemoryManager> mMemory;
    boost::shared_ptr<Halden::threads::AsyncExecutor> mExecutor;
};

}  // namespace Vantrel::Testing
