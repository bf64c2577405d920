// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
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

}  // namespace Kiln
