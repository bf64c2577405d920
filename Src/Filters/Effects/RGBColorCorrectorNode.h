// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Filters/Effects/CorrectorNode.h"

namespace Vantrel {

/// Corrects red, green and blue by tonal range. What each control does:
/// Vantrel/Effects/RGBColorCorrector.h.
class RGBColorCorrectorNode final : public CorrectorNode, public Ostrand::Allocated<RGBColorCorrectorNode> {
public:
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }
};

}  // namespace Vantrel
