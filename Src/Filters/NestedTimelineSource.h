// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <map>

#include "Ostrand/Allocated.h"
#include "Src/Nodes/SelectInputBaseNode.h"

namespace Vantrel {

/// Holds the trees of an inner sequence by time and renders the one that lies under the requested time, in the inner
/// sequence's terms. Has no fingerprint: the trees keep their own frames.
class NestedTimelineSource final : public SelectInputBaseNode, public Ostrand::Allocated<NestedTimelineSource> {
public:
    NestedTimelineSource() : SelectInputBaseNode(false, false) {}

    /// kStatus_Failure for a description that isn't media.
    Status Configure(const VideoNodeRef& description, const RenderRequirements& requirements, bool& host) override;
    [[nodiscard]] WideString GetName() override { return u"NestedTimelineSource"; }
    Guid GetFrameHash(const RenderParams& /*params*/, const RenderResultsRef& /*results*/) override { return {}; }
    /// Renders the chosen tree and lowers its picture by the media's scanline offset.
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;
    /// At the two highest qualities the inner sequence renders at full size, so that the outer motion scales a picture
    /// that has all its detail; for large ones only at the highest.
    void SelectInput(RenderParams& out, const RenderParams& params, RenderNodeRef& input) override;

    void AddSegmentTree(const RenderNodeRef& tree, std::int64_t start, std::int64_t sourceStart, std::int64_t end);
    void SetDefaultTree(const RenderNodeRef& tree) { mDefaultTree = tree; }

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }

private:
    struct SegmentEntry {
        RenderNodeRef tree;
        std::int64_t start = 0;
        std::int64_t sourceStart = 0;
        std::int64_t end = 0;
    };

    [[nodiscard]] const SegmentEntry* FindSegment(std::int64_t time) const;

    Vellum::Rect mInnerRect;
    std::int32_t mScanlineOffset = 0;
    std::uint32_t mInnerSequenceID = 0;
    std::map<std::int64_t, SegmentEntry> mSegments;
    RenderNodeRef mDefaultTree;
};

}  // namespace Vantrel
