// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Tests/Host/Render/Films.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <filesystem>
#include <random>
#include <stdexcept>
#include <vector>

#include "Host/Media/NumberPicture.h"

extern "C" {
#include <libavutil/display.h>
#include <libavutil/pixdesc.h>
}

namespace Vantrel::Testing {

namespace fs = std::filesystem;
using Vantrel::Host::HostPicture;
using Vantrel::Host::PixelBufferPool;

namespace {

void Demand(int code, const char* what) {
    if (code < 0) throw std::runtime_error(std::string(what) + ": " + Host::DescribeFFmpegError(code));
}

struct Muxer {
    ~Muxer() {
        if (!context) return;
        if (context->pb) avio_closep(&context->pb);
        avformat_free_context(context);
    }
    AVFormatContext* context = nullptr;
};

void SetRotation(AVStream& stream, int clockwise) {
    auto* matrix = reinterpret_cast<std::int32_t*>(
        av_stream_new_side_data(&stream, AV_PKT_DATA_DISPLAYMATRIX, 9 * sizeof(std::int32_t)));
    if (!matrix) throw std::bad_alloc();
    av_display_rotation_set(matrix, clockwise);
}

Host::CodecContext OpenEncoder(const FilmPlan& plan, bool globalHeader) {
    const AVCodec* codec = avcodec_find_encoder_by_name(plan.encoder);
    if (!codec) throw std::runtime_error(std::string("no encoder ") + plan.encoder);
    Host::CodecContext encoder(avcodec_alloc_context3(codec));
    encoder->width = plan.width;
    encoder->height = plan.height;
    encoder->pix_fmt = plan.format;
    encoder->time_base = av_inv_q(plan.rate);
    encoder->framerate = plan.rate;
    encoder->max_b_frames = plan.bFrames;
    encoder->gop_size = plan.groupSize;
    encoder->sample_aspect_ratio = plan.aspect;
    encoder->field_order = plan.fieldOrder;
    encoder->bit_rate = 4000000;
    if (plan.fieldOrder != AV_FIELD_PROGRESSIVE) encoder->flags |= AV_CODEC_FLAG_INTERLACED_DCT;
    if (globalHeader) encoder->flags |= AV_CODEC_FLAG_GLOBAL_HEADER;
    Demand(avcodec_open2(encoder.get(), codec, nullptr), "the encoder doesn't open");
    return encoder;
}

void Deliver(AVCodecContext& encoder, AVFormatContext& output, AVStream& stream) {
    const Host::Packet packet = Host::MakePacket();
    while (avcodec_receive_packet(&encoder, packet.get()) >= 0) {
        packet->duration = 1;
        av_packet_rescale_ts(packet.get(), encoder.time_base, stream.time_base);
        packet->stream_index = stream.index;
        Demand(av_interleaved_write_frame(&output, packet.get()), "a packet can't be written");
    }
}

}  // namespace

ScratchFolder::ScratchFolder() {
    av_log_set_level(AV_LOG_QUIET);
    std::random_device random;
    const fs::path path = fs::temp_directory_path() / ("vantrel-test-" + std::to_string(random()));
    fs::create_directory(path);
    mPath = path.string();
}

ScratchFolder::~ScratchFolder() {
    std::error_code ignored;
    fs::remove_all(mPath, ignored);
}

std::string ScratchFolder::List() const {
    std::vector<std::string> names;
    for (const fs::directory_entry& entry : fs::directory_iterator(mPath)) {
        names.push_back(entry.path().filename().string());
    }
    std::sort(names.begin(), names.end());
    std::string list;
    for (const std::string& name : names) list += (list.empty() ? "" : " ") + name;
    return list;
}

void WriteNumberFilm(const std::string& path, int frames, std::int64_t ticksPerFrame, std::uint32_t first, int width,
                     int height) {
    Host::OutputFormat format;
    format.path = path;
    format.width = width;
    format.height = height;
    format.rate = Vellum::FrameRate::Create(ticksPerFrame);
    const auto writer = Host::CreateFrameWriter(format, frames);
    const auto pool = PixelBufferPool::Create();
    const auto picture = Host::MakeHostPicture(*pool, Vellum::kPixelFormat_BGRA_4444_8u, width, height);
    for (int i = 0; i < frames; ++i) {
        Host::DrawNumber(*picture, first + static_cast<std::uint32_t>(i));
        writer->Write(*picture, i);
    }
    writer->Finish();
}

void FillPicture(Host::HostPicture& picture, const std::function<std::array<float, 4>(int x, int y)>& at) {
    const bool floats = picture.format == Vellum::kPixelFormat_BGRA_4444_32f;
    for (int y = 0; y < picture.height; ++y) {
        for (int x = 0; x < picture.width; ++x) {
            const std::array<float, 4> pixel = at(x, y);
            for (std::size_t c = 0; c < 4; ++c) {
                const std::size_t index = 4 * static_cast<std::size_t>(x) + c;
                if (floats) {
                    reinterpret_cast<float*>(picture.GetRow(y))[index] = pixel[c];
                } else {
                    picture.GetRow(y)[index] = static_cast<std::byte>(pixel[c] * 255.0F + 0.5F);
                }
            }
        }
    }
}

void WriteImage(const std::string& path, int width, int height,
                const std::function<std::array<float, 4>(int x, int y)>& at) {
    Host::OutputFormat format;
    format.path = path;
    format.width = width;
    format.height = height;
    format.rate = Vellum::FrameRate::Create(kTicks24);
    format.alpha = true;
    const auto writer = Host::CreateFrameWriter(format, 1);
    const auto pool = PixelBufferPool::Create();
    const auto picture = Host::MakeHostPicture(*pool, writer->GetPixelFormat(), width, height);
    FillPicture(*picture, at);
    writer->Write(*picture, 0);
    writer->Finish();
}

void WriteFilm(const std::string& path, const FilmPlan& plan, const std::function<void(AVFrame& frame, int n)>& draw) {
    Muxer muxer;
    Demand(avformat_alloc_output_context2(&muxer.context, nullptr, nullptr, path.c_str()), "unknown form of file");
    const Host::CodecContext encoder = OpenEncoder(plan, (muxer.context->oformat->flags & AVFMT_GLOBALHEADER) != 0);
    AVStream* stream = avformat_new_stream(muxer.context, nullptr);
    Demand(avcodec_parameters_from_context(stream->codecpar, encoder.get()), "no stream");
    stream->time_base = encoder->time_base;
    stream->avg_frame_rate = plan.rate;
    stream->sample_aspect_ratio = plan.aspect;
    if (plan.rotation != 0) SetRotation(*stream, plan.rotation);
    Demand(avio_open(&muxer.context->pb, path.c_str(), AVIO_FLAG_WRITE), "can't be written");
    Demand(avformat_write_header(muxer.context, nullptr), "can't be written");
    for (int n = 0; n < plan.frames; ++n) {
        const Host::Frame frame = Host::MakeFrame();
        frame->format = plan.format;
        frame->width = plan.width;
        frame->height = plan.height;
        Demand(av_frame_get_buffer(frame.get(), 0), "no memory");
        draw(*frame, n);
        frame->pts = n;
        frame->interlaced_frame = plan.fieldOrder != AV_FIELD_PROGRESSIVE;
        frame->top_field_first = plan.fieldOrder == AV_FIELD_TT;
        Demand(avcodec_send_frame(encoder.get(), frame.get()), "a frame can't be encoded");
        Deliver(*encoder, *muxer.context, *stream);
    }
    Demand(avcodec_send_frame(encoder.get(), nullptr), "the film can't be ended");
    Deliver(*encoder, *muxer.context, *stream);
    Demand(av_write_trailer(muxer.context), "the film can't be ended");
}

void FillPlane(AVFrame& frame, int plane, int value) {
    const AVPixFmtDescriptor& format = *av_pix_fmt_desc_get(static_cast<AVPixelFormat>(frame.format));
    const bool chroma = plane == 1 || plane == 2;
    const int height = chroma ? AV_CEIL_RSHIFT(frame.height, format.log2_chroma_h) : frame.height;
    const int width = chroma ? AV_CEIL_RSHIFT(frame.width, format.log2_chroma_w) : frame.width;
    for (int y = 0; y < height; ++y) {
        std::uint8_t* row = frame.data[plane] + static_cast<std::ptrdiff_t>(frame.linesize[plane]) * y;
        if (format.comp[0].depth <= 8) {
            std::memset(row, value, static_cast<std::size_t>(width));
        } else {
            std::fill_n(reinterpret_cast<std::uint16_t*>(row), width, static_cast<std::uint16_t>(value));
        }
    }
}

}  // namespace Vantrel::Testing
