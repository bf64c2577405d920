// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/PointwiseFilterRecords.h"

#include <algorithm>
#include <cmath>
#include <cstring>

#include "Src/Filters/Effects/ParameterReader.h"
#include "Vantrel/Effects/AlphaAdjust.h"
#include "Vantrel/Effects/BlackAndWhite.h"
#include "Vantrel/Effects/BrightnessContrast.h"
#include "Vantrel/Effects/ColorBalance.h"
#include "Vantrel/Effects/ColorPass.h"
#include "Vantrel/Effects/ColorReplace.h"
#include "Vantrel/Effects/EdgeFeather.h"
#include "Vantrel/Effects/Extract.h"
#include "Vantrel/Effects/FastColorCorrector.h"
#include "Vantrel/Effects/Flips.h"
#include "Vantrel/Effects/GammaCorrection.h"
#include "Vantrel/Effects/Noise.h"
#include "Vantrel/Effects/ProcAmp.h"
#include "Vantrel/Effects/Tint.h"

namespace Vantrel {
namespace {

using Record = PointwiseFilterRecord;
using Reader = ParameterReader;

float Radians(float degrees) {
    constexpr double kRadiansPerDegree = 0.017453292519943295;
    return static_cast<float>(static_cast<double>(degrees) * kRadiansPerDegree);
}

/// Blue, green and red; an effect has no use for a colour's alpha.
void ReadColor(const Reader& read, std::int32_t index, float& blue, float& green, float& red) {
    float alpha = 0.0F;
    read.GetEffect().GetColorParam(index, read.GetTime(), blue, green, red, alpha);
}

void NoValues(const Reader& /*read*/, std::int64_t /*frameTicks*/, Record& /*record*/) {}

void AlphaAdjust(const Reader& read, std::int64_t /*frameTicks*/, Record& record) {
    record.r1 = read.Number(0);
    record.r2 = read.Number(1);
    record.r3 = read.Number(2);
    record.r4 = read.Number(3);
}

/// r3 to r4 is the interval that becomes r5 to r6, r2 the slope; without r1 the interval is empty.
void BrightnessContrast(const Reader& read, std::int64_t /*frameTicks*/, Record& record) {
    constexpr float kLeastInterval = 8e-6F;
    const float brightness = read.Number(0) / 255.0F;
    const float contrast = read.Number(1) / 200.0F;
    record.r4 = record.r6 = 1.0F;
    if (contrast >= 0.0F) {
        record.r3 = contrast - brightness;
        record.r4 = 1.0F - contrast - brightness;
    } else {
        record.r5 = brightness - contrast;
        record.r6 = contrast + 1.0F + brightness;
    }
    const float interval = record.r4 - record.r3;
    if (std::abs(interval) < kLeastInterval) return;
    record.r2 = (record.r6 - record.r5) / interval;
    record.r1 = 1.0F;
}

void ColorBalance(const Reader& read, std::int64_t /*frameTicks*/, Record& record) {
    record.r1 = read.Number(2);
    record.r2 = read.Number(1);
    record.r3 = read.Number(0);
}

void ColorPass(const Reader& read, std::int64_t /*frameTicks*/, Record& record) {
    record.r1 = read.Integer(1) != 0 ? 1.0F : 0.0F;
    record.r2 = static_cast<float>(read.Integer(0)) / 127.0F;
    ReadColor(read, 2, record.r3, record.r4, record.r5);
}

void ColorReplace(const Reader& read, std::int64_t frameTicks, Record& record) {
    ColorPass(read, frameTicks, record);
    ReadColor(read, 3, record.r6, record.r7, record.r8);
}

void EdgeFeather(const Reader& read, std::int64_t /*frameTicks*/, Record& record) {
    record.r1 = read.Number(0) * 4.0F / 3.0F + 0.5F;
}

void Extract(const Reader& read, std::int64_t /*frameTicks*/, Record& record) {
    record.r1 = read.Number(3);
    record.r2 = read.Number(0);
    record.r3 = read.Number(1);
    record.r4 = read.Number(2);
}

/// The wheel becomes a direction of length sqrt(1/2), r8 and r9, and a strength, r10; angles run with y downward.
void FastColorCorrector(const Reader& read, std::int64_t /*frameTicks*/, Record& record) {
    constexpr float kSqrtHalf = 0.70710677F;
    const std::int32_t output = read.Integer(0);
    if (output == kFastCorrectorOutput_Luma) record.type = kPointwise_FastCorrectorLuma;
    if (output == kFastCorrectorOutput_Mask) record.type = kPointwise_FastCorrectorMask;
    record.r1 = read.Number(23);
    record.r2 = read.Number(21);
    record.r3 = read.Number(25);
    record.r4 = read.Number(24);
    record.r5 = 1.0F / read.Number(22);
    record.r6 = read.Number(11) * 0.01F;
    record.r7 = -Radians(read.Number(6));
    const float angle = Radians(read.Number(9));
    const float amount = read.Number(7);
    const float direction = std::atan2(std::sin(angle) * amount * 0.5F, std::cos(angle) * amount * 0.5F);
    record.r8 = std::cos(-direction) * kSqrtHalf;
    record.r9 = std::sin(-direction) * kSqrtHalf;
    record.r10 = read.Number(8) * amount;
    record.r11 = 1.0F;
    if (!read.Flag(1)) return;
    // The sign tells columns from rows.
    record.r11 = read.Integer(2) == kSplitLayout_Columns ? read.Number(3) : -read.Number(3);
}

void GammaCorrection(const Reader& read, std::int64_t /*frameTicks*/, Record& record) {
    record.r1 = read.Number(0) / 10.0F;
}

void Noise(const Reader& read, std::int64_t frameTicks, Record& record) {
    record.r1 = read.Number(0);
    record.r2 = read.Number(1);
    record.r3 = read.Number(2);
    const std::int64_t number = frameTicks != 0 ? read.GetTime() / frameTicks : 0;
    record.r4 = static_cast<float>(number);
}

void ProcAmp(const Reader& read, std::int64_t /*frameTicks*/, Record& record) {
    record.r1 = read.Number(0);
    record.r2 = read.Number(1);
    const float hue = Radians(read.Number(2));
    const float saturation = read.Number(3);
    record.r3 = std::cos(hue) * saturation;
    record.r4 = std::sin(hue) * saturation;
    record.r5 = read.Flag(4) ? read.Number(5) : 1.0F;
}

void Tint(const Reader& read, std::int64_t /*frameTicks*/, Record& record) {
    ReadColor(read, 0, record.r1, record.r2, record.r3);
    ReadColor(read, 1, record.r4, record.r5, record.r6);
    record.r7 = read.Number(2);
}

struct Filter {
    PointwiseFilterType type;
    const EffectRow* effect;
    void (*fill)(const Reader& read, std::int64_t frameTicks, Record& record);
    bool readsElsewhere = false;
};
constexpr Filter kFilters[] = {
    {kPointwise_AlphaAdjust, &kAlphaAdjustEffect, AlphaAdjust},
    {kPointwise_BlackAndWhite, &kBlackAndWhiteEffect, NoValues},
    {kPointwise_BrightnessContrast, &kBrightnessContrastEffect, BrightnessContrast},
    {kPointwise_ColorBalance, &kColorBalanceEffect, ColorBalance},
    {kPointwise_ColorPass, &kColorPassEffect, ColorPass},
    {kPointwise_ColorReplace, &kColorReplaceEffect, ColorReplace},
    {kPointwise_EdgeFeather, &kEdgeFeatherEffect, EdgeFeather},
    {kPointwise_Extract, &kExtractEffect, Extract},
    {kPointwise_FastCorrector, &kFastColorCorrectorEffect, FastColorCorrector},
    {kPointwise_GammaCorrection, &kGammaCorrectionEffect, GammaCorrection},
    {kPointwise_HorizontalFlip, &kHorizontalFlipEffect, NoValues, true},
    {kPointwise_Noise, &kNoiseEffect, Noise},
    {kPointwise_ProcAmp, &kProcAmpEffect, ProcAmp},
    {kPointwise_Tint, &kTintEffect, Tint},
    {kPointwise_VerticalFlip, &kVerticalFlipEffect, NoValues, true},
};

bool IsNamed(const WideString& name, const char* text) {
    return std::equal(name.begin(), name.end(), text, text + std::strlen(text),
                      [](char16_t wide, char narrow) { return wide == static_cast<unsigned char>(narrow); });
}

}  // namespace

void FillPointwiseFilterRecord(FilterNode& node, const RenderParams& params, PointwiseFilterRecord& record,
                               bool& needsNewFrame) {
    const WideString name = node.GetName();
    for (const Filter& filter : kFilters) {
        if (!IsNamed(name, filter.effect->matchName)) continue;
        const std::int64_t time = node.GetNodeTime(params.clipTime, false);
        record.type = filter.type;
        filter.fill(ParameterReader(*node.GetDescription(), *filter.effect, time), params.frameTicks, record);
        needsNewFrame = needsNewFrame || filter.readsElsewhere;
        return;
    }
}

}  // namespace Vantrel
