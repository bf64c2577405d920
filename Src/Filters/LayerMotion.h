// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

#include "Kiln/BlendMode.h"
#include "Kiln/Device.h"
#include "Kiln/Frames.h"
#include "Src/Nodes/FilterNode.h"
#include "Vellum/Geometry.h"

/// A layer's motion and opacity: read from its effects, and drawn in one go. Shared by all nodes that place pictures.
namespace Vantrel {

/// How a layer lies in the output. Filled anew for each layer and frame.
struct LayerMotion {
    float opacity = 1.0F;
    std::int32_t blendMode = Kiln::kBlend_Normal;
    /// Fractions of the output frame.
    double positionX = 0.5;
    double positionY = 0.5;
    float scaleX = 1.0F;
    float scaleY = 1.0F;
    /// Degrees.
    float rotation = 0.0F;
    /// Fractions of the layer.
    double anchorX = 0.5;
    double anchorY = 0.5;
    /// The clip's whole frame in render pixels; all 0: not known.
    Vellum::Rect sourceRect;
    /// False: the layer replaces the target; true: it is blended over it.
    bool overDestination = false;
};

/// What a motion amounts to for a given frame and output. Differences below 8e-6 count as none.
struct LayerPlacement {
    LayerPlacement(const LayerMotion& motion, const VideoFrameRef& frame, const RenderParams& params);

    /// Nothing to draw: the frame is the output already.
    [[nodiscard]] bool IsIdentity() const { return plain && !moved && !rotated && !scaled; }

    bool plain;  ///< full opacity, normal mode
    bool moved;  ///< off the centre, or of another size than the output
    bool rotated;
    bool scaled;  ///< by its factors or by another pixel aspect
    bool covers;  ///< every output pixel gets one of the layer
};

/// Fills a motion from the intrinsic effects in the chain at `node`; the caller has set overDestination. A layer with
/// nothing below it has no blend mode, and with another one than normal no opacity of its own.
/// @param uncacheMotion, uncacheOpacity  keep the effect's own node from serving a cached picture in this frame: the
///                                       caller does its work.
void ReadLayerMotion(LayerMotion& motion, FilterNode& node, const RenderParams& params, const RenderResultsRef& results,
                     bool uncacheMotion, bool uncacheOpacity);

/// Draws a layer into a frame of the output. kStatus_Failure when a frame or an interface of one is missing.
[[nodiscard]] Status DrawLayer(const Kiln::DeviceRef& device, const LayerMotion& motion, const VideoFrameRef& source,
                               const VideoFrameRef& target, Vellum::RenderQuality quality);

/// Makes a frame of the output's size and aspect in which the bottom layer can be drawn: cleared unless the layer
/// covers it. `target` is empty on failure.
[[nodiscard]] Status CreateLayerTarget(const Kiln::DeviceRef& device, Vellum::PixelFormat format,
                                       const RenderParams& params, VideoFrameRef& target);
[[nodiscard]] Status ClearUnlessCovered(const Kiln::DeviceRef& device, const LayerPlacement& placement,
                                        const VideoFrameRef& target);

/// The one-layer form of compositing: the source in a frame of the output, or the source itself when its motion changes
/// nothing. Empty on failure; a null source raises NullInterfaceException.
[[nodiscard]] VideoFrameRef TransformFrame(const Kiln::DeviceRef& device, const RenderParams& params,
                                           const LayerMotion& motion, const VideoFrameRef& source);

}  // namespace Vantrel
