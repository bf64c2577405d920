// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Nodes/SourceBaseNode.h"

namespace Vantrel {

/// Turns a stream's alpha round: 1 - a, in place but for stills, whose frames are kept. Colour stays.
class InvertAlphaSource final : public SourceBaseNode<FilterNode>, public Ostrand::Allocated<InvertAlphaSource> {
public:
    InvertAlphaSource() : SourceBaseNode(false, false) {}

    [[nodiscard]] WideString GetName() override { return u"InvertAlphaSource"; }
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }
};

}  // namespace Vantrel
