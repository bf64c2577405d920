// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
// What holds of every effect: its kernel agrees with the scalar version, and its defaults leave the picture alone.
#include <algorithm>
#include <cmath>
#include <set>

#include "Src/Nodes/NodeRegistry.h"
#include "Tests/Effects/EffectTester.h"
#include "Vantrel/EffectTable.h"

namespace Vantrel::Testing {
namespace {

/// What makes an effect's comparison its own.
struct EffectCase {
    const char* matchName;
    /// The share of pixels that may differ: where a comparison of two nearly equal numbers decides.
    double exceptionShare = 0.0;
    bool neutralByDefault = true;
    /// By how much its steepest part stretches what was rounded before.
    double stretch = 1.0;
    /// Times the tolerance, where a difference of two nearly equal numbers is magnified.
    double slack = 1.0;
};

bool Softens(const EffectRow& effect, const ParameterValues& values) {
    for (std::size_t i = 0; i < effect.parameterCount; ++i) {
        const ParameterRow& row = effect.parameters[i];
        if (std::string(row.name) == "selection_soften" && values.at(row.index)[0] > 0.0) return true;
    }
    return false;
}

using EveryEffect = EffectTest;

constexpr EffectCase kCases[] = {
    {"TQ.XQVE Luma Corrector", 0.02, true, 30.0},
    // Steep curves, and narrow levels under a power, stretch the rounding of what they are given.
    {"TQ.XQVE Luma Curve", 0.05, true, 40.0},
    {"TQ.XQVE RGB Curves", 0.05, true, 40.0},
    {"KL.XQVE Levels", 0.02, true, 30.0},
    {"TQ.XQVE Video Limiter", 0.02, false, 10.0},
    {"TQ.XQVE Alpha Adjust"},
    {"KL.XQVE Black & White", 0.0, false},
    {"TQ.XQVE Brightness & Contrast 2"},
    {"KL.XQVE Color Balance"},
    {"KL.XQVE Color Pass", 0.0, false, 24.0},
    {"KL.XQVE Color Replace", 0.0, true, 24.0},
    {"KL.XQVE Edge Feather"},
    {"KL.XQVE Extract", 0.0, false, 255.0},
    {"TQ.XQVE Fast Color Corrector", 0.01, true, 100.0},
    {"KL.XQVE Gamma Correction"},
    {"KL.XQVE Horizontal Flip", 0.0, false},
    // The saturation of a colour that is grey but for a last place has no more digits than that place.
    {"TQ.XQVE Invert", 0.002, false},
    {"TQ.XQVE Noise"},
    {"TQ.XQVE ProcAmp"},
    {"TQ.XQVE Tint"},
    {"KL.XQVE Vertical Flip", 0.0, false},
    // What is left of a screen's light after its removal is given eight times its strength, and then display values of
    // dark light rise by 13; steep settings of transparency and tolerance make steps of the matte.
    {"TQ.XQVE Ultra Key", 0.03, false, 20.0},
    // Up to seven times what two neighbours differ by.
    // Places on an edge are rounded.
    {"TQ.XQVE Garbage Matte", 0.0, true, 250.0},
    {"TQ.XQVE Garbage Matte 8", 0.0, true, 250.0},
    {"TQ.XQVE Garbage Matte 16", 0.0, true, 250.0},
    {"TQ.XQVE Sharpen", 0.0, true, 10.0},
    {"TQ.XQVE RGB Color Corrector", 0.02, true, 30.0},
    {"TQ.XQVE Three-Way Color Corrector", 0.02, true, 30.0},
};

TEST_P(EveryEffect, AgreesWithItsScalarVersion) {
    Random random;
    constexpr int kTries = 24;
    for (const EffectCase& effectCase : kCases) {
        const EffectRow* effect = FindEffect(effectCase.matchName);
        ASSERT_NE(effect, nullptr) << effectCase.matchName;
        for (int i = 0; i < kTries; ++i) {
            const Picture picture = RoundTo(RandomPicture(random, random.Int(1, 70), random.Int(1, 40)), GetFormat());
            const ParameterValues values = RandomValues(random, *effect);
            Tolerance tolerance = GetTolerance();
            tolerance.exceptionShare = effectCase.exceptionShare;
            // One pixel of a small picture is more than any share.
            if (tolerance.exceptionShare > 0.0) tolerance.exceptionShare += 1.5 / (picture.width * picture.height);
            if (!IsHalf()) tolerance.absolute *= effectCase.stretch;
            tolerance.absolute *= effectCase.slack;
            tolerance.relative *= effectCase.slack;
            // The weights of a wide recursion nearly cancel: their rounding shows as gain.
            if (Softens(*effect, values)) tolerance = {5e-3, 5e-3, false, effectCase.exceptionShare};
            ExpectAgreement(MakeEffect(effect->matchName, ToParams(*effect, values)), *effect, values, picture,
                            tolerance);
        }
    }
}

TEST_P(EveryEffect, ItsDefaultsKeepEveryBit) {
    Random random;
    for (const EffectCase& effectCase : kCases) {
        if (!effectCase.neutralByDefault) continue;
        const EffectRow& effect = *FindEffect(effectCase.matchName);
        const Picture picture = RoundTo(RandomPicture(random, 67, 9), GetFormat());
        EXPECT_TRUE(PicturesAgree(Apply(effect.matchName, ToParams(effect, {}), picture), picture, kExactly))
            << effect.matchName;
    }
}

TEST_P(EveryEffect, BadPicturesAndNumbersMakeNoNaN) {
    // What needs more than a picture and parameters.
    const std::set<const EffectRow*> left = {&kMotionEffect, &kOpacityEffect, &kStabilizerEffect, &kTrackMatteEffect};
    constexpr float kLevels[] = {60000.0F, -60000.0F, 0.0F, 1.0F, -0.0F, 1e-7F, INFINITY, -INFINITY};
    Picture finite = Plain(13, 6, {0.25, 0.5, 0.75, 1.0});
    for (int i = 0; i < 6 * 8; ++i) {
        float* const pixel = finite.At(i % 13, 1 + i / 13);
        pixel[i % 3] = kLevels[i % 6];
        pixel[(i + 1) % 3] = kLevels[i / 8];
        pixel[3] = i % 5 == 0 ? 0.0F : 0.5F;
    }
    Picture endless = finite;
    for (int i = 0; i < 8; ++i) endless.At(i, 0)[i % 3] = kLevels[6 + i % 2];
    // A mix with infinite light, of which it takes nothing, has no value.
    const std::set<const EffectRow*> mixes = {&kInvertEffect, &kDirectionalBlurEffect, &kLumaCurveEffect};
    for (const EffectRow* effect : kEffectTable) {
        if (left.count(effect) != 0 || !isRegistered(Halden::ToWide(effect->matchName), GetDevice())) continue;
        const Picture picture = RoundTo(mixes.count(effect) != 0 ? finite : endless, GetFormat());
        // Of many parameters most are points of curves, or the same for another range.
        for (std::size_t i = 0; i<effect->parameterCount; i += effect->parameterCount> 30 ? 4 : 1) {
            const ParameterRow& row = effect->parameters[i];
            if (row.type == ParameterType::kBool || row.type == ParameterType::kColor) continue;
            for (const double bad : {double{NAN}, double{INFINITY}, -1e9, 0.0, 1e9}) {
                // A blend by no number gives none.
                const bool isWhole = row.type == ParameterType::kInt || effect == &kInvertEffect;
                if (isWhole && !std::isfinite(bad)) continue;
                const ParameterValues values = {{row.index, {bad, bad}}};
                const RenderNodeRef node = MakeEffect(effect->matchName, ToParams(*effect, values));
                VideoFrameRef output;
                // What would grow without end is refused.
                TryRenderOver(node, MakePaddedFrame(GetDevice(), GetFormat(), picture, 2), output);
                if (!output) continue;
                const Picture result = DownloadFrame(GetDevice(), output);
                const bool hasNaN = std::any_of(result.pixels.begin(), result.pixels.end(),
                                                [](float value) { return std::isnan(value); });
                EXPECT_FALSE(hasNaN) << effect->matchName << ", " << row.name << " " << bad;
            }
        }
    }
}

TEST_P(EveryEffect, RefusedMemoryIsToldAndTheNextTrySucceeds) {
    Random random;
    const Picture picture = RoundTo(RandomPicture(random, 33, 6), GetFormat());
    for (const EffectCase& effectCase : kCases) {
        const EffectRow& effect = *FindEffect(effectCase.matchName);
        const ParameterValues values = RandomValues(random, effect);
        const RenderNodeRef node = MakeEffect(effect.matchName, ToParams(effect, values));
        const auto render = [&] {
            return DownloadFrame(GetDevice(), RenderOver(node, UploadFrame(GetDevice(), GetFormat(), picture)));
        };
        for (const auto& memory : {GetDevice()->GetDeviceMemory(), GetDevice()->GetHostMemory()}) {
            int allocations = 0;
            const VideoFrameRef input = UploadFrame(GetDevice(), GetFormat(), picture);
            memory->SetAllocationFilter([&](std::uint64_t) { return ++allocations < 0; });
            const Picture expected = DownloadFrame(GetDevice(), RenderOver(node, input));
            for (int refused = 1; refused <= allocations; ++refused) {
                const VideoFrameRef untouched = UploadFrame(GetDevice(), GetFormat(), picture);
                int count = 0;  // of each try
                memory->SetAllocationFilter([&](std::uint64_t) { return count++ % refused == refused - 1; });
                VideoFrameRef output;
                const Status status = TryRenderOver(node, untouched, output);
                memory->SetAllocationFilter({});
                SCOPED_TRACE(testing::Message() << effect.matchName << ", allocation " << refused);
                // What the first try has kept, the second doesn't ask for again.
                EXPECT_TRUE(status == Ostrand::kStatus_OutOfMemory || (refused > 1 && !Ostrand::Failed(status)));
                EXPECT_EQ(!output, Ostrand::Failed(status));
                EXPECT_TRUE(PicturesAgree(DownloadFrame(GetDevice(), output ? output : untouched),
                                          output ? expected : picture, kExactly));
                EXPECT_TRUE(PicturesAgree(render(), expected, kExactly));
            }
            memory->SetAllocationFilter({});
        }
    }
}

INSTANTIATE_TEST_SUITE_P(Devices, EveryEffect, ::testing::ValuesIn(AllDeviceCases()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
