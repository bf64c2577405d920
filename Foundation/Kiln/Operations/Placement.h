// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <optional>

#include "Vellum/Geometry.h"

namespace Kiln {

/// What Motion's arguments say of geometry. Sizes in pixels, positions and anchors in fractions of them.
struct LayerGeometry {
    Vellum::Rect source;
    Vellum::PixelAspectRatio sourceAspect;
    Vellum::Rect target;
    Vellum::PixelAspectRatio targetAspect;
    float positionX = 0.5F;
    float positionY = 0.5F;
    float anchorX = 0.5F;
    float anchorY = 0.5F;
    float scaleX = 1.0F;
    float scaleY = 1.0F;
    float rotation = 0.0F;
};

/// One direction of a layer, seen from the target: a pixel centre's distance from the layer's first edge is
/// x * column + y * row + start, in pixels of the target; the opposite edge is `length` away, and a target pixel is
/// `step` of the layer's pixels.
struct LayerAxis {
    double x = 0.0;
    double y = 0.0;
    double start = 0.0;
    double length = 0.0;
    double step = 0.0;
};

/// Where a layer lies in a target.
struct Placement {
    /// The target's pixels that the layer can touch, within the target rectangle; columns and rows of the axes count
    /// from its corner.
    Vellum::Rect box;
    LayerAxis across;
    LayerAxis down;
    /// Each of the box's pixels is a pixel of the layer: nothing is to be filtered.
    bool isPixelExact = false;
    /// Pixel exact, and neither turned nor flipped. `first` is then the layer's pixel at the box's corner.
    bool isShift = false;
    Vellum::Point first;
};

/// Works out where a layer lies; empty when it touches no pixel of the target. The numbers of `geometry` are finite.
///
/// Fractions of a frame in single precision miss whole pixels by some thousandths: a layer that isn't turned, or by
/// right angles, and whose edge comes within 1/512 pixel of a pixel's border is moved onto it, so that a layer that
/// fills the frame has no soft border and a whole shift stays exact.
[[nodiscard]] std::optional<Placement> PlaceLayer(const LayerGeometry& geometry);

}  // namespace Kiln
