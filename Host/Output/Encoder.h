// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <string>

#include "Host/Media/FFmpegHandles.h"
#include "Host/Output/FrameWriter.h"

namespace Vantrel::Host {

/// A file that gets its final name when it is whole; until then it stands beside it under a hidden name.
class PendingFile {
public:
    explicit PendingFile(std::string finalPath);
    ~PendingFile();
    PendingFile(const PendingFile&) = delete;
    PendingFile& operator=(const PendingFile&) = delete;

    [[nodiscard]] const std::string& GetFinalPath() const { return mFinalPath; }
    [[nodiscard]] const std::string& GetWorkingPath() const { return mWorkingPath; }
    /// Renames the file. Throws OutputError.
    void Commit();

private:
    std::string mFinalPath;
    std::string mWorkingPath;
    bool mCommitted = false;
};

/// One of FFmpeg's encoders with its converter from BGRA.
class Encoder {
public:
    /// `prepare` sets codec options before the encoder opens. Throws OutputError.
    Encoder(const char* encoderName, const OutputFormat& format, AVPixelFormat pixelFormat,
            const std::function<void(AVCodecContext&, AVDictionary**)>& prepare);

    [[nodiscard]] AVCodecContext& GetContext() const { return *mContext; }

    /// Encodes a picture; `deliver` gets each packet that comes out. Null ends the stream.
    void Encode(const HostPicture* picture, std::int64_t pts, const std::function<void(AVPacket&)>& deliver);

private:
    void ConvertPacked(const HostPicture& picture);
    void ConvertField(const HostPicture& picture, int field);
    void ConvertFloat(const HostPicture& picture);

    OutputFormat mFormat;
    CodecContext mContext;
    ScaleContext mScaler;
    bool mInterlaced = false;
    Frame mFrame = MakeFrame();
    Packet mPacket = MakePacket();
    std::shared_ptr<PixelBufferPool> mPool = PixelBufferPool::Create();
};

}  // namespace Vantrel::Host
