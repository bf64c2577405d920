// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>
#include <string>

#include "Ostrand/Status.h"
#include "SoftCuda/DriverApi.h"

// The driver's entries that Kiln calls, each with the symbol that is bound to it. Used twice: to declare and to load.
#define KILN_CUDA_ENTRIES(ENTRY)                        \
    ENTRY(cuInit, "cuInit")                             \
    ENTRY(cuDriverGetVersion, "cuDriverGetVersion")     \
    ENTRY(cuGetErrorString, "cuGetErrorString")         \
    ENTRY(cuDeviceGet, "cuDeviceGet")                   \
    ENTRY(cuDeviceGetCount, "cuDeviceGetCount")         \
    ENTRY(cuDeviceGetName, "cuDeviceGetName")           \
    ENTRY(cuDeviceGetAttribute, "cuDeviceGetAttribute") \
    ENTRY(cuDeviceTotalMem, "cuDeviceTotalMem_v2")      \
    ENTRY(cuCtxCreate, "cuCtxCreate_v2")                \
    ENTRY(cuCtxDestroy, "cuCtxDestroy_v2")              \
    ENTRY(cuCtxPushCurrent, "cuCtxPushCurrent_v2")      \
    ENTRY(cuCtxPopCurrent, "cuCtxPopCurrent_v2")        \
    ENTRY(cuModuleLoadData, "cuModuleLoadData")         \
    ENTRY(cuModuleUnload, "cuModuleUnload")             \
    ENTRY(cuModuleGetFunction, "cuModuleGetFunction")   \
    ENTRY(cuMemAlloc, "cuMemAlloc_v2")                  \
    ENTRY(cuMemFree, "cuMemFree_v2")                    \
    ENTRY(cuMemHostAlloc, "cuMemHostAlloc")             \
    ENTRY(cuMemFreeHost, "cuMemFreeHost")               \
    ENTRY(cuMemcpyHtoDAsync, "cuMemcpyHtoDAsync_v2")    \
    ENTRY(cuMemcpyDtoDAsync, "cuMemcpyDtoDAsync_v2")    \
    ENTRY(cuMemcpy2DAsync, "cuMemcpy2DAsync_v2")        \
    ENTRY(cuMemsetD32Async, "cuMemsetD32Async")         \
    ENTRY(cuFuncSetBlockShape, "cuFuncSetBlockShape")   \
    ENTRY(cuParamSetv, "cuParamSetv")                   \
    ENTRY(cuParamSetSize, "cuParamSetSize")             \
    ENTRY(cuLaunchGridAsync, "cuLaunchGridAsync")       \
    ENTRY(cuStreamCreate, "cuStreamCreate")             \
    ENTRY(cuStreamDestroy, "cuStreamDestroy_v2")        \
    ENTRY(cuStreamSynchronize, "cuStreamSynchronize")   \
    ENTRY(cuEventCreate, "cuEventCreate")               \
    ENTRY(cuEventDestroy, "cuEventDestroy_v2")          \
    ENTRY(cuEventRecord, "cuEventRecord")               \
    ENTRY(cuEventQuery, "cuEventQuery")                 \
    ENTRY(cuEventSynchronize, "cuEventSynchronize")     \
    ENTRY(cuEventElapsedTime, "cuEventElapsedTime")

namespace Kiln::Cuda {

/// The driver's entries, bound by name. The library is never unloaded: drivers keep threads of their own.
struct Driver {
// The argument is a name to declare, which parentheses would spoil. NOLINTNEXTLINE(bugprone-macro-parentheses)
#define KILN_DECLARE_ENTRY(name, symbol) decltype(&::name) name = nullptr;
    KILN_CUDA_ENTRIES(KILN_DECLARE_ENTRY)
#undef KILN_DECLARE_ENTRY

    std::string path;
    /// The library is the CPU driver, which loads CPU images.
    bool isCPUDriver = false;

    [[nodiscard]] std::string Describe(CUresult result) const;
};

/// Opens a driver and initialises it. Empty, with a reason, when it can't be used.
[[nodiscard]] std::shared_ptr<const Driver> LoadDriver(const std::string& path, std::string& message);

/// Out of memory becomes kStatus_OutOfMemory, any other failure kStatus_Failure.
[[nodiscard]] constexpr Ostrand::Status ToStatus(CUresult result) {
    if (result == CUDA_SUCCESS) return Ostrand::kStatus_OK;
    return result == CUDA_ERROR_OUT_OF_MEMORY ? Ostrand::kStatus_OutOfMemory : Ostrand::kStatus_Failure;
}

}  // namespace Kiln::Cuda
