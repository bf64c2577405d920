// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>

#include "Ostrand/Allocated.h"
#include "Src/Filters/Effects/PointwiseFilterRecords.h"
#include "Src/Nodes/FilterNode.h"

namespace Vantrel {

/// The effects that make a pixel from one pixel and few numbers: alpha adjust, black and white, brightness and
/// contrast, colour balance, pass and replace, edge feather, extract, fast colour corrector, gamma, flips, noise,
/// ProcAmp, tint. What each does: the header of its name in Vantrel/Effects.
///
/// Up to four of them, one the input of the next, run as one launch, so that the frame is read and written once: the
/// topmost collects the others' records and keeps them from rendering. They work in place; a flip, wherever it is in
/// the chain, needs a new frame.
class PointwiseFilterHostNode final : public FilterNode, public Ostrand::Allocated<PointwiseFilterHostNode> {
public:
    static constexpr Guid kInterfaceID{0x77562FDA, 0x7E50, 0x4C03, {0x9B, 0x35, 0xEC, 0x75, 0x3C, 0xA9, 0xF9, 0xF3}};

    PointwiseFilterHostNode() : FilterNode(true, false) {}

    Status QueryInterface(const Guid& iid, void** out) override;
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }

private:
    /// From the top of the chain down: the last record is the first that a pixel meets.
    struct FilterList {
        static constexpr std::size_t kCapacity = 4;
        std::array<PointwiseFilterRecord, kCapacity> records{};
        std::size_t size = 0;
    };

    /// Adds a node and the pointwise nodes below it, which it keeps from rendering in this frame. A full list ends the
    /// chain: the node that doesn't fit renders by itself.
    static void CollectPointwiseFilters(const RenderParams& params, PointwiseFilterHostNode* node, FilterList& list,
                                        bool& needsNewFrame);
    [[nodiscard]] Status RunFilters(const FilterList& list, const VideoFrameRef& input);
};

}  // namespace Vantrel
