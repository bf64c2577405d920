// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Nodes/SourceBaseNode.h"
#include "Src/Nodes/TransformRenderParamsBaseNode.h"

namespace Vantrel {

/// Softens a picture across its lines, so that detail of one line's height doesn't flicker when fields are shown in
/// turn: each line becomes a quarter of the one above, half of itself and a quarter of the one below. That takes the
/// whole frame, and no fields leave it.
class RemoveFlickerSource final : public SourceBaseNode<TransformRenderParamsBaseNode>,
                                  public Ostrand::Allocated<RemoveFlickerSource> {
public:
    RemoveFlickerSource() : SourceBaseNode(false, false) {}

    [[nodiscard]] WideString GetName() override { return u"RemoveFlickerSource"; }
    [[nodiscard]] Vellum::FrameRate GetFieldRate() override { return GetFrameRate(); }
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;
    void TransformParams(RenderParams& out, const RenderParams& params) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }
};

}  // namespace Vantrel
