// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Filters/Effects/OneKernelEffect.h"

namespace Vantrel {

/// Turns colours, or one property of them, into their opposite. What that is for each choice of channel, and where the
/// formulas come from: Vantrel/Effects/Invert.h. Values are taken as the frame holds them, display-referred, which is
/// what makes white of black; colour isn't weighed by alpha, because each pixel stands alone.
///
/// A blend of exactly 100 % is the input, and then nothing runs.
class InvertNode final : public OneKernelEffect, public Ostrand::Allocated<InvertNode> {
public:
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }
};

}  // namespace Vantrel
