// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// The language of device files: one source that compiles as OpenCL C 1.2, as CUDA C++ and, for the CPU driver, as
/// C++17. Write plain C with vector types: no templates, overloads or references, an `f` on each constant.
/// Docs/device-code.md shows the shapes of kernel.
///
/// Before it includes this header a file may say
///   #define CPU_LANES 64      for wider lanes on the CPU;
///   #define PIXEL_PER_THREAD  where its pointwise kernels do so little that in OpenCL turning pixels into lanes, which
///                             makes vector code of the others on a CPU, would cost more than it gains.

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
