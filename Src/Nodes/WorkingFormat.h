// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Kiln/Device.h"
#include "Kiln/Frames.h"
#include "Vantrel/RenderParams.h"

namespace Vantrel {

/// The pixel format in which frames are made: 32-bit float, but 16-bit float for a draft on CUDA.
[[nodiscard]] inline Vellum::PixelFormat GetWorkingPixelFormat(const RenderParams& params, const Kiln::Device& device) {
    const bool draft = params.quality < 2 && device.GetFramework() != Kiln::DeviceFramework::kOpenCL;
    return draft ? Kiln::kPixelFormat_GPU_BGRA_4444_16f : Kiln::kPixelFormat_GPU_BGRA_4444_32f;
}

}  // namespace Vantrel
