// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Media/PictureConverter.h"

#include <cstring>

#include "Host/Media/PlanarBytes.h"

extern "C" {
#include <libavutil/pixdesc.h>
}

namespace Vantrel::Host {

namespace {

int MatrixOf(const AVFrame& frame) {
    switch (frame.colorspace) {
        case AVCOL_SPC_BT709:
            return SWS_CS_ITU709;
        case AVCOL_SPC_FCC:
            return SWS_CS_FCC;
        case AVCOL_SPC_BT470BG:
        case AVCOL_SPC_SMPTE170M:
            return SWS_CS_ITU601;
        case AVCOL_SPC_SMPTE240M:
            return SWS_CS_SMPTE240M;
        case AVCOL_SPC_BT2020_NCL:
        case AVCOL_SPC_BT2020_CL:
            return SWS_CS_BT2020;
        default:
            return frame.height > 576 ? SWS_CS_ITU709 : SWS_CS_ITU601;
    }
}

LumaWeights WeightsOf(const AVFrame& frame) {
    switch (MatrixOf(frame)) {
        case SWS_CS_ITU709:
            return {0.2126, 0.0722};
        case SWS_CS_FCC:
            return {0.30, 0.11};
        case SWS_CS_SMPTE240M:
            return {0.212, 0.087};
        case SWS_CS_BT2020:
            return {0.2627, 0.0593};
        default:
            return {0.299, 0.114};
    }
}

bool IsFullRange(const AVFrame& frame) {
    if (frame.color_range != AVCOL_RANGE_UNSPECIFIED) return frame.color_range == AVCOL_RANGE_JPEG;
    switch (frame.format) {
        case AV_PIX_FMT_YUVJ420P:
        case AV_PIX_FMT_YUVJ422P:
        case AV_PIX_FMT_YUVJ444P:
        case AV_PIX_FMT_YUVJ440P:
        case AV_PIX_FMT_YUVJ411P:
            return true;
        default: {
            const AVPixFmtDescriptor* format = av_pix_fmt_desc_get(static_cast<AVPixelFormat>(frame.format));
            // Grey comes from pictures, which know no video levels.
            return format && ((format->flags & AV_PIX_FMT_FLAG_RGB) != 0 || format->nb_components < 3);
        }
    }
}

template <class Pixel>
std::shared_ptr<HostPicture> Rotate(const HostPicture& source, int rotation, PixelBufferPool& pool) {
    const bool quarter = rotation % 180 != 0;
    auto target = MakeHostPicture(pool, source.format, quarter ? source.height : source.width,
                                  quarter ? source.width : source.height);
    target->alphaType = source.alphaType;
    for (std::int32_t y = 0; y < source.height; ++y) {
        const auto* row = reinterpret_cast<const Pixel*>(source.GetRow(y));
        for (std::int32_t x = 0; x < source.width; ++x) {
            std::int32_t tx = source.width - 1 - x;
            std::int32_t ty = source.height - 1 - y;
            if (rotation == 90) {
                tx = source.height - 1 - y;
                ty = x;
            } else if (rotation == 270) {
                tx = y;
                ty = source.width - 1 - x;
            }
            reinterpret_cast<Pixel*>(target->GetRow(ty))[tx] = row[x];
        }
    }
    return target;
}

/// Interlaced, with chroma that is stored for pairs of lines.
bool HasSeparateFields(const AVFrame& frame) {
    const AVPixFmtDescriptor* format = av_pix_fmt_desc_get(static_cast<AVPixelFormat>(frame.format));
    return frame.interlaced_frame != 0 && frame.height % 4 == 0 && format->log2_chroma_h == 1;
}

/// The lines of one field as a frame that shares the memory.
Frame ShareFieldOf(const AVFrame& frame, int field) {
    Frame shared = ShareFrame(frame);
    for (int plane = 0; plane < AV_NUM_DATA_POINTERS && shared->data[plane]; ++plane) {
        shared->data[plane] += static_cast<std::ptrdiff_t>(shared->linesize[plane]) * field;
        shared->linesize[plane] *= 2;
    }
    // By the height of the whole picture, which a field no longer tells.
    if (MatrixOf(frame) == SWS_CS_ITU709) shared->colorspace = AVCOL_SPC_BT709;
    shared->height /= 2;
    return shared;
}

struct FloatPixel {
    float channels[4];
};

}  // namespace

bool IsDeepFormat(int pixelFormat) {
    const AVPixFmtDescriptor* format = av_pix_fmt_desc_get(static_cast<AVPixelFormat>(pixelFormat));
    return format && format->comp[0].depth > 8;
}

void PictureConverter::Prepare(const AVFrame& frame, AVPixelFormat target) {
    const int matrix = MatrixOf(frame);
    const int range = IsFullRange(frame) ? 1 : 0;
    if (mScaler && frame.width == mWidth && frame.height == mHeight && frame.format == mFormat && matrix == mMatrix &&
        range == mRange && target == mTarget) {
        return;
    }
    const auto format = static_cast<AVPixelFormat>(frame.format);
    mScaler.reset(sws_getContext(frame.width, frame.height, format, frame.width, frame.height, target,
                                 SWS_BILINEAR | SWS_ACCURATE_RND | SWS_FULL_CHR_H_INT, nullptr, nullptr, nullptr));
    if (!mScaler) {
        const char* name = av_get_pix_fmt_name(format);
        throw MediaError(std::string("pictures of pixel format ") + (name ? name : "unknown") + " can't be converted");
    }
    const int* coefficients = sws_getCoefficients(matrix);
    sws_setColorspaceDetails(mScaler.get(), coefficients, range, sws_getCoefficients(SWS_CS_DEFAULT), 1, 0, 1 << 16,
                             1 << 16);
    mWidth = frame.width;
    mHeight = frame.height;
    mFormat = frame.format;
    mMatrix = matrix;
    mRange = range;
    mTarget = target;
    mPlanar.reset();
}

void PictureConverter::ConvertDeep(const AVFrame& frame, HostPicture& picture) {
    if (ConvertDeepPicture(frame, WeightsOf(frame), IsFullRange(frame), picture)) return;
    Prepare(frame, AV_PIX_FMT_GBRAPF32);
    if (!mPlanar) {
        mPlanar = MakeFrame();
        mPlanar->format = AV_PIX_FMT_GBRAPF32;
        mPlanar->width = frame.width;
        mPlanar->height = frame.height;
        if (av_frame_get_buffer(mPlanar.get(), 64) < 0) throw std::bad_alloc();
    }
    sws_scale(mScaler.get(), frame.data, frame.linesize, 0, frame.height, mPlanar->data, mPlanar->linesize);
    for (std::int32_t y = 0; y < frame.height; ++y) {
        // Planes lie in the order green, blue, red, alpha.
        const float* planes[4];
        for (int plane = 0; plane < 4; ++plane) {
            planes[plane] = reinterpret_cast<const float*>(mPlanar->data[plane] +
                                                           static_cast<std::ptrdiff_t>(mPlanar->linesize[plane]) * y);
        }
        auto* row = reinterpret_cast<float*>(picture.GetRow(y));
        for (std::ptrdiff_t x = 0; x < frame.width; ++x) {
            row[4 * x] = planes[1][x];
            row[4 * x + 1] = planes[0][x];
            row[4 * x + 2] = planes[2][x];
            row[4 * x + 3] = planes[3][x];
        }
    }
}

void PictureConverter::ConvertLines(const AVFrame& frame, HostPicture& picture) {
    if (IsDeepFormat(frame.format)) return ConvertDeep(frame, picture);
    if (ConvertPlanarBytes(frame, WeightsOf(frame), IsFullRange(frame), picture)) return;
    Prepare(frame, AV_PIX_FMT_BGRA);
    std::uint8_t* const planes[] = {reinterpret_cast<std::uint8_t*>(picture.pixels.get())};
    const int strides[] = {picture.rowBytes};
    sws_scale(mScaler.get(), frame.data, frame.linesize, 0, frame.height, planes, strides);
}

std::shared_ptr<HostPicture> PictureConverter::Convert(const AVFrame& frame, int rotation) {
    auto picture = MakeHostPicture(
        *mPool, IsDeepFormat(frame.format) ? Vellum::kPixelFormat_BGRA_4444_32f : Vellum::kPixelFormat_BGRA_4444_8u,
        frame.width, frame.height);
    if (HasSeparateFields(frame)) {
        // A line of chroma belongs to two lines of one field, which lie between those of the other.
        for (int field = 0; field < 2; ++field) {
            ConvertLines(*ShareFieldOf(frame, field), *ShareField(*picture, field));
        }
    } else {
        ConvertLines(frame, *picture);
    }
    const AVPixFmtDescriptor* format = av_pix_fmt_desc_get(static_cast<AVPixelFormat>(frame.format));
    picture->alphaType =
        (format->flags & AV_PIX_FMT_FLAG_ALPHA) != 0 ? Vellum::kAlphaType_Straight : Vellum::kAlphaType_None;
    if (rotation == 0) return picture;
    return IsDeepFormat(frame.format) ? Rotate<FloatPixel>(*picture, rotation, *mPool)
                                      : Rotate<std::uint32_t>(*picture, rotation, *mPool);
}

}  // namespace Vantrel::Host
