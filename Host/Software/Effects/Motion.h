// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

#include "Host/Software/Picture.h"
#include "Kiln/BlendMode.h"
#include "Vellum/Geometry.h"

namespace Vantrel::Host::Software {

/// Where and how a layer is drawn. Means what the arguments of Kiln::Motion mean.
struct LayerDrawing {
    float positionX = 0.5F;  ///< of the target's width
    float positionY = 0.5F;
    float anchorX = 0.5F;  ///< of the layer's width
    float anchorY = 0.5F;
    float scaleX = 1.0F;
    float scaleY = 1.0F;
    float rotation = 0.0F;  ///< degrees, clockwise
    float opacity = 1.0F;
    std::int32_t blendMode = Kiln::kBlend_Normal;
    bool overDestination = false;
    Vellum::RenderQuality quality = Vellum::RenderQuality::kHigh;
    Vellum::PixelAspectRatio layerAspect;
    Vellum::PixelAspectRatio targetAspect;
};

/// Draws a layer into a target.
///
/// The road from a target pixel's centre p to a place in the layer: d = p - position; in square pixels d.x times the
/// target's aspect; turned back by the rotation; divided by the scale, across also by the layer's aspect; plus the
/// anchor. A layer that isn't turned, or by right angles, and whose border comes within 1/512 pixel of a pixel's border
/// counts as lying on it: fractions of a frame in single precision miss whole pixels by so much.
///
/// Coverage is the share of a pixel's width across the layer's border that lies inside, for both directions multiplied;
/// for a layer that isn't turned that is the exact share of the pixel. A layer whose pixels fall onto the target's is
/// copied without a filter; see Sample for the others. A layer that replaces is mixed by coverage with what it
/// replaces.
void DrawLayer(const Picture& layer, const LayerDrawing& drawing, Picture& target);

}  // namespace Vantrel::Host::Software
