// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <cmath>

#include "Kiln/FrameCopies.h"
#include "Kiln/Operations/Common.h"

namespace Kiln {
namespace {

using Vellum::PixelFormat;

constexpr Kernel<PixelFormat, DeviceBuffer, std::int32_t, std::int32_t, std::int32_t, PixelFormat, DeviceBuffer,
                 std::int32_t, std::int32_t, std::int32_t, float, float, Filter, bool>
    kScale{R"(..\..\Kiln\Modules\Scale)", "ScaleKernel"};
constexpr Kernel<PixelFormat, DeviceBuffer, std::int32_t, std::int32_t, std::int32_t, PixelFormat, DeviceBuffer,
                 std::int32_t, std::int32_t>
    kConvertFloats{R"(..\..\Kiln\Modules\Convert)", "ConvertFloatsKernel"};

bool IsOpaque(PixelFormat format) { return format == kPixelFormat_GPU_BGRX_4444_16f; }

Ostrand::Status ScaleView(const DeviceFrameView& from, const DeviceFrameView& to, double scaleX, double scaleY,
                          Vellum::RenderQuality quality) {
    return kScale.Launch(from.device, TileShapeFor(to.width, to.height), to.format, to.data,
                         PitchOf(to.rowBytes, to.format), to.width, to.height, from.format, from.data,
                         PitchOf(from.rowBytes, from.format), from.width, from.height, static_cast<float>(1.0 / scaleX),
                         static_cast<float>(1.0 / scaleY), FilterFor(quality),
                         IsOpaque(from.format) && !IsOpaque(to.format));
}

}  // namespace

Ostrand::Status Scale(const DeviceRef& device, DeviceBuffer source, std::int32_t sourceRowBytes,
                      std::int32_t sourceWidth, std::int32_t sourceHeight, DeviceBuffer target,
                      std::int32_t targetRowBytes, std::int32_t targetWidth, std::int32_t targetHeight,
                      PixelFormat format, float scaleX, float scaleY, Vellum::RenderQuality quality) {
    if (!device || source == 0 || target == 0 || !IsRenderFormat(format)) return Ostrand::kStatus_Failure;
    if (sourceWidth <= 0 || sourceHeight <= 0 || targetWidth <= 0 || targetHeight <= 0) return Ostrand::kStatus_Failure;
    if (!(scaleX > 0.0F && scaleY > 0.0F && std::isfinite(scaleX) && std::isfinite(scaleY))) {
        return Ostrand::kStatus_Failure;
    }
    const DeviceFrameView from{device, source, sourceRowBytes, sourceWidth, sourceHeight, format};
    const DeviceFrameView to{device, target, targetRowBytes, targetWidth, targetHeight, format};
    return ScaleView(from, to, scaleX, scaleY, quality);
}

Status CopyFrame(const VideoFrameRef& source, const VideoFrameRef& target, Vellum::RenderQuality quality) {
    const DeviceFrameView from = ViewDeviceFrame(source);
    const DeviceFrameView to = ViewDeviceFrame(target);
    if (!from.device || from.device != to.device || !IsRenderFormat(from.format) || !IsRenderFormat(to.format)) {
        return Ostrand::kStatus_Failure;
    }
    if (from.width != to.width || from.height != to.height) {
        return ScaleView(from, to, static_cast<double>(to.width) / from.width,
                         static_cast<double>(to.height) / from.height, quality);
    }
    if (from.format == to.format) return CopyEqualFrame(source, target);
    constexpr std::int32_t kStraight = 0;
    constexpr std::int32_t kOpaque = 2;
    return kConvertFloats.Launch(from.device, ShapeFor(to.width, to.height), to.format, to.data,
                                 PitchOf(to.rowBytes, to.format), to.width, to.height, from.format, from.data,
                                 PitchOf(from.rowBytes, from.format), IsOpaque(from.format) ? kOpaque : kStraight);
}

}  // namespace Kiln
