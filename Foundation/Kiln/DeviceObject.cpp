// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Kiln/DeviceObject.h"

#include <algorithm>
#include <utility>

#include <boost/make_shared.hpp>

#include "Kiln/Commands.h"
#include "Kiln/KernelLaunch.h"
#include "Kiln/Log.h"
#include "Kiln/ModuleRegistry.h"
#include "Kiln/Pages.h"

namespace Kiln {
namespace {

constexpr const char* kModuleCategory = "Kiln.Module";

std::uint64_t TakeIdentity() {
    static std::atomic<std::uint64_t> next{1};
    return next++;
}

// Pinned memory is taken from everybody else on the machine.
std::uint64_t GetHostLimit() { return GetMachineMemory() / 4; }

std::string GetExecutorName(DeviceFramework framework, std::uint32_t index) {
    return (framework == DeviceFramework::kCuda ? "Kiln CUDA " : "Kiln OpenCL ") + std::to_string(index);
}

}  // namespace

DeviceObject::DeviceObject(DeviceFramework framework, std::uint32_t index, std::shared_ptr<Backend> backend)
    : mFramework(framework),
      mIndex(index),
      mIdentity(TakeIdentity()),
      mBackend(std::move(backend)),
      mMemoryLimit(mBackend->GetFacts().memoryBytes),
      mDevicePool(boost::make_shared<MemoryPool>(mBackend, MemoryPool::Kind::kDevice, mMemoryLimit.load())),
      mHostPool(boost::make_shared<MemoryPool>(mBackend, MemoryPool::Kind::kHost, GetHostLimit())),
      mDeviceMemory(mDevicePool),
      mHostMemory(mHostPool),
      mCommands(boost::make_shared<Commands>(mBackend, mHostMemory)),
      mExecutor(Halden::threads::CreateThreadExecutor(GetExecutorName(framework, index))) {}

DeviceObject::~DeviceObject() {
    CloseCaches();
    mBackend->Synchronize();
    for (const auto& [key, module] : mModules) {
        for (const auto& [name, kernel] : module.kernels) {
            if (kernel != 0) mBackend->ReleaseKernel(kernel);
        }
        if (module.handle != 0) mBackend->UnloadModule(module.handle);
    }
}

void DeviceObject::SetMemoryLimit(std::uint64_t bytes) {
    mMemoryLimit = std::min(bytes, mBackend->GetFacts().memoryBytes);
    mDevicePool->SetLimit(mMemoryLimit);
}

void DeviceObject::CloseCaches() {
    mDevicePool->CloseCache();
    mHostPool->CloseCache();
}

void DeviceObject::AcquireExclusiveAccess() {
    mExclusive.Enter("Kiln::Device::AcquireExclusiveAccess");
    mBackend->Enter();
}

void DeviceObject::ReleaseExclusiveAccess() {
    mBackend->Leave();
    mExclusive.Leave();
}

std::uint64_t DeviceObject::FindModule(const char* key) { return DemandModule(key).handle; }

std::string DeviceObject::GetModuleMessage(const char* key) { return DemandModule(key).message; }

std::uint64_t DeviceObject::FindKernel(const char* moduleKey, const char* kernelName) {
    Module& module = DemandModule(moduleKey);
    if (module.handle == 0) return 0;
    const auto found = module.kernels.find(std::string_view(kernelName));
    if (found != module.kernels.end()) return found->second;
    const std::uint64_t kernel = mBackend->GetKernel(module.handle, kernelName);
    if (kernel == 0) {
        Log(kModuleCategory, std::string("module \"") + moduleKey + "\" has no kernel \"" + kernelName + "\"");
    }
    module.kernels.emplace(kernelName, kernel);
    return kernel;
}

DeviceObject::Module& DeviceObject::DemandModule(std::string_view key) {
    auto found = mModules.find(key);
    if (found == mModules.end()) found = mModules.emplace(key, Module()).first;
    Module& module = found->second;
    if (module.handle == 0 && module.generation != GetModuleGeneration()) BuildModule(key, module);
    return module;
}

void DeviceObject::BuildModule(std::string_view key, Module& module) {
    module.generation = GetModuleGeneration();
    module.message.clear();
    if (const ModuleImage* image = FindModuleImage(key)) {
        module.handle = mBackend->LoadModule(*image, module.message);
    } else {
        module.message = "no library has brought a module of that key";
    }
    if (module.handle == 0) Log(kModuleCategory, "\"" + std::string(key) + "\": " + module.message);
}

Ostrand::Status LaunchKernel(const DeviceRef& device, const char* moduleKey, const char* kernelName,
                             const LaunchShape& shape, const KernelArguments& arguments) {
    if (!device || arguments.IsOverfull()) return Ostrand::kStatus_Failure;
    if (shape.gridX <= 0 || shape.gridY <= 0) return Ostrand::kStatus_OK;
    const ScopedDeviceAccess access(device);
    const std::uint64_t kernel = device->FindKernel(moduleKey, kernelName);
    if (kernel == 0) return Ostrand::kStatus_Failure;
    const Ostrand::Status status = device->GetBackend().SetArguments(kernel, arguments);
    return Ostrand::Failed(status) ? status : device->GetBackend().Launch(kernel, shape);
}

}  // namespace Kiln
