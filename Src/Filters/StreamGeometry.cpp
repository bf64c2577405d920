// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/StreamGeometry.h"

#include <algorithm>
#include <limits>

namespace Vantrel {

std::int32_t ScaleLength(double length, double divisor) {
    const double scaled = length / divisor + 0.5;
    // Written so that a quotient that is no number fails it.
    if (!(scaled > -1.0 && scaled < static_cast<double>(std::numeric_limits<std::int32_t>::max()))) return 0;
    return static_cast<std::int32_t>(scaled);
}

StreamGeometry StreamGeometry::Read(const VideoMediaNode& media) {
    return {media.GetStreamFrameRect(), media.GetStreamPixelAspectRatio(), media.GetClipScaleToFramePolicy()};
}

Vellum::Point StreamGeometry::GetRenderSize(const RenderParams& params) const {
    double factorX = params.scaleX;
    double factorY = params.scaleY;
    if (scalePolicy != 0) {
        double ratioX = rect.Width() * (aspect.Value() / params.pixelAspectRatio.Value()) / params.sequenceRect.Width();
        double ratioY = static_cast<double>(rect.Height()) / params.sequenceRect.Height();
        if (scalePolicy == 1) ratioX = ratioY = std::max(ratioX, ratioY);
        if (scalePolicy == 2) ratioX = ratioY = std::min(ratioX, ratioY);
        factorX *= ratioX;
        factorY *= ratioY;
    }
    return {ScaleLength(rect.Width(), factorX), ScaleLength(rect.Height(), factorY)};
}

}  // namespace Vantrel
