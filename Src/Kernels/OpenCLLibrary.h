// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#ifndef CL_TARGET_OPENCL_VERSION
#define CL_TARGET_OPENCL_VERSION 120
#endif
#include <CL/cl.h>

namespace Vantrel {

/// The OpenCL entries that the engine itself calls, from the machine's loader library.
struct OpenCLTable {
    decltype(&::clCreateKernel) clCreateKernel = nullptr;
    decltype(&::clSetKernelArg) clSetKernelArg = nullptr;
    decltype(&::clFinish) clFinish = nullptr;
};

/// The process's table, bound at the first call; its entries are null on a machine without OpenCL. Any thread.
[[nodiscard]] OpenCLTable& GetOpenCL();

}  // namespace Vantrel
