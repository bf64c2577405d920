// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Kiln/FrameCopies.h"
#include "Kiln/Operations/Common.h"

namespace Kiln {
namespace {

using Vellum::PixelFormat;

constexpr const char* kModule = R"(..\..\Kiln\Modules\FrameRepairs)";

constexpr Kernel<PixelFormat, DeviceBuffer, std::int32_t, std::int32_t, std::int32_t, float4> kUnpremultiply{
    kModule, "UnpremultiplyKernel"};
constexpr Kernel<PixelFormat, DeviceBuffer, std::int32_t, std::int32_t, std::int32_t, std::int32_t, std::int32_t>
    kDeinterlace{kModule, "DeinterlaceKernel"};

}  // namespace

Status UnpremultiplyFrame(const VideoFrameRef& frame, std::uint32_t matteColor) {
    const DeviceFrameView view = ViewDeviceFrame(frame);
    if (!view.device || !IsRenderFormat(view.format)) return Ostrand::kStatus_Failure;
    const auto channel = [matteColor](unsigned index) {
        return static_cast<float>(matteColor >> (8 * index) & 0xFFU) / 255.0F;
    };
    return kUnpremultiply.Launch(view.device, ShapeFor(view.width, view.height), view.format, view.data, view.width,
                                 view.height, PitchOf(view.rowBytes, view.format),
                                 float4{channel(0), channel(1), channel(2), 0.0F});
}

Status DeinterlaceFrame(const VideoFrameRef& frame, std::int32_t keep) {
    const DeviceFrameView view = ViewDeviceFrame(frame);
    if (!view.device || !IsRenderFormat(view.format) || keep < 0 || keep > 1) return Ostrand::kStatus_Failure;
    const std::int32_t first = 1 - keep;
    const std::int32_t lines = (view.height - first + 1) / 2;
    // A single line has no neighbour to be made from.
    if (view.height < 2 || lines == 0) return Ostrand::kStatus_OK;
    return kDeinterlace.Launch(view.device, ShapeFor(view.width, lines), view.format, view.data,
                               PitchOf(view.rowBytes, view.format), view.width, lines, view.height, first);
}

}  // namespace Kiln
