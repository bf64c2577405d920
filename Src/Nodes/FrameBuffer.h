// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Marl/IVideoFrame.h"

namespace Vantrel {

/// A frame's memory at one glance. Doesn't hold the frame.
struct FrameBuffer {
    std::uint64_t data = 0;
    std::int32_t rowBytes = 0;
    Vellum::Rect bounds;
    Vellum::PixelFormat format;

    [[nodiscard]] std::int32_t Width() const { return bounds.Width(); }
    [[nodiscard]] std::int32_t Height() const { return bounds.Height(); }

    /// A null frame, or one without a data or row interface, raises NullInterfaceException.
    [[nodiscard]] static FrameBuffer Demand(const Marl::VideoFrameRef& frame) {
        const auto data = Ostrand::Demand<Marl::IFrameData>(frame);
        const auto rows = Ostrand::Demand<Marl::IFrameRows>(frame);
        return {data->GetData(), rows->GetRowBytes(), frame->GetBounds(), frame->GetPixelFormat()};
    }
    /// False, with `buffer` untouched, where Demand would raise.
    [[nodiscard]] static bool Find(const Marl::VideoFrameRef& frame, FrameBuffer& buffer) {
        const auto data = Ostrand::Query<Marl::IFrameData>(frame);
        const auto rows = Ostrand::Query<Marl::IFrameRows>(frame);
        if (!data || !rows) return false;
        buffer = {data->GetData(), rows->GetRowBytes(), frame->GetBounds(), frame->GetPixelFormat()};
        return true;
    }
};

}  // namespace Vantrel
