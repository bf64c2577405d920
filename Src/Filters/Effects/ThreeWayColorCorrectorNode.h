// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Filters/Effects/CorrectorNode.h"

namespace Vantrel {

/// Corrects colour balance, hue and saturation by tonal range, and levels. What each control does:
/// Vantrel/Effects/ThreeWayColorCorrector.h.
class ThreeWayColorCorrectorNode final : public CorrectorNode, public Ostrand::Allocated<ThreeWayColorCorrectorNode> {
public:
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }
};

}  // namespace Vantrel
