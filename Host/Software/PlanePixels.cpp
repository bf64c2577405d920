// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/PlanePixels.h"

#include <cmath>
#include <cstring>

extern "C" {
#include <libavutil/pixdesc.h>
}

namespace Vantrel::Host::Software {

namespace {

/// FFmpeg lists red, green, blue, alpha; pictures hold blue, green, red, alpha.
constexpr int kChannelOf[] = {2, 1, 0, 3};

/// One component of a row: where its values lie, and how.
struct Component {
    std::uint8_t* row;
    int step;
    int depth;
    bool isFloat;

    [[nodiscard]] double Scale() const { return static_cast<double>((1U << depth) - 1U); }
};

Component RowOf(const AVFrame& frame, const AVPixFmtDescriptor& format, int index, int y) {
    const AVComponentDescriptor& component = format.comp[index];
    std::uint8_t* row = frame.data[component.plane] + static_cast<std::ptrdiff_t>(frame.linesize[component.plane]) * y +
                        component.offset;
    return {row, component.step, component.depth, (format.flags & AV_PIX_FMT_FLAG_FLOAT) != 0};
}

void WriteRow(const float* values, int count, const Component& to) {
    for (std::ptrdiff_t x = 0; x < count; ++x) {
        std::uint8_t* target = to.row + to.step * x;
        const float value = values[4 * x];
        if (to.isFloat) {
            std::memcpy(target, &value, sizeof value);
            continue;
        }
        // Written so that NaN becomes 0.
        const double limited = value > 0.0F ? std::fmin(value, 1.0) : 0.0;
        const auto level = static_cast<std::uint16_t>(std::floor(limited * to.Scale() + 0.5));
        if (to.depth > 8) {
            std::memcpy(target, &level, sizeof level);
        } else {
            *target = static_cast<std::uint8_t>(level);
        }
    }
}

void ReadRow(const Component& from, int count, float* values) {
    for (std::ptrdiff_t x = 0; x < count; ++x) {
        const std::uint8_t* source = from.row + from.step * x;
        if (from.isFloat) {
            std::memcpy(&values[4 * x], source, sizeof(float));
        } else {
            std::uint16_t level = *source;
            if (from.depth > 8) std::memcpy(&level, source, sizeof level);
            values[4 * x] = static_cast<float>(level / from.Scale());
        }
    }
}

}  // namespace

void WritePlanes(const Picture& picture, AVFrame& frame) {
    const AVPixFmtDescriptor& format = *av_pix_fmt_desc_get(static_cast<AVPixelFormat>(frame.format));
    for (int y = 0; y < picture.height; ++y) {
        for (int i = 0; i < format.nb_components; ++i) {
            WriteRow(picture.At(0, y) + kChannelOf[i], picture.width, RowOf(frame, format, i, y));
        }
    }
}

Picture ReadPlanes(const AVFrame& frame) {
    const AVPixFmtDescriptor& format = *av_pix_fmt_desc_get(static_cast<AVPixelFormat>(frame.format));
    Picture picture(frame.width, frame.height);
    for (int y = 0; y < picture.height; ++y) {
        float* row = picture.At(0, y);
        for (int i = 0; i < format.nb_components; ++i) {
            ReadRow(RowOf(frame, format, i, y), picture.width, row + kChannelOf[i]);
        }
        for (int x = 0; format.nb_components < 4 && x < picture.width; ++x) row[4 * x + 3] = 1.0F;
    }
    return picture;
}

}  // namespace Vantrel::Host::Software
