// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <map>

#include "Host/Software/CorrectorControls.h"
#include "Host/Software/EffectContext.h"
#include "Host/Software/Effects/Basic3D.h"
#include "Host/Software/Effects/Crop.h"
#include "Host/Software/Effects/Curves.h"
#include "Host/Software/Effects/DirectionalBlur.h"
#include "Host/Software/Effects/DropShadow.h"
#include "Host/Software/Effects/GarbageMatte.h"
#include "Host/Software/Effects/GaussianBlur.h"
#include "Host/Software/Effects/Invert.h"
#include "Host/Software/Effects/Levels.h"
#include "Host/Software/Effects/LumaCorrector.h"
#include "Host/Software/Effects/PointwiseFilters.h"
#include "Host/Software/Effects/RGBColorCorrector.h"
#include "Host/Software/Effects/Sharpen.h"
#include "Host/Software/Effects/ThreeWayColorCorrector.h"
#include "Host/Software/Effects/Timecode.h"
#include "Host/Software/Effects/TrackMatte.h"
#include "Host/Software/Effects/UltraKey.h"
#include "Host/Software/Effects/VideoLimiter.h"
#include "Vantrel/Effects/Invert.h"

/// The one place that knows which scalar function is which effect: it reads parameters and calls.
namespace Vantrel::Host::Software {

namespace {

void RunInvert(const EffectContext& context, LayerPicture& layer) {
    Invert(layer.picture, context.Integer(kInvert_Channel), context.Number(kInvert_Blend) / 100.0);
}

void RunLumaCorrector(const EffectContext& context, LayerPicture& layer) {
    constexpr std::int32_t kSets = 13, kSetSize = 6;
    std::array<LumaSet, 4> sets;
    for (std::int32_t i = 0; i < 4; ++i) {
        const std::int32_t first = kSets + i * kSetSize;
        sets[static_cast<std::size_t>(i)] = {context.Number(first) / 255.0, context.Number(first + 1) / 100.0,
                                             context.Number(first + 2),     context.Number(first + 3),
                                             context.Number(first + 4),     context.Number(first + 5)};
    }
    LumaCorrect(layer.picture, ReadCorrector(context, layer, {39, 44, 6}), sets);
}

}  // namespace

EffectFunction FindEffectFunction(const std::string& matchName) {
    static const std::map<std::string, EffectFunction> kFunctions = {
        {"TQ.XQVE Fast Blur", RunGaussianBlur},
        {"TQ.XQVE Gaussian Blur 2", RunGaussianBlur},
        {"TQ.XQVE Invert", RunInvert},
        {"TQ.XQVE Luma Corrector", RunLumaCorrector},
        {"TQ.XQVE Luma Curve", RunLumaCurve},
        {"TQ.XQVE RGB Curves", RunRGBCurves},
        {"KL.XQVE Levels", RunLevels},
        {"TQ.XQVE Video Limiter", RunVideoLimiter},
        {"TQ.XQVE Alpha Adjust", RunAlphaAdjust},
        {"KL.XQVE Black & White", RunBlackAndWhite},
        {"TQ.XQVE Brightness & Contrast 2", RunBrightnessContrast},
        {"KL.XQVE Color Balance", RunColorBalance},
        {"KL.XQVE Color Pass", RunColorPass},
        {"KL.XQVE Color Replace", RunColorReplace},
        {"KL.XQVE Edge Feather", RunEdgeFeather},
        {"KL.XQVE Extract", RunExtract},
        {"TQ.XQVE Fast Color Corrector", RunFastColorCorrector},
        {"KL.XQVE Gamma Correction", RunGammaCorrection},
        {"KL.XQVE Horizontal Flip", RunHorizontalFlip},
        {"TQ.XQVE Noise", RunNoise},
        {"TQ.XQVE ProcAmp", RunProcAmp},
        {"TQ.XQVE Tint", RunTint},
        {"KL.XQVE Vertical Flip", RunVerticalFlip},
        {"TQ.XQVE Ultra Key", RunUltraKey},
        {"TQ.XQVE Sharpen", RunSharpen},
        {"TQ.XQVE Motion Blur", RunDirectionalBlur},
        {"TQ.XQVE Drop Shadow", RunDropShadow},
        {"TQ.XQVE RGB Color Corrector", RunRGBColorCorrector},
        {"TQ.XQVE Three-Way Color Corrector", RunThreeWayColorCorrector},
        {"TQ.XQVE Basic 3D", RunBasic3D},
        {"TQ.XQVE TQCrop", RunCrop},
        {"TQ.XQVE Legacy Key Track Matte", RunTrackMatte},
        {"TQ.XQVE Garbage Matte", RunGarbageMatte},
        {"TQ.XQVE Garbage Matte 8", RunGarbageMatte},
        {"TQ.XQVE Garbage Matte 16", RunGarbageMatte},
        {"TQ.XQVE Lspr Timecode", RunTimecode},
    };
    const auto found = kFunctions.find(matchName);
    return found == kFunctions.end() ? nullptr : found->second;
}

}  // namespace Vantrel::Host::Software
