// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Kiln/Frames.h"

namespace Kiln {

/// What frame operations need to know of a device frame, fetched once.
struct DeviceFrameView {
    DeviceRef device;  ///< empty when the frame isn't in device memory
    std::uint64_t data = 0;
    std::int32_t rowBytes = 0;
    std::int32_t width = 0;
    std::int32_t height = 0;
    Vellum::PixelFormat format;
};
[[nodiscard]] DeviceFrameView ViewDeviceFrame(const VideoFrameRef& frame);

/// Queues a copy of a device frame's pixels into another of the same size, format and device; kStatus_Failure for
/// frames that differ.
[[nodiscard]] Status CopyEqualFrame(const VideoFrameRef& source, const VideoFrameRef& target);

}  // namespace Kiln
