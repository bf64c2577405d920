// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Filters/SWHostVideoSegmentRenderSuiteNode.h"

namespace Vantrel {

/// Asks the host for one frame of a clip's media, undecorated, by the clip's id. Such a frame doesn't depend on the
/// time in the sequence, only on the clip time.
class SWHostRenderClipPrefetch final : public SWHostVideoSegmentRenderSuiteNode,
                                       public Ostrand::Allocated<SWHostRenderClipPrefetch> {
public:
    static constexpr Guid kInterfaceID = kHostRenderClipPrefetchID;

    Status QueryInterface(const Guid& iid, void** out) override;
    /// kStatus_Failure unless the description is media that is there and that the host can read now.
    Status Configure(const VideoNodeRef& description, const RenderRequirements& requirements, bool& host) override;
    Guid GetFrameHash(const RenderParams& params, const RenderResultsRef& results) override;
    Status RequestHostRender(const RenderParams& params, VantrelRenderCallback callback, void* context,
                             std::uint32_t& requestID) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }

private:
    /// What the clip can really deliver for these params.
    [[nodiscard]] VantrelClipRecord MakeClipRecord(const RenderParams& params) const;

    std::uint32_t mClipID = 0;
};

}  // namespace Vantrel
