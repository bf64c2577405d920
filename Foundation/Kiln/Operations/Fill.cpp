// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Kiln/Operations/Common.h"

namespace Kiln {
namespace {

using Vellum::PixelFormat;

constexpr const char* kModule = R"(..\..\Kiln\Modules\Fill)";

constexpr Kernel<PixelFormat, DeviceBuffer, std::int32_t, std::int32_t, std::int32_t, float4> kFill{kModule,
                                                                                                    "FillKernel"};
constexpr Kernel<PixelFormat, DeviceBuffer, std::int32_t, std::int32_t, std::int32_t, std::int32_t, std::int32_t,
                 float4>
    kFillRectangle{kModule, "FillRectangleKernel"};

}  // namespace

Ostrand::Status FillWithColor(const DeviceRef& device, DeviceBuffer buffer, std::int32_t rowBytes, PixelFormat format,
                              std::int32_t left, std::int32_t top, std::int32_t width, std::int32_t height,
                              const float4& color) {
    if (!device || buffer == 0 || !IsRenderFormat(format) || left < 0 || top < 0) return Ostrand::kStatus_Failure;
    if (width <= 0 || height <= 0) return Ostrand::kStatus_OK;
    const std::int32_t pitch = PitchOf(rowBytes, format);
    const LaunchShape shape = ShapeFor(width, height);
    if (left == 0 && top == 0) return kFill.Launch(device, shape, format, buffer, width, height, pitch, color);
    return kFillRectangle.Launch(device, shape, format, buffer, pitch, left, top, width, height, color);
}

Ostrand::Status FillWithTransparentBlack(const DeviceRef& device, DeviceBuffer buffer, std::int32_t rowBytes,
                                         PixelFormat format, std::int32_t left, std::int32_t top, std::int32_t width,
                                         std::int32_t height) {
    return FillWithColor(device, buffer, rowBytes, format, left, top, width, height, {0.0F, 0.0F, 0.0F, 0.0F});
}

Ostrand::Status FillWithOpaqueBlack(const DeviceRef& device, DeviceBuffer buffer, std::int32_t rowBytes,
                                    PixelFormat format, std::int32_t left, std::int32_t top, std::int32_t width,
                                    std::int32_t height) {
    return FillWithColor(device, buffer, rowBytes, format, left, top, width, height, {0.0F, 0.0F, 0.0F, 1.0F});
}

Ostrand::Status FillWithOpaqueWhite(const DeviceRef& device, DeviceBuffer buffer, std::int32_t rowBytes,
                                    PixelFormat format, std::int32_t left, std::int32_t top, std::int32_t width,
                                    std::int32_t height) {
    return FillWithColor(device, buffer, rowBytes, format, left, top, width, height, {1.0F, 1.0F, 1.0F, 1.0F});
}

}  // namespace Kiln
