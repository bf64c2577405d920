// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Src/Filters/Effects/ParameterReader.h"
#include "Src/Filters/Effects/UltraKeyRecord.h"
#include "Vantrel/RenderParams.h"

/// What a keyer works out once for each frame. Formulas: Vantrel/Effects/UltraKey.h.
namespace Vantrel {

static_assert(sizeof(UltraKeyParams) == 164, "the record is copied byte for byte");

/// A filter on the matte, horizontal and then vertical.
struct MatteStage {
    bool runs = false;
    std::int32_t reachX = 0;  ///< whole pixels that are reached in full
    std::int32_t reachY = 0;
    float fractionY = 0.0F;  ///< of the pixel beyond

    /// Radii in quarters of a reach.
    [[nodiscard]] static MatteStage Make(float radiusX, float radiusY);
};

struct UltraKeySetup {
    std::int32_t output = 0;
    UltraKeyParams record{};
    MatteStage choke;
    MatteStage soften;
    bool finishes = false;  ///< the matte's last kernel applies contrast

    [[nodiscard]] static UltraKeySetup Read(const ParameterReader& read, const RenderParams& params);
};

}  // namespace Vantrel
