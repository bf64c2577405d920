// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/Effects/EffectRow.h"

/// What the correctors share: what they show, the split view, tonal ranges, and the selection by colour.
namespace Vantrel {

/// What a corrector shows.
enum CorrectorOutput : std::int32_t {
    kCorrectorOutput_Composite = 0,   ///< the corrected picture
    kCorrectorOutput_Luma = 1,        ///< its luma as grey
    kCorrectorOutput_TonalRange = 2,  ///< shadows black, midtones grey, highlights white
    kCorrectorOutput_Mask = 3,        ///< the selection, white where it is whole
    kCorrectorOutput_Count
};

[[nodiscard]] inline const char* GetCorrectorOutputName(std::int32_t output) {
    constexpr const char* kNames[kCorrectorOutput_Count] = {"composite", "luma", "tonal_range", "mask"};
    return output >= 0 && output < kCorrectorOutput_Count ? kNames[output] : nullptr;
}

enum SplitLayout : std::int32_t { kSplitLayout_Rows = 0, kSplitLayout_Columns = 1, kSplitLayout_Count };

[[nodiscard]] inline const char* GetSplitLayoutName(std::int32_t layout) {
    constexpr const char* kNames[kSplitLayout_Count] = {"rows", "columns"};
    return layout >= 0 && layout < kSplitLayout_Count ? kNames[layout] : nullptr;
}

/// The split view corrects the first part of the picture, from the left (columns) or from the top (rows).
[[nodiscard]] constexpr std::array<ParameterRow, 3> SplitViewParameters(std::int32_t first) {
    return {{{first, "split_view", ParameterType::kBool, "", 0, 1, {0}},
             {first + 1,
              "split_layout",
              ParameterType::kInt,
              "",
              0,
              kSplitLayout_Count - 1,
              {kSplitLayout_Rows},
              &GetSplitLayoutName},
             {first + 2,
              "split_percent",
              ParameterType::kDouble,
              "%",
              0,
              100,
              {50},
              nullptr,
              ParameterConversion::kPercent,
              "share of the picture that is corrected"}}};
}

[[nodiscard]] constexpr ParameterRow LevelParameter(std::int32_t index, const char* name, double value,
                                                    const char* goesTo) {
    return {index,   name,    ParameterType::kDouble,      "of 255", 0, 255,
            {value}, nullptr, ParameterConversion::kLevel, goesTo};
}

/// How much a pixel of luma y belongs to the shadows (s), midtones (m) and highlights (h), by the four thresholds t:
///
///     s = 1 - ramp(t0, t1, y),  h = ramp(t2, t3, y) (1 - s),  m = 1 - s - h
///     ramp(a, b, y) = u u (3 - 2 u),  u = (y - a) / (b - a) limited to 0..1; a step at a where b isn't above a
///
/// The three sum to 1 at every level, whatever the thresholds are.
[[nodiscard]] constexpr std::array<ParameterRow, 4> TonalRangeParameters(std::int32_t first) {
    return {{LevelParameter(first, "shadow_full", 64, "level up to which all is shadow"),
             LevelParameter(first + 1, "shadow_end", 96, "level from which nothing is shadow"),
             LevelParameter(first + 2, "highlight_start", 160, "level up to which nothing is highlight"),
             LevelParameter(first + 3, "highlight_full", 192, "level from which all is highlight")}};
}

/// Hue and colour balance are counted on the vectorscope, the plane of BT.709's colour differences
///
///     Cb = (B - Y) / 1.8556,  Cr = (R - Y) / 1.5748
///
/// where Cb points to the right (0 degrees) and Cr up (90 degrees): blue lies at -5, red at 103, green at 230 degrees.
/// Whatever is done there leaves luma alone.
[[nodiscard]] constexpr ParameterRow HueAngleParameter(std::int32_t index, const char* name) {
    return {index, name, ParameterType::kFloat, "degrees", -360, 360, {0}};
}

/// A colour wheel pulls colours towards the hue of its angle, by amount times gain times sqrt(1/2); a negative amount
/// pulls the other way.
[[nodiscard]] constexpr std::array<ParameterRow, 3> WheelParameters(std::int32_t first,
                                                                    const std::array<const char*, 3>& names) {
    return {{{first, names[0], ParameterType::kDouble, "%", -100, 100, {0}},
             {first + 1, names[1], ParameterType::kDouble, "%", 0, 100, {100}},
             {first + 2, names[2], ParameterType::kFloat, "degrees", -360, 360, {0}}}};
}

/// The selection limits a correction to part of the picture, chosen by colour. A pixel's share is the product of three:
///
/// - hue, in turns of the hexcone (Smith, "Color Gamut Transform Pairs", SIGGRAPH 1978; 0 red, 1/3 green, 2/3 blue;
///   greys count as 0): whole from start to end on the circle, both turned back by the centre, and falling to nothing
///   within the softness outside each edge. Start and end both at 50 % without softness, the defaults, or one turn
///   apart, take in every hue.
/// - saturation, (max - min) / max, and luma (BT.709), both limited to 0..1: whole between start and end, falling to
///   nothing within the softness outside.
///
/// A thinning a (0..1) makes max(0, (share - a) / (1 - a)) of it, a negative one min(1, share / (1 + a)). Inverted it
/// is 1 - share. Softening then blurs it, by a Gaussian of sqrt(2) pixels of the sequence for each unit.
[[nodiscard]] constexpr ParameterRow SelectionParameter(std::int32_t index, const char* name, double value,
                                                        const char* goesTo) {
    return {index, name, ParameterType::kDouble, "%", 0, 100, {value}, nullptr, ParameterConversion::kPercent, goesTo};
}

inline constexpr std::size_t kSelectionParameterCount = 16;
[[nodiscard]] constexpr std::array<ParameterRow, kSelectionParameterCount> SelectionParameters(std::int32_t first) {
    return {{{first, "selection_hue_center", ParameterType::kDouble, "turns", 0, 1, {0}},
             SelectionParameter(first + 1, "selection_hue_start", 50, "of a turn"),
             SelectionParameter(first + 2, "selection_hue_start_softness", 0, "of a turn"),
             SelectionParameter(first + 3, "selection_hue_end", 50, "of a turn"),
             SelectionParameter(first + 4, "selection_hue_end_softness", 0, "of a turn"),
             SelectionParameter(first + 9, "selection_saturation_start", 0, ""),
             SelectionParameter(first + 10, "selection_saturation_start_softness", 0, ""),
             SelectionParameter(first + 11, "selection_saturation_end", 100, ""),
             SelectionParameter(first + 12, "selection_saturation_end_softness", 0, ""),
             SelectionParameter(first + 17, "selection_luma_start", 0, ""),
             SelectionParameter(first + 18, "selection_luma_start_softness", 0, ""),
             SelectionParameter(first + 19, "selection_luma_end", 100, ""),
             SelectionParameter(first + 20, "selection_luma_end_softness", 0, ""),
             {first + 23, "selection_soften", ParameterType::kDouble, "pixels", 0, 100, {0}},
             {first + 24,
              "selection_thinning",
              ParameterType::kDouble,
              "%",
              -100,
              100,
              {0},
              nullptr,
              ParameterConversion::kPercent,
              "above 0 thins the edge, below 0 widens it"},
             {first + 25, "selection_invert", ParameterType::kInt, "", 0, 1, {0}}}};
}

[[nodiscard]] constexpr ParameterRow CorrectorOutputParameter() {
    return {0,
            "output",
            ParameterType::kInt,
            "",
            0,
            kCorrectorOutput_Count - 1,
            {kCorrectorOutput_Composite},
            &GetCorrectorOutputName};
}

[[nodiscard]] constexpr ParameterRow ShowMaskParameter(std::int32_t index) {
    return {index,
            "show_mask",
            ParameterType::kBool,
            "",
            0,
            1,
            {0},
            nullptr,
            ParameterConversion::kAsIs,
            "goes before the output"};
}

}  // namespace Vantrel
