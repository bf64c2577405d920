// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Host/Media/FFmpegHandles.h"
#include "Host/Media/HostPicture.h"

namespace Vantrel::Host {

/// Turns decoded pictures into what the engine takes: full-range BGRA of 8 bits, or of 32-bit float for deeper media,
/// upright and in the decoded size. Luma and chroma follow the stream's matrix and range; a stream that doesn't tell
/// counts as BT.709 above 576 lines and BT.601 otherwise. Used by one thread at a time; keeps its scaler between
/// pictures.
class PictureConverter {
public:
    explicit PictureConverter(std::shared_ptr<PixelBufferPool> pool) : mPool(std::move(pool)) {}

    /// @param rotation clockwise degrees, a multiple of 90.
    /// Throws MediaError for a pixel format that can't be converted.
    [[nodiscard]] std::shared_ptr<HostPicture> Convert(const AVFrame& frame, int rotation);

private:
    void Prepare(const AVFrame& frame, AVPixelFormat target);
    void ConvertDeep(const AVFrame& frame, HostPicture& picture);
    /// All lines of a frame, or those of one field.
    void ConvertLines(const AVFrame& frame, HostPicture& picture);

    std::shared_ptr<PixelBufferPool> mPool;
    ScaleContext mScaler;
    int mWidth = 0;
    int mHeight = 0;
    int mFormat = -1;
    int mMatrix = -1;
    int mRange = -1;
    AVPixelFormat mTarget = AV_PIX_FMT_NONE;
    Frame mPlanar;
};

/// Is this a format whose pictures need more than 8 bits a channel?
[[nodiscard]] bool IsDeepFormat(int pixelFormat);

}  // namespace Vantrel::Host
