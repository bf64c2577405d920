// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Host/Media/HostPicture.h"
#include "Kiln/Frames.h"

namespace Vantrel::Host {

/// Brings a finished frame of the engine into host memory: a device frame is read back, a host frame is taken as it is
/// and converted where its format differs.
/// @param format BGRA_4444_8u or BGRA_4444_32f.
/// Called under the device's exclusive access. Empty when the device can't give the frame back.
[[nodiscard]] std::shared_ptr<HostPicture> TakeFinishedFrame(PixelBufferPool& pool, const Marl::VideoFrameRef& frame,
                                                             Vellum::PixelFormat format);

/// Lays a picture over opaque black, in place.
void LayOverBlack(HostPicture& picture);

/// A picture of another size than the output's, which only a tree without a compositor gives, cut or padded with
/// transparent black to the output's; its origin says where that lies in it.
[[nodiscard]] std::shared_ptr<HostPicture> PlaceOnOutput(PixelBufferPool& pool, std::shared_ptr<HostPicture> picture,
                                                         std::int32_t width, std::int32_t height);

/// Puts the lower field's lines (1, 3, ...) of `lower` into `upper`. Both have the same size and format.
void WeaveFields(HostPicture& upper, const HostPicture& lower);

/// A picture of transparent black.
[[nodiscard]] std::shared_ptr<HostPicture> MakeTransparentPicture(PixelBufferPool& pool, Vellum::PixelFormat format,
                                                                  std::int32_t width, std::int32_t height);

/// Converts between BGRA of 8 bits and of 32-bit float; the same format comes back unchanged. Values are rounded and
/// clamped for 8 bits. Throws std::invalid_argument for other formats.
[[nodiscard]] HostPictureRef ConvertPicture(PixelBufferPool& pool, const HostPictureRef& picture,
                                            Vellum::PixelFormat format);

}  // namespace Vantrel::Host
