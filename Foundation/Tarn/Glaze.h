// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

#include "Marl/IVideoFrame.h"

extern "C" {

/// A picture that the host hands over in host memory. Plain C, so that any host can fill one.
///
/// The pixels belong to `storage`, which is counted by the two functions. The Glaze record itself holds one count; the
/// host's Glaze suite disposes of the record and that count. A frame made of it holds a count of its own.
struct Glaze {
    std::uint32_t size;         ///< sizeof(Glaze)
    std::uint32_t pixelFormat;  ///< four-character code, first character in the lowest byte
    std::int32_t width;         ///< pixels
    std::int32_t height;        ///< pixels
    std::int32_t aspectNumerator;
    std::int32_t aspectDenominator;
    std::uint32_t fieldType;
    std::uint32_t alphaType;  ///< Vellum's kAlphaType values
    std::int32_t originX;     ///< where the frame's corner lies in the picture, pixels
    std::int32_t originY;
    std::int32_t rowBytes;  ///< at least width times the bytes of a pixel
    std::uint32_t reserved;
    const void* pixels;  ///< first row; rows run from top to bottom
    void* storage;
    void (*retainStorage)(void* storage);   ///< any thread
    void (*releaseStorage)(void* storage);  ///< any thread
};

}  // extern "C"

namespace Tarn {

/// Wraps a host picture as a frame without copying it. Empty when the record isn't sound: an unknown size or pixel
/// format, no pixels or no counted storage, sizes that aren't positive, rows that overlap. The record may be disposed
/// of afterwards.
[[nodiscard]] Marl::VideoFrameRef GetVideoFrameFromGlaze(const Glaze* glaze);

/// The host's four-character code as a pixel format; the invalid format for an unknown one.
[[nodiscard]] Vellum::PixelFormat SDKToBEPixelFormat(std::uint32_t code);

}  // namespace Tarn
