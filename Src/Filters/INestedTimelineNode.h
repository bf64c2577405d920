// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/IRenderNode.h"

namespace Vantrel {

/// A node that stands for a whole sequence. It is given that sequence's trees while the outer tree is built, and only
/// reads them afterwards. Both operations raise NullInterfaceException on a node that hasn't been configured.
class INestedTimelineNode : public Ostrand::OstrandUnknown {
public:
    static constexpr Guid kInterfaceID{0x6A181079, 0x6EDE, 0x4D42, {0x86, 0xAD, 0x6D, 0xC2, 0x4B, 0x14, 0x81, 0x98}};

    /// What renders from `start` up to but not including `end`, in ticks of the inner sequence; the tree's own time is
    /// `sourceStart` at `start`. A tree that begins at the same time already stays. `tree` may be null: the default
    /// tree then shows.
    virtual void AddSegmentTree(const RenderNodeRef& tree, std::int64_t start, std::int64_t sourceStart,
                                std::int64_t end) = 0;
    /// What renders where no segment lies.
    virtual void SetDefaultTree(const RenderNodeRef& tree) = 0;
};

}  // namespace Vantrel
