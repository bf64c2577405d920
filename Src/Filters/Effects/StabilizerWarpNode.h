// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Filters/Effects/StabilizerWarpInputs.h"
#include "Src/Nodes/FilterNode.h"

namespace Vantrel {

/// Draws a frame through the mesh that the stabilizer plug-in has for it; what is drawn where:
/// Vantrel/Effects/Stabilizer.h. Without the plug-in, or where its analysis doesn't fit the clip, Configure refuses and
/// the effect goes to the host.
class StabilizerWarpNode final : public FilterNode, public Ostrand::Allocated<StabilizerWarpNode> {
public:
    /// Looks for the plug-in, if no node has found it yet.
    StabilizerWarpNode();
    ~StabilizerWarpNode() override;
    Status Configure(const VideoNodeRef& description, const RenderRequirements& requirements, bool& host) override;
    /// A frame without a mesh is a failure. After one the input's frame is in the slot again.
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }

private:
    [[nodiscard]] bool Acquire(const VideoNode& description);
    [[nodiscard]] bool Covers(const VideoNode& description);
    [[nodiscard]] StabilizerSettings ReadSettings(std::int64_t time) const;
    [[nodiscard]] std::int32_t FieldsPerFrame() const { return mFieldType == 1 || mFieldType == 2 ? 2 : 1; }

    const StabilizerEntryPoints& mEntries;
    void* mHandle = nullptr;
    std::int32_t mInstanceID = 0;
    StabilizerData mData;
    StabilizerMeshCache mCache;
    std::int32_t mFieldType = 3;
};

}  // namespace Vantrel
