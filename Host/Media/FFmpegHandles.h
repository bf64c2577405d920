// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>
#include <stdexcept>
#include <string>

extern "C" {
#include <libavcodec/avcodec.h>
#include <libavformat/avformat.h>
#include <libavutil/frame.h>
#include <libswscale/swscale.h>
}

namespace Vantrel::Host {

/// What media can't give: the file, the place in it and the reason, as one sentence.
class MediaError : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

/// FFmpeg's objects, owned by scope.
struct FFmpegDeleter {
    void operator()(AVFormatContext* context) const { avformat_close_input(&context); }
    void operator()(AVCodecContext* context) const { avcodec_free_context(&context); }
    void operator()(AVFrame* frame) const { av_frame_free(&frame); }
    void operator()(AVPacket* packet) const { av_packet_free(&packet); }
    void operator()(SwsContext* context) const { sws_freeContext(context); }
};
using InputContext = std::unique_ptr<AVFormatContext, FFmpegDeleter>;
using CodecContext = std::unique_ptr<AVCodecContext, FFmpegDeleter>;
using Frame = std::unique_ptr<AVFrame, FFmpegDeleter>;
using Packet = std::unique_ptr<AVPacket, FFmpegDeleter>;
using ScaleContext = std::unique_ptr<SwsContext, FFmpegDeleter>;

/// A new object; throws std::bad_alloc.
[[nodiscard]] Frame MakeFrame();
[[nodiscard]] Packet MakePacket();
/// A second reference to the same picture.
[[nodiscard]] Frame ShareFrame(const AVFrame& frame);

/// FFmpeg's words for one of its error codes.
[[nodiscard]] std::string DescribeFFmpegError(int code);

}  // namespace Vantrel::Host
