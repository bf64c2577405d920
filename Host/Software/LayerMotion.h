// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

#include "Host/Snapshot/Node.h"
#include "Host/Software/LayerPicture.h"
#include "Kiln/BlendMode.h"

namespace Vantrel::Host::Software {

/// Where and how a layer stands in its frame.
struct LayerMotion {
    float opacity = 1.0F;
    std::int32_t blendMode = Kiln::kBlend_Normal;
    /// Fractions of the frame, and of the layer.
    double positionX = 0.5;
    double positionY = 0.5;
    double anchorX = 0.5;
    double anchorY = 0.5;
    float scaleX = 1.0F;
    float scaleY = 1.0F;
    /// Degrees, clockwise.
    float rotation = 0.0F;
    /// False: the layer replaces what lies below.
    bool overDestination = false;
};

/// Reads a clip's motion and opacity from its operators before `endOperator`. A layer that lies over nothing has no
/// blend mode, and with another one than normal no opacity either.
[[nodiscard]] LayerMotion ReadClipMotion(const Node& clip, std::int64_t parameterTime, bool overDestination,
                                         std::size_t endOperator);

/// The same for a layer of any kind at its own time. What isn't a clip has none, but for a transition between clips
/// with a blend mode: that waits for the compositor.
[[nodiscard]] LayerMotion ReadLayerMotion(const Node& layer, std::int64_t nodeTime, bool overDestination);

/// Is an operator part of a layer's motion rather than a picture's effect?
[[nodiscard]] bool IsIntrinsic(const Node& effect);

/// Draws a layer onto a picture of the view's size.
void DrawLayer(const LayerPicture& layer, const LayerMotion& motion, const View& view, Picture& target);

/// The layer on a frame of its own, of the view's size; one that fills it already and isn't moved comes back unchanged.
[[nodiscard]] LayerPicture PlaceLayer(LayerPicture layer, const LayerMotion& motion, const View& view);

}  // namespace Vantrel::Host::Software
