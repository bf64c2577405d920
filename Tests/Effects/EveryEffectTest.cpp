// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
// What holds of every effect: its kernel agrees with the scalar version, and its defaults leave the picture alone.
#include "Host/Software/EffectContext.h"
#include "Tests/Effects/EffectTester.h"
#include "Vantrel/EffectTable.h"

namespace Vantrel::Testing {
namespace {

using Host::Software::EffectContext;
using Host::Software::EffectFunction;
using Host::Software::LayerPicture;

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

class EveryEffect : public EffectTest {
protected:
    Picture OnDevice(const EffectRow& effect, const ParameterValues& values, const Picture& picture) {
        return Apply(effect.matchName, ToParams(effect, values), picture);
    }

    static Picture OnHost(const EffectRow& effect, const ParameterValues& values, const Picture& picture) {
        const EffectFunction function = Host::Software::FindEffectFunction(effect.matchName);
        EXPECT_NE(function, nullptr) << effect.matchName << " has no scalar version";
        LayerPicture layer;
        layer.picture = picture;
        layer.aspect = {1, 1};
        EffectContext context;
        context.matchName = effect.matchName;
        context.value = [&values](std::int32_t index) {
            const auto found = values.find(index);
            return found == values.end() ? std::array<double, 4>{} : found->second;
        };
        context.view.width = context.view.sequenceWidth = picture.width;
        context.view.height = context.view.sequenceHeight = picture.height;
        if (function) function(context, layer);
        return layer.picture;
    }
};

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
            EXPECT_TRUE(PicturesAgree(OnDevice(*effect, values, picture),
                                      RoundTo(OnHost(*effect, values, picture), GetFormat()), tolerance))
                << Describe(*effect, values) << "; " << picture.width << " by " << picture.height << ", seed "
                << random.GetSeed();
        }
    }
}

TEST_P(EveryEffect, ItsDefaultsKeepEveryBit) {
    Random random;
    SCOPED_TRACE(random.GetSeed());
    for (const EffectCase& effectCase : kCases) {
        if (!effectCase.neutralByDefault) continue;
        const EffectRow& effect = *FindEffect(effectCase.matchName);
        ParameterValues values;
        for (std::size_t i = 0; i < effect.parameterCount; ++i) {
            values[effect.parameters[i].index] = effect.parameters[i].value;
        }
        const Picture picture = RoundTo(RandomPicture(random, 67, 9), GetFormat());
        EXPECT_TRUE(PicturesAgree(OnDevice(effect, values, picture), picture, kExactly)) << effect.matchName;
    }
}

INSTANTIATE_TEST_SUITE_P(Devices, EveryEffect, ::testing::ValuesIn(AllDeviceCases()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
