// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Src/Effects/SecondaryRecord.h"
#include "Src/Filters/Effects/ParameterReader.h"
#include "Src/Kernels/KernelLaunch.h"
#include "Vantrel/RenderParams.h"

/// The selection by colour that five correctors share. What it means: Vantrel/Effects/CorrectorParameters.h.
namespace Vantrel {

static_assert(sizeof(SecondaryParameters) == 68, "the record is copied byte for byte");

/// Reads the selection from the parameters from `first` on.
/// @param aspect the frame's pixel aspect ratio; together with the scale of `params` it makes the blur round in the
///               sequence's geometry
[[nodiscard]] SecondaryParameters ReadSecondaryParameters(const ParameterReader& read, std::int32_t first, float aspect,
                                                          const RenderParams& params);

/// Does the selection leave anything out, or look different from the whole picture?
[[nodiscard]] bool HasSecondarySelection(const SecondaryParameters& record);

/// Fills a mask of one 32-bit float a pixel from the input's colours. The work is queued; the record is taken at once.
/// @return 0, kStatus_OutOfMemory, kStatus_Failure, or the status of the copy, the launch or the blur.
[[nodiscard]] Status RenderSecondaryMask(const Kiln::DeviceRef& device, DeviceValue input, std::int32_t inputRowBytes,
                                         DeviceValue mask, std::int32_t maskRowBytes, Vellum::PixelFormat inputFormat,
                                         std::int32_t width, std::int32_t height, const SecondaryParameters& record);

}  // namespace Vantrel
