// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <cstdint>

#include "Kiln/Device.h"

namespace Vantrel {

/// What was looked up for one device: a kernel, or a module's global.
struct KernelSlot {
    std::uint64_t contextIdentity = 0;  ///< of the device that was asked; 0 when never used
    std::uint64_t handle = 0;           ///< a CUfunction or cl_kernel; 0 when the lookup failed
};

/// As KernelSlot; the handle is the global's device address.
using SymbolSlot = KernelSlot;

/// One kernel's slots, a place for each framework and device. Kept in the static storage of the node that owns the
/// kernel, and never cleared: what a replaced context left behind is overwritten. No lock: a slot is only touched under
/// its device's exclusive access.
struct KernelTable {
    static constexpr std::size_t kDevicesPerFramework = 4;
    std::array<KernelSlot, 2 * kDevicesPerFramework> slots;
};

/// The same for a CUDA module's global.
using SymbolTable = KernelTable;

/// The kernel of that name in the module of that key, on that device. Looked up once for each context, a failure too.
/// @return a CUfunction or cl_kernel, 0 when there is none.
[[nodiscard]] std::uint64_t GetKernel(KernelTable& table, const Kiln::DeviceRef& device, const char* moduleKey,
                                      const char* kernelName);

/// The device address of a module's global, for kernels whose CUDA form reads one in place of an argument.
/// @return 0 when there is none, and always 0 on OpenCL.
[[nodiscard]] std::uint64_t GetSymbol(SymbolTable& table, const Kiln::DeviceRef& device, const char* moduleKey,
                                      const char* symbolName);

}  // namespace Vantrel
