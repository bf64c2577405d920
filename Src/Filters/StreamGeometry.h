// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

#include "Src/VideoNodes/VideoMediaNode.h"
#include "Vantrel/RenderParams.h"
#include "Vellum/Geometry.h"

namespace Vantrel {

/// The shape of a clip's pictures and how they are fitted to the sequence.
struct StreamGeometry {
    Vellum::Rect rect;
    Vellum::PixelAspectRatio aspect;
    /// 0 none; 1 fit, 2 fill, others each direction by itself.
    std::int32_t scalePolicy = 0;

    [[nodiscard]] static StreamGeometry Read(const VideoMediaNode& media);

    /// The size in which a request shows the whole picture, in render pixels: the stream's size over the request's
    /// reduction, and over what the policy reduces it to meet the sequence's frame. Rounded half up; 0 where a
    /// reduction isn't positive.
    [[nodiscard]] Vellum::Point GetRenderSize(const RenderParams& params) const;
};

/// `length` / `divisor` rounded half up by truncation; 0 when that is no number of pixels.
[[nodiscard]] std::int32_t ScaleLength(double length, double divisor);

}  // namespace Vantrel
