// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Filters/Effects/CorrectorNode.h"

namespace Vantrel {

/// Corrects luma by tonal range and keeps the colour differences. What each control does:
/// Vantrel/Effects/LumaCorrector.h.
class LumaCorrectorNode final : public CorrectorNode, public Ostrand::Allocated<LumaCorrectorNode> {
public:
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }
};

}  // namespace Vantrel
