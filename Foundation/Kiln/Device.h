// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>
#include <utility>
#include <vector>

#include <boost/shared_ptr.hpp>

#include "Halden/Executor.h"
#include "Halden/Strings.h"
#include "Kiln/DeviceCommands.h"
#include "Kiln/MemoryManager.h"

namespace Kiln {

enum class DeviceFramework : std::int32_t { kCuda = 0, kOpenCL = 1 };

class Backend;

/// A device of one framework, with its memory, modules and queue. Held by shared pointer; lives until Terminate and the
/// last holder are gone.
class Device {
public:
    virtual ~Device() = default;

    [[nodiscard]] virtual DeviceFramework GetFramework() const = 0;
    /// Position among the framework's devices, 0 to 3.
    [[nodiscard]] virtual std::uint32_t GetIndex() const = 0;
    /// Changes when the device's underlying context is replaced. Compared, never interpreted; never 0.
    [[nodiscard]] virtual std::uint64_t GetContextIdentity() const = 0;
    [[nodiscard]] virtual const std::string& GetName() const = 0;
    /// What the device says of itself: driver, version, whether it is a CPU. One line.
    [[nodiscard]] virtual const std::string& GetDescription() const = 0;

    /// Bytes of device memory that frames may take.
    [[nodiscard]] virtual std::uint64_t GetMemoryLimit() const = 0;
    /// Lowers or raises the limit (never above what the device has). For hosts that share a device.
    virtual void SetMemoryLimit(std::uint64_t bytes) = 0;

    /// Are timing lines wanted? Off at the start.
    [[nodiscard]] virtual bool IsTimingEnabled() const = 0;
    virtual void SetTimingEnabled(bool enabled) = 0;

    [[nodiscard]] virtual const boost::shared_ptr<DeviceCommands>& GetCommands() const = 0;
    [[nodiscard]] virtual const boost::shared_ptr<MemoryManager>& GetDeviceMemory() const = 0;
    [[nodiscard]] virtual const boost::shared_ptr<MemoryManager>& GetHostMemory() const = 0;

    /// The device module of a source path ("..\\..\\Src\\Filters\\Effects\\InvertNode"): a CUmodule or cl_program,
    /// built at first use and kept. 0 when there is none, or when it doesn't build; the reason is then traced under
    /// "Kiln.Module".
    [[nodiscard]] virtual std::uint64_t FindModule(const char* key) = 0;
    /// Why FindModule gave 0 for a key: the build log, or what else was wrong. Empty for a module that was built.
    [[nodiscard]] virtual std::string GetModuleMessage(const char* key) = 0;
    /// A kernel of one of those modules: a CUfunction or cl_kernel, which lives as long as the device; 0 when the
    /// module or the kernel isn't there. Looked up once.
    [[nodiscard]] virtual std::uint64_t FindKernel(const char* moduleKey, const char* kernelName) = 0;

    /// One thread; posted functions run in order.
    [[nodiscard]] virtual const boost::shared_ptr<Halden::threads::AsyncExecutor>& GetExecutor() const = 0;

    /// Holds off other users. Recursive on one thread. On CUDA it also makes the device's context current.
    virtual void AcquireExclusiveAccess() = 0;
    virtual void ReleaseExclusiveAccess() = 0;

    /// The native queue: a CUstream or cl_command_queue.
    [[nodiscard]] virtual std::uint64_t GetCommandQueueHandle() const = 0;
    /// Waits until the queue is empty. kStatus_Failure when something on it failed.
    virtual Ostrand::Status Synchronize() = 0;

    /// Kiln's own way to the framework.
    [[nodiscard]] virtual Backend& GetBackend() = 0;
};

using DeviceRef = boost::shared_ptr<Device>;

/// Holds a device's exclusive access for a scope. An empty device is allowed and means nothing to hold.
class ScopedDeviceAccess {
public:
    explicit ScopedDeviceAccess(DeviceRef device) : mDevice(std::move(device)) {
        if (mDevice) mDevice->AcquireExclusiveAccess();
    }
    ~ScopedDeviceAccess() {
        if (mDevice) mDevice->ReleaseExclusiveAccess();
    }
    ScopedDeviceAccess(const ScopedDeviceAccess&) = delete;
    ScopedDeviceAccess& operator=(const ScopedDeviceAccess&) = delete;

private:
    DeviceRef mDevice;
};

/// Finds the devices. Calls nest; the argument is reserved, pass true. What a framework lacks is not an error: it then
/// has no device, and GetFrameworkMessage tells why. The last Terminate waits until processor-bound work has ended.
///
/// Environment: KILN_CUDA_DRIVER (a path, "soft" or "none") and KILN_OPENCL ("none", or part of a platform's name)
/// override what is looked for.
void Initialize(bool reserved);
void Terminate();

/// The first device of a framework, empty when there is none.
[[nodiscard]] DeviceRef GetPrimaryDevice(DeviceFramework framework);
/// Device `index` of a framework, empty when there is none.
[[nodiscard]] DeviceRef GetDevice(DeviceFramework framework, std::uint32_t index);
[[nodiscard]] std::uint32_t GetDeviceCount(DeviceFramework framework);
/// Why a framework has no device, or an empty text.
[[nodiscard]] std::string GetFrameworkMessage(DeviceFramework framework);

/// The file that the name of the CUDA driver's library stands for on this machine: the real driver where it has a
/// device, else the CPU driver. Empty when neither is there or the environment says "none". Decided once per process.
[[nodiscard]] std::string GetCudaDriverPath();

/// Tells Kiln a name that the library above can render; hosts list them.
void RegisterMatchName(const Halden::WideString& name);
[[nodiscard]] std::vector<Halden::WideString> GetRegisteredMatchNames();

}  // namespace Kiln
