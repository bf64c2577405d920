// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Src/Kernels/KernelLaunch.h"

namespace Vantrel {

/// Blurs a picture of one 32-bit float a pixel in place, by a recursive Gaussian whose cost doesn't depend on its width
/// (second order; R. Deriche, "Recursively implementing the Gaussian and its derivatives", INRIA 1993). Beyond the edge
/// the picture continues with its outermost pixels. Both sigmas, in pixels, are to be above 0, and the row bytes a
/// multiple of 16. The work is queued.
/// @return 0, kStatus_OutOfMemory, kStatus_Failure, or the status of a launch.
[[nodiscard]] Status SingleChannelBlur(const Kiln::DeviceRef& device, DeviceValue buffer, std::int32_t rowBytes,
                                       std::int32_t width, std::int32_t height, float sigmaX, float sigmaY);

}  // namespace Vantrel
