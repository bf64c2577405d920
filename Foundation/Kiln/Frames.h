// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

#include "Kiln/Device.h"
#include "Marl/IVideoFrame.h"

namespace Kiln {

using Marl::IVideoFrame;
using Marl::VideoFrameRef;
using Ostrand::Status;
using Vellum::kPixelFormat_GPU_BGRA_4444_16f;
using Vellum::kPixelFormat_GPU_BGRA_4444_32f;
using Vellum::kPixelFormat_GPU_BGRX_4444_16f;

/// Answered by frames in device memory only.
class IDeviceFrame : public Ostrand::OstrandUnknown {
public:
    static constexpr Marl::Guid kInterfaceID{
        0x7B1E5C52, 0x90D4, 0x4B7C, {0xA5, 0x3E, 0x18, 0x66, 0xF2, 0x4D, 0x09, 0xC7}};
    [[nodiscard]] virtual const DeviceRef& GetDevice() const = 0;
};

/// Fills a new device frame for use as a matte.
class IOpaqueFill : public Ostrand::OstrandUnknown {
public:
    static constexpr Marl::Guid kInterfaceID{
        0xA1489635, 0x6B6B, 0x47A6, {0x8F, 0xB6, 0x57, 0x6F, 0x3E, 0x25, 0xBE, 0x56}};
    /// Makes every pixel opaque white.
    virtual Status FillOpaque() = 0;
};

/// Makes a device frame with undefined pixels. kStatus_OutOfMemory when refused (`out` is then empty), kStatus_Failure
/// for a size that isn't positive or a format that the device doesn't render in. Four bytes a pixel (BGRA_4444_8u) are
/// had as well: room for a mask of one float a pixel.
[[nodiscard]] Status CreateGPUVideoFrame(VideoFrameRef& out, const DeviceRef& device, Vellum::PixelFormat format,
                                         std::int32_t width, std::int32_t height, Vellum::PixelAspectRatio aspect,
                                         std::uint32_t fieldType, Vellum::Point origin);

/// A new device frame with the attributes of `frame` and undefined pixels; empty when refused.
[[nodiscard]] VideoFrameRef CreateSimilarFrame(const VideoFrameRef& frame);

/// Is it in device memory?
[[nodiscard]] bool IsDeviceFrame(const VideoFrameRef& frame);

/// A frame in memory that the device reads fast, shaped for `hostFrame`: its format and attributes. An all-zero
/// rectangle keeps the host frame's size; otherwise the rectangle's size is made, into which CopyToHostFrame resamples.
/// Empty when memory is refused.
[[nodiscard]] VideoFrameRef AllocateHostFrameForUpload(const DeviceRef& device, const VideoFrameRef& hostFrame,
                                                       Vellum::RenderQuality quality, const Vellum::Rect& rect);

/// A host frame in ordinary memory with undefined pixels; empty for sizes that aren't positive.
[[nodiscard]] VideoFrameRef CreateHostVideoFrame(Vellum::PixelFormat format, std::int32_t width, std::int32_t height,
                                                 Vellum::PixelAspectRatio aspect, std::uint32_t fieldType,
                                                 Vellum::Point origin);

/// Copies one host frame into another of the same format, resampling when their sizes differ. Any thread.
[[nodiscard]] Status CopyToHostFrame(const VideoFrameRef& target, const VideoFrameRef& source,
                                     Vellum::RenderQuality quality);

/// Uploads a frame that AllocateHostFrameForUpload made, unconverted, to the device that it was made for: the device
/// frame has the host's layout and attributes. The copy is asynchronous and keeps the host frame alive. Empty when
/// memory is refused or the frame isn't an upload frame.
[[nodiscard]] VideoFrameRef CopyToDevice(const VideoFrameRef& uploadFrame);

/// Reads a device frame of a format that devices render in back into a host frame of BGRA_4444_32f or BGRA_4444_8u of
/// the same size; values are rounded and clamped for 8 bits. Waits for the device.
[[nodiscard]] Status CopyFromDevice(const VideoFrameRef& target, const VideoFrameRef& deviceFrame);

/// Converts an uploaded frame from the host's layout to the format of `target`, which is one that devices render in and
/// of the same size: levels, matrix, channel order, alpha as the source's attributes say. Premultiplied colour comes
/// out straight.
[[nodiscard]] Status ConvertFrame(const VideoFrameRef& source, const VideoFrameRef& target);

/// Takes the matte colour (blue, green, red in the lower three bytes) out of colour that was blended with it: in place,
/// c = m + (c - m) / a, and m where a is 0.
[[nodiscard]] Status UnpremultiplyFrame(const VideoFrameRef& frame, std::uint32_t matteColor);

/// Replaces, in place, the lines of one field by interpolation from the other. `keep` 0 keeps the even lines (0, 2,
/// ...), 1 the odd ones.
[[nodiscard]] Status DeinterlaceFrame(const VideoFrameRef& frame, std::int32_t keep);

/// Copies pixels between device frames; sizes and formats may differ. Resamples by quality when sizes do.
[[nodiscard]] Status CopyFrame(const VideoFrameRef& source, const VideoFrameRef& target, Vellum::RenderQuality quality);

/// Copies a rectangle of a device frame onto one of another of the same format, resampled by quality when their sizes
/// differ; each pixel of the target's rectangle is replaced, alpha included, and colour is weighed by alpha. What of
/// the source's rectangle lies outside its frame isn't part of it; with equal sizes neither is what falls outside the
/// target. Copies nothing, and is no failure, where nothing is left. kStatus_Failure for frames of two devices or
/// formats.
[[nodiscard]] Status CopyFrameRect(const VideoFrameRef& source, const Vellum::Rect& sourceRect,
                                   const VideoFrameRef& target, const Vellum::Rect& targetRect,
                                   Vellum::RenderQuality quality);

}  // namespace Kiln
