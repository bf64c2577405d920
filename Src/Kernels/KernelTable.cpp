// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Kernels/KernelTable.h"

#include "Src/Kernels/CudaDriver.h"
#include "Src/Kernels/OpenCLLibrary.h"

namespace Vantrel {
namespace {

using Kiln::DeviceFramework;

/// The slot's handle, looked up through `find` when the device's context isn't the one that the slot knows.
template <class Find>
std::uint64_t Lookup(KernelTable& table, const Kiln::DeviceRef& device, const char* moduleKey, Find find) {
    const bool isOpenCL = device->GetFramework() != DeviceFramework::kCuda;
    const std::size_t index = (isOpenCL ? KernelTable::kDevicesPerFramework : 0) + device->GetIndex();
    KernelSlot& slot = table.slots.at(index);
    const std::uint64_t known = slot.contextIdentity;
    slot.contextIdentity = device->GetContextIdentity();
    if (known == slot.contextIdentity) return slot.handle;

    slot.handle = 0;
    const std::uint64_t module = device->FindModule(moduleKey);
    if (module != 0) slot.handle = find(isOpenCL, module);
    return slot.handle;
}

template <class Handle>
Handle ToHandle(std::uint64_t value) {
    return reinterpret_cast<Handle>(static_cast<std::uintptr_t>(value));
}

}  // namespace

std::uint64_t GetKernel(KernelTable& table, const Kiln::DeviceRef& device, const char* moduleKey,
                        const char* kernelName) {
    return Lookup(table, device, moduleKey, [kernelName](bool isOpenCL, std::uint64_t module) -> std::uint64_t {
        if (isOpenCL) {
            const OpenCLTable& openCL = GetOpenCL();
            if (!openCL.clCreateKernel) return 0;
            cl_int error = CL_SUCCESS;
            return reinterpret_cast<std::uintptr_t>(
                openCL.clCreateKernel(ToHandle<cl_program>(module), kernelName, &error));
        }
        const CudaDriverTable& driver = GetCudaDriver();
        if (!driver.cuModuleGetFunction) return 0;
        CUfunction function = nullptr;
        driver.cuModuleGetFunction(&function, ToHandle<CUmodule>(module), kernelName);
        return reinterpret_cast<std::uintptr_t>(function);
    });
}

std::uint64_t GetSymbol(SymbolTable& table, const Kiln::DeviceRef& device, const char* moduleKey,
                        const char* symbolName) {
    return Lookup(table, device, moduleKey, [symbolName](bool isOpenCL, std::uint64_t module) -> std::uint64_t {
        const CudaDriverTable& driver = GetCudaDriver();
        if (isOpenCL || !driver.cuModuleGetGlobal) return 0;
        CUdeviceptr address = 0;
        std::size_t bytes = 0;
        driver.cuModuleGetGlobal(&address, &bytes, ToHandle<CUmodule>(module), symbolName);
        return address;
    });
}

}  // namespace Vantrel
