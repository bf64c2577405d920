// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Kiln/Resample.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <cstring>
#include <vector>

#include "Kiln/ParallelRows.h"

namespace Kiln {
namespace {

using Vellum::RenderQuality;

// The source pixels that one target pixel is made of, with weights that add up to 1.
struct Taps {
    std::int32_t first = 0;
    std::vector<float> weights;
};

double WeighLinear(double x) { return std::max(0.0, 1.0 - std::abs(x)); }

// Keys, "Cubic convolution interpolation for digital image processing", 1981, with a = -1/2.
double WeighCubic(double x) {
    x = std::abs(x);
    if (x < 1.0) return (1.5 * x - 2.5) * x * x + 1.0;
    if (x < 2.0) return ((-0.5 * x + 2.5) * x - 4.0) * x + 2.0;
    return 0.0;
}

Taps MakeTaps(std::int32_t index, std::int32_t targetSize, std::int32_t sourceSize, RenderQuality quality) {
    const double ratio = static_cast<double>(sourceSize) / targetSize;
    const double centre = (index + 0.5) * ratio - 0.5;
    const auto clampToSource = [&](double x) {
        return static_cast<std::int32_t>(std::clamp(x, 0.0, static_cast<double>(sourceSize - 1)));
    };
    if (quality < RenderQuality::kMedium) return {clampToSource(std::floor(centre + 0.5)), {1.0F}};
    const bool isCubic = quality > RenderQuality::kMedium;
    const double stretch = isCubic ? std::max(1.0, ratio) : 1.0;
    const double reach = (isCubic ? 2.0 : 1.0) * stretch;
    const auto low = static_cast<std::int32_t>(std::ceil(centre - reach));
    const auto high = static_cast<std::int32_t>(std::floor(centre + reach));
    Taps taps;
    taps.first = clampToSource(low);
    std::vector<double> weights(static_cast<std::size_t>(clampToSource(high) - taps.first + 1));
    double sum = 0.0;
    // What lies beyond the edge counts for the edge's own pixel.
    for (std::int32_t i = low; i <= high; ++i) {
        const double weight = isCubic ? WeighCubic((i - centre) / stretch) : WeighLinear(i - centre);
        weights[static_cast<std::size_t>(clampToSource(i) - taps.first)] += weight;
        sum += weight;
    }
    for (const double weight : weights) taps.weights.push_back(static_cast<float>(weight / sum));
    return taps;
}

std::vector<Taps> MakeAllTaps(std::int32_t targetSize, std::int32_t sourceSize, RenderQuality quality) {
    std::vector<Taps> taps;
    taps.reserve(static_cast<std::size_t>(targetSize));
    for (std::int32_t i = 0; i < targetSize; ++i) taps.push_back(MakeTaps(i, targetSize, sourceSize, quality));
    return taps;
}

// How a format's four numbers are read: scale of the stored integers, which is alpha, and the colour that stands for
// none.
struct Layout {
    bool isFloat = false;
    bool weighsByAlpha = false;
    std::size_t alpha = 3;
    std::array<float, 4> neutral = {};
};

Layout GetLayout(const FrameAttributes& attributes) {
    using namespace Vellum::PixelFormatBits;
    const std::uint32_t upper = attributes.format.GetUpper();
    Layout layout;
    layout.isFloat = (upper & kLayoutMask) == kLayoutFloat;
    layout.weighsByAlpha =
        attributes.alphaType == Vellum::kAlphaType_Straight && (upper & kAlpha) != 0 && (upper & kPremultiplied) == 0;
    layout.alpha = (upper & kOrderMask) == kOrderARGB ? 0 : 3;
    if ((upper & kClassMask) == kClassYUV) layout.neutral = {128.0F, 128.0F, 16.0F, 0.0F};
    return layout;
}

// Four numbers that the processor takes as one; a class of its own, because containers drop a type's attributes.
struct Pixel {
    using Vector = float __attribute__((vector_size(16)));
    Vector values = {};

    float operator[](std::size_t channel) const { return values[channel]; }
};
using Row = std::vector<Pixel>;

// Resamples the rows of one band. Source rows are brought to the target's width once each and kept while they are
// needed.
class BandResampler {
public:
    BandResampler(const Layout& layout, const FrameAttributes& from, const std::uint8_t* source,
                  const std::vector<Taps>& columns)
        : mLayout(layout),
          mFrom(from),
          mSource(source),
          mColumns(columns),
          mNeutral{layout.neutral[0], layout.neutral[1], layout.neutral[2], layout.neutral[3]},
          mDecoded(static_cast<std::size_t>(from.width)) {}

