// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Nodes/FilterNode.h"

namespace Vantrel {

/// A leaf that draws the colour bars of SMPTE EG 1 (see ColorBarsPattern.h). The fingerprint has no time in it, so the
/// bars render once for a size and quality.
class ColorBarsNode final : public FilterNode, public Ostrand::Allocated<ColorBarsNode> {
public:
    ColorBarsNode() : FilterNode(false, false) {}

    Guid GetFrameHash(const RenderParams& params, const RenderResultsRef& results) override;
    [[nodiscard]] WideString GetName() override { return u"ColorBars"; }
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }
};

}  // namespace Vantrel
