// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Media/DeepPicture.h"

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <vector>

extern "C" {
#include <libavutil/pixdesc.h>
}

namespace Vantrel::Host {

namespace {

/// Reads lines of one component as numbers, one a pixel.
class ComponentReader {
public:
    ComponentReader(const AVFrame& frame, const AVPixFmtDescriptor& format, int component)
        : mFrame(frame),
          mFormat(format),
          mComponent(component),
          mShiftX(IsChroma() ? format.log2_chroma_w : 0),
          mShiftY(IsChroma() ? format.log2_chroma_h : 0),
          mWidth(AV_CEIL_RSHIFT(frame.width, mShiftX)),
          mHeight(AV_CEIL_RSHIFT(frame.height, mShiftY)),
          mRaw(static_cast<std::size_t>(mWidth)),
          mLine(static_cast<std::size_t>(mWidth)) {}

    void Read(int y, float* values) {
        // Where the line lies between the component's own lines, whose middles lie half a line from their borders.
        const float place = std::max(0.0F, (static_cast<float>(y) + 0.5F) / static_cast<float>(1 << mShiftY) - 0.5F);
        const int above = static_cast<int>(place);
        const float share = place - static_cast<float>(above);
        Accumulate(above, 1.0F - share, true);
        if (share > 0.0F) Accumulate(std::min(above + 1, mHeight - 1), share, false);
        if (mShiftX == 0) {
            std::copy(mLine.begin(), mLine.end(), values);
            return;
        }
        const int step = 1 << mShiftX;
        for (int x = 0; x < mFrame.width; ++x) {
            const auto left = static_cast<std::size_t>(x >> mShiftX);
            const std::size_t right = std::min(left + 1, mLine.size() - 1);
            const float weight = static_cast<float>(x & (step - 1)) / static_cast<float>(step);
            values[x] = mLine[left] * (1.0F - weight) + mLine[right] * weight;
        }
    }

private:
    [[nodiscard]] bool IsChroma() const {
        return (mFormat.flags & AV_PIX_FMT_FLAG_RGB) == 0 && mFormat.nb_components >= 3 &&
               (mComponent == 1 || mComponent == 2);
    }

    [[nodiscard]] const std::uint8_t* RowAt(int line) const {
        const AVComponentDescriptor& component = mFormat.comp[mComponent];
        return mFrame.data[component.plane] + static_cast<std::ptrdiff_t>(mFrame.linesize[component.plane]) * line +
               component.offset;
    }

    void Accumulate(int line, float weight, bool first) {
        const AVComponentDescriptor& component = mFormat.comp[mComponent];
        const bool isFloat = (mFormat.flags & AV_PIX_FMT_FLAG_FLOAT) != 0;
        const bool plain = component.step == 2 && component.shift == 0 && (mFormat.flags & AV_PIX_FMT_FLAG_BE) == 0;
        const auto* numbers = reinterpret_cast<const std::uint16_t*>(RowAt(line));
        if (!isFloat && !plain) {
            av_read_image_line2(mRaw.data(), const_cast<const std::uint8_t**>(mFrame.data), mFrame.linesize, &mFormat,
                                0, line, mComponent, mWidth, 0, sizeof(std::uint16_t));
            numbers = mRaw.data();
        }
        for (int x = 0; x < mWidth; ++x) {
            float value = 0.0F;
            if (isFloat) {
                std::memcpy(&value, RowAt(line) + static_cast<std::ptrdiff_t>(component.step) * x, sizeof value);
            } else {
                value = static_cast<float>(numbers[x]);
            }
            float& sum = mLine[static_cast<std::size_t>(x)];
            sum = first ? weight * value : sum + weight * value;
        }
    }

