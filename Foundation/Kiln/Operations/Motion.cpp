// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <cmath>

#include "Kiln/Operations/Common.h"
#include "Kiln/Operations/Placement.h"

namespace Kiln {
namespace {

using Vellum::PixelFormat;

constexpr const char* kModule = R"(..\..\Kiln\Modules\Motion)";

constexpr Kernel<PixelFormat, DeviceBuffer, std::int32_t, std::int32_t, std::int32_t, std::int32_t, std::int32_t,
                 DeviceBuffer, std::int32_t, std::int32_t, std::int32_t, std::int32_t, std::int32_t, float, float,
                 float, float, float, float, float, float, float, float, Filter, float, std::int32_t, bool,
                 std::int32_t, std::int32_t>
    kMotion{kModule, "MotionKernel"};
constexpr Kernel<PixelFormat, DeviceBuffer, std::int32_t, std::int32_t, std::int32_t, std::int32_t, std::int32_t,
                 DeviceBuffer, std::int32_t, std::int32_t, std::int32_t, std::int32_t, std::int32_t, float, float,
                 float, float, float, float, float, float, Filter, float, std::int32_t, bool, std::int32_t,
                 std::int32_t>
    kUprightMotion{kModule, "UprightMotionKernel"};
constexpr Kernel<PixelFormat, DeviceBuffer, std::int32_t, std::int32_t, std::int32_t, std::int32_t, std::int32_t,
                 DeviceBuffer, std::int32_t, std::int32_t, std::int32_t, float, std::int32_t, bool, std::int32_t,
                 std::int32_t>
    kPlace{kModule, "PlaceKernel"};
constexpr Kernel<PixelFormat, DeviceBuffer, std::int32_t, std::int32_t, std::int32_t, DeviceBuffer, std::int32_t, float>
    kOverlay{kModule, "OverlayKernel"};

/// One end of a drawing.
struct Side {
    DeviceBuffer buffer;
    std::int32_t pitch;
};

struct Look {
    PixelFormat format;
    float opacity;
    std::int32_t blendMode;
    bool overDestination;
    Filter filter;
};

Ostrand::Status DrawShifted(const DeviceRef& device, const Side& source, const Side& target,
                            const LayerGeometry& geometry, const Placement& placement, const Look& look) {
    const Vellum::Rect& box = placement.box;
    const std::int32_t left = geometry.target.left + box.left;
    const std::int32_t top = geometry.target.top + box.top;
    const std::int32_t sourceLeft = geometry.source.left + placement.first.x;
    const std::int32_t sourceTop = geometry.source.top + placement.first.y;
    const LaunchShape shape = ShapeFor(box.Width(), box.Height());
    const bool fromTheCorners = left == 0 && top == 0 && sourceLeft == 0 && sourceTop == 0;
    if (fromTheCorners && look.overDestination && look.blendMode == kBlend_Normal) {
        return kOverlay.Launch(device, shape, look.format, target.buffer, box.Width(), box.Height(), target.pitch,
                               source.buffer, source.pitch, look.opacity);
    }
    return kPlace.Launch(device, shape, look.format, target.buffer, target.pitch, left, top, box.Width(), box.Height(),
                         source.buffer, source.pitch, sourceLeft, sourceTop, look.opacity, look.blendMode,
                         look.overDestination, box.left, box.top);
}

Ostrand::Status DrawPlaced(const DeviceRef& device, const Side& source, const Side& target,
                           const LayerGeometry& geometry, const Placement& placement, const Look& look) {
    const Vellum::Rect& box = placement.box;
    const LayerAxis& a = placement.across;
    const LayerAxis& d = placement.down;
    const auto narrow = [](double value) { return static_cast<float>(value); };
    const Filter filter = placement.isPixelExact ? Filter::kNearest : look.filter;
    if (a.y == 0.0 && d.x == 0.0 && filter != Filter::kNearest) {
        return kUprightMotion.Launch(device, TileShapeFor(box.Width(), box.Height()), look.format, target.buffer,
                                     target.pitch, geometry.target.left + box.left, geometry.target.top + box.top,
                                     box.Width(), box.Height(), source.buffer, source.pitch, geometry.source.left,
                                     geometry.source.top, geometry.source.Width(), geometry.source.Height(),
                                     narrow(a.x), narrow(a.start), narrow(a.length), narrow(a.step), narrow(d.y),
                                     narrow(d.start), narrow(d.length), narrow(d.step), filter, look.opacity,
                                     look.blendMode, look.overDestination, box.left, box.top);
    }
    return kMotion.Launch(device, ShapeFor(box.Width(), box.Height()), look.format, target.buffer, target.pitch,
                          geometry.target.left + box.left, geometry.target.top + box.top, box.Width(), box.Height(),
                          source.buffer, source.pitch, geometry.source.left, geometry.source.top,
                          geometry.source.Width(), geometry.source.Height(), narrow(a.x), narrow(a.y), narrow(a.start),
                          narrow(a.length), narrow(a.step), narrow(d.x), narrow(d.y), narrow(d.start), narrow(d.length),
                          narrow(d.step), filter, look.opacity, look.blendMode, look.overDestination, box.left,
                          box.top);
}

bool AreFinite(std::initializer_list<float> values) {
    return std::all_of(values.begin(), values.end(), [](float value) { return std::isfinite(value); });
}

}  // namespace

Ostrand::Status Motion(const DeviceRef& device, DeviceBuffer source, std::int32_t sourceRowBytes,
                       std::int32_t sourceLeft, std::int32_t sourceTop, std::int32_t sourceWidth,
                       std::int32_t sourceHeight, std::int32_t sourceAspectNumerator,
                       std::int32_t sourceAspectDenominator, DeviceBuffer target, std::int32_t targetRowBytes,
                       std::int32_t targetLeft, std::int32_t targetTop, std::int32_t targetWidth,
                       std::int32_t targetHeight, std::int32_t targetAspectNumerator,
                       std::int32_t targetAspectDenominator, Vellum::PixelFormat format, float positionX,
                       float positionY, float anchorX, float anchorY, float scaleX, float scaleY, float rotation,
                       float opacity, std::int32_t blendMode, bool overDestination, Vellum::RenderQuality quality) {
    if (!device || source == 0 || target == 0 || !IsRenderFormat(format)) return Ostrand::kStatus_Failure;
    if (sourceWidth <= 0 || sourceHeight <= 0 || targetWidth <= 0 || targetHeight <= 0) return Ostrand::kStatus_Failure;
    if (!AreFinite({positionX, positionY, anchorX, anchorY, scaleX, scaleY, rotation, opacity})) {
        return Ostrand::kStatus_Failure;
    }
    const LayerGeometry geometry{{sourceLeft, sourceTop, sourceLeft + sourceWidth, sourceTop + sourceHeight},
                                 {sourceAspectNumerator, sourceAspectDenominator},
                                 {targetLeft, targetTop, targetLeft + targetWidth, targetTop + targetHeight},
                                 {targetAspectNumerator, targetAspectDenominator},
                                 positionX,
                                 positionY,
                                 anchorX,
                                 anchorY,
                                 scaleX,
                                 scaleY,
                                 rotation};
    const Look look{format, std::clamp(opacity, 0.0F, 1.0F), blendMode, overDestination, FilterFor(quality)};
    // Nothing is laid over: the target stays as it is.
    if (overDestination && look.opacity == 0.0F) return Ostrand::kStatus_OK;
    const std::optional<Placement> placement = PlaceLayer(geometry);
    if (!placement) return Ostrand::kStatus_OK;
    const Side from{source, PitchOf(sourceRowBytes, format)};
    const Side to{target, PitchOf(targetRowBytes, format)};
    return placement->isShift ? DrawShifted(device, from, to, geometry, *placement, look)
                              : DrawPlaced(device, from, to, geometry, *placement, look);
}

}  // namespace Kiln
