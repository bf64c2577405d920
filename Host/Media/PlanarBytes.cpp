// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Media/PlanarBytes.h"

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <vector>

namespace Vantrel::Host {

namespace {

/// Chroma is summed in sixteenths of a level and multiplied in 256ths; colour is summed in 32nds. All of it fits 16
/// bits.
constexpr int kChromaZero = 128 * 16;
constexpr int kSixteenthTo256th = 16;
constexpr int kColorBits = 5;
constexpr int kLumaBits = 7;

/// What a step of luma or chroma adds to a colour, as factors for MultiplyHigh.
struct Factors {
    std::int16_t luma, redOfCr, greenOfCb, greenOfCr, blueOfCb;
    std::int16_t black;
};

Factors FactorsFor(const LumaWeights& weights, bool fullRange) {
    const double lumaStep = fullRange ? 1.0 : 255.0 / 219.0;
    const double chromaStep = fullRange ? 1.0 : 255.0 / 224.0;
    const double green = 1.0 - weights.red - weights.blue;
    const double redOfCr = 2.0 * (1.0 - weights.red) * chromaStep;
    const double blueOfCb = 2.0 * (1.0 - weights.blue) * chromaStep;
    const auto toLuma = [](double value) {
        return static_cast<std::int16_t>(std::lround(value * (1 << (15 + kColorBits - kLumaBits))));
    };
    const auto toChroma = [](double value) {
        return static_cast<std::int16_t>(std::lround(value * (1 << (15 + kColorBits - 8))));
    };
    return {toLuma(lumaStep),
            toChroma(redOfCr),
            toChroma(-blueOfCb * weights.blue / green),
            toChroma(-redOfCr * weights.red / green),
            toChroma(blueOfCb),
            static_cast<std::int16_t>(fullRange ? 0 : 16)};
}

/// One line of the picture on its way.
struct Line {
    const std::uint8_t* luma;
    const std::uint8_t* near[2];  ///< of the blue and the red chroma plane, the line that is closer
    const std::uint8_t* far[2];
    int nearWeight;  ///< of 4
    int width;
    int chromaWidth;
    bool halfWidth;
    bool centred;
    std::int16_t* sums;       ///< room for a line of chroma and one value on each side
    std::int16_t* chroma[2];  ///< room for a line of pixels and one more
    std::uint8_t* out;
};

#define ALWAYS_INLINE inline __attribute__((always_inline))

/// The high half of the product of two 16-bit numbers, doubled and rounded: an instruction of its own.
ALWAYS_INLINE std::int16_t MultiplyHigh(std::int16_t a, std::int16_t b) {
    return static_cast<std::int16_t>((((std::int32_t{a} * b) >> 14) + 1) >> 1);
}

ALWAYS_INLINE void SpreadChroma(const Line& line, int plane) {
    std::int16_t* sums = line.sums + 1;
    const std::uint8_t* near = line.near[plane];
    const std::uint8_t* far = line.far[plane];
    const auto nearWeight = static_cast<std::int16_t>(line.nearWeight);
    const auto farWeight = static_cast<std::int16_t>(4 - line.nearWeight);
    const int count = line.chromaWidth;
    for (std::ptrdiff_t x = 0; x < count; ++x) {
        sums[x] = static_cast<std::int16_t>(near[x] * nearWeight + far[x] * farWeight - kChromaZero / 4);
    }
    sums[-1] = sums[0];
    sums[count] = sums[count - 1];
    std::int16_t* values = line.chroma[plane];
    if (!line.halfWidth) {
        for (std::ptrdiff_t x = 0; x < count; ++x) values[x] = static_cast<std::int16_t>(4 * sums[x]);
    } else if (line.centred) {
        for (std::ptrdiff_t x = 0; x < count; ++x) {
            values[2 * x] = static_cast<std::int16_t>(3 * sums[x] + sums[x - 1]);
            values[2 * x + 1] = static_cast<std::int16_t>(3 * sums[x] + sums[x + 1]);
        }
    } else {
        for (std::ptrdiff_t x = 0; x < count; ++x) {
            values[2 * x] = static_cast<std::int16_t>(4 * sums[x]);
            values[2 * x + 1] = static_cast<std::int16_t>(2 * (sums[x] + sums[x + 1]));
        }
    }
}

ALWAYS_INLINE std::uint8_t ToByte(int sum) {
    const auto level = static_cast<std::int16_t>(sum >> kColorBits);
    return static_cast<std::uint8_t>(std::clamp<std::int16_t>(level, 0, 255));
}

ALWAYS_INLINE void ConvertLineBody(const Line& line, const Factors& factors) {
    SpreadChroma(line, 0);
    SpreadChroma(line, 1);
    const std::uint8_t* luma = line.luma;
    const std::int16_t* cbs = line.chroma[0];
    const std::int16_t* crs = line.chroma[1];
    std::uint8_t* __restrict out = line.out;
    const Factors f = factors;
    constexpr int kHalf = 1 << (kColorBits - 1);
    const int width = line.width;
    for (std::ptrdiff_t x = 0; x < width; ++x) {
        const auto level = static_cast<std::int16_t>((luma[x] - f.black) * (1 << kLumaBits));
        const auto cb = static_cast<std::int16_t>(cbs[x] * kSixteenthTo256th);
        const auto cr = static_cast<std::int16_t>(crs[x] * kSixteenthTo256th);
        const auto base = static_cast<std::int16_t>(MultiplyHigh(level, f.luma) + kHalf);
        const auto blue = static_cast<std::int16_t>(base + MultiplyHigh(cb, f.blueOfCb));
        const auto green =
            static_cast<std::int16_t>(base + MultiplyHigh(cb, f.greenOfCb) + MultiplyHigh(cr, f.greenOfCr));
        const auto red = static_cast<std::int16_t>(base + MultiplyHigh(cr, f.redOfCr));
        out[4 * x] = ToByte(blue);
        out[4 * x + 1] = ToByte(green);
        out[4 * x + 2] = ToByte(red);
        out[4 * x + 3] = 255;
    }
}

void ConvertLine(const Line& line, const Factors& factors) { ConvertLineBody(line, factors); }

#if defined(__x86_64__)
__attribute__((target("avx2"))) void ConvertLineWide(const Line& line, const Factors& factors) {
    ConvertLineBody(line, factors);
}
bool HasWideVectors() { return __builtin_cpu_supports("avx2") != 0; }
#else
void ConvertLineWide(const Line& line, const Factors& factors) { ConvertLineBody(line, factors); }
bool HasWideVectors() { return false; }
#endif

/// Shifts from pixels to chroma.
struct Halving {
    int across, down;
};

bool FindHalving(int format, Halving& halving) {
    switch (format) {
        case AV_PIX_FMT_YUV420P:
        case AV_PIX_FMT_YUVJ420P:
            halving = {1, 1};
            return true;
        case AV_PIX_FMT_YUV422P:
        case AV_PIX_FMT_YUVJ422P:
            halving = {1, 0};
            return true;
        case AV_PIX_FMT_YUV444P:
        case AV_PIX_FMT_YUVJ444P:
            halving = {0, 0};
            return true;
        default:
            return false;
    }
}

}  // namespace

bool ConvertPlanarBytes(const AVFrame& frame, const LumaWeights& weights, bool fullRange, HostPicture& picture) {
    Halving halving{};
    if (!FindHalving(frame.format, halving)) return false;
    const Factors factors = FactorsFor(weights, fullRange);
    const auto convert = HasWideVectors() ? ConvertLineWide : ConvertLine;
    Line line{};
    line.width = frame.width;
    line.chromaWidth = AV_CEIL_RSHIFT(frame.width, halving.across);
    line.halfWidth = halving.across != 0;
    line.centred = frame.chroma_location == AVCHROMA_LOC_CENTER;
    const auto room = static_cast<std::size_t>(frame.width) + 2;
    std::vector<std::int16_t> buffer(3 * room);
    line.sums = buffer.data();
    line.chroma[0] = buffer.data() + room;
    line.chroma[1] = buffer.data() + 2 * room;
    const int lastChroma = AV_CEIL_RSHIFT(frame.height, halving.down) - 1;
    for (int y = 0; y < frame.height; ++y) {
        // A line of halved chroma lies between the two lines of pixels that share it.
        const int near = y >> halving.down;
        const int far = halving.down == 0 ? near : std::clamp((y & 1) != 0 ? near + 1 : near - 1, 0, lastChroma);
        line.nearWeight = halving.down == 0 ? 4 : 3;
        line.luma = frame.data[0] + static_cast<std::ptrdiff_t>(frame.linesize[0]) * y;
        for (int plane = 0; plane < 2; ++plane) {
            const auto pitch = static_cast<std::ptrdiff_t>(frame.linesize[1 + plane]);
            line.near[plane] = frame.data[1 + plane] + pitch * near;
            line.far[plane] = frame.data[1 + plane] + pitch * far;
        }
        line.out = reinterpret_cast<std::uint8_t*>(picture.GetRow(y));
        convert(line, factors);
    }
    return true;
}

}  // namespace Vantrel::Host