    const AVFrame& mFrame;
    const AVPixFmtDescriptor& mFormat;
    int mComponent;
    int mShiftX;
    int mShiftY;
    int mWidth;
    int mHeight;
    std::vector<std::uint16_t> mRaw;
    std::vector<float> mLine;
};

/// What turns stored numbers into levels: 0 to 1, chroma -1/2 to 1/2.
struct Levels {
    float black, scale, chromaZero, chromaScale, alphaScale;
};

Levels LevelsOf(const AVPixFmtDescriptor& format, bool fullRange) {
    if ((format.flags & AV_PIX_FMT_FLAG_FLOAT) != 0) return {0.0F, 1.0F, 0.0F, 1.0F, 1.0F};
    const int bits = format.comp[0].depth;
    const auto unit = static_cast<float>(1 << (bits - 8));
    const float peak = 1.0F / static_cast<float>((1 << bits) - 1);
    if (fullRange) return {0.0F, peak, 128.0F * unit, peak, peak};
    return {16.0F * unit, 1.0F / (219.0F * unit), 128.0F * unit, 1.0F / (224.0F * unit), peak};
}

bool IsReadable(int pixelFormat, const AVPixFmtDescriptor& format) {
    constexpr std::uint64_t kOthers =
        AV_PIX_FMT_FLAG_PAL | AV_PIX_FMT_FLAG_BAYER | AV_PIX_FMT_FLAG_HWACCEL | AV_PIX_FMT_FLAG_BITSTREAM;
    if (pixelFormat == AV_PIX_FMT_XYZ12LE || pixelFormat == AV_PIX_FMT_XYZ12BE) return false;
    const bool isFloat = (format.flags & AV_PIX_FMT_FLAG_FLOAT) != 0;
    if ((format.flags & kOthers) != 0 || (isFloat && (format.flags & AV_PIX_FMT_FLAG_BE) != 0)) return false;
    return isFloat ? format.comp[0].depth == 32 : format.comp[0].depth > 8 && format.comp[0].depth <= 16;
}

/// Red, green and blue lines made of luma and chroma, in place.
void TurnIntoColor(float* luma, float* cb, float* cr, std::size_t count, const LumaWeights& weights) {
    const auto redOfCr = static_cast<float>(2.0 * (1.0 - weights.red));
    const auto blueOfCb = static_cast<float>(2.0 * (1.0 - weights.blue));
    const double greenWeight = 1.0 - weights.red - weights.blue;
    const auto greenOfCr = static_cast<float>(weights.red / greenWeight) * redOfCr;
    const auto greenOfCb = static_cast<float>(weights.blue / greenWeight) * blueOfCb;
    for (std::size_t x = 0; x < count; ++x) {
        const float red = luma[x] + redOfCr * cr[x];
        const float green = luma[x] - greenOfCb * cb[x] - greenOfCr * cr[x];
        const float blue = luma[x] + blueOfCb * cb[x];
        luma[x] = red;
        cb[x] = green;
        cr[x] = blue;
    }
}

}  // namespace

bool ConvertDeepPicture(const AVFrame& frame, const LumaWeights& weights, bool fullRange, HostPicture& picture) {
    const AVPixFmtDescriptor* format = av_pix_fmt_desc_get(static_cast<AVPixelFormat>(frame.format));
    if (!format || !IsReadable(frame.format, *format)) return false;
    const Levels levels = LevelsOf(*format, fullRange);
    const bool isColor = (format->flags & AV_PIX_FMT_FLAG_RGB) != 0;
    const bool isGrey = format->nb_components < 3;
    const bool hasAlpha = (format->flags & AV_PIX_FMT_FLAG_ALPHA) != 0;
    const auto width = static_cast<std::size_t>(frame.width);
    std::vector<ComponentReader> readers;
    readers.reserve(static_cast<std::size_t>(format->nb_components));
    for (int i = 0; i < format->nb_components; ++i) readers.emplace_back(frame, *format, i);
    // Red, green, blue, alpha; or luma, chroma twice, alpha.
    std::vector<float> lines[4];
    for (auto& line : lines) line.assign(width, 1.0F);
    for (int y = 0; y < frame.height; ++y) {
        for (std::size_t i = 0; i < readers.size(); ++i) {
            const bool isAlpha = hasAlpha && i + 1 == readers.size();
            const bool isChroma = !isColor && !isAlpha && i > 0;
            float* line = lines[isAlpha ? 3 : i].data();
            readers[i].Read(y, line);
            const float zero = isAlpha ? 0.0F : isChroma ? levels.chromaZero : levels.black;
            const float scale = isAlpha ? levels.alphaScale : isChroma ? levels.chromaScale : levels.scale;
            for (std::size_t x = 0; x < width; ++x) line[x] = (line[x] - zero) * scale;
        }
        if (!isColor && !isGrey) TurnIntoColor(lines[0].data(), lines[1].data(), lines[2].data(), width, weights);
        const float* green = lines[isGrey ? 0 : 1].data();
        const float* blue = lines[isGrey ? 0 : 2].data();
        auto* row = reinterpret_cast<float*>(picture.GetRow(y));
        for (std::size_t x = 0; x < width; ++x) {
            row[4 * x] = blue[x];
            row[4 * x + 1] = green[x];
            row[4 * x + 2] = lines[0][x];
            row[4 * x + 3] = lines[3][x];
        }
    }
    return true;
}

}  // namespace Vantrel::Host
