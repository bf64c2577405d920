// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// The language of device files: one source that compiles as OpenCL C 1.2, as CUDA C++ and, for the CPU driver, as
/// C++17. Write plain C with vector types: no templates, overloads or references, an `f` on each constant.
/// Docs/device-code.md shows the shapes of kernel.
///
/// A file that wants wider lanes on the CPU says `#define CPU_LANES 64` before it includes this header.

#if defined(__OPENCL_VERSION__)
#include "Kiln/Device/DialectOpenCL.h"
#elif defined(__CUDA__) || defined(__CUDACC__)
#include "Kiln/Device/DialectCuda.h"
#else
#include "Kiln/Device/DialectCpu.h"
#endif

#include "Kiln/Device/DeviceMath.h"
#include "Kiln/Device/Pixels.h"
#include "Kiln/Device/Texture.h"