    void MakeRow(const Taps& rows, std::uint8_t* target) {
        Row sum(mColumns.size(), Pixel{});
        for (std::size_t i = 0; i < rows.weights.size(); ++i) {
            const Row& row = GetRow(rows.first + static_cast<std::int32_t>(i), rows.weights.size());
            const float weight = rows.weights[i];
            for (std::size_t x = 0; x < sum.size(); ++x) sum[x].values += weight * row[x].values;
        }
        Encode(sum, target);
    }

private:
    struct KeptRow {
        std::int32_t index = -1;
        Row row;
    };

    const Row& GetRow(std::int32_t index, std::size_t rowsInUse) {
        if (mKept.size() < rowsInUse) mKept.resize(rowsInUse);
        KeptRow& kept = mKept[static_cast<std::size_t>(index) % mKept.size()];
        if (kept.index != index) {
            kept.index = index;
            Decode(index);
            kept.row.resize(mColumns.size());
            for (std::size_t x = 0; x < mColumns.size(); ++x) kept.row[x] = SumUp(mColumns[x]);
        }
        return kept.row;
    }

    [[nodiscard]] Pixel SumUp(const Taps& taps) const {
        const Pixel* pixel = &mDecoded[static_cast<std::size_t>(taps.first)];
        Pixel sum;
        for (const float weight : taps.weights) sum.values += weight * (pixel++)->values;
        return sum;
    }

    void Decode(std::int32_t index) {
        const std::uint8_t* row = mSource + static_cast<std::ptrdiff_t>(index) * mFrom.rowBytes;
        if (mLayout.isFloat) {
            std::memcpy(static_cast<void*>(mDecoded.data()), row, mDecoded.size() * sizeof(Pixel));
        } else {
            for (Pixel& pixel : mDecoded) {
                for (std::size_t c = 0; c < 4; ++c) pixel.values[c] = *row++;
            }
        }
        if (!mLayout.weighsByAlpha) return;
        for (Pixel& pixel : mDecoded) {
            const float alpha = pixel[mLayout.alpha];
            pixel.values = (pixel.values - mNeutral) * alpha;
            pixel.values[mLayout.alpha] = alpha;
        }
    }

    void Encode(Row& row, std::uint8_t* target) const {
        if (mLayout.weighsByAlpha) {
            for (Pixel& pixel : row) {
                const float alpha = pixel[mLayout.alpha];
                pixel.values = pixel.values * (alpha > 0.0F ? 1.0F / alpha : 0.0F) + mNeutral;
                pixel.values[mLayout.alpha] = alpha;
            }
        }
        if (mLayout.isFloat) {
            std::memcpy(target, static_cast<const void*>(row.data()), row.size() * sizeof(Pixel));
            return;
        }
        for (const Pixel& pixel : row) {
            for (std::size_t c = 0; c < 4; ++c) {
                const float raised = pixel[c] + 0.5F;
                const float positive = raised > 0.0F ? raised : 0.0F;
                *target++ = static_cast<std::uint8_t>(static_cast<std::int32_t>(positive < 255.0F ? positive : 255.0F));
            }
        }
    }

    const Layout& mLayout;
    const FrameAttributes& mFrom;
    const std::uint8_t* mSource;
    const std::vector<Taps>& mColumns;
    const Pixel::Vector mNeutral;
    Row mDecoded;
    std::vector<KeptRow> mKept;
};

}  // namespace

Status ResampleOnHost(const FrameAttributes& to, std::uint8_t* target, const FrameAttributes& from,
                      const std::uint8_t* source, RenderQuality quality) {
    const Layout layout = GetLayout(from);
    const std::size_t bytesPerPixel = Vellum::BytesPerPixel(from.format);
    if (bytesPerPixel != (layout.isFloat ? sizeof(Pixel) : 4)) return Ostrand::kStatus_Failure;
    const std::vector<Taps> columns = MakeAllTaps(to.width, from.width, quality);
    const std::vector<Taps> rows = MakeAllTaps(to.height, from.height, quality);
    // A band makes its first rows' neighbours anew, so bands of a few rows would do most of the work twice.
    constexpr std::int32_t kFewestRows = 48;
    const std::uint64_t rowCost = static_cast<std::uint64_t>(std::max(to.width, from.width)) * sizeof(Pixel);
    ForEachBand(to.height, rowCost, kFewestRows, [&](std::int32_t first, std::int32_t last) {
        BandResampler resampler(layout, from, source, columns);
        for (std::int32_t y = first; y < last; ++y) {
            resampler.MakeRow(rows[static_cast<std::size_t>(y)], target + static_cast<std::ptrdiff_t>(y) * to.rowBytes);
        }
    });
    return Ostrand::kStatus_OK;
}

}  // namespace Kiln
