// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Kiln/FrameCopies.h"
#include "Kiln/FrameObject.h"
#include "Kiln/Operations/Common.h"
#include "Kiln/Scratch.h"

namespace Kiln {
namespace {

constexpr Kernel<DeviceBuffer, std::int32_t, Vellum::PixelFormat, DeviceBuffer, std::int32_t, std::int32_t,
                 std::int32_t, bool>
    kPackBytes{R"(..\..\Kiln\Modules\ReadBack)", "PackBytesKernel"};

Status ReadRows(const FrameAttributes& to, std::uint8_t* target, const DeviceFrameView& from) {
    const std::uint64_t widthBytes = static_cast<std::uint64_t>(to.width) * Vellum::BytesPerPixel(to.format);
    return from.device->GetBackend().CopyRowsToHost(target, static_cast<std::uint64_t>(to.rowBytes), from.data,
                                                    {0, static_cast<std::uint64_t>(from.rowBytes)}, widthBytes,
                                                    static_cast<std::uint64_t>(to.height));
}

// Converted on the device, so that a quarter of the bytes has to be fetched.
Status ReadBytes(const FrameAttributes& to, std::uint8_t* target, const DeviceFrameView& from) {
    const DeviceScratchBuffer packed(from.device, to.GetBytes());
    if (packed.GetHandle() == 0) return Ostrand::kStatus_OutOfMemory;
    const Status status =
        kPackBytes.Launch(from.device, ShapeFor(to.width, to.height), packed.GetHandle(),
                          PitchOf(to.rowBytes, to.format), from.format, from.data, PitchOf(from.rowBytes, from.format),
                          from.width, from.height, (from.format.GetUpper() & Vellum::PixelFormatBits::kAlpha) == 0);
    if (Ostrand::Failed(status)) return status;
    DeviceFrameView view = from;
    view.data = packed.GetHandle();
    view.rowBytes = to.rowBytes;
    return ReadRows(to, target, view);
}

}  // namespace

Status CopyFromDevice(const VideoFrameRef& target, const VideoFrameRef& deviceFrame) {
    const DeviceFrameView from = ViewDeviceFrame(deviceFrame);
    if (!from.device || !IsRenderFormat(from.format)) return Ostrand::kStatus_Failure;
    if (!target || IsDeviceFrame(target)) return Ostrand::kStatus_Failure;
    const FrameAttributes to = GetAttributes(target);
    if (to.width != from.width || to.height != from.height) return Ostrand::kStatus_Failure;
    const ScopedDeviceAccess access(from.device);
    if (to.format == Vellum::kPixelFormat_BGRA_4444_8u) return ReadBytes(to, GetHostPixels(target), from);
    if (to.format != Vellum::kPixelFormat_BGRA_4444_32f) return Ostrand::kStatus_Failure;
    if (from.format == kPixelFormat_GPU_BGRA_4444_32f) return ReadRows(to, GetHostPixels(target), from);
    VideoFrameRef floats;
    Status status = CreateGPUVideoFrame(floats, from.device, kPixelFormat_GPU_BGRA_4444_32f, from.width, from.height,
                                        Vellum::kPixelAspectRatio_Square, Vellum::kFieldType_Progressive, {});
    if (!Ostrand::Failed(status)) status = CopyFrame(deviceFrame, floats, Vellum::RenderQuality::kDraft);
    return Ostrand::Failed(status) ? status : ReadRows(to, GetHostPixels(target), ViewDeviceFrame(floats));
}

}  // namespace Kiln
