// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

#include "Halden/Strings.h"
#include "SoftCuda/DriverApi.h"

namespace Vantrel {

/// The CUDA driver's entries by their base names. An entry that was bound under a versioned name stands under its base
/// name all the same, so callers don't know which it was. Null until bound, never cleared: the library stays loaded.
///
/// Written by LoadCudaDriver in one thread under the lock of Initialize, read without a lock after that.
struct CudaDriverTable {
// NOLINTBEGIN(bugprone-macro-parentheses): names that are declared can't stand in parentheses
#define CUDA_PROBE(name) decltype(&::name) name = nullptr;
#define CUDA_ENTRY(driver, name) decltype(&::name) name = nullptr;
#define CUDA_VERSIONED(driver, name) decltype(&::name) name = nullptr;
// NOLINTEND(bugprone-macro-parentheses)
#define CUDA_REBIND(driver, requested, name, symbol)
#include "Src/Kernels/CudaDriverEntries.h"
};

/// The process's table.
[[nodiscard]] CudaDriverTable& GetCudaDriver();

/// The two calls that binding needs of the platform.
class DriverPlatform {
public:
    virtual ~DriverPlatform() = default;
    /// A handle that stays valid until the process ends, or null.
    virtual void* LoadLibrary(const Halden::WideString& name) = 0;
    /// The entry's address, or null.
    virtual void* GetProcAddress(void* library, const char* name) = 0;
};

/// This machine's platform: the driver's name stands for the file that Kiln chose.
[[nodiscard]] DriverPlatform& GetDriverPlatform();

constexpr std::int32_t kCudaDriver_NotLoadable = 999;

/// Binds the driver. What `requestedApiVersion` (4000 is version 4.0) and the driver's own version call for must all be
/// there; the first name that is missing ends the load, with what was bound until then left bound. Messages go to
/// standard output.
/// @return 0; kCudaDriver_NotLoadable when the library or a name is missing; or the status of cuInit or
///         cuDriverGetVersion.
std::int32_t LoadCudaDriver(std::uint32_t initFlags, std::int32_t requestedApiVersion,
                            DriverPlatform& platform = GetDriverPlatform());

/// Opens the library only. @return 0 or kCudaDriver_NotLoadable, with a null handle.
std::int32_t LoadCudaLibrary(void*& library, DriverPlatform& platform = GetDriverPlatform());

}  // namespace Vantrel
