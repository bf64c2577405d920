// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Filters/FieldTime.h"
#include "Src/Nodes/SourceBaseNode.h"
#include "Src/Nodes/TransformRenderParamsBaseNode.h"

namespace Vantrel {

/// Takes a stream's second field for its first one: a request for the first field goes to the second, half a frame
/// later.
class ReverseFieldDominanceSource final : public SourceBaseNode<TransformRenderParamsBaseNode>,
                                          public Ostrand::Allocated<ReverseFieldDominanceSource> {
public:
    ReverseFieldDominanceSource() : SourceBaseNode(false, false) {}

    [[nodiscard]] WideString GetName() override { return u"ReverseFieldDominanceSource"; }
    void TransformParams(RenderParams& out, const RenderParams& params) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }
};

}  // namespace Vantrel
