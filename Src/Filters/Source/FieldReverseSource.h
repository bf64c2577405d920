// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Nodes/SourceBaseNode.h"

namespace Vantrel {

/// Exchanges the lines of a picture's two fields, for media whose field order isn't the sequence's.
class FieldReverseSource final : public SourceBaseNode<FilterNode>, public Ostrand::Allocated<FieldReverseSource> {
public:
    FieldReverseSource() : SourceBaseNode(false, false) {}

    [[nodiscard]] WideString GetName() override { return u"FieldReverseSource"; }
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }
};

}  // namespace Vantrel
