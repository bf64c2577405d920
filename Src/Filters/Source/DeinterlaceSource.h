// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Nodes/SourceBaseNode.h"

namespace Vantrel {

/// Hides a stream's fields: what lies above sees whole frames only, and asks for a field of a frame, which the upload
/// then interpolates. Frames pass untouched.
class DeinterlaceSource final : public SourceBaseNode<FilterNode>, public Ostrand::Allocated<DeinterlaceSource> {
public:
    DeinterlaceSource() : SourceBaseNode(false, false) {}

    [[nodiscard]] WideString GetName() override { return u"DeinterlaceSource"; }
    [[nodiscard]] Vellum::FrameRate GetFieldRate() override { return GetFrameRate(); }

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }
};

}  // namespace Vantrel
