// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Kiln/BlendMode.h"
#include "Kiln/Device.h"
#include "Vellum/Geometry.h"
#include "Vellum/PixelFormat.h"

/// Operations on device buffers. A buffer is a device value and its row bytes. All of them queue work and return; a
/// negative status means that nothing was queued. Called under the device's exclusive access.
namespace Kiln {

using DeviceBuffer = std::uint64_t;

/// Blue, green, red, alpha.
struct float4 {
    float x = 0.0F;
    float y = 0.0F;
    float z = 0.0F;
    float w = 0.0F;

    friend constexpr bool operator==(const float4& a, const float4& b) {
        return a.x == b.x && a.y == b.y && a.z == b.z && a.w == b.w;
    }
};
static_assert(sizeof(float4) == 16);

/// Fills a rectangle of a buffer (left, top, width, height in pixels).
Ostrand::Status FillWithColor(const DeviceRef& device, DeviceBuffer buffer, std::int32_t rowBytes,
                              Vellum::PixelFormat format, std::int32_t left, std::int32_t top, std::int32_t width,
                              std::int32_t height, const float4& color);
Ostrand::Status FillWithTransparentBlack(const DeviceRef& device, DeviceBuffer buffer, std::int32_t rowBytes,
                                         Vellum::PixelFormat format, std::int32_t left, std::int32_t top,
                                         std::int32_t width, std::int32_t height);
Ostrand::Status FillWithOpaqueBlack(const DeviceRef& device, DeviceBuffer buffer, std::int32_t rowBytes,
                                    Vellum::PixelFormat format, std::int32_t left, std::int32_t top, std::int32_t width,
                                    std::int32_t height);
Ostrand::Status FillWithOpaqueWhite(const DeviceRef& device, DeviceBuffer buffer, std::int32_t rowBytes,
                                    Vellum::PixelFormat format, std::int32_t left, std::int32_t top, std::int32_t width,
                                    std::int32_t height);

/// Resamples all of the source onto all of the target, upper left corners together. `scaleX` and `scaleY` are target
/// size over source size, positive; they may differ from the quotient of the whole sizes by the fraction that rounding
/// to pixels took away. Beyond its border the source's pixels go on. Colour is weighed by alpha. The filter by quality:
/// the nearest pixel; bilinear; Catmull-Rom's cubic. The last two are widened where they reduce, so that every source
/// pixel counts.
Ostrand::Status Scale(const DeviceRef& device, DeviceBuffer source, std::int32_t sourceRowBytes,
                      std::int32_t sourceWidth, std::int32_t sourceHeight, DeviceBuffer target,
                      std::int32_t targetRowBytes, std::int32_t targetWidth, std::int32_t targetHeight,
                      Vellum::PixelFormat format, float scaleX, float scaleY, Vellum::RenderQuality quality);

/// Draws a layer: moves, scales and turns `source` into `target`.
///
/// The layer's anchor (fractions of the source) comes to lie on the position (fractions of the target). Around it the
/// layer is scaled (factors; the source's pixel aspect over the target's is applied besides) and then turned clockwise
/// by `rotation` degrees in square-pixel space. Pixels outside the source are transparent; edges are exact to a
/// fraction of a pixel by coverage; colour is weighed by alpha. Filters are those of Scale. A layer whose pixels fall
/// onto the target's (moved by whole pixels, turned by right angles, flipped) is drawn without a filter, to the bit;
/// within 1/512 pixel of that counts, since fractions of a frame in single precision come no closer.
///
/// A scale of 0, or a place outside the target, draws nothing and is no failure; a number that isn't finite is one.
/// @param sourceAspectNumerator,targetAspectNumerator pixel aspects; one that isn't positive counts as square.
/// @param opacity          0.0 to 1.0, clamped; multiplies the layer's alpha.
/// @param blendMode        an IR_BlendMode; unknown numbers draw as kBlend_Normal. Docs/blend-modes.md has the
/// formulas.
/// @param overDestination  false: the layer replaces the target where its box lies, mixed by coverage at its edges; the
///                         rest of the target stays, and the blend mode has no part in it. true: it is blended over
///                         the target, which stays to the bit where the layer is transparent.
Ostrand::Status Motion(const DeviceRef& device, DeviceBuffer source, std::int32_t sourceRowBytes,
                       std::int32_t sourceLeft, std::int32_t sourceTop, std::int32_t sourceWidth,
                       std::int32_t sourceHeight, std::int32_t sourceAspectNumerator,
                       std::int32_t sourceAspectDenominator, DeviceBuffer target, std::int32_t targetRowBytes,
                       std::int32_t targetLeft, std::int32_t targetTop, std::int32_t targetWidth,
                       std::int32_t targetHeight, std::int32_t targetAspectNumerator,
                       std::int32_t targetAspectDenominator, Vellum::PixelFormat format, float positionX,
                       float positionY, float anchorX, float anchorY, float scaleX, float scaleY, float rotation,
                       float opacity, std::int32_t blendMode, bool overDestination, Vellum::RenderQuality quality);

/// Which lines of the target Accumulate fills; the others stay.
enum AccumulateMode : std::int32_t { kAccumulate_Frame = 0, kAccumulate_UpperField = 1, kAccumulate_LowerField = 2 };

/// Sums `count` pictures by weight into the target; colour is weighed by alpha. All of them have the target's size,
/// format and row bytes. The weights are expected to sum to 1.
/// @param mode an AccumulateMode; the upper field has the lines 0, 2, ...
Ostrand::Status Accumulate(const DeviceRef& device, const DeviceBuffer* sources, const float* weights,
                           std::int32_t count, DeviceBuffer target, std::int32_t rowBytes, std::int32_t width,
                           Vellum::PixelFormat format, std::int32_t height, std::int32_t mode);

enum IR_BlurDirection : std::int32_t { kBlur_Horizontal = 1, kBlur_Vertical = 2, kBlur_Both = 3 };

/// Blurs by a Gaussian of the given standard deviations, in pixels; colour is weighed by alpha, so that transparent
/// pixels bleed none. The source lies in the middle of the target, which is larger by twice what it grows. Within 1/512
/// of the range of the true Gaussian at any width from 0.3 on, at a cost that hardly depends on it.
/// @param keepSize  true: outside the source its edge pixels go on; false: nothing lies there.
/// @param direction an IR_BlurDirection; a direction that isn't named, or whose sigma isn't above 0, isn't blurred.
Ostrand::Status GaussianBlur(const DeviceRef& device, DeviceBuffer source, std::int32_t sourceRowBytes,
                             std::int32_t sourceWidth, std::int32_t sourceHeight, DeviceBuffer target,
                             std::int32_t targetRowBytes, std::int32_t targetWidth, std::int32_t targetHeight,
                             Vellum::PixelFormat format, float sigmaX, float sigmaY, bool keepSize,
                             std::int32_t direction);

/// Mixes two pictures of the target's size and format. With f the fraction:
///
///     a = f a1 + (1 - f) a2,   c = (f a1 c1 + (1 - f) a2 c2) / a
///
/// so that colour counts by what it covers; where nothing is covered the result is transparent black. At fraction 0.0
/// the result is the second picture, at 1.0 the first, to the bit. The fraction isn't clamped. The target may be one of
/// the sources.
/// @param film mixes light rather than display values: c stands for |c|^2.2 with the sign of c, mixed and taken back.
///             2.2 is the transfer gradient that 47 CFR 73.682 (a) (20) assumes of displays.
Ostrand::Status CrossDissolve(const DeviceRef& device, DeviceBuffer first, std::int32_t firstRowBytes,
                              DeviceBuffer second, std::int32_t secondRowBytes, DeviceBuffer target,
                              std::int32_t targetRowBytes, Vellum::PixelFormat targetFormat, std::int32_t targetWidth,
                              std::int32_t targetHeight, float fraction, bool film);

/// Copies a rectangle of one buffer to a place in another of the same format. An extent of 0 or below copies nothing
/// and is no failure; a place before a buffer's beginning or beyond its rows is one. That the rectangle ends within the
/// last row is the caller's care, and so is that the buffers are two.
Ostrand::Status DeviceCopyRect(const DeviceRef& device, DeviceBuffer source, std::int32_t sourceRowBytes,
                               DeviceBuffer target, std::int32_t targetRowBytes, Vellum::PixelFormat format,
                               std::int32_t sourceLeft, std::int32_t sourceTop, std::int32_t targetLeft,
                               std::int32_t targetTop, std::int32_t width, std::int32_t height);

/// Copies a picture with the lines of its two fields exchanged, pair by pair; an odd last line stays in its place.
Ostrand::Status FieldReverse(const DeviceRef& device, DeviceBuffer source, std::int32_t sourceRowBytes,
                             DeviceBuffer target, std::int32_t targetRowBytes, Vellum::PixelFormat format,
                             std::int32_t width, std::int32_t height);

}  // namespace Kiln
