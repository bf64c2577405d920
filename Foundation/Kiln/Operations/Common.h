// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

#include "Kiln/FrameOperations.h"
#include "Kiln/Frames.h"
#include "Kiln/KernelLaunch.h"
#include "Vellum/PixelFormat.h"

namespace Kiln {

/// Can devices render into it?
[[nodiscard]] inline bool IsRenderFormat(Vellum::PixelFormat format) {
    return format == kPixelFormat_GPU_BGRA_4444_32f || format == kPixelFormat_GPU_BGRA_4444_16f ||
           format == kPixelFormat_GPU_BGRX_4444_16f;
}

/// Row bytes as kernels take them: in pixels.
[[nodiscard]] inline std::int32_t PitchOf(std::int32_t rowBytes, Vellum::PixelFormat format) {
    return rowBytes / static_cast<std::int32_t>(Vellum::BytesPerPixel(format));
}

/// The filters of Modules/Sampling.h.
enum class Filter : std::int32_t { kNearest = 0, kBilinear = 1, kBicubic = 2 };

[[nodiscard]] inline Filter FilterFor(Vellum::RenderQuality quality) {
    if (quality < Vellum::RenderQuality::kMedium) return Filter::kNearest;
    return quality == Vellum::RenderQuality::kMedium ? Filter::kBilinear : Filter::kBicubic;
}

/// Of a kernel whose threads make TILE_LINES lines each; the number is that of Modules/Sampling.h.
[[nodiscard]] inline LaunchShape TileShapeFor(std::int32_t width, std::int32_t height) {
    constexpr std::int32_t kTileLines = 8;
    return ShapeFor(width, (height + kTileLines - 1) / kTileLines);
}

}  // namespace Kiln
