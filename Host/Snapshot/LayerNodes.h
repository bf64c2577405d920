// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <vector>

#include "Host/Snapshot/NodeFactory.h"
#include "Host/Snapshot/TrackLayout.h"

namespace Vantrel::Host {

class SequenceBuilder;

/// A stretch of a layer in which it is active, with the track that it belongs to.
struct ActiveLayer {
    const Placement* placement = nullptr;
    std::int32_t trackID = 0;
};

/// Turns the active layers of a segment into its tree. A clip's node is made once and serves all segments that show it.
class LayerNodes {
public:
    LayerNodes(SequenceBuilder& sequences, const SequenceFormat& format);

    /// @param layers bottom first, at least one
    /// @return a segment with root and offset; without a root if nothing is to be seen
    [[nodiscard]] Segment MakeSegment(std::int64_t start, std::int64_t end, const std::vector<ActiveLayer>& layers);

private:
    struct Stacked {
        std::int64_t anchor = 0;
        NodePtr node;
        bool shows = true;
    };

    [[nodiscard]] NodePtr LayerNode(const ActiveLayer& layer, const MatteLookup& mattes);
    [[nodiscard]] NodePtr ClipNode(const PlacedItem& placed, std::int32_t trackID, const MatteLookup& mattes);
    [[nodiscard]] NodePtr MakeClipNode(const PlacedItem& placed, std::int32_t trackID, const MatteLookup& mattes);
    [[nodiscard]] NodePtr SequenceMedia(const ClipRequest& request, const SequencePtr& sequence);
    [[nodiscard]] NodePtr MulticamClip(const ClipRequest& request, const MatteLookup& mattes);
    [[nodiscard]] std::vector<NodeInput> AngleClips(const ClipRequest& request);
    [[nodiscard]] NodePtr GridNode(const PlacedItem& placed, std::int32_t trackID);
    [[nodiscard]] NodePtr AdjustmentOver(const std::vector<Stacked>& below, const ActiveLayer& layer,
                                         const MatteLookup& mattes);
    [[nodiscard]] NodePtr CompositorOf(const std::vector<Stacked>& layers, std::int64_t origin) const;

    SequenceBuilder& mSequences;
    SequenceFormat mFormat;
    NodeFactory mFactory;
    std::map<const PlacedItem*, NodePtr> mClips;
};

}  // namespace Vantrel::Host
