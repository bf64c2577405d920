// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Host/Software/EffectContext.h"
#include "Host/Software/Effects/Corrector.h"

namespace Vantrel::Host::Software {

/// Where an effect has the parameters that correctors share.
struct CorrectorIndices {
    std::int32_t showMask;
    std::int32_t selection;
    std::int32_t tonalRange = -1;  ///< below 0: it has none, nor a view of it
    std::int32_t splitView = 1;
    std::int32_t showTonalRange = -1;
};

[[nodiscard]] inline Selection::Range ReadRange(const EffectContext& context, std::int32_t first) {
    return {context.Number(first) / 100.0, context.Number(first + 1) / 100.0, context.Number(first + 2) / 100.0,
            context.Number(first + 3) / 100.0};
}

[[nodiscard]] inline Selection ReadSelection(const EffectContext& context, const LayerPicture& layer,
                                             std::int32_t first) {
    Selection selection;
    selection.hueCenter = context.Number(first);
    selection.hue = ReadRange(context, first + 1);
    selection.saturation = ReadRange(context, first + 9);
    selection.luma = ReadRange(context, first + 17);
    const double aspect = static_cast<double>(layer.aspect.numerator) / layer.aspect.denominator;
    const double softness = context.Number(first + 23);
    selection.blurX = std::sqrt(2.0 * aspect) / context.view.ScaleX() * softness;
    selection.blurY = std::sqrt(2.0) / context.view.ScaleY() * softness;
    selection.thinning = context.Number(first + 24) / 100.0;
    selection.inverted = context.Integer(first + 25) != 0;
    return selection;
}

inline void ReadSplitView(const EffectContext& context, std::int32_t first, Corrector& corrector) {
    if (!context.Flag(first)) return;
    const bool columns = context.Integer(first + 1) == kSplitLayout_Columns;
    (columns ? corrector.columns : corrector.rows) = context.Number(first + 2) / 100.0;
}

[[nodiscard]] inline Corrector ReadCorrector(const EffectContext& context, const LayerPicture& layer,
                                             const CorrectorIndices& indices) {
    Corrector corrector;
    if (context.Flag(indices.showMask)) {
        corrector.output = kCorrectorOutput_Mask;
    } else if (indices.showTonalRange >= 0 && context.Flag(indices.showTonalRange)) {
        corrector.output = kCorrectorOutput_TonalRange;
    } else {
        corrector.output = context.Integer(0);
    }
    ReadSplitView(context, indices.splitView, corrector);
    for (std::int32_t i = 0; i < 4 && indices.tonalRange >= 0; ++i) {
        corrector.range[static_cast<std::size_t>(i)] = context.Number(indices.tonalRange + i) / 255.0;
    }
    corrector.hasSelection = true;
    corrector.selection = ReadSelection(context, layer, indices.selection);
    return corrector;
}

}  // namespace Vantrel::Host::Software
