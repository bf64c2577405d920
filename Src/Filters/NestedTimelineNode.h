// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Filters/INestedTimelineNode.h"
#include "Src/Filters/MediaNode.h"
#include "Src/Filters/NestedTimelineSource.h"

namespace Vantrel {

/// A clip that is a whole sequence: a media node whose producer renders that sequence's trees.
class NestedTimelineNode final : public MediaNode,
                                 public INestedTimelineNode,
                                 public Ostrand::Allocated<NestedTimelineNode> {
public:
    void AddRef() override { MediaNode::AddRef(); }
    void Release() override { MediaNode::Release(); }
    /// Answers for a multicam node too: as a root both get their output rectangle from the render call.
    Status QueryInterface(const Guid& iid, void** out) override;
    Status Configure(const VideoNodeRef& description, const RenderRequirements& requirements, bool& host) override;
    [[nodiscard]] WideString GetName() override { return u"NestedTimelineNode"; }

    void AddSegmentTree(const RenderNodeRef& tree, std::int64_t start, std::int64_t sourceStart,
                        std::int64_t end) override {
        mSource->AddSegmentTree(tree, start, sourceStart, end);
    }
    void SetDefaultTree(const RenderNodeRef& tree) override { mSource->SetDefaultTree(tree); }

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }

private:
    InterfaceRef<NestedTimelineSource> mSource;
};

}  // namespace Vantrel
