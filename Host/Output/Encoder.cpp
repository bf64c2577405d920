// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Output/Encoder.h"

#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <filesystem>

#include "Vellum/FieldOrder.h"

extern "C" {
#include <libavutil/pixdesc.h>
}

namespace Vantrel::Host {

namespace {

void Demand(int code, const std::string& path, const char* what) {
    if (code < 0) throw OutputError(path + ": " + what + ": " + DescribeFFmpegError(code));
}

std::int32_t RoundUp(std::int32_t size, std::int32_t step) { return (size + step - 1) / step * step; }

/// Subsampled chroma needs even sizes, of each field where there are two: the last column and the last line of each
/// field are repeated.
std::shared_ptr<HostPicture> PadTo(const HostPicture& picture, std::int32_t width, std::int32_t height, bool interlaced,
                                   PixelBufferPool& pool) {
    auto padded = MakeHostPicture(pool, picture.format, width, height);
    const std::int32_t step = interlaced && picture.height > 1 ? 2 : 1;
    for (std::int32_t y = 0; y < padded->height; ++y) {
        const std::int32_t beyond = std::max(0, y - picture.height + 1);
        const std::byte* from = picture.GetRow(y - RoundUp(beyond, step));
        std::byte* to = padded->GetRow(y);
        const auto bytes = static_cast<std::size_t>(picture.width) * 4;
        std::memcpy(to, from, bytes);
        if (padded->width != picture.width) std::memcpy(to + bytes, from + bytes - 4, 4);
    }
    return padded;
}

bool IsSubsampled(AVPixelFormat format) {
    const AVPixFmtDescriptor* descriptor = av_pix_fmt_desc_get(format);
    return descriptor && (descriptor->log2_chroma_w != 0 || descriptor->log2_chroma_h != 0);
}

}  // namespace

PendingFile::PendingFile(std::string finalPath) : mFinalPath(std::move(finalPath)) {
    const std::filesystem::path path(mFinalPath);
    const std::filesystem::path folder = path.has_parent_path() ? path.parent_path() : ".";
    std::error_code error;
    if (!std::filesystem::is_directory(folder, error)) {
        throw OutputError("the output folder " + folder.string() + " isn't there");
    }
    mWorkingPath =
        (folder / ("." + path.stem().string() + "." + std::to_string(getpid()) + path.extension().string())).string();
}

PendingFile::~PendingFile() {
    if (!mCommitted) (void)std::remove(mWorkingPath.c_str());
}

void PendingFile::Commit() {
    if (std::rename(mWorkingPath.c_str(), mFinalPath.c_str()) != 0) {
        throw OutputError(mFinalPath + " can't be written: " + std::strerror(errno));
    }
    mCommitted = true;
}

Encoder::Encoder(const char* encoderName, const OutputFormat& format, AVPixelFormat pixelFormat,
                 const std::function<void(AVCodecContext&, AVDictionary**)>& prepare)
    : mFormat(format) {
    const AVCodec* codec = avcodec_find_encoder_by_name(encoderName);
    if (!codec) throw OutputError(format.path + ": FFmpeg has no encoder " + encoderName + " on this machine");
    mContext.reset(avcodec_alloc_context3(codec));
    if (!mContext) throw std::bad_alloc();
    const bool even = IsSubsampled(pixelFormat);
    mContext->width = even ? (format.width + 1) & ~1 : format.width;
    mInterlaced = even && Vellum::IsInterlaced(format.fieldType);
    mContext->height = even ? RoundUp(format.height, mInterlaced ? 4 : 2) : format.height;
    mContext->pix_fmt = pixelFormat;
    mContext->sample_aspect_ratio = {format.aspect.numerator, format.aspect.denominator};
    AVDictionary* options = nullptr;
    prepare(*mContext, &options);
    const int code = avcodec_open2(mContext.get(), codec, &options);
    av_dict_free(&options);
    Demand(code, format.path, "the encoder doesn't take this picture");

    mFrame->format = pixelFormat;
    mFrame->width = mContext->width;
    mFrame->height = mContext->height;
    mFrame->colorspace = mContext->colorspace;
    mFrame->color_range = mContext->color_range;
    Demand(av_frame_get_buffer(mFrame.get(), 64), format.path, "no memory for a picture");
    const AVPixFmtDescriptor* descriptor = av_pix_fmt_desc_get(pixelFormat);
    if ((descriptor->flags & AV_PIX_FMT_FLAG_FLOAT) != 0) return;
    const int lines = mInterlaced ? mContext->height / 2 : mContext->height;
    mScaler.reset(sws_getContext(mContext->width, lines, AV_PIX_FMT_BGRA, mContext->width, lines, pixelFormat,
                                 SWS_BILINEAR | SWS_ACCURATE_RND, nullptr, nullptr, nullptr));
    if (!mScaler) throw OutputError(format.path + ": pictures can't be converted for " + encoderName);
    sws_setColorspaceDetails(mScaler.get(), sws_getCoefficients(SWS_CS_DEFAULT), 1, sws_getCoefficients(SWS_CS_ITU709),
                             mContext->color_range == AVCOL_RANGE_JPEG ? 1 : 0, 0, 1 << 16, 1 << 16);
}

void Encoder::ConvertPacked(const HostPicture& picture) {
    std::shared_ptr<HostPicture> padded;
    const HostPicture* source = &picture;
    if (picture.width != mContext->width || picture.height != mContext->height) {
        padded = PadTo(picture, mContext->width, mContext->height, mInterlaced, *mPool);
        source = padded.get();
    }
    if (mInterlaced) {
        // Chroma is shared between lines of one field only.
        for (int field = 0; field < 2; ++field) ConvertField(*source, field);
        return;
    }
    const std::uint8_t* const planes[] = {reinterpret_cast<const std::uint8_t*>(source->pixels.get())};
    const int strides[] = {source->rowBytes};
    sws_scale(mScaler.get(), planes, strides, 0, source->height, mFrame->data, mFrame->linesize);
}

void Encoder::ConvertField(const HostPicture& picture, int field) {
    const std::shared_ptr<HostPicture> source = ShareField(picture, field);
    const std::uint8_t* const planes[] = {reinterpret_cast<const std::uint8_t*>(source->pixels.get())};
    const int strides[] = {source->rowBytes};
    std::uint8_t* targets[4] = {};
    int targetStrides[4] = {};
    for (int plane = 0; plane < 4 && mFrame->data[plane]; ++plane) {
        targets[plane] = mFrame->data[plane] + static_cast<std::ptrdiff_t>(mFrame->linesize[plane]) * field;
        targetStrides[plane] = 2 * mFrame->linesize[plane];
    }
    sws_scale(mScaler.get(), planes, strides, 0, source->height, targets, targetStrides);
}

void Encoder::ConvertFloat(const HostPicture& picture) {
    // Packed blue, green, red, alpha; the planes lie in the order green, blue, red, alpha.
    constexpr int kPlaneOf[] = {1, 0, 2, 3};
    const int planes = mFrame->data[3] ? 4 : 3;
    for (std::int32_t y = 0; y < picture.height; ++y) {
        const auto* row = reinterpret_cast<const float*>(picture.GetRow(y));
        for (int channel = 0; channel < planes; ++channel) {
            auto* plane = reinterpret_cast<float*>(
                mFrame->data[kPlaneOf[channel]] + static_cast<std::ptrdiff_t>(mFrame->linesize[kPlaneOf[channel]]) * y);
            const bool weighted = planes == 4 && channel < 3;
            for (std::int32_t x = 0; x < picture.width; ++x) {
                plane[x] = row[4 * x + channel] * (weighted ? row[4 * x + 3] : 1.0F);
            }
        }
    }
}

void Encoder::Encode(const HostPicture* picture, std::int64_t pts, const std::function<void(AVPacket&)>& deliver) {
    if (picture) {
        Demand(av_frame_make_writable(mFrame.get()), mFormat.path, "no memory for a picture");
        if (mScaler) {
            ConvertPacked(*picture);
        } else {
            ConvertFloat(*picture);
        }
        mFrame->pts = pts;
        mFrame->interlaced_frame = mInterlaced ? 1 : 0;
        mFrame->top_field_first = mFormat.fieldType == Vellum::kFieldType_UpperFirst ? 1 : 0;
    }
    Demand(avcodec_send_frame(mContext.get(), picture ? mFrame.get() : nullptr), mFormat.path,
           "a picture can't be encoded");
    for (;;) {
        const int code = avcodec_receive_packet(mContext.get(), mPacket.get());
        if (code == AVERROR(EAGAIN) || code == AVERROR_EOF) return;
        Demand(code, mFormat.path, "a picture can't be encoded");
        deliver(*mPacket);
        av_packet_unref(mPacket.get());
    }
}

}  // namespace Vantrel::Host
