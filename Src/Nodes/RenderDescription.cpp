// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Nodes/RenderDescription.h"

#include <cstring>

#include "Tarn/Glaze.h"

namespace Vantrel {
namespace {

// Nine codes each, in order of preference: what the device converts cheapest comes first. The matrix of the wanted
// format leads.
constexpr char kFormats709[] = "VUYAvux7vup7bgraargbbgrxxrgbbgrpprgb";
constexpr char kFormats601[] = "vuyavuyxvuypbgraargbbgrxxrgbbgrpprgb";
static_assert(sizeof kFormats709 == 9 * 4 + 1 && sizeof kFormats601 == sizeof kFormats709);

}  // namespace

RenderDescription::RenderDescription(const RenderParams& params) {
    if (params.anyPixelFormat == 0) {
        mFormats[0] = params.pixelFormat;
        mDescription.pixelFormatCount = 2;
    } else {
        const bool is709 =
            (Tarn::SDKToBEPixelFormat(params.pixelFormat).GetUpper() & Vellum::PixelFormatBits::kBT709) != 0;
        std::memcpy(mFormats.data(), is709 ? kFormats709 : kFormats601, sizeof mFormats);
        mDescription.pixelFormatCount = static_cast<std::int32_t>(mFormats.size());
    }
    mDescription.pixelFormats = mFormats.data();
    mDescription.width = params.outputRect.Width();
    mDescription.height = params.outputRect.Height();
    mDescription.aspectNumerator = params.pixelAspectRatio.numerator;
    mDescription.aspectDenominator = params.pixelAspectRatio.denominator;
    mDescription.quality = params.quality;
    mDescription.fieldType = params.fieldType;
    mDescription.deinterlaceQuality = params.quality;
}

}  // namespace Vantrel
