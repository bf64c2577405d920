// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstring>

#include "Vantrel/Effects/AlphaAdjust.h"
#include "Vantrel/Effects/Basic3D.h"
#include "Vantrel/Effects/BlackAndWhite.h"
#include "Vantrel/Effects/BrightnessContrast.h"
#include "Vantrel/Effects/ColorBalance.h"
#include "Vantrel/Effects/ColorPass.h"
#include "Vantrel/Effects/ColorReplace.h"
#include "Vantrel/Effects/Crop.h"
#include "Vantrel/Effects/Curves.h"
#include "Vantrel/Effects/DirectionalBlur.h"
#include "Vantrel/Effects/DropShadow.h"
#include "Vantrel/Effects/EdgeFeather.h"
#include "Vantrel/Effects/Extract.h"
#include "Vantrel/Effects/FastColorCorrector.h"
#include "Vantrel/Effects/Flips.h"
#include "Vantrel/Effects/GammaCorrection.h"
#include "Vantrel/Effects/GarbageMatte.h"
#include "Vantrel/Effects/GaussianBlur.h"
#include "Vantrel/Effects/Intrinsics.h"
#include "Vantrel/Effects/Invert.h"
#include "Vantrel/Effects/Levels.h"
#include "Vantrel/Effects/LumaCorrector.h"
#include "Vantrel/Effects/Noise.h"
#include "Vantrel/Effects/ProcAmp.h"
#include "Vantrel/Effects/RGBColorCorrector.h"
#include "Vantrel/Effects/Sharpen.h"
#include "Vantrel/Effects/Stabilizer.h"
#include "Vantrel/Effects/ThreeWayColorCorrector.h"
#include "Vantrel/Effects/Timecode.h"
#include "Vantrel/Effects/Tint.h"
#include "Vantrel/Effects/TrackMatte.h"
#include "Vantrel/Effects/UltraKey.h"
#include "Vantrel/Effects/VideoLimiter.h"

/// The effects and their parameters as data, the one place where an index, a name or a default is told: nodes read by
/// these indices, hosts read files and list effects by these rows. An effect is a header in Vantrel/Effects and a line
/// here.
namespace Vantrel {

inline constexpr const EffectRow* kEffectTable[] = {
    &kMotionEffect,
    &kOpacityEffect,
    &kInvertEffect,
    &kLumaCorrectorEffect,
    &kLumaCurveEffect,
    &kRGBCurvesEffect,
    &kLevelsEffect,
    &kVideoLimiterEffect,
    &kAlphaAdjustEffect,
    &kBlackAndWhiteEffect,
    &kBrightnessContrastEffect,
    &kColorBalanceEffect,
    &kColorPassEffect,
    &kColorReplaceEffect,
    &kEdgeFeatherEffect,
    &kExtractEffect,
    &kFastColorCorrectorEffect,
    &kGammaCorrectionEffect,
    &kHorizontalFlipEffect,
    &kNoiseEffect,
    &kProcAmpEffect,
    &kTintEffect,
    &kVerticalFlipEffect,
    &kFastBlurEffect,
    &kGaussianBlurEffect,
    &kUltraKeyEffect,
    &kRGBColorCorrectorEffect,
    &kThreeWayColorCorrectorEffect,
    &kSharpenEffect,
    &kBasic3DEffect,
    &kCropEffect,
    &kTrackMatteEffect,
    &kGarbageMatteEffect,
    &kGarbageMatte8Effect,
    &kGarbageMatte16Effect,
    &kTimecodeEffect,
    &kDirectionalBlurEffect,
    &kDropShadowEffect,
    &kStabilizerEffect,
};

/// The effect of that match name, or null.
[[nodiscard]] inline const EffectRow* FindEffect(const char* matchName) {
    for (const EffectRow* effect : kEffectTable) {
        if (std::strcmp(effect->matchName, matchName) == 0) return effect;
    }
    return nullptr;
}

}  // namespace Vantrel
