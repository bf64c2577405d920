// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#define CL_TARGET_OPENCL_VERSION 120
#include <CL/cl.h>

#include <memory>
#include <string>

#include "Ostrand/Status.h"

// The loader's entries that Kiln calls. Used twice: to declare and to load.
#define KILN_OPENCL_ENTRIES(ENTRY)          \
    ENTRY(clGetPlatformIDs)                 \
    ENTRY(clGetPlatformInfo)                \
    ENTRY(clGetDeviceIDs)                   \
    ENTRY(clGetDeviceInfo)                  \
    ENTRY(clCreateContext)                  \
    ENTRY(clReleaseContext)                 \
    ENTRY(clCreateCommandQueue)             \
    ENTRY(clReleaseCommandQueue)            \
    ENTRY(clCreateBuffer)                   \
    ENTRY(clReleaseMemObject)               \
    ENTRY(clSetMemObjectDestructorCallback) \
    ENTRY(clEnqueueMapBuffer)               \
    ENTRY(clEnqueueUnmapMemObject)          \
    ENTRY(clEnqueueWriteBuffer)             \
    ENTRY(clEnqueueReadBuffer)              \
    ENTRY(clEnqueueReadBufferRect)          \
    ENTRY(clEnqueueCopyBuffer)              \
    ENTRY(clEnqueueCopyBufferRect)          \
    ENTRY(clEnqueueFillBuffer)              \
    ENTRY(clCreateProgramWithSource)        \
    ENTRY(clCreateProgramWithBinary)        \
    ENTRY(clBuildProgram)                   \
    ENTRY(clGetProgramInfo)                 \
    ENTRY(clGetProgramBuildInfo)            \
    ENTRY(clReleaseProgram)                 \
    ENTRY(clCreateKernel)                   \
    ENTRY(clReleaseKernel)                  \
    ENTRY(clSetKernelArg)                   \
    ENTRY(clEnqueueNDRangeKernel)           \
    ENTRY(clEnqueueMarkerWithWaitList)      \
    ENTRY(clGetEventInfo)                   \
    ENTRY(clGetEventProfilingInfo)          \
    ENTRY(clWaitForEvents)                  \
    ENTRY(clReleaseEvent)                   \
    ENTRY(clFlush)                          \
    ENTRY(clFinish)

namespace Kiln::OpenCL {

/// The loader's entries, bound by name. The library is never unloaded: platforms keep threads of their own.
struct Driver {
// The argument is a name to declare, which parentheses would spoil. NOLINTNEXTLINE(bugprone-macro-parentheses)
#define KILN_DECLARE_ENTRY(name) decltype(&::name) name = nullptr;
    KILN_OPENCL_ENTRIES(KILN_DECLARE_ENTRY)
#undef KILN_DECLARE_ENTRY

    [[nodiscard]] std::string GetPlatformText(cl_platform_id platform, cl_platform_info what) const;
    [[nodiscard]] std::string GetDeviceText(cl_device_id device, cl_device_info what) const;
    template <class T>
    [[nodiscard]] T GetDeviceValue(cl_device_id device, cl_device_info what) const {
        T value = {};
        clGetDeviceInfo(device, what, sizeof value, &value, nullptr);
        return value;
    }
};

/// Opens the OpenCL loader. Empty, with a reason, when it can't be used.
[[nodiscard]] std::shared_ptr<const Driver> LoadDriver(std::string& message);

/// What stands for memory becomes kStatus_OutOfMemory, any other failure kStatus_Failure.
[[nodiscard]] constexpr Ostrand::Status ToStatus(cl_int result) {
    if (result == CL_SUCCESS) return Ostrand::kStatus_OK;
    const bool isMemory =
        result == CL_MEM_OBJECT_ALLOCATION_FAILURE || result == CL_OUT_OF_RESOURCES || result == CL_OUT_OF_HOST_MEMORY;
    return isMemory ? Ostrand::kStatus_OutOfMemory : Ostrand::kStatus_Failure;
}

}  // namespace Kiln::OpenCL
