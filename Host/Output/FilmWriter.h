// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Host/Output/Encoder.h"

namespace Vantrel::Host {

/// H.264 in an MP4, MOV or Matroska file: 4:2:0, BT.709, video levels; pictures with alpha must lie on black already.
class FilmWriter : public FrameWriter {
public:
    explicit FilmWriter(const OutputFormat& format);

    [[nodiscard]] Vellum::PixelFormat GetPixelFormat() const override { return Vellum::kPixelFormat_BGRA_4444_8u; }
    void Write(const HostPicture& picture, std::int64_t number) override;
    void Finish() override;

private:
    struct OutputDeleter {
        void operator()(AVFormatContext* context) const;
    };

    void WritePacket(AVPacket& packet);
    void Demand(int code, const char* what) const;

    PendingFile mFile;
    std::unique_ptr<AVFormatContext, OutputDeleter> mOutput;
    std::unique_ptr<Encoder> mEncoder;
    AVStream* mStream = nullptr;  ///< owned by mOutput
    AVRational mTimeBase{};
    std::int64_t mFrames = 0;
};

}  // namespace Vantrel::Host
