// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <algorithm>

#include "Kiln/FrameCopies.h"
#include "Kiln/Operations/Common.h"

namespace Kiln {
namespace {

using Vellum::PixelFormat;

/// Where a rectangle begins in a buffer; false when its rows don't hold it.
bool FindRows(RowLayout& layout, std::int32_t rowBytes, std::uint64_t pixelBytes, std::int32_t left, std::int32_t top,
              std::int32_t width) {
    if (left < 0 || top < 0 || rowBytes <= 0) return false;
    const std::uint64_t leftBytes = pixelBytes * static_cast<std::uint64_t>(left);
    layout.rowBytes = static_cast<std::uint64_t>(rowBytes);
    layout.offset = layout.rowBytes * static_cast<std::uint64_t>(top) + leftBytes;
    return leftBytes + pixelBytes * static_cast<std::uint64_t>(width) <= layout.rowBytes;
}

Vellum::Rect Within(const Vellum::Rect& rect, std::int32_t width, std::int32_t height) {
    return {std::max(rect.left, 0), std::max(rect.top, 0), std::min(rect.right, width), std::min(rect.bottom, height)};
}

Vellum::Rect Moved(const Vellum::Rect& rect, std::int32_t x, std::int32_t y) {
    return {rect.left + x, rect.top + y, rect.right + x, rect.bottom + y};
}

}  // namespace

Status DeviceCopyRect(const DeviceRef& device, DeviceBuffer source, std::int32_t sourceRowBytes, DeviceBuffer target,
                      std::int32_t targetRowBytes, PixelFormat format, std::int32_t sourceLeft, std::int32_t sourceTop,
                      std::int32_t targetLeft, std::int32_t targetTop, std::int32_t width, std::int32_t height) {
    if (!device || source == 0 || target == 0 || Vellum::BytesPerPixel(format) == 0) return Ostrand::kStatus_Failure;
    if (width <= 0 || height <= 0) return Ostrand::kStatus_OK;
    const std::uint64_t pixelBytes = Vellum::BytesPerPixel(format);
    RowLayout from;
    RowLayout to;
    if (!FindRows(from, sourceRowBytes, pixelBytes, sourceLeft, sourceTop, width) ||
        !FindRows(to, targetRowBytes, pixelBytes, targetLeft, targetTop, width)) {
        return Ostrand::kStatus_Failure;
    }
    return device->GetBackend().CopyRows(target, to, source, from, pixelBytes * static_cast<std::uint64_t>(width),
                                         static_cast<std::uint64_t>(height));
}

Status CopyFrameRect(const VideoFrameRef& source, const Vellum::Rect& sourceRect, const VideoFrameRef& target,
                     const Vellum::Rect& targetRect, Vellum::RenderQuality quality) {
    const DeviceFrameView from = ViewDeviceFrame(source);
    const DeviceFrameView to = ViewDeviceFrame(target);
    if (!from.device || from.device != to.device || from.format != to.format) return Ostrand::kStatus_Failure;
    Vellum::Rect in = Within(sourceRect, from.width, from.height);
    if (sourceRect.Width() == targetRect.Width() && sourceRect.Height() == targetRect.Height()) {
        const std::int32_t x = targetRect.left - sourceRect.left, y = targetRect.top - sourceRect.top;
        const Vellum::Rect out = Within(Moved(in, x, y), to.width, to.height);
        in = Moved(out, -x, -y);
        return DeviceCopyRect(from.device, from.data, from.rowBytes, to.data, to.rowBytes, to.format, in.left, in.top,
                              out.left, out.top, out.Width(), out.Height());
    }
    const Vellum::Rect out = Within(targetRect, to.width, to.height);
    if (in.Width() <= 0 || in.Height() <= 0 || out.Width() <= 0 || out.Height() <= 0) return Ostrand::kStatus_OK;
    const auto scaleX = static_cast<float>(static_cast<double>(out.Width()) / in.Width());
    const auto scaleY = static_cast<float>(static_cast<double>(out.Height()) / in.Height());
    return Motion(from.device, from.data, from.rowBytes, in.left, in.top, in.Width(), in.Height(), 1, 1, to.data,
                  to.rowBytes, out.left, out.top, out.Width(), out.Height(), 1, 1, to.format, 0.5F, 0.5F, 0.5F, 0.5F,
                  scaleX, scaleY, 0.0F, 1.0F, kBlend_Normal, false, quality);
}

}  // namespace Kiln
