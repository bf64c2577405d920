// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Output/FilmWriter.h"

#include <cerrno>

#include "Vellum/FieldOrder.h"

namespace Vantrel::Host {

namespace {

AVRational ToRational(Vellum::FrameRate rate) {
    AVRational result{};
    av_reduce(&result.num, &result.den, Vellum::kTicksPerSecond, rate.GetTicksPerFrame(), INT32_MAX);
    return result;
}

}  // namespace

void FilmWriter::OutputDeleter::operator()(AVFormatContext* context) const {
    if (context->pb) avio_closep(&context->pb);
    avformat_free_context(context);
}

FilmWriter::FilmWriter(const OutputFormat& format) : mFile(format.path) {
    AVFormatContext* output = nullptr;
    Demand(avformat_alloc_output_context2(&output, nullptr, nullptr, mFile.GetWorkingPath().c_str()),
           "unknown form of file");
    mOutput.reset(output);
    const AVRational rate = ToRational(format.rate);
    mTimeBase = av_inv_q(rate);
    mEncoder = std::make_unique<Encoder>(
        "libx264", format, AV_PIX_FMT_YUV420P, [&](AVCodecContext& context, AVDictionary** options) {
            context.time_base = mTimeBase;
            context.framerate = rate;
            context.colorspace = AVCOL_SPC_BT709;
            context.color_primaries = AVCOL_PRI_BT709;
            context.color_trc = AVCOL_TRC_BT709;
            context.color_range = AVCOL_RANGE_MPEG;
            if (Vellum::IsInterlaced(format.fieldType)) {
                const bool upperFirst = format.fieldType == Vellum::kFieldType_UpperFirst;
                context.flags |= AV_CODEC_FLAG_INTERLACED_DCT | AV_CODEC_FLAG_INTERLACED_ME;
                context.field_order = upperFirst ? AV_FIELD_TT : AV_FIELD_BB;
                av_dict_set(options, "x264-params", upperFirst ? "tff=1" : "bff=1", 0);
            }
            if ((output->oformat->flags & AVFMT_GLOBALHEADER) != 0) context.flags |= AV_CODEC_FLAG_GLOBAL_HEADER;
            av_dict_set(options, "preset", "veryfast", 0);
            av_dict_set(options, "crf", "18", 0);
        });
    mStream = avformat_new_stream(output, nullptr);
    if (!mStream) throw std::bad_alloc();
    AVCodecContext& context = mEncoder->GetContext();
    Demand(avcodec_parameters_from_context(mStream->codecpar, &context), "the film can't be described");
    mStream->time_base = mTimeBase;
    mStream->avg_frame_rate = rate;
    mStream->sample_aspect_ratio = context.sample_aspect_ratio;
    if (!format.timecode.empty()) av_dict_set(&output->metadata, "timecode", format.timecode.c_str(), 0);
    Demand(avio_open(&output->pb, mFile.GetWorkingPath().c_str(), AVIO_FLAG_WRITE), "can't be written");
    AVDictionary* options = nullptr;
    av_dict_set(&options, "movflags", "+faststart", 0);
    const int code = avformat_write_header(output, &options);
    av_dict_free(&options);
    Demand(code, "can't be written");
}

void FilmWriter::Demand(int code, const char* what) const {
    if (code < 0) throw OutputError(mFile.GetFinalPath() + ": " + what + ": " + DescribeFFmpegError(code));
}

void FilmWriter::WritePacket(AVPacket& packet) {
    av_packet_rescale_ts(&packet, mTimeBase, mStream->time_base);
    packet.stream_index = mStream->index;
    Demand(av_interleaved_write_frame(mOutput.get(), &packet), "can't be written");
    // The muxer buffers: a full disk shows on the stream below it.
    Demand(mOutput->pb->error, "can't be written");
}

void FilmWriter::Write(const HostPicture& picture, std::int64_t /*number*/) {
    mEncoder->Encode(&picture, mFrames++, [this](AVPacket& packet) { WritePacket(packet); });
}

void FilmWriter::Finish() {
    mEncoder->Encode(nullptr, 0, [this](AVPacket& packet) { WritePacket(packet); });
    Demand(av_write_trailer(mOutput.get()), "can't be finished");
    avio_flush(mOutput->pb);
    Demand(mOutput->pb->error, "can't be written");
    Demand(avio_closep(&mOutput->pb), "can't be written");
    mFile.Commit();
}

}  // namespace Vantrel::Host
